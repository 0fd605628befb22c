#include "platform/dds/DdsFile.h"

#include <algorithm>
#include <cstring>
#include <filesystem>
#include <functional>
#include <gtest/gtest.h>
#include <tuple>

#include "support/TestSupport.h"

namespace fs = std::filesystem;
using Dds::Format;
using Dds::ImageInfo;
using Dds::ResourceDimension;
using TestSupport::ReadWholeFile;
using TestSupport::ScratchDir;
using TestSupport::WriteWholeFile;

namespace
{
// An image whose bytes differ from subresource to subresource, so a swapped face
// or mip shows up in a byte comparison.
Dds::Image MakeImage(const ImageInfo& anInfo)
{
	Dds::Image image;
	std::string error;
	EXPECT_TRUE(image.Init(anInfo, error)) << error;
	uint32_t state = 12345;
	for (uint8_t& byte : image.Bytes())
	{
		state = state * 1103515245u + 12345u;
		byte = uint8_t(state >> 16);
	}
	return image;
}

std::vector<uint8_t> SaveBytes(const ImageInfo& anInfo)
{
	std::vector<uint8_t> bytes;
	std::string error;
	EXPECT_TRUE(Dds::SaveToMemory(MakeImage(anInfo), bytes, error)) << error;
	return bytes;
}

uint32_t U32At(const std::string& someBytes, size_t anOffset)
{
	uint32_t value = 0;
	std::memcpy(&value, someBytes.data() + anOffset, 4);
	return value;
}

void SetU32(std::vector<uint8_t>& someBytes, size_t anOffset, uint32_t aValue)
{
	std::memcpy(someBytes.data() + anOffset, &aValue, 4);
}

void ExpectRoundTrip(const ScratchDir& aScratch, const ImageInfo& anInfo, bool aDx10Flag,
                     const std::string& aLabel)
{
	const Dds::Image image = MakeImage(anInfo);
	const std::string path = aScratch.File("Textures/" + aLabel + ".dds");
	std::string error;
	ASSERT_TRUE(Dds::SaveToFile(path, image, error)) << aLabel << ": " << error;

	const std::string file = ReadWholeFile(path);
	ASSERT_GT(file.size(), 128u) << aLabel;
	EXPECT_EQ(file.substr(84, 4) == "DX10", aDx10Flag) << aLabel << ": header kind";
	EXPECT_EQ(file.size(), (aDx10Flag ? 148 : 128) + image.Bytes().size()) << aLabel;

	ImageInfo info;
	ASSERT_TRUE(Dds::GetImageInfoFromFile(path, info, error)) << aLabel << ": " << error;
	EXPECT_EQ(info, anInfo) << aLabel;
	Dds::Image loaded;
	// Readers find the file under any spelling of its path.
	ASSERT_TRUE(Dds::LoadFromFile(aScratch.File("TEXTURES/" + aLabel + ".DDS"), loaded, error))
	    << aLabel << ": " << error;
	EXPECT_EQ(loaded.Info(), anInfo) << aLabel;
	EXPECT_TRUE(loaded.Bytes() == image.Bytes()) << aLabel << ": pixels differ";
}
} // namespace

