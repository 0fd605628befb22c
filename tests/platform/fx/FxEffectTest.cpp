// Drawing with effects: lookups by name, variables reaching their passes, engine
// matrices, the render states a pass declares, samplers, and damaged files.

#include <array>
#include <cstring>
#include <deque>

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

std::vector<ColorVertex> Reversed(std::vector<ColorVertex> someVertices)
{
	std::swap(someVertices[1], someVertices[3]);
	return someVertices;
}

// Row-major engine matrices for row vectors: translation in the last row.
std::array<float, 16> Translation(float anX, float aY, float aZ)
{
	return {1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1, 0, anX, aY, aZ, 1};
}

std::array<float, 16> Scale(float aFactor)
{
	return {aFactor, 0, 0, 0, 0, aFactor, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1};
}

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
		Clear();
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

	void Clear()
	{
		GetContext().ClearRenderTargetView(*myTarget, myClearColor);
		GetContext().ClearDepthStencilView(*myDepth, true, false, 1.0f, 0);
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

	// The target's pixels, also written to /tmp/lumora-fx-<name>.png when named, to look at.
	std::vector<uint8_t> ReadAll(const char* aPngName = nullptr)
	{
		const std::vector<uint8_t> bytes = ReadPixels(*myTarget);
		if (aPngName && bytes.size() == 64 * 64 * 4)
		{
			Gpu::SavePng(std::string("/tmp/lumora-fx-") + aPngName + ".png", 64, 64, bytes.data());
		}
		return bytes;
	}

	static Pixel At(const std::vector<uint8_t>& someBytes, int anX, int aY)
	{
		return PixelAt(someBytes, 64, anX, aY);
	}

	int CountNotClear(const std::vector<uint8_t>& someBytes)
	{
		int count = 0;
		for (int at = 0; at < 64 * 64; ++at)
		{
			count += At(someBytes, at, 0) != myClearPixel ? 1 : 0;
		}
		return count;
	}

	void SetIdentityCamera(Fx::Effect& anEffect)
	{
		const std::array<float, 16> identity = Scale(1.0f);
		for (const char* name : {"World", "View", "Projection"})
		{
			EXPECT_TRUE(anEffect.GetVariableByName(name)->SetMatrix(identity.data())) << name;
		}
	}

	const float myClearColor[4] = {0.0f, 0.0f, 1.0f, 1.0f};
	const Pixel myClearPixel = {0, 0, 255, 255};
	Gpu::RenderTargetView* myTarget = nullptr;
	Gpu::DepthStencilView* myDepth = nullptr;
	std::deque<Fx::Effect> myEffects;
	std::deque<Gpu::InputLayout> myLayouts;
};

