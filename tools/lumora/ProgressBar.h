#pragma once
// ProgressBar: a second thread that polls a percentage (the facade's GetBakeProgress)
// ten times a second and draws it on standard output while the calling thread works:
// redrawn in place on a terminal, a line per tenth otherwise (logs, pipes). The value
// found at the start is drawn only once it has moved: it may be the last job's.
//
//   LumoraTool::ProgressBar bar("ambient", [&] { return editor.GetBakeProgress(); });
//   editor.BakeAmbient(level, 2, false);   // blocks; the bar moves meanwhile
//   bar.Stop();                            // last value drawn, line ended
#include <atomic>
#include <functional>
#include <string>
#include <thread>

namespace LumoraTool
{
class ProgressBar
{
public:
	ProgressBar(std::string aLabel, std::function<int()> aPoll);
	~ProgressBar();
	ProgressBar(const ProgressBar&) = delete;
	ProgressBar& operator=(const ProgressBar&) = delete;

	void Stop();

private:
	void Draw(int aPercent);

	std::string myLabel;
	std::function<int()> myPoll;
	std::atomic<bool> myStopFlag{false};
	bool myTerminalFlag = false;
	int myLastDrawn = -1;
	std::thread myThread;
};
} // namespace LumoraTool
