#pragma once
// Materials: the procedural surfaces of the sample content. Each material is a function of the
// texture coordinate that gives a colour, a height, a roughness and an ambient occlusion; the
// texture baker samples it into the four maps that a model's effect reads.
//
//   Content::Texel texel = Content::SampleMaterial(Content::MaterialKind::Bricks, 0.25, 0.5);
//
// (u, v) lie in [0, 1) with v = 0 on the image's top row; every material tiles at 1.

#include <array>

namespace Content
{
enum class MaterialKind
{
	Bricks,
	Concrete,
	WoodPlanks,
	MetalPanels,
	Marble
};

constexpr std::array<MaterialKind, 5> ourMaterialKinds = {MaterialKind::Bricks, MaterialKind::Concrete,
                                                          MaterialKind::WoodPlanks, MaterialKind::MetalPanels,
                                                          MaterialKind::Marble};

struct Texel
{
	double myColor[3] = {0.0, 0.0, 0.0}; // sRGB-encoded, 0..1
	double myHeight = 0.0;               // 0 (groove) .. 1 (top)
	double myRoughness = 0.5;
	double myOcclusion = 1.0;
};

// "bricks", "concrete", "wood", "metal", "marble": the stem of the texture and material names.
const char* MaterialName(MaterialKind aKind);
// How steep the normal map makes one unit of height per texel-width step.
double NormalStrength(MaterialKind aKind);
Texel SampleMaterial(MaterialKind aKind, double aU, double aV);
} // namespace Content
