#include "view/MovingResolution.h"

#include <algorithm>

namespace LumoraEditor
{
int NextMovingDivisor(int aDivisor, double aFrameMs)
{
	const int divisor = std::clamp(aDivisor, ourSmallestMovingDivisor, ourLargestMovingDivisor);
	if (aFrameMs > ourMovingFrameBudgetMs)
	{
		return std::min(divisor + 1, ourLargestMovingDivisor);
	}
	// A step sharper draws (d / (d - 1))^2 times the pixels; it is taken when that still leaves a
	// fifth of the budget, so that the divisor does not swing between two steps.
	const double sharper = divisor - 1.0;
	if (divisor > ourSmallestMovingDivisor &&
	    aFrameMs * (divisor * divisor) / (sharper * sharper) < 0.8 * ourMovingFrameBudgetMs)
	{
		return divisor - 1;
	}
	return divisor;
}
} // namespace LumoraEditor
