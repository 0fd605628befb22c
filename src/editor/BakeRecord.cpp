#include "editor/BakeRecord.h"

#include <algorithm>
#include <cfloat>
#include <cmath>
#include <ctime>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <limits>
#include <nlohmann/json.hpp>
#include <set>
#include <system_error>
#include <tuple>

#include "core/ShortestDecimal.h"
#include "editor/BakeInputs.h"
#include "engine/FI_File.h"
#include "platform/paths/Paths.h"

namespace Lumora
{
namespace
{
// Keys keep the order they are written in, so the file reads date first.
using Json = nlohmann::ordered_json;

constexpr int ourFormat = 1;
// Far beyond any level's record; a larger file is not read into memory.
constexpr uintmax_t ourMaxRecordBytes = 16u << 20;
// LUMORA_VERSION is the project version that Lumora::GetVersion() returns too: that function
// lives in liblumora's own object, which the folder libraries do not link.
constexpr const char* ourToolVersion = LUMORA_VERSION;

const char* SectionName(BakePhase aPhase)
{
	switch (aPhase)
	{
	case BakePhase::AMBIENT:
		return "ambient";
	case BakePhase::REFLECTIONS:
		return "reflections";
	}
	return "";
}

// What a phase's bake is called in messages.
const char* BakeName(BakePhase aPhase)
{
	switch (aPhase)
	{
	case BakePhase::AMBIENT:
		return "ambient";
	case BakePhase::REFLECTIONS:
		return "reflection";
	}
	return "";
}

bool IsBakeDate(const std::string& aText)
{
	static const char ourPattern[] = "dddd-dd-ddTdd:dd:ddZ";
	if (aText.size() != sizeof(ourPattern) - 1)
	{
		return false;
	}
	for (size_t index = 0; index < aText.size(); ++index)
	{
		const bool digitFlag = aText[index] >= '0' && aText[index] <= '9';
		if (ourPattern[index] == 'd' ? !digitFlag : aText[index] != ourPattern[index])
		{
			return false;
		}
	}
	return true;
}

Json VectorJson(const Vector3<float>& aVector)
{
	return Json::array({ShortestDecimal(aVector.x), ShortestDecimal(aVector.y), ShortestDecimal(aVector.z)});
}

Json SectionJson(BakePhase aPhase, const BakePhaseRecord& aRecord)
{
	Json section = Json::object();
	section["date"] = aRecord.myDate;
	section["tool_version"] = aRecord.myToolVersion;
	if (aPhase == BakePhase::AMBIENT)
	{
		section["bounces"] = aRecord.myBounces;
		const BakeGrid& grid = aRecord.myGrid;
		section["grid"] = Json::object({{"counts", {grid.myCounts[0], grid.myCounts[1], grid.myCounts[2]}},
		                                {"world_min", VectorJson(grid.myWorldMin)},
		                                {"world_size", VectorJson(grid.myWorldSize)}});
	}
	section["rooms"] = aRecord.myRooms;
	section["files"] = Json::object();
	for (const auto& [path, size] : aRecord.myFiles)
	{
		section["files"][path] = size;
	}
	// To the millisecond: the rest is noise. A time that is no number (JSON has none) is left out.
	section["timings"] = Json::object();
	for (const auto& [step, seconds] : aRecord.myTimings)
	{
		if (std::isfinite(seconds) && seconds >= 0.0)
		{
			section["timings"][step] = std::round(seconds * 1000.0) / 1000.0;
		}
	}
	section["inputs"] = Json::object();
	for (const auto& [path, hash] : aRecord.myInputs)
	{
		section["inputs"][path] = hash;
	}
	section["room_bakes"] = Json::array();
	for (const BakeRoomUpdate& update : aRecord.myRoomUpdates)
	{
		section["room_bakes"].push_back(Json::object({{"date", update.myDate}, {"rooms", update.myRooms}}));
	}
	return section;
}

// What is wrong with a record, thrown while it is read and caught in ReadBakeRecord.
struct RecordError
{
	std::string myText;
};

// A value and where it is in the file, as a JSON pointer ("/ambient/grid/counts/0").
struct Place
{
	const Json& myValue;
	std::string myWhere;

