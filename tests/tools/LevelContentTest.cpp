// The generated sample levels and catalogues, read back from the files the way the editor reads them:
// every required value present and written as the editor's savers write it; room bounds that fit their
// shells exactly, with every door joined to a neighbour's door; lights inside rooms and reaching a
// surface; path graphs that are a chain and a ring through door openings; decals lying on the room
// surfaces they face; and every entity type, decal type, model and texture named anywhere existing.

#include <gtest/gtest.h>
#include <tinyxml.h>

#include <algorithm>
#include <array>
#include <bitset>
#include <cmath>
#include <functional>
#include <locale>
#include <map>
#include <set>
#include <sstream>
#include <string>
#include <vector>

#include "GeneratedContent.h"
#include "Models.h"
#include "RoomShapes.h"
#include "core/Matrix44.h"
#include "engine/Debug.h"
#include "support/TestSupport.h"
#include "xml/XML.h"

namespace
{
using ContentTestSupport::Dot;
using ContentTestSupport::GeneratedContent;
using Vec = Vector3<float>;

const char* const ourLevels[] = {"sample_small", "sample_large"};
const char* const ourLevelFiles[] = {"rooms.xml", "entities.xml", "lights.xml", "nodegraph.xml",
                                     "decals.xml"};
constexpr float ourTolerance = 1e-3f;

float Component(const Vec& aVector, int anAxis)
{
	return anAxis == 0 ? aVector.x : (anAxis == 1 ? aVector.y : aVector.z);
}

struct Box
{
	Vec myMin;
	Vec myMax;

