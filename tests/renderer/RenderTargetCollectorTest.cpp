// The collector without a GPU: batching per model surface, the lists of each
// render category, storage kept over Reset, the camera block.
#include <gtest/gtest.h>

#include "engine/Camera.h"
#include "engine/CameraInstance.h"
#include "model/Model.h"
#include "renderer/RenderTargetCollector.h"

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

TEST(RenderTargetCollectorTest, CategoriesPickTheLists)
{
	struct Case
	{
		Zeph::RenderCategory myCategory;
		int myCounts[Collector::BATCH_LIST_COUNT]; // shadow casting, unshadowed, forward, outline
	};
	const Case cases[] = {
	    {Zeph::RENDER_CATEGORY_SHADOW_CASTING, {1, 0, 0, 0}},
	    {Zeph::RENDER_CATEGORY_UNSHADOWED, {0, 1, 0, 0}},
	    {Zeph::RENDER_CATEGORY_FORWARD, {0, 0, 1, 0}},
	    {Zeph::RENDER_CATEGORY_SHADOW_CASTING_OUTLINE, {1, 0, 0, 1}},
	};
	OneSurfaceModel model;
	for (const Case& test : cases)
	{
		Collector collector;
		collector.AddInstance(test.myCategory, model.myModel, model.GetSurface(), At(0), At(0), InRoom(-1));
		for (int list = 0; list < Collector::BATCH_LIST_COUNT; ++list)
		{
			EXPECT_EQ(collector.GetBatches(static_cast<Collector::BatchListType>(list)).Count(),
			          test.myCounts[list])
			    << "category " << test.myCategory << ", list " << list;
		}
	}
}

TEST(RenderTargetCollectorTest, ResetEmptiesTheListsAndKeepsTheirStorage)
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
	EXPECT_EQ(list[0].GetCapacity(), 200) << "the per-instance arrays grow by 100";

	collector.Reset();
	EXPECT_EQ(list.Count(), 0);
	EXPECT_EQ(list.GetCapacity(), 2);

	// The next frame reuses the batches: the first one still has room for 200.
	collector.AddInstance(Zeph::RENDER_CATEGORY_UNSHADOWED, second.myModel, second.GetSurface(), At(3), At(3),
	                      InRoom(-1));
	ASSERT_EQ(list.Count(), 1);
	EXPECT_EQ(list[0].GetModel(), &second.myModel);
	EXPECT_EQ(list[0].GetCount(), 1);
	EXPECT_EQ(list[0].GetCapacity(), 200);
	EXPECT_FLOAT_EQ(list[0].GetWorld(0).GetPosition().x, 3.0f);
}

TEST(RenderTargetCollectorTest, CameraBlockKeepsTheLastView)
{
	Collector collector;
	const Matrix44<float> identity;
	for (int i = 0; i < 16; ++i)
	{
		EXPECT_EQ(collector.GetView().myMatrix[i], identity.myMatrix[i]);
		EXPECT_EQ(collector.GetInverseProjection().myMatrix[i], identity.myMatrix[i]);
	}
	Zeph::Camera lens(16.0f / 9.0f);
	Zeph::CameraInstance camera(&lens);
	collector.SetCamera(camera);
	const Matrix44<float> firstView = camera.GetView();
	camera.SetPosition({3.0f, 1.0f, -2.0f});
	collector.SetCamera(camera);

	EXPECT_FLOAT_EQ(collector.GetFarPlane(), lens.GetFarPlane());
	for (int i = 0; i < 16; ++i)
	{
		EXPECT_FLOAT_EQ(collector.GetPreviousView().myMatrix[i], firstView.myMatrix[i]);
		EXPECT_FLOAT_EQ(collector.GetView().myMatrix[i], camera.GetView().myMatrix[i]);
		EXPECT_FLOAT_EQ(collector.GetCameraWorld().myMatrix[i], camera.GetActualOrientation().myMatrix[i]);
		EXPECT_FLOAT_EQ(collector.GetProjection().myMatrix[i], camera.GetProjection().myMatrix[i]);
	}
	// The inverse projection undoes the projection.
	const Matrix44<float> product = collector.GetProjection() * collector.GetInverseProjection();
	for (int i = 0; i < 16; ++i)
	{
		EXPECT_NEAR(product.myMatrix[i], identity.myMatrix[i], 1e-5f) << "element " << i;
	}
}
