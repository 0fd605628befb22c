// DDS files made into textures: written with Dds::SaveToFile, loaded with
// Gpu::CreateTextureFromFile, and checked by what a shader samples from them.

#include "platform/gpu/TextureLoader.h"

#include <cstring>

#include "GpuTest.h"
#include "TestProgram.h"
#include "platform/dds/DdsFile.h"
#include "platform/gpu/Formats.h"
#include "support/TestSupport.h"

namespace
{
using Color = SampleProgram::Color;
using Dds::Format;
using Dds::ResourceDimension;
using Bytes = std::vector<uint8_t>;

// Repeats one pixel (or one 4x4 block) over aSize bytes from aDestination.
void Repeat(uint8_t* aDestination, uint64_t aSize, const Bytes& aPattern)
{
	for (uint64_t at = 0; at + aPattern.size() <= aSize; at += aPattern.size())
	{
		std::memcpy(aDestination + at, aPattern.data(), aPattern.size());
	}
}

Color Unorm(Pixel aPixel)
{
	return {aPixel[0] / 255.0f, aPixel[1] / 255.0f, aPixel[2] / 255.0f, aPixel[3] / 255.0f};
}

uint16_t Rgb565(uint32_t aRed, uint32_t aGreen, uint32_t aBlue)
{
	return static_cast<uint16_t>(aRed << 11 | aGreen << 5 | aBlue);
}

// A BC1 colour block: two 565 endpoints and one 2-bit index for all 16 pixels.
Bytes Bc1Block(uint16_t aColor0, uint16_t aColor1, uint8_t anIndex)
{
	const uint8_t indices = static_cast<uint8_t>(anIndex * 0x55);
	return {uint8_t(aColor0), uint8_t(aColor0 >> 8),
	        uint8_t(aColor1), uint8_t(aColor1 >> 8),
	        indices,          indices,
	        indices,          indices};
}

template <typename Value, size_t Count> Bytes BytesOf(const std::array<Value, Count>& someValues)
{
	Bytes bytes(sizeof(someValues));
	std::memcpy(bytes.data(), someValues.data(), sizeof(someValues));
	return bytes;
}

void ExpectColor(const Color& anActual, const Color& anExpected, float aTolerance, const std::string& aWhere)
{
	for (int channel = 0; channel < 4; ++channel)
	{
		EXPECT_NEAR(anActual[channel], anExpected[channel], aTolerance) << aWhere << ", channel " << channel;
	}
}

const std::array<float, 4> ourFaceDirections[6] = {{1, 0, 0, 0},  {-1, 0, 0, 0}, {0, 1, 0, 0},
                                                   {0, -1, 0, 0}, {0, 0, 1, 0},  {0, 0, -1, 0}};
} // namespace

class TextureLoaderTest : public GpuTest
{
protected:
	void SetUpGpu() override { mySampleProgram.Init(GetContext()); }

	void TearDown() override
	{
		mySampleProgram.Destroy();
		GpuTest::TearDown();
	}

	void Save(const std::string& aPath, const Dds::Image& anImage)
	{
		std::string error;
		ASSERT_TRUE(Dds::SaveToFile(aPath, anImage, error)) << error;
	}

	Dds::Image MakeImage(const Dds::ImageInfo& anInfo)
	{
		Dds::Image image;
		std::string error;
		EXPECT_TRUE(image.Init(anInfo, error)) << error;
		return image;
	}

	// The loaded texture, destroyed by the fixture; null when loading failed.
	Gpu::Texture* Load(const std::string& aPath, Dds::ImageInfo* anInfoOut)
	{
		return Keep(Gpu::CreateTextureFromFile(GetContext(), aPath, anInfoOut));
	}

	TestSupport::ScratchDir myScratch;
	SampleProgram mySampleProgram;
};

