#include "GpuTest.h"

namespace
{
using FramebufferCacheTest = GpuTest;

TEST_F(FramebufferCacheTest, SameViewsShareOneFramebuffer)
{
	Gpu::Texture* first = MakeTarget(Dds::Format::R8G8B8A8_UNORM, 16, 16);
	Gpu::Texture* second = MakeTarget(Dds::Format::R16G16B16A16_FLOAT, 16, 16);
	Gpu::Texture* depth = MakeTarget(Dds::Format::D24_UNORM_S8_UINT, 16, 16);
	ASSERT_TRUE(first && second && depth);
	Gpu::RenderTargetView* a = first->CreateRenderTargetView();
	Gpu::RenderTargetView* b = second->CreateRenderTargetView();
	Gpu::DepthStencilView* d = depth->CreateDepthStencilView();
	Gpu::FramebufferCache& cache = GetContext().GetFramebufferCache();

	Gpu::RenderTargetView* const one[] = {a};
	Gpu::RenderTargetView* const two[] = {a, b};
	Gpu::RenderTargetView* const swapped[] = {b, a};
	const GLuint justA = cache.Get(one, nullptr);
	ASSERT_NE(justA, 0u);
	EXPECT_EQ(cache.Get(one, nullptr), justA);
	const GLuint withDepth = cache.Get(two, d);
	EXPECT_NE(withDepth, justA);
	EXPECT_NE(cache.Get(swapped, d), withDepth); // slots matter, not just the set
	EXPECT_EQ(cache.Get(two, d), withDepth);
	EXPECT_EQ(cache.GetEntryCount(), 3u);

	ASSERT_TRUE(GetContext().SetRenderTargets(two, d));
	GLint bound = 0;
	glGetIntegerv(GL_DRAW_FRAMEBUFFER_BINDING, &bound);
	EXPECT_EQ(static_cast<GLuint>(bound), withDepth);

	// Destroying b drops both framebuffers that use it, and GL's binding with them.
	second->DestroyView(b);
	EXPECT_EQ(cache.GetEntryCount(), 1u);
	EXPECT_EQ(GetContext().GetStateCache().GetDrawFramebuffer(), 0u);
}

// GL reuses texture names; a view made where a destroyed one was must get a
// framebuffer that really draws into it.
TEST_F(FramebufferCacheTest, RecreatedViewNeverFindsAStaleFramebuffer)
{
	Gpu::Texture* first = MakeTarget(Dds::Format::R8G8B8A8_UNORM, 8, 8);
	ASSERT_NE(first, nullptr);
	Gpu::RenderTargetView* old = first->CreateRenderTargetView();
	const uint64_t oldId = old->GetUniqueId();
	const float red[4] = {1, 0, 0, 1};
	GetContext().ClearRenderTargetView(*old, red);
	Gpu::FramebufferCache& cache = GetContext().GetFramebufferCache();
	EXPECT_EQ(cache.GetEntryCount(), 1u);
	first->DestroyView(old);
	EXPECT_EQ(cache.GetEntryCount(), 0u);

	Gpu::RenderTargetView* fresh = first->CreateRenderTargetView();
	EXPECT_NE(fresh->GetUniqueId(), oldId);
	const float green[4] = {0, 1, 0, 1};
	GetContext().ClearRenderTargetView(*fresh, green);
	Gpu::RenderTargetView* const views[] = {fresh};
	const GLuint framebuffer = cache.Get(views, nullptr);
	GLint attached = 0;
	glGetNamedFramebufferAttachmentParameteriv(framebuffer, GL_COLOR_ATTACHMENT0,
	                                           GL_FRAMEBUFFER_ATTACHMENT_OBJECT_NAME, &attached);
	EXPECT_EQ(static_cast<GLuint>(attached), fresh->GetName());
	EXPECT_EQ(PixelAt(ReadPixels(*fresh), 8, 7, 7), (Pixel{0, 255, 0, 255}));
	// Whether or not GL handed out the old name again, the cache held one entry.
	EXPECT_EQ(cache.GetEntryCount(), 1u);
}
} // namespace
