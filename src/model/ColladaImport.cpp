#include "model/ColladaImport.h"

#include <algorithm>
#include <array>
#include <climits>
#include <cmath>
#include <cstdint>
#include <cstring>
#include <limits>
#include <numbers>
#include <unordered_map>
#include <utility>

#include "engine/Camera.h"
#include "model/Model.h"
#include "model/ModelLight.h"
#include "model/ModelNode.h"
#include "model/Surface.h"
#include "model/TransformationNodeHierarchy.h"
#include "model/VertexTypes.h"
#include "platform/collada/Document.h"

namespace Zeph
{
namespace
{
// What fills one element of a vertex.
enum class Fill
{
	Position,
	Weights,
	Bones,
	Normal,
	Color,
	TexCoord,
	Tangent,
	TexTangent,
	Binormal,
	TexBinormal,
};

struct LayoutElement
{
	Fill myFill;
	const char* mySemanticName;
	Dds::Format myFormat;
	int mySize;
	const Collada::Source* mySource; // null for the skin's two words
};

// The most nodes of a scene, and polygon sets (surfaces) of a geometry: what a GrowingArray holds.
constexpr int ourMaxNodeCount = std::numeric_limits<unsigned short>::max();

// The corner key: the source indices of position, normal, colour, texture
// coordinate, geometry tangent, texture tangent, geometry binormal and texture
// binormal, -1 where the polygon set has no such input.
constexpr std::array<Collada::Semantic, 8> ourKeySemantics = {
    Collada::Semantic::Position, Collada::Semantic::Normal,      Collada::Semantic::Color,
    Collada::Semantic::TexCoord, Collada::Semantic::Tangent,     Collada::Semantic::TexTangent,
    Collada::Semantic::Binormal, Collada::Semantic::TexBinormal,
};
using CornerKey = std::array<int64_t, 8>;

struct CornerKeyHash
{
	size_t operator()(const CornerKey& aKey) const
	{
		uint64_t hash = 1469598103934665603ull;
		for (int64_t value : aKey)
		{
			hash = (hash ^ static_cast<uint64_t>(value)) * 1099511628211ull;
			hash ^= hash >> 29;
		}
		return static_cast<size_t>(hash);
	}
};

// Where each element's data comes from in the key.
size_t KeySlot(Fill aFill)
{
	switch (aFill)
	{
	case Fill::Position:
	case Fill::Weights:
	case Fill::Bones:
		return 0;
	case Fill::Normal:
		return 1;
	case Fill::Color:
		return 2;
	case Fill::TexCoord:
		return 3;
	case Fill::Tangent:
		return 4;
	case Fill::TexTangent:
		return 5;
	case Fill::Binormal:
		return 6;
	case Fill::TexBinormal:
		return 7;
	}
	return 0;
}

// The elements, each only where the mesh has its source, in the order the vertex
// types list them; the skin's weights and bones follow the position.
std::vector<LayoutElement> BuildLayout(const Collada::Mesh& aMesh, bool aSkinnedFlag)
{
	std::vector<LayoutElement> layout;
	const auto add = [&](Fill aFill, Collada::Semantic aSemantic, const char* aName, Dds::Format aFormat,
	                     int aSize) {
		if (const Collada::Source* source = aMesh.FindSourceBySemantic(aSemantic))
		{
			layout.push_back({aFill, aName, aFormat, aSize, source});
		}
	};
	add(Fill::Position, Collada::Semantic::Position, "POSITION", Dds::Format::R32G32B32_FLOAT, 12);
	if (aSkinnedFlag)
	{
		layout.push_back({Fill::Weights, "WEIGHTS", Dds::Format::R8G8B8A8_UNORM, 4, nullptr});
		layout.push_back({Fill::Bones, "BONES", Dds::Format::R8G8B8A8_UINT, 4, nullptr});
	}
	add(Fill::Normal, Collada::Semantic::Normal, "NORMAL", Dds::Format::R32G32B32_FLOAT, 12);
	add(Fill::Color, Collada::Semantic::Color, "COLOR", Dds::Format::R32G32B32A32_FLOAT, 16);
	add(Fill::TexCoord, Collada::Semantic::TexCoord, "TEXCOORD", Dds::Format::R32G32_FLOAT, 8);
	add(Fill::Tangent, Collada::Semantic::Tangent, "TANGENT", Dds::Format::R32G32B32_FLOAT, 12);
	add(Fill::TexTangent, Collada::Semantic::TexTangent, "TANGENT", Dds::Format::R32G32B32_FLOAT, 12);
	add(Fill::Binormal, Collada::Semantic::Binormal, "BINORMAL", Dds::Format::R32G32B32_FLOAT, 12);
	add(Fill::TexBinormal, Collada::Semantic::TexBinormal, "BINORMAL", Dds::Format::R32G32B32_FLOAT, 12);
	return layout;
}

// The vertex type whose row the layout is, or -1. The element count picks the row
// (with the second element deciding between rows of the same length); then every
// element must be the row's.
int MatchVertexType(const std::vector<LayoutElement>& aLayout)
{
	if (aLayout.empty() || std::strcmp(aLayout[0].mySemanticName, "POSITION") != 0 ||
	    aLayout[0].myFormat != Dds::Format::R32G32B32_FLOAT)
	{
		return -1;
	}
	int type = -1;
	switch (aLayout.size())
	{
	case 2:
		type = VERTEX_TYPE_POS_UV;
		break;
	case 3:
		if (std::strcmp(aLayout[1].mySemanticName, "NORMAL") == 0)
		{
			type = VERTEX_TYPE_POS_NORM_UV;
		}
		else if (std::strcmp(aLayout[1].mySemanticName, "COLOR") == 0)
		{
			type = VERTEX_TYPE_POS_COL_UV;
		}
		break;
	case 4:
		type = VERTEX_TYPE_POS_NORM_UV_TAN;
		break;
	case 5:
		type = std::strcmp(aLayout[1].mySemanticName, "NORMAL") == 0 ? VERTEX_TYPE_POS_NORM_UV_TAN_BI
		                                                             : VERTEX_TYPE_POS_WEIGHT_BONES_NORM_UV;
		break;
	case 6:
		type = VERTEX_TYPE_POS_WEIGHT_BONES_NORM_UV_TAN;
		break;
	case 7:
		type = VERTEX_TYPE_POS_WEIGHT_BONES_NORM_UV_TAN_BI;
		break;
	default:
		return -1;
	}
	const std::span<const VertexElement> row = GetVertexTypeElements(type);
	if (row.size() != aLayout.size())
	{
		return -1;
	}
	for (size_t index = 0; index < row.size(); ++index)
	{
		if (std::strcmp(row[index].mySemanticName, aLayout[index].mySemanticName) != 0 ||
		    row[index].myFormat != aLayout[index].myFormat)
		{
			return -1;
		}
	}
	return type;
}

// Up to aCount values of the source's element anIndex into someValues; what the
// element lacks (a short stride, an index outside the source) keeps its value.
void ReadElement(const Collada::Source* aSource, int64_t anIndex, float* someValues, int aCount)
{
	if (aSource == nullptr || anIndex < 0 || anIndex > UINT32_MAX)
	{
		return;
	}
	const float* element = aSource->Element(static_cast<uint32_t>(anIndex));
	if (element == nullptr)
	{
		return;
	}
	const int count = std::min(aCount, aSource->myStride);
	const size_t available =
	    aSource->myFloats.size() - static_cast<size_t>(element - aSource->myFloats.data());
	std::memcpy(someValues, element, std::min(static_cast<size_t>(count), available) * sizeof(float));
}

// The skin's weights and bones words of a vertex: byte j of each is influence j's
// weight in 1/255 steps and its joint. A joint that is no byte (the bind shape's -1)
// gets bone 0.
void SkinWords(const Collada::Skin& aSkin, int64_t aPositionIndex, uint8_t someWeights[4],
               uint8_t someBones[4])
{
	if (aPositionIndex < 0 || static_cast<size_t>(aPositionIndex) >= aSkin.myInfluences.size())
	{
		return;
	}
	const std::vector<Collada::Influence>& influences =
	    aSkin.myInfluences[static_cast<size_t>(aPositionIndex)];
	for (size_t j = 0; j < influences.size() && j < 4; ++j)
	{
		const float scaled = std::clamp(influences[j].myWeight, 0.0f, 1.0f) * 255.0f + 0.5f;
		someWeights[j] = static_cast<uint8_t>(scaled);
		const int joint = influences[j].myJoint;
		someBones[j] = joint >= 0 && joint <= 255 ? static_cast<uint8_t>(joint) : 0;
	}
}

struct MaterialChannel
{
	const Collada::Channel Collada::Effect::*myChannel;
	const char* myVariableName;
	bool mySRGBFlag;
};

// The channels whose first texture a surface binds, in binding order.
constexpr MaterialChannel ourMaterialChannels[] = {
    {&Collada::Effect::myReflective, "SubstanceTexture", true},
    {&Collada::Effect::myDiffuse, "DiffuseTexture", true},
    {&Collada::Effect::myBump, "NormalTexture", false},
    {&Collada::Effect::mySpecular, "RoughnessTexture", true},
    {&Collada::Effect::myAmbient, "AOTexture", true},
};

class Converter
{
public:
	Converter(const Collada::Document& aDocument, std::vector<AlTextureBinding>& someBindings,
	          size_t aModelByteLimit)
	    : myDocument(aDocument), myBindings(someBindings), myModelByteLimit(aModelByteLimit)
	{
	}

