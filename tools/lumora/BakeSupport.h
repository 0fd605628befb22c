#pragma once
// What the bake commands share: Ctrl-C and SIGTERM turned into a cancel of the running
// bake, and the progress bar's line for the facade's bake.
//
//   const LumoraTool::StopSignals signals;             // for as long as the bake runs
//   ProgressBar bar("ambient", [&] { return LumoraTool::PollBake(editor); });
//   editor.BakeAmbient(level, 2, false);
//   if (LumoraTool::StopAsked()) { ... cancelled: nothing more is written ... }
#include <chrono>
#include <csignal>
#include <string>

#include "ProgressBar.h"
#include "editor/LumoraWrapper.h"

namespace LumoraTool
{
// Ctrl-C and SIGTERM cancel the facade's bake for as long as an instance lives; the
// handlers reset themselves, so a second signal stops the process the usual way.
class StopSignals
{
public:
	StopSignals();
	~StopSignals();
	StopSignals(const StopSignals&) = delete;
	StopSignals& operator=(const StopSignals&) = delete;

private:
	struct sigaction myPreviousInterrupt = {};
	struct sigaction myPreviousTerminate = {};
};

// Whether a signal asked the bake to stop, and which one (SIGINT, SIGTERM; 0: none).
bool StopAsked();
int GetStopSignal();

// The level's ambient volume, as the bakes write it: "data/XML/levels/LEVEL/ambient.sh".
std::string AmbientFile(const std::string& aLevel);

double SecondsSince(std::chrono::steady_clock::time_point aStart);
// "1234 bytes", or "missing".
std::string SizeOf(const std::string& aPath);
// "42 s", "3 min 05 s", "1 h 02 min".
std::string Duration(double aSeconds);

// The bar's detail: the bounce and probes (ambient) or the room (reflections), and the
// time left once the bake has measured some of its work.
ProgressBar::Progress PollBake(const Lumora::LumoraWrapper& anEditor);
} // namespace LumoraTool
