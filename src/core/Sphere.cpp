#include "core/Sphere.h"

namespace Intersection
{
bool Sphere::Collide(const CollisionObject& anObject) const
{
	return anObject.CollideWithSphere(*this);
}

bool Sphere::CollideWithSphere(const Sphere& aSphere) const
{
	// Squared on both sides: no square root, and the comparison stays exact for
	// spheres that just touch.
	const float radiusSum = myRadius + aSphere.myRadius;
	return (aSphere.myPosition - myPosition).LengthFast() <= radiusSum * radiusSum;
}

void Sphere::SetPosition(const Vector3<float>& aPosition)
{
	myPosition = aPosition;
}

Vector3<float> Sphere::GetPosition() const
{
	return myPosition;
}
} // namespace Intersection
