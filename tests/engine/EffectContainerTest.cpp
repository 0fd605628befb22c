// Effects through the engine's container: sharing by name, the sprite effect
// compiled from source, the line effect kept apart, retrying failed loads, the
// reports of missing variables, and switching techniques. What the setters upload
// is seen in the renderer's frames (golden images of lit rooms).

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
TEST_F(EngineTest, TheContainerSharesRetriesCompilesTheSpriteFromSourceAndReportsMissingVariables)
{
	LUMORA_RETURN_UNLESS(CreateEngine(64, 64));
	WorkingDirectory directory(myScratch.Path() / "work");
	Zeph::EffectContainer& container = Zeph::Engine::GetInstance()->GetEffectContainer();
	// Whatever the engine loaded for itself at start-up is not counted.
	const size_t baseline = container.GetCount();
	Zeph::Effect* posCol = container.GetEffect("Data/Shaders/Misc/Vertex_PosCol.fx");
	ASSERT_NE(posCol, nullptr) << TakeLog();
	EXPECT_EQ(container.GetEffect("Data/Shaders/Misc/Vertex_PosCol.fx"), posCol);
	EXPECT_EQ(posCol->GetTechnique()->GetName(), "Render");
	EXPECT_EQ(container.GetCount(), baseline + 1u);

	Zeph::Effect* line = container.GetEffect(Zeph::ShaderFiles[Zeph::EFFECT_LINE]);
	ASSERT_NE(line, nullptr) << TakeLog();
	EXPECT_EQ(container.GetEffect("data/shaders/misc/Line2D.fx"), line);
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

	// The sprite effect is compiled from its source and never reads a compiled file: a damaged
	// one leaves it alone.
	TestSupport::WriteWholeFile("data/Shaders/Sprite/Sprite.fx", spriteSource);
	TestSupport::WriteWholeFile("data/Shaders/Sprite/Sprite.fxal", "not a compiled effect");
	Zeph::Effect* sprite = container.GetEffect(Zeph::ShaderFiles[Zeph::EFFECT_SPRITE]);
	ASSERT_NE(sprite, nullptr) << TakeLog();
	EXPECT_TRUE(container.HasSpriteEffect());
	EXPECT_EQ(container.GetEffect("data/Shaders/Sprite/Sprite.fx"), sprite);
	EXPECT_EQ(container.GetCount(), baseline + 1u);

	// The variables an effect must have are reported, not refused.
	WriteCompiledEffect("data/Shaders/Test/NoWorld.fx",
	                    std::string("uniform mat4 View;\nuniform mat4 Projection;\n") + ourPlainPass);
	Zeph::Effect* effect = container.GetEffect("data/Shaders/Test/NoWorld.fx");
	ASSERT_NE(effect, nullptr);
	EXPECT_THAT(TakeLog(),
	            AllOf(HasSubstr("myWorldMatrixVariable is invalid, data/Shaders/Test/NoWorld.fx"),
	                  HasSubstr("myFarPlaneVariable is invalid"), Not(HasSubstr("myViewMatrixVariable")),
	                  Not(HasSubstr("myProjectionMatrixVariable"))));
	effect->SetTechnique("RenderOther");
	EXPECT_EQ(effect->GetTechnique()->GetName(), "RenderOther");
	effect->SetTechnique("NoSuchTechnique");
	EXPECT_FALSE(effect->GetTechnique()->IsValid());
}
