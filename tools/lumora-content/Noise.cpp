#include "Noise.h"

#include <cmath>

namespace Content
{
namespace
{
// A 32-bit integer mix (Wang-style); any fixed bijection with good avalanche will do.
uint32_t Mix(uint32_t aValue)
{
	aValue ^= aValue >> 16;
	aValue *= 0x7feb352du;
	aValue ^= aValue >> 15;
	aValue *= 0x846ca68bu;
	aValue ^= aValue >> 16;
	return aValue;
}

int Wrap(int aValue, int aPeriod)
{
	const int rest = aValue % aPeriod;
	return rest < 0 ? rest + aPeriod : rest;
}

double Fade(double aT)
{
	return aT * aT * (3.0 - 2.0 * aT);
}
} // namespace

double Noise::Lattice(int anX, int anY, int aPeriodX, int aPeriodY) const
{
	const uint32_t x = static_cast<uint32_t>(Wrap(anX, aPeriodX));
	const uint32_t y = static_cast<uint32_t>(Wrap(anY, aPeriodY));
	const uint32_t hash = Mix(x * 0x9e3779b1u ^ Mix(y + 0x632be5abu) ^ Mix(mySeed));
	return static_cast<double>(hash >> 8) / static_cast<double>(1u << 24);
}

double Noise::Value(double aU, double aV, int aPeriodU, int aPeriodV) const
{
	const double x = aU * aPeriodU;
	const double y = aV * aPeriodV;
	const double cellX = std::floor(x);
	const double cellY = std::floor(y);
	const int ix = static_cast<int>(cellX);
	const int iy = static_cast<int>(cellY);
	const double fx = Fade(x - cellX);
	const double fy = Fade(y - cellY);
	const double topLeft = Lattice(ix, iy, aPeriodU, aPeriodV);
	const double topRight = Lattice(ix + 1, iy, aPeriodU, aPeriodV);
	const double bottomLeft = Lattice(ix, iy + 1, aPeriodU, aPeriodV);
	const double bottomRight = Lattice(ix + 1, iy + 1, aPeriodU, aPeriodV);
	const double top = topLeft + (topRight - topLeft) * fx;
	const double bottom = bottomLeft + (bottomRight - bottomLeft) * fx;
	return top + (bottom - top) * fy;
}

double Noise::Fractal(double aU, double aV, int aBasePeriod, int anOctaveCount) const
{
	double sum = 0.0;
	double weight = 1.0;
	double total = 0.0;
	int period = aBasePeriod;
	for (int octave = 0; octave < anOctaveCount; ++octave)
	{
		sum += Value(aU, aV, period) * weight;
		total += weight;
		weight *= 0.5;
		period *= 2;
	}
	return sum / total;
}
} // namespace Content
