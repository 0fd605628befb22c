#pragma once
// CameraInstance: a placed camera over a Camera lens, with the matrices the renderer
// needs (projection, view, the camera-to-world orientation, last frame's view and
// the far-plane corners in view space).
//
// The world's up is +Y, handedness is left-handed and the camera never rolls: every
// yaw or pitch rebuilds it from its forward direction and the world up.
//
//   Zeph::Camera lens(16.0f / 9.0f);
//   Zeph::CameraInstance camera(&lens);       // at (0, 0, 5) looking along +z
//   camera.Move(2.0f);                        // forward
//   camera.Yaw(0.1f);                         // radians, about the camera's up
//   camera.Pitch(-0.2f);                      // refused whole near straight up/down

#include "core/Matrix44.h"
#include "core/Vector3.h"

namespace Zeph
{
class Camera;

class CameraInstance
{
public:
	explicit CameraInstance(Camera* aCamera);

	void SetPosition(const Vector3<float>& aPosition);
	const Vector3<float>& GetPosition() const { return myPosition; }
	// Up from row 1, forward from row 2 and position from row 3 of the argument.
	void SetOrientation(const Matrix44<float>& anOrientation);
	const Matrix44<float>& GetActualOrientation() const { return myOrientation; }
	const Matrix44<float>& GetProjection() const { return myProjection; }
	float GetFarPlane() const;
	const Matrix44<float>& GetView() const { return myView; }
	const Matrix44<float>& GetPreviousView() const { return myPreviousView; }
	const Vector3<float>& GetForward() const { return myForward; }
	const Vector3<float>& GetUp() const { return myUp; }
	// The four far-plane corners in view space, in the order the renderer's
	// full-screen passes expect them.
	const Vector3<float>* GetFarCorners() const { return myFarCorners; }

	void StorePreviousView() { myPreviousView = myView; }

	void Move(float aDistance);
	void Strafe(float aDistance);
	void Yaw(float anAngle);
	void Pitch(float anAngle);

	void SetProjection(float aFov, float anAspectRatio, float aNearPlane, float aFarPlane);
	// Points the camera; the reflection bake uses it for cube-map faces.
	void LookTo(const Vector3<float>& aPosition, const Vector3<float>& aDirection,
	            const Vector3<float>& anUp);

private:
	void BuildProjection();
	void UpdateMatrices();
	// myOrientation with its 3x3 block turned by aRotation (on the left, so about
	// the camera's own axes); used by Yaw and Pitch.
	Matrix44<float> TurnedOrientation(const Matrix44<float>& aRotation) const;

	Camera* myCamera;
	Vector3<float> myPosition;
	Vector3<float> myForward;
	Vector3<float> myUp;
	Matrix44<float> myProjection;
	Matrix44<float> myOrientation;
	Matrix44<float> myPreviousView;
	Matrix44<float> myView;
	Vector3<float> myFarCorners[4];
};
} // namespace Zeph
