#include "renderer/LightMeshRenderTargetHelper.h"

#include "renderer/DeferredRenderTargetHelper.h"
#include "renderer/LightVolumes.h"

namespace Zeph
{
void LightMeshRenderTargetHelper::Begin(RenderTargetCollector& aCollector)
{
	if (!myRenderFlag || myGBuffer == nullptr)
	{
		return;
	}
	LightVolumes::DrawPointLights(aCollector, myGBuffer->GetPointLightModel(), "RenderMesh");
	LightVolumes::DrawSpotLights(aCollector, myGBuffer->GetSpotLightModel(), "RenderMesh");
}
} // namespace Zeph
