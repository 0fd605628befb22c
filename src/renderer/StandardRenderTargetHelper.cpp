#include "renderer/StandardRenderTargetHelper.h"

#include "engine/Effect.h"
#include "model/Model.h"
#include "platform/fx/Technique.h"
#include "renderer/RenderTargetCollector.h"

namespace Zeph
{
void StandardRenderTargetHelper::RenderAuxiliaryList(RenderTargetCollector& aCollector)
{
	for (AuxiliaryEffect* effect : aCollector.GetAuxiliaryList())
	{
		effect->Render();
	}
}

void StandardRenderTargetHelper::RenderAuxiliaryEntry(RenderTargetCollector& aCollector)
{
	// Nothing in the editor sets the entry; while it is empty there is nothing to draw.
	(void)aCollector;
}

void StandardRenderTargetHelper::Render(const RenderBatch& aBatch)
{
	Effect* effect = GetBatchEffect(aBatch);
	if (effect == nullptr)
	{
		return;
	}
	Fx::Technique* technique = aBatch.GetModel()->GetRenderTechnique();
	if (technique == nullptr || !technique->IsValid())
	{
		technique = effect->GetTechnique();
	}
	DrawBatch(aBatch, *effect, technique != nullptr && technique->IsValid() ? technique : nullptr);
}

void StandardRenderTargetHelper::RenderSkinned(const SkinnedRenderBatch& aBatch)
{
	Render(aBatch);
}
} // namespace Zeph
