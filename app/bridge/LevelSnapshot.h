#pragma once
// What the engine thread hands the user interface after loading a level: every object's
// values in the engine's order, the decal types, the rooms and the camera's start.
#include <QString>
#include <QStringList>
#include <array>
#include <utility>
#include <vector>

#include "bridge/CameraPlacement.h"
#include "core/Document.h"

namespace LumoraEditor
{
struct LevelSnapshot
{
	QString myLevel;
	// Empty when the level loaded without an error report.
	QStringList myProblems;
	Document::ObjectLists myObjects;
	QStringList myDecalTypes;
	QStringList myRoomIds;
	// Each room's box (minimum and maximum corners), in the order of myRoomIds.
	std::vector<std::pair<std::array<float, 3>, std::array<float, 3>>> myRoomBounds;
	CameraPlacement myStartView;
};
} // namespace LumoraEditor
