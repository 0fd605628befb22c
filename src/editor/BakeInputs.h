#pragma once
// BakeInputs: the files a bake of a level depends on, and their content hashes, so that a
// bake record can tell later which of them changed.
//
//   std::vector<std::string> inputs = Lumora::CollectBakeInputs("sample_small");   // level loaded
//   std::map<std::string, std::string> hashes = Lumora::HashBakeInputs(inputs);
//   std::string key = Lumora::CombineInputHashes(hashes);   // one hash for all: a part's header
//
// Paths are spelled as the engine names them, relative to the working folder that holds
// data/; files are opened through Paths::Resolve, as the engine opens them. A hash is
// XXH3-128 written as 32 lowercase hex digits.
#include <map>
#include <string>
#include <vector>

namespace Lumora
{
// The hash of a file that cannot be read.
inline constexpr const char* ourMissingHash = "missing";

// The level's five files, both catalogues, the post-processing settings (SSAO, bloom, the
// colour-grading lookup), the effects the probe captures draw with and the files they
// include, and every model and texture the engine has loaded: sorted, each once. Without an
// engine the models and textures are left out.
std::vector<std::string> CollectBakeInputs(const std::string& aLevel);

// Each file's content hash; ourMissingHash for one that cannot be read.
std::map<std::string, std::string> HashBakeInputs(const std::vector<std::string>& somePaths);
std::string HashBakeInput(const std::string& aPath);

// One hash over the (path, hash) pairs in path order: equal exactly when the inputs are.
std::string CombineInputHashes(const std::map<std::string, std::string>& someHashes);

// Whether the text is a hash as HashBakeInput writes it (32 lowercase hex digits).
bool IsInputHash(const std::string& aText);
} // namespace Lumora
