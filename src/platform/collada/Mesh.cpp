#include "platform/collada/Mesh.h"

#include <algorithm>
#include <utility>

namespace Collada
{
Semantic SemanticFromName(const std::string& aName)
{
	static const std::pair<const char*, Semantic> ourNames[] = {
	    {"POSITION", Semantic::Position},     {"NORMAL", Semantic::Normal},
	    {"TEXCOORD", Semantic::TexCoord},     {"COLOR", Semantic::Color},
	    {"TEXTANGENT", Semantic::TexTangent}, {"TEXBINORMAL", Semantic::TexBinormal},
	    {"TANGENT", Semantic::Tangent},       {"BINORMAL", Semantic::Binormal},
	};
	for (const auto& [name, semantic] : ourNames)
	{
		if (aName == name)
		{
			return semantic;
		}
	}
	return Semantic::Other;
}

const float* Source::Element(uint32_t anIndex) const
{
	const size_t first = size_t(myOffset) + size_t(anIndex) * size_t(myStride);
	if (anIndex >= uint32_t(myCount) || myStride <= 0 || first + size_t(myStride) > myFloats.size())
	{
		return nullptr;
	}
	return myFloats.data() + first;
}

const std::string* Source::NameElement(uint32_t anIndex) const
{
	const size_t first = size_t(myOffset) + size_t(anIndex) * size_t(myStride);
	if (anIndex >= uint32_t(myCount) || myStride <= 0 || first + size_t(myStride) > myNames.size())
	{
		return nullptr;
	}
	return &myNames[first];
}

const Input* PolygonSet::FindInput(Semantic aSemantic, int aSet) const
{
	for (const Input& input : myInputs)
	{
		if (input.mySemantic == aSemantic && (aSet < 0 || input.mySet == aSet))
		{
			return &input;
		}
	}
	return nullptr;
}

const Input* PolygonSet::FindInputByName(const std::string& aSemanticName, int aSet) const
{
	for (const Input& input : myInputs)
	{
		if (input.mySemanticName == aSemanticName && (aSet < 0 || input.mySet == aSet))
		{
			return &input;
		}
	}
	return nullptr;
}

size_t PolygonSet::GetCornerCount() const
{
	return myInputs.empty() ? 0 : myInputs.front().myIndices.size();
}

size_t PolygonSet::GetTriangleCount() const
{
	size_t triangles = 0;
	for (uint32_t corners : myFaceVertexCounts)
	{
		triangles += corners >= 3 ? corners - 2 : 0;
	}
	return triangles;
}

const Source* Mesh::FindSource(const std::string& anId) const
{
	for (const Source& source : mySources)
	{
		if (source.myId == anId)
		{
			return &source;
		}
	}
	return nullptr;
}

const Source* Mesh::FindSourceBySemantic(Semantic aSemantic, int aSet) const
{
	for (const PolygonSet& set : mySets)
	{
		if (const Input* input = set.FindInput(aSemantic, aSet))
		{
			return FindSource(input->mySource);
		}
	}
	for (const Input& input : myVertexInputs)
	{
		if (input.mySemantic == aSemantic && (aSet < 0 || input.mySet == aSet))
		{
			return FindSource(input.mySource);
		}
	}
	return nullptr;
}

bool Mesh::IsTriangles() const
{
	for (const PolygonSet& set : mySets)
	{
		if (set.myKind != PolygonKind::Triangles)
		{
			return false;
		}
	}
	return true;
}

size_t Mesh::GetTriangleCount() const
{
	size_t triangles = 0;
	for (const PolygonSet& set : mySets)
	{
		triangles += set.GetTriangleCount();
	}
	return triangles;
}

namespace
{
// The corners, as positions in the set's index lists, of the triangles the set gives.
std::vector<size_t> TriangleCorners(const PolygonSet& aSet)
{
	std::vector<size_t> corners;
	corners.reserve(aSet.GetTriangleCount() * 3);
	// The shortest list bounds the corners, so a hand-made set with uneven lists reads nothing past one.
	size_t cornerCount = aSet.GetCornerCount();
	for (const Input& input : aSet.myInputs)
	{
		cornerCount = std::min(cornerCount, input.myIndices.size());
	}
	size_t first = 0;
	for (uint32_t count : aSet.myFaceVertexCounts)
	{
		if (first + count > cornerCount)
		{
			break;
		}
		for (uint32_t k = 0; count >= 3 && k + 2 < count; ++k)
		{
			if (aSet.myKind == PolygonKind::Tristrips)
			{
				// Every other triangle of a strip is flipped so that all keep the strip's winding.
				const bool evenFlag = (k % 2) == 0;
				corners.push_back(first + (evenFlag ? k : k + 1));
				corners.push_back(first + (evenFlag ? k + 1 : k));
				corners.push_back(first + k + 2);
			}
			else
			{
				corners.push_back(first);
				corners.push_back(first + k + 1);
				corners.push_back(first + k + 2);
			}
		}
		first += count;
	}
	return corners;
}
} // namespace

void Mesh::Triangulate()
{
	for (PolygonSet& set : mySets)
	{
		if (set.myKind == PolygonKind::Triangles)
		{
			continue;
		}
		const std::vector<size_t> corners = TriangleCorners(set);
		for (Input& input : set.myInputs)
		{
			std::vector<uint32_t> indices;
			indices.reserve(corners.size());
			for (size_t corner : corners)
			{
				indices.push_back(input.myIndices[corner]);
			}
			input.myIndices = std::move(indices);
		}
		set.myFaceVertexCounts.assign(corners.size() / 3, 3);
		set.myKind = PolygonKind::Triangles;
	}
}
} // namespace Collada
