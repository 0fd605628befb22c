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
// `Xvfb -displayfd FD -screen 0 640x480x24 -nolisten tcp`: Xvfb takes the first display
// number whose lock it can create (so parallel test processes never share one) and
// writes that number to the pipe once it accepts connections. Start points $DISPLAY
// at it, and Stop ends it and puts $DISPLAY back. Whether a test may skip when Start
// fails depends on why: IsXvfbInstalled() tells the case the machine cannot help (no
// Xvfb at all) from a server that would not start.
//
// Xlib comes with this header. Its macro None (0L) would replace every enumerator
// of that name (Gpu::CullMode::None, Gpu::DeviceFailure::None), so it is undone
// here: write 0 for X's None.

#include <X11/Xlib.h>
#include <X11/Xutil.h>
#include <cstdlib>
#include <fcntl.h>
#include <poll.h>
#include <signal.h>
#include <spawn.h>
#include <sstream>
#include <string>
#include <sys/wait.h>
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
			if (Connect(display))
			{
				return true;
			}
		}
		if (!IsXvfbInstalled())
		{
			myReason = "no X server can be started: $DISPLAY does not answer and Xvfb is not installed";
			return false;
		}
		const char* previous = std::getenv("DISPLAY");
		myPreviousDisplay = previous != nullptr ? previous : "";
		const std::string name = ":" + StartXvfb(aScreen);
		if (name == ":" || !Connect(name.c_str()))
		{
			Stop();
			myReason = "no X server can be started: Xvfb did not accept connections";
			return false;
		}
		setenv("DISPLAY", name.c_str(), 1);
		return true;
	}

	void Stop()
	{
		if (myConnection != nullptr)
		{
			XCloseDisplay(myConnection);
			myConnection = nullptr;
		}
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

private:
	// Keeps the connection that answered: an X server resets when its last client
	// leaves and refuses connections meanwhile, which later clients would run into.
	bool Connect(const char* aDisplayName)
	{
		myConnection = XOpenDisplay(aDisplayName);
		return myConnection != nullptr;
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

	// The display number Xvfb reports once it is ready; empty when it exits or stays silent
	// for ten seconds (the server, if any, is left to Stop).
	std::string StartXvfb(const std::string& aScreen)
	{
		// Only the write end goes to the child.
		int pipeEnds[2];
		if (pipe(pipeEnds) != 0 || fcntl(pipeEnds[0], F_SETFD, FD_CLOEXEC) != 0)
		{
			return {};
		}
		posix_spawn_file_actions_t actions;
		posix_spawn_file_actions_init(&actions);
		posix_spawn_file_actions_addopen(&actions, STDOUT_FILENO, "/dev/null", O_WRONLY, 0);
		posix_spawn_file_actions_addopen(&actions, STDERR_FILENO, "/dev/null", O_WRONLY, 0);
		const std::string xvfb = FindXvfb();
		const std::string writeEnd = std::to_string(pipeEnds[1]);
		const char* arguments[] = {"Xvfb",      "-displayfd", writeEnd.c_str(),
		                           "-screen",   "0",          aScreen.c_str(),
		                           "-nolisten", "tcp",        nullptr};
		const int result =
		    posix_spawn(&myPid, xvfb.c_str(), &actions, nullptr, const_cast<char**>(arguments), environ);
		posix_spawn_file_actions_destroy(&actions);
		close(pipeEnds[1]);
		if (result != 0)
		{
			myPid = -1;
		}
		// Xvfb writes "N\n"; the pipe ends early when it exits.
		std::string number;
		pollfd ready = {.fd = pipeEnds[0], .events = POLLIN, .revents = 0};
		char character = 0;
		while (myPid > 0 && poll(&ready, 1, 10000) == 1 && read(pipeEnds[0], &character, 1) == 1 &&
		       character != '\n')
		{
			number += character;
		}
		close(pipeEnds[0]);
		return character == '\n' ? number : std::string();
	}

	pid_t myPid = -1;
	Display* myConnection = nullptr;
	std::string myPreviousDisplay;
	std::string myReason;
};
