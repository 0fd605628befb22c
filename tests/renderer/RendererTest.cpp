// The renderer with a GPU (headless, 160 x 90): instances drawn through the
// collector, a room box drawn as lines over the frame, read back from the back buffer.
// Every frame is saved under /tmp/lumora-renderer-tests/ to be looked at.
#include <algorithm>
#include <cmath>
#include <cstdint>
#include <gtest/gtest.h>
#include <memory>
#include <string>
#include <vector>

#include "engine/Camera.h"
#include "engine/CameraInstance.h"
#include "engine/Instance.h"
#include "engine/Room.h"
#include "engine/ViewFixture.h"
#include "model/ModelFactory.h"
#include "platform/gpu/Readback.h"
#include "renderer/FrameCapture.h"
#include "renderer/Renderer.h"
#include "support/TestSupport.h"

namespace
{

class RendererTest : public ViewTest
{
protected:
	static Zeph::Renderer& Renderer() { return Zeph::Engine::GetInstance()->GetRenderer(); }
	static Zeph::ModelFactory& Factory() { return Zeph::Engine::GetInstance()->GetModelFactory(); }

	// Renders the frame, reads the back buffer and saves it as aName.png.
	void RenderAndRead(const std::string& aName)
	{
		Zeph::Engine* engine = Zeph::Engine::GetInstance();
		engine->RenderScene();
		myPixels.clear();
		ASSERT_TRUE(Gpu::ReadRenderTarget(engine->GetContext(), *engine->GetBackBufferView(), myPixels));
		ASSERT_EQ(myPixels.size(), static_cast<size_t>(ourWidth * ourHeight * 4));
		// Saved opaque: the room box's colour has alpha 0, which a viewer would show as a hole.
		Gpu::SavePng("/tmp/lumora-renderer-tests/" + aName + ".png", ourWidth, ourHeight,
		             TestSupport::Opaque(myPixels).data());
	}

	const uint8_t* At(int anX, int aY) const
	{
		return &myPixels[static_cast<size_t>((aY * ourWidth + anX) * 4)];
	}
	bool IsBlack(int anX, int aY) const
	{
		return At(anX, aY)[0] == 0 && At(anX, aY)[1] == 0 && At(anX, aY)[2] == 0;
	}
	// How many pixels within one of aPixel are lit: at 255 in aChannel, or (aChannel -1) not black.
	int LitNear(Pixel aPixel, int aChannel) const
	{
		int lit = 0;
		for (int y = std::max(aPixel.myY - 1, 0); y <= std::min(aPixel.myY + 1, ourHeight - 1); ++y)
		{
			for (int x = std::max(aPixel.myX - 1, 0); x <= std::min(aPixel.myX + 1, ourWidth - 1); ++x)
			{
				lit += (aChannel < 0 ? !IsBlack(x, y) : At(x, y)[aChannel] == 255) ? 1 : 0;
			}
		}
		return lit;
	}

	std::vector<uint8_t> myPixels;
};

} // namespace

TEST_F(RendererTest, ALateBoxIsDrawnWhereTheCameraSeesItAndSubmittedBoxesKeepTheirPreviousWorld)
{
	LUMORA_RETURN_UNLESS(Start());
	Zeph::ModelNode* box = Factory().CreateAABB("red box", {1.0f, 1.0f, 1.0f}, {0.5f, 0.0f, 0.0f, 1.0f},
	                                            Gpu::PrimitiveTopology::TriangleList);
	ASSERT_NE(box, nullptr) << TakeLog();
	Zeph::Instance instance(box);
	instance.SetPosition({0.0f, 0.0f, 10.0f});
	// A gizmo: drawn over the finished frame, so its colour reaches the back buffer as is.
	Renderer().RenderLateInstance(&instance);
	RenderAndRead("box");

	const uint8_t* centre = At(ourWidth / 2, ourHeight / 2);
	EXPECT_NEAR(centre[0], TestSupport::SrgbEncoded(0.5f), 1) << "the back buffer stores sRGB-encoded colour";
	EXPECT_EQ(centre[1], 0);
	EXPECT_EQ(centre[2], 0);
	for (const Pixel corner :
	     {Pixel{0, 0}, Pixel{ourWidth - 1, 0}, Pixel{0, ourHeight - 1}, Pixel{ourWidth - 1, ourHeight - 1}})
	{
		EXPECT_TRUE(IsBlack(corner.myX, corner.myY)) << corner.myX << ", " << corner.myY;
	}
	// The near face's silhouette: inside just within its corner, outside just beyond.
	const Pixel topLeft = Project({-1.0f, 1.0f, 9.0f});
	EXPECT_NEAR(At(topLeft.myX + 2, topLeft.myY + 2)[0], TestSupport::SrgbEncoded(0.5f), 1);
	EXPECT_TRUE(IsBlack(topLeft.myX - 2, topLeft.myY - 2));

	// The frame emptied the queues: the next one draws nothing.
	RenderAndRead("box-next-frame");
	EXPECT_TRUE(IsBlack(ourWidth / 2, ourHeight / 2));

	// Submitting keeps each instance's previous world matrix.
	Zeph::Instance first(box);
	Zeph::Instance second(box);
	first.SetPosition({1.0f, 0.0f, 10.0f});
	second.SetPosition({-1.0f, 0.0f, 10.0f});
	first.Render();
	second.Render();
	const Zeph::RenderBatchList& list =
	    Renderer().GetRTC().GetBatches(Zeph::RenderTargetCollector::SHADOW_CASTING_LIST);
	ASSERT_EQ(list.Count(), 1) << "one model, one batch";
	ASSERT_EQ(list[0].GetCount(), 2);
	EXPECT_FLOAT_EQ(list[0].GetPreviousWorld(0).GetPosition().x, 1.0f) << "a first frame has not moved";
	RenderAndRead("two-boxes");

	first.SetPosition({2.0f, 0.5f, 10.0f});
	first.Render();
	second.Render();
	ASSERT_EQ(list.Count(), 1);
	EXPECT_FLOAT_EQ(list[0].GetWorld(0).GetPosition().x, 2.0f);
	EXPECT_FLOAT_EQ(list[0].GetPreviousWorld(0).GetPosition().x, 1.0f);
	EXPECT_FLOAT_EQ(list[0].GetPreviousWorld(0).GetPosition().y, 0.0f);
	EXPECT_FLOAT_EQ(list[0].GetWorld(1).GetPosition().x, -1.0f);
	EXPECT_FLOAT_EQ(list[0].GetPreviousWorld(1).GetPosition().x, -1.0f);
	RenderAndRead("two-boxes-moved");
}