// Every array item (layer, cube face), mip and volume slice gets its own colour,
// and a shader sampling it must get that colour back: the subresources reached
// GL in their places.
TEST_F(TextureLoaderTest, EveryItemMipAndSliceSamplesItsOwnColour)
{
	const struct
	{
		const char* myName;
		Dds::ImageInfo myInfo;
		GLenum myViewTarget;
	} cases[] = {
	    {"cube with nine mips",
	     {256, 256, 1, 6, 9, Dds::MiscTextureCube, Format::R8G8B8A8_UNORM},
	     GL_TEXTURE_CUBE_MAP},
	    {"cube array",
	     {4, 4, 1, 12, 3, Dds::MiscTextureCube, Format::R8G8B8A8_UNORM},
	     GL_TEXTURE_CUBE_MAP_ARRAY},
	    {"volume", {8, 8, 4, 1, 4, 0, Format::R8G8B8A8_UNORM, ResourceDimension::Texture3D}, GL_TEXTURE_3D},
	    {"2D array", {16, 8, 1, 3, 5, 0, Format::R8G8B8A8_UNORM}, GL_TEXTURE_2D_ARRAY},
	};
	for (const auto& test : cases)
	{
		SCOPED_TRACE(test.myName);
		const Dds::ImageInfo& info = test.myInfo;
		// Each subresource filled with its colour, and one query per colour to read it back.
		Dds::Image image = MakeImage(info);
		std::vector<SampleQuery> queries;
		std::vector<Color> expected;
		for (uint32_t item = 0; item < info.myArraySize; ++item)
		{
			for (uint32_t mip = 0; mip < info.myMipLevels; ++mip)
			{
				const uint32_t depth = Dds::MipExtent(info.myDepth, mip);
				for (uint32_t slice = 0; slice < depth; ++slice)
				{
					const Pixel pixel = {uint8_t(10 + 20 * item), uint8_t(10 + 25 * mip),
					                     uint8_t(30 + 50 * slice), 255};
					Repeat(image.Data(mip, item) + slice * image.SlicePitch(mip), image.SlicePitch(mip),
					       {pixel.begin(), pixel.end()});
					std::array<float, 4> coord = {0.5f, 0.5f, float(item), 0};
					if (info.IsCube())
					{
						coord = ourFaceDirections[item % 6];
						coord[3] = float(item / 6);
					}
					else if (info.IsVolume())
					{
						coord = {0.5f, 0.5f, (float(slice) + 0.5f) / float(depth), 0};
					}
					queries.push_back({coord, float(mip)});
					expected.push_back(Unorm(pixel));
				}
			}
		}
		// Readers find the file under another spelling of its path.
		Save(myScratch.File(std::string("Layouts/") + test.myName + ".DDS"), image);
		Dds::ImageInfo loadedInfo;
		Gpu::Texture* texture =
		    Load(myScratch.File(std::string("LAYOUTS/") + test.myName + ".dds"), &loadedInfo);
		ASSERT_NE(texture, nullptr);
		EXPECT_EQ(loadedInfo, info);
		EXPECT_EQ(texture->GetDefaultShaderResourceView()->GetTarget(), test.myViewTarget);
		const std::vector<Color> colors =
		    mySampleProgram.Sample(*texture->GetDefaultShaderResourceView(), queries);
		for (size_t query = 0; query < colors.size(); ++query)
		{
			ExpectColor(colors[query], expected[query], 1e-4f, "query " + std::to_string(query));
		}
	}
}

