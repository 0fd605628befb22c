#pragma once
// Variable: one uniform of an effect, set by the engine by name and received by
// every pass program that uses it when the pass is applied.
//
//   Fx::Variable* world = effect.GetVariableByName("World");   // keep the pointer
//   world->SetMatrix(worldMatrix.myData);   // row-major engine matrix, uploaded unchanged
//   effect.GetVariableByName("SpriteTexture")->SetResource(texture.GetDefaultShaderResourceView());
//   pass->Apply(context);                   // uploads what changed since this pass last drew
//
// The value lives in the variable (one per effect), so a value set once reaches
// every pass. A name the effect does not declare gives an invalid variable whose
// setters do nothing and return false, as a declared variable that some pass
// optimised away is valid and simply not uploaded to that pass. Setting the wrong
// kind of value or an array range past the end is reported and returns false.
// Until a variable is first set, passes keep the GLSL initializer (or zero).
//
// A matrix is stored as the engine gives it: a mat4 gets the 16 floats unchanged,
// a mat3 the upper-left 3x3 of them, so GLSL's M * v computes the engine's v * M.
// Views set with SetResource must stay alive while the effect may draw with them.

#include <cstdint>
#include <span>
#include <string>
#include <vector>

#include "platform/fx/EffectDesc.h"

namespace Gpu
{
class ShaderResourceView;
}

namespace Fx
{
class Variable
{
public:
	Variable() = default;

	void Init(const VariableDesc& aDesc);

	bool IsValid() const { return myValidFlag; }
	const std::string& GetName() const { return myDesc.myName; }
	VariableType GetType() const { return myDesc.myType; }
	int GetElementCount() const { return myDesc.myElementCount; } // 0: not an array
	// The first texture unit of a sampler; -1 for other types.
	int GetUnit() const { return myDesc.myUnit; }

	bool SetMatrix(const float* some16);
	bool SetMatrixArray(const float* someMatrices, int anOffset, int aCount);     // 16 floats per matrix
	bool SetFloatVector(const float* some4);                                      // a vecN takes the first N
	bool SetFloatVectorArray(const float* someVectors, int anOffset, int aCount); // 4 floats per element
	bool SetFloat(float aValue);
	bool SetFloatArray(const float* someValues, int anOffset, int aCount);
	bool SetInt(int aValue);                          // int, uint and bool
	bool SetIntVector(const int* some4);              // an ivecN takes the first N
	bool SetResource(Gpu::ShaderResourceView* aView); // null unbinds
	bool SetResourceArray(Gpu::ShaderResourceView* const* someViews, int anOffset, int aCount);

	// The stored value: floats (a mat4 element is 16, a mat3 element 9 in GLSL's
	// column order), integers, or one view per sampler element.
	std::span<const float> GetFloats() const { return myFloats; }
	std::span<const int32_t> GetInts() const { return myInts; }
	Gpu::ShaderResourceView* GetResource(int anElement = 0) const;
	// Counts every change; passes compare it with what they last received.
	uint64_t GetVersion() const { return myVersion; }

private:
	bool Check(const char* aFunctionName, bool aKindFlag, const char* aKind, const void* someValues,
	           int anOffset, int aCount);
	int Elements() const { return myDesc.myElementCount == 0 ? 1 : myDesc.myElementCount; }
	void StoreMatrix(int anElement, const float* some16);

	VariableDesc myDesc;
	bool myValidFlag = false;
	std::vector<float> myFloats;
	std::vector<int32_t> myInts;
	std::vector<Gpu::ShaderResourceView*> myViews;
	uint64_t myVersion = 0;
};
} // namespace Fx
