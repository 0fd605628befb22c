#pragma once
// ModelAnimationData: the four lists a model carries for the animation layers
// (transformation records, named records, matrix records and integers). The model
// code loads, keeps and saves them; it gives them no meaning of its own.
//
//   const Zeph::ModelAnimationData& data = model->GetAnimationData();
//   for (const Zeph::ModelNamedRecord& record : data.myNamedRecords) { ... record.myName ... }
//
// Owned by its Model; each record owns its transformation.
#include <array>
#include <memory>
#include <string>
#include <vector>

#include "core/Matrix44.h"
#include "model/TransformationNode.h"

namespace Zeph
{
// A transformation with its matrix (set as the node's orientation).
struct ModelTransformationRecord
{
	std::unique_ptr<TransformationNode> myTransformation;
};

struct ModelNamedRecord
{
	std::string myName;
	unsigned short myValue = 0; // stored as a 32-bit integer in files
	int myFirst = 0;
	int mySecond = 0;
	std::unique_ptr<TransformationNode> myTransformation;
};

struct ModelMatrixRecord
{
	std::array<Matrix44<float>, 3> myMatrices;
	std::vector<int> myValues;
};

struct ModelAnimationData
{
	std::vector<ModelTransformationRecord> myTransformationRecords;
	std::vector<ModelNamedRecord> myNamedRecords;
	std::vector<ModelMatrixRecord> myMatrixRecords;
	std::vector<int> myIntegers;
};
} // namespace Zeph