	std::unique_ptr<ModelNode> Run(std::string& anError)
	{
		auto root = std::make_unique<ModelNode>();
		auto* rootTransformation = new TransformationNodeHierarchy();
		root->SetTransformation(rootTransformation);
		if (const Collada::VisualScene* scene = myDocument.GetVisualScene())
		{
			root->SetName(!scene->myName.empty() ? scene->myName : scene->myId);
			for (const std::unique_ptr<Collada::Node>& node : scene->myNodes)
			{
				if (!AddChild(*root, *node))
				{
					anError = myError;
					return nullptr;
				}
			}
		}
		// The document is right-handed, the engine left-handed: x is negated at the
		// root, and the reversed winding of every model goes with it.
		Matrix44<float> mirror;
		mirror.myMatrix[0] = -1.0f;
		Matrix44<float> matrix = rootTransformation->GetTransformationForTime(0.0);
		matrix *= mirror;
		rootTransformation->SetOrientation(matrix);
		return root;
	}

private:
	bool AddChild(ModelNode& aParent, const Collada::Node& aNode)
	{
		// Joints carry the skeleton, which the animation layers build from the skin.
		if (aNode.myIsJointFlag)
		{
			return true;
		}
		// A node's children live in a GrowingArray of at most 65,535; and nodes instanced by
		// nodes that are themselves instanced several times multiply, so a small document could
		// otherwise expand into millions of nodes.
		if (++myNodeCount > ourMaxNodeCount)
		{
			myError = "the scene expands to more than " + std::to_string(ourMaxNodeCount) +
			          " nodes (at node \"" + aNode.myId + "\")";
			return false;
		}
		auto* child = new ModelNode();
		aParent.AddChild(child);
		child->SetName(!aNode.myName.empty() ? aNode.myName : aNode.myId);
		auto* transformation = new TransformationNodeHierarchy();
		transformation->SetOrientation(aNode.GetLocalMatrix());
		child->SetTransformation(transformation);

		// The first entity instance decides what the node holds; instanced nodes
		// become children after the node's own.
		const Collada::Instance* entity = nullptr;
		for (const Collada::Instance& instance : aNode.myInstances)
		{
			if (instance.myKind != Collada::InstanceKind::Node)
			{
				entity = &instance;
				break;
			}
		}
		if (entity != nullptr && !ConvertInstance(*child, *entity))
		{
			return false;
		}
		for (const std::unique_ptr<Collada::Node>& grandChild : aNode.myChildren)
		{
			if (!AddChild(*child, *grandChild))
			{
				return false;
			}
		}
		for (const Collada::Instance& instance : aNode.myInstances)
		{
			if (instance.myKind == Collada::InstanceKind::Node && instance.myNode != nullptr &&
			    !AddChild(*child, *instance.myNode))
			{
				return false;
			}
		}
		return true;
	}

