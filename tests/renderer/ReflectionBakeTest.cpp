// The reflection bake on a headless engine: the files it writes (read back through the DDS
// reader), where light lands on the cube's faces, the filtered mips measured against the
// cosine-power lobes integrated on the CPU from mip 0, the progress after each room, and
// saves that fail (the bake goes on, the old file stays whole; only the platform layer's
// error entry tells). The log has the editor's own fatal levels, so nothing here may be a
// severe or critical report. The bake writes "data/Cubemaps/<level>/", so each test runs
// in a scratch directory whose data/ links the repository's folders, except Cubemaps,
// which holds copies of the two cube maps the renderer reads. A baked file loading into
// the frame is in the command-line tool's golden image of the baked sample level.
#include <algorithm>
#include <array>
#include <cmath>
#include <cstring>
#include <filesystem>
#include <gtest/gtest.h>
#include <memory>
#include <numeric>
#include <string>
#include <vector>

#include "BakeFixture.h"
#include "core/CoreReport.h"
#include "core/GrowingArray.h"
#include "engine/Room.h"
#include "platform/dds/DdsFile.h"
#include "renderer/DynamicCubemap.h"
#include "support/FileSizeLimit.h"

#include "CubeFaces.h"
#include "HalfFloat.h"

using namespace FrameTesting;
using testing::AllOf;
using testing::HasSubstr;
using testing::Not;

namespace
{
namespace fs = std::filesystem;

constexpr int ourFaceSize = 256;
constexpr int ourMipCount = 9;

using Rgb = std::array<double, 3>;

// A baked cube file: RGBA halves, faces +X, -X, +Y, -Y, +Z, -Z, each with its mips.
struct CubeFile
{
	Dds::Image myImage;

	static int Size(int aMip) { return std::max(1, ourFaceSize >> aMip); }
	Rgb Texel(int aFace, int aMip, int anX, int aY) const
	{
		const uint8_t* data = myImage.Data(static_cast<uint32_t>(aMip), static_cast<uint32_t>(aFace));
		uint16_t halves[4];
		std::memcpy(halves, data + (static_cast<size_t>(aY) * Size(aMip) + anX) * 8, sizeof(halves));
		return {Content::HalfToFloat(halves[0]), Content::HalfToFloat(halves[1]),
		        Content::HalfToFloat(halves[2])};
	}
	// Mean of the texels (aLeft..aRight, aTop..aBottom) of a face at mip 0, per channel.
	Rgb Mean(int aFace, int aLeft, int aTop, int aRight, int aBottom) const
	{
		Rgb sum{};
		for (int y = aTop; y <= aBottom; ++y)
		{
			for (int x = aLeft; x <= aRight; ++x)
			{
				const Rgb texel = Texel(aFace, 0, x, y);
				for (int channel = 0; channel < 3; ++channel)
				{
					sum[channel] += texel[channel] / ((aBottom - aTop + 1) * (aRight - aLeft + 1));
				}
			}
		}
		return sum;
	}
};

// Mip 0 reduced to a coarser cube for the reference integrals: per texel its unit direction
// (in the layout the content tool and the shaders share), its solid angle and its mean colour.
struct Radiance
{
	struct Texel
	{
		Content::Vec3 myDirection;
		double mySolidAngle;
		Rgb myColor;
	};
	std::vector<Texel> myTexels;

	Radiance(const CubeFile& aCube, int aSize)
	{
		const int block = ourFaceSize / aSize;
		for (int face = 0; face < Zeph::DynamicCubemap::ourFaceCount; ++face)
		{
			for (int y = 0; y < aSize; ++y)
			{
				for (int x = 0; x < aSize; ++x)
				{
					// The texel's area on the face, 4 / size^2, over the cube of its distance.
					Texel texel{Direction(face, x, y, aSize), 4.0 / (aSize * aSize), {}};
					const Content::Vec3& unit = texel.myDirection;
					texel.mySolidAngle *=
					    std::pow(std::max({std::abs(unit.x), std::abs(unit.y), std::abs(unit.z)}), 3);
					for (int at = 0; at < block * block; ++at)
					{
						const Rgb color =
						    aCube.Texel(face, 0, x * block + at % block, y * block + at / block);
						for (int channel = 0; channel < 3; ++channel)
						{
							texel.myColor[channel] += color[channel] / (block * block);
						}
					}
					myTexels.push_back(texel);
				}
			}
		}
	}

