// The light-volume and decal-box models read back with the COLLADA reader: closed convex shapes
// wound outward that contain the shape the renderer scales them to, the point volume closely.

#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <string>
#include <vector>

#include "GeneratedContent.h"
#include "platform/collada/Document.h"

namespace
{
constexpr double ourPi = 3.14159265358979323846;

using ContentTestSupport::Dot;
using Point = Vector3<double>;
using Triangle = std::array<Point, 3>;

// The plane of a triangle: unit normal by its winding (counter-clockwise = front) and offset.
std::pair<Point, double> Plane(const Triangle& aTriangle)
{
	Point normal = (aTriangle[1] - aTriangle[0]).Cross(aTriangle[2] - aTriangle[0]);
	normal.Normalize();
	return {normal, Dot(normal, aTriangle[0])};
}

void LoadTriangles(const std::string& aName, std::vector<Triangle>& someTrianglesOut)
{
	ASSERT_EQ(ContentTestSupport::GeneratedContent::Get().Error(), "");
	Collada::Document document;
	std::string error;
	ASSERT_TRUE(
	    document.Load(ContentTestSupport::GeneratedContent::Get().Path("models/" + aName + ".dae"), error))
	    << error;
	ASSERT_EQ(document.GetGeometries().size(), 1u);
	Collada::Mesh mesh = document.GetGeometries()[0].myMesh;
	mesh.Triangulate();
	for (const Collada::PolygonSet& set : mesh.mySets)
	{
		const Collada::Input* input = set.FindInput(Collada::Semantic::Position);
		ASSERT_TRUE(input && mesh.FindSource(input->mySource));
		for (size_t corner = 0; corner + 2 < input->myIndices.size(); corner += 3)
		{
			Triangle triangle;
			for (size_t k = 0; k < 3; ++k)
			{
				const float* xyz = mesh.FindSource(input->mySource)->Element(input->myIndices[corner + k]);
				triangle[k] = Point(xyz[0], xyz[1], xyz[2]);
			}
			someTrianglesOut.push_back(triangle);
		}
	}
}
} // namespace

TEST(VolumeModelTest, VolumesAreClosedOutwardConvexAndContainTheirShapes)
{
	// Points whose convex hull is the shape: the unit sphere (sampled), the cone (apex and base
	// circle), the unit cube (corners).
	std::vector<Point> sphere, cone = {Point(0.0, 0.0, 0.0)}, cube;
	for (int step = 0; step < 41 * 80; ++step)
	{
		const double polar = ourPi * (step / 80) / 40, azimuth = 2.0 * ourPi * (step % 80) / 80;
		sphere.emplace_back(std::sin(polar) * std::cos(azimuth), std::cos(polar),
		                    std::sin(polar) * std::sin(azimuth));
	}
	for (int step = 0; step < 720; ++step)
	{
		cone.emplace_back(std::cos(ourPi * step / 360), std::sin(ourPi * step / 360), 1.0);
	}
	for (int corner = 0; corner < 8; ++corner)
	{
		cube.emplace_back(corner & 1 ? 0.5 : -0.5, corner & 2 ? 0.5 : -0.5, corner & 4 ? 0.5 : -0.5);
	}
	struct Case
	{
		const char* myName;
		size_t myTriangles;
		const std::vector<Point>& myInside;
		double myMinVolume, myMaxVolume;
	} const cases[] = {{"light_volume_point", 80, sphere, 4.0 / 3.0 * ourPi, 4.0 / 3.0 * ourPi * 1.08},
	                   {"light_volume_spot", 24, cone, ourPi / 3.0, ourPi / 3.0 * 1.03},
	                   {"decal_box", 12, cube, 1.0 - 1e-5, 1.0 + 1e-5}};
	for (const Case& test : cases)
	{
		SCOPED_TRACE(test.myName);
		std::vector<Triangle> triangles;
		ASSERT_NO_FATAL_FAILURE(LoadTriangles(test.myName, triangles));
		EXPECT_EQ(triangles.size(), test.myTriangles);
		double volume = 0.0;  // signed tetrahedra to the origin: positive when wound outward
		double nearest = 1e9; // the face plane nearest to the origin
		int wrong = 0;
		for (const Triangle& triangle : triangles)
		{
			volume += Dot(triangle[0], triangle[1].Cross(triangle[2])) / 6.0;
			const auto [normal, offset] = Plane(triangle);
			nearest = std::min(nearest, offset);
			// Convex and outward: every corner of the model and every point of the shape lies
			// on or behind every face's plane.
			bool ok = true;
			for (const Triangle& other : triangles)
			{
				for (const Point& corner : other)
				{
					ok = ok && Dot(normal, corner) - offset <= 1e-5;
				}
			}
			for (const Point& point : test.myInside)
			{
				ok = ok && Dot(normal, point) <= offset;
			}
			if (!ok && ++wrong <= 5)
			{
				ADD_FAILURE() << "a face at (" << triangle[0].x << ", " << triangle[0].y << ", "
				              << triangle[0].z << ") has a corner or the shape in front of it";
			}
		}
		EXPECT_TRUE(volume >= test.myMinVolume && volume <= test.myMaxVolume) << "volume " << volume;
		if (&test.myInside == &sphere) // the point volume circumscribes the unit sphere closely
		{
			EXPECT_GE(nearest, 1.0) << "a face plane cuts into the unit sphere";
			EXPECT_LT(nearest, 1.001) << "the volume is larger than it needs to be";
		}
	}
}