// Each format's typeless and sRGB forms and whether it is sRGB; what has no such forms (B8G8R8A8
// included, and BC4-BC6H for sRGB) maps to itself.
TEST(DdsFormatTest, SRGBAndTypelessMaps)
{
	const std::tuple<Format, Format, Format, bool> cases[] = {
	    {Format::R8G8B8A8_UNORM, Format::R8G8B8A8_TYPELESS, Format::R8G8B8A8_UNORM_SRGB, false},
	    {Format::R8G8B8A8_SINT, Format::R8G8B8A8_TYPELESS, Format::R8G8B8A8_UNORM_SRGB, false},
	    {Format::R8G8B8A8_UNORM_SRGB, Format::R8G8B8A8_TYPELESS, Format::R8G8B8A8_UNORM_SRGB, true},
	    {Format::BC3_UNORM, Format::BC3_TYPELESS, Format::BC3_UNORM_SRGB, false},
	    {Format::BC4_SNORM, Format::BC4_TYPELESS, Format::BC4_SNORM, false},
	    {Format::BC5_UNORM, Format::BC5_TYPELESS, Format::BC5_UNORM, false},
	    {Format::BC6H_SF16, Format::BC6H_TYPELESS, Format::BC6H_SF16, false},
	    {Format::BC7_UNORM, Format::BC7_TYPELESS, Format::BC7_UNORM_SRGB, false},
	    {Format::BC7_UNORM_SRGB, Format::BC7_TYPELESS, Format::BC7_UNORM_SRGB, true},
	    {Format::B8G8R8A8_UNORM, Format::B8G8R8A8_UNORM, Format::B8G8R8A8_UNORM, false},
	    {Format::B8G8R8A8_UNORM_SRGB, Format::B8G8R8A8_UNORM_SRGB, Format::B8G8R8A8_UNORM_SRGB, true},
	};
	for (const auto& [format, typeless, srgb, srgbFlag] : cases)
	{
		EXPECT_EQ(std::tuple(Dds::ToTypeless(format), Dds::ToSRGB(format), Dds::IsSRGB(format)),
		          std::tuple(typeless, srgb, srgbFlag))
		    << Dds::FormatName(format);
	}
}

TEST(DdsFileTest, EveryFormatAndLayoutRoundTripsByteForByte)
{
	ScratchDir scratch;
	const struct
	{
		Format format;
		bool dx10Flag; // no legacy form that is written: the DX10 header
	} cases[] = {
	    {Format::R8G8B8A8_UNORM_SRGB, true}, {Format::B8G8R8X8_UNORM, false}, {Format::BC2_UNORM, false},
	    {Format::BC3_TYPELESS, true},        {Format::R32_FLOAT, false},      {Format::R11G11B10_FLOAT, true},
	    {Format::BC4_SNORM, true},           {Format::BC5_UNORM, true},       {Format::BC6H_UF16, true},
	    {Format::BC7_UNORM_SRGB, true},
	};
	for (const auto& test : cases)
	{
		// 20x12 gives levels that are not whole blocks (5x3, 2x1, 1x1).
		ExpectRoundTrip(scratch, ImageInfo{20, 12, 1, 1, 5, 0, test.format}, test.dx10Flag,
		                Dds::FormatName(test.format));
	}

	const struct
	{
		const char* label;
		ImageInfo info;
		bool dx10Flag;
		uint64_t totalBytes;
	} layouts[] = {
	    // 4 bytes x (256^2 + 128^2 + ... + 1) = 349524 per face.
	    {"cube", ImageInfo{256, 256, 1, 6, 9, Dds::MiscTextureCube, Format::R8G8B8A8_UNORM}, false,
	     6 * 349524ull},
	    {"cube-array", ImageInfo{8, 8, 1, 12, 1, Dds::MiscTextureCube, Format::BC3_UNORM}, true, 12 * 64},
	    // 8x4x4, 4x2x2, 2x1x1, 1x1x1 texels of 8 bytes.
	    {"volume", ImageInfo{8, 4, 4, 1, 4, 0, Format::R16G16B16A16_FLOAT, ResourceDimension::Texture3D},
	     false, 1176},
	    {"volume-bc", ImageInfo{8, 8, 2, 1, 3, 0, Format::BC1_UNORM, ResourceDimension::Texture3D}, false,
	     4 * 8 * 2 + 8 + 8},
	    // 5x5, 2x2, 1x1: 2x2 blocks of 8 bytes, then one each.
	    {"bc4", ImageInfo{5, 5, 1, 1, 3, 0, Format::BC4_UNORM}, true, 4 * 8 + 8 + 8},
	    // 20x12 down to 1x1 is 5x3, 3x2, 2x1, 1, 1 blocks of 16 bytes per item.
	    {"bc7-array", ImageInfo{20, 12, 1, 2, 5, 0, Format::BC7_UNORM}, true, 2 * 25 * 16},
	    {"line", ImageInfo{16, 1, 1, 1, 5, 0, Format::R8G8B8A8_UNORM, ResourceDimension::Texture1D}, true,
	     4 * 31},
	};
	for (const auto& test : layouts)
	{
		SCOPED_TRACE(test.label);
		EXPECT_EQ(MakeImage(test.info).Bytes().size(), test.totalBytes);
		ExpectRoundTrip(scratch, test.info, test.dx10Flag, test.label);
	}

	// Subresources follow Direct3D's order: face 1 starts after face 0's whole chain.
	const Dds::Image cube = MakeImage(layouts[0].info);
	EXPECT_EQ(cube.Data(0, 1) - cube.Data(0, 0), 349524);
	EXPECT_EQ(cube.Data(8, 5) - cube.Data(0, 0), 6 * 349524 - 4);
	EXPECT_EQ(cube.RowPitch(1), 512u);
	const std::string cubeFile = ReadWholeFile(scratch.File("Textures/cube.dds"));
	EXPECT_EQ(U32At(cubeFile, 112), 0xFE00u) << "cube map with all six faces";
	const std::string volumeFile = ReadWholeFile(scratch.File("Textures/volume.dds"));
	EXPECT_EQ(U32At(volumeFile, 112), 0x200000u) << "volume";
	EXPECT_EQ(U32At(volumeFile, 24), 4u) << "depth";
	const std::string arrayFile = ReadWholeFile(scratch.File("Textures/cube-array.dds"));
	EXPECT_EQ(U32At(arrayFile, 136), 4u) << "DX10 cube flag";
	EXPECT_EQ(U32At(arrayFile, 140), 2u) << "DX10 array size counts cubes";
}

