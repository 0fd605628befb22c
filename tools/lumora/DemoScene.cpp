#include "DemoScene.h"

#include <cstdio>

#include "core/Vector2.h"
#include "core/Vector3.h"
#include "engine/Engine.h"
#include "engine/Instance.h"
#include "engine/Text.h"
#include "engine/TextureContainer.h"
#include "model/ModelFactory.h"
#include "renderer/FrameCapture.h"
#include "renderer/Renderer.h"

namespace LumoraTool
{
namespace
{
struct Placement
{
	const char* myModel;
	Vector3<float> myPosition;
};

const Placement ourScene[] = {
    {"data/models/room_large.dae", {0.0f, 0.0f, 0.0f}},
    {"data/models/floor_tile_marble.dae", {-0.5f, 0.005f, 1.5f}},
    {"data/models/floor_tile_marble.dae", {0.5f, 0.005f, 1.5f}},
    {"data/models/crate.dae", {-2.2f, 0.0f, 0.8f}},
    {"data/models/crate.dae", {-2.4f, 0.0f, -0.4f}},
    {"data/models/pillar.dae", {2.4f, 0.0f, 2.0f}},
    {"data/models/pillar.dae", {2.4f, 0.0f, -1.5f}},
    {"data/models/arch.dae", {0.0f, 0.0f, 3.0f}},
    {"data/models/sculpture_knot.dae", {0.0f, 0.0f, 1.5f}},
};

Zeph::PointLightData PointLight(const Vector3<float>& aPosition, float aFalloff, const Vector4<float>& aColor)
{
	Zeph::PointLightData light;
	light.myPosition = aPosition;
	light.myFalloff = aFalloff;
	light.myColor = aColor;
	return light;
}

// A spot light at aPosition pointing straight down.
Zeph::SpotLightData SpotLightDown(const Vector3<float>& aPosition, float aFalloff,
                                  const Vector4<float>& aColor)
{
	Zeph::SpotLightData spot;
	spot.myFalloff = aFalloff;
	spot.myAngles = Vector2<float>(0.95f, 0.8f);
	spot.myColor = aColor;
	// Rows: right (1, 0, 0), up (0, 0, 1), forward (0, -1, 0).
	float* m = spot.myOrientation.myMatrix;
	m[0] = 1.0f;
	m[1] = m[2] = 0.0f;
	m[4] = m[5] = 0.0f;
	m[6] = 1.0f;
	m[8] = m[10] = 0.0f;
	m[9] = -1.0f;
	spot.myOrientation.SetPosition(aPosition);
	return spot;
}

} // namespace

DemoScene::DemoScene() : myCamera(&myLens)
{
}

DemoScene::~DemoScene() = default;

bool DemoScene::Init(Zeph::Engine& anEngine)
{
	Destroy();
	myEngine = &anEngine;
	for (const Placement& placement : ourScene)
	{
		Zeph::ModelNode* model = anEngine.GetModelFactory().GetModel(placement.myModel);
		if (model == nullptr)
		{
			std::fprintf(stderr, "lumora: cannot load %s (is data/ here?)\n", placement.myModel);
			Destroy();
			return false;
		}
		myInstances.push_back(std::make_unique<Zeph::Instance>(model));
		myInstances.back()->SetPosition(placement.myPosition);
	}
	// Until the room is baked, a dim even ambient over it.
	Zeph::FrameCapture::UploadUniformAmbient(0.12f, {-5.0f, 0.0f, -5.0f}, {10.0f, 4.0f, 10.0f});
	myPointLights = {
	    PointLight({-2.6f, 2.4f, 0.2f}, 4.5f, {7.0f, 4.6f, 2.6f, 1.0f}),
	    PointLight({2.8f, 2.2f, 0.3f}, 4.0f, {2.2f, 3.4f, 6.0f, 1.0f}),
	    PointLight({0.0f, 3.2f, 3.8f}, 4.0f, {5.0f, 4.6f, 4.2f, 1.0f}),
	};
	mySpotLights = {SpotLightDown({0.0f, 3.6f, 1.5f}, 5.0f, {9.0f, 8.0f, 6.5f, 1.0f})};
	myDecal.myPosition = Vector3<float>(-5.0f, 1.6f, 1.8f);
	myDecal.myNorm = Vector3<float>(1.0f, 0.0f, 0.0f);
	myDecal.mySize = 1.4f;
	myDecal.myDepth = 0.4f;
	myDecal.myTexture = anEngine.GetTextureContainer().GetTexture("data/textures/marble_albedo.dds", true);
	myDecal.myNormalTexture =
	    anEngine.GetTextureContainer().GetTexture("data/textures/marble_normal.dds", false);

	const Vector3<float> eye(3.6f, 2.7f, -4.2f);
	Vector3<float> direction = Vector3<float>(0.0f, 0.9f, 1.2f) - eye;
	myCamera.LookTo(eye, direction.Normalize(), Vector3<float>(0.0f, 1.0f, 0.0f));
	if (Zeph::Font* font = anEngine.GetFontContainer().GetFont("Arial"))
	{
		myInfo = std::make_unique<Zeph::Text>(font);
		myInfo->SetPosition(Vector2<float>(8.0f, 8.0f));
		myInfo->SetSize(14.0f);
		myInfo->SetText("Camera Position: 3.6 2.7 -4.2");
	}
	return true;
}

void DemoScene::Destroy()
{
	myInstances.clear();
	myPointLights.clear();
	mySpotLights.clear();
	myDecal = Zeph::DecalData();
	myInfo.reset();
	myEngine = nullptr;
}

void DemoScene::Queue()
{
	if (myEngine == nullptr)
	{
		return;
	}
	Zeph::FrameCapture::SetCamera(myCamera);
	for (const std::unique_ptr<Zeph::Instance>& instance : myInstances)
	{
		instance->Render();
	}
	Zeph::RenderTargetCollector& collector = myEngine->GetRenderer().GetRTC();
	for (const Zeph::PointLightData& light : myPointLights)
	{
		collector.AddPointLight(light);
	}
	for (const Zeph::SpotLightData& light : mySpotLights)
	{
		collector.AddSpotLight(light);
	}
	if (myDecal.myTexture != nullptr)
	{
		collector.AddDecal(myDecal);
	}
	if (myInfo)
	{
		myInfo->Render(false);
	}
}
} // namespace LumoraTool
