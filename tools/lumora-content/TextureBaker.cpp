#include "TextureBaker.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <vector>

#include "platform/dds/Format.h"

namespace Content
{
namespace
{
// One mip level as floats, four channels per texel, in the space where averaging is right
// (linear values for the colour and grey maps, unit vectors for the normal map).
struct Level
{
	uint32_t mySize = 0;
	std::vector<std::array<double, 4>> myTexels;
};

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

double Coordinate(uint32_t anIndex, uint32_t aSize)
{
	return (anIndex + 0.5) / aSize;
}

Level SampleLevelZero(MaterialKind aMaterial, MapKind aMap)
{
	Level level;
	level.mySize = MapSize(aMap);
	const uint32_t size = level.mySize;
	level.myTexels.resize(size_t(size) * size);
	if (aMap == MapKind::Normal)
	{
		std::vector<double> heights(size_t(size) * size);
		for (uint32_t y = 0; y < size; ++y)
		{
			for (uint32_t x = 0; x < size; ++x)
			{
				heights[size_t(y) * size + x] =
				    SampleMaterial(aMaterial, Coordinate(x, size), Coordinate(y, size)).myHeight;
			}
		}
		const double strength = NormalStrength(aMaterial);
		auto height = [&](uint32_t anX, uint32_t anY) {
			return heights[size_t(anY % size) * size + anX % size];
		};
		for (uint32_t y = 0; y < size; ++y)
		{
			for (uint32_t x = 0; x < size; ++x)
			{
				const double alongU = (height(x + 1, y) - height(x + size - 1, y)) * 0.5;
				// Rows run down the image while v runs up it.
				const double alongV = -(height(x, y + 1) - height(x, y + size - 1)) * 0.5;
				double normal[3] = {-alongU * strength, -alongV * strength, 1.0};
				const double length =
				    std::sqrt(normal[0] * normal[0] + normal[1] * normal[1] + normal[2] * normal[2]);
				level.myTexels[size_t(y) * size + x] = {normal[0] / length, normal[1] / length,
				                                        normal[2] / length, height(x, y)};
			}
		}
		return level;
	}
	for (uint32_t y = 0; y < size; ++y)
	{
		for (uint32_t x = 0; x < size; ++x)
		{
			const Texel texel = SampleMaterial(aMaterial, Coordinate(x, size), Coordinate(y, size));
			std::array<double, 4>& out = level.myTexels[size_t(y) * size + x];
			switch (aMap)
			{
			case MapKind::Albedo:
				out = {SrgbToLinear(texel.myColor[0]), SrgbToLinear(texel.myColor[1]),
				       SrgbToLinear(texel.myColor[2]), 1.0};
				break;
			case MapKind::Roughness:
				out = {texel.myRoughness, texel.myRoughness, texel.myRoughness, 1.0};
				break;
			case MapKind::Occlusion:
				out = {texel.myOcclusion, texel.myOcclusion, texel.myOcclusion, 1.0};
				break;
			case MapKind::Normal:
				break;
			}
		}
	}
	return level;
}

Level Downsample(const Level& aLevel, MapKind aMap)
{
	Level half;
	half.mySize = std::max(aLevel.mySize / 2, 1u);
	half.myTexels.resize(size_t(half.mySize) * half.mySize);
	for (uint32_t y = 0; y < half.mySize; ++y)
	{
		for (uint32_t x = 0; x < half.mySize; ++x)
		{
			std::array<double, 4> sum = {0.0, 0.0, 0.0, 0.0};
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
			}
			if (aMap == MapKind::Normal)
			{
				const double length = std::sqrt(sum[0] * sum[0] + sum[1] * sum[1] + sum[2] * sum[2]);
				for (int channel = 0; channel < 3; ++channel)
				{
					sum[channel] = length > 1e-9 ? sum[channel] / length : (channel == 2 ? 1.0 : 0.0);
				}
			}
			half.myTexels[size_t(y) * half.mySize + x] = sum;
		}
	}
	return half;
}

void Store(const Level& aLevel, MapKind aMap, uint8_t* someBytes)
{
	for (size_t index = 0; index < aLevel.myTexels.size(); ++index)
	{
		const std::array<double, 4>& texel = aLevel.myTexels[index];
		uint8_t* out = someBytes + index * 4;
		for (int channel = 0; channel < 4; ++channel)
		{
			double value = texel[channel];
			if (aMap == MapKind::Normal && channel < 3)
			{
				value = value * 0.5 + 0.5;
			}
			else if (channel < 3)
			{
				value = LinearToSrgb(value);
			}
			out[channel] = ToByte(value);
		}
	}
}
} // namespace

const char* MapSuffix(MapKind aMap)
{
	switch (aMap)
	{
	case MapKind::Albedo:
		return "albedo";
	case MapKind::Normal:
		return "normal";
	case MapKind::Roughness:
		return "roughness";
	case MapKind::Occlusion:
		return "ao";
	}
	return "unknown";
}

uint32_t MapSize(MapKind aMap)
{
	return (aMap == MapKind::Albedo || aMap == MapKind::Normal) ? 256 : 128;
}

std::string TextureFileName(MaterialKind aMaterial, MapKind aMap)
{
	return std::string(MaterialName(aMaterial)) + "_" + MapSuffix(aMap) + ".dds";
}

bool BakeMap(MaterialKind aMaterial, MapKind aMap, Dds::Image& anImageOut, std::string& anErrorOut)
{
	const uint32_t size = MapSize(aMap);
	uint32_t mipCount = 1;
	while ((size >> (mipCount - 1)) > 1)
	{
		++mipCount;
	}
	Dds::ImageInfo info;
	info.myWidth = size;
	info.myHeight = size;
	info.myDepth = 1;
	info.myArraySize = 1;
	info.myMipLevels = mipCount;
	info.myFormat = aMap == MapKind::Normal ? Dds::Format::R8G8B8A8_UNORM : Dds::Format::R8G8B8A8_UNORM_SRGB;
	if (!anImageOut.Init(info, anErrorOut))
	{
		return false;
	}
	Level level = SampleLevelZero(aMaterial, aMap);
	for (uint32_t mip = 0; mip < mipCount; ++mip)
	{
		if (mip > 0)
		{
			level = Downsample(level, aMap);
		}
		Store(level, aMap, anImageOut.Data(mip, 0));
	}
	return true;
}
} // namespace Content
