#pragma once
// GrowingArray: the one sequence container of the engine and the editor.
//
// Elements live contiguously by value in one array-new'd block that grows by a
// fixed step chosen by the owner (never by doubling) and never shrinks.
// Removal swaps the last element into the hole. Counts, capacity and indices are
// of CountType (always unsigned short in this codebase), so an array holds at
// most 65,535 elements; an Add past that is a critical report in every build.
// The array owns its storage; it owns the objects behind pointer elements only
// when its owner calls DeleteAll.
//
// Debug builds assert on out-of-range access, on Last/RemoveLast of an empty
// array and on a ReSize below the count. Release builds check nothing on the
// hot paths.

#include <cassert>
#include <cstddef>
#include <cstring>
#include <functional>
#include <limits>
#include <type_traits>

#include "core/CoreReport.h"

namespace GrowingArrayDetail
{
// Reports an Add that would pass the counter's range as a critical error.
// Lives out of line so this header needs no log.
void ReportCapacityOverflow(int aRequestedCount, int aLimit);
}

template <typename T, typename CountType = unsigned short>
class GrowingArray
{
public:
	GrowingArray(int aNrOfRecommendedItems, int anItemIncreaseSize, bool aUseSafeModeFlag = true)
	{
		myData = nullptr;
		Init(aNrOfRecommendedItems, anItemIncreaseSize, aUseSafeModeFlag);
	}

	~GrowingArray()
	{
		delete[] myData;
		myData = nullptr;
		myMaxNrOfItems = 0;
		myCurNrOfItems = 0;
		myItemIncreaseSize = 0;
		myUseSafeModeFlag = false;
	}

	GrowingArray(const GrowingArray&) = delete;
	GrowingArray& operator=(const GrowingArray&) = delete;

	// For an array without storage (after construction use ReInit instead).
	void Init(int aNrOfRecommendedItems, int anItemIncreaseSize, bool aUseSafeModeFlag = true)
	{
		assert(myData == nullptr && "GrowingArray::Init on an array that has storage; use ReInit");
		myMaxNrOfItems = static_cast<CountType>(aNrOfRecommendedItems);
		myItemIncreaseSize = static_cast<CountType>(anItemIncreaseSize);
		myCurNrOfItems = 0;
		myUseSafeModeFlag = aUseSafeModeFlag;
		myData = new T[myMaxNrOfItems];
	}

	void ReInit(int aNrOfRecommendedItems, int anItemIncreaseSize, bool aUseSafeModeFlag = true)
	{
		delete[] myData;
		myData = nullptr;
		Init(aNrOfRecommendedItems, anItemIncreaseSize, aUseSafeModeFlag);
	}

	T& operator[](const int& anIndex)
	{
		assert(static_cast<CountType>(anIndex) < myCurNrOfItems && "GrowingArray index out of range");
		return myData[static_cast<CountType>(anIndex)];
	}

	const T& operator[](const int& anIndex) const
	{
		assert(static_cast<CountType>(anIndex) < myCurNrOfItems && "GrowingArray index out of range");
		return myData[static_cast<CountType>(anIndex)];
	}

	T& Last()
	{
		assert(myCurNrOfItems > 0 && "GrowingArray::Last on an empty array");
		return myData[myCurNrOfItems - 1];
	}

	const T& Last() const
	{
		assert(myCurNrOfItems > 0 && "GrowingArray::Last on an empty array");
		return myData[myCurNrOfItems - 1];
	}

	void Add(const T& anObject)
	{
		// The common case stays small enough to inline into the caller's loop;
		// growth is rare and lives out of line.
		if (myCurNrOfItems == myMaxNrOfItems) [[unlikely]]
		{
			GrowAndAdd(anObject);
			return;
		}
		myData[myCurNrOfItems] = anObject;
		++myCurNrOfItems;
	}

	void RemoveLast()
	{
		assert(myCurNrOfItems > 0 && "GrowingArray::RemoveLast on an empty array");
		--myCurNrOfItems;
	}

	void RemoveCyclicAtIndex(int anItemNumber)
	{
		const CountType index = static_cast<CountType>(anItemNumber);
		assert(index < myCurNrOfItems && "GrowingArray::RemoveCyclicAtIndex out of range");
		myData[index] = myData[myCurNrOfItems - 1];
		--myCurNrOfItems;
	}

	void RemoveAll() { myCurNrOfItems = 0; }

	void DeleteAll()
		requires std::is_pointer_v<T>
	{
		for (CountType i = 0; i < myCurNrOfItems; ++i)
		{
			delete myData[i];
			myData[i] = nullptr;
		}
		myCurNrOfItems = 0;
	}

	int Count() const { return myCurNrOfItems; }

	void ReSize(int aNewSize)
	{
		const CountType newSize = static_cast<CountType>(aNewSize);
		assert(newSize >= myCurNrOfItems && "GrowingArray::ReSize below the count");
		T* newData = new T[newSize];
		if (myUseSafeModeFlag)
		{
			for (CountType i = 0; i < myCurNrOfItems; ++i)
			{
				newData[i] = myData[i];
			}
		}
		else if (myCurNrOfItems > 0)
		{
			// Raw mode moves the used slots as bytes; only owners of trivially
			// relocatable records choose it.
			std::memcpy(static_cast<void*>(newData), static_cast<const void*>(myData),
			            sizeof(T) * myCurNrOfItems);
		}
		delete[] myData;
		myData = newData;
		myMaxNrOfItems = newSize;
	}

	// Capacity, for owners that size work by it and for tests.
	int GetCapacity() const { return myMaxNrOfItems; }

	T* begin() { return myData; }
	T* end() { return myData + myCurNrOfItems; }
	const T* begin() const { return myData; }
	const T* end() const { return myData + myCurNrOfItems; }

private:
	void GrowAndAdd(const T& anObject)
	{
		const int limit = std::numeric_limits<CountType>::max();
		if (static_cast<int>(myCurNrOfItems) + 1 > limit)
		{
			// Wrapping the count would corrupt every index the owner holds. With a
			// non-fatal log the element is refused and the array stays as it was.
			GrowingArrayDetail::ReportCapacityOverflow(static_cast<int>(myCurNrOfItems) + 1, limit);
			return;
		}
		// Near the top of the range the last step is cut to what the counter can hold;
		// a step of 0 (an owner's mistake) still makes room for the one element.
		const int wanted = static_cast<int>(myMaxNrOfItems) + myItemIncreaseSize;
		int newSize = wanted > limit ? limit : wanted;
		if (newSize <= static_cast<int>(myCurNrOfItems))
		{
			newSize = myCurNrOfItems + 1;
		}
		// anObject may be one of our own elements (Add(array[i]), Add(array.Last())):
		// the growth frees the storage it lives in, so read it from its new place.
		const T* object = &anObject;
		const bool ownElementFlag =
		    !std::less<const T*>()(object, myData) && std::less<const T*>()(object, myData + myCurNrOfItems);
		const std::ptrdiff_t ownIndex = ownElementFlag ? object - myData : 0;
		ReSize(newSize);
		myData[myCurNrOfItems] = ownElementFlag ? myData[ownIndex] : anObject;
		++myCurNrOfItems;
	}

	T* myData;
	CountType myMaxNrOfItems = 0;
	CountType myCurNrOfItems = 0;
	CountType myItemIncreaseSize = 0;
	bool myUseSafeModeFlag = false;
};
