// COLLADA documents (and XML in general): the nesting scan never lets a document deeper than its
// limit reach TinyXML; any bytes load or fail with a message. A loaded document's import (which
// triangulates, reads every index of its sources, walks the nodes, instances included, and
// reduces the skins) is a model tree that the .al writer and reader carry over unchanged.

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

} // namespace

int LumoraFuzz::Collada(const uint8_t* someData, size_t aSize)
{
	// The nesting scan that guards every TinyXML load never counts fewer levels than the parser
	// builds (an empty element, which the parser enters without recursing, may add one).
	constexpr int limit = 6;
	const std::string text(reinterpret_cast<const char*>(someData), aSize);
	if (XmlScan::FindTooDeep(text, limit) == 0)
	{
		TiXmlDocument xml;
		xml.Parse(text.c_str(), nullptr, TIXML_ENCODING_UTF8);
		Require(DeepestElement(xml) <= limit + 1);
	}
	::Collada::Document document;
	std::string error;
	if (!document.LoadFromMemory(someData, aSize, error))
	{
		Require(!error.empty() && document.GetGeometries().empty() && document.GetVisualScene() == nullptr);
		return 0;
	}
	std::vector<Zeph::AlTextureBinding> bindings;
	const std::unique_ptr<Zeph::ModelNode> tree = Zeph::ColladaImport::Convert(document, bindings, error);
	if (tree)
	{
		CheckModelTree(*tree, bindings);
	}
	return 0;
}
