#pragma once
// Skin: a <controller> with a <skin>, binding a geometry's vertices to joints.
//
//   const Collada::Controller* controller = document.FindController("Armature_Cube-skin");
//   Collada::Skin skin = controller->mySkin;
//   skin.ReduceInfluences(4, 0.0f);                  // at most 4 joints per vertex, weights sum to 1
//   const Collada::Geometry* base = document.FindGeometry(skin.mySource);
//   for (const Collada::Influence& influence : skin.myInfluences[vertex]) { ... }
//
// Matrices are in the engine's row-vector convention (v * M): the reader transposes the
// column-vector matrices of the file. myInfluences has one entry per position of the base
// geometry (the <vertex_weights> count); a joint index of -1 binds to the bind shape itself.

#include <string>
#include <vector>

#include "core/Matrix44.h"

namespace Collada
{
struct Influence
{
	int myJoint = 0;
	float myWeight = 0.0f;
};

struct Skin
{
	std::string mySource; // the base geometry's id
	Matrix44<float> myBindShapeMatrix;
	std::vector<std::string> myJointNames;
	std::vector<Matrix44<float>> myInverseBindMatrices; // one per joint
	std::vector<std::vector<Influence>> myInfluences;   // one list per vertex

	// Drops the influences below aMinWeight, keeps the aMaxCount largest of each vertex (in
	// decreasing weight) and scales what is left to sum to 1. A vertex whose weights sum to 0
	// keeps them as they are.
	void ReduceInfluences(size_t aMaxCount, float aMinWeight);
};

struct Controller
{
	std::string myId;
	std::string myName;
	bool myHasSkinFlag = false; // morph controllers are kept as names only
	Skin mySkin;
	int myLine = 0;
};
} // namespace Collada
