// lumora: headless jobs on a level. This first version tells what the build holds.
#include <cstdio>
#include <cstring>

#include "lumora.h"

int main(int argc, char** argv)
{
	if (argc > 1 && (std::strcmp(argv[1], "--version") == 0 || std::strcmp(argv[1], "-V") == 0))
	{
		std::printf("lumora %s\n", Lumora::GetVersion());
		return 0;
	}
	if (argc > 1)
	{
		std::fprintf(stderr, "lumora: unknown argument '%s' (this build knows --version only)\n", argv[1]);
		return 2;
	}
	std::printf("Lumora %s\n%s", Lumora::GetVersion(), Lumora::GetBuildInfo().c_str());
	return 0;
}
