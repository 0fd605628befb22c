#pragma once
// DecalMeshRenderTargetHelper: projects the queued decals into the G-buffer. Begin
// copies the G-buffer normals (so the decal pass can read them while it writes the
// normal target), binds the linear depth and the copy, and binds albedo, normal,
// material and reflection with the depth buffer; End draws every decal box with
// "RenderDynamic" and every mesh decal with "RenderMesh". Nothing happens per batch.
#include <memory>

#include "core/Matrix44.h"
#include "renderer/LightVolumes.h"
#include "renderer/RenderTargetHelper.h"

namespace Gpu
{
class DepthStencilView;
}

namespace Zeph
{
class DeferredRenderTargetHelper;
class FullScreenHelper;
class Texture;
struct DecalData;

class DecalMeshRenderTargetHelper : public RenderTargetHelper
{
public:
	DecalMeshRenderTargetHelper();
	~DecalMeshRenderTargetHelper() override;

	bool Init(int aWidth, int aHeight, FullScreenHelper* aFullScreenHelper, DeferredRenderTargetHelper* aGBuffer);
	// The normal copy made again at a new size; the old one stays when it cannot be made.
	bool Resize(int aWidth, int aHeight);
	void Destroy();
	void SetDepth(Gpu::DepthStencilView* aDepth) { myDepth = aDepth; }

	void Begin(RenderTargetCollector& aCollector) override;
	void End(RenderTargetCollector& aCollector) override;
	void Render(const RenderBatch& aBatch) override { (void)aBatch; }
	void RenderSkinned(const SkinnedRenderBatch& aBatch) override { (void)aBatch; }

	// The decal box's world matrix: scale (size, size, depth), rotation rows
	// r = u x norm, u2 = norm x r, norm (u = +Y, or +Z when norm is vertical; the
	// rows are not normalised), translation at the decal's position.
	static Matrix44<float> BuildWorld(const DecalData& aDecal);

private:
	void DrawDecals(const GrowingArray<DecalData>& someDecals, const char* aTechnique);

	FullScreenHelper* myFullScreenHelper = nullptr;
	DeferredRenderTargetHelper* myGBuffer = nullptr;
	Gpu::DepthStencilView* myDepth = nullptr;
	std::unique_ptr<Texture> myNormalCopy;
	VolumeModel myBoxModel;
};
} // namespace Zeph
