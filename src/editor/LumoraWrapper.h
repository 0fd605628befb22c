#pragma once
// LumoraWrapper: the one class an editor front end sees. It owns the editor's scene
// (rooms, placed entities, point and spot lights, decals, the AI path graph), the
// editor camera, the info line and the marker geometry, and keeps the front end's two
// threads apart.
//
//   Lumora::LumoraWrapper::Create(windowHandle, 1280, 720);   // 0: headless
//   Lumora::LumoraWrapper* editor = Lumora::LumoraWrapper::GetInstance();
//   editor->ParseLevel(u"sample_small");
//   // render loop thread:                 // user-interface thread:
//   editor->Update(16.0f);                  editor->DoIntersection(x, y);
//   editor->Render();                       editor->MoveSelectedVector(0, 1, 0);
//                                           editor->SaveLights(u"sample_small");
//   Lumora::LumoraWrapper::ShutDown();
//
// In a native child window the view follows the window: the host resizes the window, then
// calls Resize with its new size in device pixels; GetWidth and GetHeight give the size
// drawn at, which picking, ProjectToView and the camera's aspect follow.
//
// Threads. Update and Render are frame steps: they run only when the facade is free
// and no claim is waiting, and return at once otherwise (the frame is dropped, not
// queued). Editing operations and saving claim the facade: they wait (polling every
// millisecond) until it is free, take it, work and free it. Loading, Resize and the settings
// updates claim after the frame: they wait until no frame is being rendered and no
// update runs, then claim. Picking and the queries take nothing. Whoever holds the busy
// flag makes the engine's GL context current on its thread and lets it go when it
// frees the flag, so the context is never current on two threads.
//
// Strings from the front end are UTF-16; the engine's strings are UTF-8.
#include <atomic>
#include <bitset>
#include <functional>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "ai/NGEdge.h"
#include "ai/NGNode.h"
#include "core/GrowingArray.h"
#include "editor/BakeRecord.h"
#include "editor/DecalStruct.h"
#include "editor/DecalType.h"
#include "editor/DecalTypeStruct.h"
#include "editor/LightOverlays.h"
#include "editor/LumoraMode.h"
#include "editor/PointLightStruct.h"
#include "editor/SpotLightStruct.h"
#include "level/KeptContent.h"
#include "renderer/BakeStatus.h"
#include "renderer/DecalData.h"
#include "renderer/PointLightData.h"
#include "renderer/SpotLightData.h"

namespace Zeph
{
class Camera;
class CameraInstance;
class Instance;
class Room;
class Text;
class Texture;
} // namespace Zeph

namespace Lumora
{
class LumoraWrapper
{
public:
	// The scene arrays' starting room and growth step. The path graph never grows past
	// it: nodes and edges point at each other's elements, which must not move.
	static constexpr int ourArraySize = 2000;

	// Lifecycle and frame loop.
	static bool Create(uint64_t aHwnd, int aWidth, int aHeight);
	static LumoraWrapper* GetInstance() { return ourInstance; }
	static void ShutDown();
	// The log levels (bit 0 debug .. bit 3 critical) whose reports end the process, for
	// the next Create: severe and critical by default. A tool that lists a level's
	// problems turns them all off and listens to the log instead.
	static void SetFatalReportLevels(std::bitset<4> someLevels);
	// Hands every report of the library's log to aListener as well: its level (0 debug,
	// 1 error, 2 severe, 3 critical), the reporting function and the message (without its
	// line break). It is called on whichever thread reports (a frame, a bake, the user-
	// interface thread) and must not call back into the facade. Process-wide, before or
	// after Create; an empty function removes it. The log reads its listener without a lock:
	// set it while nothing else reports (before Create, or with no frame, edit or bake running).
	static void SetReportListener(
	    std::function<void(int aLevel, const std::string& aFunction, const std::string& aText)> aListener);
	void Update(float someElapsedTime);
	void Render();
	// The drawing area follows the view: the back buffer and depth, the renderer's frame-sized
	// targets (its SH volume, settings and grading stay), the size picking uses and the camera's
	// aspect, at aWidth x aHeight device pixels. With a window, the host resizes the window
	// first; its surface follows. Claims after the frame. False, with the old size kept and
	// the reason in the log, for a size below 1 or above what the GPU can draw, or when the
	// targets cannot be made; the same size is true at once. A running bake holds the facade
	// until it ends, so a host that resizes during a bake calls Resize afterwards.
	bool Resize(int aWidth, int aHeight);
	// The size drawn at, in device pixels; any thread.
	int GetWidth() const { return myWidth.load(); }
	int GetHeight() const { return myHeight.load(); }

