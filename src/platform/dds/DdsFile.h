#pragma once
// DdsFile: reads and writes DDS files, the engine's texture file format.
//
//   Dds::Image image;
//   std::string error;
//   if (!Dds::LoadFromFile("data/Cubemaps/level/1.dds", image, error)) { log(error); return false; }
//   ... image.Info(), image.Data(mip, face) ...
//   if (!Dds::SaveToFile("data/Cubemaps/level/1.dds", image, error)) { log(error); }
//
// Reading accepts the legacy header (FourCC DXT1-DXT5, ATI1/BC4U/BC4S for BC4,
// ATI2/BC5U/BC5S for BC5 and the float FourCCs, or 32-bit RGBA/BGRA/BGRX bit
// masks) and the "DX10" extension header (any format of Format.h, 1D/2D arrays,
// cube arrays, volumes). Writing uses the legacy header wherever the format has
// a legacy form that older viewers open (BC1-BC3, the float and 8-bit RGBA
// formats) and the texture is not an array; everything else, BC4-BC7 included,
// gets the DX10 header.
//
// Every function returns false with a message naming the file and the fault;
// a failed load leaves anImageOut empty, a failed save leaves the old file as
// it was (the new one is written to a temporary and renamed over it).

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

#include "platform/dds/Image.h"
#include "platform/dds/ImageInfo.h"

namespace Dds
{
// Reads only the headers, and checks that the file is long enough for the data.
bool GetImageInfoFromFile(const std::string& aFileName, ImageInfo& anInfoOut, std::string& anErrorOut);
bool LoadFromFile(const std::string& aFileName, Image& anImageOut, std::string& anErrorOut);
// Errors name the source as "<memory>".
bool LoadFromMemory(const void* someBytes, size_t aSize, Image& anImageOut, std::string& anErrorOut);

bool SaveToFile(const std::string& aFileName, const Image& anImage, std::string& anErrorOut);
// SaveToFile in two steps, for writers that replace several files together: the image
// written whole to a new temporary beside aFileName (its name returned), then renamed over
// it. A temporary that is not used is the caller's to remove.
bool SaveToTemporary(const std::string& aFileName, const Image& anImage, std::string& aTemporaryOut,
                     std::string& anErrorOut);
bool ReplaceWithTemporary(const std::string& aTemporary, const std::string& aFileName,
                          std::string& anErrorOut);
// The bytes SaveToFile() writes.
bool SaveToMemory(const Image& anImage, std::vector<uint8_t>& someBytesOut, std::string& anErrorOut);
} // namespace Dds
