#pragma once
// The module's parts, each registering its functions and classes.
#include <pybind11/pybind11.h>

namespace LumoraPython
{
// EngineSession (EngineSession.cpp).
void RegisterEngine(pybind11::module_& aModule);
// check(data, level) (CheckBinding.cpp).
void RegisterCheck(pybind11::module_& aModule);
// read_ambient, read_dds, read_bake_record, stale_inputs (FileBinding.cpp).
void RegisterFiles(pybind11::module_& aModule);
} // namespace LumoraPython
