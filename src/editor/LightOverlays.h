#pragma once
// LightOverlays: what the editor draws over the finished frame to show its lights. Every
// point and spot light gets an icon of constant size on screen (a bulb with eight rays, or
// a lamp throwing a cone of light, with a short tick along the spot's direction) in the light's
// colour, the selected one inside a ring; and a light's reach is drawn as wire: three great
// circles of a point light's falloff sphere, a spot light's outer cone out to its reach with
// a ring where it meets the sphere of that reach, and the ring of the inner cone there.
//
//   LightOverlays overlays;
//   overlays.Init();                                 // the models, once (context current)
//   const LightOverlays::View view = LightOverlays::MakeView(camera, width, height);
//   overlays.BeginFrame();                           // each frame, while it is queued:
//   overlays.QueuePointVolume(renderer, light, color);
//   overlays.QueueIcon(renderer, view, LightOverlays::POINT_ICON, position, color, false);
//   overlays.Destroy();                              // context current
//
// The shapes are made once, at unit size, as models of the overlay effect: a quad whose
// fragment shader draws the glyph, and line models. Each frame places instances of them from
// pools, one matrix each (a quad turned to the camera and scaled by its distance, a wire
// scaled by the light's reach and angles), and queues them as late items; nothing is
// uploaded per frame. Picking asks the same view which icons cover a pixel.
#include <memory>
#include <vector>

#include "core/Matrix44.h"
#include "core/Vector3.h"
#include "core/Vector4.h"

namespace Zeph
{
class CameraInstance;
class Instance;
class ModelNode;
class Renderer;
struct PointLightData;
struct SpotLightData;
} // namespace Zeph

namespace Lumora
{
class LightOverlays
{
public:
	// The icon's glyph across, in device pixels, and how far from its centre a click still
	// picks it (the glyph's rays with their outline).
	static constexpr float ourIconPixels = 24.0f;
	static constexpr float ourIconPickRadius = 13.0f;
	// A spot light's direction tick, from the light's centre.
	static constexpr float ourTickPixels = 26.0f;

	enum IconKind
	{
		POINT_ICON,
		SPOT_ICON,
	};

	// The camera and drawing size the overlays are placed for, and picked with.
	struct View
	{
		Matrix44<float> myViewProjection;
		Vector3<float> myRight;
		Vector3<float> myUp;
		Vector3<float> myForward;
		// Pixels per world unit across the view at view depth 1.
		float myPixelsAtUnitDepth = 1.0f;
		float myWidth = 1.0f;
		float myHeight = 1.0f;
	};
	static View MakeView(const Zeph::CameraInstance& aCamera, int aWidth, int aHeight);
	// The pixel at which aWorld is drawn (top-left origin, DoIntersection's convention) and its
	// view depth; false when it lies behind the camera or on its plane.
	static bool Project(const View& aView, const Vector3<float>& aWorld, float& anXOut, float& aYOut,
	                    float& aDepthOut);
	// Whether the icon of a light at aPosition covers the pixel, as drawn: only in front of
	// the near plane.
	static bool IconCovers(const View& aView, const Vector3<float>& aPosition, float anX, float aY);
	// A light's colour as its overlays show it: scaled so its largest channel is 1 (a bright
	// light's colour over 1 still reads as a hue), opaque; grey for a black light.
	static Vector4<float> DisplayColor(const Vector4<float>& aLightColor);

	LightOverlays() = default;
	~LightOverlays();
	LightOverlays(const LightOverlays&) = delete;
	LightOverlays& operator=(const LightOverlays&) = delete;

	// Makes the models; false (reported) when the overlay effect or a model cannot be made.
	bool Init();
	void Destroy();

	// Every pooled instance free for this frame's overlays.
	void BeginFrame();
	// An icon at aPosition facing the camera, aColor its fill, ringed when selected. Nothing
	// for a light behind the near plane.
	void QueueIcon(Zeph::Renderer& aRenderer, const View& aView, IconKind aKind,
	               const Vector3<float>& aPosition, const Vector4<float>& aColor, bool aSelectedFlag);
	// The tick from a spot light's centre along its direction, ourTickPixels long where it
	// lies across the view.
	void QueueSpotTick(Zeph::Renderer& aRenderer, const View& aView, const Zeph::SpotLightData& aLight,
	                   const Vector4<float>& aColor);
	// The reach of a light as wire (the light pass lights nothing beyond myFalloff).
	void QueuePointVolume(Zeph::Renderer& aRenderer, const Zeph::PointLightData& aLight,
	                      const Vector4<float>& aColor);
	void QueueSpotVolume(Zeph::Renderer& aRenderer, const Zeph::SpotLightData& aLight,
	                     const Vector4<float>& aColor);

	bool IsReady() const { return myReadyFlag; }

private:
	// One shape's model and the instances that place it, the first myUsed of them taken this frame.
	struct Shape
	{
		std::unique_ptr<Zeph::ModelNode> myModel;
		std::vector<std::unique_ptr<Zeph::Instance>> myInstances;
		size_t myUsed = 0;
	};
	enum ShapeIndex
	{
		POINT_ICON_SHAPE,
		SPOT_ICON_SHAPE,
		HALO_SHAPE,
		SPHERE_SHAPE,
		CONE_SHAPE,
		RING_SHAPE,
		TICK_SHAPE,
		SHAPE_COUNT,
	};

	// The next free instance of a shape placed by aWorld and queued with aColor.
	void Queue(Zeph::Renderer& aRenderer, ShapeIndex aShape, const Matrix44<float>& aWorld,
	           const Vector4<float>& aColor);

	Shape myShapes[SHAPE_COUNT];
	bool myReadyFlag = false;
};
} // namespace Lumora
