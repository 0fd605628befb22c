#pragma once
// AABB: an axis-aligned box, used for rooms and for the small picking boxes
// around lights and path nodes.
//
// The constructor leaves every field uninitialised: owners fill what they need
// (a room all four, a picking box only the corners), and the ray and point tests
// read only myMinPos and myMaxPos. Boxes take part in no shape-versus-shape test,
// so both collision slots report no contact.

#include "core/CollisionObject.h"
#include "core/Vector3.h"

namespace Intersection
{
template <typename T> class AABB : public CollisionObject
{
public:
	AABB() {}

	bool Collide(const CollisionObject& anObject) const override
	{
		static_cast<void>(anObject);
		return false;
	}

	bool CollideWithSphere(const Sphere& aSphere) const override
	{
		static_cast<void>(aSphere);
		return false;
	}

	Vector3<T> myCenterPosition;
	Vector3<T> myExtents; // half sizes: max minus centre
	Vector3<T> myMinPos;
	Vector3<T> myMaxPos;
};
} // namespace Intersection