TEST(DdsFileTest, HeadersHaveTheirFieldsAtKnownOffsets)
{
	ScratchDir scratch;
	const struct
	{
		Format format;
		size_t offset;
		uint32_t value;
		const char* field;
	} cases[] = {
	    {Format::BC1_UNORM, 0, 0x20534444, "magic 'DDS '"},
	    {Format::BC1_UNORM, 4, 124, "header size"},
	    {Format::BC1_UNORM, 84, 0x31545844, "FourCC 'DXT1'"},
	    {Format::BC1_UNORM, 20, 32, "linear size of the top level"},
	    {Format::BC1_UNORM, 28, 2, "mip count"},
	    {Format::R16G16B16A16_FLOAT, 84, 113, "FourCC 113"},
	    {Format::R8G8B8A8_UNORM, 80, 0x41, "RGB and alpha flags"},
	    {Format::R8G8B8A8_UNORM, 20, 32, "row pitch"},
	    {Format::B8G8R8A8_UNORM, 92, 0xFF0000, "red mask"},
	    {Format::BC4_UNORM, 20, 32, "linear size of 2x2 blocks of 8 bytes"},
	    {Format::BC4_UNORM, 128, 80, "DXGI format"},
	    {Format::BC7_UNORM_SRGB, 128, 99, "DXGI format"},
	};
	for (const auto& test : cases)
	{
		const std::string path = scratch.File(std::string(Dds::FormatName(test.format)) + ".dds");
		std::string error;
		ASSERT_TRUE(Dds::SaveToFile(path, MakeImage(ImageInfo{8, 8, 1, 1, 2, 0, test.format}), error))
		    << error;
		const std::string file = ReadWholeFile(path);
		ASSERT_GE(file.size(), 128u);
		EXPECT_EQ(U32At(file, test.offset), test.value) << Dds::FormatName(test.format) << ": " << test.field;
	}
}

