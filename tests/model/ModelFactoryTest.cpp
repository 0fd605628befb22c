// The model factory with a GPU: generated boxes, the cull-shape fallback and the
// load failure while the importers are missing.
#include <cstdint>
#include <cstring>
#include <gtest/gtest.h>
#include <vector>

#include "engine/Effect.h"
#include "engine/EngineFixture.h"
#include "model/Model.h"
#include "model/ModelFactory.h"
#include "model/ModelNode.h"

using ModelFactoryTest = EngineTest;

TEST_F(ModelFactoryTest, CreateAABBBuildsTheBoxOnceForAName)
{
	LUMORA_RETURN_UNLESS(CreateEngine(64, 64));
	Zeph::ModelFactory& factory = Zeph::Engine::GetInstance()->GetModelFactory();
	// Whatever the engine loaded for itself at start-up is not counted.
	const size_t baseline = factory.GetCount();
	Zeph::ModelNode* box = factory.CreateAABB("box", {1.0f, 2.0f, 3.0f}, {0.25f, 0.5f, 0.75f, 1.0f},
	                                          Gpu::PrimitiveTopology::TriangleList);
	ASSERT_NE(box, nullptr) << TakeLog();
	Zeph::ModelNode* again = factory.CreateAABB("box", {9.0f, 9.0f, 9.0f}, {0.0f, 1.0f, 0.0f, 0.0f},
	                                            Gpu::PrimitiveTopology::LineList);
	EXPECT_EQ(again, box);
	EXPECT_EQ(factory.GetModel("box"), box) << "GetModel finds a generated box without loading";
	EXPECT_EQ(factory.GetCount(), baseline + 1u);

	// The first call's size and colour (the late-gizmo golden image shows the box drawn).
	const Zeph::Model* model = box->GetModel();
	ASSERT_EQ(model->GetVertexData().size(), 8u * 28u);
	float corner[7];
	std::memcpy(corner, model->GetVertexData().data() + 6 * 28, sizeof(corner));
	EXPECT_EQ(std::vector<float>(corner, corner + 7), (std::vector<float>{1, 2, 3, 0.25f, 0.5f, 0.75f, 1}));
	ASSERT_NE(model->GetEffect(), nullptr);
	EXPECT_EQ(model->GetEffect()->GetFileName(), "Data/Shaders/Misc/Vertex_PosCol.fx");
	EXPECT_EQ(TakeLog().find("CRITICAL"), std::string::npos);
}

TEST_F(ModelFactoryTest, UnknownNamesAndTexturesReportAndFallBack)
{
	LUMORA_RETURN_UNLESS(CreateEngine(64, 64));
	Zeph::ModelFactory& factory = Zeph::Engine::GetInstance()->GetModelFactory();
	// Whatever the engine loaded for itself at start-up is not counted.
	const size_t baseline = factory.GetCount();
	const Intersection::Sphere sphere = factory.GetCullShapeFromModel("data/models/nothing.dae");
	std::string log = TakeLog();
	EXPECT_NE(log.find("Tried to get radius for model not in container!"), std::string::npos) << log;
	EXPECT_EQ((std::vector{sphere.myPosition.x, sphere.myPosition.y, sphere.myPosition.z, sphere.myRadius}),
	          (std::vector{0.0f, 0.0f, 0.0f, 1.0f}));

	// A failed load stores nothing: the second request fails (and reports) again.
	for (int attempt = 0; attempt < 2; ++attempt)
	{
		EXPECT_EQ(factory.GetModel("data/models/missing.dae"), nullptr);
		log = TakeLog();
		EXPECT_NE(log.find("Couldn't load Model: data/models/missing.dae"), std::string::npos) << log;
	}
	EXPECT_EQ(factory.GetCount(), baseline);

	// A surface texture from an art path is looked up from its data folder.
	struct Case
	{
		const char* myPath;
		const char* myLooked; // the path the texture container was asked for
	};
	const Case cases[] = {
	    {"C:/work/data/tex/a.dds", "data/tex/a.dds"},
	    {"D:/art/tex/data.dds", "data.dds"},
	    {"D:/art/tex/data", "D:/art/tex/data"}, // "data" as the last four characters is not searched
	    {"C:/art/b.dds", "C:/art/b.dds"},
	};
	Zeph::Surface surface;
	for (const Case& test : cases)
	{
		EXPECT_FALSE(surface.SetTexture(test.myPath, "DiffuseTexture", true));
		const std::string log = TakeLog();
		EXPECT_NE(log.find(std::string("Invalid Texture: ") + test.myLooked + "\n"), std::string::npos)
		    << log;
	}
	EXPECT_EQ(surface.GetTextureCount(), 0) << "a failed binding adds nothing";
}
