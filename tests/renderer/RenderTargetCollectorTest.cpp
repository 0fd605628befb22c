// The collector without a GPU: batching per model surface, the lists of each
// render category and of skinned surfaces, the pass runners, light and decal lists
// and storage kept over Reset, the camera block.
#include <gtest/gtest.h>
#include <string>
#include <vector>

#include "engine/Camera.h"
#include "engine/CameraInstance.h"
#include "model/Model.h"
#include "model/VertexTypes.h"
#include "renderer/RenderTargetCollector.h"
#include "renderer/RenderTargetHelper.h"

namespace
{
using Collector = Zeph::RenderTargetCollector;

Matrix44<float> At(float anX)
{
	Matrix44<float> matrix;
	matrix.SetPosition({anX, 0.0f, 0.0f});
	return matrix;
}

Zeph::RoomData InRoom(int anIndex)
{
	Zeph::RoomData room;
	room.myRoomIndex = anIndex;
	return room;
}

// A model with one surface (no GPU objects; the collector only keeps pointers).
struct OneSurfaceModel
{
	OneSurfaceModel() { myModel.GetSurfaces().Add(Zeph::Surface()); }
	const Zeph::Surface& GetSurface() const { return myModel.GetSurfaces()[0]; }
	Zeph::Model myModel;
};
} // namespace

TEST(RenderTargetCollectorTest, InstancesOfOneModelShareABatch)
{
	OneSurfaceModel crate;
	OneSurfaceModel barrel;
	Collector collector;
	collector.AddInstance(Zeph::RENDER_CATEGORY_SHADOW_CASTING, crate.myModel, crate.GetSurface(), At(1),
	                      At(-1), InRoom(4));
	collector.AddInstance(Zeph::RENDER_CATEGORY_SHADOW_CASTING, barrel.myModel, barrel.GetSurface(), At(5),
	                      At(5), InRoom(0));
	collector.AddInstance(Zeph::RENDER_CATEGORY_SHADOW_CASTING, crate.myModel, crate.GetSurface(), At(2),
	                      At(-2), InRoom(6));

	const Zeph::RenderBatchList& batches = collector.GetBatches(Collector::SHADOW_CASTING_LIST);
	ASSERT_EQ(batches.Count(), 2);
	const Zeph::RenderBatch& crates = batches[0];
	EXPECT_EQ(crates.GetModel(), &crate.myModel);
	EXPECT_EQ(crates.GetSurface(), &crate.GetSurface());
	ASSERT_EQ(crates.GetCount(), 2);
	EXPECT_FLOAT_EQ(crates.GetWorld(0).GetPosition().x, 1.0f);
	EXPECT_FLOAT_EQ(crates.GetWorld(1).GetPosition().x, 2.0f);
	EXPECT_FLOAT_EQ(crates.GetPreviousWorld(0).GetPosition().x, -1.0f);
	EXPECT_FLOAT_EQ(crates.GetPreviousWorld(1).GetPosition().x, -2.0f);
	EXPECT_EQ(crates.GetRoomData(0).myRoomIndex, 4);
	EXPECT_EQ(crates.GetRoomData(1).myRoomIndex, 6);
	EXPECT_EQ(batches[1].GetModel(), &barrel.myModel);
	EXPECT_EQ(batches[1].GetCount(), 1);
}

