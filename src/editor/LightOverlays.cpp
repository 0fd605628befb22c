#include "editor/LightOverlays.h"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <numbers>
#include <span>
#include <type_traits>

#include "core/Vector2.h"
#include "engine/CameraInstance.h"
#include "engine/Effect.h"
#include "engine/EffectContainer.h"
#include "engine/Engine.h"
#include "engine/EngineReport.h"
#include "engine/Instance.h"
#include "engine/ShaderFiles.h"
#include "model/Model.h"
#include "model/ModelNode.h"
#include "renderer/PointLightData.h"
#include "renderer/Renderer.h"
#include "renderer/SpotLightData.h"

namespace Lumora
{
namespace
{
// Overlay.fx's ourHalfQuadPixels: the icon quad's corners lie this many pixels from its centre.
constexpr float ourQuadHalfPixels = 18.0f;
constexpr int ourCircleSegments = 64;
// The spot cone's lines from the apex to its rim.
constexpr int ourConeLines = 4;
// The tick's arrowhead: its barbs reach back this far along the tick and this far out.
constexpr float ourBarbBack = 0.25f;
constexpr float ourBarbOut = 0.15f;

struct WireVertex
{
	Vector3<float> myPosition;
	Vector4<float> myColor;
};
struct IconVertex
{
	Vector3<float> myPosition;
	Vector2<float> myCorner;
};
static_assert(sizeof(WireVertex) == 28 && std::is_trivially_copyable_v<WireVertex>,
              "a wire vertex is three and four packed floats");
static_assert(sizeof(IconVertex) == 20 && std::is_trivially_copyable_v<IconVertex>,
              "an icon vertex is three and two packed floats");

const Gpu::InputElement ourWireLayout[] = {
    {"POSITION", 0, Dds::Format::R32G32B32_FLOAT, 0, 0},
    {"COLOR", 0, Dds::Format::R32G32B32A32_FLOAT, 0, 12},
};
const Gpu::InputElement ourIconLayout[] = {
    {"POSITION", 0, Dds::Format::R32G32B32_FLOAT, 0, 0},
    {"TEXCOORD", 0, Dds::Format::R32G32_FLOAT, 0, 12},
};

// A line list drawn white (the tint colours it).
struct Wire
{
	std::vector<WireVertex> myVertices;
	std::vector<uint32_t> myIndices;

