#include "engine/FI_File.h"

#include <bit>
#include <cstdint>
#include <cstring>
#include <iostream>
#include <limits>
#include <locale>

#include "platform/paths/Paths.h"

// The binary formats are little-endian and values are written as their memory image.
static_assert(std::endian::native == std::endian::little, "FI_File writes raw little-endian bytes");

namespace
{
constexpr std::streamsize ourWholeLine = std::numeric_limits<std::streamsize>::max();

template <typename T> void ReadRaw(std::fstream& aStream, T& aValue)
{
	aStream.read(reinterpret_cast<char*>(&aValue), sizeof(T));
}

template <typename T> void WriteRaw(std::fstream& aStream, const T& aValue)
{
	aStream.write(reinterpret_cast<const char*>(&aValue), sizeof(T));
}

// Bytes between the read position and the end of the file, or -1 when unknown.
std::streamoff BytesLeft(std::fstream& aStream)
{
	const std::streampos here = aStream.tellg();
	if (here == std::streampos(-1))
	{
		return -1;
	}
	aStream.seekg(0, std::ios::end);
	const std::streampos end = aStream.tellg();
	aStream.seekg(here);
	return end == std::streampos(-1) ? -1 : end - here;
}
} // namespace

// Binary numbers are their memory image; the formats fix int at 4 bytes.
static_assert(sizeof(int) == 4 && sizeof(float) == 4 && sizeof(double) == 8 && sizeof(unsigned short) == 2);

template <typename T> bool FI_File::ReadNumber(T& aValue)
{
	if ((myFlags & FileFlags::READ) == 0)
	{
		return false;
	}
	if ((myFlags & FileFlags::BINARY) != 0)
	{
		ReadRaw(myStream, aValue);
	}
	else
	{
		myStream >> aValue;
	}
	return true;
}

template <typename T> bool FI_File::WriteNumber(T aValue)
{
	if ((myFlags & FileFlags::WRITE) == 0)
	{
		return false;
	}
	if ((myFlags & FileFlags::BINARY) != 0)
	{
		WriteRaw(myStream, aValue);
	}
	else
	{
		myStream << aValue;
	}
	return Written();
}

bool FI_File::Written() const
{
	return !myStream.fail();
}

FI_File::FI_File() : myFlags(0)
{
}

FI_File::~FI_File() = default;

bool FI_File::Open(std::string aFileName, int someFlags)
{
	myStream.close();
	myStream.clear();
	myFlags = someFlags;

	// Append without write is checked first: append alone (4) has neither access
	// bit either, and this message names the actual mistake.
	if ((someFlags & FileFlags::APPEND) != 0 && (someFlags & FileFlags::WRITE) == 0)
	{
		std::cerr << "error: can't have append without read access.\n\n";
		myFlags = 0;
		return false;
	}
	if ((someFlags & (FileFlags::READ | FileFlags::WRITE)) == 0)
	{
		std::cerr << "error: must have at least read or write access.\n\n";
		myFlags = 0;
		return false;
	}

	std::ios::openmode mode{};
	if ((someFlags & FileFlags::READ) != 0)
	{
		mode |= std::ios::in;
	}
	if ((someFlags & FileFlags::WRITE) != 0)
	{
		mode |= std::ios::out;
	}
	if ((someFlags & FileFlags::APPEND) != 0)
	{
		mode |= std::ios::app;
	}
	if ((someFlags & FileFlags::BINARY) != 0)
	{
		mode |= std::ios::binary;
	}

	const std::string path =
	    (someFlags & FileFlags::WRITE) != 0 ? Paths::PrepareForWrite(aFileName) : Paths::Resolve(aFileName);
	if (!path.empty())
	{
		myStream.open(path, mode);
	}
	if (path.empty() || !myStream.is_open())
	{
		std::cerr << "error: unable to open file:" << aFileName << "\n\n";
		myStream.clear();
		// With the flags cleared every later call reports false instead of quietly
		// failing on a stream that was never opened.
		myFlags = 0;
		return false;
	}
	// Files must read the same whatever locale the host application installs
	// (a decimal comma would break every float in the settings file).
	myStream.imbue(std::locale::classic());
	return true;
}

bool FI_File::Close()
{
	myStream.close();
	myFlags = 0;
	if (myStream.fail() || myStream.bad())
	{
		myStream.clear();
		return false;
	}
	return true;
}

int FI_File::GetFileSize()
{
	const std::streampos start = myStream.tellg();
	if (start == std::streampos(-1))
	{
		// No position to measure from (closed, or a failed read): report it rather
		// than a size computed from -1.
		return -1;
	}
	myStream.seekg(0, std::ios::end);
	const std::streampos end = myStream.tellg();
	myStream.seekg(0, std::ios::beg);
	return static_cast<int>(end - start);
}

