#pragma once
// Strings across the front-end boundary: the front end's strings are UTF-16
// (std::u16string); the engine's are narrow, and narrow means UTF-8 here.
//
//   ToNarrow(u"Level1")  -> "Level1"       ToWide("Level1") -> u"Level1"
//
// ToNarrow writes an unpaired surrogate (which no encoding can represent) as '?', as a
// code-page conversion writes its default character. ToWide reads malformed UTF-8
// bytes as U+FFFD. LowBytes keeps the low 8 bits of each character, the conversion the
// decal type change uses on its argument.
#include <string>

namespace Lumora
{
std::string ToNarrow(const std::u16string& aString);
std::u16string ToWide(const std::string& aString);
std::string LowBytes(const std::u16string& aString);
} // namespace Lumora