	Place Member(const char* aName) const
	{
		if (!myValue.is_object())
		{
			throw RecordError{Where() + " is not an object"};
		}
		const auto found = myValue.find(aName);
		if (found == myValue.end())
		{
			throw RecordError{Where() + " has no \"" + aName + "\""};
		}
		return {*found, myWhere + "/" + aName};
	}

	std::string Where() const { return myWhere.empty() ? "the file" : myWhere; }

	void Require(bool aFlag, const char* aWhat) const
	{
		if (!aFlag)
		{
			throw RecordError{Where() + " is not " + aWhat};
		}
	}

	long long Whole(long long aMinimum, long long aMaximum) const
	{
		const std::string range =
		    "a whole number from " + std::to_string(aMinimum) + " to " + std::to_string(aMaximum);
		Require(myValue.is_number_integer(), range.c_str());
		// Read as the kind it is, so that a huge unsigned number does not wrap into range.
		long long value = 0;
		bool inRangeFlag = false;
		if (myValue.is_number_unsigned())
		{
			const uint64_t unsignedValue = myValue.get<uint64_t>();
			inRangeFlag = unsignedValue <= static_cast<uint64_t>(aMaximum);
			value = static_cast<long long>(unsignedValue);
		}
		else
		{
			value = myValue.get<int64_t>();
			inRangeFlag = value <= aMaximum;
		}
		Require(inRangeFlag && value >= aMinimum, range.c_str());
		return value;
	}

	double Number(double aMinimum, double aMaximum) const
	{
		Require(myValue.is_number(), "a number");
		const double value = myValue.get<double>();
		Require(std::isfinite(value) && value >= aMinimum && value <= aMaximum, "a number in range");
		return value;
	}

	std::string Text() const
	{
		Require(myValue.is_string(), "a string");
		return myValue.get<std::string>();
	}

	std::string Date() const
	{
		const std::string date = Text();
		Require(IsBakeDate(date), "a date such as \"2026-11-24T10:31:02Z\"");
		return date;
	}

	std::vector<std::string> Texts() const
	{
		Require(myValue.is_array(), "an array of strings");
		std::vector<std::string> texts;
		for (size_t index = 0; index < myValue.size(); ++index)
		{
			texts.push_back(Place{myValue[index], myWhere + "/" + std::to_string(index)}.Text());
		}
		return texts;
	}

	Vector3<float> Vector() const
	{
		Require(myValue.is_array() && myValue.size() == 3, "an array of 3 numbers");
		float values[3];
		for (size_t index = 0; index < 3; ++index)
		{
			values[index] = static_cast<float>(
			    Place{myValue[index], myWhere + "/" + std::to_string(index)}.Number(-FLT_MAX, FLT_MAX));
		}
		return {values[0], values[1], values[2]};
	}

