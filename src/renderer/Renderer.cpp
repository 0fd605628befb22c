#include "renderer/Renderer.h"

#include "engine/Effect.h"
#include "engine/Engine.h"
#include "engine/Instance.h"
#include "engine/Text.h"
#include "model/Model.h"
#include "platform/fx/Technique.h"
#include "platform/gpu/Context.h"

namespace Zeph
{
namespace
{
constexpr float ourClearColor[4] = {0.0f, 0.0f, 0.0f, 1.0f};

// The lists a frame draws; the outline list only feeds the outline mask.
constexpr RenderTargetCollector::BatchListType ourDrawnLists[] = {
    RenderTargetCollector::SHADOW_CASTING_LIST,
    RenderTargetCollector::UNSHADOWED_LIST,
    RenderTargetCollector::FORWARD_LIST,
};
} // namespace

Renderer::Renderer() : myLateItems(16, 16)
{
}

bool Renderer::Init(int aWidth, int aHeight)
{
	myWidth = aWidth;
	myHeight = aHeight;
	myViewport = Gpu::Viewport();
	myViewport.myWidth = static_cast<float>(aWidth);
	myViewport.myHeight = static_cast<float>(aHeight);
	return true;
}

void Renderer::Destroy()
{
	myCollector.Reset();
	myLateItems.RemoveAll();
}

void Renderer::RenderLateInstance(Instance* anInstance)
{
	if (anInstance == nullptr)
	{
		return;
	}
	LateRenderItem item;
	item.myKind = LateRenderItem::INSTANCE;
	item.myInstance = anInstance;
	myLateItems.Add(item);
}

void Renderer::RenderLateText(Text* aText)
{
	if (aText == nullptr)
	{
		return;
	}
	LateRenderItem item;
	item.myKind = LateRenderItem::TEXT;
	item.myText = aText;
	myLateItems.Add(item);
}

void Renderer::Render(Gpu::RenderTargetView* aTarget, Gpu::DepthStencilView* aDepth)
{
	Engine* engine = Engine::GetInstance();
	if (engine == nullptr || aTarget == nullptr)
	{
		myCollector.Reset();
		myLateItems.RemoveAll();
		return;
	}
	Gpu::Context& context = engine->GetContext();
	context.SetViewport(myViewport);
	context.ClearRenderTargetView(*aTarget, ourClearColor);
	if (aDepth != nullptr)
	{
		context.ClearDepthStencilView(*aDepth, true, true, 1.0f, 0);
	}
	Gpu::RenderTargetView* const targets[] = {aTarget};
	if (context.SetRenderTargets(targets, aDepth))
	{
		DrawBatches(context);
	}
	myCollector.Reset();
	RenderLateItems(context, aTarget);
	myLateItems.RemoveAll();
	// The frame ends by presenting it.
	engine->Present();
}

void Renderer::DrawBatches(Gpu::Context& aContext)
{
	for (RenderTargetCollector::BatchListType list : ourDrawnLists)
	{
		const RenderBatchList& batches = myCollector.GetBatches(list);
		for (int index = 0; index < batches.Count(); ++index)
		{
			DrawBatch(aContext, batches[index]);
		}
	}
	aContext.SetInputLayout(nullptr);
	aContext.SetVertexBuffer(0, nullptr, 0, 0);
	aContext.SetIndexBuffer(nullptr, Gpu::IndexFormat::UInt32, 0);
}

void Renderer::DrawBatch(Gpu::Context& aContext, const RenderBatch& aBatch)
{
	const Model* model = aBatch.GetModel();
	const Surface* surface = aBatch.GetSurface();
	Effect* effect = surface->GetEffect() != nullptr ? surface->GetEffect() : model->GetEffect();
	if (effect == nullptr || !model->SetupBuffers(aContext))
	{
		return;
	}
	Fx::Technique* technique = model->GetRenderTechnique();
	if (technique == nullptr || !technique->IsValid())
	{
		technique = effect->GetTechnique();
	}
	if (technique == nullptr)
	{
		return;
	}
	effect->SetViewMatrix(myCollector.GetView());
	effect->SetPrevViewMatrix(myCollector.GetPreviousView());
	effect->SetProjectionMatrix(myCollector.GetProjection());
	effect->SetFarPlane(myCollector.GetFarPlane());
	surface->ActivateTextures();
	aContext.SetPrimitiveTopology(surface->GetPrimitiveTopology());
	for (int instance = 0; instance < aBatch.GetCount(); ++instance)
	{
		const RoomData& room = aBatch.GetRoomData(instance);
		effect->SetWorldMatrix(aBatch.GetWorld(instance));
		effect->SetPrevWorldMatrix(aBatch.GetPreviousWorld(instance));
		effect->SetEnvironmentBox(Vector4<float>(room.myCenter), Vector4<float>(room.myMax),
		                          Vector4<float>(room.myMin));
		for (int pass = 0; pass < technique->GetPassCount(); ++pass)
		{
			if (technique->GetPassByIndex(pass)->Apply(aContext))
			{
				aContext.DrawIndexed(static_cast<uint32_t>(surface->GetIndexCount()),
				                     static_cast<uint32_t>(surface->GetStartIndex()), 0);
			}
		}
	}
}

void Renderer::RenderLateItems(Gpu::Context& aContext, Gpu::RenderTargetView* aTarget)
{
	Gpu::RenderTargetView* const targets[] = {aTarget};
	for (const LateRenderItem& item : myLateItems)
	{
		switch (item.myKind)
		{
		case LateRenderItem::INSTANCE:
			// Over the finished image: no depth buffer, so the scene hides nothing of it.
			if (aContext.SetRenderTargets(targets, nullptr))
			{
				item.myInstance->Render();
				DrawBatches(aContext);
			}
			myCollector.Reset();
			break;
		case LateRenderItem::TEXT:
			item.myText->Render(true);
			break;
		case LateRenderItem::SPRITE:
			break;
		}
	}
}
} // namespace Zeph