TEST_F(RendererTest, RoomBoxIsDrawnAsLinesOverTheFrameAndSharedByEqualBounds)
{
	LUMORA_RETURN_UNLESS(Start());
	Zeph::Room room({-1.0f, -1.0f, 9.0f}, {1.0f, 1.0f, 11.0f});
	room.InitDebugInstance();
	ASSERT_NE(room.GetDebugInstance(), nullptr) << TakeLog();
	room.Render();
	EXPECT_EQ(Renderer().GetLateCount(), 1);
	RenderAndRead("room");
	EXPECT_EQ(Renderer().GetLateCount(), 0) << "the frame empties the late list";

	// The box's 36 triangle indices read as a line list give 18 lines: eight of the
	// twelve edges (the near and far faces' left and right edges and the four edges
	// running from near to far) and one diagonal on every face. Probed: edge middles.
	for (const Vector3<float>& edge : {Vector3<float>(-1.0f, 0.0f, 9.0f), Vector3<float>(1.0f, 0.0f, 9.0f),
	                                   Vector3<float>(-1.0f, 0.0f, 11.0f), Vector3<float>(-1.0f, 1.0f, 10.0f),
	                                   Vector3<float>(1.0f, -1.0f, 10.0f)})
	{
		const Pixel pixel = Project(edge);
		EXPECT_TRUE(LitNear(pixel, 0) > 0) << "edge at " << pixel.myX << ", " << pixel.myY;
		EXPECT_EQ(At(pixel.myX, pixel.myY)[1], 0) << "red only";
	}
	// The faces are not filled: the near face probed off its diagonal (which runs
	// from (-x, -y) to (+x, +y)), in its upper-left and lower-right quarters.
	EXPECT_EQ(LitNear(Project({-0.5f, 0.5f, 9.0f}), -1), 0);
	EXPECT_EQ(LitNear(Project({0.5f, -0.5f, 9.0f}), -1), 0);
	EXPECT_TRUE(IsBlack(0, 0));

	// The box is drawn at the room's centre: the same model moved by the instance.
	const Matrix44<float>& orientation = room.GetDebugInstance()->GetOrientation();
	EXPECT_FLOAT_EQ(orientation.GetPosition().z, 10.0f);
	room.DestroyDebugInstance();
	EXPECT_EQ(room.GetDebugInstance(), nullptr);

	// Rooms with equal bounds share their box model.
	Zeph::Room first({0.0f, 0.0f, 0.0f}, {2.0f, 4.0f, 6.0f});
	Zeph::Room same({0.0f, 0.0f, 0.0f}, {2.0f, 4.0f, 6.0f});
	Zeph::Room other({0.0f, 0.0f, 0.0f}, {2.0f, 4.0f, 7.0f});
	const size_t baseline = Factory().GetCount();
	first.InitDebugInstance();
	same.InitDebugInstance();
	other.InitDebugInstance();
	ASSERT_NE(first.GetDebugInstance(), nullptr) << TakeLog();
	ASSERT_NE(same.GetDebugInstance(), nullptr);
	ASSERT_NE(other.GetDebugInstance(), nullptr);
	EXPECT_NE(first.GetDebugInstance(), same.GetDebugInstance());
	EXPECT_EQ(first.GetDebugInstance()->GetModelNode(), same.GetDebugInstance()->GetModelNode());
	EXPECT_NE(first.GetDebugInstance()->GetModelNode(), other.GetDebugInstance()->GetModelNode());
	// Stored under the bounds' name: asking for that name gives the room's box.
	EXPECT_EQ(Factory().CreateAABB("room000246", {5.0f, 5.0f, 5.0f}, {0.0f, 0.0f, 1.0f, 1.0f},
	                               Gpu::PrimitiveTopology::TriangleList),
	          first.GetDebugInstance()->GetModelNode());
	EXPECT_EQ(Factory().CreateAABB("room000247", {5.0f, 5.0f, 5.0f}, {0.0f, 0.0f, 1.0f, 1.0f},
	                               Gpu::PrimitiveTopology::TriangleList),
	          other.GetDebugInstance()->GetModelNode());
	EXPECT_EQ(Factory().GetCount(), baseline + 2u);
}