	// aMargin > 0 keeps that far from every face; a negative margin lets a point lie just outside.
	bool Contains(const Vec& aPoint, float aMargin) const
	{
		for (int axis = 0; axis < 3; ++axis)
		{
			const float value = Component(aPoint, axis);
			if (value < Component(myMin, axis) + aMargin || value > Component(myMax, axis) - aMargin)
			{
				return false;
			}
		}
		return true;
	}
};

struct Door
{
	Vec myCenter; // at floor level
	Vec myOutward;
	float myWidth = 0.0f;
	float myHeight = 0.0f;
};

struct Room
{
	std::string myId;
	Box myBox;
	std::vector<Door> myDoors; // from the shell placed in the room
	int myShells = 0;
};

struct Entity
{
	std::string myType;
	Vec myPosition;
	Vec myRotation;
};

struct Light
{
	bool mySpotFlag = false;
	Vec myPosition;
	Vector4<float> myColor;
	float myFalloff = 0.0f;
	Vec myDirection;
	float myInner = 0.0f;
	float myOuter = 0.0f;
};

struct Edge
{
	int myFirst = 0;
	int mySecond = 0;
	float myDistance = 0.0f;
};

struct Decal
{
	std::string myType;
	Vec myPosition;
	Vec myNorm;
	float mySize = 0.0f;
	float myDepth = 0.0f;
};

struct Level
{
	std::vector<Room> myRooms;
	std::vector<Entity> myEntities;
	std::vector<Light> myLights;
	std::vector<std::pair<int, Vec>> myNodes;
	std::vector<Edge> myEdges;
	int myNodeCount = -1;
	int myEdgeCount = -1;
	std::vector<Decal> myDecals;
};

// While it lives the editor's cursor reads under a log of its own, and every report it makes (a
// missing element or attribute, named with its file) fails the test that read.
class ReportsFail
{
public:
	ReportsFail()
	{
		EXPECT_TRUE(Debug::Create(myScratch.File("log.txt"), std::bitset<4>(0)));
		Debug::SetReportListener(
		    [](Debug::AssertLevels, int, const char*, const char* aMessage) { ADD_FAILURE() << aMessage; });
	}
	~ReportsFail()
	{
		Debug::SetReportListener({});
		Debug::Destroy();
	}

private:
	TestSupport::ScratchDir myScratch;
};

// Calls aRead with the cursor on each aRecord of the section aFirst (or aSecond below it); a section
// that is missing or holds no such record fails.
void ForEach(const std::string& aFile, const char* aFirst, const char* aSecond, const char* aRecord,
             const std::function<void(XML&)>& aRead)
{
	XML xml(GeneratedContent::Get().Path(aFile));
	if (!xml.GoToElement(aFirst, aSecond, "") || !xml.EnterChild(aRecord))
	{
		ADD_FAILURE() << aFile << ": no <" << aRecord << "> in <" << aFirst << "> " << aSecond;
		return;
	}
	do
	{
		aRead(xml);
	} while (xml.GoToNextSibling(aRecord));
}

// The entity catalogue as id, component type and model path per record.
std::vector<std::array<std::string, 3>> EntityTypes()
{
	std::vector<std::array<std::string, 3>> types;
	ForEach("XML/EntityTypes.xml", "entities", "", "entity", [&](XML& anXml) {
		types.push_back({anXml.GetAttribute<std::string>("id"),
		                 anXml.GetChildAttribute<std::string>("visual-component", "type"),
		                 anXml.GetChildAttribute<std::string>("visual-component", "filepath")});
	});
	return types;
}

// The orientation the editor builds for an entity: translation, then z, y and x rotations in degrees.
Matrix44<float> Orientation(const Entity& anEntity)
{
	const float degrees = 0.01745329238474369f;
	Matrix44<float> orientation;
	orientation.SetPosition(anEntity.myPosition);
	orientation *= Matrix33<float>::CreateRotateAroundZ(anEntity.myRotation.z * degrees);
	orientation *= Matrix33<float>::CreateRotateAroundY(anEntity.myRotation.y * degrees);
	orientation *= Matrix33<float>::CreateRotateAroundX(anEntity.myRotation.x * degrees);
	return orientation;
}

// A model-space point (aW 1) or direction (aW 0) in world space.
Vec Transform(const Content::Vec3& aPoint, const Matrix44<float>& anOrientation, float aW)
{
	return Vec(Vector4<float>(static_cast<float>(aPoint.x), static_cast<float>(aPoint.y),
	                          static_cast<float>(aPoint.z), aW) *
	           anOrientation);
}

// Reads the five files as the editor does (rooms with their x mirrored back) and ties every room
// shell to the room whose box holds all of its vertices, taking over the shell's doors in world space.
Level LoadLevel(const std::string& aName)
{
	const ReportsFail reportsFail;
	Level level;
	const std::string folder = "XML/levels/" + aName + "/";
	ForEach(folder + "rooms.xml", "rooms", "", "room", [&](XML& anXml) {
		Vec min = anXml.GetVector3Attribute("min");
		Vec max = anXml.GetVector3Attribute("max");
		const float mirroredMin = -min.x;
		const float mirroredMax = -max.x;
		min.x = std::min(mirroredMin, mirroredMax);
		max.x = std::max(mirroredMin, mirroredMax);
		level.myRooms.push_back({anXml.GetChildAttribute<std::string>("id", ""), {min, max}, {}, 0});
	});
	ForEach(folder + "entities.xml", "entities", "", "entity", [&](XML& anXml) {
		level.myEntities.push_back({anXml.GetAttribute<std::string>("type"),
		                            anXml.GetVector3Attribute("position"),
		                            anXml.GetVector3Attribute("rotation")});
	});
	for (const bool spotFlag : {false, true})
	{
		ForEach(folder + "lights.xml", spotFlag ? "spot-lights" : "point-lights", "",
		        spotFlag ? "spot-light" : "point-light", [&](XML& anXml) {
			        level.myLights.push_back(
			            {spotFlag, anXml.GetVector3Attribute("position"), anXml.GetVector4Attribute("color"),
			             anXml.GetChildAttribute<float>("falloff", ""),
			             spotFlag ? anXml.GetVector3Attribute("direction") : Vec(0.0f, 0.0f, 0.0f),
			             spotFlag ? anXml.GetChildAttribute<float>("angles", "inner") : 0.0f,
			             spotFlag ? anXml.GetChildAttribute<float>("angles", "outer") : 0.0f});
		        });
	}
	const std::string graph = folder + "nodegraph.xml";
	ForEach(graph, "node-graph", "nodes", "node", [&](XML& anXml) {
		level.myNodes.push_back({anXml.GetAttribute<int>("id"), anXml.GetVector3Attribute("position")});
	});
	ForEach(graph, "node-graph", "edges", "edge", [&](XML& anXml) {
		level.myEdges.push_back({anXml.GetChildAttribute<int>("connections", "firstID"),
		                         anXml.GetChildAttribute<int>("connections", "secondID"),
		                         anXml.GetChildAttribute<float>("distance", "")});
	});
	XML counts(GeneratedContent::Get().Path(graph));
	EXPECT_TRUE(counts.GoToElement("node-graph", "nodes", "")) << graph;
	level.myNodeCount = counts.GetAttribute<int>("number-of-nodes");
	EXPECT_TRUE(counts.GoToElement("node-graph", "edges", "")) << graph;
	level.myEdgeCount = counts.GetAttribute<int>("number-of-edges");
	ForEach(folder + "decals.xml", "decals", "", "decal", [&](XML& anXml) {
		level.myDecals.push_back({anXml.GetChildAttribute<std::string>("decal-type", ""),
		                          anXml.GetVector3Attribute("position"), anXml.GetVector3Attribute("norm"),
		                          anXml.GetChildAttribute<float>("size", ""),
		                          anXml.GetChildAttribute<float>("depth", "")});
	});

	static const std::vector<Content::ModelDescription> ourModels = Content::BuildModels();
	std::map<std::string, std::string> modelsByType; // "crate" -> "crate", from the model paths
	for (const auto& [id, kind, path] : EntityTypes())
	{
		const std::string file = path.substr(path.find_last_of('/') + 1);
		modelsByType[id] = file.substr(0, file.find('.'));
	}
	for (const Entity& entity : level.myEntities)
	{
		const auto model = modelsByType.find(entity.myType);
		const Content::RoomShape* shape =
		    model != modelsByType.end() ? Content::FindRoomShape(model->second) : nullptr;
		if (!shape)
		{
			continue;
		}
		const auto description = std::find_if(ourModels.begin(), ourModels.end(), [&](const auto& aModel) {
			return aModel.myName == shape->myName;
		});
		if (description == ourModels.end())
		{
			ADD_FAILURE() << "no model " << shape->myName;
			continue;
		}
		const Matrix44<float> orientation = Orientation(entity);
		Box bounds{Vec(1e9f, 1e9f, 1e9f), Vec(-1e9f, -1e9f, -1e9f)};
		for (const Content::MeshVertex& vertex : description->myMesh.GetVertices())
		{
			const Vec world = Transform(vertex.myPosition, orientation, 1.0f);
			bounds.myMin = Vec(std::min(bounds.myMin.x, world.x), std::min(bounds.myMin.y, world.y),
			                   std::min(bounds.myMin.z, world.z));
			bounds.myMax = Vec(std::max(bounds.myMax.x, world.x), std::max(bounds.myMax.y, world.y),
			                   std::max(bounds.myMax.z, world.z));
		}
		Room* home = nullptr;
		for (Room& room : level.myRooms)
		{
			if (room.myBox.Contains(bounds.myMin, -ourTolerance) &&
			    room.myBox.Contains(bounds.myMax, -ourTolerance))
			{
				EXPECT_EQ(home, nullptr) << aName << ": the " << entity.myType << " shell fits two rooms";
				home = &room;
			}
		}
		if (!home)
		{
			ADD_FAILURE() << aName << ": no room encloses the " << entity.myType << " shell at "
			              << entity.myPosition.x << ", " << entity.myPosition.z;
			continue;
		}
		// Enclosing is not enough for the reflections, which project onto the room's box: it must
		// be the shell's own bounds.
		EXPECT_TRUE(bounds.Contains(home->myBox.myMin, -ourTolerance) &&
		            bounds.Contains(home->myBox.myMax, -ourTolerance))
		    << aName << ": room " << home->myId << " is larger than its shell";
		++home->myShells;
		for (const Content::DoorOpening& door : Content::RoomDoors(*shape))
		{
			home->myDoors.push_back({Transform(door.myCenter, orientation, 1.0f),
			                         Transform(door.myOutward, orientation, 0.0f),
			                         static_cast<float>(door.myWidth), static_cast<float>(door.myHeight)});
		}
	}
	return level;
}

const Level& GetLevel(const std::string& aName)
{
	static std::map<std::string, Level> ourLevelsByName;
	const auto found = ourLevelsByName.find(aName);
	return found != ourLevelsByName.end() ? found->second : ourLevelsByName[aName] = LoadLevel(aName);
}

// The room holding a point at least aMargin inside its box, or null.
const Room* RoomAround(const Level& aLevel, const Vec& aPoint, float aMargin)
{
	for (const Room& room : aLevel.myRooms)
	{
		if (room.myBox.Contains(aPoint, aMargin))
		{
			return &room;
		}
	}
	return nullptr;
}

// True when aPoint lies in the opening of aDoor (on its wall plane).
bool InOpening(const Door& aDoor, const Vec& aPoint)
{
	const Vec offset = aPoint - aDoor.myCenter;
	const Vec along = Vec(0.0f, 1.0f, 0.0f).Cross(aDoor.myOutward);
	return std::abs(Dot(offset, aDoor.myOutward)) < ourTolerance &&
	       std::abs(Dot(offset, along)) <= aDoor.myWidth * 0.5f && offset.y >= -ourTolerance &&
	       offset.y <= aDoor.myHeight;
}

// Distance from aPoint inside aBox to the face whose inward normal is aNormal, or -1 when aNormal is
// not an axis of the box.
float DistanceToFace(const Box& aBox, const Vec& aPoint, const Vec& aNormal)
{
	for (int axis = 0; axis < 3; ++axis)
	{
		const float along = Component(aNormal, axis);
		if (std::abs(std::abs(along) - 1.0f) < 1e-4f)
		{
			return along > 0.0f ? Component(aPoint, axis) - Component(aBox.myMin, axis)
			                    : Component(aBox.myMax, axis) - Component(aPoint, axis);
		}
	}
	return -1.0f;
}

// Six significant digits in general notation, as the editor's savers write floats.
std::string SaverText(float aValue)
{
	std::ostringstream stream;
	stream.imbue(std::locale::classic());
	stream << aValue;
	return stream.str();
}
} // namespace

