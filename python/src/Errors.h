#pragma once
// The module's errors. LumoraError is what the library said went wrong (Python's
// lumora.LumoraError, a RuntimeError); the rest map onto Python's own exceptions by pybind11's
// translation (std::invalid_argument: ValueError, std::out_of_range: IndexError).
#include <stdexcept>
#include <string>

namespace LumoraPython
{
class LumoraError : public std::runtime_error
{
public:
	using std::runtime_error::runtime_error;
};
} // namespace LumoraPython
