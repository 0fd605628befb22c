#include "platform/paths/Paths.h"

#include <algorithm>
#include <atomic>
#include <cctype>
#include <cerrno>
#include <chrono>
#include <cstdio>
#include <dirent.h>
#include <fcntl.h>
#include <signal.h>
#include <strings.h>
#include <sys/stat.h>
#include <unistd.h>
#include <vector>

namespace
{
bool Exists(const std::string& aPath)
{
	struct stat info;
	return ::lstat(aPath.c_str(), &info) == 0;
}

// The name in aDirectory that equals aName ignoring ASCII case, or an empty string.
// When several spellings differ only in case, the byte-wise smallest wins so that
// the same path always resolves to the same file.
std::string FindIgnoringCase(const std::string& aDirectory, const std::string& aName)
{
	DIR* directory = ::opendir(aDirectory.empty() ? "." : aDirectory.c_str());
	if (directory == nullptr)
	{
		return {};
	}
	std::string found;
	while (const dirent* entry = ::readdir(directory))
	{
		if (::strcasecmp(entry->d_name, aName.c_str()) == 0 &&
		    (found.empty() || found.compare(entry->d_name) > 0))
		{
			found = entry->d_name;
		}
	}
	::closedir(directory);
	return found;
}

std::vector<std::string> SplitComponents(const std::string& aPath)
{
	std::vector<std::string> components;
	std::string::size_type start = 0;
	while (start <= aPath.size())
	{
		std::string::size_type end = aPath.find('/', start);
		if (end == std::string::npos)
		{
			end = aPath.size();
		}
		if (end > start)
		{
			components.push_back(aPath.substr(start, end - start));
		}
		start = end + 1;
	}
	return components;
}

std::string DirectoryOf(const std::string& aPath)
{
	const std::string::size_type slash = aPath.rfind('/');
	if (slash == std::string::npos)
	{
		return ".";
	}
	return slash == 0 ? "/" : aPath.substr(0, slash);
}

std::string FileNameOf(const std::string& aPath)
{
	const std::string::size_type slash = aPath.rfind('/');
	return slash == std::string::npos ? aPath : aPath.substr(slash + 1);
}

bool IsAlphanumeric(const std::string& aText)
{
	return !aText.empty() && std::all_of(aText.begin(), aText.end(), [](char aCharacter) {
		return std::isalnum(static_cast<unsigned char>(aCharacter)) != 0;
	});
}

bool IsDecimal(const std::string& aText)
{
	return !aText.empty() && aText.size() < 10 &&
	       std::all_of(aText.begin(), aText.end(),
	                   [](char aCharacter) { return aCharacter >= '0' && aCharacter <= '9'; });
}

// Whether the middle of a temporary's name (between "." + name + "." and ".tmp") was
// left by a writer that is gone: "<pid>.<6 characters>" whose process no longer runs,
// or the "<6 characters>" of writers from before the pid was part of the name.
bool IsLeftBehind(const std::string& aMiddle)
{
	const std::string::size_type dot = aMiddle.find('.');
	if (dot == std::string::npos)
	{
		return aMiddle.size() == 6 && IsAlphanumeric(aMiddle);
	}
	const std::string pid = aMiddle.substr(0, dot);
	const std::string unique = aMiddle.substr(dot + 1);
	if (!IsDecimal(pid) || unique.size() != 6 || !IsAlphanumeric(unique))
	{
		return false;
	}
	const pid_t process = static_cast<pid_t>(std::stol(pid));
	return process != ::getpid() && ::kill(process, 0) != 0 && errno == ESRCH;
}

// A save or bake that was killed leaves its temporary beside the file; the next write
// of the same file removes those whose writer is gone. Temporaries of running writers
// (this process included) and every other file stay.
void RemoveLeftBehindTemporaries(const std::string& aDirectory, const std::string& aName)
{
	DIR* directory = ::opendir(aDirectory.c_str());
	if (directory == nullptr)
	{
		return;
	}
	const std::string prefix = "." + aName + ".";
	const std::string suffix = ".tmp";
	std::vector<std::string> leftBehind;
	while (const dirent* entry = ::readdir(directory))
	{
		const std::string entryName = entry->d_name;
		if (entryName.size() > prefix.size() + suffix.size() && entryName.starts_with(prefix) &&
		    entryName.ends_with(suffix) &&
		    IsLeftBehind(entryName.substr(prefix.size(), entryName.size() - prefix.size() - suffix.size())))
		{
			leftBehind.push_back(entryName);
		}
	}
	::closedir(directory);
	for (const std::string& entryName : leftBehind)
	{
		const std::string path = (aDirectory == "/" ? "" : aDirectory) + "/" + entryName;
		struct stat info;
		if (::lstat(path.c_str(), &info) == 0 && S_ISREG(info.st_mode))
		{
			::unlink(path.c_str());
		}
	}
}

// mkdir -p for the directory part of an already resolved path.
bool CreateParents(const std::string& aPath)
{
	const std::string::size_type lastSlash = aPath.rfind('/');
	if (lastSlash == std::string::npos || lastSlash == 0)
	{
		return true;
	}
	std::string::size_type slash = aPath[0] == '/' ? 1 : 0;
	while ((slash = aPath.find('/', slash)) != std::string::npos && slash <= lastSlash)
	{
		const std::string prefix = aPath.substr(0, slash);
		if (!prefix.empty() && ::mkdir(prefix.c_str(), 0777) != 0 && errno != EEXIST)
		{
			return false;
		}
		++slash;
	}
	struct stat info;
	return ::stat(aPath.substr(0, lastSlash).c_str(), &info) == 0 && S_ISDIR(info.st_mode);
}
} // namespace

