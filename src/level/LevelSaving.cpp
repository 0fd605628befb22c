// Writing back what the designer edits: lights with the path graph, and decals. Each saver
// loads the level's file, empties the sections it owns, appends one record per object and
// writes the whole document back (through a temporary renamed over the file), so comments and
// sections that belong to others stay as they were. Each record is written from the editor's
// data alone; what a section held beside its records (the facade's kept content: comments,
// foreign elements, records the loader left out) goes back after the records.
#include "editor/LumoraWrapper.h"

#include <cstdio>
#include <filesystem>
#include <initializer_list>
#include <string>
#include <system_error>

#include "core/Matrix44.h"
#include "core/Vector3.h"
#include "platform/paths/Paths.h"
#include "xml/XML.h"
#include "xml/XMLElement.h"

namespace Lumora
{
namespace
{
std::string LevelFile(const std::string& aLevel, const char* aFileName)
{
	return "data/XML/levels/" + aLevel + "/" + aFileName;
}

// A level saved for the first time has no file yet: one is made holding the root and the
// sections the saver fills (and its folder, if needed). A file that exists is never touched
// here. When the file cannot be made, the cursor reports the missing file as usual.
void CreateIfMissing(const std::string& aPath, std::initializer_list<const char*> someSections)
{
	std::error_code error;
	if (std::filesystem::exists(Paths::Resolve(aPath), error))
	{
		return;
	}
	std::string text = "<root>\n";
	for (const char* section : someSections)
	{
		text += std::string("    <") + section + " />\n";
	}
	text += "</root>\n";

	const std::string target = Paths::PrepareForWrite(aPath);
	const std::string temporary = target.empty() ? std::string() : Paths::TemporaryFor(target);
	if (temporary.empty())
	{
		return;
	}
	FILE* file = std::fopen(temporary.c_str(), "w");
	if (file == nullptr)
	{
		return;
	}
	const bool writtenFlag = std::fwrite(text.data(), 1, text.size(), file) == text.size();
	if (std::fclose(file) != 0 || !writtenFlag)
	{
		std::remove(temporary.c_str());
		return;
	}
	Paths::ReplaceWith(temporary, target);
}

// A child element holding one value in its attribute "value" (or another name).
template <typename T>
void AddValueChild(XMLElement& aRecord, const char* aTag, const T& aValue, const char* aName)
{
	XMLElement child(aTag);
	child.AddAttribute(aName, aValue);
	aRecord.InsertElement(child);
}

void AddVector3Child(XMLElement& aRecord, const char* aTag, const Vector3<float>& aVector)
{
	XMLElement child(aTag);
	child.AddVector3Attributes(aVector);
	aRecord.InsertElement(child);
}

void AddVector4Child(XMLElement& aRecord, const char* aTag, const Vector4<float>& aVector)
{
	XMLElement child(aTag);
	child.AddVector4Attributes(aVector);
	aRecord.InsertElement(child);
}

// Appends what a section kept at the cursor, after the records, as it stood.
void InsertKeptText(XML& anXML, const std::string& aText)
{
	XMLElement kept("kept");
	if (!aText.empty() && kept.SetText(aText))
	{
		anXML.InsertChildrenOf(kept, false);
	}
}

// The cursor on the section under the root, emptied. A file that lacks the section is not
// reshaped: the walk leaves no cursor, RemoveChildren reports it ("No node set to remove
// children from", fatal under the facade's log) and the answer is false, so that a caller
// whose log lets it go on leaves the file as it was.
bool EmptySection(XML& anXML, const char* aSection)
{
	const bool foundFlag = anXML.GoToElement(aSection, "", "");
	anXML.RemoveChildren();
	return foundFlag;
}

void InsertPointLights(XML& anXML, const GrowingArray<Zeph::PointLightData>& someLights)
{
	for (int index = 0; index < someLights.Count(); ++index)
	{
		const Zeph::PointLightData& light = someLights[index];
		XMLElement record("point-light");
		AddVector3Child(record, "position", light.myPosition);
		AddVector4Child(record, "color", light.myColor);
		AddValueChild(record, "falloff", light.myFalloff, "value");
		anXML.InsertElement(record, false);
	}
}

void InsertSpotLights(XML& anXML, const GrowingArray<Zeph::SpotLightData>& someLights)
{
	for (int index = 0; index < someLights.Count(); ++index)
	{
		const Zeph::SpotLightData& light = someLights[index];
		XMLElement record("spot-light");
		AddVector3Child(record, "position", light.myOrientation.GetPosition());
		AddVector4Child(record, "color", light.myColor);
		AddValueChild(record, "falloff", light.myFalloff, "value");
		AddVector3Child(record, "direction", light.myOrientation.GetForward());
		XMLElement angles("angles");
		angles.AddAttribute("inner", light.myAngles.x);
		angles.AddAttribute("outer", light.myAngles.y);
		record.InsertElement(angles);
		anXML.InsertElement(record, false);
	}
}
} // namespace

void LumoraWrapper::SaveLights(const std::u16string& aLevel)
{
	const std::string level = SysSTringToStdString(aLevel);
	const std::string path = LevelFile(level, "lights.xml");
	// Held for the whole save, lights and path graph: no edit (and no frame, which rewrites the
	// edges' distances while it draws them) changes what is being written.
	Claim();
	CreateIfMissing(path, {"point-lights", "spot-lights"});
	{
		// Both sections or nothing: a file lacking either is written not at all.
		XML xml(path);
		if (EmptySection(xml, "point-lights"))
		{
			InsertPointLights(xml, myEnvironmentPointLights);
			InsertKeptText(xml, myKept.myPointLights);
			if (EmptySection(xml, "spot-lights"))
			{
				InsertSpotLights(xml, myEnvironmentSpotLights);
				InsertKeptText(xml, myKept.mySpotLights);
				// The lights are on disk before the path graph's file is opened.
				xml.SaveFile();
			}
		}
	}
	// Each file stands alone: where the log let a failed lights file pass, the path graph
	// is still written.
	SaveNodes(level);
	Release();
}

void LumoraWrapper::SaveNodes(const std::string& aLevel)
{
	// Runs inside SaveLights, under its claim.
	const std::string path = LevelFile(aLevel, "nodegraph.xml");
	CreateIfMissing(path, {"node-graph"});
	XML xml(path);
	if (!EmptySection(xml, "node-graph"))
	{
		return;
	}

	XMLElement nodes("nodes");
	nodes.AddAttribute("number-of-nodes", myNodes.Count());
	for (int index = 0; index < myNodes.Count(); ++index)
	{
		const AI::NGNode& node = myNodes[index];
		XMLElement record("node");
		record.AddAttribute("id", node.GetID());
		AddVector3Child(record, "position", node.GetPosition());
		nodes.InsertElement(record);
	}
	xml.InsertElement(nodes, false);

	XMLElement edges("edges");
	edges.AddAttribute("number-of-edges", myEdges.Count());
	for (int index = 0; index < myEdges.Count(); ++index)
	{
		const AI::NGEdge& edge = myEdges[index];
		XMLElement record("edge");
		XMLElement connections("connections");
		connections.AddAttribute("firstID", edge.GetFirstConnectionID());
		connections.AddAttribute("secondID", edge.GetSecondConnectionID());
		record.InsertElement(connections);
		AddValueChild(record, "distance", edge.GetDistance(), "value");
		edges.InsertElement(record);
	}
	xml.InsertElement(edges, false);

	// The kept children of the file's "nodes" and "edges" (records left out, comments) follow the
	// records written; the graph's other children follow both.
	xml.GoToElement("node-graph", "nodes", "");
	InsertKeptText(xml, myKept.myNodes);
	xml.GoToElement("node-graph", "edges", "");
	InsertKeptText(xml, myKept.myEdges);
	xml.GoToElement("node-graph", "", "");
	InsertKeptText(xml, myKept.myNodeGraph);
	xml.SaveFile();
}

void LumoraWrapper::SaveDecals(const std::u16string& aLevel)
{
	const std::string path = LevelFile(SysSTringToStdString(aLevel), "decals.xml");
	Claim();
	CreateIfMissing(path, {"decals"});
	{
		XML xml(path);
		if (EmptySection(xml, "decals"))
		{
			for (int index = 0; index < myDecals.Count(); ++index)
			{
				const Zeph::DecalData& decal = myDecals[index];
				XMLElement record("decal");
				AddValueChild(record, "decal-type", decal.myTypeId, "id");
				AddVector3Child(record, "position", decal.myPosition);
				AddVector3Child(record, "norm", decal.myNorm);
				AddVector4Child(record, "color", decal.myColor);
				AddValueChild(record, "size", decal.mySize, "value");
				AddValueChild(record, "depth", decal.myDepth, "value");
				xml.InsertElement(record, false);
			}
			InsertKeptText(xml, myKept.myDecals);
			xml.SaveFile();
		}
	}
	Release();
}
} // namespace Lumora
