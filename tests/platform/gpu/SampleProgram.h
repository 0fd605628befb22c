#pragma once
// SampleProgram: reads what shaders see through a texture view. Each query is a
// coordinate and an explicit LOD; one fragment per query samples the view with
// textureLod and writes the result into a row of an RGBA32F target, read back in
// one go. The sampler filters by point with clamped addressing, so an integer LOD
// picks exactly that mip and a texel centre gives exactly the stored value.
//
//   SampleProgram sampler;
//   sampler.Init(context);
//   const SampleQuery queries[] = {{{1, 0, 0, 0}, 2.0f}}; // +X face of a cube, mip 2
//   std::vector<SampleProgram::Color> colors = sampler.Sample(*cube->GetDefaultShaderResourceView(),
//   queries); sampler.Destroy();
//
// Coordinates are what the view's GLSL sampler takes: uv (2D), uv and layer (2D
// array), a direction (cube), a direction and cube index (cube array), uvw (3D).

#include <array>
#include <epoxy/gl.h>
#include <gtest/gtest.h>
#include <map>
#include <span>
#include <string>
#include <vector>

#include "platform/gpu/Context.h"
#include "platform/gpu/Readback.h"
#include "platform/gpu/SamplerState.h"
#include "platform/gpu/Texture.h"

struct SampleQuery
{
	std::array<float, 4> myCoord = {};
	float myLod = 0.0f;
};

class SampleProgram
{
public:
	using Color = std::array<float, 4>;
	static constexpr int ourMaxQueries = 64;

	// Fails the current test when the target or the sampler cannot be made.
	void Init(Gpu::Context& aContext)
	{
		myContext = &aContext;
		Gpu::TextureDesc desc;
		desc.myWidth = ourMaxQueries;
		desc.myFormat = Dds::Format::R32G32B32A32_FLOAT;
		desc.myLabel = "sampled values";
		ASSERT_TRUE(myTarget.Init(aContext, desc));
		myTargetView = myTarget.CreateRenderTargetView();
		ASSERT_NE(myTargetView, nullptr);
		ASSERT_TRUE(mySampler.Init(aContext, {.myFilter = Gpu::Filter::Point}, "point, clamped"));
	}

	void Destroy()
	{
		if (myContext == nullptr)
		{
			return;
		}
		for (const auto& [target, program] : myPrograms)
		{
			myContext->GetStateCache().ForgetProgram(program);
			glDeleteProgram(program);
		}
		myPrograms.clear();
		myContext->SetSampler(0, nullptr);
		mySampler.Destroy();
		myTarget.Destroy();
		myTargetView = nullptr;
		myContext = nullptr;
	}