	// Modes, display and camera.
	void SetIsLightMode(int aMode);
	void RenderMeshes(bool aRenderFlag);
	void RenderRooms(bool aRenderFlag);
	// While the camera moves, frames are drawn at 1/aDivisor of the width and height and
	// scaled up; the first frame with the camera still is drawn at full size (1, the start's
	// setting, draws every frame at full size; held to 1..4).
	void SetInteractiveDivisor(int aDivisor);
	// Whether the last frame was drawn smaller because the camera moved; the rendering thread.
	bool IsFrameReduced() const;
	void PitchCamera(float aPitch);
	void YawCamera(float aYaw);
	void Zoom(float aZoom);
	// Puts the camera at a position, turned by aYaw about the world's up, then tilted by
	// aPitch about its own right axis (radians; positive looks down): for tools and
	// front ends that restore a saved view.
	void PlaceCamera(const Vector3<float>& aPosition, float aYaw, float aPitch);
	// Where the camera is and its yaw and pitch as PlaceCamera takes them, so that PlaceCamera
	// with them puts the camera back as it is (yaw in -pi..pi, pitch in -pi/2..pi/2).
	void GetCameraPlacement(Vector3<float>& aPosition, float& aYaw, float& aPitch) const;
	void Strafe(float aStrafe);
	// The pixel (device pixels, top-left origin, as DoIntersection takes it) at which a world
	// point is drawn with the current camera and size, possibly outside the view; false when
	// the point lies behind the camera.
	bool ProjectToView(const Vector3<float>& aWorld, float& aX, float& aY) const;
	// Every point and spot light drawn over the frame as an icon about 24 pixels across
	// whatever its distance (a bulb with rays, or a lamp throwing a cone of light with a tick
	// along the spot's direction), in the light's colour, the selected one in a ring; a click on an icon
	// picks its light. In LIGHT_MODE only, where the icons take the marker boxes' place. Off by default.
	void SetLightIconsFlag(bool aFlag);
	// Which lights show their reach as wire over the frame, in LIGHT_MODE: a point light's
	// falloff sphere as three great circles, a spot light's outer cone out to its reach with
	// the inner cone's ring. The selected light's is drawn brighter. NONE by default.
	enum class LightVolumes
	{
		NONE,
		SELECTED,
		ALL,
	};
	void SetLightVolumes(LightVolumes aWhich);

	// Picking and selection.
	// Selects the nearest object of the mode whose marker box the ray through the pixel hits,
	// or, in LIGHT_MODE with icons shown, whose icon covers the pixel.
	void DoIntersection(float aMouseX, float aMouseY);
	// Selection by kind and index, as an outliner selects: the kind's mode becomes the
	// editor's mode and the object its only selection (-1 selects nothing). False, with mode
	// and selection as they were, when the index names no object of that kind.
	enum class ObjectKind
	{
		POINT_LIGHT,
		SPOT_LIGHT,
		DECAL,
		PATH_NODE,
	};
	bool Select(ObjectKind aKind, int anIndex);
	// Every object of the editor's mode that a click at the pixel would hit, nearest first (the
	// first is what DoIntersection selects): a front end cycles through the rest when the same
	// spot is clicked again. Takes nothing, like DoIntersection.
	struct PickHit
	{
		ObjectKind myKind;
		int myIndex;
		// From the camera to the object's centre.
		float myDistance;
	};
	std::vector<PickHit> PickAll(float aMouseX, float aMouseY) const;
	// The selected object of the editor's mode put at a position, or pointed along a
	// direction (a spot light, keeping its position; a decal, keeping its direction's
	// length). False when nothing is selected that can take it, or the direction is zero
	// or not finite.
	bool SetSelectedPosition(const Vector3<float>& aPosition);
	bool SetSelectedDirection(const Vector3<float>& aDirection);
	bool TryGetCurrentPointLight(PointLightStruct& aPointLightRef) const;
	bool TryGetCurrentSpotLight(SpotLightStruct& aSpotLightRef) const;
	bool TryGetCurrentDecal(DecalStruct& aDecalRef) const;

