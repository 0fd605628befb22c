#include "platform/gpu/Multisample.h"

#include <epoxy/gl.h>
#include <vector>

#include "platform/gpu/Formats.h"
#include "platform/gpu/Report.h"

namespace Gpu
{
bool CheckMultisampleQualityLevels(Dds::Format aFormat, int aSampleCount, unsigned int& someLevelsOut)
{
	someLevelsOut = 0;
	const FormatInfo info = GetFormatInfo(aFormat);
	if (!info.IsSupported() || info.myCompressedFlag)
	{
		ReportError(__LINE__, "Gpu::CheckMultisampleQualityLevels", "Format %u cannot be multisampled",
		            static_cast<unsigned>(aFormat));
		return false;
	}
	GLint countOfCounts = 0;
	glGetInternalformativ(GL_TEXTURE_2D_MULTISAMPLE, info.myInternalFormat, GL_NUM_SAMPLE_COUNTS, 1,
	                      &countOfCounts);
	if (countOfCounts > 0)
	{
		std::vector<GLint> counts(static_cast<size_t>(countOfCounts));
		glGetInternalformativ(GL_TEXTURE_2D_MULTISAMPLE, info.myInternalFormat, GL_SAMPLES, countOfCounts,
		                      counts.data());
		for (GLint count : counts)
		{
			if (count == aSampleCount)
			{
				someLevelsOut = 1;
			}
		}
	}
	LUMORA_GL_CHECK("Gpu::CheckMultisampleQualityLevels");
	return true;
}
} // namespace Gpu
