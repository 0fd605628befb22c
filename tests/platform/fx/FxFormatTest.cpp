// The compiled effect format: round trip, damaged files, and the staleness of
// every compiled effect under data/ against its sources. No GL needed.

#include <algorithm>
#include <filesystem>
#include <gtest/gtest.h>
#include <random>
#include <string>
#include <vector>

#include "fuzz/FuzzCorpus.h"
#include "platform/fx/CompiledFormat.h"
#include "platform/fx/Compiler.h"
#include "support/TestSupport.h"

namespace
{
std::vector<uint8_t> ReadBytes(const std::string& aPath)
{
	const std::string text = TestSupport::ReadWholeFile(aPath);
	return {text.begin(), text.end()};
}

// Empty when up to date, else what is wrong, naming the file.
std::string Staleness(const std::string& aSource)
{
	const std::string compiled = aSource + "al";
	if (!std::filesystem::exists(compiled))
	{
		return compiled + " is missing: build the lumora_effects target";
	}
	uint64_t now = 0;
	uint64_t stored = 0;
	std::string error;
	if (!Fx::ComputeSourceHash(aSource, now, error))
	{
		return aSource + " cannot be hashed: " + error;
	}
	if (!Fx::ReadSourceHash(ReadBytes(compiled), stored, error))
	{
		return compiled + " is unreadable (" + error + "): rebuild it with the lumora_effects target";
	}
	return now == stored ? std::string() : compiled + " is stale: rebuild it with the lumora_effects target";
}

const char* const ourVertexPosCol = "data/Shaders/Misc/Vertex_PosCol.fxal";
} // namespace

TEST(FxStalenessTest, EveryEffectUnderDataIsCompiledFromItsCurrentSources)
{
	std::vector<std::string> sources;
	for (const auto& entry : std::filesystem::recursive_directory_iterator("data"))
	{
		if (entry.is_regular_file() && entry.path().extension() == ".fx")
		{
			sources.push_back(entry.path().string());
		}
	}
	// The effects the engine needs are among them.
	for (const char* required : {"data/Shaders/Misc/Vertex_PosCol.fx", "data/Shaders/Sprite/Sprite.fx",
	                             "data/Shaders/Misc/Line2D.fx"})
	{
		EXPECT_NE(std::find(sources.begin(), sources.end(), required), sources.end()) << required;
	}
	for (const std::string& source : sources)
	{
		EXPECT_EQ(Staleness(source), "");
	}
}

TEST(FxStalenessTest, ChangingAnIncludeMakesTheCompiledFileStale)
{
	TestSupport::ScratchDir scratch;
	std::filesystem::create_directories(scratch.Path() / "Common");
	const std::string include = scratch.File("Common/Shared.fxh");
	const std::string source = scratch.File("Effect.fx");
	TestSupport::WriteWholeFile(include, "uniform float Fade;\n");
	TestSupport::WriteWholeFile(source, "#include \"common/shared.fxh\"\nvertex V { void main() {} }\n");

	uint64_t original = 0;
	std::string error;
	ASSERT_TRUE(Fx::ComputeSourceHash(source, original, error)) << error;
	// A compiled file made now carries that hash (the header alone is enough to tell).
	Fx::EffectDesc desc;
	desc.mySourceHash = original;
	std::vector<uint8_t> compiled;
	Fx::WriteCompiled(desc, compiled);
	TestSupport::WriteWholeFile(source + "al", std::string(compiled.begin(), compiled.end()));
	EXPECT_EQ(Staleness(source), "");

	TestSupport::WriteWholeFile(include, "uniform float Fade;\nuniform float More;\n");
	EXPECT_EQ(Staleness(source), source + "al is stale: rebuild it with the lumora_effects target");
	TestSupport::WriteWholeFile(include, "uniform float Fade;\n");
	EXPECT_EQ(Staleness(source), "");

	std::filesystem::remove(include);
	uint64_t hash = 0;
	EXPECT_FALSE(Fx::ComputeSourceHash(source, hash, error));
	EXPECT_NE(error.find("common/shared.fxh"), std::string::npos) << error;
}

TEST(FxCompiledFormatTest, DamagedFilesAreRefusedWithAMessageOrReadWhole)
{
	const std::vector<uint8_t> original = ReadBytes(ourVertexPosCol);
	ASSERT_FALSE(original.empty()) << ourVertexPosCol << " is missing: build the lumora_effects target";
	// The real file reads whole and writes back the same bytes.
	Fx::EffectDesc desc;
	std::string error;
	ASSERT_TRUE(Fx::ReadCompiled(original, desc, error)) << error;
	std::vector<uint8_t> again;
	Fx::WriteCompiled(desc, again);
	EXPECT_EQ(again, original);

	std::vector<uint8_t> newer = original;
	newer[4] = static_cast<uint8_t>(Fx::ourCompiledFormatVersion + 1);
	EXPECT_FALSE(Fx::ReadCompiled(newer, desc, error));
	EXPECT_NE(error.find("format version"), std::string::npos) << error;
	uint64_t hash = 0;
	EXPECT_FALSE(Fx::ReadSourceHash(std::vector<uint8_t>{'D', 'D', 'S', ' '}, hash, error));
	EXPECT_NE(error.find("magic"), std::string::npos) << error;

	// The fuzz targets' kinds of change (cuts among them); half the mutations recompute the checksum,
	// so the structural checks behind it are reached.
	const std::string originalBytes(original.begin(), original.end());
	std::mt19937 random(20240611);
	int read = 0;
	int refused = 0;
	for (int iteration = 0; iteration < 4000; ++iteration)
	{
		const std::string mutated = FuzzCorpus::Mutate(originalBytes, random);
		std::vector<uint8_t> bytes(mutated.begin(), mutated.end());
		if (iteration % 2 == 0)
		{
			Fx::ResealCompiled(bytes);
		}
		if (Fx::ReadCompiled(bytes, desc, error))
		{
			// Whatever is accepted is read whole: it writes back byte for byte.
			std::vector<uint8_t> again;
			Fx::WriteCompiled(desc, again);
			ASSERT_EQ(again, bytes) << "iteration " << iteration;
			++read;
		}
		else
		{
			ASSERT_FALSE(error.empty()) << "iteration " << iteration;
			++refused;
		}
	}
	// Both outcomes occur, so the mutations reach past the header checks.
	EXPECT_GT(read, 0);
	EXPECT_GT(refused, 2000);
}
