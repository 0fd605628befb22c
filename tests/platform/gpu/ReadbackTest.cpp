#include <filesystem>
#include <iterator>
#include <tuple>

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

	TestSupport::ScratchDir scratch;
	const std::string path = scratch.File("shots/quadrants.png");
	ASSERT_TRUE(Gpu::SavePng(path, 64, 32, pixels.data()));
	int width = 0;
	int height = 0;
	std::vector<uint8_t> decoded;
	ASSERT_TRUE(TestSupport::ReadPng(path, width, height, decoded));
	EXPECT_EQ(std::tuple(width, height, decoded), std::tuple(64, 32, pixels));
	const std::filesystem::directory_iterator files(scratch.Path() / "shots");
	EXPECT_EQ(std::distance(begin(files), end(files)), 1) << "no temporary is left beside the picture";

	EXPECT_FALSE(Gpu::SavePng("/proc/lumora/none.png", 64, 32, pixels.data()));
	EXPECT_FALSE(Gpu::SavePng(path, 0, 32, pixels.data()));
	// A float target reads back as floats only, beyond 0..1 both ways (values a half holds exactly).
	Gpu::Texture* floats = MakeTarget(Dds::Format::R16G16B16A16_FLOAT, 1, 1);
	ASSERT_NE(floats, nullptr);
	Gpu::RenderTargetView* floatView = floats->CreateRenderTargetView();
	const std::vector<float> color = {0.25f, -2.0f, 1000.0f, 1.0f};
	GetContext().ClearRenderTargetView(*floatView, color.data());
	std::vector<float> values;
	EXPECT_TRUE(Gpu::ReadRenderTarget(GetContext(), *floatView, values));
	EXPECT_EQ(values, color);
	std::vector<uint8_t> bytes;
	EXPECT_FALSE(Gpu::ReadRenderTarget(GetContext(), *floatView, bytes));
	ExpectReports({{"/proc/lumora/none.png"}, {}, {"Format 10 is not an 8-bit RGBA target"}});
}

} // namespace
