#pragma once
// MeshBuilder: collects the vertices and polygon sets of one generated model and computes its
// tangent frames from the texture coordinates.
//
//   Content::MeshBuilder mesh;
//   const uint32_t walls = mesh.AddSet("walls", Content::PrimitiveKind::Quads);
//   mesh.AddRectangle(walls, corner, right * 4.0, up * 3.0, 2.0);   // faces right x up
//   mesh.ComputeTangentFrames();
//
// Faces wind counter-clockwise seen from the side their normal points to (COLLADA's front face).
// Texture coordinates are COLLADA's: v runs up the image. The tangent follows +u and the binormal
// +v over the surface; after ComputeTangentFrames() both are unit vectors perpendicular to the
// normal with tangent x binormal = normal, so the generated UV layouts must not be mirrored.

#include <cstdint>
#include <string>
#include <vector>

#include "core/Vector3.h"

namespace Content
{
using Vec3 = Vector3<double>;

inline double Dot(const Vec3& aLeft, const Vec3& aRight)
{
	return aLeft.x * aRight.x + aLeft.y * aRight.y + aLeft.z * aRight.z;
}

inline Vec3 Normalized(Vec3 aVector)
{
	const double length = aVector.Length();
	return length > 0.0 ? aVector * (1.0 / length) : aVector;
}

struct MeshVertex
{
	Vec3 myPosition;
	Vec3 myNormal;
	double myU = 0.0;
	double myV = 0.0;
	Vec3 myTangent = Vec3(0.0, 0.0, 0.0);
	Vec3 myBinormal = Vec3(0.0, 0.0, 0.0);
};

// Triangles are written as <triangles>, quads as a <polylist> of four-corner faces.
enum class PrimitiveKind
{
	Triangles,
	Quads
};

struct MeshSet
{
	std::string myMaterial; // the material symbol the set is bound by
	PrimitiveKind myKind = PrimitiveKind::Triangles;
	std::vector<uint32_t> myIndices; // 3 or 4 vertex numbers per face, by kind
};

class MeshBuilder
{
public:
	uint32_t AddSet(const std::string& aMaterialSymbol, PrimitiveKind aKind);
	uint32_t AddVertex(const Vec3& aPosition, const Vec3& aNormal, double aU, double aV);
	void AddTriangle(uint32_t aSet, uint32_t aFirst, uint32_t aSecond, uint32_t aThird);
	// Corners counter-clockwise; a triangle set gets the two triangles (0, 1, 2) and (0, 2, 3).
	void AddQuad(uint32_t aSet, uint32_t aFirst, uint32_t aSecond, uint32_t aThird, uint32_t aFourth);
	// A flat rectangle from aCorner along aRight and anUp, facing aRight x anUp. Its texture
	// coordinates are the world position projected on the two directions, divided by aTileSize,
	// so neighbouring rectangles of one plane continue each other's pattern.
	void AddRectangle(uint32_t aSet, const Vec3& aCorner, const Vec3& aRight, const Vec3& anUp,
	                  double aTileSize);

	void ComputeTangentFrames();

	const std::vector<MeshVertex>& GetVertices() const { return myVertices; }
	const std::vector<MeshSet>& GetSets() const { return mySets; }

private:
	std::vector<MeshVertex> myVertices;
	std::vector<MeshSet> mySets;
};
} // namespace Content