// Each format's texel (or 4x4 block) fills every mip of an 8x8 texture; every mip
// must sample as the stored value decodes under Direct3D's rules.
TEST_F(TextureLoaderTest, FormatsSampleTheirStoredValues)
{
	const Pixel rgba = {188, 64, 255, 128};
	const Pixel bgra = {10, 100, 200, 255};
	const Color bgraRead = {200 / 255.0f, 100 / 255.0f, 10 / 255.0f, 1};
	const uint16_t bc1Color = Rgb565(20, 40, 10);
	const Color bc1Read = {20 / 31.0f, 40 / 63.0f, 10 / 31.0f, 1.0f};
	auto decoded = [](const Color& aColor) {
		return Color{SrgbToLinear(aColor[0]), SrgbToLinear(aColor[1]), SrgbToLinear(aColor[2]), aColor[3]};
	};
	const struct
	{
		Format myFormat;
		Bytes myPattern;
		Color myExpected;
		float myTolerance;
	} cases[] = {
	    {Format::R8G8B8A8_UNORM, {rgba.begin(), rgba.end()}, Unorm(rgba), 1e-4f},
	    {Format::R8G8B8A8_UNORM_SRGB, {rgba.begin(), rgba.end()}, decoded(Unorm(rgba)), 2e-3f},
	    {Format::B8G8R8A8_UNORM, {bgra.begin(), bgra.end()}, bgraRead, 1e-4f},
	    {Format::B8G8R8X8_UNORM, {10, 100, 200, 7}, bgraRead, 1e-4f}, // alpha ignored
	    {Format::BC1_UNORM, Bc1Block(bc1Color, 0, 0), bc1Read, 4e-3f},
	    // Endpoints in the three-colour order: index 3 is transparent black.
	    {Format::BC1_UNORM, Bc1Block(bc1Color, bc1Color, 3), {0, 0, 0, 0}, 1e-4f},
	    // 0.25, -2, 1000, 0.5 as halves.
	    {Format::R16G16B16A16_FLOAT,
	     BytesOf(std::array<uint16_t, 4>{0x3400, 0xC000, 0x63D0, 0x3800}),
	     {0.25f, -2.0f, 1000.0f, 0.5f},
	     0.0f},
	    {Format::R32G32B32A32_FLOAT,
	     BytesOf(std::array<float, 4>{-1.5f, 0.125f, 65536.0f, 7.0f}),
	     {-1.5f, 0.125f, 65536.0f, 7.0f},
	     0.0f},
	};
	int number = 0;
	for (const auto& test : cases)
	{
		SCOPED_TRACE(Dds::FormatName(test.myFormat));
		Dds::Image image = MakeImage({8, 8, 1, 1, 4, 0, test.myFormat});
		std::vector<SampleQuery> queries;
		for (uint32_t mip = 0; mip < 4; ++mip)
		{
			Repeat(image.Data(mip, 0), image.SubresourceSize(mip), test.myPattern);
			queries.push_back({{0.4f, 0.6f, 0, 0}, float(mip)});
		}
		const std::string path = myScratch.File(std::to_string(++number) + ".dds");
		Save(path, image);
		Dds::ImageInfo info;
		Gpu::Texture* texture = Load(path, &info);
		ASSERT_NE(texture, nullptr);
		EXPECT_EQ(info.myFormat, test.myFormat);
		const std::vector<Color> colors =
		    mySampleProgram.Sample(*texture->GetDefaultShaderResourceView(), queries);
		for (size_t mip = 0; mip < colors.size(); ++mip)
		{
			ExpectColor(colors[mip], test.myExpected, test.myTolerance, "mip " + std::to_string(mip));
		}
	}
}

TEST_F(TextureLoaderTest, FailuresGiveNullAndOneReportNamingTheFile)
{
	Dds::ImageInfo info;
	info.myWidth = 77;
	const std::string missing = myScratch.File("missing.dds");
	EXPECT_EQ(Load(missing, &info), nullptr);
	ExpectReports({{"Gpu::CreateTextureFromFile", missing}});
	EXPECT_EQ(info.myWidth, 77u) << "the information of a file that was never read";

	// Bytes that are no DDS file at all (the file layer's own messages are its tests').
	const std::string garbage = myScratch.File("garbage.dds");
	TestSupport::WriteWholeFile(garbage, "PNG? no, not even that");
	EXPECT_EQ(Load(garbage, nullptr), nullptr);
	ExpectReports({{"Gpu::CreateTextureFromFile", garbage}});

	// A format the file layer knows and GL does not: the information still arrives.
	ASSERT_FALSE(Gpu::GetFormatInfo(Format::R16G16B16A16_UNORM).IsSupported());
	const std::string unorm16 = myScratch.File("unorm16.dds");
	Save(unorm16, MakeImage({4, 4, 1, 1, 1, 0, Format::R16G16B16A16_UNORM}));
	EXPECT_EQ(Load(unorm16, &info), nullptr);
	ExpectReports({{unorm16, "R16G16B16A16_UNORM"}});
	EXPECT_EQ(std::pair(info.myFormat, info.myWidth), std::pair(Format::R16G16B16A16_UNORM, 4u));

	// GL compresses only 2D images with BC formats.
	const std::string bcVolume = myScratch.File("bc volume.dds");
	Save(bcVolume, MakeImage({8, 8, 4, 1, 1, 0, Format::BC1_UNORM, ResourceDimension::Texture3D}));
	EXPECT_EQ(Load(bcVolume, &info), nullptr);
	ExpectReports({{bcVolume, "volume"}});
	EXPECT_EQ(info.myDepth, 4u);

	EXPECT_EQ(Gpu::CreateTextureFromImage(GetContext(), Dds::Image(), "nothing yet"), nullptr);
	ExpectReports({{"nothing yet", "empty"}});
}
