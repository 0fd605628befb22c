#pragma once
// Renderer: the deferred frame. Everything a frame shows is queued first in the
// RenderTargetCollector (instances by model surface, point and spot lights, decals)
// and in the late list (overlays); Render then runs the frame and empties every queue:
//
//   shadow map -> G-buffer -> decals -> outline mask -> shadow resolve -> point and
//   spot light volumes -> SSAO -> ambient (SH volume + reflections) -> light meshes ->
//   forward -> post chain (SSAO apply, tone map, bloom, tone map, grade, outline) ->
//   auxiliary effects -> late items -> debug tiles -> present
//
//   Zeph::Renderer& renderer = engine->GetRenderer();
//   renderer.GetRTC().SetCamera(camera);
//   instance->Render();                          // into the collector
//   renderer.GetRTC().AddPointLight(light);
//   renderer.RenderLateInstance(gizmo);          // over the finished image
//   engine->RenderScene();                       // Render(back buffer, depth) + present
//
// Owned by the Engine; Init runs once the device exists and before the first frame.
#include <atomic>
#include <memory>
#include <string>
#include <vector>

#include "core/GrowingArray.h"
#include "platform/gpu/StateCache.h"
#include "renderer/BakeMonitor.h"
#include "renderer/DecalMeshRenderTargetHelper.h"
#include "renderer/DeferredRenderTargetHelper.h"
#include "renderer/LateRenderItem.h"
#include "renderer/LightMeshRenderTargetHelper.h"
#include "renderer/MaterialDefaults.h"
#include "renderer/OutlineRenderTargetHelper.h"
#include "renderer/RenderTargetCollector.h"
#include "renderer/ShadowRenderTargetHelper.h"
#include "renderer/StandardRenderTargetHelper.h"
#include "renderer/post/BloomManager.h"
#include "renderer/post/ColorGradingManager.h"
#include "renderer/post/ComputeHelper.h"
#include "renderer/post/FXAAManager.h"
#include "renderer/post/FullScreenHelper.h"
#include "renderer/post/HDR_Manager.h"
#include "renderer/post/MotionBlurManager.h"
#include "renderer/post/OutlineManager.h"
#include "renderer/post/SSAOManager.h"

namespace Fx
{
class Variable;
}

namespace Gpu
{
class DepthStencilView;
class RenderTargetView;
class ShaderResourceView;
class Texture;
class TimestampQueries;
} // namespace Gpu

namespace Zeph
{
struct AmbientPart;
struct AmbientVolume;
class CameraInstance;
class Instance;
class ProbeHelper;
class Room;
class DynamicCubemap;
class Text;
class Texture;

class Renderer
{
public:
	// Shadow-map size in texels per quality level 0..3 (level 0 renders no shadows).
	static constexpr int ourShadowMapSizes[4] = {8, 1024, 2048, 4096};

	Renderer();
	~Renderer();
	Renderer(const Renderer&) = delete;
	Renderer& operator=(const Renderer&) = delete;

	bool Init(int aWidth, int aHeight);
	// The targets that follow the frame's size (HDR pair, tone-mapped image, G-buffer,
	// decal normals, shadow resolve, outline mask, special depth and every post stage's)
	// made again at a new size, new before old. Everything else stays: the SH volume,
	// the settings on the effects, the colour grading lookup, the shadow caster, the SSAO
	// directions and the eye adaptation. When a target cannot be made, every target is
	// put back at the old size and it returns false (reported at the error level); a size
	// below 1x1 is refused the same way. The same size does nothing.
	bool Resize(int aWidth, int aHeight);
	// Frames drawn while the camera moves: at 1/aDivisor of the width and height, so that a
	// designer flying through a level on a software rasterizer gets several frames a second;
	// 1 (the default) draws every frame at full size. The camera moves when the view differs
	// from the frame before's; the first frame with the camera still is drawn at full size again.
	// The reduced image is scaled up to the back buffer by the colour grading pass and the
	// overlays are drawn over it at full size. The divisor is held to 1..4.
	void SetInteractiveDivisor(int aDivisor);
	// Whether the last frame was drawn at the reduced size.
	bool IsFrameReduced() const { return myWidth != myOutputWidth || myHeight != myOutputHeight; }
	// Releases every target and forgets the queued frame; the engine calls it first at shutdown.
	void Destroy();

