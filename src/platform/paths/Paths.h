#pragma once
// Paths: the file layer's view of relative paths on a case-sensitive file system.
//
// The engine spells its paths several ways (data/Shaders/..., data/shaders/misc/...,
// Data/Shaders/Misc/...). Resolve() matches each component case-insensitively
// against what exists, so every spelling finds the one data/ tree:
//
//   std::ifstream in(Paths::Resolve("data/shaders/misc/x.fx"));   // opens data/Shaders/Misc/x.fx
//
// Writers call PrepareForWrite(), which resolves what exists and creates the
// missing directories, and write whole files through a temporary:
//
//   std::string target = Paths::PrepareForWrite("data/Cubemaps/level/1.dds");
//   std::string temp = Paths::TemporaryFor(target);
//   ... write temp ...
//   if (!Paths::ReplaceWith(temp, target)) { /* old file untouched, temp removed */ }

#include <string>

namespace Paths
{
// The path with every component that exists spelled as on disk. An exact match
// wins over a case-insensitive one; components past the first missing one are
// kept as given. Absolute paths are resolved the same way below "/".
std::string Resolve(const std::string& aPath);

// Resolve(), then create the missing parent directories of the file. Returns the
// path to write to; an empty string when a directory could not be created.
std::string PrepareForWrite(const std::string& aPath);

// A unique name for a temporary file in the same directory as aFinalPath, created
// empty: "." + file name + "." + process id + "." + 6 characters + ".tmp". Temporaries
// of the same file left by a writer that was killed (whose process is gone) are
// removed first.
std::string TemporaryFor(const std::string& aFinalPath);

// Flushes aTemporary to disk and renames it over aFinalPath. On failure the
// temporary is removed, aFinalPath is left as it was and false is returned.
bool ReplaceWith(const std::string& aTemporary, const std::string& aFinalPath);

// Removes a temporary that will not be renamed into place (a write that failed or was
// cancelled); an empty name or a file already gone is no error.
void Discard(const std::string& aTemporary);
} // namespace Paths
