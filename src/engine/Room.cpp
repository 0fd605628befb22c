#include "engine/Room.h"

#include <sstream>

#include "engine/Engine.h"
#include "engine/Instance.h"
#include "model/ModelFactory.h"
#include "renderer/Renderer.h"

namespace Zeph
{
Room::Room(const Vector3<float>& aMin, const Vector3<float>& aMax) : myList(25, 10, true)
{
	myMinPos = aMin;
	myMaxPos = aMax;
	myCenterPosition = (aMin + aMax) * 0.5f;
	myExtents = aMax - myCenterPosition;
}

Room::~Room()
{
	DestroyDebugInstance();
}

bool Room::SphereInside(const Intersection::Sphere& aSphere) const
{
	const float centre[3] = {myCenterPosition.x, myCenterPosition.y, myCenterPosition.z};
	const float extents[3] = {myExtents.x, myExtents.y, myExtents.z};
	const float sphere[3] = {aSphere.myPosition.x, aSphere.myPosition.y, aSphere.myPosition.z};
	for (int axis = 0; axis < 3; ++axis)
	{
		if (!(centre[axis] - extents[axis] < sphere[axis] + aSphere.myRadius &&
		      centre[axis] + extents[axis] > sphere[axis] - aSphere.myRadius))
		{
			return false;
		}
	}
	return true;
}

std::string Room::GetDebugModelName(const Vector3<float>& aMin, const Vector3<float>& aMax)
{
	std::ostringstream name;
	name << "room" << aMin.x << aMin.y << aMin.z << aMax.x << aMax.y << aMax.z;
	return name.str();
}

void Room::InitDebugInstance()
{
	DestroyDebugInstance();
	Engine* engine = Engine::GetInstance();
	if (engine == nullptr)
	{
		return;
	}
	ModelNode* box = engine->GetModelFactory().CreateAABB(GetDebugModelName(myMinPos, myMaxPos), myExtents,
	                                                      Vector4<float>(1.0f, 0.0f, 0.0f, 0.0f),
	                                                      Gpu::PrimitiveTopology::LineList);
	if (box != nullptr)
	{
		myDebugInstance = new Instance(box);
	}
}

void Room::DestroyDebugInstance()
{
	delete myDebugInstance;
	myDebugInstance = nullptr;
}

void Room::Render()
{
	Engine* engine = Engine::GetInstance();
	if (myDebugInstance == nullptr || engine == nullptr)
	{
		return;
	}
	myDebugInstance->SetPosition(myCenterPosition);
	engine->GetRenderer().RenderLateInstance(myDebugInstance);
}
} // namespace Zeph