	void Render(Gpu::RenderTargetView* aBackBuffer, Gpu::DepthStencilView* aDepth);

	RenderTargetCollector& GetRTC() { return myCollector; }
	// aTint colours an instance of the overlay effect (the editor's light icons and wires).
	void RenderLateInstance(Instance* anInstance,
	                        const Vector4<float>& aTint = Vector4<float>(1.0f, 1.0f, 1.0f, 1.0f));
	void RenderLateText(Text* aText);
	int GetLateCount() const { return myLateItems.Count(); }
	// Forgets the queued late items without drawing them (after a bake, whose queued
	// scene never becomes a frame and whose overlay objects may go before the next one).
	void DiscardLateItems() { myLateItems.RemoveAll(); }
	int GetLateCapacity() const { return myLateItems.GetCapacity(); }

	// Adds aDelta to the accumulated time and writes the total to "Time" (the model
	// effect) and "ElapsedTime" (the full-screen effect).
	void SetElapsedTime(float aDelta);
	float GetElapsedTime() const { return myElapsedTime; }
	// "FarPlane" and the far-frustum corners on the full-screen effect.
	void UpdateScreenCamera(const CameraInstance& aCamera);
	LightMeshRenderTargetHelper& GetLightMeshRenderer() { return myLightMeshHelper; }

	// Grades the frame through another 3D lookup file; false (reported) when it cannot
	// be loaded, and the frame then keeps no grade until a lookup loads.
	bool SetColorGrading(const std::string& aLookupFile);

	void SetSSAOVariables(float aScale, float aSampleRadius, float aBias, float anIntensity);
	void SetHDRandBloomVariables(float anAutoExposure, float aLumMin, float aLumMax, float aBloomThreshold,
	                             float aBloomFactor, float anEmissiveMultiplier);

	// Loads a level's baked ambient light (ambient.sh) and uploads it. The volume shown
	// so far is dropped first: a file that cannot be opened (the level has not been
	// baked) leaves no volume, and so does a damaged file (counts that do not match its
	// size, or outside 1..2048), which is reported at the error level.
	void SetSH(const std::string& aPath);
	// The irradiance volume: update false creates the seven 3D textures from the
	// blocks, true overwrites them; both bind them to the full-screen effect.
	bool UploadSHToGPU(bool anUpdateFlag, const std::vector<uint32_t>* someBlocks, int anX, int aY, int aZ);
	// "WorldMin" and "WorldSize" of the volume on the full-screen effect.
	void SetVolumeBounds(const Vector3<float>& aWorldMin, const Vector3<float>& aWorldSize);

	bool SetupShadowDepthBuffer();
	bool SetupSpecialDepthBuffer();

	// Debug tiles: registered names ("motion-blur", "linear-depth", "ssao",
	// "deferred-albedo", "deferred-normal", "shadow-map"); shown ones are drawn down the
	// left of the screen at the end of the frame.
	void ShowDebugTexture(const std::string& aName);
	void HideDebugTexture(const std::string& aName);
	int GetShownDebugTextureCount() const { return static_cast<int>(myShownDebugTextures.size()); }

