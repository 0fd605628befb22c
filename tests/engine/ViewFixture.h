#pragma once
// ViewTest: the engine fixture with a 160 x 90 engine and a camera at (0, 0, 5) looking
// along +z (its start pose), handed to the frame capture; and the pixel a world point
// lands on, for tests that read rendered frames.
#include <cmath>
#include <memory>

#include "core/Vector3.h"
#include "core/Vector4.h"
#include "engine/Camera.h"
#include "engine/CameraInstance.h"
#include "engine/EngineFixture.h"
#include "renderer/FrameCapture.h"

class ViewTest : public EngineTest
{
protected:
	static constexpr int ourWidth = 160;
	static constexpr int ourHeight = 90;

	struct Pixel
	{
		int myX;
		int myY;
	};

	// The engine and the camera; false (the test skipped) without a GL context.
	bool Start()
	{
		if (!CreateEngine(ourWidth, ourHeight))
		{
			return false;
		}
		MakeCamera();
		Zeph::FrameCapture::SetCamera(*myCamera);
		return true;
	}

	void MakeCamera()
	{
		myLens = std::make_unique<Zeph::Camera>(static_cast<float>(ourWidth) / ourHeight);
		myCamera = std::make_unique<Zeph::CameraInstance>(myLens.get());
	}

	Pixel Project(const Vector3<float>& aPoint) const
	{
		Vector4<float> clip(aPoint.x, aPoint.y, aPoint.z, 1.0f);
		clip = clip * (myCamera->GetView() * myCamera->GetProjection());
		const float x = (clip.x / clip.w * 0.5f + 0.5f) * ourWidth;
		const float y = (0.5f - clip.y / clip.w * 0.5f) * ourHeight;
		return {static_cast<int>(std::floor(x)), static_cast<int>(std::floor(y))};
	}

	std::unique_ptr<Zeph::Camera> myLens;
	std::unique_ptr<Zeph::CameraInstance> myCamera;
};
