// The ambient bake: an SH irradiance volume over the level's rooms, a probe every two
// units, each probe's cubemap rendered through the frame's passes and projected onto
// second-order SH, packed into the seven volume textures the ambient pass samples.
#include "renderer/Renderer.h"

#include <algorithm>
#include <chrono>
#include <cmath>
#include <cstring>
#include <functional>
#include <optional>
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
#include "renderer/AmbientPartFile.h"
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

struct Renderer::SHBakeJob
{
	const GrowingArray<Room*>* myRooms = nullptr;
	AmbientGrid myGrid;
	// Whether the probe at a position (and cell) is baked; null: every probe.
	std::function<bool(const Vector3<float>&, size_t)> mySelected;
	// The volume the first bounce is lit by; null: the neutral one (direct light only).
	const std::vector<uint32_t>* myFirstLight = nullptr;
	int myFirstBounce = 1;
	int myBounceCount = 1;
	bool myDebugFlag = false;
	// A part of a bake spread over machines: its probes start from the G-buffer the whole bake
	// would have (RunSHBake).
	bool myPartFlag = false;
	// Where the volume goes, for the log.
	std::string myTarget;
};

Renderer::SHBakeRun Renderer::RunSHBake(const SHBakeJob& aJob, std::vector<uint32_t>* someBlocks)
{
	Engine* engine = Engine::GetInstance();
	const GrowingArray<Room*>& rooms = *aJob.myRooms;
	const AmbientGrid& grid = aJob.myGrid;
	const int* counts = grid.myCounts;
	DynamicCubemap* cube = myProbeHelper->GetSHCubemap();
	DeferredRenderTargetHelper gbuffer;
	if (engine == nullptr || cube == nullptr || !gbuffer.Init(cube->GetSize(), cube->GetSize()))
	{
		return SHBakeRun::NOT_RUN;
	}
	const auto selected = [&aJob](const Vector3<float>& aProbe, size_t aCell) {
		return !aJob.mySelected || aJob.mySelected(aProbe, aCell);
	};
	long long selectedCells = 0;
	long long selectedProbes = 0;
	grid.ForEachProbe([&](const Vector3<float>& aProbe, int, int, int, size_t aCell) {
		if (selected(aProbe, aCell))
		{
			++selectedCells;
			selectedProbes += AmbientGrid::StrictlyInsideAnyRoom(rooms, aProbe) ? 1 : 0;
		}
	});
	myBakeMonitor.Begin(BakePhase::AMBIENT, selectedProbes * aJob.myBounceCount, 0, aJob.myBounceCount);
	// A large level bakes for hours: say how much there is to do before starting.
	if (aJob.myBounceCount > 0)
	{
		ReportDebug(__LINE__, "Zeph::Renderer::GenerateSH",
		            "Baking %lld probes (of %d x %d x %d cells) over %d bounce%s into %s", selectedProbes,
		            counts[0], counts[1], counts[2], aJob.myBounceCount, aJob.myBounceCount == 1 ? "" : "s",
		            aJob.myTarget.c_str());
	}
	SetVolumeBounds(grid.myWorldMin, grid.myWorldSize);
	if (aJob.myFirstLight != nullptr)
	{
		UploadSHToGPU(false, aJob.myFirstLight, counts[0], counts[1], counts[2]);
	}
	else
	{
		std::vector<uint32_t> neutral[ProbeHelper::ourBlockCount];
		for (std::vector<uint32_t>& block : neutral)
		{
			block.assign(static_cast<size_t>(grid.GetCellCount()), ourNeutralSHTexel);
		}
		UploadSHToGPU(false, neutral, counts[0], counts[1], counts[2]);
	}

	Gpu::Context& context = engine->GetContext();
	if (aJob.myPartFlag)
	{
		// Every probe of a bake draws into this one G-buffer, which is not cleared between faces
		// or probes: where a face sees nothing, what the faces before it drew stays, and the
		// ambient pass lights it. A part starts where the whole bake would be: the probe the whole
		// bake draws just before the part's first (in this bounce, or the last of the bounce
		// before) is drawn first and thrown away. Exact wherever that probe's six faces cover
		// what the part's first face leaves empty, as they do in rooms closed but for doors.
		std::optional<Vector3<float>> last;
		std::optional<Vector3<float>> beforeFirst;
		bool firstFoundFlag = false;
		grid.ForEachProbe([&](const Vector3<float>& aProbe, int, int, int, size_t aCell) {
			if (!firstFoundFlag && selected(aProbe, aCell))
			{
				firstFoundFlag = true;
				beforeFirst = last;
			}
			if (AmbientGrid::StrictlyInsideAnyRoom(rooms, aProbe))
			{
				last = aProbe;
			}
		});
		if (!beforeFirst && aJob.myFirstBounce > 1)
		{
			beforeFirst = last;
		}
		if (beforeFirst)
		{
			Stopwatch watch;
			for (int face = 0; face < 6; ++face)
			{
				RenderProbeFace(*cube, face, *beforeFirst, gbuffer, false);
			}
			myBakeTimings.myRendering += watch.Lap();
		}
	}
	ProbeAtlas atlas;
	const bool batchedFlag =
	    myProbeReadback == ProbeReadback::BATCHED && atlas.Init(context, cube->GetSize());
	// The probes in the atlas are counted as done once read back.
	long long pending = 0;
	const auto flush = [&] {
		if (!atlas.Flush(someBlocks, myBakeTimings))
		{
			ReportCritical(1154, "Zeph::Renderer::AddScalars", "FAILED TO REFRESH CUBEMAP");
		}
		myBakeMonitor.AddProbes(pending);
		pending = 0;
	};
	// The progress counts cells: every cell of the grid in a whole bake (layers beyond the
	// last probe position are never visited), the selected ones otherwise.
	const double cellsToVisit =
	    aJob.mySelected ? static_cast<double>(selectedCells) : static_cast<double>(grid.GetCellCount());
	const double total = cellsToVisit * std::max(aJob.myBounceCount, 1);
	bool cancelledFlag = false;
	for (int run = 0; run < aJob.myBounceCount && !cancelledFlag; ++run)
	{
		const int bounce = aJob.myFirstBounce + run;
		myBakeMonitor.SetBounce(run + 1);
		context.SetViewport(cube->GetViewport());
		grid.ForEachProbe([&](const Vector3<float>& aProbe, int anX, int aY, int aZ, size_t aCell) {
			cancelledFlag = cancelledFlag || myBakeMonitor.IsCancelRequested();
			if (cancelledFlag || !selected(aProbe, aCell))
			{
				return;
			}
			if (AmbientGrid::StrictlyInsideAnyRoom(rooms, aProbe))
			{
				Stopwatch watch;
				for (int face = 0; face < 6; ++face)
				{
					RenderProbeFace(*cube, face, aProbe, gbuffer, false);
				}
				myBakeTimings.myRendering += watch.Lap();
				if (aJob.myDebugFlag)
				{
					SaveProbeCapture(*cube, "data/cubemaps/sh debug/" + std::to_string(aCell) + "bounce" +
					                            std::to_string(bounce - 1) + ".dds");
				}
				// Batched where the atlas could be made, else one read-back per probe.
				if (batchedFlag && cube->GetTexture() != nullptr &&
				    atlas.Add(context, *cube->GetTexture(), aCell))
				{
					myBakeTimings.myRendering += watch.Lap();
					++pending;
					if (atlas.IsFull())
					{
						flush();
					}
				}
				else
				{
					AddScalars(*cube, someBlocks, anX, aY, aZ, counts[0], counts[1], counts[2]);
					myBakeMonitor.AddProbes(1);
				}
				++myBakedProbeCount;
			}
			else
			{
				for (int block = 0; block < ProbeHelper::ourBlockCount; ++block)
				{
					someBlocks[block][aCell] = ourNeutralSHTexel;
				}
			}
			++myBakingProgressCounter;
			myBakingProgress =
			    std::min(100, static_cast<int>(static_cast<double>(myBakingProgressCounter) / total * 100.0));
		});
		flush();
		// Only now does the next bounce see this one: within a bounce every probe is lit
		// by the previous bounce's volume.
		if (!cancelledFlag)
		{
			UploadSHToGPU(true, someBlocks, counts[0], counts[1], counts[2]);
		}
	}
	myCollector.Reset();
	gbuffer.Destroy();
	// A cancel that came during the last read-back still wins: nothing is written yet.
	cancelledFlag = cancelledFlag || myBakeMonitor.IsCancelRequested();
	return cancelledFlag ? SHBakeRun::CANCELLED : SHBakeRun::DONE;
}

