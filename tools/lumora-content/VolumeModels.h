#pragma once
// VolumeModels: the closed convex shapes the deferred renderer draws to cover the pixels a light or
// a decal can touch. They carry the same vertex layout as the lit sample models (so they import as
// the same vertex type and share its effects), with flat faces wound outward.
//
//   for (const Content::ModelDescription& model : Content::BuildVolumeModels()) { ... }
//
// light_volume_point: an icosphere (an icosahedron subdivided once, 80 faces) scaled so that every
//   face plane lies at least 1 from the origin: it contains the unit sphere, which the renderer
//   scales to the light's reach.
// light_volume_spot: a cone with its apex at the origin and its axis along +Z, 1 long, whose 12
//   flat sides touch the cone of radius 1 at z = 1 from outside (the margin apart); closed by its
//   base at z = 1.
//
// Both are coarse on purpose. A light shades exactly the pixels within its reach whatever volume
// covers them, so the tessellation only trades triangles against pixels that are shaded and then
// dropped: the 80-face sphere is 7 % larger than the sphere it contains, the 12-sided cone 2 %.
// The light volumes are drawn per light in every frame and, in the ambient bake, six times per
// probe into 32 x 32 faces, where their triangles cost more than the pixels they cover.
// decal_box: the unit cube -0.5..0.5.

#include <vector>

#include "Models.h"

namespace Content
{
// How far (relative) the point and spot volumes reach past the sphere and cone they contain, so
// that the six significant digits of the document cannot bring a face inside them.
constexpr double ourVolumeMargin = 1e-4;
constexpr int ourSpotSegments = 12;

std::vector<ModelDescription> BuildVolumeModels();
} // namespace Content
