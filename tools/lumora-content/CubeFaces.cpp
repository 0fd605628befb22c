#include "CubeFaces.h"

namespace Content
{
Vec3 CubeFacePoint(uint32_t aFace, double aA, double aB)
{
	switch (aFace)
	{
	case 0:
		return Vec3(1.0, -aB, -aA);
	case 1:
		return Vec3(-1.0, -aB, aA);
	case 2:
		return Vec3(aA, 1.0, aB);
	case 3:
		return Vec3(aA, -1.0, -aB);
	case 4:
		return Vec3(aA, -aB, 1.0);
	default:
		return Vec3(-aA, -aB, -1.0);
	}
}

Vec3 CubeTexelDirection(uint32_t aFace, uint32_t anX, uint32_t aY, uint32_t aSize)
{
	const double a = -1.0 + (2.0 * anX + 1.0) / aSize;
	const double b = -1.0 + (2.0 * aY + 1.0) / aSize;
	return Normalized(CubeFacePoint(aFace, a, b));
}
} // namespace Content
