#include "support/Golden.h"

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <png.h>

#include "platform/gpu/Readback.h"

namespace TestSupport
{
bool ReadPng(const std::string& aPath, int& aWidth, int& aHeight, std::vector<uint8_t>& someRgba)
{
	png_image image{};
	image.version = PNG_IMAGE_VERSION;
	if (!png_image_begin_read_from_file(&image, aPath.c_str()))
	{
		return false;
	}
	image.format = PNG_FORMAT_RGBA;
	someRgba.resize(PNG_IMAGE_SIZE(image));
	const bool readFlag = png_image_finish_read(&image, nullptr, someRgba.data(), 0, nullptr) != 0;
	png_image_free(&image); // nothing to free after a finished read; safe either way
	aWidth = static_cast<int>(image.width);
	aHeight = static_cast<int>(image.height);
	return readFlag;
}

std::string CompareWithGolden(const std::string& aName, int aWidth, int aHeight,
                              const std::vector<uint8_t>& someRgba, const GoldenTolerance& aTolerance)
{
	const std::string golden = "tests/golden/" + aName + ".png";
	const char* update = std::getenv("LUMORA_UPDATE_GOLDEN");
	if (update != nullptr && *update != '\0' && *update != '0')
	{
		return Gpu::SavePng(golden, aWidth, aHeight, someRgba.data()) ? "" : "cannot write " + golden;
	}
	int width = 0;
	int height = 0;
	std::vector<uint8_t> expected;
	if (!ReadPng(golden, width, height, expected))
	{
		return "cannot read " + golden +
		       " (write it with LUMORA_UPDATE_GOLDEN=1 after looking at the render)";
	}
	if (width != aWidth || height != aHeight || expected.size() != someRgba.size())
	{
		return golden + " is " + std::to_string(width) + "x" + std::to_string(height) + ", the render " +
		       std::to_string(aWidth) + "x" + std::to_string(aHeight);
	}
	// The difference image: grey levels 16 times the pixel's largest channel difference, opaque.
	std::vector<uint8_t> difference(someRgba.size(), 255);
	size_t differing = 0;
	int largest = 0;
	for (size_t pixel = 0; pixel < someRgba.size() / 4; ++pixel)
	{
		const auto channel = [&](size_t anIndex) {
			return std::abs(someRgba[pixel * 4 + anIndex] - expected[pixel * 4 + anIndex]);
		};
		const int worst = std::max({channel(0), channel(1), channel(2), channel(3)});
		largest = std::max(largest, worst);
		std::fill_n(difference.begin() + static_cast<std::ptrdiff_t>(pixel * 4), 3,
		            static_cast<uint8_t>(std::min(255, worst * 16)));
		differing += worst > aTolerance.myChannel ? 1 : 0;
	}
	const size_t allowed =
	    static_cast<size_t>(aTolerance.myPixelFraction * static_cast<double>(someRgba.size() / 4));
	if (differing <= allowed)
	{
		return "";
	}
	const std::string out = (std::filesystem::temp_directory_path() / "lumora-golden" / aName).string();
	Gpu::SavePng(out + "-actual.png", aWidth, aHeight, someRgba.data());
	Gpu::SavePng(out + "-difference.png", aWidth, aHeight, difference.data());
	return std::to_string(differing) + " pixels differ from " + golden + " by more than " +
	       std::to_string(aTolerance.myChannel) + "/255 (largest " + std::to_string(largest) + ", " +
	       std::to_string(allowed) + " allowed); actual: " + out + "-actual.png, difference: " + out +
	       "-difference.png";
}
} // namespace TestSupport
