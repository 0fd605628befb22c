#include "level/KeptContent.h"

#include <utility>

namespace Lumora
{
void KeptContent::Added(std::vector<std::string>& someParts, int aCount)
{
	someParts.resize(aCount > 0 ? static_cast<size_t>(aCount) : 0);
	if (!someParts.empty())
	{
		someParts.back().clear();
	}
}

void KeptContent::RemovedCyclic(std::vector<std::string>& someParts, int anIndex)
{
	if (anIndex < 0 || static_cast<size_t>(anIndex) >= someParts.size())
	{
		return;
	}
	if (static_cast<size_t>(anIndex) + 1 != someParts.size())
	{
		someParts[anIndex] = std::move(someParts.back());
	}
	someParts.pop_back();
}

const std::string& KeptContent::PartsOf(const std::vector<std::string>& someParts, int anIndex)
{
	static const std::string ourNone;
	return anIndex >= 0 && static_cast<size_t>(anIndex) < someParts.size() ? someParts[anIndex] : ourNone;
}
} // namespace Lumora
