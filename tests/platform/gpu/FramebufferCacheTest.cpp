#include "GpuTest.h"

namespace
{
using FramebufferCacheTest = GpuTest;

// One framebuffer per ordered set of views, dropped with any of its views. GL reuses texture
// names, so a view made where a destroyed one was must get a framebuffer that draws into it.
TEST_F(FramebufferCacheTest, SameViewsShareOneFramebufferAndARecreatedViewNeverFindsAStaleOne)
{
	Gpu::Texture* first = MakeTarget(Dds::Format::R8G8B8A8_UNORM, 8, 8);
	Gpu::Texture* second = MakeTarget(Dds::Format::R16G16B16A16_FLOAT, 8, 8);
	Gpu::Texture* depth = MakeTarget(Dds::Format::D24_UNORM_S8_UINT, 8, 8);
	ASSERT_TRUE(first && second && depth);
	Gpu::RenderTargetView* a = first->CreateRenderTargetView();
	Gpu::RenderTargetView* b = second->CreateRenderTargetView();
	Gpu::DepthStencilView* d = depth->CreateDepthStencilView();
	Gpu::FramebufferCache& cache = GetContext().GetFramebufferCache();
	Gpu::RenderTargetView* const one[] = {a};
	Gpu::RenderTargetView* const two[] = {a, b};
	Gpu::RenderTargetView* const swapped[] = {b, a};
	const GLuint justA = cache.Get(one, nullptr);
	const GLuint withDepth = cache.Get(two, d);
	EXPECT_EQ(cache.Get(one, nullptr), justA);
	EXPECT_NE(withDepth, justA);
	EXPECT_NE(cache.Get(swapped, d), withDepth); // slots matter, not just the set
	EXPECT_EQ(cache.Get(two, d), withDepth);
	EXPECT_EQ(cache.GetEntryCount(), 3u);
	ASSERT_TRUE(GetContext().SetRenderTargets(two, d));
	// Destroying b drops both framebuffers that use it, and GL's binding with them.
	second->DestroyView(b);
	EXPECT_EQ(cache.GetEntryCount(), 1u);
	EXPECT_EQ(GetContext().GetStateCache().GetDrawFramebuffer(), 0u);

	const uint64_t oldId = a->GetUniqueId();
	first->DestroyView(a);
	EXPECT_EQ(cache.GetEntryCount(), 0u);
	Gpu::RenderTargetView* fresh = first->CreateRenderTargetView();
	EXPECT_NE(fresh->GetUniqueId(), oldId);
	const float green[4] = {0, 1, 0, 1};
	GetContext().ClearRenderTargetView(*fresh, green);
	EXPECT_EQ(PixelAt(ReadPixels(*fresh), 8, 7, 7), (Pixel{0, 255, 0, 255}));
	EXPECT_EQ(cache.GetEntryCount(), 1u);
}
} // namespace
