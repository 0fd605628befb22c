// The two catalogues that every level draws on, read once when the scene is set up: the entity
// types (which model an entity of a type shows, and whether it casts shadows) and the decal
// types (the albedo and normal textures of each).
#include "editor/LumoraWrapper.h"

#include <string>

#include "engine/Debug.h"
#include "engine/Engine.h"
#include "engine/TextureContainer.h"
#include "xml/XML.h"

namespace Lumora
{
void LumoraWrapper::ParseEntities()
{
	XML xml("data/XML/EntityTypes.xml");
	if (!xml.GoToElement("entities", "", "") || !xml.EnterChild("entity"))
	{
		return;
	}
	do
	{
		const std::string id = xml.GetAttribute<std::string>("id");
		// Only the first component of an entity says what it looks like; types shown otherwise
		// than by a model are not placed by the editor.
		if (xml.EnterChild("visual-component"))
		{
			if (xml.GetAttribute<std::string>("type") == "model")
			{
				bool castShadowFlag = true;
				xml.TryGetAttribute<bool>(castShadowFlag, "cast-shadow");
				myEntityBank[id] = xml.GetAttribute<std::string>("filepath");
				myEntityShadowCasterBank[id] = castShadowFlag;
			}
			xml.ExitChild();
		}
	} while (xml.GoToNextSibling("entity"));
	xml.ExitChild();
}

void LumoraWrapper::ReloadCatalogues()
{
	ClaimAfterTheFrame();
	myEntityBank.clear();
	myEntityShadowCasterBank.clear();
	ParseEntities();
	ParseDecalTypes("data/XML/DecalTypes.xml");
	Release();
}

void LumoraWrapper::ParseDecalTypes(const std::string& aPath)
{
	static constexpr const char* ourFunction = "Lumora::LumoraWrapper::ParseDecalTypes";
	myDecalTypes.clear();
	Zeph::TextureContainer& textures = Zeph::Engine::GetInstance()->GetTextureContainer();
	Debug* log = Debug::GetInstance();

	XML xml(aPath);
	// The records stand directly under the root; the catalogue holds at least one, so the first
	// is read without a test and its absence ends in the cursor's report.
	xml.GoToElement("decal", "", "");
	do
	{
		const std::string id = xml.GetAttribute<std::string>("id");
		const std::string texturePath = xml.GetChildAttribute<std::string>("texture", "path");
		const std::string normalPath = xml.GetChildAttribute<std::string>("normal", "path");
		if (myDecalTypes.contains(id) && log != nullptr)
		{
			log->CriticalErrorMessage(267, ourFunction,
			                          "Tried to parse existing decal-type more than once: %s", id.c_str());
		}
		DecalType type;
		type.myTexture = textures.GetTexture(texturePath, true);
		type.myNormalTexture = textures.GetTexture(normalPath, false);
		if ((type.myTexture == nullptr || type.myNormalTexture == nullptr) && log != nullptr)
		{
			log->CriticalErrorMessage(275, ourFunction, "Incorrect decal texture/normal path");
		}
		// The first definition of a type stays.
		myDecalTypes.emplace(id, type);
	} while (xml.GoToNextSibling("decal"));
}
} // namespace Lumora
