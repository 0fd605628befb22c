#pragma once
// HalfFloat: IEEE 754 binary16 conversion for the float textures the generator writes
// (R16G16B16A16_FLOAT cube maps).
//
//   uint16_t bits = Content::FloatToHalf(0.25f);   // 0x3400
//   float value = Content::HalfToFloat(bits);      // 0.25f
//
// FloatToHalf rounds to the nearest half, ties to even, as GPUs do when they convert; values beyond
// the largest half (65504) become infinity, tiny values become subnormal halves or zero, and NaN
// stays NaN. HalfToFloat is exact: every half is a float.

#include <cstdint>

namespace Content
{
uint16_t FloatToHalf(float aValue);
float HalfToFloat(uint16_t aBits);
} // namespace Content
