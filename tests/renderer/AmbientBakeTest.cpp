// The ambient bake on a headless engine: the probe grid and its progress, the file it
// writes, the packing of coefficients, the light it captures (a room lit from +X lights
// surfaces that face +X), and its failures: a grid too large refused before any work, a
// file the disk will not take reported with the old file kept, a bake without rooms
// leaving no volume. What the bake writes is shown through SetSH in the command-line
// tool's golden image of the baked sample level.
#include <algorithm>
#include <array>
#include <cmath>
#include <filesystem>
#include <gtest/gtest.h>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "ColladaWriter.h"
#include "FrameFixture.h"
#include "Models.h"
#include "engine/Effect.h"
#include "engine/Room.h"
#include "model/Model.h"
#include "model/ModelNode.h"
#include "platform/fx/Effect.h"
#include "platform/fx/Variable.h"
#include "renderer/AmbientGrid.h"
#include "renderer/AmbientVolumeFile.h"
#include "renderer/ProbeHelper.h"
#include "renderer/RenderTargetHelper.h"
#include "renderer/Renderer.h"
#include "renderer/ShPacking.h"
#include "support/FileSizeLimit.h"
#include "support/TestSupport.h"

using namespace FrameTesting;
using testing::AllOf;
using testing::HasSubstr;

namespace
{
// Under the editor's own log levels (severe and critical end the process): what a user
// can cause must be an error entry and the bake must come back.
class AmbientBakeTest : public FrameTest
{
protected:
	AmbientBakeTest() { myFatalLevels = 12; }

	// The crate with flat textures (albedo anAlbedo, flat normal, full roughness, no occlusion),
	// mirrored through its centre and scaled to a closed room of 3.96 units a side around
	// (0, 2, 0), so its faces look inwards; its model, for the caller to change.
	const Zeph::Model* PlaceClosedBox(const std::string& aName, uint8_t anAlbedo)
	{
		std::string document = TestSupport::ReadWholeFile("data/models/crate.dae");
		EXPECT_FALSE(document.empty()) << "run from the repository root";
		const std::string prefix = "data/textures/wood_";
		for (size_t at = document.find(prefix); at != std::string::npos; at = document.find(prefix, at))
		{
			document.replace(at, prefix.size(), myScratch.File(aName + "_"));
		}
		const std::pair<const char*, std::array<uint8_t, 4>> textures[] = {
		    {"albedo.dds", {anAlbedo, anAlbedo, anAlbedo, 255}},
		    {"normal.dds", {128, 128, 255, 255}},
		    {"roughness.dds", {255, 255, 255, 255}},
		    {"ao.dds", {255, 255, 255, 255}}};
		for (const auto& [name, color] : textures)
		{
			WriteSolidTexture(aName + "_" + name, color.data());
		}
		const std::string model = myScratch.File(aName + ".dae");
		TestSupport::WriteWholeFile(model, document);
		Place(model.c_str(), {0.0f, 0.0f, 0.0f});
		if (HasFatalFailure())
		{
			return nullptr;
		}
		Matrix44<float> mirror;
		for (const int diagonal : {0, 5, 10})
		{
			mirror.myMatrix[diagonal] = -4.4f;
		}
		mirror.SetPosition(
		    Vector3<float>(0.0f, 3.98f, 0.0f)); // the crate's floor (y = 0) becomes the ceiling
		myInstances.back()->SetOrientation(mirror);
		Matrix44<float> local;
		return Zeph::RenderTargetHelper::FindFirstModel(
		    Zeph::Engine::GetInstance()->GetModelFactory().GetModel(model), local);
	}

