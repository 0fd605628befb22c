#pragma once
// Texture: one texture of the engine, loaded from a DDS file (shared through the
// TextureContainer) or made as a render target. It owns its GPU texture; shaders
// read it through GetShaderResourceView.
//
//   Zeph::Texture texture;
//   if (texture.Load("data/textures/brick_d.dds", true)) { effect.SetShaderResource("AlbedoTexture",
//   texture.GetShaderResourceView()); }
//
// Needs the Engine (its context current on the calling thread).

#include <memory>
#include <string>

#include "platform/dds/Format.h"
#include "platform/dds/ImageInfo.h"
#include "platform/gpu/Texture.h"

namespace Zeph
{
class Texture
{
public:
	Texture() = default;
	// A render target of one mip level; a failure is reported and leaves both views null.
	Texture(int aWidth, int aHeight, Dds::Format aFormat);
	~Texture();
	Texture(const Texture&) = delete;
	Texture& operator=(const Texture&) = delete;

	// aSRGBFlag: sample the file's 8-bit and BC formats as sRGB (decoded on sampling).
	bool Load(const std::string& aFileName, bool aSRGBFlag);

	Gpu::ShaderResourceView* GetShaderResourceView() const { return myShaderResourceView; }
	Gpu::RenderTargetView* GetRenderTargetView() const { return myRenderTargetView; }
	const Dds::ImageInfo& GetImageInfo() const { return myImageInfo; }
	const std::string& GetFileName() const { return myFileName; }
	// The GPU texture behind the views (for copies and readback).
	Gpu::Texture* GetResource() const { return myResource.get(); }

private:
	bool ConvertToSRGB();
	bool BindTextureToView(bool aSRGBFlag);
	void Release();

	Gpu::ShaderResourceView* myShaderResourceView = nullptr;
	Gpu::RenderTargetView* myRenderTargetView = nullptr;
	// The texture while it is being created; null afterwards, when myResource owns it.
	Gpu::Texture* myTexture = nullptr;
	Dds::ImageInfo myImageInfo;
	std::string myFileName = "empty";
	std::unique_ptr<Gpu::Texture> myResource;
};
} // namespace Zeph
