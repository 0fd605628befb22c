#include "platform/fx/VariableType.h"

namespace Fx
{
bool ParseVariableType(std::string_view aName, VariableType& aTypeOut)
{
	for (int type = 0; type < static_cast<int>(VariableType::Count); ++type)
	{
		if (aName == GetTypeName(static_cast<VariableType>(type)))
		{
			aTypeOut = static_cast<VariableType>(type);
			return true;
		}
	}
	return false;
}

const char* GetTypeName(VariableType aType)
{
	switch (aType)
	{
	case VariableType::Float:
		return "float";
	case VariableType::Vec2:
		return "vec2";
	case VariableType::Vec3:
		return "vec3";
	case VariableType::Vec4:
		return "vec4";
	case VariableType::Int:
		return "int";
	case VariableType::IVec2:
		return "ivec2";
	case VariableType::IVec3:
		return "ivec3";
	case VariableType::IVec4:
		return "ivec4";
	case VariableType::UInt:
		return "uint";
	case VariableType::Bool:
		return "bool";
	case VariableType::Mat3:
		return "mat3";
	case VariableType::Mat4:
		return "mat4";
	case VariableType::Sampler2D:
		return "sampler2D";
	case VariableType::Sampler2DArray:
		return "sampler2DArray";
	case VariableType::Sampler3D:
		return "sampler3D";
	case VariableType::SamplerCube:
		return "samplerCube";
	case VariableType::SamplerCubeArray:
		return "samplerCubeArray";
	case VariableType::Sampler2DShadow:
		return "sampler2DShadow";
	case VariableType::Sampler2DArrayShadow:
		return "sampler2DArrayShadow";
	case VariableType::SamplerCubeShadow:
		return "samplerCubeShadow";
	case VariableType::IntSampler2D:
		return "isampler2D";
	case VariableType::UIntSampler2D:
		return "usampler2D";
	case VariableType::Count:
		break;
	}
	return "?";
}

bool IsSampler(VariableType aType)
{
	return GetSamplerTarget(aType) != 0;
}

int GetFloatCount(VariableType aType)
{
	switch (aType)
	{
	case VariableType::Float:
		return 1;
	case VariableType::Vec2:
		return 2;
	case VariableType::Vec3:
		return 3;
	case VariableType::Vec4:
		return 4;
	case VariableType::Mat3:
		return 9;
	case VariableType::Mat4:
		return 16;
	default:
		return 0;
	}
}

int GetIntCount(VariableType aType)
{
	switch (aType)
	{
	case VariableType::Int:
	case VariableType::UInt:
	case VariableType::Bool:
		return 1;
	case VariableType::IVec2:
		return 2;
	case VariableType::IVec3:
		return 3;
	case VariableType::IVec4:
		return 4;
	default:
		return 0;
	}
}

bool IsVertexInputType(VariableType aType)
{
	return (GetFloatCount(aType) > 0 && GetFloatCount(aType) <= 4) ||
	       (GetIntCount(aType) > 0 && aType != VariableType::Bool);
}

GLenum GetSamplerTarget(VariableType aType)
{
	switch (aType)
	{
	case VariableType::Sampler2D:
	case VariableType::Sampler2DShadow:
	case VariableType::IntSampler2D:
	case VariableType::UIntSampler2D:
		return GL_TEXTURE_2D;
	case VariableType::Sampler2DArray:
	case VariableType::Sampler2DArrayShadow:
		return GL_TEXTURE_2D_ARRAY;
	case VariableType::Sampler3D:
		return GL_TEXTURE_3D;
	case VariableType::SamplerCube:
	case VariableType::SamplerCubeShadow:
		return GL_TEXTURE_CUBE_MAP;
	case VariableType::SamplerCubeArray:
		return GL_TEXTURE_CUBE_MAP_ARRAY;
	default:
		return 0;
	}
}
} // namespace Fx
