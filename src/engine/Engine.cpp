#include "engine/Engine.h"

#include <chrono>
#include <cstdio>
#include <thread>

#include "engine/EngineReport.h"
#include "model/ModelFactory.h"
#include "platform/gpu/Multisample.h"
#include "renderer/CubemapContainer.h"
#include "renderer/Renderer.h"

namespace Zeph
{
Engine* Engine::ourInstance = nullptr;

namespace
{
constexpr Dds::Format ourBackBufferFormat = Dds::Format::R8G8B8A8_UNORM_SRGB;
constexpr int ourMultisampleCount = 4;
} // namespace

bool Engine::Create(Gpu::WindowHandle& aWindowHandle, int aWidth, int aHeight)
{
	if (ourInstance != nullptr)
	{
		// One engine per process: a second Create would orphan the first one's GPU objects.
		ReportCritical(__LINE__, "Zeph::Engine::Create", "The engine already exists");
		return false;
	}
	// Registered before any set-up so that the parts can reach the engine; on failure
	// it stays registered and the caller still calls ShutDown.
	ourInstance = new Engine();
	return ourInstance->Init(aWindowHandle, aWidth, aHeight);
}

void Engine::ShutDown()
{
	if (ourInstance == nullptr)
	{
		return;
	}
	// The containers release GPU objects: the context must be current here.
	ourInstance->myDevice.MakeCurrent();
	ourInstance->myRenderer->Destroy();
	ourInstance->myCubemapContainer->Destroy();
	ourInstance->myFontContainer.Clear();
	ourInstance->myEffectContainer.Clear();
	ourInstance->myTextureContainer.Clear();
	ourInstance->myModelFactory->Clear();
	ourInstance->myDdsTextureContainer.Clear();
	delete ourInstance;
	ourInstance = nullptr;
}

bool Engine::Init(Gpu::WindowHandle aWindowHandle, int aWidth, int aHeight)
{
	myWindow = aWindowHandle;
	// The parts exist from the start, so ShutDown finds them after a failed start-up too.
	myModelFactory = std::make_unique<ModelFactory>();
	myRenderer = std::make_unique<Renderer>();
	myCubemapContainer = std::make_unique<CubemapContainer>();
	myUseMultisampling = false;
	myDriverType = DriverType::HARDWARE;
	mySetupInfo = SetupInfo();
	mySetupInfo.myWidth = aWidth;
	mySetupInfo.myHeight = aHeight;
	mySetupInfo.myWindowed = true;
	mySetupInfo.myVSync = false;
	// The device shows the window (maps it) when it makes its surface on it.
	if (!D3DDeviceSetup(aWidth, aHeight))
	{
		return false;
	}
	if (!SwapChainSetup(aWidth, aHeight))
	{
		return false;
	}
	if (!SetupRenderTargets(aWidth, aHeight))
	{
		return false;
	}
	return myRenderer->Init(aWidth, aHeight);
}

bool Engine::D3DDeviceSetup(int aWidth, int aHeight)
{
	if (!myDevice.Init(aWidth, aHeight, myWindow))
	{
		// The driver's side of the story, logged without ending the process; the
		// report after it is the failure.
		ReportDebug(__LINE__, "Zeph::Engine::D3DDeviceSetup", "%s", myDevice.GetFailureText().c_str());
		// A context below GL 4.5 core is the feature level the engine cannot use.
		if (myDevice.GetFailure() == Gpu::DeviceFailure::VersionTooLow)
		{
			ReportCritical(__LINE__, "Zeph::Engine::D3DDeviceSetup",
			               "Direct3D Feature Level 11 unsupported.");
		}
		else
		{
			ReportCritical(__LINE__, "Zeph::Engine::D3DDeviceSetup", "D3DCreateDevice Failed.");
		}
		return false;
	}
	int major = 0;
	int minor = 0;
	if (std::sscanf(myDevice.GetVersionName().c_str(), "%d.%d", &major, &minor) == 2)
	{
		myFeatureLevel = major * 10 + minor;
	}
	return true;
}

bool Engine::SwapChainSetup(int aWidth, int aHeight)
{
	if (!Gpu::CheckMultisampleQualityLevels(ourBackBufferFormat, ourMultisampleCount, myMultisampleQuality))
	{
		return false;
	}
	// The swap chain presents at the host's refresh rate; myRefreshRate* records the
	// 60/1 that the window was described with, which GL has no use for.
	return mySwapChain.Init(myDevice, aWidth, aHeight, ourBackBufferFormat);
}

void Engine::AcquireSetupFlag()
{
	bool expected = false;
	while (!myIsSettingUpTargets.compare_exchange_weak(expected, true))
	{
		expected = false;
		std::this_thread::sleep_for(std::chrono::milliseconds(1));
	}
}

void Engine::ReleaseSetupFlag()
{
	myIsSettingUpTargets.store(false);
}

bool Engine::SetupRenderTargets(int aWidth, int aHeight)
{
	AcquireSetupFlag();
	const bool result = CreateTargets(aWidth, aHeight);
	// A step that fails part-way still clears the flag, so a later set-up never waits
	// forever; the targets it did not make stay null and the next set-up tries again.
	ReleaseSetupFlag();
	return result;
}

bool Engine::Resize(int aWidth, int aHeight)
{
	const char* function = "Zeph::Engine::Resize";
	const int oldWidth = mySetupInfo.myWidth;
	const int oldHeight = mySetupInfo.myHeight;
	if (aWidth == oldWidth && aHeight == oldHeight)
	{
		return true;
	}
	int maxWidth = 0;
	int maxHeight = 0;
	myDevice.GetMaxFrameSize(maxWidth, maxHeight);
	if (aWidth < 1 || aHeight < 1 || aWidth > maxWidth || aHeight > maxHeight)
	{
		ReportError(__LINE__, function,
		            "Cannot draw a view of %dx%d pixels (1x1 to %dx%d); it stays at %dx%d", aWidth, aHeight,
		            maxWidth, maxHeight, oldWidth, oldHeight);
		return false;
	}
	// The back buffer goes before its successor is made; when that fails the old size
	// is made again, which held before.
	if (!SetupRenderTargets(aWidth, aHeight))
	{
		SetupRenderTargets(oldWidth, oldHeight);
		ReportError(__LINE__, function, "Cannot make a %dx%d back buffer; the view stays at %dx%d", aWidth,
		            aHeight, oldWidth, oldHeight);
		return false;
	}
	if (!myRenderer->Resize(aWidth, aHeight))
	{
		SetupRenderTargets(oldWidth, oldHeight);
		return false;
	}
	mySetupInfo.myWidth = aWidth;
	mySetupInfo.myHeight = aHeight;
	return true;
}

bool Engine::CreateTargets(int aWidth, int aHeight)
{
	ReleaseTargets();
	if (!mySwapChain.ResizeBuffers(aWidth, aHeight, ourBackBufferFormat))
	{
		return false;
	}
	myBackBufferView = mySwapChain.GetBuffer()->CreateRenderTargetView();
	if (myBackBufferView == nullptr)
	{
		return false;
	}
	Gpu::TextureDesc depthDesc;
	depthDesc.myWidth = aWidth;
	depthDesc.myHeight = aHeight;
	depthDesc.myMipLevels = 1;
	depthDesc.myFormat = Dds::Format::R24G8_TYPELESS;
	depthDesc.myLabel = "depth buffer";
	myDepthTexture = std::make_unique<Gpu::Texture>();
	if (!myDepthTexture->Init(myDevice.GetContext(), depthDesc))
	{
		myDepthTexture.reset();
		return false;
	}
	Gpu::DepthStencilDesc depthViewDesc;
	depthViewDesc.myFormat = Dds::Format::D24_UNORM_S8_UINT;
	myDepthStencilView = myDepthTexture->CreateDepthStencilView(depthViewDesc);
	if (myDepthStencilView == nullptr)
	{
		return false;
	}
	Gpu::ShaderResourceDesc depthShaderDesc;
	depthShaderDesc.myFormat = Dds::Format::R24_UNORM_X8_TYPELESS;
	depthShaderDesc.myDimension = Gpu::ViewDimension::Texture2D;
	depthShaderDesc.myMipCount = 1;
	myDepthShaderView = myDepthTexture->CreateShaderResourceView(depthShaderDesc);
	if (myDepthShaderView == nullptr)
	{
		return false;
	}
	Gpu::Context& context = myDevice.GetContext();
	Gpu::RenderTargetView* const targets[] = {myBackBufferView};
	if (!context.SetRenderTargets(targets, myDepthStencilView))
	{
		return false;
	}
	Gpu::Viewport viewport;
	viewport.myWidth = static_cast<float>(aWidth);
	viewport.myHeight = static_cast<float>(aHeight);
	context.SetViewport(viewport);
	return true;
}

void Engine::ReleaseTargets()
{
	// Views die with their textures; the pointers only have to be forgotten.
	myDepthShaderView = nullptr;
	myDepthStencilView = nullptr;
	myBackBufferView = nullptr;
	if (myDepthTexture)
	{
		myDepthTexture->Destroy();
		myDepthTexture.reset();
	}
}

void Engine::RenderScene()
{
	myRenderer->Render(myBackBufferView, myDepthStencilView);
}

void Engine::Present()
{
	mySwapChain.Present(mySetupInfo.myVSync ? 1 : 0);
}

Engine::~Engine()
{
	if (myDevice.IsInitialized())
	{
		myDevice.MakeCurrent();
		// The views first (depth as a texture, back buffer, depth target), then what owns them.
		if (myDepthTexture && myDepthShaderView != nullptr)
		{
			myDepthTexture->DestroyView(myDepthShaderView);
		}
		myDepthShaderView = nullptr;
		if (mySwapChain.GetBuffer() != nullptr && myBackBufferView != nullptr)
		{
			mySwapChain.GetBuffer()->DestroyView(myBackBufferView);
		}
		myBackBufferView = nullptr;
		if (myDepthTexture && myDepthStencilView != nullptr)
		{
			myDepthTexture->DestroyView(myDepthStencilView);
		}
		myDepthStencilView = nullptr;
		mySwapChain.Destroy();
		ReleaseTargets();
		myDevice.GetContext().ClearState();
		myDevice.GetContext().Flush();
	}
	myDevice.Destroy();
}
} // namespace Zeph
