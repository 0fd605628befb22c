#include "model/TransformationNodeHierarchy.h"

namespace Zeph
{
Matrix44<float> TransformationNodeHierarchy::GetTransformationForTime(double aTime) const
{
	if (myChildren.empty())
	{
		return myOrientation;
	}
	Matrix44<float> result = myChildren.front()->GetTransformationForTime(aTime);
	for (size_t index = 1; index < myChildren.size(); ++index)
	{
		result *= myChildren[index]->GetTransformationForTime(aTime);
	}
	return result;
}
} // namespace Zeph
