// Drawing with effects: lookups by name, variables reaching their passes, the render
// states a pass declares, samplers, and damaged files. (The engine matrices of the
// shipped effects show in every rendered frame.)

#include <array>
#include <deque>
#include <tuple>

#include "GpuTest.h"
#include "platform/fx/CompiledFormat.h"
#include "platform/fx/Compiler.h"
#include "platform/fx/Effect.h"
#include "support/TestSupport.h"

namespace
{
struct SpriteVertex
{
	float myPosition[3];
	float myTexCoord[2];
};

const Pixel ourOrange = {255, 128, 0, 255};
const Pixel ourRed = {255, 0, 0, 255};
const Pixel ourGreen = {0, 255, 0, 255};
} // namespace

class FxEffectTest : public GpuTest
{
protected:
	void SetUpGpu() override
	{
		Gpu::Texture* depth = MakeTarget(Dds::Format::D32_FLOAT, 64, 64);
		ASSERT_NE(depth, nullptr);
		myDepth = depth->CreateDepthStencilView();
		myTarget = BindTarget(Dds::Format::R8G8B8A8_UNORM, 64, 64, myDepth);
		ASSERT_NE(myTarget, nullptr);
		GetContext().ClearRenderTargetView(*myTarget, myClearColor);
		GetContext().ClearDepthStencilView(*myDepth, true, false, 1.0f, 0);
	}

	void TearDown() override
	{
		for (Gpu::InputLayout& layout : myLayouts)
		{
			layout.Destroy();
		}
		for (Fx::Effect& effect : myEffects)
		{
			effect.Destroy();
		}
		GpuTest::TearDown();
	}

	// An effect from a compiled file under data/, or from source; null (test failed) when it does not load.
	Fx::Effect* Load(const std::string& aCompiledPath)
	{
		const std::string bytes = TestSupport::ReadWholeFile(aCompiledPath);
		return Make({bytes.begin(), bytes.end()}, aCompiledPath);
	}

	Fx::Effect* Compile(const std::string& aSource)
	{
		Fx::CompileOutput output;
		EXPECT_TRUE(Fx::CompileFromMemory(aSource, "Test.fx", output)) << output.myMessages;
		return Make(output.myCompiled, "Test.fx");
	}

	Fx::Effect* Make(const std::vector<uint8_t>& someCompiled, const std::string& aName)
	{
		Fx::Effect& effect = myEffects.emplace_back();
		EXPECT_TRUE(effect.Init(GetContext(), someCompiled, aName)) << Joined();
		return effect.GetTechniqueCount() > 0 ? &effect : nullptr;
	}

	// Applies the pass and draws the vertices as quads through an input layout made from its inputs.
	template <typename Vertex> void Draw(Fx::Pass* aPass, const std::vector<Vertex>& someVertices)
	{
		ASSERT_NE(aPass, nullptr);
		const bool colorFlag = std::is_same_v<Vertex, ColorVertex>;
		const Gpu::InputElement elements[] = {
		    {"POSITION", 0, Dds::Format::R32G32B32_FLOAT, 0, 0},
		    {colorFlag ? "COLOR" : "TEXCOORD", 0,
		     colorFlag ? Dds::Format::R8G8B8A8_UNORM : Dds::Format::R32G32_FLOAT, 0, 12},
		};
		Gpu::InputLayout& layout = myLayouts.emplace_back();
		ASSERT_TRUE(layout.Init(GetContext(), elements, aPass->GetVertexInputs(), "test vertices"));
		ASSERT_TRUE(aPass->Apply(GetContext()));
		GetContext().SetInputLayout(&layout);
		DrawVertices(someVertices);
	}

	Pixel At(int anX, int aY) { return PixelAt(ReadPixels(*myTarget), 64, anX, aY); }

