#include "model/Surface.h"

#include "engine/Effect.h"
#include "engine/Engine.h"
#include "engine/EngineReport.h"
#include "engine/TextureContainer.h"
#include "platform/fx/Effect.h"
#include "platform/fx/Variable.h"

namespace Zeph
{
namespace
{
// Art paths are absolute paths of the artist's machine; the engine reads them
// relative to its working directory, from the "data" folder on.
std::string PathFromData(const std::string& aPath)
{
	if (aPath.size() < 5)
	{
		return aPath;
	}
	for (size_t start = 0; start + 5 <= aPath.size(); ++start)
	{
		if (aPath.compare(start, 4, "data") == 0)
		{
			return aPath.substr(start);
		}
	}
	return aPath;
}
} // namespace

bool Surface::SetTexture(const std::string& aPath, const std::string& aVariableName, bool aSRGBFlag)
{
	const std::string path = PathFromData(aPath);
	Engine* engine = Engine::GetInstance();
	Texture* texture =
	    engine != nullptr ? engine->GetTextureContainer().GetTexture(path, aSRGBFlag) : nullptr;
	if (texture == nullptr)
	{
		ReportCritical(__LINE__, "Zeph::Surface::SetTexture", "Invalid Texture: %s", path.c_str());
		return false;
	}
	Fx::Variable* variable = nullptr;
	if (myEffect != nullptr && myEffect->GetEffect() != nullptr)
	{
		variable = myEffect->GetEffect()->GetVariableByName(aVariableName.c_str());
	}
	if (variable == nullptr || !variable->IsValid())
	{
		ReportCritical(__LINE__, "Zeph::Surface::SetTexture", "Shader Resource Not Found: %s",
		               aVariableName.c_str());
		return false;
	}
	myFileNames.push_back(path);
	myShaderResourceNames.push_back(aVariableName);
	mySRGBFlags.push_back(aSRGBFlag);
	myTextures.push_back(texture);
	myShaderResources.push_back(variable);
	return true;
}

void Surface::ActivateTextures() const
{
	for (size_t index = 0; index < myTextures.size(); ++index)
	{
		myShaderResources[index]->SetResource(myTextures[index]->GetShaderResourceView());
	}
}
} // namespace Zeph
