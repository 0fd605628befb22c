#include "renderer/RenderTargetCollector.h"

#include "engine/CameraInstance.h"
#include "model/Model.h"
#include "model/VertexTypes.h"
#include "renderer/RenderTargetHelper.h"

namespace Zeph
{
namespace
{
bool IsSkinned(const Model& aModel)
{
	return aModel.GetVertexType() == VERTEX_TYPE_POS_WEIGHT_BONES_NORM_UV_TAN ||
	       aModel.GetVertexType() == VERTEX_TYPE_POS_WEIGHT_BONES_NORM_UV_TAN_BI;
}
} // namespace

RenderTargetCollector::RenderTargetCollector()
    : myPointLights(100, 100, false), mySpotLights(100, 100, false), myDecals(1000, 1000),
      myMeshDecals(1000, 1000), myAuxiliaryList(100, 100, false)
{
}

void RenderTargetCollector::SetCamera(const CameraInstance& aCamera)
{
	myPreviousView = myView;
	myInverseProjection = aCamera.GetProjection().Inverse();
	myCameraWorld = aCamera.GetActualOrientation();
	myView = aCamera.GetView();
	myProjection = aCamera.GetProjection();
	myFarPlane = aCamera.GetFarPlane();
}

void RenderTargetCollector::AddAuxiliary(AuxiliaryEffect* anEffect)
{
	if (anEffect != nullptr)
	{
		myAuxiliaryList.Add(anEffect);
	}
}

void RenderTargetCollector::AddInstance(RenderCategory aCategory, const Model& aModel,
                                        const Surface& aSurface, const Matrix44<float>& aWorld,
                                        const Matrix44<float>& aPreviousWorld, const RoomData& aRoomData)
{
	const bool skinned = IsSkinned(aModel);
	const BatchListType shadowCasting = skinned ? SHADOW_CASTING_SKINNED_LIST : SHADOW_CASTING_LIST;
	switch (aCategory)
	{
	case RENDER_CATEGORY_SHADOW_CASTING:
		AddToList(shadowCasting, aModel, aSurface, aWorld, aPreviousWorld, aRoomData);
		break;
	case RENDER_CATEGORY_UNSHADOWED:
		AddToList(skinned ? UNSHADOWED_SKINNED_LIST : UNSHADOWED_LIST, aModel, aSurface, aWorld,
		          aPreviousWorld, aRoomData);
		break;
	case RENDER_CATEGORY_FORWARD:
		// The forward pass has no skinned list: a skinned forward surface is not drawn.
		if (!skinned)
		{
			AddToList(FORWARD_LIST, aModel, aSurface, aWorld, aPreviousWorld, aRoomData);
		}
		break;
	case RENDER_CATEGORY_SHADOW_CASTING_OUTLINE:
		AddToList(shadowCasting, aModel, aSurface, aWorld, aPreviousWorld, aRoomData);
		AddToList(skinned ? OUTLINE_SKINNED_LIST : OUTLINE_LIST, aModel, aSurface, aWorld, aPreviousWorld,
		          aRoomData);
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

void RenderTargetCollector::RunBatches(RenderTargetHelper& aHelper, BatchListType aList, bool aSkinnedFlag)
{
	const RenderBatchList& batches = myBatchLists[aList];
	for (int index = 0; index < batches.Count(); ++index)
	{
		if (aSkinnedFlag)
		{
			aHelper.RenderSkinned(batches[index]);
		}
		else
		{
			aHelper.Render(batches[index]);
		}
	}
}

void RenderTargetCollector::RenderShadowCastingStatic(RenderTargetHelper& aHelper)
{
	aHelper.RenderAuxiliaryEntry(*this);
	aHelper.Begin(*this);
	RunBatches(aHelper, SHADOW_CASTING_LIST, false);
	aHelper.End(*this);
}

void RenderTargetCollector::RenderShadowCastingSkinned(RenderTargetHelper& aHelper)
{
	aHelper.RenderAuxiliaryEntry(*this);
	aHelper.Begin(*this);
	RunBatches(aHelper, SHADOW_CASTING_SKINNED_LIST, true);
	aHelper.End(*this);
}

void RenderTargetCollector::RenderUnshadowed(RenderTargetHelper& aHelper)
{
	aHelper.Begin(*this);
	RunBatches(aHelper, UNSHADOWED_LIST, false);
	RunBatches(aHelper, UNSHADOWED_SKINNED_LIST, true);
	aHelper.End(*this);
}

void RenderTargetCollector::RenderForward(RenderTargetHelper& aHelper)
{
	aHelper.Begin(*this);
	RunBatches(aHelper, FORWARD_LIST, false);
	aHelper.End(*this);
}

void RenderTargetCollector::RenderOutline(RenderTargetHelper& aHelper)
{
	aHelper.Begin(*this);
	RunBatches(aHelper, OUTLINE_LIST, false);
	RunBatches(aHelper, OUTLINE_SKINNED_LIST, true);
	aHelper.End(*this);
}

void RenderTargetCollector::Reset()
{
	for (RenderBatchList& list : myBatchLists)
	{
		list.Clear();
	}
	myPointLights.RemoveAll();
	mySpotLights.RemoveAll();
	myDecals.RemoveAll();
	myMeshDecals.RemoveAll();
	myAuxiliaryList.RemoveAll();
	myAuxiliaryEntry = AuxiliaryEntry();
}
} // namespace Zeph