	bool ConvertInstance(ModelNode& aNode, const Collada::Instance& anInstance)
	{
		switch (anInstance.myKind)
		{
		case Collada::InstanceKind::Geometry: {
			const Collada::Geometry* geometry = myDocument.FindGeometry(anInstance.myUrl);
			if (geometry == nullptr || !geometry->myHasMeshFlag)
			{
				return true; // splines and convex meshes are not drawn
			}
			return ConvertGeometry(aNode, *geometry, nullptr, anInstance);
		}
		case Collada::InstanceKind::Controller: {
			const Collada::Controller* controller = myDocument.FindController(anInstance.myUrl);
			if (controller == nullptr || !controller->myHasSkinFlag)
			{
				return true; // morph targets are not drawn
			}
			const Collada::Geometry* geometry = myDocument.FindGeometry(controller->mySkin.mySource);
			if (geometry == nullptr || !geometry->myHasMeshFlag)
			{
				return true;
			}
			Collada::Skin skin = controller->mySkin;
			skin.ReduceInfluences(4, 0.0f);
			return ConvertGeometry(aNode, *geometry, &skin, anInstance);
		}
		case Collada::InstanceKind::Camera:
			if (const Collada::Camera* camera = myDocument.FindCamera(anInstance.myUrl))
			{
				aNode.SetCamera(ConvertCamera(*camera));
			}
			return true;
		case Collada::InstanceKind::Light:
			if (const Collada::Light* light = myDocument.FindLight(anInstance.myUrl))
			{
				aNode.SetLight(ConvertLight(*light));
			}
			return true;
		case Collada::InstanceKind::Node:
			return true;
		}
		return true;
	}

