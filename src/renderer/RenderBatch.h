#pragma once
// RenderBatch: every instance of one model surface queued in a frame, so that the
// model's buffers and effect are set up once and its instances drawn one after
// another, each with its world matrix, last frame's world matrix and its room.
// Skinned surfaces are batched the same way (SkinnedRenderBatch) in lists of their own.
// RenderBatchList: the batches of one list of the collector; it keeps its batches
// (and their storage) when it is emptied for the next frame.
//
//   RenderBatch* batch = list.Find(model, surface);     // null: no batch for it yet
//   if (batch == nullptr) batch = list.Append(model, surface);
//   batch->Add(world, previousWorld, roomData);
#include <memory>
#include <vector>

#include "core/GrowingArray.h"
#include "core/Matrix44.h"
#include "engine/RoomData.h"

namespace Zeph
{
class Model;
class Surface;

class RenderBatch
{
public:
	RenderBatch();
	RenderBatch(const RenderBatch&) = delete;
	RenderBatch& operator=(const RenderBatch&) = delete;

	// Starts the batch over for a source, keeping the storage.
	void Reset(const Model* aModel, const Surface* aSurface);
	void Add(const Matrix44<float>& aWorld, const Matrix44<float>& aPreviousWorld, const RoomData& aRoomData);

	const Model* GetModel() const { return myModel; }
	const Surface* GetSurface() const { return mySurface; }
	int GetCount() const { return myWorlds.Count(); }
	const Matrix44<float>& GetWorld(int anIndex) const { return myWorlds[anIndex]; }
	const Matrix44<float>& GetPreviousWorld(int anIndex) const { return myPreviousWorlds[anIndex]; }
	const RoomData& GetRoomData(int anIndex) const { return myRoomData[anIndex]; }
	int GetCapacity() const { return myWorlds.GetCapacity(); }

private:
	const Model* myModel = nullptr;
	const Surface* mySurface = nullptr; // the shared resource the batch is found by
	GrowingArray<Matrix44<float>> myWorlds;
	GrowingArray<Matrix44<float>> myPreviousWorlds;
	GrowingArray<RoomData> myRoomData;
};

// Skinned surfaces (surfaces of models with bones) batch the same way.
using SkinnedRenderBatch = RenderBatch;

class RenderBatchList
{
public:
	RenderBatch* Find(const Surface* aSurface) const;
	RenderBatch* Append(const Model* aModel, const Surface* aSurface);
	int Count() const { return myCount; }
	const RenderBatch& operator[](int anIndex) const { return *myBatches[static_cast<size_t>(anIndex)]; }
	// Batches made so far; Clear keeps them for the next frame.
	int GetCapacity() const { return static_cast<int>(myBatches.size()); }
	void Clear() { myCount = 0; }

private:
	std::vector<std::unique_ptr<RenderBatch>> myBatches;
	int myCount = 0;
};
} // namespace Zeph
