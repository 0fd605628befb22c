#include "TextureBaker.h"

#include "MipChain.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <vector>

#include "platform/dds/Format.h"

namespace Content
{
namespace
{
double Coordinate(uint32_t anIndex, uint32_t aSize)
{
	return (anIndex + 0.5) / aSize;
}

MipLevel SampleLevelZero(MaterialKind aMaterial, MapKind aMap)
{
	MipLevel level;
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
	return BakeMipChain(SampleLevelZero(aMaterial, aMap), aMap == MapKind::Normal, false, anImageOut,
	                    anErrorOut);
}
} // namespace Content
