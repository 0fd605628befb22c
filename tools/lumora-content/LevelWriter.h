#pragma once
// LevelWriter: writes a level's five XML files and the two catalogues through the editor's own XML
// cursor and element builder (src/xml), the way the editor's savers write them: records built from
// the leaves up, appended under a "root" element, the document printed by TinyXML, floats with six
// significant digits. A file that the editor loads and saves back is therefore the same bytes, and
// after an edit it differs only in the records that changed.
//
//   std::string error;
//   if (!Content::WriteLevel("data/XML/levels/sample_small/", level, error)) { print(error); }
//
// Each file is written to a temporary beside it and renamed over it, so a failed run leaves the old
// file as it was.

#include <array>
#include <string>

#include "LevelDescription.h"

namespace Content
{
// "rooms.xml", "entities.xml", "lights.xml", "nodegraph.xml", "decals.xml", in the order written.
constexpr std::array<const char*, 5> ourLevelFileNames = {"rooms.xml", "entities.xml", "lights.xml",
                                                          "nodegraph.xml", "decals.xml"};

// aDirectory ends with '/'; missing directories are created.
bool WriteLevel(const std::string& aDirectory, const LevelDescription& aLevel, std::string& anErrorOut);
bool WriteEntityTypes(const std::string& aPath, std::string& anErrorOut);
bool WriteDecalTypes(const std::string& aPath, std::string& anErrorOut);
} // namespace Content
