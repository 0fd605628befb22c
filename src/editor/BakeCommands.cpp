// The facade's bake commands: the level's scene queued once as a frame would queue it
// (in light mode: entities, lights and decals, no node markers, no decal box), then the
// renderer's bake on the calling thread while the facade is held.
#include "editor/LumoraWrapper.h"

#include "engine/Engine.h"
#include "renderer/Renderer.h"

namespace Lumora
{
void LumoraWrapper::BakeAmbient(const std::u16string& aLevel, int aNumOfBounces, bool aSaveToDDSFlag)
{
	Claim();
	const LumoraMode mode = myMode;
	myMode = LIGHT_MODE;
	// The light gizmos are grown first, so the queued scene has one for every light
	// even when the lights were added or loaded in another mode.
	UpdateScene(0.0f);
	RenderScene();
	myMode = mode;
	const std::string path = "data/XML/levels/" + SysSTringToStdString(aLevel) + "/ambient.sh";
	Zeph::Renderer& renderer = Zeph::Engine::GetInstance()->GetRenderer();
	renderer.GenerateSH(myRooms, path, aNumOfBounces, aSaveToDDSFlag);
	// The queued scene's markers were never drawn; a later load may delete them.
	renderer.DiscardLateItems();
	Release();
}

void LumoraWrapper::BakeSpecular(const std::u16string& aLevel)
{
	Claim();
	const LumoraMode mode = myMode;
	myMode = LIGHT_MODE;
	UpdateScene(0.0f);
	RenderScene();
	myMode = mode;
	Zeph::Renderer& renderer = Zeph::Engine::GetInstance()->GetRenderer();
	renderer.GenerateReflections(myRooms, SysSTringToStdString(aLevel));
	renderer.DiscardLateItems();
	Release();
}

int LumoraWrapper::GetBakeProgress() const
{
	Zeph::Engine* engine = Zeph::Engine::GetInstance();
	return engine != nullptr ? engine->GetRenderer().GetBakingProgress() : 0;
}
} // namespace Lumora
