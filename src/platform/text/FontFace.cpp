#include "platform/text/FontFace.h"

#include <fontconfig/fontconfig.h>

#include "platform/gpu/Report.h"

namespace Glyphs
{
namespace
{
std::string PatternString(FcPattern* aPattern, const char* anObject)
{
	FcChar8* value = nullptr;
	if (FcPatternGetString(aPattern, anObject, 0, &value) != FcResultMatch || value == nullptr)
	{
		return {};
	}
	return reinterpret_cast<const char*>(value);
}

// fontconfig's configuration, loaded on first use and released at exit: the library's
// implicit default configuration is never freed, which leak checkers report.
class FontConfig
{
public:
	FontConfig() : myConfig(FcInitLoadConfigAndFonts()) {}
	~FontConfig()
	{
		if (myConfig != nullptr)
		{
			FcConfigDestroy(myConfig);
		}
	}
	FontConfig(const FontConfig&) = delete;
	FontConfig& operator=(const FontConfig&) = delete;

	FcConfig* Get() const { return myConfig; }

private:
	FcConfig* myConfig;
};

FcConfig* GetFontConfig()
{
	static FontConfig ourConfig;
	return ourConfig.Get();
}
} // namespace

bool FontFace::HasFontConfig()
{
	return GetFontConfig() != nullptr;
}

FontFace::~FontFace()
{
	Destroy();
}

bool FontFace::Resolve(const std::string& aFamilyName, FontMatch& aMatchOut)
{
	const char* function = "Glyphs::FontFace::Resolve";
	aMatchOut = FontMatch();
	aMatchOut.myRequestedFamily = aFamilyName;
	if (aFamilyName.empty())
	{
		Gpu::ReportError(__LINE__, function, "No font family named");
		return false;
	}
	FcConfig* config = GetFontConfig();
	if (config == nullptr)
	{
		Gpu::ReportError(__LINE__, function, "fontconfig did not start; no font for '%s'",
		                 aFamilyName.c_str());
		return false;
	}
	FcPattern* pattern = FcPatternCreate();
	if (pattern == nullptr)
	{
		Gpu::ReportError(__LINE__, function, "fontconfig could not make a pattern for '%s'",
		                 aFamilyName.c_str());
		return false;
	}
	FcPatternAddString(pattern, FC_FAMILY, reinterpret_cast<const FcChar8*>(aFamilyName.c_str()));
	FcPatternAddBool(pattern, FC_SCALABLE, FcTrue);
	FcConfigSubstitute(config, pattern, FcMatchPattern);
	FcDefaultSubstitute(pattern);
	FcResult result = FcResultNoMatch;
	FcPattern* match = FcFontMatch(config, pattern, &result);
	FcPatternDestroy(pattern);
	if (match == nullptr)
	{
		Gpu::ReportError(__LINE__, function, "fontconfig found no font for the family '%s'",
		                 aFamilyName.c_str());
		return false;
	}
	aMatchOut.myFile = PatternString(match, FC_FILE);
	aMatchOut.myFamily = PatternString(match, FC_FAMILY);
	aMatchOut.myStyle = PatternString(match, FC_STYLE);
	int index = 0;
	if (FcPatternGetInteger(match, FC_INDEX, 0, &index) == FcResultMatch)
	{
		aMatchOut.myFaceIndex = index;
	}
	FcPatternDestroy(match);
	if (aMatchOut.myFile.empty())
	{
		Gpu::ReportError(__LINE__, function, "fontconfig's match for the family '%s' names no file",
		                 aFamilyName.c_str());
		return false;
	}
	return true;
}

bool FontFace::Init(const FreeTypeLibrary& aLibrary, const FontMatch& aMatch)
{
	const char* function = "Glyphs::FontFace::Init";
	Destroy();
	if (!aLibrary)
	{
		Gpu::ReportError(__LINE__, function, "No FreeType instance to open '%s' with", aMatch.myFile.c_str());
		return false;
	}
	FT_Face face = nullptr;
	const FT_Error error = FT_New_Face(aLibrary.get(), aMatch.myFile.c_str(), aMatch.myFaceIndex, &face);
	if (error != 0)
	{
		Gpu::ReportError(__LINE__, function, "FreeType cannot open '%s' (face %d) for the family '%s': %s",
		                 aMatch.myFile.c_str(), aMatch.myFaceIndex, aMatch.myRequestedFamily.c_str(),
		                 FT_Error_String(error) != nullptr ? FT_Error_String(error) : "error");
		return false;
	}
	if (!FT_IS_SCALABLE(face) || face->units_per_EM == 0)
	{
		Gpu::ReportError(__LINE__, function, "'%s' is not a scalable font", aMatch.myFile.c_str());
		FT_Done_Face(face);
		return false;
	}
	myLibrary = aLibrary;
	myFace = face;
	myMatch = aMatch;
	mySelectedSize = 0;
	return true;
}

void FontFace::Destroy()
{
	if (myFace != nullptr)
	{
		FT_Done_Face(myFace);
		myFace = nullptr;
	}
	// The FreeType instance goes once its factory and all its faces are gone.
	myLibrary.reset();
	mySelectedSize = 0;
}

bool FontFace::SelectSize(int aSize26Dot6)
{
	if (myFace == nullptr || aSize26Dot6 <= 0)
	{
		return false;
	}
	if (aSize26Dot6 == mySelectedSize)
	{
		return true;
	}
	// 72 dots per inch: one point is one pixel, so the size is the em in pixels.
	if (FT_Set_Char_Size(myFace, 0, aSize26Dot6, 72, 72) != 0)
	{
		mySelectedSize = 0;
		return false;
	}
	mySelectedSize = aSize26Dot6;
	return true;
}

LineMetrics FontFace::GetLineMetrics(float aPixelSize) const
{
	LineMetrics metrics;
	if (myFace == nullptr)
	{
		return metrics;
	}
	// The design metrics scaled without hinting, so a line's height does not jump between sizes.
	const float scale = aPixelSize / static_cast<float>(myFace->units_per_EM);
	metrics.myAscent = static_cast<float>(myFace->ascender) * scale;
	metrics.myDescent = -static_cast<float>(myFace->descender) * scale;
	metrics.myLineHeight = static_cast<float>(myFace->height) * scale;
	if (metrics.myLineHeight < metrics.myAscent + metrics.myDescent)
	{
		metrics.myLineHeight = metrics.myAscent + metrics.myDescent;
	}
	return metrics;
}

uint32_t FontFace::GetGlyphIndex(char32_t aCodePoint) const
{
	return myFace != nullptr ? FT_Get_Char_Index(myFace, aCodePoint) : 0;
}

bool FontFace::HasKerning() const
{
	return myFace != nullptr && FT_HAS_KERNING(myFace);
}

float FontFace::GetKerning(uint32_t aLeftGlyph, uint32_t aRightGlyph) const
{
	if (!HasKerning() || mySelectedSize == 0)
	{
		return 0.0f;
	}
	FT_Vector delta{0, 0};
	if (FT_Get_Kerning(myFace, aLeftGlyph, aRightGlyph, FT_KERNING_DEFAULT, &delta) != 0)
	{
		return 0.0f;
	}
	return static_cast<float>(delta.x) / 64.0f;
}
} // namespace Glyphs
