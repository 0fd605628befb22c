// The deferred frame's effect files as the renderer meets them: every technique and
// variable the renderer looks up exists with its type, and every pass links and applies,
// including those of files that no frame draws (the skinned vertex layout, the compute
// stand-in, the cube-map blur). What the passes draw is measured on whole frames
// (renderer/FrameTest, PostProcessTest, AmbientBakeTest and the frame goldens).

#include <deque>
#include <iterator>
#include <sstream>
#include <string>
#include <vector>

#include "GpuTest.h"
#include "platform/fx/Effect.h"
#include "support/TestSupport.h"

namespace
{
struct EffectFile
{
	const char* myCompiledPath;
	// Technique names, the first one first in the file.
	const char* myTechniques;
	// GLSL declarations as the renderer expects them: "type name name[count]; type name".
	std::string myVariables;
	const char* myVertexInputs; // in location order, for every pass
};

const std::string ourTransforms = "mat4 World View Projection; float FarPlane; ";
const char* const ourModelTechniques =
    "Render RenderBase RenderAlphaTest RenderFrontFace RenderGBuffer RenderGBufferFrontFace "
    "RenderOutlineMask "
    "RenderShadowBuffer RenderShadowBufferBase RenderShadowBufferAlphaTest RenderShadowBufferFrontFace";
const std::string ourModelVariables =
    ourTransforms + "sampler2D DiffuseTexture NormalTexture RoughnessTexture AOTexture SubstanceTexture; "
                    "samplerCube CubeMap; vec4 EnvBoxPos EnvBoxMin EnvBoxMax LightRadiusUV; "
                    "mat4 ShadowCasterViewProj; float ShadowBias";
const std::string ourLightVariables = ourTransforms +
                                      "vec4 LightPosition LightColor; float LightFalloff; "
                                      "sampler2D AlbedoTexture NormalTexture DepthTexture MaterialTexture; ";

const std::vector<EffectFile> ourEffectFiles = {
    {"data/Shaders/PBL/Vertex_PosNormUVTanBiNorm.fxal", ourModelTechniques, ourModelVariables,
     "POSITION NORMAL TEXCOORD TANGENT BINORMAL"},
    {"data/Shaders/PBL/Vertex_PosWeightBonesNormUVTanBi.fxal", ourModelTechniques, ourModelVariables,
     "POSITION WEIGHTS BONES NORMAL TEXCOORD TANGENT BINORMAL"},
    {"data/Shaders/PBL/DeferredPointLight.fxal", "Render RenderMesh", ourLightVariables, "POSITION"},
    {"data/Shaders/PBL/DeferredSpotLight.fxal", "Render RenderMesh",
     ourLightVariables + "mat4 Scale; vec4 LightDirection; vec2 LightAngles", "POSITION"},
    {"data/Shaders/Misc/decals.fxal", "RenderDynamic RenderMesh",
     ourTransforms + "mat4 InvWorld InvView; vec4 DecalNormal; "
                     "sampler2D DecalTexture DecalNormalTexture DepthTexture NormalTexture",
     "POSITION"},
    {"data/Shaders/FullScreen/VertexUV_Shader.fxal",
     "Render RenderRotated RenderDepth RenderRToWhite RenderShadowMap RenderAmbient RenderSSAO "
     "RenderBilaterialHorz RenderBilaterialVert RenderApplySSAO RenderLum DownSampleLog AdaptLuminance "
     "ToneMap DownSamplePointHiPass DownSamplePoint HorBlur VertBlur Bloom ColorGrade HorOutlineBlur "
     "VertOutlineBlur Outline RenderFullBlur RenderFXAA BlurCubemap RenderReflectionCross",
     ourTransforms +
         "float ElapsedTime; sampler2D SourceTexture DiffuseTexture SecondaryDiffuseTexture "
         "TertiaryDiffuseTexture QuartaryDiffuseTexture QuintiaryDiffuseTexture VelocityTexture; "
         "vec2 InvTargetSize InvSourceSize ScreenSize; mat4 invView; vec4 FarFrustrumCornersViewSpace[4]; "
         "sampler2D LinearDepthTexture AlbedoTexture NormalTexture MaterialTexture ReflectionTexture "
         "ShadowMap; sampler3D cArTexture cAgTexture cAbTexture cBrTexture cBgTexture cBbTexture cCTexture; "
         "vec4 WorldSize WorldMin; mat4 ShadowCasterViewProj; vec4 LightRadiusUV; float ShadowBias; "
         "sampler2DShadow ShadowDepthTexture; vec4 Randvectors[16]; "
         "float SSAO_scale SSAO_sample_rad SSAO_bias SSAO_Intensity; sampler2D AOTexture; "
         "float AutoExposureAdjustment lumMin lumMax BloomThreshold BloomFactor EmissiveMultiplier; "
         "vec4 horSampleOffsets[15] horSampleWeights[15] vertSampleOffsets[15] vertSampleWeights[15]; "
         "sampler3D ColorGradingTex; float BlurFactor BlurScale; mat4 ScaleMatrix; float CubePower; "
         "samplerCube CubeNormals",
     "POSITION TEXCOORD"},
    {"data/Shaders/Compute Shader/Compute_Shader.fxal", "Render",
     ourTransforms + "sampler2D inputData outputData", "POSITION TEXCOORD"},
};

std::vector<std::string> Words(const std::string& aText)
{
	std::istringstream stream(aText);
	return {std::istream_iterator<std::string>(stream), std::istream_iterator<std::string>()};
}

} // namespace

