// Golden images of the deferred frame (160 x 90, the tolerance of support/Golden.h:
// 5/255 per channel on all but 0.1 % of the pixels), each showing one pass's work in
// the small sample room. Each scene renders 20 frames so that the eye adaptation has
// settled, as it has in the editor.
#include <gtest/gtest.h>

#include "FrameFixture.h"
#include "engine/TextureContainer.h"
#include "model/ModelFactory.h"

using namespace FrameTesting;

namespace
{
constexpr int ourSettleFrames = 20;

class FrameGoldenTest : public FrameTest
{
protected:
	// The small room with a crate, seen from a corner at eye height.
	bool StartRoom(int aShadowQuality = 1)
	{
		if (!Start(aShadowQuality))
		{
			return false;
		}
		Place("data/models/room_small.dae", {0.0f, 0.0f, 0.0f});
		Place("data/models/crate.dae", {-0.6f, 0.0f, 0.7f});
		Look({1.6f, 1.7f, -1.7f}, {-0.3f, 0.7f, 0.6f});
		return true;
	}

	static Zeph::PointLightData Point(const Vector3<float>& aPosition, float aFalloff,
	                                  const Vector4<float>& aColor)
	{
		return {.myFalloff = aFalloff, .myPosition = aPosition, .myColor = aColor};
	}
};
} // namespace

TEST_F(FrameGoldenTest, RoomLitByOnePointLight)
{
	LUMORA_RETURN_UNLESS(StartRoom());
	myPointLights.push_back(Point({0.2f, 1.6f, 0.3f}, 3.0f, {6.0f, 5.0f, 4.0f, 1.0f}));
	Render("golden-point-light", ourSettleFrames);
	ExpectGolden("frame-point-light");
}

TEST_F(FrameGoldenTest, SpotLightConeOnTheFloor)
{
	LUMORA_RETURN_UNLESS(StartRoom());
	mySpotLights.push_back(SpotDown({0.3f, 2.9f, 0.3f}, 4.0f, 0.96f, 0.88f));
	Render("golden-spot-light", ourSettleFrames);
	ExpectGolden("frame-spot-light");
}

TEST_F(FrameGoldenTest, DecalOnAWall)
{
	LUMORA_RETURN_UNLESS(StartRoom());
	Zeph::TextureContainer& textures = Zeph::Engine::GetInstance()->GetTextureContainer();
	Zeph::DecalData decal;
	// A marble plate on the brick wall at the left of the picture (x = -2, facing +X).
	decal.myPosition = Vector3<float>(-2.0f, 1.3f, -0.2f);
	decal.myNorm = Vector3<float>(1.0f, 0.0f, 0.0f);
	decal.mySize = 0.9f;
	decal.myDepth = 0.3f;
	decal.myTexture = textures.GetTexture("data/textures/marble_albedo.dds", true);
	decal.myNormalTexture = textures.GetTexture("data/textures/marble_normal.dds", false);
	ASSERT_NE(decal.myTexture, nullptr);
	myPointLights.push_back(Point({-0.8f, 1.6f, -0.2f}, 3.0f, {4.0f, 4.0f, 4.0f, 1.0f}));
	myDecals.push_back(decal);
	Render("golden-decal", ourSettleFrames);
	ExpectGolden("frame-decal");
}

TEST_F(FrameGoldenTest, PillarShadowsTheAmbientLight)
{
	LUMORA_RETURN_UNLESS(StartRoom());
	Place("data/models/pillar.dae", {0.4f, 0.0f, 0.2f});
	ASSERT_TRUE(Zeph::FrameCapture::UploadUniformAmbient(0.6f, {-2.0f, 0.0f, -2.0f}, {4.0f, 3.0f, 4.0f}));
	// The caster's light travels down and to the viewer's right, so the pillar's shadow
	// crosses the floor at the right of its base.
	Renderer().GetShadowHelper().SetCasterDirection({0.45f, -1.0f, 0.3f});
	Render("golden-pillar-shadow", ourSettleFrames);
	ExpectGolden("frame-pillar-shadow");
}

TEST_F(FrameGoldenTest, PostChainWithOcclusionBloomAndGrade)
{
	LUMORA_RETURN_UNLESS(StartRoom());
	Place("data/models/pillar.dae", {0.4f, 0.0f, 0.2f});
	ASSERT_TRUE(Zeph::FrameCapture::UploadUniformAmbient(0.4f, {-2.0f, 0.0f, -2.0f}, {4.0f, 3.0f, 4.0f}));
	ASSERT_TRUE(Renderer().SetColorGrading("data/grading/warm.dds"));
	// A hot small light for the bloom, near the crate for the occlusion in its corners.
	myPointLights.push_back(Point({-0.2f, 0.9f, 0.3f}, 1.5f, {40.0f, 30.0f, 18.0f, 1.0f}));
	Render("golden-post-chain", ourSettleFrames);
	ExpectGolden("frame-post-chain");
}

TEST_F(FrameGoldenTest, LateGizmoIsDrawnOverTheScene)
{
	LUMORA_RETURN_UNLESS(StartRoom());
	myPointLights.push_back(Point({0.2f, 1.6f, 0.3f}, 3.0f, {6.0f, 5.0f, 4.0f, 1.0f}));
	// A red box behind the crate: drawn late, it shows through the crate.
	Zeph::ModelNode* box = Zeph::Engine::GetInstance()->GetModelFactory().CreateAABB(
	    "gizmo", {0.15f, 0.15f, 0.15f}, {1.0f, 0.0f, 0.0f, 1.0f}, Gpu::PrimitiveTopology::TriangleList);
	ASSERT_NE(box, nullptr);
	auto gizmo = std::make_unique<Zeph::Instance>(box);
	gizmo->SetPosition({-0.9f, 0.4f, 1.2f});
	myLateInstances.push_back(gizmo.get());
	Render("golden-late-gizmo", ourSettleFrames);
	ExpectGolden("frame-late-gizmo");
}

TEST_F(FrameGoldenTest, SampleModelsShowTheirTexturesAndMaterials)
{
	LUMORA_RETURN_UNLESS(Start());
	// Concrete tiles, a wooden crate, a marble pillar and the two-material knot (metal
	// and marble), under a warm and a cool light and a dim ambient.
	Place("data/models/floor_tile_concrete.dae", {-1.0f, 0.0f, -1.0f});
	Place("data/models/floor_tile_concrete.dae", {1.0f, 0.0f, -1.0f});
	Place("data/models/floor_tile_concrete.dae", {-1.0f, 0.0f, 1.0f});
	Place("data/models/floor_tile_concrete.dae", {1.0f, 0.0f, 1.0f});
	Place("data/models/crate.dae", {-1.0f, 0.0f, -0.4f});
	Place("data/models/pillar.dae", {1.1f, 0.0f, 0.9f});
	Place("data/models/sculpture_knot.dae", {0.2f, 0.0f, 0.4f});
	ASSERT_TRUE(Zeph::FrameCapture::UploadUniformAmbient(0.15f, {-2.0f, 0.0f, -2.0f}, {4.0f, 3.0f, 4.0f}));
	myPointLights.push_back(Point({1.2f, 2.0f, -1.2f}, 4.0f, {6.0f, 5.0f, 3.6f, 1.0f}));
	myPointLights.push_back(Point({-1.4f, 1.6f, 1.4f}, 3.5f, {1.6f, 2.4f, 4.0f, 1.0f}));
	Look({3.2f, 2.6f, -3.6f}, {0.0f, 0.6f, 0.2f});
	Render("golden-sample-models", ourSettleFrames);
	ExpectGolden("frame-sample-models");
}
