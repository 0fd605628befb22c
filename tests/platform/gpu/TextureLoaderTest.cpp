// DDS files made into textures: written with Dds::SaveToFile, loaded with
// Gpu::CreateTextureFromFile, and checked by what GL holds in every subresource.

#include "platform/gpu/TextureLoader.h"

#include <cstring>
#include <tuple>

#include "GpuTest.h"
#include "platform/dds/DdsFile.h"
#include "platform/gpu/Formats.h"
#include "support/TestSupport.h"

namespace
{
using Dds::Format;
using Dds::ResourceDimension;
using Bytes = std::vector<uint8_t>;
using Color = std::array<float, 4>;

// Repeats one pixel (or one 4x4 block) over aSize bytes from aDestination.
void Repeat(uint8_t* aDestination, uint64_t aSize, const Bytes& aPattern)
{
	for (uint64_t at = 0; at + aPattern.size() <= aSize; at += aPattern.size())
	{
		std::memcpy(aDestination + at, aPattern.data(), aPattern.size());
	}
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

// A BC4-BC7 block: (value, bits) fields packed from the lowest bit up, then one index of
// anIndexBits per texel (texel 0 leaves out the top bit of a 4-bit index, which is 0).
Bytes PackBlock(std::vector<std::pair<uint32_t, int>> someFields, int anIndexBits, uint32_t (*anIndex)(int))
{
	for (int texel = 0; texel < 16; ++texel)
	{
		someFields.push_back({anIndex(texel), texel == 0 && anIndexBits == 4 ? 3 : anIndexBits});
	}
	Bytes bytes;
	int at = 0;
	for (const auto& [value, count] : someFields)
	{
		for (int bit = 0; bit < count; ++bit, ++at)
		{
			bytes.resize(static_cast<size_t>(at / 8 + 1));
			bytes.back() |= static_cast<uint8_t>((value >> bit & 1) << (at % 8));
		}
	}
	return bytes;
}

// BC4 (and each channel of BC5) with texel t taking index t % 8.
Bytes Bc4Block(uint8_t anEnd0, uint8_t anEnd1)
{
	return PackBlock({{anEnd0, 8}, {anEnd1, 8}}, 3, [](int aTexel) { return uint32_t(aTexel % 8); });
}

Bytes operator+(Bytes aFirst, const Bytes& aSecond)
{
	aFirst.insert(aFirst.end(), aSecond.begin(), aSecond.end());
	return aFirst;
}

// Index t % 8 of a BC4 block with end0 > end1: 0 and 1 are the ends, k in 2..7 is
// ((8 - k) end0 + (k - 1) end1) / 7.
float Bc4Value(float anEnd0, float anEnd1, int aTexel)
{
	const int k = aTexel % 8;
	return k < 2 ? (k == 0 ? anEnd0 : anEnd1) : ((8 - k) * anEnd0 + (k - 1) * anEnd1) / 7;
}

// BC6H mode 11 (code 00011): 10-bit RGB ends (495, 0, 495) and (0, 495, 1023), odd texels
// taking end 1. As unsigned halves 495 is 1.0 and 1023 the largest half, 65504; as signed,
// 495 is 32800 and 1023 (-1) is -93 * 2^-24.
const Bytes ourBc6hBlock =
    PackBlock({{0x03, 5}, {495, 10}, {0, 10}, {495, 10}, {0, 10}, {495, 10}, {1023, 10}}, 4,
              [](int aTexel) { return aTexel % 2 == 0 ? 0u : 15u; });
// BC7 mode 6 (bit 6): 7-bit RGBA ends and a p-bit each, (255, 1, 129, 255) and (0, 254, 64, 126),
// odd texels taking end 1 but texel 5 index 8, weight 34: (30 end0 + 34 end1 + 32) / 64.
const Bytes ourBc7Block = PackBlock(
    {{1 << 6, 7}, {127, 7}, {0, 7}, {0, 7}, {127, 7}, {64, 7}, {32, 7}, {127, 7}, {63, 7}, {1, 1}, {0, 1}}, 4,
    [](int aTexel) { return aTexel == 5       ? 8u
	                        : aTexel % 2 == 0 ? 0u
	                                          : 15u; });

// What texel aTexel (0..15) of the blocks above decodes to in aFormat.
Color Decoded(Format aFormat, int aTexel)
{
	const bool endOneFlag = aTexel % 2 == 1;
	const Color bc7 = aTexel == 5  ? Color{120, 135, 94, 186}
	                  : endOneFlag ? Color{0, 254, 64, 126}
	                               : Color{255, 1, 129, 255};
	switch (aFormat)
	{
	case Format::BC4_UNORM:
		return {Bc4Value(1, 0, aTexel), 0, 0, 1};
	case Format::BC4_SNORM:
		return {Bc4Value(1, -1, aTexel), 0, 0, 1};
	case Format::BC5_UNORM:
		return {Bc4Value(1, 0, aTexel), Bc4Value(128 / 255.0f, 0, aTexel), 0, 1};
	case Format::BC5_SNORM:
		return {Bc4Value(1, -1, aTexel), Bc4Value(64 / 127.0f, -64 / 127.0f, aTexel), 0, 1};
	case Format::BC6H_UF16:
		return endOneFlag ? Color{0, 1, 65504, 1} : Color{1, 0, 1, 1};
	case Format::BC6H_SF16:
		return endOneFlag ? Color{0, 32800, std::ldexp(-93.0f, -24), 1} : Color{32800, 0, 32800, 1};
	case Format::BC7_UNORM_SRGB:
		return {SrgbToLinear(bc7[0] / 255), SrgbToLinear(bc7[1] / 255), SrgbToLinear(bc7[2] / 255),
		        bc7[3] / 255};
	default:
		return {bc7[0] / 255, bc7[1] / 255, bc7[2] / 255, bc7[3] / 255};
	}
}

template <typename Value, size_t Count> Bytes BytesOf(const std::array<Value, Count>& someValues)
{
	Bytes bytes(sizeof(someValues));
	std::memcpy(bytes.data(), someValues.data(), sizeof(someValues));
	return bytes;
}

// What GL holds in mip aMip, every layer, face or depth slice one after another, as RGBA floats
// (compressed formats decoded).
std::vector<float> Texels(const Gpu::Texture& aTexture, int aMip)
{
	const int slices =
	    aTexture.GetTarget() == GL_TEXTURE_3D ? aTexture.GetMipDepth(aMip) : aTexture.GetSliceCount();
	std::vector<float> values(
	    static_cast<size_t>(aTexture.GetMipWidth(aMip) * aTexture.GetMipHeight(aMip) * slices) * 4);
	glGetTextureImage(aTexture.GetName(), aMip, GL_RGBA, GL_FLOAT,
	                  static_cast<GLsizei>(values.size() * sizeof(float)), values.data());
	return values;
}
} // namespace

class TextureLoaderTest : public GpuTest
{
protected:
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

