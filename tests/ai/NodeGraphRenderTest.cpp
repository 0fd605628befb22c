// The path graph's visuals in a headless frame (160 x 90): red marker boxes at the nodes
// and a green line between them, drawn over the finished image and read back from the
// back buffer. Frames are saved under /tmp/lumora-ai-tests/ to be looked at.
#include <cstdint>
#include <functional>
#include <gtest/gtest.h>
#include <string>
#include <vector>

#include "ai/NGEdge.h"
#include "ai/NGNode.h"
#include "engine/Instance.h"
#include "engine/ViewFixture.h"
#include "platform/gpu/Readback.h"
#include "renderer/FrameCapture.h"
#include "renderer/Renderer.h"

namespace
{
constexpr int ourRed = 0;
constexpr int ourGreen = 1;

class NodeGraphRenderTest : public ViewTest
{
protected:
	// One frame with the graph queued as the editor queues it, read back and saved.
	void Draw(const std::string& aName)
	{
		int lateCount = 0;
		const auto queue = [&] {
			for (AI::NGNode& node : myNodes)
			{
				node.Render();
			}
			myEdge.Render();
			lateCount = Zeph::Engine::GetInstance()->GetRenderer().GetLateCount();
		};
		int width = 0;
		int height = 0;
		myPixels.clear();
		ASSERT_TRUE(Zeph::FrameCapture::RenderAndRead(queue, 1, myPixels, width, height));
		ASSERT_EQ(width, ourWidth);
		ASSERT_EQ(height, ourHeight);
		EXPECT_EQ(lateCount, 3) << "two boxes and a line on the late list";
		Gpu::SavePng("/tmp/lumora-ai-tests/" + aName + ".png", ourWidth, ourHeight,
		             TestSupport::Opaque(myPixels).data());
	}

	// Whether some pixel within one of (x, y) passes aTest on its RGB bytes (or, with anAllFlag,
	// every pixel there does).
	bool Around(Pixel aPixel, bool anAllFlag, const std::function<bool(const uint8_t*)>& aTest) const
	{
		for (int y = std::max(aPixel.myY - 1, 0); y <= std::min(aPixel.myY + 1, ourHeight - 1); ++y)
		{
			for (int x = std::max(aPixel.myX - 1, 0); x <= std::min(aPixel.myX + 1, ourWidth - 1); ++x)
			{
				if (aTest(&myPixels[static_cast<size_t>((y * ourWidth + x) * 4)]) != anAllFlag)
				{
					return !anAllFlag;
				}
			}
		}
		return anAllFlag;
	}
	// A pixel within one of (x, y) that is pure full red or pure full green.
	bool IsNear(Pixel aPixel, int aChannel) const
	{
		return Around(aPixel, false, [&](const uint8_t* aRgb) {
			return aRgb[aChannel] == 255 && aRgb[1 - aChannel] == 0 && aRgb[2] == 0;
		});
	}
	bool IsBlackAround(Pixel aPixel) const
	{
		return Around(aPixel, true,
		              [](const uint8_t* aRgb) { return aRgb[0] == 0 && aRgb[1] == 0 && aRgb[2] == 0; });
	}

	void TearDown() override
	{
		for (AI::NGNode& node : myNodes)
		{
			node.DestroyDebugInstance();
		}
		myEdge.DestroyDebugLine();
		EngineTest::TearDown();
	}

	std::vector<uint8_t> myPixels;
	AI::NGNode myNodes[2];
	AI::NGEdge myEdge;
};
} // namespace

TEST_F(NodeGraphRenderTest, BoxesAtTheNodesAndALineBetweenThemFollowAMovedNode)
{
	LUMORA_RETURN_UNLESS(Start());
	const Vector3<float> a(-1.5f, -0.5f, 10.0f);
	const Vector3<float> b(1.5f, 0.5f, 10.0f);
	// The graph a - b with both visuals, made as the editor makes them; made twice, the
	// first box and line are deleted (the sanitizer build reports a leak otherwise).
	for (int at = 0; at < 2; ++at)
	{
		myNodes[at].InitDebugInstance();
		myNodes[at].InitDebugInstance();
		myNodes[at].SetID(at + 1);
		myNodes[at].SetPosition(at == 0 ? a : b);
	}
	myEdge.InitDebugLine();
	myEdge.InitDebugLine();
	myEdge.Connect(&myNodes[0], &myNodes[1]);
	myNodes[0].AddEdge(&myEdge);
	myNodes[1].AddEdge(&myEdge);
	ASSERT_NE(myNodes[0].GetDebugInstance(), nullptr) << TakeLog();
	ASSERT_NE(myEdge.GetDebugLine(), nullptr) << TakeLog();
	EXPECT_EQ(myNodes[0].GetDebugInstance()->GetModelNode(), myNodes[1].GetDebugInstance()->GetModelNode())
	    << "every marker shares one box model";
	Draw("graph");

	// Each box covers +-0.25 around its node: probed off the line (above and below the
	// centre), and clear just beyond its top face.
	for (const Vector3<float>& node : {a, b})
	{
		for (const float dy : {0.15f, -0.15f})
		{
			const Pixel inside = Project(node + Vector3<float>(0.0f, dy, 0.0f));
			EXPECT_TRUE(IsNear(inside, ourRed)) << "box at " << inside.myX << ", " << inside.myY;
		}
		const Pixel above = Project(node + Vector3<float>(0.0f, 0.45f, 0.0f));
		EXPECT_TRUE(IsBlackAround(above)) << "above the box at " << above.myX << ", " << above.myY;
	}
	EXPECT_TRUE(IsBlackAround(Project({0.0f, 1.0f, 10.0f}))) << "nothing off the graph";

	const Vector3<float> moved(1.5f, -1.0f, 8.0f);
	myNodes[1].SetPosition(moved);
	Draw("graph-after-move");
	EXPECT_FLOAT_EQ(myEdge.GetDistance(), (moved - a).Length()) << "drawing brings the distance up to date";
	EXPECT_TRUE(IsNear(Project(moved + Vector3<float>(0.0f, 0.15f, 0.0f)), ourRed)) << "the box moved";
	EXPECT_TRUE(IsBlackAround(Project(b))) << "the box left its old place";
	for (const float t : {0.3f, 0.5f, 0.7f})
	{
		EXPECT_TRUE(IsNear(Project(a + (moved - a) * t), ourGreen)) << "new line at t = " << t;
		EXPECT_TRUE(IsBlackAround(Project(a + (b - a) * t))) << "old line at t = " << t;
	}

	// A copy refers to the same visuals; the element that made them releases them once
	// (the fixture's tear-down releases them again, which does nothing).
	const AI::NGNode copy = myNodes[0];
	EXPECT_EQ(copy.GetDebugInstance(), myNodes[0].GetDebugInstance());
	myNodes[0].DestroyDebugInstance();
	myEdge.DestroyDebugLine();
	EXPECT_EQ(myNodes[0].GetDebugInstance(), nullptr);
	EXPECT_EQ(myEdge.GetDebugLine(), nullptr);
}
