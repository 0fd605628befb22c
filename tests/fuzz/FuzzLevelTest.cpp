// The level entry over its corpus and mutations (FuzzCorpus.h): the facade loads every level
// folder with the log non-fatal, whatever its files hold.

#include "FuzzCorpus.h"

TEST(FuzzCorpusTest, LevelsLoadThroughTheFacadeWhateverTheirFiles)
{
	// Read first: the facade's working directory is a scratch one.
	const std::vector<std::string> seeds = FuzzCorpus::ReadCorpus("level");
	if (!LumoraFuzz::LevelAvailable())
	{
		ASSERT_FALSE(TestSupport::IsCi()) << "No OpenGL 4.5 core context under CI";
		GTEST_SKIP() << "No OpenGL 4.5 core context";
	}
	std::mt19937 random(20261125);
	FuzzCorpus::Run(&LumoraFuzz::Level, 80, seeds, random);

	LumoraFuzz::ShutDownLevel();
}
