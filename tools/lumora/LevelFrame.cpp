#include "LevelFrame.h"

#include <chrono>
#include <cmath>
#include <cstdio>
#include <filesystem>
#include <vector>

#include "editor/LumoraWrapper.h"
#include "editor/StringConversion.h"
#include "engine/CameraInstance.h"
#include "engine/Engine.h"
#include "platform/gpu/Readback.h"

namespace LumoraTool
{
namespace
{
constexpr float ourHalfPi = 1.57079633f;

// From the start position (0, 10, 0), looking along +z: turned round toward -z (turns
// are about the camera's own up, so they come first), back over the first room's edge,
// down at a steep angle (the camera's pitch is limited) to eye height in the room, a
// slight downward tilt, and backed off toward the wall.
void PlaceCamera(Lumora::LumoraWrapper& anEditor)
{
	const auto forward = [&anEditor] {
		return anEditor.GetCameraInstance()->GetActualOrientation().GetForward();
	};
	constexpr float steep = 0.9f;
	anEditor.YawCamera(2.0f * ourHalfPi);
	anEditor.Zoom(-5.0f);
	anEditor.PitchCamera(steep);
	const float down = forward().y < 0.0f ? 1.0f : -1.0f;
	if (down < 0.0f)
	{
		anEditor.PitchCamera(-2.0f * steep);
	}
	anEditor.Zoom(7.5f / std::sin(steep));
	anEditor.PitchCamera(-down * (steep - 0.18f));
	anEditor.Zoom(-4.5f);
}
} // namespace

bool RenderLevelFrame(const std::string& aLevel, const std::string& aPath, int aWidth, int aHeight,
                      int aBounces)
{
	if (!std::filesystem::is_directory("data/XML/levels/" + aLevel))
	{
		std::fprintf(stderr, "lumora: no level '%s' under data/XML/levels/ (run from the repository root)\n",
		             aLevel.c_str());
		return false;
	}
	if (!Lumora::LumoraWrapper::Create(0, aWidth, aHeight))
	{
		std::fprintf(stderr, "lumora: the editor could not start (see DebugLogger.txt)\n");
		return false;
	}
	Lumora::LumoraWrapper& editor = *Lumora::LumoraWrapper::GetInstance();
	editor.ParseLevel(Lumora::ToWide(aLevel));
	if (aBounces > 0)
	{
		const auto start = std::chrono::steady_clock::now();
		editor.BakeAmbient(Lumora::ToWide(aLevel), aBounces, false);
		const double seconds =
		    std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
		std::printf("baked the ambient light of %s, %d bounce%s, in %.1f s\n", aLevel.c_str(), aBounces,
		            aBounces == 1 ? "" : "s", seconds);
		editor.ParseLevel(Lumora::ToWide(aLevel));
	}
	PlaceCamera(editor);
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
	result = result && Gpu::SavePng(aPath, aWidth, aHeight, pixels.data());
	if (!result)
	{
		std::fprintf(stderr, "lumora: cannot write %s\n", aPath.c_str());
	}
	else
	{
		std::printf(
		    "level %s: %d rooms, %d entities, %d point and %d spot lights, %d decals, %d path nodes\n",
		    aLevel.c_str(), editor.GetRooms().Count(), editor.GetEntities().Count(),
		    editor.GetPointLights().Count(), editor.GetSpotLights().Count(), editor.GetDecals().Count(),
		    editor.GetNodes().Count());
	}
	Lumora::LumoraWrapper::ShutDown();
	return result;
}
} // namespace LumoraTool
