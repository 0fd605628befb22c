// Writing through the cursor: saving to the file a path names whatever its spelling, number
// formatting, and the failures that must leave the file on disk as it was.

#include "xml/XML.h"
#include "xml/XMLElement.h"

#include <locale>

#include "XMLTestFixture.h"
#include "support/FileSizeLimit.h"

namespace
{
int FileCount(const std::filesystem::path& aDirectory)
{
	const std::filesystem::directory_iterator entries(aDirectory);
	return static_cast<int>(std::distance(begin(entries), end(entries)));
}

void AddLight(XML& anXml, float aFalloff)
{
	XMLElement falloff("falloff");
	falloff.AddAttribute("value", aFalloff);
	XMLElement record("light");
	record.InsertElement(falloff);
	anXml.InsertElement(record, false);
}

struct CommaDecimalPoint : std::numpunct<char>
{
	char do_decimal_point() const override { return ','; }
};
} // namespace

// What a rewritten section keeps beside it, and the temporary a save leaves none of, are the level
// saves' own tests (LevelLoadSaveTest); here the path as the user spelt it.
TEST_F(XMLFixture, ARewrittenSectionIsSavedToTheFileWhateverThePathSpelling)
{
	const std::string givenName = (myScratch.Path() / "Levels/DEMO/Lights.xml").string();
	{
		XML xml(givenName);
		ASSERT_TRUE(xml.GoToElement("lights", "", ""));
		xml.RemoveChildren();
		AddLight(xml, 0.75f);
		xml.SaveFile();
		EXPECT_EQ(ReportCount(), 0);
		xml.GetAttribute<int>("missing"); // messages carry the name as given
		EXPECT_TRUE(Logged("Could not get attribute [missing] in [lights] in [" + givenName + "]"));
	}
	EXPECT_EQ(FileCount(myScratch.Path()), 2); // the log and levels/: nothing under the given spelling
	EXPECT_EQ(FileCount(std::filesystem::path(myPath).parent_path()), 1);
	XML reread(myPath);
	ASSERT_TRUE(reread.GoToElement("lights", "light", ""));
	EXPECT_EQ(reread.GetChildAttribute<float>("falloff", ""), 0.75f);
	EXPECT_FALSE(reread.GoToNextSibling("light"));
}

TEST_F(XMLFixture, NumbersAreWrittenWithSixSignificantDigitsAndReadBackWhateverTheUserLocale)
{
	const std::locale previous =
	    std::locale::global(std::locale(std::locale::classic(), new CommaDecimalPoint));
	// clang-format off
	const std::tuple<const char*, float, const char*> floats[] = {
	    {"tenth", 0.1f, "0.1"}, {"two", 2.0f, "2"}, {"third", 1.0f / 3.0f, "0.333333"}, {"big", 1234567.0f, "1.23457e+06"}};
	// clang-format on
	{
		XML xml(myPath);
		EXPECT_TRUE(xml.GoToElement("bare", "", "")); // nothing fatal before the locale is restored
		XMLElement values("values");
		for (const auto& [name, value, written] : floats)
		{
			values.AddAttribute(name, value);
		}
		values.AddAttribute("text", "a<b & \"c\"");
		xml.InsertElement(values, true);
	}
	const std::string saved = TestSupport::ReadWholeFile(myPath);
	XML reread(myPath);
	EXPECT_TRUE(reread.GoToElement("bare", "values", ""));
	for (const auto& [name, value, written] : floats)
	{
		EXPECT_NE(saved.find(std::string(name) + "=\"" + written + "\""), std::string::npos) << name;
		EXPECT_EQ(reread.GetAttribute<float>(name), std::stof(written)) << name;
	}
	EXPECT_EQ(reread.GetAttribute<std::string>("text"), "a<b & \"c\"");
	std::locale::global(previous);
}

TEST_F(XMLFixture, FailedSavesLeaveTheFileAsItWasAndNoTemporary)
{
	XML xml(myPath);
	ASSERT_TRUE(xml.GoToElement("lights", "", ""));
	XMLElement big("big");
	big.AddAttribute("text", std::string(64 * 1024, 'x'));
	xml.InsertElement(big, false);
	{
		// A file size limit makes the write fail part way, as a full disk would.
		const TestSupport::FileSizeLimit full(16 * 1024);
		xml.SaveFile();
	}
	EXPECT_TRUE(Logged("Could not save file [" + myPath + "]"));
	EXPECT_EQ(TestSupport::ReadWholeFile(myPath), ourLightsText);
	EXPECT_EQ(FileCount(std::filesystem::path(myPath).parent_path()), 1);

	// A document that failed to load is never written over its file, nor copied.
	const std::string broken = "<root><lights></root>";
	const std::string path = WriteDocument("broken.xml", broken);
	XML failed(path);
	EXPECT_FALSE(failed.GoToElement("", "", ""));
	failed.SaveFile();
	failed.CopyDocument(myScratch.File("copy.xml"));
	EXPECT_TRUE(Logged("Could not save file [" + path + "]"));
	EXPECT_TRUE(Logged("No document set to copy"));
	EXPECT_EQ(TestSupport::ReadWholeFile(path), broken);
	EXPECT_FALSE(std::filesystem::exists(myScratch.File("copy.xml")));
}
