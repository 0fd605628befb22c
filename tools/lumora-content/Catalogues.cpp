#include "Catalogues.h"

#include "DecalTextures.h"
#include "RoomShapes.h"

namespace Content
{
std::vector<EntityType> EntityTypes()
{
	std::vector<EntityType> types;
	for (const RoomShape& shape : RoomShapes())
	{
		types.push_back({shape.myName, "data/models/" + shape.myName + ".dae"});
	}
	for (const char* prop :
	     {"floor_tile_marble", "floor_tile_concrete", "pillar", "crate", "arch", "sculpture_knot"})
	{
		types.push_back({prop, std::string("data/models/") + prop + ".dae"});
	}
	return types;
}

std::vector<DecalType> DecalTypes()
{
	std::vector<DecalType> types;
	for (const DecalKind kind : ourDecalKinds)
	{
		types.push_back({DecalName(kind), "data/textures/" + DecalTextureFileName(kind, MapKind::Albedo),
		                 "data/textures/" + DecalTextureFileName(kind, MapKind::Normal)});
	}
	return types;
}
} // namespace Content
