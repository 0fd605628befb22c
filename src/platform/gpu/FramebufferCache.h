#pragma once
// FramebufferCache: one GL framebuffer per combination of bound views.
//
//   GLuint fbo = cache.Get(someColorViews, depthView);   // made on first use, then reused
//   cache.ForgetView(view.GetUniqueId());                // the view's destruction does this
//
// Direct3D binds views; GL draws into framebuffer objects. The cache keys each
// framebuffer on the views' unique ids, never on GL texture names, because GL
// hands a deleted name out again: a key of names would return a framebuffer
// whose attachment is gone. When a view is destroyed every framebuffer that uses
// it is deleted. Owned by Gpu::Context; one per GL context (framebuffers are not
// shared between contexts).

#include <array>
#include <cstdint>
#include <epoxy/gl.h>
#include <span>
#include <vector>

namespace Gpu
{
class DepthStencilView;
class RenderTargetView;
class StateCache;

class FramebufferCache
{
public:
	static constexpr int ourMaxColorTargets = 8;

	void Init(StateCache& aStateCache) { myStateCache = &aStateCache; }
	void Destroy();

	// The framebuffer with these attachments (null entries leave a slot empty);
	// 0, reported, when the combination is not complete.
	GLuint Get(std::span<RenderTargetView* const> someColorViews, const DepthStencilView* aDepthView);
	void ForgetView(uint64_t aUniqueId);
	// The colour slot of aFramebuffer that holds the view, or -1.
	int FindColorSlot(GLuint aFramebuffer, uint64_t aViewId) const;
	// Whether aFramebuffer's depth attachment is the view.
	bool HasDepthView(GLuint aFramebuffer, uint64_t aViewId) const;
	size_t GetEntryCount() const { return myEntries.size(); }

private:
	struct Key
	{
		std::array<uint64_t, ourMaxColorTargets> myColorIds{};
		uint64_t myDepthId = 0;

		bool operator==(const Key&) const = default;
	};
	struct Entry
	{
		Key myKey;
		GLuint myFramebuffer = 0;
	};

	const Entry* FindEntry(GLuint aFramebuffer) const;
	GLuint Create(std::span<RenderTargetView* const> someColorViews, const DepthStencilView* aDepthView);
	void Delete(GLuint aFramebuffer);

	// A handful of target combinations per frame: a linear search beats hashing.
	std::vector<Entry> myEntries;
	StateCache* myStateCache = nullptr;
};
} // namespace Gpu
