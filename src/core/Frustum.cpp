#include "core/Frustum.h"

#include <cmath>

namespace Intersection
{
void Frustum::Init(const Matrix44<float>& aViewProjection)
{
	const float* m = aViewProjection.myMatrix;
	// Column j of the matrix gives clip coordinate j of a row vector.
	const auto column = [m](int j, float aScale, Plane& aPlane) {
		aPlane.myA += aScale * m[j];
		aPlane.myB += aScale * m[4 + j];
		aPlane.myC += aScale * m[8 + j];
		aPlane.myD += aScale * m[12 + j];
	};
	// w + x, w - x, w + y, w - y, w + z, w - z: each is >= 0 inside.
	for (int plane = 0; plane < 6; ++plane)
	{
		Plane& p = myPlanes[plane];
		p = Plane{0.0f, 0.0f, 0.0f, 0.0f};
		column(3, 1.0f, p);
		column(plane / 2, plane % 2 == 0 ? 1.0f : -1.0f, p);
		const float length = std::sqrt(p.myA * p.myA + p.myB * p.myB + p.myC * p.myC);
		if (length > 0.0f)
		{
			p.myA /= length;
			p.myB /= length;
			p.myC /= length;
			p.myD /= length;
		}
		else
		{
			// A degenerate plane (a broken matrix) culls nothing.
			p = Plane{};
		}
	}
}

bool Frustum::IsSphereOutside(const Vector3<float>& aCentre, float aRadius) const
{
	for (const Plane& p : myPlanes)
	{
		if (p.myA * aCentre.x + p.myB * aCentre.y + p.myC * aCentre.z + p.myD < -aRadius)
		{
			return true;
		}
	}
	return false;
}
} // namespace Intersection
