#include "HalfFloat.h"

#include <bit>

namespace Content
{
uint16_t FloatToHalf(float aValue)
{
	const uint32_t bits = std::bit_cast<uint32_t>(aValue);
	const uint16_t sign = static_cast<uint16_t>((bits >> 16) & 0x8000u);
	const uint32_t exponent = (bits >> 23) & 0xFFu;
	const uint32_t mantissa = bits & 0x7FFFFFu;
	if (exponent == 0xFFu)
	{
		// Infinity keeps its sign; NaN keeps a quiet bit so that it cannot turn into infinity.
		return static_cast<uint16_t>(sign | 0x7C00u | (mantissa != 0 ? 0x200u | (mantissa >> 13) : 0u));
	}
	// The half exponent of the value; below 1 the result is subnormal (or zero).
	const int halfExponent = int(exponent) - 127 + 15;
	if (halfExponent >= 31)
	{
		return static_cast<uint16_t>(sign | 0x7C00u);
	}
	uint32_t significand = 0; // with the implicit bit, aligned so that bit 13 and up are kept
	int shift = 13;
	uint32_t biasedExponent = 0;
	if (halfExponent <= 0)
	{
		if (halfExponent < -10)
		{
			// Less than half the smallest subnormal: rounds to zero.
			return sign;
		}
		significand = mantissa | 0x800000u;
		shift = 14 - halfExponent;
	}
	else
	{
		significand = mantissa;
		biasedExponent = uint32_t(halfExponent) << 10;
	}
	const uint32_t kept = significand >> shift;
	const uint32_t dropped = significand & ((1u << shift) - 1u);
	const uint32_t halfway = 1u << (shift - 1);
	uint32_t result = biasedExponent + kept;
	if (dropped > halfway || (dropped == halfway && (kept & 1u) != 0))
	{
		// A carry out of the mantissa moves into the exponent, which is the right next value
		// (and reaches 0x7C00, infinity, past the largest half).
		++result;
	}
	return static_cast<uint16_t>(sign | result);
}

float HalfToFloat(uint16_t aBits)
{
	const uint32_t sign = uint32_t(aBits & 0x8000u) << 16;
	const uint32_t exponent = (aBits >> 10) & 0x1Fu;
	uint32_t mantissa = aBits & 0x3FFu;
	if (exponent == 0x1Fu)
	{
		return std::bit_cast<float>(sign | 0x7F800000u | (mantissa << 13));
	}
	if (exponent != 0)
	{
		return std::bit_cast<float>(sign | ((exponent + 127 - 15) << 23) | (mantissa << 13));
	}
	if (mantissa == 0)
	{
		return std::bit_cast<float>(sign);
	}
	// Subnormal: normalise into the float's wider exponent range.
	int floatExponent = 127 - 15 + 1;
	while ((mantissa & 0x400u) == 0)
	{
		mantissa <<= 1;
		--floatExponent;
	}
	mantissa &= 0x3FFu;
	return std::bit_cast<float>(sign | (uint32_t(floatExponent) << 23) | (mantissa << 13));
}
} // namespace Content
