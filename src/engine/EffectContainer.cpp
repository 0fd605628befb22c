#include "engine/EffectContainer.h"

#include "engine/EngineReport.h"
#include "engine/ShaderFiles.h"
#include "platform/fx/Compiler.h"

namespace Zeph
{
EffectContainer::EffectContainer()
    : mySpriteEffectFileName(ShaderFiles[EFFECT_SPRITE]), myLineEffectFileName(ShaderFiles[EFFECT_LINE])
{
}

Effect* EffectContainer::GetEffect(const std::string& aFileName)
{
	if (aFileName == mySpriteEffectFileName)
	{
		if (!mySpriteEffectCreatedFlag)
		{
			InitSpriteEffect();
		}
		return mySpriteEffect.get();
	}
	if (aFileName == myLineEffectFileName)
	{
		if (!myLineEffect)
		{
			InitLineEffect();
		}
		return myLineEffect.get();
	}
	const auto found = myEffects.find(aFileName);
	if (found != myEffects.end())
	{
		return found->second.get();
	}
	auto effect = std::make_unique<Effect>();
	if (!effect->Init(aFileName))
	{
		return nullptr;
	}
	Effect* result = effect.get();
	myEffects.emplace(aFileName, std::move(effect));
	return result;
}

void EffectContainer::InitSpriteEffect()
{
	const char* function = "Zeph::EffectContainer::InitSpriteEffect";
	Fx::CompileOutput output;
	const bool compiledFlag = Fx::CompileFromFile(mySpriteEffectFileName, output);
	if (!output.myMessages.empty())
	{
		ReportDebug(__LINE__, function, "%s", output.myMessages.c_str());
	}
	if (!compiledFlag)
	{
		if (!output.myMessages.empty())
		{
			ReportCritical(__LINE__, function, "%s", output.myMessages.c_str());
		}
		ReportCritical(__LINE__, function, "Invalid Effect File: %s", mySpriteEffectFileName.c_str());
		return;
	}
	auto effect = std::make_unique<Effect>();
	if (!effect->InitFromCompiled(output.myCompiled, mySpriteEffectFileName))
	{
		ReportCritical(__LINE__, function, "Cant Create Effect");
		return;
	}
	mySpriteEffect = std::move(effect);
	mySpriteEffectCreatedFlag = true;
}

void EffectContainer::InitLineEffect()
{
	auto effect = std::make_unique<Effect>();
	if (effect->Init(myLineEffectFileName))
	{
		myLineEffect = std::move(effect);
	}
}

void EffectContainer::Clear()
{
	myEffects.clear();
	mySpriteEffect.reset();
	myLineEffect.reset();
	mySpriteEffectCreatedFlag = false;
}
} // namespace Zeph
