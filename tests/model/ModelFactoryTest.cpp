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
#include "model/TransformationNode.h"
#include "platform/fx/Technique.h"

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

	const Zeph::Model* model = box->GetModel();
	ASSERT_NE(model, nullptr);
	// The first call's size and colour, corner by corner.
	ASSERT_EQ(model->GetVertexCount(), 8);
	ASSERT_EQ(model->GetVertexStride(), 28);
	ASSERT_EQ(model->GetVertexData().size(), 8u * 28u);
	const float signs[8][3] = {{-1, -1, -1}, {-1, 1, -1}, {1, 1, -1}, {1, -1, -1},
	                           {-1, -1, 1},  {-1, 1, 1},  {1, 1, 1},  {1, -1, 1}};
	for (int vertex = 0; vertex < 8; ++vertex)
	{
		float values[7];
		std::memcpy(values, model->GetVertexData().data() + vertex * 28, sizeof(values));
		EXPECT_EQ(std::vector<float>(values, values + 7),
		          (std::vector<float>{signs[vertex][0] * 1.0f, signs[vertex][1] * 2.0f,
		                              signs[vertex][2] * 3.0f, 0.25f, 0.5f, 0.75f, 1.0f}))
		    << "vertex " << vertex;
	}
	const uint32_t expectedIndices[36] = {0, 1, 2, 0, 2, 3, 4, 6, 5, 4, 7, 6, 4, 5, 1, 4, 1, 0,
	                                      3, 2, 6, 3, 6, 7, 1, 5, 6, 1, 6, 2, 4, 0, 3, 4, 3, 7};
	ASSERT_EQ(model->GetIndexCount(), 36);
	ASSERT_EQ(model->GetIndexData().size(), sizeof(expectedIndices));
	EXPECT_EQ(model->GetIndexFormat(), 42);
	EXPECT_EQ(std::memcmp(model->GetIndexData().data(), expectedIndices, sizeof(expectedIndices)), 0);

	const GrowingArray<Gpu::InputElement>& layout = model->GetInputLayoutDesc();
	ASSERT_EQ(layout.Count(), 2);
	EXPECT_TRUE(layout[0].mySemanticName == "POSITION" &&
	            layout[0].myFormat == Dds::Format::R32G32B32_FLOAT && layout[0].myAlignedByteOffset == 0u);
	EXPECT_TRUE(layout[1].mySemanticName == "COLOR" &&
	            layout[1].myFormat == Dds::Format::R32G32B32A32_FLOAT &&
	            layout[1].myAlignedByteOffset == 12u);

	ASSERT_EQ(model->GetSurfaces().Count(), 1);
	const Zeph::Surface& surface = model->GetSurfaces()[0];
	EXPECT_EQ(surface.GetIndexCount(), 36);
	EXPECT_EQ(surface.GetStartIndex(), 0);
	EXPECT_EQ(surface.GetPrimitiveTopology(), Gpu::PrimitiveTopology::TriangleList);
	ASSERT_NE(surface.GetEffect(), nullptr);
	EXPECT_EQ(surface.GetEffect()->GetFileName(), "Data/Shaders/Misc/Vertex_PosCol.fx");
	EXPECT_EQ(model->GetEffect(), surface.GetEffect());
	ASSERT_NE(model->GetRenderTechnique(), nullptr);
	EXPECT_EQ(model->GetRenderTechnique()->GetName(), "Render");
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
	EXPECT_NE(log.find("Zeph::ModelFactory::GetCullShapeFromModel"), std::string::npos) << log;
	EXPECT_EQ((std::vector{sphere.myPosition.x, sphere.myPosition.y, sphere.myPosition.z, sphere.myRadius}),
	          (std::vector{0.0f, 0.0f, 0.0f, 1.0f}));

	// A failed load stores nothing: the second request fails (and reports) again.
	for (int attempt = 0; attempt < 2; ++attempt)
	{
		EXPECT_EQ(factory.GetModel("data/models/missing.dae"), nullptr);
		log = TakeLog();
		EXPECT_NE(log.find("Couldn't load Model: data/models/missing.dae"), std::string::npos) << log;
		EXPECT_NE(log.find("Zeph::ModelFactory::LoadModel"), std::string::npos) << log;
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
		EXPECT_NE(log.find("Zeph::Surface::SetTexture"), std::string::npos) << log;
	}
	EXPECT_EQ(surface.GetTextureCount(), 0) << "a failed binding adds nothing";
}
