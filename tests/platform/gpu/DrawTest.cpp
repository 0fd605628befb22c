// Drawing under Direct3D conventions: vertex buffers through an input layout, clockwise
// front faces and blend states (depth and the upper-left origin show in every rendered frame).

#include <array>
#include <vector>

#include "GpuTest.h"
#include "TestProgram.h"
#include "platform/gpu/SamplerState.h"

class DrawTest : public GpuTest
{
protected:
	void SetUpGpu() override
	{
		myTarget = BindTarget(Dds::Format::R8G8B8A8_UNORM_SRGB, 64, 64);
		ASSERT_NE(myTarget, nullptr);
		GetContext().ClearRenderTargetView(*myTarget, myClearColor);

		myProgram = LinkProgram(ourColorVertex, ourColorFragment);
		GetContext().GetStateCache().UseProgram(myProgram);
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
		myLayout.Destroy();
		GetContext().GetStateCache().ForgetProgram(myProgram);
		glDeleteProgram(myProgram);
		GpuTest::TearDown();
	}

	Pixel At(int anX, int aY) { return PixelAt(ReadPixels(*myTarget), 64, anX, aY); }

	static constexpr Pixel ourRed = {255, 0, 0, 255};
	static constexpr Pixel ourGreen = {0, 255, 0, 255};
	const float myClearColor[4] = {0.0f, 0.0f, 0.5f, 1.0f};
	const Pixel myClearPixel = {0, 0, SrgbEncoded(0.5f), 255};
	Gpu::RenderTargetView* myTarget = nullptr;
	GLuint myProgram = 0;
	Gpu::InputLayout myLayout;
};

TEST_F(DrawTest, ClockwiseIsFrontAndBackFacesAreCulled)
{
	const ColorVertex top{{0, 0.5f, 0.5f}, {255, 0, 0, 255}};
	const ColorVertex right{{0.5f, -0.5f, 0.5f}, {255, 0, 0, 255}};
	const ColorVertex left{{-0.5f, -0.5f, 0.5f}, {255, 0, 0, 255}};
	const struct
	{
		Gpu::RasterizerState myState;
		bool myClockwiseFlag; // on screen
		bool myDrawnFlag;
	} cases[] = {{{}, false, false},
	             {{}, true, true},
	             {{.myFrontCounterClockwiseFlag = true}, true, false},
	             {{.myCullMode = Gpu::CullMode::None}, false, true}};
	for (const auto& test : cases)
	{
		GetContext().ClearRenderTargetView(*myTarget, myClearColor);
		GetContext().SetRasterizerState(test.myState);
		DrawVertices<ColorVertex>(
		    {top, test.myClockwiseFlag ? right : left, test.myClockwiseFlag ? left : right}, false);
		EXPECT_EQ(At(32, 32), test.myDrawnFlag ? ourRed : myClearPixel) << &test - cases;
	}
}

TEST_F(DrawTest, AlphaBlendingMixesInLinearSpace)
{
	Gpu::BlendState alpha;
	alpha.myEnableFlag = true;
	alpha.myColor = {Gpu::Blend::SrcAlpha, Gpu::Blend::InvSrcAlpha, Gpu::BlendOp::Add};
	alpha.myAlpha = {Gpu::Blend::One, Gpu::Blend::Zero, Gpu::BlendOp::Add};
	GetContext().SetBlendState(alpha);
	DrawVertices(Quad(-1, 1, 1, -1, {255, 0, 0, 64}));

	// sRGB targets blend after decoding the destination, as Direct3D's do.
	const float source = 64.0f / 255.0f;
	const Pixel pixel = At(32, 32);
	EXPECT_NEAR(pixel[0], SrgbEncoded(source), 2);
	EXPECT_NEAR(pixel[2], SrgbEncoded(0.5f * (1.0f - source)), 2);

	// A write mask without red (or alpha, 64 from the blend) keeps the destination's.
	Gpu::BlendState noRed;
	noRed.myWriteMask = Gpu::ColorWrite::Green | Gpu::ColorWrite::Blue;
	GetContext().SetBlendState(noRed);
	DrawVertices(Quad(-1, 1, 1, -1, ourGreen));
	EXPECT_EQ(At(32, 32), (Pixel{pixel[0], 255, 0, 64}));
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
