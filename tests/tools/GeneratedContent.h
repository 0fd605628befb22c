#pragma once
// GeneratedContent: runs the content generator once per test binary into a scratch directory and
// gives the tests its files; LoadGeneratedImage reads one of them back with the DDS reader; Dot is the
// tests' own, so that a fault in the generator's vector helpers cannot hide in both.

#include <gtest/gtest.h>

#include <algorithm>
#include <iterator>
#include <string>
#include <vector>

#include "Generator.h"
#include "core/Vector3.h"
#include "platform/dds/DdsFile.h"
#include "support/TestSupport.h"

namespace ContentTestSupport
{
template <typename T> T Dot(const Vector3<T>& aLeft, const Vector3<T>& aRight)
{
	return aLeft.x * aRight.x + aLeft.y * aRight.y + aLeft.z * aRight.z;
}

class GeneratedContent
{
public:
	static const GeneratedContent& Get()
	{
		static const GeneratedContent ourContent;
		return ourContent;
	}

	std::string Path(const std::string& aRelative) const { return myScratch.File(aRelative); }
	const std::vector<std::string>& Files() const { return myFiles; }
	const std::string& Error() const { return myError; }
	std::vector<std::string> Documents() const
	{
		std::vector<std::string> documents;
		std::copy_if(myFiles.begin(), myFiles.end(), std::back_inserter(documents),
		             [](const std::string& aFile) { return aFile.ends_with(".dae"); });
		return documents;
	}

private:
	GeneratedContent()
	{
		if (!Content::Generate(myScratch.Path().string(), myFiles, myError) && myError.empty())
		{
			myError = "generation failed without a message";
		}
	}

	TestSupport::ScratchDir myScratch;
	std::vector<std::string> myFiles;
	std::string myError;
};

// Loads a generated file ("grading/warm.dds") into anImageOut; use with ASSERT_NO_FATAL_FAILURE.
inline void LoadGeneratedImage(const std::string& aRelative, Dds::Image& anImageOut)
{
	const GeneratedContent& content = GeneratedContent::Get();
	ASSERT_EQ(content.Error(), "");
	ASSERT_NE(std::find(content.Files().begin(), content.Files().end(), aRelative), content.Files().end())
	    << aRelative << " is not among the generated files";
	std::string error;
	ASSERT_TRUE(Dds::LoadFromFile(content.Path(aRelative), anImageOut, error)) << error;
}
} // namespace ContentTestSupport
