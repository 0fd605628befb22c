#pragma once
// A frame rendered through the engine headless: coloured boxes on a floor seen by
// the editor's camera, depth-tested, with one box drawn as a wireframe and the
// camera's info line in the top-left corner. It shows
// that the device, the effects, the camera and the back buffer work together on
// this machine, until the renderer draws levels.

#include <string>

namespace LumoraTool
{
// Writes the frame as a PNG; prints what went wrong and returns false otherwise.
bool RenderDemoFrame(const std::string& aPath, int aWidth, int aHeight);
} // namespace LumoraTool
