// Half floats: known binary16 encodings (nearest, ties to even; overflow; subnormals) and an exact
// round trip of every half.

#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <limits>

#include "HalfFloat.h"

TEST(HalfFloatTest, EncodesKnownValuesRoundingToNearestEven)
{
	const std::pair<float, uint16_t> cases[] = {
	    {0.0f, 0x0000},       {-0.0f, 0x8000},        {1.0f, 0x3C00},
	    {-2.0f, 0xC000},      {0.08f, 0x2D1F},        {0.1f, 0x2E66},
	    {65504.0f, 0x7BFF},   {65519.0f, 0x7BFF},     {65520.0f, 0x7C00},
	    {-1.0e6f, 0xFC00},    {0x1.002p0f, 0x3C00},   {0x1.006p0f, 0x3C02},
	    {0x1.003p0f, 0x3C01}, {0x1p-24f, 0x0001},     {0x1p-25f, 0x0000},
	    {0x1.8p-25f, 0x0001}, {0x1.ffcp-15f, 0x0400}, {std::numeric_limits<float>::infinity(), 0x7C00},
	};
	for (const auto& [value, bits] : cases)
	{
		EXPECT_EQ(Content::FloatToHalf(value), bits) << std::hexfloat << value;
	}
	const uint16_t nan = Content::FloatToHalf(std::numeric_limits<float>::quiet_NaN());
	EXPECT_TRUE((nan & 0x7C00) == 0x7C00 && (nan & 0x03FF) != 0);
}

TEST(HalfFloatTest, EveryHalfDecodesToItsValueAndEncodesBack)
{
	for (uint32_t bits = 0; bits <= 0xFFFF; ++bits)
	{
		const uint32_t exponent = (bits >> 10) & 0x1F;
		const uint32_t mantissa = bits & 0x3FF;
		const float value = Content::HalfToFloat(static_cast<uint16_t>(bits));
		if (exponent == 0x1F && mantissa != 0)
		{
			EXPECT_TRUE(std::isnan(value)) << bits;
			continue;
		}
		double expected = exponent == 0x1F ? std::numeric_limits<double>::infinity()
		                  : exponent == 0  ? std::ldexp(double(mantissa), -24)
		                                   : std::ldexp(1.0 + mantissa / 1024.0, int(exponent) - 15);
		expected = (bits & 0x8000) ? -expected : expected;
		ASSERT_EQ(double(value), expected) << std::hex << bits;
		ASSERT_EQ(std::signbit(value), (bits & 0x8000) != 0) << std::hex << bits;
		ASSERT_EQ(Content::FloatToHalf(value), bits) << std::hex << bits;
	}
}
