#include "platform/text/FontWrapper.h"

#include "platform/gpu/Report.h"

namespace Glyphs
{
FontWrapper::~FontWrapper()
{
	Destroy();
}

bool FontWrapper::Init(Gpu::Context& aContext, const FreeTypeLibrary& aLibrary,
                       const std::string& aFamilyName)
{
	Destroy();
	FontMatch match;
	if (!FontFace::Resolve(aFamilyName, match) || !myFace.Init(aLibrary, match))
	{
		return false;
	}
	if (!myRenderer.Init(aContext))
	{
		myFace.Destroy();
		return false;
	}
	myAtlas.Init(myFace, aFamilyName + " glyphs");
	myContext = &aContext;
	return true;
}

void FontWrapper::Destroy()
{
	myRenderer.Destroy();
	myAtlas.Destroy();
	myFace.Destroy();
	myContext = nullptr;
}

bool FontWrapper::DrawString(std::wstring_view aText, float aPixelSize, float anX, float aY, uint32_t aColor,
                             uint32_t someFlags)
{
	return DrawString(aText, aPixelSize, RectF{anX, aY, anX, aY}, aColor, someFlags | DrawFlags::NoWordWrap);
}

bool FontWrapper::DrawString(std::wstring_view aText, float aPixelSize, const RectF& aLayoutRect,
                             uint32_t aColor, uint32_t someFlags)
{
	if (myContext == nullptr)
	{
		Gpu::ReportError(__LINE__, "Glyphs::FontWrapper::DrawString", "The font is not initialised");
		return false;
	}
	if (!myLayout.Build(myFace, myAtlas, aText, aPixelSize, aLayoutRect, someFlags))
	{
		return false;
	}
	const bool clipFlag = (someFlags & DrawFlags::ClipRect) != 0;
	return myRenderer.Draw(*myContext, myAtlas, myLayout, aColor, someFlags,
	                       clipFlag ? &aLayoutRect : nullptr);
}

RectF FontWrapper::MeasureString(std::wstring_view aText, float aPixelSize, const RectF& aLayoutRect,
                                 uint32_t someFlags)
{
	if (myContext == nullptr)
	{
		Gpu::ReportError(__LINE__, "Glyphs::FontWrapper::MeasureString", "The font is not initialised");
		return RectF{aLayoutRect.myLeft, aLayoutRect.myTop, aLayoutRect.myLeft, aLayoutRect.myTop};
	}
	myLayout.Build(myFace, myAtlas, aText, aPixelSize, aLayoutRect, someFlags);
	return myLayout.GetBounds();
}
} // namespace Glyphs
