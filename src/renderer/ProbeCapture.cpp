// The probe capture both bakes share: one face of a probe cubemap drawn through the
// frame's G-buffer, light and ambient passes.
#include "renderer/Renderer.h"

#include "engine/CameraInstance.h"
#include "engine/Effect.h"
#include "engine/Engine.h"
#include "platform/fx/Variable.h"
#include "platform/gpu/Context.h"
#include "renderer/DynamicCubemap.h"

namespace Zeph
{
void Renderer::RenderProbeFace(DynamicCubemap& aCube, int aFace, const Vector3<float>& aPosition,
                               DeferredRenderTargetHelper& aGBuffer, bool aClearGBufferFlag)
{
	Engine* engine = Engine::GetInstance();
	Gpu::Context& context = engine->GetContext();
	Gpu::RenderTargetView* face = aCube.GetFaceRenderTargetView(aFace);
	Gpu::DepthStencilView* depth = aCube.GetDepthStencilView();
	CameraInstance* camera = aCube.GetFaceCamera(aFace);
	if (face == nullptr || depth == nullptr || camera == nullptr)
	{
		return;
	}
	if (aClearGBufferFlag)
	{
		aGBuffer.Clear();
	}
	// The face and depth the light passes draw into are bound first, so the clears
	// below happen where the lights will draw.
	Gpu::RenderTargetView* const output[] = {face};
	context.SetRenderTargets(output, depth);
	const float black[4] = {0.0f, 0.0f, 0.0f, 0.0f};
	context.ClearRenderTargetView(*face, black);
	context.ClearDepthStencilView(*depth, true, true, 1.0f, 0);
	myCurrentOutput = face;
	myCurrentDepth = depth;
	aCube.SetPosition(aPosition);
	myCollector.SetCamera(*camera);
	// A face sees a sixth of the directions around it: what lies outside is skipped.
	const bool cullingFlag = myCollector.GetViewCullingFlag();
	myCollector.SetViewCullingFlag(myProbeCullingFlag);
	context.SetViewport(aCube.GetViewport());

	aGBuffer.SetDepth(depth);
	myCollector.RenderShadowCastingStatic(aGBuffer);
	context.SetViewport(aCube.GetViewport());
	RenderLights(aGBuffer);

	// The ambient pass at the face: the face camera's frustum, and no sun shadow (the
	// frame's shadow visibility belongs to the screen, not to this face).
	Effect* fullScreen = myFullScreenHelper.GetEffect();
	if (fullScreen != nullptr)
	{
		fullScreen->GetEffect()->GetVariableByName("invView")->SetMatrix(
		    myCollector.GetCameraWorld().myMatrix);
		fullScreen->SetShaderResource("ShadowMap", myMaterialDefaults.GetWhite());
	}
	UpdateScreenCamera(*camera);
	// White stays bound: the next frame's shadow resolve publishes its own visibility,
	// and without a shadow map the sun is never blocked.
	RenderAmbient(aGBuffer, aCube.GetSize(), aCube.GetSize());
	myCollector.SetViewCullingFlag(cullingFlag);
	context.SetRenderTargets({}, nullptr);
}
} // namespace Zeph
