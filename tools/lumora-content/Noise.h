#pragma once
// Noise: deterministic, tileable value noise for the procedural textures.
//
//   Content::Noise noise(1234);
//   double grain = noise.Fractal(u, v, 8, 4);   // four octaves, base period 8 cells over [0, 1)
//
// The lattice values come from an integer hash of the cell and the seed, so the same seed gives
// the same bytes on every run and machine. Coordinates wrap at 1, so a texture made from it tiles.

#include <cstdint>

namespace Content
{
class Noise
{
public:
	explicit Noise(uint32_t aSeed) : mySeed(aSeed) {}

	// A value in [0, 1) for an integer lattice point, wrapped at aPeriodX by aPeriodY cells.
	double Lattice(int anX, int anY, int aPeriodX, int aPeriodY) const;
	// Smoothly interpolated noise in [0, 1]; (u, v) in texture space, aPeriod cells across it.
	double Value(double aU, double aV, int aPeriod) const { return Value(aU, aV, aPeriod, aPeriod); }
	// Stretched noise: different cell counts along u and v (brushed metal, wood fibre).
	double Value(double aU, double aV, int aPeriodU, int aPeriodV) const;
	// Octaves of Value() with doubling periods and halving weights, normalised to [0, 1].
	double Fractal(double aU, double aV, int aBasePeriod, int anOctaveCount) const;

	// A hash of two integers and the seed in [0, 1): per-brick and per-plank variation.
	double Hash(int anX, int anY) const { return Lattice(anX, anY, 1 << 30, 1 << 30); }

private:
	uint32_t mySeed;
};
} // namespace Content
