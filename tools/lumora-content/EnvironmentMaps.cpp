#include "EnvironmentMaps.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <vector>

#include "CubeFaces.h"
#include "HalfFloat.h"
#include "platform/dds/Format.h"

namespace Content
{
namespace
{
constexpr double ourZenith = 1.0;
constexpr double ourWalls = 0.25;
constexpr double ourFloor = 0.08;

using Rgba = std::array<double, 4>;

// One face of one mip level, row by row.
struct FaceLevel
{
	uint32_t mySize = 0;
	std::vector<Rgba> myTexels;
};

bool InitCube(uint32_t aMipCount, Dds::Image& anImageOut, std::string& anErrorOut)
{
	Dds::ImageInfo info;
	info.myWidth = ourCubemapSize;
	info.myHeight = ourCubemapSize;
	info.myArraySize = ourCubeFaceCount;
	info.myMipLevels = aMipCount;
	info.myMiscFlags = Dds::MiscTextureCube;
	info.myFormat = Dds::Format::R16G16B16A16_FLOAT;
	return anImageOut.Init(info, anErrorOut);
}

// Samples aFunction at every texel centre of one face of level 0.
template <typename Function> FaceLevel SampleFace(uint32_t aFace, Function aFunction)
{
	FaceLevel level;
	level.mySize = ourCubemapSize;
	level.myTexels.reserve(size_t(ourCubemapSize) * ourCubemapSize);
	for (uint32_t y = 0; y < ourCubemapSize; ++y)
	{
		for (uint32_t x = 0; x < ourCubemapSize; ++x)
		{
			level.myTexels.push_back(aFunction(CubeTexelDirection(aFace, x, y, ourCubemapSize)));
		}
	}
	return level;
}

FaceLevel Downsample(const FaceLevel& aLevel)
{
	FaceLevel half;
	half.mySize = std::max(aLevel.mySize / 2, 1u);
	half.myTexels.resize(size_t(half.mySize) * half.mySize);
	for (uint32_t y = 0; y < half.mySize; ++y)
	{
		for (uint32_t x = 0; x < half.mySize; ++x)
		{
			Rgba sum = {0.0, 0.0, 0.0, 0.0};
			for (uint32_t corner = 0; corner < 4; ++corner)
			{
				const uint32_t sourceX = std::min(x * 2 + (corner & 1), aLevel.mySize - 1);
				const uint32_t sourceY = std::min(y * 2 + (corner >> 1), aLevel.mySize - 1);
				const Rgba& texel = aLevel.myTexels[size_t(sourceY) * aLevel.mySize + sourceX];
				for (size_t channel = 0; channel < 4; ++channel)
				{
					sum[channel] += texel[channel] * 0.25;
				}
			}
			half.myTexels[size_t(y) * half.mySize + x] = sum;
		}
	}
	return half;
}

// Little-endian halves, four per texel, whatever the host's byte order.
void Store(const FaceLevel& aLevel, uint8_t* someBytes)
{
	for (const Rgba& texel : aLevel.myTexels)
	{
		for (const double value : texel)
		{
			const uint16_t bits = FloatToHalf(static_cast<float>(value));
			*someBytes++ = static_cast<uint8_t>(bits & 0xFFu);
			*someBytes++ = static_cast<uint8_t>(bits >> 8);
		}
	}
}

double SmoothStep(double anEdge0, double anEdge1, double aValue)
{
	const double t = std::clamp((aValue - anEdge0) / (anEdge1 - anEdge0), 0.0, 1.0);
	return t * t * (3.0 - 2.0 * t);
}
} // namespace

double InteriorRadiance(double anX, double aY, double aZ)
{
	const double length = std::sqrt(anX * anX + aY * aY + aZ * aZ);
	const double up = length > 0.0 ? aY / length : 0.0;
	if (up >= 0.0)
	{
		// A broad lobe: half the zenith's brightness over the walls at about 50 degrees up.
		return ourWalls + (ourZenith - ourWalls) * up * up * up;
	}
	// The walls' grey meets the floor a little below the horizon.
	return ourWalls + (ourFloor - ourWalls) * SmoothStep(0.0, 0.35, -up);
}

bool BuildFallbackCubemap(Dds::Image& anImageOut, std::string& anErrorOut)
{
	const uint32_t mipCount = Dds::FullMipCount(ourCubemapSize, ourCubemapSize, 1);
	if (!InitCube(mipCount, anImageOut, anErrorOut))
	{
		return false;
	}
	for (uint32_t face = 0; face < ourCubeFaceCount; ++face)
	{
		FaceLevel level = SampleFace(face, [](const Vec3& aDirection) {
			const double value = InteriorRadiance(aDirection.x, aDirection.y, aDirection.z);
			return Rgba{value, value, value, 1.0};
		});
		for (uint32_t mip = 0; mip < mipCount; ++mip)
		{
			if (mip > 0)
			{
				level = Downsample(level);
			}
			Store(level, anImageOut.Data(mip, face));
		}
	}
	return true;
}

bool BuildNormalTestCubemap(Dds::Image& anImageOut, std::string& anErrorOut)
{
	if (!InitCube(1, anImageOut, anErrorOut))
	{
		return false;
	}
	for (uint32_t face = 0; face < ourCubeFaceCount; ++face)
	{
		const FaceLevel level = SampleFace(face, [](const Vec3& aDirection) {
			return Rgba{aDirection.x, aDirection.y, aDirection.z, 1.0};
		});
		Store(level, anImageOut.Data(0, face));
	}
	return true;
}
} // namespace Content
