#pragma once
// RenderTargetCollector: what one frame draws, queued before the frame runs: the
// camera block and the instances of every model surface, grouped into batches per
// surface (so per model) in the lists their surface's render category names.
//
//   RenderTargetCollector& collector = engine->GetRenderer().GetRTC();
//   collector.SetCamera(camera);                     // once per frame, before rendering
//   instance->Render();                              // queues its surfaces here
//   engine->RenderScene();                           // draws and empties the lists
//
// Lists only grow; Reset empties them for the next frame and keeps their storage.
// The camera block survives Reset, which is what keeps last frame's view.
#include "core/Matrix44.h"
#include "engine/RoomData.h"
#include "model/Surface.h"
#include "renderer/RenderBatch.h"

namespace Zeph
{
class CameraInstance;
class Model;

class RenderTargetCollector
{
public:
	enum BatchListType
	{
		SHADOW_CASTING_LIST = 0,
		UNSHADOWED_LIST = 1,
		FORWARD_LIST = 2,
		OUTLINE_LIST = 3,
		BATCH_LIST_COUNT = 4,
	};

	// Previous view := view, then the camera's inverse projection, world matrix,
	// view, projection and far plane.
	void SetCamera(const CameraInstance& aCamera);
	float GetFarPlane() const { return myFarPlane; }
	const Matrix44<float>& GetCameraWorld() const { return myCameraWorld; }
	const Matrix44<float>& GetView() const { return myView; }
	const Matrix44<float>& GetPreviousView() const { return myPreviousView; }
	const Matrix44<float>& GetProjection() const { return myProjection; }
	const Matrix44<float>& GetInverseProjection() const { return myInverseProjection; }

	// Queues one instance of aSurface (of aModel): shadow casting (0), unshadowed
	// (1), forward (2), or shadow casting and outline (3).
	void AddInstance(RenderCategory aCategory, const Model& aModel, const Surface& aSurface,
	                 const Matrix44<float>& aWorld, const Matrix44<float>& aPreviousWorld,
	                 const RoomData& aRoomData);
	const RenderBatchList& GetBatches(BatchListType aList) const { return myBatchLists[aList]; }

	void Reset();

private:
	void AddToList(BatchListType aList, const Model& aModel, const Surface& aSurface,
	               const Matrix44<float>& aWorld, const Matrix44<float>& aPreviousWorld,
	               const RoomData& aRoomData);

	float myFarPlane = 0.0f;
	Matrix44<float> myCameraWorld;
	Matrix44<float> myView;
	Matrix44<float> myPreviousView;
	Matrix44<float> myProjection;
	Matrix44<float> myInverseProjection;
	RenderBatchList myBatchLists[BATCH_LIST_COUNT];
};
} // namespace Zeph
