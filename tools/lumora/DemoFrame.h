#pragma once
// A frame rendered through the engine headless: the sample models (floor tiles, a
// crate, a pillar, an arch, the knot sculpture, a room shell) imported from data/,
// placed as instances, lit by one directional light and drawn by the renderer, with
// the camera's info line on top. It shows that import, textures, effects, the camera
// and the frame work together on this machine, until the editor draws levels.

#include <string>

namespace LumoraTool
{
// Writes the frame as a PNG; prints what went wrong and returns false otherwise.
bool RenderDemoFrame(const std::string& aPath, int aWidth, int aHeight);
} // namespace LumoraTool
