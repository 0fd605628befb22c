#pragma once
// RenderState: the fixed-function settings of a draw, described as Direct3D 11
// describes them, so engine code ported from it keeps its state tables.
//
//   Gpu::BlendState alpha;
//   alpha.myEnableFlag = true;
//   alpha.myColor = {Gpu::Blend::SrcAlpha, Gpu::Blend::InvSrcAlpha, Gpu::BlendOp::Add};
//   context.SetBlendState(alpha);
//   context.SetDepthStencilState({.myDepthEnableFlag = true, .myDepthFunc = Gpu::Comparison::Less});
//
// These are plain values: the context hands them to the StateCache, which sets
// only the GL state that differs from what it last set. A default-constructed
// state is Direct3D's default state.

#include <cstdint>

namespace Gpu
{
enum class Comparison
{
	Never,
	Less,
	Equal,
	LessEqual,
	Greater,
	NotEqual,
	GreaterEqual,
	Always,
};

enum class Blend
{
	Zero,
	One,
	SrcColor,
	InvSrcColor,
	SrcAlpha,
	InvSrcAlpha,
	DestAlpha,
	InvDestAlpha,
	DestColor,
	InvDestColor,
	SrcAlphaSat,
	BlendFactor,
	InvBlendFactor,
};

enum class BlendOp
{
	Add,
	Subtract,
	RevSubtract,
	Min,
	Max,
};

// Direct3D's D3D11_COLOR_WRITE_ENABLE bits.
namespace ColorWrite
{
constexpr uint8_t Red = 1;
constexpr uint8_t Green = 2;
constexpr uint8_t Blue = 4;
constexpr uint8_t Alpha = 8;
constexpr uint8_t All = 15;
} // namespace ColorWrite

struct BlendEquation
{
	Blend mySource = Blend::One;
	Blend myDestination = Blend::Zero;
	BlendOp myOp = BlendOp::Add;

	bool operator==(const BlendEquation&) const = default;
};

// One state for every render target (Direct3D's IndependentBlendEnable off).
struct BlendState
{
	bool myEnableFlag = false;
	BlendEquation myColor;
	BlendEquation myAlpha;
	uint8_t myWriteMask = ColorWrite::All;

	bool operator==(const BlendState&) const = default;
};

struct DepthStencilState
{
	bool myDepthEnableFlag = true;
	bool myDepthWriteFlag = true;
	Comparison myDepthFunc = Comparison::Less;

	bool operator==(const DepthStencilState&) const = default;
};

enum class FillMode
{
	Solid,
	Wireframe,
};

enum class CullMode
{
	None,
	Front,
	Back,
};

struct RasterizerState
{
	FillMode myFillMode = FillMode::Solid;
	CullMode myCullMode = CullMode::Back;
	bool myFrontCounterClockwiseFlag = false;
	bool myDepthClipFlag = true;
	bool myScissorFlag = false;

	bool operator==(const RasterizerState&) const = default;
};
} // namespace Gpu
