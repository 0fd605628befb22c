#pragma once
// FileSizeLimit: a full disk for the length of a scope. Every write that would take a
// file of this process (and of the processes it starts meanwhile) past the given size
// fails (EFBIG; SIGXFSZ is ignored), for root as for anyone, which neither a read-only
// folder nor a chmod achieves in a test that runs as root.
//
//   {
//       TestSupport::FileSizeLimit full(4096);
//       EXPECT_FALSE(WriteSomethingLarge(path));
//   }   // the old limit is back
#include <csignal>
#include <sys/resource.h>

namespace TestSupport
{
class FileSizeLimit
{
public:
	explicit FileSizeLimit(rlim_t aBytes)
	{
		::getrlimit(RLIMIT_FSIZE, &myPrevious);
		myPreviousHandler = std::signal(SIGXFSZ, SIG_IGN);
		rlimit limit = myPrevious;
		limit.rlim_cur = aBytes;
		::setrlimit(RLIMIT_FSIZE, &limit);
	}
	~FileSizeLimit()
	{
		::setrlimit(RLIMIT_FSIZE, &myPrevious);
		std::signal(SIGXFSZ, myPreviousHandler);
	}
	FileSizeLimit(const FileSizeLimit&) = delete;
	FileSizeLimit& operator=(const FileSizeLimit&) = delete;

private:
	rlimit myPrevious{};
	void (*myPreviousHandler)(int) = SIG_DFL;
};
} // namespace TestSupport
