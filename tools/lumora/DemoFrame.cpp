#include "DemoFrame.h"

#include <cstdio>
#include <memory>
#include <vector>

#include "core/Vector2.h"
#include "core/Vector3.h"
#include "engine/Camera.h"
#include "engine/CameraInstance.h"
#include "engine/Engine.h"
#include "engine/Instance.h"
#include "engine/ShaderFiles.h"
#include "engine/Text.h"
#include "model/ModelFactory.h"
#include "platform/gpu/Readback.h"
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

bool RenderWithEngine(Zeph::Engine& anEngine, const std::string& aPath, int aWidth, int aHeight)
{
	std::vector<std::unique_ptr<Zeph::Instance>> instances;
	for (const Placement& placement : ourScene)
	{
		Zeph::ModelNode* model = anEngine.GetModelFactory().GetModel(placement.myModel);
		if (model == nullptr)
		{
			std::fprintf(stderr, "lumora: cannot load %s (is data/ here?)\n", placement.myModel);
			return false;
		}
		instances.push_back(std::make_unique<Zeph::Instance>(model));
		instances.back()->SetPosition(placement.myPosition);
	}
	if (Zeph::Effect* lit =
	        anEngine.GetEffectContainer().GetEffect(Zeph::ShaderFiles[Zeph::EFFECT_LIT_MODEL]))
	{
		lit->SetDirectionalLight(Vector4<float>(-0.45f, -0.8f, 0.4f, 0.0f),
		                         Vector4<float>(1.0f, 0.95f, 0.9f, 1.0f));
	}

	Zeph::Camera camera;
	Zeph::CameraInstance view(&camera);
	const Vector3<float> eye(3.6f, 2.7f, -4.2f);
	Vector3<float> direction = Vector3<float>(0.0f, 0.9f, 1.2f) - eye;
	view.LookTo(eye, direction.Normalize(), Vector3<float>(0.0f, 1.0f, 0.0f));
	anEngine.GetRenderer().GetRTC().SetCamera(view);
	for (const std::unique_ptr<Zeph::Instance>& instance : instances)
	{
		instance->Render();
	}
	// The editor's info line, queued with the frame's late list.
	std::unique_ptr<Zeph::Text> info;
	if (Zeph::Font* font = anEngine.GetFontContainer().GetFont("Arial"))
	{
		info = std::make_unique<Zeph::Text>(font);
		info->SetPosition(Vector2<float>(8.0f, 8.0f));
		info->SetSize(14.0f);
		info->SetText("Camera Position: 3.6 2.7 -4.2");
		info->Render(false);
	}
	anEngine.RenderScene();

	std::vector<uint8_t> pixels;
	if (!Gpu::ReadRenderTarget(anEngine.GetContext(), *anEngine.GetBackBufferView(), pixels) ||
	    !Gpu::SavePng(aPath, aWidth, aHeight, pixels.data()))
	{
		std::fprintf(stderr, "lumora: cannot write %s\n", aPath.c_str());
		return false;
	}
	return true;
}
} // namespace

bool RenderDemoFrame(const std::string& aPath, int aWidth, int aHeight)
{
	Gpu::WindowHandle window = 0;
	bool result = false;
	if (Zeph::Engine::Create(window, aWidth, aHeight))
	{
		result = RenderWithEngine(*Zeph::Engine::GetInstance(), aPath, aWidth, aHeight);
	}
	else
	{
		std::fprintf(stderr, "lumora: the engine could not start (no OpenGL 4.5 core context?)\n");
	}
	Zeph::Engine::ShutDown();
	return result;
}
} // namespace LumoraTool
