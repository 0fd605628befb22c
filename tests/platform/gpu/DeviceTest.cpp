#include "platform/gpu/Buffer.h"
#include "platform/gpu/Readback.h"

#include <cstdio>
#include <filesystem>
#include <sys/wait.h>
#include <thread>
#include <unistd.h>

#include "GpuTest.h"

namespace
{
using DeviceTest = GpuTest;

// Direct3D's conventions are set once on the context; the renderer never sets them again.
TEST_F(DeviceTest, ContextFollowsDirect3DAndBadInitIsReportedNotFatal)
{
	for (const auto& [query, expected] : {std::pair<GLenum, GLint>{GL_CLIP_ORIGIN, GL_UPPER_LEFT},
	                                      {GL_CLIP_DEPTH_MODE, GL_ZERO_TO_ONE},
	                                      {GL_FRONT_FACE, GL_CW}})
	{
		GLint value = 0;
		glGetIntegerv(query, &value);
		EXPECT_EQ(value, expected) << std::hex << query;
	}
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
	ASSERT_TRUE(fixed.Init({.mySize = sizeof(initial), .myLabel = "fixed"}, initial));
	Gpu::Buffer& dynamic = myBuffers.emplace_back();
	ASSERT_TRUE(dynamic.Init(
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

// Mesa reads MESA_GL_VERSION_OVERRIDE once per process, so a driver that offers
// only an older GL is played by a child process: this test's binary again, run
// for this test alone with the variable set, which reports how Init failed.
namespace
{
constexpr const char* ourProbeVariable = "LUMORA_DEVICE_PROBE";

struct ProbeResult
{
	int myExitCode = -1;
	std::string myOutput;
};

// Runs this test alone in a child process whose driver offers only aGlVersion.
ProbeResult RunProbe(const char* aGlVersion)
{
	const testing::TestInfo* test = testing::UnitTest::GetInstance()->current_test_info();
	const std::string command = std::string(ourProbeVariable) + "=1 MESA_GL_VERSION_OVERRIDE=" + aGlVersion +
	                            " '" + std::filesystem::read_symlink("/proc/self/exe").string() +
	                            "' --gtest_filter=" + test->test_suite_name() + "." + test->name() + " 2>&1";
	ProbeResult result;
	FILE* child = popen(command.c_str(), "r");
	if (child == nullptr)
	{
		return result;
	}
	char buffer[4096];
	for (size_t count; (count = std::fread(buffer, 1, sizeof(buffer), child)) > 0;)
	{
		result.myOutput.append(buffer, count);
	}
	const int status = pclose(child);
	result.myExitCode = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
	return result;
}
} // namespace

TEST(DeviceFailureTest, OlderGlIsVersionTooLowNotNoDevice)
{
	if (std::getenv(ourProbeVariable) != nullptr)
	{
		// The child: report through standard error, answer with the failure's number.
		Gpu::Device device;
		const bool initializedFlag = device.Init(16, 16);
		std::printf("probe: %s; version '%s'; %s\n", initializedFlag ? "initialized" : "failed",
		            device.GetVersionName().c_str(), device.GetFailureText().c_str());
		std::fflush(stdout);
		device.Destroy();
		_exit(static_cast<int>(device.GetFailure()));
	}
	{
		Gpu::Device device;
		if (!device.Init(16, 16))
		{
			LUMORA_SKIP_OR_FAIL("No OpenGL 4.5 core context");
		}
		EXPECT_EQ(device.GetFailure(), Gpu::DeviceFailure::None);
		device.Destroy();
	}

	const ProbeResult older = RunProbe("4.1");
	EXPECT_EQ(older.myExitCode, static_cast<int>(Gpu::DeviceFailure::VersionTooLow)) << older.myOutput;
	EXPECT_NE(older.myOutput.find("OpenGL 4.5 core profile is needed"), std::string::npos) << older.myOutput;
	EXPECT_NE(older.myOutput.find("version '4.1"), std::string::npos) << older.myOutput;
}