// The FourCCs that other tools write for BC4 and BC5 read as those formats with the bytes unchanged
// (written back, they get the DX10 header like any BC4 or BC5 image).
TEST(DdsFileTest, OtherToolsFourCCsReadAsBc4AndBc5)
{
	const struct
	{
		const char* fourCC;
		Format sameBlockBytes;
		Format format;
	} cases[] = {
	    {"ATI1", Format::BC1_UNORM, Format::BC4_UNORM}, {"BC4U", Format::BC1_UNORM, Format::BC4_UNORM},
	    {"BC4S", Format::BC1_UNORM, Format::BC4_SNORM}, {"ATI2", Format::BC3_UNORM, Format::BC5_UNORM},
	    {"BC5U", Format::BC3_UNORM, Format::BC5_UNORM}, {"BC5S", Format::BC3_UNORM, Format::BC5_SNORM},
	};
	for (const auto& test : cases)
	{
		SCOPED_TRACE(test.fourCC);
		std::vector<uint8_t> bytes = SaveBytes(ImageInfo{12, 8, 1, 1, 3, 0, test.sameBlockBytes});
		std::memcpy(bytes.data() + 84, test.fourCC, 4);
		Dds::Image image;
		std::string error;
		ASSERT_TRUE(Dds::LoadFromMemory(bytes.data(), bytes.size(), image, error)) << error;
		EXPECT_EQ(image.Info(), (ImageInfo{12, 8, 1, 1, 3, 0, test.format}));
		EXPECT_TRUE(std::equal(image.Bytes().begin(), image.Bytes().end(), bytes.begin() + 128, bytes.end()));
	}
}

TEST(DdsFileTest, MalformedInputFailsWithAMessage)
{
	const std::vector<uint8_t> legacy = SaveBytes(ImageInfo{8, 8, 1, 1, 4, 0, Format::BC1_UNORM});
	const std::vector<uint8_t> dx10 =
	    SaveBytes(ImageInfo{4, 4, 1, 6, 3, Dds::MiscTextureCube, Format::R8G8B8A8_UNORM_SRGB});
	const std::vector<uint8_t> bc7 = SaveBytes(ImageInfo{8, 8, 1, 1, 1, 0, Format::BC7_UNORM});
	const struct
	{
		const char* label;
		const std::vector<uint8_t>& base;
		std::function<void(std::vector<uint8_t>&)> change;
		const char* message;
	} cases[] = {
	    {"magic", legacy, [](auto& b) { b[0] = 'X'; }, "bad magic"},
	    {"header size", legacy, [](auto& b) { SetU32(b, 4, 123); }, "header size fields are 123 and 32"},
	    {"huge width", legacy, [](auto& b) { SetU32(b, 16, 0xFFFFFFFF); }, "is outside 1..16384"},
	    {"huge image", dx10,
	     [](auto& b) {
		     SetU32(b, 12, 16384);
		     SetU32(b, 16, 16384);
		     SetU32(b, 128, uint32_t(Format::R32G32B32A32_FLOAT));
		     SetU32(b, 140, 300);
	     },
	     "more than 1024 MiB"},
	    {"huge array", dx10, [](auto& b) { SetU32(b, 140, 0x80000000); }, "array size 2147483648"},
	    {"mip count", legacy, [](auto& b) { SetU32(b, 28, 5); }, "mip count 5 is outside 1..4"},
	    {"missing data", legacy, [](auto& b) { SetU32(b, 28, 1), SetU32(b, 12, 16); }, "needs 192"},
	    {"cube faces", legacy,
	     [](auto& b) { SetU32(b, 112, 0x200 | 0x400 | 0x800 | 0x1000 | 0x2000 | 0x4000); },
	     "cube map is missing faces"},
	    {"unknown DXGI format", dx10, [](auto& b) { SetU32(b, 128, 85); }, "unsupported DXGI format 85"},
	    {"unknown FourCC", legacy, [](auto& b) { std::memcpy(b.data() + 84, "YUY2", 4); },
	     "unsupported FourCC 'YUY2'"},
	    // BC5 takes twice the bytes of the BC1 data there: 64 + 16 + 16 + 16 after the header.
	    {"short ATI2 data", legacy, [](auto& b) { std::memcpy(b.data() + 84, "ATI2", 4); },
	     "the BC5_UNORM 8x8x1 image with 4 mips and 1 slices needs 240"},
	    {"unknown masks", legacy,
	     [](auto& b) {
		     SetU32(b, 80, 0x40);
		     SetU32(b, 88, 16);
	     },
	     "unsupported pixel format (flags 0x40, 16 bits"},
	    {"dimension", dx10, [](auto& b) { SetU32(b, 132, 7); },
	     "cube flag is set on a texture that is not 2D"},
	    {"dimension", dx10, [](auto& b) { SetU32(b, 132, 7), SetU32(b, 136, 0); }, "resource dimension 7"},
	    {"short BC7 data", bc7, [](auto& b) { b.pop_back(); },
	     "truncated: 211 bytes, the BC7_UNORM 8x8x1 image with 1 mips and 1 slices needs 212"},
	    // Cut inside the legacy header.
	    {"cut header", legacy, [](auto& b) { b.resize(100); }, "truncated: 100 bytes"},
	};
	for (const auto& test : cases)
	{
		std::vector<uint8_t> bytes = test.base;
		test.change(bytes);
		Dds::Image image;
		std::string error;
		EXPECT_FALSE(Dds::LoadFromMemory(bytes.data(), bytes.size(), image, error)) << test.label;
		EXPECT_NE(error.find("Dds::LoadFromMemory: <memory>: "), std::string::npos)
		    << test.label << ": " << error;
		EXPECT_NE(error.find(test.message), std::string::npos) << test.label << ": " << error;
		EXPECT_TRUE(image.IsEmpty()) << test.label;
	}
	ScratchDir scratch;
	const std::string path = scratch.File("short.dds");
	WriteWholeFile(path, std::string(legacy.begin(), legacy.end() - 1));
	Dds::Image image;
	std::string error;
	EXPECT_FALSE(Dds::LoadFromFile(path, image, error));
	EXPECT_NE(error.find("Dds::LoadFromFile: " + path + ": truncated"), std::string::npos) << error;
	EXPECT_FALSE(Dds::LoadFromFile(scratch.File("none.dds"), image, error));
	EXPECT_NE(error.find("none.dds: cannot open the file"), std::string::npos) << error;
}

