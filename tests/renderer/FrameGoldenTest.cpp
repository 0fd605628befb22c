// Golden images of the deferred frame (160 x 90, the tolerance of support/Golden.h:
// 5/255 per channel on all but 0.1 % of the pixels), each showing one pass's work in
// the small sample room. Each scene renders 20 frames so that the eye adaptation has
// settled, as it has in the editor.
#include <gtest/gtest.h>
#include <vector>

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

	static Zeph::PointLightData Point(const Vector3<float>& aPosition, float aFalloff, const Vector4<float>& aColor)
	{
		Zeph::PointLightData light;
		light.myPosition = aPosition;
		light.myFalloff = aFalloff;
		light.myColor = aColor;
		return light;
	}

	// A uniform irradiance volume over the room: every probe gives E / pi = aLevel.
	static void UploadUniformAmbient(float aLevel)
	{
		const auto pack = [](float aX, float aY, float aZ, float aW) {
			const auto byte = [](float aValue) {
				return static_cast<uint32_t>((std::clamp(aValue, -1.0f, 1.0f) + 1.0f) * 0.5f * 255.0f);
			};
			return byte(aX) | byte(aY) << 8 | byte(aZ) << 16 | byte(aW) << 24;
		};
		std::vector<uint32_t> blocks[7];
		for (int block = 0; block < 7; ++block)
		{
			// cAr, cAg, cAb carry the constant in w; every other coefficient is 0.
			blocks[block].assign(8, block < 3 ? pack(0.0f, 0.0f, 0.0f, aLevel) : pack(0.0f, 0.0f, 0.0f, 0.0f));
		}
		Zeph::Renderer& renderer = Zeph::Engine::GetInstance()->GetRenderer();
		ASSERT_TRUE(renderer.UploadSHToGPU(false, blocks, 2, 2, 2));
		renderer.SetVolumeBounds({-2.0f, 0.0f, -2.0f}, {4.0f, 3.0f, 4.0f});
	}
};
} // namespace

TEST_F(FrameGoldenTest, RoomLitByOnePointLight)
{
	if (!StartRoom())
	{
		return;
	}
	myPointLights.push_back(Point({0.2f, 1.6f, 0.3f}, 3.0f, {6.0f, 5.0f, 4.0f, 1.0f}));
	Render("golden-point-light", ourSettleFrames);
	ExpectGolden("frame-point-light");
}

TEST_F(FrameGoldenTest, SpotLightConeOnTheFloor)
{
	if (!StartRoom())
	{
		return;
	}
	mySpotLights.push_back(SpotDown({0.3f, 2.9f, 0.3f}, 4.0f, 0.96f, 0.88f));
	Render("golden-spot-light", ourSettleFrames);
	ExpectGolden("frame-spot-light");
}

TEST_F(FrameGoldenTest, DecalOnAWall)
{
	if (!StartRoom())
	{
		return;
	}
	Zeph::TextureContainer& textures = Zeph::Engine::GetInstance()->GetTextureContainer();
	Zeph::DecalData decal;
	decal.myPosition = Vector3<float>(-0.3f, 1.4f, 2.0f);
	decal.myNorm = Vector3<float>(0.0f, 0.0f, -1.0f);
	decal.mySize = 1.0f;
	decal.myDepth = 0.3f;
	decal.myTexture = textures.GetTexture("data/textures/metal_albedo.dds", true);
	decal.myNormalTexture = textures.GetTexture("data/textures/metal_normal.dds", false);
	ASSERT_NE(decal.myTexture, nullptr);
	myDecals.push_back(decal);
	myPointLights.push_back(Point({-0.2f, 1.5f, 1.0f}, 2.5f, {5.0f, 5.0f, 5.0f, 1.0f}));
	Render("golden-decal", ourSettleFrames);
	ExpectGolden("frame-decal");
}

TEST_F(FrameGoldenTest, PillarShadowsTheAmbientLight)
{
	if (!StartRoom())
	{
		return;
	}
	Place("data/models/pillar.dae", {0.4f, 0.0f, 0.2f});
	UploadUniformAmbient(0.6f);
	// The caster comes down steeply from behind the viewer's right.
	Renderer().GetShadowHelper().SetCasterDirection({-0.45f, -1.0f, 0.35f});
	Render("golden-pillar-shadow", ourSettleFrames);
	ExpectGolden("frame-pillar-shadow");
}

TEST_F(FrameGoldenTest, PostChainWithOcclusionBloomAndGrade)
{
	if (!StartRoom())
	{
		return;
	}
	Place("data/models/pillar.dae", {0.4f, 0.0f, 0.2f});
	UploadUniformAmbient(0.4f);
	ASSERT_TRUE(Renderer().SetColorGrading("data/grading/warm.dds"));
	// A hot small light for the bloom, near the crate for the occlusion in its corners.
	myPointLights.push_back(Point({-0.2f, 0.9f, 0.3f}, 1.5f, {40.0f, 30.0f, 18.0f, 1.0f}));
	Render("golden-post-chain", ourSettleFrames);
	ExpectGolden("frame-post-chain");
}

TEST_F(FrameGoldenTest, LateGizmoIsDrawnOverTheScene)
{
	if (!StartRoom())
	{
		return;
	}
	myPointLights.push_back(Point({0.2f, 1.6f, 0.3f}, 3.0f, {6.0f, 5.0f, 4.0f, 1.0f}));
	// A red box behind the crate: drawn late, it shows through the crate.
	Zeph::ModelNode* box = Zeph::Engine::GetInstance()->GetModelFactory().CreateAABB(
	    "gizmo", {0.15f, 0.15f, 0.15f}, {1.0f, 0.0f, 0.0f, 1.0f}, Gpu::PrimitiveTopology::TriangleList);
	ASSERT_NE(box, nullptr);
	myInstances.push_back(std::make_unique<Zeph::Instance>(box));
	Zeph::Instance* gizmo = myInstances.back().get();
	myInstances.pop_back();
	gizmo->SetPosition({-0.9f, 0.4f, 1.2f});
	myLateInstances.push_back(gizmo);
	Render("golden-late-gizmo", ourSettleFrames);
	ExpectGolden("frame-late-gizmo");
	delete gizmo;
}