	// A closed room 4 x 4 x 4 around (0, 2, 0), seen from inside, white (albedo 255), with a flat
	// normal, full roughness and no occlusion: the sample content's room model without doors.
	void PlaceWhiteRoom()
	{
		std::string document = Content::WriteColladaDocument(Content::Room("white_room", 4.0, 4.0, 4.0, 0,
		                                                                   Content::MaterialKind::Concrete,
		                                                                   Content::MaterialKind::Concrete));
		const std::string prefix = "data/textures/concrete_";
		for (size_t at = document.find(prefix); at != std::string::npos; at = document.find(prefix, at))
		{
			document.replace(at, prefix.size(), myScratch.File("white_"));
		}
		const std::pair<const char*, std::array<uint8_t, 4>> textures[] = {
		    {"white_albedo.dds", {255, 255, 255, 255}},
		    {"white_normal.dds", {128, 128, 255, 255}},
		    {"white_roughness.dds", {255, 255, 255, 255}},
		    {"white_ao.dds", {255, 255, 255, 255}}};
		for (const auto& [name, color] : textures)
		{
			WriteSolidTexture(name, color.data());
		}
		const std::string model = myScratch.File("white_room.dae");
		TestSupport::WriteWholeFile(model, document);
		Place(model.c_str(), {0.0f, 0.0f, 0.0f});
	}

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

	// "WorldMin" and "WorldSize" as the ambient pass receives them, one after the other.
	std::vector<float> Bounds()
	{
		std::vector<float> bounds;
		for (const char* name : {"WorldMin", "WorldSize"})
		{
			const Fx::Variable* variable =
			    Renderer().GetFullScreenHelper().GetEffect()->GetEffect()->GetVariableByName(name);
			EXPECT_NE(variable, nullptr) << name;
			bounds.insert(bounds.end(), variable->GetFloats().begin(), variable->GetFloats().begin() + 3);
		}
		return bounds;
	}

	std::vector<std::unique_ptr<Zeph::Room>> myRooms;
	GrowingArray<Zeph::Room*> myRoomList{8, 8};
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
	    {"no extent", {1.0f, 0.0f, 0.0f}, {1.0f, 3.0f, 3.0f}, {0, 0, 0}, {}},
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
		rooms.Add(&room);
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

