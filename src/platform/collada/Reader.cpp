#include "platform/collada/Reader.h"

#include <algorithm>
#include <charconv>
#include <cstdarg>
#include <cstdio>
#include <map>
#include <set>
#include <tinyxml.h>

#include "platform/collada/Document.h"

namespace Collada
{
namespace
{
// Ends the read; caught in Reader::Read, so it never leaves the document layer.
struct ReadFault
{
	std::string myMessage;
};

constexpr int ourMaxNodeDepth = 256;

class Context
{
public:
	explicit Context(const std::string& aName) : myName(aName) {}

	[[noreturn]] void Fail(int aLine, const std::string& anElement, const std::string& aWhat) const
	{
		throw ReadFault{myName + ":" + std::to_string(aLine) + ": <" + anElement + ">: " + aWhat};
	}
	[[noreturn]] void Fail(const TiXmlElement& anElement, const std::string& aWhat) const
	{
		Fail(anElement.Row(), anElement.Value(), aWhat);
	}

	std::string myName;
};

std::string Attribute(const TiXmlElement& anElement, const char* aName)
{
	const char* value = anElement.Attribute(aName);
	return value != nullptr ? value : "";
}

std::string RequiredAttribute(const Context& aContext, const TiXmlElement& anElement, const char* aName)
{
	const char* value = anElement.Attribute(aName);
	if (value == nullptr || *value == '\0')
	{
		aContext.Fail(anElement, std::string("missing attribute '") + aName + "'");
	}
	return value;
}

const TiXmlElement* Child(const TiXmlElement& anElement, const char* aName)
{
	return anElement.FirstChildElement(aName);
}

const TiXmlElement& RequiredChild(const Context& aContext, const TiXmlElement& anElement, const char* aName)
{
	const TiXmlElement* child = anElement.FirstChildElement(aName);
	if (child == nullptr)
	{
		aContext.Fail(anElement, std::string("missing <") + aName + ">");
	}
	return *child;
}

std::string Text(const TiXmlElement& anElement)
{
	const char* text = anElement.GetText();
	return text != nullptr ? text : "";
}

bool IsSpace(char aCharacter)
{
	return aCharacter == ' ' || aCharacter == '\t' || aCharacter == '\n' || aCharacter == '\r';
}

// Calls aVisit(begin, end) for every whitespace-separated token of aText.
template <typename Visit> void ForEachToken(const std::string& aText, Visit aVisit)
{
	size_t at = 0;
	while (at < aText.size())
	{
		while (at < aText.size() && IsSpace(aText[at]))
		{
			++at;
		}
		size_t end = at;
		while (end < aText.size() && !IsSpace(aText[end]))
		{
			++end;
		}
		if (end > at)
		{
			aVisit(aText.data() + at, aText.data() + end);
		}
		at = end;
	}
}

std::vector<float> Floats(const Context& aContext, const TiXmlElement& anElement)
{
	std::vector<float> values;
	ForEachToken(Text(anElement), [&](const char* aBegin, const char* anEnd) {
		float value = 0.0f;
		if (*aBegin == '+')
		{
			++aBegin;
		}
		// Exporters running under a comma locale write "0,5"; the comma can only be a decimal point.
		std::string token(aBegin, anEnd);
		std::replace(token.begin(), token.end(), ',', '.');
		const auto [end, error] = std::from_chars(token.data(), token.data() + token.size(), value);
		if (end != token.data() + token.size() ||
		    (error != std::errc() && error != std::errc::result_out_of_range))
		{
			aContext.Fail(anElement, "'" + std::string(aBegin, anEnd) + "' is not a number");
		}
		values.push_back(value);
	});
	return values;
}

// Whole numbers from aMinimum to 2^31 - 1.
std::vector<int> Integers(const Context& aContext, const TiXmlElement& anElement, int aMinimum = 0)
{
	std::vector<int> values;
	ForEachToken(Text(anElement), [&](const char* aBegin, const char* anEnd) {
		int value = 0;
		const auto [end, error] = std::from_chars(aBegin, anEnd, value);
		if (end != anEnd || error != std::errc() || value < aMinimum)
		{
			aContext.Fail(anElement, "'" + std::string(aBegin, anEnd) + "' is not a valid index");
		}
		values.push_back(value);
	});
	return values;
}

int IntegerAttribute(const Context& aContext, const TiXmlElement& anElement, const char* aName, int aDefault,
                     bool aRequiredFlag = false)
{
	const char* text = anElement.Attribute(aName);
	if (text == nullptr)
	{
		if (aRequiredFlag)
		{
			aContext.Fail(anElement, std::string("missing attribute '") + aName + "'");
		}
		return aDefault;
	}
	int value = 0;
	const char* end = text + std::char_traits<char>::length(text);
	const auto [stop, error] = std::from_chars(text, end, value);
	if (stop != end || error != std::errc() || value < 0)
	{
		aContext.Fail(anElement,
		              std::string("attribute '") + aName + "' is not a valid count: '" + text + "'");
	}
	return value;
}

// A reference inside this document: "#id" gives "id".
std::string LocalReference(const Context& aContext, const TiXmlElement& anElement, const char* anAttribute)
{
	const std::string url = RequiredAttribute(aContext, anElement, anAttribute);
	if (url[0] != '#' || url.size() < 2)
	{
		aContext.Fail(anElement, "'" + url + "' is not a reference inside this document");
	}
	return url.substr(1);
}

// file:// removed, %XX decoded, backslashes turned into slashes.
std::string DecodePath(const std::string& aUri)
{
	std::string path = aUri;
	if (path.rfind("file:///", 0) == 0 && path.size() > 9 && path[9] == ':')
	{
		path = path.substr(8); // file:///C:/x: a drive letter follows
	}
	else if (path.rfind("file://", 0) == 0)
	{
		path = path.substr(7);
	}
	std::string decoded;
	for (size_t at = 0; at < path.size(); ++at)
	{
		auto hex = [](char aDigit) {
			return aDigit >= '0' && aDigit <= '9'   ? aDigit - '0'
			       : aDigit >= 'a' && aDigit <= 'f' ? aDigit - 'a' + 10
			       : aDigit >= 'A' && aDigit <= 'F' ? aDigit - 'A' + 10
			                                        : -1;
		};
		if (path[at] == '%' && at + 2 < path.size() && hex(path[at + 1]) >= 0 && hex(path[at + 2]) >= 0)
		{
			decoded.push_back(char(hex(path[at + 1]) * 16 + hex(path[at + 2])));
			at += 2;
		}
		else
		{
			decoded.push_back(path[at] == '\\' ? '/' : path[at]);
		}
	}
	return decoded;
}

Matrix44<float> RowVectorMatrix(const float* someValues)
{
	Matrix44<float> matrix;
	for (int row = 0; row < 4; ++row)
	{
		for (int column = 0; column < 4; ++column)
		{
			matrix.myMatrix[4 * column + row] = someValues[4 * row + column];
		}
	}
	return matrix;
}

Source ReadSource(const Context& aContext, const TiXmlElement& anElement)
{
	Source source;
	source.myId = RequiredAttribute(aContext, anElement, "id");
	source.myName = Attribute(anElement, "name");
	source.myLine = anElement.Row();
	const TiXmlElement* array = nullptr;
	bool namesFlag = false;
	for (const char* kind : {"float_array", "int_array", "bool_array", "Name_array", "IDREF_array"})
	{
		if ((array = Child(anElement, kind)) != nullptr)
		{
			namesFlag = kind[0] == 'N' || (kind[0] == 'I' && kind[1] == 'D');
			break;
		}
	}
	if (array == nullptr)
	{
		aContext.Fail(anElement, "source '" + source.myId + "' has no array");
	}
	size_t valueCount = 0;
	if (namesFlag)
	{
		ForEachToken(Text(*array), [&](const char* aBegin, const char* anEnd) {
			source.myNames.emplace_back(aBegin, anEnd);
		});
		valueCount = source.myNames.size();
	}
	else if (std::string(array->Value()) == "bool_array")
	{
		ForEachToken(Text(*array), [&](const char* aBegin, const char*) {
			source.myFloats.push_back(*aBegin == 't' || *aBegin == '1' ? 1.0f : 0.0f);
		});
		valueCount = source.myFloats.size();
	}
	else
	{
		source.myFloats = Floats(aContext, *array);
		valueCount = source.myFloats.size();
	}
	const int declared = IntegerAttribute(aContext, *array, "count", int(valueCount), true);
	if (size_t(declared) != valueCount)
	{
		aContext.Fail(*array,
		              "count " + std::to_string(declared) + " but " + std::to_string(valueCount) + " values");
	}
	const TiXmlElement& common = RequiredChild(aContext, anElement, "technique_common");
	const TiXmlElement& accessor = RequiredChild(aContext, common, "accessor");
	const std::string arrayId = LocalReference(aContext, accessor, "source");
	if (arrayId != Attribute(*array, "id"))
	{
		aContext.Fail(accessor, "source '#" + arrayId + "' names no array of source '" + source.myId + "'");
	}
	source.myCount = IntegerAttribute(aContext, accessor, "count", 0, true);
	source.myStride = IntegerAttribute(aContext, accessor, "stride", 1);
	source.myOffset = IntegerAttribute(aContext, accessor, "offset", 0);
	if (source.myStride < 1)
	{
		aContext.Fail(accessor, "stride must be at least 1");
	}
	const unsigned long long needed =
	    (unsigned long long)source.myOffset +
	    (unsigned long long)source.myCount * (unsigned long long)source.myStride;
	if (needed > valueCount)
	{
		aContext.Fail(accessor, "count " + std::to_string(source.myCount) + " x stride " +
		                            std::to_string(source.myStride) + " needs " + std::to_string(needed) +
		                            " values but the array has " + std::to_string(valueCount));
	}
	for (const TiXmlElement* param = accessor.FirstChildElement("param"); param != nullptr;
	     param = param->NextSiblingElement("param"))
	{
		source.myParams.push_back(Attribute(*param, "name"));
	}
	return source;
}

// A polygon set's <input> as written: the semantic, the source, the offset into each corner's tuple.
struct FileInput
{
	Input myInput;
	int myLine = 0;
};

void CheckIndices(const Context& aContext, const Source& aSource, const std::vector<uint32_t>& someIndices,
                  int aLine, const std::string& anElement)
{
	for (uint32_t index : someIndices)
	{
		if (index >= uint32_t(aSource.myCount))
		{
			aContext.Fail(aLine, anElement,
			              "index " + std::to_string(index) + " is past the end of source '" + aSource.myId +
			                  "' (" + std::to_string(aSource.myCount) + " elements)");
		}
	}
}

PolygonSet ReadPolygonSet(const Context& aContext, const TiXmlElement& anElement, const Mesh& aMesh)
{
	PolygonSet set;
	const std::string kind = anElement.Value();
	set.myKind = kind == "triangles"   ? PolygonKind::Triangles
	             : kind == "polylist"  ? PolygonKind::Polylist
	             : kind == "polygons"  ? PolygonKind::Polygons
	             : kind == "tristrips" ? PolygonKind::Tristrips
	                                   : PolygonKind::Trifans;
	set.myMaterial = Attribute(anElement, "material");
	set.myLine = anElement.Row();
	const int count = IntegerAttribute(aContext, anElement, "count", 0, true);

	std::vector<FileInput> inputs;
	int tupleSize = 0;
	for (const TiXmlElement* input = anElement.FirstChildElement("input"); input != nullptr;
	     input = input->NextSiblingElement("input"))
	{
		FileInput fileInput;
		fileInput.myLine = input->Row();
		fileInput.myInput.mySemanticName = RequiredAttribute(aContext, *input, "semantic");
		fileInput.myInput.mySemantic = SemanticFromName(fileInput.myInput.mySemanticName);
		fileInput.myInput.mySource = LocalReference(aContext, *input, "source");
		fileInput.myInput.myOffset = IntegerAttribute(aContext, *input, "offset", 0, true);
		fileInput.myInput.mySet = IntegerAttribute(aContext, *input, "set", 0);
		if (fileInput.myInput.myOffset > 1024)
		{
			aContext.Fail(*input, "offset " + std::to_string(fileInput.myInput.myOffset) + " is too large");
		}
		if (fileInput.myInput.mySemanticName == "VERTEX"
		        ? fileInput.myInput.mySource != aMesh.myVerticesId
		        : aMesh.FindSource(fileInput.myInput.mySource) == nullptr)
		{
			aContext.Fail(*input, "source '#" + fileInput.myInput.mySource + "' is not in the mesh");
		}
		tupleSize = std::max(tupleSize, fileInput.myInput.myOffset + 1);
		inputs.push_back(std::move(fileInput));
	}
	if (inputs.empty())
	{
		aContext.Fail(anElement, "has no <input>");
	}

	// All corners' tuples, one primitive after the other, and each primitive's corner count.
	std::vector<int> tuples;
	auto addPrimitive = [&](const TiXmlElement& aP) {
		const std::vector<int> values = Integers(aContext, aP);
		if (values.size() % size_t(tupleSize) != 0)
		{
			aContext.Fail(aP, std::to_string(values.size()) + " indices are not a whole number of " +
			                      std::to_string(tupleSize) + "-index corners");
		}
		set.myFaceVertexCounts.push_back(uint32_t(values.size() / size_t(tupleSize)));
		tuples.insert(tuples.end(), values.begin(), values.end());
	};
	const size_t cornersPerTuple = size_t(tupleSize);
	if (set.myKind == PolygonKind::Triangles || set.myKind == PolygonKind::Polylist)
	{
		const TiXmlElement* p = Child(anElement, "p");
		if (p != nullptr)
		{
			tuples = Integers(aContext, *p);
		}
		size_t expectedCorners = 0;
		if (set.myKind == PolygonKind::Triangles)
		{
			expectedCorners = size_t(count) * 3;
			set.myFaceVertexCounts.assign(size_t(count), 3);
		}
		else
		{
			const TiXmlElement* vcount = Child(anElement, "vcount");
			if (vcount != nullptr)
			{
				for (int corners : Integers(aContext, *vcount))
				{
					set.myFaceVertexCounts.push_back(uint32_t(corners));
					expectedCorners += size_t(corners);
				}
			}
			if (set.myFaceVertexCounts.size() != size_t(count))
			{
				aContext.Fail(vcount != nullptr ? *vcount : anElement,
				              "vcount has " + std::to_string(set.myFaceVertexCounts.size()) +
				                  " entries for count " + std::to_string(count));
			}
		}
		if (tuples.size() != expectedCorners * cornersPerTuple)
		{
			aContext.Fail(p != nullptr ? *p : anElement,
			              "has " + std::to_string(tuples.size()) + " indices; " +
			                  std::to_string(expectedCorners) + " corners of " + std::to_string(tupleSize) +
			                  " need " + std::to_string(expectedCorners * cornersPerTuple));
		}
	}
	else
	{
		for (const TiXmlElement* child = anElement.FirstChildElement(); child != nullptr;
		     child = child->NextSiblingElement())
		{
			const std::string name = child->Value();
			if (name == "p")
			{
				addPrimitive(*child);
			}
			else if (name == "ph" && set.myKind == PolygonKind::Polygons)
			{
				addPrimitive(RequiredChild(aContext, *child, "p"));
				for (const TiXmlElement* hole = child->FirstChildElement("h"); hole != nullptr;
				     hole = hole->NextSiblingElement("h"))
				{
					++set.myDroppedHoleCount;
				}
			}
		}
		if (set.myFaceVertexCounts.size() != size_t(count))
		{
			aContext.Fail(anElement, "count " + std::to_string(count) + " but " +
			                             std::to_string(set.myFaceVertexCounts.size()) + " primitives");
		}
	}

	const size_t corners = tuples.size() / cornersPerTuple;
	for (const FileInput& fileInput : inputs)
	{
		std::vector<uint32_t> indices(corners);
		for (size_t corner = 0; corner < corners; ++corner)
		{
			indices[corner] = uint32_t(tuples[corner * cornersPerTuple + size_t(fileInput.myInput.myOffset)]);
		}
		if (fileInput.myInput.mySemanticName == "VERTEX")
		{
			for (const Input& vertexInput : aMesh.myVertexInputs)
			{
				CheckIndices(aContext, *aMesh.FindSource(vertexInput.mySource), indices, fileInput.myLine,
				             "input");
				Input expanded = vertexInput;
				expanded.myOffset = fileInput.myInput.myOffset;
				expanded.myIndices = indices;
				set.myInputs.push_back(std::move(expanded));
			}
		}
		else
		{
			CheckIndices(aContext, *aMesh.FindSource(fileInput.myInput.mySource), indices, fileInput.myLine,
			             "input");
			Input input = fileInput.myInput;
			input.myIndices = std::move(indices);
			set.myInputs.push_back(std::move(input));
		}
	}
	return set;
}

Mesh ReadMesh(const Context& aContext, const TiXmlElement& anElement)
{
	Mesh mesh;
	for (const TiXmlElement* source = anElement.FirstChildElement("source"); source != nullptr;
	     source = source->NextSiblingElement("source"))
	{
		mesh.mySources.push_back(ReadSource(aContext, *source));
	}
	const TiXmlElement& vertices = RequiredChild(aContext, anElement, "vertices");
	mesh.myVerticesId = RequiredAttribute(aContext, vertices, "id");
	for (const TiXmlElement* input = vertices.FirstChildElement("input"); input != nullptr;
	     input = input->NextSiblingElement("input"))
	{
		Input vertexInput;
		vertexInput.mySemanticName = RequiredAttribute(aContext, *input, "semantic");
		vertexInput.mySemantic = SemanticFromName(vertexInput.mySemanticName);
		vertexInput.mySource = LocalReference(aContext, *input, "source");
		if (mesh.FindSource(vertexInput.mySource) == nullptr)
		{
			aContext.Fail(*input, "source '#" + vertexInput.mySource + "' is not in the mesh");
		}
		mesh.myVertexInputs.push_back(std::move(vertexInput));
	}
	if (mesh.myVertexInputs.empty() || mesh.myVertexInputs.front().mySemantic != Semantic::Position)
	{
		aContext.Fail(vertices, "has no POSITION input");
	}
	for (const TiXmlElement* child = anElement.FirstChildElement(); child != nullptr;
	     child = child->NextSiblingElement())
	{
		const std::string name = child->Value();
		if (name == "triangles" || name == "polylist" || name == "polygons" || name == "tristrips" ||
		    name == "trifans")
		{
			mesh.mySets.push_back(ReadPolygonSet(aContext, *child, mesh));
		}
	}
	return mesh;
}

Controller ReadController(const Context& aContext, const TiXmlElement& anElement)
{
	Controller controller;
	controller.myId = RequiredAttribute(aContext, anElement, "id");
	controller.myName = Attribute(anElement, "name");
	controller.myLine = anElement.Row();
	const TiXmlElement* skinElement = Child(anElement, "skin");
	if (skinElement == nullptr)
	{
		return controller;
	}
	controller.myHasSkinFlag = true;
	Skin& skin = controller.mySkin;
	skin.mySource = LocalReference(aContext, *skinElement, "source");
	if (const TiXmlElement* bindShape = Child(*skinElement, "bind_shape_matrix"))
	{
		const std::vector<float> values = Floats(aContext, *bindShape);
		if (values.size() != 16)
		{
			aContext.Fail(*bindShape, "needs 16 values, has " + std::to_string(values.size()));
		}
		skin.myBindShapeMatrix = RowVectorMatrix(values.data());
	}
	std::vector<Source> sources;
	for (const TiXmlElement* source = skinElement->FirstChildElement("source"); source != nullptr;
	     source = source->NextSiblingElement("source"))
	{
		sources.push_back(ReadSource(aContext, *source));
	}
	auto findSource = [&](const TiXmlElement& anInput, bool aNamesFlag) -> const Source& {
		const std::string id = LocalReference(aContext, anInput, "source");
		for (const Source& source : sources)
		{
			if (source.myId == id)
			{
				if (aNamesFlag ? source.myNames.empty() && source.myCount > 0 : !source.myNames.empty())
				{
					aContext.Fail(anInput, "source '#" + id + "' holds the wrong kind of values");
				}
				return source;
			}
		}
		aContext.Fail(anInput, "source '#" + id + "' is not in the skin");
	};

	const TiXmlElement& joints = RequiredChild(aContext, *skinElement, "joints");
	const Source* jointSource = nullptr;
	for (const TiXmlElement* input = joints.FirstChildElement("input"); input != nullptr;
	     input = input->NextSiblingElement("input"))
	{
		const std::string semantic = RequiredAttribute(aContext, *input, "semantic");
		if (semantic == "JOINT")
		{
			jointSource = &findSource(*input, true);
			for (int joint = 0; joint < jointSource->myCount; ++joint)
			{
				skin.myJointNames.push_back(*jointSource->NameElement(uint32_t(joint)));
			}
		}
		else if (semantic == "INV_BIND_MATRIX")
		{
			const Source& matrices = findSource(*input, false);
			if (matrices.myStride != 16)
			{
				aContext.Fail(*input, "INV_BIND_MATRIX source '" + matrices.myId + "' needs stride 16");
			}
			for (int joint = 0; joint < matrices.myCount; ++joint)
			{
				skin.myInverseBindMatrices.push_back(RowVectorMatrix(matrices.Element(uint32_t(joint))));
			}
		}
	}
	if (jointSource == nullptr)
	{
		aContext.Fail(joints, "has no JOINT input");
	}
	if (skin.myInverseBindMatrices.size() != skin.myJointNames.size())
	{
		aContext.Fail(joints, std::to_string(skin.myJointNames.size()) + " joints but " +
		                          std::to_string(skin.myInverseBindMatrices.size()) +
		                          " inverse bind matrices");
	}

	const TiXmlElement& weights = RequiredChild(aContext, *skinElement, "vertex_weights");
	const int vertexCount = IntegerAttribute(aContext, weights, "count", 0, true);
	int jointOffset = -1;
	int weightOffset = -1;
	int tupleSize = 0;
	const Source* weightSource = nullptr;
	for (const TiXmlElement* input = weights.FirstChildElement("input"); input != nullptr;
	     input = input->NextSiblingElement("input"))
	{
		const std::string semantic = RequiredAttribute(aContext, *input, "semantic");
		const int offset = IntegerAttribute(aContext, *input, "offset", 0, true);
		if (offset > 1024)
		{
			aContext.Fail(*input, "offset " + std::to_string(offset) + " is too large");
		}
		tupleSize = std::max(tupleSize, offset + 1);
		if (semantic == "JOINT")
		{
			jointOffset = offset;
			if (findSource(*input, true).myCount != jointSource->myCount)
			{
				aContext.Fail(*input, "joint source differs in length from the <joints> one");
			}
		}
		else if (semantic == "WEIGHT")
		{
			weightOffset = offset;
			weightSource = &findSource(*input, false);
		}
	}
	if (jointOffset < 0 || weightSource == nullptr)
	{
		aContext.Fail(weights, "needs a JOINT and a WEIGHT input");
	}
	std::vector<int> vcount;
	if (const TiXmlElement* element = Child(weights, "vcount"))
	{
		vcount = Integers(aContext, *element);
	}
	std::vector<int> v;
	const TiXmlElement* vElement = Child(weights, "v");
	if (vElement != nullptr)
	{
		v = Integers(aContext, *vElement, -1);
	}
	if (vcount.size() != size_t(vertexCount))
	{
		aContext.Fail(weights, "vcount has " + std::to_string(vcount.size()) + " entries for count " +
		                           std::to_string(vertexCount));
	}
	size_t influenceCount = 0;
	for (int count : vcount)
	{
		influenceCount += size_t(count);
	}
	if (v.size() != influenceCount * size_t(tupleSize))
	{
		aContext.Fail(vElement != nullptr ? *vElement : weights,
		              "has " + std::to_string(v.size()) + " values; the vcount sum " +
		                  std::to_string(influenceCount) + " needs " +
		                  std::to_string(influenceCount * size_t(tupleSize)));
	}
	size_t at = 0;
	for (int count : vcount)
	{
		std::vector<Influence> influences;
		for (int k = 0; k < count; ++k, at += size_t(tupleSize))
		{
			const int joint = v[at + size_t(jointOffset)];
			const int weight = v[at + size_t(weightOffset)];
			if (joint >= jointSource->myCount || weight < 0 || weight >= weightSource->myCount)
			{
				aContext.Fail(vElement->Row(), "v",
				              "influence (joint " + std::to_string(joint) + ", weight " +
				                  std::to_string(weight) + ") is past the end of its sources");
			}
			influences.push_back({joint, *weightSource->Element(uint32_t(weight))});
		}
		skin.myInfluences.push_back(std::move(influences));
	}
	return controller;
}

Transform ReadTransform(const Context& aContext, const TiXmlElement& anElement, TransformKind aKind,
                        size_t aCount)
{
	Transform transform;
	transform.myKind = aKind;
	transform.mySid = Attribute(anElement, "sid");
	const std::vector<float> values = Floats(aContext, anElement);
	if (values.size() != aCount)
	{
		aContext.Fail(anElement,
		              "needs " + std::to_string(aCount) + " values, has " + std::to_string(values.size()));
	}
	std::copy(values.begin(), values.end(), transform.myValues);
	return transform;
}

Instance ReadInstance(const Context& aContext, const TiXmlElement& anElement, InstanceKind aKind)
{
	Instance instance;
	instance.myKind = aKind;
	instance.myLine = anElement.Row();
	instance.myUrl = LocalReference(aContext, anElement, "url");
	for (const TiXmlElement* skeleton = anElement.FirstChildElement("skeleton"); skeleton != nullptr;
	     skeleton = skeleton->NextSiblingElement("skeleton"))
	{
		const std::string text = Text(*skeleton);
		instance.mySkeletons.push_back(text.empty() || text[0] != '#' ? text : text.substr(1));
	}
	const TiXmlElement* bind = Child(anElement, "bind_material");
	const TiXmlElement* common = bind != nullptr ? Child(*bind, "technique_common") : nullptr;
	for (const TiXmlElement* material = common != nullptr ? common->FirstChildElement("instance_material")
	                                                      : nullptr;
	     material != nullptr; material = material->NextSiblingElement("instance_material"))
	{
		InstanceMaterial binding;
		binding.mySymbol = RequiredAttribute(aContext, *material, "symbol");
		binding.myTarget = LocalReference(aContext, *material, "target");
		for (const TiXmlElement* input = material->FirstChildElement("bind_vertex_input"); input != nullptr;
		     input = input->NextSiblingElement("bind_vertex_input"))
		{
			binding.myVertexInputs.push_back({RequiredAttribute(aContext, *input, "semantic"),
			                                  RequiredAttribute(aContext, *input, "input_semantic"),
			                                  IntegerAttribute(aContext, *input, "input_set", 0)});
		}
		instance.myMaterials.push_back(std::move(binding));
	}
	return instance;
}

std::unique_ptr<Node> ReadNode(const Context& aContext, const TiXmlElement& anElement, int aDepth)
{
	if (aDepth > ourMaxNodeDepth)
	{
		aContext.Fail(anElement, "nodes are nested deeper than " + std::to_string(ourMaxNodeDepth));
	}
	auto node = std::make_unique<Node>();
	node->myId = Attribute(anElement, "id");
	node->myName = Attribute(anElement, "name");
	node->mySid = Attribute(anElement, "sid");
	node->myIsJointFlag = Attribute(anElement, "type") == "JOINT";
	node->myLine = anElement.Row();
	static const std::map<std::string, std::pair<TransformKind, size_t>> ourTransforms = {
	    {"matrix", {TransformKind::Matrix, 16}}, {"translate", {TransformKind::Translate, 3}},
	    {"rotate", {TransformKind::Rotate, 4}},  {"scale", {TransformKind::Scale, 3}},
	    {"lookat", {TransformKind::LookAt, 9}},  {"skew", {TransformKind::Skew, 7}}};
	static const std::map<std::string, InstanceKind> ourInstances = {
	    {"instance_geometry", InstanceKind::Geometry},
	    {"instance_controller", InstanceKind::Controller},
	    {"instance_camera", InstanceKind::Camera},
	    {"instance_light", InstanceKind::Light},
	    {"instance_node", InstanceKind::Node}};
	for (const TiXmlElement* child = anElement.FirstChildElement(); child != nullptr;
	     child = child->NextSiblingElement())
	{
		const std::string name = child->Value();
		if (auto transform = ourTransforms.find(name); transform != ourTransforms.end())
		{
			node->myTransforms.push_back(
			    ReadTransform(aContext, *child, transform->second.first, transform->second.second));
		}
		else if (auto instance = ourInstances.find(name); instance != ourInstances.end())
		{
			node->myInstances.push_back(ReadInstance(aContext, *child, instance->second));
		}
		else if (name == "node")
		{
			node->myChildren.push_back(ReadNode(aContext, *child, aDepth + 1));
		}
	}
	return node;
}

void ReadColor(const Context& aContext, const TiXmlElement& anElement, float* aColorOut, size_t aCount)
{
	const std::vector<float> values = Floats(aContext, anElement);
	if (values.size() < 3 || values.size() > aCount)
	{
		aContext.Fail(anElement, "needs 3 or " + std::to_string(aCount) + " values, has " +
		                             std::to_string(values.size()));
	}
	std::copy(values.begin(), values.end(), aColorOut);
}

// The newparams of an effect and its profile: sid to the element inside the newparam.
using NewParams = std::map<std::string, const TiXmlElement*>;

void CollectNewParams(const TiXmlElement& anElement, NewParams& someParamsOut)
{
	for (const TiXmlElement* param = anElement.FirstChildElement("newparam"); param != nullptr;
	     param = param->NextSiblingElement("newparam"))
	{
		if (const TiXmlElement* value = param->FirstChildElement())
		{
			someParamsOut.emplace(Attribute(*param, "sid"), value);
		}
	}
}

void ReadChannel(const Context& aContext, const TiXmlElement& anElement, const NewParams& someParams,
                 const Document& aDocument, Channel& aChannelOut)
{
	if (const TiXmlElement* color = Child(anElement, "color"))
	{
		aChannelOut.myHasColorFlag = true;
		ReadColor(aContext, *color, aChannelOut.myColor, 4);
	}
	const TiXmlElement* texture = Child(anElement, "texture");
	if (texture == nullptr)
	{
		return;
	}
	const std::string sampler = RequiredAttribute(aContext, *texture, "texture");
	aChannelOut.myHasTextureFlag = true;
	aChannelOut.myTexcoord = Attribute(*texture, "texcoord");
	// sampler newparam -> its <source> -> surface newparam -> its <init_from> -> image.
	std::string image = sampler;
	if (auto samplerParam = someParams.find(sampler); samplerParam != someParams.end())
	{
		const TiXmlElement* source = Child(*samplerParam->second, "source");
		auto surfaceParam = someParams.find(source != nullptr ? Text(*source) : std::string());
		const TiXmlElement* initFrom =
		    surfaceParam != someParams.end() ? Child(*surfaceParam->second, "init_from") : nullptr;
		if (initFrom == nullptr)
		{
			aContext.Fail(*texture, "sampler '" + sampler + "' leads to no surface with an init_from");
		}
		image = Text(*initFrom);
	}
	if (aDocument.FindImage(image) == nullptr)
	{
		aContext.Fail(*texture, "texture '" + sampler + "' names no image ('" + image + "')");
	}
	aChannelOut.myImage = image;
}

// The first <bump> inside an <extra> of anElement (at any depth of the extra).
const TiXmlElement* FindBumpInExtra(const TiXmlElement& anElement)
{
	auto search = [](auto& aSelf, const TiXmlElement& aParent) -> const TiXmlElement* {
		for (const TiXmlElement* child = aParent.FirstChildElement(); child != nullptr;
		     child = child->NextSiblingElement())
		{
			if (std::string(child->Value()) == "bump")
			{
				return child;
			}
			if (const TiXmlElement* found = aSelf(aSelf, *child))
			{
				return found;
			}
		}
		return nullptr;
	};
	for (const TiXmlElement* extra = anElement.FirstChildElement("extra"); extra != nullptr;
	     extra = extra->NextSiblingElement("extra"))
	{
		if (const TiXmlElement* bump = search(search, *extra))
		{
			return bump;
		}
	}
	return nullptr;
}

Effect ReadEffect(const Context& aContext, const TiXmlElement& anElement, const Document& aDocument)
{
	Effect effect;
	effect.myId = RequiredAttribute(aContext, anElement, "id");
	effect.myName = Attribute(anElement, "name");
	effect.myLine = anElement.Row();
	const TiXmlElement* profile = Child(anElement, "profile_COMMON");
	if (profile == nullptr)
	{
		return effect;
	}
	NewParams params;
	CollectNewParams(anElement, params);
	CollectNewParams(*profile, params);
	const TiXmlElement& technique = RequiredChild(aContext, *profile, "technique");
	static const std::pair<const char*, Shading> ourShadings[] = {{"constant", Shading::Constant},
	                                                              {"lambert", Shading::Lambert},
	                                                              {"phong", Shading::Phong},
	                                                              {"blinn", Shading::Blinn}};
	const TiXmlElement* shading = nullptr;
	for (const auto& [name, kind] : ourShadings)
	{
		if ((shading = Child(technique, name)) != nullptr)
		{
			effect.myShading = kind;
			break;
		}
	}
	if (shading == nullptr)
	{
		aContext.Fail(technique, "has no constant, lambert, phong or blinn");
	}
	const std::pair<const char*, Channel*> channels[] = {
	    {"emission", &effect.myEmission},     {"ambient", &effect.myAmbient},
	    {"diffuse", &effect.myDiffuse},       {"specular", &effect.mySpecular},
	    {"reflective", &effect.myReflective}, {"bump", &effect.myBump}};
	for (const auto& [name, channel] : channels)
	{
		if (const TiXmlElement* element = Child(*shading, name))
		{
			ReadChannel(aContext, *element, params, aDocument, *channel);
		}
	}
	if (const TiXmlElement* shininess = Child(*shading, "shininess"))
	{
		if (const TiXmlElement* value = Child(*shininess, "float"))
		{
			const std::vector<float> values = Floats(aContext, *value);
			if (values.size() != 1)
			{
				aContext.Fail(*value, "needs one value");
			}
			effect.myShininess = values[0];
		}
	}
	if (!effect.myBump.myHasTextureFlag)
	{
		for (const TiXmlElement* holder : {&technique, profile, &anElement})
		{
			if (const TiXmlElement* bump = FindBumpInExtra(*holder))
			{
				ReadChannel(aContext, *bump, params, aDocument, effect.myBump);
				break;
			}
		}
	}
	return effect;
}

Camera ReadCamera(const Context& aContext, const TiXmlElement& anElement)
{
	Camera camera;
	camera.myId = RequiredAttribute(aContext, anElement, "id");
	camera.myName = Attribute(anElement, "name");
	camera.myLine = anElement.Row();
	const TiXmlElement& optics = RequiredChild(aContext, anElement, "optics");
	const TiXmlElement& common = RequiredChild(aContext, optics, "technique_common");
	const TiXmlElement* projection = Child(common, "perspective");
	const char* xName = "xfov";
	const char* yName = "yfov";
	if (projection == nullptr)
	{
		projection = Child(common, "orthographic");
		camera.myProjection = Projection::Orthographic;
		xName = "xmag";
		yName = "ymag";
	}
	if (projection == nullptr)
	{
		aContext.Fail(common, "has no perspective or orthographic");
	}
	auto value = [&](const char* aName, float& aValueOut, bool* aHasFlagOut) {
		const TiXmlElement* element = Child(*projection, aName);
		if (element == nullptr)
		{
			return;
		}
		const std::vector<float> values = Floats(aContext, *element);
		if (values.size() != 1)
		{
			aContext.Fail(*element, "needs one value");
		}
		aValueOut = values[0];
		if (aHasFlagOut != nullptr)
		{
			*aHasFlagOut = true;
		}
	};
	value(xName, camera.myXFov, &camera.myHasXFlag);
	value(yName, camera.myYFov, &camera.myHasYFlag);
	value("aspect_ratio", camera.myAspectRatio, &camera.myHasAspectRatioFlag);
	value("znear", camera.myZNear, nullptr);
	value("zfar", camera.myZFar, nullptr);
	return camera;
}

Light ReadLight(const Context& aContext, const TiXmlElement& anElement)
{
	Light light;
	light.myId = RequiredAttribute(aContext, anElement, "id");
	light.myName = Attribute(anElement, "name");
	light.myLine = anElement.Row();
	const TiXmlElement* common = Child(anElement, "technique_common");
	const TiXmlElement* kind = common != nullptr ? common->FirstChildElement() : nullptr;
	if (kind == nullptr)
	{
		return light;
	}
	const std::string name = kind->Value();
	light.myKind = name == "ambient"       ? LightKind::Ambient
	               : name == "directional" ? LightKind::Directional
	               : name == "point"       ? LightKind::Point
	               : name == "spot"        ? LightKind::Spot
	                                       : LightKind::Undefined;
	if (light.myKind == LightKind::Undefined)
	{
		aContext.Fail(*kind, "is not a light kind");
	}
	ReadColor(aContext, RequiredChild(aContext, *kind, "color"), light.myColor, 3);
	const std::pair<const char*, float*> values[] = {{"constant_attenuation", &light.myConstantAttenuation},
	                                                 {"linear_attenuation", &light.myLinearAttenuation},
	                                                 {"quadratic_attenuation", &light.myQuadraticAttenuation},
	                                                 {"falloff_angle", &light.myFalloffAngle},
	                                                 {"falloff_exponent", &light.myFalloffExponent}};
	for (const auto& [valueName, target] : values)
	{
		if (const TiXmlElement* element = Child(*kind, valueName))
		{
			const std::vector<float> numbers = Floats(aContext, *element);
			if (numbers.size() != 1)
			{
				aContext.Fail(*element, "needs one value");
			}
			*target = numbers[0];
		}
	}
	return light;
}

// Every element of aLibraryName under the root, then each aItemName inside it.
template <typename Visit>
void ForEachInLibrary(const TiXmlElement& aRoot, const char* aLibraryName, const char* anItemName,
                      Visit aVisit)
{
	for (const TiXmlElement* library = aRoot.FirstChildElement(aLibraryName); library != nullptr;
	     library = library->NextSiblingElement(aLibraryName))
	{
		for (const TiXmlElement* item = library->FirstChildElement(anItemName); item != nullptr;
		     item = item->NextSiblingElement(anItemName))
		{
			aVisit(*item);
		}
	}
}

Image ReadImage(const TiXmlElement& anElement)
{
	Image image;
	image.myId = Attribute(anElement, "id");
	image.myName = Attribute(anElement, "name");
	image.myLine = anElement.Row();
	if (const TiXmlElement* initFrom = Child(anElement, "init_from"))
	{
		image.myPath = DecodePath(Text(*initFrom));
	}
	return image;
}
} // namespace

bool Reader::Read(const TiXmlElement& aRoot, std::string& anErrorOut)
{
	const Context context(myName);
	Document& document = myDocument;
	try
	{
		if (std::string(aRoot.Value()) != "COLLADA")
		{
			context.Fail(aRoot, "the root element is not <COLLADA>");
		}
		if (const TiXmlElement* asset = Child(aRoot, "asset"))
		{
			if (const TiXmlElement* up = Child(*asset, "up_axis"))
			{
				document.myAsset.myUpAxis = Text(*up);
				if (document.myAsset.myUpAxis != "X_UP" && document.myAsset.myUpAxis != "Y_UP" &&
				    document.myAsset.myUpAxis != "Z_UP")
				{
					context.Fail(*up, "'" + document.myAsset.myUpAxis + "' is not X_UP, Y_UP or Z_UP");
				}
			}
			if (const TiXmlElement* unit = Child(*asset, "unit"))
			{
				double meter = 1.0;
				if (unit->Attribute("meter", &meter) != nullptr)
				{
					document.myAsset.myUnitMeter = float(meter);
				}
				if (unit->Attribute("name") != nullptr)
				{
					document.myAsset.myUnitName = Attribute(*unit, "name");
				}
			}
		}
		// Images first: effects resolve their textures against them.
		ForEachInLibrary(aRoot, "library_images", "image", [&](const TiXmlElement& anImage) {
			document.myImages.push_back(ReadImage(anImage));
		});
		ForEachInLibrary(aRoot, "library_effects", "effect", [&](const TiXmlElement& anEffect) {
			for (const TiXmlElement* holder : {&anEffect, Child(anEffect, "profile_COMMON")})
			{
				for (const TiXmlElement* image = holder != nullptr ? holder->FirstChildElement("image")
				                                                   : nullptr;
				     image != nullptr; image = image->NextSiblingElement("image"))
				{
					document.myImages.push_back(ReadImage(*image));
				}
			}
		});
		ForEachInLibrary(aRoot, "library_effects", "effect", [&](const TiXmlElement& anEffect) {
			document.myEffects.push_back(ReadEffect(context, anEffect, document));
		});
		ForEachInLibrary(aRoot, "library_materials", "material", [&](const TiXmlElement& aMaterial) {
			Material material;
			material.myId = RequiredAttribute(context, aMaterial, "id");
			material.myName = Attribute(aMaterial, "name");
			material.myLine = aMaterial.Row();
			const TiXmlElement& instance = RequiredChild(context, aMaterial, "instance_effect");
			material.myEffect = LocalReference(context, instance, "url");
			if (document.FindEffect(material.myEffect) == nullptr)
			{
				context.Fail(instance, "effect '#" + material.myEffect + "' is not in the document");
			}
			document.myMaterials.push_back(std::move(material));
		});
		ForEachInLibrary(aRoot, "library_geometries", "geometry", [&](const TiXmlElement& aGeometry) {
			Geometry geometry;
			geometry.myId = RequiredAttribute(context, aGeometry, "id");
			geometry.myName = Attribute(aGeometry, "name");
			geometry.myLine = aGeometry.Row();
			if (const TiXmlElement* mesh = Child(aGeometry, "mesh"))
			{
				geometry.myHasMeshFlag = true;
				geometry.myMesh = ReadMesh(context, *mesh);
			}
			document.myGeometries.push_back(std::move(geometry));
		});
		ForEachInLibrary(aRoot, "library_controllers", "controller", [&](const TiXmlElement& aController) {
			Controller controller = ReadController(context, aController);
			const Geometry* base =
			    controller.myHasSkinFlag ? document.FindGeometry(controller.mySkin.mySource) : nullptr;
			if (controller.myHasSkinFlag)
			{
				const TiXmlElement& skin = *Child(aController, "skin");
				if (base == nullptr || !base->myHasMeshFlag)
				{
					context.Fail(skin, "source '#" + controller.mySkin.mySource + "' is not a mesh geometry");
				}
				const Source* positions = base->myMesh.FindSourceBySemantic(Semantic::Position);
				if (positions == nullptr ||
				    size_t(positions->myCount) != controller.mySkin.myInfluences.size())
				{
					context.Fail(*Child(skin, "vertex_weights"),
					             "count " + std::to_string(controller.mySkin.myInfluences.size()) +
					                 " differs from the base mesh's position count");
				}
			}
			document.myControllers.push_back(std::move(controller));
		});
		ForEachInLibrary(aRoot, "library_cameras", "camera", [&](const TiXmlElement& aCamera) {
			document.myCameras.push_back(ReadCamera(context, aCamera));
		});
		ForEachInLibrary(aRoot, "library_lights", "light", [&](const TiXmlElement& aLight) {
			document.myLights.push_back(ReadLight(context, aLight));
		});
		ForEachInLibrary(aRoot, "library_nodes", "node", [&](const TiXmlElement& aNode) {
			document.myLibraryNodes.push_back(ReadNode(context, aNode, 0));
		});
		ForEachInLibrary(aRoot, "library_visual_scenes", "visual_scene", [&](const TiXmlElement& aScene) {
			auto scene = std::make_unique<VisualScene>();
			scene->myId = Attribute(aScene, "id");
			scene->myName = Attribute(aScene, "name");
			scene->myLine = aScene.Row();
			for (const TiXmlElement* node = aScene.FirstChildElement("node"); node != nullptr;
			     node = node->NextSiblingElement("node"))
			{
				scene->myNodes.push_back(ReadNode(context, *node, 0));
			}
			document.myVisualScenes.push_back(std::move(scene));
		});

		// Instances: every url must name something of its kind; instance_node gets its target.
		auto resolve = [&](auto& aSelf, Node& aNode) -> void {
			for (Instance& instance : aNode.myInstances)
			{
				bool foundFlag = false;
				switch (instance.myKind)
				{
				case InstanceKind::Geometry:
					foundFlag = document.FindGeometry(instance.myUrl) != nullptr;
					break;
				case InstanceKind::Controller:
					foundFlag = document.FindController(instance.myUrl) != nullptr;
					break;
				case InstanceKind::Camera:
					foundFlag = document.FindCamera(instance.myUrl) != nullptr;
					break;
				case InstanceKind::Light:
					foundFlag = document.FindLight(instance.myUrl) != nullptr;
					break;
				case InstanceKind::Node:
					instance.myNode = document.FindNode(instance.myUrl);
					foundFlag = instance.myNode != nullptr;
					break;
				}
				if (!foundFlag)
				{
					context.Fail(instance.myLine, "instance",
					             "'#" + instance.myUrl + "' is not in the document");
				}
				// instance_material targets are left unchecked: exporters write bindings to materials they
				// did not export, and a set without its material is still drawable.
			}
			for (auto& child : aNode.myChildren)
			{
				aSelf(aSelf, *child);
			}
		};
		for (auto& node : document.myLibraryNodes)
		{
			resolve(resolve, *node);
		}
		for (auto& scene : document.myVisualScenes)
		{
			for (auto& node : scene->myNodes)
			{
				resolve(resolve, *node);
			}
		}
		// A node reached again while it is being walked would make every walk of the scene endless.
		std::set<const Node*> walking;
		std::set<const Node*> done;
		auto checkCycles = [&](auto& aSelf, const Node& aNode) -> void {
			if (done.count(&aNode) != 0)
			{
				return;
			}
			if (!walking.insert(&aNode).second)
			{
				context.Fail(aNode.myLine, "node",
				             "'" + aNode.myId + "' instances itself through instance_node");
			}
			for (const Instance& instance : aNode.myInstances)
			{
				if (instance.myNode != nullptr)
				{
					aSelf(aSelf, *instance.myNode);
				}
			}
			for (const auto& child : aNode.myChildren)
			{
				aSelf(aSelf, *child);
			}
			walking.erase(&aNode);
			done.insert(&aNode);
		};
		for (auto& node : document.myLibraryNodes)
		{
			checkCycles(checkCycles, *node);
		}
		for (auto& scene : document.myVisualScenes)
		{
			for (auto& node : scene->myNodes)
			{
				checkCycles(checkCycles, *node);
			}
		}

		const TiXmlElement* scene = Child(aRoot, "scene");
		const TiXmlElement* instance = scene != nullptr ? Child(*scene, "instance_visual_scene") : nullptr;
		if (instance != nullptr)
		{
			const std::string id = LocalReference(context, *instance, "url");
			for (auto& visualScene : document.myVisualScenes)
			{
				if (visualScene->myId == id && document.myScene == nullptr)
				{
					document.myScene = visualScene.get();
				}
			}
			if (document.myScene == nullptr)
			{
				context.Fail(*instance, "visual scene '#" + id + "' is not in the document");
			}
		}
		else if (!document.myVisualScenes.empty())
		{
			document.myScene = document.myVisualScenes.front().get();
		}
	}
	catch (const ReadFault& aFault)
	{
		anErrorOut = aFault.myMessage;
		return false;
	}
	return true;
}
} // namespace Collada
