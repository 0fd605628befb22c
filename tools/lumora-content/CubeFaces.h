#pragma once
// CubeFaces: which direction each texel of a cube map stands for, in Direct3D's layout: faces in
// the order +X, -X, +Y, -Y, +Z, -Z, row 0 of a face at its top, and each face seen from inside the
// cube with its own up and right (the up of the four side faces is +Y; +Y's top row looks towards
// -Z and -Y's towards +Z).
//
//   const Content::Vec3 direction = Content::CubeTexelDirection(2, x, y, 256);   // unit vector
//
// The generated environment maps and the shaders that sample them meet in this convention.

#include <cstdint>

#include "MeshBuilder.h"

namespace Content
{
constexpr uint32_t ourCubeFaceCount = 6;

// The direction through a point of face aFace; aA runs from -1 (left) to 1 (right), aB from -1 (top)
// to 1 (bottom). Not normalised: the face's own axis component is +-1.
Vec3 CubeFacePoint(uint32_t aFace, double aA, double aB);
// The unit direction through the centre of texel (anX, aY) of a face aSize texels wide.
Vec3 CubeTexelDirection(uint32_t aFace, uint32_t anX, uint32_t aY, uint32_t aSize);
} // namespace Content
