// COLLADA documents (and XML in general): the nesting scan never lets a document deeper than its
// limit reach TinyXML; any bytes load or fail with a message. A loaded document keeps every index
// inside its source, triangulates, evaluates its transforms and reduces its skins; its import
// is a model tree that the .al writer and reader carry over unchanged.

#include <algorithm>
#include <string>
#include <tinyxml.h>
#include <vector>

#include "FuzzEntries.h"
#include "ModelTreeGuarantees.h"
#include "model/ColladaImport.h"
#include "platform/collada/Document.h"
#include "platform/xmlscan/NestingScan.h"

namespace
{
void WalkNode(const ::Collada::Node& aNode, int aDepth)
{
	// The reader refuses instance cycles; a walk deeper than any document could nest means one slipped by.
	LumoraFuzz::Require(aDepth <= 10000);
	volatile float sink = aNode.GetLocalMatrix().myMatrix[0];
	(void)sink;
	for (const ::Collada::Instance& instance : aNode.myInstances)
	{
		if (instance.myNode != nullptr)
		{
			WalkNode(*instance.myNode, aDepth + 1);
		}
	}
	for (const auto& child : aNode.myChildren)
	{
		WalkNode(*child, aDepth + 1);
	}
}
// The deepest element of a parsed (or partly parsed) document, the root's children at 1.
int DeepestElement(const TiXmlNode& aNode)
{
	int deepest = 0;
	for (const TiXmlElement* child = aNode.FirstChildElement(); child != nullptr;
	     child = child->NextSiblingElement())
	{
		deepest = std::max(deepest, 1 + DeepestElement(*child));
	}
	return deepest;
}

// The nesting scan that guards every TinyXML load never counts fewer levels than the parser
// builds (an empty element, which the parser enters without recursing, may add one).
void CheckNestingScan(const uint8_t* someData, size_t aSize)
{
	constexpr int limit = 6;
	const std::string text(reinterpret_cast<const char*>(someData), aSize);
	if (XmlScan::FindTooDeep(text, limit) == 0)
	{
		TiXmlDocument xml;
		xml.Parse(text.c_str(), nullptr, TIXML_ENCODING_UTF8);
		LumoraFuzz::Require(DeepestElement(xml) <= limit + 1);
	}
}
} // namespace

int LumoraFuzz::Collada(const uint8_t* someData, size_t aSize)
{
	CheckNestingScan(someData, aSize);
	::Collada::Document document;
	std::string error;
	if (!document.LoadFromMemory(someData, aSize, error))
	{
		Require(!error.empty() && document.GetGeometries().empty() && document.GetVisualScene() == nullptr);
		return 0;
	}
	++ourAcceptedCount;
	for (const ::Collada::Geometry& geometry : document.GetGeometries())
	{
		::Collada::Mesh mesh = geometry.myMesh;
		const size_t triangles = mesh.GetTriangleCount();
		mesh.Triangulate();
		Require(mesh.IsTriangles() && mesh.GetTriangleCount() == triangles);
		for (const ::Collada::PolygonSet& set : mesh.mySets)
		{
			for (const ::Collada::Input& input : set.myInputs)
			{
				const ::Collada::Source* source = mesh.FindSource(input.mySource);
				Require(source != nullptr && input.myIndices.size() == set.GetTriangleCount() * 3);
				for (uint32_t index : input.myIndices)
				{
					Require(source->Element(index) != nullptr || source->NameElement(index) != nullptr);
				}
			}
		}
	}
	for (const ::Collada::Controller& controller : document.GetControllers())
	{
		::Collada::Skin skin = controller.mySkin;
		skin.ReduceInfluences(4, 0.0f);
		for (const auto& influences : skin.myInfluences)
		{
			Require(influences.size() <= 4);
		}
	}
	for (const auto& scene : document.GetVisualScenes())
	{
		for (const auto& node : scene->myNodes)
		{
			WalkNode(*node, 0);
		}
	}
	std::vector<Zeph::AlTextureBinding> bindings;
	const std::unique_ptr<Zeph::ModelNode> tree = Zeph::ColladaImport::Convert(document, bindings, error);
	if (tree)
	{
		CheckModelTree(*tree, bindings);
	}
	return 0;
}
