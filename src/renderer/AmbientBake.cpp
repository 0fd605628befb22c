// The ambient bake: an SH irradiance volume over the level's rooms, a probe every two
// units, each probe's cubemap rendered through the frame's passes and projected onto
// second-order SH, packed into the seven volume textures the ambient pass samples.
#include "renderer/Renderer.h"

#include <algorithm>
#include <cmath>
#include <cstring>
#include <string>
#include <vector>

#include "engine/Engine.h"
#include "engine/EngineReport.h"
#include "engine/Room.h"
#include "platform/dds/DdsFile.h"
#include "platform/dds/Image.h"
#include "platform/gpu/Readback.h"
#include "platform/sh/ShProjection.h"
#include "renderer/AmbientVolumeFile.h"
#include "renderer/DynamicCubemap.h"
#include "renderer/ProbeHelper.h"
#include "renderer/ShPacking.h"

namespace Zeph
{
namespace
{
constexpr float ourProbeSpacing = 2.0f;

// The SH constants of the irradiance packing, with sqrt(pi) of the single-precision pi.
struct ShConstants
{
	float myC0;
	float myC1;
	float myC2;
	float myC3;
	float myC4;
};

const ShConstants& Constants()
{
	static const ShConstants constants = [] {
		const float sqrtPi = std::sqrt(3.14159274f);
		ShConstants values{};
		values.myC0 = 1.0f / (2.0f * sqrtPi);
		values.myC1 = std::sqrt(3.0f) / (3.0f * sqrtPi);
		values.myC2 = std::sqrt(15.0f) / (8.0f * sqrtPi);
		values.myC3 = std::sqrt(5.0f) / (16.0f * sqrtPi);
		values.myC4 = 0.5f * values.myC2;
		return values;
	}();
	return constants;
}

bool StrictlyInsideAnyRoom(const GrowingArray<Room*>& someRooms, const Vector3<float>& aPoint)
{
	for (int index = 0; index < someRooms.Count(); ++index)
	{
		const Vector3<float>& minimum = someRooms[index]->GetMin();
		const Vector3<float>& maximum = someRooms[index]->GetMax();
		if (aPoint.x > minimum.x && aPoint.x < maximum.x && aPoint.y > minimum.y && aPoint.y < maximum.y &&
		    aPoint.z > minimum.z && aPoint.z < maximum.z)
		{
			return true;
		}
	}
	return false;
}
} // namespace

void Renderer::SaveProbeCapture(DynamicCubemap& aCube, const std::string& aPath)
{
	// The sharp capture only (mip 0 of each face), as 32-bit floats: a debugging aid.
	std::vector<float> texels;
	if (aCube.GetTexture() == nullptr || !Gpu::ReadTexture(*aCube.GetTexture(), 0, 0, 6, texels))
	{
		return;
	}
	Dds::ImageInfo info;
	info.myWidth = static_cast<uint32_t>(aCube.GetSize());
	info.myHeight = info.myWidth;
	info.myArraySize = 6;
	info.myMiscFlags = Dds::MiscTextureCube;
	info.myFormat = Dds::Format::R32G32B32A32_FLOAT;
	Dds::Image image;
	std::string error;
	if (!image.Init(info, error) || image.Bytes().size() != texels.size() * sizeof(float))
	{
		return;
	}
	std::memcpy(image.Bytes().data(), texels.data(), image.Bytes().size());
	if (!Dds::SaveToFile(aPath, image, error))
	{
		ReportDebug(__LINE__, "Zeph::Renderer::GenerateSH", "Could not save %s: %s", aPath.c_str(),
		            error.c_str());
	}
}

void Renderer::GenerateSH(const GrowingArray<Room*>& someRooms, const std::string& aPath, int aBounces,
                          bool aDebugFlag)
{
	Engine* engine = Engine::GetInstance();
	if (engine == nullptr)
	{
		return;
	}
	myProbeHelper.reset();
	myProbeHelper = std::make_unique<ProbeHelper>();
	myProbeHelper->Init();
	mySHLoadedFlag = false;
	PublishSHViews();
	DynamicCubemap* cube = myProbeHelper->GetSHCubemap();
	DeferredRenderTargetHelper gbuffer;
	if (cube == nullptr || !gbuffer.Init(cube->GetSize(), cube->GetSize()))
	{
		myCollector.Reset();
		return;
	}

	Vector3<float> worldMin(2000000.0f, 2000000.0f, 2000000.0f);
	Vector3<float> worldMax(-2000000.0f, -20000000.0f, -2000000.0f);
	for (int index = 0; index < someRooms.Count(); ++index)
	{
		const Vector3<float>& minimum = someRooms[index]->GetMin();
		const Vector3<float>& maximum = someRooms[index]->GetMax();
		worldMin.Set(std::min(worldMin.x, minimum.x), std::min(worldMin.y, minimum.y),
		             std::min(worldMin.z, minimum.z));
		worldMax.Set(std::max(worldMax.x, maximum.x), std::max(worldMax.y, maximum.y),
		             std::max(worldMax.z, maximum.z));
	}
	const Vector3<float> worldSize = worldMax - worldMin;
	const int counts[3] = {static_cast<int>(std::ceil(worldSize.x / ourProbeSpacing)),
	                       static_cast<int>(std::ceil(worldSize.y / ourProbeSpacing)),
	                       static_cast<int>(std::ceil(worldSize.z / ourProbeSpacing))};
	myBakingProgressCounter = 0;
	myBakingProgress = 0;
	// Without rooms (or with rooms of no extent) there is no grid: nothing is baked and
	// no file is written; the volume stays empty.
	if (counts[0] <= 0 || counts[1] <= 0 || counts[2] <= 0 || counts[0] > AmbientVolume::ourMaxCount ||
	    counts[1] > AmbientVolume::ourMaxCount || counts[2] > AmbientVolume::ourMaxCount)
	{
		gbuffer.Destroy();
		myCollector.Reset();
		return;
	}
	SetVolumeBounds(worldMin, worldSize);
	const long long cells = static_cast<long long>(counts[0]) * counts[1] * counts[2];
	std::vector<uint32_t> blocks[ProbeHelper::ourBlockCount];
	for (std::vector<uint32_t>& block : blocks)
	{
		block.assign(static_cast<size_t>(cells), ourNeutralSHTexel);
	}
	// The first bounce sees a neutral volume (about no irradiance): direct light only.
	UploadSHToGPU(false, blocks, counts[0], counts[1], counts[2]);

	Gpu::Context& context = engine->GetContext();
	const double total = static_cast<double>(cells) * std::max(aBounces, 1);
	for (int bounce = 0; bounce < aBounces; ++bounce)
	{
		context.SetViewport(cube->GetViewport());
		int iz = 0;
		for (float z = worldMin.z + 1.0f; z < worldMax.z; z += ourProbeSpacing, ++iz)
		{
			int iy = 0;
			for (float y = worldMin.y + 1.0f; y < worldMax.y; y += ourProbeSpacing, ++iy)
			{
				int ix = 0;
				for (float x = worldMin.x + 1.0f; x < worldMax.x; x += ourProbeSpacing, ++ix)
				{
					const Vector3<float> probe(x, y, z);
					const size_t cell = static_cast<size_t>((iz * counts[1] + iy) * counts[0] + ix);
					if (StrictlyInsideAnyRoom(someRooms, probe))
					{
						for (int face = 0; face < 6; ++face)
						{
							RenderProbeFace(*cube, face, probe, gbuffer, false);
						}
						if (aDebugFlag)
						{
							SaveProbeCapture(*cube, "data/cubemaps/sh debug/" + std::to_string(cell) +
							                            "bounce" + std::to_string(bounce) + ".dds");
						}
						AddScalars(*cube, blocks, ix, iy, iz, counts[0], counts[1], counts[2]);
					}
					else
					{
						for (std::vector<uint32_t>& block : blocks)
						{
							block[cell] = ourNeutralSHTexel;
						}
					}
					++myBakingProgressCounter;
					myBakingProgress = std::min(
					    100, static_cast<int>(static_cast<double>(myBakingProgressCounter) / total * 100.0));
				}
			}
		}
		// Only now does the next bounce see this one: within a bounce every probe is lit
		// by the previous bounce's volume.
		UploadSHToGPU(true, blocks, counts[0], counts[1], counts[2]);
		if (bounce == aBounces - 1)
		{
			AmbientVolume volume;
			volume.myWorldSize = worldSize;
			volume.myWorldMin = worldMin;
			std::copy(counts, counts + 3, volume.myCounts);
			for (int block = 0; block < ProbeHelper::ourBlockCount; ++block)
			{
				volume.myBlocks[block] = blocks[block];
			}
			if (!WriteAmbientVolume(aPath, volume))
			{
				ReportDebug(__LINE__, "Zeph::Renderer::GenerateSH", "Could not write %s", aPath.c_str());
			}
		}
	}
	myCollector.Reset();
	gbuffer.Destroy();
}

void Renderer::AddScalars(DynamicCubemap& aCube, std::vector<uint32_t>* someBlocks, int anX, int aY, int aZ,
                          int aCountX, int aCountY, int aCountZ)
{
	(void)aCountZ;
	float red[Sh::ourCoefficientCount];
	float green[Sh::ourCoefficientCount];
	float blue[Sh::ourCoefficientCount];
	if (aCube.GetTexture() == nullptr ||
	    !Sh::ProjectCubeMap(Engine::GetInstance()->GetContext(), 3, *aCube.GetTexture(), red, green, blue))
	{
		ReportCritical(1154, "Zeph::Renderer::AddScalars", "FAILED TO REFRESH CUBEMAP");
		return;
	}
	const ShConstants& c = Constants();
	const size_t cell = static_cast<size_t>((aZ * aCountY + aY) * aCountX + anX);
	const float* channels[3] = {red, green, blue};
	for (int channel = 0; channel < 3; ++channel)
	{
		const float* s = channels[channel];
		someBlocks[channel][cell] =
		    PackSHVector(-c.myC1 * s[3], -c.myC1 * s[1], c.myC1 * s[2], c.myC0 * s[0] - c.myC3 * s[6]);
		someBlocks[3 + channel][cell] =
		    PackSHVector(c.myC2 * s[4], -c.myC2 * s[5], 3.0f * c.myC3 * s[6], -c.myC2 * s[7]);
	}
	someBlocks[6][cell] = PackSHVector(c.myC4 * red[8], c.myC4 * green[8], c.myC4 * blue[8], 1.0f);
}
} // namespace Zeph
