#include "renderer/AmbientPartFile.h"

#include <algorithm>
#include <cstring>
#include <filesystem>

#include "engine/FI_File.h"
#include "platform/paths/Paths.h"

namespace Zeph
{
namespace
{
constexpr char ourMagic[8] = {'L', 'M', 'R', 'S', 'H', 'P', 'R', 'T'};
constexpr uint32_t ourVersion = 1;
constexpr long long ourHeaderSize = 8 + 4 + 4 + 12 + 12 + 12 + 8 + 8 + 2 * AmbientPart::ourHashLength;

// The file stream reads and writes int and float; the wider and unsigned fields go as bytes.
template <typename T> bool WriteRaw(FI_File& aFile, T aValue)
{
	return aFile.WriteData(&aValue, sizeof(aValue));
}

template <typename T> bool ReadRaw(FI_File& aFile, T& aValue)
{
	return aFile.ReadData(&aValue, sizeof(aValue));
}

bool WriteHash(FI_File& aFile, const std::string& aHash)
{
	char bytes[AmbientPart::ourHashLength] = {};
	std::memcpy(bytes, aHash.data(), std::min<size_t>(aHash.size(), sizeof(bytes)));
	return aFile.WriteData(bytes, sizeof(bytes));
}

bool ReadHash(FI_File& aFile, std::string& aHash)
{
	char bytes[AmbientPart::ourHashLength] = {};
	if (!aFile.ReadData(bytes, sizeof(bytes)))
	{
		return false;
	}
	aHash.assign(bytes, strnlen(bytes, sizeof(bytes)));
	return true;
}

bool WriteVector(FI_File& aFile, const Vector3<float>& aVector)
{
	return aFile.Write(aVector.x) && aFile.Write(aVector.y) && aFile.Write(aVector.z);
}

bool ReadVector(FI_File& aFile, Vector3<float>& aVector)
{
	return aFile.Read(aVector.x) && aFile.Read(aVector.y) && aFile.Read(aVector.z);
}

bool SameGrid(const AmbientPart& aFirst, const AmbientPart& aSecond)
{
	const auto same = [](const Vector3<float>& aLeft, const Vector3<float>& aRight) {
		return aLeft.x == aRight.x && aLeft.y == aRight.y && aLeft.z == aRight.z;
	};
	return same(aFirst.myWorldSize, aSecond.myWorldSize) && same(aFirst.myWorldMin, aSecond.myWorldMin) &&
	       std::equal(aFirst.myCounts, aFirst.myCounts + 3, aSecond.myCounts);
}

std::string DescribeGrid(const AmbientPart& aPart)
{
	return std::to_string(aPart.myCounts[0]) + " x " + std::to_string(aPart.myCounts[1]) + " x " +
	       std::to_string(aPart.myCounts[2]);
}

std::string DescribeRange(long long aFirst, long long aCount)
{
	return "cells " + std::to_string(aFirst) + " to " + std::to_string(aFirst + aCount - 1);
}
} // namespace

bool WriteAmbientPart(const std::string& aPath, const AmbientPart& aPart, std::string& aProblemOut)
{
	for (const std::vector<uint32_t>& block : aPart.myBlocks)
	{
		if (aPart.myCount <= 0 || static_cast<long long>(block.size()) != aPart.myCount)
		{
			aProblemOut = aPath + ": the part's blocks do not match its cell count";
			return false;
		}
	}
	const std::string target = Paths::PrepareForWrite(aPath);
	const std::string temporary = target.empty() ? std::string() : Paths::TemporaryFor(target);
	if (temporary.empty())
	{
		aProblemOut = aPath + ": its folder or a temporary file beside it cannot be made";
		return false;
	}
	FI_File file;
	bool written = file.Open(temporary, FI_File::FileFlags::WRITE | FI_File::FileFlags::BINARY) &&
	               file.WriteData(ourMagic, sizeof(ourMagic)) && WriteRaw(file, ourVersion) &&
	               file.Write(aPart.myBounce) && WriteVector(file, aPart.myWorldSize) &&
	               WriteVector(file, aPart.myWorldMin) && file.Write(aPart.myCounts[0]) &&
	               file.Write(aPart.myCounts[1]) && file.Write(aPart.myCounts[2]) &&
	               WriteRaw(file, static_cast<int64_t>(aPart.myFirst)) &&
	               WriteRaw(file, static_cast<int64_t>(aPart.myCount)) &&
	               WriteHash(file, aPart.myInputsHash) && WriteHash(file, aPart.myPreviousHash);
	for (const std::vector<uint32_t>& block : aPart.myBlocks)
	{
		written = written && file.WriteData(block.data(), static_cast<int>(block.size() * 4));
	}
	written = file.Flush() && written;
	written = file.Close() && written;
	if (!written)
	{
		Paths::Discard(temporary);
		aProblemOut = aPath + ": the disk did not take the part (full, or over a size limit)";
		return false;
	}
	if (!Paths::ReplaceWith(temporary, target))
	{
		aProblemOut = aPath + ": the part could not replace the file there";
		return false;
	}
	return true;
}

bool ReadAmbientPart(const std::string& aPath, AmbientPart& aPartOut, std::string& aProblemOut,
                     bool aHeaderOnlyFlag)
{
	std::error_code ignored;
	FI_File file;
	if (!std::filesystem::is_regular_file(Paths::Resolve(aPath), ignored) ||
	    !file.Open(aPath, FI_File::FileFlags::READ | FI_File::FileFlags::BINARY))
	{
		aProblemOut = aPath + " cannot be opened";
		return false;
	}
	const long long size = file.GetFileSize();
	char magic[sizeof(ourMagic)] = {};
	uint32_t version = 0;
	AmbientPart part;
	int64_t first = 0;
	int64_t count = 0;
	if (size < ourHeaderSize || !file.ReadData(magic, sizeof(magic)) ||
	    std::memcmp(magic, ourMagic, sizeof(magic)) != 0)
	{
		aProblemOut = aPath + " is not an ambient bake part";
		return false;
	}
	if (!ReadRaw(file, version) || version != ourVersion || !file.Read(part.myBounce) ||
	    !ReadVector(file, part.myWorldSize) || !ReadVector(file, part.myWorldMin) ||
	    !file.Read(part.myCounts[0]) || !file.Read(part.myCounts[1]) || !file.Read(part.myCounts[2]) ||
	    !ReadRaw(file, first) || !ReadRaw(file, count) || !ReadHash(file, part.myInputsHash) ||
	    !ReadHash(file, part.myPreviousHash))
	{
		aProblemOut = aPath + " is a part of another version (" + std::to_string(version) + ", this is " +
		              std::to_string(ourVersion) + ")";
		return false;
	}
	part.myFirst = first;
	part.myCount = count;
	const bool countsFlag = std::all_of(part.myCounts, part.myCounts + 3, [](int aCount) {
		return aCount > 0 && aCount <= AmbientVolume::ourMaxCount;
	});
	if (!countsFlag || part.myBounce < 1 || first < 0 || count <= 0 || first > part.GetCellCount() - count)
	{
		aProblemOut = aPath + " is damaged: bounce " + std::to_string(part.myBounce) + ", " +
		              DescribeRange(first, count) + " of a grid of " + DescribeGrid(part);
		return false;
	}
	if (size != ourHeaderSize + 28LL * count)
	{
		aProblemOut = aPath + " holds " + std::to_string(size) + " bytes; its " + std::to_string(count) +
		              " cells need " + std::to_string(ourHeaderSize + 28LL * count);
		return false;
	}
	for (std::vector<uint32_t>& block : part.myBlocks)
	{
		if (aHeaderOnlyFlag)
		{
			break;
		}
		block.resize(static_cast<size_t>(count));
		if (!file.ReadData(block.data(), static_cast<int>(count * 4)))
		{
			aProblemOut = aPath + " could not be read to its end";
			return false;
		}
	}
	aPartOut = std::move(part);
	return true;
}

bool MergeAmbientParts(const std::vector<std::string>& somePaths, const AmbientPart& anExpected,
                       AmbientVolume& aVolumeOut, std::string& aProblemOut)
{
	struct Range
	{
		long long myFirst;
		long long myCount;
		size_t myIndex;
	};
	std::vector<AmbientPart> headers(somePaths.size());
	std::vector<Range> ranges;
	for (size_t index = 0; index < somePaths.size(); ++index)
	{
		AmbientPart& part = headers[index];
		const std::string& path = somePaths[index];
		if (!ReadAmbientPart(path, part, aProblemOut, true))
		{
			return false;
		}
		if (!SameGrid(part, anExpected))
		{
			aProblemOut = path + " is a part of another grid (" + DescribeGrid(part) + "; the level's is " +
			              DescribeGrid(anExpected) + ")";
			return false;
		}
		if (part.myInputsHash != anExpected.myInputsHash)
		{
			aProblemOut = path + " was baked from other inputs (the level's files, models or textures "
			                     "have changed since, or it is another level's)";
			return false;
		}
		if (part.myBounce != headers[0].myBounce || part.myPreviousHash != headers[0].myPreviousHash)
		{
			aProblemOut = path + " is bounce " + std::to_string(part.myBounce) +
			              (part.myBounce == headers[0].myBounce ? " lit by another previous volume" : "") +
			              "; " + somePaths[0] + " is bounce " + std::to_string(headers[0].myBounce);
			return false;
		}
		ranges.push_back({part.myFirst, part.myCount, index});
	}
	if (ranges.empty())
	{
		aProblemOut = "no parts to merge";
		return false;
	}
	std::sort(ranges.begin(), ranges.end(),
	          [](const Range& aLeft, const Range& aRight) { return aLeft.myFirst < aRight.myFirst; });
	long long next = 0;
	for (size_t index = 0; index < ranges.size(); ++index)
	{
		const Range& range = ranges[index];
		if (range.myFirst < next)
		{
			aProblemOut = somePaths[range.myIndex] + " (" + DescribeRange(range.myFirst, range.myCount) +
			              ") overlaps " + somePaths[ranges[index - 1].myIndex];
			return false;
		}
		if (range.myFirst > next)
		{
			aProblemOut = "no part holds " + DescribeRange(next, range.myFirst - next);
			return false;
		}
		next = range.myFirst + range.myCount;
	}
	const long long cells = anExpected.GetCellCount();
	if (next < cells)
	{
		aProblemOut = "no part holds " + DescribeRange(next, cells - next);
		return false;
	}
	AmbientVolume volume;
	volume.myWorldSize = anExpected.myWorldSize;
	volume.myWorldMin = anExpected.myWorldMin;
	std::copy(anExpected.myCounts, anExpected.myCounts + 3, volume.myCounts);
	for (std::vector<uint32_t>& block : volume.myBlocks)
	{
		block.resize(static_cast<size_t>(cells));
	}
	for (const Range& range : ranges)
	{
		AmbientPart part;
		if (!ReadAmbientPart(somePaths[range.myIndex], part, aProblemOut))
		{
			return false;
		}
		for (int block = 0; block < AmbientVolume::ourBlockCount; ++block)
		{
			std::copy(part.myBlocks[block].begin(), part.myBlocks[block].end(),
			          volume.myBlocks[block].begin() + range.myFirst);
		}
	}
	aVolumeOut = std::move(volume);
	return true;
}
} // namespace Zeph
