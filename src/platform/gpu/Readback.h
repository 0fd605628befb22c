#pragma once
// Readback: a render target's pixels back in memory, row 0 at the top.
//
//   std::vector<uint8_t> rgba;
//   if (Gpu::ReadRenderTarget(device.GetContext(), *view, rgba))
//       Gpu::SavePng("/tmp/frame.png", view->GetWidth(), view->GetHeight(), rgba.data());
//
// Each read waits for the GPU (0.1-0.3 ms on llvmpipe even for a tiny target):
// read one atlas rather than many small targets. sRGB targets read back their
// stored (encoded) values, as Direct3D's staging copies do.

#include <cstdint>
#include <string>
#include <vector>

namespace Gpu
{
class Context;
class RenderTargetView;
class Texture;

// RGBA8 bytes (B8G8R8A8 targets come back in R, G, B, A order too) of an 8-bit
// colour target; false, reported, for other formats.
bool ReadRenderTarget(Context& aContext, const RenderTargetView& aView, std::vector<uint8_t>& someBytes);
// RGBA floats of any colour target; 8-bit targets come back as 0..1.
bool ReadRenderTarget(Context& aContext, const RenderTargetView& aView, std::vector<float>& someValues);
// RGBA floats of mip aMip of a colour texture, slices aFirstSlice to aFirstSlice + aSliceCount - 1
// (array layers, cube faces +X..-Z, or depth slices of a 3D texture) one after another, each row 0
// first; channels the format lacks read as 0 (alpha as 1). Reported and false for a missing range.
bool ReadTexture(const Texture& aTexture, int aMip, int aFirstSlice, int aSliceCount,
                 std::vector<float>& someValues);

// Writes RGBA8 pixels (row 0 at the top) as a PNG, through a temporary file that
// replaces aPath only when complete. Missing directories are created.
bool SavePng(const std::string& aPath, int aWidth, int aHeight, const uint8_t* somePixels);
} // namespace Gpu
