#pragma once
// BakeProgress: the percentage a bake reports after aDone of aTotal steps (rooms of the
// reflection bake): trunc(aDone / aTotal * 100), at most 100; 0 when there is nothing to do.
//
//   myBakingProgress = BakeProgress(room + 1, rooms.Count());   // 33, 66, 100 for three rooms

namespace Zeph
{
inline int BakeProgress(int aDone, int aTotal)
{
	if (aTotal <= 0 || aDone <= 0)
	{
		return 0;
	}
	const double percent = static_cast<double>(aDone) / static_cast<double>(aTotal) * 100.0;
	return percent > 100.0 ? 100 : static_cast<int>(percent);
}
} // namespace Zeph
