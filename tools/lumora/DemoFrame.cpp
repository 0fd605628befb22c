#include "DemoFrame.h"

#include <cstdio>
#include <vector>

#include "core/Matrix44.h"
#include "core/Vector3.h"
#include "engine/Camera.h"
#include "engine/CameraInstance.h"
#include "engine/Engine.h"
#include "engine/Text.h"
#include "platform/gpu/Buffer.h"
#include "platform/gpu/InputLayout.h"
#include "platform/gpu/Readback.h"

namespace LumoraTool
{
namespace
{
struct Vertex
{
	float myPosition[3];
	float myColor[4];
};

struct Box
{
	Vector3<float> myCenter;
	Vector3<float> myHalfSize;
	float myColor[3];
};

// The engine's box: corners 0-7 and twelve triangles, clockwise seen from outside.
constexpr uint32_t ourBoxIndices[36] = {0, 1, 2, 0, 2, 3, 4, 6, 5, 4, 7, 6, 4, 5, 1, 4, 1, 0,
                                        3, 2, 6, 3, 6, 7, 1, 5, 6, 1, 6, 2, 4, 0, 3, 4, 3, 7};

// Corners in the engine's order; the lower ones darker, so faces read without lighting.
void AddBox(const Box& aBox, std::vector<Vertex>& someVertices, std::vector<uint32_t>& someIndices)
{
	const uint32_t first = static_cast<uint32_t>(someVertices.size());
	const float signs[8][3] = {{-1, -1, -1}, {-1, 1, -1}, {1, 1, -1}, {1, -1, -1},
	                           {-1, -1, 1},  {-1, 1, 1},  {1, 1, 1},  {1, -1, 1}};
	for (const auto& sign : signs)
	{
		const float shade = sign[1] > 0 ? 1.0f : 0.3f;
		someVertices.push_back(
		    {{aBox.myCenter.x + sign[0] * aBox.myHalfSize.x, aBox.myCenter.y + sign[1] * aBox.myHalfSize.y,
		      aBox.myCenter.z + sign[2] * aBox.myHalfSize.z},
		     {aBox.myColor[0] * shade, aBox.myColor[1] * shade, aBox.myColor[2] * shade, 1.0f}});
	}
	for (uint32_t index : ourBoxIndices)
	{
		someIndices.push_back(first + index);
	}
}

bool Draw(Zeph::Engine& anEngine, Zeph::Effect& anEffect, const char* aTechnique,
          const std::vector<Vertex>& someVertices, const std::vector<uint32_t>& someIndices)
{
	Gpu::Context& context = anEngine.GetContext();
	anEffect.SetTechnique(aTechnique);
	Fx::Pass* pass = anEffect.GetTechnique()->GetPassByIndex(0);
	if (pass == nullptr)
	{
		std::fprintf(stderr, "lumora: the effect has no technique '%s'\n", aTechnique);
		return false;
	}
	Gpu::Buffer vertices;
	Gpu::Buffer indices;
	Gpu::InputLayout layout;
	const Gpu::InputElement elements[] = {
	    {"POSITION", 0, Dds::Format::R32G32B32_FLOAT, 0, 0},
	    {"COLOR", 0, Dds::Format::R32G32B32A32_FLOAT, 0, 12},
	};
	bool result =
	    vertices.Init({Gpu::BufferKind::Vertex, someVertices.size() * sizeof(Vertex), false, "demo vertices"},
	                  someVertices.data()) &&
	    indices.Init({Gpu::BufferKind::Index, someIndices.size() * sizeof(uint32_t), false, "demo indices"},
	                 someIndices.data()) &&
	    layout.Init(context, elements, pass->GetVertexInputs(), "demo layout");
	if (result)
	{
		context.SetInputLayout(&layout);
		context.SetVertexBuffer(0, &vertices, sizeof(Vertex), 0);
		context.SetIndexBuffer(&indices, Gpu::IndexFormat::UInt32, 0);
		context.SetPrimitiveTopology(Gpu::PrimitiveTopology::TriangleList);
		result = pass->Apply(context) && context.DrawIndexed(static_cast<uint32_t>(someIndices.size()), 0, 0);
		context.SetInputLayout(nullptr);
		context.SetVertexBuffer(0, nullptr, 0, 0);
		context.SetIndexBuffer(nullptr, Gpu::IndexFormat::UInt32, 0);
	}
	layout.Destroy();
	indices.Destroy();
	vertices.Destroy();
	return result;
}

bool RenderWithEngine(Zeph::Engine& anEngine, const std::string& aPath, int aWidth, int aHeight)
{
	Zeph::Effect* effect = anEngine.GetEffectContainer().GetEffect("Data/Shaders/Misc/Vertex_PosCol.fx");
	if (effect == nullptr)
	{
		std::fprintf(stderr,
		             "lumora: cannot load Data/Shaders/Misc/Vertex_PosCol.fx (is data/ here, built?)\n");
		return false;
	}
	Zeph::Camera camera;
	Zeph::CameraInstance view(&camera);
	const Vector3<float> eye(7.0f, 6.0f, -10.0f);
	Vector3<float> direction = Vector3<float>(0.0f, 0.5f, 0.0f) - eye;
	view.LookTo(eye, direction.Normalize(), Vector3<float>(0.0f, 1.0f, 0.0f));
	effect->SetWorldMatrix(Matrix44<float>());
	effect->SetViewMatrix(view.GetView());
	effect->SetProjectionMatrix(view.GetProjection());

	std::vector<Vertex> vertices;
	std::vector<uint32_t> indices;
	AddBox({{0.0f, -0.1f, 0.0f}, {6.0f, 0.1f, 6.0f}, {0.55f, 0.55f, 0.6f}}, vertices, indices);
	const float colors[][3] = {{0.9f, 0.25f, 0.2f},  {0.2f, 0.7f, 0.3f},  {0.25f, 0.4f, 0.95f},
	                           {0.95f, 0.75f, 0.2f}, {0.7f, 0.3f, 0.85f}, {0.2f, 0.8f, 0.85f}};
	for (int row = 0; row < 3; ++row)
	{
		for (int column = 0; column < 3; ++column)
		{
			const int at = row * 3 + column;
			const float height = 0.4f + 0.35f * static_cast<float>((at * 5) % 7);
			AddBox(
			    {{-3.5f + 3.5f * static_cast<float>(column), height, -3.5f + 3.5f * static_cast<float>(row)},
			     {0.8f, height, 0.8f},
			     {colors[at % 6][0], colors[at % 6][1], colors[at % 6][2]}},
			    vertices, indices);
		}
	}
	std::vector<Vertex> wireVertices;
	std::vector<uint32_t> wireIndices;
	AddBox({{0.0f, 4.5f, 0.0f}, {1.2f, 0.6f, 1.2f}, {1.0f, 0.95f, 0.6f}}, wireVertices, wireIndices);

	Gpu::Context& context = anEngine.GetContext();
	const float sky[4] = {0.05f, 0.07f, 0.1f, 1.0f};
	context.ClearRenderTargetView(*anEngine.GetBackBufferView(), sky);
	context.ClearDepthStencilView(*anEngine.GetDepthStencilView(), true, true, 1.0f, 0);
	Gpu::RenderTargetView* const targets[] = {anEngine.GetBackBufferView()};
	if (!context.SetRenderTargets(targets, anEngine.GetDepthStencilView()) ||
	    !Draw(anEngine, *effect, "Render", vertices, indices) ||
	    !Draw(anEngine, *effect, "RenderWireFrame", wireVertices, wireIndices))
	{
		std::fprintf(stderr, "lumora: drawing the frame failed\n");
		return false;
	}
	// The editor's info line, drawn at once over the frame.
	if (Zeph::Font* font = anEngine.GetFontContainer().GetFont("Arial"))
	{
		Zeph::Text info(font);
		info.SetPosition(Vector2<float>(8.0f, 8.0f));
		info.SetSize(14.0f);
		info.SetText("Camera Position: 7 6 -10");
		info.Render(true);
	}
	anEngine.Present();
	std::vector<uint8_t> pixels;
	if (!Gpu::ReadRenderTarget(context, *anEngine.GetBackBufferView(), pixels) ||
	    !Gpu::SavePng(aPath, aWidth, aHeight, pixels.data()))
	{
		std::fprintf(stderr, "lumora: cannot write %s\n", aPath.c_str());
		return false;
	}
	return true;
}
} // namespace

bool RenderDemoFrame(const std::string& aPath, int aWidth, int aHeight)
{
	Gpu::WindowHandle window = 0;
	bool result = false;
	if (Zeph::Engine::Create(window, aWidth, aHeight))
	{
		result = RenderWithEngine(*Zeph::Engine::GetInstance(), aPath, aWidth, aHeight);
	}
	else
	{
		std::fprintf(stderr, "lumora: the engine could not start (no OpenGL 4.5 core context?)\n");
	}
	Zeph::Engine::ShutDown();
	return result;
}
} // namespace LumoraTool
