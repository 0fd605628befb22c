#pragma once
// The fixture for tests that need a GL context: a headless device, current on the
// test's thread. Without one the test is skipped, except under CI=true, where a
// missing GL is a failure. Every report the layer makes is collected; a test that
// expects one takes it with TakeReports(), and any left over fails the test.

#include <cstdlib>
#include <cstring>
#include <gtest/gtest.h>
#include <memory>
#include <string>
#include <vector>

#include "core/CoreReport.h"
#include "platform/gpu/Device.h"
#include "platform/gpu/Texture.h"
#include "support/GlSupport.h"

class GpuTest : public testing::Test
{
protected:
	void SetUp() override
	{
		ourReports.clear();
		myPreviousHandler = CoreReport::GetCriticalHandler();
		CoreReport::SetCriticalHandler([](int, const char* aFunctionName, const char* aMessage) {
			ourReports.push_back(std::string(aFunctionName) + ": " + aMessage);
		});
		if (!myDevice.Init(64, 64))
		{
			const std::string why = myDevice.GetFailureText() + " " + Joined();
			ourReports.clear();
			if (TestSupport::IsCi())
			{
				FAIL() << "No OpenGL 4.5 core context under CI: " << why;
			}
			GTEST_SKIP() << "No OpenGL 4.5 core context: " << why;
		}
	}

	void TearDown() override
	{
		for (std::unique_ptr<Gpu::Texture>& texture : myTextures)
		{
			texture->Destroy();
		}
		myTextures.clear();
		myDevice.Destroy();
		CoreReport::SetCriticalHandler(myPreviousHandler);
		EXPECT_TRUE(ourReports.empty()) << "Unexpected reports: " << Joined();
	}

	// The reports made since the last call, as "function: message".
	static std::vector<std::string> TakeReports() { return std::exchange(ourReports, {}); }

	// A texture that the fixture destroys; null (with the report kept) when Init fails.
	Gpu::Texture* MakeTexture(const Gpu::TextureDesc& aDesc)
	{
		auto texture = std::make_unique<Gpu::Texture>();
		if (!texture->Init(myDevice.GetContext(), aDesc))
		{
			return nullptr;
		}
		myTextures.push_back(std::move(texture));
		return myTextures.back().get();
	}

	Gpu::Texture* MakeTarget(Dds::Format aFormat, int aWidth, int aHeight, int aMipLevels = 1)
	{
		Gpu::TextureDesc desc;
		desc.myWidth = aWidth;
		desc.myHeight = aHeight;
		desc.myMipLevels = aMipLevels;
		desc.myFormat = aFormat;
		desc.myLabel = "test target";
		return MakeTexture(desc);
	}

	Gpu::Context& GetContext() { return myDevice.GetContext(); }

	static std::string Joined()
	{
		std::string text;
		for (const std::string& report : ourReports)
		{
			text += report + "; ";
		}
		return text;
	}

	Gpu::Device myDevice;
	std::vector<std::unique_ptr<Gpu::Texture>> myTextures;
	CoreReport::Handler myPreviousHandler = nullptr;
	static inline std::vector<std::string> ourReports;
};
