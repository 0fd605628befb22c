#include "renderer/post/FullScreenHelper.h"

#include "engine/Effect.h"
#include "engine/Engine.h"
#include "engine/EngineReport.h"
#include "engine/ShaderFiles.h"
#include "engine/Texture.h"
#include "platform/fx/Technique.h"
#include "platform/fx/Variable.h"
#include "platform/gpu/Context.h"

namespace Zeph
{
namespace
{
struct QuadVertex
{
	float myPosition[3];
	float myTexCoord[2];
};

// Top-left, top-right, bottom-left, bottom-right: one strip, texture row 0 at the top.
constexpr QuadVertex ourQuad[4] = {
    {{-1.0f, 1.0f, 0.0f}, {0.0f, 0.0f}},
    {{1.0f, 1.0f, 0.0f}, {1.0f, 0.0f}},
    {{-1.0f, -1.0f, 0.0f}, {0.0f, 1.0f}},
    {{1.0f, -1.0f, 0.0f}, {1.0f, 1.0f}},
};

float Inverse(float aValue)
{
	return aValue > 0.0f ? 1.0f / aValue : 0.0f;
}
} // namespace

FullScreenHelper::~FullScreenHelper()
{
	Destroy();
}

bool FullScreenHelper::Init()
{
	const char* function = "Zeph::FullScreenHelper::Init";
	Destroy();
	Engine* engine = Engine::GetInstance();
	Effect* effect =
	    engine != nullptr ? engine->GetEffectContainer().GetEffect(ShaderFiles[EFFECT_FULL_SCREEN]) : nullptr;
	if (effect == nullptr)
	{
		ReportCritical(__LINE__, function, "Cannot load the full-screen effect %s",
		               ShaderFiles[EFFECT_FULL_SCREEN]);
		return false;
	}
	Fx::Effect& fx = *effect->GetEffect();
	struct Entry
	{
		const char* myName;
		Fx::Variable** myVariable;
		const char* myMissingText;
	};
	const Entry entries[] = {
	    {"ElapsedTime", &myElapsedTimeVariable, "myElapsedTimeVariable is invalid"},
	    {"DiffuseTexture", &myDiffuseSRV, "DiffuseTexture is invalid"},
	    {"SecondaryDiffuseTexture", &mySecondarySRV, "mySecondarySRV is invalid"},
	    {"TertiaryDiffuseTexture", &myTertiarySRV, "myTertiarySRV is invalid"},
	    {"QuartaryDiffuseTexture", &myQuartarySRV, "myQuartarySRV is invalid"},
	    {"QuintiaryDiffuseTexture", &myQuintiarySRV, "myQuintiarySRV is invalid"},
	    {"VelocityTexture", &myVelocitySRV, "myVelocitySRV is invalid"},
	    {"InvTargetSize", &myInvTargetSizeVariable, "myInvTargetSizeVariable is invalid"},
	    {"InvSourceSize", &myInvSourceSizeVariable, "myInvSourceSizeVariable is invalid"},
	    {"ScreenSize", &myScreenSizeVariable, "myScreenSizeVariable is invalid"},
	    {"SourceTexture", &mySourceSRV, "mySourceSRV is invalid (the effect declares no SourceTexture)"},
	};
	bool resultFlag = true;
	for (const Entry& entry : entries)
	{
		*entry.myVariable = fx.GetVariableByName(entry.myName);
		if (!(*entry.myVariable)->IsValid())
		{
			ReportCritical(__LINE__, function, "%s", entry.myMissingText);
			resultFlag = false;
		}
	}
	myEffect = effect;
	if (!resultFlag || !CreateQuad())
	{
		Destroy();
		return false;
	}
	return true;
}

bool FullScreenHelper::CreateQuad()
{
	const char* function = "Zeph::FullScreenHelper::Init";
	// Every technique draws with the same vertex stage inputs, so the "Render" pass's
	// signature serves them all.
	Fx::Technique* technique = FindTechnique("Render", function);
	Fx::Pass* pass = technique != nullptr ? technique->GetPassByIndex(0) : nullptr;
	if (pass == nullptr)
	{
		ReportCritical(__LINE__, function,
		               "The full-screen effect has no Render pass to take the quad layout from");
		return false;
	}
	Gpu::BufferDesc desc;
	desc.myKind = Gpu::BufferKind::Vertex;
	desc.mySize = sizeof(ourQuad);
	desc.myLabel = "full-screen quad";
	if (!myVertexBuffer.Init(Engine::GetInstance()->GetContext(), desc, ourQuad))
	{
		ReportCritical(__LINE__, function, "Failed to create the full-screen quad");
		return false;
	}
	const Gpu::InputElement elements[] = {
	    {"POSITION", 0, Dds::Format::R32G32B32_FLOAT, 0, 0},
	    {"TEXCOORD", 0, Dds::Format::R32G32_FLOAT, 0, Gpu::InputElement::ourAppendAligned},
	};
	if (!myInputLayout.Init(Engine::GetInstance()->GetContext(), elements, pass->GetVertexInputs(),
	                        "full-screen quad layout"))
	{
		ReportCritical(__LINE__, function, "Failed to create the full-screen quad's input layout");
		myVertexBuffer.Destroy();
		return false;
	}
	myQuadFlag = true;
	return true;
}

void FullScreenHelper::Destroy()
{
	if (myQuadFlag)
	{
		myInputLayout.Destroy();
		myVertexBuffer.Destroy();
		myQuadFlag = false;
	}
	myEffect = nullptr;
	myElapsedTimeVariable = nullptr;
	mySourceSRV = nullptr;
	myDiffuseSRV = nullptr;
	mySecondarySRV = nullptr;
	myTertiarySRV = nullptr;
	myQuartarySRV = nullptr;
	myQuintiarySRV = nullptr;
	myVelocitySRV = nullptr;
	myInvTargetSizeVariable = nullptr;
	myInvSourceSizeVariable = nullptr;
	myScreenSizeVariable = nullptr;
}

Effect* FullScreenHelper::GetEffect()
{
	return myEffect;
}

void FullScreenHelper::SetElapsedTime(float aTime)
{
	if (myElapsedTimeVariable != nullptr)
	{
		myElapsedTimeVariable->SetFloat(aTime);
	}
}

void FullScreenHelper::SetDiffuseTextures(Gpu::ShaderResourceView* aDiffuse,
                                          Gpu::ShaderResourceView* aSecondary,
                                          Gpu::ShaderResourceView* aTertiary)
{
	if (myEffect != nullptr)
	{
		myDiffuseSRV->SetResource(aDiffuse);
		mySecondarySRV->SetResource(aSecondary);
		myTertiarySRV->SetResource(aTertiary);
	}
}

void FullScreenHelper::SetVelocityTexture(Gpu::ShaderResourceView* aVelocity)
{
	if (myEffect != nullptr)
	{
		myVelocitySRV->SetResource(aVelocity);
	}
}

Fx::Technique* FullScreenHelper::FindTechnique(const char* aTechnique, const char* aFunctionName)
{
	Fx::Technique* technique = myEffect->GetEffect()->GetTechniqueByName(aTechnique);
	if (!technique->IsValid() || technique->GetPassCount() == 0)
	{
		ReportCritical(__LINE__, aFunctionName, "The full-screen effect has no technique %s", aTechnique);
		return nullptr;
	}
	return technique;
}

void FullScreenHelper::Process(const char* aTechnique, Gpu::ShaderResourceView* aSource, int aSourceWidth,
                               int aSourceHeight, Gpu::RenderTargetView* aTarget,
                               const Gpu::Viewport& aViewport)
{
	if (myEffect == nullptr || aTechnique == nullptr)
	{
		return;
	}
	Fx::Technique* technique = FindTechnique(aTechnique, "Zeph::FullScreenHelper::Process");
	if (technique == nullptr)
	{
		return;
	}
	Gpu::Context& context = Engine::GetInstance()->GetContext();
	context.SetViewport(aViewport);
	Gpu::RenderTargetView* const targets[] = {aTarget};
	context.SetRenderTargets(targets, nullptr);

	const float invTarget[4] = {Inverse(aViewport.myWidth), Inverse(aViewport.myHeight), 0.0f, 0.0f};
	const float invSource[4] = {Inverse(static_cast<float>(aSourceWidth)),
	                            Inverse(static_cast<float>(aSourceHeight)), 0.0f, 0.0f};
	const float screen[4] = {aViewport.myWidth, aViewport.myHeight, 0.0f, 0.0f};
	myInvTargetSizeVariable->SetFloatVector(invTarget);
	myInvSourceSizeVariable->SetFloatVector(invSource);
	myScreenSizeVariable->SetFloatVector(screen);
	mySourceSRV->SetResource(aSource);

	context.SetInputLayout(&myInputLayout);
	context.SetVertexBuffer(0, &myVertexBuffer, sizeof(QuadVertex), 0);
	context.SetPrimitiveTopology(Gpu::PrimitiveTopology::TriangleStrip);
	for (int index = 0; index < technique->GetPassCount(); ++index)
	{
		technique->GetPassByIndex(index)->Apply(context);
		context.Draw(4, 0);
	}

	// The inputs leave their texture units before anything can draw into them.
	UnbindTextures();
	technique->GetPassByIndex(0)->Apply(context);
	context.SetInputLayout(nullptr);
	context.SetVertexBuffer(0, nullptr, 0, 0);
}

void FullScreenHelper::Process(const char* aTechnique, Texture* aSource, Texture* aTarget)
{
	if (aTarget == nullptr)
	{
		return;
	}
	const Dds::ImageInfo& target = aTarget->GetImageInfo();
	Process(aTechnique, aSource, aTarget->GetRenderTargetView(), static_cast<int>(target.myWidth),
	        static_cast<int>(target.myHeight));
}

void FullScreenHelper::Process(const char* aTechnique, Texture* aSource, Gpu::RenderTargetView* aTarget,
                               int aWidth, int aHeight)
{
	Gpu::Viewport viewport;
	viewport.myWidth = static_cast<float>(aWidth);
	viewport.myHeight = static_cast<float>(aHeight);
	int sourceWidth = aWidth;
	int sourceHeight = aHeight;
	Gpu::ShaderResourceView* source = nullptr;
	if (aSource != nullptr)
	{
		source = aSource->GetShaderResourceView();
		sourceWidth = static_cast<int>(aSource->GetImageInfo().myWidth);
		sourceHeight = static_cast<int>(aSource->GetImageInfo().myHeight);
	}
	Process(aTechnique, source, sourceWidth, sourceHeight, aTarget, viewport);
}

void FullScreenHelper::ApplyFirstPass(const char* aTechnique)
{
	if (myEffect == nullptr)
	{
		return;
	}
	Fx::Technique* technique = FindTechnique(aTechnique, "Zeph::FullScreenHelper::ApplyFirstPass");
	if (technique != nullptr)
	{
		technique->GetPassByIndex(0)->Apply(Engine::GetInstance()->GetContext());
	}
}

void FullScreenHelper::UnbindTextures()
{
	mySourceSRV->SetResource(nullptr);
	myDiffuseSRV->SetResource(nullptr);
	mySecondarySRV->SetResource(nullptr);
	myTertiarySRV->SetResource(nullptr);
	myQuartarySRV->SetResource(nullptr);
	myQuintiarySRV->SetResource(nullptr);
}
} // namespace Zeph
