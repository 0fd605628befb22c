#include "Materials.h"

#include <algorithm>
#include <cmath>

#include "Noise.h"

namespace Content
{
namespace
{
constexpr double ourPi = 3.14159265358979323846;

double Clamp01(double aValue)
{
	return std::clamp(aValue, 0.0, 1.0);
}

double SmoothStep(double anEdge0, double anEdge1, double aValue)
{
	const double t = Clamp01((aValue - anEdge0) / (anEdge1 - anEdge0));
	return t * t * (3.0 - 2.0 * t);
}

void SetColor(Texel& aTexel, double aRed, double aGreen, double aBlue)
{
	aTexel.myColor[0] = Clamp01(aRed);
	aTexel.myColor[1] = Clamp01(aGreen);
	aTexel.myColor[2] = Clamp01(aBlue);
}

// Distance from (aX, aY) in [0, 1)^2 cell space to the nearest cell edge.
double EdgeDistance(double aX, double aY)
{
	return std::min(std::min(aX, 1.0 - aX), std::min(aY, 1.0 - aY));
}

// Running bond: 8 courses of 4 bricks, every other course shifted by half a brick.
Texel Bricks(double aU, double aV)
{
	static const Noise ourNoise(101);
	const int rows = 8;
	const int columns = 4;
	const double rowPosition = aV * rows;
	const int row = static_cast<int>(std::floor(rowPosition));
	const double shift = (row % 2 != 0) ? 0.5 : 0.0;
	const double columnPosition = aU * columns + shift;
	const int column = static_cast<int>(std::floor(columnPosition));
	const double x = columnPosition - column;
	const double y = rowPosition - row;
	// The mortar joint is about 1 cm wide at a brick 25 cm long and 6 cm high; in cell units the
	// same width is larger across the short side.
	const double edge = std::min(std::min(x, 1.0 - x) * 4.0, std::min(y, 1.0 - y));
	const double brick = SmoothStep(0.06, 0.16, edge);
	const double variation = ourNoise.Hash(column % columns, row);
	const double grain = ourNoise.Fractal(aU, aV, 16, 4);
	const double mortarGrain = ourNoise.Fractal(aU, aV, 64, 2);

	Texel texel;
	const double red = 0.55 + 0.15 * variation + 0.12 * (grain - 0.5);
	const double mortar = 0.62 + 0.1 * (mortarGrain - 0.5);
	SetColor(texel, mortar + (red - mortar) * brick, mortar + (0.27 + 0.06 * variation - mortar) * brick,
	         mortar + (0.2 + 0.04 * variation - mortar) * brick);
	texel.myHeight = Clamp01(0.15 + 0.75 * brick + 0.1 * (grain - 0.5));
	texel.myRoughness = 0.75 + 0.15 * (1.0 - brick) + 0.08 * (grain - 0.5);
	texel.myOcclusion = 0.55 + 0.45 * SmoothStep(0.0, 0.2, edge);
	return texel;
}

// Cast concrete: fractal blotches, a few pores and the faint lines of the formwork.
Texel Concrete(double aU, double aV)
{
	static const Noise ourNoise(202);
	const double blotch = ourNoise.Fractal(aU, aV, 4, 5);
	const double fine = ourNoise.Fractal(aU, aV, 64, 2);
	const double pore = SmoothStep(0.7, 0.8, ourNoise.Fractal(aU, aV, 32, 3));
	const double formwork = SmoothStep(0.985, 1.0, std::cos(aV * 2.0 * ourPi * 2.0));

	Texel texel;
	const double grey = 0.5 + 0.18 * (blotch - 0.5) + 0.06 * (fine - 0.5) - 0.15 * pore - 0.05 * formwork;
	SetColor(texel, grey, grey * 0.99, grey * 0.96);
	texel.myHeight = Clamp01(0.6 + 0.2 * (blotch - 0.5) + 0.15 * (fine - 0.5) - 0.45 * pore - 0.2 * formwork);
	texel.myRoughness = 0.85 + 0.1 * (fine - 0.5);
	texel.myOcclusion = 1.0 - 0.45 * pore - 0.15 * formwork;
	return texel;
}

// Four planks across, grain along v, each plank cut once at a staggered point.
Texel WoodPlanks(double aU, double aV)
{
	static const Noise ourNoise(303);
	const int planks = 4;
	const double across = aU * planks;
	const int plank = static_cast<int>(std::floor(across));
	const double x = across - plank;
	const double cut = ourNoise.Hash(plank, 7);
	const double along = aV - cut - std::floor(aV - cut);
	const double edge = std::min(std::min(x, 1.0 - x) * 0.25, std::min(along, 1.0 - along));
	const double board = SmoothStep(0.002, 0.012, edge);
	const double tone = ourNoise.Hash(plank, static_cast<int>(std::floor(aV - cut)) & 1);
	// Rings: stretched noise bends the stripes that run along the board.
	const double warp = ourNoise.Fractal(aU, aV, 4, 3);
	const double rings = 0.5 + 0.5 * std::sin((x * 9.0 + warp * 6.0 + tone * 5.0) * 2.0 * ourPi);
	const double fibre = ourNoise.Value(aU, aV, 256, 8);

	Texel texel;
	const double light = 0.55 + 0.1 * tone - 0.12 * rings + 0.05 * (fibre - 0.5);
	SetColor(texel, light * board + 0.1 * (1.0 - board), light * 0.7 * board + 0.07 * (1.0 - board),
	         light * 0.45 * board + 0.05 * (1.0 - board));
	texel.myHeight = Clamp01(0.2 + 0.7 * board - 0.08 * rings + 0.04 * (fibre - 0.5));
	texel.myRoughness = 0.6 + 0.15 * rings + 0.1 * (1.0 - board);
	texel.myOcclusion = 0.5 + 0.5 * SmoothStep(0.0, 0.02, edge);
	return texel;
}

// Two by two panels with recessed seams, a rivet near each corner and brushed streaks.
Texel MetalPanels(double aU, double aV)
{
	static const Noise ourNoise(404);
	const double px = aU * 2.0;
	const double py = aV * 2.0;
	const int panelX = static_cast<int>(std::floor(px));
	const int panelY = static_cast<int>(std::floor(py));
	const double x = px - panelX;
	const double y = py - panelY;
	const double seam = SmoothStep(0.008, 0.02, EdgeDistance(x, y));
	double rivet = 0.0;
	for (const double cornerX : {0.06, 0.94})
	{
		for (const double cornerY : {0.06, 0.94})
		{
			const double distance = std::hypot(x - cornerX, y - cornerY);
			rivet = std::max(rivet, 1.0 - SmoothStep(0.012, 0.02, distance));
		}
	}
	const double brushed = ourNoise.Value(aU, aV, 4) * 0.3 + ourNoise.Value(aU, aV, 2, 256) * 0.7;
	const double tint = ourNoise.Hash(panelX, panelY);

	Texel texel;
	const double metal = 0.52 + 0.06 * tint + 0.08 * (brushed - 0.5);
	SetColor(texel, metal * seam * 0.95 + 0.15 * (1.0 - seam), metal * seam + 0.15 * (1.0 - seam),
	         metal * seam * 1.05 + 0.16 * (1.0 - seam));
	texel.myHeight = Clamp01(0.1 + 0.6 * seam + 0.3 * rivet);
	texel.myRoughness = 0.3 + 0.15 * (brushed - 0.5) + 0.3 * (1.0 - seam);
	texel.myOcclusion = 0.55 + 0.45 * seam;
	return texel;
}

// Polished marble: a pale ground with dark veins from a turbulent sine.
Texel Marble(double aU, double aV)
{
	static const Noise ourNoise(505);
	const double turbulence = ourNoise.Fractal(aU, aV, 4, 5);
	const double vein = std::abs(std::sin((aU + aV + turbulence * 2.5) * 2.0 * ourPi * 2.0));
	const double dark = 1.0 - SmoothStep(0.0, 0.3, vein);
	const double cloud = ourNoise.Fractal(aU, aV, 8, 3);

	Texel texel;
	const double ground = 0.86 + 0.08 * (cloud - 0.5);
	const double color = ground - 0.3 * dark;
	SetColor(texel, color, color * 0.99, color * 0.97);
	texel.myHeight = Clamp01(0.5 + 0.05 * (cloud - 0.5) - 0.05 * dark);
	texel.myRoughness = 0.12 + 0.06 * dark;
	texel.myOcclusion = 1.0;
	return texel;
}
} // namespace

const char* MaterialName(MaterialKind aKind)
{
	switch (aKind)
	{
	case MaterialKind::Bricks:
		return "bricks";
	case MaterialKind::Concrete:
		return "concrete";
	case MaterialKind::WoodPlanks:
		return "wood";
	case MaterialKind::MetalPanels:
		return "metal";
	case MaterialKind::Marble:
		return "marble";
	}
	return "unknown";
}

double NormalStrength(MaterialKind aKind)
{
	switch (aKind)
	{
	case MaterialKind::Bricks:
		return 6.0;
	case MaterialKind::Concrete:
		return 3.0;
	case MaterialKind::WoodPlanks:
		return 4.0;
	case MaterialKind::MetalPanels:
		return 5.0;
	case MaterialKind::Marble:
		return 1.5;
	}
	return 1.0;
}

Texel SampleMaterial(MaterialKind aKind, double aU, double aV)
{
	switch (aKind)
	{
	case MaterialKind::Bricks:
		return Bricks(aU, aV);
	case MaterialKind::Concrete:
		return Concrete(aU, aV);
	case MaterialKind::WoodPlanks:
		return WoodPlanks(aU, aV);
	case MaterialKind::MetalPanels:
		return MetalPanels(aU, aV);
	case MaterialKind::Marble:
		return Marble(aU, aV);
	}
	return Texel();
}
} // namespace Content
