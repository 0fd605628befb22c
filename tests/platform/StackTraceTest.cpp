#include "platform/stacktrace/StackTrace.h"

#include <gtest/gtest.h>
#include <string>
#include <vector>

namespace
{
__attribute__((noinline)) std::vector<StackTrace::Frame> CaptureHere(int& aCaptureLine, int aSkipFrames)
{
	aCaptureLine = __LINE__ + 1;
	std::vector<StackTrace::Frame> frames = StackTrace::Capture(aSkipFrames);
	// Keeps the call from becoming a tail call, which would drop this frame.
	asm volatile("" ::: "memory");
	return frames;
}

__attribute__((noinline)) std::vector<StackTrace::Frame> CaptureThroughCaller(int& aCaptureLine,
                                                                              int aSkipFrames)
{
	std::vector<StackTrace::Frame> frames = CaptureHere(aCaptureLine, aSkipFrames);
	asm volatile("" ::: "memory");
	return frames;
}

bool Names(const StackTrace::Frame& aFrame, const std::string& aFunction)
{
	return aFrame.myFunction.find(aFunction) != std::string::npos;
}
} // namespace

TEST(StackTraceTest, FirstFrameIsTheCallerWithFileLineAndDemangledName)
{
	int captureLine = 0;
	const std::vector<StackTrace::Frame> frames = CaptureThroughCaller(captureLine, 0);
	ASSERT_GE(frames.size(), 3u);

	const StackTrace::Frame& top = frames[0];
	EXPECT_EQ(top.myFunction.rfind("(anonymous namespace)::CaptureHere(int&, int)", 0), 0u) << top.myFunction;
	EXPECT_TRUE(top.myFile.ends_with("StackTraceTest.cpp")) << top.myFile;
	EXPECT_EQ(top.myLine, captureLine);
	EXPECT_FALSE(top.myModule.empty());
	EXPECT_NE(top.myAddress, nullptr);

	EXPECT_TRUE(Names(frames[1], "CaptureThroughCaller")) << frames[1].myFunction;
	bool testBodyFound = false;
	for (const StackTrace::Frame& frame : frames)
	{
		testBodyFound =
		    testBodyFound ||
		    Names(frame, "StackTraceTest_FirstFrameIsTheCallerWithFileLineAndDemangledName_Test::TestBody");
		EXPECT_EQ(frame.myFunction.find("StackTrace::Capture"), std::string::npos) << "Capture's own frame";
	}
	EXPECT_TRUE(testBodyFound);
}

TEST(StackTraceTest, SkipFramesDropsThatManyCallers)
{
	int captureLine = 0;
	const std::vector<StackTrace::Frame> all = CaptureThroughCaller(captureLine, 0);
	const std::vector<StackTrace::Frame> skipped = CaptureThroughCaller(captureLine, 1);
	ASSERT_FALSE(skipped.empty());
	EXPECT_TRUE(Names(skipped[0], "CaptureThroughCaller")) << skipped[0].myFunction;
	EXPECT_EQ(skipped.size() + 1, all.size());
}

TEST(StackTraceTest, FramesOutsideTheProgramStillNameTheirModule)
{
	int captureLine = 0;
	const std::vector<StackTrace::Frame> frames = CaptureThroughCaller(captureLine, 0);
	// The outermost frames belong to the C library's start-up code.
	bool libcFound = false;
	for (const StackTrace::Frame& frame : frames)
	{
		libcFound = libcFound || frame.myModule.find("libc.so") != std::string::npos;
	}
	EXPECT_TRUE(libcFound);
}