TEST_F(FxEffectTest, LooksUpTechniquesPassesAndVariablesByName)
{
	Fx::Effect* effect = Load("data/Shaders/Misc/Vertex_PosCol.fxal");
	ASSERT_NE(effect, nullptr);
	ASSERT_EQ(effect->GetTechniqueCount(), 2);
	EXPECT_EQ(effect->GetTechniqueByIndex(0)->GetName(), "Render");
	EXPECT_EQ(effect->GetTechniqueByIndex(1)->GetName(), "RenderWireFrame");
	EXPECT_EQ(effect->GetTechniqueByName("RenderWireFrame"), effect->GetTechniqueByIndex(1));
	Fx::Technique* missing = effect->GetTechniqueByName("RenderSolid");
	ASSERT_NE(missing, nullptr);
	EXPECT_FALSE(missing->IsValid());
	EXPECT_EQ(missing->GetPassCount(), 0);
	EXPECT_EQ(missing->GetPassByIndex(0), nullptr);
	EXPECT_FALSE(effect->GetTechniqueByIndex(2)->IsValid());

	Fx::Technique* render = effect->GetTechniqueByName("Render");
	EXPECT_TRUE(render->IsValid());
	ASSERT_EQ(render->GetPassCount(), 1);
	EXPECT_EQ(render->GetPassByName("P0"), render->GetPassByIndex(0));
	EXPECT_EQ(render->GetPassByName("P1"), nullptr);
	const std::span<const Gpu::AttributeLocation> inputs = render->GetPassByIndex(0)->GetVertexInputs();
	ASSERT_EQ(inputs.size(), 2u);
	for (const auto& [index, name] : {std::pair{0, "POSITION"}, std::pair{1, "COLOR"}})
	{
		EXPECT_EQ(inputs[index].mySemanticName, name);
		EXPECT_EQ(inputs[index].mySemanticIndex, 0u);
		EXPECT_EQ(inputs[index].myLocation, index);
	}

	EXPECT_EQ(effect->GetVariableCount(), 4);
	Fx::Variable* world = effect->GetVariableByName("World");
	EXPECT_TRUE(world->IsValid());
	EXPECT_EQ(world->GetType(), Fx::VariableType::Mat4);
	EXPECT_EQ(world->GetElementCount(), 0);
	EXPECT_EQ(effect->GetVariableByIndex(0), world);

	// An unknown name gives a variable that takes nothing, quietly.
	Fx::Variable* unknown = effect->GetVariableByName("WorldViewProjection");
	ASSERT_NE(unknown, nullptr);
	EXPECT_FALSE(unknown->IsValid());
	const float values[16] = {};
	EXPECT_FALSE(unknown->SetMatrix(values));
	EXPECT_FALSE(unknown->SetFloat(1.0f));
	EXPECT_FALSE(unknown->SetResource(nullptr));
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
	EXPECT_EQ(technique->GetPassByIndex(0)->GetName(), "Left");
	EXPECT_EQ(technique->GetPassByIndex(1)->GetName(), "Right");

	// Declared but used by no pass: still a variable, which nobody receives.
	Fx::Variable* unused = effect->GetVariableByName("Unused");
	EXPECT_TRUE(unused->IsValid());
	EXPECT_TRUE(unused->SetFloat(3.0f));
	EXPECT_EQ(unused->GetFloats()[0], 3.0f);
	EXPECT_EQ(technique->GetPassByIndex(0)->GetLocation(1), -1);

	Draw(technique->GetPassByIndex(0), Quad(-1, 1, 0, -1, ourOrange));
	EXPECT_EQ(At(ReadAll(), 16, 32), ourGreen);

	const float red[4] = {1.0f, 0.0f, 0.0f, 1.0f};
	ASSERT_TRUE(effect->GetVariableByName("Tint")->SetFloatVector(red));
	Draw(technique->GetPassByIndex(0), Quad(-1, 1, 0, -1, ourOrange));
	Draw(technique->GetPassByIndex(1), Quad(0, 1, 1, -1, ourOrange));
	const std::vector<uint8_t> pixels = ReadAll("variables");
	EXPECT_EQ(At(pixels, 16, 32), ourRed);
	EXPECT_EQ(At(pixels, 48, 32), ourRed);
}

TEST_F(FxEffectTest, VertexPosColTransformsByEngineMatricesAndDrawsSolidOrWireframe)
{
	Fx::Effect* effect = Load("data/Shaders/Misc/Vertex_PosCol.fxal");
	ASSERT_NE(effect, nullptr);
	Fx::Pass* solid = effect->GetTechniqueByName("Render")->GetPassByIndex(0);
	Fx::Pass* wire = effect->GetTechniqueByName("RenderWireFrame")->GetPassByIndex(0);
	// v * World * View, as row vectors: x moves right by 0.5, then everything halves.
	const std::array<float, 16> world = Translation(0.5f, 0.0f, 0.0f);
	const std::array<float, 16> view = Scale(0.5f);
	SetIdentityCamera(*effect);
	ASSERT_TRUE(effect->GetVariableByName("World")->SetMatrix(world.data()));
	ASSERT_TRUE(effect->GetVariableByName("View")->SetMatrix(view.data()));
	Draw(solid, Quad(-0.5f, 1.0f, 0.5f, 0.0f, ourOrange));
	// Clip x 0..0.5 is columns 32..47; clip y 0..0.5 (up) is rows 16..31 (row 0 at the top).
	const std::vector<uint8_t> pixels = ReadAll("vertex_poscol");
	for (const auto& [x, y] : {std::pair{32, 16}, std::pair{47, 31}})
	{
		EXPECT_EQ(At(pixels, x, y), ourOrange) << x << ", " << y;
	}
	EXPECT_EQ(CountNotClear(pixels), 16 * 16);

	Clear();
	SetIdentityCamera(*effect);
	Draw(solid, Quad(-0.5f, 0.5f, 0.5f, -0.5f, ourOrange));
	const std::vector<uint8_t> filled = ReadAll("solid");
	EXPECT_EQ(At(filled, 32, 32), ourOrange);
	EXPECT_EQ(CountNotClear(filled), 32 * 32);

	Clear();
	Draw(wire, Quad(-0.5f, 0.5f, 0.5f, -0.5f, ourOrange));
	const std::vector<uint8_t> outlined = ReadAll("wireframe");
	EXPECT_EQ(At(outlined, 32, 24), myClearPixel);
	// The left edge lies on the boundary between columns 15 and 16.
	EXPECT_TRUE(At(outlined, 15, 32) == ourOrange || At(outlined, 16, 32) == ourOrange);
	EXPECT_GT(CountNotClear(outlined), 4 * 28);
	EXPECT_LT(CountNotClear(outlined), 32 * 32 / 2);

	// Render culls back faces; RenderWireFrame culls nothing.
	Clear();
	Draw(solid, Reversed(Quad(-0.5f, 0.5f, 0.5f, -0.5f, ourOrange)));
	EXPECT_EQ(CountNotClear(ReadAll()), 0);
	Draw(wire, Reversed(Quad(-0.5f, 0.5f, 0.5f, -0.5f, ourOrange)));
	EXPECT_EQ(CountNotClear(ReadAll()), CountNotClear(outlined));
}