	static Content::Vec3 Direction(int aFace, int anX, int aY, int aSize)
	{
		return Content::CubeTexelDirection(static_cast<uint32_t>(aFace), static_cast<uint32_t>(anX),
		                                   static_cast<uint32_t>(aY), static_cast<uint32_t>(aSize));
	}

	// The radiance averaged over the sphere with the weight max(0, cos)^aPower around aNormal.
	Rgb Lobe(const Content::Vec3& aNormal, double aPower) const
	{
		Rgb sum{};
		double total = 0.0;
		for (const Texel& texel : myTexels)
		{
			const double cosine = Content::Dot(aNormal, texel.myDirection);
			if (cosine > 0.0)
			{
				const double weight = std::pow(cosine, aPower) * texel.mySolidAngle;
				for (int channel = 0; channel < 3; ++channel)
				{
					sum[channel] += texel.myColor[channel] * weight;
				}
				total += weight;
			}
		}
		for (double& channel : sum)
		{
			channel /= total;
		}
		return sum;
	}
};

// Progress read by the platform layer's error hook each time a cube file cannot be saved
// (which happens in the bake after the rooms before it are done and before its own
// progress is stored); the entry still goes to the log.
std::vector<int> ourProgressAtFailedSaves;
CoreReport::Handler ourLogHandler = nullptr;

void RecordFailedSave(int aLine, const char* aFunctionName, const char* aMessage)
{
	if (std::string(aFunctionName) == "Gpu::SaveTextureToDds")
	{
		ourProgressAtFailedSaves.push_back(Zeph::Engine::GetInstance()->GetRenderer().GetBakingProgress());
	}
	if (ourLogHandler != nullptr)
	{
		ourLogHandler(aLine, aFunctionName, aMessage);
	}
}

class ReflectionBakeTest : public BakeTest
{
protected:
	// Queues the scene as the editor does before a bake, and bakes.
	void Bake(const std::string& aLevel)
	{
		Queue();
		Renderer().GenerateReflections(myRooms, aLevel);
	}

	static bool Load(const std::string& aPath, CubeFile& aCubeOut)
	{
		std::string error;
		const bool loaded = Dds::LoadFromFile(aPath, aCubeOut.myImage, error);
		EXPECT_TRUE(loaded) << error;
		return loaded;
	}
};
} // namespace

TEST_F(ReflectionBakeTest, ProgressFollowsTheRoomsFailedSavesAreNotTheBakesToReportAndNoRoomsBakeNothing)
{
	LUMORA_RETURN_UNLESS(Start());
	Place("data/models/room_small.dae", {0.0f, 0.0f, 0.0f});
	AddRoom("west", {-4.0f, 0.0f, 0.0f});
	AddRoom("middle", {0.0f, 0.0f, 0.0f});
	AddRoom("east", {4.0f, 0.0f, 0.0f});

	// Folders where the files of the second and third rooms should go: their saves fail,
	// the bake goes on, and the hook shows the progress the rooms before each left.
	fs::create_directories(CubePath("three", "middle"));
	fs::create_directories(CubePath("three", "east"));
	ourProgressAtFailedSaves.clear();
	ourLogHandler = CoreReport::GetErrorHandler();
	CoreReport::SetErrorHandler(&RecordFailedSave);
	Bake("three");
	CoreReport::SetErrorHandler(ourLogHandler);
	EXPECT_EQ(ourProgressAtFailedSaves, (std::vector<int>{33, 66}));
	EXPECT_EQ(Renderer().GetBakingProgress(), 100);
	// The platform layer's own entries name the files; the bake adds nothing of its own.
	EXPECT_THAT(TakeLog(), AllOf(HasSubstr(CubePath("three", "middle")), HasSubstr(CubePath("three", "east")),
	                             Not(HasSubstr("Zeph::Renderer")), Not(HasSubstr("SEVERE"))));
	CubeFile west;
	EXPECT_TRUE(Load(CubePath("three", "west"), west));

	// Without rooms the progress goes back to 0, nothing is written, and the queued scene is let go.
	myRooms.RemoveAll();
	myPointLights.push_back({});
	Bake("empty");
	EXPECT_EQ(Renderer().GetBakingProgress(), 0);
	EXPECT_FALSE(fs::exists("data/Cubemaps/empty"));
	EXPECT_EQ(Renderer().GetRTC().GetPointLights().Count(), 0) << "the bake empties the collector";
}

