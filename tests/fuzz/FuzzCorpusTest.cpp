// The file readers' fuzz entries over their corpora and mutations (FuzzCorpus.h).

#include "FuzzCorpus.h"

TEST(FuzzCorpusTest, FileReadersSurviveTheirCorporaAndMutations)
{
	const FuzzCorpus::Target targets[] = {
	    {"dds", &LumoraFuzz::Dds, 3000},
	    {"collada", &LumoraFuzz::Collada, 1500},
	    {"al", &LumoraFuzz::Al, 3000},
	    {"ambient", &LumoraFuzz::Ambient, 400},
	};
	std::mt19937 random(20261124);
	for (const FuzzCorpus::Target& target : targets)
	{
		SCOPED_TRACE(target.myName);
		FuzzCorpus::Run(target, FuzzCorpus::ReadCorpus(target.myName), random);
	}
}
