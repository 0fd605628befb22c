// The ambient bake on a headless engine: the probe grid and its progress, the file it
// writes, what a loaded file puts on the GPU, the packing of coefficients, the light it
// captures (a room lit from +X lights surfaces that face +X), and its failures under the
// editor's fatal log levels: a grid too large refused before any work, a file the disk
// will not take reported with the old file kept, a bake without rooms leaving no volume.
#include <algorithm>
#include <array>
#include <cmath>
#include <filesystem>
#include <gtest/gtest.h>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "FrameFixture.h"
#include "engine/Effect.h"
#include "engine/Room.h"
#include "model/Model.h"
#include "model/ModelNode.h"
#include "platform/fx/Effect.h"
#include "platform/fx/Variable.h"
#include "platform/gpu/Readback.h"
#include "renderer/AmbientGrid.h"
#include "renderer/AmbientVolumeFile.h"
#include "renderer/ProbeHelper.h"
#include "renderer/RenderTargetHelper.h"
#include "renderer/Renderer.h"
#include "renderer/ShPacking.h"
#include "support/FileSizeLimit.h"
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

	// "WorldMin" and "WorldSize" as the ambient pass receives them.
	std::vector<float> Bounds(const char* aName)
	{
		const Fx::Variable* variable =
		    Renderer().GetFullScreenHelper().GetEffect()->GetEffect()->GetVariableByName(aName);
		return variable != nullptr
		           ? std::vector<float>(variable->GetFloats().begin(), variable->GetFloats().begin() + 3)
		           : std::vector<float>();
	}

	// The volume a bake wrote; empty blocks and counts of 0 when it cannot be read.
	static Zeph::AmbientVolume ReadVolume(const std::string& aPath)
	{
		Zeph::AmbientVolume volume;
		std::string problem;
		EXPECT_EQ(Zeph::ReadAmbientVolume(aPath, volume, problem), Zeph::AmbientVolumeRead::OK) << problem;
		return volume;
	}

	std::vector<std::unique_ptr<Zeph::Room>> myRooms;
	GrowingArray<Zeph::Room*> myRoomList{8, 8};
};

