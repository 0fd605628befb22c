#pragma once
// ShProjection: a cube map's light as order-3 spherical harmonics (9 coefficients per colour).
//
//   float red[9], green[9], blue[9];
//   if (!Sh::ProjectCubeMap(device.GetContext(), 3, cube, red, green, blue)) { ... reported already ... }
//   // or, with the six faces already in memory (+X, -X, +Y, -Y, +Z, -Z, RGBA floats, row 0 first):
//   Sh::ProjectCubeTexels(texels, 32, 4, red, green, blue);
//
//   // Many probes from one read-back: render cube i's face f into tile i * 6 + f of an atlas
//   // (viewport per face, see the layout below), read the atlas once, then
//   std::vector<float> coefficients(cubeCount * Sh::ourCubeCoefficientCount);
//   Sh::ProjectCubeAtlas(atlasTexels, atlasWidth, atlasHeight, 4, 32, cubeCount, coefficients.data());
//
// Conventions, the ones the engine's packing of irradiance vectors expects (those of D3DX11):
// - basis of a unit direction (x, y, z), in this order:
//   Y0 = 0.2820948, Y1 = -0.4886025 y, Y2 = 0.4886025 z, Y3 = -0.4886025 x, Y4 = 1.0925484 xy,
//   Y5 = -1.0925484 yz, Y6 = 0.9461747 z^2 - 0.3153916, Y7 = -1.0925484 xz, Y8 = 0.5462742 (x^2 - y^2);
// - texel (column x, row y) of a W-wide face sits at a = -1 + (2x + 1) / W, b = -1 + (2y + 1) / W
//   and looks along +X (1, -b, -a), -X (-1, -b, a), +Y (a, 1, b), -Y (a, -1, -b), +Z (a, -b, 1),
//   -Z (-a, -b, -1), normalised: row 0 of a side face is its +y edge;
// - each texel weighs its solid angle, 4 / (1 + a^2 + b^2)^(3/2), and the weights are scaled to sum
//   to 4 pi. A constant 1 therefore gives a first coefficient of 2 sqrt(pi), about 3.5449.
// Alpha is ignored.
//
// The CPU projection multiplies each texel by a table of weight x basis that is built once per face
// width and kept (about 220 KB for 32 x 32 faces; widths above 128 build theirs per call). All
// functions may be called from any thread; the texture ones need the texture's context current.

#include <array>

namespace Gpu
{
class Context;
class Texture;
} // namespace Gpu

namespace Sh
{
inline constexpr int ourCoefficientCount = 9;                           // per colour channel (order 3)
inline constexpr int ourCubeCoefficientCount = 3 * ourCoefficientCount; // R0..8, G0..8, B0..8

// The order-3 basis at a unit direction, in the order above.
std::array<float, ourCoefficientCount> EvaluateBasis(float anX, float aY, float aZ);

// The unit direction through the centre of texel (aColumn, aRow) of face aFace (0..5: +X, -X, +Y, -Y,
// +Z, -Z) of a cube aWidth texels wide.
std::array<float, 3> TexelDirection(int aFace, int aColumn, int aRow, int aWidth);

// Projects six faces of aWidth x aWidth texels, stored one after another in face order, each row 0
// first, aChannelCount (3 or 4) floats per texel. Writes 9 coefficients to each output. Reports and
// returns false (outputs untouched) on bad arguments.
bool ProjectCubeTexels(const float* someTexels, int aWidth, int aChannelCount, float* anROut, float* aGOut,
                       float* aBOut);

// Projects aCubeCount cubes whose faces lie in one atlas of anAtlasWidth x anAtlasHeight texels (row 0
// first, aChannelCount floats per texel). The atlas is a grid of square tiles aFaceWidth wide, filled
// row by row: tile t sits at column (t % perRow) * aFaceWidth, row (t / perRow) * aFaceWidth, where
// perRow = anAtlasWidth / aFaceWidth (texels right of the last whole tile are ignored). Face f of cube
// i is tile i * 6 + f, in the face order above, oriented as a face of its own cube. For cube i,
// someCoefficientsOut[i * 27 ..] receives R0..R8, G0..G8, B0..B8, exactly what ProjectCubeTexels gives
// for its six faces. Reports and returns false when the atlas is too small or an argument is bad.
bool ProjectCubeAtlas(const float* someTexels, int anAtlasWidth, int anAtlasHeight, int aChannelCount,
                      int aFaceWidth, int aCubeCount, float* someCoefficientsOut);

// The D3DX-style projection of a cube texture: anOrder must be 3; aCube must be a single cube (six
// faces) of a floating-point format with red, green and blue (R32G32B32A32_FLOAT, R16G16B16A16_FLOAT,
// R11G11B10_FLOAT). Reads mip 0 of the six faces back (one wait for the GPU) and projects it.
bool ProjectCubeMap(Gpu::Context& aContext, int anOrder, const Gpu::Texture& aCube, float* anROut,
                    float* aGOut, float* aBOut);

// Reads mip 0, slice 0 of a 2D floating-point texture laid out as the atlas above and projects its
// cubes: the bake's one read-back for a whole batch of probes.
bool ProjectCubeAtlas(Gpu::Context& aContext, const Gpu::Texture& anAtlas, int aFaceWidth, int aCubeCount,
                      float* someCoefficientsOut);
} // namespace Sh
