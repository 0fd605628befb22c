#pragma once
// LevelProblem: one thing wrong in a level's files, as the level check reports it and the
// problems panel lists it. A plain record filled field by field from the check's report, so
// its members are named as the report names them.
#include <QString>

namespace LumoraEditor
{
struct LevelProblem
{
	// The file, relative to the data folder where it lies inside it.
	QString file;
	// Where in the file: the element (and attribute) named by the check, or empty.
	QString element;
	QString message;
	// In a file that a bake writes: baking the level again replaces it.
	bool bakedFlag = false;
};
} // namespace LumoraEditor
