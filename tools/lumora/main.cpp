// lumora: the library's jobs from the command line, headless: bake a level's lighting,
// render it to a PNG, check its files, describe a baked or model file. Without a
// command it tells what the build holds and whether this machine gives it an OpenGL
// 4.5 core context.
#include <CLI/CLI.hpp>
#include <cstdio>
#include <string>

#include "Commands.h"
#include "DemoFrame.h"
#include "EditorSession.h"
#include "lumora.h"
#include "platform/gpu/Device.h"

namespace
{
void PrintBuildAndGpu()
{
	std::printf("Lumora %s\n%s", Lumora::GetVersion(), Lumora::GetBuildInfo().c_str());
	Gpu::Device device;
	if (!device.Init(16, 16))
	{
		std::printf("gpu:        no OpenGL 4.5 core context on this machine: %s\n",
		            device.GetFailureText().c_str());
		return;
	}
	std::printf("gpu:        %s, OpenGL %s, %s\n", device.GetRendererName().c_str(),
	            device.GetVersionName().c_str(),
	            device.IsHardwareDevice() ? "EGL device"
	            : device.IsSurfaceless()  ? "EGL surfaceless"
	                                      : "EGL pbuffer");
	device.Destroy();
}

// "WxH" into two positive sizes.
std::string ParseSize(const std::string& aText, int& aWidth, int& aHeight)
{
	int width = 0;
	int height = 0;
	char separator = 0;
	char rest = 0;
	if (std::sscanf(aText.c_str(), "%d%c%d%c", &width, &separator, &height, &rest) != 3 ||
	    (separator != 'x' && separator != 'X') || width < 1 || height < 1 || width > 8192 || height > 8192)
	{
		return "--size takes WIDTHxHEIGHT, each 1 to 8192 (as 1280x720), not '" + aText + "'";
	}
	aWidth = width;
	aHeight = height;
	return {};
}
} // namespace

