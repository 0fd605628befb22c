// The GPU layer on llvmpipe: how many small draws a frame can afford, and what a
// bare 1280x720 frame (clear + present) costs headless and into an X11 window.
// Each benchmark iteration is one frame, so the time column is the time per frame;
// llvmpipe renders on its own threads, so times and rates are wall-clock time.

#include <benchmark/benchmark.h>

#include <cstdint>
#include <string>

#include "platform/gpu/Buffer.h"
#include "platform/gpu/Device.h"
#include "platform/gpu/SwapChain.h"
#include "platform/gpu/Texture.h"

#include "../tests/platform/gpu/XServer.h"

namespace
{
constexpr int ourDrawsPerFrame = 1000;

// A quad whose corners come from gl_VertexID, moved by a per-draw offset the way
// the engine changes per-object constants between draws.
GLuint MakeQuadProgram()
{
	const char* vertexSource = R"(#version 450 core
layout(location = 0) uniform vec2 uOffset;
const vec2 corners[4] = vec2[](vec2(0.0, 0.0), vec2(0.05, 0.0), vec2(0.05, -0.05), vec2(0.0, -0.05));
void main()
{
	gl_Position = vec4(corners[gl_VertexID] + uOffset, 0.5, 1.0);
})";
	const char* fragmentSource = R"(#version 450 core
out vec4 oColor;
void main()
{
	oColor = vec4(1.0, 0.5, 0.0, 1.0);
})";
	const GLuint program = glCreateProgram();
	for (const auto& [stage, source] :
	     {std::pair{GL_VERTEX_SHADER, vertexSource}, std::pair{GL_FRAGMENT_SHADER, fragmentSource}})
	{
		const GLuint shader = glCreateShader(stage);
		glShaderSource(shader, 1, &source, nullptr);
		glCompileShader(shader);
		glAttachShader(program, shader);
		glDeleteShader(shader);
	}
	glLinkProgram(program);
	GLint linkedFlag = GL_FALSE;
	glGetProgramiv(program, GL_LINK_STATUS, &linkedFlag);
	if (linkedFlag != GL_TRUE)
	{
		glDeleteProgram(program);
		return 0;
	}
	return program;
}

void BM_IndexedQuadDraws(benchmark::State& aState)
{
	Gpu::Device device;
	if (!device.Init(64, 64))
	{
		aState.SkipWithError("no OpenGL 4.5 core context");
		return;
	}
	Gpu::Context& context = device.GetContext();
	Gpu::TextureDesc desc;
	desc.myWidth = 1280;
	desc.myHeight = 720;
	desc.myFormat = Dds::Format::R8G8B8A8_UNORM_SRGB;
	desc.myLabel = "draw target";
	Gpu::Texture target;
	const uint16_t indices[6] = {0, 1, 2, 0, 2, 3};
	Gpu::Buffer indexBuffer;
	const GLuint program = MakeQuadProgram();
	if (program == 0 || !target.Init(context, desc) ||
	    !indexBuffer.Init(context,
	                      {.myKind = Gpu::BufferKind::Index, .mySize = sizeof(indices), .myLabel = "quad"},
	                      indices))
	{
		aState.SkipWithError("setup failed");
		device.Destroy();
		return;
	}
	Gpu::RenderTargetView* views[] = {target.CreateRenderTargetView()};
	context.SetRenderTargets(views, nullptr);
	context.SetViewport({.myWidth = 1280, .myHeight = 720});
	context.GetStateCache().UseProgram(program);
	context.SetInputLayout(nullptr);
	context.SetIndexBuffer(&indexBuffer, Gpu::IndexFormat::UInt16, 0);
	context.SetPrimitiveTopology(Gpu::PrimitiveTopology::TriangleList);
	const float clearColor[4] = {0.0f, 0.0f, 0.0f, 1.0f};
	for (auto _ : aState)
	{
		context.ClearRenderTargetView(*views[0], clearColor);
		for (int draw = 0; draw < ourDrawsPerFrame; ++draw)
		{
			// A 40x25 grid over the target.
			glProgramUniform2f(program, 0, -1.0f + 0.05f * static_cast<float>(draw % 40),
			                   1.0f - 0.08f * static_cast<float>(draw / 40));
			context.DrawIndexed(6, 0, 0);
		}
		glFinish();
	}
	aState.SetItemsProcessed(aState.iterations() * ourDrawsPerFrame);
	aState.counters["draws/frame"] = ourDrawsPerFrame;
	context.GetStateCache().ForgetProgram(program);
	glDeleteProgram(program);
	indexBuffer.Destroy();
	target.Destroy();
	device.Destroy();
}
BENCHMARK(BM_IndexedQuadDraws)->Unit(benchmark::kMillisecond)->UseRealTime();

// One frame as the editor's loop shows it: clear the 1280x720 back buffer and
// present. Headless, Present only flushes, so the frame waits for the GPU here.
void ClearAndPresent(benchmark::State& aState, Gpu::Device& aDevice)
{
	Gpu::SwapChain swapChain;
	if (!swapChain.Init(aDevice, 1280, 720, Dds::Format::R8G8B8A8_UNORM_SRGB))
	{
		aState.SkipWithError("no swap chain");
		return;
	}
	Gpu::RenderTargetView* view = swapChain.GetBuffer()->CreateRenderTargetView();
	float clearColor[4] = {0.2f, 0.3f, 0.4f, 1.0f};
	for (auto _ : aState)
	{
		clearColor[0] = clearColor[0] > 0.9f ? 0.1f : clearColor[0] + 0.01f;
		aDevice.GetContext().ClearRenderTargetView(*view, clearColor);
		swapChain.Present(0);
		glFinish();
	}
	aState.counters["frames"] =
	    benchmark::Counter(static_cast<double>(aState.iterations()), benchmark::Counter::kIsRate);
	swapChain.Destroy();
}

void BM_ClearPresentHeadless(benchmark::State& aState)
{
	Gpu::Device device;
	if (!device.Init(1280, 720))
	{
		aState.SkipWithError("no OpenGL 4.5 core context");
		return;
	}
	ClearAndPresent(aState, device);
	device.Destroy();
}
BENCHMARK(BM_ClearPresentHeadless)->Unit(benchmark::kMillisecond)->UseRealTime();

// The same frame blitted into a 1280x720 window of an X server (Xvfb when
// $DISPLAY does not answer) and handed to it by Mesa's software path.
void BM_ClearPresentX11(benchmark::State& aState)
{
	XServer server;
	if (!server.Start("1920x1080x24"))
	{
		aState.SkipWithError(server.GetReason().c_str());
		return;
	}
	Display* display = XOpenDisplay(nullptr);
	if (display == nullptr)
	{
		aState.SkipWithError("cannot open the X display");
		return;
	}
	const Window window = XCreateSimpleWindow(display, DefaultRootWindow(display), 0, 0, 1280, 720, 0, 0, 0);
	XSync(display, False);
	Gpu::Device device;
	if (device.Init(1280, 720, window))
	{
		ClearAndPresent(aState, device);
		device.Destroy();
	}
	else
	{
		aState.SkipWithError("no OpenGL 4.5 core context for the window");
	}
	XDestroyWindow(display, window);
	XCloseDisplay(display);
}
BENCHMARK(BM_ClearPresentX11)->Unit(benchmark::kMillisecond)->UseRealTime();
} // namespace
