#include "renderer/MaterialDefaults.h"

#include <cstdint>

#include "engine/Effect.h"
#include "engine/Engine.h"

namespace Zeph
{
namespace
{
std::unique_ptr<Gpu::Texture> CreatePixel(Dds::Format aFormat, const uint8_t (&aColor)[4], const char* aLabel)
{
	Gpu::TextureDesc desc;
	desc.myFormat = aFormat;
	desc.myLabel = aLabel;
	auto texture = std::make_unique<Gpu::Texture>();
	if (!texture->Init(Engine::GetInstance()->GetContext(), desc) || !texture->Upload(0, 0, aColor, 4))
	{
		return nullptr;
	}
	return texture;
}
} // namespace

bool MaterialDefaults::Init()
{
	if (Engine::GetInstance() == nullptr)
	{
		return false;
	}
	myWhite = CreatePixel(Dds::Format::R8G8B8A8_UNORM, {255, 255, 255, 255}, "default white");
	myFlatNormal = CreatePixel(Dds::Format::R8G8B8A8_UNORM, {128, 128, 255, 255}, "default normal");
	myBlack = CreatePixel(Dds::Format::R8G8B8A8_UNORM, {0, 0, 0, 255}, "default black");
	return myWhite && myFlatNormal && myBlack;
}

void MaterialDefaults::Destroy()
{
	for (std::unique_ptr<Gpu::Texture>* texture : {&myWhite, &myFlatNormal, &myBlack})
	{
		if (*texture)
		{
			(*texture)->Destroy();
			texture->reset();
		}
	}
}

void MaterialDefaults::Apply(Effect& anEffect) const
{
	if (!myWhite || !myFlatNormal || !myBlack)
	{
		return;
	}
	Gpu::ShaderResourceView* white = myWhite->GetDefaultShaderResourceView();
	anEffect.SetShaderResource("DiffuseTexture", white);
	anEffect.SetShaderResource("NormalTexture", myFlatNormal->GetDefaultShaderResourceView());
	anEffect.SetShaderResource("RoughnessTexture", white);
	anEffect.SetShaderResource("AOTexture", white);
	anEffect.SetShaderResource("SubstanceTexture", myBlack->GetDefaultShaderResourceView());
}
} // namespace Zeph
