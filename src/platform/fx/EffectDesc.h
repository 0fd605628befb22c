#pragma once
// EffectDesc: everything a compiled effect holds, as plain values.
//
// The compiler fills one from a source (.fx), the compiled form (.fxal) stores it,
// and Fx::Effect builds its GL programs and variables from it. Stage, variable and
// file indices refer into the vectors of the same EffectDesc.

#include <cstdint>
#include <string>
#include <vector>

#include "platform/fx/VariableType.h"
#include "platform/gpu/RenderState.h"
#include "platform/gpu/SamplerState.h"

namespace Fx
{
enum class StageKind : uint8_t
{
	Vertex,
	Geometry,
	Fragment,
};

// One vertex shader input: the GLSL variable name is the semantic ("TEXCOORD1"),
// split into name and index; locations run 0..n-1 in declaration order.
struct VertexInput
{
	std::string myVariableName; // as declared: "POSITION", "TEXCOORD0"
	std::string mySemanticName;
	uint32_t mySemanticIndex = 0;
	VariableType myType = VariableType::Vec4;
	int myLocation = 0;

	bool operator==(const VertexInput&) const = default;
};

// Assembled GLSL of one stage block: #version, the shared text and the block's
// body, with #line directives whose source numbers index EffectDesc::myFiles.
struct StageDesc
{
	StageKind myKind = StageKind::Vertex;
	std::string myName;
	std::string mySource;
	std::vector<VertexInput> myInputs; // vertex stages only

	bool operator==(const StageDesc&) const = default;
};

// The state groups a pass declares; applying the pass sets only these.
namespace StateGroup
{
constexpr uint8_t Blend = 1;
constexpr uint8_t DepthStencil = 2;
constexpr uint8_t Rasterizer = 4;
constexpr uint8_t All = 7;
} // namespace StateGroup

struct PassDesc
{
	std::string myName;
	int myVertexStage = -1;
	int myGeometryStage = -1; // -1: none
	int myFragmentStage = -1;
	uint8_t myStateGroups = 0;
	Gpu::BlendState myBlend;
	Gpu::DepthStencilState myDepthStencil;
	Gpu::RasterizerState myRasterizer;
	std::vector<VertexInput> myInputs; // the vertex stage's signature

	bool operator==(const PassDesc&) const = default;
};

struct TechniqueDesc
{
	std::string myName;
	std::vector<PassDesc> myPasses;

	bool operator==(const TechniqueDesc&) const = default;
};

struct VariableDesc
{
	std::string myName;
	VariableType myType = VariableType::Float;
	int myElementCount = 0;     // 0: not an array
	int myUnit = -1;            // first texture unit of a sampler (arrays take consecutive units)
	Gpu::SamplerDesc mySampler; // samplers only

	bool operator==(const VariableDesc& anOther) const;
};

struct EffectDesc
{
	uint64_t mySourceHash = 0;
	std::vector<std::string> myFiles; // the source, then its includes; #line source numbers index this
	std::vector<StageDesc> myStages;
	std::vector<VariableDesc> myVariables;
	std::vector<TechniqueDesc> myTechniques;

	bool operator==(const EffectDesc&) const = default;
};
} // namespace Fx
