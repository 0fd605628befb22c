#pragma once
// DecalData: one projected decal: a box of size x size x depth centred on the
// position, projecting along myNorm (the normal of the surface the decal faces).
// The colour is kept and saved with the decal; the decal pass does not read it.
// The two textures belong to the decal type and are not owned.
#include <string>

#include "core/Vector3.h"
#include "core/Vector4.h"

namespace Zeph
{
class Texture;

struct DecalData
{
	float mySize = 1.0f;
	Vector3<float> myPosition{0.0f, 0.0f, 0.0f};
	Vector4<float> myColor{1.0f, 1.0f, 1.0f, 1.0f};
	Texture* myTexture = nullptr;
	Texture* myNormalTexture = nullptr;
	Vector3<float> myNorm{0.0f, 0.0f, -1.0f};
	std::string myTypeId = "brick";
	float myDepth = 0.3f;
	float myReserved = 0.0f;
};
} // namespace Zeph
