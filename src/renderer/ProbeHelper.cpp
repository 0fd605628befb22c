#include "renderer/ProbeHelper.h"

#include "engine/Engine.h"
#include "engine/EngineReport.h"
#include "engine/Texture.h"
#include "renderer/DynamicCubemap.h"

namespace Zeph
{
ProbeHelper::ProbeHelper() = default;

ProbeHelper::~ProbeHelper()
{
	Destroy();
}

bool ProbeHelper::Init()
{
	mySHCubemap = std::make_unique<DynamicCubemap>(ourSHCubeSize);
	myReflectionCubemap = std::make_unique<DynamicCubemap>(ourReflectionCubeSize);
	const bool cubes = mySHCubemap->Init("") && myReflectionCubemap->Init("");
	myFilterTarget =
	    std::make_unique<Texture>(ourFilterTargetSize, ourFilterTargetSize, Dds::Format::R16G16B16A16_FLOAT);
	return cubes && myFilterTarget->GetRenderTargetView() != nullptr;
}

void ProbeHelper::Destroy()
{
	for (int block = 0; block < ourBlockCount; ++block)
	{
		if (myTextures[block])
		{
			myTextures[block]->Destroy();
			myTextures[block].reset();
		}
		myViews[block] = nullptr;
	}
	mySHCubemap.reset();
	myReflectionCubemap.reset();
	myFilterTarget.reset();
}

bool ProbeHelper::Upload(bool anUpdateFlag, const std::vector<uint32_t>* someBlocks, int anX, int aY, int aZ)
{
	Engine* engine = Engine::GetInstance();
	const size_t count = static_cast<size_t>(anX) * static_cast<size_t>(aY) * static_cast<size_t>(aZ);
	if (engine == nullptr || anX <= 0 || aY <= 0 || aZ <= 0)
	{
		ReportCritical(__LINE__, "Zeph::Renderer::UploadSHToGPU", "Failed to create 3D texture");
		return false;
	}
	const uint32_t rowPitch = static_cast<uint32_t>(anX) * 4u;
	const uint32_t slicePitch = rowPitch * static_cast<uint32_t>(aY);
	for (int block = 0; block < ourBlockCount; ++block)
	{
		if (someBlocks[block].size() < count)
		{
			ReportCritical(__LINE__, "Zeph::Renderer::UploadSHToGPU", "Failed to create 3D texture");
			return false;
		}
		const bool fits = myTextures[block] && myTextures[block]->GetDesc().myWidth == anX &&
		                  myTextures[block]->GetDesc().myHeight == aY && myTextures[block]->GetDesc().myDepth == aZ;
		if (anUpdateFlag && fits)
		{
			myTextures[block]->Upload(0, 0, someBlocks[block].data(), rowPitch, slicePitch);
			continue;
		}
		if (myTextures[block])
		{
			myTextures[block]->Destroy();
		}
		Gpu::TextureDesc desc;
		desc.myKind = Gpu::TextureKind::Texture3D;
		desc.myWidth = anX;
		desc.myHeight = aY;
		desc.myDepth = aZ;
		desc.myFormat = Dds::Format::R8G8B8A8_UNORM;
		desc.myLabel = "irradiance volume";
		myTextures[block] = std::make_unique<Gpu::Texture>();
		myViews[block] = nullptr;
		if (!myTextures[block]->Init(engine->GetContext(), desc) ||
		    !myTextures[block]->Upload(0, 0, someBlocks[block].data(), rowPitch, slicePitch))
		{
			myTextures[block].reset();
			ReportCritical(1350, "Zeph::Renderer::UploadSHToGPU", "Failed to create 3D texture");
			return false;
		}
		myViews[block] = myTextures[block]->GetDefaultShaderResourceView();
		if (myViews[block] == nullptr)
		{
			ReportCritical(1363, "Zeph::Renderer::UploadSHToGPU", "Failed to create 3D SRV");
			return false;
		}
	}
	return true;
}
} // namespace Zeph