bool FI_File::NewLine()
{
	if ((myFlags & FileFlags::BINARY) != 0)
	{
		return false;
	}
	// A file opened for both reads; nothing in the engine opens a text file that way.
	if ((myFlags & FileFlags::READ) != 0)
	{
		myStream.ignore(ourWholeLine, '\n');
		return true;
	}
	if ((myFlags & FileFlags::WRITE) != 0)
	{
		myStream.put('\n');
		return Written();
	}
	return false;
}

bool FI_File::Read(unsigned short& aValue)
{
	return ReadNumber(aValue);
}

bool FI_File::Read(int& aValue)
{
	return ReadNumber(aValue);
}

bool FI_File::Read(float& aValue)
{
	return ReadNumber(aValue);
}

bool FI_File::Read(double& aValue)
{
	return ReadNumber(aValue);
}

bool FI_File::Read(std::string& aString)
{
	if ((myFlags & FileFlags::READ) == 0)
	{
		return false;
	}
	if ((myFlags & FileFlags::BINARY) == 0)
	{
		myStream.ignore(ourWholeLine, '"');
		std::getline(myStream, aString, '"');
		return true;
	}
	std::int32_t length = 0;
	ReadRaw(myStream, length);
	aString.clear();
	if (!myStream)
	{
		return true;
	}
	// A corrupt length must not turn into a huge allocation: it fails the stream
	// like any other malformed read, and the caller sees it at Close.
	const std::streamoff left = BytesLeft(myStream);
	if (length < 0 || left < 0 || length > left)
	{
		myStream.setstate(std::ios::failbit);
		return true;
	}
	aString.resize(static_cast<std::size_t>(length));
	myStream.read(aString.data(), length);
	return true;
}

bool FI_File::ReadWord(std::string& aWord)
{
	if ((myFlags & FileFlags::READ) == 0)
	{
		return false;
	}
	// Binary files have no words; reading the length-prefixed form that WriteWord
	// writes in binary mode keeps the two symmetric.
	if ((myFlags & FileFlags::BINARY) != 0)
	{
		return Read(aWord);
	}
	myStream >> aWord;
	while (myStream && aWord.starts_with("//"))
	{
		myStream.ignore(ourWholeLine, '\n');
		myStream >> aWord;
	}
	if (!myStream)
	{
		// A file that ends inside a comment must not hand the comment back as a word.
		aWord.clear();
	}
	return true;
}

bool FI_File::ReadData(void* aDestination, int aByteCount)
{
	if ((myFlags & FileFlags::READ) == 0 || (myFlags & FileFlags::BINARY) == 0)
	{
		return false;
	}
	if (aByteCount < 0 || (aByteCount > 0 && aDestination == nullptr))
	{
		return false;
	}
	myStream.read(static_cast<char*>(aDestination), aByteCount);
	return true;
}

bool FI_File::Write(const std::string& aString)
{
	if ((myFlags & FileFlags::WRITE) == 0)
	{
		return false;
	}
	if ((myFlags & FileFlags::BINARY) == 0)
	{
		myStream << '"' << aString << '"';
		return Written();
	}
	// The length field is 32 bits; a longer string cannot be written faithfully.
	if (aString.size() > static_cast<std::size_t>(std::numeric_limits<std::int32_t>::max()))
	{
		return false;
	}
	WriteRaw(myStream, static_cast<std::int32_t>(aString.size()));
	myStream.write(aString.data(), static_cast<std::streamsize>(aString.size()));
	return Written();
}

bool FI_File::Write(const char* aString)
{
	if (aString == nullptr)
	{
		return false;
	}
	return Write(std::string(aString));
}

bool FI_File::WriteWord(const std::string& aWord)
{
	if ((myFlags & FileFlags::WRITE) == 0)
	{
		return false;
	}
	if ((myFlags & FileFlags::BINARY) != 0)
	{
		return Write(aWord);
	}
	myStream << aWord;
	return Written();
}

bool FI_File::Write(int aValue)
{
	return WriteNumber(aValue);
}

bool FI_File::Write(float aValue)
{
	return WriteNumber(aValue);
}

bool FI_File::Write(double aValue)
{
	return WriteNumber(aValue);
}

bool FI_File::WriteData(const void* aSource, int aByteCount)
{
	if ((myFlags & FileFlags::WRITE) == 0 || (myFlags & FileFlags::BINARY) == 0)
	{
		return false;
	}
	if (aByteCount < 0 || (aByteCount > 0 && aSource == nullptr))
	{
		return false;
	}
	myStream.write(static_cast<const char*>(aSource), aByteCount);
	return Written();
}

bool FI_File::Flush()
{
	if ((myFlags & FileFlags::WRITE) == 0)
	{
		return false;
	}
	myStream.flush();
	return Written();
}