TEST(SampleLevelTest, EveryFileIsWrittenAsTheEditorSavesIt)
{
	ASSERT_EQ(GeneratedContent::Get().Error(), "");
	std::vector<std::string> files = {"XML/EntityTypes.xml", "XML/DecalTypes.xml"};
	for (const char* level : ourLevels)
	{
		for (const char* file : ourLevelFiles)
		{
			files.push_back(std::string("XML/levels/") + level + "/" + file);
		}
	}
	TestSupport::ScratchDir scratch;
	for (const std::string& file : files)
	{
		const std::string path = GeneratedContent::Get().Path(file);
		// Loaded and written back untouched by the editor's cursor: not a byte may change.
		const std::string copy = scratch.File("copy.xml");
		{
			XML xml(path);
			xml.CopyDocument(copy);
		}
		EXPECT_TRUE(TestSupport::ReadWholeFile(copy) == TestSupport::ReadWholeFile(path)) << file;
		// Every number as the savers write it, so saving after an edit changes only the edited records.
		TiXmlDocument document;
		ASSERT_TRUE(document.LoadFile(path)) << file;
		int numbers = 0;
		const std::function<void(const TiXmlElement*)> check = [&](const TiXmlElement* anElement) {
			for (const TiXmlAttribute* attribute = anElement->FirstAttribute(); attribute;
			     attribute = attribute->Next())
			{
				std::istringstream stream(attribute->Value());
				stream.imbue(std::locale::classic());
				float value = 0.0f;
				if (stream >> value && stream.peek() == std::char_traits<char>::eof())
				{
					++numbers;
					EXPECT_EQ(attribute->ValueStr(), SaverText(value)) << file << ": " << attribute->Name();
				}
			}
			for (const TiXmlElement* child = anElement->FirstChildElement(); child;
			     child = child->NextSiblingElement())
			{
				check(child);
			}
		};
		check(document.RootElement());
		EXPECT_EQ(numbers > 0, file.find("/levels/") != std::string::npos) << file;
	}
}

