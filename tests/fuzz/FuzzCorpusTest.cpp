// The file readers' fuzz entries over their corpora and mutations (FuzzCorpus.h).

#include <tuple>

#include "FuzzCorpus.h"

TEST(FuzzCorpusTest, FileReadersSurviveTheirCorporaAndMutations)
{
	const std::tuple<const char*, int (*)(const uint8_t*, size_t), int> targets[] = {
	    {"dds", &LumoraFuzz::Dds, 3000},
	    {"collada", &LumoraFuzz::Collada, 1500},
	    {"al", &LumoraFuzz::Al, 3000},
	    {"ambient", &LumoraFuzz::Ambient, 400},
	};
	std::mt19937 random(20261124);
	for (const auto& [name, entry, mutations] : targets)
	{
		SCOPED_TRACE(name);
		FuzzCorpus::Run(entry, mutations, FuzzCorpus::ReadCorpus(name), random);
	}
}
