// Effects through the engine's container: sharing by name, the sprite effect
// compiled from source, the line effect kept apart, retrying failed loads, the
// reports of missing variables, and the setters reaching their variables.

#include <filesystem>

#include "EngineFixture.h"
#include "engine/ShaderFiles.h"
#include "platform/fx/Compiler.h"

namespace
{
using testing::AllOf;
using testing::HasSubstr;
using testing::Not;

// Runs a test in a scratch copy of data/Shaders: the engine reads data/ relative to
// the working directory, so the copy can be damaged without touching the real one.
class WorkingDirectory
{
public:
	explicit WorkingDirectory(const std::filesystem::path& aPath)
	    : myPrevious(std::filesystem::current_path())
	{
		std::filesystem::create_directories(aPath / "data");
		std::filesystem::copy(myPrevious / "data" / "Shaders", aPath / "data" / "Shaders",
		                      std::filesystem::copy_options::recursive);
		std::filesystem::current_path(aPath);
	}
	~WorkingDirectory() { std::filesystem::current_path(myPrevious); }

private:
	std::filesystem::path myPrevious;
};

// Compiles an effect source written into the working directory's data/ to its .fxal.
void WriteCompiledEffect(const std::string& aPath, const std::string& aSource)
{
	std::filesystem::create_directories(std::filesystem::path(aPath).parent_path());
	TestSupport::WriteWholeFile(aPath, aSource);
	Fx::CompileOutput output;
	ASSERT_TRUE(Fx::CompileFromFile(aPath, output)) << output.myMessages;
	TestSupport::WriteWholeFile(aPath + "al",
	                            std::string(output.myCompiled.begin(), output.myCompiled.end()));
}

const char* const ourPlainPass = R"(
vertex VS
{
	in vec3 POSITION;
	void main() { gl_Position = Projection * (View * vec4(POSITION, 1.0)); }
}
fragment PS
{
	out vec4 oColor;
	void main() { oColor = vec4(1.0); }
}
technique Render { pass P0 { VertexShader = VS; PixelShader = PS; } }
technique RenderOther { pass P0 { VertexShader = VS; PixelShader = PS; } }
)";
} // namespace

