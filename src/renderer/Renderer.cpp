#include "renderer/Renderer.h"

#include "renderer/AmbientVolumeFile.h"

#include <algorithm>
#include <functional>
#include <iterator>

#include "engine/CameraInstance.h"
#include "engine/Debug.h"
#include "engine/Effect.h"
#include "engine/EffectContainer.h"
#include "engine/Engine.h"
#include "engine/EngineReport.h"
#include "engine/Instance.h"
#include "engine/ShaderFiles.h"
#include "engine/Text.h"
#include "engine/Texture.h"
#include "platform/fx/Pass.h"
#include "platform/fx/Technique.h"
#include "platform/fx/Variable.h"
#include "platform/gpu/Context.h"
#include "platform/gpu/Texture.h"
#include "platform/gpu/TimestampQueries.h"
#include "renderer/LightVolumes.h"
#include "renderer/ProbeHelper.h"
#include "xml/XML.h"

namespace Zeph
{
namespace
{
constexpr float ourBlack[4] = {0.0f, 0.0f, 0.0f, 0.0f};
constexpr const char* ourSHVariables[ProbeHelper::ourBlockCount] = {
    "cArTexture", "cAgTexture", "cAbTexture", "cBrTexture", "cBgTexture", "cBbTexture", "cCTexture"};
constexpr int ourDebugTileSize = 256;

Gpu::Viewport MakeViewport(int aWidth, int aHeight)
{
	Gpu::Viewport viewport;
	viewport.myWidth = static_cast<float>(aWidth);
	viewport.myHeight = static_cast<float>(aHeight);
	return viewport;
}

Fx::Variable* FullScreenVariable(FullScreenHelper& aHelper, const char* aName)
{
	Effect* effect = aHelper.GetEffect();
	return effect != nullptr && effect->GetEffect() != nullptr ? effect->GetEffect()->GetVariableByName(aName)
	                                                           : nullptr;
}

// A depth buffer of the frame: R24G8_TYPELESS with a D24S8 depth view and an R24X8
// shader view; each step's failure is reported at its own line.
bool CreateDepthBuffer(int aWidth, int aHeight, const char* aFunction, const char* aText,
                       const int (&someLines)[3], std::unique_ptr<Gpu::Texture>& aTextureOut,
                       Gpu::DepthStencilView*& aDepthOut, Gpu::ShaderResourceView*& aShaderOut)
{
	Gpu::TextureDesc desc;
	desc.myWidth = aWidth;
	desc.myHeight = aHeight;
	desc.myFormat = Dds::Format::R24G8_TYPELESS;
	desc.myLabel = aText;
	aTextureOut = std::make_unique<Gpu::Texture>();
	if (!aTextureOut->Init(Engine::GetInstance()->GetContext(), desc))
	{
		aTextureOut.reset();
		ReportCritical(someLines[0], aFunction, "%s", aText);
		return false;
	}
	Gpu::DepthStencilDesc depthDesc;
	depthDesc.myFormat = Dds::Format::D24_UNORM_S8_UINT;
	aDepthOut = aTextureOut->CreateDepthStencilView(depthDesc);
	if (aDepthOut == nullptr)
	{
		ReportCritical(someLines[1], aFunction, "%s", aText);
		return false;
	}
	Gpu::ShaderResourceDesc shaderDesc;
	shaderDesc.myFormat = Dds::Format::R24_UNORM_X8_TYPELESS;
	shaderDesc.myDimension = Gpu::ViewDimension::Texture2D;
	shaderDesc.myMipCount = 1;
	aShaderOut = aTextureOut->CreateShaderResourceView(shaderDesc);
	if (aShaderOut == nullptr)
	{
		ReportCritical(someLines[2], aFunction, "%s", aText);
		return false;
	}
	return true;
}
} // namespace

Renderer::Renderer() : myLateItems(16, 16)
{
}

Renderer::~Renderer() = default;

bool Renderer::Init(int aWidth, int aHeight)
{
	Engine* engine = Engine::GetInstance();
	if (engine == nullptr)
	{
		return false;
	}
	Destroy();
	myWidth = aWidth;
	myHeight = aHeight;
	myOutputWidth = aWidth;
	myOutputHeight = aHeight;
	int& quality = engine->GetSetupInfo().myShadowQuality;
	if (quality < SetupInfo::SHADOWS_DISABLED || quality > SetupInfo::SHADOWS_HIGH)
	{
		quality = SetupInfo::SHADOWS_HIGH;
	}
	myShadowQuality = quality;
	myShadowMapSize = ourShadowMapSizes[myShadowQuality];

	for (std::unique_ptr<Texture>& target : myHDRTargets)
	{
		target = std::make_unique<Texture>(aWidth, aHeight, Dds::Format::R16G16B16A16_FLOAT);
	}
	myToneMappedTarget = std::make_unique<Texture>(aWidth, aHeight, Dds::Format::R8G8B8A8_UNORM_SRGB);
	if (!myComputeHelper.Init() || !myFullScreenHelper.Init())
	{
		return false;
	}
	myPingPong[0] = myHDRTargets[0].get();
	myPingPong[1] = myHDRTargets[1].get();
	myPingPongIndex = 0;
	PostProcessManager* const stages[] = {&myBloomManager, &myHDRManager,          &myMotionBlurManager,
	                                      &mySSAOManager,  &myColorGradingManager, &myOutlineManager,
	                                      &myFXAAManager};
	for (PostProcessManager* stage : stages)
	{
		stage->Init(aWidth, aHeight, &myFullScreenHelper, &myComputeHelper);
	}
	myMaterialDefaults.Init();
	// Until a shadow map is resolved (never, at quality 0) nothing blocks the sun.
	if (Effect* fullScreen = myFullScreenHelper.GetEffect())
	{
		fullScreen->SetShaderResource("ShadowMap", myMaterialDefaults.GetWhite());
	}
	myDeferredHelper.Init(aWidth, aHeight);
	myDecalHelper.Init(aWidth, aHeight, &myFullScreenHelper, &myDeferredHelper);
	myShadowHelper.Init(myShadowMapSize, aWidth, aHeight);
	myOutlineHelper.Init(aWidth, aHeight);
	myProbeHelper = std::make_unique<ProbeHelper>();
	myProbeHelper->Init();
	myLightMeshHelper.Init(&myDeferredHelper);
	SetupSpecialDepthBuffer();
	SetupShadowDepthBuffer();
	myScreenViewport = MakeViewport(aWidth, aHeight);
	myOutputViewport = myScreenViewport;
	myShadowViewport = MakeViewport(myShadowMapSize, myShadowMapSize);
	Effect* modelEffect = engine->GetEffectContainer().GetEffect(ShaderFiles[EFFECT_LIT_MODEL]);
	myTimeVariable = modelEffect != nullptr && modelEffect->GetEffect() != nullptr
	                     ? modelEffect->GetEffect()->GetVariableByName("Time")
	                     : nullptr;
	Effect* overlayEffect = engine->GetEffectContainer().GetEffect(ShaderFiles[EFFECT_OVERLAY]);
	myOverlayTint = overlayEffect != nullptr && overlayEffect->GetEffect() != nullptr
	                    ? overlayEffect->GetEffect()->GetVariableByName("Tint")
	                    : nullptr;
	RegisterDebugTextures();
	LoadSettings();
	return true;
}

bool Renderer::Resize(int aWidth, int aHeight)
{
	const char* function = "Zeph::Renderer::Resize";
	if (!myHDRTargets[0])
	{
		ReportError(__LINE__, function, "The renderer has no targets to resize");
		return false;
	}
	if (aWidth < 1 || aHeight < 1)
	{
		ReportError(__LINE__, function, "Cannot resize the frame to %dx%d", aWidth, aHeight);
		return false;
	}
	if (!ResizeTargets(aWidth, aHeight))
	{
		return false;
	}
	myOutputWidth = aWidth;
	myOutputHeight = aHeight;
	myOutputViewport = MakeViewport(aWidth, aHeight);
	return true;
}

void Renderer::SetInteractiveDivisor(int aDivisor)
{
	myInteractiveDivisor = std::clamp(aDivisor, 1, 4);
}

void Renderer::FollowTheCamera()
{
	const float* view = myCollector.GetView().myMatrix;
	const float* previous = myCollector.GetPreviousView().myMatrix;
	const bool movingFlag = myInteractiveDivisor > 1 && !std::equal(view, view + 16, previous);
	const int width = movingFlag ? std::max(1, myOutputWidth / myInteractiveDivisor) : myOutputWidth;
	const int height = movingFlag ? std::max(1, myOutputHeight / myInteractiveDivisor) : myOutputHeight;
	// A size that cannot be made is reported by ResizeTargets and the frame is drawn at the size
	// the targets have. Reduced targets that cannot be made turn the reduction off, so that the
	// failure is reported once rather than at every moving frame.
	if (!ResizeTargets(width, height) && movingFlag)
	{
		myInteractiveDivisor = 1;
	}
}

bool Renderer::ResizeTargets(int aWidth, int aHeight)
{
	const char* function = "Zeph::Renderer::Resize";
	if (aWidth == myWidth && aHeight == myHeight)
	{
		return true;
	}
	// Each step makes its owner's targets at the size and swaps them in only when all
	// are made, so a step that fails has changed nothing and the steps before it can be
	// taken back.
	const std::function<bool(int, int)> steps[] = {
	    [this](int aStepWidth, int aStepHeight) { return ResizeFrameTargets(aStepWidth, aStepHeight); },
	    [this](int aStepWidth, int aStepHeight) { return myDeferredHelper.Resize(aStepWidth, aStepHeight); },
	    [this](int aStepWidth, int aStepHeight) { return myDecalHelper.Resize(aStepWidth, aStepHeight); },
	    [this](int aStepWidth, int aStepHeight) { return myShadowHelper.Resize(aStepWidth, aStepHeight); },
	    [this](int aStepWidth, int aStepHeight) { return myOutlineHelper.Resize(aStepWidth, aStepHeight); },
	    [this](int aStepWidth, int aStepHeight) { return myBloomManager.Resize(aStepWidth, aStepHeight); },
	    [this](int aStepWidth, int aStepHeight) { return myHDRManager.Resize(aStepWidth, aStepHeight); },
	    [this](int aStepWidth, int aStepHeight) {
		    return myMotionBlurManager.Resize(aStepWidth, aStepHeight);
	    },
	    [this](int aStepWidth, int aStepHeight) { return mySSAOManager.Resize(aStepWidth, aStepHeight); },
	    [this](int aStepWidth, int aStepHeight) {
		    return myColorGradingManager.Resize(aStepWidth, aStepHeight);
	    },
	    [this](int aStepWidth, int aStepHeight) { return myOutlineManager.Resize(aStepWidth, aStepHeight); },
	    [this](int aStepWidth, int aStepHeight) { return myFXAAManager.Resize(aStepWidth, aStepHeight); },
	};
	const int stepCount = static_cast<int>(std::size(steps));
	int done = 0;
	while (done < stepCount && steps[done](aWidth, aHeight))
	{
		++done;
	}
	if (done < stepCount)
	{
		for (int step = done - 1; step >= 0; --step)
		{
			steps[step](myWidth, myHeight);
		}
		ReportError(__LINE__, function, "Cannot make the frame's targets at %dx%d; the frame stays at %dx%d",
		            aWidth, aHeight, myWidth, myHeight);
		return false;
	}
	myWidth = aWidth;
	myHeight = aHeight;
	myScreenViewport = MakeViewport(aWidth, aHeight);
	myLitImage = nullptr;
	// The debug tiles point at targets that were just replaced: the shown ones follow by name.
	RegisterDebugTextures();
	for (DebugTexture& shown : myShownDebugTextures)
	{
		for (const DebugTexture& registered : myDebugTextures)
		{
			if (registered.myName == shown.myName)
			{
				shown = registered;
			}
		}
	}
	return true;
}

bool Renderer::ResizeFrameTargets(int aWidth, int aHeight)
{
	std::unique_ptr<Texture> hdrTargets[2];
	for (std::unique_ptr<Texture>& target : hdrTargets)
	{
		target = std::make_unique<Texture>(aWidth, aHeight, Dds::Format::R16G16B16A16_FLOAT);
		if (target->GetRenderTargetView() == nullptr)
		{
			return false;
		}
	}
	auto toneMapped = std::make_unique<Texture>(aWidth, aHeight, Dds::Format::R8G8B8A8_UNORM_SRGB);
	std::unique_ptr<Gpu::Texture> depthTexture;
	Gpu::DepthStencilView* depthView = nullptr;
	Gpu::ShaderResourceView* depthShaderView = nullptr;
	if (toneMapped->GetRenderTargetView() == nullptr ||
	    !CreateDepthBuffer(aWidth, aHeight, "Zeph::Renderer::SetupSpecialDepthBuffer",
	                       "Failed at special depth", {533, 552, 570}, depthTexture, depthView,
	                       depthShaderView))
	{
		if (depthTexture)
		{
			depthTexture->Destroy();
		}
		return false;
	}
	for (int index = 0; index < 2; ++index)
	{
		myHDRTargets[index] = std::move(hdrTargets[index]);
		myPingPong[index] = myHDRTargets[index].get();
	}
	myToneMappedTarget = std::move(toneMapped);
	if (mySpecialDepthTexture)
	{
		mySpecialDepthTexture->Destroy();
	}
	mySpecialDepthTexture = std::move(depthTexture);
	mySpecialDepthView = depthView;
	mySpecialDepthShaderView = depthShaderView;
	return true;
}

void Renderer::Destroy()
{
	myCollector.Reset();
	myLateItems.RemoveAll();
	myDebugTextures.clear();
	myShownDebugTextures.clear();
	if (Engine::GetInstance() == nullptr)
	{
		return;
	}
	myBloomManager.Destroy();
	myHDRManager.Destroy();
	myMotionBlurManager.Destroy();
	mySSAOManager.Destroy();
	myColorGradingManager.Destroy();
	myOutlineManager.Destroy();
	myFXAAManager.Destroy();
	myFullScreenHelper.Destroy();
	myComputeHelper.Destroy();
	myDeferredHelper.Destroy();
	myDecalHelper.Destroy();
	myShadowHelper.Destroy();
	myOutlineHelper.Destroy();
	myMaterialDefaults.Destroy();
	myProbeHelper.reset();
	mySHLoadedFlag = false;
	for (std::unique_ptr<Gpu::Texture>* depth : {&myShadowDepthTexture, &mySpecialDepthTexture})
	{
		if (*depth)
		{
			(*depth)->Destroy();
			depth->reset();
		}
	}
	myShadowDepthView = nullptr;
	myShadowDepthShaderView = nullptr;
	mySpecialDepthView = nullptr;
	mySpecialDepthShaderView = nullptr;
	myHDRTargets[0].reset();
	myHDRTargets[1].reset();
	myToneMappedTarget.reset();
	myPingPong[0] = nullptr;
	myPingPong[1] = nullptr;
	myLitImage = nullptr;
	myTimestamps.reset();
	myTimeVariable = nullptr;
	myOverlayTint = nullptr;
}

bool Renderer::SetupShadowDepthBuffer()
{
	return CreateDepthBuffer(myShadowMapSize, myShadowMapSize, "Zeph::Renderer::SetupShadowDepthBuffer",
	                         "Failed at shadow depth", {464, 483, 501}, myShadowDepthTexture,
	                         myShadowDepthView, myShadowDepthShaderView);
}

bool Renderer::SetupSpecialDepthBuffer()
{
	return CreateDepthBuffer(myWidth, myHeight, "Zeph::Renderer::SetupSpecialDepthBuffer",
	                         "Failed at special depth", {533, 552, 570}, mySpecialDepthTexture,
	                         mySpecialDepthView, mySpecialDepthShaderView);
}

void Renderer::RegisterDebugTextures()
{
	myDebugTextures.clear();
	myDebugTextures.push_back({"motion-blur", myMotionBlurManager.GetBuffer(), nullptr, "Render"});
	myDebugTextures.push_back({"linear-depth",
	                           myDeferredHelper.GetTarget(DeferredRenderTargetHelper::LINEAR_DEPTH), nullptr,
	                           "RenderDepth"});
	myDebugTextures.push_back({"ssao", mySSAOManager.GetOcclusionBuffer(), nullptr, "RenderRToWhite"});
	myDebugTextures.push_back({"deferred-albedo",
	                           myDeferredHelper.GetTarget(DeferredRenderTargetHelper::ALBEDO), nullptr,
	                           "Render"});
	myDebugTextures.push_back({"deferred-normal",
	                           myDeferredHelper.GetTarget(DeferredRenderTargetHelper::NORMAL), nullptr,
	                           "Render"});
	myDebugTextures.push_back({"shadow-map", nullptr, myShadowDepthShaderView, "RenderRToWhite"});
}

void Renderer::ShowDebugTexture(const std::string& aName)
{
	const auto isNamed = [&aName](const DebugTexture& aTexture) { return aTexture.myName == aName; };
	if (std::find_if(myShownDebugTextures.begin(), myShownDebugTextures.end(), isNamed) !=
	    myShownDebugTextures.end())
	{
		return;
	}
	const auto found = std::find_if(myDebugTextures.begin(), myDebugTextures.end(), isNamed);
	if (found != myDebugTextures.end())
	{
		myShownDebugTextures.push_back(*found);
	}
}

void Renderer::HideDebugTexture(const std::string& aName)
{
	for (size_t index = 0; index < myShownDebugTextures.size(); ++index)
	{
		if (myShownDebugTextures[index].myName == aName)
		{
			myShownDebugTextures[index] = myShownDebugTextures.back();
			myShownDebugTextures.pop_back();
			return;
		}
	}
}

void Renderer::LoadSettings()
{
	XML ssao("data/Shaders/SSAO.xml");
	ssao.GoToElement("ssao", "", "");
	const float scale = ssao.GetAttribute<float>("scale");
	const float radius = ssao.GetAttribute<float>("sample-rad");
	const float bias = ssao.GetAttribute<float>("bias");
	const float intensity = ssao.GetAttribute<float>("intensity");
	SetSSAOVariables(scale, radius, bias, intensity);

	XML hdr("data/Shaders/HDRBloom.xml");
	hdr.GoToElement("hdr-bloom", "", "");
	const float exposure = hdr.GetAttribute<float>("auto-exposure");
	const float lumMin = hdr.GetAttribute<float>("lum-min");
	const float lumMax = hdr.GetAttribute<float>("lum-max");
	const float threshold = hdr.GetAttribute<float>("bloom-threshold");
	const float factor = hdr.GetAttribute<float>("bloom-factor");
	const float emissive = hdr.GetAttribute<float>("emissive-mult");
	SetHDRandBloomVariables(exposure, lumMin, lumMax, threshold, factor, emissive);
}

bool Renderer::SetColorGrading(const std::string& aLookupFile)
{
	myColorGradingManager.Destroy();
	return myColorGradingManager.Init(myWidth, myHeight, &myFullScreenHelper, &myComputeHelper, aLookupFile);
}

void Renderer::SetSSAOVariables(float aScale, float aSampleRadius, float aBias, float anIntensity)
{
	const char* const names[] = {"SSAO_scale", "SSAO_sample_rad", "SSAO_bias", "SSAO_Intensity"};
	const float values[] = {aScale, aSampleRadius, aBias, anIntensity};
	for (int index = 0; index < 4; ++index)
	{
		if (Fx::Variable* variable = FullScreenVariable(myFullScreenHelper, names[index]))
		{
			variable->SetFloat(values[index]);
		}
	}
}

void Renderer::SetHDRandBloomVariables(float anAutoExposure, float aLumMin, float aLumMax,
                                       float aBloomThreshold, float aBloomFactor, float anEmissiveMultiplier)
{
	const char* const names[] = {"AutoExposureAdjustment", "lumMin",      "lumMax",
	                             "BloomThreshold",         "BloomFactor", "EmissiveMultiplier"};
	const float values[] = {anAutoExposure,  aLumMin,      aLumMax,
	                        aBloomThreshold, aBloomFactor, anEmissiveMultiplier};
	for (int index = 0; index < 6; ++index)
	{
		if (Fx::Variable* variable = FullScreenVariable(myFullScreenHelper, names[index]))
		{
			variable->SetFloat(values[index]);
		}
	}
}

void Renderer::SetElapsedTime(float aDelta)
{
	myElapsedTime += aDelta;
	if (myTimeVariable != nullptr)
	{
		myTimeVariable->SetFloat(myElapsedTime);
	}
	myFullScreenHelper.SetElapsedTime(myElapsedTime);
}

void Renderer::UpdateScreenCamera(const CameraInstance& aCamera)
{
	if (Fx::Variable* farPlane = FullScreenVariable(myFullScreenHelper, "FarPlane"))
	{
		farPlane->SetFloat(aCamera.GetFarPlane());
	}
	// The camera keeps its corners as (w, -h, -far), (-w, -h, -far), (-w, h, -far),
	// (w, h, -far); the passes take view rays toward the far plane (z = +far) in the
	// order of the full-screen quad's corners: top-left, top-right, bottom-left,
	// bottom-right. Negating a corner gives the opposite ray.
	const Vector3<float>* corners = aCamera.GetFarCorners();
	const int order[4] = {0, 1, 3, 2};
	float rays[16];
	for (int index = 0; index < 4; ++index)
	{
		const Vector3<float>& corner = corners[order[index]];
		rays[index * 4 + 0] = -corner.x;
		rays[index * 4 + 1] = -corner.y;
		rays[index * 4 + 2] = -corner.z;
		rays[index * 4 + 3] = 0.0f;
	}
	if (Fx::Variable* variable = FullScreenVariable(myFullScreenHelper, "FarFrustrumCornersViewSpace"))
	{
		variable->SetFloatVectorArray(rays, 0, 4);
	}
}

void Renderer::SetSH(const std::string& aPath)
{
	// The volume shown so far goes first, whatever the file holds: a level whose file is
	// missing or damaged must not show the previous level's light.
	myProbeHelper.reset();
	myProbeHelper = std::make_unique<ProbeHelper>();
	myProbeHelper->Init();
	mySHLoadedFlag = false;
	PublishSHViews();
	SetVolumeBounds(Vector3<float>(0.0f, 0.0f, 0.0f), Vector3<float>(0.0f, 0.0f, 0.0f));
	AmbientVolume volume;
	std::string problem;
	const AmbientVolumeRead result = ReadAmbientVolume(aPath, volume, problem);
	if (result == AmbientVolumeRead::DAMAGED)
	{
		ReportError(__LINE__, "Zeph::Renderer::SetSH", "Damaged ambient light, not loaded: %s",
		            problem.c_str());
		return;
	}
	if (result == AmbientVolumeRead::CANNOT_OPEN)
	{
		// Unbaked level: no volume, so the ambient pass adds nothing.
		return;
	}
	SetVolumeBounds(volume.myWorldMin, volume.myWorldSize);
	if (UploadSHToGPU(false, volume.myBlocks, volume.myCounts[0], volume.myCounts[1], volume.myCounts[2]))
	{
		mySHLoadedFlag = true;
	}
}

bool Renderer::UploadSHToGPU(bool anUpdateFlag, const std::vector<uint32_t>* someBlocks, int anX, int aY,
                             int aZ)
{
	if (!myProbeHelper)
	{
		myProbeHelper = std::make_unique<ProbeHelper>();
		myProbeHelper->Init();
	}
	const bool uploaded = myProbeHelper->Upload(anUpdateFlag, someBlocks, anX, aY, aZ);
	PublishSHViews();
	return uploaded;
}

void Renderer::PublishSHViews()
{
	Effect* effect = myFullScreenHelper.GetEffect();
	if (effect == nullptr)
	{
		return;
	}
	for (int block = 0; block < ProbeHelper::ourBlockCount; ++block)
	{
		effect->SetShaderResource(ourSHVariables[block],
		                          myProbeHelper ? myProbeHelper->GetView(block) : nullptr);
	}
}

void Renderer::SetVolumeBounds(const Vector3<float>& aWorldMin, const Vector3<float>& aWorldSize)
{
	const float minimum[4] = {aWorldMin.x, aWorldMin.y, aWorldMin.z, 0.0f};
	const float size[4] = {aWorldSize.x, aWorldSize.y, aWorldSize.z, 0.0f};
	if (Fx::Variable* variable = FullScreenVariable(myFullScreenHelper, "WorldMin"))
	{
		variable->SetFloatVector(minimum);
	}
	if (Fx::Variable* variable = FullScreenVariable(myFullScreenHelper, "WorldSize"))
	{
		variable->SetFloatVector(size);
	}
}

void Renderer::RenderLateInstance(Instance* anInstance, const Vector4<float>& aTint)
{
	if (anInstance == nullptr)
	{
		return;
	}
	LateRenderItem item;
	item.myKind = LateRenderItem::INSTANCE;
	item.myInstance = anInstance;
	item.myTint = aTint;
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

void Renderer::BeginPass(const char* aName)
{
	if (myPassTimingFlag)
	{
		if (!myTimestamps)
		{
			myTimestamps = std::make_unique<Gpu::TimestampQueries>();
		}
		myTimestamps->Mark(aName);
	}
}

void Renderer::EndPasses()
{
	if (!myPassTimingFlag || !myTimestamps)
	{
		return;
	}
	myTimestamps->Mark("end");
	myPassTimes.clear();
	for (const Gpu::TimestampQueries::Interval& interval : myTimestamps->Resolve())
	{
		myPassTimes.push_back({interval.myName, interval.myMilliseconds});
	}
}

void Renderer::RenderShadowMap()
{
	Gpu::Context& context = Engine::GetInstance()->GetContext();
	context.SetViewport(myShadowViewport);
	if (myShadowDepthView == nullptr || !context.SetRenderTargets({}, myShadowDepthView))
	{
		return;
	}
	context.ClearDepthStencilView(*myShadowDepthView, true, true, 1.0f, 0);
	myShadowHelper.SetRecomputeFlag(true);
	myCollector.RenderShadowCastingStatic(myShadowHelper);
	myCollector.RenderShadowCastingSkinned(myShadowHelper);
}

void Renderer::ClearFrameTargets()
{
	Gpu::Context& context = Engine::GetInstance()->GetContext();
	context.SetViewport(myScreenViewport);
	for (Texture* target : {myHDRTargets[0].get(), myOutlineHelper.GetTarget(), myHDRTargets[1].get()})
	{
		if (target != nullptr && target->GetRenderTargetView() != nullptr)
		{
			context.ClearRenderTargetView(*target->GetRenderTargetView(), ourBlack);
		}
	}
	if (myCurrentDepth != nullptr)
	{
		context.ClearDepthStencilView(*myCurrentDepth, true, true, 1.0f, 0);
	}
	if (mySpecialDepthView != nullptr)
	{
		context.ClearDepthStencilView(*mySpecialDepthView, true, true, 1.0f, 0);
	}
}

void Renderer::RenderLights(DeferredRenderTargetHelper& aGBuffer)
{
	Engine* engine = Engine::GetInstance();
	Gpu::RenderTargetView* const targets[] = {myCurrentOutput};
	engine->GetContext().SetRenderTargets(targets, myCurrentDepth);
	const struct
	{
		const char* myName;
		DeferredRenderTargetHelper::Slot mySlot;
	} inputs[] = {{"AlbedoTexture", DeferredRenderTargetHelper::ALBEDO},
	              {"NormalTexture", DeferredRenderTargetHelper::NORMAL},
	              {"DepthTexture", DeferredRenderTargetHelper::LINEAR_DEPTH},
	              {"MaterialTexture", DeferredRenderTargetHelper::MATERIAL}};
	for (EffectType type : {EFFECT_DEFERRED_POINT_LIGHT, EFFECT_DEFERRED_SPOT_LIGHT})
	{
		if (Effect* effect = engine->GetEffectContainer().GetEffect(ShaderFiles[type]))
		{
			for (const auto& input : inputs)
			{
				effect->SetShaderResource(input.myName,
				                          aGBuffer.GetTarget(input.mySlot)->GetShaderResourceView());
			}
		}
	}
	LightVolumes::DrawPointLights(myCollector, aGBuffer.GetPointLightModel(), "Render");
	LightVolumes::DrawSpotLights(myCollector, aGBuffer.GetSpotLightModel(), "Render");
}

void Renderer::RenderAmbient(DeferredRenderTargetHelper& aGBuffer, int aWidth, int aHeight)
{
	Effect* effect = myFullScreenHelper.GetEffect();
	if (effect == nullptr)
	{
		return;
	}
	const struct
	{
		const char* myName;
		DeferredRenderTargetHelper::Slot mySlot;
	} inputs[] = {{"LinearDepthTexture", DeferredRenderTargetHelper::LINEAR_DEPTH},
	              {"AlbedoTexture", DeferredRenderTargetHelper::ALBEDO},
	              {"NormalTexture", DeferredRenderTargetHelper::NORMAL},
	              {"MaterialTexture", DeferredRenderTargetHelper::MATERIAL},
	              {"ReflectionTexture", DeferredRenderTargetHelper::REFLECTION}};
	for (const auto& input : inputs)
	{
		effect->SetShaderResource(input.myName, aGBuffer.GetTarget(input.mySlot)->GetShaderResourceView());
	}
	Texture* depth = aGBuffer.GetTarget(DeferredRenderTargetHelper::LINEAR_DEPTH);
	myFullScreenHelper.Process("RenderAmbient", depth->GetShaderResourceView(), aWidth, aHeight,
	                           myCurrentOutput, MakeViewport(aWidth, aHeight));
	for (const auto& input : inputs)
	{
		effect->SetShaderResource(input.myName, nullptr);
	}
	myFullScreenHelper.ApplyFirstPass("RenderAmbient");
}

void Renderer::RenderPostChain()
{
	Gpu::Context& context = Engine::GetInstance()->GetContext();
	mySSAOManager.Render(GetOtherHDR()->GetRenderTargetView(), GetCurrentHDR());
	myPingPongIndex ^= 1;
	myLitImage = GetCurrentHDR();
	myCurrentOutput = myBackBuffer;
	context.SetRenderTargets({}, nullptr);
	BeginPass("tone map");
	myHDRManager.Render(myToneMappedTarget->GetRenderTargetView(), GetCurrentHDR());
	myPingPongIndex ^= 1;
	BeginPass("bloom");
	myBloomManager.Render(GetCurrentHDR()->GetRenderTargetView(), myToneMappedTarget.get());
	BeginPass("tone map 2");
	myHDRManager.Render(myToneMappedTarget->GetRenderTargetView(), GetCurrentHDR());
	BeginPass("grading");
	myColorGradingManager.Render(myBackBuffer, myOutputWidth, myOutputHeight, myToneMappedTarget.get());
	// With nothing outlined (no selection) the mask is empty and the outline would blend a glow of
	// alpha 0 over the image, leaving every pixel as it is: its blur chain and full-screen pass
	// (about an eighth of the frame on a software rasterizer) are skipped.
	if (myCollector.GetBatches(RenderTargetCollector::OUTLINE_LIST).Count() > 0 ||
	    myCollector.GetBatches(RenderTargetCollector::OUTLINE_SKINNED_LIST).Count() > 0)
	{
		BeginPass("outline");
		myOutlineManager.Render(myBackBuffer, myOutputWidth, myOutputHeight, myOutlineHelper.GetTarget());
	}
}

void Renderer::RenderLateItems()
{
	Gpu::Context& context = Engine::GetInstance()->GetContext();
	Gpu::RenderTargetView* const targets[] = {myBackBuffer};
	for (const LateRenderItem& item : myLateItems)
	{
		switch (item.myKind)
		{
		case LateRenderItem::INSTANCE:
			// Over the finished image: no depth buffer, so the scene hides nothing of it.
			context.SetRenderTargets(targets, nullptr);
			if (myOverlayTint != nullptr)
			{
				myOverlayTint->SetFloatVector(&item.myTint.x);
			}
			item.myInstance->Render();
			myCollector.RenderShadowCastingStatic(myStandardHelper);
			myCollector.Reset();
			break;
		case LateRenderItem::TEXT:
			item.myText->Render(true);
			break;
		case LateRenderItem::SPRITE:
			break;
		}
	}
	myLateItems.RemoveAll();
}

void Renderer::RenderDebugTextures()
{
	const int screenHeight = Engine::GetInstance()->GetSetupInfo().myHeight;
	int x = 0;
	int y = 0;
	for (const DebugTexture& tile : myShownDebugTextures)
	{
		Gpu::ShaderResourceView* view =
		    tile.myTexture != nullptr ? tile.myTexture->GetShaderResourceView() : tile.myView;
		if (view == nullptr)
		{
			continue;
		}
		if (y > 0 && y + ourDebugTileSize > screenHeight)
		{
			y = 0;
			x += ourDebugTileSize;
		}
		Gpu::Viewport viewport = MakeViewport(ourDebugTileSize, ourDebugTileSize);
		viewport.myTopLeftX = static_cast<float>(x);
		viewport.myTopLeftY = static_cast<float>(y);
		myFullScreenHelper.Process(tile.myTechnique, view, ourDebugTileSize, ourDebugTileSize, myBackBuffer,
		                           viewport);
		y += ourDebugTileSize;
	}
}

void Renderer::Render(Gpu::RenderTargetView* aBackBuffer, Gpu::DepthStencilView* aDepth)
{
	Engine* engine = Engine::GetInstance();
	if (engine == nullptr || aBackBuffer == nullptr || !myHDRTargets[0] ||
	    myFullScreenHelper.GetEffect() == nullptr)
	{
		myCollector.Reset();
		myLateItems.RemoveAll();
		return;
	}
	Gpu::Context& context = engine->GetContext();
	FollowTheCamera();
	BeginPass("clear");
	myBackBuffer = aBackBuffer;
	myCurrentOutput = aBackBuffer;
	// A reduced frame does not fit the engine's depth buffer (the back buffer's size): the
	// special depth buffer, which follows the frame's size and is cleared with it, stands in.
	myCurrentDepth = IsFrameReduced() && mySpecialDepthView != nullptr ? mySpecialDepthView : aDepth;
	myPingPongIndex = 0;
	myDeferredHelper.Clear();
	if (myShadowQuality != 0)
	{
		BeginPass("shadow map");
		RenderShadowMap();
	}
	ClearFrameTargets();
	if (Fx::Variable* inverseView = FullScreenVariable(myFullScreenHelper, "invView"))
	{
		inverseView->SetMatrix(myCollector.GetCameraWorld().myMatrix);
	}
	myCurrentOutput = GetCurrentHDR()->GetRenderTargetView();

	BeginPass("G-buffer");
	myDeferredHelper.SetDepth(myCurrentDepth);
	myCollector.RenderUnshadowed(myDeferredHelper);
	myCollector.RenderShadowCastingStatic(myDeferredHelper);
	BeginPass("decals");
	myDecalHelper.SetDepth(myCurrentDepth);
	myCollector.RenderShadowCastingStatic(myDecalHelper);
	BeginPass("G-buffer skinned");
	myCollector.RenderShadowCastingSkinned(myDeferredHelper);
	BeginPass("outline mask");
	myCollector.RenderOutline(myOutlineHelper);
	context.SetViewport(myScreenViewport);
	if (myShadowQuality != 0)
	{
		BeginPass("shadow resolve");
		myShadowHelper.Resolve(
		    myFullScreenHelper, myShadowDepthShaderView,
		    myDeferredHelper.GetTarget(DeferredRenderTargetHelper::LINEAR_DEPTH)->GetShaderResourceView(),
		    myDeferredHelper.GetTarget(DeferredRenderTargetHelper::NORMAL)->GetShaderResourceView());
		context.SetViewport(myScreenViewport);
	}
	BeginPass("lights");
	RenderLights(myDeferredHelper);
	BeginPass("SSAO");
	mySSAOManager.ComputeOcclusion(
	    myDeferredHelper.GetTarget(DeferredRenderTargetHelper::NORMAL)->GetShaderResourceView(),
	    myDeferredHelper.GetTarget(DeferredRenderTargetHelper::LINEAR_DEPTH)->GetShaderResourceView());
	BeginPass("ambient");
	RenderAmbient(myDeferredHelper, myWidth, myHeight);

	BeginPass("forward");
	context.SetViewport(myScreenViewport);
	Gpu::RenderTargetView* const output[] = {myCurrentOutput};
	context.SetRenderTargets(output, myCurrentDepth);
	myLightMeshHelper.Begin(myCollector);
	myLightMeshHelper.End(myCollector);
	myCollector.RenderForward(myStandardHelper);

	BeginPass("SSAO apply");
	RenderPostChain();

	BeginPass("late");
	context.SetViewport(myOutputViewport);
	Gpu::RenderTargetView* const backBuffer[] = {myBackBuffer};
	context.SetRenderTargets(backBuffer, nullptr);
	// Effects that leave a state group unnamed keep the current one: the late items
	// start from the defaults, not from whatever the last post stage blended with.
	context.SetBlendState(Gpu::BlendState());
	context.SetDepthStencilState(Gpu::DepthStencilState());
	context.SetRasterizerState(Gpu::RasterizerState());
	if (myCollector.GetAuxiliaryList().Count() > 0)
	{
		myStandardHelper.RenderAuxiliaryList(myCollector);
	}
	myCollector.Reset();
	RenderLateItems();
	RenderDebugTextures();
	context.SetViewport(myOutputViewport);
	EndPasses();
	engine->Present();
}
} // namespace Zeph
