// The level entry over its corpus and mutations (FuzzCorpus.h): the facade loads every level
// folder with the log non-fatal, whatever its files hold.

#include "FuzzCorpus.h"
#include "editor/LumoraWrapper.h"

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
	FuzzCorpus::Run({"level", &LumoraFuzz::Level, 80, false}, seeds, random);

	// The entry really loads each input, catalogues included: the small sample level without its
	// entity types places no entity, and with them every one.
	const std::string sample = TestSupport::ReadWholeFile(std::string(LUMORA_FUZZ_SOURCE_ROOT) +
	                                                      "/tests/fuzz/corpus/level/sample_small");
	const size_t entityTypes = sample.find("<entities>", sample.find("<entity type"));
	ASSERT_NE(entityTypes, std::string::npos);
	std::string withoutTypes = sample;
	withoutTypes.replace(entityTypes, std::string("<entities>").size(), "<nothing>");
	const Lumora::LumoraWrapper& facade = *Lumora::LumoraWrapper::GetInstance();
	for (const auto& [text, entities] : {std::pair{withoutTypes, 0}, std::pair{sample, 9}})
	{
		LumoraFuzz::Level(reinterpret_cast<const uint8_t*>(text.data()), text.size());
		EXPECT_EQ(facade.GetEntities().Count(), entities);
		EXPECT_EQ(facade.GetPointLights().Count(), 3);
		EXPECT_EQ(facade.GetRooms().Count(), 1);
	}
	LumoraFuzz::ShutDownLevel();
}
