#include "platform/text/TextLayout.h"

#include <algorithm>
#include <cmath>
#include <limits>

#include "platform/gpu/Report.h"

namespace Glyphs
{
namespace
{
bool IsSpace(char32_t aCodePoint)
{
	return aCodePoint == U' ' || aCodePoint == U'\t';
}

// Far beyond any target, positions are held where the int conversion stays defined.
int RoundToPixel(float aValue)
{
	constexpr float limit = 1.0e8f;
	if (std::isnan(aValue))
	{
		return 0;
	}
	return static_cast<int>(std::clamp(std::floor(aValue + 0.5f), -limit, limit));
}
} // namespace

bool TextLayout::Build(FontFace& aFace, GlyphAtlas& anAtlas, std::wstring_view aText, float aPixelSize,
                       const RectF& aRect, uint32_t someFlags)
{
	myGlyphs.clear();
	myBounds = RectF{aRect.myLeft, aRect.myTop, aRect.myLeft, aRect.myTop};
	myLineCount = 0;
	myLineHeight = 0.0f;
	if (!GlyphAtlas::IsValidSize(aPixelSize))
	{
		Gpu::ReportError(__LINE__, "Glyphs::TextLayout::Build", "Font size %g is outside %g..%g pixels",
		                 static_cast<double>(aPixelSize), static_cast<double>(GlyphAtlas::ourMinPixelSize),
		                 static_cast<double>(GlyphAtlas::ourMaxPixelSize));
		return false;
	}
	const bool wrapFlag = (someFlags & DrawFlags::NoWordWrap) == 0 && aRect.GetWidth() > 0.0f;
	const float wrapWidth = wrapFlag ? aRect.GetWidth() : std::numeric_limits<float>::infinity();
	std::vector<Line> lines;
	BreakLines(aFace, anAtlas, aText, aPixelSize, wrapWidth, lines);

	const LineMetrics metrics = aFace.GetLineMetrics(aPixelSize);
	myLineHeight = metrics.myLineHeight;
	myLineCount = static_cast<int>(lines.size());
	const float blockHeight = myLineHeight * static_cast<float>(lines.size());
	float top = aRect.myTop;
	if ((someFlags & DrawFlags::Bottom) != 0)
	{
		top = aRect.myBottom - blockHeight;
	}
	else if ((someFlags & DrawFlags::VCenter) != 0)
	{
		top = aRect.myTop + (aRect.GetHeight() - blockHeight) * 0.5f;
	}
	float left = std::numeric_limits<float>::infinity();
	float right = -std::numeric_limits<float>::infinity();
	for (size_t index = 0; index < lines.size(); ++index)
	{
		const Line& line = lines[index];
		float start = aRect.myLeft;
		if ((someFlags & DrawFlags::Right) != 0)
		{
			start = aRect.myRight - line.myWidth;
		}
		else if ((someFlags & DrawFlags::Center) != 0)
		{
			start = aRect.myLeft + (aRect.GetWidth() - line.myWidth) * 0.5f;
		}
		const int lineX = RoundToPixel(start);
		const int baseline = RoundToPixel(top + myLineHeight * static_cast<float>(index) + metrics.myAscent);
		left = std::min(left, static_cast<float>(lineX));
		right = std::max(right, static_cast<float>(lineX) + line.myWidth);
		for (const Item& item : line.myItems)
		{
			if (item.myGlyph == nullptr || item.myGlyph->myWidth == 0 || item.myGlyph->myHeight == 0)
			{
				continue;
			}
			myGlyphs.push_back({item.myGlyph, lineX + RoundToPixel(item.myPen) + item.myGlyph->myBearingX,
			                    baseline - item.myGlyph->myBearingY});
		}
	}
	myBounds = RectF{left, top, right, top + blockHeight};
	return true;
}

void TextLayout::BreakLines(FontFace& aFace, GlyphAtlas& anAtlas, std::wstring_view aText, float aPixelSize,
                            float aWrapWidth, std::vector<Line>& someLines)
{
	static_assert(sizeof(wchar_t) == 4, "wide strings hold UTF-32 code points");
	size_t paragraphStart = 0;
	while (paragraphStart <= aText.size())
	{
		size_t paragraphEnd = aText.find(L'\n', paragraphStart);
		if (paragraphEnd == std::wstring_view::npos)
		{
			paragraphEnd = aText.size();
		}
		// The paragraph's glyphs with pens from its start, kerned pair by pair.
		std::vector<Item> items;
		float pen = 0.0f;
		uint32_t previous = 0;
		for (size_t at = paragraphStart; at < paragraphEnd; ++at)
		{
			const char32_t codePoint = static_cast<char32_t>(aText[at]);
			if (codePoint == U'\r')
			{
				continue;
			}
			const uint32_t index = aFace.GetGlyphIndex(codePoint);
			const Glyph* glyph = anAtlas.GetGlyph(index, aPixelSize);
			if (previous != 0 && index != 0)
			{
				// The atlas selected this size on the face while rendering or earlier.
				aFace.SelectSize(static_cast<int>(std::lround(aPixelSize * 64.0f)));
				pen += aFace.GetKerning(previous, index);
			}
			items.push_back({glyph, codePoint, pen});
			pen += glyph != nullptr ? glyph->myAdvance : 0.0f;
			previous = index;
		}
		auto end = [&](size_t anIndex) {
			return items[anIndex].myPen +
			       (items[anIndex].myGlyph != nullptr ? items[anIndex].myGlyph->myAdvance : 0.0f);
		};
		// Greedy breaking: a line takes items until one that is not a space ends past the width.
		size_t start = 0;
		do
		{
			const float base = start < items.size() ? items[start].myPen : 0.0f;
			size_t stop = items.size(); // one past the line's last item
			size_t next = items.size();
			for (size_t at = start; at < items.size(); ++at)
			{
				if (at == start || IsSpace(items[at].myCodePoint) || end(at) - base <= aWrapWidth)
				{
					continue;
				}
				size_t space = at;
				while (space > start && !IsSpace(items[space - 1].myCodePoint))
				{
					--space;
				}
				const bool wordBreakFlag =
				    space > start &&
				    std::any_of(items.begin() + static_cast<long>(start),
				                items.begin() + static_cast<long>(space),
				                [](const Item& anItem) { return !IsSpace(anItem.myCodePoint); });
				stop = wordBreakFlag ? space : at;
				next = stop;
				while (next < items.size() && IsSpace(items[next].myCodePoint))
				{
					++next;
				}
				break;
			}
			Line& line = someLines.emplace_back();
			for (size_t at = start; at < stop; ++at)
			{
				Item item = items[at];
				item.myPen -= base;
				line.myItems.push_back(item);
			}
			size_t last = stop;
			while (last > start && IsSpace(items[last - 1].myCodePoint))
			{
				--last;
			}
			line.myWidth = last > start ? end(last - 1) - base : 0.0f;
			start = next;
		} while (start < items.size());
		paragraphStart = paragraphEnd + 1;
	}
}
} // namespace Glyphs
