#include "engine/Texture.h"

#include "engine/Engine.h"
#include "engine/EngineReport.h"
#include "platform/dds/DdsFile.h"
#include "platform/gpu/TextureLoader.h"

namespace Zeph
{
Texture::Texture(int aWidth, int aHeight, Dds::Format aFormat)
{
	const char* function = "Zeph::Texture::Texture";
	myImageInfo.myWidth = static_cast<uint32_t>(aWidth > 0 ? aWidth : 0);
	myImageInfo.myHeight = static_cast<uint32_t>(aHeight > 0 ? aHeight : 0);
	Gpu::TextureDesc desc;
	desc.myWidth = aWidth;
	desc.myHeight = aHeight;
	desc.myMipLevels = 1;
	desc.myFormat = aFormat;
	desc.myLabel = "render target";
	auto texture = std::make_unique<Gpu::Texture>();
	if (!texture->Init(Engine::GetInstance()->GetContext(), desc))
	{
		ReportCritical(__LINE__, function, "Couldn't Create Texture2D");
		return;
	}
	myTexture = texture.get();
	myRenderTargetView = myTexture->CreateRenderTargetView();
	if (myRenderTargetView == nullptr)
	{
		ReportCritical(__LINE__, function, "Couldn't create RenderTarget");
		myTexture = nullptr;
		texture->Destroy();
		return;
	}
	Gpu::ShaderResourceDesc viewDesc;
	viewDesc.myDimension = Gpu::ViewDimension::Texture2D;
	viewDesc.myMipCount = 1;
	myShaderResourceView = myTexture->CreateShaderResourceView(viewDesc);
	if (myShaderResourceView == nullptr)
	{
		ReportCritical(__LINE__, function, "Coudln't Create ShaderResource");
		myRenderTargetView = nullptr;
		myTexture = nullptr;
		texture->Destroy();
		return;
	}
	myResource = std::move(texture);
	myTexture = nullptr;
}

Texture::~Texture()
{
	Release();
}

void Texture::Release()
{
	// The views belong to the GPU texture and go with it.
	myShaderResourceView = nullptr;
	myRenderTargetView = nullptr;
	myTexture = nullptr;
	if (myResource)
	{
		myResource->Destroy();
		myResource.reset();
	}
}

bool Texture::Load(const std::string& aFileName, bool aSRGBFlag)
{
	Release();
	// A missing or damaged file is the caller's to report (it knows what asked for
	// the file): nothing is logged here and nothing is kept.
	std::string error;
	Dds::ImageInfo info;
	if (!Dds::GetImageInfoFromFile(aFileName, info, error))
	{
		return false;
	}
	Dds::Image image;
	if (!Dds::LoadFromFile(aFileName, image, error))
	{
		return false;
	}
	std::unique_ptr<Gpu::Texture> loaded =
	    Gpu::CreateTextureFromImage(Engine::GetInstance()->GetContext(), image, aFileName);
	if (!loaded)
	{
		return false;
	}
	myImageInfo = info;
	myResource = std::move(loaded);
	myTexture = myResource.get();
	bool srgbFlag = aSRGBFlag;
	if (srgbFlag && myImageInfo.myResourceDimension == Dds::ResourceDimension::Texture2D)
	{
		srgbFlag = ConvertToSRGB();
	}
	const bool result = BindTextureToView(srgbFlag);
	myTexture = nullptr;
	if (!result)
	{
		Release();
		return false;
	}
	myFileName = aFileName;
	return true;
}

bool Texture::ConvertToSRGB()
{
	// The loaded texture's format admits no sRGB view; a copy in the typeless form of
	// its format admits both, as under Direct3D.
	Gpu::TextureDesc desc = myTexture->GetDesc();
	desc.myFormat = Dds::ToTypeless(desc.myFormat);
	auto copy = std::make_unique<Gpu::Texture>();
	Engine* engine = Engine::GetInstance();
	if (!copy->Init(engine->GetContext(), desc))
	{
		return false;
	}
	engine->AcquireSetupFlag();
	const bool copiedFlag = engine->GetContext().CopyResource(*copy, *myTexture);
	engine->ReleaseSetupFlag();
	if (!copiedFlag)
	{
		copy->Destroy();
		return false;
	}
	myResource->Destroy();
	myResource = std::move(copy);
	myTexture = myResource.get();
	return true;
}

bool Texture::BindTextureToView(bool aSRGBFlag)
{
	Gpu::ShaderResourceDesc desc;
	desc.myFormat = aSRGBFlag ? Dds::ToSRGB(myImageInfo.myFormat) : myImageInfo.myFormat;
	if (myImageInfo.myResourceDimension == Dds::ResourceDimension::Texture2D)
	{
		if (myImageInfo.IsCube())
		{
			desc.myDimension = Gpu::ViewDimension::TextureCube;
			desc.mySliceCount = 6;
		}
		else
		{
			desc.myDimension = Gpu::ViewDimension::Texture2D;
			desc.mySliceCount = 1;
		}
	}
	else
	{
		// Only 2D and cube files are expected here. The view is still made, over the
		// whole texture in its own dimension, so a volume file that arrives here works.
		ReportCritical(__LINE__, "Zeph::Texture::BindTextureToView", "INVALID TEXTURE FORMAT");
	}
	myShaderResourceView = myTexture->CreateShaderResourceView(desc);
	return myShaderResourceView != nullptr;
}
} // namespace Zeph
