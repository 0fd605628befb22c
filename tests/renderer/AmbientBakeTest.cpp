// The ambient bake on a headless engine: the probe grid and its progress, the file it
// writes, what a loaded file puts on the GPU, the packing of coefficients, and the
// light it captures (a room lit from +X lights surfaces that face +X).
#include <algorithm>
#include <cmath>
#include <filesystem>
#include <gtest/gtest.h>
#include <memory>
#include <string>
#include <vector>

#include "FrameFixture.h"
#include "engine/Room.h"
#include "platform/gpu/Readback.h"
#include "renderer/AmbientVolumeFile.h"
#include "renderer/ProbeHelper.h"
#include "renderer/Renderer.h"
#include "renderer/ShPacking.h"
#include "support/TestSupport.h"

using namespace FrameTesting;

namespace
{
class AmbientBakeTest : public FrameTest
{
protected:
	// Rooms owned by the test, handed to the bake as the facade hands its own.
	Zeph::Room* AddRoom(const Vector3<float>& aMin, const Vector3<float>& aMax)
	{
		myRooms.push_back(std::make_unique<Zeph::Room>(aMin, aMax));
		myRoomList.Add(myRooms.back().get());
		return myRooms.back().get();
	}
	void Bake(const std::string& aPath, int aBounces)
	{
		Queue();
		Renderer().GenerateSH(myRoomList, aPath, aBounces, false);
	}

	std::vector<std::unique_ptr<Zeph::Room>> myRooms;
	GrowingArray<Zeph::Room*> myRoomList{8, 8};
	TestSupport::ScratchDir myScratch;
};

// The irradiance / pi a cell's seven texels give for a normal, red channel.
float RedIrradiance(const Zeph::AmbientVolume& aVolume, size_t aCell, const Vector3<float>& aNormal)
{
	const auto decode = [&](int aBlock, int aComponent) {
		return static_cast<float>((aVolume.myBlocks[aBlock][aCell] >> (8 * aComponent)) & 0xFF) / 255.0f *
		           2.0f -
		       1.0f;
	};
	const float n[4] = {aNormal.x, aNormal.y, aNormal.z, 1.0f};
	const float quadratic[4] = {aNormal.x * aNormal.y, aNormal.y * aNormal.z, aNormal.z * aNormal.z,
	                            aNormal.z * aNormal.x};
	float value = 0.0f;
	for (int component = 0; component < 4; ++component)
	{
		value += decode(0, component) * n[component] + decode(3, component) * quadratic[component];
	}
	return value + decode(6, 0) * (aNormal.x * aNormal.x - aNormal.y * aNormal.y);
}
} // namespace

TEST(ShPackingTest, CoefficientsAreClampedMappedAndTruncated)
{
	EXPECT_EQ(Zeph::PackSHVector(1.5f, -3.0f, 0.0f, 1.0f), 0xFF7F00FFu);
	EXPECT_EQ(Zeph::PackSHVector(0.0f, 0.0f, 0.0f, 0.0f), Zeph::ourNeutralSHTexel);
	// (0.5 + 1) / 2 * 255 = 191.25 -> 191; (-0.5 + 1) / 2 * 255 = 63.75 -> 63 (not rounded).
	EXPECT_EQ(Zeph::PackSHVector(0.5f, -0.5f, 0.0f, 0.0f) & 0xFFFFu, 0x3FBFu);
}

TEST_F(AmbientBakeTest, GridCountsProgressAndWhatZeroBouncesLeave)
{
	if (!Start())
	{
		return;
	}
	// 10 x 4 x 9 units: 5 x 2 x 5 probes; along z only 4 positions (1, 3, 5, 7) lie
	// below the maximum, so the last layer is never visited and the progress stops short.
	AddRoom({0.0f, 0.0f, 0.0f}, {10.0f, 4.0f, 9.0f});
	const std::string path = myScratch.File("level/ambient.sh");
	Bake(path, 0);
	EXPECT_FALSE(std::filesystem::exists(path)) << "no bounce, no file";
	EXPECT_EQ(Renderer().GetBakingProgress(), 0);
	EXPECT_NE(Renderer().GetProbeHelper()->GetView(0), nullptr) << "a neutral volume is bound";

	Bake(path, 1);
	Zeph::AmbientVolume volume;
	std::string problem;
	ASSERT_EQ(Zeph::ReadAmbientVolume(path, volume, problem), Zeph::AmbientVolumeRead::OK) << problem;
	EXPECT_EQ(volume.myCounts[0], 5);
	EXPECT_EQ(volume.myCounts[1], 2);
	EXPECT_EQ(volume.myCounts[2], 5);
	EXPECT_EQ(volume.myWorldMin.z, 0.0f);
	EXPECT_EQ(volume.myWorldSize.z, 9.0f);
	EXPECT_EQ(Renderer().GetBakingProgress(), 80) << "40 of 50 cells visited";
	// The unvisited layer (iz = 4) keeps the neutral value in every block.
	for (int block = 0; block < Zeph::AmbientVolume::ourBlockCount; ++block)
	{
		EXPECT_EQ(volume.myBlocks[block][4 * 10 + 3], Zeph::ourNeutralSHTexel) << "block " << block;
	}
	// cC's w is always 1, stored as 255, in every visited cell.
	EXPECT_EQ(volume.myBlocks[6][0] >> 24, 255u);
}

