#pragma once
// Frustum: the six planes of a camera's view volume in world space, taken from its
// view-projection matrix (row vectors: clip = world * view * projection), for
// skipping whatever lies wholly outside what the camera sees.
//
//   Intersection::Frustum frustum;
//   frustum.Init(view * projection);
//   if (frustum.IsSphereOutside(centre, radius)) { ...nothing of it is on screen... }
//
// The near plane is taken as -w <= z, which holds for both depth ranges (0..w and
// -w..w): at worst a sphere just behind the near plane is kept, never one in view lost.

#include "core/Matrix44.h"
#include "core/Vector3.h"

namespace Intersection
{
class Frustum
{
public:
	void Init(const Matrix44<float>& aViewProjection);
	// True only when the whole sphere lies outside one of the planes.
	bool IsSphereOutside(const Vector3<float>& aCentre, float aRadius) const;

private:
	struct Plane
	{
		float myA = 0.0f;
		float myB = 0.0f;
		float myC = 0.0f;
		float myD = 1.0f; // everything inside until Init
	};
	Plane myPlanes[6];
};
} // namespace Intersection
