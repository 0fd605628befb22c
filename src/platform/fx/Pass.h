#pragma once
// Pass: one GL program of an effect with the render states its declaration sets.
//
//   Fx::Pass* pass = effect.GetTechniqueByName("Render")->GetPassByIndex(0);
//   layout.Init(context, elements, pass->GetVertexInputs(), "mesh");   // semantics to locations
//   pass->Apply(context);
//   context.DrawIndexed(count, 0, 0);
//
// Apply makes the program current, uploads the variables that changed since this
// program last received them, binds each sampler variable's view and sampler
// state on its texture unit, and sets the state groups the pass declares (only
// those, as Direct3D effects do). Owned by its Fx::Technique.

#include <cstdint>
#include <epoxy/gl.h>
#include <span>
#include <string>
#include <vector>

#include "platform/fx/EffectDesc.h"
#include "platform/gpu/InputLayout.h"

namespace Gpu
{
class Context;
}

namespace Fx
{
class Effect;

class Pass
{
public:
	Pass() = default;
	~Pass() = default;
	Pass(const Pass&) = delete;
	Pass& operator=(const Pass&) = delete;

	// Links the program from compiled stages (0 where a pass has none); reports a
	// link failure with the pass name and the driver's log.
	bool Init(Effect& anEffect, const PassDesc& aDesc, std::span<const GLuint> someStageShaders,
	          const std::string& aTechniqueName);
	void Destroy(Gpu::Context& aContext);

	const std::string& GetName() const { return myDesc.myName; }
	bool Apply(Gpu::Context& aContext);

	// The vertex-input signature: semantic name and index to attribute location.
	std::span<const Gpu::AttributeLocation> GetVertexInputs() const { return myAttributes; }
	// The same inputs with their GLSL types.
	std::span<const VertexInput> GetVertexInputTypes() const { return myDesc.myInputs; }
	const PassDesc& GetDesc() const { return myDesc; }
	GLuint GetProgram() const { return myProgram; }
	// The variable's uniform location in this program; -1 where the pass does not use it.
	GLint GetLocation(int aVariableIndex) const;

private:
	void Upload(int aVariableIndex);

	Effect* myEffect = nullptr;
	PassDesc myDesc;
	GLuint myProgram = 0;
	std::vector<Gpu::AttributeLocation> myAttributes;
	std::vector<GLint> myLocations;   // per effect variable
	std::vector<uint64_t> myReceived; // the variable versions this program holds
};
} // namespace Fx
