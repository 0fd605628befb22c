// The sample levels shipped in data/XML/levels load through the facade with the shipped
// catalogues: every kind of object is there and nothing is left out.
#include <filesystem>
#include <string>

#include "editor/FacadeFixture.h"

namespace
{
using SampleLevelTest = FacadeTest;

TEST_F(SampleLevelTest, ShippedLevelsLoadCompletelyAndSilently)
{
	for (const std::string level : {"sample_small", "sample_large"})
	{
		SCOPED_TRACE(level);
		ASSERT_TRUE(std::filesystem::is_directory("data/XML/levels/" + level)) << "no sample level " << level;
		Facade().ParseLevel(std::u16string(level.begin(), level.end()));
		EXPECT_GT(Facade().GetRooms().Count(), 0);
		EXPECT_GT(Facade().GetEntities().Count(), 0);
		EXPECT_GT(Facade().GetPointLights().Count(), 0);
		EXPECT_GT(Facade().GetSpotLights().Count(), 0);
		EXPECT_GT(Facade().GetNodes().Count(), 0);
		EXPECT_GT(Facade().GetEdges().Count(), 0);
		EXPECT_GT(Facade().GetDecals().Count(), 0);
	}
	EXPECT_THAT(LogText(), testing::Not(testing::HasSubstr("\"Error Type:\"")));
}
} // namespace
