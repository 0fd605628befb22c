#include "renderer/AmbientGrid.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <limits>

#include "engine/Room.h"
#include "renderer/AmbientVolumeFile.h"

namespace Zeph
{
namespace
{
// Beyond this distance from the origin a float no longer holds a probe position (1 unit
// off the grid's corner, then steps of 2) exactly, and the steps would stall.
constexpr float ourMaxCoordinate = 4194304.0f;

int CountAlong(float aSize)
{
	const double count = std::ceil(static_cast<double>(aSize) / AmbientGrid::ourProbeSpacing);
	if (!(count > 0.0))
	{
		return 0;
	}
	return count >= static_cast<double>(std::numeric_limits<int>::max()) ? std::numeric_limits<int>::max()
	                                                                     : static_cast<int>(count);
}

std::string Bytes(long double aBytes)
{
	char text[64];
	if (aBytes >= 1024.0L * 1024.0L * 1024.0L)
	{
		std::snprintf(text, sizeof(text), "%.1Lf GiB", aBytes / (1024.0L * 1024.0L * 1024.0L));
	}
	else
	{
		std::snprintf(text, sizeof(text), "%.1Lf MiB", aBytes / (1024.0L * 1024.0L));
	}
	return text;
}
} // namespace

AmbientGrid AmbientGrid::FromRooms(const GrowingArray<Room*>& someRooms)
{
	// The starting corners are the engine's; the y of the maximum starts ten times lower.
	AmbientGrid grid;
	grid.myWorldMin = Vector3<float>(2000000.0f, 2000000.0f, 2000000.0f);
	grid.myWorldMax = Vector3<float>(-2000000.0f, -20000000.0f, -2000000.0f);
	for (int index = 0; index < someRooms.Count(); ++index)
	{
		const Vector3<float>& minimum = someRooms[index]->GetMin();
		const Vector3<float>& maximum = someRooms[index]->GetMax();
		grid.myWorldMin.Set(std::min(grid.myWorldMin.x, minimum.x), std::min(grid.myWorldMin.y, minimum.y),
		                    std::min(grid.myWorldMin.z, minimum.z));
		grid.myWorldMax.Set(std::max(grid.myWorldMax.x, maximum.x), std::max(grid.myWorldMax.y, maximum.y),
		                    std::max(grid.myWorldMax.z, maximum.z));
	}
	grid.myWorldSize = grid.myWorldMax - grid.myWorldMin;
	grid.myCounts[0] = CountAlong(grid.myWorldSize.x);
	grid.myCounts[1] = CountAlong(grid.myWorldSize.y);
	grid.myCounts[2] = CountAlong(grid.myWorldSize.z);
	if (grid.IsEmpty())
	{
		grid.myCounts[0] = grid.myCounts[1] = grid.myCounts[2] = 0;
	}
	return grid;
}

long long AmbientGrid::GetCellCount() const
{
	if (IsEmpty())
	{
		return 0;
	}
	// Three ints multiply to at most 2^93: held in long double, capped for the caller.
	const long double cells = static_cast<long double>(myCounts[0]) * myCounts[1] * myCounts[2];
	return cells >= static_cast<long double>(std::numeric_limits<long long>::max())
	           ? std::numeric_limits<long long>::max()
	           : static_cast<long long>(cells);
}

std::string AmbientGrid::GetSizeProblem() const
{
	if (IsEmpty())
	{
		return {};
	}
	const long double cells = static_cast<long double>(myCounts[0]) * myCounts[1] * myCounts[2];
	const long double bytes = cells * ourBytesPerCell;
	char counts[160];
	std::snprintf(counts, sizeof(counts), "%d x %d x %d = %.0Lf probes (rooms spanning %g x %g x %g units)",
	              myCounts[0], myCounts[1], myCounts[2], cells, static_cast<double>(myWorldSize.x),
	              static_cast<double>(myWorldSize.y), static_cast<double>(myWorldSize.z));
	for (const float coordinate :
	     {myWorldMin.x, myWorldMin.y, myWorldMin.z, myWorldMax.x, myWorldMax.y, myWorldMax.z})
	{
		if (!(std::fabs(coordinate) <= ourMaxCoordinate))
		{
			char where[96];
			std::snprintf(where, sizeof(where), "the rooms reach %g units from the origin; the limit is %g",
			              static_cast<double>(coordinate), static_cast<double>(ourMaxCoordinate));
			return std::string("The ambient volume cannot be baked: ") + where;
		}
	}
	const int largest = std::max({myCounts[0], myCounts[1], myCounts[2]});
	if (largest > AmbientVolume::ourMaxCount)
	{
		return std::string("The ambient volume would have ") + counts + ": " + std::to_string(largest) +
		       " along one axis, where a volume texture holds at most " +
		       std::to_string(AmbientVolume::ourMaxCount);
	}
	if (bytes > static_cast<long double>(ourMaxBlockBytes))
	{
		return std::string("The ambient volume would have ") + counts + ", which need " + Bytes(bytes) +
		       " (" + std::to_string(ourBytesPerCell) + " bytes per probe); the limit is " +
		       Bytes(static_cast<long double>(ourMaxBlockBytes));
	}
	return {};
}

bool AmbientGrid::StrictlyInsideAnyRoom(const GrowingArray<Room*>& someRooms, const Vector3<float>& aPoint)
{
	for (int index = 0; index < someRooms.Count(); ++index)
	{
		const Vector3<float>& minimum = someRooms[index]->GetMin();
		const Vector3<float>& maximum = someRooms[index]->GetMax();
		if (aPoint.x > minimum.x && aPoint.x < maximum.x && aPoint.y > minimum.y && aPoint.y < maximum.y &&
		    aPoint.z > minimum.z && aPoint.z < maximum.z)
		{
			return true;
		}
	}
	return false;
}

long long AmbientGrid::CountProbesInside(const GrowingArray<Room*>& someRooms) const
{
	long long inside = 0;
	ForEachProbe([&](const Vector3<float>& aPosition, int, int, int, size_t) {
		inside += StrictlyInsideAnyRoom(someRooms, aPosition) ? 1 : 0;
	});
	return inside;
}
} // namespace Zeph
