#include "editor/StringConversion.h"

#include <cstdint>

namespace Lumora
{
namespace
{
void AppendUtf8(std::string& aText, char32_t aCodePoint)
{
	if (aCodePoint < 0x80)
	{
		aText += static_cast<char>(aCodePoint);
	}
	else if (aCodePoint < 0x800)
	{
		aText += static_cast<char>(0xC0 | (aCodePoint >> 6));
		aText += static_cast<char>(0x80 | (aCodePoint & 0x3F));
	}
	else if (aCodePoint < 0x10000)
	{
		aText += static_cast<char>(0xE0 | (aCodePoint >> 12));
		aText += static_cast<char>(0x80 | ((aCodePoint >> 6) & 0x3F));
		aText += static_cast<char>(0x80 | (aCodePoint & 0x3F));
	}
	else
	{
		aText += static_cast<char>(0xF0 | (aCodePoint >> 18));
		aText += static_cast<char>(0x80 | ((aCodePoint >> 12) & 0x3F));
		aText += static_cast<char>(0x80 | ((aCodePoint >> 6) & 0x3F));
		aText += static_cast<char>(0x80 | (aCodePoint & 0x3F));
	}
}

void AppendUtf16(std::u16string& aText, char32_t aCodePoint)
{
	if (aCodePoint < 0x10000)
	{
		aText += static_cast<char16_t>(aCodePoint);
	}
	else
	{
		const char32_t offset = aCodePoint - 0x10000;
		aText += static_cast<char16_t>(0xD800 + (offset >> 10));
		aText += static_cast<char16_t>(0xDC00 + (offset & 0x3FF));
	}
}

bool IsHighSurrogate(char16_t aUnit)
{
	return aUnit >= 0xD800 && aUnit <= 0xDBFF;
}

bool IsLowSurrogate(char16_t aUnit)
{
	return aUnit >= 0xDC00 && aUnit <= 0xDFFF;
}
} // namespace

std::string ToNarrow(const std::u16string& aString)
{
	std::string text;
	text.reserve(aString.size());
	for (size_t index = 0; index < aString.size(); ++index)
	{
		const char16_t unit = aString[index];
		if (IsHighSurrogate(unit) && index + 1 < aString.size() && IsLowSurrogate(aString[index + 1]))
		{
			const char32_t codePoint = 0x10000 + ((static_cast<char32_t>(unit) - 0xD800) << 10) +
			                           (static_cast<char32_t>(aString[index + 1]) - 0xDC00);
			AppendUtf8(text, codePoint);
			++index;
		}
		else if (IsHighSurrogate(unit) || IsLowSurrogate(unit))
		{
			text += '?';
		}
		else
		{
			AppendUtf8(text, unit);
		}
	}
	return text;
}

std::u16string ToWide(const std::string& aString)
{
	constexpr char32_t replacement = 0xFFFD;
	std::u16string text;
	text.reserve(aString.size());
	size_t index = 0;
	while (index < aString.size())
	{
		const auto lead = static_cast<uint8_t>(aString[index]);
		int length = 0;
		char32_t codePoint = 0;
		if (lead < 0x80)
		{
			length = 1;
			codePoint = lead;
		}
		else if ((lead & 0xE0) == 0xC0)
		{
			length = 2;
			codePoint = lead & 0x1F;
		}
		else if ((lead & 0xF0) == 0xE0)
		{
			length = 3;
			codePoint = lead & 0x0F;
		}
		else if ((lead & 0xF8) == 0xF0)
		{
			length = 4;
			codePoint = lead & 0x07;
		}
		bool valid = length > 0 && index + static_cast<size_t>(length) <= aString.size();
		for (int next = 1; valid && next < length; ++next)
		{
			const auto unit = static_cast<uint8_t>(aString[index + static_cast<size_t>(next)]);
			valid = (unit & 0xC0) == 0x80;
			codePoint = (codePoint << 6) | (unit & 0x3F);
		}
		// Overlong forms, surrogates and values past U+10FFFF are not characters.
		static constexpr char32_t smallest[5] = {0, 0, 0x80, 0x800, 0x10000};
		valid = valid && codePoint >= smallest[length] && codePoint <= 0x10FFFF &&
		        !(codePoint >= 0xD800 && codePoint <= 0xDFFF);
		if (!valid)
		{
			AppendUtf16(text, replacement);
			++index;
			continue;
		}
		AppendUtf16(text, codePoint);
		index += static_cast<size_t>(length);
	}
	return text;
}

std::string LowBytes(const std::u16string& aString)
{
	std::string text;
	text.reserve(aString.size());
	for (const char16_t unit : aString)
	{
		text += static_cast<char>(unit & 0xFF);
	}
	return text;
}
} // namespace Lumora
