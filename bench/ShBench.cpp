// SH projection of the ambient bake's 32x32 probe cubes: one cube from memory, a batch of 64 from one
// atlas (time per cube), and one cube texture read back from the GPU (llvmpipe; upload excluded).

#include <benchmark/benchmark.h>

#include <cstdint>
#include <random>
#include <vector>

#include "platform/gpu/Device.h"
#include "platform/gpu/Texture.h"
#include "platform/sh/ShProjection.h"

namespace
{
constexpr int ourFaceWidth = 32;

std::vector<float> RandomTexels(size_t aCount)
{
	std::mt19937 generator(7u);
	std::uniform_real_distribution<float> distribution(0.0f, 4.0f);
	std::vector<float> values(aCount);
	for (float& value : values)
	{
		value = distribution(generator);
	}
	return values;
}

void BM_ProjectCubeTexels(benchmark::State& aState)
{
	const std::vector<float> texels = RandomTexels(6 * ourFaceWidth * ourFaceWidth * 4);
	float r[9], g[9], b[9];
	for (auto _ : aState)
	{
		Sh::ProjectCubeTexels(texels.data(), ourFaceWidth, 4, r, g, b);
		benchmark::DoNotOptimize(r);
		benchmark::ClobberMemory();
	}
}
BENCHMARK(BM_ProjectCubeTexels)->Unit(benchmark::kMicrosecond);

// 64 cubes, 384 tiles of 32x32 in a 1024-wide atlas (32 tiles per row, 12 rows): the time is per
// batch, items/s counts cubes.
void BM_ProjectCubeAtlasPerCube(benchmark::State& aState)
{
	const int cubes = 64;
	const int width = 1024;
	const int height = 12 * ourFaceWidth;
	const std::vector<float> texels = RandomTexels(static_cast<size_t>(width * height * 4));
	std::vector<float> coefficients(cubes * Sh::ourCubeCoefficientCount);
	for (auto _ : aState)
	{
		Sh::ProjectCubeAtlas(texels.data(), width, height, 4, ourFaceWidth, cubes, coefficients.data());
		benchmark::DoNotOptimize(coefficients.data());
		benchmark::ClobberMemory();
	}
	aState.SetItemsProcessed(aState.iterations() * cubes); // items/s: cubes per second
}
BENCHMARK(BM_ProjectCubeAtlasPerCube)->Unit(benchmark::kMicrosecond);

void BM_ProjectCubeMapTexture(benchmark::State& aState)
{
	Gpu::Device device;
	if (!device.Init(64, 64))
	{
		aState.SkipWithError("no OpenGL 4.5 core context");
		return;
	}
	Gpu::Texture cube;
	const std::vector<float> texels = RandomTexels(6 * ourFaceWidth * ourFaceWidth * 4);
	bool readyFlag = cube.Init(device.GetContext(), {.myKind = Gpu::TextureKind::TextureCube,
	                                                 .myWidth = ourFaceWidth,
	                                                 .myHeight = ourFaceWidth,
	                                                 .myArraySize = 6,
	                                                 .myFormat = Dds::Format::R32G32B32A32_FLOAT,
	                                                 .myLabel = "bench probe"});
	const size_t faceFloats = texels.size() / 6;
	for (int face = 0; readyFlag && face < 6; ++face)
	{
		readyFlag = cube.Upload(0, face, texels.data() + faceFloats * static_cast<size_t>(face),
		                        ourFaceWidth * 4 * sizeof(float));
	}
	float r[9], g[9], b[9];
	for (auto _ : aState)
	{
		if (!readyFlag || !Sh::ProjectCubeMap(device.GetContext(), 3, cube, r, g, b))
		{
			aState.SkipWithError("projection failed");
			break;
		}
		benchmark::DoNotOptimize(r);
	}
	cube.Destroy();
	device.Destroy();
}
BENCHMARK(BM_ProjectCubeMapTexture)->Unit(benchmark::kMicrosecond);
} // namespace
