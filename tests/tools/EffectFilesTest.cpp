// The deferred frame's effect files as the renderer meets them: every technique and
// variable the renderer looks up exists with its type and every pass links and
// applies; then the full-screen and light passes draw on small hand-made G-buffers
// and are checked against what their output means (copies, exposure, the irradiance
// formula, occlusion at a step, light reach and cones).

#include <algorithm>
#include <cmath>
#include <deque>
#include <functional>
#include <iterator>
#include <sstream>
#include <string>
#include <vector>

#include "GpuTest.h"
#include "platform/fx/Effect.h"
#include "platform/gpu/InputLayout.h"
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

// An RGBA float image, row 0 at the top.
struct Image
{
	int myWidth = 0;
	int myHeight = 0;
	std::vector<float> myValues;

	const float* At(int anX, int aY) const
	{
		return &myValues[(static_cast<size_t>(aY) * myWidth + anX) * 4];
	}
};

Image Filled(int aWidth, int aHeight, const std::function<std::array<float, 4>(int, int)>& aTexel)
{
	Image image{aWidth, aHeight, {}};
	for (int y = 0; y < aHeight; ++y)
	{
		for (int x = 0; x < aWidth; ++x)
		{
			const std::array<float, 4> texel = aTexel(x, y);
			image.myValues.insert(image.myValues.end(), texel.begin(), texel.end());
		}
	}
	return image;
}

Image Constant(std::array<float, 4> aTexel)
{
	return Filled(1, 1, [&](int, int) { return aTexel; });
}

// Row-major engine matrices (row vectors).
const std::array<float, 16> ourIdentity = {1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1};

// A frustum whose far plane (at depth 10) spans -10..10 on x and y.
constexpr float ourFarPlane = 10.0f;
const float ourCorners[16] = {-10, 10, 10, 0, 10, 10, 10, 0, -10, -10, 10, 0, 10, -10, 10, 0};
} // namespace

class EffectFilesTest : public GpuTest
{
protected:
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

	Fx::Effect* Load(const std::string& aCompiledPath)
	{
		const std::string bytes = TestSupport::ReadWholeFile(aCompiledPath);
		Fx::Effect& effect = myEffects.emplace_back();
		const std::vector<uint8_t> compiled(bytes.begin(), bytes.end());
		EXPECT_TRUE(effect.Init(GetContext(), compiled, aCompiledPath)) << aCompiledPath << ": " << Joined();
		return effect.GetTechniqueCount() > 0 ? &effect : nullptr;
	}

	// A texture of the given description holding someTexels; its view, or null (test failed).
	Gpu::ShaderResourceView* Upload(const Gpu::TextureDesc& aDesc, const void* someTexels, uint32_t aRowPitch)
	{
		Gpu::Texture* texture = MakeTexture(aDesc);
		EXPECT_TRUE(texture && texture->Upload(0, 0, someTexels, aRowPitch)) << aDesc.myLabel;
		return texture ? texture->GetDefaultShaderResourceView() : nullptr;
	}

	// A UNORM volume of 2^3 texels of one value.
	Gpu::ShaderResourceView* Volume(Pixel aTexel)
	{
		const std::vector<Pixel> texels(8, aTexel);
		return Upload({.myKind = Gpu::TextureKind::Texture3D,
		               .myWidth = 2,
		               .myHeight = 2,
		               .myDepth = 2,
		               .myFormat = Dds::Format::R8G8B8A8_UNORM,
		               .myLabel = "test volume"},
		              texels.data(), 8);
	}

	void Bind(Fx::Effect& anEffect, const char* aName, const Image& anImage)
	{
		Gpu::ShaderResourceView* view =
		    Upload({.myWidth = anImage.myWidth,
		            .myHeight = anImage.myHeight,
		            .myFormat = Dds::Format::R32G32B32A32_FLOAT,
		            .myLabel = "test input"},
		           anImage.myValues.data(), static_cast<uint32_t>(anImage.myWidth * 16));
		EXPECT_TRUE(anEffect.GetVariableByName(aName)->SetResource(view)) << aName;
	}

	void Set(Fx::Effect& anEffect, const char* aName, std::array<float, 4> aValue)
	{
		EXPECT_TRUE(anEffect.GetVariableByName(aName)->SetFloatVector(aValue.data())) << aName;
	}

