#pragma once
// ColorGradingManager: grades the image through a 3D lookup of sRGB-encoded colours
// ("ColorGrade"); the lookup comes from data/grading/default.dds, a volume texture,
// and is bound to "ColorGradingTex" once at Init.

#include <memory>
#include <string>

#include "renderer/post/PostProcessManager.h"

namespace Gpu
{
class ShaderResourceView;
class Texture;
} // namespace Gpu

namespace Zeph
{
class ColorGradingManager : public PostProcessManager
{
public:
	static constexpr const char* ourLookupFile = "data/grading/default.dds";

	ColorGradingManager() = default;
	~ColorGradingManager() override;

	bool Init(int aWidth, int aHeight, FullScreenHelper* aFullScreenHelper,
	          ComputeHelper* aComputeHelper) override;
	// Init with another lookup file.
	bool Init(int aWidth, int aHeight, FullScreenHelper* aFullScreenHelper, ComputeHelper* aComputeHelper,
	          const std::string& aLookupFile);
	void Render(Gpu::RenderTargetView* aDestination, Texture* aSource) override;
	// Into a destination of another size than the stage's (the source is scaled to it).
	void Render(Gpu::RenderTargetView* aDestination, int aWidth, int aHeight, Texture* aSource);
	void Destroy() override;

	Gpu::ShaderResourceView* GetLookupView() const { return myLookupView; }

private:
	std::unique_ptr<Gpu::Texture> myLookup;
	Gpu::ShaderResourceView* myLookupView = nullptr;
};
} // namespace Zeph
