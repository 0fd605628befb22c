#pragma once
// FI_File: the engine's typed file stream, in text or binary mode.
//
// The same calls read and write both modes, chosen by the flags at Open, so a
// format's reader and writer are written once:
//
//   FI_File file;
//   if (file.Open("data/x.sh", FI_File::FileFlags::WRITE | FI_File::FileFlags::BINARY)) { file.Write(3); }
//
// Text mode: strings are written between double quotes, numbers with the
// stream's default formatting and no separator. Binary mode: numbers as raw
// little-endian bytes, strings as a 4-byte length and the characters.
// Paths are resolved case-insensitively (Paths::Resolve); writing creates
// missing directories. Writes, Flush and Close return false once the stream has
// failed (a full disk, a file size limit), so a writer learns it before it renames a
// temporary over the file it replaces.

#include <fstream>
#include <string>

class FI_File
{
public:
	// Plain enum inside a struct so the flags combine as ints (READ | BINARY).
	struct FileFlags
	{
		enum : int
		{
			READ = 1,
			WRITE = 2,
			APPEND = 4,
			BINARY = 8,
		};
	};

	FI_File();
	~FI_File();

	bool Open(std::string aFileName, int someFlags);
	bool Close();

	int GetFileSize();
	bool NewLine();

	bool Read(unsigned short& aValue);
	bool Read(int& aValue);
	bool Read(float& aValue);
	bool Read(double& aValue);
	bool Read(std::string& aString);
	bool ReadWord(std::string& aWord);
	bool ReadData(void* aDestination, int aByteCount);

	bool Write(const std::string& aString);
	bool Write(const char* aString);
	bool WriteWord(const std::string& aWord);
	bool Write(int aValue);
	bool Write(float aValue);
	bool Write(double aValue);
	bool WriteData(const void* aSource, int aByteCount);

	bool Flush();

	int GetFlags() const { return myFlags; }

private:
	// The typed reads and writes share one shape: check the flag, then raw bytes
	// in binary mode or stream extraction/insertion in text mode.
	template <typename T> bool ReadNumber(T& aValue);
	template <typename T> bool WriteNumber(T aValue);
	// Whether the stream took everything so far. A write the disk refuses (full, a size
	// limit) fails the stream, often only when its buffer is flushed: writers check the
	// results of the writes, Flush and Close before they trust the file.
	bool Written() const;

	int myFlags;
	std::fstream myStream;
};
