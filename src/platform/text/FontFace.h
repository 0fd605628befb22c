#pragma once
// FontFace: one font file found by family name and opened with FreeType.
//
//   Glyphs::FontMatch match;
//   if (!Glyphs::FontFace::Resolve("Arial", match)) { ... reported ... }
//   // match.myFile: /usr/share/fonts/truetype/liberation/LiberationSans-Regular.ttf
//   Glyphs::FontFace face;
//   if (!face.Init(factory.GetLibrary(), match)) { ... reported ... }
//   const Glyphs::LineMetrics line = face.GetLineMetrics(12.0f);
//
// Families resolve through fontconfig, which maps names the engine uses ("Arial") to
// metric-compatible faces (Liberation Sans). A family that is not installed resolves
// to fontconfig's fallback face, as a text system that substitutes fonts draws with
// one; the match keeps the family found so callers can tell. Only an empty name or a
// fontconfig that finds no file at all fails. The face shares the FreeType instance
// of the factory that made it, which lives while any of its faces does.

#include <cstdint>
#include <ft2build.h>
#include <memory>
#include <string>
#include FT_FREETYPE_H

namespace Glyphs
{
using FreeTypeLibrary = std::shared_ptr<FT_LibraryRec_>;

struct FontMatch
{
	std::string myRequestedFamily;
	std::string myFamily; // the family of the face found
	std::string myStyle;
	std::string myFile;
	int myFaceIndex = 0; // the face within a collection file
};

// Vertical metrics at one pixel size: the baseline lies myAscent below a line's top,
// and lines are myLineHeight apart.
struct LineMetrics
{
	float myAscent = 0.0f;
	float myDescent = 0.0f; // positive, below the baseline
	float myLineHeight = 0.0f;
};

class FontFace
{
public:
	FontFace() = default;
	~FontFace();
	FontFace(const FontFace&) = delete;
	FontFace& operator=(const FontFace&) = delete;

	// Whether fontconfig's configuration could be loaded (once per process).
	static bool HasFontConfig();
	// Reports and returns false for an empty name or when fontconfig offers no file.
	static bool Resolve(const std::string& aFamilyName, FontMatch& aMatchOut);

	// Reports and returns false when FreeType cannot open the file as a scalable face.
	bool Init(const FreeTypeLibrary& aLibrary, const FontMatch& aMatch);
	void Destroy();

	bool IsInitialized() const { return myFace != nullptr; }
	const FontMatch& GetMatch() const { return myMatch; }
	FT_Face GetFace() const { return myFace; }

	// Sets FreeType's current size; false for a size FreeType refuses (callers check ranges first).
	bool SelectSize(int aSize26Dot6);
	LineMetrics GetLineMetrics(float aPixelSize) const;
	uint32_t GetGlyphIndex(char32_t aCodePoint) const;
	bool HasKerning() const;
	// The pair's kerning in pixels at the selected size; 0 where the face has none.
	float GetKerning(uint32_t aLeftGlyph, uint32_t aRightGlyph) const;

private:
	FreeTypeLibrary myLibrary;
	FT_Face myFace = nullptr;
	FontMatch myMatch;
	int mySelectedSize = 0;
};
} // namespace Glyphs
