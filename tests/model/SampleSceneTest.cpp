// The sample models with their textures, drawn forward through the renderer and
// compared with a golden image: import, texture binding, the lit effect's "Render"
// technique, the camera and the frame all have to agree for it to match.

#include <memory>

#include "engine/Camera.h"
#include "engine/CameraInstance.h"
#include "engine/EngineFixture.h"
#include "engine/Instance.h"
#include "engine/ShaderFiles.h"
#include "model/ModelFactory.h"
#include "platform/gpu/Readback.h"
#include "renderer/Renderer.h"
#include "support/Golden.h"

TEST_F(EngineTest, TheSampleModelsRenderWithTheirTexturesAsTheGoldenImage)
{
	constexpr int width = 160;
	constexpr int height = 90;
	if (!CreateEngine(width, height))
	{
		return;
	}
	Zeph::Engine* engine = Zeph::Engine::GetInstance();
	Zeph::ModelFactory& factory = engine->GetModelFactory();
	const struct
	{
		const char* model;
		Vector3<float> position;
	} placements[] = {
	    {"data/models/floor_tile_concrete.dae", {-1.0f, 0.0f, -1.0f}},
	    {"data/models/floor_tile_concrete.dae", {1.0f, 0.0f, -1.0f}},
	    {"data/models/floor_tile_concrete.dae", {-1.0f, 0.0f, 1.0f}},
	    {"data/models/floor_tile_concrete.dae", {1.0f, 0.0f, 1.0f}},
	    {"data/models/crate.dae", {-1.0f, 0.0f, -0.4f}},
	    {"data/models/pillar.dae", {1.1f, 0.0f, 0.9f}},
	    {"data/models/sculpture_knot.dae", {0.2f, 0.0f, 0.4f}},
	};
	std::vector<std::unique_ptr<Zeph::Instance>> instances;
	for (const auto& placement : placements)
	{
		Zeph::ModelNode* model = factory.GetModel(placement.model);
		ASSERT_NE(model, nullptr) << placement.model << "\n" << TakeLog();
		instances.push_back(std::make_unique<Zeph::Instance>(model));
		instances.back()->SetPosition(placement.position);
	}
	// One directional light from above, front and right, for every lit effect.
	Zeph::Effect* lit = engine->GetEffectContainer().GetEffect(Zeph::ShaderFiles[Zeph::EFFECT_LIT_MODEL]);
	ASSERT_NE(lit, nullptr);
	lit->SetDirectionalLight(Vector4<float>(-0.45f, -0.8f, 0.4f, 0.0f),
	                         Vector4<float>(1.0f, 0.95f, 0.9f, 1.0f));

	Zeph::Camera camera(static_cast<float>(width) / static_cast<float>(height));
	Zeph::CameraInstance view(&camera);
	const Vector3<float> eye(3.2f, 2.6f, -3.6f);
	Vector3<float> direction = Vector3<float>(0.0f, 0.6f, 0.2f) - eye;
	view.LookTo(eye, direction.Normalize(), Vector3<float>(0.0f, 1.0f, 0.0f));
	engine->GetRenderer().GetRTC().SetCamera(view);
	for (const std::unique_ptr<Zeph::Instance>& instance : instances)
	{
		instance->Render();
	}
	engine->RenderScene();

	std::vector<uint8_t> pixels;
	ASSERT_TRUE(Gpu::ReadRenderTarget(engine->GetContext(), *engine->GetBackBufferView(), pixels));
	Gpu::SavePng(myScratch.File("sample-scene.png"), width, height, pixels.data());
	const std::string difference = TestSupport::CompareWithGolden("sample-scene", width, height, pixels);
	EXPECT_TRUE(difference.empty()) << difference;
}