TEST_F(ReflectionBakeTest, ALitRoomsCubeShowsItsLightsFollowsTheLobesAndOutlivesAFullDisk)
{
	LUMORA_RETURN_UNLESS(Start());
	// room_small at the origin lit by four lights, none in the middle of anything, so that no
	// face looks the same turned or mirrored: a red one before the +X wall (above and to the right
	// of the middle of face 0), a blue one under the ceiling towards +X and -Z, and two green ones,
	// one low over the floor and one low in the -X, +Z corner. Each lights only its own part of
	// the room.
	Place("data/models/room_small.dae", {0.0f, 0.0f, 0.0f});
	myPointLights = {
	    {.myFalloff = 1.0f, .myPosition = {1.6f, 1.8f, -0.5f}, .myColor = {8.0f, 0.0f, 0.0f, 1.0f}},
	    {.myFalloff = 1.2f, .myPosition = {1.0f, 2.7f, -1.0f}, .myColor = {0.0f, 0.0f, 6.0f, 1.0f}},
	    {.myFalloff = 3.0f, .myPosition = {0.6f, 0.3f, 0.4f}, .myColor = {0.0f, 8.0f, 0.0f, 1.0f}},
	    {.myFalloff = 1.0f, .myPosition = {-1.5f, 0.5f, 1.3f}, .myColor = {0.0f, 6.0f, 0.0f, 1.0f}}};
	AddRoom("small", {0.0f, 0.0f, 0.0f});
	Bake("lit");
	const std::string path = CubePath("lit", "small");
	CubeFile cube;
	ASSERT_TRUE(Load(path, cube));
	const Dds::ImageInfo& info = cube.myImage.Info();
	ASSERT_EQ((std::array{info.myArraySize, info.myMipLevels, info.myWidth, info.myHeight}),
	          (std::array<uint32_t, 4>{6, ourMipCount, ourFaceSize, ourFaceSize}));

	// The room's walls are grey and the light the ambient pass adds is grey too, so each light
	// shows as its channel above the smaller of the other two. The red light is before the +X
	// wall: red on face 0, none on face 1 (-X).
	const auto redExcess = [](const Rgb& aColor) { return aColor[0] - std::min(aColor[1], aColor[2]); };
	const auto greenExcess = [](const Rgb& aColor) { return aColor[1] - std::min(aColor[0], aColor[2]); };
	const Rgb plusX = cube.Mean(0, 0, 64, ourFaceSize - 1, 191);
	const Rgb minusX = cube.Mean(1, 0, 0, ourFaceSize - 1, ourFaceSize - 1);
	EXPECT_GT(redExcess(plusX), 0.01);
	EXPECT_LT(std::abs(redExcess(minusX)), 0.02 * redExcess(plusX)) << redExcess(minusX);
	// The green light is low in the room: on every side face the lower half of the wall (rows
	// 166..216; the floor starts below) is greener than its upper half (rows 40..90).
	for (int face : {0, 1, 4, 5})
	{
		const Rgb upper = cube.Mean(face, 0, 40, ourFaceSize - 1, 90);
		const Rgb lower = cube.Mean(face, 0, 166, ourFaceSize - 1, 216);
		EXPECT_GT(greenExcess(lower), 0.005) << "face " << face;
		EXPECT_GT(greenExcess(lower), 3.0 * std::abs(greenExcess(upper)))
		    << "face " << face << ": row 0 looks up";
	}
	// -Y (face 3) looks down at the floor under the green light, +Y (face 2) at the ceiling far above it.
	const Rgb floor = cube.Mean(3, 64, 64, 191, 191);
	const Rgb ceiling = cube.Mean(2, 64, 64, 191, 191);
	EXPECT_GT(greenExcess(floor), 4.0 * greenExcess(ceiling));

	// The filtered mips against the lobes max(0, cos)^p, p = 8192^((8 - m) / 8), integrated on the
	// CPU over mip 0 (reduced where the lobe is wide enough): mip 1 is mip 0 hardly blurred, mip 8
	// its cosine-weighted hemisphere. The sharp mips are measured on a grid that includes the
	// faces' edges and centres, the others at every texel.
	const Radiance full(cube, ourFaceSize);
	const Radiance half(cube, ourFaceSize / 2);
	const Radiance quarter(cube, ourFaceSize / 4);
	for (int mip = 1; mip < ourMipCount; ++mip)
	{
		const Radiance& radiance = mip == 1 ? full : mip == 2 ? half : quarter;
		const double power = std::pow(8192.0, (8 - mip) * 0.125);
		const int size = CubeFile::Size(mip);
		std::vector<int> samples = {0, size / 4, size / 2, size * 3 / 4, size - 1};
		if (size <= 16)
		{
			samples.resize(static_cast<size_t>(size));
			std::iota(samples.begin(), samples.end(), 0);
		}
		double worst = 0.0;
		double brightest = 0.0;
		for (int face = 0; face < 6; ++face)
		{
			for (int y : samples)
			{
				for (int x : samples)
				{
					const Rgb expected = radiance.Lobe(Radiance::Direction(face, x, y, size), power);
					const Rgb actual = cube.Texel(face, mip, x, y);
					for (int channel = 0; channel < 3; ++channel)
					{
						// Written so that a NaN in the file makes the worst difference NaN.
						const double difference = std::abs(actual[channel] - expected[channel]);
						worst = difference <= worst ? worst : difference;
						brightest = std::max(brightest, expected[channel]);
					}
				}
			}
		}
		EXPECT_GT(brightest, 0.01) << "mip " << mip;
		// The filter sums each lobe to a hundredth of its peak over a cross of about the mip's own
		// resolution; the first mips stay within 2 % of the exact lobe (the CPU's reference for the
		// wider ones is itself summed over a quarter of mip 0).
		EXPECT_LT(worst, (mip <= 3 ? 0.02 : 0.05) * brightest)
		    << "mip " << mip << ": worst difference " << worst << " of " << brightest;
	}

	// The same room baked again without its lights onto a disk with room for the log only: the
	// save's error entry names the file, the bake finishes, the old cube stays whole.
	const std::string before = TestSupport::ReadWholeFile(path);
	ASSERT_GT(before.size(), 4000000u);
	TakeLog();
	myPointLights.clear();
	{
		TestSupport::FileSizeLimit full(fs::file_size(myLogPath) + 65536);
		Bake("lit");
	}
	EXPECT_EQ(Renderer().GetBakingProgress(), 100);
	EXPECT_NE(TakeLog().find(path), std::string::npos) << "the save's error entry names the file";
	EXPECT_TRUE(TestSupport::ReadWholeFile(path) == before) << "the old cubemap was replaced";
	EXPECT_EQ(std::distance(fs::directory_iterator("data/Cubemaps/lit"), fs::directory_iterator()), 1)
	    << "no temporary is left beside it";
}