namespace
{
bool SameGrid(const AmbientVolume& aVolume, const AmbientGrid& aGrid)
{
	const auto same = [](const Vector3<float>& aLeft, const Vector3<float>& aRight) {
		return aLeft.x == aRight.x && aLeft.y == aRight.y && aLeft.z == aRight.z;
	};
	return same(aVolume.myWorldMin, aGrid.myWorldMin) && same(aVolume.myWorldSize, aGrid.myWorldSize) &&
	       std::equal(aVolume.myCounts, aVolume.myCounts + 3, aGrid.myCounts);
}

std::string DescribeCounts(const int* someCounts)
{
	return std::to_string(someCounts[0]) + " x " + std::to_string(someCounts[1]) + " x " +
	       std::to_string(someCounts[2]);
}
} // namespace

void Renderer::GenerateSH(const GrowingArray<Room*>& someRooms, const std::string& aPath, int aBounces,
                          bool aDebugFlag)
{
	GenerateSHVolume(someRooms, nullptr, aPath, aBounces, aDebugFlag);
}

void Renderer::GenerateSHForRooms(const GrowingArray<Room*>& someRooms,
                                  const GrowingArray<Room*>& someBakedRooms, const std::string& aPath,
                                  int aBounces)
{
	GenerateSHVolume(someRooms, &someBakedRooms, aPath, aBounces, false);
}

