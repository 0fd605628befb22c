#include "core/GrowingArray.h"

#include <gtest/gtest.h>

#include <numeric>
#include <string>
#include <vector>

#include "core/CoreReport.h"

namespace
{
template <typename T> std::vector<T> Contents(const GrowingArray<T>& anArray)
{
	return std::vector<T>(anArray.begin(), anArray.end());
}

struct DestructionCounter
{
	static inline int ourDestroyedCount = 0;
	~DestructionCounter() { ++ourDestroyedCount; }
};

// Counts copy assignments, so a test can tell safe-mode growth from a byte copy.
struct AssignmentCounter
{
	static inline int ourAssignmentCount = 0;
	int myValue = 0;
	AssignmentCounter& operator=(const AssignmentCounter& anOther)
	{
		myValue = anOther.myValue;
		++ourAssignmentCount;
		return *this;
	}
};

// Overwrites its value when destroyed, so a read from released storage shows.
struct PoisonOnDestroy
{
	int myValue = 0;
	~PoisonOnDestroy() { myValue = -1; }
};
} // namespace

TEST(GrowingArray, GrowsByTheFixedStepAndKeepsOrder)
{
	GrowingArray<int> array(2000, 2000, true);
	for (int i = 0; i <= 2000; ++i)
	{
		ASSERT_EQ(array.GetCapacity(), 2000) << "before add " << i;
		array.Add(i * 3);
	}
	EXPECT_EQ(array.GetCapacity(), 4000);
	ASSERT_EQ(array.Count(), 2001);
	for (int i = 0; i < 2001; ++i)
	{
		ASSERT_EQ(array[i], i * 3) << "at index " << i;
	}

	// The step is the increase size, not the first capacity; a step of zero still
	// makes room for the one element.
	std::vector<int> zeroTo35(36);
	std::iota(zeroTo35.begin(), zeroTo35.end(), 0);
	for (const auto& [step, finalCapacity] : {std::pair{10, 45}, std::pair{0, 36}})
	{
		GrowingArray<int> small(25, step, true);
		for (int i = 0; i < 36; ++i)
		{
			small.Add(i);
		}
		EXPECT_EQ(small.GetCapacity(), finalCapacity) << "step " << step;
		EXPECT_EQ(Contents(small), zeroTo35) << "step " << step;
	}
}

TEST(GrowingArray, RemoveCyclicMovesTheLastElementIntoTheHole)
{
	for (const auto& [index, expected] :
	     {std::pair{0, std::vector<char>{'C', 'B'}}, std::pair{2, std::vector<char>{'A', 'B'}}})
	{
		GrowingArray<char> array(4, 4, true);
		for (char c : {'A', 'B', 'C'})
		{
			array.Add(c);
		}
		array.RemoveCyclicAtIndex(index);
		EXPECT_EQ(Contents(array), expected) << "removing index " << index;
		array.RemoveLast();
		EXPECT_EQ(Contents(array), std::vector<char>{expected[0]});
	}
}

TEST(GrowingArray, ClearingKeepsTheStorage)
{
	GrowingArray<std::string> strings(8, 8, true);
	strings.Add("first");
	strings.Add("second");
	const std::string* storage = strings.begin();
	strings.RemoveAll();
	EXPECT_EQ(strings.Count(), 0);
	strings.Add("X");
	EXPECT_EQ(strings.begin(), storage);
	EXPECT_EQ(Contents(strings), std::vector<std::string>{"X"});

	// DeleteAll skips a null pointer and nulls every used slot.
	DestructionCounter::ourDestroyedCount = 0;
	GrowingArray<DestructionCounter*> pointers(4, 4, true);
	pointers.Add(new DestructionCounter);
	pointers.Add(nullptr);
	pointers.Add(new DestructionCounter);
	pointers.DeleteAll();
	EXPECT_EQ(DestructionCounter::ourDestroyedCount, 2);
	EXPECT_EQ(pointers.Count(), 0);
	EXPECT_EQ(std::vector<DestructionCounter*>(pointers.begin(), pointers.begin() + 3),
	          std::vector<DestructionCounter*>(3, nullptr));
}

TEST(GrowingArray, ReInitStartsEmptyWithTheNewCapacity)
{
	GrowingArray<int> array(5, 5, true);
	array.Add(1);
	array.ReInit(12, 3, true);
	EXPECT_EQ(array.Count(), 0);
	EXPECT_EQ(array.GetCapacity(), 12);
	for (int i = 0; i < 13; ++i)
	{
		array.Add(i);
	}
	EXPECT_EQ(array.GetCapacity(), 15) << "growth uses the new step";
}

TEST(GrowingArray, SafeModeAssignsOnGrowthRawModeCopiesBytes)
{
	// Four Adds assign in both modes; safe mode also assigns the three moved elements.
	for (const auto& [safeMode, expectedAssignments] : {std::pair{true, 7}, std::pair{false, 4}})
	{
		AssignmentCounter::ourAssignmentCount = 0;
		GrowingArray<AssignmentCounter> array(3, 3, safeMode);
		for (int i = 0; i < 4; ++i)
		{
			array.Add(AssignmentCounter{i * 10});
		}
		EXPECT_EQ(AssignmentCounter::ourAssignmentCount, expectedAssignments) << "safe mode " << safeMode;
		for (int i = 0; i < 4; ++i)
		{
			EXPECT_EQ(array[i].myValue, i * 10) << "safe mode " << safeMode;
		}
	}
}

TEST(GrowingArray, AddOfAnOwnElementSurvivesGrowth)
{
	GrowingArray<PoisonOnDestroy> array(2, 2, true);
	array.Add(PoisonOnDestroy{7});
	array.Add(PoisonOnDestroy{8});
	array.Add(array[0]); // the argument lives in the storage this growth replaces
	ASSERT_EQ(array.Count(), 3);
	EXPECT_EQ(array[2].myValue, 7);
}

namespace
{
std::vector<std::string> ourReports;
void RecordReport(int, const char* aFunctionName, const char* aMessage)
{
	ourReports.push_back(std::string(aFunctionName) + ": " + aMessage);
}
} // namespace

TEST(GrowingArray, RefusesToGrowPastTheCounterRange)
{
	ourReports.clear();
	const CoreReport::Handler previous = CoreReport::GetCriticalHandler();
	CoreReport::SetCriticalHandler(&RecordReport);
	GrowingArray<int> array(2000, 2000, true);
	for (int i = 0; i < 65535; ++i)
	{
		array.Add(i);
	}
	EXPECT_TRUE(ourReports.empty());
	EXPECT_EQ(array.GetCapacity(), 65535) << "the last step is cut to the counter's range";
	array.Add(-1);
	CoreReport::SetCriticalHandler(previous);

	ASSERT_EQ(ourReports.size(), 1u);
	EXPECT_EQ(ourReports[0].rfind("GrowingArray::Add: ", 0), 0u) << ourReports[0];
	EXPECT_NE(ourReports[0].find("65535"), std::string::npos) << ourReports[0];
	EXPECT_EQ(array.Count(), 65535);
	EXPECT_EQ(array.Last(), 65534);
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
