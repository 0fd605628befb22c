#pragma once
// Effect: a compiled effect (.fxal) loaded into GL: techniques of passes, each
// pass a linked program with its render states, and variables set by name.
//
//   std::vector<uint8_t> bytes = ...read "data/Shaders/Misc/Vertex_PosCol.fxal"...;
//   Fx::Effect effect;
//   if (!effect.Init(context, bytes, "Vertex_PosCol")) { ... reported ... }
//   Fx::Variable* world = effect.GetVariableByName("World");      // never null
//   Fx::Technique* render = effect.GetTechniqueByName("Render");  // never null
//   world->SetMatrix(matrix);
//   render->GetPassByIndex(0)->Apply(context);
//   context.DrawIndexed(...);
//   effect.Destroy();                                              // with the context current
//
// Init checks the whole file (a damaged one is reported, never read out of range),
// compiles every stage, links one program per pass with the vertex inputs bound to
// their locations, looks up every variable's location in every program and sets
// each sampler to its fixed texture unit. Lookups by name are for set-up; keep the
// returned pointers, which stay valid until Destroy.

#include <cstdint>
#include <memory>
#include <span>
#include <string>
#include <vector>

#include "platform/fx/EffectDesc.h"
#include "platform/fx/Technique.h"
#include "platform/fx/Variable.h"
#include "platform/gpu/SamplerState.h"

namespace Gpu
{
class Context;
}

namespace Fx
{
class Effect
{
public:
	Effect() = default;
	~Effect() = default;
	Effect(const Effect&) = delete;
	Effect& operator=(const Effect&) = delete;

	bool Init(Gpu::Context& aContext, std::span<const uint8_t> someCompiled, const std::string& aLabel);
	void Destroy();

	Technique* GetTechniqueByName(const char* aName);
	Technique* GetTechniqueByIndex(int anIndex);
	Variable* GetVariableByName(const char* aName);
	Variable* GetVariableByIndex(int anIndex);
	int GetTechniqueCount() const { return static_cast<int>(myTechniques.size()); }
	int GetVariableCount() const { return static_cast<int>(myVariables.size()); }

	const std::string& GetLabel() const { return myLabel; }
	const EffectDesc& GetDesc() const { return myDesc; }
	// The sampler state of a sampler variable; null for other variables.
	const Gpu::SamplerState* GetSamplerState(int aVariableIndex) const;

private:
	Gpu::Context* myContext = nullptr;
	std::string myLabel;
	EffectDesc myDesc;
	std::vector<Variable> myVariables;
	std::vector<std::unique_ptr<Gpu::SamplerState>> mySamplerStates; // per variable, null for non-samplers
	std::vector<std::unique_ptr<Technique>> myTechniques;
	Technique myInvalidTechnique;
	Variable myInvalidVariable;
};
} // namespace Fx
