#pragma once
// AmbientGrid: the probe grid of the ambient bake over a level's rooms: the rooms'
// common bounding box, a probe every 2 units from 1 unit inside its minimum corner,
// and the cells of the seven coefficient blocks (x fastest, then y, then z).
//
//   Zeph::AmbientGrid grid = Zeph::AmbientGrid::FromRooms(rooms);
//   if (grid.IsEmpty()) { ... no rooms, or rooms of no extent ... }
//   if (std::string problem = grid.GetSizeProblem(); !problem.empty()) { ... refused ... }
//   grid.ForEachProbe([&](const Vector3<float>& aPosition, int anX, int aY, int aZ, size_t aCell) { ... });
//
// The grid is worked out before anything is allocated, so a level too large to bake is
// refused with its numbers instead of running out of memory part-way.
#include <cstddef>
#include <string>

#include "core/GrowingArray.h"
#include "core/Vector3.h"

namespace Zeph
{
class Room;

struct AmbientGrid
{
	static constexpr float ourProbeSpacing = 2.0f;
	// Each cell holds seven 32-bit texels, on the CPU while the bake runs and again in
	// the seven 3D textures.
	static constexpr long long ourBytesPerCell = 28;
	// The most the blocks of one bake may take (1 GiB: about 38 million cells).
	static constexpr long long ourMaxBlockBytes = 1LL << 30;

	Vector3<float> myWorldMin{0.0f, 0.0f, 0.0f};
	Vector3<float> myWorldMax{0.0f, 0.0f, 0.0f};
	Vector3<float> myWorldSize{0.0f, 0.0f, 0.0f};
	// The probe counts, ceil(size / 2) per axis; 0 on every axis when the grid is empty.
	// Counts too large for an int are held at the largest int (the grid is then refused).
	int myCounts[3] = {0, 0, 0};

	static AmbientGrid FromRooms(const GrowingArray<Room*>& someRooms);

	// No rooms, or rooms whose box has no extent (or no finite extent) on some axis.
	bool IsEmpty() const { return myCounts[0] <= 0 || myCounts[1] <= 0 || myCounts[2] <= 0; }
	long long GetCellCount() const;
	// Why the grid cannot be baked (more than 2048 probes along an axis, or blocks over
	// the memory limit), with the probe counts, the memory needed and the limit; empty
	// when it can.
	std::string GetSizeProblem() const;
	// The probes that lie strictly inside at least one room: the ones a bounce renders.
	long long CountProbesInside(const GrowingArray<Room*>& someRooms) const;
	static bool StrictlyInsideAnyRoom(const GrowingArray<Room*>& someRooms, const Vector3<float>& aPoint);

	// Every visited probe position, z outermost and x innermost, stepping 2 units from 1
	// unit above the minimum while strictly below the maximum: an axis whose size is not
	// a multiple of 2 has one position fewer than its count, and that layer is not visited.
	template <typename Function> void ForEachProbe(Function&& aFunction) const
	{
		int iz = 0;
		for (float z = myWorldMin.z + 1.0f; z < myWorldMax.z; z += ourProbeSpacing, ++iz)
		{
			int iy = 0;
			for (float y = myWorldMin.y + 1.0f; y < myWorldMax.y; y += ourProbeSpacing, ++iy)
			{
				int ix = 0;
				for (float x = myWorldMin.x + 1.0f; x < myWorldMax.x; x += ourProbeSpacing, ++ix)
				{
					const size_t cell = (static_cast<size_t>(iz) * static_cast<size_t>(myCounts[1]) +
					                     static_cast<size_t>(iy)) *
					                        static_cast<size_t>(myCounts[0]) +
					                    static_cast<size_t>(ix);
					aFunction(Vector3<float>(x, y, z), ix, iy, iz, cell);
				}
			}
		}
	}
};
} // namespace Zeph
