#include "platform/gpu/SamplerState.h"

#include "platform/gpu/Context.h"
#include "platform/gpu/GlEnums.h"
#include "platform/gpu/Report.h"

namespace Gpu
{
bool SamplerState::Init(Context& aContext, const SamplerDesc& aDesc, const std::string& aLabel)
{
	if (myName != 0 || !(aDesc.myMaxAnisotropy >= 1.0f && aDesc.myMaxAnisotropy <= 16.0f) ||
	    !(aDesc.myMinLod <= aDesc.myMaxLod))
	{
		ReportError(__LINE__, "Gpu::SamplerState::Init", "Sampler '%s': %s (anisotropy %g, LOD %g..%g)",
		            aLabel.c_str(), myName != 0 ? "already initialized" : "bad description",
		            static_cast<double>(aDesc.myMaxAnisotropy), static_cast<double>(aDesc.myMinLod),
		            static_cast<double>(aDesc.myMaxLod));
		return false;
	}
	myContext = &aContext;
	myDesc = aDesc;
	glCreateSamplers(1, &myName);
	glSamplerParameteri(myName, GL_TEXTURE_MIN_FILTER, static_cast<GLint>(ToGlMinFilter(aDesc.myFilter)));
	glSamplerParameteri(myName, GL_TEXTURE_MAG_FILTER, static_cast<GLint>(ToGlMagFilter(aDesc.myFilter)));
	glSamplerParameteri(myName, GL_TEXTURE_WRAP_S, static_cast<GLint>(ToGlAddress(aDesc.myAddressU)));
	glSamplerParameteri(myName, GL_TEXTURE_WRAP_T, static_cast<GLint>(ToGlAddress(aDesc.myAddressV)));
	glSamplerParameteri(myName, GL_TEXTURE_WRAP_R, static_cast<GLint>(ToGlAddress(aDesc.myAddressW)));
	glSamplerParameterf(myName, GL_TEXTURE_LOD_BIAS, aDesc.myMipLodBias);
	glSamplerParameterf(myName, GL_TEXTURE_MIN_LOD, aDesc.myMinLod);
	glSamplerParameterf(myName, GL_TEXTURE_MAX_LOD, aDesc.myMaxLod);
	glSamplerParameterfv(myName, GL_TEXTURE_BORDER_COLOR, aDesc.myBorderColor);
	// Core since GL 4.6; llvmpipe's 4.5 has it through ARB/EXT_texture_filter_anisotropic.
	if (aDesc.myFilter == Filter::Anisotropic && epoxy_has_gl_extension("GL_EXT_texture_filter_anisotropic"))
	{
		glSamplerParameterf(myName, GL_TEXTURE_MAX_ANISOTROPY_EXT, aDesc.myMaxAnisotropy);
	}
	glSamplerParameteri(myName, GL_TEXTURE_COMPARE_MODE,
	                    aDesc.myComparisonFlag ? GL_COMPARE_REF_TO_TEXTURE : GL_NONE);
	glSamplerParameteri(myName, GL_TEXTURE_COMPARE_FUNC,
	                    static_cast<GLint>(ToGlComparison(aDesc.myComparison)));
	LabelObject(GL_SAMPLER, myName, aLabel);
	LUMORA_GL_CHECK("Gpu::SamplerState::Init");
	return true;
}

void SamplerState::Destroy()
{
	if (myName != 0)
	{
		myContext->GetStateCache().ForgetSampler(myName);
		glDeleteSamplers(1, &myName);
		myName = 0;
	}
}
} // namespace Gpu