	// The engine's camera with the document's lens: the vertical field of view (in
	// radians, as the engine keeps it; from the horizontal one and the aspect ratio
	// when only those are given), the aspect ratio (from the two fields of view when
	// the document gives none), and the planes. What the document leaves out keeps
	// the engine's default.
	static Camera* ConvertCamera(const Collada::Camera& aCamera)
	{
		auto* camera = new Camera();
		float fov = camera->GetFov();
		float aspectRatio = camera->GetAspectRatio();
		if (aCamera.myProjection == Collada::Projection::Perspective)
		{
			constexpr float toRadians = std::numbers::pi_v<float> / 180.0f;
			if (aCamera.myHasAspectRatioFlag && aCamera.myAspectRatio > 0.0f)
			{
				aspectRatio = aCamera.myAspectRatio;
			}
			else if (aCamera.myHasXFlag && aCamera.myHasYFlag && aCamera.myYFov > 0.0f)
			{
				aspectRatio = aCamera.myXFov / aCamera.myYFov;
			}
			if (aCamera.myHasYFlag)
			{
				fov = aCamera.myYFov * toRadians;
			}
			else if (aCamera.myHasXFlag && aspectRatio > 0.0f)
			{
				fov = aCamera.myXFov / aspectRatio * toRadians;
			}
		}
		camera->SetLens(fov, aspectRatio, aCamera.myZNear, aCamera.myZFar);
		return camera;
	}

	// Point and spot lights become point records, directional lights directional
	// ones; ambient light has no place at a node and gives no record.
	static ModelLight* ConvertLight(const Collada::Light& aLight)
	{
		ModelLight::Kind kind = ModelLight::POINT;
		switch (aLight.myKind)
		{
		case Collada::LightKind::Point:
		case Collada::LightKind::Spot:
			kind = ModelLight::POINT;
			break;
		case Collada::LightKind::Directional:
			kind = ModelLight::DIRECTIONAL;
			break;
		case Collada::LightKind::Ambient:
		case Collada::LightKind::Undefined:
			return nullptr;
		}
		auto* light = new ModelLight();
		light->myKind = kind;
		light->myColor = Vector4<float>(aLight.myColor[0], aLight.myColor[1], aLight.myColor[2], 1.0f);
		return light;
	}

