#pragma once
// GLSL for tests that draw without the effect system.
//
// LinkProgram builds a program from two sources, failing the test with the log
// when it does not build. ourColorVertex/ourColorFragment pass position (location 0)
// through as clip space and write colour (location 1) out.
//
// SampleProgram reads what shaders see through a texture view: each query is a
// coordinate and an explicit LOD; one fragment per query samples the view with
// textureLod into a texel of an RGBA32F row, read back in one go. The sampler
// filters by point with clamped addressing, so an integer LOD picks exactly that
// mip and a texel centre gives exactly the stored value. Coordinates are what the
// view's GLSL sampler takes: uv (2D), uv and layer (2D array), a direction (cube),
// a direction and cube index (cube array), uvw (3D).

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

// 0 (and a test failure with the compiler's or linker's log) when the program does not build.
inline GLuint LinkProgram(const char* aVertexSource, const char* aFragmentSource)
{
	const GLuint program = glCreateProgram();
	std::string log(4096, '\0');
	for (const auto& [stage, source] :
	     {std::pair{GL_VERTEX_SHADER, aVertexSource}, std::pair{GL_FRAGMENT_SHADER, aFragmentSource}})
	{
		const GLuint shader = glCreateShader(stage);
		glShaderSource(shader, 1, &source, nullptr);
		glCompileShader(shader);
		glGetShaderInfoLog(shader, GLsizei(log.size()), nullptr, log.data());
		glAttachShader(program, shader);
		glDeleteShader(shader);
	}
	glLinkProgram(program);
	GLint linkedFlag = GL_FALSE;
	glGetProgramiv(program, GL_LINK_STATUS, &linkedFlag);
	if (linkedFlag != GL_TRUE)
	{
		glGetProgramInfoLog(program, GLsizei(log.size()), nullptr, log.data());
		ADD_FAILURE() << log.c_str() << "\n" << aVertexSource << "\n" << aFragmentSource;
		glDeleteProgram(program);
		return 0;
	}
	return program;
}

constexpr const char* ourColorVertex = R"(#version 450 core
layout(location = 0) in vec3 aPosition;
layout(location = 1) in vec4 aColor;
out vec4 vColor;
void main() { vColor = aColor; gl_Position = vec4(aPosition, 1.0); })";
constexpr const char* ourColorFragment = R"(#version 450 core
in vec4 vColor;
out vec4 oColor;
void main() { oColor = vColor; })";

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

	void Init(Gpu::Context& aContext)
	{
		myContext = &aContext;
		ASSERT_TRUE(myTarget.Init(aContext, {.myWidth = ourMaxQueries,
		                                     .myFormat = Dds::Format::R32G32B32A32_FLOAT,
		                                     .myLabel = "sampled values"}));
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
		myContext = nullptr;
	}

	// One colour per query; empty (test failed) for a view without a program or too many queries.
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
		for (size_t i = 0; i < someQueries.size() && i * 4 + 3 < values.size(); ++i)
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
		// The sampler type and the coordinate's components it takes.
		const std::map<GLenum, std::pair<const char*, const char*>> kinds = {
		    {GL_TEXTURE_2D, {"sampler2D", "xy"}},
		    {GL_TEXTURE_2D_ARRAY, {"sampler2DArray", "xyz"}},
		    {GL_TEXTURE_CUBE_MAP, {"samplerCube", "xyz"}},
		    {GL_TEXTURE_CUBE_MAP_ARRAY, {"samplerCubeArray", "xyzw"}},
		    {GL_TEXTURE_3D, {"sampler3D", "xyz"}}};
		const auto kind = kinds.find(aTarget);
		if (kind == kinds.end())
		{
			return 0;
		}
		const std::string fragment = std::string("#version 450 core\nlayout(binding = 0) uniform ") +
		                             kind->second.first + " uTexture;\n" + R"(
layout(location = 0) uniform vec4 uCoords[64];
layout(location = 64) uniform float uLods[64];
out vec4 oColor;
void main()
{
	int query = int(gl_FragCoord.x);
	oColor = textureLod(uTexture, uCoords[query].)" +
		                             kind->second.second + ", uLods[query]);\n}\n";
		// A triangle covering the viewport, from the vertex index alone.
		const GLuint program = LinkProgram(R"(#version 450 core
void main() { gl_Position = vec4(gl_VertexID == 1 ? 3.0 : -1.0, gl_VertexID == 2 ? 3.0 : -1.0, 0.5, 1.0); })",
		                                   fragment.c_str());
		if (program != 0)
		{
			myPrograms[aTarget] = program;
		}
		return program;
	}

	Gpu::Context* myContext = nullptr;
	Gpu::Texture myTarget;
	Gpu::RenderTargetView* myTargetView = nullptr;
	Gpu::SamplerState mySampler;
	std::map<GLenum, GLuint> myPrograms;
};
