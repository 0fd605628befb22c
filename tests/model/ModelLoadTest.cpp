// The model factory with a GPU: ".al" files written and loaded back with their effects,
// textures, techniques and stored bounding sphere, the load reports, every vertex type's
// layout against its effect, a lit quad on screen, generated boxes, the cull-shape fallback
// and texture paths.
#include <cmath>
#include <cstring>
#include <filesystem>
#include <gmock/gmock-matchers.h>
#include <gtest/gtest.h>
#include <iterator>
#include <utility>
#include <vector>

#include "ModelTreeCheck.h"
#include "engine/Effect.h"
#include "engine/EffectContainer.h"
#include "engine/EngineFixture.h"
#include "engine/ShaderFiles.h"
#include "engine/TextureContainer.h"
#include "model/ColladaMeshFactory.h"
#include "model/Model.h"
#include "model/ModelFactory.h"
#include "model/ModelNode.h"
#include "model/VertexTypes.h"
#include "platform/dds/DdsFile.h"
#include "platform/fx/Technique.h"
#include "platform/gpu/Readback.h"

namespace
{
class ModelLoadTest : public EngineTest
{
protected:
	// The lit effect on a model and its surfaces, as the importers set it.
	static Zeph::Effect* SetLitEffect(Zeph::Model& aModel)
	{
		Zeph::Effect* effect = Zeph::Engine::GetInstance()->GetEffectContainer().GetEffect(
		    Zeph::ShaderFiles[Zeph::EFFECT_LIT_MODEL]);
		aModel.SetEffect(effect);
		for (Zeph::Surface& surface : aModel.GetSurfaces())
		{
			surface.SetEffect(effect);
		}
		return effect;
	}
};

} // namespace

TEST_F(ModelLoadTest, AnAlFileLoadsAsTheTreeThatWasSavedWithItsTexturesAndTechniques)
{
	LUMORA_RETURN_UNLESS(CreateEngine(64, 64));
	const uint8_t red[4] = {255, 0, 0, 255};
	const uint8_t flat[4] = {128, 128, 255, 255};
	const std::string albedo = WriteSolidTexture("albedo.dds", red);
	const std::string normal = WriteSolidTexture("normal.dds", flat);
	std::unique_ptr<Zeph::ModelNode> tree(ModelTreeCheck::MakeTree());
	SetLitEffect(*tree->GetModel());
	Zeph::Surface& first = tree->GetModel()->GetSurfaces()[0];
	ASSERT_TRUE(first.SetTexture(albedo, "DiffuseTexture", true)) << TakeLog();
	ASSERT_TRUE(first.SetTexture(normal, "NormalTexture", false)) << TakeLog();
	Zeph::Model* leafModel = tree->GetChildren()[0]->GetChildren()[0]->GetModel();
	SetLitEffect(*leafModel);
	ASSERT_TRUE(leafModel->GetSurfaces()[1].SetTexture(albedo, "SubstanceTexture", true)) << TakeLog();

	const std::string path = myScratch.File("models/tree.al");
	ASSERT_TRUE(Zeph::ColladaMeshFactory::SaveModelNodeAL(*tree, path)) << TakeLog();
	const std::filesystem::directory_iterator files(myScratch.Path() / "models");
	EXPECT_EQ(std::distance(begin(files), end(files)), 1)
	    << "no temporary file is left beside the model file";

	Zeph::ModelFactory& factory = Zeph::Engine::GetInstance()->GetModelFactory();
	// Whatever the engine loaded for itself at start-up is not counted.
	const size_t baseline = factory.GetCount();
	Zeph::ModelNode* loaded = factory.CreateModelNodeAL(path);
	ASSERT_NE(loaded, nullptr) << TakeLog();
	EXPECT_EQ(ModelTreeCheck::Encoded(*loaded), ModelTreeCheck::Encoded(*tree));
	EXPECT_EQ(loaded->GetModel()->GetSurfaces()[0].GetTexture(1), first.GetTexture(1))
	    << "the shared texture";
	EXPECT_EQ(factory.GetModel(path), loaded) << "the same path gives the same tree";
	EXPECT_EQ(factory.CreateModelNodeAL(path), loaded);
	EXPECT_EQ(factory.GetCount(), baseline + 1u);

	// Each drawn model gets the lit effect and its three techniques; a null object none.
	const Zeph::Model* model = loaded->GetModel();
	ASSERT_NE(model->GetEffect(), nullptr);
	EXPECT_EQ(model->GetEffect()->GetFileName(), Zeph::ShaderFiles[Zeph::EFFECT_LIT_MODEL]);
	EXPECT_EQ(model->GetSurfaces()[1].GetEffect(), model->GetEffect());
	EXPECT_TRUE(model->GetRenderTechnique() != nullptr && model->GetGBufferTechnique()->IsValid() &&
	            model->GetShadowTechnique()->IsValid());
	const Zeph::Model* nullChild =
	    loaded->GetChildren()[0]->GetChildren()[0]->GetModel()->GetChildModels()[0];
	EXPECT_EQ(nullChild->GetEffect(), nullptr);

	// The root model's quad: x from -0.5 to 0.5 (mirrored, the same), y too, z 0.5.
	const Intersection::Sphere sphere = factory.GetCullShapeFromModel(path);
	EXPECT_FLOAT_EQ(sphere.myPosition.x, 0.0f);
	EXPECT_FLOAT_EQ(sphere.myPosition.z, 0.5f);
	EXPECT_NEAR(sphere.myRadius, std::sqrt(0.5f), 1e-6f);
}