void Renderer::GenerateSHVolume(const GrowingArray<Room*>& someRooms,
                                const GrowingArray<Room*>* someBakedRooms, const std::string& aPath,
                                int aBounces, bool aDebugFlag)
{
	const char* function = "Zeph::Renderer::GenerateSH";
	if (Engine::GetInstance() == nullptr)
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
		ReportError(__LINE__, function, "%s; %s is left as it was", problem.c_str(), aPath.c_str());
		myCollector.Reset();
		myBakeMonitor.End(BakeResult::FAILED, problem + "; " + aPath + " is left as it was");
		return;
	}
	// A room re-bake keeps every other cell of the file, which must be of this grid.
	AmbientVolume kept;
	bool keepFlag = false;
	std::string note;
	if (someBakedRooms != nullptr && aBounces > 0 && !grid.IsEmpty())
	{
		std::string problem;
		const AmbientVolumeRead read = ReadAmbientVolume(aPath, kept, problem);
		keepFlag = read == AmbientVolumeRead::OK && SameGrid(kept, grid);
		if (!keepFlag)
		{
			note =
			    (read == AmbientVolumeRead::OK ? aPath + " is of a grid of " + DescribeCounts(kept.myCounts) +
			                                         ", the rooms' is " + DescribeCounts(grid.myCounts)
			     : read == AmbientVolumeRead::CANNOT_OPEN ? aPath + " does not exist"
			                                              : problem) +
			    ": the whole volume was baked";
			ReportDebug(__LINE__, function, "%s", note.c_str());
		}
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
		myBakeMonitor.End(BakeResult::FINISHED, "no rooms with extent: nothing baked");
		return;
	}
	std::vector<uint32_t> blocks[ProbeHelper::ourBlockCount];
	for (int block = 0; block < ProbeHelper::ourBlockCount; ++block)
	{
		if (keepFlag)
		{
			blocks[block] = std::move(kept.myBlocks[block]);
		}
		else
		{
			blocks[block].assign(static_cast<size_t>(grid.GetCellCount()), ourNeutralSHTexel);
		}
	}
	SHBakeJob job;
	job.myRooms = &someRooms;
	job.myGrid = grid;
	if (keepFlag)
	{
		job.mySelected = [someBakedRooms](const Vector3<float>& aProbe, size_t) {
			return AmbientGrid::StrictlyInsideAnyRoom(*someBakedRooms, aProbe);
		};
	}
	job.myBounceCount = aBounces;
	job.myDebugFlag = aDebugFlag;
	job.myTarget = aPath;
	const SHBakeRun run = RunSHBake(job, blocks);
	if (run == SHBakeRun::CANCELLED)
	{
		// What the editor shows goes back to what the file holds.
		SetSH(aPath);
		myBakeMonitor.End(BakeResult::CANCELLED, aPath + " is left as it was");
		return;
	}
	if (run == SHBakeRun::NOT_RUN)
	{
		myBakeMonitor.End(BakeResult::FAILED,
		                  "the probe cubemap could not be made; " + aPath + " is left as it was");
		return;
	}
	if (aBounces > 0)
	{
		AmbientVolume volume;
		volume.myWorldSize = grid.myWorldSize;
		volume.myWorldMin = grid.myWorldMin;
		std::copy(grid.myCounts, grid.myCounts + 3, volume.myCounts);
		for (int block = 0; block < ProbeHelper::ourBlockCount; ++block)
		{
			volume.myBlocks[block] = std::move(blocks[block]);
		}
		// The volume on the GPU is the new one either way; the file is replaced whole or
		// not at all.
		std::string problem;
		if (!WriteAmbientVolume(aPath, volume, problem))
		{
			ReportError(__LINE__, function, "Could not write the ambient light: %s", problem.c_str());
			myBakeMonitor.End(BakeResult::FAILED, problem);
			return;
		}
	}
	myBakeMonitor.End(BakeResult::FINISHED, note);
}