int main(int argc, char** argv)
{
	CLI::App app("Lumora: bakes, renders and checks level lighting, headless. Run from the folder that "
	             "holds data/.",
	             "lumora");
	app.set_version_flag("--version,-V", std::string("lumora ") + Lumora::GetVersion());

	LumoraTool::BakeOptions bake;
	CLI::App* bakeCommand = app.add_subcommand(
	    "bake", "Bake a level's ambient light (SH volume, ambient.sh) and its rooms' reflection cubemaps");
	bakeCommand->add_option("LEVEL", bake.myLevel, "Level folder name under data/XML/levels/")->required();
	bakeCommand->add_option("--bounces", bake.myBounces, "Ambient light bounces (0 writes nothing)")
	    ->check(CLI::Range(0, 16))
	    ->capture_default_str();
	CLI::Option* ambientOnly =
	    bakeCommand->add_flag("--ambient-only", bake.myAmbientOnlyFlag, "Bake the ambient volume only");
	CLI::Option* specularOnly = bakeCommand->add_flag("--specular-only", bake.mySpecularOnlyFlag,
	                                                  "Bake the reflection cubemaps only");
	ambientOnly->excludes(specularOnly);
	bakeCommand->add_flag("--debug-captures", bake.myDebugCapturesFlag,
	                      "Also save every probe's capture to data/cubemaps/sh debug/");
	bakeCommand->add_flag("--force", bake.myForceFlag,
	                      "Bake even a level in which check finds problems (they are baked in)");
	CLI::Option* rooms =
	    bakeCommand
	        ->add_option("--rooms", bake.myRooms,
	                     "Re-bake only these rooms (IDs, comma-separated): their cubemaps, and the ambient "
	                     "probes inside them (every other cell of ambient.sh is kept)")
	        ->delimiter(',');
	std::string probes;
	CLI::Option* partBounce =
	    bakeCommand
	        ->add_option("--bounce", bake.myPartBounce,
	                     "Bake one bounce (from 1) of a range of cells into a part file, for a bake spread "
	                     "over machines (with --probes and --out; lumora bake-merge joins the parts)")
	        ->check(CLI::Range(1, 16));
	CLI::Option* previous = bakeCommand->add_option(
	    "--previous", bake.myPrevious, "The merged volume of the bounce before (--bounce 2 and on)");
	CLI::Option* probeRange = bakeCommand->add_option(
	    "--probes", probes, "FIRST:COUNT: the cells of the part, in ambient.sh's order (x, then y, then z)");
	CLI::Option* partOutput = bakeCommand->add_option("--out", bake.myPartOutput, "The part file to write");
	bakeCommand
	    ->add_option("--jobs,-j", bake.myJobs,
	                 "Processes to share the bake, this one included (0: one per processor); the result "
	                 "is the same, byte for byte")
	    ->check(CLI::Range(0, 256))
	    ->capture_default_str();
	partBounce->needs(probeRange)->needs(partOutput)->excludes(rooms)->excludes(specularOnly);
	previous->needs(partBounce);
	probeRange->needs(partBounce);
	partOutput->needs(partBounce);

	// The helper processes of "bake --jobs" (not for people: it reads jobs on its input).
	std::string workerLevel;
	CLI::App* workerCommand = app.add_subcommand("bake-worker", "");
	workerCommand->group("");
	workerCommand->add_option("LEVEL", workerLevel)->required();

	LumoraTool::MergeOptions merge;
	CLI::App* mergeCommand = app.add_subcommand(
	    "bake-merge", "Join one bounce's part files (lumora bake --bounce) into an ambient.sh-format file");
	mergeCommand->add_option("LEVEL", merge.myLevel, "Level folder name under data/XML/levels/")->required();
	mergeCommand->add_option("PART", merge.myParts, "The bounce's part files")->required();
	mergeCommand->add_option("--out", merge.myOutput, "The volume to write")->required();

	LumoraTool::RenderOptions render;
	std::string size = "1280x720";
	std::vector<float> camera;
	CLI::App* renderCommand = app.add_subcommand("render", "Render one frame of a level to a PNG");
	renderCommand->add_option("LEVEL", render.myLevel, "Level folder name under data/XML/levels/")
	    ->required();
	renderCommand->add_option("--out,-o", render.myOutput, "The PNG to write")->required();
	renderCommand->add_option("--size", size, "WIDTHxHEIGHT")->capture_default_str();
	renderCommand
	    ->add_option("--camera", camera, "Camera position X,Y,Z (default: walked into the first room)")
	    ->delimiter(',')
	    ->expected(3);
	renderCommand->add_option("--yaw", render.myYaw,
	                          "Camera turn about the up axis, radians (with --camera)");
	renderCommand->add_option("--pitch", render.myPitch,
	                          "Camera tilt, radians, positive looks down (with --camera)");
	renderCommand->add_option("--mode", render.myMode, "Editor mode: what the overlays show")
	    ->check(CLI::IsMember({"light", "node", "decal"}))
	    ->capture_default_str();

	std::string checkLevel;
	CLI::App* checkCommand = app.add_subcommand(
	    "check", "Read a level's files and both catalogues; list every problem (exit 1 if any)");
	checkCommand->add_option("LEVEL", checkLevel, "Level folder name under data/XML/levels/")->required();
	bool checkJson = false;
	checkCommand->add_flag(
	    "--json", checkJson,
	    "Print the problems as JSON records (message, file, element, baked) and the notes");

	std::string infoPath;
	CLI::App* infoCommand = app.add_subcommand(
	    "info", "Describe an ambient.sh, a DDS texture, an .al model or a bake record (bake.json)");
	infoCommand->add_option("FILE", infoPath, "The file")->required();

	std::string demoOutput;
	CLI::App* demoCommand = app.add_subcommand("demo", "Render the built-in demo scene (no level) to a PNG");
	demoCommand->add_option("--out,-o", demoOutput, "The PNG to write")->required();

	app.require_subcommand(0, 1);
	try
	{
		app.parse(argc, argv);
	}
	catch (const CLI::CallForHelp& request)
	{
		return app.exit(request);
	}
	catch (const CLI::CallForAllHelp& request)
	{
		return app.exit(request);
	}
	catch (const CLI::CallForVersion& request)
	{
		return app.exit(request);
	}
	catch (const CLI::ParseError& error)
	{
		// CLI11 answers with its own exit codes (105 to 114) and a second line of advice;
		// every bad argument here is one "lumora:" line and status 2, as for the commands.
		LumoraTool::PrintError(std::string(error.what()) + " (lumora --help lists the commands)");
		return 2;
	}

	bake.myLevel = LumoraTool::LevelSpelledOnDisk(bake.myLevel);
	render.myLevel = LumoraTool::LevelSpelledOnDisk(render.myLevel);
	checkLevel = LumoraTool::LevelSpelledOnDisk(checkLevel);
	merge.myLevel = LumoraTool::LevelSpelledOnDisk(merge.myLevel);
	if (*bakeCommand)
	{
		if (*partBounce)
		{
			char rest = 0;
			if (std::sscanf(probes.c_str(), "%lld:%lld%c", &bake.myFirst, &bake.myCount, &rest) != 2 ||
			    bake.myFirst < 0 || bake.myCount < 1)
			{
				LumoraTool::PrintError(
				    "--probes takes FIRST:COUNT, a first cell from 0 and a count from 1 (as "
				    "0:5000), not '" +
				    probes + "'");
				return 2;
			}
			if ((bake.myPartBounce > 1) != !bake.myPrevious.empty())
			{
				LumoraTool::PrintError(
				    bake.myPartBounce > 1
				        ? "--bounce " + std::to_string(bake.myPartBounce) +
				              " needs --previous, the merged volume of bounce " +
				              std::to_string(bake.myPartBounce - 1)
				        : std::string("--bounce 1 is lit by direct light only: it takes no --previous"));
				return 2;
			}
			bake.myAmbientOnlyFlag = true;
		}
		if (bake.myJobs != 1 && (*partBounce || *rooms || bake.myDebugCapturesFlag))
		{
			LumoraTool::PrintError("--jobs shares a whole bake: it does not go with --bounce, --rooms or "
			                       "--debug-captures");
			return 2;
		}
		return LumoraTool::RunBake(bake);
	}
	if (*workerCommand)
	{
		return LumoraTool::RunBakeWorker(LumoraTool::LevelSpelledOnDisk(workerLevel));
	}
	if (*mergeCommand)
	{
		return LumoraTool::RunBakeMerge(merge);
	}
	if (*renderCommand)
	{
		if (const std::string problem = ParseSize(size, render.myWidth, render.myHeight); !problem.empty())
		{
			LumoraTool::PrintError(problem);
			return 2;
		}
		if (camera.size() == 3)
		{
			render.myCamera = Vector3<float>(camera[0], camera[1], camera[2]);
		}
		return LumoraTool::RunRender(render);
	}
	if (*checkCommand)
	{
		return LumoraTool::RunCheck(checkLevel, checkJson);
	}
	if (*infoCommand)
	{
		return LumoraTool::RunInfo(infoPath);
	}
	if (*demoCommand)
	{
		if (!LumoraTool::RenderDemoFrame(demoOutput, 640, 360))
		{
			return 1;
		}
		std::printf("wrote %s (640x360)\n", demoOutput.c_str());
		return 0;
	}
	PrintBuildAndGpu();
	return 0;
}
