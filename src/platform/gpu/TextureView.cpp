#include "platform/gpu/TextureView.h"

#include <atomic>

#include "platform/gpu/Context.h"
#include "platform/gpu/Formats.h"
#include "platform/gpu/Report.h"
#include "platform/gpu/Texture.h"

namespace Gpu
{
namespace
{
// Ids start at 1 so that 0 can mean "no view" in framebuffer keys.
std::atomic<uint64_t> ourNextUniqueId{1};
} // namespace

bool View::InitView(Texture& aTexture, GLenum aTarget, Dds::Format aFormat, int aFirstMip, int aMipCount,
                    int aFirstSlice, int aSliceCount, const char* aKind)
{
	myTexture = &aTexture;
	myTarget = aTarget;
	myFormat = aFormat;
	myWidth = aTexture.GetMipWidth(aFirstMip);
	myHeight = aTexture.GetMipHeight(aFirstMip);
	mySliceCount = aSliceCount;
	myAttachmentLayer = -1;

	// A 3D texture's views stay 3D (glTextureView cannot pick depth slices); a
	// single-slice target of one is attached through the framebuffer layer instead.
	const bool volumeFlag = aTexture.GetTarget() == GL_TEXTURE_3D;
	const int firstLayer = volumeFlag ? 0 : aFirstSlice;
	const int layerCount = volumeFlag ? 1 : aSliceCount;
	if (volumeFlag && aSliceCount == 1)
	{
		myAttachmentLayer = aFirstSlice;
	}

	glGenTextures(1, &myName);
	glTextureView(myName, aTarget, aTexture.GetName(), GetFormatInfo(aFormat).myInternalFormat,
	              static_cast<GLuint>(aFirstMip), static_cast<GLuint>(aMipCount),
	              static_cast<GLuint>(firstLayer), static_cast<GLuint>(layerCount));
	LUMORA_GL_CHECK("Gpu::View::InitView");
	myUniqueId = ourNextUniqueId.fetch_add(1);
	const std::string& label = aTexture.GetDesc().myLabel;
	if (!label.empty())
	{
		LabelObject(GL_TEXTURE, myName,
		            label + " " + aKind + " mip " + std::to_string(aFirstMip) + " slice " +
		                std::to_string(aFirstSlice));
	}
	return true;
}

void View::Destroy()
{
	if (myName == 0)
	{
		return;
	}
	myTexture->GetContext().GetFramebufferCache().ForgetView(myUniqueId);
	glDeleteTextures(1, &myName);
	myName = 0;
	myUniqueId = 0;
}
} // namespace Gpu