// Applied in this order: Vertex_PosCol's Render declares depth and rasterizer states, not blending,
// so the sprite's blending stays on; Line2D tests depth without writing it and culls nothing.
TEST_F(FxEffectTest, PassesSetOnlyTheStateGroupsTheyDeclare)
{
	const struct
	{
		const char* myFile;
		GLboolean myBlendFlag;
		GLboolean myDepthTestFlag;
		GLboolean myDepthWriteFlag;
		GLboolean myCullFlag;
	} passes[] = {{"data/Shaders/Sprite/Sprite.fxal", GL_TRUE, GL_FALSE, GL_FALSE, GL_FALSE},
	              {"data/Shaders/Misc/Vertex_PosCol.fxal", GL_TRUE, GL_TRUE, GL_TRUE, GL_TRUE},
	              {"data/Shaders/Misc/Line2D.fxal", GL_TRUE, GL_TRUE, GL_FALSE, GL_FALSE}};
	for (const auto& pass : passes)
	{
		SCOPED_TRACE(pass.myFile);
		Fx::Effect* effect = Load(pass.myFile);
		ASSERT_NE(effect, nullptr);
		ASSERT_TRUE(effect->GetTechniqueByName("Render")->GetPassByIndex(0)->Apply(GetContext()));
		GLboolean writeMask = GL_FALSE;
		glGetBooleanv(GL_DEPTH_WRITEMASK, &writeMask);
		EXPECT_EQ(glIsEnabled(GL_BLEND), pass.myBlendFlag);
		EXPECT_EQ(glIsEnabled(GL_DEPTH_TEST), pass.myDepthTestFlag);
		EXPECT_EQ(writeMask, pass.myDepthWriteFlag);
		EXPECT_EQ(glIsEnabled(GL_CULL_FACE), pass.myCullFlag);
	}
}

TEST_F(FxEffectTest, SpriteSamplesWithItsClampSamplerAndBlends)
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
	const std::vector<uint8_t> clamped = ReadAll("sprite_clamp");
	EXPECT_EQ(At(clamped, 2, 32), ourRed);
	EXPECT_EQ(At(clamped, 38, 32), ourGreen); // u = 1.2: past the edge, the last texel

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
	const std::vector<uint8_t> wrapped = ReadAll("sprite_wrap");
	EXPECT_EQ(At(wrapped, 38, 32), ourRed);
	EXPECT_EQ(At(wrapped, 60, 32), ourGreen);

	// Half-transparent tint: SrcAlpha / InvSrcAlpha over the blue clear colour.
	Clear();
	const float half[4] = {1, 1, 1, 0.5f};
	ASSERT_TRUE(sprite->GetVariableByName("SpriteColor")->SetFloatVector(half));
	Draw(sprite->GetTechniqueByName("Render")->GetPassByIndex(0), quad);
	const Pixel blended = At(ReadAll("sprite_blend"), 50, 32);
	EXPECT_EQ(blended[0], 0);
	EXPECT_NEAR(blended[1], 128, 1);
	EXPECT_NEAR(blended[2], 128, 1);
	EXPECT_EQ(blended[3], 255);

	// Null unbinds: the sampler then reads black.
	ASSERT_TRUE(sprite->GetVariableByName("SpriteTexture")->SetResource(nullptr));
	EXPECT_EQ(sprite->GetVariableByName("SpriteTexture")->GetResource(), nullptr);
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
