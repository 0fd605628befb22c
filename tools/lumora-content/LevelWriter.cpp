#include "LevelWriter.h"

#include <cstdio>
#include <memory>
#include <vector>

#include <tinyxml.h>

#include "Catalogues.h"
#include "platform/paths/Paths.h"
#include "xml/XML.h"
#include "xml/XMLElement.h"

namespace Content
{
namespace
{
using Elements = std::vector<std::unique_ptr<XMLElement>>;

// A single value as the savers write it: one child whose attribute holds the value.
template <typename T>
void AddValue(XMLElement& aRecord, const char* aTag, const char* anAttribute, const T& aValue)
{
	XMLElement child(aTag);
	child.AddAttribute(anAttribute, aValue);
	aRecord.InsertElement(child);
}

void AddVector(XMLElement& aRecord, const char* aTag, const Vector3<float>& aVector)
{
	XMLElement child(aTag);
	child.AddVector3Attributes(aVector);
	aRecord.InsertElement(child);
}

void AddColor(XMLElement& aRecord, const char* aTag, const Vector4<float>& aColor)
{
	XMLElement child(aTag);
	child.AddVector4Attributes(aColor);
	aRecord.InsertElement(child);
}

// Appends someElements under the root of a new document and writes it to aPath. The cursor reports
// its failures to the log (stderr without one) and returns nothing, so the written file is read back
// to see that it holds what was appended.
bool WriteDocument(const std::string& aPath, const Elements& someElements, std::string& anErrorOut)
{
	const std::string target = Paths::PrepareForWrite(aPath);
	const std::string temporary = target.empty() ? std::string() : Paths::TemporaryFor(target);
	if (temporary.empty())
	{
		anErrorOut = aPath + ": cannot create its directory";
		return false;
	}
	{
		TiXmlDocument empty;
		empty.LinkEndChild(new TiXmlElement("root"));
		if (!empty.SaveFile(temporary))
		{
			anErrorOut = aPath + ": cannot be written";
			return false;
		}
	}
	{
		XML xml(temporary);
		for (const std::unique_ptr<XMLElement>& element : someElements)
		{
			xml.InsertElementAtRoot(*element, false);
		}
		xml.SaveFile();
	}
	TiXmlDocument check;
	size_t count = 0;
	if (check.LoadFile(temporary) && check.RootElement() != nullptr)
	{
		for (const TiXmlElement* child = check.RootElement()->FirstChildElement(); child != nullptr;
		     child = child->NextSiblingElement())
		{
			++count;
		}
	}
	if (count != someElements.size())
	{
		std::remove(temporary.c_str());
		anErrorOut = aPath + ": the document was not written whole";
		return false;
	}
	if (!Paths::ReplaceWith(temporary, target))
	{
		anErrorOut = aPath + ": cannot replace the old file";
		return false;
	}
	return true;
}

// rooms.xml mirrors x: the reader negates both x values and puts them in order.
std::unique_ptr<XMLElement> Rooms(const LevelDescription& aLevel)
{
	auto section = std::make_unique<XMLElement>("rooms");
	for (const LevelRoom& room : aLevel.myRooms)
	{
		XMLElement record("room");
		AddVector(record, "min", Vector3<float>(-room.myMax.x, room.myMin.y, room.myMin.z));
		AddVector(record, "max", Vector3<float>(-room.myMin.x, room.myMax.y, room.myMax.z));
		AddValue(record, "id", "value", room.myId);
		section->InsertElement(record);
	}
	return section;
}

std::unique_ptr<XMLElement> Entities(const LevelDescription& aLevel)
{
	auto section = std::make_unique<XMLElement>("entities");
	for (const LevelEntity& entity : aLevel.myEntities)
	{
		XMLElement record("entity");
		record.AddAttribute("type", entity.myType);
		AddVector(record, "position", entity.myPosition);
		AddVector(record, "rotation", entity.myRotation);
		section->InsertElement(record);
	}
	return section;
}

Elements Lights(const LevelDescription& aLevel)
{
	Elements sections;
	sections.push_back(std::make_unique<XMLElement>("point-lights"));
	for (const LevelPointLight& light : aLevel.myPointLights)
	{
		XMLElement record("point-light");
		AddVector(record, "position", light.myPosition);
		AddColor(record, "color", light.myColor);
		AddValue(record, "falloff", "value", light.myFalloff);
		sections.back()->InsertElement(record);
	}
	sections.push_back(std::make_unique<XMLElement>("spot-lights"));
	for (const LevelSpotLight& light : aLevel.mySpotLights)
	{
		XMLElement record("spot-light");
		AddVector(record, "position", light.myPosition);
		AddColor(record, "color", light.myColor);
		AddValue(record, "falloff", "value", light.myFalloff);
		AddVector(record, "direction", light.myDirection);
		XMLElement angles("angles");
		angles.AddAttribute("inner", light.myInner);
		angles.AddAttribute("outer", light.myOuter);
		record.InsertElement(angles);
		sections.back()->InsertElement(record);
	}
	return sections;
}

std::unique_ptr<XMLElement> NodeGraph(const LevelDescription& aLevel)
{
	XMLElement nodes("nodes");
	nodes.AddAttribute("number-of-nodes", static_cast<int>(aLevel.myNodes.size()));
	for (const LevelNode& node : aLevel.myNodes)
	{
		XMLElement record("node");
		record.AddAttribute("id", node.myId);
		AddVector(record, "position", node.myPosition);
		nodes.InsertElement(record);
	}
	XMLElement edges("edges");
	edges.AddAttribute("number-of-edges", static_cast<int>(aLevel.myEdges.size()));
	for (const LevelEdge& edge : aLevel.myEdges)
	{
		// The editor recomputes the distance from the nodes when it connects an edge and saves that
		// value; the same single-precision length is stored here.
		Vector3<float> first;
		Vector3<float> second;
		for (const LevelNode& node : aLevel.myNodes)
		{
			first = node.myId == edge.myFirstId ? node.myPosition : first;
			second = node.myId == edge.mySecondId ? node.myPosition : second;
		}
		XMLElement record("edge");
		XMLElement connections("connections");
		connections.AddAttribute("firstID", edge.myFirstId);
		connections.AddAttribute("secondID", edge.mySecondId);
		record.InsertElement(connections);
		AddValue(record, "distance", "value", (second - first).Length());
		edges.InsertElement(record);
	}
	auto section = std::make_unique<XMLElement>("node-graph");
	section->InsertElement(nodes);
	section->InsertElement(edges);
	return section;
}

std::unique_ptr<XMLElement> Decals(const LevelDescription& aLevel)
{
	auto section = std::make_unique<XMLElement>("decals");
	for (const LevelDecal& decal : aLevel.myDecals)
	{
		XMLElement record("decal");
		AddValue(record, "decal-type", "id", decal.myType);
		AddVector(record, "position", decal.myPosition);
		AddVector(record, "norm", decal.myNorm);
		AddColor(record, "color", decal.myColor);
		AddValue(record, "size", "value", decal.mySize);
		AddValue(record, "depth", "value", decal.myDepth);
		section->InsertElement(record);
	}
	return section;
}

Elements One(std::unique_ptr<XMLElement> anElement)
{
	Elements elements;
	elements.push_back(std::move(anElement));
	return elements;
}
} // namespace

bool WriteLevel(const std::string& aDirectory, const LevelDescription& aLevel, std::string& anErrorOut)
{
	const Elements documents[5] = {One(Rooms(aLevel)), One(Entities(aLevel)), Lights(aLevel),
	                               One(NodeGraph(aLevel)), One(Decals(aLevel))};
	for (size_t file = 0; file < ourLevelFileNames.size(); ++file)
	{
		if (!WriteDocument(aDirectory + ourLevelFileNames[file], documents[file], anErrorOut))
		{
			return false;
		}
	}
	return true;
}

bool WriteEntityTypes(const std::string& aPath, std::string& anErrorOut)
{
	auto section = std::make_unique<XMLElement>("entities");
	for (const EntityType& type : EntityTypes())
	{
		XMLElement component("visual-component");
		component.AddAttribute("type", "model");
		component.AddAttribute("filepath", type.myModelPath);
		component.AddAttribute("cast-shadow", "true");
		XMLElement record("entity");
		record.AddAttribute("id", type.myId);
		record.InsertElement(component);
		section->InsertElement(record);
	}
	return WriteDocument(aPath, One(std::move(section)), anErrorOut);
}

bool WriteDecalTypes(const std::string& aPath, std::string& anErrorOut)
{
	// The records stand directly under the root; the catalogue has no section element.
	Elements records;
	for (const DecalType& type : DecalTypes())
	{
		auto record = std::make_unique<XMLElement>("decal");
		record->AddAttribute("id", type.myId);
		XMLElement texture("texture");
		texture.AddAttribute("path", type.myTexturePath);
		XMLElement normal("normal");
		normal.AddAttribute("path", type.myNormalPath);
		record->InsertElement(texture);
		record->InsertElement(normal);
		records.push_back(std::move(record));
	}
	return WriteDocument(aPath, records, anErrorOut);
}
} // namespace Content
