#pragma once
// The lumora tool's commands. Each returns the process's exit status: 0 done, 1 the
// job failed or found problems (said on standard error or listed), 2 bad arguments.
#include <optional>
#include <string>
#include <vector>

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
	// Only these rooms: their cubemaps, and the ambient volume's probes inside them.
	std::vector<std::string> myRooms;
	// Processes to share the bake (this one and helpers, byte for byte the same result); 0:
	// one per processor.
	int myJobs = 1;
	// A part of a bake spread over machines (myPartBounce > 0): cells myFirst .. myFirst +
	// myCount - 1 of that bounce, lit by myPrevious (the merged volume of the bounce before),
	// into myPartOutput.
	int myPartBounce = 0;
	std::string myPrevious;
	long long myFirst = 0;
	long long myCount = 0;
	std::string myPartOutput;
};
// Loads the level, bakes its ambient volume and/or its room reflections with a
// progress bar, and prints what was written. A level in which check finds problems
// (other than in its baked files) is refused, unless forced.
// Ctrl-C or SIGTERM cancels it: nothing more is written, exit 130.
int RunBake(const BakeOptions& someOptions);

// A helper process of a bake spread over this machine's processors: loads the level and
// bakes the jobs read on standard input (BakeWorkers.h).
int RunBakeWorker(const std::string& aLevel);

struct MergeOptions
{
	std::string myLevel;
	std::vector<std::string> myParts;
	std::string myOutput;
};
// One bounce's part files assembled into an ambient.sh-format file.
int RunBakeMerge(const MergeOptions& someOptions);

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

// Reads the level's files and both catalogues and lists every problem (as JSON records with
// aJsonFlag: what the desktop editor reads).
int RunCheck(const std::string& aLevel, bool aJsonFlag);

// Describes an ambient.sh, a DDS, an .al model or a bake record (bake.json).
int RunInfo(const std::string& aPath);
} // namespace LumoraTool
