#include "platform/gpu/TimestampQueries.h"

namespace Gpu
{
TimestampQueries::~TimestampQueries()
{
	Destroy();
}

void TimestampQueries::Mark(const char* aName)
{
	if (myUsed == myQueries.size())
	{
		GLuint query = 0;
		glGenQueries(1, &query);
		myQueries.push_back(query);
		myNames.emplace_back();
	}
	glQueryCounter(myQueries[myUsed], GL_TIMESTAMP);
	myNames[myUsed] = aName;
	++myUsed;
}

std::vector<TimestampQueries::Interval> TimestampQueries::Resolve()
{
	std::vector<Interval> intervals;
	GLuint64 previous = 0;
	for (size_t index = 0; index < myUsed; ++index)
	{
		GLuint64 time = 0;
		glGetQueryObjectui64v(myQueries[index], GL_QUERY_RESULT, &time);
		if (index > 0)
		{
			intervals.push_back({myNames[index - 1], static_cast<double>(time - previous) / 1.0e6});
		}
		previous = time;
	}
	myUsed = 0;
	return intervals;
}

void TimestampQueries::Destroy()
{
	if (!myQueries.empty())
	{
		glDeleteQueries(static_cast<GLsizei>(myQueries.size()), myQueries.data());
	}
	myQueries.clear();
	myNames.clear();
	myUsed = 0;
}
} // namespace Gpu
