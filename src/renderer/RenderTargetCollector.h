#pragma once
// RenderTargetCollector: what one frame draws, queued before the frame runs: the
// camera block; the point lights, spot lights and decals; and the instances of every
// model surface, grouped into batches per surface (so per model) in the lists their
// surface's render category names, skinned surfaces in lists of their own.
//
//   RenderTargetCollector& collector = engine->GetRenderer().GetRTC();
//   collector.SetCamera(camera);                     // once per frame, before rendering
//   instance->Render();                              // queues its surfaces here
//   collector.AddPointLight(light);                  // lights and decals are copied
//   engine->RenderScene();                           // draws and empties the lists
//
// Lists only grow (lights by 100, decals by 1000); Reset empties them for the next
// frame and keeps their storage. The camera block survives Reset, which is what
// keeps last frame's view. Each pass runner calls a helper's Begin, its batch
// operation for every batch of the list(s), then End.
//
// With view culling on, the runners skip static instances whose bounds lie wholly
// outside the camera's frustum and the light passes skip lights the same way; the
// probe captures turn it on (six narrow views of a whole level each).
#include "core/Frustum.h"
#include "core/GrowingArray.h"
#include "core/Matrix44.h"
#include "engine/RoomData.h"
#include "model/Surface.h"
#include "renderer/DecalData.h"
#include "renderer/PointLightData.h"
#include "renderer/RenderBatch.h"
#include "renderer/SpotLightData.h"

namespace Zeph
{
class CameraInstance;
class Model;
class RenderTargetHelper;

// An effect object that an instance node carries as a second attachment; the
// standard helper draws the collector's list of them after the post chain.
class AuxiliaryEffect
{
public:
	virtual ~AuxiliaryEffect() = default;
	virtual void Render() = 0;
};

class RenderTargetCollector
{
public:
	enum BatchListType
	{
		SHADOW_CASTING_LIST = 0,
		SHADOW_CASTING_SKINNED_LIST,
		UNSHADOWED_LIST,
		UNSHADOWED_SKINNED_LIST,
		FORWARD_LIST,
		OUTLINE_LIST,
		OUTLINE_SKINNED_LIST,
		BATCH_LIST_COUNT,
	};

	// The auxiliary entry: two pointer-sized values, zero unless set.
	struct AuxiliaryEntry
	{
		void* myFirst = nullptr;
		void* mySecond = nullptr;
		bool IsEmpty() const { return myFirst == nullptr && mySecond == nullptr; }
	};

	RenderTargetCollector();

	// Previous view := view, then the camera's inverse projection, world matrix,
	// view, projection and far plane.
	void SetCamera(const CameraInstance& aCamera);
	float GetFarPlane() const { return myFarPlane; }
	const Matrix44<float>& GetCameraWorld() const { return myCameraWorld; }
	const Matrix44<float>& GetView() const { return myView; }
	const Matrix44<float>& GetPreviousView() const { return myPreviousView; }
	const Matrix44<float>& GetProjection() const { return myProjection; }
	const Matrix44<float>& GetInverseProjection() const { return myInverseProjection; }

	void SetViewCullingFlag(bool aFlag) { myViewCullingFlag = aFlag; }
	bool GetViewCullingFlag() const { return myViewCullingFlag; }
	// True when view culling is on and the sphere lies wholly outside the camera's view.
	bool IsCulled(const Vector3<float>& aCentre, float aRadius) const
	{
		return myViewCullingFlag && aRadius >= 0.0f && myFrustum.IsSphereOutside(aCentre, aRadius);
	}
	// Static instances the runners have culled, in all (a statistic; Reset keeps it).
	int GetCulledInstanceCount() const { return myCulledInstanceCount; }

	void AddPointLight(const PointLightData& aLight) { myPointLights.Add(aLight); }
	void AddSpotLight(const SpotLightData& aLight) { mySpotLights.Add(aLight); }
	void AddDecal(const DecalData& aDecal) { myDecals.Add(aDecal); }
	void AddMeshDecal(const DecalData& aDecal) { myMeshDecals.Add(aDecal); }
	void AddAuxiliary(AuxiliaryEffect* anEffect);
	void SetAuxiliaryEntry(const AuxiliaryEntry& anEntry) { myAuxiliaryEntry = anEntry; }

	const GrowingArray<PointLightData>& GetPointLights() const { return myPointLights; }
	const GrowingArray<SpotLightData>& GetSpotLights() const { return mySpotLights; }
	const GrowingArray<DecalData>& GetDecals() const { return myDecals; }
	const GrowingArray<DecalData>& GetMeshDecals() const { return myMeshDecals; }
	const GrowingArray<AuxiliaryEffect*>& GetAuxiliaryList() const { return myAuxiliaryList; }
	const AuxiliaryEntry& GetAuxiliaryEntry() const { return myAuxiliaryEntry; }

	// Queues one instance of aSurface (of aModel) by its category: shadow casting
	// (0), unshadowed (1), forward (2; static surfaces only, a skinned one is not
	// queued), or shadow casting and outline (3). A skinned surface (its model has
	// bones) goes to the skinned list of the pair.
	void AddInstance(RenderCategory aCategory, const Model& aModel, const Surface& aSurface,
	                 const Matrix44<float>& aWorld, const Matrix44<float>& aPreviousWorld,
	                 const RoomData& aRoomData);
	const RenderBatchList& GetBatches(BatchListType aList) const { return myBatchLists[aList]; }

	// The pass runners: Begin, every batch of the list(s), End.
	void RenderShadowCastingStatic(RenderTargetHelper& aHelper);
	void RenderShadowCastingSkinned(RenderTargetHelper& aHelper);
	void RenderUnshadowed(RenderTargetHelper& aHelper);
	void RenderForward(RenderTargetHelper& aHelper);
	void RenderOutline(RenderTargetHelper& aHelper);

	// Every count to zero (the auxiliary list's too) and the auxiliary entry cleared;
	// storage stays allocated.
	void Reset();

private:
	void AddToList(BatchListType aList, const Model& aModel, const Surface& aSurface,
	               const Matrix44<float>& aWorld, const Matrix44<float>& aPreviousWorld,
	               const RoomData& aRoomData);
	void RunBatches(RenderTargetHelper& aHelper, BatchListType aList, bool aSkinnedFlag);
	// The batch's instances inside the view, or the batch itself when none is culled;
	// null when all are.
	const RenderBatch* VisiblePart(const RenderBatch& aBatch);

	float myFarPlane = 0.0f;
	Matrix44<float> myCameraWorld;
	Matrix44<float> myView;
	Matrix44<float> myPreviousView;
	Matrix44<float> myProjection;
	Matrix44<float> myInverseProjection;
	GrowingArray<PointLightData> myPointLights;
	GrowingArray<SpotLightData> mySpotLights;
	GrowingArray<DecalData> myDecals;
	GrowingArray<DecalData> myMeshDecals;
	RenderBatchList myBatchLists[BATCH_LIST_COUNT];
	GrowingArray<AuxiliaryEffect*> myAuxiliaryList;
	AuxiliaryEntry myAuxiliaryEntry;
	Intersection::Frustum myFrustum;
	bool myViewCullingFlag = false;
	int myCulledInstanceCount = 0;
	RenderBatch myVisibleBatch;
};
} // namespace Zeph
