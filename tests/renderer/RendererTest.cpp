// The renderer with a GPU (headless, 160 x 90): instances submitted to the collector with
// their previous world, a room box drawn as lines over the frame, read back from the back
// buffer; a resize of the engine's view. A late box over a lit scene is in the golden images.
// Every frame is saved under /tmp/lumora-renderer-tests/ to be looked at.
#include <algorithm>
#include <cstdint>
#include <gtest/gtest.h>
#include <string>
#include <utility>
#include <vector>

#include "engine/Instance.h"
#include "engine/Room.h"
#include "engine/Texture.h"
#include "engine/ViewFixture.h"
#include "model/ModelFactory.h"
#include "platform/gpu/Readback.h"
#include "platform/gpu/TextureView.h"
#include "renderer/ProbeHelper.h"
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
	// How many pixels within one of aPixel are lit: at 255 in aChannel, or (aChannel -1) not black.
	int LitNear(Pixel aPixel, int aChannel) const
	{
		int lit = 0;
		for (int y = std::max(aPixel.myY - 1, 0); y <= std::min(aPixel.myY + 1, ourHeight - 1); ++y)
		{
			for (int x = std::max(aPixel.myX - 1, 0); x <= std::min(aPixel.myX + 1, ourWidth - 1); ++x)
			{
				const uint8_t* rgb = At(x, y);
				lit += (aChannel < 0 ? rgb[0] + rgb[1] + rgb[2] > 0 : rgb[aChannel] == 255) ? 1 : 0;
			}
		}
		return lit;
	}

	std::vector<uint8_t> myPixels;
};

} // namespace

TEST_F(RendererTest, BoxesKeepTheirPreviousWorldTheFrameEmptiesItsQueuesAndRoomBoxesAreSharedLines)
{
	LUMORA_RETURN_UNLESS(Start());
	Zeph::ModelNode* box = Factory().CreateAABB("red box", {1.0f, 1.0f, 1.0f}, {0.5f, 0.0f, 0.0f, 1.0f},
	                                            Gpu::PrimitiveTopology::TriangleList);
	ASSERT_NE(box, nullptr) << TakeLog();
	Zeph::Instance first(box);
	Zeph::Instance second(box);
	first.SetPosition({1.0f, 0.0f, 10.0f});
	second.SetPosition({-1.0f, 0.0f, 10.0f});
	const Zeph::RenderBatchList& list =
	    Renderer().GetRTC().GetBatches(Zeph::RenderTargetCollector::SHADOW_CASTING_LIST);
	Zeph::Instance late(box);
	// The first box's previous position (x, y), the second's previous x and the first's x: a
	// first frame has not moved; in the next one the first box has.
	for (const float worldX : {1.0f, 2.0f})
	{
		first.Render();
		second.Render();
		Renderer().RenderLateInstance(&late);
		ASSERT_EQ(list.Count(), 1) << "one model, one batch";
		ASSERT_EQ(list[0].GetCount(), 2);
		const std::vector<float> positions = {
		    list[0].GetPreviousWorld(0).GetPosition().x, list[0].GetPreviousWorld(0).GetPosition().y,
		    list[0].GetPreviousWorld(1).GetPosition().x, list[0].GetWorld(0).GetPosition().x};
		EXPECT_EQ(positions, (std::vector<float>{1.0f, 0.0f, -1.0f, worldX}));
		RenderAndRead("two-boxes");
		EXPECT_EQ(Renderer().GetLateCount(), 0) << "the frame empties the late list";
		EXPECT_EQ(list.Count(), 0) << "and the collector";
		first.SetPosition({2.0f, 0.5f, 10.0f});
	}

	// A room's box is drawn as lines over the frame.
	Zeph::Room room({-1.0f, -1.0f, 9.0f}, {1.0f, 1.0f, 11.0f});
	room.InitDebugInstance();
	ASSERT_NE(room.GetDebugInstance(), nullptr) << TakeLog();
	room.Render();
	RenderAndRead("room");

	// The box's 36 triangle indices read as a line list give 18 lines: eight of the
	// twelve edges (the near and far faces' left and right edges and the four edges
	// running from near to far) and one diagonal on every face. Probed: edge middles.
	for (const Vector3<float>& edge :
	     {Vector3<float>(-1.0f, 0.0f, 9.0f), Vector3<float>(1.0f, 0.0f, 9.0f),
	      Vector3<float>(-1.0f, 1.0f, 10.0f), Vector3<float>(1.0f, -1.0f, 10.0f)})
	{
		const Pixel pixel = Project(edge);
		EXPECT_TRUE(LitNear(pixel, 0) > 0) << "edge at " << pixel.myX << ", " << pixel.myY;
		EXPECT_EQ(At(pixel.myX, pixel.myY)[1], 0) << "red only";
	}
	// The faces are not filled: the near face probed off its diagonal (which runs
	// from (-x, -y) to (+x, +y)), in its upper-left and lower-right quarters.
	EXPECT_EQ(LitNear(Project({-0.5f, 0.5f, 9.0f}), -1), 0);
	EXPECT_EQ(LitNear(Project({0.5f, -0.5f, 9.0f}), -1), 0);
	room.DestroyDebugInstance();

	// Rooms with equal bounds share their box model.
	Zeph::Room rooms[3] = {{{0.0f, 0.0f, 0.0f}, {2.0f, 4.0f, 6.0f}},
	                       {{0.0f, 0.0f, 0.0f}, {2.0f, 4.0f, 6.0f}},
	                       {{0.0f, 0.0f, 0.0f}, {2.0f, 4.0f, 7.0f}}};
	const size_t baseline = Factory().GetCount();
	for (Zeph::Room& each : rooms)
	{
		each.InitDebugInstance();
		ASSERT_NE(each.GetDebugInstance(), nullptr) << TakeLog();
	}
	EXPECT_EQ(rooms[0].GetDebugInstance()->GetModelNode(), rooms[1].GetDebugInstance()->GetModelNode());
	EXPECT_EQ(Factory().GetCount(), baseline + 2u);
}

