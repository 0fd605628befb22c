// DDS files: any bytes load or fail with a message; what loads saves and loads back the same.

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
		Require(!error.empty() && image.IsEmpty());
		return 0;
	}
	std::vector<uint8_t> saved;
	::Dds::Image again;
	Require(::Dds::SaveToMemory(image, saved, error) &&
	        ::Dds::LoadFromMemory(saved.data(), saved.size(), again, error) && again.Info() == image.Info() &&
	        again.Bytes() == image.Bytes());
	return 0;
}