	// What a shader reads from mip 0 of aView with texelFetch, as RGBA floats row by row.
	std::vector<float> Fetch(const Gpu::ShaderResourceView& aView)
	{
		static const char* ourSource = R"(#version 450 core
layout(local_size_x = 1) in;
layout(binding = 0) uniform sampler2D uTexture;
layout(binding = 0, rgba32f) writeonly uniform image2D uTexels;
void main()
{
	const ivec2 at = ivec2(gl_GlobalInvocationID.xy);
	imageStore(uTexels, at, texelFetch(uTexture, at, 0));
})";
		Gpu::Texture* texels = MakeTarget(Format::R32G32B32A32_FLOAT, aView.GetWidth(), aView.GetHeight());
		const GLuint program = glCreateShaderProgramv(GL_COMPUTE_SHADER, 1, &ourSource);
		GLint linkedFlag = GL_FALSE;
		glGetProgramiv(program, GL_LINK_STATUS, &linkedFlag);
		if (texels == nullptr || linkedFlag != GL_TRUE)
		{
			glDeleteProgram(program);
			return {};
		}
		glUseProgram(program);
		glBindTextureUnit(0, aView.GetName());
		glBindImageTexture(0, texels->GetName(), 0, GL_FALSE, 0, GL_WRITE_ONLY, GL_RGBA32F);
		glDispatchCompute(static_cast<GLuint>(aView.GetWidth()), static_cast<GLuint>(aView.GetHeight()), 1);
		glMemoryBarrier(GL_TEXTURE_UPDATE_BARRIER_BIT);
		glUseProgram(0);
		glDeleteProgram(program);
		return Texels(*texels, 0);
	}

	TestSupport::ScratchDir myScratch;
};

// Bytes that differ from texel to texel, subresource to subresource, must reach GL
// in their places: every array item (layer, cube face), mip and volume slice.
TEST_F(TextureLoaderTest, EveryItemMipAndSliceArrivesInItsPlace)
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
		Dds::Image image = MakeImage(test.myInfo);
		uint32_t state = 12345;
		for (uint8_t& byte : image.Bytes())
		{
			state = state * 1103515245u + 12345u;
			byte = uint8_t(state >> 16);
		}
		// Readers find the file under another spelling of its path.
		Save(myScratch.File(std::string("Layouts/") + test.myName + ".DDS"), image);
		Dds::ImageInfo loadedInfo;
		Gpu::Texture* texture =
		    Load(myScratch.File(std::string("LAYOUTS/") + test.myName + ".dds"), &loadedInfo);
		ASSERT_NE(texture, nullptr);
		EXPECT_EQ(loadedInfo, test.myInfo);
		EXPECT_EQ(texture->GetDefaultShaderResourceView()->GetTarget(), test.myViewTarget);
		for (uint32_t mip = 0; mip < test.myInfo.myMipLevels; ++mip)
		{
			Bytes expected;
			for (uint32_t item = 0; item < test.myInfo.myArraySize; ++item)
			{
				expected.insert(expected.end(), image.Data(mip, item),
				                image.Data(mip, item) + image.SubresourceSize(mip));
			}
			Bytes actual;
			for (const float value : Texels(*texture, static_cast<int>(mip)))
			{
				actual.push_back(static_cast<uint8_t>(std::lround(value * 255.0f)));
			}
			EXPECT_TRUE(actual == expected) << "mip " << mip;
		}
	}
}

