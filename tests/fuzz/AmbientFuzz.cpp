// ambient.sh volumes: any bytes read as a volume or fail with a message naming the file; a volume
// read has counts the 3D textures can hold, blocks of its cell count, and writes back byte for byte.

#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>
#include <unistd.h>

#include "FuzzEntries.h"
#include "renderer/AmbientVolumeFile.h"

namespace
{
// The reader takes a path: each input goes through one scratch file per process.
class ScratchFiles
{
public:
	ScratchFiles()
	{
		const std::string stem = "lumora-fuzz-ambient-" + std::to_string(::getpid());
		myInput = (std::filesystem::temp_directory_path() / (stem + ".sh")).string();
		myOutput = (std::filesystem::temp_directory_path() / (stem + "-written.sh")).string();
	}
	~ScratchFiles()
	{
		std::error_code ignored;
		std::filesystem::remove(myInput, ignored);
		std::filesystem::remove(myOutput, ignored);
	}
	std::string myInput;
	std::string myOutput;
};
} // namespace

int LumoraFuzz::Ambient(const uint8_t* someData, size_t aSize)
{
	static const ScratchFiles ourFiles;
	{
		std::ofstream out(ourFiles.myInput, std::ios::binary | std::ios::trunc);
		out.write(reinterpret_cast<const char*>(someData), static_cast<std::streamsize>(aSize));
		Require(out.good());
	}
	Zeph::AmbientVolume volume;
	std::string problem;
	const Zeph::AmbientVolumeRead result = Zeph::ReadAmbientVolume(ourFiles.myInput, volume, problem);
	Require(result != Zeph::AmbientVolumeRead::CANNOT_OPEN);
	if (result == Zeph::AmbientVolumeRead::DAMAGED)
	{
		Require(problem.find(ourFiles.myInput) != std::string::npos && volume.myBlocks[0].empty());
		return 0;
	}
	++ourAcceptedCount;
	size_t cells = 1;
	for (const int count : volume.myCounts)
	{
		Require(count >= 1 && count <= Zeph::AmbientVolume::ourMaxCount);
		cells *= static_cast<size_t>(count);
	}
	for (const std::vector<uint32_t>& block : volume.myBlocks)
	{
		Require(block.size() == cells);
	}
	Require(Zeph::WriteAmbientVolume(ourFiles.myOutput, volume, problem));
	std::ifstream in(ourFiles.myOutput, std::ios::binary);
	const std::string written((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>());
	Require(written.size() == aSize && std::memcmp(written.data(), someData, aSize) == 0);
	return 0;
}