TEST(RenderTargetCollectorTest, CategoriesAndSkinningPickTheLists)
{
	// Counts per list: shadow casting, its skinned list, unshadowed, its skinned list,
	// forward, outline, outline skinned.
	struct Case
	{
		Zeph::RenderCategory myCategory;
		bool mySkinnedFlag;
		int myCounts[Collector::BATCH_LIST_COUNT];
	};
	const Case cases[] = {
	    {Zeph::RENDER_CATEGORY_SHADOW_CASTING, false, {1, 0, 0, 0, 0, 0, 0}},
	    {Zeph::RENDER_CATEGORY_UNSHADOWED, false, {0, 0, 1, 0, 0, 0, 0}},
	    {Zeph::RENDER_CATEGORY_FORWARD, false, {0, 0, 0, 0, 1, 0, 0}},
	    {Zeph::RENDER_CATEGORY_SHADOW_CASTING_OUTLINE, false, {1, 0, 0, 0, 0, 1, 0}},
	    {Zeph::RENDER_CATEGORY_SHADOW_CASTING, true, {0, 1, 0, 0, 0, 0, 0}},
	    {Zeph::RENDER_CATEGORY_UNSHADOWED, true, {0, 0, 0, 1, 0, 0, 0}},
	    // The forward pass has no skinned list: the surface is not queued at all.
	    {Zeph::RENDER_CATEGORY_FORWARD, true, {0, 0, 0, 0, 0, 0, 0}},
	    {Zeph::RENDER_CATEGORY_SHADOW_CASTING_OUTLINE, true, {0, 1, 0, 0, 0, 0, 1}},
	};
	// Every vertex type with bones (weights and bones, with or without tangents) is skinned.
	const std::vector<int> staticTypes = {0, 1, 2, 3, 4};
	const std::vector<int> skinnedTypes = {5, 6, 7};
	for (const Case& test : cases)
	{
		for (int vertexType : test.mySkinnedFlag ? skinnedTypes : staticTypes)
		{
			OneSurfaceModel model;
			model.myModel.SetVertexType(vertexType);
			Collector collector;
			collector.AddInstance(test.myCategory, model.myModel, model.GetSurface(), At(0), At(0),
			                      InRoom(-1));
			for (int list = 0; list < Collector::BATCH_LIST_COUNT; ++list)
			{
				EXPECT_EQ(collector.GetBatches(static_cast<Collector::BatchListType>(list)).Count(),
				          test.myCounts[list])
				    << "category " << test.myCategory << ", vertex type " << vertexType << ", list " << list;
			}
		}
	}
}

TEST(RenderTargetCollectorTest, RunnersCallBeginEveryBatchThenEnd)
{
	// Records the calls a runner makes.
	struct Recorder : Zeph::RenderTargetHelper
	{
		void Begin(Zeph::RenderTargetCollector&) override { myCalls += "B"; }
		void End(Zeph::RenderTargetCollector&) override { myCalls += "E"; }
		void RenderAuxiliaryEntry(Zeph::RenderTargetCollector&) override { myCalls += "A"; }
		void Render(const Zeph::RenderBatch& aBatch) override
		{
			myCalls += "s" + std::to_string(aBatch.GetCount());
		}
		void RenderSkinned(const Zeph::SkinnedRenderBatch& aBatch) override
		{
			myCalls += "k" + std::to_string(aBatch.GetCount());
		}
		std::string myCalls;
	};
	OneSurfaceModel still;
	OneSurfaceModel skinned;
	skinned.myModel.SetVertexType(Zeph::VERTEX_TYPE_POS_WEIGHT_BONES_NORM_UV_TAN_BI);
	Collector collector;
	collector.AddInstance(Zeph::RENDER_CATEGORY_SHADOW_CASTING, still.myModel, still.GetSurface(), At(0),
	                      At(0), InRoom(-1));
	collector.AddInstance(Zeph::RENDER_CATEGORY_SHADOW_CASTING, still.myModel, still.GetSurface(), At(1),
	                      At(1), InRoom(-1));
	collector.AddInstance(Zeph::RENDER_CATEGORY_UNSHADOWED, skinned.myModel, skinned.GetSurface(), At(0),
	                      At(0), InRoom(-1));
	collector.AddInstance(Zeph::RENDER_CATEGORY_UNSHADOWED, still.myModel, still.GetSurface(), At(0), At(0),
	                      InRoom(-1));

	Recorder shadow;
	collector.RenderShadowCastingStatic(shadow);
	EXPECT_EQ(shadow.myCalls, "ABs2E") << "the shadow-casting runner calls the auxiliary-entry hook first";
	Recorder unshadowed;
	collector.RenderUnshadowed(unshadowed);
	EXPECT_EQ(unshadowed.myCalls, "Bs1k1E") << "static batches, then skinned ones";
	Recorder forward;
	collector.RenderForward(forward);
	EXPECT_EQ(forward.myCalls, "BE") << "an empty list still begins and ends its pass";
}

