#include "renderer/RenderBatch.h"

namespace Zeph
{
RenderBatch::RenderBatch()
    : myWorlds(100, 100, false), myPreviousWorlds(100, 100, false), myRoomData(100, 100)
{
}

void RenderBatch::Reset(const Model* aModel, const Surface* aSurface)
{
	myModel = aModel;
	mySurface = aSurface;
	myWorlds.RemoveAll();
	myPreviousWorlds.RemoveAll();
	myRoomData.RemoveAll();
}

void RenderBatch::Add(const Matrix44<float>& aWorld, const Matrix44<float>& aPreviousWorld,
                      const RoomData& aRoomData)
{
	myWorlds.Add(aWorld);
	myPreviousWorlds.Add(aPreviousWorld);
	myRoomData.Add(aRoomData);
}

RenderBatch* RenderBatchList::Find(const Surface* aSurface) const
{
	for (int index = 0; index < myCount; ++index)
	{
		if (myBatches[static_cast<size_t>(index)]->GetSurface() == aSurface)
		{
			return myBatches[static_cast<size_t>(index)].get();
		}
	}
	return nullptr;
}

RenderBatch* RenderBatchList::Append(const Model* aModel, const Surface* aSurface)
{
	if (static_cast<size_t>(myCount) == myBatches.size())
	{
		myBatches.push_back(std::make_unique<RenderBatch>());
	}
	RenderBatch* batch = myBatches[static_cast<size_t>(myCount)].get();
	++myCount;
	batch->Reset(aModel, aSurface);
	return batch;
}
} // namespace Zeph
