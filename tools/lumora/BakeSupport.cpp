#include "BakeSupport.h"

#include <cstdio>
#include <filesystem>

#include "engine/Engine.h"
#include "renderer/BakeStatus.h"

namespace LumoraTool
{
namespace
{
// The signal that asked the bake to stop (SIGINT, SIGTERM), or 0.
volatile std::sig_atomic_t ourStopSignal = 0;

void AskToStop(int aSignal)
{
	ourStopSignal = aSignal;
	// Sets one atomic flag of the running bake; a second signal ends the process.
	if (Lumora::LumoraWrapper* editor = Lumora::LumoraWrapper::GetInstance())
	{
		editor->CancelBake();
	}
}
} // namespace

StopSignals::StopSignals()
{
	struct sigaction action = {};
	action.sa_handler = &AskToStop;
	action.sa_flags = SA_RESETHAND;
	sigemptyset(&action.sa_mask);
	sigaction(SIGINT, &action, &myPreviousInterrupt);
	sigaction(SIGTERM, &action, &myPreviousTerminate);
}

StopSignals::~StopSignals()
{
	sigaction(SIGINT, &myPreviousInterrupt, nullptr);
	sigaction(SIGTERM, &myPreviousTerminate, nullptr);
}

bool StopAsked()
{
	return ourStopSignal != 0;
}

int GetStopSignal()
{
	return ourStopSignal;
}

std::string AmbientFile(const std::string& aLevel)
{
	return "data/XML/levels/" + aLevel + "/ambient.sh";
}

double SecondsSince(std::chrono::steady_clock::time_point aStart)
{
	return std::chrono::duration<double>(std::chrono::steady_clock::now() - aStart).count();
}

std::string SizeOf(const std::string& aPath)
{
	std::error_code error;
	const auto bytes = std::filesystem::file_size(aPath, error);
	return error ? std::string("missing") : std::to_string(bytes) + " bytes";
}

std::string Duration(double aSeconds)
{
	const long long seconds = static_cast<long long>(aSeconds + 0.5);
	char text[48];
	if (seconds >= 3600)
	{
		std::snprintf(text, sizeof(text), "%lld h %02lld min", seconds / 3600, seconds / 60 % 60);
	}
	else if (seconds >= 60)
	{
		std::snprintf(text, sizeof(text), "%lld min %02lld s", seconds / 60, seconds % 60);
	}
	else
	{
		std::snprintf(text, sizeof(text), "%lld s", seconds);
	}
	return text;
}

ProgressBar::Progress PollBake(const Lumora::LumoraWrapper& anEditor)
{
	const Zeph::BakeStatus status = anEditor.GetBakeStatus();
	ProgressBar::Progress progress{anEditor.GetBakeProgress(), ""};
	char text[160] = "";
	if (status.myPhase == Zeph::BakePhase::AMBIENT)
	{
		std::snprintf(text, sizeof(text), "bounce %d/%d, %lld/%lld probes", status.myBounce,
		              status.myBounceCount, status.myProbesDone, status.myProbesTotal);
	}
	else if (status.myPhase == Zeph::BakePhase::REFLECTIONS)
	{
		std::snprintf(text, sizeof(text), "%d/%d rooms", status.myRoomsDone, status.myRoomsTotal);
	}
	progress.myDetail = text;
	if (status.myPhase != Zeph::BakePhase::IDLE)
	{
		progress.myDetail += status.mySecondsLeft >= 0.0
		                         ? ", " + Duration(status.mySecondsLeft) + " left"
		                         : ", " + Duration(status.myElapsedSeconds) + " so far";
	}
	return progress;
}
} // namespace LumoraTool
