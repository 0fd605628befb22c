#include "renderer/DeferredRenderTargetHelper.h"

#include "engine/Effect.h"
#include "engine/EffectContainer.h"
#include "engine/Engine.h"
#include "engine/RoomData.h"
#include "engine/Texture.h"
#include "model/Model.h"
#include "model/ModelFactory.h"
#include "model/ModelNode.h"
#include "platform/gpu/Context.h"
#include "renderer/CubemapContainer.h"
#include "renderer/DynamicCubemap.h"
#include "renderer/RenderTargetCollector.h"

namespace Zeph
{
namespace
{
constexpr Dds::Format ourFormats[DeferredRenderTargetHelper::SLOT_COUNT] = {
    Dds::Format::R8G8B8A8_UNORM_SRGB, Dds::Format::R8G8B8A8_UNORM, Dds::Format::R32_FLOAT,
    Dds::Format::R8G8B8A8_UNORM, Dds::Format::R8G8B8A8_UNORM_SRGB};
constexpr float ourClearValues[DeferredRenderTargetHelper::SLOT_COUNT][4] = {
    {0.0f, 0.0f, 0.0f, 0.0f}, {0.5f, 0.5f, 0.5f, 0.5f}, {-1.0f, -1.0f, -1.0f, -1.0f},
    {0.0f, 0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 0.0f, 0.0f}};
constexpr const char* ourPointLightModel = "data/models/light_volume_point.dae";
constexpr const char* ourSpotLightModel = "data/models/light_volume_spot.dae";

} // namespace

DeferredRenderTargetHelper::DeferredRenderTargetHelper() = default;
DeferredRenderTargetHelper::~DeferredRenderTargetHelper() = default;

bool DeferredRenderTargetHelper::Init(int aWidth, int aHeight)
{
	Engine* engine = Engine::GetInstance();
	if (engine == nullptr)
	{
		return false;
	}
	myWidth = aWidth;
	myHeight = aHeight;
	bool success = true;
	for (int slot = 0; slot < SLOT_COUNT; ++slot)
	{
		myTargets[slot] = std::make_unique<Texture>(aWidth, aHeight, ourFormats[slot]);
		success = success && myTargets[slot]->GetRenderTargetView() != nullptr;
	}
	myPointLightModel = LightVolumes::Load(ourPointLightModel);
	mySpotLightModel = LightVolumes::Load(ourSpotLightModel);
	return success;
}

bool DeferredRenderTargetHelper::Resize(int aWidth, int aHeight)
{
	std::unique_ptr<Texture> targets[SLOT_COUNT];
	for (int slot = 0; slot < SLOT_COUNT; ++slot)
	{
		targets[slot] = std::make_unique<Texture>(aWidth, aHeight, ourFormats[slot]);
		if (targets[slot]->GetRenderTargetView() == nullptr)
		{
			return false;
		}
	}
	for (int slot = 0; slot < SLOT_COUNT; ++slot)
	{
		myTargets[slot] = std::move(targets[slot]);
	}
	myWidth = aWidth;
	myHeight = aHeight;
	return true;
}

void DeferredRenderTargetHelper::Destroy()
{
	for (std::unique_ptr<Texture>& target : myTargets)
	{
		target.reset();
	}
	myPointLightModel = VolumeModel();
	mySpotLightModel = VolumeModel();
	myDepth = nullptr;
}

void DeferredRenderTargetHelper::Clear()
{
	Gpu::Context& context = Engine::GetInstance()->GetContext();
	for (int slot = 0; slot < SLOT_COUNT; ++slot)
	{
		if (myTargets[slot] && myTargets[slot]->GetRenderTargetView() != nullptr)
		{
			context.ClearRenderTargetView(*myTargets[slot]->GetRenderTargetView(), ourClearValues[slot]);
		}
	}
}

void DeferredRenderTargetHelper::Begin(RenderTargetCollector& aCollector)
{
	Engine* engine = Engine::GetInstance();
	Gpu::RenderTargetView* targets[SLOT_COUNT] = {};
	for (int slot = 0; slot < SLOT_COUNT; ++slot)
	{
		targets[slot] = myTargets[slot] ? myTargets[slot]->GetRenderTargetView() : nullptr;
	}
	engine->GetContext().SetRenderTargets(targets, myDepth);
	const Matrix44<float>& cameraWorld = aCollector.GetCameraWorld();
	const Vector3<float> eye = cameraWorld.GetPosition();
	engine->GetEffectContainer().ForEachEffect([&aCollector, &eye](Effect& anEffect) {
		anEffect.SetViewMatrix(aCollector.GetView());
		anEffect.SetPrevViewMatrix(aCollector.GetPreviousView());
		anEffect.SetProjectionMatrix(aCollector.GetProjection());
		anEffect.SetFarPlane(aCollector.GetFarPlane());
		anEffect.SetEyePosition(eye);
	});
	myHasRoomFlag = false;
}

void DeferredRenderTargetHelper::End(RenderTargetCollector& aCollector)
{
	(void)aCollector;
}

void DeferredRenderTargetHelper::PublishEnvironment(const RoomData& aRoomData)
{
	Engine* engine = Engine::GetInstance();
	DynamicCubemap* cubemap = aRoomData.myCubemap;
	if (cubemap == nullptr)
	{
		cubemap = engine->GetCubemapContainer().GetCubemap(-1, "");
	}
	Gpu::ShaderResourceView* cube = cubemap != nullptr ? cubemap->GetCubeShaderResourceView() : nullptr;
	const Vector4<float> center(aRoomData.myCenter.x, aRoomData.myCenter.y, aRoomData.myCenter.z, 1.0f);
	const Vector4<float> maximum(aRoomData.myMax.x, aRoomData.myMax.y, aRoomData.myMax.z, 1.0f);
	const Vector4<float> minimum(aRoomData.myMin.x, aRoomData.myMin.y, aRoomData.myMin.z, 1.0f);
	engine->GetEffectContainer().ForEachEffect([&](Effect& anEffect) {
		anEffect.SetEnvironmentBox(center, maximum, minimum);
		anEffect.SetShaderResource("CubeMap", cube);
	});
}

void DeferredRenderTargetHelper::Render(const RenderBatch& aBatch)
{
	Effect* effect = GetBatchEffect(aBatch);
	if (effect == nullptr)
	{
		return;
	}
	DrawBatch(aBatch, *effect,
	          FindTechnique(*effect, aBatch.GetModel()->GetGBufferTechniqueName(), "RenderGBuffer"),
	          [this, &aBatch](int anInstance) {
		          const RoomData& room = aBatch.GetRoomData(anInstance);
		          if (!myHasRoomFlag || room.myRoomIndex != myLastRoomIndex)
		          {
			          PublishEnvironment(room);
			          myHasRoomFlag = true;
			          myLastRoomIndex = room.myRoomIndex;
		          }
	          });
}

void DeferredRenderTargetHelper::RenderSkinned(const SkinnedRenderBatch& aBatch)
{
	Render(aBatch);
}
} // namespace Zeph
