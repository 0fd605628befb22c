#pragma once
// TransformationNodeHierarchy: a transformation made of child transformations, each
// with its own matrix (and its own kind, so a child may be animated).
//
//   auto* hierarchy = new Zeph::TransformationNodeHierarchy();
//   hierarchy->AddChild(scale);       // applied first
//   hierarchy->AddChild(translate);   // then this
//   Matrix44<float> local = hierarchy->GetTransformationForTime(0.0);   // scale * translate
//
// Owns its children. Without children it is a fixed node: its own matrix.
#include <memory>
#include <vector>

#include "model/TransformationNode.h"

namespace Zeph
{
class TransformationNodeHierarchy : public TransformationNode
{
public:
	TransformationNodeHierarchy() : TransformationNode(TransformationNode_Hierarchy) {}

	// The children's matrices at aTime multiplied in child order, first child on the
	// left: with row vectors (v * M) the first child is applied first. The node's own
	// matrix is used only when it has no children.
	Matrix44<float> GetTransformationForTime(double aTime) const override;

	// Takes ownership.
	void AddChild(TransformationNode* aChild) { myChildren.emplace_back(aChild); }
	int GetChildCount() const { return static_cast<int>(myChildren.size()); }
	const TransformationNode& GetChild(int anIndex) const
	{
		return *myChildren[static_cast<size_t>(anIndex)];
	}

private:
	std::vector<std::unique_ptr<TransformationNode>> myChildren;
};
} // namespace Zeph