	// Editing.
	void AddPointLight();
	void AddSpotLight();
	void AddDecal();
	void AddPathNode();
	void CopyPointLight();
	void CopySpotLight();
	void CopyDecal();
	void RemoveSelectedPointLight();
	void RemoveSelectedSpotLight();
	void RemoveSelectedDecal();
	void RemoveSelectedNode();
	void DeleteSelected();
	void MoveSelectedVector(float anX, float aY, float aZ);
	void MoveSelectedVert(float aMovement);
	void MoveSelectedHor(float aMovement);
	void MoveSelectedDepth(float aMovement);
	void PitchSpotLight(float aPitch);
	void YawSpotLight(float aYaw);
	void ChangeColorPointLight(float anR, float aG, float aB);
	void ChangeColorSpotLight(float anR, float aG, float aB);
	void ChangeColorDecal(float anR, float aG, float aB);
	void ChangeFalloffPointLight(float aFalloff);
	void ChangeFalloffSpotLight(float aFalloff);
	void ChangeAnglesSpotLight(float anInnerValue, float anOuterValue);
	void ChangeDecalSize(float aSize);
	void ChangeDecalDepth(float aDepth);
	void ChangeDecalType(const std::u16string& aDecalType);
	void GetCurrentDecalTypes(DecalTypeStruct& aDecalTypeRef) const;

	// Bakes (they hold the facade for their whole run; frames are dropped meanwhile)
	// and the progress of the running or last bake, 0..100, readable from any thread.
	void BakeAmbient(const std::u16string& aLevel, int aNumOfBounces, bool aSaveToDDSFlag);
	void BakeSpecular(const std::u16string& aLevel);
	int GetBakeProgress() const;
	// Any thread: stops the running bake within one probe or cube face; it writes nothing
	// (every file as it was, no temporary left) and frees the facade. A no-op when no bake
	// runs.
	void CancelBake();
	// Any thread: the running bake's phase, bounce, counts and time left, or how the last
	// one ended (BakeStatus.h).
	Zeph::BakeStatus GetBakeStatus() const;
	// The same bakes for the rooms with the given IDs only: their probes re-baked over every
	// bounce, every other cell of ambient.sh kept (the whole volume when the file does not
	// match the rooms' grid; the status's message says so); their cubemaps alone rendered
	// and written. False, with the reason, when an ID names no room (nothing is baked) or
	// the bake did not finish (the status tells).
	bool BakeAmbientRooms(const std::u16string& aLevel, int aNumOfBounces,
	                      const std::vector<std::string>& someRoomIDs, std::string& aProblemOut);
	bool BakeSpecularRooms(const std::u16string& aLevel, const std::vector<std::string>& someRoomIDs,
	                       std::string& aProblemOut);
	// A bake spread over machines: bounce aBounce (from 1) of the cells aFirst .. aFirst +
	// aCount - 1 of the loaded level's grid, lit by aPreviousFile (the merged volume of the
	// bounce before; empty for bounce 1), into the part file anOutFile, whose header ties it
	// to the grid, the level's inputs and the previous volume. The level's ambient.sh is
	// untouched and shown again afterwards.
	bool BakeAmbientPart(const std::u16string& aLevel, int aBounce, const std::string& aPreviousFile,
	                     long long aFirst, long long aCount, const std::string& anOutFile,
	                     std::string& aProblemOut);
	// One bounce's parts of the loaded level assembled into anOutFile (ambient.sh's format),
	// refusing parts of another grid or other inputs, of different bounces or previous
	// volumes, overlaps and gaps.
	bool MergeAmbientParts(const std::u16string& aLevel, const std::vector<std::string>& someParts,
	                       const std::string& anOutFile, std::string& aProblemOut);
	// The reflection bake spread over machines: the cubemap of the loaded level's room aRoomID,
	// rendered as BakeSpecular renders it, lit by the ambient volume in anAmbientFile (the
	// merged volume of an ambient bake that has not replaced the level's yet; empty: the
	// level's own ambient.sh), into anOutFile. The level's files, its bake record and the
	// reflections shown are untouched.
	bool BakeSpecularPart(const std::u16string& aLevel, const std::string& aRoomID,
	                      const std::string& anAmbientFile, const std::string& anOutFile,
	                      std::string& aProblemOut);
	// Writes a phase's entry of the level's bake record (bake.json) for outputs that are in place,
	// hashing the loaded level's inputs: what the driver of a bake spread over machines calls once
	// it has put the outputs together. someRooms empty: every room; aBounces: the ambient phase's.
	// False, with the reason, when the record cannot be written (the old one stays).
	bool RecordBake(const std::u16string& aLevel, BakePhase aPhase, const std::vector<std::string>& someRooms,
	                int aBounces, const std::map<std::string, double>& someTimings, std::string& aProblemOut);

