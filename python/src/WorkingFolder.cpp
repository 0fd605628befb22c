#include "WorkingFolder.h"

#include <pybind11/pybind11.h>

#include <filesystem>
#include <system_error>
#include <unistd.h>

#include "Errors.h"

namespace LumoraPython
{
namespace
{
std::mutex& FolderMutex()
{
	static std::mutex ourMutex;
	return ourMutex;
}
} // namespace

std::string WorkingFolder::CheckDataFolder(const std::string& aFolder)
{
	namespace fs = std::filesystem;
	std::error_code error;
	const fs::path folder = fs::absolute(aFolder.empty() ? fs::path(".") : fs::path(aFolder), error);
	if (error || !fs::is_directory(folder / "data", error))
	{
		throw LumoraError("no data/ folder in " + (error ? aFolder : folder.lexically_normal().string()) +
		                  ": give the folder that holds the game's data/");
	}
	return folder.lexically_normal().string();
}

WorkingFolder::WorkingFolder(const std::string& aFolder)
{
	{
		// Another thread may hold the folder for a long call (a bake) and need Python's lock
		// meanwhile (a progress callback).
		pybind11::gil_scoped_release unlocked;
		myLock = std::unique_lock<std::mutex>(FolderMutex());
	}
	std::error_code error;
	myPrevious = std::filesystem::current_path(error).string();
	if (error || chdir(aFolder.c_str()) != 0)
	{
		throw LumoraError("cannot work in " + aFolder + ": " + (error ? error.message() : "chdir failed"));
	}
}

WorkingFolder::~WorkingFolder()
{
	// The caller's folder may be gone meanwhile; the next call sets its own.
	if (!myPrevious.empty() && chdir(myPrevious.c_str()) != 0)
	{
		myPrevious.clear();
	}
}
} // namespace LumoraPython