TEST(SampleLevelTest, RoomBoundsFitTheirShellsAndEveryDoorJoinsANeighbour)
{
	ASSERT_EQ(GeneratedContent::Get().Error(), "");
	for (const char* name : ourLevels)
	{
		const Level& level = GetLevel(name);
		ASSERT_FALSE(level.myRooms.empty()) << name;
		std::set<std::string> ids;
		for (const Room& room : level.myRooms)
		{
			EXPECT_TRUE(ids.insert(room.myId).second) << name << ": room id " << room.myId << " twice";
			EXPECT_EQ(room.myShells, 1) << name << ": room " << room.myId;
			for (const Room& other : level.myRooms)
			{
				const bool overlapFlag = &other != &room &&
				                         room.myBox.myMin.x < other.myBox.myMax.x - ourTolerance &&
				                         other.myBox.myMin.x < room.myBox.myMax.x - ourTolerance &&
				                         room.myBox.myMin.z < other.myBox.myMax.z - ourTolerance &&
				                         other.myBox.myMin.z < room.myBox.myMax.z - ourTolerance;
				EXPECT_FALSE(overlapFlag)
				    << name << ": rooms " << room.myId << " and " << other.myId << " overlap";
			}
			for (const Door& door : room.myDoors)
			{
				// Half a metre through the door, at head height: another room, or the outside.
				const Vec beyond = door.myCenter + door.myOutward * 0.5f + Vec(0.0f, 1.5f, 0.0f);
				const Room* neighbour = RoomAround(level, beyond, 0.0f);
				if (!neighbour)
				{
					EXPECT_STREQ(name, "sample_small") << "a door of " << room.myId << " leads outside";
					continue;
				}
				const bool matchedFlag = std::any_of(
				    neighbour->myDoors.begin(), neighbour->myDoors.end(), [&](const Door& anOther) {
					    return (anOther.myCenter - door.myCenter).Length() < ourTolerance &&
					           Dot(anOther.myOutward, door.myOutward) < -0.999f &&
					           std::abs(anOther.myWidth - door.myWidth) < ourTolerance &&
					           std::abs(anOther.myHeight - door.myHeight) < ourTolerance;
				    });
				EXPECT_TRUE(matchedFlag) << name << ": the door of " << room.myId << " at " << door.myCenter.x
				                         << ", " << door.myCenter.z << " meets a wall of " << neighbour->myId;
			}
		}
	}
}

