// _lumora: the compiled part of the lumora package (python/lumora), over the editor facade.
#include <pybind11/pybind11.h>

#include "Bindings.h"
#include "EngineSession.h"
#include "Errors.h"
#include "editor/LumoraWrapper.h"

PYBIND11_MODULE(_lumora, aModule)
{
	aModule.doc() = "Lumora's library for Python: the engine, the level check and the baked files' readers. "
	                "Use it through the lumora package.";
	pybind11::register_exception<LumoraPython::LumoraError>(aModule, "LumoraError", PyExc_RuntimeError);
	LumoraPython::RegisterEngine(aModule);
	LumoraPython::RegisterCheck(aModule);
	LumoraPython::RegisterFiles(aModule);
	// An interpreter that exits with an Editor still open shuts the engine down first, while its
	// GL driver is still loaded.
	pybind11::module_::import("atexit").attr("register")(pybind11::cpp_function([] {
		if (Lumora::LumoraWrapper::GetInstance() != nullptr)
		{
			pybind11::gil_scoped_release unlocked;
			Lumora::LumoraWrapper::ShutDown();
		}
	}));
}