	uint32_t Add(const Vector3<float>& aPosition)
	{
		myVertices.push_back({aPosition, Vector4<float>(1.0f, 1.0f, 1.0f, 1.0f)});
		return static_cast<uint32_t>(myVertices.size() - 1);
	}
	void Line(uint32_t aFrom, uint32_t aTo) { myIndices.insert(myIndices.end(), {aFrom, aTo}); }
	// A closed circle of radius 1 about aCentre in the plane of the unit axes anX and aY;
	// the index of its first vertex.
	uint32_t Circle(const Vector3<float>& aCentre, const Vector3<float>& anX, const Vector3<float>& aY)
	{
		const uint32_t first = static_cast<uint32_t>(myVertices.size());
		for (int segment = 0; segment < ourCircleSegments; ++segment)
		{
			const float angle = 2.0f * std::numbers::pi_v<float> * static_cast<float>(segment) /
			                    static_cast<float>(ourCircleSegments);
			Add(aCentre + anX * std::cos(angle) + aY * std::sin(angle));
			Line(first + static_cast<uint32_t>(segment),
			     first + static_cast<uint32_t>((segment + 1) % ourCircleSegments));
		}
		return first;
	}
};

const Vector3<float> ourX(1.0f, 0.0f, 0.0f);
const Vector3<float> ourY(0.0f, 1.0f, 0.0f);
const Vector3<float> ourZ(0.0f, 0.0f, 1.0f);

// Three great circles of the unit sphere.
Wire MakeSphere()
{
	Wire wire;
	const Vector3<float> centre(0.0f, 0.0f, 0.0f);
	wire.Circle(centre, ourX, ourY);
	wire.Circle(centre, ourY, ourZ);
	wire.Circle(centre, ourZ, ourX);
	return wire;
}

// The cone with its apex at the origin and its unit rim at z = 1; placed with its x and y
// axes scaled by the reach times the sine of the cone's half-angle and z by the reach
// times its cosine, the rim lies where the cone meets the sphere of the reach.
Wire MakeCone()
{
	Wire wire;
	const uint32_t apex = wire.Add(Vector3<float>(0.0f, 0.0f, 0.0f));
	const uint32_t rim = wire.Circle(ourZ, ourX, ourY);
	for (int line = 0; line < ourConeLines; ++line)
	{
		wire.Line(apex, rim + static_cast<uint32_t>(line * ourCircleSegments / ourConeLines));
	}
	return wire;
}

// The cone's rim alone, for the inner cone.
Wire MakeRing()
{
	Wire wire;
	wire.Circle(ourZ, ourX, ourY);
	return wire;
}

// A unit arrow along +z from the origin.
Wire MakeTick()
{
	Wire wire;
	const uint32_t tail = wire.Add(Vector3<float>(0.0f, 0.0f, 0.0f));
	const uint32_t tip = wire.Add(ourZ);
	wire.Line(tail, tip);
	for (const Vector3<float>& side : {ourX, ourX * -1.0f, ourY, ourY * -1.0f})
	{
		wire.Line(tip, wire.Add(ourZ * (1.0f - ourBarbBack) + side * ourBarbOut));
	}
	return wire;
}

// A model of the overlay effect drawn with aTechnique; its input layout is matched against
// that technique, so the effect's current technique is switched for the making and put back.
std::unique_ptr<Zeph::ModelNode> MakeModel(Zeph::Effect& anEffect, const char* aName, const char* aTechnique,
                                           std::span<const Gpu::InputElement> aLayout,
                                           std::span<const uint8_t> someVertices, int aVertexCount,
                                           const std::vector<uint32_t>& someIndices,
                                           Gpu::PrimitiveTopology aTopology)
{
	auto model = new Zeph::Model();
	model->SetVertexData(aVertexCount, static_cast<int>(someVertices.size()) / aVertexCount,
	                     someVertices.data(), static_cast<int>(someVertices.size()));
	model->SetIndexData(static_cast<int>(someIndices.size()), Zeph::Model::ourIndexFormatR32,
	                    someIndices.data(), static_cast<int>(someIndices.size() * sizeof(uint32_t)));
	model->SetInputLayoutDesc(aLayout);
	model->SetEffect(&anEffect);
	Zeph::Surface surface;
	surface.SetEffect(&anEffect);
	surface.SetIndexCount(static_cast<int>(someIndices.size()));
	surface.SetStartIndex(0);
	surface.SetPrimitiveTopology(aTopology);
	model->GetSurfaces().Add(surface);
	auto node = std::make_unique<Zeph::ModelNode>();
	node->SetName(aName);
	node->SetModel(model);
	anEffect.SetTechnique(aTechnique);
	const bool madeFlag = model->Init();
	anEffect.SetTechnique("Render");
	if (!madeFlag)
	{
		return nullptr;
	}
	node->SetTechniqueByName(aTechnique);
	node->SetIsShadowCasterFlag(false);
	return node;
}

std::unique_ptr<Zeph::ModelNode> MakeWireModel(Zeph::Effect& anEffect, const char* aName, const Wire& aWire)
{
	const std::span<const uint8_t> bytes(reinterpret_cast<const uint8_t*>(aWire.myVertices.data()),
	                                     aWire.myVertices.size() * sizeof(WireVertex));
	return MakeModel(anEffect, aName, "Render", ourWireLayout, bytes,
	                 static_cast<int>(aWire.myVertices.size()), aWire.myIndices,
	                 Gpu::PrimitiveTopology::LineList);
}

std::unique_ptr<Zeph::ModelNode> MakeIconModel(Zeph::Effect& anEffect, const char* aTechnique)
{
	const IconVertex corners[4] = {
	    {Vector3<float>(-1.0f, -1.0f, 0.0f), Vector2<float>(-1.0f, -1.0f)},
	    {Vector3<float>(-1.0f, 1.0f, 0.0f), Vector2<float>(-1.0f, 1.0f)},
	    {Vector3<float>(1.0f, 1.0f, 0.0f), Vector2<float>(1.0f, 1.0f)},
	    {Vector3<float>(1.0f, -1.0f, 0.0f), Vector2<float>(1.0f, -1.0f)},
	};
	return MakeModel(anEffect, aTechnique, aTechnique, ourIconLayout,
	                 std::span(reinterpret_cast<const uint8_t*>(corners), sizeof(corners)), 4,
	                 {0, 1, 2, 0, 2, 3}, Gpu::PrimitiveTopology::TriangleList);
}

// A placement whose x, y and z axes are the given rows, at aPosition.
Matrix44<float> Placement(const Vector3<float>& anX, const Vector3<float>& aY, const Vector3<float>& aZ,
                          const Vector3<float>& aPosition)
{
	Matrix44<float> world;
	world.SetRotation(aZ, aY, anX);
	world.SetPosition(aPosition);
	return world;
}

// A unit basis around a spot light's axis (its roll is free: the cone is round), or false
// when the axis is zero or not finite.
bool SpotBasis(const Zeph::SpotLightData& aLight, Vector3<float>& aRightOut, Vector3<float>& anUpOut,
               Vector3<float>& aForwardOut)
{
	const Vector3<float> axis = aLight.myOrientation.GetForward();
	const float length = axis.Length();
	if (!std::isfinite(length) || length <= 0.0f)
	{
		return false;
	}
	aForwardOut = axis * (1.0f / length);
	const Vector3<float> helper = std::abs(aForwardOut.y) > 0.999f ? ourZ : ourY;
	aRightOut = helper.Cross(aForwardOut);
	aRightOut *= 1.0f / aRightOut.Length();
	anUpOut = aForwardOut.Cross(aRightOut);
	return true;
}
} // namespace

LightOverlays::View LightOverlays::MakeView(const Zeph::CameraInstance& aCamera, int aWidth, int aHeight)
{
	View view;
	view.myViewProjection = aCamera.GetView() * aCamera.GetProjection();
	const Matrix44<float>& orientation = aCamera.GetActualOrientation();
	view.myRight = orientation.GetRight();
	view.myUp = orientation.GetUp();
	view.myForward = orientation.GetForward();
	view.myWidth = static_cast<float>(std::max(aWidth, 1));
	view.myHeight = static_cast<float>(std::max(aHeight, 1));
	view.myPixelsAtUnitDepth = aCamera.GetProjection().myMatrix[5] * 0.5f * view.myHeight;
	return view;
}

bool LightOverlays::Project(const View& aView, const Vector3<float>& aWorld, float& anXOut, float& aYOut,
                            float& aDepthOut)
{
	const Vector4<float> clip = Vector4<float>(aWorld) * aView.myViewProjection;
	if (!(clip.w > 0.0f))
	{
		return false;
	}
	anXOut = (clip.x / clip.w + 1.0f) * 0.5f * aView.myWidth;
	aYOut = (1.0f - clip.y / clip.w) * 0.5f * aView.myHeight;
	aDepthOut = clip.w;
	return true;
}

bool LightOverlays::IconCovers(const View& aView, const Vector3<float>& aPosition, float anX, float aY)
{
	const Vector4<float> clip = Vector4<float>(aPosition) * aView.myViewProjection;
	float x = 0.0f;
	float y = 0.0f;
	float depth = 0.0f;
	// Clip depth runs 0..w from the near plane: nearer icons are not drawn.
	if (!(clip.z >= 0.0f) || !Project(aView, aPosition, x, y, depth))
	{
		return false;
	}
	const float dx = x - anX;
	const float dy = y - aY;
	return dx * dx + dy * dy <= ourIconPickRadius * ourIconPickRadius;
}

Vector4<float> LightOverlays::DisplayColor(const Vector4<float>& aLightColor)
{
	const float r = std::isfinite(aLightColor.x) ? std::max(aLightColor.x, 0.0f) : 0.0f;
	const float g = std::isfinite(aLightColor.y) ? std::max(aLightColor.y, 0.0f) : 0.0f;
	const float b = std::isfinite(aLightColor.z) ? std::max(aLightColor.z, 0.0f) : 0.0f;
	const float largest = std::max({r, g, b});
	if (!(largest > 1e-6f) || !std::isfinite(largest))
	{
		return Vector4<float>(0.5f, 0.5f, 0.5f, 1.0f);
	}
	return Vector4<float>(r / largest, g / largest, b / largest, 1.0f);
}

LightOverlays::~LightOverlays()
{
	Destroy();
}

bool LightOverlays::Init()
{
	Destroy();
	Zeph::Engine* engine = Zeph::Engine::GetInstance();
	Zeph::Effect* effect =
	    engine != nullptr ? engine->GetEffectContainer().GetEffect(Zeph::ShaderFiles[Zeph::EFFECT_OVERLAY])
	                      : nullptr;
	if (effect == nullptr || effect->GetEffect() == nullptr)
	{
		Zeph::ReportError(__LINE__, "Lumora::LightOverlays::Init",
		                  "No overlay effect: light icons and wires are not drawn");
		return false;
	}
	myShapes[POINT_ICON_SHAPE].myModel = MakeIconModel(*effect, "RenderPointIcon");
	myShapes[SPOT_ICON_SHAPE].myModel = MakeIconModel(*effect, "RenderSpotIcon");
	myShapes[HALO_SHAPE].myModel = MakeIconModel(*effect, "RenderIconHalo");
	myShapes[SPHERE_SHAPE].myModel = MakeWireModel(*effect, "light-sphere-wire", MakeSphere());
	myShapes[CONE_SHAPE].myModel = MakeWireModel(*effect, "light-cone-wire", MakeCone());
	myShapes[RING_SHAPE].myModel = MakeWireModel(*effect, "light-ring-wire", MakeRing());
	myShapes[TICK_SHAPE].myModel = MakeWireModel(*effect, "light-tick-wire", MakeTick());
	for (const Shape& shape : myShapes)
	{
		if (!shape.myModel)
		{
			Zeph::ReportError(__LINE__, "Lumora::LightOverlays::Init",
			                  "Cannot make the overlay models: light icons and wires are not drawn");
			Destroy();
			return false;
		}
	}
	myReadyFlag = true;
	return true;
}

void LightOverlays::Destroy()
{
	for (Shape& shape : myShapes)
	{
		// The instances refer to the model: they go first.
		shape.myInstances.clear();
		shape.myModel.reset();
		shape.myUsed = 0;
	}
	myReadyFlag = false;
}

void LightOverlays::BeginFrame()
{
	for (Shape& shape : myShapes)
	{
		shape.myUsed = 0;
	}
}

void LightOverlays::Queue(Zeph::Renderer& aRenderer, ShapeIndex aShape, const Matrix44<float>& aWorld,
                          const Vector4<float>& aColor)
{
	Shape& shape = myShapes[aShape];
	if (!myReadyFlag)
	{
		return;
	}
	// Each queued overlay needs an instance of its own: the late list draws an instance at
	// the matrix it holds when the frame reaches it.
	if (shape.myUsed == shape.myInstances.size())
	{
		shape.myInstances.push_back(std::make_unique<Zeph::Instance>(shape.myModel.get()));
	}
	Zeph::Instance& instance = *shape.myInstances[shape.myUsed++];
	instance.SetOrientation(aWorld);
	aRenderer.RenderLateInstance(&instance, aColor);
}

void LightOverlays::QueueIcon(Zeph::Renderer& aRenderer, const View& aView, IconKind aKind,
                              const Vector3<float>& aPosition, const Vector4<float>& aColor,
                              bool aSelectedFlag)
{
	const Vector4<float> clip = Vector4<float>(aPosition) * aView.myViewProjection;
	if (!(clip.z >= 0.0f) || !(clip.w > 0.0f))
	{
		return;
	}
	// The quad's half-size in the world at the light's depth, so it covers the same pixels
	// wherever the light is.
	const float half = ourQuadHalfPixels * clip.w / aView.myPixelsAtUnitDepth;
	const Matrix44<float> world =
	    Placement(aView.myRight * half, aView.myUp * half, aView.myForward * half, aPosition);
	if (aSelectedFlag)
	{
		Queue(aRenderer, HALO_SHAPE, world, Vector4<float>(1.0f, 0.85f, 0.3f, 1.0f));
	}
	Queue(aRenderer, aKind == SPOT_ICON ? SPOT_ICON_SHAPE : POINT_ICON_SHAPE, world, aColor);
}

void LightOverlays::QueueSpotTick(Zeph::Renderer& aRenderer, const View& aView,
                                  const Zeph::SpotLightData& aLight, const Vector4<float>& aColor)
{
	Vector3<float> right;
	Vector3<float> up;
	Vector3<float> forward;
	const Vector3<float> position = aLight.myOrientation.GetPosition();
	const Vector4<float> clip = Vector4<float>(position) * aView.myViewProjection;
	if (!(clip.z >= 0.0f) || !(clip.w > 0.0f) || !SpotBasis(aLight, right, up, forward))
	{
		return;
	}
	const float length = ourTickPixels * clip.w / aView.myPixelsAtUnitDepth;
	Queue(aRenderer, TICK_SHAPE, Placement(right * length, up * length, forward * length, position), aColor);
}

void LightOverlays::QueuePointVolume(Zeph::Renderer& aRenderer, const Zeph::PointLightData& aLight,
                                     const Vector4<float>& aColor)
{
	const float reach = aLight.myFalloff;
	if (!(reach > 0.0f) || !std::isfinite(reach))
	{
		return;
	}
	Queue(aRenderer, SPHERE_SHAPE, Placement(ourX * reach, ourY * reach, ourZ * reach, aLight.myPosition),
	      aColor);
}

void LightOverlays::QueueSpotVolume(Zeph::Renderer& aRenderer, const Zeph::SpotLightData& aLight,
                                    const Vector4<float>& aColor)
{
	Vector3<float> right;
	Vector3<float> up;
	Vector3<float> forward;
	const float reach = aLight.myFalloff;
	if (!(reach > 0.0f) || !std::isfinite(reach) || !SpotBasis(aLight, right, up, forward))
	{
		return;
	}
	const Vector3<float> apex = aLight.myOrientation.GetPosition();
	// The light pass ends the cone at the sphere of the reach around the apex (its
	// attenuation reaches zero there): the rim of a cone of cosine c lies reach * c along the
	// axis, reach * sqrt(1 - c^2) out from it.
	const auto place = [&](float aCosine) {
		const float cosine = std::clamp(aCosine, -1.0f, 1.0f);
		const float across = reach * std::sqrt(1.0f - cosine * cosine);
		return Placement(right * across, up * across, forward * (reach * cosine), apex);
	};
	Queue(aRenderer, CONE_SHAPE, place(aLight.myAngles.y), aColor);
	if (aLight.myAngles.x > aLight.myAngles.y)
	{
		Queue(aRenderer, RING_SHAPE, place(aLight.myAngles.x),
		      Vector4<float>(aColor.x, aColor.y, aColor.z, aColor.w * 0.6f));
	}
}
} // namespace Lumora
