// Compiling effect sources: messages with the right file and line, rejected
// declarations, and what a compiled file says about techniques, passes,
// states, variables and vertex inputs.

#include <filesystem>
#include <tuple>

#include "GpuTest.h"
#include "platform/fx/CompiledFormat.h"
#include "platform/fx/Compiler.h"
#include "support/TestSupport.h"

namespace
{
using FxCompilerTest = GpuTest;

// A pass that compiles, for sources whose problem lies elsewhere.
const char* const ourGoodStages = R"(vertex V
{
	in vec3 POSITION;
	void main() { gl_Position = vec4(POSITION, 1.0); }
}
fragment F
{
	out vec4 oColor;
	void main() { oColor = vec4(1.0); }
}
)";

} // namespace

TEST_F(FxCompilerTest, ErrorsNameTheFileAndLine)
{
	const std::string pass = "technique T { pass P { VertexShader = V; PixelShader = F; } }\n";
	// Sources and the message each must give; FILE stands for the scratch directory, which
	// holds the include files the cases use.
	const std::pair<std::string, std::string> cases[] = {
	    {std::string(ourGoodStages) + "float Broken()\n{\n\treturn missing;\n}\n" + pass,
	     "FILE/Main.fx(13): error: `missing' undeclared"},
	    {"#include \"Common/Inc.fxh\"\n" + std::string(ourGoodStages) + pass,
	     "FILE/Common/Inc.fxh(2): error: `missing' undeclared"},
	    {std::string(ourGoodStages) + "technique T\n{\n\tpass P\n\t{\n\t\tVertexShader = V;\n"
	                                  "\t\tPixelShader = F;\n\t\tBlending = true;\n\t}\n}\n",
	     "FILE/Main.fx(17): error: unknown state 'Blending' in pass 'P' of technique 'T'"},
	    {std::string(ourGoodStages) +
	         "technique T { pass P { VertexShader = V; PixelShader = F; CullMode = Sometimes; } }\n",
	     "FILE/Main.fx(11): error: 'Sometimes' is not a value of CullMode (NONE, FRONT, BACK)"},
	    {"#include \"A.fxh\"\n" + std::string(ourGoodStages) + pass,
	     "FILE/B.fxh(2): error: include cycle: FILE/Main.fx -> FILE/A.fxh -> FILE/B.fxh -> FILE/A.fxh"},
	    {"\n#include \"Nowhere.fxh\"\n" + std::string(ourGoodStages) + pass,
	     "FILE/Main.fx(2): error: cannot open include file 'Nowhere.fxh'"},
	    {"uniform Frame { mat4 World; };\n" + std::string(ourGoodStages) + pass,
	     "FILE/Main.fx(1): error: uniform block 'Frame' is not supported"},
	    {std::string(ourGoodStages) + "technique T { pass P { VertexShader = W; PixelShader = F; } }\n",
	     "FILE/Main.fx(11): error: VertexShader 'W' names no stage block"},
	    {std::string(ourGoodStages) + "technique T { pass P { VertexShader = F; PixelShader = F; } }\n",
	     "FILE/Main.fx(11): error: VertexShader 'F' is a fragment block"},
	    {"uniform vec4 Tint;\nsampler Tint { Filter = ANISOTROPIC; }\n" + std::string(ourGoodStages) + pass,
	     "FILE/Main.fx(2): error: sampler state 'Tint' names no sampler uniform"},
	    {"uniform sampler2D Tex;\nsampler Tex { Wrap = Clamp; }\n" + std::string(ourGoodStages) + pass,
	     "FILE/Main.fx(2): error: unknown sampler state 'Wrap' in sampler 'Tex'"},
	    {"#version 330\n" + std::string(ourGoodStages) + pass,
	     "FILE/Main.fx(1): error: remove the #version line"},
	    {"vertex V { in vec3 aPosition; void main() {} }\n"
	     "fragment F { out vec4 o; void main() { o = vec4(1); } }\n" +
	         pass,
	     "FILE/Main.fx(1): error: vertex input 'aPosition' must be named by its semantic"},
	    {"vertex V { in vec3 POSITION; out vec4 vColor; void main() { vColor = vec4(1); "
	     "gl_Position = vec4(POSITION, 1); } }\n"
	     "fragment F { in vec3 vColor; out vec4 o; void main() { o = vec4(vColor, 1); } }\n" +
	         pass,
	     "FILE/Main.fx(1): technique 'T', pass 'P': error:"},
	};
	TestSupport::ScratchDir scratch;
	std::filesystem::create_directories(scratch.Path() / "Common");
	TestSupport::WriteWholeFile(scratch.File("Common/Inc.fxh"),
	                            "// shared\nfloat Broken() { return missing; }\n");
	TestSupport::WriteWholeFile(scratch.File("A.fxh"), "#include \"B.fxh\"\n");
	TestSupport::WriteWholeFile(scratch.File("B.fxh"), "\n#include \"a.fxh\"\n");
	for (const auto& [source, message] : cases)
	{
		Fx::CompileOutput output;
		EXPECT_FALSE(Fx::CompileFromMemory(source, scratch.File("Main.fx"), output)) << message;
		std::string expected = message;
		for (size_t at = expected.find("FILE"); at != std::string::npos; at = expected.find("FILE"))
		{
			expected.replace(at, 4, scratch.Path().string());
		}
		EXPECT_NE(output.myMessages.find(expected), std::string::npos)
		    << "expected: " << expected << "\nmessages:\n"
		    << output.myMessages;
		EXPECT_TRUE(output.myCompiled.empty()) << message;
	}
}

