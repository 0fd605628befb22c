// The collector without a GPU: batching per model surface, the lists of each
// render category and of skinned surfaces, the pass runners, light and decal lists
// and storage kept over Reset. The camera block is in every lit golden frame.
#include <gtest/gtest.h>
#include <string>
#include <vector>

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
	// One instance at x = anX that has not moved, in no room.
	void AddTo(Zeph::RenderTargetCollector& aCollector, Zeph::RenderCategory aCategory,
	           float anX = 0.0f) const
	{
		aCollector.AddInstance(aCategory, myModel, GetSurface(), At(anX), At(anX), InRoom(-1));
	}
	Zeph::Model myModel;
};
} // namespace

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
	// Every vertex type with bones (5 to 7: weights and bones, with or without tangents) is skinned.
	for (const Case& test : cases)
	{
		for (int vertexType = test.mySkinnedFlag ? 5 : 0; vertexType < (test.mySkinnedFlag ? 8 : 5);
		     ++vertexType)
		{
			OneSurfaceModel model;
			model.myModel.SetVertexType(vertexType);
			Collector collector;
			model.AddTo(collector, test.myCategory);
			std::vector<int> counts;
			for (int list = 0; list < Collector::BATCH_LIST_COUNT; ++list)
			{
				counts.push_back(collector.GetBatches(static_cast<Collector::BatchListType>(list)).Count());
			}
			EXPECT_EQ(counts, std::vector<int>(test.myCounts, std::end(test.myCounts)))
			    << "category " << test.myCategory << ", vertex type " << vertexType;
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
	still.AddTo(collector, Zeph::RENDER_CATEGORY_SHADOW_CASTING);
	still.AddTo(collector, Zeph::RENDER_CATEGORY_SHADOW_CASTING, 1.0f);
	skinned.AddTo(collector, Zeph::RENDER_CATEGORY_UNSHADOWED);
	still.AddTo(collector, Zeph::RENDER_CATEGORY_UNSHADOWED);

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

TEST(RenderTargetCollectorTest, InstancesOfOneModelShareABatchAndResetEmptiesTheListsForTheNextFrame)
{
	OneSurfaceModel first;
	OneSurfaceModel second;
	Collector collector;
	for (int instance = 0; instance < 150; ++instance)
	{
		collector.AddInstance(Zeph::RENDER_CATEGORY_UNSHADOWED, first.myModel, first.GetSurface(),
		                      At(static_cast<float>(instance)), At(-instance), InRoom(instance));
		if (instance == 1)
		{
			second.AddTo(collector, Zeph::RENDER_CATEGORY_UNSHADOWED);
		}
	}
	const Zeph::RenderBatchList& list = collector.GetBatches(Collector::UNSHADOWED_LIST);
	ASSERT_EQ(list.Count(), 2);
	ASSERT_EQ(list[0].GetCount(), 150);
	EXPECT_EQ(list[1].GetModel(), &second.myModel);
	EXPECT_EQ(list[1].GetCount(), 1);
	const Zeph::RenderBatch& batch = list[0];
	EXPECT_EQ(
	    (std::vector<float>{batch.GetWorld(149).GetPosition().x, batch.GetPreviousWorld(149).GetPosition().x,
	                        static_cast<float>(batch.GetRoomData(149).myRoomIndex)}),
	    (std::vector<float>{149.0f, -149.0f, 149.0f}));
	// Lights, decals (past their list's first capacity, each name copied with it) and auxiliary
	// effects go with Reset.
	collector.AddPointLight({});
	for (int index = 0; index < 1001; ++index)
	{
		Zeph::DecalData record;
		record.myTypeId = "type" + std::to_string(index);
		collector.AddDecal(record);
	}
	EXPECT_EQ(collector.GetDecals()[1000].myTypeId, "type1000");
	struct Effect : Zeph::AuxiliaryEffect
	{
		void Render() override {}
	} effect;
	collector.AddAuxiliary(&effect);
	collector.SetAuxiliaryEntry({&effect, nullptr});
	collector.Reset();
	EXPECT_EQ(list.Count() + collector.GetPointLights().Count() + collector.GetDecals().Count() +
	              collector.GetAuxiliaryList().Count(),
	          0);
	EXPECT_TRUE(collector.GetAuxiliaryEntry().IsEmpty());

	// The next frame reuses the batches: the first one keeps its room for the 150.
	second.AddTo(collector, Zeph::RENDER_CATEGORY_UNSHADOWED, 3.0f);
	ASSERT_EQ(list.Count(), 1);
	EXPECT_EQ(list[0].GetModel(), &second.myModel);
	EXPECT_EQ(list[0].GetCount(), 1);
	EXPECT_GE(list[0].GetCapacity(), 150);
	EXPECT_FLOAT_EQ(list[0].GetWorld(0).GetPosition().x, 3.0f);
}
