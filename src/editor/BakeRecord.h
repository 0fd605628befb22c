#pragma once
// BakeRecord: what a level's last bakes were made from and what they wrote, kept beside the
// level's files as data/XML/levels/<level>/bake.json (pretty JSON, written whole through a
// temporary). From it `lumora check` tells a missing or stale bake and `lumora info` describes
// one. A record has a section per phase, each written by that phase's bake.
//
// After a bake, while the level is still loaded (CollectBakeInputs names what the engine loaded):
//
//   Lumora::BakePhaseRecord ambient =
//       Lumora::MakeBakePhaseRecord(rooms, written, timings, Lumora::CollectBakeInputs(level));
//   ambient.myBounces = 2;
//   ambient.myGrid = {{nx, ny, nz}, worldMin, worldSize};
//   std::string message;
//   if (!Lumora::RecordBakePhase(level, Lumora::BakePhase::AMBIENT, ambient, message))
//       ...   // not written: message says why
//   else if (!message.empty())
//       ...   // written, over a damaged record that message names
//
// Later, from the folder holding data/:
//
//   Lumora::BakeRecord record;
//   std::string problem;
//   const std::string path = Lumora::GetBakeRecordPath(level);
//   if (Lumora::ReadBakeRecord(path, record, problem) == Lumora::BakeRecordRead::OK)
//       for (const std::string& line : Lumora::FindStaleInputs(record)) { ... }
#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <vector>

#include "core/Vector3.h"

namespace Lumora
{
enum class BakePhase
{
	AMBIENT,
	REFLECTIONS,
};

// The ambient volume's probe grid.
struct BakeGrid
{
	int myCounts[3] = {0, 0, 0};
	Vector3<float> myWorldMin{0.0f, 0.0f, 0.0f};
	Vector3<float> myWorldSize{0.0f, 0.0f, 0.0f};

	bool operator==(const BakeGrid& anOther) const;
};

// A bake of some rooms made after the bake that its section describes.
struct BakeRoomUpdate
{
	std::string myDate;
	std::vector<std::string> myRooms;

	bool operator==(const BakeRoomUpdate&) const = default;
};

struct BakePhaseRecord
{
	// UTC, ISO 8601 to the second: "2026-11-24T10:31:02Z".
	std::string myDate;
	// Lumora::GetVersion() of the library that baked.
	std::string myToolVersion;
	// The ambient phase's only.
	int myBounces = 0;
	BakeGrid myGrid;
	// The IDs of the rooms baked; empty: every room.
	std::vector<std::string> myRooms;
	// Each file written, with its size in bytes.
	std::map<std::string, uint64_t> myFiles;
	// Seconds per step of the bake ("total", "rendering", "readback", "projection", ...).
	std::map<std::string, double> myTimings;
	// Each input's content hash (BakeInputs.h).
	std::map<std::string, std::string> myInputs;
	// The rooms baked again since (RecordBakePhase), oldest first.
	std::vector<BakeRoomUpdate> myRoomUpdates;

	bool operator==(const BakePhaseRecord&) const = default;
};

struct BakeRecord
{
	std::optional<BakePhaseRecord> myAmbient;
	std::optional<BakePhaseRecord> myReflections;

	bool operator==(const BakeRecord&) const = default;
};

enum class BakeRecordRead
{
	OK,
	MISSING, // no file: the level was not baked since records are kept
	DAMAGED, // aProblemRef names the file and says what is wrong; nothing of it is used
};

// "data/XML/levels/<level>/bake.json".
std::string GetBakeRecordPath(const std::string& aLevel);

// The present moment as a record's date.
std::string GetBakeDateNow();
// "2026-11-24 10:31" for "2026-11-24T10:31:02Z", as messages give it.
std::string ShortBakeDate(const std::string& aDate);

// A phase's record dated now by this library: the written files' sizes as they are on disk (a
// file that is not there is left out), the timings, and the inputs hashed. The ambient phase's
// bounces and grid are the caller's to set.
BakePhaseRecord MakeBakePhaseRecord(const std::vector<std::string>& someRooms,
                                    const std::vector<std::string>& someWrittenFiles,
                                    const std::map<std::string, double>& someTimings,
                                    const std::vector<std::string>& someInputs);

// Writes the record as the level's bake.json, through a temporary renamed over the old file;
// false, with aProblemRef naming the file and the reason, when it cannot (the old one stays).
bool WriteBakeRecord(const std::string& aLevel, const BakeRecord& aRecord, std::string& aProblemRef);

// Reads a bake.json. Whatever the file holds, this neither throws nor crashes: what is not a
// record as WriteBakeRecord writes it is DAMAGED, with one line in aProblemRef.
BakeRecordRead ReadBakeRecord(const std::string& aPath, BakeRecord& aRecordOut, std::string& aProblemRef);

// Puts a phase's record into the level's bake.json, keeping the other phase. A damaged record is
// replaced (true, and aMessageRef says so); false, with aMessageRef saying why, when nothing could
// be written. A bake of some rooms into a section that holds more is merged (see the source).
bool RecordBakePhase(const std::string& aLevel, BakePhase aPhase, const BakePhaseRecord& aRecord,
                     std::string& aMessageRef);

// One line per input that differs from the record now: "lights.xml changed since the ambient
// bake of 2026-11-24 10:31", "data/textures/brick_d.dds is gone since the reflection bake of ...".
// The level's own files are named by their file name. Each file is hashed once, from the
// working folder; the second form takes hashes made already (HashBakeInputs).
std::vector<std::string> FindStaleInputs(const BakeRecord& aRecord);
std::vector<std::string> FindStaleInputs(const BakeRecord& aRecord,
                                         const std::map<std::string, std::string>& someCurrentHashes);
// Every input path either phase lists, each once.
std::vector<std::string> GetRecordedInputs(const BakeRecord& aRecord);
} // namespace Lumora