	void Set(Fx::Effect& anEffect, const char* aName, float aValue)
	{
		EXPECT_TRUE(anEffect.GetVariableByName(aName)->SetFloat(aValue)) << aName;
	}

	// A float target of the given size, cleared to aClear, bound with an optional depth
	// buffer cleared to aDepth.
	Gpu::RenderTargetView* Target(int aWidth, int aHeight, std::array<float, 4> aClear = {0, 0, 0, 0},
	                              bool aDepthFlag = false, float aDepth = 0.0f)
	{
		Gpu::DepthStencilView* depth =
		    aDepthFlag ? MakeTarget(Dds::Format::D32_FLOAT, aWidth, aHeight)->CreateDepthStencilView()
		               : nullptr;
		Gpu::RenderTargetView* view = BindTarget(Dds::Format::R32G32B32A32_FLOAT, aWidth, aHeight, depth);
		if (!view)
		{
			return nullptr;
		}
		GetContext().ClearRenderTargetView(*view, aClear.data());
		if (depth)
		{
			GetContext().ClearDepthStencilView(*depth, true, false, aDepth, 0);
		}
		return view;
	}

	// Draws the technique's first pass over the whole target: a quad at clip depth 0.5,
	// counter-clockwise on screen, texture coordinate (0,0) at the top-left.
	void DrawQuad(Fx::Effect& anEffect, const char* aTechnique)
	{
		struct Vertex
		{
			float myPosition[3];
			float myTexCoord[2];
		};
		const std::vector<Vertex> corners = {{{-1, 1, 0.5f}, {0, 0}},
		                                     {{-1, -1, 0.5f}, {0, 1}},
		                                     {{1, -1, 0.5f}, {1, 1}},
		                                     {{1, 1, 0.5f}, {1, 0}}};
		Fx::Pass* pass = anEffect.GetTechniqueByName(aTechnique)->GetPassByIndex(0);
		ASSERT_NE(pass, nullptr) << aTechnique;
		const Gpu::InputElement elements[] = {{"POSITION", 0, Dds::Format::R32G32B32_FLOAT, 0, 0},
		                                      {"TEXCOORD", 0, Dds::Format::R32G32_FLOAT, 0, 12}};
		const std::span<const Gpu::InputElement> used(elements, pass->GetVertexInputs().size());
		Gpu::InputLayout& layout = myLayouts.emplace_back();
		ASSERT_TRUE(layout.Init(GetContext(), used, pass->GetVertexInputs(), "test quad"));
		ASSERT_TRUE(pass->Apply(GetContext()));
		GetContext().SetInputLayout(&layout);
		DrawVertices(corners);
	}

	Image Read(const Gpu::RenderTargetView* aView)
	{
		Image image{aView->GetWidth(), aView->GetHeight(), {}};
		EXPECT_TRUE(Gpu::ReadRenderTarget(GetContext(), *aView, image.myValues));
		image.myValues.resize(static_cast<size_t>(image.myWidth) * image.myHeight * 4);
		return image;
	}

	// The full-screen effect with its camera: identity view, the far-plane corners above.
	Fx::Effect* FullScreen()
	{
		Fx::Effect* effect = Load("data/Shaders/FullScreen/VertexUV_Shader.fxal");
		if (effect)
		{
			EXPECT_TRUE(effect->GetVariableByName("FarFrustrumCornersViewSpace")
			                ->SetFloatVectorArray(ourCorners, 0, 4));
			EXPECT_TRUE(effect->GetVariableByName("invView")->SetMatrix(ourIdentity.data()));
			Set(*effect, "FarPlane", ourFarPlane);
		}
		return effect;
	}

