#pragma once
// ProbeHelper: the light-probe resources of the renderer: the irradiance volume's
// seven 3D textures (one per packed SH coefficient block, R8G8B8A8_UNORM, null until
// uploaded), the 32-texel cube the ambient bake captures each probe into, the
// 256-texel cube of the reflection bake and the 768 x 768 target the reflection
// filter draws its face crosses into. Replaced by each ambient bake and each load of
// a baked volume.
#include <cstdint>
#include <memory>
#include <vector>

#include "platform/gpu/Texture.h"

namespace Zeph
{
class DynamicCubemap;
class Texture;

class ProbeHelper
{
public:
	static constexpr int ourBlockCount = 7;
	static constexpr int ourSHCubeSize = 32;
	static constexpr int ourReflectionCubeSize = 256;
	static constexpr int ourFilterTargetSize = 768;

	ProbeHelper();
	~ProbeHelper();
	ProbeHelper(const ProbeHelper&) = delete;
	ProbeHelper& operator=(const ProbeHelper&) = delete;

	bool Init();
	void Destroy();

	// Creates the seven textures (update false) or overwrites the existing ones whole
	// (update true) from blocks of nx * ny * nz packed texels each. Reports and
	// returns false when a texture or view cannot be made.
	bool Upload(bool anUpdateFlag, const std::vector<uint32_t>* someBlocks, int anX, int aY, int aZ);
	Gpu::ShaderResourceView* GetView(int aBlock) const { return myViews[aBlock]; }
	const Gpu::Texture* GetTexture(int aBlock) const { return myTextures[aBlock].get(); }
	bool HasVolume() const { return myViews[0] != nullptr; }

	DynamicCubemap* GetSHCubemap() const { return mySHCubemap.get(); }
	DynamicCubemap* GetReflectionCubemap() const { return myReflectionCubemap.get(); }
	Texture* GetFilterTarget() const { return myFilterTarget.get(); }

private:
	Gpu::ShaderResourceView* myViews[ourBlockCount] = {};
	std::unique_ptr<Gpu::Texture> myTextures[ourBlockCount];
	std::unique_ptr<DynamicCubemap> mySHCubemap;
	std::unique_ptr<DynamicCubemap> myReflectionCubemap;
	std::unique_ptr<Texture> myFilterTarget;
};
} // namespace Zeph
