#include "platform/collada/Document.h"

#include <fstream>
#include <iterator>
#include <tinyxml.h>

#include "platform/collada/Reader.h"
#include "platform/paths/Paths.h"
#include "platform/xmlscan/NestingScan.h"

namespace Collada
{
namespace
{
template <typename T> const T* FindById(const std::vector<T>& someItems, const std::string& anId)
{
	for (const T& item : someItems)
	{
		if (item.myId == anId)
		{
			return &item;
		}
	}
	return nullptr;
}

const Node* FindNodeIn(const std::vector<std::unique_ptr<Node>>& someNodes, const std::string& anId)
{
	for (const auto& node : someNodes)
	{
		if (node->myId == anId)
		{
			return node.get();
		}
		if (const Node* found = FindNodeIn(node->myChildren, anId))
		{
			return found;
		}
	}
	return nullptr;
}
} // namespace

bool Document::Load(const std::string& aPath, std::string& anErrorOut)
{
	Destroy();
	std::ifstream file(Paths::Resolve(aPath), std::ios::binary);
	if (!file)
	{
		anErrorOut = aPath + ": cannot open the file";
		return false;
	}
	const std::string bytes((std::istreambuf_iterator<char>(file)), std::istreambuf_iterator<char>());
	if (file.bad())
	{
		anErrorOut = aPath + ": cannot read the file";
		return false;
	}
	return LoadFromMemory(bytes.data(), bytes.size(), anErrorOut, aPath);
}

bool Document::LoadFromMemory(const void* someBytes, size_t aSize, std::string& anErrorOut,
                              const std::string& aName)
{
	Destroy();
	// TinyXML parses a terminated string; a zero byte inside the data ends the text there, which
	// then fails as an unfinished document.
	const std::string text(static_cast<const char*>(someBytes), aSize);
	// TinyXML parses nested elements by recursion; a document nested thousands deep would
	// overflow the stack inside the parser, so it is refused before parsing.
	if (const int line = XmlScan::FindTooDeep(text, XmlScan::ourMaxDepth); line > 0)
	{
		anErrorOut = aName + ": " + XmlScan::Describe(line, XmlScan::ourMaxDepth);
		return false;
	}
	TiXmlDocument xml;
	xml.Parse(text.c_str(), nullptr, TIXML_ENCODING_UTF8);
	if (xml.Error())
	{
		anErrorOut =
		    aName + ":" + std::to_string(xml.ErrorRow()) + ": not well-formed XML: " + xml.ErrorDesc();
		return false;
	}
	const TiXmlElement* root = xml.RootElement();
	if (root == nullptr)
	{
		anErrorOut = aName + ": the document has no root element";
		return false;
	}
	Reader reader(*this, aName);
	if (!reader.Read(*root, anErrorOut))
	{
		Destroy();
		return false;
	}
	return true;
}

void Document::Destroy()
{
	myAsset = Asset();
	myGeometries.clear();
	myControllers.clear();
	myMaterials.clear();
	myEffects.clear();
	myImages.clear();
	myCameras.clear();
	myLights.clear();
	myVisualScenes.clear();
	myLibraryNodes.clear();
	myScene = nullptr;
}

const Geometry* Document::FindGeometry(const std::string& anId) const
{
	return FindById(myGeometries, anId);
}

const Controller* Document::FindController(const std::string& anId) const
{
	return FindById(myControllers, anId);
}

const Material* Document::FindMaterial(const std::string& anId) const
{
	return FindById(myMaterials, anId);
}

const Effect* Document::FindEffect(const std::string& anId) const
{
	return FindById(myEffects, anId);
}

const Image* Document::FindImage(const std::string& anId) const
{
	return FindById(myImages, anId);
}

const Camera* Document::FindCamera(const std::string& anId) const
{
	return FindById(myCameras, anId);
}

const Light* Document::FindLight(const std::string& anId) const
{
	for (const Light& light : myLights)
	{
		if (light.myId == anId && light.myKind != LightKind::Undefined)
		{
			return &light;
		}
	}
	return FindById(myLights, anId);
}

const Node* Document::FindNode(const std::string& anId) const
{
	if (anId.empty())
	{
		return nullptr;
	}
	if (const Node* found = FindNodeIn(myLibraryNodes, anId))
	{
		return found;
	}
	for (const auto& scene : myVisualScenes)
	{
		if (const Node* found = FindNodeIn(scene->myNodes, anId))
		{
			return found;
		}
	}
	return nullptr;
}
} // namespace Collada