TEST_F(FxCompilerTest, VertexPosColNamesItsIncludeAndCompilesToTheBuildsBytes)
{
	Fx::CompileOutput output;
	ASSERT_TRUE(Fx::CompileFromFile("data/SHADERS/MISC/vertex_poscol.fx", output)) << output.myMessages;
	ASSERT_EQ(output.myDependencies.size(), 2u);
	EXPECT_EQ(output.myDependencies[1], "data/Shaders/Common/Transforms.fxh");
	// The build's compiled file is the same bytes but for the spelling of the source path (what the
	// description holds is checked on the loaded effect).
	Fx::CompileOutput again;
	ASSERT_TRUE(Fx::CompileFromFile("data/Shaders/Misc/Vertex_PosCol.fx", again)) << again.myMessages;
	const std::string built = TestSupport::ReadWholeFile("data/Shaders/Misc/Vertex_PosCol.fxal");
	EXPECT_EQ(std::string(again.myCompiled.begin(), again.myCompiled.end()), built);
}

TEST_F(FxCompilerTest, SamplerDeclarationsMapOntoSamplerDescriptions)
{
	const std::string source = R"(uniform sampler2D Declared;
uniform samplerCube Undeclared[2];
uniform sampler2DShadow Shadow;
sampler Declared { Filter = ANISOTROPIC; MaxAnisotropy = 8; AddressU = Mirror; AddressV = Border;
	BorderColor = float4(1, 0.5, 0, 1); MinLOD = 1; MaxLOD = 4.5; }
sampler Shadow { Filter = COMPARISON_MIN_MAG_MIP_LINEAR; ComparisonFunc = LESS_EQUAL; }
)" + std::string(ourGoodStages) +
	                           "technique T { pass P { VertexShader = V; PixelShader = F; } }\n";
	Fx::CompileOutput output;
	ASSERT_TRUE(Fx::CompileFromMemory(source, "Samplers.fx", output)) << output.myMessages;
	Fx::EffectDesc desc;
	std::string error;
	ASSERT_TRUE(Fx::ReadCompiled(output.myCompiled, desc, error)) << error;
	ASSERT_EQ(desc.myVariables.size(), 3u);

	// What is not said takes Direct3D's default (clamped W for the declared one, a wrapping linear
	// sampler for the undeclared array); units follow the declaration order, and the array takes two.
	const Gpu::SamplerDesc& declared = desc.myVariables[0].mySampler;
	EXPECT_EQ(std::tuple(declared.myFilter, declared.myMaxAnisotropy, declared.myAddressU,
	                     declared.myAddressV, declared.myAddressW, declared.myBorderColor[1],
	                     declared.myMinLod, declared.myMaxLod),
	          std::tuple(Gpu::Filter::Anisotropic, 8.0f, Gpu::TextureAddress::Mirror,
	                     Gpu::TextureAddress::Border, Gpu::TextureAddress::Clamp, 0.5f, 1.0f, 4.5f));
	const Fx::VariableDesc& undeclared = desc.myVariables[1];
	EXPECT_EQ(
	    std::tuple(undeclared.mySampler.myFilter, undeclared.mySampler.myAddressV, undeclared.myElementCount),
	    std::tuple(Gpu::Filter::Linear, Gpu::TextureAddress::Wrap, 2));
	const Gpu::SamplerDesc& shadow = desc.myVariables[2].mySampler;
	EXPECT_EQ(std::tuple(shadow.myComparisonFlag, shadow.myComparison),
	          std::tuple(true, Gpu::Comparison::LessEqual));
	EXPECT_EQ(std::tuple(desc.myVariables[0].myUnit, undeclared.myUnit, desc.myVariables[2].myUnit),
	          std::tuple(0, 1, 3));
}
