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

// 0, aStep, 2 * aStep, ... (aCount values).
std::vector<int> Sequence(int aCount, int aStep = 1)
{
	std::vector<int> values;
	for (int i = 0; i < aCount; ++i)
	{
		values.push_back(i * aStep);
	}
	return values;
}

void AddAll(GrowingArray<int>& anArray, const std::vector<int>& someValues)
{
	for (const int value : someValues)
	{
		anArray.Add(value);
	}
}

// Counts copy assignments (so a test can tell safe-mode growth from a byte copy) and destructions,
// and overwrites its value when destroyed, so a read from released storage shows.
struct Probe
{
	static inline int ourAssignmentCount = 0;
	static inline int ourDestroyedCount = 0;
	int myValue = 0;
	Probe& operator=(const Probe& anOther)
	{
		myValue = anOther.myValue;
		++ourAssignmentCount;
		return *this;
	}
	~Probe()
	{
		myValue = -1;
		++ourDestroyedCount;
	}
};

std::vector<std::string> ourReports;
} // namespace

TEST(GrowingArray, GrowsByTheFixedStepAndKeepsOrder)
{
	GrowingArray<int> array(2000, 2000, true);
	AddAll(array, Sequence(2000, 3));
	EXPECT_EQ(array.GetCapacity(), 2000);
	array.Add(6000);
	EXPECT_EQ(array.GetCapacity(), 4000);
	EXPECT_EQ(Contents(array), Sequence(2001, 3));

	// The step is the increase size, not the first capacity; a step of zero still
	// makes room for the one element; ReInit empties and takes the new step.
	for (const auto& [step, finalCapacity] : {std::pair{10, 45}, std::pair{0, 36}})
	{
		GrowingArray<int> small(25, step, true);
		AddAll(small, Sequence(36));
		EXPECT_EQ(small.GetCapacity(), finalCapacity) << "step " << step;
		EXPECT_EQ(Contents(small), Sequence(36)) << "step " << step;
		small.ReInit(12, 3, true);
		EXPECT_EQ(small.Count(), 0);
		EXPECT_EQ(small.GetCapacity(), 12);
		AddAll(small, Sequence(13));
		EXPECT_EQ(small.GetCapacity(), 15) << "growth uses the new step";
	}

	// The argument of Add may live in the storage that its growth replaces.
	GrowingArray<Probe> own(2, 2, true);
	own.Add(Probe{7});
	own.Add(Probe{8});
	own.Add(own[0]);
	ASSERT_EQ(own.Count(), 3);
	EXPECT_EQ(own[2].myValue, 7);
}

TEST(GrowingArray, RemovingAndClearing)
{
	// RemoveCyclicAtIndex moves the last element into the hole.
	for (const auto& [index, expected] :
	     {std::pair{0, std::vector<int>{2, 1}}, std::pair{2, std::vector<int>{0, 1}}})
	{
		GrowingArray<int> array(4, 4, true);
		AddAll(array, Sequence(3));
		array.RemoveCyclicAtIndex(index);
		EXPECT_EQ(Contents(array), expected) << "removing index " << index;
		array.RemoveLast();
		EXPECT_EQ(Contents(array), std::vector<int>{expected[0]});
	}

	// RemoveAll keeps the storage.
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
	GrowingArray<Probe*> pointers(4, 4, true);
	pointers.Add(new Probe);
	pointers.Add(nullptr);
	pointers.Add(new Probe);
	Probe::ourDestroyedCount = 0;
	pointers.DeleteAll();
	EXPECT_EQ(Probe::ourDestroyedCount, 2);
	EXPECT_EQ(pointers.Count(), 0);
	EXPECT_EQ(std::vector<Probe*>(pointers.begin(), pointers.begin() + 3), std::vector<Probe*>(3, nullptr));
}

TEST(GrowingArray, SafeModeAssignsOnGrowthRawModeCopiesBytes)
{
	// Four Adds assign in both modes; safe mode also assigns the three moved elements.
	for (const auto& [safeMode, expectedAssignments] : {std::pair{true, 7}, std::pair{false, 4}})
	{
		Probe::ourAssignmentCount = 0;
		GrowingArray<Probe> array(3, 3, safeMode);
		for (int i = 0; i < 4; ++i)
		{
			array.Add(Probe{i * 10});
		}
		EXPECT_EQ(Probe::ourAssignmentCount, expectedAssignments) << "safe mode " << safeMode;
		EXPECT_EQ((std::vector<int>{array[0].myValue, array[1].myValue, array[2].myValue, array[3].myValue}),
		          Sequence(4, 10));
	}
}

TEST(GrowingArray, RefusesToGrowPastTheCounterRange)
{
	ourReports.clear();
	const CoreReport::Handler previous = CoreReport::GetCriticalHandler();
	CoreReport::SetCriticalHandler([](int, const char* aFunctionName, const char* aMessage) {
		ourReports.push_back(std::string(aFunctionName) + ": " + aMessage);
	});
	GrowingArray<int> array(2000, 2000, true);
	AddAll(array, Sequence(65535));
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
