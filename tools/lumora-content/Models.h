#pragma once
// Models: the catalogue of sample models, built in metres with y up and the floor at y = 0.
//
//   for (const Content::ModelDescription& model : Content::BuildModels())
//   {
//       std::string document = Content::WriteColladaDocument(model);   // -> models/<name>.dae
//   }
//
// Rooms are inward-facing shells (walls, floor and ceiling) with door openings; the rest are
// props seen from outside: floor tiles, a pillar, a crate, an arch and a torus-knot sculpture with
// two materials. Every model's tangent frames are computed before it is returned.

#include <string>
#include <vector>

#include "Materials.h"
#include "MeshBuilder.h"

namespace Content
{
// Binds a polygon set's material symbol to one of the procedural materials.
struct ModelMaterial
{
	std::string mySymbol;
	MaterialKind myMaterial = MaterialKind::Concrete;
};

struct ModelDescription
{
	std::string myName; // file stem and id prefix: "room_small" -> models/room_small.dae
	MeshBuilder myMesh;
	std::vector<ModelMaterial> myMaterials; // one per polygon set symbol
};

std::vector<ModelDescription> BuildModels();
// A box room [-w/2, w/2] x [0, h] x [-d/2, d/2] seen from inside, with a door 1.2 m wide and 2.2 m
// high in the middle of each wall named in aDoors (DoorSide bits; 0: a closed room). The walls are
// quads (a polylist in the file); the ceiling is concrete.
ModelDescription Room(const std::string& aName, double aWidth, double aHeight, double aDepth, int aDoors,
                      MaterialKind aWallMaterial, MaterialKind aFloorMaterial);
} // namespace Content
