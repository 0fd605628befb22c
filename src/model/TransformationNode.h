#pragma once
// TransformationNode: the local transformation of one model node. The base holds a
// fixed matrix; the two animated kinds derive from it and override the evaluation:
// TransformationNodeHierarchy (child transformations) and TransformationNodeCurves
// (animation curves). The kind is stored in model files, so the enum takes any int.
//
//   Zeph::TransformationNode* node = new Zeph::TransformationNode();   // identity
//   Matrix44<float> local = node->GetTransformationForTime(0.0);
//
// Owned by its ModelNode.
#include "core/Matrix44.h"

namespace Zeph
{
enum TransformationNodeType : int
{
	TransformationNode_Curves = 0,
	TransformationNode_Hierarchy = 1,
};

class TransformationNode
{
public:
	explicit TransformationNode(TransformationNodeType aType = TransformationNode_Hierarchy) : myType(aType)
	{
	}
	virtual ~TransformationNode() = default;
	TransformationNode(const TransformationNode&) = delete;
	TransformationNode& operator=(const TransformationNode&) = delete;

	// The node's matrix at aTime (seconds); the fixed kind ignores the time.
	virtual Matrix44<float> GetTransformationForTime(double aTime) const
	{
		static_cast<void>(aTime);
		return myOrientation;
	}

	void SetOrientation(const Matrix44<float>& anOrientation) { myOrientation = anOrientation; }
	const Matrix44<float>& GetOrientation() const { return myOrientation; }
	TransformationNodeType GetType() const { return myType; }

protected:
	Matrix44<float> myOrientation;
	TransformationNodeType myType;
};
} // namespace Zeph
