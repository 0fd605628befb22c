#include "platform/fx/Effect.h"

#include <cstring>

#include "platform/fx/CompiledFormat.h"
#include "platform/fx/GlProgram.h"
#include "platform/gpu/Report.h"

namespace Fx
{
bool Effect::Init(Gpu::Context& aContext, std::span<const uint8_t> someCompiled, const std::string& aLabel)
{
	Destroy();
	myContext = &aContext;
	myLabel = aLabel;
	std::string error;
	if (!ReadCompiled(someCompiled, myDesc, error))
	{
		Gpu::ReportError(__LINE__, "Fx::Effect::Init", "'%s' is not a usable compiled effect: %s",
		                 aLabel.c_str(), error.c_str());
		return false;
	}
	myVariables.resize(myDesc.myVariables.size());
	for (size_t index = 0; index < myVariables.size(); ++index)
	{
		const VariableDesc& desc = myDesc.myVariables[index];
		myVariables[index].Init(desc);
		std::unique_ptr<Gpu::SamplerState>& sampler = mySamplerStates.emplace_back();
		if (IsSampler(desc.myType))
		{
			sampler = std::make_unique<Gpu::SamplerState>();
			if (!sampler->Init(aContext, desc.mySampler, aLabel + " " + desc.myName))
			{
				Destroy();
				return false;
			}
		}
	}

	const DebugOutputPause pause;
	std::vector<GLuint> shaders;
	bool okFlag = true;
	for (const StageDesc& stage : myDesc.myStages)
	{
		std::string log;
		shaders.push_back(CompileStage(stage.myKind, stage.mySource, log));
		if (shaders.back() == 0)
		{
			Gpu::ReportError(__LINE__, "Fx::Effect::Init", "'%s': stage '%s' does not compile: %s",
			                 aLabel.c_str(), stage.myName.c_str(),
			                 MapDriverLog(log, myDesc.myFiles, myDesc.myFiles[0]).c_str());
			okFlag = false;
		}
	}
	for (size_t index = 0; index < myDesc.myTechniques.size() && okFlag; ++index)
	{
		const TechniqueDesc& desc = myDesc.myTechniques[index];
		Technique& technique = *myTechniques.emplace_back(std::make_unique<Technique>());
		technique.Init(desc.myName);
		for (const PassDesc& passDesc : desc.myPasses)
		{
			const GLuint stages[3] = {
			    shaders[static_cast<size_t>(passDesc.myVertexStage)],
			    passDesc.myGeometryStage >= 0 ? shaders[static_cast<size_t>(passDesc.myGeometryStage)] : 0,
			    shaders[static_cast<size_t>(passDesc.myFragmentStage)]};
			if (!technique.AddPass().Init(*this, passDesc, stages, desc.myName))
			{
				okFlag = false;
				break;
			}
		}
	}
	for (const GLuint shader : shaders)
	{
		glDeleteShader(shader);
	}
	if (!okFlag)
	{
		Destroy();
		return false;
	}
	return true;
}

void Effect::Destroy()
{
	if (myContext != nullptr)
	{
		for (std::unique_ptr<Technique>& technique : myTechniques)
		{
			technique->Destroy(*myContext);
		}
		for (std::unique_ptr<Gpu::SamplerState>& sampler : mySamplerStates)
		{
			if (sampler)
			{
				sampler->Destroy();
			}
		}
	}
	myTechniques.clear();
	mySamplerStates.clear();
	myVariables.clear();
	myDesc = EffectDesc{};
	myContext = nullptr;
}

Technique* Effect::GetTechniqueByName(const char* aName)
{
	for (std::unique_ptr<Technique>& technique : myTechniques)
	{
		if (aName && technique->GetName() == aName)
		{
			return technique.get();
		}
	}
	return &myInvalidTechnique;
}

Technique* Effect::GetTechniqueByIndex(int anIndex)
{
	return anIndex >= 0 && anIndex < GetTechniqueCount() ? myTechniques[static_cast<size_t>(anIndex)].get()
	                                                     : &myInvalidTechnique;
}

Variable* Effect::GetVariableByName(const char* aName)
{
	for (Variable& variable : myVariables)
	{
		if (aName && variable.GetName() == aName)
		{
			return &variable;
		}
	}
	return &myInvalidVariable;
}

Variable* Effect::GetVariableByIndex(int anIndex)
{
	return anIndex >= 0 && anIndex < GetVariableCount() ? &myVariables[static_cast<size_t>(anIndex)]
	                                                    : &myInvalidVariable;
}

const Gpu::SamplerState* Effect::GetSamplerState(int aVariableIndex) const
{
	return aVariableIndex >= 0 && aVariableIndex < static_cast<int>(mySamplerStates.size())
	           ? mySamplerStates[static_cast<size_t>(aVariableIndex)].get()
	           : nullptr;
}
} // namespace Fx