	// Post-processing settings.
	void UpdateSSAO(float aScale, float aSampleRadius, float aBias, float anIntensity);
	void UpdateHDRandBloom(float anAutoExposure, float aLumMin, float aLumMax, float aBloomThresh,
	                       float aBloomFactor, float anEmissiveMultiplier);

	// Levels.
	void ParseLevel(const std::u16string& aLevel);
	// Reads the entity-type and decal-type catalogues again (after the user edited them); the
	// next ParseLevel places entities and decals by them.
	void ReloadCatalogues();
	void SaveLights(const std::u16string& aLevel);
	void SaveDecals(const std::u16string& aLevel);

	// Read access for tools and tests (the front end does not need these).
	LumoraMode GetMode() const { return myMode; }
	const Zeph::CameraInstance* GetCameraInstance() const { return myCameraInstance.get(); }
	const Zeph::Text* GetInfoText() const { return myInfoText.get(); }
	int GetSelectedPoint() const { return myCurrentSelectedPoint; }
	int GetSelectedSpot() const { return myCurrentSelectedSpot; }
	int GetSelectedNode() const { return myCurrentSelectedNode; }
	int GetSelectedDecal() const { return myCurrentSelectedDecal; }
	const GrowingArray<Zeph::PointLightData>& GetPointLights() const { return myEnvironmentPointLights; }
	const GrowingArray<Zeph::SpotLightData>& GetSpotLights() const { return myEnvironmentSpotLights; }
	const GrowingArray<Zeph::DecalData>& GetDecals() const { return myDecals; }
	const GrowingArray<AI::NGNode>& GetNodes() const { return myNodes; }
	const GrowingArray<AI::NGEdge>& GetEdges() const { return myEdges; }
	const GrowingArray<Zeph::Room*>& GetRooms() const { return myRooms; }
	const GrowingArray<Zeph::Instance*>& GetEntities() const { return myEntities; }
	const GrowingArray<Zeph::Instance*>& GetLightGizmos() const { return myLightGizmos; }
	const Zeph::Instance* GetMarkedGizmo() const { return myMarkedGizmo.get(); }
	const Zeph::Instance* GetDecalBox() const { return myDecalBox.get(); }
	const std::map<std::string, DecalType>& GetDecalTypes() const { return myDecalTypes; }
	const std::map<std::string, std::string>& GetEntityBank() const { return myEntityBank; }
	bool GetLightIconsFlag() const { return myLightIconsFlag.load(); }
	LightVolumes GetLightVolumes() const { return myLightVolumes.load(); }
	bool IsBusy() const { return myPausedFlag.load(); }
	bool IsUpdateActive() const { return myUpdateActive.load(); }
	// Called by Render with the busy flag held, after the scene is submitted and before
	// the engine draws it: a hook for tools and tests that check what a frame sees. Set
	// it while no frame step can run.
	using FrameObserver = std::function<void(const LumoraWrapper&)>;
	void SetFrameObserver(FrameObserver anObserver) { myFrameObserver = std::move(anObserver); }
	int GetNodeIDCounter() const { return myNodeIDCounter; }

private:
	LumoraWrapper() = default;
	~LumoraWrapper() = default;
	LumoraWrapper(const LumoraWrapper&) = delete;
	LumoraWrapper& operator=(const LumoraWrapper&) = delete;

