#pragma once
// Texture: GPU image storage (2D, 2D array, cube, 3D) with its mip chain and views.
//
//   Gpu::TextureDesc desc;
//   desc.myKind = Gpu::TextureKind::TextureCube;
//   desc.myWidth = desc.myHeight = 128;
//   desc.myArraySize = 6;              // faces +X, -X, +Y, -Y, +Z, -Z
//   desc.myMipLevels = 0;              // the whole chain
//   desc.myFormat = Dds::Format::R16G16B16A16_FLOAT;
//   desc.myLabel = "room cubemap";
//   Gpu::Texture cube;
//   if (!cube.Init(device.GetContext(), desc)) { ... reported already ... }
//   cube.Upload(0, 3, pixels, rowPitch);   // mip 0 of face -Y, memory row 0 at the top
//   Gpu::RenderTargetView* face = cube.CreateRenderTargetView({.myMip = 1, .myFirstSlice = 4});
//   cube.Destroy();                        // views go with it
//
// Storage is immutable (glTextureStorage*): size, format and mip count are fixed
// at Init, which is what glTextureView needs to carve views out of it. Memory
// row 0 is the top row of the image everywhere: the context runs with the
// upper-left clip origin, so uploads, render targets and readbacks agree without
// flipping. Subresources are addressed as (mip, slice) where a slice is an array
// layer or a cube face; a 3D mip is uploaded whole.

#include <cstdint>
#include <epoxy/gl.h>
#include <memory>
#include <string>
#include <vector>

#include "platform/gpu/TextureView.h"

namespace Gpu
{
class Context;

enum class TextureKind
{
	Texture2D,   // an array when myArraySize > 1
	TextureCube, // myArraySize faces, a multiple of 6 (a cube array above 6)
	Texture3D,
};

struct TextureDesc
{
	TextureKind myKind = TextureKind::Texture2D;
	int myWidth = 1;
	int myHeight = 1;
	int myDepth = 1;     // 3D only
	int myArraySize = 1; // layers of a 2D texture, faces of a cube
	int myMipLevels = 1; // 0: down to 1x1
	Dds::Format myFormat = Dds::Format::UNKNOWN;
	std::string myLabel;
};

class Texture
{
public:
	Texture() = default;
	~Texture() = default;
	Texture(const Texture&) = delete;
	Texture& operator=(const Texture&) = delete;

	// Creates the storage and, for colour formats, a default shader-resource view
	// of the whole texture. Reports and returns false on a bad description.
	bool Init(Context& aContext, const TextureDesc& aDesc);
	void Destroy();

	// Copies one subresource from memory. aRowPitch is the distance between rows
	// (rows of 4x4 blocks for compressed formats); aSlicePitch is the distance
	// between depth slices of a 3D mip (0: rows are packed).
	bool Upload(int aMip, int aSlice, const void* someData, uint32_t aRowPitch, uint32_t aSlicePitch = 0);

	ShaderResourceView* CreateShaderResourceView(const ShaderResourceDesc& aDesc = {});
	RenderTargetView* CreateRenderTargetView(const RenderTargetDesc& aDesc = {});
	DepthStencilView* CreateDepthStencilView(const DepthStencilDesc& aDesc = {});
	// Destroys a view this texture made; anything else is refused with a report.
	void DestroyView(View* aView);
	ShaderResourceView* GetDefaultShaderResourceView() const { return myDefaultView; }

	bool IsInitialized() const { return myName != 0; }
	GLuint GetName() const { return myName; }
	GLenum GetTarget() const { return myTarget; }
	const TextureDesc& GetDesc() const { return myDesc; }
	int GetMipLevels() const { return myDesc.myMipLevels; }
	int GetSliceCount() const;
	int GetMipWidth(int aMip) const;
	int GetMipHeight(int aMip) const;
	int GetMipDepth(int aMip) const;
	Context& GetContext() const { return *myContext; }
	// Whether views (and copies) of aFormat may share this storage: glTextureView reinterprets
	// only within a format's view class.
	bool CanViewAs(Dds::Format aFormat) const;

private:
	template <typename ViewType>
	ViewType* AddView(GLenum aTarget, Dds::Format aFormat, int aFirstMip, int aMipCount, int aFirstSlice,
	                  int aSliceCount, const char* aKind);

	Context* myContext = nullptr;
	TextureDesc myDesc;
	GLuint myName = 0;
	GLenum myTarget = 0;
	std::vector<std::unique_ptr<View>> myViews;
	ShaderResourceView* myDefaultView = nullptr;
};
} // namespace Gpu
