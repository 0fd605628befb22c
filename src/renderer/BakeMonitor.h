#pragma once
// BakeMonitor: the running bake's status and its cancel request, shared between the
// thread that bakes and any thread that asks. The baking thread begins a phase, counts
// its work as it goes and ends it; others read a copy of the status or ask it to stop.
//
//   monitor.Begin(Zeph::BakePhase::AMBIENT, probes, 0, bounces);
//   for (...) { if (monitor.IsCancelRequested()) break; ... monitor.AddProbes(1); }
//   monitor.End(Zeph::BakeResult::FINISHED, "");
//
//   monitor.RequestCancel();                 // another thread; a no-op when nothing runs
//   Zeph::BakeStatus status = monitor.GetStatus();
//
// The estimate of the time left is the time spent so far per unit of work (a probe, or a
// room), times the units left. RequestCancel only sets an atomic flag, so a signal handler
// may call it.
#include <atomic>
#include <chrono>
#include <mutex>

#include "renderer/BakeStatus.h"

namespace Zeph
{
class BakeMonitor
{
public:
	void Begin(BakePhase aPhase, long long aProbesTotal, int aRoomsTotal, int aBounceCount);
	void SetBounce(int aBounce);
	void AddProbes(long long aCount);
	void AddRoom();
	// Back to idle, recording how the bake ended. A cancel asked for meanwhile is dropped.
	void End(BakeResult aResult, const std::string& aMessage);

	void RequestCancel();
	bool IsCancelRequested() const { return myCancelFlag.load(std::memory_order_relaxed); }

	BakeStatus GetStatus() const;

private:
	mutable std::mutex myMutex;
	BakeStatus myStatus;
	std::chrono::steady_clock::time_point myStart;
	std::atomic<bool> myRunningFlag{false};
	std::atomic<bool> myCancelFlag{false};
	static_assert(std::atomic<bool>::is_always_lock_free, "RequestCancel must be signal-safe");
};
} // namespace Zeph
