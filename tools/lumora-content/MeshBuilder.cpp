#include "MeshBuilder.h"

#include <cmath>

namespace Content
{
uint32_t MeshBuilder::AddSet(const std::string& aMaterialSymbol, PrimitiveKind aKind)
{
	MeshSet set;
	set.myMaterial = aMaterialSymbol;
	set.myKind = aKind;
	mySets.push_back(set);
	return static_cast<uint32_t>(mySets.size() - 1);
}

uint32_t MeshBuilder::AddVertex(const Vec3& aPosition, const Vec3& aNormal, double aU, double aV)
{
	MeshVertex vertex;
	vertex.myPosition = aPosition;
	vertex.myNormal = Normalized(aNormal);
	vertex.myU = aU;
	vertex.myV = aV;
	myVertices.push_back(vertex);
	return static_cast<uint32_t>(myVertices.size() - 1);
}

void MeshBuilder::AddTriangle(uint32_t aSet, uint32_t aFirst, uint32_t aSecond, uint32_t aThird)
{
	std::vector<uint32_t>& indices = mySets[aSet].myIndices;
	indices.insert(indices.end(), {aFirst, aSecond, aThird});
}

void MeshBuilder::AddQuad(uint32_t aSet, uint32_t aFirst, uint32_t aSecond, uint32_t aThird, uint32_t aFourth)
{
	std::vector<uint32_t>& indices = mySets[aSet].myIndices;
	if (mySets[aSet].myKind == PrimitiveKind::Quads)
	{
		indices.insert(indices.end(), {aFirst, aSecond, aThird, aFourth});
		return;
	}
	indices.insert(indices.end(), {aFirst, aSecond, aThird, aFirst, aThird, aFourth});
}

void MeshBuilder::AddRectangle(uint32_t aSet, const Vec3& aCorner, const Vec3& aRight, const Vec3& anUp,
                               double aTileSize)
{
	const Vec3 normal = Normalized(aRight.Cross(anUp));
	const Vec3 rightAxis = Normalized(aRight);
	const Vec3 upAxis = Normalized(anUp);
	const Vec3 corners[4] = {aCorner, aCorner + aRight, aCorner + aRight + anUp, aCorner + anUp};
	uint32_t numbers[4] = {};
	for (int corner = 0; corner < 4; ++corner)
	{
		numbers[corner] = AddVertex(corners[corner], normal, Dot(corners[corner], rightAxis) / aTileSize,
		                            Dot(corners[corner], upAxis) / aTileSize);
	}
	AddQuad(aSet, numbers[0], numbers[1], numbers[2], numbers[3]);
}

void MeshBuilder::ComputeTangentFrames()
{
	std::vector<Vec3> alongU(myVertices.size(), Vec3(0.0, 0.0, 0.0));
	std::vector<Vec3> alongV(myVertices.size(), Vec3(0.0, 0.0, 0.0));
	auto addTriangle = [&](uint32_t aFirst, uint32_t aSecond, uint32_t aThird) {
		const MeshVertex& first = myVertices[aFirst];
		const MeshVertex& second = myVertices[aSecond];
		const MeshVertex& third = myVertices[aThird];
		const Vec3 edge1 = second.myPosition - first.myPosition;
		const Vec3 edge2 = third.myPosition - first.myPosition;
		const double du1 = second.myU - first.myU;
		const double dv1 = second.myV - first.myV;
		const double du2 = third.myU - first.myU;
		const double dv2 = third.myV - first.myV;
		const double determinant = du1 * dv2 - du2 * dv1;
		if (std::abs(determinant) < 1e-12)
		{
			return;
		}
		// Weighting by the triangle's UV area (the determinant's magnitude) favours large faces.
		const double scale = determinant > 0.0 ? 1.0 : -1.0;
		const Vec3 tangent = (edge1 * dv2 - edge2 * dv1) * scale;
		const Vec3 binormal = (edge2 * du1 - edge1 * du2) * scale;
		for (const uint32_t number : {aFirst, aSecond, aThird})
		{
			alongU[number] += tangent;
			alongV[number] += binormal;
		}
	};
	for (const MeshSet& set : mySets)
	{
		const size_t corners = set.myKind == PrimitiveKind::Quads ? 4 : 3;
		for (size_t face = 0; face + corners <= set.myIndices.size(); face += corners)
		{
			const uint32_t* index = &set.myIndices[face];
			addTriangle(index[0], index[1], index[2]);
			if (corners == 4)
			{
				addTriangle(index[0], index[2], index[3]);
			}
		}
	}
	for (size_t number = 0; number < myVertices.size(); ++number)
	{
		MeshVertex& vertex = myVertices[number];
		const Vec3& normal = vertex.myNormal;
		Vec3 tangent = alongU[number] - normal * Dot(normal, alongU[number]);
		if (tangent.Length() < 1e-9)
		{
			// No usable UV gradient: any direction perpendicular to the normal will do.
			const Vec3 helper = std::abs(normal.y) < 0.9 ? Vec3(0.0, 1.0, 0.0) : Vec3(1.0, 0.0, 0.0);
			tangent = helper.Cross(normal);
		}
		vertex.myTangent = Normalized(tangent);
		vertex.myBinormal = Normalized(normal.Cross(vertex.myTangent));
	}
}
} // namespace Content
