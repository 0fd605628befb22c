// The ambient bake: an SH irradiance volume over the level's rooms, a probe every two
// units, each probe's cubemap rendered through the frame's passes and projected onto
// second-order SH, packed into the seven volume textures the ambient pass samples.
#include "renderer/Renderer.h"

#include <algorithm>
#include <chrono>
#include <cmath>
#include <cstring>
#include <string>
#include <vector>

#include "engine/Engine.h"
#include "engine/EngineReport.h"
#include "engine/Room.h"
#include "platform/dds/DdsFile.h"
#include "platform/dds/Image.h"
#include "platform/gpu/Context.h"
#include "platform/gpu/Readback.h"
#include "platform/gpu/Texture.h"
#include "platform/sh/ShProjection.h"
#include "renderer/AmbientGrid.h"
#include "renderer/AmbientVolumeFile.h"
#include "renderer/DynamicCubemap.h"
#include "renderer/ProbeHelper.h"
#include "renderer/ShPacking.h"

namespace Zeph
{
namespace
{
// Seconds since the last lap (or since it was made).
class Stopwatch
{
public:
	double Lap()
	{
		const auto now = std::chrono::steady_clock::now();
		const double seconds = std::chrono::duration<double>(now - myStart).count();
		myStart = now;
		return seconds;
	}

private:
	std::chrono::steady_clock::time_point myStart = std::chrono::steady_clock::now();
};

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

// The seven packed vectors of one cell from its red, green and blue coefficients.
void StoreScalars(const float* aRed, const float* aGreen, const float* aBlue,
                  std::vector<uint32_t>* someBlocks, size_t aCell)
{
	const ShConstants& c = Constants();
	const float* channels[3] = {aRed, aGreen, aBlue};
	for (int channel = 0; channel < 3; ++channel)
	{
		const float* s = channels[channel];
		someBlocks[channel][aCell] =
		    PackSHVector(-c.myC1 * s[3], -c.myC1 * s[1], c.myC1 * s[2], c.myC0 * s[0] - c.myC3 * s[6]);
		someBlocks[3 + channel][aCell] =
		    PackSHVector(c.myC2 * s[4], -c.myC2 * s[5], 3.0f * c.myC3 * s[6], -c.myC2 * s[7]);
	}
	someBlocks[6][aCell] = PackSHVector(c.myC4 * aRed[8], c.myC4 * aGreen[8], c.myC4 * aBlue[8], 1.0f);
}

// Probes rendered one after another are gathered in an atlas (each face copied into
// its tile) and read back together: on a software rasterizer every read-back waits
// for the whole pipeline, so one per batch instead of one per probe.
class ProbeAtlas
{
public:
	static constexpr int ourCubesPerBatch = 64;
	static constexpr int ourTilesPerRow = 48;

	bool Init(Gpu::Context& aContext, int aFaceSize)
	{
		myFaceSize = aFaceSize;
		Gpu::TextureDesc desc;
		desc.myWidth = ourTilesPerRow * aFaceSize;
		desc.myHeight = (ourCubesPerBatch * 6 + ourTilesPerRow - 1) / ourTilesPerRow * aFaceSize;
		desc.myFormat = Dds::Format::R16G16B16A16_FLOAT;
		desc.myLabel = "SH probe atlas";
		return myTexture.Init(aContext, desc);
	}
	bool IsFull() const { return static_cast<int>(myCells.size()) == ourCubesPerBatch; }
	bool IsEmpty() const { return myCells.empty(); }

	// Copies mip 0 of the cube's six faces into the next cube's tiles.
	bool Add(Gpu::Context& aContext, const Gpu::Texture& aCube, size_t aCell)
	{
		const int first = static_cast<int>(myCells.size()) * 6;
		for (int face = 0; face < 6; ++face)
		{
			const int tile = first + face;
			if (!aContext.CopySubresourceRegion(myTexture, 0, 0, (tile % ourTilesPerRow) * myFaceSize,
			                                    (tile / ourTilesPerRow) * myFaceSize, 0, aCube, 0, face))
			{
				return false;
			}
		}
		myCells.push_back(aCell);
		return true;
	}