	void Init();
	void InitScene();
	void DestroyScene();
	void UpdateScene(float someElapsedTime);
	void RenderScene();
	// Queues the light icons (when anIconsFlag) and the wires the display switches ask for
	// (View.cpp).
	void QueueLightOverlays(int aSelectedPoint, int aSelectedSpot, bool anIconsFlag);
	// Queues the scene a bake renders (BakeCommands.cpp).
	void QueueBakeScene();
	// After a reflection bake that finished: the rooms' cubemaps read again from their new files.
	void ShowBakedReflections(const std::u16string& aLevel);
	// The room bakes' common run: the rooms named found (else aProblemOut names the first
	// that is not, and nothing is baked), the scene queued, aBake run on them, all while the
	// facade is held. aBake sets aProblemOut when its bake did not finish.
	bool BakeRooms(const std::vector<std::string>& someRoomIDs, std::string& aProblemOut,
	               const std::function<void(const GrowingArray<Zeph::Room*>&)>& aBake);
	void ResetIndices();
	std::string SysSTringToStdString(const std::u16string& aString) const;

	// The four waiting disciplines. Every Claim... returns with the busy flag held and
	// the GL context current on the calling thread; Release frees both.
	bool TryClaimForUpdate();
	bool TryClaimForRender();
	void Claim();
	void WaitUntilFree() const;
	void ClaimAfterTheFrame();
	void Release();

	// A marker box instance: a generated box of half extents myNodeHalfDimensions.
	Zeph::Instance* NewGizmo(const char* aModelName, const Vector4<float>& aColor) const;

	// Level loading and saving.
	void ParseRooms(const std::string& aPath);
	void ParseEntities(const std::string& aLevel);
	void ParseEntities();
	void ParseLights(const std::string& aPath);
	void ParseNodes(const std::string& aPath);
	void ParseDecals(const std::string& aPath);
	void ParseDecalTypes(const std::string& aPath);
	// Gives every entity its room's cubemap from the room's file (the fallback where there is
	// none or it is no cube), by the rooms ParseEntities found the entities in.
	void AssignRoomCubemaps(const std::string& aLevel);
	void SaveNodes(const std::string& aLevel);

	// Private helpers of picking and editing (Picking.cpp, Editing.cpp).
	// Waits until the facade is free and takes it when aSelection (read after the
	// wait) names an object; false, with the flag untouched, when it is -1.
	bool ClaimForSelection(const std::atomic<int>& aSelection);
	// Whether the current mode's moving or turning has a selected object to act on;
	// aNodesFlag: path nodes count in NODE_MODE.
	bool HasSelectionForMode(bool aNodesFlag) const;
	// Waits, then adds the offset (given in world space, or as aMovement along the
	// camera's row anAxisRow: 0 right, 1 up, 2 forward) to the mode's selection.
	void MoveSelectedByMode(const Vector3<float>& anOffset, bool aNodesFlag);
	// The selected object's position replaced by what aPlace makes of it; false when
	// nothing of the mode is selected (path nodes only with aNodesFlag).
	bool PlaceSelected(const std::function<Vector3<float>(const Vector3<float>&)>& aPlace, bool aNodesFlag);
	void MoveSelectedAlongCamera(int anAxisRow, float aMovement);
	// Waits, then turns the selected spot light (LIGHT_MODE) or decal (DECAL_MODE).
	void TurnSelected(const Matrix33<float>& aRotation);
	// p + aDistance * f for the camera's position p and forward row f.
	Vector3<float> InFrontOfCamera(float aDistance) const;
	// Detaches the edge at anIndex from the nodes that hold it, destroys its line and
	// removes it; an edge moved into its place has its nodes pointed at the new address.
	void RemoveEdgeAt(int anIndex);
	// (end of picking and editing helpers)

