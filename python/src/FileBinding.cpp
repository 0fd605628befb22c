// The baked files' readers: read_ambient (ambient.sh), read_dds (DDS textures such as the
// reflection cubemaps), read_bake_record and stale_inputs (bake.json). Each reads through the
// library's own reader, so Python sees exactly what the engine would load, and turns the
// result into plain Python values and NumPy arrays; the lumora package wraps them in classes
// (python/lumora/_files.py).
//
// Paths are taken as given, relative to the caller's working directory. A file that is not
// there is Python's FileNotFoundError; one the library refuses is LumoraError with its message.
#include <pybind11/numpy.h>
#include <pybind11/stl.h>

#include <bit>
#include <cerrno>
#include <charconv>
#include <cstring>
#include <filesystem>
#include <memory>
#include <system_error>

#include "Bindings.h"
#include "Errors.h"
#include "Values.h"
#include "WorkingFolder.h"
#include "editor/BakeRecord.h"
#include "platform/dds/DdsFile.h"
#include "platform/paths/Paths.h"
#include "renderer/AmbientVolumeFile.h"

namespace py = pybind11;

namespace LumoraPython
{
namespace
{
// FileNotFoundError(errno, strerror, filename), as open() raises it.
[[noreturn]] void RaiseNotFound(const std::string& aPath)
{
	PyErr_SetObject(PyExc_FileNotFoundError, py::make_tuple(ENOENT, std::strerror(ENOENT), aPath).ptr());
	throw py::error_already_set();
}

// The library resolves a path's case as the engine does, so the check does too.
void RequireExisting(const std::string& aPath)
{
	std::error_code error;
	if (!std::filesystem::exists(Paths::Resolve(aPath), error))
	{
		RaiseNotFound(aPath);
	}
}

// --- ambient.sh -----------------------------------------------------------------------------

py::dict ReadAmbient(const std::string& aPath)
{
	RequireExisting(aPath);
	Zeph::AmbientVolume volume;
	std::string problem;
	Zeph::AmbientVolumeRead readResult;
	{
		py::gil_scoped_release unlocked;
		readResult = Zeph::ReadAmbientVolume(aPath, volume, problem);
	}
	if (readResult == Zeph::AmbientVolumeRead::CANNOT_OPEN)
	{
		throw LumoraError(aPath + " is not a file that can be read");
	}
	if (readResult == Zeph::AmbientVolumeRead::DAMAGED)
	{
		throw LumoraError(problem);
	}

	const int nx = volume.myCounts[0];
	const int ny = volume.myCounts[1];
	const int nz = volume.myCounts[2];
	const size_t cells = static_cast<size_t>(nx) * ny * nz;
	py::array_t<uint8_t> blocks({static_cast<py::ssize_t>(Zeph::AmbientVolume::ourBlockCount),
	                             static_cast<py::ssize_t>(nz), static_cast<py::ssize_t>(ny),
	                             static_cast<py::ssize_t>(nx), py::ssize_t(4)});
	uint8_t* out = blocks.mutable_data();
	{
		py::gil_scoped_release unlocked;
		// Byte k of a texel is component k (ShPacking.h), whatever the host's byte order.
		for (int block = 0; block < Zeph::AmbientVolume::ourBlockCount; ++block)
		{
			const std::vector<uint32_t>& texels = volume.myBlocks[block];
			uint8_t* target = out + block * cells * 4;
			if constexpr (std::endian::native == std::endian::little)
			{
				std::memcpy(target, texels.data(), cells * 4);
			}
			else
			{
				for (size_t cell = 0; cell < cells; ++cell)
				{
					for (int component = 0; component < 4; ++component)
					{
						target[cell * 4 + component] = static_cast<uint8_t>(texels[cell] >> (8 * component));
					}
				}
			}
		}
	}

	py::dict result;
	result["world_min"] = Triple(volume.myWorldMin);
	result["world_size"] = Triple(volume.myWorldSize);
	result["counts"] = Triple(volume.myCounts);
	result["blocks"] = blocks;
	return result;
}

// --- DDS ------------------------------------------------------------------------------------

// How one pixel of a format looks to NumPy: the element type, the elements per pixel (per
// block for block-compressed formats) and the components in the order they are stored.
// Formats whose components share bits (10:10:10:2, 11:11:10, depth and stencil in 32 bits)
// are one uint32 per pixel, "packed".
struct PixelLayout
{
	const char* myDtype;
	int myElements;
	const char* myChannels;
	bool myPackedFlag;
};

// No default: the compiler names a format added to the enum but not here.
PixelLayout GetPixelLayout(Dds::Format aFormat)
{
	using Dds::Format;
	switch (aFormat)
	{
	case Format::R32G32B32A32_FLOAT:
		return {"float32", 4, "RGBA", false};
	case Format::R32G32B32_FLOAT:
		return {"float32", 3, "RGB", false};
	case Format::R16G16B16A16_FLOAT:
		return {"float16", 4, "RGBA", false};
	case Format::R16G16B16A16_UNORM:
		return {"uint16", 4, "RGBA", false};
	case Format::R32G32_FLOAT:
		return {"float32", 2, "RG", false};
	case Format::R10G10B10A2_UNORM:
		return {"uint32", 1, "RGBA", true};
	case Format::R11G11B10_FLOAT:
		return {"uint32", 1, "RGB", true};
	case Format::R8G8B8A8_TYPELESS:
	case Format::R8G8B8A8_UNORM:
	case Format::R8G8B8A8_UNORM_SRGB:
	case Format::R8G8B8A8_UINT:
		return {"uint8", 4, "RGBA", false};
	case Format::R8G8B8A8_SNORM:
	case Format::R8G8B8A8_SINT:
		return {"int8", 4, "RGBA", false};
	case Format::R16G16_FLOAT:
		return {"float16", 2, "RG", false};
	case Format::D32_FLOAT:
		return {"float32", 1, "D", false};
	case Format::R32_FLOAT:
		return {"float32", 1, "R", false};
	case Format::R24G8_TYPELESS:
		return {"uint32", 1, "RG", true};
	case Format::D24_UNORM_S8_UINT:
		return {"uint32", 1, "DS", true};
	case Format::R24_UNORM_X8_TYPELESS:
		return {"uint32", 1, "RX", true};
	case Format::R8G8_UNORM:
		return {"uint8", 2, "RG", false};
	case Format::R16_FLOAT:
		return {"float16", 1, "R", false};
	case Format::R8_UNORM:
		return {"uint8", 1, "R", false};
	case Format::BC1_TYPELESS:
	case Format::BC1_UNORM:
	case Format::BC1_UNORM_SRGB:
	case Format::BC2_TYPELESS:
	case Format::BC2_UNORM:
	case Format::BC2_UNORM_SRGB:
	case Format::BC3_TYPELESS:
	case Format::BC3_UNORM:
	case Format::BC3_UNORM_SRGB:
	case Format::BC7_TYPELESS:
	case Format::BC7_UNORM:
	case Format::BC7_UNORM_SRGB:
		return {"uint8", static_cast<int>(Dds::BlockBytes(aFormat)), "RGBA", false};
	case Format::BC4_TYPELESS:
	case Format::BC4_UNORM:
	case Format::BC4_SNORM:
		return {"uint8", static_cast<int>(Dds::BlockBytes(aFormat)), "R", false};
	case Format::BC5_TYPELESS:
	case Format::BC5_UNORM:
	case Format::BC5_SNORM:
		return {"uint8", static_cast<int>(Dds::BlockBytes(aFormat)), "RG", false};
	case Format::BC6H_TYPELESS:
	case Format::BC6H_UF16:
	case Format::BC6H_SF16:
		return {"uint8", static_cast<int>(Dds::BlockBytes(aFormat)), "RGB", false};
	case Format::B8G8R8A8_UNORM:
	case Format::B8G8R8A8_TYPELESS:
	case Format::B8G8R8A8_UNORM_SRGB:
		return {"uint8", 4, "BGRA", false};
	case Format::B8G8R8X8_UNORM:
		return {"uint8", 4, "BGRX", false};
	case Format::UNKNOWN:
		break;
	}
	// The loader refuses formats it does not know, so no image arrives here with one.
	throw LumoraError(std::string("no array layout for DDS format ") + Dds::FormatName(aFormat));
}

const char* DimensionName(const Dds::ImageInfo& anInfo)
{
	switch (anInfo.myResourceDimension)
	{
	case Dds::ResourceDimension::Texture1D:
		return "1D";
	case Dds::ResourceDimension::Texture2D:
		return "2D";
	case Dds::ResourceDimension::Texture3D:
		return "3D";
	case Dds::ResourceDimension::Unknown:
		break;
	}
	return "unknown";
}

py::dict ReadDds(const std::string& aPath)
{
	RequireExisting(aPath);
	// The arrays are views into the loaded image, which the capsule keeps alive as long as any
	// of them is: a large cubemap is not copied a second time.
	auto image = std::make_unique<Dds::Image>();
	std::string error;
	bool loadedFlag = false;
	{
		py::gil_scoped_release unlocked;
		loadedFlag = Dds::LoadFromFile(aPath, *image, error);
	}
	if (!loadedFlag)
	{
		throw LumoraError(error);
	}
	const Dds::ImageInfo info = image->Info();
	const PixelLayout layout = GetPixelLayout(info.myFormat);
	const bool compressedFlag = Dds::IsBlockCompressed(info.myFormat);
	const py::dtype dtype(layout.myDtype);
	const py::ssize_t itemSize = dtype.itemsize();

	const py::capsule keeper(image.get(), [](void* anImage) { delete static_cast<Dds::Image*>(anImage); });
	const Dds::Image* owned = image.release();

	py::list images;
	for (uint32_t item = 0; item < info.myArraySize; ++item)
	{
		py::list mips;
		for (uint32_t mip = 0; mip < info.myMipLevels; ++mip)
		{
			const uint32_t width = Dds::MipExtent(info.myWidth, mip);
			const uint32_t height = Dds::MipExtent(info.myHeight, mip);
			const uint32_t depth = info.IsVolume() ? Dds::MipExtent(info.myDepth, mip) : 1;
			// Rows and columns of pixels, or of 4x4 blocks.
			const py::ssize_t rows = Dds::RowCount(info.myFormat, height);
			const py::ssize_t columns = compressedFlag ? (width + 3) / 4 : width;
			std::vector<py::ssize_t> shape = {rows, columns, layout.myElements};
			if (info.IsVolume())
			{
				shape.insert(shape.begin(), depth);
			}
			std::vector<py::ssize_t> strides(shape.size());
			py::ssize_t stride = itemSize;
			for (size_t axis = shape.size(); axis-- > 0;)
			{
				strides[axis] = stride;
				stride *= shape[axis];
			}
			mips.append(py::array(dtype, shape, strides, owned->Data(mip, item), keeper));
		}
		images.append(mips);
	}

	py::dict result;
	result["format"] = Dds::FormatName(info.myFormat);
	result["dimension"] = DimensionName(info);
	result["width"] = info.myWidth;
	result["height"] = info.myHeight;
	result["depth"] = info.myDepth;
	result["mips"] = info.myMipLevels;
	result["array_size"] = info.myArraySize;
	result["is_cube"] = info.IsCube();
	result["cube_count"] = info.IsCube() ? info.myArraySize / 6 : 0u;
	result["compressed"] = compressedFlag;
	result["block_bytes"] = compressedFlag ? Dds::BlockBytes(info.myFormat) : 0u;
	result["srgb"] = Dds::IsSRGB(info.myFormat);
	result["packed"] = layout.myPackedFlag;
	result["channels"] = layout.myChannels;
	result["images"] = images;
	return result;
}

// --- bake.json ------------------------------------------------------------------------------

py::dict PhaseDict(const Lumora::BakePhaseRecord& aRecord, bool anAmbientFlag)
{
	py::dict phase;
	phase["date"] = aRecord.myDate;
	phase["tool_version"] = aRecord.myToolVersion;
	// Only the ambient section holds bounces and a grid; the reflection one has none to give.
	if (anAmbientFlag)
	{
		py::dict grid;
		grid["counts"] = Triple(aRecord.myGrid.myCounts);
		grid["world_min"] = Triple(aRecord.myGrid.myWorldMin);
		grid["world_size"] = Triple(aRecord.myGrid.myWorldSize);
		phase["bounces"] = aRecord.myBounces;
		phase["grid"] = grid;
	}
	else
	{
		phase["bounces"] = py::none();
		phase["grid"] = py::none();
	}
	phase["rooms"] = aRecord.myRooms;
	phase["files"] = aRecord.myFiles;
	phase["timings"] = aRecord.myTimings;
	phase["inputs"] = aRecord.myInputs;
	py::list updates;
	for (const Lumora::BakeRoomUpdate& update : aRecord.myRoomUpdates)
	{
		py::dict entry;
		entry["date"] = update.myDate;
		entry["rooms"] = update.myRooms;
		updates.append(entry);
	}
	phase["room_updates"] = updates;
	return phase;
}

// The record at aPath; false when there is none.
bool LoadRecord(const std::string& aPath, Lumora::BakeRecord& aRecordOut)
{
	std::string problem;
	Lumora::BakeRecordRead result;
	{
		py::gil_scoped_release unlocked;
		result = Lumora::ReadBakeRecord(aPath, aRecordOut, problem);
	}
	if (result == Lumora::BakeRecordRead::DAMAGED)
	{
		throw LumoraError(problem);
	}
	return result == Lumora::BakeRecordRead::OK;
}

py::object ReadBakeRecordFile(const std::string& aPath)
{
	Lumora::BakeRecord record;
	if (!LoadRecord(aPath, record))
	{
		return py::none();
	}
	py::dict result;
	result["ambient"] = record.myAmbient ? py::object(PhaseDict(*record.myAmbient, true)) : py::none();
	result["reflections"] =
	    record.myReflections ? py::object(PhaseDict(*record.myReflections, false)) : py::none();
	return result;
}

std::vector<std::string> StaleInputs(const std::string& aDataFolder, const std::string& aPath)
{
	const std::string folder = WorkingFolder::CheckDataFolder(aDataFolder);
	// The record's path is the caller's, so it is made absolute before the working folder
	// changes; its inputs are named relative to the data folder.
	std::error_code error;
	const std::filesystem::path absolute = std::filesystem::absolute(aPath, error);
	const std::string path = error ? aPath : absolute.string();
	Lumora::BakeRecord record;
	if (!LoadRecord(path, record))
	{
		RaiseNotFound(aPath);
	}
	WorkingFolder here(folder);
	py::gil_scoped_release unlocked;
	return Lumora::FindStaleInputs(record);
}
} // namespace

void RegisterFiles(py::module_& aModule)
{
	aModule.def("read_ambient", &ReadAmbient, py::arg("path"),
	            "The irradiance volume in an ambient.sh: dict with world_min, world_size (x, y, z), counts "
	            "(nx, ny, nz) and blocks, a uint8 array (7, nz, ny, nx, 4) of the packed coefficient "
	            "texels cAr, cAg, cAb, cBr, cBg, cBb, cC.");
	aModule.def("read_dds", &ReadDds, py::arg("path"),
	            "A DDS texture: dict with format, dimension, width, height, depth, mips, array_size (faces "
	            "counted one by one), is_cube, cube_count, compressed, block_bytes, srgb, packed, channels "
	            "and images, a list per array slice or cube face of a list per mip of NumPy arrays "
	            "(rows, columns, channels), with the depth first for volumes; block-compressed formats "
	            "give their 4x4 blocks' bytes.");
	aModule.def("read_bake_record", &ReadBakeRecordFile, py::arg("path"),
	            "A level's bake.json as dicts per phase (ambient, reflections; None for a phase not "
	            "baked), or None when there is no file.");
	aModule.def("stale_inputs", &StaleInputs, py::arg("data"), py::arg("path"),
	            "One line per input of the bake record at path that changed since its bake, the inputs "
	            "hashed from the folder data (which holds data/).");
}
} // namespace LumoraPython
