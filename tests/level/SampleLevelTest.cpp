// The sample levels shipped in data/XML/levels load through the facade with the shipped
// catalogues: every kind of object is there and nothing is left out.
#include <filesystem>
#include <string>

#include "editor/FacadeFixture.h"

namespace
{
class SampleLevelTest : public FacadeTest, public testing::WithParamInterface<const char*>
{
};

TEST_P(SampleLevelTest, LoadsCompletelyAndSilently)
{
	const std::string level = GetParam();
	if (!std::filesystem::is_directory("data/XML/levels/" + level))
	{
		GTEST_SKIP() << "No sample level " << level << " in data/XML/levels";
	}
	Facade().ParseLevel(std::u16string(level.begin(), level.end()));
	EXPECT_GT(Facade().GetRooms().Count(), 0);
	EXPECT_GT(Facade().GetEntities().Count(), 0);
	EXPECT_GT(Facade().GetPointLights().Count(), 0);
	EXPECT_GT(Facade().GetSpotLights().Count(), 0);
	EXPECT_GT(Facade().GetNodes().Count(), 0);
	EXPECT_GT(Facade().GetEdges().Count(), 0);
	EXPECT_GT(Facade().GetDecals().Count(), 0);
	const std::string log = LogText();
	EXPECT_EQ(log.find("\"Error Type:\""), std::string::npos) << log;
}

INSTANTIATE_TEST_SUITE_P(Shipped, SampleLevelTest, testing::Values("sample_small", "sample_large"));
} // namespace