	std::deque<Fx::Effect> myEffects;
	std::deque<Gpu::InputLayout> myLayouts;
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

TEST_F(EffectFilesTest, CopyingPassesKeepTexelsWhereTheyAre)
{
	Fx::Effect* effect = FullScreen();
	ASSERT_NE(effect, nullptr);
	const Image source = Filled(4, 4, [](int anX, int aY) {
		return std::array<float, 4>{0.1f + 0.2f * anX, 0.05f + 0.25f * aY, 0.5f, 0.25f * (anX + 1)};
	});
	Bind(*effect, "SourceTexture", source);
	Bind(*effect, "AOTexture", Constant({0.5f, 0, 0, 1}));

	// Each technique and what it makes of a texel: RGB scaled (by the occlusion of a half for
	// RenderApplySSAO), or red everywhere with an opaque alpha.
	struct Case
	{
		const char* myTechnique;
		float myScale;
		bool myRedFlag;
	};
	const Case cases[] = {
	    {"Render", 1.0f, false}, {"RenderRToWhite", 1.0f, true}, {"RenderApplySSAO", 0.5f, false}};
	for (const Case& testCase : cases)
	{
		SCOPED_TRACE(testCase.myTechnique);
		Gpu::RenderTargetView* target = Target(4, 4);
		ASSERT_NE(target, nullptr);
		DrawQuad(*effect, testCase.myTechnique);
		const Image result = Read(target);
		for (int y = 0; y < 4; ++y)
		{
			for (int x = 0; x < 4; ++x)
			{
				const float* texel = source.At(x, y);
				for (int channel = 0; channel < 4; ++channel)
				{
					const float expected =
					    channel == 3 ? (testCase.myRedFlag ? 1.0f : texel[3])
					                 : (testCase.myRedFlag ? texel[0] : texel[channel]) * testCase.myScale;
					EXPECT_NEAR(result.At(x, y)[channel], expected, 1e-5f)
					    << "texel " << x << "," << y << " channel " << channel;
				}
			}
		}
	}
}

TEST_F(EffectFilesTest, ExposureAdaptsTowardTheAverageAndToneMapsHighlightsOnly)
{
	Fx::Effect* effect = FullScreen();
	ASSERT_NE(effect, nullptr);

	// Log luminance per pixel, then its average over an 8 x 8 source into one texel.
	Bind(*effect, "SourceTexture", Filled(8, 8, [](int anX, int) {
		return std::array<float, 4>{anX < 4 ? 0.25f : 4.0f, anX < 4 ? 0.25f : 4.0f, anX < 4 ? 0.25f : 4.0f,
		                            1};
	}));
	Gpu::RenderTargetView* logTarget = Target(8, 8);
	DrawQuad(*effect, "RenderLum");
	Image logs = Read(logTarget);
	EXPECT_NEAR(logs.At(0, 0)[0], std::log(0.25f + 1e-4f), 1e-3f);
	EXPECT_NEAR(logs.At(7, 7)[0], std::log(4.0f + 1e-4f), 1e-3f);

	Bind(*effect, "SourceTexture", logs);
	Set(*effect, "InvTargetSize", {1, 1, 0, 0});
	Gpu::RenderTargetView* average = Target(1, 1);
	DrawQuad(*effect, "DownSampleLog");
	const float averageLog = Read(average).At(0, 0)[0];
	EXPECT_NEAR(averageLog, 0.5f * (std::log(0.25f) + std::log(4.0f)), 1e-3f); // geometric mean 1

	// A tenth of the way from the previous luminance to the (clamped) average.
	struct Adapt
	{
		float myPrevious;
		float myAverageLog;
		float myLumMax;
		float myExpected;
	};
	for (const Adapt& adapt :
	     {Adapt{0.5f, std::log(2.0f), 4.0f, 0.65f}, Adapt{0.5f, std::log(100.0f), 4.0f, 0.85f},
	      Adapt{2.0f, std::log(2.0f), 4.0f, 2.0f}, Adapt{1.0f, std::log(3.0f), 2.0f, 1.1f}})
	{
		Set(*effect, "lumMin", 0.05f);
		Set(*effect, "lumMax", adapt.myLumMax);
		Bind(*effect, "SourceTexture", Constant({adapt.myAverageLog, 0, 0, 1}));
		Bind(*effect, "DiffuseTexture", Constant({adapt.myPrevious, 0, 0, 1}));
		Gpu::RenderTargetView* adapted = Target(1, 1);
		DrawQuad(*effect, "AdaptLuminance");
		EXPECT_NEAR(Read(adapted).At(0, 0)[0], adapt.myExpected, 1e-4f)
		    << adapt.myPrevious << " " << adapt.myAverageLog;
	}

	// Exposure 1 (adjustment equal to the adapted luminance): shadows and mid-tones pass,
	// highlights roll off below 1 in order; tone mapping its own output keeps shadows and
	// mid-tones and compresses highlights only a little more.
	Set(*effect, "AutoExposureAdjustment", 0.5f);
	Bind(*effect, "DiffuseTexture", Constant({0.5f, 0, 0, 1}));
	const float inputs[] = {0.0f, 0.1f, 0.3f, 0.55f, 0.8f, 1.5f, 3.0f, 6.0f};
	Bind(*effect, "SourceTexture", Filled(8, 1, [&](int anX, int) {
		return std::array<float, 4>{inputs[anX], inputs[anX], inputs[anX], 0.75f};
	}));
	Gpu::RenderTargetView* mapped = Target(8, 1);
	DrawQuad(*effect, "ToneMap");
	const Image once = Read(mapped);
	for (int at = 0; at < 8; ++at)
	{
		SCOPED_TRACE(inputs[at]);
		const float value = once.At(at, 0)[0];
		EXPECT_FLOAT_EQ(once.At(at, 0)[3], 0.75f);
		if (inputs[at] <= 0.55f)
		{
			EXPECT_NEAR(value, inputs[at], 1e-4f);
		}
		else
		{
			EXPECT_LT(value, std::min(inputs[at], 1.0f));
			EXPECT_GT(value, once.At(at - 1, 0)[0]);
		}
	}
	Bind(*effect, "SourceTexture", once);
	Gpu::RenderTargetView* twice = Target(8, 1);
	DrawQuad(*effect, "ToneMap");
	const Image again = Read(twice);
	for (int at = 0; at < 8; ++at)
	{
		SCOPED_TRACE(inputs[at]);
		if (inputs[at] <= 0.55f)
		{
			EXPECT_NEAR(again.At(at, 0)[0], once.At(at, 0)[0], 1e-4f);
		}
		else
		{
			EXPECT_LE(again.At(at, 0)[0], once.At(at, 0)[0]);
			EXPECT_GT(again.At(at, 0)[0], 0.8f * once.At(at, 0)[0]);
		}
	}
}

TEST_F(EffectFilesTest, AmbientPassAddsVolumeIrradianceShadowedAndEmissiveLight)
{
	Fx::Effect* effect = FullScreen();
	ASSERT_NE(effect, nullptr);
	// A surface facing world +Y at depth 0.5; white, rough, non-metallic, no reflection.
	// Its right half has no geometry.
	Bind(*effect, "LinearDepthTexture", Filled(4, 1, [](int anX, int) {
		return std::array<float, 4>{anX < 2 ? 0.5f : -1.0f, 0, 0, 0};
	}));
	Bind(*effect, "NormalTexture", Constant({0.5f, 1.0f, 0.5f, 1}));
	Bind(*effect, "AlbedoTexture", Constant({1, 1, 1, 1}));
	Bind(*effect, "ReflectionTexture", Constant({0, 0, 0, 1}));
	// Stored coefficient c as c * 0.5 + 0.5: red has a constant term 0.5, green 0.5 * n.y,
	// blue 0.5 * n.x (zero for this normal); the quadratic terms are zero.
	auto coefficients = [&](const char* aName, Pixel aTexel) {
		EXPECT_TRUE(effect->GetVariableByName(aName)->SetResource(Volume(aTexel)));
	};
	coefficients("cArTexture", {128, 128, 128, 192});
	coefficients("cAgTexture", {128, 192, 128, 128});
	coefficients("cAbTexture", {192, 128, 128, 128});
	for (const char* name : {"cBrTexture", "cBgTexture", "cBbTexture", "cCTexture"})
	{
		coefficients(name, {128, 128, 128, 128});
	}
	Set(*effect, "WorldMin", {-100, -100, -100, 0});
	Set(*effect, "EmissiveMultiplier", 2.0f);
	const float c = 192.0f / 255.0f * 2.0f - 1.0f; // a stored 192 decodes to this (about 0.5)

	struct Case
	{
		const char* myName;
		float myWorldSize;
		float mySun;
		float myEmissive;
		std::array<float, 3> myExpected;
	};
	const Case cases[] = {
	    {"lit", 200.0f, 1.0f, 0.0f, {c, c, 0.0f}},
	    {"sun blocked", 200.0f, 0.0f, 0.0f, {0.35f * c, 0.35f * c, 0.0f}},
	    {"emissive", 200.0f, 1.0f, 0.5f, {c + 1.0f, c + 1.0f, 1.0f}},
	    {"no volume", 0.0f, 1.0f, 0.0f, {0.0f, 0.0f, 0.0f}},
	};
	for (const Case& testCase : cases)
	{
		SCOPED_TRACE(testCase.myName);
		Set(*effect, "WorldSize", {testCase.myWorldSize, testCase.myWorldSize, testCase.myWorldSize, 0});
		Bind(*effect, "MaterialTexture", Constant({1.0f, 0.0f, 1.0f, testCase.myEmissive}));
		Bind(*effect, "ShadowMap", Constant({testCase.mySun, 0, 0, 1}));
		Gpu::RenderTargetView* target = Target(4, 1, {0.25f, 0.25f, 0.25f, 1.0f});
		DrawQuad(*effect, "RenderAmbient");
		const Image result = Read(target);
		for (int channel = 0; channel < 3; ++channel)
		{
			// Added to what the target held; nothing where there is no geometry.
			EXPECT_NEAR(result.At(0, 0)[channel], 0.25f + testCase.myExpected[channel], 0.01f) << channel;
			EXPECT_FLOAT_EQ(result.At(3, 0)[channel], 0.25f) << channel;
		}
		EXPECT_FLOAT_EQ(result.At(0, 0)[3], 1.0f);
	}
}

TEST_F(EffectFilesTest, OcclusionDarkensBesideAStepAndNowhereOnAnOpenPlane)
{
	Fx::Effect* effect = FullScreen();
	ASSERT_NE(effect, nullptr);
	Set(*effect, "SSAO_scale", 1.0f);
	Set(*effect, "SSAO_sample_rad", 0.5f);
	Set(*effect, "SSAO_bias", 0.05f);
	Set(*effect, "SSAO_Intensity", 1.5f);
	// Sample directions as the renderer makes them: random, of random length.
	std::array<float, 64> directions{};
	uint32_t state = 12345u;
	for (float& value : directions)
	{
		state = state * 1664525u + 1013904223u;
		value = static_cast<float>(state >> 8) / static_cast<float>(1u << 24) * 2.0f - 1.0f;
	}
	EXPECT_TRUE(effect->GetVariableByName("Randvectors")->SetFloatVectorArray(directions.data(), 0, 16));
	// A wall facing the camera at view depth 5; with the step, the right half of the
	// screen is half a unit nearer.
	Bind(*effect, "NormalTexture", Constant({0.5f, 0.5f, 0.0f, 1}));
	for (const bool stepFlag : {false, true})
	{
		SCOPED_TRACE(stepFlag ? "step" : "open plane");
		Bind(*effect, "LinearDepthTexture", Filled(64, 64, [&](int anX, int) {
			return std::array<float, 4>{stepFlag && anX >= 32 ? 0.45f : 0.5f, 0, 0, 0};
		}));
		Gpu::RenderTargetView* target = Target(64, 64);
		DrawQuad(*effect, "RenderSSAO");
		const Image result = Read(target);
		float nearStep = 0.0f;
		for (int y = 0; y < 64; ++y)
		{
			EXPECT_NEAR(result.At(8, y)[0], 1.0f, 1e-4f) << y;  // far from the step
			EXPECT_NEAR(result.At(60, y)[0], 1.0f, 1e-4f) << y; // on the nearer part
			EXPECT_EQ(result.At(8, y)[0], result.At(8, y)[3]) << y;
			nearStep += result.At(31, y)[0] / 64.0f; // beside the step, at its foot
		}
		if (stepFlag)
		{
			EXPECT_LT(nearStep, 0.9f);
			EXPECT_GT(nearStep, 0.2f);
		}
		else
		{
			EXPECT_NEAR(nearStep, 1.0f, 1e-4f);
		}
	}
}

TEST_F(EffectFilesTest, LightsReachNoFartherThanTheirFalloffAndSpotsStayInTheirCone)
{
	// A wall facing the camera at view depth 5 that spans -5..5 (identity projection), lit
	// from one unit in front of its centre; the left column holds no geometry.
	auto setUp = [&](Fx::Effect& anEffect) {
		for (const char* name : {"World", "View", "Projection"})
		{
			EXPECT_TRUE(anEffect.GetVariableByName(name)->SetMatrix(ourIdentity.data()));
		}
		Set(anEffect, "FarPlane", ourFarPlane);
		Bind(anEffect, "DepthTexture", Filled(33, 33, [](int anX, int) {
			     return std::array<float, 4>{anX == 0 ? -1.0f : 0.5f, 0, 0, 0};
		     }));
		// The G-buffer is read texel for pixel: every target has the screen's size.
		auto screen = [](std::array<float, 4> aTexel) {
			return Filled(33, 33, [&](int, int) { return aTexel; });
		};
		Bind(anEffect, "NormalTexture", screen({0.5f, 0.5f, 0.0f, 1}));
		Bind(anEffect, "AlbedoTexture", screen({0.8f, 0.8f, 0.8f, 1}));
		Bind(anEffect, "MaterialTexture", screen({0.5f, 0.0f, 1.0f, 0}));
		Set(anEffect, "LightPosition", {0, 0, 4, 1});
		Set(anEffect, "LightColor", {3, 2, 1, 1});
		Set(anEffect, "LightFalloff", 2.0f);
	};
	// Pixel (x, y) of 33 sees wall point ((x + 0.5) / 33 * 10 - 5, 5 - (y + 0.5) / 33 * 10, 5).
	auto wallDistance = [](int anX, int aY) {
		const float x = (anX + 0.5f) / 33.0f * 10.0f - 5.0f;
		const float y = 5.0f - (aY + 0.5f) / 33.0f * 10.0f;
		return std::sqrt(x * x + y * y + 1.0f);
	};

	for (const char* path :
	     {"data/Shaders/PBL/DeferredPointLight.fxal", "data/Shaders/PBL/DeferredSpotLight.fxal"})
	{
		SCOPED_TRACE(path);
		const bool spotFlag = std::string(path).find("Spot") != std::string::npos;
		Fx::Effect* effect = Load(path);
		ASSERT_NE(effect, nullptr);
		setUp(*effect);
		// Pointing at the wall; full light within 20 degrees of the axis, none beyond 30.
		const float cosOuter = std::cos(30.0f * 3.14159265f / 180.0f);
		if (spotFlag)
		{
			EXPECT_TRUE(effect->GetVariableByName("Scale")->SetMatrix(ourIdentity.data()));
			Set(*effect, "LightDirection", {0, 0, 1, 0});
			Set(*effect, "LightAngles", {std::cos(20.0f * 3.14159265f / 180.0f), cosOuter, 0, 0});
		}
		// Back faces of the volume behind the scene pass the depth test: here the depth buffer
		// holds 0 and the quad lies at 0.5.
		Gpu::RenderTargetView* target = Target(33, 33, {0.125f, 0.125f, 0.125f, 1.0f}, true, 0.0f);
		DrawQuad(*effect, "Render");
		const Image result = Read(target);

		const float* center = result.At(16, 16);
		EXPECT_GT(center[0], center[1] + 0.05f); // the light's colour: red over green over blue
		EXPECT_GT(center[1], center[2] + 0.05f);
		int lit = 0;
		for (int y = 0; y < 33; ++y)
		{
			for (int x = 0; x < 33; ++x)
			{
				const float* texel = result.At(x, y);
				const float distance = wallDistance(x, y);
				// Cosine between the axis and the direction from the light to the wall point.
				const bool outsideFlag = distance >= 2.0f || (spotFlag && 1.0f / distance <= cosOuter);
				if (x == 0 || outsideFlag)
				{
					EXPECT_EQ(texel[0], 0.125f) << x << "," << y;
				}
				else
				{
					EXPECT_GE(texel[0], 0.125f) << x << "," << y;
					EXPECT_TRUE(std::isfinite(texel[0]) && std::isfinite(texel[1]) &&
					            std::isfinite(texel[2]));
					lit += texel[0] > 0.125f ? 1 : 0;
				}
				// Brighter toward the light along the middle row.
				if (y == 16 && x > 16 && !outsideFlag)
				{
					EXPECT_LT(texel[0], result.At(x - 1, y)[0]) << x;
				}
			}
		}
		EXPECT_GT(lit, 4);
		EXPECT_EQ(result.At(16, 16)[3], 1.0f);
	}
}
