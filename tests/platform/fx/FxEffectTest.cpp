// Effects on the device: lookups by name, the render states a pass declares, and damaged
// files. (What the shipped effects draw, with their matrices, initializers, samplers and
// several passes sharing variables, shows in every golden frame.)

#include <array>
#include <deque>
#include <tuple>

#include "GpuTest.h"
#include "platform/fx/CompiledFormat.h"
#include "platform/fx/Effect.h"
#include "support/TestSupport.h"

class FxEffectTest : public GpuTest
{
protected:
	void TearDown() override
	{
		for (Fx::Effect& effect : myEffects)
		{
			effect.Destroy();
		}
		GpuTest::TearDown();
	}

	// An effect from a compiled file under data/; null (test failed) when it does not load.
	Fx::Effect* Load(const std::string& aCompiledPath)
	{
		const std::string text = TestSupport::ReadWholeFile(aCompiledPath);
		const std::vector<uint8_t> bytes(text.begin(), text.end());
		Fx::Effect& effect = myEffects.emplace_back();
		EXPECT_TRUE(effect.Init(GetContext(), bytes, aCompiledPath)) << Joined();
		return effect.GetTechniqueCount() > 0 ? &effect : nullptr;
	}

	std::deque<Fx::Effect> myEffects;
};

TEST_F(FxEffectTest, LooksUpTechniquesPassesAndVariablesByName)
{
	Fx::Effect* effect = Load("data/Shaders/Misc/Vertex_PosCol.fxal");
	ASSERT_NE(effect, nullptr);
	// (An unknown technique or variable name gives an invalid object: the engine's effect reports on it.)
	EXPECT_EQ(effect->GetTechniqueByName("RenderWireFrame"), effect->GetTechniqueByIndex(1));
	EXPECT_EQ(effect->GetTechniqueByIndex(2)->GetPassByIndex(0), nullptr);
	Fx::Technique* render = effect->GetTechniqueByName("Render");
	EXPECT_EQ(render->GetPassByName("P0"), render->GetPassByIndex(0));
	EXPECT_EQ(render->GetPassByName("P1"), nullptr);
	Fx::Variable* world = effect->GetVariableByName("World");
	EXPECT_EQ(std::tuple(world->GetType(), world->GetElementCount(), effect->GetVariableByIndex(0)),
	          std::tuple(Fx::VariableType::Mat4, 0, world));
	// An unknown name gives a variable that takes nothing, quietly.
	const float values[16] = {};
	EXPECT_FALSE(effect->GetVariableByName("WorldViewProjection")->SetMatrix(values));
	EXPECT_TRUE(TakeReports().empty());

	// Wrong kinds of value and ranges past the end are reported and change nothing.
	EXPECT_FALSE(world->SetFloat(2.0f));
	EXPECT_FALSE(world->SetFloatVector(values));
	EXPECT_FALSE(world->SetMatrixArray(values, 1, 1));
	EXPECT_FALSE(world->SetResource(nullptr));
	ExpectReports({{"Variable 'World' is a mat4, not a float"}, {}, {"outside variable 'World'"}, {}});
	EXPECT_EQ(world->GetVersion(), 0u);
}

// Applied in this order: Vertex_PosCol's Render declares depth and rasterizer states, not blending,
// so the sprite's blending stays on; its RenderWireFrame only rasterizer states, so its depth states
// stay; Line2D tests depth without writing it and culls nothing, and its rasterizer group fills again.
TEST_F(FxEffectTest, PassesSetOnlyTheStateGroupsTheyDeclare)
{
	const struct
	{
		const char* myFile;
		const char* myTechnique;
		std::array<GLint, 5> myStates; // blend, depth test, depth write, cull, polygon mode
	} passes[] = {{"data/Shaders/Sprite/Sprite.fxal", "Render", {1, 0, 0, 0, GL_FILL}},
	              {"data/Shaders/Misc/Vertex_PosCol.fxal", "Render", {1, 1, 1, 1, GL_FILL}},
	              {"data/Shaders/Misc/Vertex_PosCol.fxal", "RenderWireFrame", {1, 1, 1, 0, GL_LINE}},
	              {"data/Shaders/Misc/Line2D.fxal", "Render", {1, 1, 0, 0, GL_FILL}}};
	for (const auto& pass : passes)
	{
		SCOPED_TRACE(std::string(pass.myFile) + " " + pass.myTechnique);
		Fx::Effect* effect = Load(pass.myFile);
		ASSERT_NE(effect, nullptr);
		ASSERT_TRUE(effect->GetTechniqueByName(pass.myTechnique)->GetPassByIndex(0)->Apply(GetContext()));
		GLboolean writeMask = GL_FALSE;
		glGetBooleanv(GL_DEPTH_WRITEMASK, &writeMask);
		GLint polygonMode[2] = {};
		glGetIntegerv(GL_POLYGON_MODE, polygonMode);
		EXPECT_EQ((std::array<GLint, 5>{glIsEnabled(GL_BLEND), glIsEnabled(GL_DEPTH_TEST), writeMask,
		                                glIsEnabled(GL_CULL_FACE), polygonMode[0]}),
		          pass.myStates);
	}
}

TEST_F(FxEffectTest, DamagedAndUnlinkableEffectsAreReported)
{
	const std::string text = TestSupport::ReadWholeFile("data/Shaders/Misc/Vertex_PosCol.fxal");
	std::vector<uint8_t> bytes(text.begin(), text.end());
	ASSERT_FALSE(bytes.empty());
	Fx::Effect effect;
	const std::vector<uint8_t> truncated(bytes.begin(),
	                                     bytes.begin() + static_cast<std::ptrdiff_t>(bytes.size() / 2));
	EXPECT_FALSE(effect.Init(GetContext(), truncated, "half of Vertex_PosCol"));
	ExpectReports({{"'half of Vertex_PosCol' is not a usable compiled effect"}});
	EXPECT_FALSE(effect.GetTechniqueByName("Render")->IsValid());

	// Stages that compile alone but disagree on an interface variable.
	Fx::EffectDesc desc;
	std::string error;
	ASSERT_TRUE(Fx::ReadCompiled(bytes, desc, error)) << error;
	ASSERT_EQ(desc.myStages.size(), 2u);
	std::string& fragment = desc.myStages[1].mySource;
	const size_t input = fragment.find("in vec4 vColor;");
	const size_t output = fragment.find("oColor = vColor;");
	ASSERT_TRUE(input != std::string::npos && output != std::string::npos);
	fragment.replace(output, 16, "oColor = vec4(vColor, 1.0);");
	fragment.replace(input, 15, "in vec3 vColor;");
	Fx::WriteCompiled(desc, bytes);
	EXPECT_FALSE(effect.Init(GetContext(), bytes, "mismatched"));
	ExpectReports({{"'mismatched': pass 'P0' of technique 'Render' does not link"}});
	effect.Destroy();
}
