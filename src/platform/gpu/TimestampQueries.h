#pragma once
// TimestampQueries: GPU timestamps at marked points of a frame, read back once the
// frame is done, as Direct3D's timestamp queries are used to time passes.
//
//   Gpu::TimestampQueries timer;
//   timer.Mark("G-buffer");  ... draw ...  timer.Mark("lights");  ... draw ...  timer.Mark("end");
//   for (const Gpu::TimestampQueries::Interval& pass : timer.Resolve()) { pass.myName, pass.myMilliseconds }
//
// Resolve waits for the GPU. Each interval runs from one mark to the next and
// carries the first mark's name; the last mark closes the list.
#include <epoxy/gl.h>
#include <string>
#include <vector>

namespace Gpu
{
class TimestampQueries
{
public:
	struct Interval
	{
		std::string myName;
		double myMilliseconds = 0.0;
	};

	TimestampQueries() = default;
	~TimestampQueries();
	TimestampQueries(const TimestampQueries&) = delete;
	TimestampQueries& operator=(const TimestampQueries&) = delete;

	void Mark(const char* aName);
	// The intervals between the marks since the last Resolve; clears the marks.
	std::vector<Interval> Resolve();
	void Destroy();

private:
	std::vector<GLuint> myQueries;
	std::vector<std::string> myNames;
	size_t myUsed = 0;
};
} // namespace Gpu
