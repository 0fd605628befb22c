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
} // namespace

TEST(StackTraceTest, FramesStartAtTheCallerWithFileLineAndNameAfterTheSkippedOnes)
{
	int captureLine = 0;
	const std::vector<StackTrace::Frame> frames = CaptureThroughCaller(captureLine, 0);
	ASSERT_GE(frames.size(), 3u);
	EXPECT_TRUE(frames[0].myFunction.starts_with("(anonymous namespace)::CaptureHere(int&, int)"))
	    << frames[0].myFunction;
	EXPECT_TRUE(frames[0].myFile.ends_with("StackTraceTest.cpp")) << frames[0].myFile;
	EXPECT_EQ(frames[0].myLine, captureLine);
	EXPECT_NE(frames[0].myAddress, nullptr);
	EXPECT_NE(frames[1].myFunction.find("CaptureThroughCaller"), std::string::npos) << frames[1].myFunction;
	// The outermost frames, in the C library's start-up code, still name their module.
	bool libcFound = false;
	for (const StackTrace::Frame& frame : frames)
	{
		libcFound = libcFound || frame.myModule.find("libc.so") != std::string::npos;
	}
	EXPECT_TRUE(libcFound);

	const std::vector<StackTrace::Frame> skipped = CaptureThroughCaller(captureLine, 1);
	ASSERT_FALSE(skipped.empty());
	EXPECT_NE(skipped[0].myFunction.find("CaptureThroughCaller"), std::string::npos) << skipped[0].myFunction;
	EXPECT_EQ(skipped.size() + 1, frames.size());
}
