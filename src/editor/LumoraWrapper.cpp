#include "editor/LumoraWrapper.h"

#include <bitset>
#include <chrono>
#include <locale>
#include <sstream>
#include <thread>

#include "editor/StringConversion.h"
#include "engine/Camera.h"
#include "engine/CameraInstance.h"
#include "engine/Debug.h"
#include "engine/Engine.h"
#include "engine/FontContainer.h"
#include "engine/Instance.h"
#include "engine/Room.h"
#include "engine/Text.h"
#include "engine/TextureContainer.h"
#include "model/ModelFactory.h"
#include "model/ModelNode.h"
#include "platform/gpu/Device.h"
#include "renderer/LightMeshRenderTargetHelper.h"
#include "renderer/Renderer.h"

namespace Lumora
{
LumoraWrapper* LumoraWrapper::ourInstance = nullptr;

namespace
{
constexpr auto ourPollInterval = std::chrono::milliseconds(1);
// Severe and critical errors end the process unless the front end chose otherwise.
constexpr unsigned long ourDefaultFatalLevels = 12;
std::bitset<4> ourFatalLevels(ourDefaultFatalLevels);

Zeph::Engine* EngineOrNull()
{
	return Zeph::Engine::GetInstance();
}
} // namespace

bool LumoraWrapper::Create(uint64_t aHwnd, int aWidth, int aHeight)
{
	if (!Debug::Create("DebugLogger.txt", ourFatalLevels))
	{
		return false;
	}
	ourInstance = new LumoraWrapper();
	// The engine reports a device it cannot make as a critical error, which this log
	// makes fatal. A machine without OpenGL 4.5 is an answer, not a crash: a headless
	// probe first, and a plain error entry and false when it fails.
	{
		Gpu::Device probe;
		if (!probe.Init(16, 16))
		{
			Debug::GetInstance()->ErrorMessage(__LINE__, "Lumora::LumoraWrapper::Create",
			                                   "No OpenGL 4.5 core context: %s",
			                                   probe.GetFailureText().c_str());
			return false;
		}
		probe.Destroy();
	}
	Gpu::WindowHandle window = static_cast<Gpu::WindowHandle>(aHwnd & 0xFFFFFFFFu);
	if (!Zeph::Engine::Create(window, aWidth, aHeight))
	{
		return false;
	}
	ourInstance->Init();
	// The creating thread lets the context go: the first frame step or claim takes it.
	Zeph::Engine::GetInstance()->ReleaseContext();
	return true;
}

void LumoraWrapper::SetFatalReportLevels(std::bitset<4> someLevels)
{
	ourFatalLevels = someLevels;
}

void LumoraWrapper::SetReportListener(
    std::function<void(int aLevel, const std::string& aFunction, const std::string& aText)> aListener)
{
	if (!aListener)
	{
		Debug::SetReportListener({});
		return;
	}
	Debug::SetReportListener([listener = std::move(aListener)](Debug::AssertLevels aLevel, int,
	                                                           const char* aFunction, const char* aText) {
		// Messages are written as log entries, many ending in a line break that a front end's
		// list does not want.
		std::string text = aText;
		while (!text.empty() && (text.back() == '\n' || text.back() == '\r' || text.back() == ' '))
		{
			text.pop_back();
		}
		listener(static_cast<int>(aLevel), aFunction, text);
	});
}

void LumoraWrapper::ShutDown()
{
	if (ourInstance == nullptr)
	{
		return;
	}
	// After a failed Create there is no scene, but the log, the instance and perhaps a
	// half-made engine are there: they go too, so that a later Create can succeed.
	if (Zeph::Engine* engine = EngineOrNull())
	{
		engine->MakeContextCurrent();
	}
	if (ourInstance->mySceneFlag)
	{
		ourInstance->DestroyScene();
	}
	Debug::Destroy();
	Zeph::Engine::ShutDown();
	// The instance goes with the scene, so a stale GetInstance cannot reach freed members.
	delete ourInstance;
	ourInstance = nullptr;
}

void LumoraWrapper::Init()
{
	myNodeIDCounter = 1;
	ResetIndices();
	myRenderIsDoneFlag = true;
	myPausedFlag = false;
	myUpdateActive = false;
	myRenderRoomsFlag = false;
	myRenderMeshesFlag = true;
	myLightIconsFlag = false;
	myLightVolumes = LightVolumes::NONE;
	myNodeHalfDimensions = 0.25f;
	myMode = LIGHT_MODE;

	Zeph::Engine* engine = EngineOrNull();
	myWidth = engine->GetSetupInfo().myWidth;
	myHeight = engine->GetSetupInfo().myHeight;
	myInfoText = std::make_unique<Zeph::Text>(engine->GetFontContainer().GetFont("Arial"));
	myInfoText->SetPosition(Vector2<float>(5.0f, 5.0f));
	myInfoText->SetSize(12.0f);
	myMarkedGizmo.reset(NewGizmo("marked-gizmo", Vector4<float>(0.0f, 1.0f, 0.0f, 0.0f)));
	// Without its models (reported) the editor goes on without light icons and wires.
	myLightOverlays = std::make_unique<LightOverlays>();
	myLightOverlays->Init();
	InitScene();
}

void LumoraWrapper::InitScene()
{
	Zeph::Engine* engine = EngineOrNull();
	const Zeph::SetupInfo& setup = engine->GetSetupInfo();
	myCamera = std::make_unique<Zeph::Camera>(static_cast<float>(setup.myWidth) /
	                                          static_cast<float>(std::max(setup.myHeight, 1)));
	myCameraInstance = std::make_unique<Zeph::CameraInstance>(myCamera.get());
	myCameraInstance->SetPosition(Vector3<float>(0.0f, 10.0f, 0.0f));
	engine->GetRenderer().UpdateScreenCamera(*myCameraInstance);

	myEntityBank.clear();
	myEntityShadowCasterBank.clear();
	ParseEntities();
	myDecalTypes.clear();
	ParseDecalTypes("data/XML/DecalTypes.xml");

	myEntities.ReInit(ourArraySize, ourArraySize, true);
	myEnvironmentPointLights.ReInit(ourArraySize, ourArraySize, true);
	myEnvironmentSpotLights.ReInit(ourArraySize, ourArraySize, true);
	myLightGizmos.ReInit(ourArraySize, ourArraySize, true);
	myRooms.ReInit(ourArraySize, ourArraySize, true);
	myEdges.ReInit(ourArraySize, ourArraySize, true);
	myNodes.ReInit(ourArraySize, ourArraySize, true);
	myDecals.ReInit(ourArraySize, ourArraySize, true);

	Zeph::TextureContainer& textures = engine->GetTextureContainer();
	myTexture = textures.GetTexture("data/Particles/bricksAlbedo.dds", true);
	myNormTexture = textures.GetTexture("data/Particles/bricksNormal.dds", false);

	Zeph::ModelNode* box = engine->GetModelFactory().CreateAABB("decal-box", Vector3<float>(1.0f, 1.0f, 1.0f),
	                                                            Vector4<float>(1.0f, 1.0f, 1.0f, 1.0f),
	                                                            Gpu::PrimitiveTopology::TriangleList);
	if (box != nullptr)
	{
		box->SetTechniqueByName("RenderWireFrame");
		myDecalBox = std::make_unique<Zeph::Instance>(box);
	}
	mySceneFlag = true;
}

void LumoraWrapper::DestroyScene()
{
	for (int index = 0; index < myEdges.Count(); ++index)
	{
		myEdges[index].DestroyDebugLine();
	}
	myEdges.RemoveAll();
	for (int index = 0; index < myNodes.Count(); ++index)
	{
		myNodes[index].DestroyDebugInstance();
	}
	myNodes.RemoveAll();
	for (int index = 0; index < myRooms.Count(); ++index)
	{
		myRooms[index]->DestroyDebugInstance();
	}
	myRooms.DeleteAll();
	myLightGizmos.DeleteAll();
	myMarkedGizmo.reset();
	myLightOverlays.reset();
	myEntityBank.clear();
	myEntityShadowCasterBank.clear();
	myCameraInstance.reset();
	myCamera.reset();
	myEntities.DeleteAll();
	myEnvironmentPointLights.RemoveAll();
	myEnvironmentSpotLights.RemoveAll();
	myDecals.RemoveAll();
	myDecalBox.reset();
	myInfoText.reset();
	mySceneFlag = false;
}

Zeph::Instance* LumoraWrapper::NewGizmo(const char* aModelName, const Vector4<float>& aColor) const
{
	const float half = myNodeHalfDimensions;
	Zeph::ModelNode* box = EngineOrNull()->GetModelFactory().CreateAABB(
	    aModelName, Vector3<float>(half, half, half), aColor, Gpu::PrimitiveTopology::TriangleList);
	return box != nullptr ? new Zeph::Instance(box) : nullptr;
}

// --- the handshake ---------------------------------------------------------------------

bool LumoraWrapper::TryClaimForUpdate()
{
	if (!myRenderIsDoneFlag.load() || myWaitingClaims.load() > 0)
	{
		return false;
	}
	bool expected = false;
	if (!myPausedFlag.compare_exchange_strong(expected, true))
	{
		return false;
	}
	EngineOrNull()->MakeContextCurrent();
	return true;
}

bool LumoraWrapper::TryClaimForRender()
{
	if (myWaitingClaims.load() > 0)
	{
		return false;
	}
	bool expected = false;
	if (!myPausedFlag.compare_exchange_strong(expected, true))
	{
		return false;
	}
	// Only a frame in progress clears the render-done flag, and it holds the busy flag
	// meanwhile; the test is kept for the rule's sake.
	if (!myRenderIsDoneFlag.load())
	{
		myPausedFlag = false;
		return false;
	}
	EngineOrNull()->MakeContextCurrent();
	return true;
}

void LumoraWrapper::WaitUntilFree() const
{
	myWaitingClaims.fetch_add(1);
	while (myPausedFlag.load())
	{
		std::this_thread::sleep_for(ourPollInterval);
	}
	myWaitingClaims.fetch_sub(1);
}

void LumoraWrapper::Claim()
{
	// Announced first: frame steps stand back while a claim waits, so the claim gets
	// the flag when the running step ends.
	myWaitingClaims.fetch_add(1);
	for (;;)
	{
		bool expected = false;
		if (myPausedFlag.compare_exchange_strong(expected, true))
		{
			break;
		}
		std::this_thread::sleep_for(ourPollInterval);
	}
	myWaitingClaims.fetch_sub(1);
	EngineOrNull()->MakeContextCurrent();
}

void LumoraWrapper::ClaimAfterTheFrame()
{
	// Announced first, as Claim is: a render loop that runs without pause starts no frame
	// step while this waits, so the wait ends with the step that runs. Polled unannounced,
	// the gaps between its frames are too short to be seen, and a resize waited for seconds.
	myWaitingClaims.fetch_add(1);
	while (!myRenderIsDoneFlag.load())
	{
		std::this_thread::sleep_for(ourPollInterval);
	}
	while (myUpdateActive.load())
	{
		std::this_thread::sleep_for(ourPollInterval);
	}
	// These operations also wait for the busy flag, so a load or a settings change
	// never overlaps an edit or a bake running on another thread.
	Claim();
	myWaitingClaims.fetch_sub(1);
}

void LumoraWrapper::Release()
{
	EngineOrNull()->ReleaseContext();
	myPausedFlag = false;
}

// --- the frame loop --------------------------------------------------------------------

void LumoraWrapper::Update(float someElapsedTime)
{
	if (!TryClaimForUpdate())
	{
		return;
	}
	myUpdateActive = true;
	UpdateScene(someElapsedTime);
	Zeph::Renderer& renderer = EngineOrNull()->GetRenderer();
	renderer.SetElapsedTime(someElapsedTime);
	renderer.UpdateScreenCamera(*myCameraInstance);
	renderer.GetRTC().SetCamera(*myCameraInstance);
	myUpdateActive = false;
	Release();
}

void LumoraWrapper::UpdateScene(float someElapsedTime)
{
	(void)someElapsedTime;
	// Picking writes the selection from the user-interface thread while frames run, and
	// resets it to -1 before it looks for a hit: one read, tested and used.
	const int selectedDecal = myCurrentSelectedDecal.load();
	if (myMode == DECAL_MODE && selectedDecal >= 0 && selectedDecal < myDecals.Count() && myDecalBox)
	{
		const Zeph::DecalData& decal = myDecals[selectedDecal];
		myDecalBox->SetScale(decal.mySize, decal.mySize, decal.myDepth);
		Matrix44<float> rotation;
		rotation.SetRotation(decal.myNorm);
		myDecalBox->SetOrientation(myDecalBox->GetOrientation() * rotation);
		myDecalBox->SetPosition(decal.myPosition);
	}
	if (myMode == LIGHT_MODE)
	{
		while (myEnvironmentPointLights.Count() + myEnvironmentSpotLights.Count() > myLightGizmos.Count())
		{
			Zeph::Instance* gizmo = NewGizmo("light-gizmo", Vector4<float>(1.0f, 0.0f, 0.0f, 0.0f));
			if (gizmo == nullptr)
			{
				break;
			}
			myLightGizmos.Add(gizmo);
		}
	}
}

void LumoraWrapper::Render()
{
	if (!TryClaimForRender())
	{
		return;
	}
	myRenderIsDoneFlag = false;
	RenderScene();
	if (myFrameObserver)
	{
		myFrameObserver(*this);
	}
	Zeph::Engine* engine = EngineOrNull();
	engine->RenderScene();

	std::ostringstream line;
	line.imbue(std::locale::classic());
	const Vector3<float>& position = myCameraInstance->GetPosition();
	line << "Camera Position: " << position.x << " " << position.y << " " << position.z;
	myInfoText->SetText(line.str());
	myInfoText->Render(false);

	myRenderIsDoneFlag = true;
	Release();
}

void LumoraWrapper::RenderScene()
{
	Zeph::Renderer& renderer = EngineOrNull()->GetRenderer();
	Zeph::RenderTargetCollector& collector = renderer.GetRTC();
	for (int index = 0; index < myEntities.Count(); ++index)
	{
		myEntities[index]->Render();
	}

	// The light icons, when shown, stand in for the marker boxes. One read per frame: the
	// switch may change meanwhile, and a frame shows one or the other.
	const bool iconsFlag = myLightIconsFlag.load();
	const bool gizmosFlag = myRenderMeshesFlag.load() && myMode == LIGHT_MODE && !iconsFlag;
	// One read of each selection per frame (picking may change them meanwhile), so the
	// frame marks one light at most and draws the box only for a decal it has.
	const int selectedPoint = myCurrentSelectedPoint.load();
	const int selectedSpot = myCurrentSelectedSpot.load();
	const int selectedDecal = myCurrentSelectedDecal.load();
	int gizmo = 0;
	// The marker of a light: the marked gizmo for the selected one, else the light's
	// pool gizmo (a pool shorter than the lights leaves the rest unmarked).
	const auto mark = [&](bool aSelectedFlag, const Vector3<float>& aPosition) {
		Zeph::Instance* marker = nullptr;
		if (aSelectedFlag)
		{
			marker = myMarkedGizmo.get();
		}
		else if (gizmo < myLightGizmos.Count())
		{
			marker = myLightGizmos[gizmo];
		}
		if (marker != nullptr)
		{
			marker->SetPosition(aPosition);
			renderer.RenderLateInstance(marker);
		}
		++gizmo;
	};
	for (int index = 0; index < myEnvironmentPointLights.Count(); ++index)
	{
		const Zeph::PointLightData& light = myEnvironmentPointLights[index];
		if (gizmosFlag)
		{
			mark(index == selectedPoint, light.myPosition);
		}
		collector.AddPointLight(light);
	}
	for (int index = 0; index < myEnvironmentSpotLights.Count(); ++index)
	{
		const Zeph::SpotLightData& light = myEnvironmentSpotLights[index];
		if (gizmosFlag)
		{
			mark(index == selectedSpot, light.myOrientation.GetPosition());
		}
		collector.AddSpotLight(light);
	}

	if (myRenderRoomsFlag.load())
	{
		for (int index = 0; index < myRooms.Count(); ++index)
		{
			myRooms[index]->Render();
		}
	}
	for (int index = 0; index < myDecals.Count(); ++index)
	{
		collector.AddDecal(myDecals[index]);
	}

	if (myMode == NODE_MODE)
	{
		for (int index = 0; index < myNodes.Count(); ++index)
		{
			Zeph::PointLightData marker;
			marker.myFalloff = 1.0f;
			marker.myPosition = myNodes[index].GetPosition();
			marker.myColor = Vector4<float>(3.0f, 0.0f, 0.0f, 0.0f);
			collector.AddPointLight(marker);
			myNodes[index].Render();
		}
		for (int index = 0; index < myEdges.Count(); ++index)
		{
			myEdges[index].Render();
		}
	}
	else if (myMode == DECAL_MODE && myDecalBox && selectedDecal != -1)
	{
		renderer.RenderLateInstance(myDecalBox.get());
	}
	QueueLightOverlays(selectedPoint, selectedSpot, iconsFlag);
}

// --- modes, display, camera, settings --------------------------------------------------

void LumoraWrapper::SetIsLightMode(int aMode)
{
	Claim();
	ResetIndices();
	myMode = static_cast<LumoraMode>(aMode);
	Release();
}

void LumoraWrapper::RenderMeshes(bool aRenderFlag)
{
	myRenderMeshesFlag = aRenderFlag;
	EngineOrNull()->GetRenderer().GetLightMeshRenderer().SetRenderFlag(aRenderFlag);
}

void LumoraWrapper::RenderRooms(bool aRenderFlag)
{
	myRenderRoomsFlag = aRenderFlag;
}

void LumoraWrapper::SetInteractiveDivisor(int aDivisor)
{
	Claim();
	EngineOrNull()->GetRenderer().SetInteractiveDivisor(aDivisor);
	Release();
}

bool LumoraWrapper::IsFrameReduced() const
{
	Zeph::Engine* engine = EngineOrNull();
	return engine != nullptr && engine->GetRenderer().IsFrameReduced();
}

void LumoraWrapper::PitchCamera(float aPitch)
{
	Claim();
	myCameraInstance->Pitch(aPitch);
	Release();
}

void LumoraWrapper::YawCamera(float aYaw)
{
	Claim();
	myCameraInstance->Yaw(aYaw);
	Release();
}

void LumoraWrapper::PlaceCamera(const Vector3<float>& aPosition, float aYaw, float aPitch)
{
	Matrix44<float> orientation =
	    Matrix44<float>::CreateRotateAroundX(-aPitch) * Matrix44<float>::CreateRotateAroundY(aYaw);
	orientation.SetPosition(aPosition);
	Claim();
	myCameraInstance->SetOrientation(orientation);
	Release();
}

void LumoraWrapper::Zoom(float aZoom)
{
	Claim();
	myCameraInstance->Move(aZoom);
	Release();
}

void LumoraWrapper::Strafe(float aStrafe)
{
	Claim();
	myCameraInstance->Strafe(aStrafe);
	Release();
}

void LumoraWrapper::UpdateSSAO(float aScale, float aSampleRadius, float aBias, float anIntensity)
{
	ClaimAfterTheFrame();
	EngineOrNull()->GetRenderer().SetSSAOVariables(aScale, aSampleRadius, aBias, anIntensity);
	Release();
}

void LumoraWrapper::UpdateHDRandBloom(float anAutoExposure, float aLumMin, float aLumMax, float aBloomThresh,
                                      float aBloomFactor, float anEmissiveMultiplier)
{
	ClaimAfterTheFrame();
	EngineOrNull()->GetRenderer().SetHDRandBloomVariables(anAutoExposure, aLumMin, aLumMax, aBloomThresh,
	                                                      aBloomFactor, anEmissiveMultiplier);
	Release();
}

void LumoraWrapper::ResetIndices()
{
	myCurrentSelectedPoint = -1;
	myCurrentSelectedSpot = -1;
	myCurrentSelectedNode = -1;
	myCurrentSelectedDecal = -1;
}

std::string LumoraWrapper::SysSTringToStdString(const std::u16string& aString) const
{
	return ToNarrow(aString);
}
} // namespace Lumora