// Every vertex type's layout feeds its effect's "Render" and shadow passes (the two lit
// effects' techniques are checked with the effect files).
TEST_F(ModelLoadTest, EveryVertexTypesLayoutFeedsItsEffect)
{
	LUMORA_RETURN_UNLESS(CreateEngine(64, 64));
	Zeph::EffectContainer& effects = Zeph::Engine::GetInstance()->GetEffectContainer();
	Gpu::Context& context = Zeph::Engine::GetInstance()->GetContext();
	for (int type = 0; type < Zeph::VERTEX_TYPE_COUNT; ++type)
	{
		Zeph::Effect* effect = effects.GetEffect(Zeph::ShaderFiles[static_cast<size_t>(type)]);
		ASSERT_NE(effect, nullptr) << TakeLog();
		GrowingArray<Gpu::InputElement> layout(10, 10);
		Zeph::BuildInputLayoutDesc(type, layout);
		for (const char* name : {"Render", "RenderShadowBuffer"})
		{
			Fx::Technique* technique = effect->GetEffect()->GetTechniqueByName(name);
			if (!technique->IsValid())
			{
				EXPECT_STREQ(name, "RenderShadowBuffer") << "type " << type << " has no Render";
				continue;
			}
			Gpu::InputLayout inputLayout;
			EXPECT_TRUE(inputLayout.Init(context,
			                             std::span<const Gpu::InputElement>(layout.begin(), layout.end()),
			                             technique->GetPassByIndex(0)->GetVertexInputs(), "test layout"))
			    << "type " << type << ", " << name << "\n"
			    << TakeLog();
			inputLayout.Destroy();
		}
	}
}

