#pragma once
// PostProcessManager: one stage of the post chain. A stage owns its intermediate
// render targets (sized from the frame at Init) and draws from a source texture into
// a destination through the shared FullScreenHelper.
//
//   Zeph::BloomManager bloom;
//   bloom.Init(width, height, &fullScreenHelper, &computeHelper);
//   bloom.Render(destinationView, &hdrImage);
//   bloom.Resize(newWidth, newHeight);      // the view was resized
//   bloom.Destroy();
//
// The helpers belong to the caller and must outlive the stage.

#include <memory>

#include "engine/Texture.h"
#include "platform/dds/Format.h"

namespace Gpu
{
class RenderTargetView;
}

namespace Zeph
{
class ComputeHelper;
class FullScreenHelper;

class PostProcessManager
{
public:
	PostProcessManager() = default;
	virtual ~PostProcessManager() = default;
	PostProcessManager(const PostProcessManager&) = delete;
	PostProcessManager& operator=(const PostProcessManager&) = delete;

	// Keeps the size and the helpers; false, reported, for a size below 1x1 or no
	// full-screen helper. Stages call it first from their own Init.
	virtual bool Init(int aWidth, int aHeight, FullScreenHelper* aFullScreenHelper,
	                  ComputeHelper* aComputeHelper);
	virtual void Render(Gpu::RenderTargetView* aDestination, Texture* aSource) = 0;
	// Makes the targets that follow the frame's size again at the new size and keeps
	// everything else (the helpers, lookups, sample directions, eye adaptation). New
	// targets are made before the old ones go: when one cannot be made, the stage keeps
	// its old targets and size and returns false. A stage that was never made has
	// nothing to resize.
	bool Resize(int aWidth, int aHeight);
	// Releases the stage's targets; Init may run again afterwards.
	virtual void Destroy();

	int GetWidth() const { return myWidth; }
	int GetHeight() const { return myHeight; }

protected:
	// The stage's size-dependent targets made anew, swapped in only when all are made;
	// Resize has checked the size and sets it afterwards. Stages without such targets
	// keep this one.
	virtual bool ResizeTargets(int aWidth, int aHeight);

	// A render target of the size, at least 1x1 (a fraction of a tiny frame would be
	// empty); null, reported by the texture, when it cannot be made.
	static std::unique_ptr<Texture> CreateTarget(int aWidth, int aHeight, Dds::Format aFormat);

	int myWidth = 0;
	int myHeight = 0;
	FullScreenHelper* myFullScreenHelper = nullptr;
	ComputeHelper* myComputeHelper = nullptr;
};
} // namespace Zeph
