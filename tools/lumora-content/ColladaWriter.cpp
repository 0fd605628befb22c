#include "ColladaWriter.h"

#include <cmath>
#include <cstdio>
#include <map>
#include <vector>

#include "TextureBaker.h"

namespace Content
{
const char* const ourTextureDirectory = "data/textures/";

namespace
{
// Builds indented XML text line by line; attribute values and text are known not to need
// escaping (names, numbers and paths made here).
class XmlText
{
public:
	void Open(const std::string& aTag)
	{
		Line("<" + aTag + ">");
		++myDepth;
	}
	void Close(const std::string& aName)
	{
		--myDepth;
		Line("</" + aName + ">");
	}
	void Line(const std::string& aText) { myText += std::string(myDepth * 2, ' ') + aText + "\n"; }
	void Element(const std::string& aTag, const std::string& aName, const std::string& aText)
	{
		Line("<" + aTag + ">" + aText + "</" + aName + ">");
	}
	const std::string& Text() const { return myText; }

private:
	std::string myText;
	int myDepth = 0;
};

std::string Quoted(const std::string& aName, const std::string& aValue)
{
	return " " + aName + "=\"" + aValue + "\"";
}

std::string Join(const std::vector<double>& someValues)
{
	std::string text;
	for (const double value : someValues)
	{
		if (!text.empty())
		{
			text += ' ';
		}
		text += FormatNumber(value);
	}
	return text;
}

void WriteSource(XmlText& anXml, const std::string& anId, const std::vector<double>& someValues,
                 const std::vector<std::string>& someParams)
{
	const size_t stride = someParams.size();
	anXml.Open("source" + Quoted("id", anId));
	anXml.Element("float_array" + Quoted("id", anId + "-array") +
	                  Quoted("count", std::to_string(someValues.size())),
	              "float_array", Join(someValues));
	anXml.Open("technique_common");
	anXml.Open("accessor" + Quoted("source", "#" + anId + "-array") +
	           Quoted("count", std::to_string(someValues.size() / stride)) +
	           Quoted("stride", std::to_string(stride)));
	for (const std::string& param : someParams)
	{
		anXml.Line("<param" + Quoted("name", param) + Quoted("type", "float") + "/>");
	}
	anXml.Close("accessor");
	anXml.Close("technique_common");
	anXml.Close("source");
}

std::string TextureStem(MaterialKind aMaterial, MapKind aMap)
{
	return std::string(MaterialName(aMaterial)) + "_" + MapSuffix(aMap);
}

constexpr MapKind ourMaps[4] = {MapKind::Albedo, MapKind::Normal, MapKind::Roughness, MapKind::Occlusion};

// Distinct materials of the model, in the order of first use.
std::vector<MaterialKind> UsedMaterials(const ModelDescription& aModel)
{
	std::vector<MaterialKind> used;
	for (const ModelMaterial& binding : aModel.myMaterials)
	{
		bool seen = false;
		for (const MaterialKind kind : used)
		{
			seen = seen || kind == binding.myMaterial;
		}
		if (!seen)
		{
			used.push_back(binding.myMaterial);
		}
	}
	return used;
}

void WriteEffect(XmlText& anXml, MaterialKind aMaterial)
{
	const std::string name = MaterialName(aMaterial);
	anXml.Open("effect" + Quoted("id", name + "-fx") + Quoted("name", name));
	anXml.Open("profile_COMMON");
	for (const MapKind map : ourMaps)
	{
		const std::string stem = TextureStem(aMaterial, map);
		anXml.Open("newparam" + Quoted("sid", stem + "-surface"));
		anXml.Open("surface" + Quoted("type", "2D"));
		anXml.Element("init_from", "init_from", stem);
		anXml.Element("format", "format", "A8R8G8B8");
		anXml.Close("surface");
		anXml.Close("newparam");
		anXml.Open("newparam" + Quoted("sid", stem + "-sampler"));
		anXml.Open("sampler2D");
		anXml.Element("source", "source", stem + "-surface");
		anXml.Element("wrap_s", "wrap_s", "WRAP");
		anXml.Element("wrap_t", "wrap_t", "WRAP");
		anXml.Element("minfilter", "minfilter", "LINEAR_MIPMAP_LINEAR");
		anXml.Element("magfilter", "magfilter", "LINEAR");
		anXml.Close("sampler2D");
		anXml.Close("newparam");
	}
	auto texture = [&](const std::string& aChannel, MapKind aMap) {
		anXml.Open(aChannel);
		anXml.Line("<texture" + Quoted("texture", TextureStem(aMaterial, aMap) + "-sampler") +
		           Quoted("texcoord", "UVSET0") + "/>");
		anXml.Close(aChannel);
	};
	anXml.Open("technique" + Quoted("sid", "common"));
	anXml.Open("phong");
	anXml.Open("emission");
	anXml.Element("color", "color", "0 0 0 1");
	anXml.Close("emission");
	texture("ambient", MapKind::Occlusion);
	texture("diffuse", MapKind::Albedo);
	texture("specular", MapKind::Roughness);
	anXml.Open("shininess");
	anXml.Element("float", "float", "20");
	anXml.Close("shininess");
	anXml.Close("phong");
	anXml.Open("extra");
	anXml.Open("technique" + Quoted("profile", "FCOLLADA"));
	texture("bump", MapKind::Normal);
	anXml.Close("technique");
	anXml.Close("extra");
	anXml.Close("technique");
	anXml.Close("profile_COMMON");
	anXml.Close("effect");
}

void WriteGeometry(XmlText& anXml, const ModelDescription& aModel)
{
	const std::string& name = aModel.myName;
	const std::vector<MeshVertex>& vertices = aModel.myMesh.GetVertices();

	// Positions are shared by every vertex that writes the same numbers.
	std::map<std::string, uint32_t> positionNumbers;
	std::vector<uint32_t> positionOf(vertices.size());
	std::vector<double> positions;
	std::vector<double> normals;
	std::vector<double> coordinates;
	std::vector<double> tangents;
	std::vector<double> binormals;
	for (size_t number = 0; number < vertices.size(); ++number)
	{
		const MeshVertex& vertex = vertices[number];
		const std::vector<double> position = {vertex.myPosition.x, vertex.myPosition.y, vertex.myPosition.z};
		const auto [entry, added] =
		    positionNumbers.emplace(Join(position), static_cast<uint32_t>(positions.size() / 3));
		if (added)
		{
			positions.insert(positions.end(), position.begin(), position.end());
		}
		positionOf[number] = entry->second;
		normals.insert(normals.end(), {vertex.myNormal.x, vertex.myNormal.y, vertex.myNormal.z});
		coordinates.insert(coordinates.end(), {vertex.myU, vertex.myV});
		tangents.insert(tangents.end(), {vertex.myTangent.x, vertex.myTangent.y, vertex.myTangent.z});
		binormals.insert(binormals.end(), {vertex.myBinormal.x, vertex.myBinormal.y, vertex.myBinormal.z});
	}

	anXml.Open("geometry" + Quoted("id", name + "-mesh") + Quoted("name", name));
	anXml.Open("mesh");
	WriteSource(anXml, name + "-positions", positions, {"X", "Y", "Z"});
	WriteSource(anXml, name + "-normals", normals, {"X", "Y", "Z"});
	WriteSource(anXml, name + "-uv0", coordinates, {"S", "T"});
	WriteSource(anXml, name + "-textangents0", tangents, {"X", "Y", "Z"});
	WriteSource(anXml, name + "-texbinormals0", binormals, {"X", "Y", "Z"});
	anXml.Open("vertices" + Quoted("id", name + "-vertices"));
	anXml.Line("<input" + Quoted("semantic", "POSITION") + Quoted("source", "#" + name + "-positions") +
	           "/>");
	anXml.Close("vertices");

	for (const MeshSet& set : aModel.myMesh.GetSets())
	{
		const bool quads = set.myKind == PrimitiveKind::Quads;
		const size_t corners = quads ? 4 : 3;
		const std::string tag = quads ? "polylist" : "triangles";
		anXml.Open(tag + Quoted("material", set.myMaterial) +
		           Quoted("count", std::to_string(set.myIndices.size() / corners)));
		anXml.Line("<input" + Quoted("semantic", "VERTEX") + Quoted("source", "#" + name + "-vertices") +
		           Quoted("offset", "0") + "/>");
		anXml.Line("<input" + Quoted("semantic", "NORMAL") + Quoted("source", "#" + name + "-normals") +
		           Quoted("offset", "1") + "/>");
		for (const auto& [semantic, source] : {std::pair<std::string, std::string>{"TEXCOORD", "-uv0"},
		                                       {"TEXTANGENT", "-textangents0"},
		                                       {"TEXBINORMAL", "-texbinormals0"}})
		{
			anXml.Line("<input" + Quoted("semantic", semantic) + Quoted("source", "#" + name + source) +
			           Quoted("offset", "1") + Quoted("set", "0") + "/>");
		}
		if (quads)
		{
			std::string counts;
			for (size_t face = 0; face < set.myIndices.size() / 4; ++face)
			{
				counts += face == 0 ? "4" : " 4";
			}
			anXml.Element("vcount", "vcount", counts);
		}
		std::string indices;
		for (const uint32_t number : set.myIndices)
		{
			if (!indices.empty())
			{
				indices += ' ';
			}
			indices += std::to_string(positionOf[number]) + " " + std::to_string(number);
		}
		anXml.Element("p", "p", indices);
		anXml.Close(tag);
	}
	anXml.Close("mesh");
	anXml.Close("geometry");
}
} // namespace

std::string FormatNumber(double aValue)
{
	if (std::abs(aValue) < 5e-7)
	{
		return "0";
	}
	char text[32];
	std::snprintf(text, sizeof(text), "%.6g", aValue);
	return text;
}

std::string WriteColladaDocument(const ModelDescription& aModel)
{
	const std::string& name = aModel.myName;
	const std::vector<MaterialKind> materials = UsedMaterials(aModel);
	XmlText xml;
	xml.Line("<?xml version=\"1.0\" encoding=\"utf-8\"?>");
	xml.Open("COLLADA" + Quoted("xmlns", "http://www.collada.org/2005/11/COLLADASchema") +
	         Quoted("version", "1.4.1"));
	xml.Open("asset");
	xml.Open("contributor");
	xml.Element("authoring_tool", "authoring_tool", "lumora-content");
	xml.Close("contributor");
	// Fixed dates: the documents are generated and must not change from run to run.
	xml.Element("created", "created", "2026-01-01T00:00:00Z");
	xml.Element("modified", "modified", "2026-01-01T00:00:00Z");
	xml.Line("<unit" + Quoted("meter", "1") + Quoted("name", "meter") + "/>");
	xml.Element("up_axis", "up_axis", "Y_UP");
	xml.Close("asset");

	xml.Open("library_images");
	for (const MaterialKind material : materials)
	{
		for (const MapKind map : ourMaps)
		{
			const std::string stem = TextureStem(material, map);
			xml.Open("image" + Quoted("id", stem) + Quoted("name", stem));
			xml.Element("init_from", "init_from", ourTextureDirectory + TextureFileName(material, map));
			xml.Close("image");
		}
	}
	xml.Close("library_images");

	xml.Open("library_materials");
	for (const MaterialKind material : materials)
	{
		const std::string materialName = MaterialName(material);
		xml.Open("material" + Quoted("id", materialName) + Quoted("name", materialName));
		xml.Line("<instance_effect" + Quoted("url", "#" + materialName + "-fx") + "/>");
		xml.Close("material");
	}
	xml.Close("library_materials");

	xml.Open("library_effects");
	for (const MaterialKind material : materials)
	{
		WriteEffect(xml, material);
	}
	xml.Close("library_effects");

	xml.Open("library_geometries");
	WriteGeometry(xml, aModel);
	xml.Close("library_geometries");

	xml.Open("library_visual_scenes");
	xml.Open("visual_scene" + Quoted("id", "Scene") + Quoted("name", "Scene"));
	xml.Open("node" + Quoted("id", name + "-node") + Quoted("name", name) + Quoted("type", "NODE"));
	xml.Element("matrix" + Quoted("sid", "transform"), "matrix", "1 0 0 0 0 1 0 0 0 0 1 0 0 0 0 1");
	xml.Open("instance_geometry" + Quoted("url", "#" + name + "-mesh"));
	xml.Open("bind_material");
	xml.Open("technique_common");
	for (const ModelMaterial& binding : aModel.myMaterials)
	{
		xml.Open("instance_material" + Quoted("symbol", binding.mySymbol) +
		         Quoted("target", std::string("#") + MaterialName(binding.myMaterial)));
		xml.Line("<bind_vertex_input" + Quoted("semantic", "UVSET0") + Quoted("input_semantic", "TEXCOORD") +
		         Quoted("input_set", "0") + "/>");
		xml.Close("instance_material");
	}
	xml.Close("technique_common");
	xml.Close("bind_material");
	xml.Close("instance_geometry");
	xml.Close("node");
	xml.Close("visual_scene");
	xml.Close("library_visual_scenes");
	xml.Open("scene");
	xml.Line("<instance_visual_scene" + Quoted("url", "#Scene") + "/>");
	xml.Close("scene");
	xml.Close("COLLADA");
	return xml.Text();
}
} // namespace Content
