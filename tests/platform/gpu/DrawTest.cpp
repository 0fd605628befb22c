// Drawing under Direct3D conventions: vertex buffers through an input layout,
// upper-left origin, clockwise front faces, depth and blend states.

#include <array>
#include <cmath>
#include <deque>
#include <vector>

#include "GpuTest.h"
#include "TestProgram.h"
#include "platform/gpu/Buffer.h"
#include "platform/gpu/Readback.h"
#include "platform/gpu/SamplerState.h"

namespace
{
struct Vertex
{
	float myPosition[3];
	uint8_t myColor[4];
};

uint8_t SrgbEncoded(float aLinear)
{
	const float encoded =
	    aLinear <= 0.0031308f ? aLinear * 12.92f : 1.055f * std::pow(aLinear, 1.0f / 2.4f) - 0.055f;
	return static_cast<uint8_t>(std::lround(encoded * 255.0f));
}

// A quad from (aLeft, aTop) to (aRight, aBottom) in clip space, clockwise on screen.
std::array<Vertex, 4> Quad(float aLeft, float aTop, float aRight, float aBottom, float aDepth,
                           std::array<uint8_t, 4> aColor)
{
	auto vertex = [&](float anX, float aY) {
		return Vertex{{anX, aY, aDepth}, {aColor[0], aColor[1], aColor[2], aColor[3]}};
	};
	return {vertex(aLeft, aTop), vertex(aRight, aTop), vertex(aRight, aBottom), vertex(aLeft, aBottom)};
}
} // namespace

class DrawTest : public GpuTest
{
protected:
	void SetUp() override
	{
		GpuTest::SetUp();
		if (IsSkipped() || HasFailure())
		{
			return;
		}
		Gpu::Texture* target = MakeTarget(Dds::Format::R8G8B8A8_UNORM_SRGB, 64, 64);
		ASSERT_NE(target, nullptr);
		myTarget = target->CreateRenderTargetView();
		Gpu::RenderTargetView* targets[] = {myTarget};
		ASSERT_TRUE(GetContext().SetRenderTargets(targets, nullptr));
		GetContext().SetViewport({.myWidth = 64, .myHeight = 64});
		GetContext().ClearRenderTargetView(*myTarget, myClearColor);

		myProgram.Init();
		GetContext().GetStateCache().UseProgram(myProgram.GetName());
		const Gpu::InputElement elements[] = {
		    {"POSITION", 0, Dds::Format::R32G32B32_FLOAT, 0, 0},
		    {"COLOR", 0, Dds::Format::R8G8B8A8_UNORM, 0, Gpu::InputElement::ourAppendAligned},
		};
		const Gpu::AttributeLocation locations[] = {{"POSITION", 0, 0}, {"COLOR", 0, 1}};
		ASSERT_TRUE(myLayout.Init(GetContext(), elements, locations, "position and colour"));
		GetContext().SetInputLayout(&myLayout);
	}

	void TearDown() override
	{
		for (Gpu::Buffer& buffer : myBuffers)
		{
			buffer.Destroy();
		}
		myLayout.Destroy();
		GetContext().GetStateCache().ForgetProgram(myProgram.GetName());
		myProgram.Destroy();
		GpuTest::TearDown();
	}

	// Draws the vertices as a list of quads, indexed, from immutable buffers.
	void DrawQuads(const std::vector<Vertex>& someVertices)
	{
		std::vector<uint16_t> indices;
		for (uint16_t first = 0; first < someVertices.size(); first += 4)
		{
			for (const uint16_t corner : {0, 1, 2, 0, 2, 3})
			{
				indices.push_back(static_cast<uint16_t>(first + corner));
			}
		}
		Gpu::Buffer& vertices = myBuffers.emplace_back();
		ASSERT_TRUE(
		    vertices.Init({.mySize = someVertices.size() * sizeof(Vertex), .myLabel = "quad vertices"},
		                  someVertices.data()));
		Gpu::Buffer& indexBuffer = myBuffers.emplace_back();
		ASSERT_TRUE(indexBuffer.Init(
		    {.myKind = Gpu::BufferKind::Index, .mySize = indices.size() * 2, .myLabel = "quad indices"},
		    indices.data()));
		Gpu::Context& context = GetContext();
		ASSERT_TRUE(context.SetVertexBuffer(0, &vertices, sizeof(Vertex), 0));
		ASSERT_TRUE(context.SetIndexBuffer(&indexBuffer, Gpu::IndexFormat::UInt16, 0));
		context.SetPrimitiveTopology(Gpu::PrimitiveTopology::TriangleList);
		ASSERT_TRUE(context.DrawIndexed(static_cast<uint32_t>(indices.size()), 0, 0));
	}

	void DrawTriangle(const std::array<Vertex, 3>& someVertices)
	{
		Gpu::Buffer& vertices = myBuffers.emplace_back();
		ASSERT_TRUE(
		    vertices.Init({.mySize = sizeof(someVertices), .myLabel = "triangle"}, someVertices.data()));
		ASSERT_TRUE(GetContext().SetVertexBuffer(0, &vertices, sizeof(Vertex), 0));
		GetContext().Draw(3, 0);
	}

