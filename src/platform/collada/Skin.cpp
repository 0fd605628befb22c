#include "platform/collada/Skin.h"

#include <algorithm>

namespace Collada
{
void Skin::ReduceInfluences(size_t aMaxCount, float aMinWeight)
{
	for (std::vector<Influence>& influences : myInfluences)
	{
		std::erase_if(influences,
		              [&](const Influence& anInfluence) { return anInfluence.myWeight < aMinWeight; });
		// Stable, so equal weights keep the file's order and the result does not depend on the sort.
		std::stable_sort(
		    influences.begin(), influences.end(),
		    [](const Influence& aLeft, const Influence& aRight) { return aLeft.myWeight > aRight.myWeight; });
		if (influences.size() > aMaxCount)
		{
			influences.resize(aMaxCount);
		}
		float sum = 0.0f;
		for (const Influence& influence : influences)
		{
			sum += influence.myWeight;
		}
		if (sum > 0.0f)
		{
			for (Influence& influence : influences)
			{
				influence.myWeight /= sum;
			}
		}
	}
}
} // namespace Collada
