#pragma once
// A level rendered through the editor facade headless: LumoraWrapper::Create without a
// window, ParseLevel, the editor camera walked into the level with the camera controls,
// a few frames of the front end's loop (Update, Render) so the eye adaptation settles,
// and the back buffer read back into a PNG. The facade writes its log, DebugLogger.txt,
// into the working directory.
#include <string>

namespace LumoraTool
{
// Writes the frame as a PNG; prints what went wrong and returns false otherwise.
// With aBounces above 0 the level's ambient light is baked first (written to the
// level's ambient.sh) and the level loaded again, so the picture shows it.
bool RenderLevelFrame(const std::string& aLevel, const std::string& aPath, int aWidth, int aHeight,
                      int aBounces = 0);
} // namespace LumoraTool
