#include "platform/gpu/FramebufferCache.h"

#include <algorithm>
#include <string>

#include "platform/gpu/Formats.h"
#include "platform/gpu/Report.h"
#include "platform/gpu/StateCache.h"
#include "platform/gpu/TextureView.h"

namespace Gpu
{
namespace
{
void Attach(GLuint aFramebuffer, GLenum anAttachment, const View& aView)
{
	if (aView.GetAttachmentLayer() >= 0)
	{
		glNamedFramebufferTextureLayer(aFramebuffer, anAttachment, aView.GetName(), 0,
		                               aView.GetAttachmentLayer());
	}
	else
	{
		// A view of several slices attaches layered: a geometry shader picks the layer.
		glNamedFramebufferTexture(aFramebuffer, anAttachment, aView.GetName(), 0);
	}
}
} // namespace

void FramebufferCache::Destroy()
{
	for (const Entry& entry : myEntries)
	{
		Delete(entry.myFramebuffer);
	}
	myEntries.clear();
}

const FramebufferCache::Entry* FramebufferCache::FindEntry(GLuint aFramebuffer) const
{
	if (aFramebuffer == 0)
	{
		return nullptr;
	}
	const auto found = std::find_if(myEntries.begin(), myEntries.end(), [aFramebuffer](const Entry& anEntry) {
		return anEntry.myFramebuffer == aFramebuffer;
	});
	return found != myEntries.end() ? &*found : nullptr;
}

int FramebufferCache::FindColorSlot(GLuint aFramebuffer, uint64_t aViewId) const
{
	if (const Entry* entry = FindEntry(aFramebuffer); entry != nullptr && aViewId != 0)
	{
		for (int slot = 0; slot < ourMaxColorTargets; ++slot)
		{
			if (entry->myKey.myColorIds[static_cast<size_t>(slot)] == aViewId)
			{
				return slot;
			}
		}
	}
	return -1;
}

bool FramebufferCache::HasDepthView(GLuint aFramebuffer, uint64_t aViewId) const
{
	const Entry* entry = FindEntry(aFramebuffer);
	return entry != nullptr && aViewId != 0 && entry->myKey.myDepthId == aViewId;
}

GLuint FramebufferCache::Get(std::span<RenderTargetView* const> someColorViews,
                             const DepthStencilView* aDepthView)
{
	if (someColorViews.size() > ourMaxColorTargets)
	{
		ReportError(__LINE__, "Gpu::FramebufferCache::Get", "%zu render targets bound, at most %d",
		            someColorViews.size(), ourMaxColorTargets);
		return 0;
	}
	Key key;
	for (size_t slot = 0; slot < someColorViews.size(); ++slot)
	{
		key.myColorIds[slot] = someColorViews[slot] ? someColorViews[slot]->GetUniqueId() : 0;
	}
	key.myDepthId = aDepthView ? aDepthView->GetUniqueId() : 0;
	if (key == Key())
	{
		// Nothing bound (Direct3D allows it): no framebuffer, rather than an incomplete one.
		return 0;
	}
	const auto found = std::find_if(myEntries.begin(), myEntries.end(),
	                                [&key](const Entry& anEntry) { return anEntry.myKey == key; });
	if (found != myEntries.end())
	{
		return found->myFramebuffer;
	}
	const GLuint framebuffer = Create(someColorViews, aDepthView);
	if (framebuffer != 0)
	{
		myEntries.push_back({key, framebuffer});
	}
	return framebuffer;
}

GLuint FramebufferCache::Create(std::span<RenderTargetView* const> someColorViews,
                                const DepthStencilView* aDepthView)
{
	const char* function = "Gpu::FramebufferCache::Create";
	GLuint framebuffer = 0;
	glCreateFramebuffers(1, &framebuffer);
	std::array<GLenum, ourMaxColorTargets> drawBuffers{};
	std::string label = "framebuffer";
	for (size_t slot = 0; slot < someColorViews.size(); ++slot)
	{
		drawBuffers[slot] = GL_NONE;
		if (const RenderTargetView* view = someColorViews[slot])
		{
			drawBuffers[slot] = GL_COLOR_ATTACHMENT0 + static_cast<GLenum>(slot);
			Attach(framebuffer, drawBuffers[slot], *view);
			label += " " + std::to_string(view->GetUniqueId());
		}
	}
	glNamedFramebufferDrawBuffers(framebuffer, static_cast<GLsizei>(someColorViews.size()),
	                              drawBuffers.data());
	if (aDepthView)
	{
		const bool stencilFlag = GetFormatInfo(aDepthView->GetFormat()).myStencilFlag;
		Attach(framebuffer, stencilFlag ? GL_DEPTH_STENCIL_ATTACHMENT : GL_DEPTH_ATTACHMENT, *aDepthView);
		label += " depth " + std::to_string(aDepthView->GetUniqueId());
	}
	LabelObject(GL_FRAMEBUFFER, framebuffer, label);
	LUMORA_GL_CHECK(function);

	const GLenum status = glCheckNamedFramebufferStatus(framebuffer, GL_DRAW_FRAMEBUFFER);
	if (status != GL_FRAMEBUFFER_COMPLETE)
	{
		ReportError(__LINE__, function, "Incomplete framebuffer (status 0x%04x) for %s", status,
		            label.c_str());
		Delete(framebuffer);
		return 0;
	}
	return framebuffer;
}

void FramebufferCache::ForgetView(uint64_t aUniqueId)
{
	if (aUniqueId == 0)
	{
		return; // 0 marks the empty slots of every key
	}
	std::erase_if(myEntries, [this, aUniqueId](const Entry& anEntry) {
		const bool usedFlag = anEntry.myKey.myDepthId == aUniqueId ||
		                      std::find(anEntry.myKey.myColorIds.begin(), anEntry.myKey.myColorIds.end(),
		                                aUniqueId) != anEntry.myKey.myColorIds.end();
		if (usedFlag)
		{
			Delete(anEntry.myFramebuffer);
		}
		return usedFlag;
	});
}

void FramebufferCache::Delete(GLuint aFramebuffer)
{
	if (myStateCache)
	{
		myStateCache->ForgetFramebuffer(aFramebuffer);
	}
	glDeleteFramebuffers(1, &aFramebuffer);
}
} // namespace Gpu