// One engine and one container in a scratch copy of data/Shaders, through all of it.
TEST_F(EngineTest, TheContainerSharesRetriesCompilesTheSpriteFromSourceAndEffectsReachTheirVariables)
{
	LUMORA_RETURN_UNLESS(CreateEngine(64, 64));
	WorkingDirectory directory(myScratch.Path() / "work");
	Zeph::EffectContainer& container = Zeph::Engine::GetInstance()->GetEffectContainer();
	// Whatever the engine loaded for itself at start-up is not counted.
	const size_t baseline = container.GetCount();
	Zeph::Effect* posCol = container.GetEffect("Data/Shaders/Misc/Vertex_PosCol.fx");
	ASSERT_NE(posCol, nullptr) << TakeLog();
	EXPECT_EQ(container.GetEffect("Data/Shaders/Misc/Vertex_PosCol.fx"), posCol);
	EXPECT_TRUE(posCol->GetTechnique()->IsValid());
	EXPECT_EQ(posCol->GetTechnique()->GetName(), "Render");
	EXPECT_EQ(container.GetCount(), baseline + 1u);

	Zeph::Effect* line = container.GetEffect(Zeph::ShaderFiles[Zeph::EFFECT_LINE]);
	ASSERT_NE(line, nullptr) << TakeLog();
	EXPECT_EQ(container.GetEffect("data/shaders/misc/Line2D.fx"), line);
	EXPECT_TRUE(line->GetTechnique()->IsValid());
	EXPECT_EQ(container.GetCount(), baseline + 1u) << "the line effect is not in the map";

	for (int attempt = 0; attempt < 2; ++attempt)
	{
		EXPECT_EQ(container.GetEffect("data/Shaders/Misc/Missing.fx"), nullptr);
		EXPECT_THAT(TakeLog(), AllOf(HasSubstr("Cant Create Effect"), HasSubstr("Zeph::Effect::Init"),
		                             HasSubstr("data/Shaders/Misc/Missing.fxal")))
		    << "attempt " << attempt;
	}
	EXPECT_EQ(container.GetCount(), baseline + 1u);

	// A broken sprite source: the compiler's text, with the line, and at the debug level too;
	// the next request compiles it again.
	const std::string spriteSource = TestSupport::ReadWholeFile("data/Shaders/Sprite/Sprite.fx");
	TestSupport::WriteWholeFile("data/Shaders/Sprite/Sprite.fx",
	                            "vertex VS { void main() { gl_Position = undefinedThing; } }\n"
	                            "fragment PS { out vec4 oColor; void main() { oColor = vec4(1.0); } }\n"
	                            "technique Render { pass P0 { VertexShader = VS; PixelShader = PS; } }\n");
	for (int attempt = 0; attempt < 2; ++attempt)
	{
		EXPECT_EQ(container.GetEffect(Zeph::ShaderFiles[Zeph::EFFECT_SPRITE]), nullptr);
		EXPECT_FALSE(container.HasSpriteEffect());
		EXPECT_THAT(TakeLog(), AllOf(HasSubstr("Invalid Effect File: data/Shaders/Sprite/Sprite.fx"),
		                             HasSubstr("Zeph::EffectContainer::InitSpriteEffect"),
		                             HasSubstr("data/Shaders/Sprite/Sprite.fx(1)"), HasSubstr("\"DEBUG\"")));
	}

	// The sprite effect is compiled from its source and never reads a compiled file: damaged
	// compiled files leave it alone, while another effect fails on its own.
	TestSupport::WriteWholeFile("data/Shaders/Sprite/Sprite.fx", spriteSource);
	TestSupport::WriteWholeFile("data/Shaders/Sprite/Sprite.fxal", "not a compiled effect");
	TestSupport::WriteWholeFile("data/Shaders/Misc/Vertex_Pos.fxal", "not a compiled effect");
	Zeph::Effect* sprite = container.GetEffect(Zeph::ShaderFiles[Zeph::EFFECT_SPRITE]);
	ASSERT_NE(sprite, nullptr) << TakeLog();
	EXPECT_TRUE(container.HasSpriteEffect());
	EXPECT_TRUE(sprite->GetTechnique()->IsValid());
	EXPECT_EQ(sprite->GetTechnique()->GetName(), "Render");
	EXPECT_EQ(container.GetEffect("data/Shaders/Sprite/Sprite.fx"), sprite);
	EXPECT_EQ(container.GetCount(), baseline + 1u);
	EXPECT_EQ(container.GetEffect("Data/Shaders/Misc/Vertex_Pos.fx"), nullptr);
	EXPECT_THAT(TakeLog(), HasSubstr("Cant Create Effect"));

	// The variables an effect must have are reported, not refused; the setters reach theirs.
	WriteCompiledEffect("data/Shaders/Test/NoWorld.fx",
	                    std::string("uniform mat4 View;\nuniform mat4 Projection;\n") + ourPlainPass);
	WriteCompiledEffect("data/Shaders/Test/Full.fx", std::string(R"(
uniform mat4 World;
uniform mat4 View;
uniform mat4 Projection;
uniform float FarPlane;
uniform vec4 EyePos;
uniform vec4 LightDirection;
uniform vec4 LightColor;
uniform vec4 EnvBoxPos;
uniform vec4 EnvBoxMax;
uniform vec4 EnvBoxMin;
uniform vec4 PointLightColors[4];
uniform vec4 PointLightPositions[4];
uniform float PointLightRanges[4];
uniform float Time;
uniform sampler2D AlbedoTexture;
)") + ourPlainPass);
	ASSERT_NE(container.GetEffect("data/Shaders/Test/NoWorld.fx"), nullptr);
	EXPECT_THAT(TakeLog(),
	            AllOf(HasSubstr("myWorldMatrixVariable is invalid, data/Shaders/Test/NoWorld.fx"),
	                  HasSubstr("myFarPlaneVariable is invalid"), Not(HasSubstr("myViewMatrixVariable")),
	                  Not(HasSubstr("myProjectionMatrixVariable"))));

	Zeph::Effect* effect = container.GetEffect("data/Shaders/Test/Full.fx");
	ASSERT_NE(effect, nullptr) << TakeLog();
	Fx::Effect& fx = *effect->GetEffect();
	effect->SetEyePosition(Vector3<float>(1.0f, 2.0f, 3.0f));
	EXPECT_EQ(std::vector<float>(fx.GetVariableByName("EyePos")->GetFloats().begin(),
	                             fx.GetVariableByName("EyePos")->GetFloats().end()),
	          (std::vector<float>{1.0f, 2.0f, 3.0f, 1.0f}));
	effect->SetDirectionalLight(Vector4<float>(0.0f, -1.0f, 0.0f, 0.0f),
	                            Vector4<float>(1.0f, 0.5f, 0.25f, 1.0f));
	EXPECT_EQ(fx.GetVariableByName("LightDirection")->GetFloats()[1], -1.0f) << "direction first";
	EXPECT_EQ(fx.GetVariableByName("LightColor")->GetFloats()[2], 0.25f);
	effect->SetEnvironmentBox(Vector4<float>(1, 1, 1, 1), Vector4<float>(2, 2, 2, 1),
	                          Vector4<float>(-2, -2, -2, 1));
	EXPECT_EQ(fx.GetVariableByName("EnvBoxPos")->GetFloats()[0], 1.0f);
	EXPECT_EQ(fx.GetVariableByName("EnvBoxMax")->GetFloats()[0], 2.0f);
	EXPECT_EQ(fx.GetVariableByName("EnvBoxMin")->GetFloats()[0], -2.0f);

	const Vector4<float> colors[4] = {{1, 0, 0, 1}, {0, 1, 0, 1}, {0, 0, 1, 1}, {1, 1, 1, 1}};
	const Vector4<float> positions[4] = {{0, 0, 0, 1}, {1, 0, 0, 1}, {2, 0, 0, 1}, {3, 0, 0, 1}};
	const float ranges[4] = {5.0f, 6.0f, 7.0f, 8.0f};
	effect->SetPointLights(colors, positions, ranges);
	EXPECT_EQ(fx.GetVariableByName("PointLightColors")->GetFloats()[4 * 3 + 1], 1.0f);
	EXPECT_EQ(fx.GetVariableByName("PointLightPositions")->GetFloats()[4 * 2], 2.0f);
	EXPECT_EQ(fx.GetVariableByName("PointLightRanges")->GetFloats()[3], 8.0f);
	effect->SetFarPlane(750.0f);
	EXPECT_EQ(fx.GetVariableByName("FarPlane")->GetFloats()[0], 750.0f);
	effect->SetTime(2.5f);
	EXPECT_EQ(fx.GetVariableByName("Time")->GetFloats()[0], 2.5f);

	Matrix44<float> world;
	world.myMatrix[12] = 4.0f; // translation x
	effect->SetWorldMatrix(world);
	effect->SetPrevWorldMatrix(world); // no such variable: nothing happens
	EXPECT_EQ(fx.GetVariableByName("World")->GetFloats()[12], 4.0f) << "uploaded as stored, row-major";

	EXPECT_FALSE(effect->SetShaderResource("NoSuchTexture", nullptr));
	EXPECT_TRUE(effect->SetShaderResource("AlbedoTexture", nullptr));
	effect->SetTechnique("RenderOther");
	EXPECT_EQ(effect->GetTechnique()->GetName(), "RenderOther");
	effect->SetTechnique("NoSuchTechnique");
	EXPECT_FALSE(effect->GetTechnique()->IsValid());
}
