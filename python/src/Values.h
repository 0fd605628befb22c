#pragma once
// Small conversions of the library's values to Python's, shared by the module's parts.
#include <pybind11/pybind11.h>

#include "core/ShortestDecimal.h"
#include "core/Vector3.h"

namespace LumoraPython
{
// A vector as a tuple of the shortest decimals of its components.
inline pybind11::tuple Triple(const Vector3<float>& aVector)
{
	return pybind11::make_tuple(ShortestDecimal(aVector.x), ShortestDecimal(aVector.y),
	                            ShortestDecimal(aVector.z));
}

inline pybind11::tuple Triple(const int someValues[3])
{
	return pybind11::make_tuple(someValues[0], someValues[1], someValues[2]);
}
} // namespace LumoraPython