// Under the editor's own log levels (severe and critical end the process): what a user
// can cause must be an error entry and the bake must come back.
class AmbientBakeFailureTest : public AmbientBakeTest
{
protected:
	AmbientBakeFailureTest() { myFatalLevels = 12; }
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

TEST(AmbientGridTest, CountsAndTheGridsThatCannotBeBaked)
{
	const struct
	{
		const char* myName;
		Vector3<float> myMin;
		Vector3<float> myMax;
		int myCounts[3];
		std::vector<std::string> myProblemParts; // empty: the grid can be baked
	} cases[] = {
	    {"no rooms", {}, {}, {0, 0, 0}, {}},
	    {"no extent", {1.0f, 0.0f, 0.0f}, {1.0f, 3.0f, 3.0f}, {0, 0, 0}, {}},
	    {"10 x 4 x 9", {0.0f, 0.0f, 0.0f}, {10.0f, 4.0f, 9.0f}, {5, 2, 5}, {}},
	    {"a room of 4 km",
	     {0.0f, 0.0f, 0.0f},
	     {4000.0f, 4000.0f, 4000.0f},
	     {2000, 2000, 2000},
	     {"2000 x 2000 x 2000 = 8000000000 probes", "208.6 GiB", "28 bytes per probe",
	      "the limit is 1.0 GiB"}},
	    {"too long for a volume texture",
	     {0.0f, 0.0f, 0.0f},
	     {5000.0f, 2.0f, 2.0f},
	     {2500, 1, 1},
	     {"2500 x 1 x 1", "at most 2048"}},
	    {"too far down for float steps",
	     {0.0f, -1.0e7f, 0.0f},
	     {2.0f, -1.0e7f + 2.0f, 2.0f},
	     {1, 1, 1},
	     {"-1e+07 units", "the limit is"}},
	};
	for (const auto& test : cases)
	{
		SCOPED_TRACE(test.myName);
		GrowingArray<Zeph::Room*> rooms(2, 2);
		Zeph::Room room(test.myMin, test.myMax);
		if (std::string(test.myName) != "no rooms")
		{
			rooms.Add(&room);
		}
		const Zeph::AmbientGrid grid = Zeph::AmbientGrid::FromRooms(rooms);
		EXPECT_EQ(std::vector<int>(grid.myCounts, grid.myCounts + 3),
		          std::vector<int>(test.myCounts, test.myCounts + 3));
		EXPECT_EQ(grid.IsEmpty(), test.myCounts[0] == 0);
		const std::string problem = grid.GetSizeProblem();
		EXPECT_EQ(problem.empty(), test.myProblemParts.empty()) << problem;
		for (const std::string& part : test.myProblemParts)
		{
			EXPECT_NE(problem.find(part), std::string::npos) << problem;
		}
	}
}

TEST_F(AmbientBakeTest, GridProgressRoomWallsAndTheBakesThatWriteNothing)
{
	LUMORA_RETURN_UNLESS(Start());
	// Probes at x = 1, 3, 5: x = 3 lies on the second room's minimum plane and in no
	// room, so its cell keeps the neutral value; the others are captured (a captured
	// cell's cC has w = 1, stored as 255, where the neutral value has 127).
	AddRoom({0.0f, 0.0f, 0.0f}, {2.0f, 2.0f, 2.0f});
	AddRoom({3.0f, 0.0f, 0.0f}, {7.0f, 2.0f, 2.0f});
	const std::string planes = myScratch.File("planes/ambient.sh");
	Bake(planes, 1);
	Zeph::AmbientVolume volume = ReadVolume(planes);
	ASSERT_EQ(volume.myCounts[0], 4);
	EXPECT_EQ(volume.myBlocks[6][0] >> 24, 255u) << "x = 1, inside the first room";
	EXPECT_EQ(volume.myBlocks[6][1], Zeph::ourNeutralSHTexel) << "x = 3, on the second room's wall";
	EXPECT_EQ(volume.myBlocks[6][2] >> 24, 255u) << "x = 5, inside the second room";
	EXPECT_EQ(volume.myBlocks[6][3], Zeph::ourNeutralSHTexel) << "x = 7 is never visited";

	// 10 x 4 x 9 units: 5 x 2 x 5 probes; along z only 4 positions (-1, 1, 3, 5) lie
	// below the maximum, so the last layer is never visited and the progress stops short.
	myRoomList.RemoveAll();
	AddRoom({-2.0f, 0.0f, -2.0f}, {8.0f, 4.0f, 7.0f});
	const std::string path = myScratch.File("level/ambient.sh");
	Bake(path, 0);
	EXPECT_FALSE(std::filesystem::exists(path)) << "no bounce, no file";
	EXPECT_EQ(Renderer().GetBakingProgress(), 0);
	EXPECT_NE(Renderer().GetProbeHelper()->GetView(0), nullptr) << "a neutral volume is bound";

	Bake(path, 1);
	volume = ReadVolume(path);
	ASSERT_EQ(std::vector<int>(volume.myCounts, volume.myCounts + 3), (std::vector<int>{5, 2, 5}));
	EXPECT_EQ(volume.myWorldMin.z, -2.0f);
	EXPECT_EQ(volume.myWorldSize.z, 9.0f);
	EXPECT_EQ(Bounds("WorldMin"), (std::vector<float>{-2.0f, 0.0f, -2.0f}));
	EXPECT_EQ(Bounds("WorldSize"), (std::vector<float>{10.0f, 4.0f, 9.0f}));
	EXPECT_EQ(Renderer().GetBakingProgress(), 80) << "40 of 50 cells visited";
	// The unvisited layer (iz = 4) keeps the neutral value in every block.
	for (int block = 0; block < Zeph::AmbientVolume::ourBlockCount; ++block)
	{
		EXPECT_EQ(volume.myBlocks[block][4 * 10 + 3], Zeph::ourNeutralSHTexel) << "block " << block;
	}
	// cC's w is always 1, stored as 255, in every visited cell.
	EXPECT_EQ(volume.myBlocks[6][0] >> 24, 255u);

	// Without rooms: no volume, no bounds, and nothing written.
	const std::string before = TestSupport::ReadWholeFile(path);
	myRoomList.RemoveAll();
	Bake(path, 1);
	EXPECT_EQ(Renderer().GetProbeHelper()->GetView(0), nullptr);
	EXPECT_EQ(Bounds("WorldMin"), (std::vector<float>{0.0f, 0.0f, 0.0f}));
	EXPECT_EQ(Bounds("WorldSize"), (std::vector<float>{0.0f, 0.0f, 0.0f}));
	EXPECT_EQ(TestSupport::ReadWholeFile(path), before) << "nothing baked, nothing written";
}

TEST_F(AmbientBakeTest, RoomLitFromPlusXBrightensSurfacesFacingPlusXAndFacesSkipWhatTheyCannotSee)
{
	LUMORA_RETURN_UNLESS(Start());
	// The small room (4 x 3 x 4 around the origin) with one red light near its +X wall:
	// the probe in the middle sees the lit wall at +X and a dark wall at -X.
	Place("data/models/room_small.dae", {0.0f, 0.0f, 0.0f});
	AddRoom({-2.0f, 0.0f, -2.0f}, {2.0f, 3.0f, 2.0f});
	myPointLights.push_back(
	    {.myFalloff = 1.5f, .myPosition = {1.6f, 1.0f, 0.0f}, .myColor = {40.0f, 2.0f, 2.0f, 1.0f}});
	const std::string path = myScratch.File("lit/ambient.sh");
	Bake(path, 1);
	const Zeph::AmbientVolume volume = ReadVolume(path);
	ASSERT_EQ(volume.myCounts[0], 2);
	// Cells at x = -1 and x = +1 (iy = 0, iz = 1): both see more red from +X than from -X.
	for (const size_t cell : {size_t(1 * 2 * 2 + 0), size_t(1 * 2 * 2 + 1)})
	{
		const float facingPlusX = RedIrradiance(volume, cell, {1.0f, 0.0f, 0.0f});
		const float facingMinusX = RedIrradiance(volume, cell, {-1.0f, 0.0f, 0.0f});
		EXPECT_GT(facingPlusX, 0.05f) << "cell " << cell;
		EXPECT_GT(facingPlusX, 2.0f * std::max(facingMinusX, 0.0f) + 0.02f) << "cell " << cell;
	}

	// Reading the probes back one by one, or each face alone, instead of in batches
	// gives the same file.
	using Readback = Zeph::Renderer::ProbeReadback;
	for (const Readback mode : {Readback::PER_PROBE, Readback::PER_FACE})
	{
		Renderer().SetProbeReadback(mode);
		const std::string single = myScratch.File("single/ambient.sh");
		Bake(single, 1);
		EXPECT_EQ(TestSupport::ReadWholeFile(single), TestSupport::ReadWholeFile(path))
		    << "mode " << static_cast<int>(mode);
	}
	Renderer().SetProbeReadback(Readback::BATCHED);

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

	// A crate in one corner and a spot light over the opposite one: each probe face sees
	// only part of the scene, and skipping the rest changes nothing in two bounces.
	Place("data/models/crate.dae", {1.4f, 0.0f, 1.4f});
	myPointLights[0].myColor = Vector4<float>(10.0f, 2.0f, 2.0f, 1.0f);
	mySpotLights.push_back(SpotDown({-1.5f, 2.8f, -1.5f}, 3.0f, 0.9f, 0.8f));
	const int culledBefore = Renderer().GetRTC().GetCulledInstanceCount();
	const std::string culled = myScratch.File("culled/ambient.sh");
	Bake(culled, 2);
	EXPECT_GT(Renderer().GetRTC().GetCulledInstanceCount(), culledBefore) << "the crate is behind some faces";
	EXPECT_FALSE(Renderer().GetRTC().GetViewCullingFlag()) << "the frame draws everything again";

	Renderer().SetProbeCullingFlag(false);
	const int culledAfter = Renderer().GetRTC().GetCulledInstanceCount();
	const std::string everything = myScratch.File("everything/ambient.sh");
	Bake(everything, 2);
	Renderer().SetProbeCullingFlag(true);
	EXPECT_EQ(Renderer().GetRTC().GetCulledInstanceCount(), culledAfter);
	const std::string bytes = TestSupport::ReadWholeFile(culled);
	ASSERT_FALSE(bytes.empty());
	EXPECT_TRUE(bytes == TestSupport::ReadWholeFile(everything)) << "culling changed the volume";
}

TEST_F(AmbientBakeTest, AClosedRoomOfUniformRadianceGivesTheSameAmbientForEveryNormal)
{
	LUMORA_RETURN_UNLESS(Start(0));
	// The crate with flat textures (grey albedo, flat normal, full roughness, no
	// occlusion), mirrored through its centre and scaled to a 4-unit room around the
	// probe, so its faces look inwards. Glowing and unlit, every wall sends the same
	// radiance to the probe.
	std::string document = TestSupport::ReadWholeFile("data/models/crate.dae");
	ASSERT_FALSE(document.empty()) << "run from the repository root";
	const std::string prefix = "data/textures/wood_";
	for (size_t at = document.find(prefix); at != std::string::npos; at = document.find(prefix, at))
	{
		document.replace(at, prefix.size(), myScratch.File("flat_"));
	}
	const std::pair<const char*, std::array<uint8_t, 4>> textures[] = {
	    {"flat_albedo.dds", {128, 128, 128, 255}},
	    {"flat_normal.dds", {128, 128, 255, 255}},
	    {"flat_roughness.dds", {255, 255, 255, 255}},
	    {"flat_ao.dds", {255, 255, 255, 255}}};
	for (const auto& [name, color] : textures)
	{
		WriteSolidTexture(name, color.data());
	}
	const std::string model = myScratch.File("glowing_box.dae");
	TestSupport::WriteWholeFile(model, document);
	Place(model.c_str(), {0.0f, 0.0f, 0.0f});
	ASSERT_FALSE(HasFatalFailure());
	Matrix44<float> mirror;
	for (const int diagonal : {0, 5, 10})
	{
		mirror.myMatrix[diagonal] = -4.4f;
	}
	mirror.SetPosition(Vector3<float>(0.0f, 3.96f, 0.0f)); // the crate's floor (y = 0) becomes the ceiling
	myInstances.back()->SetOrientation(mirror);
	Matrix44<float> local;
	const Zeph::Model* box = Zeph::RenderTargetHelper::FindFirstModel(
	    Zeph::Engine::GetInstance()->GetModelFactory().GetModel(model), local);
	ASSERT_NE(box, nullptr);
	ASSERT_NE(box->GetEffect(), nullptr);
	ASSERT_TRUE(box->GetEffect()->GetEffect()->GetVariableByName("EmissiveAmount")->SetFloat(0.25f));
	// One probe, at (0, 2, 0), the middle of the room.
	AddRoom({-1.0f, 1.0f, -1.0f}, {1.0f, 3.0f, 1.0f});
	const std::string path = myScratch.File("uniform/ambient.sh");
	Bake(path, 1);
	const Zeph::AmbientVolume volume = ReadVolume(path);
	ASSERT_EQ(volume.myCounts[0] * volume.myCounts[1] * volume.myCounts[2], 1);

	// The stored vectors give irradiance / pi = the walls' radiance for every normal:
	// albedo 128 (0.216 once decoded from sRGB) x emissive 0.25 x the multiplier 2. Up to
	// the packing: a zero coefficient is stored as 127 (decoded -1/255), which by itself
	// moves the sum by -13.1e-3 to +7.8e-3 over all normals; one step of 1/255 more is
	// left for the capture.
	const float albedo = std::pow((128.0f / 255.0f + 0.055f) / 1.055f, 2.4f);
	const float radiance = albedo * 0.25f * 2.0f;
	for (int x = -1; x <= 1; ++x)
	{
		for (int y = -1; y <= 1; ++y)
		{
			for (int z = -1; z <= 1; ++z)
			{
				if (x == 0 && y == 0 && z == 0)
				{
					continue;
				}
				const float length = std::sqrt(static_cast<float>(x * x + y * y + z * z));
				const Vector3<float> normal(x / length, y / length, z / length);
				const float value = RedIrradiance(volume, 0, normal);
				EXPECT_GE(value, radiance - 13.1e-3f - 1.0f / 255.0f) << x << " " << y << " " << z;
				EXPECT_LE(value, radiance + 7.8e-3f + 1.0f / 255.0f) << x << " " << y << " " << z;
			}
		}
	}
}

TEST_F(AmbientBakeFailureTest, AFileTheDiskWillNotTakeOrAGridTooLargeIsReportedAndTheOldFileKept)
{
	LUMORA_RETURN_UNLESS(Start());
	// Two small rooms far apart: a grid of 51 x 1 x 51 cells (a 73 KB file) with two
	// probes to render.
	AddRoom({0.0f, 0.0f, 0.0f}, {2.0f, 2.0f, 2.0f});
	AddRoom({100.0f, 0.0f, 100.0f}, {102.0f, 2.0f, 102.0f});
	const std::string path = myScratch.File("level/ambient.sh");
	Bake(path, 1);
	const std::string before = TestSupport::ReadWholeFile(path);
	ASSERT_EQ(before.size(), 36u + 28u * 51u * 51u);
	const std::string logBefore = TakeLog();
	EXPECT_NE(logBefore.find("Baking 2 probes (of 51 x 1 x 51 cells) over 1 bounce into " + path),
	          std::string::npos)
	    << "the bake says how much it has to do first\n"
	    << logBefore;

	myPointLights.push_back(
	    {.myFalloff = 2.0f, .myPosition = {1.0f, 1.0f, 1.5f}, .myColor = {9.0f, 9.0f, 9.0f, 1.0f}});
	{
		// Room for the log, not for the file.
		TestSupport::FileSizeLimit full(std::filesystem::file_size(myLogPath) + 32768);
		Bake(path, 1);
	}
	std::string log = TakeLog();
	EXPECT_NE(log.find("ERROR"), std::string::npos) << log;
	EXPECT_NE(log.find("Could not write the ambient light: " + path), std::string::npos) << log;
	EXPECT_TRUE(TestSupport::ReadWholeFile(path) == before) << "the old file was replaced";
	EXPECT_EQ(std::distance(std::filesystem::directory_iterator(myScratch.Path() / "level"),
	                        std::filesystem::directory_iterator()),
	          1)
	    << "no temporary is left beside it";
	const Gpu::ShaderResourceView* shown = Renderer().GetProbeHelper()->GetView(0);
	EXPECT_NE(shown, nullptr) << "the new bake is still shown";

	// A room of 4 km: 8 billion probes, 224 GB of blocks. Refused with the numbers, the
	// volume shown and the file kept.
	AddRoom({0.0f, 0.0f, 0.0f}, {4000.0f, 4000.0f, 4000.0f});
	Bake(path, 1);
	log = TakeLog();
	EXPECT_NE(log.find("ERROR"), std::string::npos) << log;
	for (const char* part :
	     {"8000000000 probes", "GiB", "the limit is", "level/ambient.sh is left as it was"})
	{
		EXPECT_NE(log.find(part), std::string::npos) << part << "\n" << log;
	}
	EXPECT_EQ(Renderer().GetProbeHelper()->GetView(0), shown);
	EXPECT_EQ(TestSupport::ReadWholeFile(path), before);
	EXPECT_EQ(Renderer().GetBakingProgress(), 0);
	EXPECT_EQ(Renderer().GetRTC().GetPointLights().Count(), 0) << "the queued scene is let go";
}
