// One frame of a level through the editor facade headless: the level loaded, the
// editor camera placed, a few frames of the front end's loop (Update, Render) so the
// eye adaptation settles, and the back buffer read back into a PNG.
#include <cstdio>
#include <filesystem>
#include <vector>

#include "Commands.h"
#include "EditorSession.h"
#include "LevelCamera.h"
#include "editor/LumoraMode.h"
#include "engine/Engine.h"
#include "platform/gpu/Readback.h"
#include "platform/paths/Paths.h"

namespace LumoraTool
{
namespace
{
int ModeNumber(const std::string& aMode)
{
	if (aMode == "node")
	{
		return Lumora::NODE_MODE;
	}
	return aMode == "decal" ? Lumora::DECAL_MODE : Lumora::LIGHT_MODE;
}
} // namespace

int RunRender(const RenderOptions& someOptions)
{
	EditorSession session;
	if (!session.Start(someOptions.myLevel, someOptions.myWidth, someOptions.myHeight) ||
	    !session.Load(someOptions.myLevel))
	{
		return 1;
	}
	if (std::error_code ignored;
	    !std::filesystem::exists(Paths::Resolve("data/XML/levels/" + someOptions.myLevel + "/ambient.sh"), ignored))
	{
		std::printf("note: level %s has no baked ambient light yet (lumora bake %s makes ambient.sh)\n",
		            someOptions.myLevel.c_str(), someOptions.myLevel.c_str());
	}
	Lumora::LumoraWrapper& editor = session.Editor();
	editor.SetIsLightMode(ModeNumber(someOptions.myMode));
	if (someOptions.myCamera)
	{
		editor.PlaceCamera(*someOptions.myCamera, someOptions.myYaw, someOptions.myPitch);
	}
	else
	{
		WalkIntoTheFirstRoom(editor);
	}
	// A picture of the lit level: without the light gizmos and light volume outlines.
	editor.RenderMeshes(false);
	for (int frame = 0; frame < 20; ++frame)
	{
		editor.Update(16.0f);
		editor.Render();
	}
	Zeph::Engine* engine = Zeph::Engine::GetInstance();
	std::vector<uint8_t> pixels;
	engine->MakeContextCurrent();
	bool result = Gpu::ReadRenderTarget(engine->GetContext(), *engine->GetBackBufferView(), pixels);
	engine->ReleaseContext();
	for (size_t alpha = 3; alpha < pixels.size(); alpha += 4)
	{
		pixels[alpha] = 255;
	}
	result = result &&
	         Gpu::SavePng(someOptions.myOutput, someOptions.myWidth, someOptions.myHeight, pixels.data());
	if (!result)
	{
		PrintError("cannot write " + someOptions.myOutput);
		return 1;
	}
	std::printf("level %s: %d rooms, %d entities, %d point and %d spot lights, %d decals, %d path nodes\n",
	            someOptions.myLevel.c_str(), editor.GetRooms().Count(), editor.GetEntities().Count(),
	            editor.GetPointLights().Count(), editor.GetSpotLights().Count(), editor.GetDecals().Count(),
	            editor.GetNodes().Count());
	std::printf("wrote %s (%dx%d, %s mode)\n", someOptions.myOutput.c_str(), someOptions.myWidth,
	            someOptions.myHeight, someOptions.myMode.c_str());
	if (session.GetProblemCount() > 0)
	{
		PrintError("rendering reported problems:");
		session.PrintProblems();
		return 1;
	}
	return 0;
}
} // namespace LumoraTool