TEST_F(ModelLoadTest, ALoadedLitModelDrawnWithRenderShowsItsAlbedoLit)
{
	LUMORA_RETURN_UNLESS(CreateEngine(64, 64));
	const uint8_t albedo[4] = {200, 120, 40, 255};
	const std::string texture = WriteSolidTexture("albedo.dds", albedo);
	Zeph::ModelNode source;
	source.SetModel(ModelTreeCheck::MakeQuadModel(0.5f, 0.5f));
	SetLitEffect(*source.GetModel());
	for (Zeph::Surface& surface : source.GetModel()->GetSurfaces())
	{
		ASSERT_TRUE(surface.SetTexture(texture, "DiffuseTexture", false)) << TakeLog();
	}
	const std::string path = myScratch.File("quad.al");
	ASSERT_TRUE(Zeph::ColladaMeshFactory::SaveModelNodeAL(source, path)) << TakeLog();
	Zeph::Engine* engine = Zeph::Engine::GetInstance();
	Zeph::ModelNode* tree = engine->GetModelFactory().GetModel(path);
	ASSERT_NE(tree, nullptr) << TakeLog();
	Zeph::Model* model = tree->GetModel();

	const Matrix44<float> identity;
	Zeph::Effect* effect = model->GetEffect();
	effect->SetWorldMatrix(identity);
	effect->SetViewMatrix(identity);
	effect->SetProjectionMatrix(identity);
	// The light travels into the screen and down, at a cosine of 0.8 to the quad's normal (-z).
	const float light[3] = {1.0f, 0.5f, 1.0f};
	effect->SetDirectionalLight({0.0f, -0.6f, 0.8f, 0.0f}, {light[0], light[1], light[2], 1.0f});
	Gpu::Context& context = engine->GetContext();
	context.ClearDepthStencilView(*engine->GetDepthStencilView(), true, true, 1.0f, 0);
	Gpu::RenderTargetView* const targets[] = {engine->GetBackBufferView()};
	ASSERT_TRUE(context.SetRenderTargets(targets, engine->GetDepthStencilView()));
	ASSERT_TRUE(model->SetupBuffers(context));
	for (const Zeph::Surface& surface : model->GetSurfaces())
	{
		surface.ActivateTextures();
		context.SetPrimitiveTopology(surface.GetPrimitiveTopology());
		ASSERT_TRUE(model->GetRenderTechnique()->GetPassByIndex(0)->Apply(context));
		ASSERT_TRUE(context.DrawIndexed(static_cast<uint32_t>(surface.GetIndexCount()),
		                                static_cast<uint32_t>(surface.GetStartIndex()), 0));
	}
	std::vector<uint8_t> pixels;
	ASSERT_TRUE(Gpu::ReadRenderTarget(context, *engine->GetBackBufferView(), pixels));
	const size_t centre = (32 * 64 + 32) * 4;
	for (size_t channel = 0; channel < 3; ++channel)
	{
		const float lit = static_cast<float>(albedo[channel]) / 255.0f * light[channel] * 0.8f;
		EXPECT_NEAR(pixels[centre + channel], TestSupport::SrgbEncoded(lit), 2) << "channel " << channel;
	}
}

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

TEST_F(ModelFactoryTest, ModelsThatCannotLoadAreReportedAndNotStoredAndUnknownNamesFallBack)
{
	LUMORA_RETURN_UNLESS(CreateEngine(64, 64));
	Zeph::ModelFactory& factory = Zeph::Engine::GetInstance()->GetModelFactory();
	// Whatever the engine loaded for itself at start-up is not counted.
	const size_t baseline = factory.GetCount();
	const Intersection::Sphere sphere = factory.GetCullShapeFromModel("data/models/nothing.dae");
	EXPECT_THAT(TakeLog(), testing::HasSubstr("Tried to get radius for model not in container!"));
	EXPECT_EQ((std::vector{sphere.myPosition.x, sphere.myPosition.y, sphere.myPosition.z, sphere.myRadius}),
	          (std::vector{0.0f, 0.0f, 0.0f, 1.0f}));

	// Each reason is reported before the load's own failure; a failed load stores nothing, so
	// the second request fails (and reports) again.
	const std::string damaged = myScratch.File("damaged.al");
	const std::string missing = myScratch.File("missing.al");
	TestSupport::WriteWholeFile(damaged, std::string("\x02\x00\x00\x00\x07", 5));
	const std::pair<std::string, std::string> loads[] = {
	    {"data/models/crate", "Invalid model file format: data/models/crate\n"},
	    {missing, "Failed to open " + missing + ":\n"},
	    {damaged, "Damaged model file " + damaged + ": "},
	    {damaged, "Damaged model file " + damaged + ": "},
	};
	for (const auto& [name, reason] : loads)
	{
		EXPECT_EQ(factory.GetModel(name), nullptr) << name;
		const std::string log = TakeLog();
		const size_t failed =
		    log.find("\"Zeph::ModelFactory::LoadModel\"\n\"Couldn't load Model: " + name + "\n");
		EXPECT_LT(log.find(reason), failed) << log;
		EXPECT_NE(failed, std::string::npos) << log;
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
