#pragma once
// TextureLoader: DDS images and files made into GPU textures, the way D3DX11 made
// shader resources from files.
//
//   Dds::ImageInfo info;
//   std::unique_ptr<Gpu::Texture> cube = Gpu::CreateTextureFromFile(context, "data/Cubemaps/1.dds", &info);
//   if (!cube) { ... reported already, with the file name ... }
//   Gpu::ShaderResourceView* view = cube->GetDefaultShaderResourceView(); // a cube over all mips
//   ...
//   cube->Destroy();                   // the caller owns the texture and destroys it
//
// The texture holds every subresource of the image in the image's own format, so
// an sRGB file decodes on sampling and a BC file stays compressed:
//   - a 2D image becomes a 2D texture, a 2D array when its array size is above 1;
//     a 1D image becomes a 2D texture one row high (a 1D array, a 2D array);
//   - a cube image (the TEXTURECUBE flag) becomes a cube with faces +X, -X, +Y,
//     -Y, +Z, -Z in file order, a cube array when it holds more than one cube;
//   - a volume becomes a 3D texture.
// Texture::GetDefaultShaderResourceView() is the view that matches the image: 2D,
// 2D array, cube, cube array or 3D, over every mip and slice. Other views (one
// face through a 2D-array view of a cube, an sRGB view) come from
// Texture::CreateShaderResourceView().
//
// One format is converted rather than refused: B8G8R8X8_UNORM, common in older
// files, has no GL form of its own and becomes B8G8R8A8_UNORM with alpha 1, which
// is what Direct3D samples from it. The texture's desc then says B8G8R8A8_UNORM;
// the image information keeps the file's format.

#include <memory>
#include <string>

#include "platform/dds/Image.h"
#include "platform/dds/ImageInfo.h"
#include "platform/gpu/Texture.h"

namespace Gpu
{
class Context;

// Null, reported with aLabel and the reason, when the image is empty, its format
// has no GL form, it exceeds the GL limits, or the storage or an upload fails.
// aLabel names the texture in reports and for GL debug output.
std::unique_ptr<Texture> CreateTextureFromImage(Context& aContext, const Dds::Image& anImage,
                                                const std::string& aLabel);

// Reads the file (through Dds::LoadFromFile, so each path component matches
// case-insensitively) and makes the texture, labelled with the file name.
// anInfoOut, when not null, receives the image information whenever the file
// could be read, even when no texture could be made of it. Null, reported with
// the file name, when the file is missing or damaged or the texture fails.
std::unique_ptr<Texture> CreateTextureFromFile(Context& aContext, const std::string& aFileName,
                                               Dds::ImageInfo* anInfoOut);
} // namespace Gpu
