#pragma once
// BakeStatus: where a running bake is, as a copy any thread may hold: the phase, the
// bounce, the probes and rooms done of their totals, the time spent and the time left
// (estimated from what the bake has cost so far), and how the last bake ended.
//
//   const Zeph::BakeStatus status = renderer.GetBakeStatus();     // from any thread
//   if (status.myPhase == Zeph::BakePhase::AMBIENT)
//       std::printf("bounce %d/%d, %lld/%lld probes, %.0f s left\n", status.myBounce,
//                   status.myBounceCount, status.myProbesDone, status.myProbesTotal,
//                   status.mySecondsLeft);
#include <string>

namespace Zeph
{
enum class BakePhase
{
	IDLE,
	AMBIENT,
	REFLECTIONS,
};

enum class BakeResult
{
	NONE,      // nothing baked since the engine started
	FINISHED,  // every output written
	CANCELLED, // stopped on request; every output as it was before the bake
	FAILED,    // refused or unable to write; myLastMessage says why
};

struct BakeStatus
{
	BakePhase myPhase = BakePhase::IDLE;
	// The ambient bake's bounce, 1-based, of myBounceCount (0 of 0 for reflections).
	int myBounce = 0;
	int myBounceCount = 0;
	// Probe cubemaps rendered of those the ambient bake renders over all its bounces.
	long long myProbesDone = 0;
	long long myProbesTotal = 0;
	// Rooms whose reflection cubemap is done, of those the bake renders.
	int myRoomsDone = 0;
	int myRoomsTotal = 0;
	double myElapsedSeconds = 0.0;
	// Negative until the bake has measured enough to tell.
	double mySecondsLeft = -1.0;
	// The last bake that ended, and what it said (why it failed, or what it chose).
	BakeResult myLastResult = BakeResult::NONE;
	std::string myLastMessage;
};

const char* GetBakePhaseName(BakePhase aPhase);
const char* GetBakeResultName(BakeResult aResult);
} // namespace Zeph
