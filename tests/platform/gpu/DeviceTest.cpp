#include "platform/gpu/Buffer.h"
#include "platform/gpu/Readback.h"

#include <thread>

#include "GpuTest.h"

namespace
{
using DeviceTest = GpuTest;

// Direct3D's conventions are set once on the context (its clip origin, depth range and front
// faces show in every rendered frame; cube maps filter across their seams, as Direct3D's do).
TEST_F(DeviceTest, ContextFollowsDirect3DAndBadInitIsReportedNotFatal)
{
	EXPECT_TRUE(glIsEnabled(GL_TEXTURE_CUBE_MAP_SEAMLESS));

	EXPECT_FALSE(myDevice.Init(64, 64));
	Gpu::Device other;
	EXPECT_FALSE(other.Init(0, 32));
	ExpectReports({{"already initialized"}, {"Gpu::Device::Init: Bad back-buffer size 0x32"}});
	// The failed device left the shared display alone.
	EXPECT_TRUE(myDevice.MakeCurrent());
	EXPECT_NE(MakeTarget(Dds::Format::R8G8B8A8_UNORM, 4, 4), nullptr);
}

TEST_F(DeviceTest, ContextMovesBetweenThreads)
{
	Gpu::Texture* target = MakeTarget(Dds::Format::R8G8B8A8_UNORM, 8, 8);
	ASSERT_NE(target, nullptr);
	Gpu::RenderTargetView* view = target->CreateRenderTargetView();
	myDevice.ReleaseCurrent();
	EXPECT_EQ(eglGetCurrentContext(), EGL_NO_CONTEXT);

	bool clearedFlag = false;
	std::thread renderThread([&] {
		if (myDevice.MakeCurrent())
		{
			const float green[4] = {0.0f, 1.0f, 0.0f, 1.0f};
			myDevice.GetContext().ClearRenderTargetView(*view, green);
			glFinish();
			myDevice.ReleaseCurrent();
			clearedFlag = true;
		}
	});
	renderThread.join();
	ASSERT_TRUE(clearedFlag);
	ASSERT_TRUE(myDevice.MakeCurrent());
	EXPECT_EQ(PixelAt(ReadPixels(*view), 8, 7, 7), (Pixel{0, 255, 0, 255}));
}

TEST_F(DeviceTest, UnsupportedFormatAndBadDescriptionsFailCleanly)
{
	EXPECT_EQ(MakeTarget(static_cast<Dds::Format>(9999), 8, 8), nullptr);
	EXPECT_EQ(MakeTexture({.myKind = Gpu::TextureKind::TextureCube,
	                       .myWidth = 8,
	                       .myHeight = 4,
	                       .myArraySize = 6,
	                       .myFormat = Dds::Format::R8G8B8A8_UNORM,
	                       .myLabel = "oblong cube"}),
	          nullptr);
	EXPECT_EQ(MakeTarget(Dds::Format::R8G8B8A8_UNORM, 8, 8, 5), nullptr); // 8x8 has 4 mips

	Gpu::Texture* texture = MakeTarget(Dds::Format::R8G8B8A8_UNORM, 8, 8);
	ASSERT_NE(texture, nullptr);
	EXPECT_EQ(texture->CreateRenderTargetView({.myFormat = Dds::Format::R16G16B16A16_FLOAT}), nullptr);
	EXPECT_EQ(texture->CreateDepthStencilView(), nullptr);
	const uint8_t row[4] = {};
	EXPECT_FALSE(texture->Upload(0, 0, row, 4)); // a pitch shorter than a row
	ExpectReports({{"unsupported DXGI format 9999"},
	               {"'oblong cube' needs square faces"},
	               {"5 mips asked, 8x8x1 has 4"},
	               {"(format 28): no render target of format 10"},
	               {},
	               {"row pitch 4 below the 32 bytes"}});
}

// Buffers start zeroed; only dynamic ones take updates, and only inside their size.
TEST_F(DeviceTest, BuffersStartZeroAndOnlyDynamicOnesChange)
{
	const uint32_t initial[4] = {1, 2, 3, 4};
	Gpu::Buffer& fixed = myBuffers.emplace_back();
	ASSERT_TRUE(fixed.Init(GetContext(), {.mySize = sizeof(initial), .myLabel = "fixed"}, initial));
	Gpu::Buffer& dynamic = myBuffers.emplace_back();
	ASSERT_TRUE(dynamic.Init(
	    GetContext(),
	    {.myKind = Gpu::BufferKind::Constant, .mySize = 16, .myDynamicFlag = true, .myLabel = "dynamic"},
	    nullptr));
	const uint32_t update[2] = {7, 8};
	EXPECT_TRUE(dynamic.Update(update, sizeof(update), 8));
	EXPECT_FALSE(dynamic.Update(update, sizeof(update), 12)); // past the end
	EXPECT_FALSE(fixed.Update(update, sizeof(update)));
	ExpectReports({{}, {"'fixed' (16 bytes, immutable)"}});
	for (const auto& [buffer, expected] : {std::pair{&dynamic, std::array<uint32_t, 4>{0, 0, 7, 8}},
	                                       std::pair{&fixed, std::array<uint32_t, 4>{1, 2, 3, 4}}})
	{
		std::array<uint32_t, 4> contents{9, 9, 9, 9};
		glGetNamedBufferSubData(buffer->GetName(), 0, sizeof(contents), contents.data());
		EXPECT_EQ(contents, expected);
	}
}
} // namespace
