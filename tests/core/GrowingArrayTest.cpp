#include "core/GrowingArray.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "core/CoreReport.h"

namespace
{
template <typename T> std::vector<T> Contents(const GrowingArray<T>& anArray)
{
	return std::vector<T>(anArray.begin(), anArray.end());
}

// Counts destructions, so a test can see which objects an array released.
struct DestructionCounter
{
	static int ourDestroyedCount;
	~DestructionCounter() { ++ourDestroyedCount; }
};
int DestructionCounter::ourDestroyedCount = 0;

// Counts copy assignments, so a test can tell safe-mode growth from a raw copy.
struct AssignmentCounter
{
	static int ourAssignmentCount;
	int myValue = 0;

	AssignmentCounter() = default;
	explicit AssignmentCounter(int aValue) : myValue(aValue) {}
	AssignmentCounter(const AssignmentCounter&) = default;
	AssignmentCounter& operator=(const AssignmentCounter& anOther)
	{
		myValue = anOther.myValue;
		++ourAssignmentCount;
		return *this;
	}
};
int AssignmentCounter::ourAssignmentCount = 0;

// Overwrites its value when destroyed, so reading an element out of freed
// storage shows up as a wrong value even without a sanitizer.
struct PoisonOnDestroy
{
	int myValue = 0;
	~PoisonOnDestroy() { myValue = -1; }
};
} // namespace

TEST(GrowingArray, GrowsByTheFixedStepAndKeepsOrder)
{
	GrowingArray<int> array(2000, 2000, true);
	EXPECT_EQ(array.GetCapacity(), 2000);
	for (int i = 0; i < 2000; ++i)
	{
		array.Add(i * 3);
	}
	EXPECT_EQ(array.Count(), 2000);
	EXPECT_EQ(array.GetCapacity(), 2000);

	array.Add(2000 * 3);
	EXPECT_EQ(array.Count(), 2001);
	EXPECT_EQ(array.GetCapacity(), 4000);
	for (int i = 0; i < 2001; ++i)
	{
		ASSERT_EQ(array[i], i * 3) << "at index " << i;
	}

	// A room's own list: the step differs from the first capacity.
	GrowingArray<int> small(25, 10, true);
	for (int i = 0; i < 36; ++i)
	{
		small.Add(i);
		ASSERT_EQ(small.GetCapacity(), i < 25 ? 25 : i < 35 ? 35 : 45) << "after " << i + 1 << " adds";
	}

	// A step of zero would never make room; the array still takes the element.
	GrowingArray<int> noStep(1, 0, true);
	noStep.Add(1);
	noStep.Add(2);
	noStep.Add(3);
	EXPECT_EQ(Contents(noStep), (std::vector<int>{1, 2, 3}));
}

TEST(GrowingArray, RemoveCyclicMovesTheLastElementIntoTheHole)
{
	GrowingArray<char> array(4, 4, true);
	for (char c : {'A', 'B', 'C'})
	{
		array.Add(c);
	}
	array.RemoveCyclicAtIndex(0);
	EXPECT_EQ(Contents(array), (std::vector<char>{'C', 'B'}));

	array.RemoveAll();
	for (char c : {'A', 'B', 'C'})
	{
		array.Add(c);
	}
	array.RemoveCyclicAtIndex(2);
	EXPECT_EQ(Contents(array), (std::vector<char>{'A', 'B'}));

	array.RemoveLast();
	EXPECT_EQ(Contents(array), (std::vector<char>{'A'}));
	EXPECT_EQ(array.Last(), 'A');
}

TEST(GrowingArray, RemoveAllKeepsTheStorageForReuse)
{
	GrowingArray<std::string> array(8, 8, true);
	array.Add("first");
	array.Add("second");
	const std::string* storage = array.begin();

	array.RemoveAll();
	EXPECT_EQ(array.Count(), 0);
	array.Add("X");
	EXPECT_EQ(array.begin(), storage);
	EXPECT_EQ(array.Count(), 1);
	EXPECT_EQ(array[0], "X");
	EXPECT_EQ(array.GetCapacity(), 8);
}

TEST(GrowingArray, DeleteAllReleasesPointeesAndClearsSlots)
{
	DestructionCounter::ourDestroyedCount = 0;
	GrowingArray<DestructionCounter*> array(4, 4, true);
	array.Add(new DestructionCounter);
	array.Add(nullptr);
	array.Add(new DestructionCounter);

	array.DeleteAll();
	EXPECT_EQ(DestructionCounter::ourDestroyedCount, 2);
	EXPECT_EQ(array.Count(), 0);
	for (int i = 0; i < 3; ++i)
	{
		EXPECT_EQ(array.begin()[i], nullptr) << "slot " << i;
	}
	EXPECT_EQ(array.GetCapacity(), 4);
}

TEST(GrowingArray, ReInitReleasesTheOldStorage)
{
	DestructionCounter::ourDestroyedCount = 0;
	GrowingArray<DestructionCounter> array(5, 5, true);
	array.Add(DestructionCounter());
	array.Add(DestructionCounter());
	DestructionCounter::ourDestroyedCount = 0;

	// All five slots of the old storage are destroyed, not only the used ones.
	array.ReInit(12, 3, true);
	EXPECT_EQ(DestructionCounter::ourDestroyedCount, 5);
	EXPECT_EQ(array.Count(), 0);
	EXPECT_EQ(array.GetCapacity(), 12);
}