bool Renderer::GenerateSHPart(const GrowingArray<Room*>& someRooms, int aBounce,
                              const AmbientVolume* aPrevious, long long aFirst, long long aCount,
                              AmbientPart& aPartOut)
{
	const char* function = "Zeph::Renderer::GenerateSHPart";
	myBakingProgressCounter = 0;
	myBakingProgress = 0;
	myBakedProbeCount = 0;
	myBakeTimings = BakeTimings();
	const AmbientGrid grid = AmbientGrid::FromRooms(someRooms);
	std::string problem = grid.GetSizeProblem();
	const long long cells = grid.GetCellCount();
	if (problem.empty() && grid.IsEmpty())
	{
		problem = "the level has no rooms with extent: there is no grid to bake";
	}
	else if (problem.empty() && (aFirst < 0 || aCount < 1 || aFirst > cells - aCount))
	{
		problem = "cells " + std::to_string(aFirst) + " to " + std::to_string(aFirst + aCount - 1) +
		          " are not all in the grid of " + DescribeCounts(grid.myCounts) + " (" +
		          std::to_string(cells) + " cells, 0 to " + std::to_string(cells - 1) + ")";
	}
	else if (problem.empty() && aBounce < 1)
	{
		problem = "bounce " + std::to_string(aBounce) + ": bounces count from 1";
	}
	else if (problem.empty() && aBounce > 1 && aPrevious == nullptr)
	{
		problem = "bounce " + std::to_string(aBounce) + " needs the volume of bounce " +
		          std::to_string(aBounce - 1);
	}
	else if (problem.empty() && aBounce > 1 && !SameGrid(*aPrevious, grid))
	{
		problem = "the previous bounce's volume is of a grid of " + DescribeCounts(aPrevious->myCounts) +
		          ", the rooms' is " + DescribeCounts(grid.myCounts);
	}
	if (!problem.empty())
	{
		ReportError(__LINE__, function, "%s", problem.c_str());
		myCollector.Reset();
		myBakeMonitor.End(BakeResult::FAILED, problem);
		return false;
	}
	myProbeHelper.reset();
	myProbeHelper = std::make_unique<ProbeHelper>();
	myProbeHelper->Init();
	mySHLoadedFlag = false;
	std::vector<uint32_t> blocks[ProbeHelper::ourBlockCount];
	for (std::vector<uint32_t>& block : blocks)
	{
		block.assign(static_cast<size_t>(cells), ourNeutralSHTexel);
	}
	SHBakeJob job;
	job.myRooms = &someRooms;
	job.myGrid = grid;
	job.mySelected = [aFirst, aCount](const Vector3<float>&, size_t aCell) {
		return static_cast<long long>(aCell) >= aFirst && static_cast<long long>(aCell) < aFirst + aCount;
	};
	job.myFirstLight = aBounce > 1 ? aPrevious->myBlocks : nullptr;
	job.myFirstBounce = aBounce;
	job.myBounceCount = 1;
	job.myPartFlag = true;
	job.myTarget = "cells " + std::to_string(aFirst) + " to " + std::to_string(aFirst + aCount - 1) +
	               " of bounce " + std::to_string(aBounce);
	const SHBakeRun run = RunSHBake(job, blocks);
	if (run != SHBakeRun::DONE)
	{
		myBakeMonitor.End(run == SHBakeRun::CANCELLED ? BakeResult::CANCELLED : BakeResult::FAILED,
		                  run == SHBakeRun::CANCELLED ? "no part written"
		                                              : "the probe cubemap could not be made");
		return false;
	}
	AmbientPart part;
	part.myBounce = aBounce;
	part.myWorldSize = grid.myWorldSize;
	part.myWorldMin = grid.myWorldMin;
	std::copy(grid.myCounts, grid.myCounts + 3, part.myCounts);
	part.myFirst = aFirst;
	part.myCount = aCount;
	for (int block = 0; block < ProbeHelper::ourBlockCount; ++block)
	{
		part.myBlocks[block].assign(blocks[block].begin() + aFirst, blocks[block].begin() + aFirst + aCount);
	}
	aPartOut = std::move(part);
	myBakeMonitor.End(BakeResult::FINISHED, "");
	return true;
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
