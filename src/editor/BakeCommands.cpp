// The facade's bake commands: the level's scene queued once as a frame would queue it
// (in light mode: entities, lights and decals, no node markers, no decal box), then the
// renderer's bake on the calling thread while the facade is held.
#include "editor/LumoraWrapper.h"

#include <algorithm>

#include "editor/BakeInputs.h"
#include "editor/BakeRecord.h"
#include "editor/StringConversion.h"
#include "engine/Engine.h"
#include "engine/EngineReport.h"
#include "engine/Room.h"
#include "renderer/AmbientGrid.h"
#include "renderer/AmbientPartFile.h"
#include "renderer/CubemapContainer.h"
#include "renderer/Renderer.h"

namespace Lumora
{
namespace
{
std::string AmbientPath(const std::u16string& aLevel)
{
	return "data/XML/levels/" + ToNarrow(aLevel) + "/ambient.sh";
}

// The rooms named by someIDs, or the first ID that names none.
std::string FindRooms(const GrowingArray<Zeph::Room*>& someRooms, const std::vector<std::string>& someIDs,
                      GrowingArray<Zeph::Room*>& aFoundOut)
{
	for (const std::string& id : someIDs)
	{
		bool foundFlag = false;
		for (int index = 0; index < someRooms.Count(); ++index)
		{
			if (someRooms[index]->GetID() == id)
			{
				aFoundOut.Add(someRooms[index]);
				foundFlag = true;
			}
		}
		if (!foundFlag)
		{
			return "the level has no room with the ID '" + id + "'";
		}
	}
	return someIDs.empty() ? "no room IDs given" : std::string();
}

// The record of a bake whose outputs are in place: what it wrote and what it was made from.
bool WriteRecord(const std::string& aLevel, BakePhase aPhase, const std::vector<std::string>& someRooms,
                 const GrowingArray<Zeph::Room*>& someLevelRooms, int aBounces,
                 const std::map<std::string, double>& someTimings, std::string& aMessageOut)
{
	std::vector<std::string> written;
	if (aPhase == BakePhase::AMBIENT)
	{
		written.push_back(AmbientPath(ToWide(aLevel)));
	}
	else
	{
		for (int index = 0; index < someLevelRooms.Count(); ++index)
		{
			const std::string& id = someLevelRooms[index]->GetID();
			const std::string file = Zeph::CubemapContainer::GetRoomFile(aLevel, id);
			if (!file.empty() &&
			    (someRooms.empty() || std::find(someRooms.begin(), someRooms.end(), id) != someRooms.end()))
			{
				written.push_back(file);
			}
		}
	}
	BakePhaseRecord record = MakeBakePhaseRecord(someRooms, written, someTimings, CollectBakeInputs(aLevel));
	if (aPhase == BakePhase::AMBIENT)
	{
		const Zeph::AmbientGrid grid = Zeph::AmbientGrid::FromRooms(someLevelRooms);
		record.myBounces = aBounces;
		std::copy(grid.myCounts, grid.myCounts + 3, record.myGrid.myCounts);
		record.myGrid.myWorldMin = grid.myWorldMin;
		record.myGrid.myWorldSize = grid.myWorldSize;
	}
	return RecordBakePhase(aLevel, aPhase, record, aMessageOut);
}

// After a bake that finished, what it wrote and what it was made from go into the level's
// bake.json. A record that cannot be written is an error entry; the baked files stand.
void RecordPhase(const std::u16string& aLevel, BakePhase aPhase, const std::vector<std::string>& someRooms,
                 const GrowingArray<Zeph::Room*>& someLevelRooms, int aBounces)
{
	const Zeph::Renderer& renderer = Zeph::Engine::GetInstance()->GetRenderer();
	const Zeph::BakeStatus status = renderer.GetBakeStatus();
	if (status.myLastResult != Zeph::BakeResult::FINISHED || (aPhase == BakePhase::AMBIENT && aBounces <= 0))
	{
		return;
	}
	std::map<std::string, double> timings{{"total", status.myElapsedSeconds}};
	if (aPhase == BakePhase::AMBIENT)
	{
		timings["rendering"] = renderer.GetBakeTimings().myRendering;
		timings["readback"] = renderer.GetBakeTimings().myReadback;
		timings["projection"] = renderer.GetBakeTimings().myProjection;
	}
	std::string message;
	if (!WriteRecord(ToNarrow(aLevel), aPhase, someRooms, someLevelRooms, aBounces, timings, message))
	{
		Zeph::ReportError(__LINE__, "Lumora::LumoraWrapper::RecordBake", "%s", message.c_str());
	}
	else if (!message.empty())
	{
		Zeph::ReportDebug(__LINE__, "Lumora::LumoraWrapper::RecordBake", "%s", message.c_str());
	}
}

// Why the renderer's last bake did not finish (aName names it), or empty when it did.
std::string UnfinishedBake(const char* aName)
{
	const Zeph::BakeStatus status = Zeph::Engine::GetInstance()->GetRenderer().GetBakeStatus();
	if (status.myLastResult == Zeph::BakeResult::FINISHED)
	{
		return {};
	}
	return std::string("the ") + aName + " bake " + Zeph::GetBakeResultName(status.myLastResult) + ": " +
	       status.myLastMessage;
}

// One hash over every file a part of the loaded level's ambient bake reads: the bake's inputs
// and the cubemaps its ambient pass reflects (the rooms' own, the fallback). The record leaves
// the cubemaps out, as they are the reflection bake's outputs (a whole bake writes them after
// the volume); parts baked before and after they changed must not be merged.
std::string HashOfInputs(const std::u16string& aLevel, const GrowingArray<Zeph::Room*>& someRooms)
{
	const std::string level = ToNarrow(aLevel);
	std::vector<std::string> inputs = CollectBakeInputs(level);
	inputs.push_back(Zeph::CubemapContainer::ourFallbackFile);
	for (int index = 0; index < someRooms.Count(); ++index)
	{
		const std::string file = Zeph::CubemapContainer::GetRoomFile(level, someRooms[index]->GetID());
		if (!file.empty())
		{
			inputs.push_back(file);
		}
	}
	return CombineInputHashes(HashBakeInputs(inputs));
}
} // namespace

void LumoraWrapper::QueueBakeScene()
{
	const LumoraMode mode = myMode;
	myMode = LIGHT_MODE;
	// The light gizmos are grown first, so the queued scene has one for every light
	// even when the lights were added or loaded in another mode.
	UpdateScene(0.0f);
	RenderScene();
	myMode = mode;
}

void LumoraWrapper::BakeAmbient(const std::u16string& aLevel, int aNumOfBounces, bool aSaveToDDSFlag)
{
	Claim();
	QueueBakeScene();
	Zeph::Renderer& renderer = Zeph::Engine::GetInstance()->GetRenderer();
	renderer.GenerateSH(myRooms, AmbientPath(aLevel), aNumOfBounces, aSaveToDDSFlag);
	// The queued scene's markers were never drawn; a later load may delete them.
	renderer.DiscardLateItems();
	RecordPhase(aLevel, BakePhase::AMBIENT, {}, myRooms, aNumOfBounces);
	Release();
}

void LumoraWrapper::ShowBakedReflections(const std::u16string& aLevel)
{
	// The cubemaps the frame shows were read when the level loaded: after a finished bake they
	// are read again from the new files, so the view shows what was baked.
	if (Zeph::Engine::GetInstance()->GetRenderer().GetBakeStatus().myLastResult != Zeph::BakeResult::FINISHED)
	{
		return;
	}
	Zeph::Engine::GetInstance()->GetCubemapContainer().Clear();
	AssignRoomCubemaps(SysSTringToStdString(aLevel));
}

void LumoraWrapper::BakeSpecular(const std::u16string& aLevel)
{
	Claim();
	QueueBakeScene();
	Zeph::Renderer& renderer = Zeph::Engine::GetInstance()->GetRenderer();
	renderer.GenerateReflections(myRooms, SysSTringToStdString(aLevel));
	renderer.DiscardLateItems();
	RecordPhase(aLevel, BakePhase::REFLECTIONS, {}, myRooms, 0);
	ShowBakedReflections(aLevel);
	Release();
}

bool LumoraWrapper::BakeRooms(const std::vector<std::string>& someRoomIDs, std::string& aProblemOut,
                              const std::function<void(const GrowingArray<Zeph::Room*>&)>& aBake)
{
	Claim();
	GrowingArray<Zeph::Room*> rooms(4, 4);
	aProblemOut = FindRooms(myRooms, someRoomIDs, rooms);
	if (aProblemOut.empty())
	{
		QueueBakeScene();
		aBake(rooms);
		Zeph::Engine::GetInstance()->GetRenderer().DiscardLateItems();
	}
	Release();
	return aProblemOut.empty();
}

bool LumoraWrapper::BakeAmbientRooms(const std::u16string& aLevel, int aNumOfBounces,
                                     const std::vector<std::string>& someRoomIDs, std::string& aProblemOut)
{
	return BakeRooms(someRoomIDs, aProblemOut, [&](const GrowingArray<Zeph::Room*>& someRooms) {
		Zeph::Renderer& renderer = Zeph::Engine::GetInstance()->GetRenderer();
		renderer.GenerateSHForRooms(myRooms, someRooms, AmbientPath(aLevel), aNumOfBounces);
		// A room bake that had to bake the whole volume (its message says why) is recorded as one.
		const bool wholeFlag = !renderer.GetBakeStatus().myLastMessage.empty();
		RecordPhase(aLevel, BakePhase::AMBIENT, wholeFlag ? std::vector<std::string>() : someRoomIDs, myRooms,
		            aNumOfBounces);
		aProblemOut = UnfinishedBake("ambient");
	});
}

bool LumoraWrapper::BakeSpecularRooms(const std::u16string& aLevel,
                                      const std::vector<std::string>& someRoomIDs, std::string& aProblemOut)
{
	return BakeRooms(someRoomIDs, aProblemOut, [&](const GrowingArray<Zeph::Room*>&) {
		Zeph::Engine::GetInstance()->GetRenderer().GenerateReflections(myRooms, SysSTringToStdString(aLevel),
		                                                               &someRoomIDs);
		RecordPhase(aLevel, BakePhase::REFLECTIONS, someRoomIDs, myRooms, 0);
		ShowBakedReflections(aLevel);
		aProblemOut = UnfinishedBake("reflection");
	});
}

bool LumoraWrapper::BakeAmbientPart(const std::u16string& aLevel, int aBounce,
                                    const std::string& aPreviousFile, long long aFirst, long long aCount,
                                    const std::string& anOutFile, std::string& aProblemOut)
{
	Zeph::AmbientVolume previous;
	std::string previousHash;
	if (aBounce > 1)
	{
		if (aPreviousFile.empty())
		{
			aProblemOut = "bounce " + std::to_string(aBounce) + " needs the merged volume of bounce " +
			              std::to_string(aBounce - 1);
			return false;
		}
		if (Zeph::ReadAmbientVolume(aPreviousFile, previous, aProblemOut) != Zeph::AmbientVolumeRead::OK)
		{
			aProblemOut = aProblemOut.empty() ? aPreviousFile + " cannot be opened" : aProblemOut;
			return false;
		}
		previousHash = HashBakeInputs({aPreviousFile}).begin()->second;
	}
	else if (!aPreviousFile.empty())
	{
		aProblemOut = "bounce 1 is lit by direct light only: it takes no previous volume";
		return false;
	}
	Claim();
	const std::string inputsHash = HashOfInputs(aLevel, myRooms);
	Zeph::Renderer& renderer = Zeph::Engine::GetInstance()->GetRenderer();
	QueueBakeScene();
	Zeph::AmbientPart part;
	bool bakedFlag =
	    renderer.GenerateSHPart(myRooms, aBounce, aBounce > 1 ? &previous : nullptr, aFirst, aCount, part);
	renderer.DiscardLateItems();
	// The part's light is not the level's: the editor shows the level's own again.
	renderer.SetSH(AmbientPath(aLevel));
	Release();
	if (!bakedFlag)
	{
		aProblemOut = UnfinishedBake("part");
		return false;
	}
	part.myInputsHash = inputsHash;
	part.myPreviousHash = previousHash;
	return Zeph::WriteAmbientPart(anOutFile, part, aProblemOut);
}

bool LumoraWrapper::MergeAmbientParts(const std::u16string& aLevel, const std::vector<std::string>& someParts,
                                      const std::string& anOutFile, std::string& aProblemOut)
{
	Claim();
	const Zeph::AmbientGrid grid = Zeph::AmbientGrid::FromRooms(myRooms);
	Zeph::AmbientPart expected;
	expected.myWorldMin = grid.myWorldMin;
	expected.myWorldSize = grid.myWorldSize;
	std::copy(grid.myCounts, grid.myCounts + 3, expected.myCounts);
	expected.myInputsHash = HashOfInputs(aLevel, myRooms);
	Release();
	Zeph::AmbientVolume volume;
	return Zeph::MergeAmbientParts(someParts, expected, volume, aProblemOut) &&
	       Zeph::WriteAmbientVolume(anOutFile, volume, aProblemOut);
}

bool LumoraWrapper::BakeSpecularPart(const std::u16string& aLevel, const std::string& aRoomID,
                                     const std::string& anAmbientFile, const std::string& anOutFile,
                                     std::string& aProblemOut)
{
	Claim();
	Zeph::Renderer& renderer = Zeph::Engine::GetInstance()->GetRenderer();
	if (!anAmbientFile.empty())
	{
		renderer.SetSH(anAmbientFile);
	}
	QueueBakeScene();
	const bool bakedFlag = renderer.GenerateReflectionPart(myRooms, aRoomID, anOutFile);
	renderer.DiscardLateItems();
	if (!anAmbientFile.empty())
	{
		renderer.SetSH(AmbientPath(aLevel));
	}
	Release();
	aProblemOut = bakedFlag ? std::string() : UnfinishedBake("reflection part");
	return bakedFlag;
}

bool LumoraWrapper::RecordBake(const std::u16string& aLevel, BakePhase aPhase,
                               const std::vector<std::string>& someRooms, int aBounces,
                               const std::map<std::string, double>& someTimings, std::string& aProblemOut)
{
	Claim();
	const bool writtenFlag =
	    WriteRecord(ToNarrow(aLevel), aPhase, someRooms, myRooms, aBounces, someTimings, aProblemOut);
	Release();
	return writtenFlag;
}

void LumoraWrapper::CancelBake()
{
	if (Zeph::Engine* engine = Zeph::Engine::GetInstance())
	{
		engine->GetRenderer().CancelBake();
	}
}

Zeph::BakeStatus LumoraWrapper::GetBakeStatus() const
{
	Zeph::Engine* engine = Zeph::Engine::GetInstance();
	return engine != nullptr ? engine->GetRenderer().GetBakeStatus() : Zeph::BakeStatus();
}

int LumoraWrapper::GetBakeProgress() const
{
	Zeph::Engine* engine = Zeph::Engine::GetInstance();
	return engine != nullptr ? engine->GetRenderer().GetBakingProgress() : 0;
}
} // namespace Lumora