TEST(SampleLevelTest, LightsStandInsideRoomsAndReachASurface)
{
	ASSERT_EQ(GeneratedContent::Get().Error(), "");
	for (const char* name : ourLevels)
	{
		const Level& level = GetLevel(name);
		for (const Light& light : level.myLights)
		{
			const Vec& at = light.myPosition;
			const Room* room = RoomAround(level, at, 0.1f);
			if (!room)
			{
				ADD_FAILURE() << name << ": the light at " << at.x << ", " << at.y << ", " << at.z
				              << " is in a wall or outside every room";
				continue;
			}
			EXPECT_GT(light.myFalloff, 0.0f) << name;
			EXPECT_TRUE(light.myColor.x >= 0.0f && light.myColor.y >= 0.0f && light.myColor.z >= 0.0f &&
			            light.myColor.x + light.myColor.y + light.myColor.z > 0.0f)
			    << name << ": light at " << at.x << ", " << at.y << ", " << at.z;
			if (!light.mySpotFlag)
			{
				continue;
			}
			// A unit direction survives the editor's normalising and saving unchanged.
			EXPECT_NEAR(light.myDirection.Length(), 1.0f, 1e-5f) << name;
			EXPECT_TRUE(0.0f < light.myOuter && light.myOuter < light.myInner && light.myInner < 1.0f)
			    << name << ": angles " << light.myInner << ", " << light.myOuter;
			// Where the cone's axis leaves the room it meets a wall, the floor or the ceiling; the
			// light must reach that far.
			float exit = 1e9f;
			for (int axis = 0; axis < 3; ++axis)
			{
				const float direction = Component(light.myDirection, axis);
				if (std::abs(direction) > 1e-6f)
				{
					const float face =
					    Component(direction > 0.0f ? room->myBox.myMax : room->myBox.myMin, axis);
					exit = std::min(exit, (face - Component(at, axis)) / direction);
				}
			}
			EXPECT_LE(exit, light.myFalloff + ourTolerance) << name << ": the spot light at " << at.x << ", "
			                                                << at.y << ", " << at.z << " lights nothing";
		}
	}
}