namespace Paths
{
std::string Resolve(const std::string& aPath)
{
	if (aPath.empty())
	{
		return aPath;
	}
	const bool absoluteFlag = aPath.front() == '/';
	std::string resolved = absoluteFlag ? "/" : "";
	bool missingFlag = false;
	for (const std::string& component : SplitComponents(aPath))
	{
		if (component == ".")
		{
			continue;
		}
		std::string spelling = component;
		// ".." is kept rather than folded into the text: below a symbolic link the
		// textual parent is not the real one, and the kernel walks it correctly.
		if (!missingFlag && component != ".." && !Exists(resolved + component))
		{
			spelling = FindIgnoringCase(resolved, component);
			if (spelling.empty())
			{
				missingFlag = true;
				spelling = component;
			}
		}
		resolved += spelling;
		resolved += '/';
	}
	if (resolved.size() > 1 && aPath.back() != '/')
	{
		resolved.pop_back();
	}
	if (resolved.empty())
	{
		return ".";
	}
	return resolved;
}

std::string PrepareForWrite(const std::string& aPath)
{
	std::string resolved = Resolve(aPath);
	if (!CreateParents(resolved))
	{
		return {};
	}
	return resolved;
}

std::string TemporaryFor(const std::string& aFinalPath)
{
	// Like mkstemp, but created with 0666 so the umask applies and the replaced
	// file gets the permissions any new file would (mkstemp gives 0600).
	static std::atomic<unsigned> ourCounter{0};
	static const char ourAlphabet[] = "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789";
	const std::string directory = DirectoryOf(aFinalPath);
	const std::string name = FileNameOf(aFinalPath);
	RemoveLeftBehindTemporaries(directory, name);
	const std::string pid = std::to_string(::getpid());
	for (int attempt = 0; attempt < 100; ++attempt)
	{
		unsigned long long seed =
		    static_cast<unsigned long long>(std::chrono::steady_clock::now().time_since_epoch().count()) ^
		    (static_cast<unsigned long long>(::getpid()) << 32) ^ (ourCounter++ * 7919ULL);
		std::string unique;
		for (int i = 0; i < 6; ++i)
		{
			unique += ourAlphabet[seed % (sizeof(ourAlphabet) - 1)];
			seed /= sizeof(ourAlphabet) - 1;
		}
		const std::string candidate =
		    (directory == "/" ? "" : directory) + "/." + name + "." + pid + "." + unique + ".tmp";
		const int descriptor = ::open(candidate.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0666);
		if (descriptor >= 0)
		{
			::close(descriptor);
			return candidate;
		}
		if (errno != EEXIST)
		{
			break;
		}
	}
	// The directory cannot hold a new file: an empty name makes the caller's open
	// fail with its own message instead of writing somewhere unexpected.
	return {};
}

bool ReplaceWith(const std::string& aTemporary, const std::string& aFinalPath)
{
	const int descriptor = ::open(aTemporary.c_str(), O_RDONLY | O_CLOEXEC);
	if (descriptor < 0)
	{
		return false;
	}
	// A replaced file keeps the permissions its user gave it.
	struct stat finalInfo;
	if (::stat(aFinalPath.c_str(), &finalInfo) == 0 && S_ISREG(finalInfo.st_mode))
	{
		::fchmod(descriptor, finalInfo.st_mode & 07777);
	}
	const bool syncedFlag = ::fsync(descriptor) == 0;
	::close(descriptor);
	if (!syncedFlag || ::rename(aTemporary.c_str(), aFinalPath.c_str()) != 0)
	{
		::unlink(aTemporary.c_str());
		return false;
	}
	// Without syncing the directory a crash could still lose the rename itself.
	const int directory = ::open(DirectoryOf(aFinalPath).c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
	if (directory >= 0)
	{
		::fsync(directory);
		::close(directory);
	}
	return true;
}
void Discard(const std::string& aTemporary)
{
	if (!aTemporary.empty())
	{
		::unlink(aTemporary.c_str());
	}
}
} // namespace Paths
