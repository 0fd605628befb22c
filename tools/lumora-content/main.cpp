// lumora-content: writes the sample content: models, textures, grading lookups, cube maps, the
// entity and decal type catalogues and the sample levels.
//
//   lumora-content [--out DIRECTORY]
//
// DIRECTORY defaults to "data": models (the light and decal volumes among them) go to
// DIRECTORY/models/*.dae, textures (decal textures among them) to DIRECTORY/textures/*.dds, the
// colour-grading lookups to DIRECTORY/grading/*.dds, the cube maps to DIRECTORY/Cubemaps/*.dds, the
// catalogues to DIRECTORY/XML/EntityTypes.xml and DIRECTORY/XML/DecalTypes.xml and the levels to
// DIRECTORY/XML/levels/<level>/*.xml. The output is the same bytes on
// every run, so the files under data/ are committed and a test regenerates them to check that they are
// current. Run it from the repository root. The exit status is 1 on any error.

#include <cstdio>
#include <cstring>
#include <string>
#include <vector>

#include "Generator.h"

int main(int argc, char** argv)
{
	std::string out = "data";
	for (int index = 1; index < argc; ++index)
	{
		if (std::strcmp(argv[index], "--out") == 0 && index + 1 < argc)
		{
			out = argv[++index];
		}
		else
		{
			std::fprintf(stderr, "usage: lumora-content [--out DIRECTORY]\n");
			return 1;
		}
	}
	std::vector<std::string> written;
	std::string error;
	if (!Content::Generate(out, written, error))
	{
		std::fprintf(stderr, "lumora-content: %s\n", error.c_str());
		return 1;
	}
	std::printf("lumora-content: wrote %zu files under %s\n", written.size(), out.c_str());
	return 0;
}