TEST(SampleLevelTest, PathsAreAChainAndARingThroughDoorOpenings)
{
	ASSERT_EQ(GeneratedContent::Get().Error(), "");
	for (const char* name : ourLevels)
	{
		const Level& level = GetLevel(name);
		const bool ringFlag = std::string(name) == "sample_large";
		const int count = static_cast<int>(level.myNodes.size());
		EXPECT_EQ(level.myNodeCount, count) << name;
		EXPECT_EQ(level.myEdgeCount, static_cast<int>(level.myEdges.size())) << name;
		EXPECT_EQ(static_cast<int>(level.myEdges.size()), ringFlag ? count : count - 1) << name;
		// The loader refuses (with a message) edges that name no node, join a node to itself or give
		// it a third: with those gone, the edge count and connectedness make a chain or a ring.
		const std::map<int, Vec> positions(level.myNodes.begin(), level.myNodes.end());
		std::map<int, std::vector<int>> neighbours;
		for (const Edge& edge : level.myEdges)
		{
			if (!positions.count(edge.myFirst) || !positions.count(edge.mySecond))
			{
				ADD_FAILURE() << name << ": edge " << edge.myFirst << "-" << edge.mySecond;
				continue;
			}
			neighbours[edge.myFirst].push_back(edge.mySecond);
			neighbours[edge.mySecond].push_back(edge.myFirst);
			const Vec from = positions.at(edge.myFirst);
			const Vec to = positions.at(edge.mySecond);
			EXPECT_NEAR(edge.myDistance, (to - from).Length(), 1e-5f * (to - from).Length()) << name;
			// A straight edge inside one room's box crosses no wall.
			const bool sharedFlag =
			    std::any_of(level.myRooms.begin(), level.myRooms.end(), [&](const Room& aRoom) {
				    return aRoom.myBox.Contains(from, -ourTolerance) &&
				           aRoom.myBox.Contains(to, -ourTolerance);
			    });
			EXPECT_TRUE(sharedFlag) << name << ": edge " << edge.myFirst << "-" << edge.mySecond
			                        << " runs through a wall";
		}
		for (const auto& [id, position] : positions)
		{
			// A node on a wall stands in that wall's door.
			for (const Room& room : level.myRooms)
			{
				if (!room.myBox.Contains(position, -ourTolerance) ||
				    room.myBox.Contains(position, ourTolerance))
				{
					continue;
				}
				const bool doorFlag =
				    std::any_of(room.myDoors.begin(), room.myDoors.end(),
				                [&](const Door& aDoor) { return InOpening(aDoor, position); });
				EXPECT_TRUE(doorFlag) << name << ": node " << id << " stands in a wall of " << room.myId;
			}
		}
		// Connected: a walk from the first node reaches every node.
		ASSERT_GT(count, 1) << name;
		std::set<int> reached = {level.myNodes[0].first};
		std::vector<int> pending = {level.myNodes[0].first};
		while (!pending.empty())
		{
			const int id = pending.back();
			pending.pop_back();
			for (const int next : neighbours[id])
			{
				if (reached.insert(next).second)
				{
					pending.push_back(next);
				}
			}
		}
		EXPECT_EQ(static_cast<int>(reached.size()), count) << name;
	}
}