// A resize remakes every frame-sized target at the new size (the G-buffer, the shadow resolve,
// each post stage's, the back buffer and depth) and keeps what does not follow the size: the
// SH volume, the shadow caster, the SSAO directions. A shown debug tile draws the new target.
// Refused sizes change nothing.
TEST_F(RendererTest, AResizeRemakesTheFrameSizedTargetsAndKeepsTheVolumeAndTheStagesSettings)
{
	LUMORA_RETURN_UNLESS(Start());
	Zeph::Engine* engine = Zeph::Engine::GetInstance();
	ASSERT_TRUE(
	    Zeph::FrameCapture::UploadUniformAmbient(0.5f, {-10.0f, -10.0f, -10.0f}, {20.0f, 20.0f, 20.0f}));
	const Zeph::ProbeHelper* volume = Renderer().GetProbeHelper();
	const Vector3<float> caster(0.3f, -0.9f, 0.1f);
	Renderer().GetShadowHelper().SetCasterDirection(caster);
	// The SSAO sample directions, component by component.
	const auto directionsOf = [] {
		std::vector<float> components;
		for (const Vector4<float>& direction : Renderer().GetSSAOManager().GetRandomVectors())
		{
			components.insert(components.end(), {direction.x, direction.y, direction.z, direction.w});
		}
		return components;
	};
	const std::vector<float> directions = directionsOf();
	Renderer().ShowDebugTexture("ssao");

	constexpr int width = 200;
	constexpr int height = 120;
	ASSERT_TRUE(engine->Resize(width, height)) << TakeLog();
	const auto sizeOf = [](const Zeph::Texture* aTexture) {
		return aTexture != nullptr ? std::pair(static_cast<int>(aTexture->GetImageInfo().myWidth),
		                                       static_cast<int>(aTexture->GetImageInfo().myHeight))
		                           : std::pair(0, 0);
	};
	const std::pair size(width, height);
	for (int slot = 0; slot < Zeph::DeferredRenderTargetHelper::SLOT_COUNT; ++slot)
	{
		EXPECT_EQ(sizeOf(Renderer().GetGBuffer().GetTarget(
		              static_cast<Zeph::DeferredRenderTargetHelper::Slot>(slot))),
		          size)
		    << "G-buffer slot " << slot;
	}
	EXPECT_EQ(sizeOf(Renderer().GetShadowHelper().GetTarget()), size);
	EXPECT_EQ(sizeOf(Renderer().GetSSAOManager().GetOcclusionBuffer()), size);
	EXPECT_EQ(sizeOf(Renderer().GetOutlineManager().GetTarget()), size);
	EXPECT_EQ(Renderer().GetHDRManager().GetLuminanceCount(),
	          Zeph::HDR_Manager::ComputeLuminanceCount(width, height));
	EXPECT_EQ(std::pair(Renderer().GetHDRManager().GetWidth(), Renderer().GetSSAOManager().GetHeight()),
	          size);
	EXPECT_EQ(std::pair(Renderer().GetWidth(), Renderer().GetHeight()), size);
	EXPECT_EQ(std::pair(engine->GetBackBufferView()->GetWidth(), engine->GetBackBufferView()->GetHeight()),
	          size);
	EXPECT_EQ(std::pair(engine->GetSetupInfo().myWidth, engine->GetSetupInfo().myHeight), size);
	EXPECT_EQ(Renderer().GetProbeHelper(), volume);
	EXPECT_NE(volume->GetView(0), nullptr);
	EXPECT_EQ(Renderer().GetShadowHelper().GetCasterDirection().x, caster.x);
	EXPECT_EQ(directionsOf(), directions);

	// Nothing is queued: the occlusion is open everywhere, and the tile in the top-left corner shows
	// it white, drawn from the new buffer.
	std::vector<uint8_t> pixels;
	int frameWidth = 0;
	int frameHeight = 0;
	ASSERT_TRUE(Zeph::FrameCapture::RenderAndRead({}, 1, pixels, frameWidth, frameHeight));
	ASSERT_EQ(std::pair(frameWidth, frameHeight), size);
	const uint8_t* tile = &pixels[(20 * width + 20) * 4];
	EXPECT_EQ(std::vector(tile, tile + 3), (std::vector<uint8_t>{255, 255, 255}));
	Gpu::SavePng("/tmp/lumora-renderer-tests/resized-tile.png", width, height,
	             TestSupport::Opaque(pixels).data());

	EXPECT_FALSE(engine->Resize(0, height));
	EXPECT_FALSE(engine->Resize(width, 1 << 20));
	EXPECT_FALSE(Renderer().Resize(-3, height));
	EXPECT_EQ(std::pair(Renderer().GetWidth(), Renderer().GetHeight()), size);
	EXPECT_EQ(std::pair(engine->GetBackBufferView()->GetWidth(), engine->GetBackBufferView()->GetHeight()),
	          size);
	EXPECT_EQ(sizeOf(Renderer().GetGBuffer().GetTarget(Zeph::DeferredRenderTargetHelper::ALBEDO)), size);
	const std::string log = TakeLog();
	EXPECT_THAT(log, testing::HasSubstr("Cannot draw a view of 0x120 pixels"));
	EXPECT_THAT(log, testing::HasSubstr("Cannot resize the frame to -3x120"));
}
