#pragma once
// GlEnums: the GL values of the layer's Direct3D-style enums. No default cases:
// a value added to an enum and not mapped here is a compiler warning, and the
// build turns warnings into errors. The return after each switch is never reached.

#include <epoxy/gl.h>

#include "platform/gpu/RenderState.h"
#include "platform/gpu/SamplerState.h"

namespace Gpu
{
constexpr GLenum ToGlComparison(Comparison aComparison)
{
	switch (aComparison)
	{
	case Comparison::Never:
		return GL_NEVER;
	case Comparison::Less:
		return GL_LESS;
	case Comparison::Equal:
		return GL_EQUAL;
	case Comparison::LessEqual:
		return GL_LEQUAL;
	case Comparison::Greater:
		return GL_GREATER;
	case Comparison::NotEqual:
		return GL_NOTEQUAL;
	case Comparison::GreaterEqual:
		return GL_GEQUAL;
	case Comparison::Always:
		return GL_ALWAYS;
	}
	return GL_ALWAYS;
}

constexpr GLenum ToGlBlend(Blend aBlend)
{
	switch (aBlend)
	{
	case Blend::Zero:
		return GL_ZERO;
	case Blend::One:
		return GL_ONE;
	case Blend::SrcColor:
		return GL_SRC_COLOR;
	case Blend::InvSrcColor:
		return GL_ONE_MINUS_SRC_COLOR;
	case Blend::SrcAlpha:
		return GL_SRC_ALPHA;
	case Blend::InvSrcAlpha:
		return GL_ONE_MINUS_SRC_ALPHA;
	case Blend::DestAlpha:
		return GL_DST_ALPHA;
	case Blend::InvDestAlpha:
		return GL_ONE_MINUS_DST_ALPHA;
	case Blend::DestColor:
		return GL_DST_COLOR;
	case Blend::InvDestColor:
		return GL_ONE_MINUS_DST_COLOR;
	case Blend::SrcAlphaSat:
		return GL_SRC_ALPHA_SATURATE;
	case Blend::BlendFactor:
		return GL_CONSTANT_COLOR;
	case Blend::InvBlendFactor:
		return GL_ONE_MINUS_CONSTANT_COLOR;
	}
	return GL_ONE;
}

constexpr GLenum ToGlBlendOp(BlendOp anOp)
{
	switch (anOp)
	{
	case BlendOp::Add:
		return GL_FUNC_ADD;
	case BlendOp::Subtract:
		return GL_FUNC_SUBTRACT;
	case BlendOp::RevSubtract:
		return GL_FUNC_REVERSE_SUBTRACT;
	case BlendOp::Min:
		return GL_MIN;
	case BlendOp::Max:
		return GL_MAX;
	}
	return GL_FUNC_ADD;
}

constexpr GLenum ToGlFillMode(FillMode aMode)
{
	switch (aMode)
	{
	case FillMode::Solid:
		return GL_FILL;
	case FillMode::Wireframe:
		return GL_LINE;
	}
	return GL_FILL;
}

constexpr GLenum ToGlAddress(TextureAddress anAddress)
{
	switch (anAddress)
	{
	case TextureAddress::Wrap:
		return GL_REPEAT;
	case TextureAddress::Clamp:
		return GL_CLAMP_TO_EDGE;
	case TextureAddress::Mirror:
		return GL_MIRRORED_REPEAT;
	case TextureAddress::Border:
		return GL_CLAMP_TO_BORDER;
	}
	return GL_REPEAT;
}

// Minification filter; the mip filter follows the texel filter, as in Direct3D's
// MIN_MAG_MIP_POINT / MIN_MAG_MIP_LINEAR / ANISOTROPIC.
constexpr GLenum ToGlMinFilter(Filter aFilter)
{
	switch (aFilter)
	{
	case Filter::Point:
		return GL_NEAREST_MIPMAP_NEAREST;
	case Filter::Linear:
	case Filter::Anisotropic:
		return GL_LINEAR_MIPMAP_LINEAR;
	}
	return GL_LINEAR_MIPMAP_LINEAR;
}

constexpr GLenum ToGlMagFilter(Filter aFilter)
{
	switch (aFilter)
	{
	case Filter::Point:
		return GL_NEAREST;
	case Filter::Linear:
	case Filter::Anisotropic:
		return GL_LINEAR;
	}
	return GL_LINEAR;
}
} // namespace Gpu
