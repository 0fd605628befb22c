#pragma once
// TextureSaver: a GPU texture written to a DDS file whole, every array slice (cube face)
// and every mip, in the texture's own format, the way D3DX11 saved a texture to a file.
//
//   if (!Gpu::SaveTextureToDds(context, *cube.GetTexture(), "data/Cubemaps/level/hall.dds"))
//   {
//       ... reported already, with the file name ...
//   }
//
// A cube keeps its cube flag, so the file loads back as a cube (Gpu::CreateTextureFromFile).
// The file is written through a temporary that replaces the old one only when complete,
// and missing directories are created. Block-compressed and depth formats are refused.
// The read waits for the GPU to finish the texture.

#include <string>

namespace Gpu
{
class Context;
class Texture;

// With aStagedOut the file is written whole to a temporary beside aPath, whose name is
// returned there, and ReplaceWithStaged later puts it in aPath's place (or the caller
// removes it): writers that replace several files together stage them all first.
bool SaveTextureToDds(Context& aContext, const Texture& aTexture, const std::string& aPath,
                      std::string* aStagedOut = nullptr);
bool ReplaceWithStaged(const std::string& aStaged, const std::string& aPath);
} // namespace Gpu
