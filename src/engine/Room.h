#pragma once
// Room: an axis-aligned box of the level with its identifier, its reflection
// cubemap's file and index, and a red wire box that shows it in the editor.
//
//   Zeph::Room room({0, 0, 0}, {2, 4, 6});     // centre (1, 2, 3), extents (1, 2, 3)
//   room.SetID("hall");
//   room.InitDebugInstance();                  // the box model is shared by equal rooms
//   room.Render();                             // drawn over the finished frame
//   room.DestroyDebugInstance();
//
// The room owns its debug instance (the box model belongs to the model factory).
// The getter of the room's cubemap comes with the cubemap container; until then a
// room only keeps the cubemap's file name and index.
#include <string>

#include "core/AABB.h"
#include "core/GrowingArray.h"
#include "core/Sphere.h"
#include "core/Vector3.h"

namespace Zeph
{
class Instance;

class Room : public Intersection::AABB<float>
{
public:
	Room(const Vector3<float>& aMin, const Vector3<float>& aMax);
	~Room() override;
	Room(const Room&) = delete;
	Room& operator=(const Room&) = delete;

	const Vector3<float>& GetMin() const { return myMinPos; }
	const Vector3<float>& GetMax() const { return myMaxPos; }
	const Vector3<float>& GetCenterPosition() const { return myCenterPosition; }
	const std::string& GetID() const { return myID; }
	void SetID(const std::string& anID) { myID = anID; }
	const std::string& GetCubemapName() const { return myCubemapName; }
	void SetCubemapName(const std::string& aName) { myCubemapName = aName; }
	int GetCubemapIndex() const { return myCubemapIndex; }
	void SetCubemapIndex(int anIndex) { myCubemapIndex = anIndex; }

	// True when the sphere overlaps the box on all three axes; touching a face is
	// not inside.
	bool SphereInside(const Intersection::Sphere& aSphere) const;

	// The wire box: a line-list box model named after the bounds, so rooms with
	// equal bounds share one. A second call replaces the first instance.
	void InitDebugInstance();
	void DestroyDebugInstance();
	Instance* GetDebugInstance() const { return myDebugInstance; }
	// Moves the debug instance to the centre and queues it over the finished frame.
	void Render();

	// The model factory name of the debug box for these bounds.
	static std::string GetDebugModelName(const Vector3<float>& aMin, const Vector3<float>& aMax);

private:
	GrowingArray<int> myList;
	std::string myID = "NO_ID";
	std::string myCubemapName;
	int myCubemapIndex = -1;
	Instance* myDebugInstance = nullptr;
};
} // namespace Zeph
