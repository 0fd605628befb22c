// ambient.sh volumes: any bytes read as a volume or fail with a message naming the file; a volume
// read writes back byte for byte (the reader's limits on counts and sizes are the volume file
// test's).

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>
#include <unistd.h>

#include "FuzzEntries.h"
#include "renderer/AmbientVolumeFile.h"

int LumoraFuzz::Ambient(const uint8_t* someData, size_t aSize)
{
	// The reader takes a path: each input goes through one scratch file per process, removed at exit.
	static const std::string ourInput =
	    (std::filesystem::temp_directory_path() / ("lumora-fuzz-ambient-" + std::to_string(::getpid())))
	        .string();
	static const std::string ourOutput = ourInput + "-written";
	static const bool ourCleanUpFlag = std::atexit([] {
		                                   std::remove(ourInput.c_str());
		                                   std::remove(ourOutput.c_str());
	                                   }) == 0;
	Require(ourCleanUpFlag);
	std::ofstream(ourInput, std::ios::binary | std::ios::trunc)
	    .write(reinterpret_cast<const char*>(someData), static_cast<std::streamsize>(aSize));
	Zeph::AmbientVolume volume;
	std::string problem;
	const Zeph::AmbientVolumeRead result = Zeph::ReadAmbientVolume(ourInput, volume, problem);
	Require(result != Zeph::AmbientVolumeRead::CANNOT_OPEN);
	if (result == Zeph::AmbientVolumeRead::DAMAGED)
	{
		Require(problem.find(ourInput) != std::string::npos && volume.myBlocks[0].empty());
		return 0;
	}
	Require(Zeph::WriteAmbientVolume(ourOutput, volume, problem));
	std::ifstream in(ourOutput, std::ios::binary);
	const std::string written((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>());
	Require(written.size() == aSize && std::memcmp(written.data(), someData, aSize) == 0);
	return 0;
}