	// One read-back and projection for every cube gathered; their cells' vectors stored.
	bool Flush(std::vector<uint32_t>* someBlocks, Renderer::BakeTimings& someTimings)
	{
		if (myCells.empty())
		{
			return true;
		}
		std::vector<float> coefficients(myCells.size() * Sh::ourCubeCoefficientCount);
		Stopwatch watch;
		const bool read = Gpu::ReadTexture(myTexture, 0, 0, 1, myTexels);
		someTimings.myReadback += watch.Lap();
		const bool projected =
		    read &&
		    Sh::ProjectCubeAtlas(myTexels.data(), myTexture.GetMipWidth(0), myTexture.GetMipHeight(0), 4,
		                         myFaceSize, static_cast<int>(myCells.size()), coefficients.data());
		someTimings.myProjection += watch.Lap();
		if (projected)
		{
			for (size_t index = 0; index < myCells.size(); ++index)
			{
				const float* rgb = &coefficients[index * Sh::ourCubeCoefficientCount];
				StoreScalars(rgb, rgb + Sh::ourCoefficientCount, rgb + 2 * Sh::ourCoefficientCount,
				             someBlocks, myCells[index]);
			}
		}
		myCells.clear();
		return projected;
	}

private:
	Gpu::Texture myTexture;
	int myFaceSize = 0;
	std::vector<size_t> myCells;
	std::vector<float> myTexels;
};

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
	myBakingProgressCounter = 0;
	myBakingProgress = 0;
	myBakedProbeCount = 0;
	myBakeTimings = BakeTimings();
	const AmbientGrid grid = AmbientGrid::FromRooms(someRooms);
	// A grid that cannot be held is refused before anything is touched: the volume shown
	// and the file on disk stay as they were.
	if (const std::string problem = grid.GetSizeProblem(); !problem.empty())
	{
		ReportError(__LINE__, "Zeph::Renderer::GenerateSH", "%s; %s is left as it was", problem.c_str(),
		            aPath.c_str());
		myCollector.Reset();
		return;
	}
	myProbeHelper.reset();
	myProbeHelper = std::make_unique<ProbeHelper>();
	myProbeHelper->Init();
	mySHLoadedFlag = false;
	PublishSHViews();
	// Without rooms (or with rooms of no extent) there is no grid: nothing is baked, no
	// file is written, and the volume is gone, its bounds with it.
	if (grid.IsEmpty())
	{
		SetVolumeBounds(Vector3<float>(0.0f, 0.0f, 0.0f), Vector3<float>(0.0f, 0.0f, 0.0f));
		myCollector.Reset();
		return;
	}
	DynamicCubemap* cube = myProbeHelper->GetSHCubemap();
	DeferredRenderTargetHelper gbuffer;
	if (cube == nullptr || !gbuffer.Init(cube->GetSize(), cube->GetSize()))
	{
		myCollector.Reset();
		return;
	}
	const int* counts = grid.myCounts;
	const long long cells = grid.GetCellCount();
	if (aBounces > 0)
	{
		// A large level bakes for hours: say how much there is to do before starting.
		ReportDebug(__LINE__, "Zeph::Renderer::GenerateSH",
		            "Baking %lld probes (of %d x %d x %d cells) over %d bounce%s into %s",
		            grid.CountProbesInside(someRooms), counts[0], counts[1], counts[2], aBounces,
		            aBounces == 1 ? "" : "s", aPath.c_str());
	}
	SetVolumeBounds(grid.myWorldMin, grid.myWorldSize);
	std::vector<uint32_t> blocks[ProbeHelper::ourBlockCount];
	for (std::vector<uint32_t>& block : blocks)
	{
		block.assign(static_cast<size_t>(cells), ourNeutralSHTexel);
	}
	// The first bounce sees a neutral volume (about no irradiance): direct light only.
	UploadSHToGPU(false, blocks, counts[0], counts[1], counts[2]);

