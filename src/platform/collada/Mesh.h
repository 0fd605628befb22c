#pragma once
// Mesh: the geometry of a COLLADA document, as the document reader leaves it.
//
//   const Collada::Geometry* geometry = document.FindGeometry("Box-mesh");
//   Collada::Mesh mesh = geometry->myMesh;          // copy if the document must stay untouched
//   if (!mesh.IsTriangles()) { mesh.Triangulate(); }
//   for (const Collada::PolygonSet& set : mesh.mySets)
//   {
//       const Collada::Input* position = set.FindInput(Collada::Semantic::Position);
//       const Collada::Source* positions = mesh.FindSource(position->mySource);
//       for (uint32_t index : position->myIndices) { const float* xyz = positions->Element(index); }
//   }
//
// Every polygon set keeps one index list per input (the interleaved <p> of the file is split by
// offset), so all lists of a set have the same length: one entry per corner. The VERTEX input of
// the file is replaced by the inputs of the mesh's <vertices> element (POSITION and whatever else
// it carries), sharing its indices. The reader has checked that every index lies inside its
// source, so Element() of a loaded mesh never answers null for an index of its own lists.
//
// <polygons> with holes (<ph>): the outer ring (<p>) is kept as a polygon and the holes (<h>) are
// dropped, counted in myDroppedHoleCount. Filling around holes would need a real polygon
// triangulator; the exporters we read write holes only for cut-outs of flat faces.

#include <cstdint>
#include <string>
#include <vector>

namespace Collada
{
// The semantics the importer asks for; anything else is Other and keeps its name.
enum class Semantic
{
	Position,
	Normal,
	TexCoord,
	Color,
	TexTangent,
	TexBinormal,
	Tangent,
	Binormal,
	Other
};

Semantic SemanticFromName(const std::string& aName);

// A <source>: its array (numbers or names) and the accessor that reads it in groups of myStride.
struct Source
{
	std::string myId;
	std::string myName;
	std::vector<float> myFloats;
	std::vector<std::string> myNames;
	// Accessor: myCount elements of myStride values each, starting at myOffset in the array.
	int myCount = 0;
	int myStride = 1;
	int myOffset = 0;
	std::vector<std::string> myParams;
	int myLine = 0;

	// The first value of element anIndex, or null when the element is not inside the array.
	const float* Element(uint32_t anIndex) const;
	const std::string* NameElement(uint32_t anIndex) const;
};

// One input of a polygon set, with its own index list (one entry per corner).
struct Input
{
	std::string mySemanticName;
	Semantic mySemantic = Semantic::Other;
	std::string mySource; // the source's id, without '#'
	int myOffset = 0;
	int mySet = 0;
	std::vector<uint32_t> myIndices;
};

enum class PolygonKind
{
	Triangles,
	Polylist,
	Polygons,
	Tristrips,
	Trifans
};

struct PolygonSet
{
	PolygonKind myKind = PolygonKind::Triangles;
	std::string myMaterial; // the material symbol, bound by the instance's bind_material
	std::vector<Input> myInputs;
	// Corners per primitive: 3 per triangle, the vcount of a polylist, the length of each <p> of
	// polygons, strips and fans.
	std::vector<uint32_t> myFaceVertexCounts;
	int myDroppedHoleCount = 0;
	int myLine = 0;

	// The input with that semantic; aSet < 0 takes the first of any set.
	const Input* FindInput(Semantic aSemantic, int aSet = -1) const;
	const Input* FindInputByName(const std::string& aSemanticName, int aSet = -1) const;
	// The corner count, which is the length of every input's index list.
	size_t GetCornerCount() const;
	// The triangles this set gives once triangulated.
	size_t GetTriangleCount() const;
};

struct Mesh
{
	std::vector<Source> mySources;
	std::string myVerticesId;
	std::vector<Input> myVertexInputs; // inputs of <vertices>, without indices
	std::vector<PolygonSet> mySets;

	const Source* FindSource(const std::string& anId) const;
	// The source that a polygon set (or <vertices>) reads for the semantic; aSet < 0: any set.
	const Source* FindSourceBySemantic(Semantic aSemantic, int aSet = -1) const;
	bool IsTriangles() const;
	// Turns every set into a triangle list in place: fans for polygons, alternating windings for
	// strips, with every input's indices following the same corners. Primitives with fewer than
	// three corners are dropped.
	void Triangulate();
	size_t GetTriangleCount() const;
};

struct Geometry
{
	std::string myId;
	std::string myName;
	// False for geometries of other kinds (convex_mesh, spline), which are kept as names only.
	bool myHasMeshFlag = false;
	Mesh myMesh;
	int myLine = 0;
};
} // namespace Collada
