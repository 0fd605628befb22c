#pragma once
// A bake as the bake panel asks for it.
#include <QString>
#include <QStringList>

namespace LumoraEditor
{
struct BakeRequest
{
	QString myLevel;
	int myBounces = 2;
	bool myAmbientFlag = true;
	bool myReflectionsFlag = true;
	// Empty: every room.
	QStringList myRoomIds;
};

// Where a running bake is (a copy any thread may hold).
struct BakeProgress
{
	bool myRunningFlag = false;
	// "ambient" or "reflections" while running.
	QString myPhase;
	int myBounce = 0;
	int myBounceCount = 0;
	long long myProbesDone = 0;
	long long myProbesTotal = 0;
	int myRoomsDone = 0;
	int myRoomsTotal = 0;
	double myElapsedSeconds = 0.0;
	// Negative until the bake can tell.
	double mySecondsLeft = -1.0;
	QString myLastMessage;
};

enum class BakeOutcome
{
	FINISHED,
	CANCELLED,
	FAILED,
};
} // namespace LumoraEditor
