#include "platform/fx/Pass.h"

#include "platform/fx/Effect.h"
#include "platform/fx/GlProgram.h"
#include "platform/gpu/Context.h"
#include "platform/gpu/Report.h"
#include "platform/gpu/TextureView.h"

namespace Fx
{
bool Pass::Init(Effect& anEffect, const PassDesc& aDesc, std::span<const GLuint> someStageShaders,
                const std::string& aTechniqueName)
{
	myEffect = &anEffect;
	myDesc = aDesc;
	for (const VertexInput& input : aDesc.myInputs)
	{
		myAttributes.push_back({input.mySemanticName, input.mySemanticIndex, input.myLocation});
	}
	std::string log;
	myProgram = LinkPass(someStageShaders, aDesc.myInputs, log);
	if (myProgram == 0)
	{
		const std::string mapped =
		    MapDriverLog(log, anEffect.GetDesc().myFiles, anEffect.GetDesc().myFiles[0]);
		Gpu::ReportError(__LINE__, "Fx::Effect::Init", "'%s': pass '%s' of technique '%s' does not link: %s",
		                 anEffect.GetLabel().c_str(), aDesc.myName.c_str(), aTechniqueName.c_str(),
		                 mapped.c_str());
		return false;
	}
	Gpu::LabelObject(GL_PROGRAM, myProgram, anEffect.GetLabel() + " " + aTechniqueName + "/" + aDesc.myName);
	const int variableCount = anEffect.GetVariableCount();
	myLocations.assign(static_cast<size_t>(variableCount), -1);
	myReceived.assign(static_cast<size_t>(variableCount), 0);
	for (int index = 0; index < variableCount; ++index)
	{
		const Variable& variable = *anEffect.GetVariableByIndex(index);
		const GLint location = glGetUniformLocation(myProgram, variable.GetName().c_str());
		myLocations[static_cast<size_t>(index)] = location;
		if (location >= 0 && IsSampler(variable.GetType()))
		{
			std::vector<GLint> units(static_cast<size_t>(std::max(1, variable.GetElementCount())));
			for (size_t element = 0; element < units.size(); ++element)
			{
				units[element] = variable.GetUnit() + static_cast<GLint>(element);
			}
			glProgramUniform1iv(myProgram, location, static_cast<GLsizei>(units.size()), units.data());
		}
	}
	LUMORA_GL_CHECK("Fx::Pass::Init");
	return true;
}

void Pass::Destroy(Gpu::Context& aContext)
{
	if (myProgram != 0)
	{
		aContext.GetStateCache().ForgetProgram(myProgram);
		glDeleteProgram(myProgram);
		myProgram = 0;
	}
	myLocations.clear();
	myReceived.clear();
	myAttributes.clear();
}

GLint Pass::GetLocation(int aVariableIndex) const
{
	return aVariableIndex >= 0 && aVariableIndex < static_cast<int>(myLocations.size())
	           ? myLocations[static_cast<size_t>(aVariableIndex)]
	           : -1;
}

void Pass::Upload(int aVariableIndex)
{
	const Variable& variable = *myEffect->GetVariableByIndex(aVariableIndex);
	const GLint location = myLocations[static_cast<size_t>(aVariableIndex)];
	const GLsizei count = std::max(1, variable.GetElementCount());
	const float* floats = variable.GetFloats().data();
	const GLint* ints = variable.GetInts().data();
	switch (variable.GetType())
	{
	case VariableType::Float:
		glProgramUniform1fv(myProgram, location, count, floats);
		break;
	case VariableType::Vec2:
		glProgramUniform2fv(myProgram, location, count, floats);
		break;
	case VariableType::Vec3:
		glProgramUniform3fv(myProgram, location, count, floats);
		break;
	case VariableType::Vec4:
		glProgramUniform4fv(myProgram, location, count, floats);
		break;
	case VariableType::Int:
	case VariableType::Bool:
		glProgramUniform1iv(myProgram, location, count, ints);
		break;
	case VariableType::IVec2:
		glProgramUniform2iv(myProgram, location, count, ints);
		break;
	case VariableType::IVec3:
		glProgramUniform3iv(myProgram, location, count, ints);
		break;
	case VariableType::IVec4:
		glProgramUniform4iv(myProgram, location, count, ints);
		break;
	case VariableType::UInt:
		glProgramUniform1uiv(myProgram, location, count, reinterpret_cast<const GLuint*>(ints));
		break;
	case VariableType::Mat3:
		glProgramUniformMatrix3fv(myProgram, location, count, GL_FALSE, floats);
		break;
	case VariableType::Mat4:
		glProgramUniformMatrix4fv(myProgram, location, count, GL_FALSE, floats);
		break;
	case VariableType::Sampler2D:
	case VariableType::Sampler2DArray:
	case VariableType::Sampler3D:
	case VariableType::SamplerCube:
	case VariableType::SamplerCubeArray:
	case VariableType::Sampler2DShadow:
	case VariableType::Sampler2DArrayShadow:
	case VariableType::SamplerCubeShadow:
	case VariableType::IntSampler2D:
	case VariableType::UIntSampler2D:
	case VariableType::Count:
		// Samplers keep their fixed units; their views are bound on every Apply.
		break;
	}
}

bool Pass::Apply(Gpu::Context& aContext)
{
	if (myProgram == 0)
	{
		Gpu::ReportError(__LINE__, "Fx::Pass::Apply", "Pass '%s' has no program", myDesc.myName.c_str());
		return false;
	}
	aContext.GetStateCache().UseProgram(myProgram);
	for (size_t index = 0; index < myLocations.size(); ++index)
	{
		if (myLocations[index] < 0)
		{
			continue;
		}
		const int variableIndex = static_cast<int>(index);
		const Variable& variable = *myEffect->GetVariableByIndex(variableIndex);
		if (IsSampler(variable.GetType()))
		{
			const Gpu::SamplerState* sampler = myEffect->GetSamplerState(variableIndex);
			for (int element = 0; element < std::max(1, variable.GetElementCount()); ++element)
			{
				const Gpu::ShaderResourceView* view = variable.GetResource(element);
				const int unit = variable.GetUnit() + element;
				glBindTextureUnit(static_cast<GLuint>(unit), view ? view->GetName() : 0);
				aContext.SetSampler(unit, sampler);
			}
		}
		else if (variable.GetVersion() != myReceived[index])
		{
			Upload(variableIndex);
			myReceived[index] = variable.GetVersion();
		}
	}
	if (myDesc.myStateGroups & StateGroup::Blend)
	{
		aContext.SetBlendState(myDesc.myBlend);
	}
	if (myDesc.myStateGroups & StateGroup::DepthStencil)
	{
		aContext.SetDepthStencilState(myDesc.myDepthStencil);
	}
	if (myDesc.myStateGroups & StateGroup::Rasterizer)
	{
		aContext.SetRasterizerState(myDesc.myRasterizer);
	}
	LUMORA_GL_CHECK("Fx::Pass::Apply");
	return true;
}
} // namespace Fx
