#pragma once
// Sphere: bounding spheres of entities, tested against rooms and each other
// while a level loads.
//
// myPreviousPosition travels with the sphere for the engine's movement code; no
// intersection test reads it.

#include "core/CollisionObject.h"
#include "core/Vector3.h"

namespace Intersection
{
class Sphere : public CollisionObject
{
public:
	Sphere() : myPosition(0.0f, 0.0f, 0.0f), myPreviousPosition(0.0f, 0.0f, 0.0f), myRadius(0.0f) {}
	Sphere(const Vector3<float>& aPosition, const float aRadius)
	    : myPosition(aPosition), myPreviousPosition(aPosition), myRadius(aRadius)
	{
	}

	// Hands this sphere to the other shape, which knows how to test against it.
	bool Collide(const CollisionObject& anObject) const override;
	// Touching spheres (distance equal to the sum of the radii) count as colliding.
	bool CollideWithSphere(const Sphere& aSphere) const override;

	void SetPosition(const Vector3<float>& aPosition) override;
	Vector3<float> GetPosition() const override;

	Vector3<float> myPosition;
	Vector3<float> myPreviousPosition;
	float myRadius;
};
} // namespace Intersection
