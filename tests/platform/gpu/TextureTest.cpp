// Clears and copies as Direct3D does them (cube faces, volume slices, mips and typeless views
// are drawn into by the reflection and ambient bakes and the renderer's depth buffer).

#include "GpuTest.h"

namespace
{
using TextureTest = GpuTest;

// Every pixel of the view, compared with one colour.
void ExpectUniform(Gpu::Context& aContext, const Gpu::RenderTargetView& aView, Pixel aColor)
{
	std::vector<uint8_t> pixels;
	ASSERT_TRUE(Gpu::ReadRenderTarget(aContext, aView, pixels));
	std::vector<uint8_t> expected;
	for (int pixel = 0; pixel < aView.GetWidth() * aView.GetHeight(); ++pixel)
	{
		expected.insert(expected.end(), aColor.begin(), aColor.end());
	}
	EXPECT_EQ(pixels, expected);
}

std::array<float, 4> ToColor(Pixel aColor)
{
	return {aColor[0] / 255.0f, aColor[1] / 255.0f, aColor[2] / 255.0f, aColor[3] / 255.0f};
}

// Neither the scissor test nor disabled write masks stop a clear of colour or depth.
TEST_F(TextureTest, ClearsFillTheWholeTargetDespiteScissorAndWriteMasks)
{
	Gpu::Texture* target = MakeTarget(Dds::Format::R8G8B8A8_UNORM, 64, 32);
	Gpu::Texture* depth = MakeTarget(Dds::Format::D24_UNORM_S8_UINT, 8, 4);
	ASSERT_TRUE(target && depth);
	Gpu::RenderTargetView* view = target->CreateRenderTargetView();
	ASSERT_NE(view, nullptr);
	GetContext().GetStateCache().SetColorWriteMask(0);
	GetContext().GetStateCache().SetDepthWriteFlag(false);
	GetContext().GetStateCache().SetScissorTestFlag(true);
	glScissor(0, 0, 1, 1);
	const Pixel color = {51, 102, 204, 255};
	GetContext().ClearRenderTargetView(*view, ToColor(color).data());
	ExpectUniform(GetContext(), *view, color);

	GetContext().ClearDepthStencilView(*depth->CreateDepthStencilView(), true, true, 0.25f, 3);
	std::vector<float> values(32, -1.0f);
	glGetTextureImage(depth->GetName(), 0, GL_DEPTH_COMPONENT, GL_FLOAT,
	                  static_cast<GLsizei>(values.size() * sizeof(float)), values.data());
	for (const float value : values)
	{
		ASSERT_NEAR(value, 0.25f, 1e-6f);
	}
}

TEST_F(TextureTest, CopiesMoveEveryMipAndRefuseWhatDoesNotFit)
{
	Gpu::Texture* source = MakeTarget(Dds::Format::R8G8B8A8_UNORM, 8, 8, 2);
	Gpu::Texture* copy = MakeTarget(Dds::Format::R8G8B8A8_UNORM, 8, 8, 2);
	Gpu::Texture* other = MakeTarget(Dds::Format::R16G16B16A16_FLOAT, 8, 8, 2);
	ASSERT_TRUE(source && copy && other);
	const Pixel top = {10, 20, 30, 255};
	const Pixel second = {70, 80, 90, 255};
	GetContext().ClearRenderTargetView(*source->CreateRenderTargetView(), ToColor(top).data());
	GetContext().ClearRenderTargetView(*source->CreateRenderTargetView({.myMip = 1}), ToColor(second).data());
	ASSERT_TRUE(GetContext().CopyResource(*copy, *source));
	ExpectUniform(GetContext(), *copy->CreateRenderTargetView(), top);
	ExpectUniform(GetContext(), *copy->CreateRenderTargetView({.myMip = 1}), second);

	EXPECT_FALSE(GetContext().CopyResource(*other, *source));
	EXPECT_FALSE(GetContext().CopySubresourceRegion(*copy, 0, 0, 6, 6, 0, *source, 1, 0)); // past the edge
	ExpectReports({{"Cannot copy"}, {}});
}
} // namespace
