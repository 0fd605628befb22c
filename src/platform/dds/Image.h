#pragma once
// Image: a texture in memory, every subresource tightly packed one after the
// other in Direct3D's order: for each array slice (each cube face, +X -X +Y -Y
// +Z -Z), mip 0 to n-1. A volume has one array slice; each of its mips holds all
// its depth slices. Row 0 is the top row, as in the file and under Direct3D.
//
//   Dds::Image image;
//   if (!image.Init(info, error)) { ... sizes out of range ... }
//   std::memcpy(image.Data(0, face), facePixels, image.SubresourceSize(0));
//   Dds::SaveToFile("data/Cubemaps/1.dds", image, error);
//
// The image owns its bytes; Data() pointers stay valid until the next Init().

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

#include "platform/dds/ImageInfo.h"

namespace Dds
{
class Image
{
public:
	// Lays out and zero-fills memory for anInfo. Fails, leaving the image empty,
	// when the info is inconsistent or larger than MaxImageBytes.
	bool Init(const ImageInfo& anInfo, std::string& anErrorOut);
	void Destroy();

	const ImageInfo& Info() const { return myInfo; }
	bool IsEmpty() const { return myBytes.empty(); }

	uint32_t SubresourceCount() const { return myInfo.myArraySize * myInfo.myMipLevels; }
	// Direct3D's subresource index: anItem * mips + aMip.
	uint32_t SubresourceIndex(uint32_t aMip, uint32_t anItem) const
	{
		return anItem * myInfo.myMipLevels + aMip;
	}
	uint8_t* Data(uint32_t aMip, uint32_t anItem);
	const uint8_t* Data(uint32_t aMip, uint32_t anItem) const;
	uint64_t RowPitch(uint32_t aMip) const;
	// One depth slice of level aMip.
	uint64_t SlicePitch(uint32_t aMip) const;
	// All of level aMip of one array slice: SlicePitch times the level's depth.
	uint64_t SubresourceSize(uint32_t aMip) const;

	// Every subresource, in order.
	const std::vector<uint8_t>& Bytes() const { return myBytes; }
	std::vector<uint8_t>& Bytes() { return myBytes; }

private:
	ImageInfo myInfo;
	std::vector<uint64_t> myOffsets; // per subresource
	std::vector<uint8_t> myBytes;
};

// The largest dimension and the most bytes an image may have. Files claiming
// more are refused before anything is allocated.
constexpr uint32_t MaxDimension = 16384;
constexpr uint32_t MaxArraySize = 2048;
constexpr uint64_t MaxImageBytes = uint64_t(1) << 30;

// Checks anInfo for consistency and size and computes the total bytes its
// subresources take. anErrorOut says what is wrong, without a file name.
bool ComputeImageBytes(const ImageInfo& anInfo, uint64_t& someBytesOut, std::string& anErrorOut);
} // namespace Dds