	// One colour per query; empty (with a test failure) when the view's kind has
	// no program or more than ourMaxQueries are asked.
	std::vector<Color> Sample(const Gpu::ShaderResourceView& aView, std::span<const SampleQuery> someQueries)
	{
		const GLuint program = ProgramFor(aView.GetTarget());
		const int count = static_cast<int>(someQueries.size());
		if (program == 0 || count > ourMaxQueries)
		{
			ADD_FAILURE() << "cannot sample " << count << " queries of view target 0x" << std::hex
			              << aView.GetTarget();
			return {};
		}
		std::vector<float> coords;
		std::vector<float> lods;
		for (const SampleQuery& query : someQueries)
		{
			coords.insert(coords.end(), query.myCoord.begin(), query.myCoord.end());
			lods.push_back(query.myLod);
		}
		glProgramUniform4fv(program, 0, count, coords.data());
		glProgramUniform1fv(program, ourMaxQueries, count, lods.data());

		Gpu::Context& context = *myContext;
		Gpu::RenderTargetView* targets[] = {myTargetView};
		EXPECT_TRUE(context.SetRenderTargets(targets, nullptr));
		context.SetViewport({.myWidth = static_cast<float>(count), .myHeight = 1.0f});
		context.SetRasterizerState({.myCullMode = Gpu::CullMode::None});
		context.SetDepthStencilState({.myDepthEnableFlag = false});
		context.SetBlendState({});
		context.SetInputLayout(nullptr);
		context.SetPrimitiveTopology(Gpu::PrimitiveTopology::TriangleList);
		context.GetStateCache().UseProgram(program);
		context.SetSampler(0, &mySampler);
		glBindTextureUnit(0, aView.GetName());
		context.Draw(3, 0);
		glBindTextureUnit(0, 0);

		std::vector<float> values;
		EXPECT_TRUE(Gpu::ReadRenderTarget(context, *myTargetView, values));
		std::vector<Color> colors;
		for (int i = 0; i < count && static_cast<size_t>(i) * 4 + 3 < values.size(); ++i)
		{
			colors.push_back({values[i * 4], values[i * 4 + 1], values[i * 4 + 2], values[i * 4 + 3]});
		}
		EXPECT_EQ(colors.size(), someQueries.size());
		return colors;
	}

private:
	GLuint ProgramFor(GLenum aTarget)
	{
		if (const auto found = myPrograms.find(aTarget); found != myPrograms.end())
		{
			return found->second;
		}
		const char* samplerType = nullptr;
		const char* lookup = nullptr;
		switch (aTarget)
		{
		case GL_TEXTURE_2D:
			samplerType = "sampler2D";
			lookup = "textureLod(uTexture, coord.xy, lod)";
			break;
		case GL_TEXTURE_2D_ARRAY:
			samplerType = "sampler2DArray";
			lookup = "textureLod(uTexture, coord.xyz, lod)";
			break;
		case GL_TEXTURE_CUBE_MAP:
			samplerType = "samplerCube";
			lookup = "textureLod(uTexture, coord.xyz, lod)";
			break;
		case GL_TEXTURE_CUBE_MAP_ARRAY:
			samplerType = "samplerCubeArray";
			lookup = "textureLod(uTexture, coord, lod)";
			break;
		case GL_TEXTURE_3D:
			samplerType = "sampler3D";
			lookup = "textureLod(uTexture, coord.xyz, lod)";
			break;
		default:
			return 0;
		}
		const std::string fragment = std::string(R"(#version 450 core
layout(binding = 0) uniform )") + samplerType +
		                             R"( uTexture;
layout(location = 0) uniform vec4 uCoords[64];
layout(location = 64) uniform float uLods[64];
out vec4 oColor;
void main()
{
	int query = int(gl_FragCoord.x);
	vec4 coord = uCoords[query];
	float lod = uLods[query];
	oColor = )" + lookup + R"(;
})";
		// A triangle covering the viewport, from the vertex index alone.
		const GLuint vertexShader = Compile(GL_VERTEX_SHADER, R"(#version 450 core
void main()
{
	gl_Position = vec4(gl_VertexID == 1 ? 3.0 : -1.0, gl_VertexID == 2 ? 3.0 : -1.0, 0.5, 1.0);
})");
		const GLuint fragmentShader = Compile(GL_FRAGMENT_SHADER, fragment.c_str());
		const GLuint program = glCreateProgram();
		glAttachShader(program, vertexShader);
		glAttachShader(program, fragmentShader);
		glLinkProgram(program);
		glDeleteShader(vertexShader);
		glDeleteShader(fragmentShader);
		GLint linkedFlag = GL_FALSE;
		glGetProgramiv(program, GL_LINK_STATUS, &linkedFlag);
		if (linkedFlag != GL_TRUE)
		{
			char log[1024] = {};
			glGetProgramInfoLog(program, sizeof(log), nullptr, log);
			ADD_FAILURE() << samplerType << " program: " << log;
			glDeleteProgram(program);
			return 0;
		}
		myPrograms[aTarget] = program;
		return program;
	}

	static GLuint Compile(GLenum aStage, const char* aSource)
	{
		const GLuint shader = glCreateShader(aStage);
		glShaderSource(shader, 1, &aSource, nullptr);
		glCompileShader(shader);
		GLint compiledFlag = GL_FALSE;
		glGetShaderiv(shader, GL_COMPILE_STATUS, &compiledFlag);
		if (compiledFlag != GL_TRUE)
		{
			char log[1024] = {};
			glGetShaderInfoLog(shader, sizeof(log), nullptr, log);
			ADD_FAILURE() << log << "\n" << aSource;
		}
		return shader;
	}

	Gpu::Context* myContext = nullptr;
	Gpu::Texture myTarget;
	Gpu::RenderTargetView* myTargetView = nullptr;
	Gpu::SamplerState mySampler;
	std::map<GLenum, GLuint> myPrograms;
};
