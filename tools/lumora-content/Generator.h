#pragma once
// Generator: writes the whole sample content under one output directory: the sample models and
// their textures, the light-volume and decal-box models, the colour-grading lookups and the
// cube maps.
//
//   std::vector<std::string> written;
//   std::string error;
//   if (!Content::Generate("data", written, error)) { print(error); }
//   // written: "models/arch.dae", ..., "textures/wood_roughness.dds", relative to the directory
//
// The output depends on nothing but this code: the same bytes on every run. Documents name their
// textures by the engine path "data/textures/...", whatever the output directory, because the
// engine opens them relative to its working directory.

#include <string>
#include <vector>

namespace Content
{
bool Generate(const std::string& anOutDirectory, std::vector<std::string>& someWrittenOut,
              std::string& anErrorOut);
} // namespace Content
