#pragma once
// Text: a piece of screen text drawn with a font, at a point or into a box.
//
//   Zeph::Text* info = new Zeph::Text(engine->GetFontContainer().GetFont("Arial"));
//   info->SetPosition(Vector2<float>(5.0f, 5.0f));
//   info->SetSize(12.0f);
//   info->SetText("Camera Position: 0 10 0");
//   info->Render(false);   // queued: the renderer draws it over the finished frame
//
// Defaults: opaque white (0xFFFFFFFF, red in the low byte), flags 0x800 (the draw
// restores the render states it changed), size 12 pixels, at (0, 0), no box (width
// -1) and no rectangle. The font is not owned; the font container keeps it.

#include <cstdint>
#include <string>

#include "core/Vector2.h"
#include "core/Vector4.h"

namespace Zeph
{
class Font;

class Text
{
public:
	explicit Text(Font* aFont);

	// Each coordinate is rounded up to a whole pixel.
	void SetPosition(const Vector2<float>& aPosition);
	void SetSize(float aSize) { mySize = aSize; }
	// UTF-8; a byte sequence that is not UTF-8 becomes '?'.
	void SetText(const std::string& aText);
	const std::wstring& GetText() const { return myText; }

	// aNowFlag: draw into the bound render target at once; otherwise queue with the renderer.
	void Render(bool aNowFlag);

private:
	Font* myFont;
	bool myUseRect = false;
	uint32_t myColor = 0xFFFFFFFF;
	uint32_t myFlags = 0x800;
	float mySize = 12.0f;
	Vector2<float> myPosition{0.0f, 0.0f};
	Vector2<float> myBoxSize{-1.0f, 0.0f};
	Vector4<float> myRect{0.0f, 0.0f, 0.0f, 0.0f}; // left, top, right, bottom
	std::wstring myText;
};
} // namespace Zeph