	const float myClearColor[4] = {0.0f, 0.0f, 1.0f, 1.0f};
	Gpu::RenderTargetView* myTarget = nullptr;
	Gpu::DepthStencilView* myDepth = nullptr;
	std::deque<Fx::Effect> myEffects;
	std::deque<Gpu::InputLayout> myLayouts;
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

TEST_F(FxEffectTest, VariablesKeepTheirInitializerUntilSetAndReachEveryPass)
{
	Fx::Effect* effect = Compile(R"(
uniform vec4 Tint = vec4(0.0, 1.0, 0.0, 1.0);
uniform float Unused;
vertex V { in vec3 POSITION; void main() { gl_Position = vec4(POSITION, 1.0); } }
fragment F { out vec4 o; void main() { o = Tint; } }
technique T
{
	pass Left { VertexShader = V; PixelShader = F; CullMode = None; DepthEnable = false; }
	pass Right { VertexShader = V; PixelShader = F; }
}
)");
	ASSERT_NE(effect, nullptr);
	Fx::Technique* technique = effect->GetTechniqueByName("T");
	ASSERT_EQ(technique->GetPassCount(), 2);
	// Declared but used by no pass: still a variable, which nobody receives.
	Fx::Variable* unused = effect->GetVariableByName("Unused");
	EXPECT_TRUE(unused->SetFloat(3.0f));
	EXPECT_EQ(unused->GetFloats()[0], 3.0f);
	EXPECT_EQ(technique->GetPassByIndex(0)->GetLocation(1), -1);

	Draw(technique->GetPassByIndex(0), Quad(-1, 1, 0, -1, ourOrange));
	EXPECT_EQ(At(16, 32), ourGreen);
	const float red[4] = {1.0f, 0.0f, 0.0f, 1.0f};
	ASSERT_TRUE(effect->GetVariableByName("Tint")->SetFloatVector(red));
	Draw(technique->GetPassByIndex(0), Quad(-1, 1, 0, -1, ourOrange));
	Draw(technique->GetPassByIndex(1), Quad(0, 1, 1, -1, ourOrange));
	EXPECT_EQ(At(16, 32), ourRed);
	EXPECT_EQ(At(48, 32), ourRed);
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

TEST_F(FxEffectTest, SpriteSamplesWithItsClampSamplerAndDeclaredSamplersWrap)
{
	Fx::Effect* sprite = Load("data/Shaders/Sprite/Sprite.fxal");
	ASSERT_NE(sprite, nullptr);
	// Two texels, red then green.
	Gpu::Texture* texture = MakeTexture(
	    {.myWidth = 2, .myHeight = 1, .myFormat = Dds::Format::R8G8B8A8_UNORM, .myLabel = "red green"});
	ASSERT_NE(texture, nullptr);
	const uint8_t texels[8] = {255, 0, 0, 255, 0, 255, 0, 255};
	ASSERT_TRUE(texture->Upload(0, 0, texels, 8));

	// A full-screen quad with u running 0..2 from left to right.
	auto vertex = [](float anX, float aY, float aU) {
		return SpriteVertex{{anX, aY, 0.5f}, {aU, aY > 0 ? 0.0f : 1.0f}};
	};
	const std::vector<SpriteVertex> quad = {vertex(-1, 1, 0), vertex(1, 1, 2), vertex(1, -1, 2),
	                                        vertex(-1, -1, 0)};
	const float opaque[4] = {1, 1, 1, 1};
	ASSERT_TRUE(
	    sprite->GetVariableByName("SpriteTexture")->SetResource(texture->GetDefaultShaderResourceView()));
	ASSERT_TRUE(sprite->GetVariableByName("SpriteColor")->SetFloatVector(opaque));
	Draw(sprite->GetTechniqueByName("Render")->GetPassByIndex(0), quad);
	EXPECT_EQ(At(2, 32), ourRed);
	EXPECT_EQ(At(38, 32), ourGreen); // u = 1.2: past the edge, the last texel

	// The same texture through a point sampler that wraps: u = 1.2 is the first texel again.
	Fx::Effect* wrapping = Compile(R"(
uniform sampler2D Texture;
sampler Texture { Filter = MIN_MAG_MIP_POINT; AddressU = Wrap; }
vertex V { in vec3 POSITION; in vec2 TEXCOORD0; out vec2 vUv; void main() { vUv = TEXCOORD0; gl_Position = vec4(POSITION, 1); } }
fragment F { in vec2 vUv; out vec4 o; void main() { o = texture(Texture, vUv); } }
technique T { pass P { VertexShader = V; PixelShader = F; CullMode = None; DepthEnable = false; } }
)");
	ASSERT_NE(wrapping, nullptr);
	ASSERT_TRUE(wrapping->GetVariableByName("Texture")->SetResource(texture->GetDefaultShaderResourceView()));
	Draw(wrapping->GetTechniqueByName("T")->GetPassByIndex(0), quad);
	EXPECT_EQ(At(38, 32), ourRed);
	EXPECT_EQ(At(60, 32), ourGreen);
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
