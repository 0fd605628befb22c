#include "Models.h"

#include <algorithm>
#include <cmath>

#include "RoomShapes.h"

namespace Content
{
namespace
{
constexpr double ourPi = 3.14159265358979323846;
const Vec3 ourUp(0.0, 1.0, 0.0);

// One texture repeat per this many metres on walls and floors.
constexpr double ourWallTile = 2.0;

// A rectangle centred on aCenter facing aNormal, with anUp along its height; right = up x normal
// keeps the texture unmirrored seen from the front.
void AddFace(MeshBuilder& aMesh, uint32_t aSet, const Vec3& aCenter, const Vec3& aNormal, const Vec3& anUp,
             double aWidth, double aHeight, double aTile)
{
	const Vec3 right = Normalized(anUp.Cross(aNormal));
	const Vec3 corner = aCenter - right * (aWidth * 0.5) - anUp * (aHeight * 0.5);
	aMesh.AddRectangle(aSet, corner, right * aWidth, anUp * aHeight, aTile);
}

// An axis-aligned box seen from outside; aBottomFlag adds the face that rests on the floor.
void AddBox(MeshBuilder& aMesh, uint32_t aSet, const Vec3& aMin, const Vec3& aMax, double aTile,
            bool aBottomFlag)
{
	const Vec3 center = (aMin + aMax) * 0.5;
	const Vec3 size = aMax - aMin;
	const Vec3 north(0.0, 0.0, -1.0);
	const Vec3 south(0.0, 0.0, 1.0);
	AddFace(aMesh, aSet, Vec3(center.x, aMax.y, center.z), ourUp, north, size.x, size.z, aTile);
	if (aBottomFlag)
	{
		AddFace(aMesh, aSet, Vec3(center.x, aMin.y, center.z), ourUp * -1.0, south, size.x, size.z, aTile);
	}
	AddFace(aMesh, aSet, Vec3(center.x, center.y, aMax.z), south, ourUp, size.x, size.y, aTile);
	AddFace(aMesh, aSet, Vec3(center.x, center.y, aMin.z), north, ourUp, size.x, size.y, aTile);
	AddFace(aMesh, aSet, Vec3(aMax.x, center.y, center.z), Vec3(1.0, 0.0, 0.0), ourUp, size.z, size.y, aTile);
	AddFace(aMesh, aSet, Vec3(aMin.x, center.y, center.z), Vec3(-1.0, 0.0, 0.0), ourUp, size.z, size.y,
	        aTile);
}

} // namespace

ModelDescription Room(const std::string& aName, double aWidth, double aHeight, double aDepth, int aDoors,
                      MaterialKind aWallMaterial, MaterialKind aFloorMaterial)
{
	ModelDescription model;
	model.myName = aName;
	model.myMaterials = {
	    {"walls", aWallMaterial}, {"floor", aFloorMaterial}, {"ceiling", MaterialKind::Concrete}};
	MeshBuilder& mesh = model.myMesh;
	const uint32_t walls = mesh.AddSet("walls", PrimitiveKind::Quads);
	const uint32_t floor = mesh.AddSet("floor", PrimitiveKind::Triangles);
	const uint32_t ceiling = mesh.AddSet("ceiling", PrimitiveKind::Triangles);

	AddFace(mesh, floor, Vec3(0.0, 0.0, 0.0), ourUp, Vec3(0.0, 0.0, -1.0), aWidth, aDepth, ourWallTile);
	AddFace(mesh, ceiling, Vec3(0.0, aHeight, 0.0), ourUp * -1.0, Vec3(0.0, 0.0, 1.0), aWidth, aDepth,
	        ourWallTile);

	const double doorWidth = ourDoorWidth;
	const double doorHeight = DoorHeight(aHeight);
	struct Wall
	{
		int myDoor;
		Vec3 myInward;
		double myLength;
		double myDistance;
	};
	const Wall sides[4] = {{DoorNorth, Vec3(0.0, 0.0, 1.0), aWidth, aDepth * 0.5},
	                       {DoorEast, Vec3(-1.0, 0.0, 0.0), aDepth, aWidth * 0.5},
	                       {DoorSouth, Vec3(0.0, 0.0, -1.0), aWidth, aDepth * 0.5},
	                       {DoorWest, Vec3(1.0, 0.0, 0.0), aDepth, aWidth * 0.5}};
	for (const Wall& wall : sides)
	{
		const Vec3 right = ourUp.Cross(wall.myInward);
		const Vec3 start = wall.myInward * -wall.myDistance - right * (wall.myLength * 0.5);
		if ((aDoors & wall.myDoor) == 0)
		{
			mesh.AddRectangle(walls, start, right * wall.myLength, ourUp * aHeight, ourWallTile);
			continue;
		}
		const double side = (wall.myLength - doorWidth) * 0.5;
		mesh.AddRectangle(walls, start, right * side, ourUp * aHeight, ourWallTile);
		mesh.AddRectangle(walls, start + right * (side + doorWidth), right * side, ourUp * aHeight,
		                  ourWallTile);
		mesh.AddRectangle(walls, start + right * side + ourUp * doorHeight, right * doorWidth,
		                  ourUp * (aHeight - doorHeight), ourWallTile);
	}
	return model;
}

namespace
{
ModelDescription FloorTile(const std::string& aName, double aSize, double aThickness, MaterialKind aMaterial)
{
	ModelDescription model;
	model.myName = aName;
	model.myMaterials = {{"tile", aMaterial}};
	const uint32_t set = model.myMesh.AddSet("tile", PrimitiveKind::Triangles);
	AddBox(model.myMesh, set, Vec3(-aSize * 0.5, 0.0, -aSize * 0.5),
	       Vec3(aSize * 0.5, aThickness, aSize * 0.5), aSize, true);
	return model;
}

ModelDescription Crate()
{
	ModelDescription model;
	model.myName = "crate";
	model.myMaterials = {{"wood", MaterialKind::WoodPlanks}};
	const uint32_t set = model.myMesh.AddSet("wood", PrimitiveKind::Quads);
	AddBox(model.myMesh, set, Vec3(-0.45, 0.0, -0.45), Vec3(0.45, 0.9, 0.45), 0.9, true);
	return model;
}

// A 16-sided marble shaft between a concrete base and capital, 3 m tall.
ModelDescription Pillar()
{
	ModelDescription model;
	model.myName = "pillar";
	model.myMaterials = {{"shaft", MaterialKind::Marble}, {"blocks", MaterialKind::Concrete}};
	MeshBuilder& mesh = model.myMesh;
	const uint32_t shaft = mesh.AddSet("shaft", PrimitiveKind::Triangles);
	const uint32_t blocks = mesh.AddSet("blocks", PrimitiveKind::Triangles);
	AddBox(mesh, blocks, Vec3(-0.35, 0.0, -0.35), Vec3(0.35, 0.3, 0.35), 0.7, false);
	AddBox(mesh, blocks, Vec3(-0.35, 2.7, -0.35), Vec3(0.35, 3.0, 0.35), 0.7, true);

	const int sides = 16;
	const double radius = 0.25;
	const double bottom = 0.3;
	const double top = 2.7;
	const double circumference = 2.0 * ourPi * radius;
	uint32_t previous[2] = {};
	for (int side = 0; side <= sides; ++side)
	{
		const double fraction = double(side) / sides;
		// The angle runs clockwise seen from above so that u runs to the right seen from outside.
		const double angle = -2.0 * ourPi * fraction;
		const Vec3 normal(std::cos(angle), 0.0, std::sin(angle));
		const double u = fraction * circumference;
		const uint32_t lower = mesh.AddVertex(normal * radius + ourUp * bottom, normal, u, bottom);
		const uint32_t upper = mesh.AddVertex(normal * radius + ourUp * top, normal, u, top);
		if (side > 0)
		{
			mesh.AddQuad(shaft, previous[0], lower, upper, previous[1]);
		}
		previous[0] = lower;
		previous[1] = upper;
	}
	return model;
}

// A round arch: a 2 m opening with its springing at 2 m, in a block 3 m wide, 3.5 m high and
// 0.6 m deep.
ModelDescription Arch()
{
	ModelDescription model;
	model.myName = "arch";
	model.myMaterials = {{"stone", MaterialKind::Bricks}};
	MeshBuilder& mesh = model.myMesh;
	const uint32_t set = mesh.AddSet("stone", PrimitiveKind::Triangles);
	const double radius = 1.0;
	const double spring = 2.0;
	const double halfWidth = 1.5;
	const double top = 3.5;
	const double halfDepth = 0.3;
	const double tile = ourWallTile;
	const int segments = 16; // a multiple of 4, so the block's upper corners lie on segment ends

	// Piers: front, back and the faces towards the opening.
	for (const double sign : {1.0, -1.0})
	{
		const double centerX = sign * (radius + halfWidth) * 0.5;
		const double width = halfWidth - radius;
		AddFace(mesh, set, Vec3(centerX, spring * 0.5, halfDepth), Vec3(0.0, 0.0, 1.0), ourUp, width, spring,
		        tile);
		AddFace(mesh, set, Vec3(centerX, spring * 0.5, -halfDepth), Vec3(0.0, 0.0, -1.0), ourUp, width,
		        spring, tile);
		AddFace(mesh, set, Vec3(sign * radius, spring * 0.5, 0.0), Vec3(-sign, 0.0, 0.0), ourUp,
		        halfDepth * 2.0, spring, tile);
		AddFace(mesh, set, Vec3(sign * halfWidth, top * 0.5, 0.0), Vec3(sign, 0.0, 0.0), ourUp,
		        halfDepth * 2.0, top, tile);
	}
	AddFace(mesh, set, Vec3(0.0, top, 0.0), ourUp, Vec3(0.0, 0.0, -1.0), halfWidth * 2.0, halfDepth * 2.0,
	        tile);

	// The spandrels between the curve and the block's outline, on the front and the back, as a
	// ring of quads from each curve point out along its ray to the outline.
	auto outline = [&](double anAngle) {
		const double c = std::cos(anAngle);
		const double s = std::sin(anAngle);
		double reach = (top - spring) / std::max(s, 1e-9);
		if (std::abs(c) > 1e-9)
		{
			reach = std::min(reach, halfWidth / std::abs(c));
		}
		return Vec3(c * reach, spring + s * reach, 0.0);
	};
	for (const double side : {1.0, -1.0})
	{
		const Vec3 normal(0.0, 0.0, side);
		const Vec3 right = ourUp.Cross(normal);
		auto vertex = [&](const Vec3& aPoint) {
			const Vec3 position(aPoint.x, aPoint.y, side * halfDepth);
			return mesh.AddVertex(position, normal, Dot(position, right) / tile, position.y / tile);
		};
		for (int segment = 0; segment < segments; ++segment)
		{
			const double from = ourPi * segment / segments;
			const double to = ourPi * (segment + 1) / segments;
			const uint32_t innerFrom =
			    vertex(Vec3(std::cos(from) * radius, spring + std::sin(from) * radius, 0.0));
			const uint32_t outerFrom = vertex(outline(from));
			const uint32_t outerTo = vertex(outline(to));
			const uint32_t innerTo = vertex(Vec3(std::cos(to) * radius, spring + std::sin(to) * radius, 0.0));
			// Counter-clockwise seen from the front (+z); the back face is the mirror order.
			if (side > 0.0)
			{
				mesh.AddQuad(set, innerFrom, outerFrom, outerTo, innerTo);
			}
			else
			{
				mesh.AddQuad(set, innerFrom, innerTo, outerTo, outerFrom);
			}
		}
	}

	// The soffit: the curved underside, facing the arch's centre. u runs along z, v along the curve,
	// continuing the right pier's inner face.
	for (int segment = 0; segment < segments; ++segment)
	{
		uint32_t corners[4] = {};
		int corner = 0;
		for (const int step : {0, 1})
		{
			const double angle = ourPi * (segment + step) / segments;
			const Vec3 normal(-std::cos(angle), -std::sin(angle), 0.0);
			const double v = (spring + radius * angle) / tile;
			for (const double z : {-halfDepth, halfDepth})
			{
				const Vec3 position(std::cos(angle) * radius, spring + std::sin(angle) * radius, z);
				corners[corner++] = mesh.AddVertex(position, normal, z / tile, v);
			}
		}
		// corners: (from, -z), (from, +z), (to, -z), (to, +z); right is +z, up is along the curve.
		mesh.AddQuad(set, corners[0], corners[1], corners[3], corners[2]);
	}
	return model;
}

// A (2, 3) torus knot tube, 1.1 m across, floating with its centre 1.2 m above the floor. Bands
// along the tube alternate between two materials, so the model has two polygon sets.
ModelDescription Sculpture()
{
	ModelDescription model;
	model.myName = "sculpture_knot";
	model.myMaterials = {{"metal", MaterialKind::MetalPanels}, {"stone", MaterialKind::Marble}};
	MeshBuilder& mesh = model.myMesh;
	const uint32_t sets[2] = {mesh.AddSet("metal", PrimitiveKind::Triangles),
	                          mesh.AddSet("stone", PrimitiveKind::Triangles)};
	const int p = 2;
	const int q = 3;
	const double major = 0.4;
	const double minor = 0.15;
	const double tube = 0.07;
	const double height = 1.2;
	const int along = 144;
	const int around = 12;
	const int band = 12;

	auto curve = [&](double aT) {
		const double ring = major + minor * std::cos(q * aT);
		return Vec3(ring * std::cos(p * aT), height + minor * std::sin(q * aT), ring * std::sin(p * aT));
	};
	auto derivative = [&](double aT) {
		const double ring = major + minor * std::cos(q * aT);
		const double ringRate = -minor * q * std::sin(q * aT);
		return Vec3(ringRate * std::cos(p * aT) - ring * p * std::sin(p * aT), minor * q * std::cos(q * aT),
		            ringRate * std::sin(p * aT) + ring * p * std::cos(p * aT));
	};
	// The offset from the torus' core circle to the curve is perpendicular to the curve's
	// direction everywhere, so it gives a frame that closes on itself without a twist seam.
	auto offset = [&](double aT) {
		return Vec3(std::cos(q * aT) * std::cos(p * aT), std::sin(q * aT),
		            std::cos(q * aT) * std::sin(p * aT));
	};

	double length = 0.0;
	std::vector<double> distance(along + 1, 0.0);
	for (int step = 1; step <= along; ++step)
	{
		length += (curve(2.0 * ourPi * step / along) - curve(2.0 * ourPi * (step - 1) / along)).Length();
		distance[step] = length;
	}
	const double tile = 1.0;
	const double circumference = 2.0 * ourPi * tube;
	std::vector<uint32_t> grid(size_t(along + 1) * (around + 1));
	for (int step = 0; step <= along; ++step)
	{
		const double t = 2.0 * ourPi * step / along;
		const Vec3 tangent = Normalized(derivative(t));
		const Vec3 first = Normalized(offset(t));
		// first x tangent (not tangent x first) keeps the UVs unmirrored seen from outside.
		const Vec3 second = first.Cross(tangent);
		for (int turn = 0; turn <= around; ++turn)
		{
			const double angle = 2.0 * ourPi * turn / around;
			const Vec3 normal = first * std::cos(angle) + second * std::sin(angle);
			grid[size_t(step) * (around + 1) + turn] =
			    mesh.AddVertex(curve(t) + normal * tube, normal, distance[step] / tile,
			                   circumference * turn / around / tile);
		}
	}
	for (int step = 0; step < along; ++step)
	{
		const uint32_t set = sets[(step / band) % 2];
		for (int turn = 0; turn < around; ++turn)
		{
			const uint32_t* row = &grid[size_t(step) * (around + 1)];
			const uint32_t* next = &grid[size_t(step + 1) * (around + 1)];
			mesh.AddQuad(set, row[turn], next[turn], next[turn + 1], row[turn + 1]);
		}
	}
	return model;
}
} // namespace

std::vector<ModelDescription> BuildModels()
{
	std::vector<ModelDescription> models;
	for (const RoomShape& shape : RoomShapes())
	{
		models.push_back(Room(shape.myName, shape.myWidth, shape.myHeight, shape.myDepth, shape.myDoors,
		                      shape.myWallMaterial, shape.myFloorMaterial));
	}
	models.push_back(FloorTile("floor_tile_marble", 1.0, 0.04, MaterialKind::Marble));
	models.push_back(FloorTile("floor_tile_concrete", 2.0, 0.08, MaterialKind::Concrete));
	models.push_back(Pillar());
	models.push_back(Crate());
	models.push_back(Arch());
	models.push_back(Sculpture());
	for (ModelDescription& model : models)
	{
		model.myMesh.ComputeTangentFrames();
	}
	return models;
}
} // namespace Content
