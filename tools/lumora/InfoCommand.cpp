// lumora info: what an ambient.sh, a DDS, an .al model or a bake record (bake.json) holds,
// read with the library's own readers (no GPU needed).
#include <algorithm>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <map>
#include <string>
#include <vector>

#include "Commands.h"
#include "EditorSession.h"
#include "editor/BakeInputs.h"
#include "editor/BakeRecord.h"
#include "model/AlFile.h"
#include "model/Model.h"
#include "model/ModelNode.h"
#include "model/VertexTypes.h"
#include "platform/dds/DdsFile.h"
#include "platform/dds/Format.h"
#include "platform/dds/ImageInfo.h"
#include "renderer/AmbientVolumeFile.h"

namespace LumoraTool
{
namespace
{
bool EndsWith(const std::string& aText, const std::string& anEnd)
{
	return aText.size() >= anEnd.size() &&
	       aText.compare(aText.size() - anEnd.size(), anEnd.size(), anEnd) == 0;
}

int DescribeAmbient(const std::string& aPath)
{
	Zeph::AmbientVolume volume;
	std::string problem;
	if (Zeph::ReadAmbientVolume(aPath, volume, problem) != Zeph::AmbientVolumeRead::OK)
	{
		PrintError(problem);
		return 1;
	}
	const Vector3<float>& minimum = volume.myWorldMin;
	const Vector3<float> maximum = volume.myWorldMin + volume.myWorldSize;
	std::printf("%s: SH irradiance volume\n", aPath.c_str());
	std::printf("  bounds (%g, %g, %g) to (%g, %g, %g)\n", minimum.x, minimum.y, minimum.z, maximum.x,
	            maximum.y, maximum.z);
	const size_t cells = volume.myBlocks[0].size();
	size_t neutral = 0;
	for (size_t cell = 0; cell < cells; ++cell)
	{
		bool all = true;
		for (const std::vector<uint32_t>& block : volume.myBlocks)
		{
			all = all && block[cell] == 0x7F7F7F7Fu;
		}
		neutral += all ? 1 : 0;
	}
	std::printf("  %d x %d x %d cells (%zu), %zu never captured (neutral)\n", volume.myCounts[0],
	            volume.myCounts[1], volume.myCounts[2], cells, neutral);
	// Each texel holds four coefficients stored as bytes; decoded as byte / 255 * 2 - 1.
	static const char* const ourBlockNames[] = {"cAr", "cAg", "cAb", "cBr", "cBg", "cBb", "cC"};
	for (int block = 0; block < Zeph::AmbientVolume::ourBlockCount; ++block)
	{
		std::printf("  %-4s", ourBlockNames[block]);
		for (int component = 0; component < 4; ++component)
		{
			int lowest = 255;
			int highest = 0;
			for (const uint32_t texel : volume.myBlocks[block])
			{
				const int value = static_cast<int>((texel >> (8 * component)) & 0xFF);
				lowest = std::min(lowest, value);
				highest = std::max(highest, value);
			}
			std::printf("  %c %+.3f..%+.3f", "xyzw"[component], lowest / 255.0 * 2.0 - 1.0,
			            highest / 255.0 * 2.0 - 1.0);
		}
		std::printf("\n");
	}
	return 0;
}

int DescribeDds(const std::string& aPath)
{
	Dds::ImageInfo info;
	std::string error;
	if (!Dds::GetImageInfoFromFile(aPath, info, error))
	{
		PrintError(aPath + ": " + error);
		return 1;
	}
	const char* kind = info.IsVolume() ? "volume texture" : info.IsCube() ? "cubemap" : "2D texture";
	std::printf("%s: %s, %s\n", aPath.c_str(), kind, Dds::FormatName(info.myFormat));
	std::printf("  %u x %u", info.myWidth, info.myHeight);
	if (info.IsVolume())
	{
		std::printf(" x %u", info.myDepth);
	}
	if (info.IsCube())
	{
		std::printf(", %u face%s", info.myArraySize, info.myArraySize == 1 ? "" : "s");
	}
	else if (info.myArraySize > 1)
	{
		std::printf(", %u slices", info.myArraySize);
	}
	std::printf(", %u mip%s\n", info.myMipLevels, info.myMipLevels == 1 ? "" : "s");
	return 0;
}

const char* VertexTypeName(int aType)
{
	static const char* const ourNames[] = {"POS_UV",
	                                       "POS_COL_UV",
	                                       "POS_NORM_UV",
	                                       "POS_NORM_UV_TAN",
	                                       "POS_NORM_UV_TAN_BI",
	                                       "POS_WEIGHT_BONES_NORM_UV_TAN",
	                                       "POS_WEIGHT_BONES_NORM_UV_TAN_BI",
	                                       "POS_WEIGHT_BONES_NORM_UV"};
	return aType >= 0 && aType < Zeph::VERTEX_TYPE_COUNT ? ourNames[aType] : "unknown";
}

struct ModelTotals
{
	int myModels = 0;
	long long myVertices = 0;
	long long myIndices = 0;
};

void DescribeModel(const Zeph::Model& aModel, int aDepth, ModelTotals& someTotals)
{
	const std::string indent(static_cast<size_t>(2 * aDepth + 2), ' ');
	if (aModel.IsNullObject())
	{
		std::printf("%smodel: null object\n", indent.c_str());
	}
	else
	{
		std::printf("%smodel: %s, %d vertices, %d indices, %d surface%s\n", indent.c_str(),
		            VertexTypeName(aModel.GetVertexType()), aModel.GetVertexCount(), aModel.GetIndexCount(),
		            aModel.GetSurfaces().Count(), aModel.GetSurfaces().Count() == 1 ? "" : "s");
		++someTotals.myModels;
		someTotals.myVertices += aModel.GetVertexCount();
		someTotals.myIndices += aModel.GetIndexCount();
	}
	for (int child = 0; child < aModel.GetChildModels().Count(); ++child)
	{
		DescribeModel(*aModel.GetChildModels()[child], aDepth + 1, someTotals);
	}
}

void DescribeNode(const Zeph::ModelNode& aNode, int aDepth, ModelTotals& someTotals)
{
	const std::string indent(static_cast<size_t>(2 * aDepth), ' ');
	std::printf("%snode '%s', %d child%s\n", indent.c_str(), aNode.GetName().c_str(),
	            aNode.GetChildren().Count(), aNode.GetChildren().Count() == 1 ? "" : "ren");
	if (aNode.GetModel() != nullptr)
	{
		DescribeModel(*aNode.GetModel(), aDepth, someTotals);
	}
	for (int child = 0; child < aNode.GetChildren().Count(); ++child)
	{
		DescribeNode(*aNode.GetChildren()[child], aDepth + 1, someTotals);
	}
}

int DescribeAl(const std::string& aPath)
{
	std::ifstream in(aPath, std::ios::binary);
	if (!in)
	{
		PrintError("cannot read " + aPath);
		return 1;
	}
	const std::vector<uint8_t> bytes((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>());
	std::vector<Zeph::AlTextureBinding> bindings;
	std::string error;
	const std::unique_ptr<Zeph::ModelNode> tree = Zeph::AlFile::Parse(bytes, bindings, error);
	if (!tree)
	{
		PrintError(aPath + ": " + error);
		return 1;
	}
	std::printf("%s: model file, %zu bytes\n", aPath.c_str(), bytes.size());
	ModelTotals totals;
	DescribeNode(*tree, 1, totals);
	std::printf("  %d model%s, %lld vertices, %lld indices, %zu texture binding%s\n", totals.myModels,
	            totals.myModels == 1 ? "" : "s", totals.myVertices, totals.myIndices, bindings.size(),
	            bindings.size() == 1 ? "" : "s");
	for (const Zeph::AlTextureBinding& binding : bindings)
	{
		std::printf("    %s <- %s%s\n", binding.myVariableName.c_str(), binding.myPath.c_str(),
		            binding.mySRGBFlag ? " (sRGB)" : "");
	}
	return 0;
}
std::string Joined(const std::vector<std::string>& someTexts)
{
	std::string text;
	for (const std::string& each : someTexts)
	{
		text += (text.empty() ? "" : ", ") + each;
	}
	return text;
}

// One phase of a record; someCurrentHashes is empty when no data/ folder is here to compare with.
void DescribeBakePhase(const char* aName, const Lumora::BakePhaseRecord& aPhase, bool anAmbientFlag,
                       const std::map<std::string, std::string>& someCurrentHashes)
{
	std::printf("  %s: baked %s by Lumora %s, %s\n", aName, aPhase.myDate.c_str(),
	            aPhase.myToolVersion.c_str(),
	            aPhase.myRooms.empty() ? "every room" : ("rooms " + Joined(aPhase.myRooms)).c_str());
	if (anAmbientFlag)
	{
		const Lumora::BakeGrid& grid = aPhase.myGrid;
		const Vector3<float>& minimum = grid.myWorldMin;
		const Vector3<float> maximum = grid.myWorldMin + grid.myWorldSize;
		std::printf("    %d bounce%s, %d x %d x %d probes, (%g, %g, %g) to (%g, %g, %g)\n", aPhase.myBounces,
		            aPhase.myBounces == 1 ? "" : "s", grid.myCounts[0], grid.myCounts[1], grid.myCounts[2],
		            minimum.x, minimum.y, minimum.z, maximum.x, maximum.y, maximum.z);
	}
	for (const Lumora::BakeRoomUpdate& update : aPhase.myRoomUpdates)
	{
		std::printf("    baked again %s: rooms %s\n", update.myDate.c_str(), Joined(update.myRooms).c_str());
	}
	for (const auto& [path, size] : aPhase.myFiles)
	{
		std::printf("    wrote %s (%llu bytes)\n", path.c_str(), static_cast<unsigned long long>(size));
	}
	if (!aPhase.myTimings.empty())
	{
		std::vector<std::string> timings;
		for (const auto& [step, seconds] : aPhase.myTimings)
		{
			char text[64];
			std::snprintf(text, sizeof(text), " %.3f s", seconds);
			timings.push_back(step + text);
		}
		std::printf("    timings: %s\n", Joined(timings).c_str());
	}
	const size_t count = aPhase.myInputs.size();
	if (someCurrentHashes.empty())
	{
		std::printf("    inputs: %zu file%s (not compared: no data/ folder here)\n", count,
		            count == 1 ? "" : "s");
		return;
	}
	std::vector<std::string> differing;
	for (const auto& [path, hash] : aPhase.myInputs)
	{
		const std::string now = someCurrentHashes.at(path);
		if (now != hash)
		{
			const bool goneFlag = now == Lumora::ourMissingHash;
			differing.push_back(path + (goneFlag                         ? " is gone"
			                            : hash == Lumora::ourMissingHash ? " appeared"
			                                                             : " changed"));
		}
	}
	std::printf("    inputs: %zu file%s, %zu unchanged\n", count, count == 1 ? "" : "s",
	            count - differing.size());
	for (const std::string& line : differing)
	{
		std::printf("      %s\n", line.c_str());
	}
}

int DescribeBakeRecord(const std::string& aPath)
{
	Lumora::BakeRecord record;
	std::string problem;
	if (Lumora::ReadBakeRecord(aPath, record, problem) != Lumora::BakeRecordRead::OK)
	{
		PrintError(problem);
		return 1;
	}
	std::error_code ignored;
	const std::map<std::string, std::string> current =
	    std::filesystem::is_directory("data", ignored)
	        ? Lumora::HashBakeInputs(Lumora::GetRecordedInputs(record))
	        : std::map<std::string, std::string>();
	std::printf("%s: bake record\n", aPath.c_str());
	if (record.myAmbient)
	{
		DescribeBakePhase("ambient", *record.myAmbient, true, current);
	}
	else
	{
		std::printf("  ambient: not on record\n");
	}
	if (record.myReflections)
	{
		DescribeBakePhase("reflections", *record.myReflections, false, current);
	}
	else
	{
		std::printf("  reflections: not on record\n");
	}
	return 0;
}
} // namespace

int RunInfo(const std::string& aPath)
{
	std::error_code ignored;
	if (!std::filesystem::is_regular_file(aPath, ignored))
	{
		PrintError("no file " + aPath);
		return 1;
	}
	std::string lower = aPath;
	std::transform(lower.begin(), lower.end(), lower.begin(),
	               [](unsigned char c) { return std::tolower(c); });
	if (EndsWith(lower, ".sh"))
	{
		return DescribeAmbient(aPath);
	}
	if (EndsWith(lower, ".dds"))
	{
		return DescribeDds(aPath);
	}
	if (EndsWith(lower, ".al"))
	{
		return DescribeAl(aPath);
	}
	if (EndsWith(lower, "bake.json"))
	{
		return DescribeBakeRecord(aPath);
	}
	PrintError("cannot describe " + aPath + " (it reads an ambient.sh, a .dds, an .al model or a bake.json)");
	return 2;
}
} // namespace LumoraTool
