#pragma once
// Camera: the lens of a view (vertical field of view, near and far planes, aspect
// ratio). A CameraInstance places it in the world; several instances may share one
// Camera, which must outlive them.

namespace Zeph
{
class Camera
{
public:
	// The aspect ratio is the engine's resolution width over height, taken once:
	// a later change of resolution does not reach an existing camera.
	// Takes the aspect ratio from the engine's SetupInfo (its defaults when no engine exists).
	Camera();
	explicit Camera(float anAspectRatio);

	float GetFov() const { return myFov; }
	float GetNearPlane() const { return myNearPlane; }
	float GetFarPlane() const { return myFarPlane; }
	float GetAspectRatio() const { return myAspectRatio; }

	void SetLens(float aFov, float anAspectRatio, float aNearPlane, float aFarPlane);

private:
	float myFov;
	float myNearPlane;
	float myFarPlane;
	float myAspectRatio;
};
} // namespace Zeph
