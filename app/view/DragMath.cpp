#include "view/DragMath.h"

#include <algorithm>
#include <cmath>

namespace LumoraEditor
{
namespace
{
float Dot(const Vec3& a, const Vec3& b)
{
	return a[0] * b[0] + a[1] * b[1] + a[2] * b[2];
}
} // namespace

Vec3 DragMove(const CameraPlacement& aCamera, int aHeight, const Vec3& aStart, float aDx, float aDy,
              DragAxis anAxis)
{
	const Vec3 forward = aCamera.Forward();
	const Vec3 toObject{aStart[0] - aCamera.myPosition[0], aStart[1] - aCamera.myPosition[1],
	                    aStart[2] - aCamera.myPosition[2]};
	// An object behind or at the camera moves as if it were a metre in front.
	const float depth = std::max(1.0f, Dot(toObject, forward));
	const float unitsPerPixel =
	    2.0f * depth * std::tan(ourVerticalFov * 0.5f) / static_cast<float>(std::max(1, aHeight));
	const Vec3 right = aCamera.Right();
	const Vec3 up = aCamera.Up();
	Vec3 move{};
	for (int axis = 0; axis < 3; ++axis)
	{
		move[axis] = (right[axis] * aDx - up[axis] * aDy) * unitsPerPixel;
	}
	if (anAxis >= 0 && anAxis < 3)
	{
		const float along = move[anAxis];
		move = {0.0f, 0.0f, 0.0f};
		// The axis seen end-on moves nowhere on screen: let the drag's vertical movement drive it.
		Vec3 axisVector{};
		axisVector[anAxis] = 1.0f;
		move[anAxis] = std::abs(Dot(axisVector, forward)) > 0.95f ? -aDy * unitsPerPixel : along;
	}
	return {aStart[0] + move[0], aStart[1] + move[1], aStart[2] + move[2]};
}

Vec3 Rotate(const Vec3& aVector, const Vec3& anAxis, float anAngle)
{
	// Rodrigues: v cos + (k x v) sin + k (k.v)(1 - cos).
	const float c = std::cos(anAngle);
	const float s = std::sin(anAngle);
	const Vec3 cross{anAxis[1] * aVector[2] - anAxis[2] * aVector[1],
	                 anAxis[2] * aVector[0] - anAxis[0] * aVector[2],
	                 anAxis[0] * aVector[1] - anAxis[1] * aVector[0]};
	const float dot = Dot(anAxis, aVector);
	Vec3 out{};
	for (int axis = 0; axis < 3; ++axis)
	{
		out[axis] = aVector[axis] * c + cross[axis] * s + anAxis[axis] * dot * (1.0f - c);
	}
	return out;
}

Vec3 DragTurn(const CameraPlacement& aCamera, const Vec3& aDirection, float aDx, float aDy)
{
	const Vec3 turned = Rotate(aDirection, {0.0f, 1.0f, 0.0f}, aDx * ourTurnSpeed);
	return Rotate(turned, aCamera.Right(), aDy * ourTurnSpeed);
}
} // namespace LumoraEditor