	// A crate in one corner and a spot light over the opposite one: each probe face sees
	// only part of the scene. Skipping the rest, and reading the probes back one by one or
	// each face alone instead of in batches, change nothing in two bounces.
	Place("data/models/crate.dae", {1.4f, 0.0f, 1.4f});
	myPointLights[0].myColor = Vector4<float>(10.0f, 2.0f, 2.0f, 1.0f);
	mySpotLights.push_back(SpotDown({-1.5f, 2.8f, -1.5f}, 3.0f, 0.9f, 0.8f));
	const int culledBefore = Renderer().GetRTC().GetCulledInstanceCount();
	Bake(path, 2);
	EXPECT_GT(Renderer().GetRTC().GetCulledInstanceCount(), culledBefore) << "the crate is behind some faces";
	EXPECT_FALSE(Renderer().GetRTC().GetViewCullingFlag()) << "the frame draws everything again";
	const std::string bytes = TestSupport::ReadWholeFile(path);
	using Readback = Zeph::Renderer::ProbeReadback;
	for (const auto& [mode, cullingFlag] :
	     {std::pair{Readback::PER_PROBE, true}, {Readback::PER_FACE, true}, {Readback::BATCHED, false}})
	{
		Renderer().SetProbeReadback(mode);
		Renderer().SetProbeCullingFlag(cullingFlag);
		const int culled = Renderer().GetRTC().GetCulledInstanceCount();
		Bake(path, 2);
		EXPECT_EQ(Renderer().GetRTC().GetCulledInstanceCount() > culled, cullingFlag);
		EXPECT_TRUE(TestSupport::ReadWholeFile(path) == bytes) << "mode " << static_cast<int>(mode);
	}
	Renderer().SetProbeCullingFlag(true);
}

TEST_F(AmbientBakeTest, AClosedRoomOfUniformRadianceGivesTheSameAmbientForEveryNormal)
{
	LUMORA_RETURN_UNLESS(Start(0));
	// The crate with flat textures (grey albedo, flat normal, full roughness, no
	// occlusion), mirrored through its centre and scaled to a 4-unit room around the
	// probe, so its faces look inwards. Glowing and unlit, every wall sends the same
	// radiance to the probe.
	const Zeph::Model* box = PlaceClosedBox("flat", 128);
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
	for (int code = 0; code < 27; ++code)
	{
		const Vector3<float> direction(code % 3 - 1.0f, code / 3 % 3 - 1.0f, code / 9 - 1.0f);
		if (code != 13)
		{
			const float value = RedIrradiance(volume, 0, direction * (1.0f / direction.Length()));
			EXPECT_GE(value, radiance - 13.1e-3f - 1.0f / 255.0f) << "direction " << code;
			EXPECT_LE(value, radiance + 7.8e-3f + 1.0f / 255.0f) << "direction " << code;
		}
	}
}

TEST_F(AmbientBakeTest, AWhiteRoomLitByOneLightBakesFalloffSymmetryAndLinearity)
{
	LUMORA_RETURN_UNLESS(Start());
	// A closed white room (4 a side around the probe at (0, 2, 0)) and one light whose reach
	// takes in the whole room: what the light adds to the probe is measured against the room
	// baked without it (the fallback cubemap's reflections are in both).
	PlaceWhiteRoom();
	ASSERT_FALSE(HasFatalFailure());
	AddRoom({-1.0f, 1.0f, -1.0f}, {1.0f, 3.0f, 1.0f});
	const std::string path = myScratch.File("white/ambient.sh");
	const Vector3<float> axes[6] = {{1.0f, 0.0f, 0.0f},  {-1.0f, 0.0f, 0.0f}, {0.0f, 1.0f, 0.0f},
	                                {0.0f, -1.0f, 0.0f}, {0.0f, 0.0f, 1.0f},  {0.0f, 0.0f, -1.0f}};
	// The irradiance (red, over pi) the probe gets from each axis direction.
	const auto bake = [&](const Vector3<float>& aLight, float anIntensity) {
		myPointLights.clear();
		if (anIntensity > 0.0f)
		{
			myPointLights.push_back({.myFalloff = 8.0f,
			                         .myPosition = aLight,
			                         .myColor = {anIntensity, anIntensity, anIntensity, 1.0f}});
		}
		Bake(path, 1);
		const Zeph::AmbientVolume volume = ReadVolume(path);
		std::array<float, 6> irradiance{};
		for (int axis = 0; axis < 6; ++axis)
		{
			irradiance[axis] = volume.myBlocks[0].empty() ? 0.0f : RedIrradiance(volume, 0, axes[axis]);
		}
		return irradiance;
	};
	const std::array<float, 6> dark = bake({}, 0.0f);
	// One step of the packing is 2/255 per stored value; an axis direction reads up to three of
	// them, and both bakes are packed.
	constexpr float packing = 2.0f * 3.0f * 2.0f / 255.0f;

	// At the room's centre: the same light reaches every wall alike, so every direction gets
	// the same.
	const std::array<float, 6> centre = bake({0.0f, 2.0f, 0.0f}, 12.0f);
	for (int axis = 0; axis < 6; ++axis)
	{
		EXPECT_GT(centre[axis] - dark[axis], 0.1f)
		    << "axis " << axis << ": " << centre[axis] << " over " << dark[axis];
		EXPECT_NEAR(centre[axis] - dark[axis], centre[0] - dark[0], packing) << "axis " << axis;
	}
	// Twice the colour, twice the light.
	const std::array<float, 6> twice = bake({0.0f, 2.0f, 0.0f}, 24.0f);
	for (int axis = 0; axis < 6; ++axis)
	{
		EXPECT_NEAR(twice[axis] - dark[axis], 2.0f * (centre[axis] - dark[axis]), 2.0f * packing)
		    << "axis " << axis;
	}
	// Half a metre from the +x wall: that wall is lit from 0.5 away, the far one from 3.5, so
	// the probe facing +x gets several times what it gets facing -x.
	const std::array<float, 6> nearWall = bake({1.5f, 2.0f, 0.0f}, 4.0f);
	const float facingNear = nearWall[0] - dark[0];
	const float facingFar = nearWall[1] - dark[1];
	EXPECT_GT(facingFar, 0.0f);
	EXPECT_GT(facingNear, 3.0f * facingFar)
	    << "facing the near wall " << facingNear << ", the far one " << facingFar;
}

TEST_F(AmbientBakeTest, RoomWallsProgressAFullDiskAGridTooLargeAndNoRoomsKeepWhatTheyMust)
{
	LUMORA_RETURN_UNLESS(Start());
	// Two rooms far apart: a grid of 52 x 1 x 52 cells (a 76 KB file) with two probes to
	// render, at (1, 1, 1) and (101, 1, 101). The probes at x = 99 lie on the second room's
	// minimum plane, in no room, and keep the neutral value; the last layers (x or z = 103)
	// lie on the grid's maximum and are never visited. A captured cell's cC has w = 1,
	// stored as 255.
	AddRoom({0.0f, 0.0f, 0.0f}, {2.0f, 2.0f, 2.0f});
	AddRoom({99.0f, 0.0f, 99.0f}, {103.0f, 2.0f, 103.0f});
	const std::string path = myScratch.File("level/ambient.sh");
	Bake(path, 1);
	const std::string before = TestSupport::ReadWholeFile(path);
	ASSERT_EQ(before.size(), 36u + 28u * 52u * 52u);
	EXPECT_THAT(TakeLog(), HasSubstr("Baking 2 probes (of 52 x 1 x 52 cells) over 1 bounce into " + path))
	    << "the bake says how much it has to do first";
	EXPECT_EQ(Renderer().GetBakingProgress(), 96) << "51 x 51 of 52 x 52 cells visited";
	EXPECT_EQ(Bounds(), (std::vector<float>{0.0f, 0.0f, 0.0f, 103.0f, 2.0f, 103.0f}));
	const Zeph::AmbientVolume volume = ReadVolume(path);
	for (const std::vector<uint32_t>& block : volume.myBlocks)
	{
		EXPECT_EQ((std::array{block.at(51), block.at(50 * 52 + 49)}),
		          (std::array{Zeph::ourNeutralSHTexel, Zeph::ourNeutralSHTexel}))
		    << "x = 103 is never visited, x = 99 lies on the second room's wall";
	}
	for (const size_t captured : {size_t(0), size_t(50 * 52 + 50)})
	{
		EXPECT_EQ(volume.myBlocks[6][captured] >> 24, 255u) << "cell " << captured;
	}

	// Room for the log, not for the file.
	myPointLights.push_back(
	    {.myFalloff = 2.0f, .myPosition = {1.0f, 1.0f, 1.5f}, .myColor = {9.0f, 9.0f, 9.0f, 1.0f}});
	{
		TestSupport::FileSizeLimit full(std::filesystem::file_size(myLogPath) + 32768);
		Bake(path, 1);
	}
	EXPECT_THAT(TakeLog(),
	            AllOf(HasSubstr("ERROR"), HasSubstr("Could not write the ambient light: " + path)));
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
	EXPECT_THAT(TakeLog(), AllOf(HasSubstr("ERROR"), HasSubstr("2000 x 2000 x 2000 = 8000000000 probes"),
	                             HasSubstr("208.6 GiB (28 bytes per probe); the limit is 1.0 GiB; " + path +
	                                       " is left as it was")));
	EXPECT_EQ(Renderer().GetProbeHelper()->GetView(0), shown);
	EXPECT_EQ(Renderer().GetBakingProgress(), 0);
	EXPECT_EQ(Renderer().GetRTC().GetPointLights().Count(), 0) << "the queued scene is let go";

	// Without rooms: no volume, no bounds, and nothing written.
	myRoomList.RemoveAll();
	Bake(path, 1);
	EXPECT_EQ(Renderer().GetProbeHelper()->GetView(0), nullptr);
	EXPECT_EQ(Bounds(), std::vector<float>(6, 0.0f));
	EXPECT_EQ(TestSupport::ReadWholeFile(path), before) << "nothing baked, nothing written";
}
