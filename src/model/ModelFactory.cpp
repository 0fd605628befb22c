#include "model/ModelFactory.h"

#include <cstdint>

#include "engine/Effect.h"
#include "engine/EffectContainer.h"
#include "engine/Engine.h"
#include "engine/EngineReport.h"
#include "model/Model.h"
#include "model/ModelNode.h"
#include "model/Surface.h"

namespace Zeph
{
namespace
{
constexpr const char* ourBoxEffectFile = "Data/Shaders/Misc/Vertex_PosCol.fx";

struct BoxVertex
{
	float myPosition[3];
	float myColor[4];
};
static_assert(sizeof(BoxVertex) == 28, "a box vertex is 28 bytes");

// Twelve triangles, two per face, wound clockwise seen from outside.
constexpr uint32_t ourBoxIndices[36] = {
    0, 1, 2, 0, 2, 3, 4, 6, 5, 4, 7, 6, 4, 5, 1, 4, 1, 0,
    3, 2, 6, 3, 6, 7, 1, 5, 6, 1, 6, 2, 4, 0, 3, 4, 3, 7,
};
} // namespace

ModelFactory::ModelFactory() = default;

ModelFactory::~ModelFactory() = default;

ModelNode* ModelFactory::GetModel(const std::string& aName)
{
	const auto found = myModels.find(aName);
	if (found != myModels.end())
	{
		return found->second.get();
	}
	return LoadModel(aName);
}

ModelNode* ModelFactory::LoadModel(const std::string& aName)
{
	// The COLLADA (.dae) and binary (.al) importers are not part of the engine yet;
	// until they are, every load fails the way a failed import does and stores nothing.
	ReportCritical(__LINE__, "Zeph::ModelFactory::LoadModel", "Couldn't load Model: %s", aName.c_str());
	return nullptr;
}

ModelNode* ModelFactory::CreateAABB(const std::string& aName, const Vector3<float>& aHalfSize,
                                    const Vector4<float>& aColor, Gpu::PrimitiveTopology aTopology)
{
	const auto found = myModels.find(aName);
	if (found != myModels.end())
	{
		return found->second.get();
	}
	Engine* engine = Engine::GetInstance();
	Effect* effect = engine != nullptr ? engine->GetEffectContainer().GetEffect(ourBoxEffectFile) : nullptr;
	if (effect == nullptr)
	{
		ReportCritical(__LINE__, "Zeph::ModelFactory::CreateAABB", "Couldn't create AABB: %s", aName.c_str());
		return nullptr;
	}

	const float x = aHalfSize.x;
	const float y = aHalfSize.y;
	const float z = aHalfSize.z;
	const float r = aColor.x;
	const float g = aColor.y;
	const float b = aColor.z;
	const float a = aColor.w;
	const BoxVertex vertices[8] = {
	    {{-x, -y, -z}, {r, g, b, a}}, {{-x, y, -z}, {r, g, b, a}}, {{x, y, -z}, {r, g, b, a}},
	    {{x, -y, -z}, {r, g, b, a}},  {{-x, -y, z}, {r, g, b, a}}, {{-x, y, z}, {r, g, b, a}},
	    {{x, y, z}, {r, g, b, a}},    {{x, -y, z}, {r, g, b, a}},
	};
	const Gpu::InputElement layout[] = {
	    {"POSITION", 0, Dds::Format::R32G32B32_FLOAT, 0, 0},
	    {"COLOR", 0, Dds::Format::R32G32B32A32_FLOAT, 0, 12},
	};

	Model* model = new Model();
	model->SetVertexData(8, static_cast<int>(sizeof(BoxVertex)), vertices,
	                     static_cast<int>(sizeof(vertices)));
	model->SetIndexData(36, Model::ourIndexFormatR32, ourBoxIndices, static_cast<int>(sizeof(ourBoxIndices)));
	model->SetInputLayoutDesc(layout);
	model->SetEffect(effect);
	Surface surface;
	surface.SetEffect(effect);
	surface.SetIndexCount(36);
	surface.SetStartIndex(0);
	surface.SetPrimitiveTopology(aTopology);
	model->GetSurfaces().Add(surface);

	auto node = std::make_unique<ModelNode>();
	node->SetName(aName);
	node->SetModel(model);
	// The layout is matched against the "Render" technique's first pass.
	effect->SetTechnique("Render");
	if (!model->Init())
	{
		ReportCritical(__LINE__, "Zeph::ModelFactory::CreateAABB", "Couldn't create AABB: %s", aName.c_str());
		return nullptr;
	}
	node->SetTechniqueByName("Render");
	node->SetIsShadowCasterFlag(false);
	ModelNode* result = node.get();
	myModels[aName] = std::move(node);
	return result;
}

Intersection::Sphere ModelFactory::GetCullShapeFromModel(const std::string& aName) const
{
	const auto found = myCullShapes.find(aName);
	if (found != myCullShapes.end())
	{
		return found->second;
	}
	ReportCritical(__LINE__, "Zeph::ModelFactory::GetCullShapeFromModel",
	               "Tried to get radius for model not in container!");
	return Intersection::Sphere(Vector3<float>(0.0f, 0.0f, 0.0f), 1.0f);
}

void ModelFactory::Clear()
{
	myModels.clear();
	myCullShapes.clear();
}
} // namespace Zeph
