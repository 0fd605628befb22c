#include "platform/gpu/StateCache.h"

namespace Gpu
{
namespace
{
constexpr GLenum ToGlCullFace(CullMode aMode)
{
	switch (aMode)
	{
	case CullMode::None:
	case CullMode::Back:
		return GL_BACK;
	case CullMode::Front:
		return GL_FRONT;
	}
	return GL_BACK;
}

void ApplyCullMode(CullMode aMode)
{
	if (aMode == CullMode::None)
	{
		glDisable(GL_CULL_FACE);
		return;
	}
	glEnable(GL_CULL_FACE);
	glCullFace(ToGlCullFace(aMode));
}

void ApplyViewport(const Viewport& aViewport)
{
	glViewportIndexedf(0, aViewport.myTopLeftX, aViewport.myTopLeftY, aViewport.myWidth, aViewport.myHeight);
	glDepthRangeIndexed(0, aViewport.myMinDepth, aViewport.myMaxDepth);
}
} // namespace

void StateCache::Reset()
{
	myDrawFramebuffer = 0;
	myReadFramebuffer = 0;
	glBindFramebuffer(GL_DRAW_FRAMEBUFFER, 0);
	glBindFramebuffer(GL_READ_FRAMEBUFFER, 0);
	myViewport = Viewport{};
	ApplyViewport(myViewport);
	myCullMode = CullMode::Back;
	ApplyCullMode(myCullMode);
	myFrontCounterClockwiseFlag = false;
	glFrontFace(GL_CW);
	myColorWriteFlag = true;
	glColorMask(GL_TRUE, GL_TRUE, GL_TRUE, GL_TRUE);
	myDepthWriteFlag = true;
	glDepthMask(GL_TRUE);
	myScissorTestFlag = false;
	glDisable(GL_SCISSOR_TEST);
}

void StateCache::BindDrawFramebuffer(GLuint aFramebuffer)
{
	if (aFramebuffer != myDrawFramebuffer)
	{
		myDrawFramebuffer = aFramebuffer;
		glBindFramebuffer(GL_DRAW_FRAMEBUFFER, aFramebuffer);
	}
}

void StateCache::BindReadFramebuffer(GLuint aFramebuffer)
{
	if (aFramebuffer != myReadFramebuffer)
	{
		myReadFramebuffer = aFramebuffer;
		glBindFramebuffer(GL_READ_FRAMEBUFFER, aFramebuffer);
	}
}

void StateCache::ForgetFramebuffer(GLuint aFramebuffer)
{
	if (myDrawFramebuffer == aFramebuffer)
	{
		myDrawFramebuffer = 0;
	}
	if (myReadFramebuffer == aFramebuffer)
	{
		myReadFramebuffer = 0;
	}
}

void StateCache::SetViewport(const Viewport& aViewport)
{
	if (!(aViewport == myViewport))
	{
		myViewport = aViewport;
		ApplyViewport(aViewport);
	}
}

void StateCache::SetCullMode(CullMode aMode)
{
	if (aMode != myCullMode)
	{
		myCullMode = aMode;
		ApplyCullMode(aMode);
	}
}

void StateCache::SetFrontCounterClockwiseFlag(bool aCounterClockwiseFlag)
{
	if (aCounterClockwiseFlag != myFrontCounterClockwiseFlag)
	{
		myFrontCounterClockwiseFlag = aCounterClockwiseFlag;
		glFrontFace(aCounterClockwiseFlag ? GL_CCW : GL_CW);
	}
}

void StateCache::SetColorWriteFlag(bool anEnabledFlag)
{
	if (anEnabledFlag != myColorWriteFlag)
	{
		myColorWriteFlag = anEnabledFlag;
		const GLboolean value = anEnabledFlag ? GL_TRUE : GL_FALSE;
		glColorMask(value, value, value, value);
	}
}

void StateCache::SetDepthWriteFlag(bool anEnabledFlag)
{
	if (anEnabledFlag != myDepthWriteFlag)
	{
		myDepthWriteFlag = anEnabledFlag;
		glDepthMask(anEnabledFlag ? GL_TRUE : GL_FALSE);
	}
}

void StateCache::SetScissorTestFlag(bool anEnabledFlag)
{
	if (anEnabledFlag != myScissorTestFlag)
	{
		myScissorTestFlag = anEnabledFlag;
		if (anEnabledFlag)
		{
			glEnable(GL_SCISSOR_TEST);
		}
		else
		{
			glDisable(GL_SCISSOR_TEST);
		}
	}
}
} // namespace Gpu
