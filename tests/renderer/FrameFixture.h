#pragma once
// The fixture of the frame tests: a headless engine at 160 x 90 with a chosen shadow
// quality, a camera, a scene of instances, lights, decals and late instances that is
// queued again for every frame, and the last frame's back buffer and lit image.
// Frames are saved under /tmp/lumora-frame-tests/ to be looked at.
#include <algorithm>
#include <cmath>
#include <cstdint>
#include <gtest/gtest.h>
#include <memory>
#include <string>
#include <vector>

#include "engine/Camera.h"
#include "engine/CameraInstance.h"
#include "engine/Instance.h"
#include "engine/Texture.h"
#include "engine/ViewFixture.h"
#include "model/ModelFactory.h"
#include "platform/gpu/Readback.h"
#include "renderer/AmbientVolumeFile.h"
#include "renderer/FrameCapture.h"
#include "renderer/Renderer.h"
#include "support/Golden.h"
#include "support/TestSupport.h"

namespace FrameTesting
{
constexpr int ourWidth = 160;
constexpr int ourHeight = 90;

class FrameTest : public ViewTest
{
protected:
	// The engine with the given shadow quality (1: a 1024 shadow map keeps tests quick).
	bool Start(int aShadowQuality = 1)
	{
		if (!CreateEngine(ourWidth, ourHeight))
		{
			return false;
		}
		Zeph::Engine::GetInstance()->GetSetupInfo().myShadowQuality = aShadowQuality;
		EXPECT_TRUE(Renderer().Init(ourWidth, ourHeight)) << TakeLog();
		MakeCamera();
		return true;
	}

	static Zeph::Renderer& Renderer() { return Zeph::Engine::GetInstance()->GetRenderer(); }

	// The volume a bake wrote; empty blocks and counts of 0 when it cannot be read.
	static Zeph::AmbientVolume ReadVolume(const std::string& aPath)
	{
		Zeph::AmbientVolume volume;
		std::string problem;
		EXPECT_EQ(Zeph::ReadAmbientVolume(aPath, volume, problem), Zeph::AmbientVolumeRead::OK) << problem;
		return volume;
	}

	void Place(const char* aModel, const Vector3<float>& aPosition)
	{
		Zeph::ModelNode* model = Zeph::Engine::GetInstance()->GetModelFactory().GetModel(aModel);
		ASSERT_NE(model, nullptr) << aModel << "\n" << TakeLog();
		myInstances.push_back(std::make_unique<Zeph::Instance>(model));
		myInstances.back()->SetPosition(aPosition);
	}

	void Look(const Vector3<float>& anEye, const Vector3<float>& aTarget,
	          const Vector3<float>& anUp = Vector3<float>(0.0f, 1.0f, 0.0f))
	{
		Vector3<float> direction = aTarget - anEye;
		myCamera->LookTo(anEye, direction.Normalize(), anUp);
	}

	// Queues the camera, the scene, the lights and the decals for one frame.
	void Queue()
	{
		Zeph::FrameCapture::SetCamera(*myCamera);
		for (const std::unique_ptr<Zeph::Instance>& instance : myInstances)
		{
			instance->Render();
		}
		Zeph::RenderTargetCollector& collector = Renderer().GetRTC();
		for (const Zeph::PointLightData& light : myPointLights)
		{
			collector.AddPointLight(light);
		}
		for (const Zeph::SpotLightData& light : mySpotLights)
		{
			collector.AddSpotLight(light);
		}
		for (const Zeph::DecalData& decal : myDecals)
		{
			collector.AddDecal(decal);
		}
		for (Zeph::Instance* gizmo : myLateInstances)
		{
			Renderer().RenderLateInstance(gizmo);
		}
	}

	// Renders aFrames frames of the scene (the eye adaptation settles over a few);
	// keeps the last back buffer and lit image.
	void Render(const std::string& aName, int aFrames = 1)
	{
		int width = 0;
		int height = 0;
		ASSERT_TRUE(Zeph::FrameCapture::RenderAndRead([this] { Queue(); }, aFrames, myPixels, width, height));
		ASSERT_EQ(width, ourWidth);
		Gpu::SavePng("/tmp/lumora-frame-tests/" + aName + ".png", ourWidth, ourHeight,
		             TestSupport::Opaque(myPixels).data());
		Zeph::Texture* lit = Renderer().GetLitImage();
		ASSERT_NE(lit, nullptr);
		myLit.clear();
		ASSERT_TRUE(Gpu::ReadRenderTarget(Zeph::Engine::GetInstance()->GetContext(),
		                                  *lit->GetRenderTargetView(), myLit));
	}

	void ExpectGolden(const std::string& aName)
	{
		const std::string difference =
		    TestSupport::CompareWithGolden(aName, ourWidth, ourHeight, TestSupport::Opaque(myPixels));
		EXPECT_TRUE(difference.empty()) << difference;
	}

	// Luminance of the lit image at a world point.
	static float Luminance(const std::vector<float>& someLit, Pixel aPixel)
	{
		EXPECT_TRUE(aPixel.myX >= 0 && aPixel.myY >= 0 && aPixel.myX < ourWidth && aPixel.myY < ourHeight)
		    << "a measured point is off screen: " << aPixel.myX << ", " << aPixel.myY;
		aPixel.myX = std::clamp(aPixel.myX, 0, ourWidth - 1);
		aPixel.myY = std::clamp(aPixel.myY, 0, ourHeight - 1);
		const float* rgba = &someLit[static_cast<size_t>((aPixel.myY * ourWidth + aPixel.myX) * 4)];
		return 0.2126f * rgba[0] + 0.7152f * rgba[1] + 0.0722f * rgba[2];
	}

	std::vector<std::unique_ptr<Zeph::Instance>> myInstances;
	std::vector<Zeph::Instance*> myLateInstances;
	std::vector<Zeph::PointLightData> myPointLights;
	std::vector<Zeph::SpotLightData> mySpotLights;
	std::vector<Zeph::DecalData> myDecals;
	std::vector<uint8_t> myPixels;
	std::vector<float> myLit;
};

inline Zeph::SpotLightData SpotDown(const Vector3<float>& aPosition, float aFalloff, float anInner,
                                    float anOuter)
{
	Zeph::SpotLightData spot;
	spot.myFalloff = aFalloff;
	spot.myAngles = Vector2<float>(anInner, anOuter);
	spot.myColor = Vector4<float>(4.0f, 3.6f, 3.0f, 1.0f);
	// Rows right (1, 0, 0), up (0, 0, 1), forward (0, -1, 0): the cone points down.
	const float rows[12] = {1.0f, 0.0f, 0.0f, 0.0f, 0.0f, 0.0f, 1.0f, 0.0f, 0.0f, -1.0f, 0.0f, 0.0f};
	std::copy(rows, rows + 12, spot.myOrientation.myMatrix);
	spot.myOrientation.SetPosition(aPosition);
	return spot;
}
} // namespace FrameTesting
