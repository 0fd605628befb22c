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

// Adds 0, 1, ... aCount - 1 and returns what the array should then hold.
std::vector<int> AddSequence(GrowingArray<int>& anArray, int aCount)
{
	std::vector<int> values(aCount);
	std::iota(values.begin(), values.end(), 0);
	for (const int value : values)
	{
		anArray.Add(value);
	}
	return values;
}

// Counts copy assignments (so a test can tell safe-mode growth from a byte copy) and overwrites its
// value when destroyed, so a read from released storage shows.
struct Probe
{
	static inline int ourAssignmentCount = 0;
	int myValue = 0;
	Probe& operator=(const Probe& anOther)
	{
		myValue = anOther.myValue;
		++ourAssignmentCount;
		return *this;
	}
	~Probe() { myValue = -1; }
};

std::vector<std::string> ourReports;
} // namespace

TEST(GrowingArray, GrowsByItsStepKeepingOrderUpToTheCounterRange)
{
	// The step is the increase size, not the first capacity; a step of zero still makes room for the
	// one element; ReInit empties and takes the new step.
	for (const auto& [step, finalCapacity] : {std::pair{10, 45}, std::pair{0, 36}})
	{
		GrowingArray<int> small(25, step, true);
		const std::vector<int> values = AddSequence(small, 36);
		EXPECT_EQ(Contents(small), values) << "step " << step;
		EXPECT_EQ(small.GetCapacity(), finalCapacity) << "step " << step;
		small.ReInit(12, 3, true);
		AddSequence(small, 13);
		EXPECT_EQ((std::pair{small.Count(), small.GetCapacity()}), (std::pair{13, 15}));
	}

	// The last step is cut to the counter's range; one element more is refused with a report.
	ourReports.clear();
	const CoreReport::Handler previous = CoreReport::GetCriticalHandler();
	CoreReport::SetCriticalHandler([](int, const char* aFunctionName, const char* aMessage) {
		ourReports.push_back(std::string(aFunctionName) + ": " + aMessage);
	});
	GrowingArray<int> array(2000, 2000, true);
	const std::vector<int> values = AddSequence(array, 65535);
	EXPECT_TRUE(ourReports.empty());
	EXPECT_EQ(array.GetCapacity(), 65535);
	array.Add(-1);
	CoreReport::SetCriticalHandler(previous);
	ASSERT_EQ(ourReports.size(), 1u);
	EXPECT_EQ(ourReports[0].rfind("GrowingArray::Add: ", 0), 0u) << ourReports[0];
	EXPECT_NE(ourReports[0].find("65535"), std::string::npos) << ourReports[0];
	EXPECT_EQ(Contents(array), values);

	// The argument of Add may live in the storage that its growth replaces.
	GrowingArray<Probe> own(2, 2, true);
	own.Add(Probe{7});
	own.Add(Probe{8});
	own.Add(own[0]);
	ASSERT_EQ(own.Count(), 3);
	EXPECT_EQ(own[2].myValue, 7);
}

TEST(GrowingArray, RemoveCyclicAtIndexMovesTheLastIntoTheHole)
{
	for (const auto& [index, expected] :
	     {std::pair{0, std::vector<int>{2, 1}}, std::pair{2, std::vector<int>{0, 1}}})
	{
		GrowingArray<int> array(4, 4, true);
		AddSequence(array, 3);
		array.RemoveCyclicAtIndex(index);
		EXPECT_EQ(Contents(array), expected) << "removing index " << index;
		array.RemoveLast();
		EXPECT_EQ(Contents(array), std::vector<int>{expected[0]});
	}
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
		EXPECT_EQ((std::vector<int>{array[0].myValue, array[3].myValue}), (std::vector<int>{0, 30}));
	}
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
