// DDS files made into textures: written with Dds::SaveToFile, loaded with
// Gpu::CreateTextureFromFile, and checked by what a shader samples from them.

#include "platform/gpu/TextureLoader.h"

#include <cmath>
#include <cstdlib>
#include <cstring>

#include "GpuTest.h"
#include "SampleProgram.h"
#include "platform/dds/DdsFile.h"
#include "platform/gpu/Formats.h"
#include "support/TestSupport.h"

namespace
{
using Color = SampleProgram::Color;
using Dds::Format;
using Dds::ResourceDimension;

Dds::ImageInfo MakeInfo(Format aFormat, uint32_t aWidth, uint32_t aHeight, uint32_t aMips,
                        ResourceDimension aDimension = ResourceDimension::Texture2D, uint32_t aDepth = 1,
                        uint32_t anArraySize = 1, bool aCubeFlag = false)
{
	Dds::ImageInfo info;
	info.myWidth = aWidth;
	info.myHeight = aHeight;
	info.myDepth = aDepth;
	info.myArraySize = anArraySize;
	info.myMipLevels = aMips;
	info.myMiscFlags = aCubeFlag ? Dds::MiscTextureCube : 0;
	info.myFormat = aFormat;
	info.myResourceDimension = aDimension;
	return info;
}

// Repeats one pixel (or one 4x4 block) over aSize bytes from aDestination.
void Repeat(uint8_t* aDestination, uint64_t aSize, const std::vector<uint8_t>& aPattern)
{
	for (uint64_t at = 0; at + aPattern.size() <= aSize; at += aPattern.size())
	{
		std::memcpy(aDestination + at, aPattern.data(), aPattern.size());
	}
}

Color Unorm(std::array<uint8_t, 4> someBytes)
{
	return {someBytes[0] / 255.0f, someBytes[1] / 255.0f, someBytes[2] / 255.0f, someBytes[3] / 255.0f};
}

float SrgbToLinear(float anEncoded)
{
	return anEncoded <= 0.04045f ? anEncoded / 12.92f : std::pow((anEncoded + 0.055f) / 1.055f, 2.4f);
}

uint16_t Rgb565(uint32_t aRed, uint32_t aGreen, uint32_t aBlue)
{
	return static_cast<uint16_t>(aRed << 11 | aGreen << 5 | aBlue);
}

// A BC1 colour block: two 565 endpoints and one 2-bit index for all 16 pixels.
std::vector<uint8_t> Bc1Block(uint16_t aColor0, uint16_t aColor1, uint8_t anIndex)
{
	const uint8_t indices = static_cast<uint8_t>(anIndex * 0x55);
	return {uint8_t(aColor0), uint8_t(aColor0 >> 8),
	        uint8_t(aColor1), uint8_t(aColor1 >> 8),
	        indices,          indices,
	        indices,          indices};
}

// A BC3 alpha block: two endpoints and one 3-bit index for all 16 pixels.
std::vector<uint8_t> Bc3AlphaBlock(uint8_t anAlpha0, uint8_t anAlpha1, uint64_t anIndex)
{
	uint64_t bits = 0;
	for (int pixel = 0; pixel < 16; ++pixel)
	{
		bits |= anIndex << (3 * pixel);
	}
	std::vector<uint8_t> block = {anAlpha0, anAlpha1};
	for (int byte = 0; byte < 6; ++byte)
	{
		block.push_back(static_cast<uint8_t>(bits >> (8 * byte)));
	}
	return block;
}

std::vector<uint8_t> Concat(std::vector<uint8_t> aFirst, const std::vector<uint8_t>& aSecond)
{
	aFirst.insert(aFirst.end(), aSecond.begin(), aSecond.end());
	return aFirst;
}

template <typename Value, size_t Count>
std::vector<uint8_t> BytesOf(const std::array<Value, Count>& someValues)
{
	std::vector<uint8_t> bytes(sizeof(someValues));
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
	void SetUp() override
	{
		GpuTest::SetUp();
		if (IsSkipped() || HasFailure())
		{
			return;
		}
		mySampleProgram.Init(GetContext());
	}

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

	// The loaded texture, destroyed by the fixture; null when loading failed.
	Gpu::Texture* Load(const std::string& aPath, Dds::ImageInfo* anInfoOut)
	{
		std::unique_ptr<Gpu::Texture> texture = Gpu::CreateTextureFromFile(GetContext(), aPath, anInfoOut);
		if (!texture)
		{
			return nullptr;
		}
		myTextures.push_back(std::move(texture));
		return myTextures.back().get();
	}

	std::vector<Color> Sample(const Gpu::Texture& aTexture, const std::vector<SampleQuery>& someQueries)
	{
		const Gpu::ShaderResourceView* view = aTexture.GetDefaultShaderResourceView();
		if (view == nullptr)
		{
			ADD_FAILURE() << "no default view";
			return {};
		}
		return mySampleProgram.Sample(*view, someQueries);
	}

	TestSupport::ScratchDir myScratch;
	SampleProgram mySampleProgram;
};

TEST_F(TextureLoaderTest, CubeWithNineMipsGivesEachFaceAndMipItsColour)
{
	auto faceColor = [](int aFace, int aMip) -> std::array<uint8_t, 4> {
		return {uint8_t(20 + 40 * aFace), uint8_t(10 + 25 * aMip), uint8_t((aFace * 9 + aMip) * 5), 255};
	};
	Dds::Image image;
	std::string error;
	ASSERT_TRUE(image.Init(
	    MakeInfo(Format::R8G8B8A8_UNORM, 256, 256, 9, ResourceDimension::Texture2D, 1, 6, true), error))
	    << error;
	for (uint32_t face = 0; face < 6; ++face)
	{
		for (uint32_t mip = 0; mip < 9; ++mip)
		{
			const std::array<uint8_t, 4> color = faceColor(int(face), int(mip));
			Repeat(image.Data(mip, face), image.SubresourceSize(mip), {color.begin(), color.end()});
		}
	}
	const std::string path = myScratch.File("sky.dds");
	Save(path, image);

	Dds::ImageInfo info;
	Gpu::Texture* cube = Load(path, &info);
	ASSERT_NE(cube, nullptr);
	EXPECT_EQ(info.myWidth, 256u);
	EXPECT_EQ(info.myHeight, 256u);
	EXPECT_EQ(info.myDepth, 1u);
	EXPECT_EQ(info.myArraySize, 6u);
	EXPECT_EQ(info.myMipLevels, 9u);
	EXPECT_EQ(info.myMiscFlags, 4u);
	EXPECT_EQ(info.myFormat, Format::R8G8B8A8_UNORM);
	EXPECT_EQ(info.myResourceDimension, ResourceDimension::Texture2D);
	EXPECT_EQ(info.myImageFileFormat, Dds::ImageFileFormat::Dds);
	EXPECT_EQ(cube->GetTarget(), GLenum(GL_TEXTURE_CUBE_MAP));
	EXPECT_EQ(cube->GetDefaultShaderResourceView()->GetTarget(), GLenum(GL_TEXTURE_CUBE_MAP));

	std::vector<SampleQuery> queries;
	for (int face = 0; face < 6; ++face)
	{
		for (int mip = 0; mip < 9; ++mip)
		{
			queries.push_back({ourFaceDirections[face], float(mip)});
		}
	}
	const std::vector<Color> colors = Sample(*cube, queries);
	ASSERT_EQ(colors.size(), queries.size());
	for (size_t query = 0; query < queries.size(); ++query)
	{
		const int face = int(query / 9);
		const int mip = int(query % 9);
		ExpectColor(colors[query], Unorm(faceColor(face, mip)), 1e-4f,
		            "face " + std::to_string(face) + " mip " + std::to_string(mip));
	}

	// Faces down, mips across, 16 pixels a cell: a picture to look at.
	std::vector<uint8_t> picture(9 * 16 * 6 * 16 * 4);
	for (size_t at = 0; at < picture.size() / 4; ++at)
	{
		const size_t x = at % (9 * 16);
		const size_t y = at / (9 * 16);
		const Color& color = colors[(y / 16) * 9 + x / 16];
		for (int channel = 0; channel < 4; ++channel)
		{
			picture[at * 4 + channel] = static_cast<uint8_t>(std::lround(color[channel] * 255.0f));
		}
	}
	EXPECT_TRUE(Gpu::SavePng(myScratch.File("cube samples.png"), 9 * 16, 6 * 16, picture.data()));
	if (const char* keep = std::getenv("LUMORA_KEEP_LOADER_PNG"))
	{
		EXPECT_TRUE(Gpu::SavePng(keep, 9 * 16, 6 * 16, picture.data()));
	}
}

TEST_F(TextureLoaderTest, VolumeGivesEachSliceOfEachMipItsColour)
{
	auto sliceColor = [](int aMip, int aSlice) -> std::array<uint8_t, 4> {
		return {uint8_t(30 + 50 * aSlice), uint8_t(40 + 60 * aMip), 200, uint8_t(255 - aSlice - aMip)};
	};
	Dds::Image image;
	std::string error;
	ASSERT_TRUE(image.Init(MakeInfo(Format::R8G8B8A8_UNORM, 8, 8, 4, ResourceDimension::Texture3D, 4), error))
	    << error;
	for (uint32_t mip = 0; mip < 4; ++mip)
	{
		for (uint32_t slice = 0; slice < Dds::MipExtent(4, mip); ++slice)
		{
			const std::array<uint8_t, 4> color = sliceColor(int(mip), int(slice));
			Repeat(image.Data(mip, 0) + slice * image.SlicePitch(mip), image.SlicePitch(mip),
			       {color.begin(), color.end()});
		}
	}
	const std::string path = myScratch.File("fog.dds");
	Save(path, image);

	Dds::ImageInfo info;
	Gpu::Texture* volume = Load(path, &info);
	ASSERT_NE(volume, nullptr);
	EXPECT_EQ(info.myWidth, 8u);
	EXPECT_EQ(info.myHeight, 8u);
	EXPECT_EQ(info.myDepth, 4u);
	EXPECT_EQ(info.myArraySize, 1u);
	EXPECT_EQ(info.myMipLevels, 4u);
	EXPECT_EQ(info.myMiscFlags, 0u);
	EXPECT_EQ(info.myResourceDimension, ResourceDimension::Texture3D);
	EXPECT_EQ(volume->GetDefaultShaderResourceView()->GetTarget(), GLenum(GL_TEXTURE_3D));

	std::vector<SampleQuery> queries;
	std::vector<std::pair<int, int>> where;
	for (int mip = 0; mip < 4; ++mip)
	{
		const int depth = int(Dds::MipExtent(4, uint32_t(mip)));
		for (int slice = 0; slice < depth; ++slice)
		{
			queries.push_back({{0.5f, 0.5f, (float(slice) + 0.5f) / float(depth), 0.0f}, float(mip)});
			where.emplace_back(mip, slice);
		}
	}
	const std::vector<Color> colors = Sample(*volume, queries);
	ASSERT_EQ(colors.size(), queries.size());
	for (size_t query = 0; query < queries.size(); ++query)
	{
		const auto [mip, slice] = where[query];
		ExpectColor(colors[query], Unorm(sliceColor(mip, slice)), 1e-4f,
		            "mip " + std::to_string(mip) + " slice " + std::to_string(slice));
	}
}

// Each format's texel (or 4x4 block) fills every mip of an 8x8 texture; every mip
// must sample as the stored value decodes under Direct3D's rules.
TEST_F(TextureLoaderTest, FormatsSampleTheirStoredValues)
{
	struct Case
	{
		const char* myName;
		Format myFormat;
		std::vector<uint8_t> myPattern;
		Color myExpected;
		float myTolerance;
	};
	const std::array<uint8_t, 4> rgba = {188, 64, 255, 128};
	const std::array<uint8_t, 4> bgra = {10, 100, 200, 255};
	const uint16_t bc1Color = Rgb565(20, 40, 10);
	const Color bc1Linear = {20 / 31.0f, 40 / 63.0f, 10 / 31.0f, 1.0f};
	const uint16_t red = Rgb565(31, 0, 0);
	const uint16_t green = Rgb565(0, 63, 0);
	const uint16_t blue = Rgb565(0, 0, 31);
	const std::vector<Case> cases = {
	    {"RGBA8", Format::R8G8B8A8_UNORM, {rgba.begin(), rgba.end()}, Unorm(rgba), 1e-4f},
	    {"RGBA8 sRGB",
	     Format::R8G8B8A8_UNORM_SRGB,
	     {rgba.begin(), rgba.end()},
	     {SrgbToLinear(188 / 255.0f), SrgbToLinear(64 / 255.0f), 1.0f, 128 / 255.0f},
	     2e-3f},
	    {"BGRA8",
	     Format::B8G8R8A8_UNORM,
	     {bgra.begin(), bgra.end()},
	     {200 / 255.0f, 100 / 255.0f, 10 / 255.0f, 1},
	     1e-4f},
	    {"BGRA8 sRGB",
	     Format::B8G8R8A8_UNORM_SRGB,
	     {bgra.begin(), bgra.end()},
	     {SrgbToLinear(200 / 255.0f), SrgbToLinear(100 / 255.0f), SrgbToLinear(10 / 255.0f), 1},
	     2e-3f},
	    {"BGRX8 (alpha ignored)",
	     Format::B8G8R8X8_UNORM,
	     {10, 100, 200, 7},
	     {200 / 255.0f, 100 / 255.0f, 10 / 255.0f, 1},
	     1e-4f},
	    {"BC1", Format::BC1_UNORM, Bc1Block(bc1Color, 0, 0), bc1Linear, 4e-3f},
	    {"BC1 sRGB",
	     Format::BC1_UNORM_SRGB,
	     Bc1Block(bc1Color, 0, 0),
	     {SrgbToLinear(bc1Linear[0]), SrgbToLinear(bc1Linear[1]), SrgbToLinear(bc1Linear[2]), 1},
	     1e-2f},
	    // Endpoints in the three-colour order: index 3 is transparent black.
	    {"BC1 punch-through", Format::BC1_UNORM, Bc1Block(bc1Color, bc1Color, 3), {0, 0, 0, 0}, 1e-4f},
	    {"BC2",
	     Format::BC2_UNORM,
	     Concat(std::vector<uint8_t>(8, 0x99), Bc1Block(green, 0, 0)),
	     {0, 1, 0, 9 / 15.0f},
	     4e-3f},
	    // Index 2 lies a third of the way from the first endpoint to the second.
	    {"BC3",
	     Format::BC3_UNORM,
	     Concat(Bc3AlphaBlock(200, 50, 2), Bc1Block(red, blue, 2)),
	     {2 / 3.0f, 0, 1 / 3.0f, (6 * 200 + 50) / 7.0f / 255.0f},
	     1e-2f},
	    // 0.25, -2, 1000, 0.5 as halves.
	    {"RGBA16F",
	     Format::R16G16B16A16_FLOAT,
	     BytesOf(std::array<uint16_t, 4>{0x3400, 0xC000, 0x63D0, 0x3800}),
	     {0.25f, -2.0f, 1000.0f, 0.5f},
	     0.0f},
	    {"R32F", Format::R32_FLOAT, BytesOf(std::array<float, 1>{3.75f}), {3.75f, 0, 0, 1}, 0.0f},
	    {"RGBA32F",
	     Format::R32G32B32A32_FLOAT,
	     BytesOf(std::array<float, 4>{-1.5f, 0.125f, 65536.0f, 7.0f}),
	     {-1.5f, 0.125f, 65536.0f, 7.0f},
	     0.0f},
	};
	// The sRGB cases carry the value the format description promises.
	EXPECT_NEAR(SrgbToLinear(188 / 255.0f), 0.5f, 5e-3f);

	for (const Case& test : cases)
	{
		SCOPED_TRACE(test.myName);
		Dds::Image image;
		std::string error;
		ASSERT_TRUE(image.Init(MakeInfo(test.myFormat, 8, 8, 4), error)) << error;
		for (uint32_t mip = 0; mip < 4; ++mip)
		{
			Repeat(image.Data(mip, 0), image.SubresourceSize(mip), test.myPattern);
		}
		const std::string path = myScratch.File(std::string(Dds::FormatName(test.myFormat)) + ".dds");
		Save(path, image);
		Dds::ImageInfo info;
		Gpu::Texture* texture = Load(path, &info);
		ASSERT_NE(texture, nullptr);
		EXPECT_EQ(info.myFormat, test.myFormat);

		std::vector<SampleQuery> queries;
		for (int mip = 0; mip < 4; ++mip)
		{
			queries.push_back({{0.4f, 0.6f, 0, 0}, float(mip)});
		}
		const std::vector<Color> colors = Sample(*texture, queries);
		ASSERT_EQ(colors.size(), queries.size());
		for (size_t mip = 0; mip < colors.size(); ++mip)
		{
			ExpectColor(colors[mip], test.myExpected, test.myTolerance, "mip " + std::to_string(mip));
		}
	}
}

// Each layer and mip of a 2D array keeps its place, and row 0 of the file is the
// top of the texture (v = 0). The file is found under another spelling of its path.
TEST_F(TextureLoaderTest, ArrayLayersAndMipsKeepTheirPlaces)
{
	auto color = [](int aLayer, int aMip, bool aTopFlag) -> std::array<uint8_t, 4> {
		return {uint8_t(40 + 50 * aLayer), uint8_t(20 + 40 * aMip), uint8_t(aTopFlag ? 250 : 5), 255};
	};
	constexpr int layers = 3;
	constexpr int mips = 5;
	Dds::Image image;
	std::string error;
	ASSERT_TRUE(image.Init(
	    MakeInfo(Format::R8G8B8A8_UNORM, 16, 8, mips, ResourceDimension::Texture2D, 1, layers), error))
	    << error;
	for (uint32_t layer = 0; layer < layers; ++layer)
	{
		for (uint32_t mip = 0; mip < mips; ++mip)
		{
			const uint32_t height = Dds::MipExtent(8, mip);
			const uint64_t rowPitch = image.RowPitch(mip);
			for (uint32_t row = 0; row < height; ++row)
			{
				const std::array<uint8_t, 4> pixel = color(int(layer), int(mip), row < (height + 1) / 2);
				Repeat(image.Data(mip, layer) + row * rowPitch, rowPitch, {pixel.begin(), pixel.end()});
			}
		}
	}
	Save(myScratch.File("Arrays/Layers.DDS"), image);

	Dds::ImageInfo info;
	Gpu::Texture* texture = Load(myScratch.File("arrays/LAYERS.dds"), &info);
	ASSERT_NE(texture, nullptr);
	EXPECT_EQ(info.myArraySize, unsigned(layers));
	EXPECT_EQ(info.myMipLevels, unsigned(mips));
	EXPECT_EQ(texture->GetDefaultShaderResourceView()->GetTarget(), GLenum(GL_TEXTURE_2D_ARRAY));

	std::vector<SampleQuery> queries;
	for (int layer = 0; layer < layers; ++layer)
	{
		for (int mip = 0; mip < mips; ++mip)
		{
			queries.push_back({{0.5f, 0.2f, float(layer), 0}, float(mip)});
			queries.push_back({{0.5f, 0.8f, float(layer), 0}, float(mip)});
		}
	}
	const std::vector<Color> colors = Sample(*texture, queries);
	ASSERT_EQ(colors.size(), queries.size());
	for (size_t query = 0; query < queries.size(); ++query)
	{
		const int layer = int(query / (2 * mips));
		const int mip = int(query / 2 % mips);
		// A mip one row high has only its top row.
		const bool topFlag = query % 2 == 0 || Dds::MipExtent(8, uint32_t(mip)) == 1;
		ExpectColor(colors[query], Unorm(color(layer, mip, topFlag)), 1e-4f,
		            "layer " + std::to_string(layer) + " mip " + std::to_string(mip) +
		                (topFlag ? " top" : " bottom"));
	}
}

// Two block-compressed cubes of three mips: a cube array in file order.
TEST_F(TextureLoaderTest, CubeArrayKeepsCubesFacesAndMipsInOrder)
{
	auto color = [](int aCube, int aFace, int aMip) {
		return Rgb565(uint32_t(2 + 5 * aFace), uint32_t(3 + 20 * aMip), uint32_t(4 + 20 * aCube));
	};
	Dds::Image image;
	std::string error;
	ASSERT_TRUE(
	    image.Init(MakeInfo(Format::BC1_UNORM, 4, 4, 3, ResourceDimension::Texture2D, 1, 12, true), error))
	    << error;
	for (uint32_t item = 0; item < 12; ++item)
	{
		for (uint32_t mip = 0; mip < 3; ++mip)
		{
			Repeat(image.Data(mip, item), image.SubresourceSize(mip),
			       Bc1Block(color(int(item / 6), int(item % 6), int(mip)), 0, 0));
		}
	}
	const std::string path = myScratch.File("probes.dds");
	Save(path, image);
	Dds::ImageInfo info;
	Gpu::Texture* cubes = Load(path, &info);
	ASSERT_NE(cubes, nullptr);
	EXPECT_EQ(info.myArraySize, 12u);
	EXPECT_TRUE(info.IsCube());
	EXPECT_EQ(cubes->GetDefaultShaderResourceView()->GetTarget(), GLenum(GL_TEXTURE_CUBE_MAP_ARRAY));

	std::vector<SampleQuery> queries;
	for (int cube = 0; cube < 2; ++cube)
	{
		for (int face = 0; face < 6; ++face)
		{
			for (int mip = 0; mip < 3; ++mip)
			{
				std::array<float, 4> coord = ourFaceDirections[face];
				coord[3] = float(cube);
				queries.push_back({coord, float(mip)});
			}
		}
	}
	const std::vector<Color> colors = Sample(*cubes, queries);
	ASSERT_EQ(colors.size(), queries.size());
	for (size_t query = 0; query < queries.size(); ++query)
	{
		const int cube = int(query / 18);
		const int face = int(query / 3 % 6);
		const int mip = int(query % 3);
		const uint16_t stored = color(cube, face, mip);
		const Color expected = {(stored >> 11) / 31.0f, (stored >> 5 & 63) / 63.0f, (stored & 31) / 31.0f, 1};
		ExpectColor(colors[query], expected, 4e-3f,
		            "cube " + std::to_string(cube) + " face " + std::to_string(face) + " mip " +
		                std::to_string(mip));
	}
}

TEST_F(TextureLoaderTest, FailuresGiveNullAndOneReportNamingTheFile)
{
	auto expectOneReportNaming = [](const std::string& aName, const std::string& anAlso) {
		const std::vector<std::string> reports = TakeReports();
		std::string all;
		for (const std::string& report : reports)
		{
			all += report + "; ";
		}
		ASSERT_EQ(reports.size(), 1u) << all;
		EXPECT_NE(reports[0].find(aName), std::string::npos) << reports[0];
		EXPECT_NE(reports[0].find(anAlso), std::string::npos) << reports[0];
	};
	Dds::ImageInfo info;
	info.myWidth = 77;
	const std::string missing = myScratch.File("missing.dds");
	EXPECT_EQ(Load(missing, &info), nullptr);
	expectOneReportNaming(missing, "Gpu::CreateTextureFromFile");
	EXPECT_EQ(info.myWidth, 77u) << "the information of a file that was never read";

	// A valid file cut short, and bytes that are no DDS file at all.
	Dds::Image image;
	std::string error;
	ASSERT_TRUE(image.Init(MakeInfo(Format::R8G8B8A8_UNORM, 16, 16, 1), error)) << error;
	std::vector<uint8_t> bytes;
	ASSERT_TRUE(Dds::SaveToMemory(image, bytes, error)) << error;
	const std::string truncated = myScratch.File("truncated.dds");
	TestSupport::WriteWholeFile(truncated, std::string(bytes.begin(), bytes.begin() + 200));
	EXPECT_EQ(Load(truncated, nullptr), nullptr);
	expectOneReportNaming(truncated, "Gpu::CreateTextureFromFile");
	const std::string garbage = myScratch.File("garbage.dds");
	TestSupport::WriteWholeFile(garbage, "PNG? no, not even that");
	EXPECT_EQ(Load(garbage, nullptr), nullptr);
	expectOneReportNaming(garbage, "Gpu::CreateTextureFromFile");

	// A format the file layer knows and GL does not: the information still arrives.
	const Format noGlForm = Format::R16G16B16A16_UNORM;
	ASSERT_FALSE(Gpu::GetFormatInfo(noGlForm).IsSupported());
	ASSERT_TRUE(image.Init(MakeInfo(noGlForm, 4, 4, 1), error)) << error;
	const std::string unorm16 = myScratch.File("unorm16.dds");
	Save(unorm16, image);
	EXPECT_EQ(Load(unorm16, &info), nullptr);
	expectOneReportNaming(unorm16, "R16G16B16A16_UNORM");
	EXPECT_EQ(info.myFormat, noGlForm);
	EXPECT_EQ(info.myWidth, 4u);

	// GL compresses only 2D images with BC formats.
	ASSERT_TRUE(image.Init(MakeInfo(Format::BC1_UNORM, 8, 8, 1, ResourceDimension::Texture3D, 4), error))
	    << error;
	const std::string bcVolume = myScratch.File("bc volume.dds");
	Save(bcVolume, image);
	EXPECT_EQ(Load(bcVolume, &info), nullptr);
	expectOneReportNaming(bcVolume, "volume");
	EXPECT_EQ(info.myDepth, 4u);

	EXPECT_EQ(Gpu::CreateTextureFromImage(GetContext(), Dds::Image(), "nothing yet"), nullptr);
	expectOneReportNaming("nothing yet", "empty");
}
