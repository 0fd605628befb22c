#pragma once
// Texture views: how a texture is seen by shaders, render targets and depth tests.
//
//   Gpu::RenderTargetView* face = cube.CreateRenderTargetView({.myFirstSlice = 2}); // +Y face, mip 0
//   Gpu::ShaderResourceView* all = cube.GetDefaultShaderResourceView();
//   cube.DestroyView(face);  // or let cube.Destroy() take every view with it
//
// A view belongs to its texture, which creates and destroys it; callers keep raw
// pointers. Each view is its own GL texture made with glTextureView, so one that
// picks a face, a mip or a different format of the same storage (an sRGB view of
// a TYPELESS texture) is an ordinary texture to GL. Each view also carries an id
// that is never reused: the framebuffer cache keys on it, so a view destroyed and
// another created in its place (GL hands out the same texture name again) can
// never find the old framebuffer.

#include <cstdint>
#include <epoxy/gl.h>
#include <string>

#include "platform/dds/Format.h"

namespace Gpu
{
class Texture;

// How a shader samples the view; Automatic follows the texture's own kind.
enum class ViewDimension
{
	Automatic,
	Texture2D,
	Texture2DArray,
	TextureCube,
	TextureCubeArray,
	Texture3D,
};

// An UNKNOWN format keeps the texture's; counts of 0 take everything from the first.
struct ShaderResourceDesc
{
	Dds::Format myFormat = Dds::Format::UNKNOWN;
	ViewDimension myDimension = ViewDimension::Automatic;
	int myFirstMip = 0;
	int myMipCount = 0;
	int myFirstSlice = 0;
	int mySliceCount = 0;
};

// One mip of one slice (array layer, cube face, or 3D depth slice); a slice count
// above 1 (0: all from the first) attaches the slices as a layered target.
struct RenderTargetDesc
{
	Dds::Format myFormat = Dds::Format::UNKNOWN;
	int myMip = 0;
	int myFirstSlice = 0;
	int mySliceCount = 1;
};

using DepthStencilDesc = RenderTargetDesc;

class View
{
public:
	View() = default;
	virtual ~View() = default;
	View(const View&) = delete;
	View& operator=(const View&) = delete;

	uint64_t GetUniqueId() const { return myUniqueId; }
	GLuint GetName() const { return myName; }
	GLenum GetTarget() const { return myTarget; }
	Dds::Format GetFormat() const { return myFormat; }
	Texture& GetTexture() const { return *myTexture; }
	// Size of the view's first mip.
	int GetWidth() const { return myWidth; }
	int GetHeight() const { return myHeight; }
	int GetSliceCount() const { return mySliceCount; }
	// The 3D slice a single-slice target draws into; -1 when the view is attached whole.
	int GetAttachmentLayer() const { return myAttachmentLayer; }
	bool IsLayered() const { return myAttachmentLayer < 0 && mySliceCount > 1; }

protected:
	friend class Texture;

	bool InitView(Texture& aTexture, GLenum aTarget, Dds::Format aFormat, int aFirstMip, int aMipCount,
	              int aFirstSlice, int aSliceCount, const char* aKind);
	virtual void Destroy();

	Texture* myTexture = nullptr;
	uint64_t myUniqueId = 0;
	GLuint myName = 0;
	GLenum myTarget = 0;
	Dds::Format myFormat = Dds::Format::UNKNOWN;
	int myWidth = 0;
	int myHeight = 0;
	int mySliceCount = 0;
	int myAttachmentLayer = -1;
};

class ShaderResourceView final : public View
{
};

class RenderTargetView final : public View
{
};

class DepthStencilView final : public View
{
};
} // namespace Gpu
