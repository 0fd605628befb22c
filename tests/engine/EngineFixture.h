#pragma once
// The fixture for engine tests that need a GPU: a log in a scratch directory (no
// level fatal, so reports can be read back), and an engine created on request.
// Without a GL context the test is skipped, except under CI=true. Every critical
// report fails the test unless the test took it with TakeLog().

#include <bitset>
#include <cstdlib>
#include <cstring>
#include <gmock/gmock-matchers.h>
#include <gtest/gtest.h>
#include <string>
#include <vector>

#include "core/Matrix44.h"
#include "engine/Debug.h"
#include "engine/Engine.h"
#include "platform/dds/DdsFile.h"
#include "platform/gpu/InputLayout.h"
#include "support/GlSupport.h"
#include "support/TestSupport.h"

// Leaves the test when a start-up helper (CreateEngine, a fixture's Start) returns false:
// the helper has already skipped the test (no GL) or failed it.
#define LUMORA_RETURN_UNLESS(aStartedFlag)                                                                   \
	do                                                                                                       \
	{                                                                                                        \
		if (!(aStartedFlag))                                                                                 \
		{                                                                                                    \
			return;                                                                                          \
		}                                                                                                    \
	} while (false)

class EngineTest : public testing::Test
{
protected:
	void SetUp() override
	{
		myLogPath = myScratch.File("DebugLogger.txt");
		ASSERT_TRUE(Debug::Create(myLogPath, myFatalLevels));
	}

	void TearDown() override
	{
		Zeph::Engine::ShutDown();
		const std::string rest = TakeLog();
		Debug::Destroy();
		EXPECT_EQ(rest.find("CRITICAL ERROR"), std::string::npos) << "Unexpected reports:\n" << rest;
	}

	// Creates the engine headless; skips the test when no GL context can be made.
	bool CreateEngine(int aWidth, int aHeight)
	{
		Gpu::WindowHandle window = 0;
		if (Zeph::Engine::Create(window, aWidth, aHeight))
		{
			return true;
		}
		const std::string log = TakeLog();
		if (log.find("D3DCreateDevice Failed.") != std::string::npos && !TestSupport::IsCi())
		{
			SkipWithoutGl();
			return false;
		}
		ADD_FAILURE() << "Engine::Create failed:\n" << log;
		return false;
	}

	// GTEST_SKIP returns from the function it is in, so it lives in a void one.
	static void SkipWithoutGl() { GTEST_SKIP() << "No OpenGL 4.5 core context"; }

	// The log written since the last call.
	std::string TakeLog()
	{
		const std::string all = TestSupport::ReadWholeFile(myLogPath);
		const std::string rest = all.size() > myLogTaken ? all.substr(myLogTaken) : std::string();
		myLogTaken = all.size();
		return rest;
	}

	// A derived fixture sets the facade's own levels (12) in its constructor to prove
	// that a path does not end the process where the editor runs.
	std::bitset<4> myFatalLevels{0};

	// A 4x4 DDS texture (RGBA8 unless told) in the scratch directory, of one colour where
	// one is given (black otherwise); its path.
	std::string WriteSolidTexture(const std::string& aName, const uint8_t* aColor = nullptr,
	                              Dds::Format aFormat = Dds::Format::R8G8B8A8_UNORM)
	{
		const Dds::ImageInfo info{.myWidth = 4, .myHeight = 4, .myFormat = aFormat};
		Dds::Image image;
		std::string error;
		EXPECT_TRUE(image.Init(info, error)) << error;
		for (uint64_t at = 0; aColor != nullptr && at + 3 < image.SubresourceSize(0); at += 4)
		{
			std::memcpy(image.Data(0, 0) + at, aColor, 4);
		}
		const std::string path = myScratch.File(aName);
		EXPECT_TRUE(Dds::SaveToFile(path, image, error)) << error;
		return path;
	}

	TestSupport::ScratchDir myScratch;
	std::string myLogPath;
	size_t myLogTaken = 0;
};