TEST(DdsFileTest, FailedSavesReportAndLeaveNothingBehind)
{
	ScratchDir scratch;
	const Dds::Image image = MakeImage(ImageInfo{8, 8, 1, 1, 1, 0, Format::BC1_UNORM});
	WriteWholeFile(scratch.File("plain"), "x");
	fs::create_directories(scratch.File("folder.dds"));
	WriteWholeFile(scratch.File("old.dds"), "old");
	const struct
	{
		std::string target;
		const Dds::Image& image;
		const char* message;
	} cases[] = {
	    {scratch.File("plain/a.dds"), image, "cannot create its directory"},
	    {scratch.File("folder.dds"), image, "cannot replace the file"},
	    {scratch.File("old.dds"), Dds::Image(), "the image is empty"},
	};
	for (const auto& test : cases)
	{
		std::string error;
		EXPECT_FALSE(Dds::SaveToFile(test.target, test.image, error)) << test.target;
		EXPECT_NE(error.find("Dds::SaveToFile: " + test.target + ": " + test.message), std::string::npos)
		    << error;
	}
	std::vector<std::string> left;
	for (const auto& entry : fs::directory_iterator(scratch.Path()))
	{
		left.push_back(entry.path().filename().string());
	}
	std::sort(left.begin(), left.end());
	EXPECT_EQ(left, (std::vector<std::string>{"folder.dds", "old.dds", "plain"})) << "no temporaries";
	EXPECT_TRUE(fs::is_empty(scratch.File("folder.dds")));
	EXPECT_EQ(ReadWholeFile(scratch.File("plain")), "x");
	EXPECT_EQ(ReadWholeFile(scratch.File("old.dds")), "old");
}
