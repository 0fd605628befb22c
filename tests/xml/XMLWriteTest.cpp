// Writing through the cursor: insertion copies, number formatting, saving through a temporary and
// the failures that must leave the file on disk as it was.

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

void AddLight(XML& anXml, float aX, float aFalloff)
{
	XMLElement position("position");
	position.AddVector3Attributes(Vector3<float>(aX, 0.0f, 1.0f));
	XMLElement falloff("falloff");
	falloff.AddAttribute("value", aFalloff);
	XMLElement record("light");
	record.InsertElement(position);
	record.InsertElement(falloff);
	anXml.InsertElement(record, false);
}

struct CommaDecimalPoint : std::numpunct<char>
{
	char do_decimal_point() const override { return ','; }
};
} // namespace

TEST_F(XMLFixture, RewrittenSectionKeepsEverythingElseInTheFileWhateverThePathSpelling)
{
	const std::string givenName = (myScratch.Path() / "Levels/DEMO/Lights.xml").string();
	{
		XML xml(givenName);
		ASSERT_TRUE(xml.GoToElement("lights", "", ""));
		xml.RemoveChildren();
		AddLight(xml, 1.0f, 0.5f);
		AddLight(xml, 2.0f, 0.75f);
		xml.SaveFile();
		EXPECT_EQ(ReportCount(), 0);
		xml.GetAttribute<int>("missing"); // messages carry the name as given
		EXPECT_TRUE(Logged("Could not get attribute [missing] in [lights] in [" + givenName + "]"));
	}
	const std::string saved = TestSupport::ReadWholeFile(myPath);
	EXPECT_NE(saved.find("keep: written by hand"), std::string::npos);
	EXPECT_NE(saved.find("keep: between sections"), std::string::npos);
	EXPECT_EQ(saved.find("note"), std::string::npos);
	EXPECT_EQ(FileCount(myScratch.Path()), 2);                            // the log and levels/
	EXPECT_EQ(FileCount(std::filesystem::path(myPath).parent_path()), 1); // no temporary left

	XML reread(myPath);
	EXPECT_TRUE(reread.GoToElement("bare", "", ""));
	ASSERT_TRUE(reread.GoToElement("lights", "light", ""));
	std::vector<float> xsAndFalloffs;
	do
	{
		xsAndFalloffs.push_back(reread.GetVector3Attribute("position").x);
		xsAndFalloffs.push_back(reread.GetChildAttribute<float>("falloff", ""));
	} while (reread.GoToNextSibling("light"));
	EXPECT_EQ(xsAndFalloffs, (std::vector<float>{1.0f, 0.5f, 2.0f, 0.75f}));
	EXPECT_EQ(ReportCount(), 1);
}

TEST_F(XMLFixture, ElementChangedAfterInsertionLeavesItsCopyAlone)
{
	{
		XML xml(myPath);
		ASSERT_TRUE(xml.GoToElement("bare", "", ""));
		XMLElement falloff("falloff");
		falloff.AddAttribute("value", 1.0f);
		XMLElement record("light");
		record.InsertElement(falloff);
		falloff.AddAttribute("value", 2.0f); // after its copy went into the record
		xml.InsertElement(record, false);
		record.InsertElement(falloff); // after its copy went into the document
		xml.InsertElement(record, true);
	}
	XML reread(myPath);
	ASSERT_TRUE(reread.GoToElement("bare", "light", "falloff"));
	EXPECT_EQ(reread.GetAttribute<float>("value"), 1.0f);
	EXPECT_FALSE(reread.GoToNextSibling(""));
	reread.ExitChild();
	ASSERT_TRUE(reread.GoToNextSibling("light"));
	EXPECT_EQ(reread.GetChildAttribute<float>("falloff", ""), 1.0f);
	reread.GoToLastChild();
	EXPECT_EQ(reread.GetAttribute<float>("value"), 2.0f);
	EXPECT_EQ(ReportCount(), 0);
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
		values.AddAttribute("count", -42);
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
	EXPECT_EQ(reread.GetAttribute<int>("count"), -42);
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
