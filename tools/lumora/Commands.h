#pragma once
// The lumora tool's commands. Each returns the process's exit status: 0 done, 1 the
// job failed or found problems (said on standard error or listed), 2 bad arguments.
#include <optional>
#include <string>

#include "core/Vector3.h"

namespace LumoraTool
{
struct BakeOptions
{
	std::string myLevel;
	int myBounces = 2;
	bool myAmbientOnlyFlag = false;
	bool mySpecularOnlyFlag = false;
	bool myDebugCapturesFlag = false;
	// Bake a level in which check finds problems.
	bool myForceFlag = false;
};
// Loads the level, bakes its ambient volume and/or its room reflections with a
// progress bar, and prints what was written. A level in which check finds problems
// (other than in its baked files) is refused, unless forced.
int RunBake(const BakeOptions& someOptions);

struct RenderOptions
{
	std::string myLevel;
	std::string myOutput;
	int myWidth = 1280;
	int myHeight = 720;
	// Without a camera position the editor camera is walked into the first room.
	std::optional<Vector3<float>> myCamera;
	float myYaw = 0.0f;
	float myPitch = 0.0f;
	std::string myMode = "light";
};
// One frame of the level to a PNG.
int RunRender(const RenderOptions& someOptions);

// Reads the level's files and both catalogues and lists every problem.
int RunCheck(const std::string& aLevel);

// Describes an ambient.sh, a DDS, an .al model or a bake record (bake.json).
int RunInfo(const std::string& aPath);
} // namespace LumoraTool
