#pragma once
// ShortestDecimal: a float as the double of its shortest decimal that reads back as the same
// float (0.1f gives 0.1, not 0.10000000149011612), for files and languages that hold doubles, so
// that values print as they were written and convert back to the float unchanged.
#include <charconv>

inline double ShortestDecimal(float aValue)
{
	char text[32];
	const std::to_chars_result end = std::to_chars(text, text + sizeof(text), aValue);
	double value = aValue;
	std::from_chars(text, end.ptr, value);
	return value;
}
