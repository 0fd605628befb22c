#include "DemoFrame.h"

#include <cstdio>

#include "DemoScene.h"
#include "engine/Engine.h"
#include "renderer/FrameCapture.h"

namespace LumoraTool
{
bool RenderDemoFrame(const std::string& aPath, int aWidth, int aHeight)
{
	Gpu::WindowHandle window = 0;
	bool result = false;
	if (Zeph::Engine::Create(window, aWidth, aHeight))
	{
		DemoScene scene;
		if (scene.Init(*Zeph::Engine::GetInstance()))
		{
			// A few frames, so that the eye adaptation settles as it has in the editor.
			result = Zeph::FrameCapture::RenderToPng([&scene] { scene.Queue(); }, 20, aPath);
			if (!result)
			{
				std::fprintf(stderr, "lumora: cannot write %s\n", aPath.c_str());
			}
		}
		scene.Destroy();
	}
	else
	{
		std::fprintf(stderr, "lumora: the engine could not start (no OpenGL 4.5 core context?)\n");
	}
	Zeph::Engine::ShutDown();
	return result;
}
} // namespace LumoraTool
