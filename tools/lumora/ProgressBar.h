#pragma once
// ProgressBar: a second thread that polls a percentage (the facade's GetBakeProgress) and
// a line of detail (bounce, counts, time left) ten times a second and draws them on
// standard output while the calling thread works: redrawn in place on a terminal, a line
// per tenth otherwise (logs, pipes). The value found at the start is drawn only once it
// has moved: it may be the last job's.
//
//   LumoraTool::ProgressBar bar("ambient", [&] { return ProgressBar::Progress{editor.GetBakeProgress(), ""};
//   });
//   editor.BakeAmbient(level, 2, false);   // blocks; the bar moves meanwhile
//   bar.Stop(finishedFlag);                 // last value (100 % once finished) drawn, line ended
#include <atomic>
#include <functional>
#include <string>
#include <thread>

namespace LumoraTool
{
class ProgressBar
{
public:
	struct Progress
	{
		int myPercent = 0;
		std::string myDetail;
	};
	ProgressBar(std::string aLabel, std::function<Progress()> aPoll);
	~ProgressBar();
	ProgressBar(const ProgressBar&) = delete;
	ProgressBar& operator=(const ProgressBar&) = delete;

	// Ends the bar with its last value, or at 100 % when aCompleteFlag says the work finished:
	// the bake's own percentage may stop short (it counts grid cells that are never visited).
	void Stop(bool aCompleteFlag = false);

private:
	void Draw(const Progress& aProgress);

	std::string myLabel;
	std::function<Progress()> myPoll;
	std::atomic<bool> myStopFlag{false};
	bool myTerminalFlag = false;
	int myLastDrawn = -1;
	std::string myLastDetail;
	std::thread myThread;
};
} // namespace LumoraTool
