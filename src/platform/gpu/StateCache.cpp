#include "platform/gpu/StateCache.h"

#include "platform/gpu/GlEnums.h"

namespace Gpu
{
namespace
{
void SetCapability(GLenum aCapability, bool anEnabledFlag)
{
	if (anEnabledFlag)
	{
		glEnable(aCapability);
	}
	else
	{
		glDisable(aCapability);
	}
}

void ApplyCullMode(CullMode aMode)
{
	SetCapability(GL_CULL_FACE, aMode != CullMode::None);
	glCullFace(aMode == CullMode::Front ? GL_FRONT : GL_BACK);
}

void ApplyViewport(const Viewport& aViewport)
{
	glViewportIndexedf(0, aViewport.myTopLeftX, aViewport.myTopLeftY, aViewport.myWidth, aViewport.myHeight);
	glDepthRangeIndexed(0, aViewport.myMinDepth, aViewport.myMaxDepth);
}

void ApplyColorMask(uint8_t aMask)
{
	glColorMask((aMask & ColorWrite::Red) != 0, (aMask & ColorWrite::Green) != 0,
	            (aMask & ColorWrite::Blue) != 0, (aMask & ColorWrite::Alpha) != 0);
}

void ApplyBlendEquations(const BlendState& aState)
{
	glBlendFuncSeparate(ToGlBlend(aState.myColor.mySource), ToGlBlend(aState.myColor.myDestination),
	                    ToGlBlend(aState.myAlpha.mySource), ToGlBlend(aState.myAlpha.myDestination));
	glBlendEquationSeparate(ToGlBlendOp(aState.myColor.myOp), ToGlBlendOp(aState.myAlpha.myOp));
}
} // namespace

void StateCache::Reset()
{
	myDrawFramebuffer = 0;
	myReadFramebuffer = 0;
	glBindFramebuffer(GL_DRAW_FRAMEBUFFER, 0);
	glBindFramebuffer(GL_READ_FRAMEBUFFER, 0);
	myProgram = 0;
	glUseProgram(0);
	myVertexArray = 0;
	glBindVertexArray(0);
	for (int unit = 0; unit < ourSamplerUnitCount; ++unit)
	{
		mySamplers[unit] = 0;
		glBindSampler(static_cast<GLuint>(unit), 0);
	}
	myViewport = Viewport{};
	ApplyViewport(myViewport);

	myBlend = BlendState{};
	SetCapability(GL_BLEND, myBlend.myEnableFlag);
	ApplyBlendEquations(myBlend);
	ApplyColorMask(myBlend.myWriteMask);

	const DepthStencilState depth;
	myDepthTestFlag = depth.myDepthEnableFlag;
	SetCapability(GL_DEPTH_TEST, myDepthTestFlag);
	myDepthWriteFlag = depth.myDepthWriteFlag;
	glDepthMask(myDepthWriteFlag ? GL_TRUE : GL_FALSE);
	myDepthFunc = depth.myDepthFunc;
	glDepthFunc(ToGlComparison(myDepthFunc));

	const RasterizerState rasterizer;
	myFillMode = rasterizer.myFillMode;
	glPolygonMode(GL_FRONT_AND_BACK, ToGlFillMode(myFillMode));
	myCullMode = rasterizer.myCullMode;
	ApplyCullMode(myCullMode);
	myFrontCounterClockwiseFlag = rasterizer.myFrontCounterClockwiseFlag;
	glFrontFace(myFrontCounterClockwiseFlag ? GL_CCW : GL_CW);
	myDepthClampFlag = !rasterizer.myDepthClipFlag;
	SetCapability(GL_DEPTH_CLAMP, myDepthClampFlag);
	myScissorTestFlag = rasterizer.myScissorFlag;
	SetCapability(GL_SCISSOR_TEST, myScissorTestFlag);
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

void StateCache::UseProgram(GLuint aProgram)
{
	if (aProgram != myProgram)
	{
		myProgram = aProgram;
		glUseProgram(aProgram);
	}
}

void StateCache::BindVertexArray(GLuint aVertexArray)
{
	if (aVertexArray != myVertexArray)
	{
		myVertexArray = aVertexArray;
		glBindVertexArray(aVertexArray);
	}
}

void StateCache::BindSampler(int aUnit, GLuint aSampler)
{
	if (aUnit >= 0 && aUnit < ourSamplerUnitCount && mySamplers[aUnit] != aSampler)
	{
		mySamplers[aUnit] = aSampler;
		glBindSampler(static_cast<GLuint>(aUnit), aSampler);
	}
}

void StateCache::ForgetProgram(GLuint aProgram)
{
	if (myProgram == aProgram)
	{
		myProgram = 0;
	}
}

void StateCache::ForgetVertexArray(GLuint aVertexArray)
{
	if (myVertexArray == aVertexArray)
	{
		myVertexArray = 0;
	}
}

void StateCache::ForgetSampler(GLuint aSampler)
{
	for (GLuint& sampler : mySamplers)
	{
		if (sampler == aSampler)
		{
			sampler = 0;
		}
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

void StateCache::SetBlendState(const BlendState& aState)
{
	SetBlendEnableFlag(aState.myEnableFlag);
	// Factors and operations are kept while blending is off, as GL keeps them.
	if (aState.myEnableFlag && (aState.myColor != myBlend.myColor || aState.myAlpha != myBlend.myAlpha))
	{
		myBlend.myColor = aState.myColor;
		myBlend.myAlpha = aState.myAlpha;
		ApplyBlendEquations(myBlend);
	}
	SetColorWriteMask(aState.myWriteMask);
}

void StateCache::SetDepthStencilState(const DepthStencilState& aState)
{
	SetDepthTestFlag(aState.myDepthEnableFlag);
	SetDepthWriteFlag(aState.myDepthWriteFlag);
	if (aState.myDepthFunc != myDepthFunc)
	{
		myDepthFunc = aState.myDepthFunc;
		glDepthFunc(ToGlComparison(myDepthFunc));
	}
}

void StateCache::SetRasterizerState(const RasterizerState& aState)
{
	if (aState.myFillMode != myFillMode)
	{
		myFillMode = aState.myFillMode;
		glPolygonMode(GL_FRONT_AND_BACK, ToGlFillMode(myFillMode));
	}
	SetCullMode(aState.myCullMode);
	SetFrontCounterClockwiseFlag(aState.myFrontCounterClockwiseFlag);
	SetDepthClampFlag(!aState.myDepthClipFlag);
	SetScissorTestFlag(aState.myScissorFlag);
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

void StateCache::SetColorWriteMask(uint8_t aMask)
{
	if (aMask != myBlend.myWriteMask)
	{
		myBlend.myWriteMask = aMask;
		ApplyColorMask(aMask);
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
		SetCapability(GL_SCISSOR_TEST, anEnabledFlag);
	}
}

void StateCache::SetBlendEnableFlag(bool anEnabledFlag)
{
	if (anEnabledFlag != myBlend.myEnableFlag)
	{
		myBlend.myEnableFlag = anEnabledFlag;
		SetCapability(GL_BLEND, anEnabledFlag);
	}
}

void StateCache::SetDepthTestFlag(bool anEnabledFlag)
{
	if (anEnabledFlag != myDepthTestFlag)
	{
		myDepthTestFlag = anEnabledFlag;
		SetCapability(GL_DEPTH_TEST, anEnabledFlag);
	}
}

void StateCache::SetDepthClampFlag(bool anEnabledFlag)
{
	if (anEnabledFlag != myDepthClampFlag)
	{
		myDepthClampFlag = anEnabledFlag;
		SetCapability(GL_DEPTH_CLAMP, anEnabledFlag);
	}
}
} // namespace Gpu
