#pragma once
// EngineSession: the module's one engine, the editor facade started headless in a data folder.
// The Python package's Editor wraps it; its methods take and give plain Python values (dicts,
// lists, NumPy arrays), and raise LumoraError with the library's own message when the library
// reports a problem. Nothing it is asked ends the interpreter: no report of the library is fatal.
//
//   session = _lumora.EngineSession("/games/x", 1280, 720)   # RuntimeError when one is open
//   session.open("sample_small")
//   session.objects(0)            # the point lights, as dicts
//   session.close()
#include <pybind11/numpy.h>
#include <pybind11/pybind11.h>

#include <functional>
#include <string>
#include <vector>

namespace Lumora
{
class LumoraWrapper;
}

namespace LumoraPython
{
class EngineSession
{
public:
	// The object kinds, as the facade numbers them (LumoraWrapper::ObjectKind).
	enum Kind
	{
		POINT_LIGHT = 0,
		SPOT_LIGHT = 1,
		DECAL = 2,
		PATH_NODE = 3,
	};

	EngineSession(const std::string& aDataFolder, int aWidth, int aHeight);
	~EngineSession();
	EngineSession(const EngineSession&) = delete;
	EngineSession& operator=(const EngineSession&) = delete;

	void Close();
	bool IsOpen() const { return myOpenFlag; }
	const std::string& GetDataFolder() const { return myDataFolder; }
	const std::string& GetLevel() const { return myLevel; }

	// Loads the level; the problems loading reported (empty: loaded cleanly). A level with
	// problems is still loaded as far as it could be; the package refuses to edit it.
	std::vector<std::string> Open(const std::string& aLevel);

	// The placed objects of a kind, as dicts (ObjectAccess.cpp).
	pybind11::list GetObjects(int aKind);
	int AddObject(int aKind, const pybind11::dict& someValues);
	void SetObject(int aKind, int anIndex, const pybind11::dict& someValues);
	void RemoveObject(int aKind, int anIndex);
	std::vector<std::string> GetDecalTypes();
	pybind11::list GetRooms();
	pybind11::dict GetGrid();

	// Writes lights.xml, nodegraph.xml and decals.xml; LumoraError with the problems.
	void Save();

	// Bakes on a thread of its own while this one polls the status every aPollSeconds, calling
	// aProgress (when not None) with the status dict. Ctrl-C, or an exception in aProgress,
	// cancels the bake, waits for it to stop, and is raised. A dict of the outcome (SessionBakes.cpp).
	pybind11::dict Bake(int aBounces, bool anAmbientFlag, bool aReflectionsFlag,
	                    const std::vector<std::string>& someRooms, const pybind11::object& aProgress,
	                    double aPollSeconds);
	// Any thread, without waiting.
	void CancelBake();
	pybind11::dict GetBakeStatus() const;
	// The pieces of a bake spread over machines (LumoraWrapper's ...Part, MergeAmbientParts and
	// RecordBake); LumoraError with the reason when they fail.
	void BakeAmbientPart(int aBounce, const std::string& aPrevious, long long aFirst, long long aCount,
	                     const std::string& anOutFile);
	void MergeAmbientParts(const std::vector<std::string>& someParts, const std::string& anOutFile);
	void BakeReflectionPart(const std::string& aRoom, const std::string& anAmbientFile,
	                        const std::string& anOutFile);
	std::string RecordBake(const std::string& aPhase, const std::vector<std::string>& someRooms, int aBounces,
	                       double aSeconds);

	// A frame at aWidth x aHeight from the camera (position, yaw, pitch; None: where it is) after
	// aFrames frames for the eye adaptation: an array of height x width x 3 bytes (RGB), also
	// written to aPngPath when that is not empty.
	pybind11::array_t<uint8_t> Render(int aWidth, int aHeight, const pybind11::object& aCamera, int aFrames,
	                                  const std::string& aMode, bool aMarkersFlag,
	                                  const std::string& aPngPath);
	// The camera's position, yaw and pitch.
	pybind11::tuple GetCamera() const;

private:
	Lumora::LumoraWrapper& Facade() const;
	// Throws LumoraError unless a level is open.
	void RequireLevel() const;
	// Runs one piece of a distributed bake in the data folder without Python's lock; LumoraError,
	// starting with aWhat, with the piece's problem and the reports made meanwhile, when it fails.
	void RunPiece(const std::string& aWhat,
	              const std::function<bool(Lumora::LumoraWrapper&, std::string&)>& aPiece);

	std::string myDataFolder;
	std::string myLevel;
	bool myOpenFlag = false;
};

void RegisterEngine(pybind11::module_& aModule);
} // namespace LumoraPython
