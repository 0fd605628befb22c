#include "support/Golden.h"

#include <algorithm>
#include <cstdio>
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
	if (!png_image_finish_read(&image, nullptr, someRgba.data(), 0, nullptr))
	{
		png_image_free(&image);
		return false;
	}
	aWidth = static_cast<int>(image.width);
	aHeight = static_cast<int>(image.height);
	return true;
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
	std::vector<uint8_t> difference(someRgba.size(), 0);
	size_t differing = 0;
	int largest = 0;
	for (size_t pixel = 0; pixel < someRgba.size() / 4; ++pixel)
	{
		int worst = 0;
		for (size_t channel = 0; channel < 4; ++channel)
		{
			const size_t at = pixel * 4 + channel;
			worst = std::max(worst, std::abs(someRgba[at] - expected[at]));
		}
		largest = std::max(largest, worst);
		const uint8_t shade = static_cast<uint8_t>(std::min(255, worst * 16));
		difference[pixel * 4] = shade;
		difference[pixel * 4 + 1] = shade;
		difference[pixel * 4 + 2] = shade;
		difference[pixel * 4 + 3] = 255;
		if (worst > aTolerance.myChannel)
		{
			++differing;
		}
	}
	const size_t allowed =
	    static_cast<size_t>(aTolerance.myPixelFraction * static_cast<double>(someRgba.size() / 4));
	if (differing <= allowed)
	{
		return "";
	}
	const std::filesystem::path out = std::filesystem::temp_directory_path() / "lumora-golden";
	const std::string actualPath = (out / (aName + "-actual.png")).string();
	const std::string differencePath = (out / (aName + "-difference.png")).string();
	Gpu::SavePng(actualPath, aWidth, aHeight, someRgba.data());
	Gpu::SavePng(differencePath, aWidth, aHeight, difference.data());
	return std::to_string(differing) + " pixels differ from " + golden + " by more than " +
	       std::to_string(aTolerance.myChannel) + "/255 (largest " + std::to_string(largest) + ", " +
	       std::to_string(allowed) + " allowed); actual: " + actualPath + ", difference: " + differencePath;
}
} // namespace TestSupport
