#pragma once
// DynamicCubemap: a cube texture that is either rendered (a capture cube: six face
// targets of mip 0, per-face views over all mips, a cube view, its own depth buffer,
// six face cameras and the face viewport) or loaded from a DDS file (only sampled).
// Faces follow Direct3D's order +X, -X, +Y, -Y, +Z, -Z with up vectors +Y, +Y, -Z,
// +Z, +Y, +Y; the face cameras have a 90-degree projection (near 0.025, far 250).
//
//   Zeph::DynamicCubemap capture(32);
//   capture.Init("");                                  // a capture cube
//   Zeph::DynamicCubemap room(256);
//   room.Init("data/Cubemaps/level/room1.dds");        // loaded from its file
//   effect->SetShaderResource("CubeMap", room.GetCubeShaderResourceView());
#include <memory>
#include <string>

#include "engine/Camera.h"
#include "engine/CameraInstance.h"
#include "platform/gpu/StateCache.h"
#include "platform/gpu/Texture.h"

namespace Zeph
{
class DynamicCubemap
{
public:
	static constexpr int ourFaceCount = 6;

	explicit DynamicCubemap(int aSize);
	~DynamicCubemap();
	DynamicCubemap(const DynamicCubemap&) = delete;
	DynamicCubemap& operator=(const DynamicCubemap&) = delete;

	// A non-empty name loads that file (and returns true: a failed load is
	// reported); an empty one makes a capture cube, false when a step fails.
	bool Init(const std::string& aName);
	bool InitCubeMap();
	bool InitDepthBuffer();
	void LoadFromFile(const std::string& aPath);
	void Destroy();

	int GetSize() const { return mySize; }
	Gpu::Texture* GetTexture() const { return myTexture.get(); }
	Gpu::ShaderResourceView* GetCubeShaderResourceView() const { return myCubeView; }
	Gpu::ShaderResourceView* GetFaceShaderResourceView(int aFace) const { return myFaceViews[aFace]; }
	Gpu::RenderTargetView* GetFaceRenderTargetView(int aFace) const { return myFaceTargets[aFace]; }
	Gpu::DepthStencilView* GetDepthStencilView() const { return myDepthView; }
	CameraInstance* GetFaceCamera(int aFace) const { return myFaceCameras[aFace].get(); }
	const Gpu::Viewport& GetViewport() const { return myViewport; }
	// Moves the six face cameras to aPosition, each looking along its face.
	void SetPosition(const Vector3<float>& aPosition);

private:
	void CreateCameras();

	int mySize = 0;
	Gpu::RenderTargetView* myFaceTargets[ourFaceCount] = {};
	Gpu::ShaderResourceView* myFaceViews[ourFaceCount] = {};
	Gpu::ShaderResourceView* myCubeView = nullptr;
	Gpu::DepthStencilView* myDepthView = nullptr;
	std::unique_ptr<Gpu::Texture> myTexture;
	std::unique_ptr<Gpu::Texture> myDepthTexture;
	std::unique_ptr<Camera> myLens;
	std::unique_ptr<CameraInstance> myFaceCameras[ourFaceCount];
	Gpu::Viewport myViewport;
};
} // namespace Zeph
