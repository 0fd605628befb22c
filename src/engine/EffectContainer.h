#pragma once
// EffectContainer: the engine's effects by file name, each loaded once from its
// compiled form (the file name + "al") on the first request. The sprite effect and
// the line effect are kept apart: the sprite effect is compiled from its source at
// run time (it never reads a compiled file), the line effect loads like the others.
//
//   Zeph::Effect* line = engine->GetEffectContainer().GetEffect(Zeph::ShaderFiles[Zeph::EFFECT_LINE]);
//
// Null when an effect cannot be made; a failed load stores nothing, so the next
// request tries again.

#include <map>
#include <memory>
#include <string>

#include "engine/Effect.h"

namespace Zeph
{
class EffectContainer
{
public:
	EffectContainer();
	~EffectContainer() = default;
	EffectContainer(const EffectContainer&) = delete;
	EffectContainer& operator=(const EffectContainer&) = delete;

	Effect* GetEffect(const std::string& aFileName);
	void Clear();

	// Calls aFunction(Effect&) for every effect loaded so far (the renderer publishes
	// the camera and the room environment to all of them).
	template <typename Function> void ForEachEffect(Function&& aFunction)
	{
		for (auto& entry : myEffects)
		{
			aFunction(*entry.second);
		}
		if (mySpriteEffect)
		{
			aFunction(*mySpriteEffect);
		}
		if (myLineEffect)
		{
			aFunction(*myLineEffect);
		}
	}

	size_t GetCount() const { return myEffects.size(); }
	bool HasSpriteEffect() const { return mySpriteEffectCreatedFlag; }

private:
	void InitSpriteEffect();
	void InitLineEffect();

	std::map<std::string, std::unique_ptr<Effect>> myEffects;
	std::unique_ptr<Effect> mySpriteEffect;
	std::string mySpriteEffectFileName;
	std::unique_ptr<Effect> myLineEffect;
	std::string myLineEffectFileName;
	bool mySpriteEffectCreatedFlag = false;
};
} // namespace Zeph