	// Each member of an object, with its place.
	template <typename Visit> void Members(Visit aVisit) const
	{
		Require(myValue.is_object(), "an object");
		for (auto member = myValue.begin(); member != myValue.end(); ++member)
		{
			aVisit(member.key(), Place{member.value(), myWhere + "/" + member.key()});
		}
	}
};

BakePhaseRecord ReadSection(BakePhase aPhase, const Place& aSection)
{
	aSection.Require(aSection.myValue.is_object(), "an object");
	BakePhaseRecord record;
	record.myDate = aSection.Member("date").Date();
	record.myToolVersion = aSection.Member("tool_version").Text();
	if (aPhase == BakePhase::AMBIENT)
	{
		record.myBounces = static_cast<int>(aSection.Member("bounces").Whole(0, 1 << 20));
		const Place grid = aSection.Member("grid");
		const Place counts = grid.Member("counts");
		counts.Require(counts.myValue.is_array() && counts.myValue.size() == 3,
		               "an array of 3 whole numbers");
		for (size_t axis = 0; axis < 3; ++axis)
		{
			record.myGrid.myCounts[axis] = static_cast<int>(
			    Place{counts.myValue[axis], counts.myWhere + "/" + std::to_string(axis)}.Whole(
			        0, std::numeric_limits<int>::max()));
		}
		record.myGrid.myWorldMin = grid.Member("world_min").Vector();
		record.myGrid.myWorldSize = grid.Member("world_size").Vector();
	}
	record.myRooms = aSection.Member("rooms").Texts();
	aSection.Member("files").Members([&](const std::string& aPath, const Place& aSize) {
		record.myFiles[aPath] = static_cast<uint64_t>(aSize.Whole(0, std::numeric_limits<int64_t>::max()));
	});
	aSection.Member("timings").Members([&](const std::string& aStep, const Place& aSeconds) {
		record.myTimings[aStep] = aSeconds.Number(0.0, DBL_MAX);
	});
	aSection.Member("inputs").Members([&](const std::string& aPath, const Place& aHash) {
		const std::string hash = aHash.Text();
		aHash.Require(IsInputHash(hash) || hash == ourMissingHash, "32 lowercase hex digits or \"missing\"");
		record.myInputs[aPath] = hash;
	});
	const Place updates = aSection.Member("room_bakes");
	updates.Require(updates.myValue.is_array(), "an array");
	for (size_t index = 0; index < updates.myValue.size(); ++index)
	{
		const Place update{updates.myValue[index], updates.myWhere + "/" + std::to_string(index)};
		record.myRoomUpdates.push_back({update.Member("date").Date(), update.Member("rooms").Texts()});
	}
	return record;
}

BakeRecord ReadRecordJson(const Json& aDocument)
{
	const Place root{aDocument, ""};
	root.Require(aDocument.is_object(), "a JSON object");
	const long long format = root.Member("format").Whole(0, std::numeric_limits<int>::max());
	if (format != ourFormat)
	{
		throw RecordError{"format " + std::to_string(format) + ", which this Lumora (format " +
		                  std::to_string(ourFormat) + ") cannot read"};
	}
	BakeRecord record;
	for (const BakePhase phase : {BakePhase::AMBIENT, BakePhase::REFLECTIONS})
	{
		if (aDocument.contains(SectionName(phase)))
		{
			(phase == BakePhase::AMBIENT ? record.myAmbient : record.myReflections) =
			    ReadSection(phase, root.Member(SectionName(phase)));
		}
	}
	return record;
}

// Whether the section holds a bake of some rooms only, every one of them among someRooms: a bake
// of those replaces the section.
bool CoversSection(const BakePhaseRecord& aSection, const std::vector<std::string>& someRooms)
{
	if (aSection.myRooms.empty())
	{
		return false;
	}
	const std::set<std::string> baked(someRooms.begin(), someRooms.end());
	std::vector<std::string> onRecord = aSection.myRooms;
	for (const BakeRoomUpdate& update : aSection.myRoomUpdates)
	{
		onRecord.insert(onRecord.end(), update.myRooms.begin(), update.myRooms.end());
	}
	return std::all_of(onRecord.begin(), onRecord.end(),
	                   [&](const std::string& aRoom) { return baked.contains(aRoom); });
}

// A whole bake replaces the section; so does a bake of some rooms when the section holds no
// others. A bake of some rooms into a section that holds more keeps the section's date, version,
// inputs, grid and timings: the other rooms were baked from those inputs, so a change since
// then still makes the level stale (while the fresh rooms are not, a check cannot tell them
// apart). The rooms' files and sizes are updated and the bake is added to the section's room
// bakes. With no section yet, a bake of some rooms is the section, with its own inputs.
void MergePhase(std::optional<BakePhaseRecord>& aSection, const BakePhaseRecord& aRecord)
{
	if (!aSection || aRecord.myRooms.empty() || CoversSection(*aSection, aRecord.myRooms))
	{
		aSection = aRecord;
		return;
	}
	for (const auto& [path, size] : aRecord.myFiles)
	{
		aSection->myFiles[path] = size;
	}
	aSection->myRoomUpdates.push_back({aRecord.myDate, aRecord.myRooms});
}

// How a message names an input: a level's own file by its name (the level is the one checked).
std::string InputName(const std::string& aPath)
{
	static const std::string ourLevels = "data/XML/levels/";
	if (aPath.starts_with(ourLevels))
	{
		const size_t slash = aPath.find('/', ourLevels.size());
		if (slash != std::string::npos && aPath.find('/', slash + 1) == std::string::npos)
		{
			return aPath.substr(slash + 1);
		}
	}
	return aPath;
}
} // namespace

bool BakeGrid::operator==(const BakeGrid& anOther) const
{
	const auto values = [](const BakeGrid& aGrid) {
		return std::tuple(aGrid.myCounts[0], aGrid.myCounts[1], aGrid.myCounts[2], aGrid.myWorldMin.x,
		                  aGrid.myWorldMin.y, aGrid.myWorldMin.z, aGrid.myWorldSize.x, aGrid.myWorldSize.y,
		                  aGrid.myWorldSize.z);
	};
	return values(*this) == values(anOther);
}

std::string GetBakeRecordPath(const std::string& aLevel)
{
	return "data/XML/levels/" + aLevel + "/bake.json";
}

std::string GetBakeDateNow()
{
	const std::time_t now = std::time(nullptr);
	std::tm utc{};
	gmtime_r(&now, &utc);
	char text[32];
	std::strftime(text, sizeof(text), "%Y-%m-%dT%H:%M:%SZ", &utc);
	return text;
}

std::string ShortBakeDate(const std::string& aDate)
{
	return IsBakeDate(aDate) ? aDate.substr(0, 10) + " " + aDate.substr(11, 5) : aDate;
}

BakePhaseRecord MakeBakePhaseRecord(const std::vector<std::string>& someRooms,
                                    const std::vector<std::string>& someWrittenFiles,
                                    const std::map<std::string, double>& someTimings,
                                    const std::vector<std::string>& someInputs)
{
	BakePhaseRecord record;
	record.myDate = GetBakeDateNow();
	record.myToolVersion = ourToolVersion;
	record.myRooms = someRooms;
	for (const std::string& path : someWrittenFiles)
	{
		std::error_code error;
		const uintmax_t size = std::filesystem::file_size(Paths::Resolve(path), error);
		if (!error)
		{
			record.myFiles[path] = size;
		}
	}
	record.myTimings = someTimings;
	record.myInputs = HashBakeInputs(someInputs);
	return record;
}

bool WriteBakeRecord(const std::string& aLevel, const BakeRecord& aRecord, std::string& aProblemRef)
{
	const std::string path = GetBakeRecordPath(aLevel);
	Json document = Json::object();
	document["format"] = ourFormat;
	if (aRecord.myAmbient)
	{
		document["ambient"] = SectionJson(BakePhase::AMBIENT, *aRecord.myAmbient);
	}
	if (aRecord.myReflections)
	{
		document["reflections"] = SectionJson(BakePhase::REFLECTIONS, *aRecord.myReflections);
	}
	// A name that is no UTF-8 (a room ID from a hand-edited file) is written with U+FFFD in it
	// rather than not at all.
	const std::string text = document.dump(2, ' ', false, Json::error_handler_t::replace) + "\n";

	const std::string target = Paths::PrepareForWrite(path);
	if (target.empty())
	{
		aProblemRef = path + ": its folder cannot be made";
		return false;
	}
	const std::string temporary = Paths::TemporaryFor(target);
	if (temporary.empty())
	{
		aProblemRef = path + ": no temporary file can be made beside it";
		return false;
	}
	FI_File file;
	bool written = file.Open(temporary, FI_File::FileFlags::WRITE | FI_File::FileFlags::BINARY) &&
	               file.WriteData(text.data(), static_cast<int>(text.size())) && file.Flush();
	// A full disk often shows only when the last buffer is written out at Close.
	written = file.Close() && written;
	if (!written)
	{
		Paths::Discard(temporary);
		aProblemRef = path + ": the disk did not take its " + std::to_string(text.size()) +
		              " bytes (full, or over a size limit); the old record is kept";
		return false;
	}
	if (!Paths::ReplaceWith(temporary, target))
	{
		aProblemRef = path + ": the new record could not replace the old one, which is kept";
		return false;
	}
	return true;
}

BakeRecordRead ReadBakeRecord(const std::string& aPath, BakeRecord& aRecordOut, std::string& aProblemRef)
{
	const std::string resolved = Paths::Resolve(aPath);
	std::error_code error;
	if (!std::filesystem::exists(resolved, error))
	{
		aProblemRef = aPath + ": no bake record";
		return BakeRecordRead::MISSING;
	}
	const std::string damaged = aPath + ": damaged bake record: ";
	const uintmax_t size = std::filesystem::file_size(resolved, error);
	if (error)
	{
		aProblemRef = damaged + "not a file that can be read";
		return BakeRecordRead::DAMAGED;
	}
	if (size > ourMaxRecordBytes)
	{
		aProblemRef = damaged + std::to_string(size) + " bytes, more than any record holds";
		return BakeRecordRead::DAMAGED;
	}
	std::ifstream in(resolved, std::ios::binary);
	const std::string text((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>());
	if (!in)
	{
		aProblemRef = damaged + "it cannot be read";
		return BakeRecordRead::DAMAGED;
	}
	Json document;
	try
	{
		document = Json::parse(text);
	}
	catch (const Json::exception& anError)
	{
		// nlohmann's text (the line, the column, what it expected; a number too large) follows a
		// tag of its own.
		const std::string what = anError.what();
		const size_t tagEnd = what.find("] ");
		aProblemRef = damaged + "not JSON: " + (tagEnd == std::string::npos ? what : what.substr(tagEnd + 2));
		return BakeRecordRead::DAMAGED;
	}
	try
	{
		aRecordOut = ReadRecordJson(document);
		return BakeRecordRead::OK;
	}
	catch (const RecordError& anError)
	{
		aProblemRef = damaged + anError.myText;
	}
	catch (const std::exception& anError)
	{
		aProblemRef = damaged + anError.what();
	}
	return BakeRecordRead::DAMAGED;
}

bool RecordBakePhase(const std::string& aLevel, BakePhase aPhase, const BakePhaseRecord& aRecord,
                     std::string& aMessageRef)
{
	aMessageRef.clear();
	BakeRecord record;
	std::string problem;
	if (ReadBakeRecord(GetBakeRecordPath(aLevel), record, problem) == BakeRecordRead::DAMAGED)
	{
		record = {};
		aMessageRef = problem + " (replaced by a record of this bake alone)";
	}
	MergePhase(aPhase == BakePhase::AMBIENT ? record.myAmbient : record.myReflections, aRecord);
	if (!WriteBakeRecord(aLevel, record, problem))
	{
		aMessageRef = problem;
		return false;
	}
	return true;
}

std::vector<std::string> GetRecordedInputs(const BakeRecord& aRecord)
{
	std::set<std::string> paths;
	for (const std::optional<BakePhaseRecord>* section : {&aRecord.myAmbient, &aRecord.myReflections})
	{
		if (*section)
		{
			for (const auto& [path, hash] : (*section)->myInputs)
			{
				paths.insert(path);
			}
		}
	}
	return {paths.begin(), paths.end()};
}

std::vector<std::string> FindStaleInputs(const BakeRecord& aRecord)
{
	return FindStaleInputs(aRecord, HashBakeInputs(GetRecordedInputs(aRecord)));
}

std::vector<std::string> FindStaleInputs(const BakeRecord& aRecord,
                                         const std::map<std::string, std::string>& someCurrentHashes)
{
	struct Section
	{
		BakePhase myPhase;
		const std::optional<BakePhaseRecord>& myRecord;
	};
	const Section sections[] = {{BakePhase::AMBIENT, aRecord.myAmbient},
	                            {BakePhase::REFLECTIONS, aRecord.myReflections}};
	std::vector<std::string> lines;
	for (const std::string& path : GetRecordedInputs(aRecord))
	{
		const auto current = someCurrentHashes.find(path);
		const std::string now = current != someCurrentHashes.end() ? current->second : HashBakeInput(path);
		// The bakes that the file's present content differs from, each "the <phase> bake of <date>";
		// two bakes of one date are named together.
		std::vector<std::pair<std::string, std::string>> bakes;
		std::string verb = "changed";
		for (const Section& section : sections)
		{
			if (!section.myRecord)
			{
				continue;
			}
			const auto recorded = section.myRecord->myInputs.find(path);
			if (recorded == section.myRecord->myInputs.end() || recorded->second == now)
			{
				continue;
			}
			if (now == ourMissingHash)
			{
				verb = "is gone";
			}
			else if (recorded->second == ourMissingHash)
			{
				verb = "appeared";
			}
			bakes.emplace_back(BakeName(section.myPhase), ShortBakeDate(section.myRecord->myDate));
		}
		if (bakes.empty())
		{
			continue;
		}
		std::string line = InputName(path) + " " + verb + " since the ";
		if (bakes.size() == 2 && bakes[0].second == bakes[1].second)
		{
			line += bakes[0].first + " and " + bakes[1].first + " bakes of " + bakes[0].second;
		}
		else
		{
			for (size_t index = 0; index < bakes.size(); ++index)
			{
				line +=
				    (index > 0 ? " and the " : "") + bakes[index].first + " bake of " + bakes[index].second;
			}
		}
		lines.push_back(line);
	}
	return lines;
}
} // namespace Lumora
