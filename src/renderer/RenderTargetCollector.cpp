#include "renderer/RenderTargetCollector.h"

#include "engine/CameraInstance.h"

namespace Zeph
{
void RenderTargetCollector::SetCamera(const CameraInstance& aCamera)
{
	myPreviousView = myView;
	myInverseProjection = aCamera.GetProjection().Inverse();
	myCameraWorld = aCamera.GetActualOrientation();
	myView = aCamera.GetView();
	myProjection = aCamera.GetProjection();
	myFarPlane = aCamera.GetFarPlane();
}

void RenderTargetCollector::AddInstance(RenderCategory aCategory, const Model& aModel,
                                        const Surface& aSurface, const Matrix44<float>& aWorld,
                                        const Matrix44<float>& aPreviousWorld, const RoomData& aRoomData)
{
	switch (aCategory)
	{
	case RENDER_CATEGORY_SHADOW_CASTING:
		AddToList(SHADOW_CASTING_LIST, aModel, aSurface, aWorld, aPreviousWorld, aRoomData);
		break;
	case RENDER_CATEGORY_UNSHADOWED:
		AddToList(UNSHADOWED_LIST, aModel, aSurface, aWorld, aPreviousWorld, aRoomData);
		break;
	case RENDER_CATEGORY_FORWARD:
		AddToList(FORWARD_LIST, aModel, aSurface, aWorld, aPreviousWorld, aRoomData);
		break;
	case RENDER_CATEGORY_SHADOW_CASTING_OUTLINE:
		AddToList(SHADOW_CASTING_LIST, aModel, aSurface, aWorld, aPreviousWorld, aRoomData);
		AddToList(OUTLINE_LIST, aModel, aSurface, aWorld, aPreviousWorld, aRoomData);
		break;
	}
}

void RenderTargetCollector::AddToList(BatchListType aList, const Model& aModel, const Surface& aSurface,
                                      const Matrix44<float>& aWorld, const Matrix44<float>& aPreviousWorld,
                                      const RoomData& aRoomData)
{
	RenderBatchList& list = myBatchLists[aList];
	RenderBatch* batch = list.Find(&aSurface);
	if (batch == nullptr)
	{
		batch = list.Append(&aModel, &aSurface);
	}
	batch->Add(aWorld, aPreviousWorld, aRoomData);
}

void RenderTargetCollector::Reset()
{
	for (RenderBatchList& list : myBatchLists)
	{
		list.Clear();
	}
}
} // namespace Zeph