TEST(SampleLevelTest, DecalsLieOnTheRoomSurfacesTheyFace)
{
	ASSERT_EQ(GeneratedContent::Get().Error(), "");
	for (const char* name : ourLevels)
	{
		const Level& level = GetLevel(name);
		for (const Decal& decal : level.myDecals)
		{
			EXPECT_NEAR(decal.myNorm.Length(), 1.0f, 1e-5f) << name;
			EXPECT_GT(decal.mySize, 0.0f) << name;
			const Vec& at = decal.myPosition;
			const Room* room = RoomAround(level, at, -ourTolerance);
			const float distance = room ? DistanceToFace(room->myBox, at, decal.myNorm) : -1.0f;
			// The projection box reaches the face, which faces the way the decal projects.
			EXPECT_TRUE(distance >= -ourTolerance && distance < decal.myDepth * 0.5f)
			    << name << ": the " << decal.myType << " decal at " << at.x << ", " << at.y << ", " << at.z;
			if (!room || distance < -ourTolerance)
			{
				continue;
			}
			// The decal's square stays on the face and off its doors.
			const float half = decal.mySize * 0.5f;
			for (int axis = 0; axis < 3; ++axis)
			{
				if (std::abs(Component(decal.myNorm, axis)) < 1e-3f)
				{
					EXPECT_TRUE(
					    Component(at, axis) - half >= Component(room->myBox.myMin, axis) - ourTolerance &&
					    Component(at, axis) + half <= Component(room->myBox.myMax, axis) + ourTolerance)
					    << name << ": the " << decal.myType << " decal hangs over the face's edge";
				}
			}
			for (const Door& door : room->myDoors)
			{
				const Vec along = Vec(0.0f, 1.0f, 0.0f).Cross(door.myOutward);
				const Vec offset = at - door.myCenter;
				const bool onDoorFlag = Dot(door.myOutward, decal.myNorm) < -0.999f &&
				                        std::abs(Dot(offset, along)) < half + door.myWidth * 0.5f &&
				                        offset.y - half < door.myHeight;
				EXPECT_FALSE(onDoorFlag)
				    << name << ": the " << decal.myType << " decal covers a door of " << room->myId;
			}
		}
	}
}

// Unknown entity types are passed over in silence when a level loads, so a misspelling in either
// file would leave an object out unnoticed; a placeable model outside the catalogue cannot be placed.
TEST(SampleLevelTest, EveryTypeModelAndTextureNamedExists)
{
	ASSERT_EQ(GeneratedContent::Get().Error(), "");
	const std::vector<std::string>& generated = GeneratedContent::Get().Files();
	auto exists = [&](const std::string& anEnginePath) {
		return anEnginePath.starts_with("data/") &&
		       std::find(generated.begin(), generated.end(), anEnginePath.substr(5)) != generated.end();
	};
	std::set<std::string> entityIds;
	std::set<std::string> models;
	std::set<std::string> decalIds;
	{
		const ReportsFail reportsFail; // the levels below are read under logs of their own
		for (const auto& [id, kind, path] : EntityTypes())
		{
			EXPECT_TRUE(entityIds.insert(id).second && kind == "model" && exists(path)) << id << ": " << path;
			models.insert(path.substr(5));
		}
		XML decalTypes(GeneratedContent::Get().Path("XML/DecalTypes.xml"));
		ASSERT_TRUE(decalTypes.GoToElement("decal", "", ""));
		do
		{
			const std::string id = decalTypes.GetAttribute<std::string>("id");
			EXPECT_TRUE(decalIds.insert(id).second) << "decal type " << id << " twice";
			for (const char* map : {"texture", "normal"})
			{
				EXPECT_TRUE(exists(decalTypes.GetChildAttribute<std::string>(map, "path")))
				    << id << ": " << map;
			}
		} while (decalTypes.GoToNextSibling("decal"));
	}
	for (const std::string& document : GeneratedContent::Get().Documents())
	{
		const bool volumeFlag =
		    document.starts_with("models/light_volume_") || document == "models/decal_box.dae";
		EXPECT_EQ(models.count(document), volumeFlag ? 0u : 1u) << document;
	}
	// A decal added in the editor is a "brick" until the designer picks another type.
	EXPECT_EQ(decalIds.count("brick"), 1u);
	for (const char* name : ourLevels)
	{
		for (const Entity& entity : GetLevel(name).myEntities)
		{
			EXPECT_EQ(entityIds.count(entity.myType), 1u) << name << ": entity type " << entity.myType;
		}
		for (const Decal& decal : GetLevel(name).myDecals)
		{
			EXPECT_EQ(decalIds.count(decal.myType), 1u) << name << ": decal type " << decal.myType;
		}
	}
}
