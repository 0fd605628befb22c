// Drawing through input layouts and blend states as Direct3D does (depth, culling and the
// upper-left origin show in every rendered frame).

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

	static constexpr Pixel ourGreen = {0, 255, 0, 255};
	const float myClearColor[4] = {0.0f, 0.0f, 0.5f, 1.0f};
	Gpu::RenderTargetView* myTarget = nullptr;
	GLuint myProgram = 0;
	Gpu::InputLayout myLayout;
};

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

// One refusal per kind of object: two elements at one location, a draw past the index buffer's
// end (which would read outside it), a draw from an index buffer destroyed while bound (GL
// hands its name straight to the next buffer made), a sampler without anisotropy.
TEST_F(DrawTest, BadInputIsReportedNotDrawn)
{
	Gpu::InputLayout layout;
	const Gpu::AttributeLocation locations[] = {{"POSITION", 0, 0}, {"TEXCOORD", 0, 0}};
	const Gpu::InputElement sameLocation[] = {{"POSITION", 0, Dds::Format::R32G32B32_FLOAT, 0, 0},
	                                          {"TEXCOORD", 0, Dds::Format::R32G32_FLOAT, 0, 12}};
	EXPECT_FALSE(layout.Init(GetContext(), sameLocation, locations, "same location"));
	Gpu::Buffer& indices = myBuffers.emplace_back();
	ASSERT_TRUE(indices.Init(
	    GetContext(), {.myKind = Gpu::BufferKind::Index, .mySize = 12, .myLabel = "six indices"}, nullptr));
	ASSERT_TRUE(GetContext().SetIndexBuffer(&indices, Gpu::IndexFormat::UInt16, 0));
	EXPECT_FALSE(GetContext().DrawIndexed(4, 3, 0)); // indices 3..6 of 6
	indices.Destroy();
	Gpu::Buffer& successor = myBuffers.emplace_back();
	ASSERT_TRUE(successor.Init(GetContext(),
	                           {.myKind = Gpu::BufferKind::Index, .mySize = 12, .myLabel = "next"}, nullptr));
	EXPECT_FALSE(GetContext().DrawIndexed(3, 0, 0));
	Gpu::SamplerState sampler;
	EXPECT_FALSE(sampler.Init(GetContext(), {.myMaxAnisotropy = 0.0f}, "no anisotropy"));
	EXPECT_EQ(TakeReports().size(), 4u);
}
