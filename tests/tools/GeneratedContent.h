#pragma once
// GeneratedContent: runs the content generator once per test binary into a scratch directory and
// gives the tests its files; Dot is the tests' own, so that a fault in the generator's vector helpers
// cannot hide in both.

#include <gtest/gtest.h>

#include <algorithm>
#include <iterator>
#include <string>
#include <vector>

#include "Generator.h"
#include "core/Vector3.h"
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
} // namespace ContentTestSupport
