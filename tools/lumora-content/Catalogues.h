#pragma once
// Catalogues: the entity types and decal types that every level shares, as written to
// data/XML/EntityTypes.xml and data/XML/DecalTypes.xml.
//
//   for (const Content::EntityType& type : Content::EntityTypes()) { ... }   // "crate" -> its model
//
// The entity types are the placeable sample models (rooms and props, not the renderer's volume
// models), each named after its model; the decal types are the decal kinds of DecalTextures.h.
// Paths are the engine's: "data/models/crate.dae", "data/textures/decal_brick_albedo.dds".

#include <string>
#include <vector>

namespace Content
{
struct EntityType
{
	std::string myId;
	std::string myModelPath;
};

struct DecalType
{
	std::string myId;
	std::string myTexturePath;
	std::string myNormalPath;
};

std::vector<EntityType> EntityTypes();
std::vector<DecalType> DecalTypes();
} // namespace Content
