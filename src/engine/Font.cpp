#include "engine/Font.h"

#include "engine/Engine.h"
#include "engine/EngineReport.h"
#include "platform/text/Factory.h"

namespace Zeph
{
Font::~Font()
{
	if (myFontWrapper)
	{
		myFontWrapper->Destroy();
	}
}

bool Font::LoadFont(const std::string& aFamilyName)
{
	const char* function = "Zeph::Font::LoadFont";
	Glyphs::Factory factory;
	if (!factory.Init())
	{
		ReportCritical(__LINE__, function, "Failed to create fontFactory");
		return false;
	}
	Engine* engine = Engine::GetInstance();
	if (engine != nullptr)
	{
		myFontWrapper = factory.CreateFontWrapper(engine->GetContext(), aFamilyName);
	}
	// The wrapper keeps what it needs of the factory; the factory itself goes now.
	factory.Destroy();
	if (!myFontWrapper)
	{
		ReportCritical(__LINE__, function, "Can't create Font");
		return false;
	}
	return true;
}

void Font::Render(const std::wstring& aText, float aSize, const Vector2<float>& aPosition, uint32_t aColor,
                  uint32_t someFlags)
{
	if (myFontWrapper)
	{
		myFontWrapper->DrawString(aText, aSize, aPosition.x, aPosition.y, aColor, someFlags);
	}
}

void Font::Render(const std::wstring& aText, float aSize, const Vector4<float>& aRect, uint32_t aColor,
                  uint32_t someFlags)
{
	if (myFontWrapper)
	{
		myFontWrapper->DrawString(aText, aSize, Glyphs::RectF{aRect.x, aRect.y, aRect.z, aRect.w}, aColor,
		                          someFlags);
	}
}
} // namespace Zeph