	bool ConvertGeometry(ModelNode& aNode, const Collada::Geometry& aGeometry, const Collada::Skin* aSkin,
	                     const Collada::Instance& anInstance)
	{
		const Collada::Mesh* mesh = &aGeometry.myMesh;
		Collada::Mesh triangulated;
		if (!mesh->IsTriangles())
		{
			triangulated = *mesh;
			triangulated.Triangulate();
			mesh = &triangulated;
		}
		const std::vector<LayoutElement> layout = BuildLayout(*mesh, aSkin != nullptr);
		const int vertexType = MatchVertexType(layout);
		if (vertexType < 0)
		{
			std::string elements;
			for (const LayoutElement& element : layout)
			{
				elements += elements.empty() ? "" : ", ";
				elements += element.mySemanticName;
			}
			myError = "geometry \"" + aGeometry.myId + "\" (line " + std::to_string(aGeometry.myLine) +
			          "): no vertex type has the layout " + (elements.empty() ? "(none)" : elements);
			return false;
		}
		int stride = 0;
		std::vector<Gpu::InputElement> layoutDesc;
		for (const LayoutElement& element : layout)
		{
			layoutDesc.push_back(
			    {element.mySemanticName, 0, element.myFormat, 0, static_cast<uint32_t>(stride)});
			stride += element.mySize;
		}

		if (mesh->mySets.size() > static_cast<size_t>(ourMaxNodeCount))
		{
			myError = "geometry \"" + aGeometry.myId + "\" has more than " + std::to_string(ourMaxNodeCount) +
			          " polygon sets";
			return false;
		}
		size_t indexCount = 0;
		for (const Collada::PolygonSet& set : mesh->mySets)
		{
			if (const Collada::Input* position = set.FindInput(Collada::Semantic::Position))
			{
				indexCount += position->myIndices.size();
			}
		}
		// Every instance of a geometry is a model of its own: a document that instances a large
		// geometry many times could ask for far more memory (and time) than it is long. The
		// corners bound what each model holds, an index and at most one vertex each.
		myModelBytes += indexCount * (sizeof(uint32_t) + static_cast<size_t>(stride));
		if (myModelBytes > myModelByteLimit)
		{
			myError = "the scene's models would take more than " + std::to_string(myModelByteLimit) +
			          " bytes (at an instance of geometry \"" + aGeometry.myId + "\")";
			return false;
		}
		std::vector<uint32_t> indices;
		indices.reserve(indexCount);
		std::vector<CornerKey> keys;
		std::unordered_map<CornerKey, uint32_t, CornerKeyHash> numbers;
		numbers.reserve(indexCount);

		auto model = std::make_unique<Model>();
		for (const Collada::PolygonSet& set : mesh->mySets)
		{
			const Collada::Input* position = set.FindInput(Collada::Semantic::Position);
			const size_t corners = position != nullptr ? position->myIndices.size() : 0;
			std::array<const Collada::Input*, 8> inputs = {};
			for (size_t slot = 0; slot < ourKeySemantics.size(); ++slot)
			{
				inputs[slot] = set.FindInput(ourKeySemantics[slot]);
			}
			const size_t start = indices.size();
			for (size_t corner = 0; corner < corners; ++corner)
			{
				CornerKey key;
				for (size_t slot = 0; slot < key.size(); ++slot)
				{
					const Collada::Input* input = inputs[slot];
					key[slot] =
					    input != nullptr && corner < input->myIndices.size() ? input->myIndices[corner] : -1;
				}
				const auto [found, newFlag] = numbers.try_emplace(key, static_cast<uint32_t>(keys.size()));
				if (newFlag)
				{
					keys.push_back(key);
				}
				indices.push_back(found->second);
			}
			Surface surface;
			surface.SetIndexCount(static_cast<int>(corners));
			surface.SetStartIndex(static_cast<int>(start));
			surface.SetReservedValues(0, 0);
			surface.SetPrimitiveTopology(Gpu::PrimitiveTopology::TriangleList);
			model->GetSurfaces().Add(surface);
			AddMaterialTextures(model->GetSurfaces().Count() - 1, set, anInstance);
		}
		for (size_t triangle = 0; triangle + 2 < indices.size(); triangle += 3)
		{
			std::swap(indices[triangle], indices[triangle + 2]);
		}

		const size_t vertexBytes = keys.size() * static_cast<size_t>(stride);
		if (vertexBytes > static_cast<size_t>(INT_MAX) || indices.size() * 4 > static_cast<size_t>(INT_MAX))
		{
			myError = "geometry \"" + aGeometry.myId + "\" is too large for one model";
			return false;
		}
		std::vector<uint8_t> vertices(vertexBytes, 0);
		for (size_t vertex = 0; vertex < keys.size(); ++vertex)
		{
			FillVertex(layout, keys[vertex], aSkin, vertices.data() + vertex * static_cast<size_t>(stride));
		}

		model->SetVertexType(vertexType);
		model->SetVertexData(static_cast<int>(keys.size()), stride, vertices.data(),
		                     static_cast<int>(vertexBytes));
		model->SetIndexData(static_cast<int>(indices.size()), Model::ourIndexFormatR32, indices.data(),
		                    static_cast<int>(indices.size() * 4));
		model->SetInputLayoutDesc(layoutDesc);
		// The bindings point at the model, which the node keeps from here on.
		for (AlTextureBinding& binding : myPendingBindings)
		{
			binding.myModel = model.get();
			myBindings.push_back(std::move(binding));
		}
		myPendingBindings.clear();
		aNode.SetModel(model.release());
		return true;
	}