	std::array<uint8_t, 4> Pixel(int anX, int aY)
	{
		std::vector<uint8_t> bytes;
		EXPECT_TRUE(Gpu::ReadRenderTarget(GetContext(), *myTarget, bytes));
		const size_t at = (static_cast<size_t>(aY) * 64 + anX) * 4;
		if (bytes.size() < at + 4)
		{
			return {};
		}
		return {bytes[at], bytes[at + 1], bytes[at + 2], bytes[at + 3]};
	}

	static constexpr std::array<uint8_t, 4> ourRed = {255, 0, 0, 255};
	static constexpr std::array<uint8_t, 4> ourGreen = {0, 255, 0, 255};
	const float myClearColor[4] = {0.0f, 0.0f, 0.5f, 1.0f};
	const std::array<uint8_t, 4> myClearPixel = {0, 0, SrgbEncoded(0.5f), 255};
	Gpu::RenderTargetView* myTarget = nullptr;
	TestProgram myProgram;
	Gpu::InputLayout myLayout;
	std::deque<Gpu::Buffer> myBuffers; // a deque: buffers cannot move
};

TEST_F(DrawTest, IndexedQuadCoversTheMiddleInSrgb)
{
	const std::array<Vertex, 4> quad = Quad(-0.5f, 0.5f, 0.5f, -0.5f, 0.5f, {255, 128, 0, 255});
	DrawQuads({quad.begin(), quad.end()});
	const std::array<uint8_t, 4> quadPixel = {255, SrgbEncoded(128.0f / 255.0f), 0, 255};
	EXPECT_EQ(Pixel(32, 32), quadPixel);
	// The quad spans pixels 16..47: half of 64 around the centre, no off-by-one at either edge.
	EXPECT_EQ(Pixel(16, 16), quadPixel);
	EXPECT_EQ(Pixel(47, 47), quadPixel);
	EXPECT_EQ(Pixel(15, 32), myClearPixel);
	EXPECT_EQ(Pixel(48, 32), myClearPixel);
	EXPECT_EQ(Pixel(0, 0), myClearPixel);
}

TEST_F(DrawTest, PositiveClipYLandsInTheTopRows)
{
	DrawTriangle({Vertex{{-1, 1, 0.5f}, {255, 0, 0, 255}}, Vertex{{1, 1, 0.5f}, {255, 0, 0, 255}},
	              Vertex{{0, 0.2f, 0.5f}, {255, 0, 0, 255}}});
	EXPECT_EQ(Pixel(32, 2), ourRed);
	EXPECT_EQ(Pixel(32, 61), myClearPixel);
}

TEST_F(DrawTest, ClockwiseIsFrontAndBackFacesAreCulled)
{
	const Vertex top{{0, 0.5f, 0.5f}, {255, 0, 0, 255}};
	const Vertex right{{0.5f, -0.5f, 0.5f}, {255, 0, 0, 255}};
	const Vertex left{{-0.5f, -0.5f, 0.5f}, {255, 0, 0, 255}};
	DrawTriangle({top, left, right}); // counter-clockwise on screen
	EXPECT_EQ(Pixel(32, 32), myClearPixel);
	DrawTriangle({top, right, left});
	EXPECT_EQ(Pixel(32, 32), ourRed);

	GetContext().ClearRenderTargetView(*myTarget, myClearColor);
	GetContext().SetRasterizerState({.myFrontCounterClockwiseFlag = true});
	DrawTriangle({top, right, left});
	EXPECT_EQ(Pixel(32, 32), myClearPixel);
	GetContext().SetRasterizerState({.myCullMode = Gpu::CullMode::None});
	DrawTriangle({top, right, left});
	EXPECT_EQ(Pixel(32, 32), ourRed);
}

TEST_F(DrawTest, DepthLessKeepsTheNearerQuadInEitherOrder)
{
	Gpu::Texture* depth = MakeTarget(Dds::Format::D32_FLOAT, 64, 64);
	ASSERT_NE(depth, nullptr);
	Gpu::DepthStencilView* depthView = depth->CreateDepthStencilView();
	ASSERT_NE(depthView, nullptr);
	Gpu::RenderTargetView* targets[] = {myTarget};
	ASSERT_TRUE(GetContext().SetRenderTargets(targets, depthView));
	GetContext().SetDepthStencilState({.myDepthFunc = Gpu::Comparison::Less});

	const std::array<Vertex, 4> nearLeft = Quad(-1, 1, 0.2f, -1, 0.3f, ourGreen);
	const std::array<Vertex, 4> farRight = Quad(-0.2f, 1, 1, -1, 0.7f, ourRed);
	GetContext().ClearDepthStencilView(*depthView, true, false, 1.0f, 0);
	DrawQuads({farRight[0], farRight[1], farRight[2], farRight[3], nearLeft[0], nearLeft[1], nearLeft[2],
	           nearLeft[3]});
	EXPECT_EQ(Pixel(32, 32), ourGreen);
	EXPECT_EQ(Pixel(60, 32), ourRed);

	GetContext().ClearDepthStencilView(*depthView, true, false, 1.0f, 0);
	DrawQuads({nearLeft[0], nearLeft[1], nearLeft[2], nearLeft[3], farRight[0], farRight[1], farRight[2],
	           farRight[3]});
	EXPECT_EQ(Pixel(32, 32), ourGreen);

	// The depth test off: the later quad wins.
	GetContext().SetDepthStencilState({.myDepthEnableFlag = false});
	DrawQuads({nearLeft[0], nearLeft[1], nearLeft[2], nearLeft[3], farRight[0], farRight[1], farRight[2],
	           farRight[3]});
	EXPECT_EQ(Pixel(32, 32), ourRed);
}

