#pragma once
// MaterialDefaults: 1x1 textures bound to a model effect's material slots before a
// surface binds its own, so that a surface without (say) an ambient-occlusion map
// reads "no occlusion" rather than the previous surface's map or black:
// DiffuseTexture white, NormalTexture flat (0.5, 0.5, 1), RoughnessTexture white,
// AOTexture white, SubstanceTexture black (not metallic).
#include <memory>

#include "platform/gpu/Texture.h"

namespace Zeph
{
class Effect;

class MaterialDefaults
{
public:
	bool Init();
	void Destroy();
	void Apply(Effect& anEffect) const;
	// A 1x1 white texture (for passes that want "no attenuation" where a mask goes).
	Gpu::ShaderResourceView* GetWhite() const
	{
		return myWhite ? myWhite->GetDefaultShaderResourceView() : nullptr;
	}

private:
	std::unique_ptr<Gpu::Texture> myWhite;
	std::unique_ptr<Gpu::Texture> myFlatNormal;
	std::unique_ptr<Gpu::Texture> myBlack;
};
} // namespace Zeph
