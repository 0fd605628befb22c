// Loading a level into the facade: ParseLevel and the five readers it runs, one per file of
// the level's folder (rooms, entities, lights, path graph, decals).
//
// Every value a record requires is read through the cursor, whose report of a missing file,
// element or attribute ends the editor under the facade's log. What a level may lack without
// harm (a whole section, an edge's node, a decal's type) is passed over, with a message where
// the scene lacks something that the file holds. What the sections of the three files that the
// editor rewrites hold beside the records taken (records left out, comments, unknown elements)
// goes to the facade's kept content, which the next save writes back (KeptContent.h); a record
// taken is the editor's, and is written back from its data alone.
#include "editor/LumoraWrapper.h"

#include <algorithm>
#include <climits>
#include <cmath>
#include <map>
#include <set>
#include <string>
#include <vector>

#include "core/GrowingArray.h"
#include "engine/EngineReport.h"
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
#include "xml/XMLElement.h"

namespace Lumora
{
namespace
{
// Degrees to radians, as the float that entity rotations have always been scaled by.
constexpr float ourDegreesToRadians = 0.01745329238474369f;

// What a level lost on loading goes to the log as an error, which the editor survives.
void ReportLeftOut(int aLine, const char* aFunction, const std::string& aMessage)
{
	Zeph::ReportError(aLine, aFunction, "%s", aMessage.c_str());
}

std::string LevelFolder(const std::string& aLevel)
{
	return "data/XML/levels/" + aLevel;
}

// The section under the cursor without the records named aRecord that the reader took (flagged
// in document order), as kept text.
std::string SectionBeyond(const XML& aXML, const char* aRecord, const std::vector<bool>& someTakenFlags)
{
	XMLElement section("section");
	if (!aXML.CopyCurrentElement(section))
	{
		return {};
	}
	section.RemoveChildren(aRecord, someTakenFlags);
	return section.GetText();
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

	// The room each entity stands in: of several containing rooms the last one in room order.
	myEntityRooms.assign(static_cast<size_t>(myEntities.Count()), -1);
	for (int entity = 0; entity < myEntities.Count(); ++entity)
	{
		for (int roomIndex = 0; roomIndex < myRooms.Count(); ++roomIndex)
		{
			if (myRooms[roomIndex]->SphereInside(spheres[entity]))
			{
				myEntityRooms[static_cast<size_t>(entity)] = roomIndex;
			}
		}
	}
	AssignRoomCubemaps(aLevel);
}

void LumoraWrapper::AssignRoomCubemaps(const std::string& aLevel)
{
	Zeph::CubemapContainer& cubemaps = Zeph::Engine::GetInstance()->GetCubemapContainer();
	// Each room's cubemap file is looked at once, through the path resolver: a file that is there
	// but cannot be a cubemap (a plain 2D DDS, a damaged one) is reported, and its room shows
	// the fallback, as does a room whose ID cannot name a file.
	std::vector<std::string> roomFiles;
	for (int roomIndex = 0; roomIndex < myRooms.Count(); ++roomIndex)
	{
		std::string file = Zeph::CubemapContainer::GetRoomFile(aLevel, myRooms[roomIndex]->GetID());
		std::string resolved;
		std::string problem;
		if (!file.empty() && Zeph::CubemapContainer::CheckFile(file, resolved, problem) ==
		                         Zeph::CubemapContainer::FileState::UNUSABLE)
		{
			ReportLeftOut(__LINE__, "Lumora::LumoraWrapper::ParseEntities",
			              Zeph::CubemapContainer::ourUnusableFileText + file + "] of room " +
			                  std::to_string(roomIndex) + ": " + problem +
			                  "; the room shows the fallback cubemap");
			file.clear();
		}
		roomFiles.push_back(file);
	}
	for (int entity = 0; entity < myEntities.Count(); ++entity)
	{
		const int roomIndex = myEntityRooms[static_cast<size_t>(entity)];
		Zeph::RoomData roomData;
		if (roomIndex >= 0)
		{
			const Zeph::Room& room = *myRooms[roomIndex];
			roomData.myCubemap = cubemaps.GetCubemap(roomIndex, roomFiles[static_cast<size_t>(roomIndex)]);
			roomData.myRoomIndex = roomIndex;
			roomData.myCenter = room.GetCenterPosition();
			roomData.myMax = room.GetMax();
			roomData.myMin = room.GetMin();
		}
		else
		{
			roomData.myCubemap = cubemaps.GetCubemap(-1, "");
			roomData.myRoomIndex = -1;
			roomData.myCenter = Vector3<float>(0.0f, 0.0f, 0.0f);
			roomData.myMax = Vector3<float>(1.0f, 1.0f, 1.0f);
			roomData.myMin = Vector3<float>(-1.0f, -1.0f, -1.0f);
		}
		myEntities[entity]->SetRoomData(roomData);
	}
}

void LumoraWrapper::ParseLights(const std::string& aPath)
{
	// Update grows the pool again for the new lights.
	myLightGizmos.DeleteAll();
	myEnvironmentPointLights.RemoveAll();
	myEnvironmentSpotLights.RemoveAll();
	myKept.myPointLights.clear();
	myKept.mySpotLights.clear();

	XML xml(aPath);
	// Either section may be missing: it holds no lights. Every light record is taken.
	std::vector<bool> takenFlags;
	if (xml.GoToElement("point-lights", "", ""))
	{
		if (xml.EnterChild("point-light"))
		{
			do
			{
				Zeph::PointLightData light;
				light.myPosition = xml.GetVector3Attribute("position");
				light.myColor = xml.GetVector4Attribute("color");
				light.myFalloff = xml.GetChildAttribute<float>("falloff", "");
				myEnvironmentPointLights.Add(light);
				takenFlags.push_back(true);
			} while (xml.GoToNextSibling("point-light"));
			xml.ExitChild();
		}
		myKept.myPointLights = SectionBeyond(xml, "point-light", takenFlags);
	}

	takenFlags.clear();
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
			takenFlags.push_back(true);
		} while (xml.GoToNextSibling("spot-light"));
		xml.ExitChild();
	}
	if (xml.GoToElement("spot-lights", "", ""))
	{
		myKept.mySpotLights = SectionBeyond(xml, "spot-light", takenFlags);
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
	myKept.myNodes.clear();
	myKept.myEdges.clear();
	myKept.myNodeGraph.clear();
	myKept.myNodeIDs.clear();

	XML xml(aPath);
	// Nodes and edges point at each other's elements, so neither array may ever grow (grow =
	// move): both keep the room they are given here, and what does not fit is refused.
	myNodes.ReInit(ourArraySize, ourArraySize, true);
	std::vector<bool> takenNodeFlags;
	int refusedNodes = 0;
	if (xml.GoToElement("node-graph", "nodes", "") && xml.EnterChild("node"))
	{
		do
		{
			if (myNodes.Count() == ourArraySize)
			{
				int id = 0;
				if (xml.TryGetAttribute<int>(id, "id"))
				{
					myKept.myNodeIDs.insert(id);
				}
				takenNodeFlags.push_back(false);
				++refusedNodes;
				continue;
			}
			myNodes.Add(AI::NGNode());
			AI::NGNode& node = myNodes.Last();
			node.InitDebugInstance();
			node.SetID(xml.GetAttribute<int>("id"));
			node.SetPosition(xml.GetVector3Attribute("position"));
			takenNodeFlags.push_back(true);
		} while (xml.GoToNextSibling("node"));
		xml.ExitChild();
	}
	if (refusedNodes > 0)
	{
		ReportLeftOut(__LINE__, ourFunction,
		              "[" + aPath + "] holds more than " + std::to_string(ourArraySize) + " path nodes: " +
		                  std::to_string(refusedNodes) + " nodes were left out (kept in the file)");
	}
	// The last node's ID, not the largest: new nodes continue from where the file ended
	// (TakeNodeID passes over the IDs in use).
	myNodeIDCounter =
	    myNodes.Count() > 0 && myNodes.Last().GetID() < INT_MAX ? myNodes.Last().GetID() + 1 : 1;

	// An edge is held only where it leaves the graph as the editor keeps it: two distinct nodes,
	// each found once, each ending at most two edges.
	std::map<int, int> nodesWithID;
	for (int index = 0; index < myNodes.Count(); ++index)
	{
		++nodesWithID[myNodes[index].GetID()];
	}
	const auto nodeWithID = [this](int anID) -> AI::NGNode* {
		for (int index = 0; index < myNodes.Count(); ++index)
		{
			if (myNodes[index].GetID() == anID)
			{
				return &myNodes[index];
			}
		}
		return nullptr;
	};
	const auto isFull = [](const AI::NGNode& aNode) {
		return aNode.GetEdgeSlots()[0] != nullptr && aNode.GetEdgeSlots()[1] != nullptr;
	};

	myEdges.ReInit(ourArraySize, ourArraySize, true);
	std::vector<bool> takenEdgeFlags;
	int refusedEdges = 0;
	if (xml.GoToElement("node-graph", "edges", "") && xml.EnterChild("edge"))
	{
		do
		{
			const float distance = xml.GetChildAttribute<float>("distance", "");
			const int firstID = xml.GetChildAttribute<int>("connections", "firstID");
			const int secondID = xml.GetChildAttribute<int>("connections", "secondID");
			AI::NGNode* first = nodeWithID(firstID);
			AI::NGNode* second = nodeWithID(secondID);
			std::string why;
			if (myEdges.Count() == ourArraySize)
			{
				++refusedEdges;
			}
			else if (firstID == secondID)
			{
				why = "joins a node to itself";
			}
			else if (nodesWithID[firstID] > 1 || nodesWithID[secondID] > 1)
			{
				const int shared = nodesWithID[firstID] > 1 ? firstID : secondID;
				why = "names path node " + std::to_string(shared) + ", an ID that " +
				      std::to_string(nodesWithID[shared]) + " nodes share";
			}
			else if (first == nullptr || second == nullptr)
			{
				// Its length and line are taken from both ends.
				why = "names a missing node";
			}
			else if (isFull(*first) || isFull(*second))
			{
				const int full = isFull(*first) ? firstID : secondID;
				why = "would be a third edge of path node " + std::to_string(full);
			}
			if (myEdges.Count() == ourArraySize || !why.empty())
			{
				if (!why.empty())
				{
					ReportLeftOut(__LINE__, ourFunction,
					              "Edge between path nodes " + std::to_string(firstID) + " and " +
					                  std::to_string(secondID) + " in [" + aPath + "] " + why +
					                  ": left out (kept in the file)");
				}
				for (const int id : {firstID, secondID})
				{
					if (id != 0)
					{
						myKept.myNodeIDs.insert(id);
					}
				}
				takenEdgeFlags.push_back(false);
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
			takenEdgeFlags.push_back(true);
		} while (xml.GoToNextSibling("edge"));
		xml.ExitChild();
	}
	if (refusedEdges > 0)
	{
		ReportLeftOut(__LINE__, ourFunction,
		              "[" + aPath + "] holds more than " + std::to_string(ourArraySize) + " path edges: " +
		                  std::to_string(refusedEdges) + " edges were left out (kept in the file)");
	}

	if (xml.GoToElement("node-graph", "nodes", ""))
	{
		myKept.myNodes = SectionBeyond(xml, "node", takenNodeFlags);
	}
	if (xml.GoToElement("node-graph", "edges", ""))
	{
		myKept.myEdges = SectionBeyond(xml, "edge", takenEdgeFlags);
	}
	// The first "nodes" and "edges" are the ones read, and the saver writes them anew.
	XMLElement graph("node-graph");
	if (xml.GoToElement("node-graph", "", "") && xml.CopyCurrentElement(graph))
	{
		graph.RemoveChildren("nodes", {true});
		graph.RemoveChildren("edges", {true});
		myKept.myNodeGraph = graph.GetText();
	}
}

int LumoraWrapper::TakeNodeID()
{
	std::set<int> used = myKept.myNodeIDs;
	for (int index = 0; index < myNodes.Count(); ++index)
	{
		used.insert(myNodes[index].GetID());
	}
	// 0 stands for "no node" in an edge, so IDs start at 1.
	int id = myNodeIDCounter > 0 ? myNodeIDCounter : 1;
	while (used.contains(id))
	{
		id = id < INT_MAX ? id + 1 : 1;
	}
	myNodeIDCounter = id < INT_MAX ? id + 1 : 1;
	return id;
}

void LumoraWrapper::ParseDecals(const std::string& aPath)
{
	myDecals.RemoveAll();
	myKept.myDecals.clear();

	XML xml(aPath);
	std::vector<bool> takenFlags;
	if (!xml.GoToElement("decals", "", ""))
	{
		return;
	}
	if (xml.EnterChild("decal"))
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
			// A decal without textures would draw nothing: it is left out of the scene, and the
			// log says which. The file keeps it, for a catalogue that knows its type.
			if (type == myDecalTypes.end())
			{
				ReportLeftOut(__LINE__, "Lumora::LumoraWrapper::ParseDecals",
				              "Unknown decal-type [" + decal.myTypeId + "] in [" + aPath +
				                  "]: decal left out (kept in the file)");
				takenFlags.push_back(false);
				continue;
			}
			decal.myTexture = type->second.myTexture;
			decal.myNormalTexture = type->second.myNormalTexture;
			myDecals.Add(decal);
			takenFlags.push_back(true);
		} while (xml.GoToNextSibling("decal"));
		xml.ExitChild();
	}
	myKept.myDecals = SectionBeyond(xml, "decal", takenFlags);
}
} // namespace Lumora
