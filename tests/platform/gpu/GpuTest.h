#pragma once
// The fixture for tests that need a GL context: a headless device, current on the
// test's thread. Without one the test is skipped, except under CI=true, where a
// missing GL is a failure. Reports are collected as ReportTest describes.
// Beside it, what the GPU suites share: pixels read back, sRGB encoding.

#include <array>
#include <cmath>
#include <deque>
#include <gtest/gtest.h>
#include <memory>
#include <string>
#include <vector>

#include "platform/ReportTest.h"
#include "platform/gpu/Buffer.h"
#include "platform/gpu/Device.h"
#include "platform/gpu/Readback.h"
#include "platform/gpu/Texture.h"
#include "support/GlSupport.h"
#include "support/TestSupport.h"

using Pixel = std::array<uint8_t, 4>;

using TestSupport::SrgbEncoded;

inline float SrgbToLinear(float anEncoded)
{
	return anEncoded <= 0.04045f ? anEncoded / 12.92f : std::pow((anEncoded + 0.055f) / 1.055f, 2.4f);
}

// The RGBA pixel at (anX, aY) of tightly packed rows; zero when out of range.
inline Pixel PixelAt(const std::vector<uint8_t>& someBytes, int aWidth, int anX, int aY)
{
	const size_t at = (static_cast<size_t>(aY) * static_cast<size_t>(aWidth) + static_cast<size_t>(anX)) * 4;
	return at + 4 <= someBytes.size()
	           ? Pixel{someBytes[at], someBytes[at + 1], someBytes[at + 2], someBytes[at + 3]}
	           : Pixel{};
}

// A vertex of the colour programs: position (clip space) and an RGBA8 colour.
struct ColorVertex
{
	float myPosition[3];
	uint8_t myColor[4];
};

// Four corners from (aLeft, aTop) to (aRight, aBottom) in clip space (y up), clockwise on screen.
inline std::vector<ColorVertex> Quad(float aLeft, float aTop, float aRight, float aBottom, Pixel aColor,
                                     float aDepth = 0.5f)
{
	auto vertex = [&](float anX, float aY) {
		return ColorVertex{{anX, aY, aDepth}, {aColor[0], aColor[1], aColor[2], aColor[3]}};
	};
	return {vertex(aLeft, aTop), vertex(aRight, aTop), vertex(aRight, aBottom), vertex(aLeft, aBottom)};
}

// Skips the current test where GL (or another facility) is missing, or fails it under CI=true.
#define LUMORA_SKIP_OR_FAIL(aWhy)                                                                            \
	do                                                                                                       \
	{                                                                                                        \
		if (TestSupport::IsCi())                                                                             \
		{                                                                                                    \
			FAIL() << "under CI: " << (aWhy);                                                                \
		}                                                                                                    \
		GTEST_SKIP() << (aWhy);                                                                              \
	} while (false)

class GpuTest : public ReportTest
{
protected:
	void SetUp() override
	{
		ReportTest::SetUp();
		if (!myDevice.Init(64, 64))
		{
			const std::string why =
			    "No OpenGL 4.5 core context: " + myDevice.GetFailureText() + " " + Joined();
			ourReports.clear();
			LUMORA_SKIP_OR_FAIL(why);
		}
		SetUpGpu();
	}

	// What a suite sets up on the device; runs only when there is one.
	virtual void SetUpGpu() {}

	void TearDown() override
	{
		for (Gpu::Buffer& buffer : myBuffers)
		{
			buffer.Destroy();
		}
		for (std::unique_ptr<Gpu::Texture>& texture : myTextures)
		{
			texture->Destroy();
		}
		myTextures.clear();
		myDevice.Destroy();
		ReportTest::TearDown();
	}

	// A texture that the fixture destroys; null (with the report kept) when Init fails.
	Gpu::Texture* MakeTexture(const Gpu::TextureDesc& aDesc)
	{
		auto texture = std::make_unique<Gpu::Texture>();
		if (!texture->Init(myDevice.GetContext(), aDesc))
		{
			return nullptr;
		}
		return Keep(std::move(texture));
	}

	Gpu::Texture* Keep(std::unique_ptr<Gpu::Texture> aTexture)
	{
		if (!aTexture)
		{
			return nullptr;
		}
		myTextures.push_back(std::move(aTexture));
		return myTextures.back().get();
	}