	static void FillVertex(const std::vector<LayoutElement>& aLayout, const CornerKey& aKey,
	                       const Collada::Skin* aSkin, uint8_t* aVertex)
	{
		uint8_t* at = aVertex;
		for (const LayoutElement& element : aLayout)
		{
			const int64_t index = aKey[KeySlot(element.myFill)];
			switch (element.myFill)
			{
			case Fill::Weights:
			case Fill::Bones: {
				uint8_t weights[4] = {0, 0, 0, 0};
				uint8_t bones[4] = {0, 0, 0, 0};
				if (aSkin != nullptr)
				{
					SkinWords(*aSkin, index, weights, bones);
				}
				std::memcpy(at, element.myFill == Fill::Weights ? weights : bones, 4);
				break;
			}
			case Fill::Color: {
				float color[4] = {0.0f, 0.0f, 0.0f, 1.0f};
				ReadElement(element.mySource, index, color, 4);
				std::memcpy(at, color, sizeof(color));
				break;
			}
			case Fill::TexCoord: {
				// The document's v runs up from the image's bottom row, the engine's down
				// from its top row.
				float uv[2] = {0.0f, 0.0f};
				ReadElement(element.mySource, index, uv, 2);
				uv[1] = 1.0f - uv[1];
				std::memcpy(at, uv, sizeof(uv));
				break;
			}
			case Fill::Position:
			case Fill::Normal:
			case Fill::Tangent:
			case Fill::TexTangent:
			case Fill::Binormal:
			case Fill::TexBinormal: {
				float xyz[3] = {0.0f, 0.0f, 0.0f};
				ReadElement(element.mySource, index, xyz, 3);
				std::memcpy(at, xyz, sizeof(xyz));
				break;
			}
			}
			at += element.mySize;
		}
	}

	// The first texture of each channel of the material that the instance binds to
	// the set's material symbol; a texture whose image has no file binds the empty
	// path (and is reported as missing when it is bound).
	void AddMaterialTextures(int aSurface, const Collada::PolygonSet& aSet,
	                         const Collada::Instance& anInstance)
	{
		const Collada::InstanceMaterial* binding = anInstance.FindMaterial(aSet.myMaterial);
		const Collada::Material* material =
		    binding != nullptr ? myDocument.FindMaterial(binding->myTarget) : nullptr;
		const Collada::Effect* effect =
		    material != nullptr ? myDocument.FindEffect(material->myEffect) : nullptr;
		if (effect == nullptr || effect->myShading == Collada::Shading::None)
		{
			return;
		}
		for (const MaterialChannel& channel : ourMaterialChannels)
		{
			const Collada::Channel& source = effect->*channel.myChannel;
			if (!source.myHasTextureFlag)
			{
				continue;
			}
			const Collada::Image* image = myDocument.FindImage(source.myImage);
			AlTextureBinding texture;
			texture.mySurface = aSurface;
			texture.myPath = image != nullptr ? image->myPath : std::string();
			texture.myVariableName = channel.myVariableName;
			texture.mySRGBFlag = channel.mySRGBFlag;
			myPendingBindings.push_back(std::move(texture));
		}
	}

	const Collada::Document& myDocument;
	std::vector<AlTextureBinding>& myBindings;
	std::vector<AlTextureBinding> myPendingBindings; // of the model being built
	std::string myError;
	int myNodeCount = 0;
	size_t myModelBytes = 0;
	size_t myModelByteLimit;
};
} // namespace

namespace ColladaImport
{
std::unique_ptr<ModelNode> Convert(const Collada::Document& aDocument,
                                   std::vector<AlTextureBinding>& someBindings, std::string& anError,
                                   size_t aModelByteLimit)
{
	Converter converter(aDocument, someBindings, aModelByteLimit);
	std::unique_ptr<ModelNode> root = converter.Run(anError);
	if (!root)
	{
		someBindings.clear();
	}
	return root;
}
} // namespace ColladaImport
} // namespace Zeph
