#pragma once
// CollisionObject: the common base of the shapes in Intersection.
//
// Shapes test each other by double dispatch: a shape's Collide asks the other
// shape to collide with its own concrete type, so a new pair of shapes needs only
// a new CollideWith... slot. The base carries no data; position access does
// nothing by default for shapes that have no single position.

#include "core/Vector3.h"

namespace Intersection
{
class Sphere;

class CollisionObject
{
public:
	virtual ~CollisionObject() = default;

	virtual bool Collide(const CollisionObject& anObject) const = 0;
	virtual bool CollideWithSphere(const Sphere& aSphere) const = 0;

	virtual void SetPosition(const Vector3<float>& aPosition) { static_cast<void>(aPosition); }
	virtual Vector3<float> GetPosition() const { return Vector3<float>(0.0f, 0.0f, 0.0f); }
	virtual void SetPreviousPosition(const Vector3<float>& aPosition) { static_cast<void>(aPosition); }
};
} // namespace Intersection
