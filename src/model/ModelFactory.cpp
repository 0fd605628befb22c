#include "model/ModelFactory.h"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <cstring>

#include "engine/Effect.h"
#include "engine/EffectContainer.h"
#include "engine/Engine.h"
#include "engine/EngineReport.h"
#include "model/ColladaMeshFactory.h"
#include "model/Model.h"
#include "model/ModelNode.h"
#include "model/Surface.h"

namespace Zeph
{
namespace
{
constexpr const char* ourLoadFunction = "Zeph::ModelFactory::LoadModel";
constexpr int ourInvalidFormatLine = 68;
constexpr int ourLoadFailedLine = 77;
constexpr int ourCreateAlFailedLine = 109;
// The box a bounding sphere starts from, grown by each vertex.
constexpr float ourBoundsStart = 2000000.0f;

const Model* FirstModel(const ModelNode& aNode)
{
	if (aNode.GetModel() != nullptr)
	{
		return aNode.GetModel();
	}
	for (const ModelNode* child : aNode.GetChildren())
	{
		if (const Model* found = FirstModel(*child))
		{
			return found;
		}
	}
	return nullptr;
}

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

ModelNode* ModelFactory::CreateModelNodeAL(const std::string& aName)
{
	const auto found = myModels.find(aName);
	if (found != myModels.end())
	{
		return found->second.get();
	}
	ModelNode* tree = ColladaMeshFactory::CreateModelNodeAL(aName);
	if (tree == nullptr)
	{
		ReportCritical(ourCreateAlFailedLine, "Zeph::ModelFactory::CreateModelNodeAL",
		               "Couldn't load Model: %s", aName.c_str());
		return nullptr;
	}
	Store(aName, tree);
	return tree;
}

ModelNode* ModelFactory::LoadModel(const std::string& aName)
{
	const size_t dot = aName.rfind('.');
	const std::string extension = dot != std::string::npos ? aName.substr(dot) : std::string();
	ModelNode* tree = nullptr;
	if (extension == ".dae")
	{
		tree = ColladaMeshFactory::CreateModelNodeDAE(aName);
		if (tree != nullptr)
		{
			tree->SetTechniqueByName("Render");
		}
	}
	else if (extension == ".al")
	{
		tree = ColladaMeshFactory::CreateModelNodeAL(aName);
	}
	else
	{
		ReportCritical(ourInvalidFormatLine, ourLoadFunction, "Invalid model file format: %s", aName.c_str());
	}
	if (tree == nullptr)
	{
		ReportCritical(ourLoadFailedLine, ourLoadFunction, "Couldn't load Model: %s", aName.c_str());
		return nullptr;
	}
	Store(aName, tree);
	return tree;
}

void ModelFactory::Store(const std::string& aName, ModelNode* aTree)
{
	myModels[aName].reset(aTree);
	myCullShapes[aName] = ComputeBoundingSphere(*aTree);
}

Intersection::Sphere ModelFactory::ComputeBoundingSphere(const ModelNode& aRoot)
{
	Vector3<float> minimum(ourBoundsStart, ourBoundsStart, ourBoundsStart);
	Vector3<float> maximum(-ourBoundsStart, -ourBoundsStart, -ourBoundsStart);
	// A tree without a model keeps the untouched box: a huge sphere, never culled.
	if (const Model* model = FirstModel(aRoot))
	{
		int stride = 0;
		if (model->GetVertexType() == 4)
		{
			stride = 56;
		}
		else if (model->GetVertexType() == 6)
		{
			stride = 64;
		}
		const std::span<const uint8_t> data = model->GetVertexData();
		for (int vertex = 0; vertex < model->GetVertexCount(); ++vertex)
		{
			float position[3] = {0.0f, 0.0f, 0.0f};
			const size_t offset = static_cast<size_t>(vertex) * static_cast<size_t>(stride);
			if (stride > 0)
			{
				if (offset + sizeof(position) > data.size())
				{
					break; // a vertex count past the data: the rest is not there to read
				}
				std::memcpy(position, data.data() + offset, sizeof(position));
			}
			minimum.x = std::min(minimum.x, position[0]);
			minimum.y = std::min(minimum.y, position[1]);
			minimum.z = std::min(minimum.z, position[2]);
			maximum.x = std::max(maximum.x, position[0]);
			maximum.y = std::max(maximum.y, position[1]);
			maximum.z = std::max(maximum.z, position[2]);
		}
	}
	minimum.x = -minimum.x;
	maximum.x = -maximum.x;
	if (minimum.x > maximum.x)
	{
		std::swap(minimum.x, maximum.x);
	}
	const Vector3<float> centre((minimum.x + maximum.x) * 0.5f, (minimum.y + maximum.y) * 0.5f,
	                            (minimum.z + maximum.z) * 0.5f);
	const float dx = maximum.x - centre.x;
	const float dy = maximum.y - centre.y;
	const float dz = maximum.z - centre.z;
	return Intersection::Sphere(centre, std::sqrt(dx * dx + dy * dy + dz * dz));
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

std::vector<std::string> ModelFactory::GetFileNames() const
{
	// Only trees read from files get a cull shape (Store).
	std::vector<std::string> names;
	names.reserve(myCullShapes.size());
	for (const auto& [name, shape] : myCullShapes)
	{
		names.push_back(name);
	}
	return names;
}

void ModelFactory::Clear()
{
	myModels.clear();
	myCullShapes.clear();
}
} // namespace Zeph