class EffectFilesTest : public GpuTest
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

	Fx::Effect* Load(const std::string& aCompiledPath)
	{
		const std::string bytes = TestSupport::ReadWholeFile(aCompiledPath);
		Fx::Effect& effect = myEffects.emplace_back();
		const std::vector<uint8_t> compiled(bytes.begin(), bytes.end());
		EXPECT_TRUE(effect.Init(GetContext(), compiled, aCompiledPath)) << aCompiledPath << ": " << Joined();
		return effect.GetTechniqueCount() > 0 ? &effect : nullptr;
	}

	std::deque<Fx::Effect> myEffects;
};

TEST_F(EffectFilesTest, DeclaresWhatTheRendererLooksUpAndEveryPassLinks)
{
	for (const EffectFile& file : ourEffectFiles)
	{
		SCOPED_TRACE(file.myCompiledPath);
		Fx::Effect* effect = Load(file.myCompiledPath);
		ASSERT_NE(effect, nullptr);
		const std::vector<std::string> techniques = Words(file.myTechniques);
		const std::vector<std::string> vertexInputs = Words(file.myVertexInputs);
		EXPECT_EQ(effect->GetTechniqueByIndex(0)->GetName(), techniques.front());
		for (const std::string& name : techniques)
		{
			Fx::Technique* technique = effect->GetTechniqueByName(name.c_str());
			ASSERT_TRUE(technique->IsValid()) << name;
			ASSERT_GE(technique->GetPassCount(), 1) << name;
			for (int index = 0; index < technique->GetPassCount(); ++index)
			{
				Fx::Pass* pass = technique->GetPassByIndex(index);
				ASSERT_NE(pass, nullptr);
				EXPECT_TRUE(pass->Apply(GetContext())) << name;
				const auto inputs = pass->GetVertexInputs();
				ASSERT_GE(inputs.size(), 1u) << name;
				for (size_t at = 0; at < inputs.size() && at < vertexInputs.size(); ++at)
				{
					EXPECT_EQ(inputs[at].mySemanticName, vertexInputs[at]) << name;
					EXPECT_EQ(inputs[at].myLocation, static_cast<int>(at)) << name;
				}
			}
		}
		std::string type;
		for (std::string word : Words(file.myVariables))
		{
			const bool lastFlag = word.ends_with(';');
			word = lastFlag ? word.substr(0, word.size() - 1) : word;
			if (type.empty())
			{
				type = word;
				continue;
			}
			const size_t bracket = word.find('[');
			const std::string name = word.substr(0, bracket);
			Fx::Variable* variable = effect->GetVariableByName(name.c_str());
			ASSERT_TRUE(variable->IsValid()) << name;
			EXPECT_STREQ(Fx::GetTypeName(variable->GetType()), type.c_str()) << name;
			EXPECT_EQ(variable->GetElementCount(),
			          bracket == std::string::npos ? 0 : std::stoi(word.substr(bracket + 1)))
			    << name;
			type = lastFlag ? std::string() : type;
		}
	}
}
