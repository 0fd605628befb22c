#pragma once
// FrameCapture: renders one frame headless and reads it back: the camera goes to the
// collector and the full-screen passes, the frame runs as Engine::RenderScene runs it,
// and the back buffer comes back as RGBA8 (row 0 at the top, the stored sRGB bytes).
//
//   Zeph::Engine::Create(0, 1280, 720);                  // no window
//   const auto queue = [&] {
//       Zeph::FrameCapture::SetCamera(camera);
//       instance->Render();                              // queue the scene
//       engine->GetRenderer().GetRTC().AddPointLight(light);
//   };
//   Zeph::FrameCapture::RenderToPng(queue, 20, "out/frame.png");
//
// Every frame empties the queues, so each frame is queued again. The eye adaptation
// moves a tenth of the way per tone-mapping step, so a picture of a scene seen for a
// moment wants a few frames (20 leave about 1 % of the start exposure's influence).
#include <cstdint>
#include <functional>

#include "core/Vector3.h"
#include <string>
#include <vector>

namespace Zeph
{
class CameraInstance;

namespace FrameCapture
{
// The collector's camera and the full-screen passes' camera (far plane, frustum corners).
void SetCamera(const CameraInstance& aCamera);
// Renders aFrameCount frames (at least one), each queued by aQueue, and reads back the
// last one's back buffer; false without an engine.
bool RenderAndRead(const std::function<void()>& aQueue, int aFrameCount, std::vector<uint8_t>& somePixelsOut,
                   int& aWidthOut, int& aHeightOut);
// The same into a PNG (written to a temporary and renamed), opaque.
bool RenderToPng(const std::function<void()>& aQueue, int aFrameCount, const std::string& aPath);
// Stands in for a baked volume: a 2 x 2 x 2 irradiance volume over the given box in
// which every direction receives irradiance / pi = aLevel (grey, clamped to 0..1).
bool UploadUniformAmbient(float aLevel, const Vector3<float>& aWorldMin, const Vector3<float>& aWorldSize);
} // namespace FrameCapture
} // namespace Zeph
