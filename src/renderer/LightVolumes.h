#pragma once
// LightVolumes: the point and spot light passes. Each queued light is drawn as its
// volume model with the light effect's variables set: a point light as the unit
// sphere scaled by falloff x 1.2 at its position; a spot light as the unit cone
// scaled by (r, r, falloff) with r = tan(acos(outer)) x falloff x 1.1 and placed by
// its orientation. Positions and the cone axis reach the shader in view space.
// The frame and the bakes draw with "Render"; the light-mesh debug view with "RenderMesh".
#include "core/Matrix44.h"

namespace Zeph
{
class Model;
class RenderTargetCollector;
struct PointLightData;
struct SpotLightData;

// A pass model (a light volume, the decal box) with the transformation its file's
// nodes give it (an imported file's root changes the handedness).
struct VolumeModel
{
	const Model* myModel = nullptr;
	Matrix44<float> myLocal;
};

namespace LightVolumes
{
// The first mesh of a model file from the engine's factory; a null model when it cannot load.
VolumeModel Load(const char* aFileName);

Matrix44<float> PointLightWorld(const PointLightData& aLight);
Matrix44<float> SpotLightScale(const SpotLightData& aLight);

// Draws every queued light of the collector with the named technique of the point
// (spot) light effect over aVolume; nothing when the volume or technique is missing.
void DrawPointLights(const RenderTargetCollector& aCollector, const VolumeModel& aVolume, const char* aTechnique);
void DrawSpotLights(const RenderTargetCollector& aCollector, const VolumeModel& aVolume, const char* aTechnique);
} // namespace LightVolumes
} // namespace Zeph