	int GetShadowQuality() const { return myShadowQuality; }
	int GetShadowMapSize() const { return myShadowMapSize; }
	int GetWidth() const { return myWidth; }
	int GetHeight() const { return myHeight; }
	// The bakes. Both render what the collector holds (queued by the caller, as the
	// editor's bake commands do) from probe cubemaps through the frame's G-buffer,
	// light and ambient passes, and run to their end on the calling thread; the
	// progress (0..100) may be read from another thread meanwhile.
	//
	// GenerateSH: the SH irradiance volume over the rooms' bounds (a probe every 2
	// units), aBounces times, each bounce lit by the previous one's volume; the last
	// bounce is written to aPath (ambient.sh); aDebugFlag saves every probe cubemap.
	// A grid too large to hold is refused at the error level before anything changes;
	// a file that cannot be written whole is reported at the error level and the old
	// one is kept. Neither ends the process.
	void GenerateSH(const GrowingArray<Room*>& someRooms, const std::string& aPath, int aBounces,
	                bool aDebugFlag);
	// The probes strictly inside someBakedRooms re-baked over every bounce, every other cell
	// kept as aPath holds it. Within the re-baked rooms the first bounce sees direct light
	// only, as in a whole bake; later bounces see the kept cells as they are on disk (the
	// last bounce of the bake that wrote them) around the rooms' previous bounce. When
	// aPath is missing, damaged or of another grid the whole volume is baked instead, and
	// the status's message says so.
	void GenerateSHForRooms(const GrowingArray<Room*>& someRooms, const GrowingArray<Room*>& someBakedRooms,
	                        const std::string& aPath, int aBounces);
	// One bounce (aBounce, from 1) of the cells aFirst .. aFirst + aCount - 1 (in ambient.sh's
	// order; those outside every room are neutral), lit by aPrevious (the volume of bounce
	// aBounce - 1; null, and unused, for bounce 1), into aPartOut's grid, range and blocks.
	// False when refused (reported at the error level) or cancelled. The volume shown
	// afterwards is the one the bounce was lit by: the caller loads the level's own back.
	bool GenerateSHPart(const GrowingArray<Room*>& someRooms, int aBounce, const AmbientVolume* aPrevious,
	                    long long aFirst, long long aCount, AmbientPart& aPartOut);
	// Projects the SH probe cubemap onto SH and stores the seven packed vectors of
	// cell (anX, aY, aZ) of a volume of aCountX x aCountY x aCountZ cells.
	void AddScalars(DynamicCubemap& aCube, std::vector<uint32_t>* someBlocks, int anX, int aY, int aZ,
	                int aCountX, int aCountY, int aCountZ);
	// GenerateReflections: a 256-texel cubemap at every room's centre, pre-filtered
	// into its mips, saved to "data/Cubemaps/" + aLevel + "/" + room id + ".dds".
	// With someBakedRooms, only the rooms whose ID it holds are rendered and written. The
	// cubemaps are written when the last is done, so a cancelled bake writes none.
	void GenerateReflections(const GrowingArray<Room*>& someRooms, const std::string& aLevel,
	                         const std::vector<std::string>* someBakedRooms = nullptr);
	// A bake spread over machines: the room with the ID aRoomID rendered as GenerateReflections
	// renders it, into anOutFile (through a temporary); the level's cubemaps are untouched.
	// False when the room is not found (the status's message says so), cancelled or not written.
	bool GenerateReflectionPart(const GrowingArray<Room*>& someRooms, const std::string& aRoomID,
	                            const std::string& anOutFile);
	int GetBakingProgress() const { return myBakingProgress.load(); }
	// Any thread: the running bake stops within one probe (ambient) or one cube face
	// (reflections) and writes nothing; the volume shown is reloaded from the file. A
	// no-op when no bake runs. Only sets a flag, so a signal handler may call it.
	void CancelBake() { myBakeMonitor.RequestCancel(); }
	// Any thread: where the running bake is, or how the last one ended.
	BakeStatus GetBakeStatus() const { return myBakeMonitor.GetStatus(); }
	// How the ambient bake reads its probes back: many probes' faces gathered in an
	// atlas and read at once (the default), each probe's cube at once, or each face
	// alone. The volume is the same either way; the modes are there to be compared.
	enum class ProbeReadback
	{
		BATCHED,
		PER_PROBE,
		PER_FACE,
	};
	void SetProbeReadback(ProbeReadback aMode) { myProbeReadback = aMode; }
	// Probe captures skip instances and lights outside each face's view (the default);
	// off, they draw everything, with the same result.
	void SetProbeCullingFlag(bool aFlag) { myProbeCullingFlag = aFlag; }
	// Where the last ambient bake spent its time, in seconds: submitting the probe
	// captures, reading them back (on a software rasterizer this waits for the
	// drawing too) and projecting them onto SH.
	struct BakeTimings
	{
		double myRendering = 0.0;
		double myReadback = 0.0;
		double myProjection = 0.0;
	};
	const BakeTimings& GetBakeTimings() const { return myBakeTimings; }
	// Probe cubemaps the last ambient bake rendered and projected, over all bounces.
	long long GetBakedProbeCount() const { return myBakedProbeCount; }
	bool IsSHLoaded() const { return mySHLoadedFlag; }
	ProbeHelper* GetProbeHelper() const { return myProbeHelper.get(); }
	FullScreenHelper& GetFullScreenHelper() { return myFullScreenHelper; }
	DeferredRenderTargetHelper& GetGBuffer() { return myDeferredHelper; }
	ShadowRenderTargetHelper& GetShadowHelper() { return myShadowHelper; }
	HDR_Manager& GetHDRManager() { return myHDRManager; }
	SSAOManager& GetSSAOManager() { return mySSAOManager; }
	OutlineManager& GetOutlineManager() { return myOutlineManager; }
	const MaterialDefaults& GetMaterialDefaults() const { return myMaterialDefaults; }
	Gpu::DepthStencilView* GetCurrentDepth() const { return myCurrentDepth; }
	// The last frame's lit image (lights, ambient and forward pass, occlusion applied)
	// before tone mapping: the HDR target the post chain started from.
	Texture* GetLitImage() const { return myLitImage; }
	// Times of the last frame's passes, when pass timing is on (benchmarks).
	void SetPassTimingFlag(bool aFlag) { myPassTimingFlag = aFlag; }
	struct PassTime
	{
		std::string myName;
		double myMilliseconds;
	};
	const std::vector<PassTime>& GetPassTimes() const { return myPassTimes; }

private:
	// One face of a probe cubemap, as both bakes capture it: the face and the cube's
	// depth cleared, the face camera moved to aPosition, the collector's shadow-casting
	// static batches drawn into aGBuffer (cleared first when aClearGBufferFlag), the
	// point and spot light passes and the ambient pass (without the sun's shadow) into
	// the face. Shadows, decals, skinned and unshadowed geometry, SSAO and
	// post-processing are left out.
	void RenderProbeFace(DynamicCubemap& aCube, int aFace, const Vector3<float>& aPosition,
	                     DeferredRenderTargetHelper& aGBuffer, bool aClearGBufferFlag);
	// The reflection cubemap's mips 1..8 filtered from mip 0 through the cross of each
	// face and its neighbours (the ProbeHelper's filter target).
	void PrefilterReflection(DynamicCubemap& aCube);
	// A room's six faces rendered from its centre into aCube and pre-filtered; false when the
	// bake was asked to stop.
	bool RenderRoomReflection(DynamicCubemap& aCube, const Room& aRoom, DeferredRenderTargetHelper& aGBuffer);
	// The ambient bakes' common run: bounces of the selected probes into someBlocks
	// (AmbientBake.cpp). False when cancelled.
	struct SHBakeJob;
	enum class SHBakeRun
	{
		DONE,
		CANCELLED,
		NOT_RUN, // the probe cubemap or its G-buffer could not be made (reported)
	};
	SHBakeRun RunSHBake(const SHBakeJob& aJob, std::vector<uint32_t>* someBlocks);
	// GenerateSH, and GenerateSHForRooms with someBakedRooms.
	void GenerateSHVolume(const GrowingArray<Room*>& someRooms, const GrowingArray<Room*>* someBakedRooms,
	                      const std::string& aPath, int aBounces, bool aDebugFlag);
	// The SH bake's debug capture: the probe cubemap's faces written as a DDS.
	void SaveProbeCapture(DynamicCubemap& aCube, const std::string& aPath);

