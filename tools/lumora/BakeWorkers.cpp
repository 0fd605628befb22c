#include "BakeWorkers.h"

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <cstring>
#include <fcntl.h>
#include <filesystem>
#include <poll.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include "BakeSupport.h"

extern char** environ;

namespace LumoraTool
{
namespace
{
void CloseIfOpen(int& aDescriptor)
{
	if (aDescriptor >= 0)
	{
		close(aDescriptor);
		aDescriptor = -1;
	}
}

// How a process that was waited for ended.
std::string DescribeExit(int aStatus)
{
	if (WIFSIGNALED(aStatus))
	{
		return std::string("killed by signal ") + std::to_string(WTERMSIG(aStatus)) + " (" +
		       strsignal(WTERMSIG(aStatus)) + ")";
	}
	return "exited with status " + std::to_string(WEXITSTATUS(aStatus));
}

bool WriteAll(int aDescriptor, const std::string& aText)
{
	size_t written = 0;
	while (written < aText.size())
	{
		const ssize_t result = write(aDescriptor, aText.data() + written, aText.size() - written);
		if (result < 0 && errno == EINTR)
		{
			continue;
		}
		if (result <= 0)
		{
			return false;
		}
		written += static_cast<size_t>(result);
	}
	return true;
}
} // namespace

BakeWorkers::~BakeWorkers()
{
	Stop();
}

bool BakeWorkers::Init(const std::string& aLevel, int aCount)
{
	Destroy();
	std::error_code error;
	std::string program = std::filesystem::read_symlink("/proc/self/exe", error).string();
	if (error)
	{
		return false;
	}
	// A worker that is gone must not end this process when a job is written to it.
	std::signal(SIGPIPE, SIG_IGN);
	for (int index = 0; index < aCount; ++index)
	{
		int input[2] = {-1, -1};
		int output[2] = {-1, -1};
		if (pipe2(input, O_CLOEXEC) != 0 || pipe2(output, O_CLOEXEC) != 0)
		{
			CloseIfOpen(input[0]);
			CloseIfOpen(input[1]);
			break;
		}
		posix_spawn_file_actions_t actions;
		posix_spawn_file_actions_init(&actions);
		posix_spawn_file_actions_adddup2(&actions, input[0], STDIN_FILENO);
		posix_spawn_file_actions_adddup2(&actions, output[1], STDOUT_FILENO);
		// The worker takes the usual answer to a closed pipe, whatever this process chose.
		posix_spawnattr_t attributes;
		posix_spawnattr_init(&attributes);
		sigset_t defaults;
		sigemptyset(&defaults);
		sigaddset(&defaults, SIGPIPE);
		posix_spawnattr_setsigdefault(&attributes, &defaults);
		posix_spawnattr_setflags(&attributes, POSIX_SPAWN_SETSIGDEF);
		std::string command = "bake-worker";
		std::string level = aLevel;
		char* arguments[] = {program.data(), command.data(), level.data(), nullptr};
		Worker worker;
		const int result =
		    posix_spawn(&worker.myPid, program.c_str(), &actions, &attributes, arguments, environ);
		posix_spawn_file_actions_destroy(&actions);
		posix_spawnattr_destroy(&attributes);
		close(input[0]);
		close(output[1]);
		if (result != 0)
		{
			close(input[1]);
			close(output[0]);
			break;
		}
		worker.myInput = input[1];
		worker.myOutput = output[0];
		myWorkers.push_back(worker);
	}
	return !myWorkers.empty();
}

void BakeWorkers::Destroy()
{
	Reap(0);
}

void BakeWorkers::Stop()
{
	Keep(0);
}

void BakeWorkers::Keep(int aCount)
{
	const size_t kept = static_cast<size_t>(std::max(aCount, 0));
	for (size_t index = kept; index < myWorkers.size(); ++index)
	{
		if (myWorkers[index].myPid > 0)
		{
			kill(myWorkers[index].myPid, SIGTERM);
		}
	}
	Reap(kept);
}

void BakeWorkers::Reap(size_t aFirst)
{
	for (size_t index = aFirst; index < myWorkers.size(); ++index)
	{
		Worker& worker = myWorkers[index];
		// The end of its input ends a worker once its current job is done.
		CloseIfOpen(worker.myInput);
		CloseIfOpen(worker.myOutput);
		int status = 0;
		while (worker.myPid > 0 && waitpid(worker.myPid, &status, 0) < 0 && errno == EINTR)
		{
		}
	}
	myWorkers.resize(std::min(aFirst, myWorkers.size()));
}

bool BakeWorkers::Send(int anIndex, const std::vector<std::string>& someFields, std::string& aLossOut)
{
	Worker& worker = myWorkers.at(static_cast<size_t>(anIndex));
	if (worker.myInput < 0)
	{
		return false;
	}
	std::string line;
	for (const std::string& field : someFields)
	{
		if (field.find_first_of("\t\n\r") != std::string::npos)
		{
			return false;
		}
		line += (line.empty() ? "" : "\t") + field;
	}
	if (!WriteAll(worker.myInput, line + "\n"))
	{
		aLossOut = Lose(worker);
		return false;
	}
	return true;
}

bool BakeWorkers::Receive(int anIndex, std::string& aProblemOut)
{
	Worker& worker = myWorkers.at(static_cast<size_t>(anIndex));
	while (worker.myOutput >= 0)
	{
		if (const size_t end = worker.myReceived.find('\n'); end != std::string::npos)
		{
			const std::string line = worker.myReceived.substr(0, end);
			worker.myReceived.erase(0, end + 1);
			if (line == "ok")
			{
				return true;
			}
			aProblemOut =
			    line.rfind("error\t", 0) == 0 ? line.substr(6) : "an answer not understood: " + line;
			return false;
		}
		if (StopAsked())
		{
			aProblemOut = "stopped";
			return false;
		}
		pollfd waiting = {worker.myOutput, POLLIN, 0};
		if (poll(&waiting, 1, 100) <= 0)
		{
			continue;
		}
		char buffer[4096];
		const ssize_t count = read(worker.myOutput, buffer, sizeof(buffer));
		if (count < 0 && errno == EINTR)
		{
			continue;
		}
		if (count <= 0)
		{
			break;
		}
		worker.myReceived.append(buffer, static_cast<size_t>(count));
	}
	aProblemOut = Lose(worker);
	return false;
}

std::string BakeWorkers::Lose(Worker& aWorker)
{
	CloseIfOpen(aWorker.myInput);
	CloseIfOpen(aWorker.myOutput);
	if (aWorker.myPid <= 0)
	{
		return "the worker is gone";
	}
	int status = 0;
	pid_t result = 0;
	while ((result = waitpid(aWorker.myPid, &status, 0)) < 0 && errno == EINTR)
	{
	}
	const std::string text = "worker process " + std::to_string(aWorker.myPid) +
	                         (result > 0 ? " " + DescribeExit(status) : " is gone");
	aWorker.myPid = -1;
	return text;
}
} // namespace LumoraTool
