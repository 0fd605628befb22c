#include "platform/dds/Image.h"

#include <cassert>

namespace Dds
{
bool ComputeImageBytes(const ImageInfo& anInfo, uint64_t& someBytesOut, std::string& anErrorOut)
{
	someBytesOut = 0;
	const uint32_t formatNumber = static_cast<uint32_t>(anInfo.myFormat);
	if (!IsKnown(anInfo.myFormat))
	{
		anErrorOut = "unsupported DXGI format " + std::to_string(formatNumber);
		return false;
	}
	const bool volumeFlag = anInfo.myResourceDimension == ResourceDimension::Texture3D;
	switch (anInfo.myResourceDimension)
	{
	case ResourceDimension::Texture1D:
		if (anInfo.myHeight != 1 || anInfo.myDepth != 1)
		{
			anErrorOut = "a 1D texture must have height and depth 1";
			return false;
		}
		break;
	case ResourceDimension::Texture2D:
		if (anInfo.myDepth != 1)
		{
			anErrorOut = "a 2D texture must have depth 1";
			return false;
		}
		break;
	case ResourceDimension::Texture3D:
		if (anInfo.myArraySize != 1 || anInfo.IsCube())
		{
			anErrorOut = "a volume texture cannot be an array or a cube";
			return false;
		}
		break;
	default:
		anErrorOut = "unsupported resource dimension " +
		             std::to_string(static_cast<uint32_t>(anInfo.myResourceDimension));
		return false;
	}
	if (anInfo.myWidth == 0 || anInfo.myHeight == 0 || anInfo.myDepth == 0 || anInfo.myWidth > MaxDimension ||
	    anInfo.myHeight > MaxDimension || anInfo.myDepth > MaxDimension)
	{
		anErrorOut = "size " + std::to_string(anInfo.myWidth) + "x" + std::to_string(anInfo.myHeight) + "x" +
		             std::to_string(anInfo.myDepth) + " is outside 1.." + std::to_string(MaxDimension);
		return false;
	}
	if (anInfo.myArraySize == 0 || anInfo.myArraySize > MaxArraySize)
	{
		anErrorOut = "array size " + std::to_string(anInfo.myArraySize) + " is outside 1.." +
		             std::to_string(MaxArraySize);
		return false;
	}
	if (anInfo.IsCube() && (anInfo.myResourceDimension != ResourceDimension::Texture2D ||
	                        anInfo.myArraySize % 6 != 0 || anInfo.myWidth != anInfo.myHeight))
	{
		anErrorOut = "a cube needs square 2D faces, six per cube (array size " +
		             std::to_string(anInfo.myArraySize) + ")";
		return false;
	}
	const uint32_t fullChain = FullMipCount(anInfo.myWidth, anInfo.myHeight, anInfo.myDepth);
	if (anInfo.myMipLevels == 0 || anInfo.myMipLevels > fullChain)
	{
		anErrorOut = "mip count " + std::to_string(anInfo.myMipLevels) + " is outside 1.." +
		             std::to_string(fullChain) + " for " + std::to_string(anInfo.myWidth) + "x" +
		             std::to_string(anInfo.myHeight) + "x" + std::to_string(anInfo.myDepth);
		return false;
	}
	// Every dimension is capped above, so one level of one slice fits in 64 bits
	// (at most 2^46 bytes); the running total is checked against the cap as it grows.
	uint64_t chainBytes = 0;
	for (uint32_t mip = 0; mip < anInfo.myMipLevels; ++mip)
	{
		chainBytes +=
		    MipSize(anInfo.myFormat, anInfo.myWidth, anInfo.myHeight, volumeFlag ? anInfo.myDepth : 1, mip);
		if (chainBytes > MaxImageBytes)
		{
			break;
		}
	}
	if (chainBytes > MaxImageBytes || chainBytes * anInfo.myArraySize > MaxImageBytes)
	{
		anErrorOut = "the image would take more than " + std::to_string(MaxImageBytes >> 20) + " MiB";
		return false;
	}
	someBytesOut = chainBytes * anInfo.myArraySize;
	return true;
}

bool Image::Init(const ImageInfo& anInfo, std::string& anErrorOut)
{
	Destroy();
	uint64_t total = 0;
	if (!ComputeImageBytes(anInfo, total, anErrorOut))
	{
		return false;
	}
	myInfo = anInfo;
	myOffsets.reserve(SubresourceCount());
	uint64_t offset = 0;
	for (uint32_t item = 0; item < myInfo.myArraySize; ++item)
	{
		for (uint32_t mip = 0; mip < myInfo.myMipLevels; ++mip)
		{
			myOffsets.push_back(offset);
			offset += SubresourceSize(mip);
		}
	}
	assert(offset == total);
	myBytes.assign(static_cast<size_t>(total), 0);
	return true;
}

void Image::Destroy()
{
	myInfo = ImageInfo();
	myOffsets.clear();
	myBytes.clear();
	myBytes.shrink_to_fit();
}

uint8_t* Image::Data(uint32_t aMip, uint32_t anItem)
{
	assert(aMip < myInfo.myMipLevels && anItem < myInfo.myArraySize && !myBytes.empty());
	return myBytes.data() + myOffsets[SubresourceIndex(aMip, anItem)];
}

const uint8_t* Image::Data(uint32_t aMip, uint32_t anItem) const
{
	assert(aMip < myInfo.myMipLevels && anItem < myInfo.myArraySize && !myBytes.empty());
	return myBytes.data() + myOffsets[SubresourceIndex(aMip, anItem)];
}

uint64_t Image::RowPitch(uint32_t aMip) const
{
	return Dds::RowPitch(myInfo.myFormat, MipExtent(myInfo.myWidth, aMip));
}

uint64_t Image::SlicePitch(uint32_t aMip) const
{
	return Dds::SlicePitch(myInfo.myFormat, MipExtent(myInfo.myWidth, aMip),
	                       MipExtent(myInfo.myHeight, aMip));
}

uint64_t Image::SubresourceSize(uint32_t aMip) const
{
	return SlicePitch(aMip) * (myInfo.IsVolume() ? MipExtent(myInfo.myDepth, aMip) : 1);
}
} // namespace Dds
