#pragma once
// SamplerState: how shaders filter and address a texture, described as Direct3D 11
// describes a sampler, realised as a GL sampler object bound to a texture unit.
//
//   Gpu::SamplerState shadow;
//   shadow.Init(context, {.myFilter = Gpu::Filter::Linear, .myAddressU = Gpu::TextureAddress::Border,
//                         .myComparisonFlag = true, .myComparison = Gpu::Comparison::LessEqual},
//               "shadow map");
//   context.SetSampler(3, &shadow);
//   shadow.Destroy();

#include <epoxy/gl.h>
#include <string>

#include "platform/gpu/RenderState.h"

namespace Gpu
{
class Context;

enum class Filter
{
	Point,
	Linear,
	Anisotropic,
};

enum class TextureAddress
{
	Wrap,
	Clamp,
	Mirror,
	Border,
};

// Direct3D's defaults, except that those clamp; engine samplers mostly wrap, so
// every field is spelled out by the caller anyway.
struct SamplerDesc
{
	Filter myFilter = Filter::Linear;
	TextureAddress myAddressU = TextureAddress::Clamp;
	TextureAddress myAddressV = TextureAddress::Clamp;
	TextureAddress myAddressW = TextureAddress::Clamp;
	float myMipLodBias = 0.0f;
	float myMaxAnisotropy = 1.0f;  // 1..16, used by Filter::Anisotropic
	bool myComparisonFlag = false; // depth comparison (shadow samplers)
	Comparison myComparison = Comparison::Never;
	float myBorderColor[4] = {0.0f, 0.0f, 0.0f, 0.0f};
	float myMinLod = -1000.0f;
	float myMaxLod = 1000.0f;
};

class SamplerState
{
public:
	SamplerState() = default;
	~SamplerState() = default;
	SamplerState(const SamplerState&) = delete;
	SamplerState& operator=(const SamplerState&) = delete;

	// Reports and returns false on a bad description (anisotropy outside 1..16, min LOD above max).
	bool Init(Context& aContext, const SamplerDesc& aDesc, const std::string& aLabel);
	void Destroy();

	GLuint GetName() const { return myName; }
	const SamplerDesc& GetDesc() const { return myDesc; }

private:
	Context* myContext = nullptr;
	SamplerDesc myDesc;
	GLuint myName = 0;
};
} // namespace Gpu
