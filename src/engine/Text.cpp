#include "engine/Text.h"

#include <cmath>

#include "engine/Engine.h"
#include "engine/Font.h"
#include "renderer/Renderer.h"

namespace Zeph
{
namespace
{
// UTF-8 to the code points of a wide string. Overlong forms, surrogates, values past
// U+10FFFF and broken sequences become '?' (one per bad byte), so any input draws.
std::wstring WideFromUtf8(const std::string& aText)
{
	std::wstring result;
	result.reserve(aText.size());
	size_t at = 0;
	while (at < aText.size())
	{
		const unsigned char lead = static_cast<unsigned char>(aText[at]);
		int length = 0;
		char32_t codePoint = 0;
		char32_t minimum = 0;
		if (lead < 0x80)
		{
			length = 1;
			codePoint = lead;
		}
		else if ((lead & 0xE0) == 0xC0)
		{
			length = 2;
			codePoint = lead & 0x1F;
			minimum = 0x80;
		}
		else if ((lead & 0xF0) == 0xE0)
		{
			length = 3;
			codePoint = lead & 0x0F;
			minimum = 0x800;
		}
		else if ((lead & 0xF8) == 0xF0)
		{
			length = 4;
			codePoint = lead & 0x07;
			minimum = 0x10000;
		}
		bool validFlag = length > 0 && at + static_cast<size_t>(length) <= aText.size();
		for (int index = 1; validFlag && index < length; ++index)
		{
			const unsigned char next = static_cast<unsigned char>(aText[at + static_cast<size_t>(index)]);
			validFlag = (next & 0xC0) == 0x80;
			codePoint = (codePoint << 6) | (next & 0x3F);
		}
		validFlag = validFlag && codePoint >= minimum && codePoint <= 0x10FFFF &&
		            (codePoint < 0xD800 || codePoint > 0xDFFF);
		if (!validFlag)
		{
			result.push_back(L'?');
			++at;
			continue;
		}
		result.push_back(static_cast<wchar_t>(codePoint));
		at += static_cast<size_t>(length);
	}
	return result;
}
} // namespace

Text::Text(Font* aFont) : myFont(aFont)
{
}

void Text::SetPosition(const Vector2<float>& aPosition)
{
	myPosition.x = std::ceil(aPosition.x);
	myPosition.y = std::ceil(aPosition.y);
}

void Text::SetText(const std::string& aText)
{
	myText = WideFromUtf8(aText);
}

void Text::Render(bool aNowFlag)
{
	if (!aNowFlag)
	{
		Engine::GetInstance()->GetRenderer().RenderLateText(this);
		return;
	}
	if (myFont == nullptr)
	{
		return;
	}
	if (myBoxSize.x == -1.0f && !myUseRect)
	{
		myFont->Render(myText, mySize, myPosition, myColor, myFlags);
		return;
	}
	const Vector4<float> rect = myUseRect
	                                ? myRect
	                                : Vector4<float>(myPosition.x, myPosition.y, myPosition.x + myBoxSize.x,
	                                                 myPosition.y + myBoxSize.y);
	myFont->Render(myText, mySize, rect, myColor, myFlags);
}
} // namespace Zeph
