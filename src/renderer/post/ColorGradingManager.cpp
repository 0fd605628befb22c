#include "renderer/post/ColorGradingManager.h"

#include "engine/Effect.h"
#include "engine/Engine.h"
#include "engine/EngineReport.h"
#include "platform/fx/Variable.h"
#include "platform/gpu/TextureLoader.h"
#include "renderer/post/FullScreenHelper.h"

namespace Zeph
{
ColorGradingManager::~ColorGradingManager()
{
	Destroy();
}

bool ColorGradingManager::Init(int aWidth, int aHeight, FullScreenHelper* aFullScreenHelper,
                               ComputeHelper* aComputeHelper)
{
	return Init(aWidth, aHeight, aFullScreenHelper, aComputeHelper, ourLookupFile);
}

bool ColorGradingManager::Init(int aWidth, int aHeight, FullScreenHelper* aFullScreenHelper,
                               ComputeHelper* aComputeHelper, const std::string& aLookupFile)
{
	const char* function = "Zeph::ColorGradingManager::Init";
	Destroy();
	if (!PostProcessManager::Init(aWidth, aHeight, aFullScreenHelper, aComputeHelper))
	{
		return false;
	}
	// The GPU loader makes a 3D texture of a volume file as it is; the engine's
	// texture class takes 2D files only.
	myLookup = Gpu::CreateTextureFromFile(Engine::GetInstance()->GetContext(), aLookupFile, nullptr);
	if (!myLookup)
	{
		ReportCritical(50, function, "FAILED TO CREATE COLOR GRADING TEXTURE");
		Destroy();
		return false;
	}
	if (myLookup->GetDesc().myKind == Gpu::TextureKind::Texture3D)
	{
		Gpu::ShaderResourceDesc viewDesc;
		viewDesc.myDimension = Gpu::ViewDimension::Texture3D;
		myLookupView = myLookup->CreateShaderResourceView(viewDesc);
	}
	if (myLookupView == nullptr)
	{
		ReportCritical(__LINE__, function, "Failed to create 3D SRV");
		Destroy();
		return false;
	}
	Effect* effect = aFullScreenHelper->GetEffect();
	Fx::Variable* lookup =
	    effect != nullptr ? effect->GetEffect()->GetVariableByName("ColorGradingTex") : nullptr;
	if (lookup == nullptr || !lookup->IsValid())
	{
		ReportCritical(__LINE__, function, "ColorGradingTex is invalid");
		Destroy();
		return false;
	}
	lookup->SetResource(myLookupView);
	return true;
}

void ColorGradingManager::Render(Gpu::RenderTargetView* aDestination, Texture* aSource)
{
	Render(aDestination, myWidth, myHeight, aSource);
}

void ColorGradingManager::Render(Gpu::RenderTargetView* aDestination, int aWidth, int aHeight, Texture* aSource)
{
	if (myFullScreenHelper != nullptr)
	{
		myFullScreenHelper->Process("ColorGrade", aSource, aDestination, aWidth, aHeight);
	}
}

void ColorGradingManager::Destroy()
{
	if (myLookup)
	{
		// The effect must not keep a view of a texture that is gone.
		Effect* effect = myFullScreenHelper != nullptr ? myFullScreenHelper->GetEffect() : nullptr;
		if (effect != nullptr)
		{
			Fx::Variable* lookup = effect->GetEffect()->GetVariableByName("ColorGradingTex");
			if (lookup->GetResource() == myLookupView)
			{
				lookup->SetResource(nullptr);
			}
		}
		myLookup->Destroy();
		myLookup.reset();
	}
	myLookupView = nullptr;
	PostProcessManager::Destroy();
}
} // namespace Zeph
