#pragma once
// Factory: starts the text system (FreeType and fontconfig) and makes font wrappers.
//
//   Glyphs::Factory factory;
//   if (!factory.Init()) { ... reported: no text system ... }
//   std::unique_ptr<Glyphs::FontWrapper> font = factory.CreateFontWrapper(context, "Arial");
//   factory.Destroy();            // the wrappers it made keep working
//
// The FreeType instance is shared: the factory and every face opened with it hold it,
// and it goes when the last of them does, so a factory may be dropped right after use.

#include <memory>
#include <string>

#include "platform/text/FontFace.h"

namespace Gpu
{
class Context;
}

namespace Glyphs
{
class FontWrapper;

class Factory
{
public:
	Factory() = default;
	~Factory() = default;
	Factory(const Factory&) = delete;
	Factory& operator=(const Factory&) = delete;

	// Reports and returns false when FreeType or fontconfig cannot start.
	bool Init();
	void Destroy() { myLibrary.reset(); }

	const FreeTypeLibrary& GetLibrary() const { return myLibrary; }
	// Null, reported, when the family cannot be resolved or opened, or its renderer not made.
	std::unique_ptr<FontWrapper> CreateFontWrapper(Gpu::Context& aContext,
	                                               const std::string& aFamilyName) const;

private:
	FreeTypeLibrary myLibrary;
};
} // namespace Glyphs
