#pragma once
// Camera: a <camera>'s optics (technique_common). Angles in degrees, as the file has them; a
// value the file leaves out is 0, and its Has flag says so (a perspective camera gives xfov, yfov
// or both, with or without an aspect ratio).

#include <string>

namespace Collada
{
enum class Projection
{
	Perspective,
	Orthographic
};

struct Camera
{
	std::string myId;
	std::string myName;
	Projection myProjection = Projection::Perspective;
	float myXFov = 0.0f; // perspective; xmag for orthographic
	float myYFov = 0.0f; // perspective; ymag for orthographic
	float myAspectRatio = 0.0f;
	float myZNear = 0.0f;
	float myZFar = 0.0f;
	bool myHasXFlag = false;
	bool myHasYFlag = false;
	bool myHasAspectRatioFlag = false;
	int myLine = 0;
};
} // namespace Collada
