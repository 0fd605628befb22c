#include "MipChain.h"

#include <algorithm>
#include <cmath>

#include "platform/dds/Format.h"

namespace Content
{
double SrgbToLinear(double aValue)
{
	return aValue <= 0.04045 ? aValue / 12.92 : std::pow((aValue + 0.055) / 1.055, 2.4);
}

double LinearToSrgb(double aValue)
{
	return aValue <= 0.0031308 ? aValue * 12.92 : 1.055 * std::pow(aValue, 1.0 / 2.4) - 0.055;
}

uint8_t ToByte(double aValue)
{
	return static_cast<uint8_t>(std::lround(std::clamp(aValue, 0.0, 1.0) * 255.0));
}

MipLevel Downsample(const MipLevel& aLevel, bool aNormalFlag, bool aCoverageWeightedFlag)
{
	MipLevel half;
	half.mySize = std::max(aLevel.mySize / 2, 1u);
	half.myTexels.resize(size_t(half.mySize) * half.mySize);
	for (uint32_t y = 0; y < half.mySize; ++y)
	{
		for (uint32_t x = 0; x < half.mySize; ++x)
		{
			std::array<double, 4> sum = {0.0, 0.0, 0.0, 0.0};
			std::array<double, 3> weighted = {0.0, 0.0, 0.0};
			for (uint32_t corner = 0; corner < 4; ++corner)
			{
				const uint32_t sourceX = std::min(x * 2 + (corner & 1), aLevel.mySize - 1);
				const uint32_t sourceY = std::min(y * 2 + (corner >> 1), aLevel.mySize - 1);
				const std::array<double, 4>& texel =
				    aLevel.myTexels[size_t(sourceY) * aLevel.mySize + sourceX];
				for (int channel = 0; channel < 4; ++channel)
				{
					sum[channel] += texel[channel] * 0.25;
				}
				for (int channel = 0; channel < 3; ++channel)
				{
					weighted[channel] += texel[channel] * texel[3] * 0.25;
				}
			}
			if (aNormalFlag)
			{
				const double length = std::sqrt(sum[0] * sum[0] + sum[1] * sum[1] + sum[2] * sum[2]);
				for (int channel = 0; channel < 3; ++channel)
				{
					sum[channel] = length > 1e-9 ? sum[channel] / length : (channel == 2 ? 1.0 : 0.0);
				}
			}
			else if (aCoverageWeightedFlag && sum[3] > 1e-9)
			{
				for (int channel = 0; channel < 3; ++channel)
				{
					sum[channel] = weighted[channel] / sum[3];
				}
			}
			half.myTexels[size_t(y) * half.mySize + x] = sum;
		}
	}
	return half;
}

bool BakeMipChain(MipLevel aLevelZero, bool aNormalFlag, bool aCoverageWeightedFlag, Dds::Image& anImageOut,
                  std::string& anErrorOut)
{
	uint32_t mipCount = 1;
	while ((aLevelZero.mySize >> (mipCount - 1)) > 1)
	{
		++mipCount;
	}
	Dds::ImageInfo info;
	info.myWidth = aLevelZero.mySize;
	info.myHeight = aLevelZero.mySize;
	info.myDepth = 1;
	info.myArraySize = 1;
	info.myMipLevels = mipCount;
	info.myFormat = aNormalFlag ? Dds::Format::R8G8B8A8_UNORM : Dds::Format::R8G8B8A8_UNORM_SRGB;
	if (!anImageOut.Init(info, anErrorOut))
	{
		return false;
	}
	MipLevel level = std::move(aLevelZero);
	for (uint32_t mip = 0; mip < mipCount; ++mip)
	{
		if (mip > 0)
		{
			level = Downsample(level, aNormalFlag, aCoverageWeightedFlag);
		}
		uint8_t* bytes = anImageOut.Data(mip, 0);
		for (size_t index = 0; index < level.myTexels.size(); ++index)
		{
			const std::array<double, 4>& texel = level.myTexels[index];
			uint8_t* out = bytes + index * 4;
			for (int channel = 0; channel < 3; ++channel)
			{
				out[channel] =
				    ToByte(aNormalFlag ? texel[channel] * 0.5 + 0.5 : LinearToSrgb(texel[channel]));
			}
			out[3] = ToByte(texel[3]);
		}
	}
	return true;
}
} // namespace Content
