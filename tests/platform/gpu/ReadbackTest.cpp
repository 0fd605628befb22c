#include <cstdlib>
#include <filesystem>
#include <iterator>
#include <utility>

#include "GpuTest.h"
#include "support/Golden.h"
#include "support/TestSupport.h"

namespace
{
using ReadbackTest = GpuTest;

// A picture worth looking at: four quadrants cleared through per-quadrant copies,
// so orientation mistakes show (red must be top left).
TEST_F(ReadbackTest, RenderedTargetSurvivesAPngRoundTrip)
{
	Gpu::Texture* picture = MakeTarget(Dds::Format::R8G8B8A8_UNORM, 64, 32);
	Gpu::Texture* tile = MakeTarget(Dds::Format::R8G8B8A8_UNORM, 32, 16);
	ASSERT_TRUE(picture && tile);
	Gpu::RenderTargetView* tileView = tile->CreateRenderTargetView();
	const float colors[4][4] = {{1, 0, 0, 1}, {0, 1, 0, 1}, {0, 0, 1, 1}, {1, 1, 1, 1}};
	for (int quadrant = 0; quadrant < 4; ++quadrant)
	{
		GetContext().ClearRenderTargetView(*tileView, colors[quadrant]);
		ASSERT_TRUE(GetContext().CopySubresourceRegion(*picture, 0, 0, (quadrant % 2) * 32,
		                                               (quadrant / 2) * 16, 0, *tile, 0, 0));
	}
	const std::vector<uint8_t> pixels = ReadPixels(*picture->CreateRenderTargetView());
	EXPECT_EQ(PixelAt(pixels, 64, 0, 0), (Pixel{255, 0, 0, 255})); // top left red
	EXPECT_EQ(PixelAt(pixels, 64, 63, 31), (Pixel{255, 255, 255, 255}));

	TestSupport::ScratchDir scratch;
	const std::string path = scratch.File("shots/quadrants.png");
	ASSERT_TRUE(Gpu::SavePng(path, 64, 32, pixels.data()));
	if (const char* keep = std::getenv("LUMORA_KEEP_TEST_PNG"))
	{
		EXPECT_TRUE(Gpu::SavePng(keep, 64, 32, pixels.data()));
	}
	int width = 0;
	int height = 0;
	std::vector<uint8_t> decoded;
	ASSERT_TRUE(TestSupport::ReadPng(path, width, height, decoded));
	EXPECT_EQ(std::pair(width, height), std::pair(64, 32));
	EXPECT_EQ(decoded, pixels);
	const std::filesystem::directory_iterator files(scratch.Path() / "shots");
	EXPECT_EQ(std::distance(begin(files), end(files)), 1) << "no temporary is left beside the picture";

	EXPECT_FALSE(Gpu::SavePng("/proc/lumora/none.png", 64, 32, pixels.data()));
	EXPECT_FALSE(Gpu::SavePng(path, 0, 32, pixels.data()));
	ExpectReports({{"/proc/lumora/none.png"}, {}});
}

TEST_F(ReadbackTest, FloatTargetsReadBackAsFloats)
{
	// Values a half float holds exactly, beyond 0..1 both ways.
	const float color[4] = {0.25f, -2.0f, 1000.0f, 1.0f};
	for (const Dds::Format format : {Dds::Format::R16G16B16A16_FLOAT, Dds::Format::R32G32B32A32_FLOAT})
	{
		SCOPED_TRACE(Dds::FormatName(format));
		Gpu::Texture* target = MakeTarget(format, 4, 4);
		ASSERT_NE(target, nullptr);
		Gpu::RenderTargetView* view = target->CreateRenderTargetView();
		GetContext().ClearRenderTargetView(*view, color);
		std::vector<float> values;
		ASSERT_TRUE(Gpu::ReadRenderTarget(GetContext(), *view, values));
		ASSERT_EQ(values.size(), 64u);
		for (size_t i = 0; i < values.size(); ++i)
		{
			ASSERT_EQ(values[i], color[i % 4]) << i;
		}
		std::vector<uint8_t> bytes;
		EXPECT_FALSE(Gpu::ReadRenderTarget(GetContext(), *view, bytes));
	}
	ExpectReports({{"Format 10 is not an 8-bit RGBA target"}, {}});
}
} // namespace