	struct DebugTexture
	{
		std::string myName;
		Texture* myTexture = nullptr;
		Gpu::ShaderResourceView* myView = nullptr;
		const char* myTechnique = "Render";
	};

	Texture* GetCurrentHDR() const { return myPingPong[myPingPongIndex]; }
	Texture* GetOtherHDR() const { return myPingPong[myPingPongIndex ^ 1]; }
	void RenderShadowMap();
	void ClearFrameTargets();
	// The two light passes and the ambient pass over aGBuffer into the current output.
	void RenderLights(DeferredRenderTargetHelper& aGBuffer);
	void RenderAmbient(DeferredRenderTargetHelper& aGBuffer, int aWidth, int aHeight);
	void RenderPostChain();
	// Binds the probe helper's seven volume views (null where there is none) to the
	// full-screen effect's "cArTexture" .. "cCTexture".
	void PublishSHViews();
	void RenderLateItems();
	void RenderDebugTextures();
	void RegisterDebugTextures();
	// The renderer's own frame-sized targets (HDR pair, tone-mapped image, special depth)
	// made at a size, swapped in only when all are made.
	bool ResizeFrameTargets(int aWidth, int aHeight);
	// Every frame-sized target made at a size (Resize's steps); the output size stays.
	bool ResizeTargets(int aWidth, int aHeight);
	// The frame's size for this frame: reduced while the camera moves (SetInteractiveDivisor).
	void FollowTheCamera();
	void LoadSettings();
	void BeginPass(const char* aName);
	void EndPasses();