TEST_F(AmbientBakeTest, AProbeOnARoomsWallPlaneIsOutsideIt)
{
	if (!Start())
	{
		return;
	}
	// Probes at x = 1, 3, 5: x = 3 lies on the second room's minimum plane and in no
	// room, so its cell keeps the neutral value; the others are captured (a captured
	// cell's cC has w = 1, stored as 255, where the neutral value has 127).
	AddRoom({0.0f, 0.0f, 0.0f}, {2.0f, 2.0f, 2.0f});
	AddRoom({3.0f, 0.0f, 0.0f}, {7.0f, 2.0f, 2.0f});
	const std::string path = myScratch.File("planes/ambient.sh");
	Bake(path, 1);
	Zeph::AmbientVolume volume;
	std::string problem;
	ASSERT_EQ(Zeph::ReadAmbientVolume(path, volume, problem), Zeph::AmbientVolumeRead::OK) << problem;
	ASSERT_EQ(volume.myCounts[0], 4);
	EXPECT_EQ(volume.myBlocks[6][0] >> 24, 255u) << "x = 1, inside the first room";
	EXPECT_EQ(volume.myBlocks[6][1], Zeph::ourNeutralSHTexel) << "x = 3, on the second room's wall";
	EXPECT_EQ(volume.myBlocks[6][2] >> 24, 255u) << "x = 5, inside the second room";
	EXPECT_EQ(volume.myBlocks[6][3], Zeph::ourNeutralSHTexel) << "x = 7 is never visited";
}

TEST_F(AmbientBakeTest, RoomLitFromPlusXBrightensSurfacesFacingPlusXAndLoadsBackExactly)
{
	if (!Start())
	{
		return;
	}
	// The small room (4 x 3 x 4 around the origin) with one red light near its +X wall:
	// the probe in the middle sees the lit wall at +X and a dark wall at -X.
	Place("data/models/room_small.dae", {0.0f, 0.0f, 0.0f});
	AddRoom({-2.0f, 0.0f, -2.0f}, {2.0f, 3.0f, 2.0f});
	Zeph::PointLightData light;
	light.myPosition = Vector3<float>(1.6f, 1.0f, 0.0f);
	light.myFalloff = 1.5f;
	light.myColor = Vector4<float>(40.0f, 2.0f, 2.0f, 1.0f);
	myPointLights.push_back(light);
	const std::string path = myScratch.File("lit/ambient.sh");
	Bake(path, 1);
	Zeph::AmbientVolume volume;
	std::string problem;
	ASSERT_EQ(Zeph::ReadAmbientVolume(path, volume, problem), Zeph::AmbientVolumeRead::OK) << problem;
	ASSERT_EQ(volume.myCounts[0], 2);
	// Cells at x = -1 and x = +1 (iy = 0, iz = 1): both see more red from +X than from -X.
	for (const size_t cell : {size_t(1 * 2 * 2 + 0), size_t(1 * 2 * 2 + 1)})
	{
		const float facingPlusX = RedIrradiance(volume, cell, {1.0f, 0.0f, 0.0f});
		const float facingMinusX = RedIrradiance(volume, cell, {-1.0f, 0.0f, 0.0f});
		EXPECT_GT(facingPlusX, 0.05f) << "cell " << cell;
		EXPECT_GT(facingPlusX, 2.0f * std::max(facingMinusX, 0.0f) + 0.02f) << "cell " << cell;
	}

	// Reading the probes back one by one instead of in batches gives the same file.
	Renderer().SetProbeBatchingFlag(false);
	const std::string single = myScratch.File("single/ambient.sh");
	Bake(single, 1);
	Renderer().SetProbeBatchingFlag(true);
	EXPECT_EQ(TestSupport::ReadWholeFile(single), TestSupport::ReadWholeFile(path));

	// The file loaded back gives the GPU exactly the bytes it holds.
	Renderer().SetSH(path);
	ASSERT_TRUE(Renderer().IsSHLoaded());
	for (int block = 0; block < Zeph::AmbientVolume::ourBlockCount; ++block)
	{
		std::vector<float> texels;
		const Gpu::ShaderResourceView* view = Renderer().GetProbeHelper()->GetView(block);
		ASSERT_NE(view, nullptr);
		ASSERT_TRUE(Gpu::ReadTexture(*Renderer().GetProbeHelper()->GetTexture(block), 0, 0,
		                             volume.myCounts[2], texels));
		ASSERT_EQ(texels.size(), volume.myBlocks[block].size() * 4);
		for (size_t cell = 0; cell < volume.myBlocks[block].size(); ++cell)
		{
			for (int component = 0; component < 4; ++component)
			{
				const uint32_t stored = (volume.myBlocks[block][cell] >> (8 * component)) & 0xFF;
				ASSERT_EQ(static_cast<uint32_t>(std::lround(texels[cell * 4 + component] * 255.0f)), stored)
				    << "block " << block << " cell " << cell;
			}
		}
	}
}
