#pragma once
// StaticArray: a fixed number of elements held by value, for small fixed sets such as
// the two edge slots of a path node and the two ends of a path edge.
//
//   StaticArray<AI::NGEdge*, 2> slots;   // both slots value-initialised (null)
//   slots[0] = edge;
//   other = slots;                       // copies every element
//
// Elements are value-initialised on construction, so pointer slots start out null.
// Debug builds assert on an index out of range, as GrowingArray does.
#include <cassert>

template <typename Type, int Size> class StaticArray
{
	static_assert(Size > 0, "a StaticArray holds at least one element");

public:
	StaticArray() = default;
	StaticArray(const StaticArray& aStaticArray) { *this = aStaticArray; }
	~StaticArray() = default;

	// Element by element, so it holds for element types that are not trivially copyable too.
	StaticArray& operator=(const StaticArray& aStaticArray)
	{
		for (int index = 0; index < Size; ++index)
		{
			myData[index] = aStaticArray.myData[index];
		}
		return *this;
	}

	Type& operator[](int anIndex)
	{
		assert(anIndex >= 0 && anIndex < Size && "StaticArray index out of range");
		return myData[anIndex];
	}
	const Type& operator[](int anIndex) const
	{
		assert(anIndex >= 0 && anIndex < Size && "StaticArray index out of range");
		return myData[anIndex];
	}

	static constexpr int Count() { return Size; }

	Type* begin() { return myData; }
	Type* end() { return myData + Size; }
	const Type* begin() const { return myData; }
	const Type* end() const { return myData + Size; }

private:
	Type myData[Size]{};
};
