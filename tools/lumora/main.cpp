// lumora: headless jobs on a level. This first version tells what the build holds
// and whether this machine gives it an OpenGL 4.5 core context.
#include <cstdio>
#include <cstdlib>
#include <cstring>

#include "DemoFrame.h"
#include "LevelFrame.h"
#include "lumora.h"
#include "platform/gpu/Device.h"

namespace
{
// Starts the headless device once, the way the bakes and renders will, and says
// what the driver is; a machine without GL is told, not a failure of the tool.
void PrintGpu()
{
	Gpu::Device device;
	if (!device.Init(16, 16))
	{
		std::printf("gpu:        no OpenGL 4.5 core context on this machine: %s\n",
		            device.GetFailureText().c_str());
		return;
	}
	std::printf("gpu:        %s, OpenGL %s, %s\n", device.GetRendererName().c_str(),
	            device.GetVersionName().c_str(), device.IsSurfaceless() ? "EGL surfaceless" : "EGL pbuffer");
	device.Destroy();
}
} // namespace

int main(int argc, char** argv)
{
	if (argc > 1 && (std::strcmp(argv[1], "--version") == 0 || std::strcmp(argv[1], "-V") == 0))
	{
		std::printf("lumora %s\n", Lumora::GetVersion());
		return 0;
	}
	if (argc > 1 && std::strcmp(argv[1], "--demo-frame") == 0)
	{
		if (argc != 3)
		{
			std::fprintf(stderr, "usage: lumora --demo-frame OUT.png\n");
			return 2;
		}
		if (!LumoraTool::RenderDemoFrame(argv[2], 640, 360))
		{
			return 1;
		}
		std::printf("wrote %s (640x360)\n", argv[2]);
		return 0;
	}
	if (argc > 1 && std::strcmp(argv[1], "--level-frame") == 0)
	{
		int bounces = 0;
		if (argc == 6 && std::strcmp(argv[4], "--bake-bounces") == 0)
		{
			bounces = std::atoi(argv[5]);
		}
		if ((argc != 4 && argc != 6) || bounces < 0 ||
		    (argc == 6 && bounces == 0 && std::strcmp(argv[5], "0") != 0))
		{
			std::fprintf(stderr, "usage: lumora --level-frame LEVEL OUT.png [--bake-bounces N]\n");
			return 2;
		}
		if (!LumoraTool::RenderLevelFrame(argv[2], argv[3], 1280, 720, bounces))
		{
			return 1;
		}
		std::printf("wrote %s (1280x720)\n", argv[3]);
		return 0;
	}
	if (argc > 1)
	{
		std::fprintf(
		    stderr,
		    "lumora: unknown argument '%s' (this build knows --version, --demo-frame and --level-frame)\n",
		    argv[1]);
		return 2;
	}
	std::printf("Lumora %s\n%s", Lumora::GetVersion(), Lumora::GetBuildInfo().c_str());
	PrintGpu();
	return 0;
}
