#include "platform/gpu/Buffer.h"
#include "platform/gpu/Formats.h"
#include "platform/gpu/Readback.h"

#include <cstdio>
#include <spawn.h>
#include <sys/wait.h>
#include <thread>
#include <unistd.h>

#include "GpuTest.h"

namespace
{
using DeviceTest = GpuTest;

TEST_F(DeviceTest, ContextIsCoreProfile45WithDirect3DConventions)
{
	GLint major = 0;
	GLint minor = 0;
	GLint profile = 0;
	glGetIntegerv(GL_MAJOR_VERSION, &major);
	glGetIntegerv(GL_MINOR_VERSION, &minor);
	glGetIntegerv(GL_CONTEXT_PROFILE_MASK, &profile);
	EXPECT_GE(major * 10 + minor, 45);
	EXPECT_NE(profile & GL_CONTEXT_CORE_PROFILE_BIT, 0);
	EXPECT_FALSE(myDevice.GetRendererName().empty());
	EXPECT_NE(myDevice.GetVersionName().find("4."), std::string::npos) << myDevice.GetVersionName();

	GLint origin = 0;
	GLint depthMode = 0;
	GLint frontFace = 0;
	GLint cullFace = 0;
	glGetIntegerv(GL_CLIP_ORIGIN, &origin);
	glGetIntegerv(GL_CLIP_DEPTH_MODE, &depthMode);
	glGetIntegerv(GL_FRONT_FACE, &frontFace);
	glGetIntegerv(GL_CULL_FACE_MODE, &cullFace);
	EXPECT_EQ(origin, GL_UPPER_LEFT);
	EXPECT_EQ(depthMode, GL_ZERO_TO_ONE);
	EXPECT_EQ(frontFace, GL_CW);
	EXPECT_EQ(cullFace, GL_BACK);
	EXPECT_TRUE(glIsEnabled(GL_CULL_FACE));
	EXPECT_TRUE(glIsEnabled(GL_TEXTURE_CUBE_MAP_SEAMLESS));
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
	std::vector<uint8_t> pixels;
	ASSERT_TRUE(Gpu::ReadRenderTarget(GetContext(), *view, pixels));
	EXPECT_EQ(pixels[0], 0);
	EXPECT_EQ(pixels[1], 255);
}

TEST_F(DeviceTest, BadInitIsReportedNotFatal)
{
	EXPECT_FALSE(myDevice.Init(64, 64));
	Gpu::Device other;
	EXPECT_FALSE(other.Init(0, 32));
	const std::vector<std::string> reports = TakeReports();
	ASSERT_EQ(reports.size(), 2u);
	EXPECT_NE(reports[0].find("already initialized"), std::string::npos) << reports[0];
	EXPECT_NE(reports[1].find("Gpu::Device::Init: Bad back-buffer size 0x32"), std::string::npos)
	    << reports[1];
	// The failed device left the shared display alone.
	EXPECT_TRUE(myDevice.MakeCurrent());
	EXPECT_NE(MakeTarget(Dds::Format::R8G8B8A8_UNORM, 4, 4), nullptr);
}

// Every format the engine uses makes storage of the intended GL format and
// accepts an upload of its own layout.
TEST_F(DeviceTest, EveryEngineFormatMapsToWorkingStorage)
{
	// By number, as files carry them: the enum must keep DXGI's values.
	const uint32_t numbers[] = {28, 29, 27, 87, 91, 71, 72, 74, 75, 77, 78,
	                            10, 41, 2,  34, 26, 24, 61, 54, 45, 40};
	for (const uint32_t number : numbers)
	{
		const Dds::Format format = static_cast<Dds::Format>(number);
		SCOPED_TRACE(number);
		const Gpu::FormatInfo info = Gpu::GetFormatInfo(format);
		ASSERT_TRUE(info.IsSupported());
		Gpu::Texture* texture = MakeTarget(format, 8, 8);
		ASSERT_NE(texture, nullptr);
		GLint internalFormat = 0;
		glGetTextureLevelParameteriv(texture->GetName(), 0, GL_TEXTURE_INTERNAL_FORMAT, &internalFormat);
		EXPECT_EQ(static_cast<GLenum>(internalFormat), info.myInternalFormat);

		while (glGetError() != GL_NO_ERROR)
		{
		}
		const std::vector<uint8_t> zeros(info.RowBytes(8) * info.BlockRows(8));
		EXPECT_TRUE(texture->Upload(0, 0, zeros.data(), info.RowBytes(8)));
		EXPECT_EQ(glGetError(), static_cast<GLenum>(GL_NO_ERROR));
	}
	EXPECT_EQ(Gpu::GetFormatInfo(static_cast<Dds::Format>(42)).RowBytes(7), 0u);
	EXPECT_EQ(Gpu::GetFormatInfo(Dds::Format::BC1_UNORM).RowBytes(7), 16u); // two 8-byte blocks
	EXPECT_EQ(Gpu::GetFormatInfo(Dds::Format::BC1_UNORM).BlockRows(5), 2u);
}

TEST_F(DeviceTest, UnsupportedFormatAndBadDescriptionsFailCleanly)
{
	constexpr Dds::Format outOfEnum = static_cast<Dds::Format>(9999);
	static_assert(!Gpu::GetFormatInfo(Dds::Format::UNKNOWN).IsSupported() &&
	              !Gpu::GetFormatInfo(outOfEnum).IsSupported());
	EXPECT_EQ(MakeTarget(outOfEnum, 8, 8), nullptr);
	Gpu::TextureDesc cube;
	cube.myKind = Gpu::TextureKind::TextureCube;
	cube.myWidth = 8;
	cube.myHeight = 4;
	cube.myArraySize = 6;
	cube.myFormat = Dds::Format::R8G8B8A8_UNORM;
	cube.myLabel = "oblong cube";
	EXPECT_EQ(MakeTexture(cube), nullptr);
	EXPECT_EQ(MakeTarget(Dds::Format::R8G8B8A8_UNORM, 8, 8, 5), nullptr); // 8x8 has 4 mips

	Gpu::Texture* texture = MakeTarget(Dds::Format::R8G8B8A8_UNORM, 8, 8);
	ASSERT_NE(texture, nullptr);
	EXPECT_EQ(texture->CreateRenderTargetView({.myFormat = Dds::Format::R16G16B16A16_FLOAT}), nullptr);
	EXPECT_EQ(texture->CreateRenderTargetView({.myMip = 1}), nullptr);
	EXPECT_EQ(texture->CreateDepthStencilView(), nullptr);
	const uint8_t row[4] = {};
	EXPECT_FALSE(texture->Upload(0, 0, row, 4)); // a pitch shorter than a row

	const std::vector<std::string> reports = TakeReports();
	ASSERT_EQ(reports.size(), 7u);
	EXPECT_NE(reports[0].find("unsupported DXGI format 9999"), std::string::npos) << reports[0];
	EXPECT_NE(reports[1].find("'oblong cube' needs square faces"), std::string::npos) << reports[1];
	EXPECT_NE(reports[2].find("5 mips asked, 8x8x1 has 4"), std::string::npos) << reports[2];
	EXPECT_NE(reports[3].find("(format 28): no render target of format 10"), std::string::npos) << reports[3];
	EXPECT_NE(reports[6].find("row pitch 4 below the 32 bytes"), std::string::npos) << reports[6];
}

TEST_F(DeviceTest, BuffersStartZeroAndOnlyDynamicOnesChange)
{
	const uint32_t initial[4] = {1, 2, 3, 4};
	Gpu::Buffer fixed;
	ASSERT_TRUE(fixed.Init({.myKind = Gpu::BufferKind::Vertex, .mySize = sizeof(initial), .myLabel = "fixed"},
	                       initial));
	Gpu::Buffer dynamic;
	ASSERT_TRUE(dynamic.Init(
	    {.myKind = Gpu::BufferKind::Constant, .mySize = 16, .myDynamicFlag = true, .myLabel = "dynamic"},
	    nullptr));

	uint32_t contents[4] = {9, 9, 9, 9};
	glGetNamedBufferSubData(dynamic.GetName(), 0, sizeof(contents), contents);
	EXPECT_EQ(contents[0] | contents[1] | contents[2] | contents[3], 0u);

	const uint32_t update[2] = {7, 8};
	EXPECT_TRUE(dynamic.Update(update, sizeof(update), 8));
	glGetNamedBufferSubData(dynamic.GetName(), 0, sizeof(contents), contents);
	EXPECT_EQ(contents[1], 0u);
	EXPECT_EQ(contents[2], 7u);
	EXPECT_EQ(contents[3], 8u);

	EXPECT_FALSE(dynamic.Update(update, sizeof(update), 12)); // past the end
	EXPECT_FALSE(fixed.Update(update, sizeof(update)));
	glGetNamedBufferSubData(fixed.GetName(), 0, sizeof(contents), contents);
	EXPECT_EQ(contents[0], 1u);
	EXPECT_EQ(contents[3], 4u);
	const std::vector<std::string> reports = TakeReports();
	ASSERT_EQ(reports.size(), 2u);
	EXPECT_NE(reports[1].find("'fixed' (16 bytes, immutable)"), std::string::npos) << reports[1];
	fixed.Destroy();
	dynamic.Destroy();
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

ProbeResult RunProbe(const char* aGlVersion)
{
	const testing::TestInfo* test = testing::UnitTest::GetInstance()->current_test_info();
	const std::string filter = std::string("--gtest_filter=") + test->test_suite_name() + "." + test->name();
	std::vector<std::string> environment = {std::string(ourProbeVariable) + "=1",
	                                        std::string("MESA_GL_VERSION_OVERRIDE=") + aGlVersion};
	for (char** entry = environ; *entry != nullptr; ++entry)
	{
		if (std::strncmp(*entry, "MESA_GL_VERSION_OVERRIDE=", 25) != 0)
		{
			environment.emplace_back(*entry);
		}
	}
	std::vector<char*> environmentPointers;
	for (std::string& entry : environment)
	{
		environmentPointers.push_back(entry.data());
	}
	environmentPointers.push_back(nullptr);
	char* arguments[] = {const_cast<char*>("gpu_tests"), const_cast<char*>(filter.c_str()), nullptr};

	int pipeEnds[2];
	ProbeResult result;
	if (pipe(pipeEnds) != 0)
	{
		return result;
	}
	posix_spawn_file_actions_t actions;
	posix_spawn_file_actions_init(&actions);
	posix_spawn_file_actions_adddup2(&actions, pipeEnds[1], STDOUT_FILENO);
	posix_spawn_file_actions_adddup2(&actions, pipeEnds[1], STDERR_FILENO);
	posix_spawn_file_actions_addclose(&actions, pipeEnds[0]);
	pid_t child = -1;
	const int spawned =
	    posix_spawn(&child, "/proc/self/exe", &actions, nullptr, arguments, environmentPointers.data());
	posix_spawn_file_actions_destroy(&actions);
	close(pipeEnds[1]);
	char buffer[4096];
	for (ssize_t count; spawned == 0 && (count = read(pipeEnds[0], buffer, sizeof(buffer))) > 0;)
	{
		result.myOutput.append(buffer, static_cast<size_t>(count));
	}
	close(pipeEnds[0]);
	int status = 0;
	if (spawned == 0 && waitpid(child, &status, 0) == child && WIFEXITED(status))
	{
		result.myExitCode = WEXITSTATUS(status);
	}
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
			const char* ci = std::getenv("CI");
			if (ci && std::strcmp(ci, "true") == 0)
			{
				FAIL() << "No OpenGL 4.5 core context under CI";
			}
			GTEST_SKIP() << "No OpenGL 4.5 core context";
		}
		EXPECT_EQ(device.GetFailure(), Gpu::DeviceFailure::None);
		device.Destroy();
	}

	const ProbeResult older = RunProbe("4.1");
	EXPECT_EQ(older.myExitCode, static_cast<int>(Gpu::DeviceFailure::VersionTooLow)) << older.myOutput;
	EXPECT_NE(older.myOutput.find("OpenGL 4.5 core profile is needed"), std::string::npos) << older.myOutput;
	EXPECT_NE(older.myOutput.find("version '4.1"), std::string::npos) << older.myOutput;

	// The same child with the driver's own version initializes: the probe itself is sound.
	const ProbeResult current = RunProbe("4.5");
	EXPECT_EQ(current.myExitCode, static_cast<int>(Gpu::DeviceFailure::None)) << current.myOutput;
	EXPECT_NE(current.myOutput.find("probe: initialized"), std::string::npos) << current.myOutput;
}
