#include "renderer/RenderTargetHelper.h"

#include <array>

#include "engine/Effect.h"
#include "engine/Engine.h"
#include "model/Model.h"
#include "model/ModelNode.h"
#include "model/TransformationNode.h"
#include "model/VertexTypes.h"
#include "platform/fx/Pass.h"
#include "platform/fx/Technique.h"
#include "platform/gpu/Context.h"
#include "renderer/Renderer.h"

namespace Zeph
{
namespace
{
// Bone matrices come from the animation layers, which play nothing in the editor: every model
// with bones (vertex types 5, 6 and 7) draws in its bind pose, with identity bones. An effect
// without a "Bones" array (the plain position shader of types 5 and 7) draws positions unskinned,
// which is the same pose.
void SetBindPose(Effect& anEffect)
{
	Fx::Variable* bones = anEffect.GetEffect()->GetVariableByName("Bones");
	if (bones == nullptr || !bones->IsValid() || bones->GetElementCount() <= 0)
	{
		return;
	}
	static const std::array<float, 16> identity = {1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1};
	for (int index = 0; index < bones->GetElementCount(); ++index)
	{
		bones->SetMatrixArray(identity.data(), index, 1);
	}
}
} // namespace

const Model* RenderTargetHelper::FindFirstModel(const ModelNode* aNode, Matrix44<float>& aTransformOut)
{
	if (aNode == nullptr)
	{
		return nullptr;
	}
	const Matrix44<float> parent = aTransformOut;
	if (const TransformationNode* transformation = aNode->GetTransformation())
	{
		aTransformOut = transformation->GetTransformationForTime(0.0) * parent;
	}
	if (aNode->GetModel() != nullptr && !aNode->GetModel()->IsNullObject())
	{
		return aNode->GetModel();
	}
	const Matrix44<float> here = aTransformOut;
	for (const ModelNode* child : aNode->GetChildren())
	{
		aTransformOut = here;
		if (const Model* model = FindFirstModel(child, aTransformOut))
		{
			return model;
		}
	}
	aTransformOut = parent;
	return nullptr;
}

Effect* RenderTargetHelper::GetBatchEffect(const RenderBatch& aBatch)
{
	const Surface* surface = aBatch.GetSurface();
	if (surface != nullptr && surface->GetEffect() != nullptr)
	{
		return surface->GetEffect();
	}
	return aBatch.GetModel() != nullptr ? aBatch.GetModel()->GetEffect() : nullptr;
}

Fx::Technique* RenderTargetHelper::FindTechnique(Effect& anEffect, const std::string& aName,
                                                 const char* aFallback)
{
	Fx::Effect* effect = anEffect.GetEffect();
	if (effect == nullptr)
	{
		return nullptr;
	}
	Fx::Technique* technique = aName.empty() ? nullptr : effect->GetTechniqueByName(aName.c_str());
	if ((technique == nullptr || !technique->IsValid()) && aFallback != nullptr)
	{
		technique = effect->GetTechniqueByName(aFallback);
	}
	return technique != nullptr && technique->IsValid() ? technique : nullptr;
}

void RenderTargetHelper::DrawBatch(const RenderBatch& aBatch, Effect& anEffect, Fx::Technique* aTechnique,
                                   const std::function<void(int)>& aPerInstance)
{
	Engine* engine = Engine::GetInstance();
	const Model* model = aBatch.GetModel();
	const Surface* surface = aBatch.GetSurface();
	if (engine == nullptr || model == nullptr || surface == nullptr || aTechnique == nullptr)
	{
		return;
	}
	Gpu::Context& context = engine->GetContext();
	if (!model->SetupBuffers(context))
	{
		return;
	}
	engine->GetRenderer().GetMaterialDefaults().Apply(anEffect);
	surface->ActivateTextures();
	if (HasBones(model->GetVertexType()))
	{
		SetBindPose(anEffect);
	}
	context.SetPrimitiveTopology(surface->GetPrimitiveTopology());
	for (int instance = 0; instance < aBatch.GetCount(); ++instance)
	{
		anEffect.SetWorldMatrix(aBatch.GetWorld(instance));
		anEffect.SetPrevWorldMatrix(aBatch.GetPreviousWorld(instance));
		if (aPerInstance)
		{
			aPerInstance(instance);
		}
		for (int pass = 0; pass < aTechnique->GetPassCount(); ++pass)
		{
			if (aTechnique->GetPassByIndex(pass)->Apply(context))
			{
				context.DrawIndexed(static_cast<uint32_t>(surface->GetIndexCount()),
				                    static_cast<uint32_t>(surface->GetStartIndex()), 0);
			}
		}
	}
}
} // namespace Zeph
