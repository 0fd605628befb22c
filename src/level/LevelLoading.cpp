// Loading a level into the facade: ParseLevel and the five readers it runs, one per file of
// the level's folder (rooms, entities, lights, path graph, decals).
//
// Every value a record requires is read through the cursor, whose report of a missing file,
// element or attribute ends the editor under the facade's log. What a level may lack without
// harm (a whole section, an edge's node, a decal's type) is passed over, with a message where
// the designer lost something that the file held.
#include "editor/LumoraWrapper.h"

#include <algorithm>
#include <cmath>
#include <string>

#include "core/GrowingArray.h"
#include "core/Matrix33.h"
#include "core/Matrix44.h"
#include "core/Sphere.h"
#include "core/Vector3.h"
#include "core/Vector4.h"
#include "engine/CameraInstance.h"
#include "engine/Debug.h"
#include "engine/Engine.h"
#include "engine/Instance.h"
#include "engine/Room.h"
#include "engine/RoomData.h"
#include "model/ModelFactory.h"
#include "model/ModelNode.h"
#include "renderer/CubemapContainer.h"
#include "renderer/Renderer.h"
#include "xml/XML.h"

namespace Lumora
{
namespace
{
// Degrees to radians, as the float that entity rotations have always been scaled by.
constexpr float ourDegreesToRadians = 0.01745329238474369f;

// What a level lost on loading goes to the log as an error, which the editor survives.
void ReportLeftOut(int aLine, const char* aFunction, const std::string& aMessage)
{
	if (Debug* log = Debug::GetInstance())
	{
		log->ErrorMessage(aLine, aFunction, "%s", aMessage.c_str());
	}
}

std::string LevelFolder(const std::string& aLevel)
{
	return "data/XML/levels/" + aLevel;
}

// Up, right and forward of a spot light from its stored direction. Only the direction is kept
// in the file, so the roll about it is rebuilt the same way every time.
void SetSpotOrientation(Matrix44<float>& anOrientation, Vector3<float> aDirection)
{
	const Vector3<float> forward = aDirection.Normalize();
	Vector3<float> up0(0.0f, 1.0f, 0.0f);
	if (std::abs(forward.y) == 1.0f)
	{
		up0.Set(0.0f, 0.0f, 1.0f);
	}
	Vector3<float> right = up0.Cross(forward);
	right.Normalize();
	Vector3<float> up = forward.Cross(right);
	up.Normalize();
	anOrientation.SetRotation(forward, up, right);
}
} // namespace

void LumoraWrapper::ParseLevel(const std::u16string& aLevel)
{
	// After the frame, and also after any edit or bake on another thread: the lead's claim
	// waits for the busy flag too, so a load never overlaps them.
	ClaimAfterTheFrame();
	myNodeIDCounter = 1;
	// The old selection would index into the new level's arrays.
	ResetIndices();

	const std::string level = SysSTringToStdString(aLevel);
	const std::string base = LevelFolder(level);
	ParseRooms(base + "/rooms.xml");
	// The entities are tied to the rooms that contain them, so the rooms come first.
	ParseEntities(level);
	ParseLights(base + "/lights.xml");
	ParseNodes(base + "/nodegraph.xml");
	ParseDecals(base + "/decals.xml");
	Zeph::Engine::GetInstance()->GetRenderer().SetSH(base + "/ambient.sh");

	myCameraInstance->SetOrientation(Matrix44<float>());
	myCameraInstance->SetPosition(Vector3<float>(0.0f, 10.0f, 0.0f));
	Release();
}

void LumoraWrapper::ParseRooms(const std::string& aPath)
{
	for (int index = 0; index < myRooms.Count(); ++index)
	{
		myRooms[index]->DestroyDebugInstance();
	}
	myRooms.DeleteAll();

	XML xml(aPath);
	xml.GoToElement("rooms", "", "");
	// A level has at least one room: the first is read whether or not it is there, so an empty
	// or missing section ends in the cursor's report.
	xml.EnterChild("room");
	do
	{
		Vector3<float> min = xml.GetVector3Attribute("min");
		Vector3<float> max = xml.GetVector3Attribute("max");
		std::string id = "NOT_SET";
		xml.TryGetChildAttribute<std::string>("id", id, "");

		// The file's x axis is mirrored.
		const float minX = -min.x;
		const float maxX = -max.x;
		min.x = std::min(minX, maxX);
		max.x = std::max(minX, maxX);

		Zeph::Room* room = new Zeph::Room(min, max);
		room->SetID(id);
		myRooms.Add(room);
		room->InitDebugInstance();
	} while (xml.GoToNextSibling("room"));
	xml.ExitChild();
}

void LumoraWrapper::ParseEntities(const std::string& aLevel)
{
	Zeph::Engine* engine = Zeph::Engine::GetInstance();
	Zeph::CubemapContainer& cubemaps = engine->GetCubemapContainer();
	Zeph::ModelFactory& factory = engine->GetModelFactory();
	cubemaps.Clear();
	myEntities.DeleteAll();

	XML xml(LevelFolder(aLevel) + "/entities.xml");
	// One sphere per instance, in the same order, for the room test below.
	GrowingArray<Intersection::Sphere> spheres(ourArraySize, ourArraySize, true);
	// A level without an "entities" section simply has no entities.
	if (xml.GoToElement("entities", "", "") && xml.EnterChild("entity"))
	{
		do
		{
			const std::string type = xml.GetAttribute<std::string>("type");
			const auto modelPath = myEntityBank.find(type);
			if (modelPath == myEntityBank.end())
			{
				continue;
			}
			Zeph::ModelNode* model = factory.GetModel(modelPath->second);
			if (model == nullptr)
			{
				// The factory has reported it; without a model there is nothing to place.
				continue;
			}
			Intersection::Sphere sphere = factory.GetCullShapeFromModel(modelPath->second);
			model->SetIsShadowCasterFlag(myEntityShadowCasterBank[type]);
			Zeph::Instance* instance = new Zeph::Instance(model);

			const Vector3<float> position = xml.GetVector3Attribute("position");
			const Vector3<float> rotation = xml.GetVector3Attribute("rotation");
			Matrix44<float> orientation;
			orientation.SetPosition(position);
			orientation *= Matrix33<float>::CreateRotateAroundZ(rotation.z * ourDegreesToRadians);
			orientation *= Matrix33<float>::CreateRotateAroundY(rotation.y * ourDegreesToRadians);
			orientation *= Matrix33<float>::CreateRotateAroundX(rotation.x * ourDegreesToRadians);
			instance->SetOrientation(orientation);

			const Vector4<float> center = Vector4<float>(sphere.myPosition) * orientation;
			sphere.SetPosition(Vector3<float>(center.x, center.y, center.z));
			spheres.Add(sphere);
			myEntities.Add(instance);
		} while (xml.GoToNextSibling("entity"));
		xml.ExitChild();
	}

	for (int entity = 0; entity < myEntities.Count(); ++entity)
	{
		bool inRoomFlag = false;
		// No early exit: of several containing rooms the last one in room order is kept.
		for (int roomIndex = 0; roomIndex < myRooms.Count(); ++roomIndex)
		{
			const Zeph::Room& room = *myRooms[roomIndex];
			if (!room.SphereInside(spheres[entity]))
			{
				continue;
			}
			Zeph::RoomData roomData;
			roomData.myCubemap =
			    cubemaps.GetCubemap(roomIndex, "data/Cubemaps/" + aLevel + "/" + room.GetID() + ".dds");
			roomData.myRoomIndex = roomIndex;
			roomData.myCenter = room.GetCenterPosition();
			roomData.myMax = room.GetMax();
			roomData.myMin = room.GetMin();
			myEntities[entity]->SetRoomData(roomData);
			inRoomFlag = true;
		}
		if (!inRoomFlag)
		{
			Zeph::RoomData roomData;
			roomData.myCubemap = cubemaps.GetCubemap(-1, "");
			roomData.myRoomIndex = -1;
			roomData.myCenter = Vector3<float>(0.0f, 0.0f, 0.0f);
			roomData.myMax = Vector3<float>(1.0f, 1.0f, 1.0f);
			roomData.myMin = Vector3<float>(-1.0f, -1.0f, -1.0f);
			myEntities[entity]->SetRoomData(roomData);
		}
	}
}

void LumoraWrapper::ParseLights(const std::string& aPath)
{
	// Update grows the pool again for the new lights.
	myLightGizmos.DeleteAll();
	myEnvironmentPointLights.RemoveAll();
	myEnvironmentSpotLights.RemoveAll();

	XML xml(aPath);
	// Either section may be missing: it holds no lights.
	if (xml.GoToElement("point-lights", "", "") && xml.EnterChild("point-light"))
	{
		do
		{
			Zeph::PointLightData light;
			light.myPosition = xml.GetVector3Attribute("position");
			light.myColor = xml.GetVector4Attribute("color");
			light.myFalloff = xml.GetChildAttribute<float>("falloff", "");
			myEnvironmentPointLights.Add(light);
		} while (xml.GoToNextSibling("point-light"));
		xml.ExitChild();
	}

	if (xml.GoToElement("spot-lights", "", "") && xml.EnterChild("spot-light"))
	{
		do
		{
			Zeph::SpotLightData light;
			light.myOrientation.SetPosition(xml.GetVector3Attribute("position"));
			SetSpotOrientation(light.myOrientation, xml.GetVector3Attribute("direction"));
			light.myFalloff = xml.GetChildAttribute<float>("falloff", "");
			light.myAngles.x = xml.GetChildAttribute<float>("angles", "inner");
			light.myAngles.y = xml.GetChildAttribute<float>("angles", "outer");
			light.myColor = xml.GetVector4Attribute("color");
			myEnvironmentSpotLights.Add(light);
		} while (xml.GoToNextSibling("spot-light"));
		xml.ExitChild();
	}
}

void LumoraWrapper::ParseNodes(const std::string& aPath)
{
	static constexpr const char* ourFunction = "Lumora::LumoraWrapper::ParseNodes";
	for (int index = 0; index < myEdges.Count(); ++index)
	{
		myEdges[index].DestroyDebugLine();
	}
	myEdges.RemoveAll();
	for (int index = 0; index < myNodes.Count(); ++index)
	{
		myNodes[index].DestroyDebugInstance();
	}
	myNodes.RemoveAll();

	XML xml(aPath);
	// Nodes and edges point at each other's elements, so neither array may ever grow (grow =
	// move): both keep the room they are given here, and what does not fit is refused.
	myNodes.ReInit(ourArraySize, ourArraySize, true);
	int refusedNodes = 0;
	if (xml.GoToElement("node-graph", "nodes", "") && xml.EnterChild("node"))
	{
		do
		{
			if (myNodes.Count() == ourArraySize)
			{
				++refusedNodes;
				continue;
			}
			myNodes.Add(AI::NGNode());
			AI::NGNode& node = myNodes.Last();
			node.InitDebugInstance();
			node.SetID(xml.GetAttribute<int>("id"));
			node.SetPosition(xml.GetVector3Attribute("position"));
		} while (xml.GoToNextSibling("node"));
		xml.ExitChild();
	}
	if (refusedNodes > 0)
	{
		ReportLeftOut(__LINE__, ourFunction,
		              "[" + aPath + "] holds more than " + std::to_string(ourArraySize) +
		                  " path nodes: " + std::to_string(refusedNodes) + " nodes were left out");
	}
	// The last node's ID, not the largest: new nodes continue from where the file ended.
	myNodeIDCounter = myNodes.Count() > 0 ? myNodes.Last().GetID() + 1 : 1;

	myEdges.ReInit(ourArraySize, ourArraySize, true);
	int refusedEdges = 0;
	// A graph is any set of chains and rings (at most two edges per node); nothing more is checked.
	if (xml.GoToElement("node-graph", "edges", "") && xml.EnterChild("edge"))
	{
		do
		{
			const float distance = xml.GetChildAttribute<float>("distance", "");
			const int firstID = xml.GetChildAttribute<int>("connections", "firstID");
			const int secondID = xml.GetChildAttribute<int>("connections", "secondID");
			if (myEdges.Count() == ourArraySize)
			{
				++refusedEdges;
				continue;
			}

			AI::NGNode* first = nullptr;
			AI::NGNode* second = nullptr;
			for (int index = 0; index < myNodes.Count(); ++index)
			{
				AI::NGNode& node = myNodes[index];
				if (node.GetID() == firstID)
				{
					first = &node;
				}
				else if (node.GetID() == secondID)
				{
					second = &node;
				}
			}
			// An edge needs both ends (its length and line are taken from them): an edge to a node
			// that is not there, or was refused above, is left out.
			if (first == nullptr || second == nullptr)
			{
				ReportLeftOut(__LINE__, ourFunction,
				              "Edge between path nodes " + std::to_string(firstID) + " and " +
				                  std::to_string(secondID) + " in [" + aPath +
				                  "] names a missing node: left out");
				continue;
			}

			myEdges.Add(AI::NGEdge());
			AI::NGEdge& edge = myEdges.Last();
			edge.InitDebugLine();
			edge.SetDistance(distance);
			// The stored distance gives way to the length between the two nodes.
			edge.Connect(first, second);
			first->AddEdge(&edge);
			second->AddEdge(&edge);
		} while (xml.GoToNextSibling("edge"));
		xml.ExitChild();
	}
	if (refusedEdges > 0)
	{
		ReportLeftOut(__LINE__, ourFunction,
		              "[" + aPath + "] holds more than " + std::to_string(ourArraySize) +
		                  " path edges: " + std::to_string(refusedEdges) + " edges were left out");
	}
}

void LumoraWrapper::ParseDecals(const std::string& aPath)
{
	myDecals.RemoveAll();

	XML xml(aPath);
	if (xml.GoToElement("decals", "", "") && xml.EnterChild("decal"))
	{
		do
		{
			Zeph::DecalData decal;
			decal.myTypeId = xml.GetChildAttribute<std::string>("decal-type", "");
			decal.myPosition = xml.GetVector3Attribute("position");
			decal.myNorm = xml.GetVector3Attribute("norm");
			decal.myColor = xml.GetVector4Attribute("color");
			decal.mySize = xml.GetChildAttribute<float>("size", "");
			decal.myDepth = xml.GetChildAttribute<float>("depth", "");

			const auto type = myDecalTypes.find(decal.myTypeId);
			// A decal without textures would draw nothing and could not be given a type's textures
			// back on save: it is left out, and the log says which.
			if (type == myDecalTypes.end())
			{
				ReportLeftOut(__LINE__, "Lumora::LumoraWrapper::ParseDecals",
				              "Unknown decal-type [" + decal.myTypeId + "] in [" + aPath +
				                  "]: decal left out");
				continue;
			}
			decal.myTexture = type->second.myTexture;
			decal.myNormalTexture = type->second.myNormalTexture;
			myDecals.Add(decal);
		} while (xml.GoToNextSibling("decal"));
		xml.ExitChild();
	}
}
} // namespace Lumora
