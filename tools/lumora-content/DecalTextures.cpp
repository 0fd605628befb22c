#include "DecalTextures.h"

#include <algorithm>
#include <cmath>
#include <vector>

#include "Materials.h"
#include "MipChain.h"
#include "Noise.h"
#include "platform/dds/Format.h"

namespace Content
{
namespace
{
constexpr double ourPi = 3.14159265358979323846;
// One texel of level 0 in texture units: the width over which shape edges are smoothed.
constexpr double ourTexel = 1.0 / ourDecalMapSize;

struct DecalTexel
{
	double myColor[3] = {0.0, 0.0, 0.0}; // sRGB-encoded, 0..1
	double myAlpha = 0.0;
	double myHeight = 0.0; // constant wherever the shape does not reach, so the normal map is flat there
};

double Clamp01(double aValue)
{
	return std::clamp(aValue, 0.0, 1.0);
}

// Either edge may be the larger: from 0 at anEdge0 to 1 at anEdge1.
double SmoothStep(double anEdge0, double anEdge1, double aValue)
{
	const double t = Clamp01((aValue - anEdge0) / (anEdge1 - anEdge0));
	return t * t * (3.0 - 2.0 * t);
}

double Mix(double aFrom, double aTo, double aWeight)
{
	return aFrom + (aTo - aFrom) * aWeight;
}

void SetColor(DecalTexel& aTexel, double aRed, double aGreen, double aBlue)
{
	aTexel.myColor[0] = Clamp01(aRed);
	aTexel.myColor[1] = Clamp01(aGreen);
	aTexel.myColor[2] = Clamp01(aBlue);
}

// 1 inside a shape whose signed distance is aDistance (negative inside), smoothed over a texel.
double Inside(double aDistance)
{
	return SmoothStep(ourTexel * 0.75, -ourTexel * 0.75, aDistance);
}

// Signed distance to a box of half size (aHalfU, aHalfV) centred on (aCenterU, aCenterV) with corners
// rounded by aRadius.
double RoundedBoxDistance(double aU, double aV, double aCenterU, double aCenterV, double aHalfU,
                          double aHalfV, double aRadius)
{
	const double du = std::abs(aU - aCenterU) - (aHalfU - aRadius);
	const double dv = std::abs(aV - aCenterV) - (aHalfV - aRadius);
	const double outside = std::hypot(std::max(du, 0.0), std::max(dv, 0.0));
	return outside + std::min(std::max(du, dv), 0.0) - aRadius;
}

// A plate of diagonal stripes with a dark frame, its paint scratched down to the metal in places.
DecalTexel Hazard(double aU, double aV)
{
	static const Noise ourNoise(601);
	const double distance = RoundedBoxDistance(aU, aV, 0.5, 0.5, 0.44, 0.24, 0.04);
	const double stripe = std::abs(std::fmod((aU + aV) * 6.0, 1.0) - 0.5); // 0..0.5, 0.25 on an edge
	const double yellow = SmoothStep(0.25 - ourTexel * 2.0, 0.25 + ourTexel * 2.0, stripe);
	const double frame = SmoothStep(-0.03 - ourTexel, -0.03 + ourTexel, distance);
	const double scratch = SmoothStep(0.72, 0.8, ourNoise.Fractal(aU, aV * 0.25, 32, 3));
	const double grime = ourNoise.Fractal(aU, aV, 8, 4);

	DecalTexel texel;
	double color[3] = {Mix(0.07, 0.95, yellow), Mix(0.07, 0.74, yellow), Mix(0.06, 0.08, yellow)};
	for (double& channel : color)
	{
		channel = Mix(channel, 0.08, frame);
		channel = Mix(channel, 0.55, scratch) * (0.85 + 0.15 * grime);
	}
	SetColor(texel, color[0], color[1], color[2]);
	texel.myAlpha = Inside(distance);
	// A raised plate with a bevelled rim; the paint stands a little above the scratches.
	texel.myHeight = 0.6 * SmoothStep(0.0, -0.02, distance) + 0.08 * (1.0 - scratch) * texel.myAlpha;
	return texel;
}

// Concentric rings, alternately red and white, embossed in steps, with a little grime.
DecalTexel Target(double aU, double aV)
{
	static const Noise ourNoise(602);
	const double radius = std::hypot(aU - 0.5, aV - 0.5);
	const double outer = 0.46;
	const double band = 0.092;
	const double ring = radius / band;
	const double fraction = ring - std::floor(ring);
	const bool red = static_cast<int>(std::floor(ring)) % 2 == 0;
	// Soften the change of colour at each band edge; the centre (ring 0) has no inner edge.
	const double toEdge = ring < 0.5 ? 1.0 - fraction : std::min(fraction, 1.0 - fraction);
	const double edge = SmoothStep(0.0, ourTexel * 2.0 / band, toEdge);
	const double redWeight = red ? Mix(0.5, 1.0, edge) : Mix(0.5, 0.0, edge);
	const double grime = ourNoise.Fractal(aU, aV, 8, 4);

	DecalTexel texel;
	const double shade = 0.82 + 0.18 * grime;
	SetColor(texel, Mix(0.92, 0.78, redWeight) * shade, Mix(0.91, 0.1, redWeight) * shade,
	         Mix(0.87, 0.08, redWeight) * shade);
	texel.myAlpha = Inside(radius - outer);
	texel.myHeight = SmoothStep(outer, outer - 0.02, radius) * (0.5 + 0.3 * redWeight);
	return texel;
}

struct CrackSegment
{
	double myFromU, myFromV, myToU, myToV;
	double myFromHalfWidth, myToHalfWidth;
};

// A random walk outward from near the centre that forks now and then; the same segments on every run.
void GrowCrack(std::vector<CrackSegment>& someSegments, const Noise& aNoise, double aU, double aV,
               double anAngle, double aHalfWidth, int aSteps, int aDepth, int aSeed)
{
	for (int step = 0; step < aSteps; ++step)
	{
		anAngle += (aNoise.Hash(aSeed, step) - 0.5) * 1.1;
		const double length = 0.03 + 0.025 * aNoise.Hash(aSeed + 1000, step);
		const double u = aU + std::cos(anAngle) * length;
		const double v = aV + std::sin(anAngle) * length;
		if (std::hypot(u - 0.5, v - 0.5) > 0.4)
		{
			return;
		}
		const double halfWidth = aHalfWidth * 0.88;
		someSegments.push_back({aU, aV, u, v, aHalfWidth, halfWidth});
		if (aDepth < 2 && aNoise.Hash(aSeed + 2000, step) > 0.68)
		{
			const double turn = aNoise.Hash(aSeed + 3000, step) > 0.5 ? 0.9 : -0.9;
			GrowCrack(someSegments, aNoise, u, v, anAngle + turn, halfWidth * 0.7, aSteps - step - 1,
			          aDepth + 1, aSeed * 7 + step + 1);
		}
		aU = u;
		aV = v;
		aHalfWidth = halfWidth;
	}
}

const std::vector<CrackSegment>& CrackSegments()
{
	static const std::vector<CrackSegment> ourSegments = [] {
		const Noise noise(603);
		std::vector<CrackSegment> segments;
		const double angles[4] = {0.3, 1.9, 3.4, 4.9};
		for (int branch = 0; branch < 4; ++branch)
		{
			const double angle = angles[branch] + (noise.Hash(branch, 99) - 0.5) * 0.6;
			GrowCrack(segments, noise, 0.5, 0.5, angle, 0.006, 12, 0, branch + 1);
		}
		return segments;
	}();
	return ourSegments;
}

// Distance to the nearest crack's edge (negative inside a crack).
double CrackDistance(double aU, double aV)
{
	double best = 1.0;
	for (const CrackSegment& segment : CrackSegments())
	{
		const double du = segment.myToU - segment.myFromU;
		const double dv = segment.myToV - segment.myFromV;
		const double lengthSquared = du * du + dv * dv;
		const double t = Clamp01(((aU - segment.myFromU) * du + (aV - segment.myFromV) * dv) /
		                         std::max(lengthSquared, 1e-12));
		const double distance = std::hypot(aU - segment.myFromU - du * t, aV - segment.myFromV - dv * t);
		best = std::min(best, distance - Mix(segment.myFromHalfWidth, segment.myToHalfWidth, t));
	}
	return best;
}

// Dark cracks with a chipped, dusty margin; the surface between them is left alone.
DecalTexel Crack(double aU, double aV)
{
	static const Noise ourNoise(604);
	const double distance = CrackDistance(aU, aV);
	const double crack = Inside(distance);
	const double chips = SmoothStep(0.35, 0.65, ourNoise.Fractal(aU, aV, 32, 3));
	const double margin = SmoothStep(0.02, 0.0, distance) * chips;

	DecalTexel texel;
	SetColor(texel, Mix(0.52, 0.05, crack), Mix(0.5, 0.045, crack), Mix(0.46, 0.04, crack));
	texel.myAlpha = std::max(crack, 0.5 * margin);
	texel.myHeight = 1.0 - 0.9 * crack - 0.2 * margin;
	return texel;
}

// A grime stain under a leak: a blotch near the top with drips running down, each ending in a drop.
DecalTexel Stain(double aU, double aV)
{
	static const Noise ourNoise(605);
	double density =
	    std::exp(-std::pow((aU - 0.5) / 0.22, 2.0)) * SmoothStep(0.06, 0.16, aV) * SmoothStep(0.4, 0.24, aV);
	for (int drip = 0; drip < 7; ++drip)
	{
		const double center = 0.3 + 0.4 * ourNoise.Hash(drip, 1);
		const double end = 0.45 + 0.45 * ourNoise.Hash(drip, 2);
		const double width = 0.008 + 0.014 * ourNoise.Hash(drip, 3);
		const double streak = std::exp(-std::pow((aU - center) / width, 2.0)) * SmoothStep(0.15, 0.25, aV) *
		                      SmoothStep(end, end - 0.06, aV);
		const double drop = std::exp(-(std::pow(aU - center, 2.0) + std::pow(aV - end + 0.02, 2.0)) /
		                             std::pow(width * 1.6, 2.0));
		density = std::max(density, std::max(streak, drop));
	}
	const double grain = ourNoise.Fractal(aU, aV, 8, 5);
	const double amount = SmoothStep(0.2, 0.55, density * (0.55 + 0.9 * grain));

	DecalTexel texel;
	const double dark = 1.0 - 0.45 * amount;
	SetColor(texel, 0.33 * dark, 0.26 * dark, 0.16 * dark);
	texel.myAlpha = 0.9 * amount;
	texel.myHeight = 0.2 * amount;
	return texel;
}

// Signed distance to the arrow: a shaft and a triangular head with its tip towards the top (v = 0).
double ArrowDistance(double aU, double aV)
{
	const double shaft = RoundedBoxDistance(aU, aV, 0.5, 0.68, 0.09, 0.22, 0.01);
	// The head as the intersection of three half planes: the base and the two slanted sides.
	const double base = aV - 0.5;
	const double tipV = 0.1;
	const double halfBase = 0.3;
	const double slope = std::hypot(halfBase, 0.5 - tipV);
	const double side = ((std::abs(aU - 0.5)) * (0.5 - tipV) - (aV - tipV) * halfBase) / slope;
	return std::min(shaft, std::max(base, side));
}

// Floor paint, worn through where feet and wheels went.
DecalTexel Arrow(double aU, double aV)
{
	static const Noise ourNoise(606);
	const double shape = Inside(ArrowDistance(aU, aV));
	const double wear = SmoothStep(0.3, 0.42, ourNoise.Fractal(aU, aV, 16, 4));
	const double grime = ourNoise.Fractal(aU, aV, 32, 2);

	DecalTexel texel;
	const double shade = 0.86 + 0.14 * grime;
	SetColor(texel, 0.92 * shade, 0.9 * shade, 0.84 * shade);
	texel.myAlpha = shape * (0.35 + 0.65 * wear);
	texel.myHeight = 0.3 * texel.myAlpha;
	return texel;
}

// Bricks behind a ragged hole in the plaster, with the plaster's broken edge around them.
DecalTexel Brick(double aU, double aV)
{
	static const Noise ourNoise(607);
	const double radius = std::hypot(aU - 0.5, aV - 0.5);
	const double ragged = 0.3 + 0.14 * (ourNoise.Fractal(aU, aV, 4, 4) - 0.5) * 2.0;
	const double distance = radius - ragged; // negative in the hole
	const Texel brick =
	    SampleMaterial(MaterialKind::Bricks, std::fmod(aU * 2.0, 1.0), std::fmod(aV * 2.0, 1.0));
	const double hole = Inside(distance + 0.025);
	const double plasterGrain = ourNoise.Fractal(aU, aV, 64, 2);

	DecalTexel texel;
	const double plaster = 0.78 + 0.08 * (plasterGrain - 0.5);
	SetColor(texel, Mix(plaster, brick.myColor[0], hole), Mix(plaster * 0.97, brick.myColor[1], hole),
	         Mix(plaster * 0.92, brick.myColor[2], hole));
	texel.myAlpha = Inside(distance);
	// The plaster's face is the wall's own level; the bricks lie deeper.
	texel.myHeight = Mix(0.9, 0.2 + 0.4 * brick.myHeight, hole);
	return texel;
}

double NormalStrength(DecalKind aKind)
{
	switch (aKind)
	{
	case DecalKind::Brick:
	case DecalKind::Crack:
		return 6.0;
	case DecalKind::Hazard:
	case DecalKind::Target:
	case DecalKind::Arrow:
		return 4.0;
	case DecalKind::Stain:
		return 3.0;
	}
	return 1.0;
}

DecalTexel SampleDecal(DecalKind aKind, double aU, double aV)
{
	switch (aKind)
	{
	case DecalKind::Brick:
		return Brick(aU, aV);
	case DecalKind::Hazard:
		return Hazard(aU, aV);
	case DecalKind::Target:
		return Target(aU, aV);
	case DecalKind::Crack:
		return Crack(aU, aV);
	case DecalKind::Stain:
		return Stain(aU, aV);
	case DecalKind::Arrow:
		return Arrow(aU, aV);
	}
	return DecalTexel();
}

MipLevel SampleLevelZero(DecalKind aKind, MapKind aMap)
{
	const uint32_t size = ourDecalMapSize;
	MipLevel level;
	level.mySize = size;
	level.myTexels.resize(size_t(size) * size);
	std::vector<DecalTexel> texels(size_t(size) * size);
	for (uint32_t y = 0; y < size; ++y)
	{
		for (uint32_t x = 0; x < size; ++x)
		{
			texels[size_t(y) * size + x] = SampleDecal(aKind, (x + 0.5) / size, (y + 0.5) / size);
		}
	}
	if (aMap == MapKind::Albedo)
	{
		for (size_t index = 0; index < texels.size(); ++index)
		{
			const DecalTexel& texel = texels[index];
			level.myTexels[index] = {SrgbToLinear(texel.myColor[0]), SrgbToLinear(texel.myColor[1]),
			                         SrgbToLinear(texel.myColor[2]), Clamp01(texel.myAlpha)};
		}
		return level;
	}
	// The decal does not tile: differences at the rim use the rim texel itself.
	auto height = [&](int anX, int anY) {
		const int last = static_cast<int>(size) - 1;
		return Clamp01(
		    texels[size_t(std::clamp(anY, 0, last)) * size + size_t(std::clamp(anX, 0, last))].myHeight);
	};
	const double strength = NormalStrength(aKind);
	for (int y = 0; y < static_cast<int>(size); ++y)
	{
		for (int x = 0; x < static_cast<int>(size); ++x)
		{
			const double alongU = (height(x + 1, y) - height(x - 1, y)) * 0.5;
			// Rows run down the image while v runs up it.
			const double alongV = -(height(x, y + 1) - height(x, y - 1)) * 0.5;
			const double normal[3] = {-alongU * strength, -alongV * strength, 1.0};
			const double length = std::sqrt(normal[0] * normal[0] + normal[1] * normal[1] + 1.0);
			level.myTexels[size_t(y) * size + x] = {normal[0] / length, normal[1] / length,
			                                        normal[2] / length, height(x, y)};
		}
	}
	return level;
}

} // namespace

const char* DecalName(DecalKind aKind)
{
	switch (aKind)
	{
	case DecalKind::Brick:
		return "brick";
	case DecalKind::Hazard:
		return "hazard";
	case DecalKind::Target:
		return "target";
	case DecalKind::Crack:
		return "crack";
	case DecalKind::Stain:
		return "stain";
	case DecalKind::Arrow:
		return "arrow";
	}
	return "unknown";
}

std::string DecalTextureFileName(DecalKind aKind, MapKind aMap)
{
	return std::string("decal_") + DecalName(aKind) + "_" + MapSuffix(aMap) + ".dds";
}

bool BakeDecalMap(DecalKind aKind, MapKind aMap, Dds::Image& anImageOut, std::string& anErrorOut)
{
	if (aMap != MapKind::Albedo && aMap != MapKind::Normal)
	{
		anErrorOut = std::string("decal ") + DecalName(aKind) + " has no " + MapSuffix(aMap) + " map";
		return false;
	}
	// Colour averaged by coverage, so the transparent surround does not darken the edge.
	return BakeMipChain(SampleLevelZero(aKind, aMap), aMap == MapKind::Normal, true, anImageOut, anErrorOut);
}
} // namespace Content
