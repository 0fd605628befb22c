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
#include "platform/gpu/Buffer.h"
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

	// Creates the engine headless (or on aWindow); skips the test when no GL context can be made.
	bool CreateEngine(int aWidth, int aHeight, Gpu::WindowHandle aWindow = 0)
	{
		Gpu::WindowHandle window = aWindow;
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

	struct ColorVertex
	{
		float myPosition[3];
		float myColor[4];
	};

	// Draws a quad of one colour through an effect pass whose inputs are POSITION and
	// COLOR (the engine's coloured-vertex layout), covering clip-space x in
	// [left, right] and y in [bottom, top], wound clockwise as the default culling wants.
	static bool DrawQuad(Gpu::Context& aContext, Fx::Pass& aPass, float aLeft, float aBottom, float aRight,
	                     float aTop, const float aColor[4])
	{
		const auto corner = [&](float anX, float aY) {
			return ColorVertex{{anX, aY, 0.5f}, {aColor[0], aColor[1], aColor[2], aColor[3]}};
		};
		const ColorVertex vertices[6] = {corner(aLeft, aBottom), corner(aLeft, aTop),
		                                 corner(aRight, aTop),   corner(aLeft, aBottom),
		                                 corner(aRight, aTop),   corner(aRight, aBottom)};
		Gpu::Buffer buffer;
		if (!buffer.Init({.mySize = sizeof(vertices), .myLabel = "test quad"}, vertices))
		{
			return false;
		}
		const Gpu::InputElement elements[] = {
		    {"POSITION", 0, Dds::Format::R32G32B32_FLOAT, 0, 0},
		    {"COLOR", 0, Dds::Format::R32G32B32A32_FLOAT, 0, 12},
		};
		Gpu::InputLayout layout;
		bool result = layout.Init(aContext, elements, aPass.GetVertexInputs(), "test quad layout");
		if (result)
		{
			aContext.SetInputLayout(&layout);
			aContext.SetVertexBuffer(0, &buffer, sizeof(ColorVertex), 0);
			aContext.SetPrimitiveTopology(Gpu::PrimitiveTopology::TriangleList);
			result = aPass.Apply(aContext);
			aContext.Draw(6, 0);
			aContext.SetInputLayout(nullptr);
			aContext.SetVertexBuffer(0, nullptr, 0, 0);
		}
		layout.Destroy();
		buffer.Destroy();
		return result;
	}

	// A derived fixture sets the facade's own levels (12) in its constructor to prove
	// that a path does not end the process where the editor runs.
	std::bitset<4> myFatalLevels{0};

	static constexpr float ourClearColor[4] = {0.1f, 0.2f, 0.3f, 1.0f};
	static constexpr float ourQuadColor[4] = {0.5f, 0.25f, 1.0f, 1.0f};

	// The acceptance frame: clears the back buffer to ourClearColor, draws a quad of
	// ourQuadColor over clip-space x -0.5..0.5, y 0.2..0.9 (the upper part of the view)
	// through Vertex_PosCol.fx with identity matrices, and presents.
	bool DrawFrame()
	{
		Zeph::Engine* engine = Zeph::Engine::GetInstance();
		Gpu::Context& context = engine->GetContext();
		Zeph::Effect* effect = engine->GetEffectContainer().GetEffect("Data/Shaders/Misc/Vertex_PosCol.fx");
		if (effect == nullptr)
		{
			ADD_FAILURE() << "Vertex_PosCol.fx did not load:\n" << TakeLog();
			return false;
		}
		const Matrix44<float> identity;
		effect->SetWorldMatrix(identity);
		effect->SetViewMatrix(identity);
		effect->SetProjectionMatrix(identity);
		context.ClearRenderTargetView(*engine->GetBackBufferView(), ourClearColor);
		context.ClearDepthStencilView(*engine->GetDepthStencilView(), true, true, 1.0f, 0);
		Gpu::RenderTargetView* const targets[] = {engine->GetBackBufferView()};
		if (!context.SetRenderTargets(targets, engine->GetDepthStencilView()) ||
		    !DrawQuad(context, *effect->GetTechnique()->GetPassByIndex(0), -0.5f, 0.2f, 0.5f, 0.9f,
		              ourQuadColor))
		{
			ADD_FAILURE() << "the frame was not drawn";
			return false;
		}
		engine->Present();
		return true;
	}

	// Whether somePixels (read back top row first, RGBA) hold DrawFrame's picture: the quad's
	// colour inside it, the clear colour around it, both sRGB-encoded.
	static testing::AssertionResult IsAcceptanceFrame(const std::vector<uint8_t>& somePixels, int aWidth,
	                                                  int aHeight)
	{
		// Clip y 0.9..0.2 is rows 0.05..0.4 of the height from the top, x -0.5..0.5 the middle half:
		// the quad's centre and a point near its top-left corner; then the corners, a point below
		// the quad and one above it.
		const int points[6][2] = {
		    {aWidth / 2, aHeight * 9 / 40}, {aWidth / 4 + 2, aHeight / 20 + 2}, {0, 0},
		    {aWidth - 1, aHeight - 1},      {aWidth / 2, aHeight * 3 / 4},      {aWidth / 2, aHeight / 40}};
		for (int point = 0; point < 6; ++point)
		{
			const float* color = point < 2 ? ourQuadColor : ourClearColor;
			const size_t at = (static_cast<size_t>(points[point][1] * aWidth + points[point][0])) * 4;
			for (size_t channel = 0; channel < 3; ++channel)
			{
				if (at + 3 >= somePixels.size() ||
				    std::abs(somePixels[at + channel] - TestSupport::SrgbEncoded(color[channel])) > 1)
				{
					return testing::AssertionFailure() << "channel " << channel << " at (" << points[point][0]
					                                   << ", " << points[point][1] << ")";
				}
			}
		}
		return testing::AssertionSuccess();
	}

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