	// Private helpers of level loading and saving (src/level/).
	// The next free path node ID from myNodeIDCounter on (never 0 or less, never one that a
	// node or kept content holds); the counter moves past it.
	int TakeNodeID();
	// (end of level helpers)

	static LumoraWrapper* ourInstance;

	int myNodeIDCounter = 1;
	// The selection: written by picking on the user-interface thread without the busy
	// flag and read by the frame, so each index is one atomic store and load.
	std::atomic<int> myCurrentSelectedPoint{-1};
	std::atomic<int> myCurrentSelectedSpot{-1};
	std::atomic<int> myCurrentSelectedNode{-1};
	std::atomic<int> myCurrentSelectedDecal{-1};
	std::atomic<bool> myRenderIsDoneFlag{true};
	std::atomic<bool> myPausedFlag{false};
	std::atomic<bool> myUpdateActive{false};
	// Claimants waiting for the busy flag. While any waits, frame steps are dropped, so a
	// render loop that runs without pause cannot starve the user-interface thread.
	mutable std::atomic<int> myWaitingClaims{0};
	// The display switches: set from the user-interface thread without the busy flag,
	// read by the frame.
	std::atomic<bool> myRenderRoomsFlag{false};
	std::atomic<bool> myRenderMeshesFlag{true};
	std::atomic<bool> myLightIconsFlag{false};
	std::atomic<LightVolumes> myLightVolumes{LightVolumes::NONE};
	// The drawing size, written by Create and Resize, readable from any thread.
	std::atomic<int> myWidth{0};
	std::atomic<int> myHeight{0};
	float myNodeHalfDimensions = 0.25f;
	std::unique_ptr<Zeph::Camera> myCamera;
	std::unique_ptr<Zeph::CameraInstance> myCameraInstance;
	std::unique_ptr<Zeph::Text> myInfoText;
	GrowingArray<Zeph::Instance*> myEntities{ourArraySize, ourArraySize, true};
	// The room index each entity stands in (-1: none), as ParseEntities found them.
	std::vector<int> myEntityRooms;
	GrowingArray<Zeph::Instance*> myLightGizmos{ourArraySize, ourArraySize, true};
	GrowingArray<Zeph::PointLightData> myEnvironmentPointLights{ourArraySize, ourArraySize, true};
	GrowingArray<Zeph::SpotLightData> myEnvironmentSpotLights{ourArraySize, ourArraySize, true};
	GrowingArray<Zeph::Room*> myRooms{ourArraySize, ourArraySize, true};
	GrowingArray<AI::NGNode> myNodes{ourArraySize, ourArraySize, true};
	GrowingArray<AI::NGEdge> myEdges{ourArraySize, ourArraySize, true};
	std::map<std::string, std::string> myEntityBank;
	std::map<std::string, bool> myEntityShadowCasterBank;
	std::map<std::string, DecalType> myDecalTypes;
	GrowingArray<Zeph::DecalData> myDecals{ourArraySize, ourArraySize, true};
	// What the sections of the loaded level's lights, path graph and decals held beside the
	// records in the arrays (src/level/KeptContent.h).
	KeptContent myKept;
	Zeph::Texture* myTexture = nullptr;
	Zeph::Texture* myNormTexture = nullptr;
	std::unique_ptr<Zeph::Instance> myDecalBox;
	std::unique_ptr<Zeph::Instance> myMarkedGizmo;
	std::unique_ptr<LightOverlays> myLightOverlays;
	LumoraMode myMode = LIGHT_MODE;
	bool mySceneFlag = false;
	FrameObserver myFrameObserver;
};
} // namespace Lumora
