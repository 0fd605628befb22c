#pragma once
// DeferredRenderTargetHelper: the G-buffer. Five targets in slot order: albedo
// (R8G8B8A8_UNORM_SRGB), view-space normal (R8G8B8A8_UNORM), linear depth
// (R32_FLOAT, view depth over the far plane, -1 where nothing was drawn), material
// (R8G8B8A8_UNORM: roughness, metalness, occlusion, emissive) and reflection
// (R8G8B8A8_UNORM_SRGB). Begin binds them with the depth buffer set by SetDepth and
// pushes the collector's camera to every effect; the batches draw with their
// model's G-buffer technique, and the room environment (box and cubemap) is
// republished to every effect only when the room changes between two instances.
// The frame owns one at screen size; each bake makes its own at the cube face size.
// It also holds the light-volume models of the light passes.
#include <memory>

#include "renderer/LightVolumes.h"
#include "renderer/RenderTargetHelper.h"

namespace Gpu
{
class DepthStencilView;
}

namespace Zeph
{
class Model;
class Texture;
struct RoomData;

class DeferredRenderTargetHelper : public RenderTargetHelper
{
public:
	enum Slot
	{
		ALBEDO = 0,
		NORMAL = 1,
		LINEAR_DEPTH = 2,
		MATERIAL = 3,
		REFLECTION = 4,
		SLOT_COUNT = 5,
	};

	DeferredRenderTargetHelper();
	~DeferredRenderTargetHelper() override;

	bool Init(int aWidth, int aHeight);
	// The five targets made again at a new size (the volume models stay); when one
	// cannot be made the old ones stay and it returns false.
	bool Resize(int aWidth, int aHeight);
	void Destroy();

	// The clear values of the five targets.
	void Clear();
	void SetDepth(Gpu::DepthStencilView* aDepth) { myDepth = aDepth; }
	Texture* GetTarget(Slot aSlot) const { return myTargets[aSlot].get(); }
	int GetWidth() const { return myWidth; }
	int GetHeight() const { return myHeight; }

	// The light volumes: a unit sphere (points) and a cone along +Z of length and
	// radius 1 (spots); null when their files cannot be loaded.
	const VolumeModel& GetPointLightModel() const { return myPointLightModel; }
	const VolumeModel& GetSpotLightModel() const { return mySpotLightModel; }

	void Begin(RenderTargetCollector& aCollector) override;
	void End(RenderTargetCollector& aCollector) override;
	void Render(const RenderBatch& aBatch) override;
	void RenderSkinned(const SkinnedRenderBatch& aBatch) override;

	// Publishes a room's box and cubemap (the fallback cubemap when it has none).
	static void PublishEnvironment(const RoomData& aRoomData);

private:
	std::unique_ptr<Texture> myTargets[SLOT_COUNT];
	Gpu::DepthStencilView* myDepth = nullptr;
	VolumeModel myPointLightModel;
	VolumeModel mySpotLightModel;
	int myWidth = 0;
	int myHeight = 0;
	bool myHasRoomFlag = false;
	int myLastRoomIndex = 0;
};
} // namespace Zeph
