// The light-volume and decal-box models read back with the COLLADA reader: closed convex shapes
// wound outward that contain the shape the renderer scales them to.

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

using Point = std::array<double, 3>;
using Triangle = std::array<Point, 3>;

double Dot(const Point& aLeft, const Point& aRight)
{
	return aLeft[0] * aRight[0] + aLeft[1] * aRight[1] + aLeft[2] * aRight[2];
}

// The plane of a triangle: unit normal by its winding (counter-clockwise = front) and offset.
std::pair<Point, double> Plane(const Triangle& aTriangle)
{
	Point edge[2];
	for (int axis = 0; axis < 3; ++axis)
	{
		edge[0][axis] = aTriangle[1][axis] - aTriangle[0][axis];
		edge[1][axis] = aTriangle[2][axis] - aTriangle[0][axis];
	}
	Point normal = {edge[0][1] * edge[1][2] - edge[0][2] * edge[1][1],
	                edge[0][2] * edge[1][0] - edge[0][0] * edge[1][2],
	                edge[0][0] * edge[1][1] - edge[0][1] * edge[1][0]};
	const double length = std::sqrt(Dot(normal, normal));
	for (double& value : normal)
	{
		value /= length;
	}
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
				triangle[k] = {xyz[0], xyz[1], xyz[2]};
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
	std::vector<Point> sphere, cone = {{0.0, 0.0, 0.0}}, cube;
	for (int step = 0; step < 41 * 80; ++step)
	{
		const double polar = ourPi * (step / 80) / 40, azimuth = 2.0 * ourPi * (step % 80) / 80;
		sphere.push_back(
		    {std::sin(polar) * std::cos(azimuth), std::cos(polar), std::sin(polar) * std::sin(azimuth)});
	}
	for (int step = 0; step < 720; ++step)
	{
		cone.push_back({std::cos(ourPi * step / 360), std::sin(ourPi * step / 360), 1.0});
	}
	for (int corner = 0; corner < 8; ++corner)
	{
		cube.push_back({corner & 1 ? 0.5 : -0.5, corner & 2 ? 0.5 : -0.5, corner & 4 ? 0.5 : -0.5});
	}
	struct Case
	{
		const char* myName;
		size_t myTriangles;
		const std::vector<Point>& myInside;
		double myMinVolume, myMaxVolume;
	} const cases[] = {{"light_volume_point", 320, sphere, 4.0 / 3.0 * ourPi, 4.0 / 3.0 * ourPi * 1.1},
	                   {"light_volume_spot", 48, cone, ourPi / 3.0, ourPi / 3.0 * 1.02},
	                   {"decal_box", 12, cube, 1.0 - 1e-5, 1.0 + 1e-5}};
	for (const Case& test : cases)
	{
		SCOPED_TRACE(test.myName);
		std::vector<Triangle> triangles;
		ASSERT_NO_FATAL_FAILURE(LoadTriangles(test.myName, triangles));
		EXPECT_EQ(triangles.size(), test.myTriangles);
		double volume = 0.0; // signed tetrahedra to the origin: positive when wound outward
		for (const auto& [a, b, c] : triangles)
		{
			volume += (a[0] * (b[1] * c[2] - b[2] * c[1]) + a[1] * (b[2] * c[0] - b[0] * c[2]) +
			           a[2] * (b[0] * c[1] - b[1] * c[0])) /
			          6.0;
		}
		int wrong = 0;
		for (const Triangle& triangle : triangles)
		{
			const auto [normal, offset] = Plane(triangle);
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
				ADD_FAILURE() << "a face at (" << triangle[0][0] << ", " << triangle[0][1] << ", "
				              << triangle[0][2] << ") has a corner or the shape in front of it";
			}
		}
		EXPECT_TRUE(volume >= test.myMinVolume && volume <= test.myMaxVolume) << "volume " << volume;
	}
}

TEST(VolumeModelTest, PointVolumeCircumscribesTheUnitSphereClosely)
{
	std::vector<Triangle> triangles;
	ASSERT_NO_FATAL_FAILURE(LoadTriangles("light_volume_point", triangles));
	ASSERT_FALSE(triangles.empty());
	double nearest = 1e9;
	for (const Triangle& triangle : triangles)
	{
		nearest = std::min(nearest, Plane(triangle).second);
	}
	EXPECT_GE(nearest, 1.0) << "a face plane cuts into the unit sphere";
	EXPECT_LT(nearest, 1.001) << "the volume is larger than it needs to be";
}
