#include "model/AnimationCurve.h"

#include <algorithm>

namespace Zeph
{
double AnimationCurve::Evaluate(double aTime) const
{
	if (myKeys.empty())
	{
		return 0.0;
	}
	if (aTime <= myKeys.front().myTime)
	{
		return myKeys.front().myValue;
	}
	if (aTime >= myKeys.back().myTime)
	{
		return myKeys.back().myValue;
	}
	// The first key after aTime; the one before it starts the segment.
	const auto after =
	    std::upper_bound(myKeys.begin(), myKeys.end(), aTime,
	                     [](double aValue, const AnimationKey& aKey) { return aValue < aKey.myTime; });
	const AnimationKey& next = *after;
	const AnimationKey& previous = *(after - 1);
	const double span = next.myTime - previous.myTime;
	if (span <= 0.0)
	{
		return next.myValue;
	}
	const double weight = (aTime - previous.myTime) / span;
	return previous.myValue + (next.myValue - previous.myValue) * weight;
}
} // namespace Zeph
