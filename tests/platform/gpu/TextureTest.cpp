#include <cstring>

#include "GpuTest.h"

namespace
{
using TextureTest = GpuTest;

// Every pixel of the view, compared with one colour; reports the first mismatch.
void ExpectUniform(Gpu::Context& aContext, const Gpu::RenderTargetView& aView, Pixel aColor)
{
	std::vector<uint8_t> pixels;
	ASSERT_TRUE(Gpu::ReadRenderTarget(aContext, aView, pixels));
	ASSERT_EQ(pixels.size(), static_cast<size_t>(aView.GetWidth() * aView.GetHeight() * 4));
	for (size_t at = 0; at < pixels.size(); at += 4)
	{
		ASSERT_EQ(PixelAt(pixels, 1, int(at / 4), 0), aColor) << "at pixel " << at / 4;
	}
}

std::array<float, 4> ToColor(Pixel aColor)
{
	return {aColor[0] / 255.0f, aColor[1] / 255.0f, aColor[2] / 255.0f, aColor[3] / 255.0f};
}

// A clear reaches every pixel, and it is Direct3D's: neither the scissor test nor
// a disabled write mask stops it.
TEST_F(TextureTest, ClearFillsTheWholeTargetDespiteScissorAndWriteMasks)
{
	Gpu::Texture* target = MakeTarget(Dds::Format::R8G8B8A8_UNORM, 64, 32);
	ASSERT_NE(target, nullptr);
	Gpu::RenderTargetView* view = target->CreateRenderTargetView();
	ASSERT_NE(view, nullptr);
	EXPECT_EQ(view->GetWidth(), 64);
	EXPECT_EQ(view->GetHeight(), 32);
	GetContext().GetStateCache().SetColorWriteMask(0);
	GetContext().GetStateCache().SetScissorTestFlag(true);
	glScissor(0, 0, 1, 1);
	const Pixel color = {51, 102, 204, 255};
	GetContext().ClearRenderTargetView(*view, ToColor(color).data());
	ExpectUniform(GetContext(), *view, color);
}

TEST_F(TextureTest, SrgbTargetsEncodeAndTypelessViewsReinterpret)
{
	const float half[4] = {0.5f, 0.5f, 0.5f, 0.5f};
	Gpu::Texture* srgb = MakeTarget(Dds::Format::R8G8B8A8_UNORM_SRGB, 8, 8);
	ASSERT_NE(srgb, nullptr);
	Gpu::RenderTargetView* srgbView = srgb->CreateRenderTargetView();
	GetContext().ClearRenderTargetView(*srgbView, half);
	std::vector<uint8_t> pixels = ReadPixels(*srgbView);
	ASSERT_FALSE(pixels.empty());
	EXPECT_NEAR(pixels[0], 188, 1); // linear 0.5 encoded
	EXPECT_NEAR(pixels[3], 128, 1); // alpha stays linear

	// One TYPELESS storage, seen as UNORM and as sRGB.
	Gpu::Texture* typeless = MakeTarget(Dds::Format::R8G8B8A8_TYPELESS, 8, 8);
	ASSERT_NE(typeless, nullptr);
	Gpu::RenderTargetView* asSrgb =
	    typeless->CreateRenderTargetView({.myFormat = Dds::Format::R8G8B8A8_UNORM_SRGB});
	Gpu::RenderTargetView* asUnorm =
	    typeless->CreateRenderTargetView({.myFormat = Dds::Format::R8G8B8A8_UNORM});
	ASSERT_NE(asSrgb, nullptr);
	ASSERT_NE(asUnorm, nullptr);
	GetContext().ClearRenderTargetView(*asSrgb, half);
	ASSERT_TRUE(Gpu::ReadRenderTarget(GetContext(), *asUnorm, pixels));
	EXPECT_NEAR(pixels[0], 188, 1);
	GetContext().ClearRenderTargetView(*asUnorm, half);
	ASSERT_TRUE(Gpu::ReadRenderTarget(GetContext(), *asSrgb, pixels));
	EXPECT_NEAR(pixels[0], 128, 1);
}

TEST_F(TextureTest, CubeFaceViewsAreSeparateTargets)
{
	Gpu::Texture* cube = MakeCube(Dds::Format::R8G8B8A8_UNORM, 16, 0);
	ASSERT_NE(cube, nullptr);
	EXPECT_EQ(cube->GetMipLevels(), 5);
	EXPECT_EQ(cube->GetDefaultShaderResourceView()->GetTarget(), static_cast<GLenum>(GL_TEXTURE_CUBE_MAP));

	auto faceColor = [](int aFace) { return Pixel{uint8_t(40 * aFace), 255, uint8_t(aFace), 255}; };
	std::array<Gpu::RenderTargetView*, 6> faces{};
	for (int face = 0; face < 6; ++face)
	{
		faces[face] = cube->CreateRenderTargetView({.myFirstSlice = face});
		ASSERT_NE(faces[face], nullptr);
		GetContext().ClearRenderTargetView(*faces[face], ToColor(faceColor(face)).data());
	}
	for (int face = 0; face < 6; ++face)
	{
		SCOPED_TRACE(face);
		ExpectUniform(GetContext(), *faces[face], faceColor(face));
	}
	// A face of a lower mip is its own target too, and leaves mip 0 alone.
	Gpu::RenderTargetView* smallFace = cube->CreateRenderTargetView({.myMip = 2, .myFirstSlice = 3});
	ASSERT_NE(smallFace, nullptr);
	EXPECT_EQ(smallFace->GetWidth(), 4);
	const Pixel white = {255, 255, 255, 255};
	GetContext().ClearRenderTargetView(*smallFace, ToColor(white).data());
	ExpectUniform(GetContext(), *smallFace, white);
	ExpectUniform(GetContext(), *faces[3], faceColor(3));

	// GLSL reads single cube texels through a 2D-array view of the faces.
	Gpu::ShaderResourceView* layers =
	    cube->CreateShaderResourceView({.myDimension = Gpu::ViewDimension::Texture2DArray});
	ASSERT_NE(layers, nullptr);
	EXPECT_EQ(layers->GetTarget(), static_cast<GLenum>(GL_TEXTURE_2D_ARRAY));
}

// Memory row 0 is the top row: an upload reads back in the same order, from any
// row pitch, and B8G8R8A8 memory means what it means under Direct3D.
TEST_F(TextureTest, UploadKeepsRowOrderAndChannelOrder)
{
	const uint8_t rgba[2][4][4] = {{{255, 0, 0, 255}, {0, 255, 0, 255}, {0, 0, 255, 255}, {9, 9, 9, 255}},
	                               {{1, 2, 3, 4}, {5, 6, 7, 8}, {10, 20, 30, 40}, {50, 60, 70, 80}}};
	Gpu::Texture* plain = MakeTarget(Dds::Format::R8G8B8A8_UNORM, 4, 2);
	ASSERT_NE(plain, nullptr);
	ASSERT_TRUE(plain->Upload(0, 0, rgba, 16));

	// The same image as BGRA with 4 bytes of padding per row.
	uint8_t bgra[2][20] = {};
	for (int y = 0; y < 2; ++y)
	{
		for (int x = 0; x < 4; ++x)
		{
			bgra[y][x * 4 + 0] = rgba[y][x][2];
			bgra[y][x * 4 + 1] = rgba[y][x][1];
			bgra[y][x * 4 + 2] = rgba[y][x][0];
			bgra[y][x * 4 + 3] = rgba[y][x][3];
		}
	}
	Gpu::Texture* swizzled = MakeTarget(Dds::Format::B8G8R8A8_UNORM, 4, 2);
	ASSERT_NE(swizzled, nullptr);
	ASSERT_TRUE(swizzled->Upload(0, 0, bgra, 20));

	for (Gpu::Texture* texture : {plain, swizzled})
	{
		const std::vector<uint8_t> pixels = ReadPixels(*texture->CreateRenderTargetView());
		ASSERT_EQ(pixels.size(), sizeof(rgba));
		EXPECT_EQ(0, std::memcmp(pixels.data(), rgba, sizeof(rgba)));
	}
}

TEST_F(TextureTest, CopiesMoveWholeTexturesAndSubresources)
{
	Gpu::Texture* source = MakeTarget(Dds::Format::R8G8B8A8_UNORM, 8, 8, 2);
	Gpu::Texture* copy = MakeTarget(Dds::Format::R8G8B8A8_UNORM, 8, 8, 2);
	ASSERT_NE(source, nullptr);
	ASSERT_NE(copy, nullptr);
	const Pixel top = {10, 20, 30, 255};
	const Pixel second = {70, 80, 90, 255};
	GetContext().ClearRenderTargetView(*source->CreateRenderTargetView(), ToColor(top).data());
	GetContext().ClearRenderTargetView(*source->CreateRenderTargetView({.myMip = 1}), ToColor(second).data());
	ASSERT_TRUE(GetContext().CopyResource(*copy, *source));
	ExpectUniform(GetContext(), *copy->CreateRenderTargetView(), top);
	ExpectUniform(GetContext(), *copy->CreateRenderTargetView({.myMip = 1}), second);

	// Mip 1 (4x4) of the source into face 5 of a cube at (2, 1).
	Gpu::Texture* cube = MakeCube(Dds::Format::R8G8B8A8_UNORM, 8);
	ASSERT_NE(cube, nullptr);
	Gpu::RenderTargetView* face = cube->CreateRenderTargetView({.myFirstSlice = 5});
	const float black[4] = {0, 0, 0, 1};
	GetContext().ClearRenderTargetView(*face, black);
	ASSERT_TRUE(GetContext().CopySubresourceRegion(*cube, 0, 5, 2, 1, 0, *source, 1, 0));
	const std::vector<uint8_t> pixels = ReadPixels(*face);
	for (int y = 0; y < 8; ++y)
	{
		for (int x = 0; x < 8; ++x)
		{
			const bool insideFlag = x >= 2 && x < 6 && y >= 1 && y < 5;
			ASSERT_EQ(PixelAt(pixels, 8, x, y), (insideFlag ? second : Pixel{0, 0, 0, 255}))
			    << x << ", " << y;
		}
	}

	Gpu::Texture* other = MakeTarget(Dds::Format::R16G16B16A16_FLOAT, 8, 8, 2);
	ASSERT_NE(other, nullptr);
	EXPECT_FALSE(GetContext().CopyResource(*other, *source));
	EXPECT_FALSE(GetContext().CopySubresourceRegion(*cube, 0, 5, 6, 6, 0, *source, 1, 0)); // past the edge
	ExpectReports({{"Cannot copy"}, {}});
}

TEST_F(TextureTest, VolumeSlicesAndDepthTargets)
{
	Gpu::Texture* volume = MakeTexture({.myKind = Gpu::TextureKind::Texture3D,
	                                    .myWidth = 4,
	                                    .myHeight = 4,
	                                    .myDepth = 4,
	                                    .myFormat = Dds::Format::R8G8B8A8_UNORM,
	                                    .myLabel = "volume"});
	ASSERT_NE(volume, nullptr);
	Gpu::RenderTargetView* slice1 = volume->CreateRenderTargetView({.myFirstSlice = 1});
	Gpu::RenderTargetView* slice2 = volume->CreateRenderTargetView({.myFirstSlice = 2});
	ASSERT_NE(slice1, nullptr);
	ASSERT_NE(slice2, nullptr);
	const Pixel red = {255, 0, 0, 255};
	const Pixel blue = {0, 0, 255, 255};
	GetContext().ClearRenderTargetView(*slice1, ToColor(red).data());
	GetContext().ClearRenderTargetView(*slice2, ToColor(blue).data());
	ExpectUniform(GetContext(), *slice1, red);
	ExpectUniform(GetContext(), *slice2, blue);

	for (const Dds::Format format : {Dds::Format::D32_FLOAT, Dds::Format::D24_UNORM_S8_UINT})
	{
		SCOPED_TRACE(Dds::FormatName(format));
		Gpu::Texture* depth = MakeTarget(format, 8, 4);
		ASSERT_NE(depth, nullptr);
		Gpu::DepthStencilView* view = depth->CreateDepthStencilView();
		ASSERT_NE(view, nullptr);
		GetContext().GetStateCache().SetDepthWriteFlag(false);
		GetContext().ClearDepthStencilView(*view, true, true, 0.25f, 3);
		std::vector<float> values(32, -1.0f);
		glGetTextureImage(depth->GetName(), 0, GL_DEPTH_COMPONENT, GL_FLOAT,
		                  static_cast<GLsizei>(values.size() * sizeof(float)), values.data());
		for (const float value : values)
		{
			ASSERT_NEAR(value, 0.25f, 1e-6f);
		}
	}
}
} // namespace
