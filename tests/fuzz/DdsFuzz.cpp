// DDS files: any bytes load or fail with a message; what loads saves and loads back the same.

#include <cstdlib>
#include <string>
#include <vector>

#include "FuzzEntries.h"
#include "platform/dds/DdsFile.h"

int LumoraFuzz::Dds(const uint8_t* someData, size_t aSize)
{
	::Dds::Image image;
	std::string error;
	if (!::Dds::LoadFromMemory(someData, aSize, image, error))
	{
		if (error.empty() || !image.IsEmpty())
		{
			std::abort();
		}
		return 0;
	}
	++ourAcceptedCount;
	std::vector<uint8_t> saved;
	::Dds::Image again;
	if (!::Dds::SaveToMemory(image, saved, error) ||
	    !::Dds::LoadFromMemory(saved.data(), saved.size(), again, error) || !(again.Info() == image.Info()) ||
	    again.Bytes() != image.Bytes())
	{
		std::abort();
	}
	return 0;
}
