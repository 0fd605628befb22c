// Clears and copies as Direct3D does them (cube faces, volume slices, mips and typeless views
// are drawn into and copied by the reflection and ambient bakes and the renderer's depth buffer).

#include "GpuTest.h"

namespace
{
using TextureTest = GpuTest;

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
	const float color[4] = {0.2f, 0.4f, 0.8f, 1.0f};
	GetContext().ClearRenderTargetView(*view, color);
	std::vector<uint8_t> expected;
	for (int pixel = 0; pixel < 64 * 32; ++pixel)
	{
		expected.insert(expected.end(), {51, 102, 204, 255});
	}
	EXPECT_EQ(ReadPixels(*view), expected);

	GetContext().ClearDepthStencilView(*depth->CreateDepthStencilView(), true, true, 0.25f, 3);
	std::vector<float> values(32, -1.0f);
	glGetTextureImage(depth->GetName(), 0, GL_DEPTH_COMPONENT, GL_FLOAT,
	                  static_cast<GLsizei>(values.size() * sizeof(float)), values.data());
	for (const float value : values)
	{
		ASSERT_NEAR(value, 0.25f, 1e-6f);
	}
}

// (Copies that succeed are the engine's sRGB conversion and the bakes' cube faces and atlas tiles.)
TEST_F(TextureTest, CopiesRefuseWhatDoesNotFit)
{
	Gpu::Texture* source = MakeTarget(Dds::Format::R8G8B8A8_UNORM, 8, 8, 2);
	Gpu::Texture* copy = MakeTarget(Dds::Format::R8G8B8A8_UNORM, 8, 8, 2);
	Gpu::Texture* other = MakeTarget(Dds::Format::R16G16B16A16_FLOAT, 8, 8, 2);
	ASSERT_TRUE(source && copy && other);
	EXPECT_FALSE(GetContext().CopyResource(*other, *source));
	EXPECT_FALSE(GetContext().CopySubresourceRegion(*copy, 0, 0, 6, 6, 0, *source, 1, 0)); // past the edge
	// Blocks of one size from another family: GL would refuse the copy without a word in release builds.
	Gpu::Texture* bc3 = MakeTarget(Dds::Format::BC3_UNORM, 8, 8);
	Gpu::Texture* bc7 = MakeTarget(Dds::Format::BC7_UNORM_SRGB, 8, 8);
	ASSERT_TRUE(bc3 && bc7);
	EXPECT_FALSE(GetContext().CopyResource(*bc7, *bc3));
	ExpectReports({{"Cannot copy"}, {}, {"Cannot copy"}});
}
} // namespace
