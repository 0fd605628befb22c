#include "renderer/BakeMonitor.h"

namespace Zeph
{
const char* GetBakePhaseName(BakePhase aPhase)
{
	switch (aPhase)
	{
	case BakePhase::AMBIENT:
		return "ambient";
	case BakePhase::REFLECTIONS:
		return "reflections";
	case BakePhase::IDLE:
		break;
	}
	return "idle";
}

const char* GetBakeResultName(BakeResult aResult)
{
	switch (aResult)
	{
	case BakeResult::FINISHED:
		return "finished";
	case BakeResult::CANCELLED:
		return "cancelled";
	case BakeResult::FAILED:
		return "failed";
	case BakeResult::NONE:
		break;
	}
	return "none";
}

void BakeMonitor::Begin(BakePhase aPhase, long long aProbesTotal, int aRoomsTotal, int aBounceCount)
{
	const std::lock_guard lock(myMutex);
	// A cancel asked for before this bake began was for another one (or none).
	myCancelFlag.store(false);
	myRunningFlag.store(true);
	myStart = std::chrono::steady_clock::now();
	myStatus.myPhase = aPhase;
	myStatus.myBounce = aBounceCount > 0 ? 1 : 0;
	myStatus.myBounceCount = aBounceCount;
	myStatus.myProbesDone = 0;
	myStatus.myProbesTotal = aProbesTotal;
	myStatus.myRoomsDone = 0;
	myStatus.myRoomsTotal = aRoomsTotal;
}

void BakeMonitor::SetBounce(int aBounce)
{
	const std::lock_guard lock(myMutex);
	myStatus.myBounce = aBounce;
}

void BakeMonitor::AddProbes(long long aCount)
{
	const std::lock_guard lock(myMutex);
	myStatus.myProbesDone += aCount;
}

void BakeMonitor::AddRoom()
{
	const std::lock_guard lock(myMutex);
	++myStatus.myRoomsDone;
}

void BakeMonitor::End(BakeResult aResult, const std::string& aMessage)
{
	const std::lock_guard lock(myMutex);
	myStatus.myElapsedSeconds =
	    myRunningFlag.load()
	        ? std::chrono::duration<double>(std::chrono::steady_clock::now() - myStart).count()
	        : 0.0;
	myStatus.myPhase = BakePhase::IDLE;
	myStatus.mySecondsLeft = aResult == BakeResult::FINISHED ? 0.0 : -1.0;
	myStatus.myLastResult = aResult;
	myStatus.myLastMessage = aMessage;
	myRunningFlag.store(false);
	myCancelFlag.store(false);
}

void BakeMonitor::RequestCancel()
{
	if (myRunningFlag.load())
	{
		myCancelFlag.store(true);
	}
}

BakeStatus BakeMonitor::GetStatus() const
{
	const std::lock_guard lock(myMutex);
	BakeStatus status = myStatus;
	if (status.myPhase == BakePhase::IDLE)
	{
		return status;
	}
	status.myElapsedSeconds =
	    std::chrono::duration<double>(std::chrono::steady_clock::now() - myStart).count();
	// The work is counted in probes for the ambient bake and in rooms for the reflections.
	const bool probesFlag = status.myPhase == BakePhase::AMBIENT;
	const double done = probesFlag ? static_cast<double>(status.myProbesDone) : status.myRoomsDone;
	const double total = probesFlag ? static_cast<double>(status.myProbesTotal) : status.myRoomsTotal;
	status.mySecondsLeft = done > 0.0 ? status.myElapsedSeconds / done * (total - done) : -1.0;
	return status;
}
} // namespace Zeph
