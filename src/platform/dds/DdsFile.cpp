#include "platform/dds/DdsFile.h"

#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>

#include "platform/paths/Paths.h"

namespace Dds
{
namespace
{
// Layout of the file: "DDS ", DDS_HEADER (124 bytes, DDS_PIXELFORMAT at 72 of
// it), then DDS_HEADER_DXT10 (20 bytes) when the FourCC is "DX10". Offsets
// below count from the start of the file; all fields are little-endian.
constexpr size_t MagicBytes = 4;
constexpr size_t HeaderBytes = 124;
constexpr size_t PixelFormatBytes = 32;
constexpr size_t Dx10Bytes = 20;
constexpr size_t LegacyEnd = MagicBytes + HeaderBytes;
constexpr size_t Dx10End = LegacyEnd + Dx10Bytes;

constexpr size_t OffsetSize = 4;
constexpr size_t OffsetFlags = 8;
constexpr size_t OffsetHeight = 12;
constexpr size_t OffsetWidth = 16;
constexpr size_t OffsetPitch = 20;
constexpr size_t OffsetDepth = 24;
constexpr size_t OffsetMipCount = 28;
constexpr size_t OffsetPfSize = 76;
constexpr size_t OffsetPfFlags = 80;
constexpr size_t OffsetFourCC = 84;
constexpr size_t OffsetBitCount = 88;
constexpr size_t OffsetMasks = 92; // R, G, B, A
constexpr size_t OffsetCaps = 108;
constexpr size_t OffsetCaps2 = 112;
constexpr size_t OffsetDxgiFormat = 128;
constexpr size_t OffsetDimension = 132;
constexpr size_t OffsetMiscFlag = 136;
constexpr size_t OffsetArraySize = 140;

constexpr uint32_t FlagCaps = 0x1;
constexpr uint32_t FlagHeight = 0x2;
constexpr uint32_t FlagWidth = 0x4;
constexpr uint32_t FlagPitch = 0x8;
constexpr uint32_t FlagPixelFormat = 0x1000;
constexpr uint32_t FlagMipCount = 0x20000;
constexpr uint32_t FlagLinearSize = 0x80000;
constexpr uint32_t FlagDepth = 0x800000;

constexpr uint32_t PfAlphaPixels = 0x1;
constexpr uint32_t PfFourCC = 0x4;
constexpr uint32_t PfRgb = 0x40;

constexpr uint32_t CapsComplex = 0x8;
constexpr uint32_t CapsTexture = 0x1000;
constexpr uint32_t CapsMipMap = 0x400000;
constexpr uint32_t Caps2Cube = 0x200;
constexpr uint32_t Caps2AllFaces = 0xFC00; // +X -X +Y -Y +Z -Z
constexpr uint32_t Caps2Volume = 0x200000;

constexpr uint32_t MakeFourCC(const char (&aText)[5])
{
	return uint32_t(uint8_t(aText[0])) | uint32_t(uint8_t(aText[1])) << 8 |
	       uint32_t(uint8_t(aText[2])) << 16 | uint32_t(uint8_t(aText[3])) << 24;
}
constexpr uint32_t Magic = MakeFourCC("DDS ");
constexpr uint32_t FourCCDx10 = MakeFourCC("DX10");

// The legacy pixel formats that are read and written: a FourCC (a DDS code or one
// of D3DFORMAT's numbers for float formats), or 32-bit RGB masks.
struct LegacyForm
{
	Format myFormat;
	uint32_t myFourCC; // 0: described by masks
	uint32_t myMasks[4];
};
constexpr LegacyForm LegacyForms[] = {
    {Format::BC1_UNORM, MakeFourCC("DXT1"), {}},
    {Format::BC2_UNORM, MakeFourCC("DXT3"), {}},
    {Format::BC3_UNORM, MakeFourCC("DXT5"), {}},
    {Format::R16G16B16A16_UNORM, 36, {}},
    {Format::R16_FLOAT, 111, {}},
    {Format::R16G16_FLOAT, 112, {}},
    {Format::R16G16B16A16_FLOAT, 113, {}},
    {Format::R32_FLOAT, 114, {}},
    {Format::R32G32_FLOAT, 115, {}},
    {Format::R32G32B32A32_FLOAT, 116, {}},
    {Format::R8G8B8A8_UNORM, 0, {0x000000FF, 0x0000FF00, 0x00FF0000, 0xFF000000}},
    {Format::B8G8R8A8_UNORM, 0, {0x00FF0000, 0x0000FF00, 0x000000FF, 0xFF000000}},
    {Format::B8G8R8X8_UNORM, 0, {0x00FF0000, 0x0000FF00, 0x000000FF, 0x00000000}},
};

// FourCCs that other tools write and that are only read. DXT2 and DXT4 mark
// premultiplied alpha, which changes nothing about the bytes. BC4 and BC5 files get the
// DX10 header when written, as BC6H and BC7 (which have no FourCC) always do: not every
// reader knows these codes, while any reader of BC4/BC5 knows the DX10 header.
struct ReadOnlyFourCC
{
	uint32_t myFourCC;
	Format myFormat;
};
constexpr ReadOnlyFourCC ReadOnlyFourCCs[] = {
    {MakeFourCC("DXT2"), Format::BC2_UNORM}, {MakeFourCC("DXT4"), Format::BC3_UNORM},
    {MakeFourCC("ATI1"), Format::BC4_UNORM}, {MakeFourCC("BC4U"), Format::BC4_UNORM},
    {MakeFourCC("BC4S"), Format::BC4_SNORM}, {MakeFourCC("ATI2"), Format::BC5_UNORM},
    {MakeFourCC("BC5U"), Format::BC5_UNORM}, {MakeFourCC("BC5S"), Format::BC5_SNORM},
};

const LegacyForm* FindLegacyForm(Format aFormat)
{
	for (const LegacyForm& form : LegacyForms)
	{
		if (form.myFormat == aFormat)
		{
			return &form;
		}
	}
	return nullptr;
}

uint32_t ReadU32(const uint8_t* someBytes, size_t anOffset)
{
	const uint8_t* p = someBytes + anOffset;
	return uint32_t(p[0]) | uint32_t(p[1]) << 8 | uint32_t(p[2]) << 16 | uint32_t(p[3]) << 24;
}

void WriteU32(uint8_t* someBytes, size_t anOffset, uint32_t aValue)
{
	for (int i = 0; i < 4; ++i)
	{
		someBytes[anOffset + i] = uint8_t(aValue >> (8 * i));
	}
}

std::string Hex(uint32_t aValue)
{
	char text[16];
	std::snprintf(text, sizeof(text), "0x%X", aValue);
	return text;
}

std::string FourCCText(uint32_t aFourCC)
{
	std::string text;
	for (int i = 0; i < 4; ++i)
	{
		const char c = char(aFourCC >> (8 * i));
		if (c < 0x20 || c > 0x7E)
		{
			return std::to_string(aFourCC);
		}
		text += c;
	}
	return "'" + text + "'";
}

bool FormatFromDdsPixelFormat(const uint8_t* someBytes, Format& aFormatOut, std::string& aWhatOut)
{
	const uint32_t flags = ReadU32(someBytes, OffsetPfFlags);
	if (flags & PfFourCC)
	{
		const uint32_t fourCC = ReadU32(someBytes, OffsetFourCC);
		for (const ReadOnlyFourCC& form : ReadOnlyFourCCs)
		{
			if (form.myFourCC == fourCC)
			{
				aFormatOut = form.myFormat;
				return true;
			}
		}
		for (const LegacyForm& form : LegacyForms)
		{
			if (form.myFourCC != 0 && form.myFourCC == fourCC)
			{
				aFormatOut = form.myFormat;
				return true;
			}
		}
		aWhatOut = "unsupported FourCC " + FourCCText(fourCC);
		return false;
	}
	const uint32_t bitCount = ReadU32(someBytes, OffsetBitCount);
	uint32_t masks[4];
	for (int i = 0; i < 4; ++i)
	{
		masks[i] = ReadU32(someBytes, OffsetMasks + 4 * i);
	}
	if (!(flags & PfAlphaPixels))
	{
		masks[3] = 0;
	}
	if ((flags & PfRgb) && bitCount == 32)
	{
		for (const LegacyForm& form : LegacyForms)
		{
			if (form.myFourCC == 0 && std::memcmp(form.myMasks, masks, sizeof(masks)) == 0)
			{
				aFormatOut = form.myFormat;
				return true;
			}
		}
	}
	aWhatOut = "unsupported pixel format (flags " + Hex(flags) + ", " + std::to_string(bitCount) +
	           " bits, masks " + Hex(masks[0]) + " " + Hex(masks[1]) + " " + Hex(masks[2]) + " " +
	           Hex(masks[3]) + ")";
	return false;
}

// Reads the headers from the first bytes of a file of aFileSize bytes and checks
// that the file holds all the data they describe. Fills the info and where the
// data starts; aWhatOut says what is wrong, without the file's name.
bool ParseHeaders(const uint8_t* someBytes, size_t anAvailable, uint64_t aFileSize, ImageInfo& anInfoOut,
                  size_t& aDataOffsetOut, std::string& aWhatOut)
{
	if (anAvailable < MagicBytes)
	{
		aWhatOut = "truncated: " + std::to_string(aFileSize) + " bytes is too short for a DDS file";
		return false;
	}
	if (ReadU32(someBytes, 0) != Magic)
	{
		aWhatOut = "not a DDS file (bad magic " + FourCCText(ReadU32(someBytes, 0)) + ")";
		return false;
	}
	if (anAvailable < LegacyEnd)
	{
		aWhatOut = "truncated: " + std::to_string(aFileSize) + " bytes, the header needs " +
		           std::to_string(LegacyEnd);
		return false;
	}
	if (ReadU32(someBytes, OffsetSize) != HeaderBytes || ReadU32(someBytes, OffsetPfSize) != PixelFormatBytes)
	{
		aWhatOut = "header size fields are " + std::to_string(ReadU32(someBytes, OffsetSize)) + " and " +
		           std::to_string(ReadU32(someBytes, OffsetPfSize)) + ", not 124 and 32";
		return false;
	}

	ImageInfo info;
	info.myWidth = ReadU32(someBytes, OffsetWidth);
	info.myHeight = ReadU32(someBytes, OffsetHeight);
	info.myMipLevels = ReadU32(someBytes, OffsetMipCount);
	if (info.myMipLevels == 0)
	{
		info.myMipLevels = 1;
	}
	const uint32_t flags = ReadU32(someBytes, OffsetFlags);
	const uint32_t caps2 = ReadU32(someBytes, OffsetCaps2);
	const uint32_t depth = ReadU32(someBytes, OffsetDepth);
	const bool dx10Flag =
	    (ReadU32(someBytes, OffsetPfFlags) & PfFourCC) && ReadU32(someBytes, OffsetFourCC) == FourCCDx10;
	size_t dataOffset = LegacyEnd;

	if (dx10Flag)
	{
		if (anAvailable < Dx10End)
		{
			aWhatOut = "truncated: " + std::to_string(aFileSize) + " bytes, the DX10 header needs " +
			           std::to_string(Dx10End);
			return false;
		}
		dataOffset = Dx10End;
		info.myFormat = static_cast<Format>(ReadU32(someBytes, OffsetDxgiFormat));
		info.myResourceDimension = static_cast<ResourceDimension>(ReadU32(someBytes, OffsetDimension));
		info.myArraySize = ReadU32(someBytes, OffsetArraySize);
		if (info.myResourceDimension == ResourceDimension::Texture3D)
		{
			info.myDepth = depth == 0 ? 1 : depth;
		}
		if (ReadU32(someBytes, OffsetMiscFlag) & MiscTextureCube)
		{
			if (info.myResourceDimension != ResourceDimension::Texture2D)
			{
				aWhatOut = "the cube flag is set on a texture that is not 2D";
				return false;
			}
			// The header counts cubes; Direct3D counts faces.
			if (info.myArraySize > MaxArraySize / 6)
			{
				aWhatOut = "array size " + std::to_string(info.myArraySize) + " cubes is above " +
				           std::to_string(MaxArraySize / 6);
				return false;
			}
			info.myArraySize *= 6;
			info.myMiscFlags = MiscTextureCube;
		}
	}
	else
	{
		if (!FormatFromDdsPixelFormat(someBytes, info.myFormat, aWhatOut))
		{
			return false;
		}
		if (caps2 & Caps2Cube)
		{
			if ((caps2 & Caps2AllFaces) != Caps2AllFaces)
			{
				aWhatOut = "cube map is missing faces (caps2 " + Hex(caps2) + "; all six are needed)";
				return false;
			}
			info.myArraySize = 6;
			info.myMiscFlags = MiscTextureCube;
		}
		else if ((caps2 & Caps2Volume) || (flags & FlagDepth))
		{
			info.myResourceDimension = ResourceDimension::Texture3D;
			info.myDepth = depth == 0 ? 1 : depth;
		}
	}

	uint64_t dataBytes = 0;
	if (!ComputeImageBytes(info, dataBytes, aWhatOut))
	{
		return false;
	}
	if (aFileSize < dataOffset || aFileSize - dataOffset < dataBytes)
	{
		aWhatOut = "truncated: " + std::to_string(aFileSize) + " bytes, the " + FormatName(info.myFormat) +
		           " " + std::to_string(info.myWidth) + "x" + std::to_string(info.myHeight) + "x" +
		           std::to_string(info.myDepth) + " image with " + std::to_string(info.myMipLevels) +
		           " mips and " + std::to_string(info.myArraySize) + " slices needs " +
		           std::to_string(dataOffset + dataBytes);
		return false;
	}
	anInfoOut = info;
	aDataOffsetOut = dataOffset;
	return true;
}

bool Load(const uint8_t* someBytes, size_t aSize, const std::string& aSourceName, const char* aFunction,
          Image& anImageOut, std::string& anErrorOut)
{
	anImageOut.Destroy();
	ImageInfo info;
	size_t dataOffset = 0;
	std::string what;
	if (!ParseHeaders(someBytes, aSize, aSize, info, dataOffset, what) || !anImageOut.Init(info, what))
	{
		anErrorOut = std::string(aFunction) + ": " + aSourceName + ": " + what;
		return false;
	}
	std::memcpy(anImageOut.Bytes().data(), someBytes + dataOffset, anImageOut.Bytes().size());
	return true;
}

bool ReadFile(const std::string& aPath, std::vector<uint8_t>& someBytesOut, std::string& aWhatOut)
{
	std::ifstream in(aPath, std::ios::binary | std::ios::ate);
	if (!in)
	{
		aWhatOut = "cannot open the file";
		return false;
	}
	const std::streamoff size = in.tellg();
	if (size < 0 || uint64_t(size) > MaxImageBytes + Dx10End)
	{
		aWhatOut = "cannot read the file (" + std::to_string(size) + " bytes)";
		return false;
	}
	someBytesOut.resize(size_t(size));
	in.seekg(0);
	if (!in.read(reinterpret_cast<char*>(someBytesOut.data()), size))
	{
		aWhatOut = "cannot read the file";
		return false;
	}
	return true;
}

bool Serialize(const Image& anImage, std::vector<uint8_t>& someBytesOut, std::string& aWhatOut)
{
	const ImageInfo& info = anImage.Info();
	uint64_t dataBytes = 0;
	if (anImage.IsEmpty())
	{
		aWhatOut = "the image is empty";
		return false;
	}
	if (!ComputeImageBytes(info, dataBytes, aWhatOut) || dataBytes != anImage.Bytes().size())
	{
		aWhatOut = "the image is inconsistent" + (aWhatOut.empty() ? "" : ": " + aWhatOut);
		return false;
	}
	const bool cubeFlag = info.IsCube();
	const bool volumeFlag = info.IsVolume();
	const LegacyForm* legacy = FindLegacyForm(info.myFormat);
	const bool arrayFlag = info.myArraySize != (cubeFlag ? 6u : 1u);
	const bool dx10Flag =
	    legacy == nullptr || arrayFlag || info.myResourceDimension == ResourceDimension::Texture1D;
	const bool compressedFlag = IsBlockCompressed(info.myFormat);
	const size_t headerEnd = dx10Flag ? Dx10End : LegacyEnd;

	someBytesOut.assign(headerEnd, 0);
	uint8_t* h = someBytesOut.data();
	WriteU32(h, 0, Magic);
	WriteU32(h, OffsetSize, HeaderBytes);
	WriteU32(h, OffsetFlags,
	         FlagCaps | FlagHeight | FlagWidth | FlagPixelFormat | FlagMipCount |
	             (compressedFlag ? FlagLinearSize : FlagPitch) | (volumeFlag ? FlagDepth : 0));
	WriteU32(h, OffsetHeight, info.myHeight);
	WriteU32(h, OffsetWidth, info.myWidth);
	// Dimensions are capped, so one row or one compressed level fits in 32 bits.
	WriteU32(h, OffsetPitch,
	         uint32_t(compressedFlag ? SlicePitch(info.myFormat, info.myWidth, info.myHeight)
	                                 : RowPitch(info.myFormat, info.myWidth)));
	WriteU32(h, OffsetDepth, volumeFlag ? info.myDepth : 0);
	WriteU32(h, OffsetMipCount, info.myMipLevels);
	WriteU32(h, OffsetPfSize, PixelFormatBytes);
	if (dx10Flag)
	{
		WriteU32(h, OffsetPfFlags, PfFourCC);
		WriteU32(h, OffsetFourCC, FourCCDx10);
	}
	else if (legacy->myFourCC != 0)
	{
		WriteU32(h, OffsetPfFlags, PfFourCC);
		WriteU32(h, OffsetFourCC, legacy->myFourCC);
	}
	else
	{
		WriteU32(h, OffsetPfFlags, PfRgb | (legacy->myMasks[3] != 0 ? PfAlphaPixels : 0));
		WriteU32(h, OffsetBitCount, 32);
		for (int i = 0; i < 4; ++i)
		{
			WriteU32(h, OffsetMasks + 4 * i, legacy->myMasks[i]);
		}
	}
	WriteU32(h, OffsetCaps,
	         CapsTexture | (info.myMipLevels > 1 ? CapsMipMap | CapsComplex : 0) |
	             (cubeFlag || volumeFlag ? CapsComplex : 0));
	WriteU32(h, OffsetCaps2, cubeFlag ? Caps2Cube | Caps2AllFaces : volumeFlag ? Caps2Volume : 0);
	if (dx10Flag)
	{
		WriteU32(h, OffsetDxgiFormat, static_cast<uint32_t>(info.myFormat));
		WriteU32(h, OffsetDimension, static_cast<uint32_t>(info.myResourceDimension));
		WriteU32(h, OffsetMiscFlag, cubeFlag ? MiscTextureCube : 0);
		WriteU32(h, OffsetArraySize, cubeFlag ? info.myArraySize / 6 : info.myArraySize);
	}
	someBytesOut.insert(someBytesOut.end(), anImage.Bytes().begin(), anImage.Bytes().end());
	return true;
}
} // namespace

bool GetImageInfoFromFile(const std::string& aFileName, ImageInfo& anInfoOut, std::string& anErrorOut)
{
	const std::string path = Paths::Resolve(aFileName);
	std::ifstream in(path, std::ios::binary | std::ios::ate);
	std::string what;
	uint8_t header[Dx10End] = {};
	std::streamoff size = in ? std::streamoff(in.tellg()) : -1;
	if (size < 0)
	{
		what = "cannot open the file";
	}
	else
	{
		in.seekg(0);
		const size_t wanted = size_t(size < std::streamoff(Dx10End) ? size : std::streamoff(Dx10End));
		size_t dataOffset = 0;
		if (!in.read(reinterpret_cast<char*>(header), std::streamsize(wanted)))
		{
			what = "cannot read the file";
		}
		else if (ParseHeaders(header, wanted, uint64_t(size), anInfoOut, dataOffset, what))
		{
			return true;
		}
	}
	anErrorOut = "Dds::GetImageInfoFromFile: " + aFileName + ": " + what;
	return false;
}

bool LoadFromFile(const std::string& aFileName, Image& anImageOut, std::string& anErrorOut)
{
	std::vector<uint8_t> bytes;
	std::string what;
	if (!ReadFile(Paths::Resolve(aFileName), bytes, what))
	{
		anImageOut.Destroy();
		anErrorOut = "Dds::LoadFromFile: " + aFileName + ": " + what;
		return false;
	}
	return Load(bytes.data(), bytes.size(), aFileName, "Dds::LoadFromFile", anImageOut, anErrorOut);
}

bool LoadFromMemory(const void* someBytes, size_t aSize, Image& anImageOut, std::string& anErrorOut)
{
	if (someBytes == nullptr)
	{
		aSize = 0;
	}
	static const uint8_t ourNothing = 0;
	const uint8_t* bytes = someBytes ? static_cast<const uint8_t*>(someBytes) : &ourNothing;
	return Load(bytes, aSize, "<memory>", "Dds::LoadFromMemory", anImageOut, anErrorOut);
}

bool SaveToMemory(const Image& anImage, std::vector<uint8_t>& someBytesOut, std::string& anErrorOut)
{
	std::string what;
	if (!Serialize(anImage, someBytesOut, what))
	{
		anErrorOut = "Dds::SaveToMemory: " + what;
		return false;
	}
	return true;
}

bool SaveToTemporary(const std::string& aFileName, const Image& anImage, std::string& aTemporaryOut,
                     std::string& anErrorOut)
{
	std::vector<uint8_t> bytes;
	std::string what;
	if (!Serialize(anImage, bytes, what))
	{
		anErrorOut = "Dds::SaveToFile: " + aFileName + ": " + what;
		return false;
	}
	const std::string target = Paths::PrepareForWrite(aFileName);
	if (target.empty())
	{
		anErrorOut = "Dds::SaveToFile: " + aFileName + ": cannot create its directory";
		return false;
	}
	// Known before anything is written: a folder (or device) by that name is never replaced.
	std::error_code error;
	if (std::filesystem::exists(target, error) && !std::filesystem::is_regular_file(target, error))
	{
		anErrorOut =
		    "Dds::SaveToFile: " + aFileName + ": cannot replace the file: something else has its name";
		return false;
	}
	const std::string temporary = Paths::TemporaryFor(target);
	if (temporary.empty())
	{
		anErrorOut = "Dds::SaveToFile: " + aFileName + ": cannot create a temporary file beside it";
		return false;
	}
	std::ofstream out(temporary, std::ios::binary | std::ios::trunc);
	out.write(reinterpret_cast<const char*>(bytes.data()), std::streamsize(bytes.size()));
	out.close();
	if (!out)
	{
		std::remove(temporary.c_str());
		anErrorOut =
		    "Dds::SaveToFile: " + aFileName + ": cannot write " + std::to_string(bytes.size()) + " bytes";
		return false;
	}
	aTemporaryOut = temporary;
	return true;
}

bool ReplaceWithTemporary(const std::string& aTemporary, const std::string& aFileName,
                          std::string& anErrorOut)
{
	if (!Paths::ReplaceWith(aTemporary, Paths::Resolve(aFileName)))
	{
		anErrorOut = "Dds::SaveToFile: " + aFileName + ": cannot replace the file";
		return false;
	}
	return true;
}

bool SaveToFile(const std::string& aFileName, const Image& anImage, std::string& anErrorOut)
{
	std::string temporary;
	return SaveToTemporary(aFileName, anImage, temporary, anErrorOut) &&
	       ReplaceWithTemporary(temporary, aFileName, anErrorOut);
}
} // namespace Dds
