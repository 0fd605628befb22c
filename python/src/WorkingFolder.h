#pragma once
// WorkingFolder: the engine names its files relative to the working directory (data/...), so
// every call into it runs with the folder that holds data/ as the process's working directory,
// the caller's restored afterwards. One at a time in the process: the guard holds a process-wide
// lock, which it takes with Python's lock released (a bake holds it while another Python
// thread goes on).
//
//   LumoraPython::WorkingFolder here(myDataFolder);   // throws LumoraError when it cannot
//   editor.ParseLevel(u"sample_small");
#include <mutex>
#include <string>

namespace LumoraPython
{
class WorkingFolder
{
public:
	explicit WorkingFolder(const std::string& aFolder);
	~WorkingFolder();
	WorkingFolder(const WorkingFolder&) = delete;
	WorkingFolder& operator=(const WorkingFolder&) = delete;

	// The folder as an absolute path, checked to hold data/; throws LumoraError otherwise.
	static std::string CheckDataFolder(const std::string& aFolder);

private:
	std::unique_lock<std::mutex> myLock;
	std::string myPrevious;
};
} // namespace LumoraPython
