#pragma once
// Technique: the ordered passes of one way to draw with an effect.
//
//   Fx::Technique* technique = effect.GetTechniqueByName("RenderWireFrame");
//   for (int index = 0; index < technique->GetPassCount(); ++index)
//   {
//       technique->GetPassByIndex(index)->Apply(context);
//       context.DrawIndexed(count, 0, 0);
//   }
//
// A technique the effect does not have is invalid and has no passes. Owned by its
// Fx::Effect.

#include <memory>
#include <string>
#include <vector>

#include "platform/fx/Pass.h"

namespace Fx
{
class Technique
{
public:
	Technique() = default;
	~Technique() = default;
	Technique(const Technique&) = delete;
	Technique& operator=(const Technique&) = delete;

	void Init(const std::string& aName)
	{
		myName = aName;
		myValidFlag = true;
	}
	Pass& AddPass() { return *myPasses.emplace_back(std::make_unique<Pass>()); }
	void Destroy(Gpu::Context& aContext);

	bool IsValid() const { return myValidFlag; }
	const std::string& GetName() const { return myName; }
	int GetPassCount() const { return static_cast<int>(myPasses.size()); }
	Pass* GetPassByIndex(int anIndex); // null when absent
	Pass* GetPassByName(const char* aName);

private:
	std::string myName;
	bool myValidFlag = false;
	std::vector<std::unique_ptr<Pass>> myPasses;
};
} // namespace Fx