TEST(RenderTargetCollectorTest, ResetEmptiesEveryListAndTheNextFrameReusesTheBatches)
{
	OneSurfaceModel first;
	OneSurfaceModel second;
	Collector collector;
	for (int instance = 0; instance < 150; ++instance)
	{
		collector.AddInstance(Zeph::RENDER_CATEGORY_UNSHADOWED, first.myModel, first.GetSurface(),
		                      At(static_cast<float>(instance)), At(0), InRoom(-1));
	}
	collector.AddInstance(Zeph::RENDER_CATEGORY_UNSHADOWED, second.myModel, second.GetSurface(), At(0), At(0),
	                      InRoom(-1));
	const Zeph::RenderBatchList& list = collector.GetBatches(Collector::UNSHADOWED_LIST);
	ASSERT_EQ(list[0].GetCount(), 150);
	EXPECT_FLOAT_EQ(list[0].GetWorld(149).GetPosition().x, 149.0f);
	// Lights and decals past their lists' first capacity; a decal's name is copied with it.
	for (int index = 0; index < 1001; ++index)
	{
		Zeph::PointLightData point;
		point.myFalloff = static_cast<float>(index);
		collector.AddPointLight(point);
		Zeph::DecalData record;
		record.myTypeId = "type" + std::to_string(index);
		collector.AddDecal(record);
	}
	EXPECT_FLOAT_EQ(collector.GetPointLights()[1000].myFalloff, 1000.0f);
	EXPECT_EQ(collector.GetDecals()[1000].myTypeId, "type1000");
	struct Effect : Zeph::AuxiliaryEffect
	{
		void Render() override {}
	} effect;
	collector.AddAuxiliary(&effect);
	collector.SetAuxiliaryEntry({&effect, nullptr});

	const int lightCapacity = collector.GetPointLights().GetCapacity();
	collector.Reset();
	EXPECT_EQ(list.Count(), 0);
	EXPECT_EQ(collector.GetPointLights().Count() + collector.GetDecals().Count(), 0);
	EXPECT_EQ(collector.GetAuxiliaryList().Count(), 0);
	EXPECT_TRUE(collector.GetAuxiliaryEntry().IsEmpty());
	EXPECT_EQ(collector.GetPointLights().GetCapacity(), lightCapacity) << "Reset keeps the storage";

	// The next frame reuses the batches: the first one keeps its room for the 150.
	collector.AddInstance(Zeph::RENDER_CATEGORY_UNSHADOWED, second.myModel, second.GetSurface(), At(3), At(3),
	                      InRoom(-1));
	ASSERT_EQ(list.Count(), 1);
	EXPECT_EQ(list[0].GetModel(), &second.myModel);
	EXPECT_EQ(list[0].GetCount(), 1);
	EXPECT_GE(list[0].GetCapacity(), 150);
	EXPECT_FLOAT_EQ(list[0].GetWorld(0).GetPosition().x, 3.0f);
}

TEST(RenderTargetCollectorTest, CameraBlockKeepsTheLastView)
{
	Collector collector;
	Zeph::Camera lens(16.0f / 9.0f);
	Zeph::CameraInstance camera(&lens);
	collector.SetCamera(camera);
	const Matrix44<float> firstView = camera.GetView();
	camera.SetPosition({3.0f, 1.0f, -2.0f});
	collector.SetCamera(camera);

	// The previous view is the first camera's; the inverse projection undoes the projection.
	const Matrix44<float> product = collector.GetProjection() * collector.GetInverseProjection();
	const Matrix44<float> identity;
	for (int i = 0; i < 16; ++i)
	{
		EXPECT_FLOAT_EQ(collector.GetPreviousView().myMatrix[i], firstView.myMatrix[i]);
		EXPECT_NEAR(product.myMatrix[i], identity.myMatrix[i], 1e-5f) << "element " << i;
	}
}