TEST_F(DrawTest, AlphaBlendingMixesInLinearSpace)
{
	Gpu::BlendState alpha;
	alpha.myEnableFlag = true;
	alpha.myColor = {Gpu::Blend::SrcAlpha, Gpu::Blend::InvSrcAlpha, Gpu::BlendOp::Add};
	alpha.myAlpha = {Gpu::Blend::One, Gpu::Blend::Zero, Gpu::BlendOp::Add};
	GetContext().SetBlendState(alpha);
	const std::array<Vertex, 4> quad = Quad(-1, 1, 1, -1, 0.5f, {255, 0, 0, 64});
	DrawQuads({quad.begin(), quad.end()});

	const float source = 64.0f / 255.0f;
	const std::array<uint8_t, 4> pixel = Pixel(32, 32);
	// sRGB targets blend after decoding the destination, as Direct3D's do.
	EXPECT_NEAR(pixel[0], SrgbEncoded(source), 2);
	EXPECT_EQ(pixel[1], 0);
	EXPECT_NEAR(pixel[2], SrgbEncoded(0.5f * (1.0f - source)), 2);
	EXPECT_EQ(pixel[3], 64);

	// A write mask without red keeps the destination's red.
	Gpu::BlendState noRed;
	noRed.myWriteMask = Gpu::ColorWrite::Green | Gpu::ColorWrite::Blue;
	GetContext().SetBlendState(noRed);
	const std::array<Vertex, 4> green = Quad(-1, 1, 1, -1, 0.5f, ourGreen);
	DrawQuads({green.begin(), green.end()});
	const std::array<uint8_t, 4> masked = Pixel(32, 32);
	EXPECT_EQ(masked[0], pixel[0]);
	EXPECT_EQ(masked[1], 255);
	EXPECT_EQ(masked[3], 64);
}

TEST_F(DrawTest, BadInputIsReportedNotDrawn)
{
	Gpu::InputLayout layout;
	const Gpu::InputElement compressed[] = {{"POSITION", 0, Dds::Format::BC1_UNORM, 0, 0}};
	const Gpu::AttributeLocation locations[] = {{"POSITION", 0, 0}, {"TEXCOORD", 0, 0}};
	EXPECT_FALSE(layout.Init(GetContext(), compressed, locations, "compressed"));
	const Gpu::InputElement sameLocation[] = {{"POSITION", 0, Dds::Format::R32G32B32_FLOAT, 0, 0},
	                                          {"TEXCOORD", 0, Dds::Format::R32G32_FLOAT, 0, 12}};
	EXPECT_FALSE(layout.Init(GetContext(), sameLocation, locations, "same location"));
	const Gpu::InputElement farSlot[] = {{"POSITION", 0, Dds::Format::R32G32B32_FLOAT, 99, 0}};
	EXPECT_FALSE(layout.Init(GetContext(), farSlot, locations, "far slot"));
	EXPECT_EQ(TakeReports().size(), 3u);

	Gpu::Buffer& indices = myBuffers.emplace_back();
	ASSERT_TRUE(
	    indices.Init({.myKind = Gpu::BufferKind::Index, .mySize = 12, .myLabel = "six indices"}, nullptr));
	EXPECT_FALSE(GetContext().SetVertexBuffer(0, &indices, 12, 0));
	EXPECT_FALSE(GetContext().SetIndexBuffer(&indices, Gpu::IndexFormat::UInt32, 2));
	EXPECT_FALSE(GetContext().DrawIndexed(3, 0, 0)); // no index buffer yet
	ASSERT_TRUE(GetContext().SetIndexBuffer(&indices, Gpu::IndexFormat::UInt16, 0));
	EXPECT_FALSE(GetContext().DrawIndexed(4, 3, 0)); // indices 3..6 of 6
	EXPECT_EQ(TakeReports().size(), 4u);

	Gpu::SamplerState sampler;
	EXPECT_FALSE(sampler.Init(GetContext(), {.myMaxAnisotropy = 0.0f}, "no anisotropy"));
	EXPECT_EQ(TakeReports().size(), 1u);
	ASSERT_TRUE(sampler.Init(GetContext(), {.myFilter = Gpu::Filter::Point}, "point"));
	GLint minFilter = 0;
	glGetSamplerParameteriv(sampler.GetName(), GL_TEXTURE_MIN_FILTER, &minFilter);
	EXPECT_EQ(minFilter, GL_NEAREST_MIPMAP_NEAREST);
	sampler.Destroy();
}
