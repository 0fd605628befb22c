#include "support/TestSupport.h"

#include <filesystem>

#include <cstdlib>
#include <fstream>
#include <sstream>
#include <stdexcept>

namespace TestSupport
{
ScratchDir::ScratchDir()
{
	std::string pattern = (std::filesystem::temp_directory_path() / "lumora-test-XXXXXX").string();
	if (mkdtemp(pattern.data()) == nullptr)
	{
		throw std::runtime_error("mkdtemp failed for " + pattern);
	}
	myPath = pattern;
}

ScratchDir::~ScratchDir()
{
	std::error_code ignored;
	std::filesystem::remove_all(myPath, ignored);
}

std::string ReadWholeFile(const std::string& aPath)
{
	std::ifstream in(aPath, std::ios::binary);
	std::ostringstream bytes;
	bytes << in.rdbuf();
	return bytes.str();
}

void WriteWholeFile(const std::string& aPath, const std::string& someBytes)
{
	std::ofstream out(aPath, std::ios::binary | std::ios::trunc);
	out << someBytes;
}

bool HasSharedTestData()
{
	std::error_code ignored;
	return std::filesystem::is_directory("../shared/testdata", ignored);
}
}
