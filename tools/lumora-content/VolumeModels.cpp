#include "VolumeModels.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <map>
#include <utility>

namespace Content
{
namespace
{
constexpr double ourPi = 3.14159265358979323846;

using Triangle = std::array<Vec3, 3>;

// Adds one flat triangle with its own three vertices. The texture coordinates project the corners
// on two axes of the face's plane (right x up = normal), so the tangent frame follows the texture.
void AddFlatTriangle(MeshBuilder& aMesh, uint32_t aSet, const Triangle& aTriangle)
{
	const Vec3 normal = Normalized((aTriangle[1] - aTriangle[0]).Cross(aTriangle[2] - aTriangle[0]));
	const Vec3 helper = std::abs(normal.y) < 0.9 ? Vec3(0.0, 1.0, 0.0) : Vec3(0.0, 0.0, 1.0);
	const Vec3 up = Normalized(helper - normal * Dot(helper, normal));
	const Vec3 right = up.Cross(normal);
	uint32_t corners[3] = {};
	for (size_t corner = 0; corner < 3; ++corner)
	{
		corners[corner] = aMesh.AddVertex(aTriangle[corner], normal, Dot(aTriangle[corner], right),
		                                  Dot(aTriangle[corner], up));
	}
	aMesh.AddTriangle(aSet, corners[0], corners[1], corners[2]);
}

ModelDescription StartModel(const char* aName)
{
	ModelDescription model;
	model.myName = aName;
	model.myMaterials = {{"volume", MaterialKind::Concrete}};
	model.myMesh.AddSet("volume", PrimitiveKind::Triangles);
	return model;
}

// The unit icosahedron's faces, each subdivided into four aLevels times with the new corners
// pushed out to the unit sphere. Faces wind counter-clockwise seen from outside.
std::vector<Triangle> Icosphere(int aLevels)
{
	const double golden = (1.0 + std::sqrt(5.0)) * 0.5;
	std::array<Vec3, 12> corners = {
	    Vec3(-1.0, golden, 0.0), Vec3(1.0, golden, 0.0), Vec3(-1.0, -golden, 0.0), Vec3(1.0, -golden, 0.0),
	    Vec3(0.0, -1.0, golden), Vec3(0.0, 1.0, golden), Vec3(0.0, -1.0, -golden), Vec3(0.0, 1.0, -golden),
	    Vec3(golden, 0.0, -1.0), Vec3(golden, 0.0, 1.0), Vec3(-golden, 0.0, -1.0), Vec3(-golden, 0.0, 1.0)};
	for (Vec3& corner : corners)
	{
		corner = Normalized(corner);
	}
	constexpr int faces[20][3] = {{0, 11, 5}, {0, 5, 1},  {0, 1, 7},   {0, 7, 10}, {0, 10, 11},
	                              {1, 5, 9},  {5, 11, 4}, {11, 10, 2}, {10, 7, 6}, {7, 1, 8},
	                              {3, 9, 4},  {3, 4, 2},  {3, 2, 6},   {3, 6, 8},  {3, 8, 9},
	                              {4, 9, 5},  {2, 4, 11}, {6, 2, 10},  {8, 6, 7},  {9, 8, 1}};
	std::vector<Triangle> triangles;
	for (const auto& face : faces)
	{
		Triangle triangle = {corners[face[0]], corners[face[1]], corners[face[2]]};
		// Whatever the table's order, wind outward: the normal must point away from the centre.
		if (Dot((triangle[1] - triangle[0]).Cross(triangle[2] - triangle[0]), triangle[0]) < 0.0)
		{
			std::swap(triangle[1], triangle[2]);
		}
		triangles.push_back(triangle);
	}
	for (int level = 0; level < aLevels; ++level)
	{
		std::vector<Triangle> finer;
		finer.reserve(triangles.size() * 4);
		for (const Triangle& triangle : triangles)
		{
			const Vec3 ab = Normalized((triangle[0] + triangle[1]) * 0.5);
			const Vec3 bc = Normalized((triangle[1] + triangle[2]) * 0.5);
			const Vec3 ca = Normalized((triangle[2] + triangle[0]) * 0.5);
			finer.push_back({triangle[0], ab, ca});
			finer.push_back({ab, triangle[1], bc});
			finer.push_back({ca, bc, triangle[2]});
			finer.push_back({ab, bc, ca});
		}
		triangles = std::move(finer);
	}
	return triangles;
}

ModelDescription PointVolume()
{
	ModelDescription model = StartModel("light_volume_point");
	std::vector<Triangle> triangles = Icosphere(1);
	// The faces nearest the centre decide the scale that puts every plane outside the unit sphere.
	double nearest = 1.0;
	for (const Triangle& triangle : triangles)
	{
		const Vec3 normal = Normalized((triangle[1] - triangle[0]).Cross(triangle[2] - triangle[0]));
		nearest = std::min(nearest, Dot(normal, triangle[0]));
	}
	const double scale = (1.0 + ourVolumeMargin) / nearest;
	for (const Triangle& triangle : triangles)
	{
		AddFlatTriangle(model.myMesh, 0, {triangle[0] * scale, triangle[1] * scale, triangle[2] * scale});
	}
	return model;
}

ModelDescription SpotVolume()
{
	ModelDescription model = StartModel("light_volume_spot");
	// The polygon's edges, not its corners, touch the circle of radius 1 (with the margin).
	const double reach = (1.0 + ourVolumeMargin) / std::cos(ourPi / ourSpotSegments);
	const Vec3 apex(0.0, 0.0, 0.0);
	const Vec3 center(0.0, 0.0, 1.0);
	auto rim = [&](int aSegment) {
		const double angle = 2.0 * ourPi * (aSegment % ourSpotSegments) / ourSpotSegments;
		return Vec3(reach * std::cos(angle), reach * std::sin(angle), 1.0);
	};
	for (int segment = 0; segment < ourSpotSegments; ++segment)
	{
		// Counter-clockwise seen from outside: the side from behind the apex, the base from +Z.
		AddFlatTriangle(model.myMesh, 0, {apex, rim(segment + 1), rim(segment)});
		AddFlatTriangle(model.myMesh, 0, {center, rim(segment), rim(segment + 1)});
	}
	return model;
}

ModelDescription DecalBox()
{
	ModelDescription model = StartModel("decal_box");
	// Each face as two triangles, (u, v) in the face's plane: corners[i] are the corners of the
	// face along +axis, counter-clockwise seen from outside.
	for (int axis = 0; axis < 3; ++axis)
	{
		for (const double side : {-0.5, 0.5})
		{
			auto point = [&](double aFirst, double aSecond) {
				double xyz[3] = {};
				xyz[axis] = side;
				xyz[(axis + 1) % 3] = aFirst;
				xyz[(axis + 2) % 3] = aSecond;
				return Vec3(xyz[0], xyz[1], xyz[2]);
			};
			Triangle first = {point(-0.5, -0.5), point(0.5, -0.5), point(0.5, 0.5)};
			Triangle second = {point(-0.5, -0.5), point(0.5, 0.5), point(-0.5, 0.5)};
			if (side < 0.0)
			{
				std::swap(first[1], first[2]);
				std::swap(second[1], second[2]);
			}
			AddFlatTriangle(model.myMesh, 0, first);
			AddFlatTriangle(model.myMesh, 0, second);
		}
	}
	return model;
}
} // namespace

std::vector<ModelDescription> BuildVolumeModels()
{
	std::vector<ModelDescription> models;
	models.push_back(PointVolume());
	models.push_back(SpotVolume());
	models.push_back(DecalBox());
	for (ModelDescription& model : models)
	{
		model.myMesh.ComputeTangentFrames();
	}
	return models;
}
} // namespace Content