	Gpu::Context& context = engine->GetContext();
	ProbeAtlas atlas;
	const bool batchedFlag =
	    myProbeReadback == ProbeReadback::BATCHED && atlas.Init(context, cube->GetSize());
	const auto flush = [&] {
		if (!atlas.Flush(blocks, myBakeTimings))
		{
			ReportCritical(1154, "Zeph::Renderer::AddScalars", "FAILED TO REFRESH CUBEMAP");
		}
	};
	const double total = static_cast<double>(cells) * std::max(aBounces, 1);
	for (int bounce = 0; bounce < aBounces; ++bounce)
	{
		context.SetViewport(cube->GetViewport());
		grid.ForEachProbe([&](const Vector3<float>& aProbe, int anX, int aY, int aZ, size_t aCell) {
			if (AmbientGrid::StrictlyInsideAnyRoom(someRooms, aProbe))
			{
				Stopwatch watch;
				for (int face = 0; face < 6; ++face)
				{
					RenderProbeFace(*cube, face, aProbe, gbuffer, false);
				}
				myBakeTimings.myRendering += watch.Lap();
				if (aDebugFlag)
				{
					SaveProbeCapture(*cube, "data/cubemaps/sh debug/" + std::to_string(aCell) + "bounce" +
					                            std::to_string(bounce) + ".dds");
				}
				// Batched where the atlas could be made, else one read-back per probe.
				if (batchedFlag && cube->GetTexture() != nullptr &&
				    atlas.Add(context, *cube->GetTexture(), aCell))
				{
					myBakeTimings.myRendering += watch.Lap();
					if (atlas.IsFull())
					{
						flush();
					}
				}
				else
				{
					AddScalars(*cube, blocks, anX, aY, aZ, counts[0], counts[1], counts[2]);
				}
				++myBakedProbeCount;
			}
			else
			{
				for (std::vector<uint32_t>& block : blocks)
				{
					block[aCell] = ourNeutralSHTexel;
				}
			}
			++myBakingProgressCounter;
			myBakingProgress =
			    std::min(100, static_cast<int>(static_cast<double>(myBakingProgressCounter) / total * 100.0));
		});
		flush();
		// Only now does the next bounce see this one: within a bounce every probe is lit
		// by the previous bounce's volume.
		UploadSHToGPU(true, blocks, counts[0], counts[1], counts[2]);
	}
	if (aBounces > 0)
	{
		AmbientVolume volume;
		volume.myWorldSize = grid.myWorldSize;
		volume.myWorldMin = grid.myWorldMin;
		std::copy(counts, counts + 3, volume.myCounts);
		for (int block = 0; block < ProbeHelper::ourBlockCount; ++block)
		{
			volume.myBlocks[block] = std::move(blocks[block]);
		}
		// The volume on the GPU is the new one either way; the file is replaced whole or
		// not at all.
		std::string problem;
		if (!WriteAmbientVolume(aPath, volume, problem))
		{
			ReportError(__LINE__, "Zeph::Renderer::GenerateSH", "Could not write the ambient light: %s",
			            problem.c_str());
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
	const Gpu::Texture* texture = aCube.GetTexture();
	std::vector<float> cubeTexels;
	bool read = texture != nullptr;
	Stopwatch watch;
	if (read && myProbeReadback == ProbeReadback::PER_FACE)
	{
		// Each face read back alone, then the cube projected as a whole.
		std::vector<float> faceTexels;
		for (int face = 0; face < 6 && read; ++face)
		{
			read = Gpu::ReadTexture(*texture, 0, face, 1, faceTexels);
			cubeTexels.insert(cubeTexels.end(), faceTexels.begin(), faceTexels.end());
		}
	}
	else if (read)
	{
		read = Gpu::ReadTexture(*texture, 0, 0, 6, cubeTexels);
	}
	myBakeTimings.myReadback += watch.Lap();
	const bool projected =
	    read && Sh::ProjectCubeTexels(cubeTexels.data(), texture->GetMipWidth(0), 4, red, green, blue);
	myBakeTimings.myProjection += watch.Lap();
	if (!projected)
	{
		ReportCritical(1154, "Zeph::Renderer::AddScalars", "FAILED TO REFRESH CUBEMAP");
		return;
	}
	StoreScalars(red, green, blue, someBlocks, static_cast<size_t>((aZ * aCountY + aY) * aCountX + anX));
}
} // namespace Zeph
