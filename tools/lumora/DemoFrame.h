#pragma once
// A frame rendered through the engine headless: the demo scene (DemoScene.h) drawn
// by the deferred renderer after 20 frames of eye adaptation. It shows that import,
// textures, effects, lights, decals, the camera and the frame work together on this
// machine, until the editor draws levels.

#include <string>

namespace LumoraTool
{
// Writes the frame as a PNG; prints what went wrong and returns false otherwise.
bool RenderDemoFrame(const std::string& aPath, int aWidth, int aHeight);
} // namespace LumoraTool