	int myShadowQuality = 3;
	int myShadowMapSize = 4096;
	// The frame's targets' size, and the size of the image it is shown at (the back buffer's):
	// the two differ only while the camera moves with an interactive divisor above 1.
	int myWidth = 0;
	int myHeight = 0;
	int myOutputWidth = 0;
	int myOutputHeight = 0;
	int myInteractiveDivisor = 1;
	std::atomic<int> myBakingProgress{0};
	// Cells visited by the current bake, over every bounce.
	long long myBakingProgressCounter = 0;
	long long myBakedProbeCount = 0;
	ProbeReadback myProbeReadback = ProbeReadback::BATCHED;
	BakeTimings myBakeTimings;
	BakeMonitor myBakeMonitor;
	bool myProbeCullingFlag = true;
	bool mySHLoadedFlag = false;
	std::unique_ptr<ProbeHelper> myProbeHelper;
	std::unique_ptr<Texture> myHDRTargets[2];
	std::unique_ptr<Texture> myToneMappedTarget;
	Texture* myPingPong[2] = {};
	int myPingPongIndex = 0;
	Texture* myLitImage = nullptr;
	Gpu::RenderTargetView* myCurrentOutput = nullptr;
	Gpu::DepthStencilView* myCurrentDepth = nullptr;
	Gpu::RenderTargetView* myBackBuffer = nullptr;
	Fx::Variable* myTimeVariable = nullptr;
	// The overlay effect's "Tint", set for every late instance.
	Fx::Variable* myOverlayTint = nullptr;
	ComputeHelper myComputeHelper;
	FullScreenHelper myFullScreenHelper;
	BloomManager myBloomManager;
	HDR_Manager myHDRManager;
	MotionBlurManager myMotionBlurManager;
	SSAOManager mySSAOManager;
	ColorGradingManager myColorGradingManager;
	OutlineManager myOutlineManager;
	FXAAManager myFXAAManager;
	ShadowRenderTargetHelper myShadowHelper;
	StandardRenderTargetHelper myStandardHelper;
	DeferredRenderTargetHelper myDeferredHelper;
	LightMeshRenderTargetHelper myLightMeshHelper;
	DecalMeshRenderTargetHelper myDecalHelper;
	OutlineRenderTargetHelper myOutlineHelper;
	MaterialDefaults myMaterialDefaults;
	RenderTargetCollector myCollector;
	GrowingArray<LateRenderItem> myLateItems;
	Gpu::Viewport myScreenViewport;
	Gpu::Viewport myOutputViewport;
	Gpu::Viewport myShadowViewport;
	std::unique_ptr<Gpu::Texture> myShadowDepthTexture;
	Gpu::DepthStencilView* myShadowDepthView = nullptr;
	Gpu::ShaderResourceView* myShadowDepthShaderView = nullptr;
	std::unique_ptr<Gpu::Texture> mySpecialDepthTexture;
	Gpu::DepthStencilView* mySpecialDepthView = nullptr;
	Gpu::ShaderResourceView* mySpecialDepthShaderView = nullptr;
	float myElapsedTime = 0.0f;
	std::vector<DebugTexture> myDebugTextures;
	std::vector<DebugTexture> myShownDebugTextures;
	bool myPassTimingFlag = false;
	std::vector<PassTime> myPassTimes;
	std::unique_ptr<Gpu::TimestampQueries> myTimestamps;
};
} // namespace Zeph
