#pragma once
// DecalType: the textures of one decal type (from the decal type catalogue). The
// textures belong to the engine's texture container; a decal copies both handles when
// its type is set.
namespace Zeph
{
class Texture;
}

namespace Lumora
{
struct DecalType
{
	Zeph::Texture* myTexture = nullptr;
	Zeph::Texture* myNormalTexture = nullptr;
};
} // namespace Lumora
