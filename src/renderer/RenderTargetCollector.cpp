#include "renderer/RenderTargetCollector.h"

#include <algorithm>
#include <cmath>

#include "core/Vector4.h"

#include "engine/CameraInstance.h"
#include "model/Model.h"
#include "model/VertexTypes.h"
#include "renderer/RenderTargetHelper.h"

namespace Zeph
{
namespace
{
// Skinned surfaces are those of models with bones, whichever vertex type carries them.
bool IsSkinned(const Model& aModel)
{
	return HasBones(aModel.GetVertexType());
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
	myFrustum.Init(myView * myProjection);
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
			// Skinned bounds move with the pose: never culled.
			aHelper.RenderSkinned(batches[index]);
		}
		else if (const RenderBatch* visible = VisiblePart(batches[index]))
		{
			aHelper.Render(*visible);
		}
	}
}

const RenderBatch* RenderTargetCollector::VisiblePart(const RenderBatch& aBatch)
{
	const Intersection::Sphere& bounds = aBatch.GetModel()->GetLocalBounds();
	if (!myViewCullingFlag || bounds.myRadius < 0.0f)
	{
		return &aBatch;
	}
	const auto isCulled = [&](int anInstance) {
		const Matrix44<float>& world = aBatch.GetWorld(anInstance);
		const float* m = world.myMatrix;
		const Vector4<float> centre =
		    Vector4<float>(bounds.myPosition.x, bounds.myPosition.y, bounds.myPosition.z, 1.0f) * world;
		// The longest axis scales the radius (worlds may scale unevenly).
		const float scale = std::sqrt(
		    std::max({m[0] * m[0] + m[1] * m[1] + m[2] * m[2], m[4] * m[4] + m[5] * m[5] + m[6] * m[6],
		              m[8] * m[8] + m[9] * m[9] + m[10] * m[10]}));
		return IsCulled(Vector3<float>(centre.x, centre.y, centre.z), bounds.myRadius * scale);
	};
	int culled = 0;
	for (int instance = 0; instance < aBatch.GetCount(); ++instance)
	{
		culled += isCulled(instance) ? 1 : 0;
	}
	myCulledInstanceCount += culled;
	if (culled == 0)
	{
		return &aBatch;
	}
	if (culled == aBatch.GetCount())
	{
		return nullptr;
	}
	myVisibleBatch.Reset(aBatch.GetModel(), aBatch.GetSurface());
	for (int instance = 0; instance < aBatch.GetCount(); ++instance)
	{
		if (!isCulled(instance))
		{
			myVisibleBatch.Add(aBatch.GetWorld(instance), aBatch.GetPreviousWorld(instance),
			                   aBatch.GetRoomData(instance));
		}
	}
	return &myVisibleBatch;
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
