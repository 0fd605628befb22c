#pragma once
// BakeWorkers: helper processes that share one bake on this machine. Each runs
// "lumora bake-worker LEVEL" (BakeWorker.cpp) with the level loaded and takes jobs one
// line at a time on its standard input, fields separated by tabs, answering each with
// one line on its standard output:
//
//   ambient  BOUNCE  FIRST  COUNT  PREVIOUS  OUT    one bounce of a range of cells into a part file
//   cubemap  ROOM  AMBIENT  OUT                     one room's reflection cubemap into OUT
//   answer:  "ok", or "error" and why
//
//   LumoraTool::BakeWorkers workers;
//   workers.Init("sample_large", 3);                  // three more processes, loading the level
//   workers.Send(0, {"ambient", "1", "0", "40", "", "/tmp/b/0.part"});
//   ... this process bakes its own share meanwhile ...
//   std::string problem;
//   if (!workers.Receive(0, problem)) { ... failed, gone, or a stop was asked ... }
//   workers.Destroy();                                // end of input; waits for each
//
// A worker that cannot start or dies is a worker whose Send and Receive fail from then
// on, never the end of the bake: the caller does that job itself.
#include <cstddef>
#include <string>
#include <sys/types.h>
#include <vector>

namespace LumoraTool
{
class EditorSession;

// Does one job, given as the fields of its line, with the facade of aSession (on which
// the level is loaded): what a worker does with each line it reads, and what the process
// that started the workers does with its own share. Empty when it was done, else why not.
std::string RunBakeJob(EditorSession& aSession, const std::string& aLevel,
                       const std::vector<std::string>& someFields);

class BakeWorkers
{
public:
	BakeWorkers() = default;
	// Stops them.
	~BakeWorkers();
	BakeWorkers(const BakeWorkers&) = delete;
	BakeWorkers& operator=(const BakeWorkers&) = delete;

	// Starts aCount processes of this program; false when not one could be started.
	bool Init(const std::string& aLevel, int aCount);
	// Closes every worker's input (each ends after its current job) and waits for them.
	void Destroy();
	// Asks every worker to stop (SIGTERM cancels its running job) and waits for them.
	void Stop();

	// Stops the workers after the first aCount (their jobs are cancelled) and waits for them.
	void Keep(int aCount);

	int GetCount() const { return static_cast<int>(myWorkers.size()); }
	// Sends one job; false when the worker is gone or a field holds a tab or a line break.
	// aLossOut tells how the worker ended when this call found it gone.
	bool Send(int anIndex, const std::vector<std::string>& someFields, std::string& aLossOut);
	// Waits for the answer to the oldest job sent and not yet answered; false, with the
	// reason, when the worker answered with an error, is gone, or a stop was asked
	// (StopAsked, checked ten times a second while waiting).
	bool Receive(int anIndex, std::string& aProblemOut);

private:
	struct Worker
	{
		pid_t myPid = -1;
		int myInput = -1;
		int myOutput = -1;
		std::string myReceived;
	};
	// Closes the input of the workers from aFirst on, waits for them and forgets them.
	void Reap(size_t aFirst);
	// The worker is gone: its pipes are closed and its exit is collected and described.
	std::string Lose(Worker& aWorker);

	std::vector<Worker> myWorkers;
};
} // namespace LumoraTool
