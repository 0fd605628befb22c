#pragma once
// XServer: an X display for tests and benchmarks that present into windows.
//
//   XServer server;
//   if (!server.Start()) { skip: server.GetReason() }
//   Display* display = XOpenDisplay(nullptr); // $DISPLAY names the server now
//   ...
//   server.Stop();                             // or let it go out of scope
//
// Start uses $DISPLAY when it names a server that answers. Otherwise it starts
// `Xvfb :N -screen 0 640x480x24 -nolisten tcp` on a display number nobody holds,
// waits until it accepts connections, points $DISPLAY at it, and Stop ends it and
// puts $DISPLAY back. Whether a test may skip when Start fails depends on why:
// IsXvfbInstalled() tells the case the machine cannot help (no Xvfb at all) from
// a server that would not start.
//
// Xlib comes with this header. Its macro None (0L) would replace every enumerator
// of that name (Gpu::CullMode::None, Gpu::DeviceFailure::None), so it is undone
// here: write 0 for X's None.

#include <X11/Xlib.h>
#include <X11/Xutil.h>
#include <chrono>
#include <cstdlib>
#include <fcntl.h>
#include <fstream>
#include <signal.h>
#include <spawn.h>
#include <sstream>
#include <string>
#include <sys/stat.h>
#include <sys/wait.h>
#include <thread>
#include <unistd.h>
#include <vector>

#undef None

extern char** environ;

// A window's pixels as RGBA (alpha 255), row 0 at the top; empty when X cannot read them.
inline std::vector<uint8_t> ReadWindowPixels(Display* aDisplay, Window aWindow, int aWidth, int aHeight)
{
	XImage* image = XGetImage(aDisplay, aWindow, 0, 0, static_cast<unsigned>(aWidth),
	                          static_cast<unsigned>(aHeight), AllPlanes, ZPixmap);
	if (image == nullptr)
	{
		return {};
	}
	std::vector<uint8_t> pixels;
	for (int y = 0; y < aHeight; ++y)
	{
		for (int x = 0; x < aWidth; ++x)
		{
			const unsigned long value = XGetPixel(image, x, y);
			pixels.insert(pixels.end(), {static_cast<uint8_t>((value & image->red_mask) >> 16),
			                             static_cast<uint8_t>((value & image->green_mask) >> 8),
			                             static_cast<uint8_t>(value & image->blue_mask), 255});
		}
	}
	XDestroyImage(image);
	return pixels;
}

class XServer
{
public:
	XServer() = default;
	~XServer() { Stop(); }
	XServer(const XServer&) = delete;
	XServer& operator=(const XServer&) = delete;

	// aScreen: Xvfb's screen geometry, width x height x depth.
	bool Start(const std::string& aScreen = "640x480x24")
	{
		if (const char* display = std::getenv("DISPLAY"); display != nullptr && *display != '\0')
		{
			if (Answers(display))
			{
				myDisplayName = display;
				return true;
			}
		}
		if (!IsXvfbInstalled())
		{
			myReason = "no X server can be started: $DISPLAY does not answer and Xvfb is not installed";
			return false;
		}
		// Another process may take the number between the check and the start: try a few.
		for (int number = FreeDisplayNumber(99), attempt = 0; number > 0 && attempt < 5;
		     number = FreeDisplayNumber(number + 1), ++attempt)
		{
			if (StartXvfb(number, aScreen))
			{
				return true;
			}
		}
		myReason = "no X server can be started: Xvfb did not accept connections";
		return false;
	}

	void Stop()
	{
		Disconnect();
		if (myPid <= 0)
		{
			return;
		}
		kill(myPid, SIGTERM);
		int status = 0;
		waitpid(myPid, &status, 0);
		myPid = -1;
		if (myPreviousDisplay.empty())
		{
			unsetenv("DISPLAY");
		}
		else
		{
			setenv("DISPLAY", myPreviousDisplay.c_str(), 1);
		}
	}

