#include "renderer/OutlineRenderTargetHelper.h"

#include "engine/Effect.h"
#include "engine/Engine.h"
#include "engine/Texture.h"
#include "platform/gpu/Context.h"

namespace Zeph
{
OutlineRenderTargetHelper::OutlineRenderTargetHelper() = default;
OutlineRenderTargetHelper::~OutlineRenderTargetHelper() = default;

bool OutlineRenderTargetHelper::Init(int aWidth, int aHeight)
{
	myTarget = std::make_unique<Texture>(aWidth, aHeight, Dds::Format::R8G8B8A8_UNORM_SRGB);
	return myTarget->GetRenderTargetView() != nullptr;
}

bool OutlineRenderTargetHelper::Resize(int aWidth, int aHeight)
{
	auto target = std::make_unique<Texture>(aWidth, aHeight, Dds::Format::R8G8B8A8_UNORM_SRGB);
	if (target->GetRenderTargetView() == nullptr)
	{
		return false;
	}
	myTarget = std::move(target);
	return true;
}

void OutlineRenderTargetHelper::Destroy()
{
	myTarget.reset();
}

void OutlineRenderTargetHelper::Begin(RenderTargetCollector& aCollector)
{
	(void)aCollector;
	if (myTarget && myTarget->GetRenderTargetView() != nullptr)
	{
		// The mask ignores depth: a selected object's outline shows through walls.
		Gpu::RenderTargetView* const targets[] = {myTarget->GetRenderTargetView()};
		Engine::GetInstance()->GetContext().SetRenderTargets(targets, nullptr);
	}
}

void OutlineRenderTargetHelper::End(RenderTargetCollector& aCollector)
{
	(void)aCollector;
	Engine::GetInstance()->GetContext().SetRenderTargets({}, nullptr);
}

void OutlineRenderTargetHelper::Render(const RenderBatch& aBatch)
{
	Effect* effect = GetBatchEffect(aBatch);
	if (effect != nullptr)
	{
		DrawBatch(aBatch, *effect, FindTechnique(*effect, "RenderOutlineMask", nullptr));
	}
}

void OutlineRenderTargetHelper::RenderSkinned(const SkinnedRenderBatch& aBatch)
{
	Render(aBatch);
}
} // namespace Zeph
