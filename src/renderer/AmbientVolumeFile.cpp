#include "renderer/AmbientVolumeFile.h"

#include <filesystem>

#include "engine/FI_File.h"
#include "platform/paths/Paths.h"

namespace Zeph
{
namespace
{
constexpr int ourHeaderSize = 36;

bool ReadVector(FI_File& aFile, Vector3<float>& aVector)
{
	return aFile.Read(aVector.x) && aFile.Read(aVector.y) && aFile.Read(aVector.z);
}
} // namespace

AmbientVolumeRead ReadAmbientVolume(const std::string& aPath, AmbientVolume& aVolumeOut,
                                    std::string& aProblemOut)
{
	// An unbaked level has no file: that is its normal state, not an error for the file
	// stream to announce on standard error.
	std::error_code ignored;
	if (!std::filesystem::is_regular_file(Paths::Resolve(aPath), ignored))
	{
		return AmbientVolumeRead::CANNOT_OPEN;
	}
	FI_File file;
	if (!file.Open(aPath, FI_File::FileFlags::READ | FI_File::FileFlags::BINARY))
	{
		return AmbientVolumeRead::CANNOT_OPEN;
	}
	const long long size = file.GetFileSize();
	// (GetFileSize leaves the read position at the start.)
	AmbientVolume volume;
	if (size < ourHeaderSize || !ReadVector(file, volume.myWorldSize) ||
	    !ReadVector(file, volume.myWorldMin) || !file.Read(volume.myCounts[0]) ||
	    !file.Read(volume.myCounts[1]) || !file.Read(volume.myCounts[2]))
	{
		aProblemOut = aPath + " is shorter than its 36-byte header";
		return AmbientVolumeRead::DAMAGED;
	}
	for (const int count : volume.myCounts)
	{
		if (count <= 0 || count > AmbientVolume::ourMaxCount)
		{
			aProblemOut = aPath + " has probe counts " + std::to_string(volume.myCounts[0]) + " x " +
			              std::to_string(volume.myCounts[1]) + " x " + std::to_string(volume.myCounts[2]) +
			              " (each must be 1 to " + std::to_string(AmbientVolume::ourMaxCount) + ")";
			return AmbientVolumeRead::DAMAGED;
		}
	}
	const long long cells =
	    static_cast<long long>(volume.myCounts[0]) * volume.myCounts[1] * volume.myCounts[2];
	const long long expected = ourHeaderSize + 28LL * cells;
	if (size != expected)
	{
		aProblemOut =
		    aPath + " holds " + std::to_string(size) + " bytes; its counts need " + std::to_string(expected);
		return AmbientVolumeRead::DAMAGED;
	}
	for (std::vector<uint32_t>& block : volume.myBlocks)
	{
		block.resize(static_cast<size_t>(cells));
		if (!file.ReadData(block.data(), static_cast<int>(cells * 4)))
		{
			aProblemOut = aPath + " could not be read to its end";
			return AmbientVolumeRead::DAMAGED;
		}
	}
	file.Close();
	aVolumeOut = std::move(volume);
	return AmbientVolumeRead::OK;
}

bool WriteAmbientVolume(const std::string& aPath, const AmbientVolume& aVolume, std::string& aProblemOut)
{
	const long long cells =
	    static_cast<long long>(aVolume.myCounts[0]) * aVolume.myCounts[1] * aVolume.myCounts[2];
	for (const std::vector<uint32_t>& block : aVolume.myBlocks)
	{
		if (cells <= 0 || static_cast<long long>(block.size()) != cells)
		{
			aProblemOut = aPath + ": the volume's blocks do not match its probe counts";
			return false;
		}
	}
	const std::string target = Paths::PrepareForWrite(aPath);
	if (target.empty())
	{
		aProblemOut = aPath + ": its folder cannot be made";
		return false;
	}
	const std::string temporary = Paths::TemporaryFor(target);
	if (temporary.empty())
	{
		aProblemOut = aPath + ": no temporary file can be made beside it";
		return false;
	}
	FI_File file;
	bool written = file.Open(temporary, FI_File::FileFlags::WRITE | FI_File::FileFlags::BINARY) &&
	               file.Write(aVolume.myWorldSize.x) && file.Write(aVolume.myWorldSize.y) &&
	               file.Write(aVolume.myWorldSize.z) && file.Write(aVolume.myWorldMin.x) &&
	               file.Write(aVolume.myWorldMin.y) && file.Write(aVolume.myWorldMin.z) &&
	               file.Write(aVolume.myCounts[0]) && file.Write(aVolume.myCounts[1]) &&
	               file.Write(aVolume.myCounts[2]);
	for (const std::vector<uint32_t>& block : aVolume.myBlocks)
	{
		written = written && file.WriteData(block.data(), static_cast<int>(cells * 4));
	}
	written = written && file.Flush();
	// A full disk often shows only when the last buffer is written out at Close.
	written = file.Close() && written;
	if (!written)
	{
		Paths::Discard(temporary);
		aProblemOut = aPath + ": the disk did not take its " + std::to_string(36 + 28 * cells) +
		              " bytes (full, or over a size limit); the old file is kept";
		return false;
	}
	if (!Paths::ReplaceWith(temporary, target))
	{
		aProblemOut = aPath + ": the new file could not replace the old one, which is kept";
		return false;
	}
	return true;
}
} // namespace Zeph
