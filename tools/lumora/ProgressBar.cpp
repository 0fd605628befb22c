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

ProgressBar::ProgressBar(std::string aLabel, std::function<Progress()> aPoll)
    : myLabel(std::move(aLabel)), myPoll(std::move(aPoll)), myTerminalFlag(isatty(fileno(stdout)) != 0)
{
	// The value before the work starts may be the last job's: nothing is drawn until
	// the value moves (or the work ends).
	const int initial = myPoll().myPercent;
	myThread = std::thread([this, initial] {
		bool movedFlag = false;
		while (!myStopFlag.load())
		{
			const Progress progress = myPoll();
			movedFlag = movedFlag || progress.myPercent != initial;
			if (movedFlag)
			{
				Draw(progress);
			}
			std::this_thread::sleep_for(std::chrono::milliseconds(100));
		}
	});
}

ProgressBar::~ProgressBar()
{
	Stop();
}

void ProgressBar::Stop(bool aCompleteFlag)
{
	if (!myThread.joinable())
	{
		return;
	}
	myStopFlag = true;
	myThread.join();
	Progress last = myPoll();
	if (aCompleteFlag)
	{
		last.myPercent = 100;
	}
	Draw(last);
	if (myTerminalFlag)
	{
		std::printf("\n");
	}
	std::fflush(stdout);
}

void ProgressBar::Draw(const Progress& aProgress)
{
	const int percent = std::clamp(aProgress.myPercent, 0, 100);
	const std::string detail = aProgress.myDetail.empty() ? std::string() : "  " + aProgress.myDetail;
	if (myTerminalFlag)
	{
		if (percent == myLastDrawn && detail == myLastDetail)
		{
			return;
		}
		const int filled = percent * ourWidth / 100;
		// Padded to the last line's length, so a shorter detail leaves nothing behind.
		std::printf("\r%-12s [%s%s] %3d%%%-*s", myLabel.c_str(),
		            std::string(static_cast<size_t>(filled), '#').c_str(),
		            std::string(static_cast<size_t>(ourWidth - filled), '.').c_str(), percent,
		            static_cast<int>(std::max(detail.size(), myLastDetail.size())), detail.c_str());
	}
	else
	{
		// Off a terminal: a line at each tenth reached.
		if (myLastDrawn >= 0 && percent / 10 == myLastDrawn / 10)
		{
			return;
		}
		std::printf("%-12s %3d%%%s\n", myLabel.c_str(), percent, detail.c_str());
	}
	myLastDrawn = percent;
	myLastDetail = detail;
	std::fflush(stdout);
}
} // namespace LumoraTool
