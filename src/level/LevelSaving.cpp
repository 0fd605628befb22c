// Writing back what the designer edits: lights with the path graph, and decals. Each saver
// loads the level's file, empties the sections it owns (making any that the file lacks),
// appends one record per object and writes the whole document back (through a temporary
// renamed over the file), so comments and sections that belong to others stay as they were.
// What the loader did not take in from those sections (the facade's kept content) goes back
// too: unknown attributes and children into their records, the rest after the records.
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

// Folds a record's kept content (XMLElement::GetText of it) into the record.
void AddKeptText(XMLElement& aRecord, const std::string& aText)
{
	XMLElement kept("kept");
	if (!aText.empty() && kept.SetText(aText))
	{
		aRecord.AddKept(kept);
	}
}

// Appends what a section kept at the cursor, after the records: as it stood, never folded into a
// record (a decal left out is no part of the first decal written).
void InsertKeptText(XML& anXML, const std::string& aText)
{
	XMLElement kept("kept");
	if (!aText.empty() && kept.SetText(aText))
	{
		anXML.InsertChildrenOf(kept, false);
	}
}

// The cursor on the section under the root. A file that lacks it (one written by hand with
// only the spot lights, say) gets it, empty, at the end of the root.
void GoToSection(XML& anXML, const char* aSection)
{
	if (anXML.GoToElement(aSection, "", ""))
	{
		return;
	}
	const XMLElement section(aSection);
	// Onto the root element: up from its first child, or by its name when it has no child.
	if (anXML.GoToElement("", "", ""))
	{
		anXML.ExitChild();
		anXML.InsertElement(section, false);
	}
	else
	{
		anXML.InsertElementAtRoot(section, false);
	}
	anXML.GoToElement(aSection, "", "");
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
		XML xml(path);
		GoToSection(xml, "point-lights");
		xml.RemoveChildren();
		XMLElement points("point-lights");
		for (int index = 0; index < myEnvironmentPointLights.Count(); ++index)
		{
			const Zeph::PointLightData& light = myEnvironmentPointLights[index];
			XMLElement record("point-light");
			AddVector3Child(record, "position", light.myPosition);
			AddVector4Child(record, "color", light.myColor);
			AddValueChild(record, "falloff", light.myFalloff, "value");
			AddKeptText(record, KeptContent::PartsOf(myKept.myPointLightParts, index));
			points.InsertElement(record);
		}
		xml.InsertChildrenOf(points, false);
		InsertKeptText(xml, myKept.myPointLights);

		GoToSection(xml, "spot-lights");
		xml.RemoveChildren();
		XMLElement spots("spot-lights");
		for (int index = 0; index < myEnvironmentSpotLights.Count(); ++index)
		{
			const Zeph::SpotLightData& light = myEnvironmentSpotLights[index];
			XMLElement record("spot-light");
			AddVector3Child(record, "position", light.myOrientation.GetPosition());
			AddVector4Child(record, "color", light.myColor);
			AddValueChild(record, "falloff", light.myFalloff, "value");
			AddVector3Child(record, "direction", light.myOrientation.GetForward());
			XMLElement angles("angles");
			angles.AddAttribute("inner", light.myAngles.x);
			angles.AddAttribute("outer", light.myAngles.y);
			record.InsertElement(angles);
			AddKeptText(record, KeptContent::PartsOf(myKept.mySpotLightParts, index));
			spots.InsertElement(record);
		}
		xml.InsertChildrenOf(spots, false);
		InsertKeptText(xml, myKept.mySpotLights);
		// The lights are on disk before the path graph's file is opened.
		xml.SaveFile();
	}
	SaveNodes(level);
	Release();
}

void LumoraWrapper::SaveNodes(const std::string& aLevel)
{
	// Runs inside SaveLights, under its claim.
	const std::string path = LevelFile(aLevel, "nodegraph.xml");
	CreateIfMissing(path, {"node-graph"});
	XML xml(path);
	GoToSection(xml, "node-graph");
	xml.RemoveChildren();

	XMLElement nodes("nodes");
	nodes.AddAttribute("number-of-nodes", myNodes.Count());
	for (int index = 0; index < myNodes.Count(); ++index)
	{
		const AI::NGNode& node = myNodes[index];
		XMLElement record("node");
		record.AddAttribute("id", node.GetID());
		AddVector3Child(record, "position", node.GetPosition());
		AddKeptText(record, KeptContent::PartsOf(myKept.myNodeParts, index));
		nodes.InsertElement(record);
	}

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
		AddKeptText(record, KeptContent::PartsOf(myKept.myEdgeParts, index));
		edges.InsertElement(record);
	}
	// The kept graph holds the file's "nodes" and "edges" (their records left out, comments,
	// unknown attributes), which fold into the two written here, and whatever else stood in
	// "node-graph".
	XMLElement graph("node-graph");
	graph.InsertElement(nodes);
	graph.InsertElement(edges);
	AddKeptText(graph, myKept.myNodeGraph);
	xml.InsertChildrenOf(graph, false);
	xml.SaveFile();
}

void LumoraWrapper::SaveDecals(const std::u16string& aLevel)
{
	const std::string path = LevelFile(SysSTringToStdString(aLevel), "decals.xml");
	Claim();
	CreateIfMissing(path, {"decals"});
	{
		XML xml(path);
		GoToSection(xml, "decals");
		xml.RemoveChildren();
		XMLElement section("decals");
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
			AddKeptText(record, KeptContent::PartsOf(myKept.myDecalParts, index));
			section.InsertElement(record);
		}
		xml.InsertChildrenOf(section, false);
		InsertKeptText(xml, myKept.myDecals);
		xml.SaveFile();
	}
	Release();
}
} // namespace Lumora
