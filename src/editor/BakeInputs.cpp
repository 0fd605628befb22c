#include "editor/BakeInputs.h"

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <system_error>
#include <xxhash.h>

#include "engine/Engine.h"
#include "engine/ShaderFiles.h"
#include "model/ModelFactory.h"
#include "platform/fx/EffectSource.h"
#include "platform/paths/Paths.h"
#include "renderer/post/ColorGradingManager.h"

namespace Lumora
{
namespace
{
constexpr const char* ourLevelFiles[] = {"rooms.xml", "entities.xml", "lights.xml", "nodegraph.xml",
                                         "decals.xml"};
// The catalogues, and the settings files the renderer reads at Init (Renderer.cpp) and the
// grading lookup: a bake renders through the same post chain.
constexpr const char* ourSharedFiles[] = {"data/XML/EntityTypes.xml", "data/XML/DecalTypes.xml",
                                          "data/Shaders/SSAO.xml", "data/Shaders/HDRBloom.xml",
                                          Zeph::ColorGradingManager::ourLookupFile};
// The effects the probe captures draw with (the G-buffer, both light passes, the ambient pass
// and the reflection filter): a changed shader changes what a bake makes.
constexpr Zeph::EffectType ourBakeEffects[] = {Zeph::EFFECT_LIT_MODEL, Zeph::EFFECT_FULL_SCREEN,
                                               Zeph::EFFECT_DEFERRED_POINT_LIGHT,
                                               Zeph::EFFECT_DEFERRED_SPOT_LIGHT};

std::string Hex(const XXH128_hash_t& aHash)
{
	XXH128_canonical_t canonical;
	XXH128_canonicalFromHash(&canonical, aHash);
	static const char ourDigits[] = "0123456789abcdef";
	std::string text;
	text.reserve(2 * sizeof(canonical.digest));
	for (const unsigned char byte : canonical.digest)
	{
		text += ourDigits[byte >> 4];
		text += ourDigits[byte & 0xF];
	}
	return text;
}

// The streaming state, released however the hashing ends.
struct HashState
{
	HashState() : myState(XXH3_createState()) {}
	~HashState() { XXH3_freeState(myState); }
	HashState(const HashState&) = delete;
	HashState& operator=(const HashState&) = delete;

	XXH3_state_t* myState;
};
} // namespace

std::vector<std::string> CollectBakeInputs(const std::string& aLevel)
{
	std::vector<std::string> inputs;
	for (const char* file : ourLevelFiles)
	{
		inputs.push_back("data/XML/levels/" + aLevel + "/" + file);
	}
	inputs.insert(inputs.end(), std::begin(ourSharedFiles), std::end(ourSharedFiles));
	for (const Zeph::EffectType effect : ourBakeEffects)
	{
		// Each effect with every file it includes, as the effect compiler finds them; one that
		// is missing or does not assemble is still named, so that its hash tells what became of it.
		Fx::EffectSource source;
		std::string errors;
		source.Load(Zeph::ShaderFiles[effect], errors);
		inputs.push_back(Zeph::ShaderFiles[effect]);
		inputs.insert(inputs.end(), source.GetFiles().begin(), source.GetFiles().end());
	}
	if (Zeph::Engine* engine = Zeph::Engine::GetInstance())
	{
		const std::vector<std::string> textures = engine->GetTextureContainer().GetFileNames();
		const std::vector<std::string> models = engine->GetModelFactory().GetFileNames();
		inputs.insert(inputs.end(), textures.begin(), textures.end());
		inputs.insert(inputs.end(), models.begin(), models.end());
	}
	std::sort(inputs.begin(), inputs.end());
	inputs.erase(std::unique(inputs.begin(), inputs.end()), inputs.end());
	return inputs;
}

std::string HashBakeInput(const std::string& aPath)
{
	const std::string resolved = Paths::Resolve(aPath);
	std::error_code ignored;
	if (!std::filesystem::is_regular_file(resolved, ignored))
	{
		return ourMissingHash;
	}
	std::ifstream in(resolved, std::ios::binary);
	HashState state;
	if (!in || state.myState == nullptr || XXH3_128bits_reset(state.myState) != XXH_OK)
	{
		return ourMissingHash;
	}
	char buffer[1 << 16];
	while (in.read(buffer, sizeof(buffer)) || in.gcount() > 0)
	{
		XXH3_128bits_update(state.myState, buffer, static_cast<size_t>(in.gcount()));
	}
	if (in.bad())
	{
		return ourMissingHash;
	}
	return Hex(XXH3_128bits_digest(state.myState));
}

std::map<std::string, std::string> HashBakeInputs(const std::vector<std::string>& somePaths)
{
	std::map<std::string, std::string> hashes;
	for (const std::string& path : somePaths)
	{
		if (!hashes.contains(path))
		{
			hashes.emplace(path, HashBakeInput(path));
		}
	}
	return hashes;
}

std::string CombineInputHashes(const std::map<std::string, std::string>& someHashes)
{
	// Each string with its terminating zero, so that no two lists run together alike.
	std::string bytes;
	for (const auto& [path, hash] : someHashes)
	{
		bytes.append(path.c_str(), path.size() + 1);
		bytes.append(hash.c_str(), hash.size() + 1);
	}
	return Hex(XXH3_128bits(bytes.data(), bytes.size()));
}

bool IsInputHash(const std::string& aText)
{
	return aText.size() == 32 && std::all_of(aText.begin(), aText.end(), [](char c) {
		       return (c >= '0' && c <= '9') || (c >= 'a' && c <= 'f');
	       });
}
} // namespace Lumora
