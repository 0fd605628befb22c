#pragma once
// VariableType: the GLSL types an effect variable or a vertex input may have.
//
//   Fx::VariableType type;
//   if (Fx::ParseVariableType("sampler2D", type) && Fx::IsSampler(type)) { ... }
//
// The numbers are stored in compiled effects (.fxal): append new types at the end.

#include <cstdint>
#include <epoxy/gl.h>
#include <string_view>

namespace Fx
{
enum class VariableType : uint8_t
{
	Float,
	Vec2,
	Vec3,
	Vec4,
	Int,
	IVec2,
	IVec3,
	IVec4,
	UInt,
	Bool,
	Mat3,
	Mat4,
	Sampler2D,
	Sampler2DArray,
	Sampler3D,
	SamplerCube,
	SamplerCubeArray,
	Sampler2DShadow,
	Sampler2DArrayShadow,
	SamplerCubeShadow,
	IntSampler2D,
	UIntSampler2D,
	Count,
};

// The GLSL spelling ("vec4", "sampler2DShadow") to the type; false for anything else.
bool ParseVariableType(std::string_view aName, VariableType& aTypeOut);
const char* GetTypeName(VariableType aType);

bool IsSampler(VariableType aType);
// Floats per element (a mat3 stores 9, a mat4 16); 0 for integer, boolean and sampler types.
int GetFloatCount(VariableType aType);
// Integers per element for int, ivecN, uint and bool; 0 otherwise.
int GetIntCount(VariableType aType);
// Types a vertex input may have: float, vecN, int, ivecN, uint.
bool IsVertexInputType(VariableType aType);
// The texture target a sampler type reads (GL_TEXTURE_2D for sampler2D); 0 for other types.
GLenum GetSamplerTarget(VariableType aType);
} // namespace Fx
