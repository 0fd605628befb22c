#pragma once
// Engine: the process-wide owner of the GPU device, the swap chain on the host's
// window, the back buffer and the depth buffer, the resource containers, the model
// factory and the renderer. The last two live in src/model and src/renderer, which
// build on the engine, so the engine holds them through pointers to declared types.
//
//   Gpu::WindowHandle window = 0;               // 0: headless, else an X11 window id
//   if (!Zeph::Engine::Create(window, 1280, 720)) { ... }   // still call ShutDown
//   Zeph::Engine* engine = Zeph::Engine::GetInstance();
//   ... draw into engine->GetBackBufferView() ...
//   engine->Present();
//   Zeph::Engine::ShutDown();                   // GetInstance() is null afterwards
//
// The GL context is current on one thread at a time: the thread that works with the
// engine makes it current (MakeContextCurrent) and releases it when it hands over.
// Create leaves it current on the creating thread.

#include <atomic>
#include <memory>

#include "engine/EffectContainer.h"
#include "engine/FontContainer.h"
#include "engine/SetupInfo.h"
#include "engine/TextureContainer.h"
#include "platform/gpu/Device.h"
#include "platform/gpu/SwapChain.h"
#include "platform/gpu/Texture.h"

namespace Zeph
{
class CubemapContainer;
class ModelFactory;
class Renderer;

class Engine
{
public:
	enum class DriverType
	{
		HARDWARE,
	};

	static bool Create(Gpu::WindowHandle& aWindowHandle, int aWidth, int aHeight);
	static void ShutDown();
	static Engine* GetInstance() { return ourInstance; }

	TextureContainer& GetTextureContainer() { return myTextureContainer; }
	EffectContainer& GetEffectContainer() { return myEffectContainer; }
	FontContainer& GetFontContainer() { return myFontContainer; }
	ModelFactory& GetModelFactory() { return *myModelFactory; }
	CubemapContainer& GetCubemapContainer() { return *myCubemapContainer; }
	Renderer& GetRenderer() { return *myRenderer; }
	SetupInfo& GetSetupInfo() { return mySetupInfo; }
	const SetupInfo& GetSetupInfo() const { return mySetupInfo; }

	Gpu::Device& GetDevice() { return myDevice; }
	Gpu::Context& GetContext() { return myDevice.GetContext(); }
	Gpu::Texture* GetBackBuffer() { return mySwapChain.GetBuffer(); }
	Gpu::RenderTargetView* GetBackBufferView() const { return myBackBufferView; }
	Gpu::DepthStencilView* GetDepthStencilView() const { return myDepthStencilView; }
	Gpu::ShaderResourceView* GetDepthShaderView() const { return myDepthShaderView; }
	int GetFeatureLevel() const { return myFeatureLevel; }
	unsigned int GetMultisampleQuality() const { return myMultisampleQuality; }

	// (Re)creates the back buffer and the depth buffer at the given size and binds
	// them with a full viewport; start-up runs it, and so does a resize.
	bool SetupRenderTargets(int aWidth, int aHeight);
	// The drawing area at a new size: the back buffer and depth buffer (with a window,
	// its size is read again and the frame is shown stretched over it), the renderer's
	// size-dependent targets and the setup info's size. False, reported at the error
	// level with everything left at the old size, for a size below 1x1 or above what the
	// context can draw, or when a target cannot be made. The same size does nothing.
	bool Resize(int aWidth, int aHeight);

	// The set-up flag: waits, 1 ms at a time, while another caller holds it, then
	// takes it. Render-target set-up and the texture container's copies hold it.
	void AcquireSetupFlag();
	void ReleaseSetupFlag();
	bool IsSettingUpTargets() const { return myIsSettingUpTargets.load(); }

	bool MakeContextCurrent() { return myDevice.MakeCurrent(); }
	void ReleaseContext() { myDevice.ReleaseCurrent(); }

	// The renderer draws one frame of what was queued into the back buffer (with the
	// depth buffer) and presents it.
	void RenderScene();
	virtual void Present();
	virtual ~Engine();

private:
	Engine() = default;
	Engine(const Engine&) = delete;
	Engine& operator=(const Engine&) = delete;

	bool Init(Gpu::WindowHandle aWindowHandle, int aWidth, int aHeight);
	bool D3DDeviceSetup(int aWidth, int aHeight);
	bool SwapChainSetup(int aWidth, int aHeight);
	bool CreateTargets(int aWidth, int aHeight);
	void ReleaseTargets();

	std::atomic<bool> myIsSettingUpTargets = false;
	bool myUseMultisampling = false;
	unsigned int myMultisampleQuality = 0;
	DriverType myDriverType = DriverType::HARDWARE;
	// The GL version the context was made with, as major * 10 + minor (45 for 4.5).
	int myFeatureLevel = 0;
	Gpu::Device myDevice; // the device with its immediate context
	Gpu::SwapChain mySwapChain;
	Gpu::RenderTargetView* myBackBufferView = nullptr;
	Gpu::DepthStencilView* myDepthStencilView = nullptr;
	std::unique_ptr<Gpu::Texture> myDepthTexture;
	Gpu::ShaderResourceView* myDepthShaderView = nullptr;
	Gpu::WindowHandle myWindow = 0;
	TextureContainer myTextureContainer;
	EffectContainer myEffectContainer;
	FontContainer myFontContainer;
	// A container that takes only DDS files; nothing loads through it yet, and it is
	// cleared with the others at shutdown.
	TextureContainer myDdsTextureContainer{{".dds", ".DDS"}};
	std::unique_ptr<ModelFactory> myModelFactory;
	std::unique_ptr<Renderer> myRenderer;
	std::unique_ptr<CubemapContainer> myCubemapContainer;
	SetupInfo mySetupInfo;
	unsigned int myRefreshRateNumerator = 60;
	unsigned int myRefreshRateDenominator = 1;

	static Engine* ourInstance;
};
} // namespace Zeph