TEST(GrowingArray, SafeModeCopiesElementsByAssignment)
{
	GrowingArray<std::string> strings(2, 2, true);
	std::vector<std::string> expected;
	for (int i = 0; i < 9; ++i)
	{
		// Long enough to live on the heap, so a byte copy would share buffers.
		expected.push_back("a string that does not fit the small buffer #" + std::to_string(i));
		strings.Add(expected.back());
	}
	EXPECT_EQ(strings.GetCapacity(), 10);
	EXPECT_EQ(Contents(strings), expected);

	AssignmentCounter::ourAssignmentCount = 0;
	GrowingArray<AssignmentCounter> safe(3, 3, true);
	for (int i = 0; i < 4; ++i)
	{
		safe.Add(AssignmentCounter(i));
	}
	// Four Adds plus three carried over by the growth.
	EXPECT_EQ(AssignmentCounter::ourAssignmentCount, 7);
}

TEST(GrowingArray, RawModeCopiesElementsAsBytes)
{
	AssignmentCounter::ourAssignmentCount = 0;
	GrowingArray<AssignmentCounter> raw(3, 3, false);
	for (int i = 0; i < 4; ++i)
	{
		raw.Add(AssignmentCounter(i * 10));
	}
	EXPECT_EQ(AssignmentCounter::ourAssignmentCount, 4) << "growth must not call the assignment";
	EXPECT_EQ(raw.GetCapacity(), 6);
	for (int i = 0; i < 4; ++i)
	{
		EXPECT_EQ(raw[i].myValue, i * 10);
	}
}

TEST(GrowingArray, AddOfAnOwnElementSurvivesGrowth)
{
	GrowingArray<PoisonOnDestroy> array(2, 2, true);
	array.Add(PoisonOnDestroy{7});
	array.Add(PoisonOnDestroy{8});
	// The argument refers into the storage that this growth replaces.
	array.Add(array[0]);
	ASSERT_EQ(array.Count(), 3);
	EXPECT_EQ(array[2].myValue, 7);

	GrowingArray<std::string> strings(1, 1, true);
	strings.Add("long enough to be allocated on the heap by std::string");
	strings.Add(strings.Last());
	EXPECT_EQ(strings[1], strings[0]);
}

namespace
{
struct RecordedReport
{
	int myCallCount = 0;
	std::string myFunctionName;
	std::string myMessage;
};
RecordedReport ourRecordedReport;

void RecordReport(int aLine, const char* aFunctionName, const char* aMessage)
{
	static_cast<void>(aLine);
	++ourRecordedReport.myCallCount;
	ourRecordedReport.myFunctionName = aFunctionName;
	ourRecordedReport.myMessage = aMessage;
}
} // namespace

TEST(GrowingArray, RefusesToGrowPastTheCounterRange)
{
	ourRecordedReport = RecordedReport();
	const CoreReport::Handler previous = CoreReport::GetCriticalHandler();
	CoreReport::SetCriticalHandler(&RecordReport);

	GrowingArray<int> array(2000, 2000, true);
	for (int i = 0; i < 65535; ++i)
	{
		array.Add(i);
	}
	EXPECT_EQ(ourRecordedReport.myCallCount, 0);
	// The last step is cut to what a 16-bit counter can hold.
	EXPECT_EQ(array.GetCapacity(), 65535);

	array.Add(-1);
	CoreReport::SetCriticalHandler(previous);

	EXPECT_EQ(ourRecordedReport.myCallCount, 1);
	EXPECT_EQ(ourRecordedReport.myFunctionName, "GrowingArray::Add");
	EXPECT_NE(ourRecordedReport.myMessage.find("65535"), std::string::npos) << ourRecordedReport.myMessage;
	EXPECT_EQ(array.Count(), 65535);
	EXPECT_EQ(array.GetCapacity(), 65535);
	EXPECT_EQ(array[0], 0);
	EXPECT_EQ(array.Last(), 65534);
	EXPECT_EQ(CoreReport::GetCriticalHandler(), previous);
}

TEST(GrowingArrayDeathTest, DebugBuildsCatchOutOfRangeAccess)
{
#ifdef NDEBUG
	GTEST_SKIP() << "range assertions exist only in debug builds";
#else
	GTEST_FLAG_SET(death_test_style, "threadsafe");
	GrowingArray<int> array(4, 4, true);
	EXPECT_DEATH(array.Last(), "empty");
	EXPECT_DEATH(array.RemoveLast(), "empty");
	array.Add(1);
	EXPECT_DEATH(array[1], "out of range");
	EXPECT_DEATH(array[-1], "out of range");
	EXPECT_DEATH(array.RemoveCyclicAtIndex(3), "out of range");
	array.Add(2);
	EXPECT_DEATH(array.ReSize(1), "below the count");
#endif
}
