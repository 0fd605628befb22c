#pragma once
// ColladaWriter: turns a model description into the text of a COLLADA 1.4.1 document.
//
//   std::string text = Content::WriteColladaDocument(model);
//
// The document has y up and metre units, one visual scene with one node (an identity <matrix>)
// instancing the model's geometry, and one profile_COMMON phong effect per material whose
// ambient (occlusion), diffuse (albedo), specular (roughness) and bump (normal map, inside the
// technique's <extra>, where exporters put it) channels name sampler2D -> surface -> image
// chains. Images are named by their engine path, "data/textures/<file>.dds". The mesh carries
// POSITION (through <vertices>), NORMAL, TEXCOORD, TEXTANGENT and TEXBINORMAL of set 0: positions
// are shared between faces at index offset 0, the other sources are per vertex at offset 1.
// Numbers are written with six significant digits in the classic format, so the same model gives
// the same bytes on every run.

#include <string>

#include "Models.h"

namespace Content
{
// The path under which documents name the texture files: "data/textures/".
extern const char* const ourTextureDirectory;

std::string WriteColladaDocument(const ModelDescription& aModel);
// "%.6g" with negative zero and values below 5e-7 written as "0".
std::string FormatNumber(double aValue);
} // namespace Content
