#include "platform/text/Factory.h"

#include "platform/gpu/Report.h"
#include "platform/text/FontWrapper.h"

namespace Glyphs
{
bool Factory::Init()
{
	const char* function = "Glyphs::Factory::Init";
	myLibrary.reset();
	FT_Library library = nullptr;
	const FT_Error error = FT_Init_FreeType(&library);
	if (error != 0)
	{
		Gpu::ReportError(__LINE__, function, "FreeType did not start: %s",
		                 FT_Error_String(error) != nullptr ? FT_Error_String(error) : "error");
		return false;
	}
	myLibrary = FreeTypeLibrary(library, [](FT_Library aLibrary) { FT_Done_FreeType(aLibrary); });
	if (!FontFace::HasFontConfig())
	{
		Gpu::ReportError(__LINE__, function, "fontconfig did not start: no font families can be found");
		myLibrary.reset();
		return false;
	}
	return true;
}

std::unique_ptr<FontWrapper> Factory::CreateFontWrapper(Gpu::Context& aContext,
                                                        const std::string& aFamilyName) const
{
	if (!myLibrary)
	{
		Gpu::ReportError(__LINE__, "Glyphs::Factory::CreateFontWrapper", "The factory is not initialised");
		return nullptr;
	}
	auto wrapper = std::make_unique<FontWrapper>();
	if (!wrapper->Init(aContext, myLibrary, aFamilyName))
	{
		return nullptr;
	}
	return wrapper;
}
} // namespace Glyphs
