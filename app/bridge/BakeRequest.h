#pragma once
// A bake as the bake panel asks for it.
#include <QString>
#include <QStringList>

#include "renderer/BakeStatus.h"

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

// Where a running bake is, or how the last one ended: the library's own status (a copy any
// thread may hold).
using BakeProgress = Zeph::BakeStatus;

enum class BakeOutcome
{
	FINISHED,
	CANCELLED,
	FAILED,
};
} // namespace LumoraEditor
