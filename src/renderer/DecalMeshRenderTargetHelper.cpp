#include "renderer/DecalMeshRenderTargetHelper.h"

#include <cmath>

#include "engine/Effect.h"
#include "engine/EffectContainer.h"
#include "engine/Engine.h"
#include "engine/ShaderFiles.h"
#include "engine/Texture.h"
#include "model/Model.h"
#include "model/ModelFactory.h"
#include "model/ModelNode.h"
#include "platform/fx/Pass.h"
#include "platform/fx/Technique.h"
#include "platform/gpu/Context.h"
#include "renderer/DeferredRenderTargetHelper.h"
#include "renderer/RenderTargetCollector.h"
#include "renderer/post/FullScreenHelper.h"

namespace Zeph
{
namespace
{
constexpr const char* ourBoxModel = "data/models/decal_box.dae";


Effect* DecalEffect()
{
	return Engine::GetInstance()->GetEffectContainer().GetEffect(ShaderFiles[EFFECT_DECAL]);
}
} // namespace

DecalMeshRenderTargetHelper::DecalMeshRenderTargetHelper() = default;
DecalMeshRenderTargetHelper::~DecalMeshRenderTargetHelper() = default;

bool DecalMeshRenderTargetHelper::Init(int aWidth, int aHeight, FullScreenHelper* aFullScreenHelper,
                                       DeferredRenderTargetHelper* aGBuffer)
{
	Engine* engine = Engine::GetInstance();
	if (engine == nullptr)
	{
		return false;
	}
	myFullScreenHelper = aFullScreenHelper;
	myGBuffer = aGBuffer;
	myNormalCopy = std::make_unique<Texture>(aWidth, aHeight, Dds::Format::R8G8B8A8_UNORM);
	myBoxModel = LightVolumes::Load(ourBoxModel);
	return myNormalCopy->GetRenderTargetView() != nullptr;
}

bool DecalMeshRenderTargetHelper::Resize(int aWidth, int aHeight)
{
	auto copy = std::make_unique<Texture>(aWidth, aHeight, Dds::Format::R8G8B8A8_UNORM);
	if (copy->GetRenderTargetView() == nullptr)
	{
		return false;
	}
	myNormalCopy = std::move(copy);
	return true;
}

void DecalMeshRenderTargetHelper::Destroy()
{
	myNormalCopy.reset();
	myBoxModel = VolumeModel();
	myFullScreenHelper = nullptr;
	myGBuffer = nullptr;
}

Matrix44<float> DecalMeshRenderTargetHelper::BuildWorld(const DecalData& aDecal)
{
	const Vector3<float>& norm = aDecal.myNorm;
	const Vector3<float> up = std::abs(norm.y) == 1.0f ? Vector3<float>(0.0f, 0.0f, 1.0f)
	                                                   : Vector3<float>(0.0f, 1.0f, 0.0f);
	const Vector3<float> right = up.Cross(norm);
	const Vector3<float> up2 = norm.Cross(right);
	Matrix44<float> rotation;
	float* m = rotation.myMatrix;
	m[0] = right.x;
	m[1] = right.y;
	m[2] = right.z;
	m[4] = up2.x;
	m[5] = up2.y;
	m[6] = up2.z;
	m[8] = norm.x;
	m[9] = norm.y;
	m[10] = norm.z;
	Matrix44<float> scale;
	scale.myMatrix[0] = aDecal.mySize;
	scale.myMatrix[5] = aDecal.mySize;
	scale.myMatrix[10] = aDecal.myDepth;
	Matrix44<float> world = scale * rotation;
	world.SetPosition(aDecal.myPosition);
	return world;
}

void DecalMeshRenderTargetHelper::Begin(RenderTargetCollector& aCollector)
{
	Engine* engine = Engine::GetInstance();
	Effect* effect = DecalEffect();
	if (effect == nullptr || myGBuffer == nullptr || myFullScreenHelper == nullptr)
	{
		return;
	}
	Fx::Effect* fx = effect->GetEffect();
	fx->GetVariableByName("InvView")->SetMatrix(aCollector.GetCameraWorld().myMatrix);
	Texture* normal = myGBuffer->GetTarget(DeferredRenderTargetHelper::NORMAL);
	myFullScreenHelper->Process("Render", normal, myNormalCopy.get());
	effect->SetShaderResource("DepthTexture",
	                          myGBuffer->GetTarget(DeferredRenderTargetHelper::LINEAR_DEPTH)->GetShaderResourceView());
	effect->SetShaderResource("NormalTexture", myNormalCopy->GetShaderResourceView());
	Gpu::RenderTargetView* const targets[] = {
	    myGBuffer->GetTarget(DeferredRenderTargetHelper::ALBEDO)->GetRenderTargetView(),
	    normal->GetRenderTargetView(),
	    myGBuffer->GetTarget(DeferredRenderTargetHelper::MATERIAL)->GetRenderTargetView(),
	    myGBuffer->GetTarget(DeferredRenderTargetHelper::REFLECTION)->GetRenderTargetView()};
	engine->GetContext().SetViewport(Gpu::Viewport{0.0f, 0.0f, static_cast<float>(myGBuffer->GetWidth()),
	                                               static_cast<float>(myGBuffer->GetHeight()), 0.0f, 1.0f});
	engine->GetContext().SetRenderTargets(targets, myDepth);
}

void DecalMeshRenderTargetHelper::DrawDecals(const GrowingArray<DecalData>& someDecals, const char* aTechnique)
{
	Effect* effect = DecalEffect();
	if (effect == nullptr || myBoxModel.myModel == nullptr || someDecals.Count() == 0)
	{
		return;
	}
	Gpu::Context& context = Engine::GetInstance()->GetContext();
	Fx::Effect* fx = effect->GetEffect();
	Fx::Technique* technique = fx->GetTechniqueByName(aTechnique);
	if (!technique->IsValid() || !myBoxModel.myModel->SetupBuffers(context))
	{
		return;
	}
	Fx::Variable* inverseWorld = fx->GetVariableByName("InvWorld");
	Fx::Variable* decalNormal = fx->GetVariableByName("DecalNormal");
	const Surface& surface = myBoxModel.myModel->GetSurfaces()[0];
	context.SetPrimitiveTopology(surface.GetPrimitiveTopology());
	for (const DecalData& decal : someDecals)
	{
		const Matrix44<float> world = BuildWorld(decal);
		const Matrix44<float> inverse = world.Inverse();
		// The box file's own transformation goes under the decal's; the projection
		// (InvWorld) maps the world into the decal's box as the decal defines it.
		effect->SetWorldMatrix(myBoxModel.myLocal * world);
		inverseWorld->SetMatrix(inverse.myMatrix);
		const float normal[4] = {decal.myNorm.x, decal.myNorm.y, decal.myNorm.z, 0.0f};
		decalNormal->SetFloatVector(normal);
		effect->SetShaderResource("DecalTexture",
		                          decal.myTexture != nullptr ? decal.myTexture->GetShaderResourceView() : nullptr);
		effect->SetShaderResource("DecalNormalTexture", decal.myNormalTexture != nullptr
		                                                    ? decal.myNormalTexture->GetShaderResourceView()
		                                                    : nullptr);
		for (int pass = 0; pass < technique->GetPassCount(); ++pass)
		{
			if (technique->GetPassByIndex(pass)->Apply(context))
			{
				context.DrawIndexed(static_cast<uint32_t>(surface.GetIndexCount()),
				                    static_cast<uint32_t>(surface.GetStartIndex()), 0);
			}
		}
	}
}

void DecalMeshRenderTargetHelper::End(RenderTargetCollector& aCollector)
{
	Effect* effect = DecalEffect();
	if (effect == nullptr)
	{
		return;
	}
	DrawDecals(aCollector.GetDecals(), "RenderDynamic");
	DrawDecals(aCollector.GetMeshDecals(), "RenderMesh");
	for (const char* name : {"DecalTexture", "DecalNormalTexture", "DepthTexture", "NormalTexture"})
	{
		effect->SetShaderResource(name, nullptr);
	}
	Fx::Technique* technique = effect->GetEffect()->GetTechniqueByName("RenderDynamic");
	Gpu::Context& context = Engine::GetInstance()->GetContext();
	if (technique->IsValid() && technique->GetPassCount() > 0)
	{
		technique->GetPassByIndex(0)->Apply(context);
	}
	context.SetRenderTargets({}, nullptr);
}
} // namespace Zeph