	static bool IsXvfbInstalled() { return !FindXvfb().empty(); }
	const std::string& GetReason() const { return myReason; }
	const std::string& GetDisplayName() const { return myDisplayName; }
	bool IsOwnServer() const { return myPid > 0; }

private:
	// Keeps the connection that answered: an X server resets when its last client
	// leaves and refuses connections meanwhile, which later clients would run into.
	bool Answers(const char* aDisplayName)
	{
		if (myConnection == nullptr)
		{
			myConnection = XOpenDisplay(aDisplayName);
		}
		return myConnection != nullptr;
	}

	void Disconnect()
	{
		if (myConnection != nullptr)
		{
			XCloseDisplay(myConnection);
			myConnection = nullptr;
		}
	}

	static std::string FindXvfb()
	{
		const char* path = std::getenv("PATH");
		std::istringstream directories(path != nullptr && *path != '\0' ? path : "/usr/bin:/bin");
		for (std::string directory; std::getline(directories, directory, ':');)
		{
			if (access((directory + "/Xvfb").c_str(), X_OK) == 0)
			{
				return directory + "/Xvfb";
			}
		}
		return {};
	}

	// The process id in a display's lock file; 0 when there is none.
	static pid_t LockOwner(int aNumber)
	{
		std::ifstream lock("/tmp/.X" + std::to_string(aNumber) + "-lock");
		long pid = 0;
		lock >> pid;
		return static_cast<pid_t>(pid);
	}

	// The first number from aFirst on with neither a lock file nor a socket.
	static int FreeDisplayNumber(int aFirst)
	{
		for (int number = aFirst; number < aFirst + 200; ++number)
		{
			struct stat info;
			const std::string lock = "/tmp/.X" + std::to_string(number) + "-lock";
			const std::string socket = "/tmp/.X11-unix/X" + std::to_string(number);
			if (stat(lock.c_str(), &info) != 0 && stat(socket.c_str(), &info) != 0)
			{
				return number;
			}
		}
		return -1;
	}

	bool StartXvfb(int aNumber, const std::string& aScreen)
	{
		const std::string xvfb = FindXvfb();
		const std::string name = ":" + std::to_string(aNumber);
		char* arguments[] = {const_cast<char*>("Xvfb"),          const_cast<char*>(name.c_str()),
		                     const_cast<char*>("-screen"),       const_cast<char*>("0"),
		                     const_cast<char*>(aScreen.c_str()), const_cast<char*>("-nolisten"),
		                     const_cast<char*>("tcp"),           nullptr};
		posix_spawn_file_actions_t actions;
		posix_spawn_file_actions_init(&actions);
		posix_spawn_file_actions_addopen(&actions, STDOUT_FILENO, "/dev/null", O_WRONLY, 0);
		posix_spawn_file_actions_addopen(&actions, STDERR_FILENO, "/dev/null", O_WRONLY, 0);
		pid_t pid = -1;
		const int result = posix_spawn(&pid, xvfb.c_str(), &actions, nullptr, arguments, environ);
		posix_spawn_file_actions_destroy(&actions);
		if (result != 0)
		{
			return false;
		}
		const auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(10);
		while (std::chrono::steady_clock::now() < deadline)
		{
			int status = 0;
			if (waitpid(pid, &status, WNOHANG) == pid)
			{
				return false; // it exited: the number was taken after all
			}
			// Another test process may hold the number and answer in its place: the
			// lock file names the server's process.
			if (Answers(name.c_str()) && LockOwner(aNumber) != pid)
			{
				Disconnect(); // another process's server
			}
			else if (myConnection != nullptr)
			{
				myPid = pid;
				const char* previous = std::getenv("DISPLAY");
				myPreviousDisplay = previous != nullptr ? previous : "";
				setenv("DISPLAY", name.c_str(), 1);
				myDisplayName = name;
				return true;
			}
			if (LockOwner(aNumber) > 0 && LockOwner(aNumber) != pid)
			{
				break;
			}
			std::this_thread::sleep_for(std::chrono::milliseconds(20));
		}
		kill(pid, SIGTERM);
		int status = 0;
		waitpid(pid, &status, 0);
		return false;
	}

	pid_t myPid = -1;
	Display* myConnection = nullptr;
	std::string myDisplayName;
	std::string myPreviousDisplay;
	std::string myReason;
};
