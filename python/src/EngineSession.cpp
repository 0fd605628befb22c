#include "EngineSession.h"

#include <pybind11/stl.h>

#include <cmath>
#include <cstdlib>

#include "EditorSession.h"
#include "Errors.h"
#include "ReportCollector.h"
#include "Values.h"
#include "WorkingFolder.h"
#include "editor/LumoraMode.h"
#include "editor/LumoraWrapper.h"
#include "editor/StringConversion.h"
#include "engine/Engine.h"
#include "engine/Room.h"
#include "platform/gpu/Readback.h"
#include "renderer/AmbientGrid.h"
#include "renderer/CubemapContainer.h"

namespace py = pybind11;

namespace LumoraPython
{
namespace
{
std::string JoinLines(const std::vector<std::string>& someLines)
{
	std::string text;
	for (const std::string& line : someLines)
	{
		text += (text.empty() ? "" : "\n") + line;
	}
	return text;
}
} // namespace

EngineSession::EngineSession(const std::string& aDataFolder, int aWidth, int aHeight)
    : myDataFolder(WorkingFolder::CheckDataFolder(aDataFolder))
{
	if (Lumora::LumoraWrapper::GetInstance() != nullptr)
	{
		throw LumoraError("an Editor is already open in this process; close it first (the engine is one per "
		                  "process)");
	}
	if (aWidth < 1 || aHeight < 1 || aWidth > 16384 || aHeight > 16384)
	{
		throw std::invalid_argument("the view size must be 1..16384 pixels each way, not " +
		                            std::to_string(aWidth) + " x " + std::to_string(aHeight));
	}
	WorkingFolder here(myDataFolder);
	// Nothing the library reports ends the interpreter: every report is collected and the
	// calls that caused one raise it.
	Lumora::LumoraWrapper::SetFatalReportLevels(0);
	ReportCollector::Get().Listen();
	const size_t mark = ReportCollector::Get().Mark();
	bool createdFlag = false;
	{
		py::gil_scoped_release unlocked;
		createdFlag = Lumora::LumoraWrapper::Create(0, aWidth, aHeight);
	}
	const std::vector<std::string> problems = ReportCollector::Get().ProblemsSince(mark);
	if (!createdFlag || Lumora::LumoraWrapper::GetInstance() == nullptr)
	{
		// What did start is shut down, so the next Editor can start.
		if (Lumora::LumoraWrapper::GetInstance() != nullptr)
		{
			py::gil_scoped_release unlocked;
			Lumora::LumoraWrapper::ShutDown();
		}
		ReportCollector::Get().StopListening();
		throw LumoraError("the engine did not start in " + myDataFolder +
		                  (problems.empty() ? std::string(" (is an OpenGL 4.5 driver installed?)")
		                                    : ": " + JoinLines(problems)));
	}
	myOpenFlag = true;
	if (!problems.empty())
	{
		// The catalogues are read while the engine starts: a damaged one is the data's problem.
		Close();
		throw LumoraError("the engine reported problems while starting in " + myDataFolder + ":\n" +
		                  JoinLines(problems));
	}
}

EngineSession::~EngineSession()
{
	try
	{
		Close();
	}
	catch (...)
	{
		// Closing from a destructor: the folder it could not enter is reported by the next call.
	}
}

void EngineSession::Close()
{
	if (!myOpenFlag)
	{
		return;
	}
	myOpenFlag = false;
	myLevel.clear();
	WorkingFolder here(myDataFolder);
	{
		py::gil_scoped_release unlocked;
		Lumora::LumoraWrapper::ShutDown();
	}
	ReportCollector::Get().StopListening();
}

Lumora::LumoraWrapper& EngineSession::Facade() const
{
	Lumora::LumoraWrapper* facade = Lumora::LumoraWrapper::GetInstance();
	if (!myOpenFlag || facade == nullptr)
	{
		throw LumoraError("the Editor is closed");
	}
	return *facade;
}

void EngineSession::RequireLevel() const
{
	Facade();
	if (myLevel.empty())
	{
		throw LumoraError("no level is open: call open(level) first");
	}
}

std::vector<std::string> EngineSession::Open(const std::string& aLevel)
{
	Lumora::LumoraWrapper& facade = Facade();
	WorkingFolder here(myDataFolder);
	if (const std::string problem = LumoraTool::LevelFolderProblem(aLevel); !problem.empty())
	{
		throw LumoraError(problem);
	}
	const std::string level = LumoraTool::LevelSpelledOnDisk(aLevel);
	const size_t mark = ReportCollector::Get().Mark();
	{
		py::gil_scoped_release unlocked;
		facade.ParseLevel(Lumora::ToWide(level));
	}
	myLevel = level;
	return ReportCollector::Get().ProblemsSince(mark);
}

std::vector<std::string> EngineSession::GetDecalTypes()
{
	std::vector<std::string> types;
	for (const auto& [name, type] : Facade().GetDecalTypes())
	{
		types.push_back(name);
	}
	return types;
}

py::list EngineSession::GetRooms()
{
	RequireLevel();
	py::list rooms;
	const auto& levelRooms = Facade().GetRooms();
	for (int index = 0; index < levelRooms.Count(); ++index)
	{
		const Zeph::Room& room = *levelRooms[index];
		py::dict record;
		record["id"] = room.GetID();
		record["min"] = Triple(room.GetMin());
		record["max"] = Triple(room.GetMax());
		record["center"] = Triple(room.GetCenterPosition());
		// Where the reflection bake writes the room's cubemap (empty: its ID cannot name a file).
		record["cubemap"] = Zeph::CubemapContainer::GetRoomFile(myLevel, room.GetID());
		rooms.append(record);
	}
	return rooms;
}

py::dict EngineSession::GetGrid()
{
	RequireLevel();
	const Zeph::AmbientGrid grid = Zeph::AmbientGrid::FromRooms(Facade().GetRooms());
	py::dict record;
	record["counts"] = py::make_tuple(grid.myCounts[0], grid.myCounts[1], grid.myCounts[2]);
	record["world_min"] = Triple(grid.myWorldMin);
	record["world_size"] = Triple(grid.myWorldSize);
	return record;
}

void EngineSession::Save()
{
	RequireLevel();
	Lumora::LumoraWrapper& facade = Facade();
	WorkingFolder here(myDataFolder);
	const size_t mark = ReportCollector::Get().Mark();
	{
		py::gil_scoped_release unlocked;
		facade.SaveLights(Lumora::ToWide(myLevel));
		facade.SaveDecals(Lumora::ToWide(myLevel));
	}
	if (const std::vector<std::string> problems = ReportCollector::Get().ProblemsSince(mark);
	    !problems.empty())
	{
		throw LumoraError("level '" + myLevel + "' was not saved whole:\n" + JoinLines(problems));
	}
}

py::tuple EngineSession::GetCamera() const
{
	Vector3<float> position;
	float yaw = 0.0f;
	float pitch = 0.0f;
	Facade().GetCameraPlacement(position, yaw, pitch);
	return py::make_tuple(Triple(position), yaw, pitch);
}

py::array_t<uint8_t> EngineSession::Render(int aWidth, int aHeight, const py::object& aCamera, int aFrames,
                                           const std::string& aMode, bool aMarkersFlag,
                                           const std::string& aPngPath)
{
	Lumora::LumoraWrapper& facade = Facade();
	if (aFrames < 1)
	{
		throw std::invalid_argument("frames must be at least 1");
	}
	const int mode =
	    aMode == "light"  ? Lumora::LIGHT_MODE
	    : aMode == "node" ? Lumora::NODE_MODE
	    : aMode == "decal"
	        ? Lumora::DECAL_MODE
	        : throw std::invalid_argument("mode must be 'light', 'node' or 'decal', not '" + aMode + "'");
	Vector3<float> position;
	float yaw = 0.0f;
	float pitch = 0.0f;
	const bool placeFlag = !aCamera.is_none();
	if (placeFlag)
	{
		const auto [place, turn, tilt] = aCamera.cast<std::tuple<std::array<float, 3>, float, float>>();
		if (!std::isfinite(place[0]) || !std::isfinite(place[1]) || !std::isfinite(place[2]) ||
		    !std::isfinite(turn) || !std::isfinite(tilt))
		{
			throw std::invalid_argument("the camera's position, yaw and pitch must be finite");
		}
		position = Vector3<float>(place[0], place[1], place[2]);
		yaw = turn;
		pitch = tilt;
	}
	WorkingFolder here(myDataFolder);
	const size_t mark = ReportCollector::Get().Mark();
	std::vector<uint8_t> pixels;
	bool readFlag = false;
	bool sizedFlag = true;
	{
		py::gil_scoped_release unlocked;
		sizedFlag = facade.Resize(aWidth, aHeight);
		if (sizedFlag)
		{
			if (placeFlag)
			{
				facade.PlaceCamera(position, yaw, pitch);
			}
			facade.SetIsLightMode(mode);
			facade.RenderMeshes(aMarkersFlag);
			for (int frame = 0; frame < aFrames; ++frame)
			{
				facade.Update(16.0f);
				facade.Render();
			}
			Zeph::Engine* engine = Zeph::Engine::GetInstance();
			engine->MakeContextCurrent();
			readFlag = Gpu::ReadRenderTarget(engine->GetContext(), *engine->GetBackBufferView(), pixels);
			engine->ReleaseContext();
		}
	}
	if (!sizedFlag)
	{
		throw LumoraError("cannot render at " + std::to_string(aWidth) + " x " + std::to_string(aHeight) +
		                  ": " + ReportCollector::Get().LastSince(mark));
	}
	if (!readFlag || pixels.size() != static_cast<size_t>(aWidth) * static_cast<size_t>(aHeight) * 4)
	{
		throw LumoraError("the frame could not be read back");
	}
	for (size_t alpha = 3; alpha < pixels.size(); alpha += 4)
	{
		pixels[alpha] = 255;
	}
	if (!aPngPath.empty() && !Gpu::SavePng(aPngPath, aWidth, aHeight, pixels.data()))
	{
		throw LumoraError("cannot write " + aPngPath);
	}
	py::array_t<uint8_t> image({aHeight, aWidth, 3});
	uint8_t* out = image.mutable_data();
	for (size_t pixel = 0; pixel < static_cast<size_t>(aWidth) * static_cast<size_t>(aHeight); ++pixel)
	{
		out[pixel * 3 + 0] = pixels[pixel * 4 + 0];
		out[pixel * 3 + 1] = pixels[pixel * 4 + 1];
		out[pixel * 3 + 2] = pixels[pixel * 4 + 2];
	}
	return image;
}

void RegisterEngine(py::module_& aModule)
{
	py::class_<EngineSession>(aModule, "EngineSession",
	                          "The engine started headless in a data folder (one per process). The lumora "
	                          "package's Editor wraps it.")
	    .def(py::init<const std::string&, int, int>(), py::arg("data"), py::arg("width"), py::arg("height"))
	    .def("close", &EngineSession::Close)
	    .def_property_readonly("is_open", &EngineSession::IsOpen)
	    .def_property_readonly("data", &EngineSession::GetDataFolder)
	    .def_property_readonly("level", &EngineSession::GetLevel)
	    .def("open", &EngineSession::Open, py::arg("level"))
	    .def("objects", &EngineSession::GetObjects, py::arg("kind"))
	    .def("add", &EngineSession::AddObject, py::arg("kind"), py::arg("values"))
	    .def("set", &EngineSession::SetObject, py::arg("kind"), py::arg("index"), py::arg("values"))
	    .def("remove", &EngineSession::RemoveObject, py::arg("kind"), py::arg("index"))
	    .def("decal_types", &EngineSession::GetDecalTypes)
	    .def("rooms", &EngineSession::GetRooms)
	    .def("grid", &EngineSession::GetGrid)
	    .def("save", &EngineSession::Save)
	    .def("bake", &EngineSession::Bake, py::arg("bounces"), py::arg("ambient"), py::arg("reflections"),
	         py::arg("rooms"), py::arg("progress"), py::arg("poll_seconds"))
	    .def("cancel_bake", &EngineSession::CancelBake)
	    .def("bake_status", &EngineSession::GetBakeStatus)
	    .def("bake_ambient_part", &EngineSession::BakeAmbientPart, py::arg("bounce"), py::arg("previous"),
	         py::arg("first"), py::arg("count"), py::arg("out"))
	    .def("merge_ambient_parts", &EngineSession::MergeAmbientParts, py::arg("parts"), py::arg("out"))
	    .def("bake_reflection_part", &EngineSession::BakeReflectionPart, py::arg("room"), py::arg("ambient"),
	         py::arg("out"))
	    .def("record_bake", &EngineSession::RecordBake, py::arg("phase"), py::arg("rooms"),
	         py::arg("bounces"), py::arg("seconds"))
	    .def("render", &EngineSession::Render, py::arg("width"), py::arg("height"), py::arg("camera"),
	         py::arg("frames"), py::arg("mode"), py::arg("markers"), py::arg("png"))
	    .def("camera", &EngineSession::GetCamera);
}
} // namespace LumoraPython