	Gpu::Texture* MakeTarget(Dds::Format aFormat, int aWidth, int aHeight, int aMipLevels = 1)
	{
		return MakeTexture({.myWidth = aWidth,
		                    .myHeight = aHeight,
		                    .myMipLevels = aMipLevels,
		                    .myFormat = aFormat,
		                    .myLabel = "test target"});
	}

	// A cube of six square faces (aCount faces for a cube array); aMipLevels 0 is the full chain.
	Gpu::Texture* MakeCube(Dds::Format aFormat, int aSize, int aMipLevels = 1, int aCount = 6)
	{
		return MakeTexture({.myKind = Gpu::TextureKind::TextureCube,
		                    .myWidth = aSize,
		                    .myHeight = aSize,
		                    .myArraySize = aCount,
		                    .myMipLevels = aMipLevels,
		                    .myFormat = aFormat,
		                    .myLabel = "test cube"});
	}

	// A new colour target bound (with aDepth, if any) and the viewport over it; null (test failed)
	// when it cannot be made.
	Gpu::RenderTargetView* BindTarget(Dds::Format aFormat, int aWidth, int aHeight,
	                                  Gpu::DepthStencilView* aDepth = nullptr)
	{
		Gpu::Texture* color = MakeTarget(aFormat, aWidth, aHeight);
		Gpu::RenderTargetView* targets[] = {color ? color->CreateRenderTargetView() : nullptr};
		if (targets[0] == nullptr || !GetContext().SetRenderTargets(targets, aDepth))
		{
			ADD_FAILURE() << "cannot bind a " << aWidth << "x" << aHeight << " target: " << Joined();
			return nullptr;
		}
		GetContext().SetViewport(
		    {.myWidth = static_cast<float>(aWidth), .myHeight = static_cast<float>(aHeight)});
		return targets[0];
	}

	// Draws the vertices from a buffer the fixture keeps, with the bound program and layout:
	// as quads (four corners each, indexed) or, without aQuadsFlag, as a triangle list.
	template <typename Vertex>
	void DrawVertices(const std::vector<Vertex>& someVertices, bool aQuadsFlag = true)
	{
		Gpu::Context& context = GetContext();
		Gpu::Buffer& vertices = myBuffers.emplace_back();
		ASSERT_TRUE(vertices.Init(
		    context, {.mySize = someVertices.size() * sizeof(Vertex), .myLabel = "test vertices"},
		    someVertices.data()));
		ASSERT_TRUE(context.SetVertexBuffer(0, &vertices, sizeof(Vertex), 0));
		context.SetPrimitiveTopology(Gpu::PrimitiveTopology::TriangleList);
		if (!aQuadsFlag)
		{
			context.Draw(static_cast<uint32_t>(someVertices.size()), 0);
			return;
		}
		std::vector<uint16_t> indices;
		for (uint16_t first = 0; first < someVertices.size(); first += 4)
		{
			for (const uint16_t corner : {0, 1, 2, 0, 2, 3})
			{
				indices.push_back(static_cast<uint16_t>(first + corner));
			}
		}
		Gpu::Buffer& indexBuffer = myBuffers.emplace_back();
		ASSERT_TRUE(indexBuffer.Init(
		    context,
		    {.myKind = Gpu::BufferKind::Index, .mySize = indices.size() * 2, .myLabel = "test indices"},
		    indices.data()));
		ASSERT_TRUE(context.SetIndexBuffer(&indexBuffer, Gpu::IndexFormat::UInt16, 0));
		ASSERT_TRUE(context.DrawIndexed(static_cast<uint32_t>(indices.size()), 0, 0));
	}

	// The view's RGBA8 bytes, row 0 at the top; empty (test failed) when they cannot be read.
	std::vector<uint8_t> ReadPixels(const Gpu::RenderTargetView& aView)
	{
		std::vector<uint8_t> bytes;
		EXPECT_TRUE(Gpu::ReadRenderTarget(GetContext(), aView, bytes));
		return bytes;
	}

	Gpu::Context& GetContext() { return myDevice.GetContext(); }

	Gpu::Device myDevice;
	std::vector<std::unique_ptr<Gpu::Texture>> myTextures;
	std::deque<Gpu::Buffer> myBuffers; // a deque: buffers cannot move
};
