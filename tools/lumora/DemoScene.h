#pragma once
// DemoScene: the sample room used for the demo frame and the frame benchmark: the
// large room shell with floor tiles, crates, pillars, an arch and the knot sculpture
// imported from data/, three point lights, a spot light over the sculpture, a decal
// on a wall and a dim even ambient standing in for a bake, seen from a corner, with
// the camera's info line on top. Queue submits one frame of it.
//
//   LumoraTool::DemoScene scene;
//   if (scene.Init(*Zeph::Engine::GetInstance())) { scene.Queue(); engine->RenderScene(); }
//   scene.Destroy();
#include <memory>
#include <vector>

#include "engine/Camera.h"
#include "engine/CameraInstance.h"
#include "renderer/DecalData.h"
#include "renderer/PointLightData.h"
#include "renderer/SpotLightData.h"

namespace Zeph
{
class Engine;
class Instance;
class Text;
} // namespace Zeph

namespace LumoraTool
{
class DemoScene
{
public:
	DemoScene();
	~DemoScene();

	// Loads the models (reporting a missing one on stderr) and sets up lights, decal,
	// ambient and camera; false when a model cannot be loaded.
	bool Init(Zeph::Engine& anEngine);
	void Destroy();
	// Submits the camera, the instances, the lights, the decal and the info line.
	void Queue();
	// The camera Queue submits (the frame benchmark turns it to time a moving view).
	Zeph::CameraInstance& GetCamera() { return myCamera; }

private:
	Zeph::Engine* myEngine = nullptr;
	std::vector<std::unique_ptr<Zeph::Instance>> myInstances;
	std::vector<Zeph::PointLightData> myPointLights;
	std::vector<Zeph::SpotLightData> mySpotLights;
	Zeph::DecalData myDecal;
	Zeph::Camera myLens;
	Zeph::CameraInstance myCamera;
	std::unique_ptr<Zeph::Text> myInfo;
};
} // namespace LumoraTool
