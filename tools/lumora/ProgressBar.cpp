#include "ProgressBar.h"

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <unistd.h>

namespace LumoraTool
{
namespace
{
constexpr int ourWidth = 40;
} // namespace

ProgressBar::ProgressBar(std::string aLabel, std::function<int()> aPoll)
    : myLabel(std::move(aLabel)), myPoll(std::move(aPoll)), myTerminalFlag(isatty(fileno(stdout)) != 0)
{
	// The value before the work starts may be the last job's: nothing is drawn until
	// the value moves (or the work ends).
	const int initial = myPoll();
	myThread = std::thread([this, initial] {
		bool movedFlag = false;
		while (!myStopFlag.load())
		{
			const int percent = myPoll();
			movedFlag = movedFlag || percent != initial;
			if (movedFlag)
			{
				Draw(percent);
			}
			std::this_thread::sleep_for(std::chrono::milliseconds(100));
		}
	});
}

ProgressBar::~ProgressBar()
{
	Stop();
}

void ProgressBar::Stop()
{
	if (!myThread.joinable())
	{
		return;
	}
	myStopFlag = true;
	myThread.join();
	Draw(myPoll());
	if (myTerminalFlag)
	{
		std::printf("\n");
	}
	std::fflush(stdout);
}

void ProgressBar::Draw(int aPercent)
{
	const int percent = std::clamp(aPercent, 0, 100);
	if (myTerminalFlag)
	{
		if (percent == myLastDrawn)
		{
			return;
		}
		const int filled = percent * ourWidth / 100;
		std::printf("\r%-12s [%s%s] %3d%%", myLabel.c_str(),
		            std::string(static_cast<size_t>(filled), '#').c_str(),
		            std::string(static_cast<size_t>(ourWidth - filled), '.').c_str(), percent);
	}
	else
	{
		// Off a terminal: a line at each tenth reached.
		if (myLastDrawn >= 0 && percent / 10 == myLastDrawn / 10)
		{
			return;
		}
		std::printf("%-12s %3d%%\n", myLabel.c_str(), percent);
	}
	myLastDrawn = percent;
	std::fflush(stdout);
}
} // namespace LumoraTool
