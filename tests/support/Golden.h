#pragma once
// Golden images: a small render compared with tests/golden/NAME.png under a stated
// tolerance (a channel may differ by at most 5/255, on at most 0.1 % of the pixels).
// A failing comparison writes the actual image and a difference image next to the
// build's test output (the paths are in the failure message). Run the test with
// LUMORA_UPDATE_GOLDEN=1 to write a new golden image after looking at it.

#include <cstdint>
#include <string>
#include <vector>

namespace TestSupport
{
struct GoldenTolerance
{
	int myChannel = 5;
	double myPixelFraction = 0.001;
};

// An RGBA PNG's pixels; false when it cannot be read.
bool ReadPng(const std::string& aPath, int& aWidth, int& aHeight, std::vector<uint8_t>& someRgba);

// Empty when the image matches (or the golden was written on request); otherwise
// what differs and where the actual and difference images went.
std::string CompareWithGolden(const std::string& aName, int aWidth, int aHeight,
                              const std::vector<uint8_t>& someRgba, const GoldenTolerance& aTolerance = {});
} // namespace TestSupport
