#pragma once
// DrawFlags: how a string is placed, wrapped, clipped and drawn, with the values of
// the font library the engine was written for, so its flag words keep their meaning.
//
//   font.DrawString(L"Saved", 12.0f, {0, 0, 320, 20}, 0xFF00FF00, Glyphs::DrawFlags::Right |
//                   Glyphs::DrawFlags::VCenter | Glyphs::DrawFlags::ClipRect |
//                   Glyphs::DrawFlags::RestoreState);
//
// Left and Top are the zero defaults. Flags not listed here are accepted and ignored.

#include <cstdint>

namespace Glyphs
{
namespace DrawFlags
{
constexpr uint32_t Left = 0x0;
constexpr uint32_t Top = 0x0;
constexpr uint32_t Center = 0x1;
constexpr uint32_t Right = 0x2;
constexpr uint32_t VCenter = 0x4;
constexpr uint32_t Bottom = 0x8;
// Lines break only at '\n'; without it, lines that do not fit a rectangle's width wrap.
constexpr uint32_t NoWordWrap = 0x10;
// Coverage becomes all or nothing (no anti-aliased edges).
constexpr uint32_t Aliased = 0x20;
// Nothing is drawn outside the layout rectangle.
constexpr uint32_t ClipRect = 0x40;
// The render states the draw changed are put back afterwards (see TextRenderer).
constexpr uint32_t RestoreState = 0x800;
} // namespace DrawFlags

// A rectangle in pixels of the render target: left, top, right, bottom (row 0 at the top).
struct RectF
{
	float myLeft = 0.0f;
	float myTop = 0.0f;
	float myRight = 0.0f;
	float myBottom = 0.0f;

	float GetWidth() const { return myRight - myLeft; }
	float GetHeight() const { return myBottom - myTop; }
	bool operator==(const RectF&) const = default;
};
} // namespace Glyphs
