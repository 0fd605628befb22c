// A bake's inputs taken from the engine after the small sample level is loaded and baked, and
// recorded: the files the bake rests on, each one readable, and nothing stale right after.
#include <algorithm>
#include <gmock/gmock-matchers.h>
#include <string>
#include <vector>

#include "editor/BakeInputs.h"
#include "editor/BakeRecord.h"
#include "editor/FacadeFixture.h"
#include "engine/Engine.h"
#include "model/ModelFactory.h"

namespace
{
using BakeInputsTest = FacadeTest;
using testing::Contains;
using testing::EndsWith;
} // namespace

// The level's five files, both catalogues, the post-processing settings, the capture's shaders
// with the files they include, and every model and texture loaded for the level, in order and
// each once; all of them files (the room boxes that the model factory makes in memory are none). A record of the bake made from them names the
// volume with its size and finds nothing stale.
TEST_F(BakeInputsTest, TheLoadedLevelsFilesModelsAndTexturesAreTheInputsOfItsBake)
{
	Facade().ParseLevel(u"sample_small");
	Facade().BakeAmbient(u"sample_small", 1, false);
	const std::vector<std::string> inputs = Lumora::CollectBakeInputs("sample_small");
	EXPECT_TRUE(std::adjacent_find(inputs.begin(), inputs.end(), std::greater_equal<>()) == inputs.end());
	for (const char* input :
	     {"data/XML/levels/sample_small/rooms.xml", "data/XML/levels/sample_small/entities.xml",
	      "data/XML/levels/sample_small/lights.xml", "data/XML/levels/sample_small/nodegraph.xml",
	      "data/XML/levels/sample_small/decals.xml", "data/XML/EntityTypes.xml", "data/XML/DecalTypes.xml",
	      "data/Shaders/SSAO.xml", "data/Shaders/HDRBloom.xml", "data/grading/default.dds",
	      "data/models/crate.dae", "data/Shaders/PBL/DeferredPointLight.fx",
	      "data/Shaders/FullScreen/VertexUV_Shader.fx", "data/Shaders/Common/Lighting.fxh",
	      "data/Shaders/FullScreen/CubemapFilter.fxh"})
	{
		EXPECT_THAT(inputs, Contains(std::string(input)));
	}
	EXPECT_THAT(inputs, Contains(EndsWith(".dds")));
	const Zeph::ModelFactory& models = Zeph::Engine::GetInstance()->GetModelFactory();
	EXPECT_LT(models.GetFileNames().size(), models.GetCount()) << "the room boxes are no inputs";
	const std::map<std::string, std::string> hashes = Lumora::HashBakeInputs(inputs);
	for (const auto& [path, hash] : hashes)
	{
		EXPECT_TRUE(Lumora::IsInputHash(hash)) << path;
	}

	const std::string volume = "data/XML/levels/sample_small/ambient.sh";
	Lumora::BakePhaseRecord phase = Lumora::MakeBakePhaseRecord({}, {volume}, {{"total", 0.25}}, inputs);
	EXPECT_EQ(phase.myInputs, hashes);
	std::string problem;
	ASSERT_TRUE(Lumora::RecordBakePhase("sample_small", Lumora::BakePhase::AMBIENT, phase, problem))
	    << problem;
	Lumora::BakeRecord record;
	ASSERT_EQ(Lumora::ReadBakeRecord(Lumora::GetBakeRecordPath("sample_small"), record, problem),
	          Lumora::BakeRecordRead::OK)
	    << problem;
	EXPECT_EQ(record.myAmbient->myFiles, (std::map<std::string, uint64_t>{{volume, 708}}));
	EXPECT_EQ(Lumora::FindStaleInputs(record), std::vector<std::string>{});
}
