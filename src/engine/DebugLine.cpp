#include "engine/DebugLine.h"

#include <cstdint>
#include <cstring>
#include <type_traits>

#include "engine/Effect.h"
#include "engine/Engine.h"
#include "engine/EngineReport.h"
#include "engine/Instance.h"
#include "model/Model.h"
#include "model/ModelNode.h"
#include "renderer/Renderer.h"

namespace Zeph
{
namespace
{
constexpr const char* ourLineEffectFile = "Data/Shaders/Misc/Vertex_PosCol.fx";
constexpr uint32_t ourLineIndices[2] = {0, 1};
} // namespace

// The vertices go to the GPU as they lie in memory: POSITION then COLOR, 28 bytes.
static_assert(sizeof(DebugLine::Vertex) == 28 && std::is_trivially_copyable_v<DebugLine::Vertex>,
              "a line vertex is three and four packed floats");

DebugLine::DebugLine() : myVertices(2, 2, true)
{
}

DebugLine::~DebugLine()
{
	Destroy();
}

bool DebugLine::Init(const Vertex& aFirst, const Vertex& aSecond)
{
	Destroy();
	myVertices.Add(aFirst);
	myVertices.Add(aSecond);
	Engine* engine = Engine::GetInstance();
	Effect* effect = engine != nullptr ? engine->GetEffectContainer().GetEffect(ourLineEffectFile) : nullptr;
	if (effect == nullptr)
	{
		ReportCritical(__LINE__, "Zeph::DebugLine::Init", "Couldn't create the line model");
		myVertices.RemoveAll();
		return false;
	}
	const Gpu::InputElement layout[] = {
	    {"POSITION", 0, Dds::Format::R32G32B32_FLOAT, 0, 0},
	    {"COLOR", 0, Dds::Format::R32G32B32A32_FLOAT, 0, 12},
	};
	Model* model = new Model();
	model->SetVertexData(2, static_cast<int>(sizeof(Vertex)), myVertices.begin(),
	                     static_cast<int>(sizeof(Vertex) * 2));
	model->SetIndexData(2, Model::ourIndexFormatR32, ourLineIndices,
	                    static_cast<int>(sizeof(ourLineIndices)));
	model->SetInputLayoutDesc(layout);
	model->SetEffect(effect);
	model->SetDynamicVertexBufferFlag(true);
	Surface surface;
	surface.SetEffect(effect);
	surface.SetIndexCount(2);
	surface.SetPrimitiveTopology(Gpu::PrimitiveTopology::LineList);
	model->GetSurfaces().Add(surface);
	myModelNode = new ModelNode();
	myModelNode->SetModel(model);
	effect->SetTechnique("Render");
	if (!model->Init())
	{
		ReportCritical(__LINE__, "Zeph::DebugLine::Init", "Couldn't create the line model");
		Destroy();
		return false;
	}
	myModelNode->SetTechniqueByName("Render");
	myInstance = new Instance(myModelNode);
	return true;
}

void DebugLine::Destroy()
{
	delete myInstance;
	myInstance = nullptr;
	delete myModelNode;
	myModelNode = nullptr;
	myVertices.RemoveAll();
}

void DebugLine::SetVertexPosition(int anIndex, const Vector3<float>& aPosition)
{
	if (anIndex < 0 || anIndex >= myVertices.Count())
	{
		return;
	}
	myVertices[anIndex].myPosition = aPosition;
	Model* model = myModelNode != nullptr ? myModelNode->GetModel() : nullptr;
	if (model == nullptr)
	{
		return;
	}
	std::memcpy(model->GetVertexData().data(), myVertices.begin(), sizeof(Vertex) * 2);
	model->UpdateVertexBuffer();
}

void DebugLine::Render()
{
	// Lines are overlays (path edges): drawn after the frame's post-processing.
	Engine* engine = Engine::GetInstance();
	if (myInstance != nullptr && engine != nullptr)
	{
		engine->GetRenderer().RenderLateInstance(myInstance);
	}
}
} // namespace Zeph