// Each format's texel (or 4x4 block) fills every mip of an 8x8 texture; every texel must
// hold the stored value decoded as Direct3D decodes it. (sRGB and plain 8-bit textures show
// in every rendered frame.)
TEST_F(TextureLoaderTest, FormatsHoldTheirStoredValues)
{
	const Color bgraRead = {200 / 255.0f, 100 / 255.0f, 10 / 255.0f, 1};
	const uint16_t bc1Color = Rgb565(20, 40, 10);
	const struct
	{
		Format myFormat;
		Bytes myPattern;
		Color myExpected;
		float myTolerance;
	} cases[] = {
	    {Format::B8G8R8A8_UNORM, {10, 100, 200, 255}, bgraRead, 1e-6f},
	    {Format::B8G8R8X8_UNORM, {10, 100, 200, 7}, bgraRead, 1e-6f}, // alpha ignored
	    {Format::BC1_UNORM, Bc1Block(bc1Color, 0, 0), {20 / 31.0f, 40 / 63.0f, 10 / 31.0f, 1.0f}, 4e-3f},
	    // Endpoints in the three-colour order: index 3 is transparent black.
	    {Format::BC1_UNORM, Bc1Block(bc1Color, bc1Color, 3), {0, 0, 0, 0}, 1e-6f},
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
		Repeat(image.Bytes().data(), image.Bytes().size(), test.myPattern);
		const std::string path = myScratch.File(std::to_string(++number) + ".dds");
		Save(path, image);
		Gpu::Texture* texture = Load(path, nullptr);
		ASSERT_NE(texture, nullptr);
		for (int mip = 0; mip < 4; ++mip)
		{
			const std::vector<float> values = Texels(*texture, mip);
			for (size_t at = 0; at < values.size(); ++at)
			{
				ASSERT_NEAR(values[at], test.myExpected[at % 4], test.myTolerance)
				    << "mip " << mip << ", value " << at;
			}
		}
	}
}

// One hand-made block per BC4-BC7 format, over an 8x8 texture, must reach shaders decoded texel by
// texel as the format defines: a swapped signed/unsigned or sRGB/linear GL format, a wrong block
// size or a texel out of place shows as a wrong value. The engine's sRGB textures (a copy in the
// typeless format seen through the sRGB form, or the format itself where it has none) must read
// the same.
TEST_F(TextureLoaderTest, Bc4ToBc7BlocksReachShadersAsTheFormatsDefine)
{
	const std::tuple<Format, Bytes, float> cases[] = {
	    {Format::BC4_UNORM, Bc4Block(255, 0), 5e-3f},
	    {Format::BC4_SNORM, Bc4Block(127, 0x81), 9e-3f},
	    {Format::BC5_UNORM, Bc4Block(255, 0) + Bc4Block(128, 0), 5e-3f},
	    {Format::BC5_SNORM, Bc4Block(127, 0x81) + Bc4Block(64, 0xC0), 9e-3f},
	    {Format::BC6H_UF16, ourBc6hBlock, 0.0f},
	    {Format::BC6H_SF16, ourBc6hBlock, 0.0f},
	    {Format::BC7_UNORM, ourBc7Block, 1e-3f}, // its sRGB view decodes
	    {Format::BC7_UNORM_SRGB, ourBc7Block, 1e-3f},
	};
	for (const auto& [format, block, tolerance] : cases)
	{
		SCOPED_TRACE(Dds::FormatName(format));
		Dds::Image image = MakeImage({8, 8, 1, 1, 1, 0, format});
		Repeat(image.Bytes().data(), image.Bytes().size(), block);
		const std::string path = myScratch.File(std::string(Dds::FormatName(format)) + ".dds");
		Save(path, image);
		Gpu::Texture* texture = Load(path, nullptr);
		ASSERT_NE(texture, nullptr);
		Gpu::TextureDesc desc = texture->GetDesc();
		desc.myFormat = Dds::ToTypeless(format);
		Gpu::Texture* copy = MakeTexture(desc);
		ASSERT_TRUE(copy != nullptr && GetContext().CopyResource(*copy, *texture));
		Gpu::ShaderResourceView* srgb = copy->CreateShaderResourceView({.myFormat = Dds::ToSRGB(format)});
		ASSERT_NE(srgb, nullptr);
		for (const Gpu::ShaderResourceView* view : {texture->GetDefaultShaderResourceView(), srgb})
		{
			const std::vector<float> values = Fetch(*view);
			ASSERT_EQ(values.size(), 8u * 8 * 4);
			for (size_t at = 0; at < values.size(); ++at)
			{
				const size_t x = at / 4 % 8;
				const size_t y = at / 32;
				ASSERT_NEAR(values[at], Decoded(view->GetFormat(), int(y % 4 * 4 + x % 4))[at % 4], tolerance)
				    << Dds::FormatName(view->GetFormat()) << " texel " << x << "," << y << " channel "
				    << at % 4;
			}
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
