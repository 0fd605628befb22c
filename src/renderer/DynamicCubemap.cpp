#include "renderer/DynamicCubemap.h"

#include <numbers>

#include "engine/Engine.h"
#include "engine/EngineReport.h"
#include "platform/gpu/TextureLoader.h"

namespace Zeph
{
namespace
{
const Vector3<float> ourFaceDirections[DynamicCubemap::ourFaceCount] = {
    {1.0f, 0.0f, 0.0f}, {-1.0f, 0.0f, 0.0f}, {0.0f, 1.0f, 0.0f},
    {0.0f, -1.0f, 0.0f}, {0.0f, 0.0f, 1.0f}, {0.0f, 0.0f, -1.0f}};
const Vector3<float> ourFaceUps[DynamicCubemap::ourFaceCount] = {
    {0.0f, 1.0f, 0.0f}, {0.0f, 1.0f, 0.0f}, {0.0f, 0.0f, -1.0f},
    {0.0f, 0.0f, 1.0f}, {0.0f, 1.0f, 0.0f}, {0.0f, 1.0f, 0.0f}};
} // namespace

DynamicCubemap::DynamicCubemap(int aSize) : mySize(aSize)
{
}

DynamicCubemap::~DynamicCubemap()
{
	Destroy();
}

bool DynamicCubemap::Init(const std::string& aName)
{
	if (!aName.empty())
	{
		LoadFromFile(aName);
		return true;
	}
	if (!InitCubeMap() || !InitDepthBuffer())
	{
		return false;
	}
	myViewport = Gpu::Viewport();
	myViewport.myWidth = static_cast<float>(mySize);
	myViewport.myHeight = static_cast<float>(mySize);
	CreateCameras();
	return true;
}

bool DynamicCubemap::InitCubeMap()
{
	Engine* engine = Engine::GetInstance();
	Gpu::TextureDesc desc;
	desc.myKind = Gpu::TextureKind::TextureCube;
	desc.myWidth = mySize;
	desc.myHeight = mySize;
	desc.myArraySize = ourFaceCount;
	desc.myMipLevels = 0;
	desc.myFormat = Dds::Format::R16G16B16A16_FLOAT;
	desc.myLabel = "capture cubemap";
	myTexture = std::make_unique<Gpu::Texture>();
	if (engine == nullptr || mySize <= 0 || !myTexture->Init(engine->GetContext(), desc))
	{
		myTexture.reset();
		ReportCritical(148, "Zeph::DynamicCubemap::InitCubeMap", "Failed to create cubemap texture");
		return false;
	}
	for (int face = 0; face < ourFaceCount; ++face)
	{
		Gpu::RenderTargetDesc target;
		target.myFirstSlice = face;
		myFaceTargets[face] = myTexture->CreateRenderTargetView(target);
		if (myFaceTargets[face] == nullptr)
		{
			ReportCritical(166, "Zeph::DynamicCubemap::InitCubeMap", "Failed to create rtv for cubemap index %d",
			               face);
			return false;
		}
	}
	Gpu::ShaderResourceDesc cube;
	cube.myDimension = Gpu::ViewDimension::TextureCube;
	myCubeView = myTexture->CreateShaderResourceView(cube);
	if (myCubeView == nullptr)
	{
		ReportCritical(181, "Zeph::DynamicCubemap::InitCubeMap", "Failed to create SRV for cubemap");
		return false;
	}
	for (int face = 0; face < ourFaceCount; ++face)
	{
		Gpu::ShaderResourceDesc single;
		single.myDimension = Gpu::ViewDimension::Texture2DArray;
		single.myFirstSlice = face;
		single.mySliceCount = 1;
		myFaceViews[face] = myTexture->CreateShaderResourceView(single);
		if (myFaceViews[face] == nullptr)
		{
			ReportCritical(200, "Zeph::DynamicCubemap::InitCubeMap", "Failed to create SRVs for cubemap");
			return false;
		}
	}
	return true;
}

bool DynamicCubemap::InitDepthBuffer()
{
	Engine* engine = Engine::GetInstance();
	Gpu::TextureDesc desc;
	desc.myWidth = mySize;
	desc.myHeight = mySize;
	desc.myFormat = Dds::Format::D32_FLOAT;
	desc.myLabel = "capture cubemap depth";
	myDepthTexture = std::make_unique<Gpu::Texture>();
	if (engine == nullptr || mySize <= 0 || !myDepthTexture->Init(engine->GetContext(), desc))
	{
		myDepthTexture.reset();
		ReportCritical(229, "Zeph::DynamicCubemap::InitDepthBuffer", "Failed to create Depth Texture for cubemap");
		return false;
	}
	myDepthView = myDepthTexture->CreateDepthStencilView();
	if (myDepthView == nullptr)
	{
		ReportCritical(243, "Zeph::DynamicCubemap::InitDepthBuffer", "Failed to CreateDepthStencilView");
		return false;
	}
	return true;
}

void DynamicCubemap::LoadFromFile(const std::string& aPath)
{
	Engine* engine = Engine::GetInstance();
	Dds::ImageInfo info;
	myTexture = engine != nullptr ? Gpu::CreateTextureFromFile(engine->GetContext(), aPath, &info) : nullptr;
	if (!myTexture)
	{
		ReportCritical(108, "Zeph::DynamicCubemap::LoadFromFile", "Couldn't load file %s", aPath.c_str());
		return;
	}
	Gpu::ShaderResourceDesc cube;
	cube.myDimension = Gpu::ViewDimension::TextureCube;
	myCubeView = myTexture->CreateShaderResourceView(cube);
	if (myCubeView == nullptr)
	{
		ReportCritical(122, "Zeph::DynamicCubemap::LoadFromFile", "Failed to create SRV for cubemap");
	}
}

void DynamicCubemap::CreateCameras()
{
	const Engine* engine = Engine::GetInstance();
	const float aspect = engine != nullptr ? static_cast<float>(engine->GetSetupInfo().myWidth) /
	                                             static_cast<float>(engine->GetSetupInfo().myHeight)
	                                       : 16.0f / 9.0f;
	myLens = std::make_unique<Camera>(aspect);
	for (int face = 0; face < ourFaceCount; ++face)
	{
		myFaceCameras[face] = std::make_unique<CameraInstance>(myLens.get());
		myFaceCameras[face]->SetProjection(std::numbers::pi_v<float> / 4.0f, aspect, 0.1f, 1000.0f);
		myFaceCameras[face]->SetProjection(std::numbers::pi_v<float> / 2.0f, 1.0f, 0.025f, 250.0f);
	}
	SetPosition(Vector3<float>(0.0f, 0.0f, 0.0f));
}

void DynamicCubemap::SetPosition(const Vector3<float>& aPosition)
{
	for (int face = 0; face < ourFaceCount; ++face)
	{
		if (myFaceCameras[face])
		{
			myFaceCameras[face]->LookTo(aPosition, ourFaceDirections[face], ourFaceUps[face]);
		}
	}
}

void DynamicCubemap::Destroy()
{
	if (myTexture)
	{
		myTexture->Destroy();
		myTexture.reset();
	}
	if (myDepthTexture)
	{
		myDepthTexture->Destroy();
		myDepthTexture.reset();
	}
	for (int face = 0; face < ourFaceCount; ++face)
	{
		myFaceTargets[face] = nullptr;
		myFaceViews[face] = nullptr;
		myFaceCameras[face].reset();
	}
	myCubeView = nullptr;
	myDepthView = nullptr;
	myLens.reset();
}
} // namespace Zeph
