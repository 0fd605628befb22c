#pragma once
// Surface: one draw range of a model's index buffer with its effect, topology and
// texture bindings. A model owns its surfaces; every instance of the model draws
// the same surfaces, so a surface is what the renderer batches instances by.
//
//   Zeph::Surface surface;
//   surface.SetEffect(effect);
//   surface.SetIndexCount(36);
//   surface.SetPrimitiveTopology(Gpu::PrimitiveTopology::TriangleList);
//   surface.SetTexture("C:/art/data/tex/a.dds", "DiffuseTexture", true);   // binds data/tex/a.dds
//   ...
//   surface.ActivateTextures();   // before drawing: each texture to its effect variable
#include <string>
#include <vector>

#include "platform/gpu/Context.h"

namespace Fx
{
class Variable;
}

namespace Zeph
{
class Effect;
class Texture;

// Where a surface's instances are drawn (see RenderTargetCollector).
enum RenderCategory
{
	RENDER_CATEGORY_SHADOW_CASTING = 0,
	RENDER_CATEGORY_UNSHADOWED = 1,
	RENDER_CATEGORY_FORWARD = 2,
	RENDER_CATEGORY_SHADOW_CASTING_OUTLINE = 3,
};

class Surface
{
public:
	Surface() = default;

	void SetEffect(Effect* anEffect) { myEffect = anEffect; }
	Effect* GetEffect() const { return myEffect; }
	void SetIndexCount(int aCount) { myIndexCount = aCount; }
	int GetIndexCount() const { return myIndexCount; }
	void SetStartIndex(int anIndex) { myStartIndex = anIndex; }
	int GetStartIndex() const { return myStartIndex; }
	void SetPrimitiveTopology(Gpu::PrimitiveTopology aTopology) { myPrimitiveTopology = aTopology; }
	Gpu::PrimitiveTopology GetPrimitiveTopology() const { return myPrimitiveTopology; }
	// Two integers model files store with a surface: a reserved one and one the
	// importer sets to 0. Kept for the animation layers and written back unchanged.
	void SetReservedValues(int aReserved, int aSecond)
	{
		myReservedValue = aReserved;
		mySecondReservedValue = aSecond;
	}
	int GetReservedValue() const { return myReservedValue; }
	int GetSecondReservedValue() const { return mySecondReservedValue; }
	void SetRenderCategory(RenderCategory aCategory) { myRenderCategory = aCategory; }
	RenderCategory GetRenderCategory() const { return myRenderCategory; }

	// Binds the texture at aPath (cut to begin at its first "data", when it has one)
	// to the effect variable aVariableName. A texture that does not load or a
	// variable the effect lacks is reported and nothing is bound.
	bool SetTexture(const std::string& aPath, const std::string& aVariableName, bool aSRGBFlag);
	// Sets every bound texture on its variable.
	void ActivateTextures() const;

	int GetTextureCount() const { return static_cast<int>(myFileNames.size()); }
	const std::string& GetTextureFileName(int anIndex) const { return myFileNames[anIndex]; }
	const std::string& GetTextureVariableName(int anIndex) const { return myShaderResourceNames[anIndex]; }
	bool GetTextureSRGBFlag(int anIndex) const { return mySRGBFlags[anIndex]; }
	Texture* GetTexture(int anIndex) const { return myTextures[anIndex]; }

private:
	Effect* myEffect = nullptr; // shared, owned by the EffectContainer
	int myIndexCount = 0;
	int myStartIndex = 0;
	int myReservedValue = 0;
	int mySecondReservedValue = 0;
	Gpu::PrimitiveTopology myPrimitiveTopology = Gpu::PrimitiveTopology::TriangleList;
	RenderCategory myRenderCategory = RENDER_CATEGORY_SHADOW_CASTING;
	// The bindings, one entry per bound texture in each array.
	std::vector<std::string> myFileNames;
	std::vector<std::string> myShaderResourceNames;
	std::vector<bool> mySRGBFlags;
	std::vector<Texture*> myTextures; // owned by the TextureContainer
	std::vector<Fx::Variable*> myShaderResources;
};
} // namespace Zeph
