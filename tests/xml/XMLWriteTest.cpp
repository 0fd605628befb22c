// Writing through the cursor: insertion copies, number formatting, saving through a temporary and
// the failures that must leave the file on disk as it was.

#include "xml/XML.h"
#include "xml/XMLElement.h"

#include <csignal>
#include <locale>
#include <sys/resource.h>

#include "XMLTestFixture.h"

namespace
{
const char* const ourLevelText = R"(<?xml version="1.0" ?>
<!-- keep: written by hand -->
<root>
	<point-lights>
		<point-light>
			<position x="9" y="9" z="9" />
			<falloff value="9" />
			<handmade note="dropped on save" />
		</point-light>
	</point-lights>
	<!-- keep: between sections -->
	<spot-lights>
		<spot-light>
			<falloff value="3" />
		</spot-light>
	</spot-lights>
</root>
)";

int FileCount(const std::filesystem::path& aDirectory)
{
	int count = 0;
	for ([[maybe_unused]] const auto& entry : std::filesystem::directory_iterator(aDirectory))
	{
		++count;
	}
	return count;
}

void AddPointLight(XML& anXml, float aX, float aFalloff)
{
	XMLElement position("position");
	position.AddVector3Attributes(Vector3<float>(aX, 0.0f, 1.0f));
	XMLElement falloff("falloff");
	falloff.AddAttribute("value", aFalloff);
	XMLElement record("point-light");
	record.InsertElement(position);
	record.InsertElement(falloff);
	anXml.InsertElement(record, false);
}
} // namespace

class XMLWriteTest : public XMLFixture
{
protected:
	void SetUp() override
	{
		XMLFixture::SetUp();
		myPath = WriteDocument("levels/demo/lights.xml", ourLevelText);
	}

	std::string myPath;
};

TEST_F(XMLWriteTest, RewrittenSectionKeepsEverythingElse)
{
	{
		XML xml(myPath);
		ASSERT_TRUE(xml.GoToElement("point-lights", "", ""));
		xml.RemoveChildren();
		AddPointLight(xml, 1.0f, 0.5f);
		AddPointLight(xml, 2.0f, 0.75f);
		xml.SaveFile();
	}
	EXPECT_EQ(ReportCount(), 0);
	const std::string saved = TestSupport::ReadWholeFile(myPath);
	EXPECT_NE(saved.find("keep: written by hand"), std::string::npos);
	EXPECT_NE(saved.find("keep: between sections"), std::string::npos);
	EXPECT_EQ(saved.find("handmade"), std::string::npos);
	// Nothing but the file itself is left in its directory.
	EXPECT_EQ(FileCount(std::filesystem::path(myPath).parent_path()), 1);

	XML reread(myPath);
	ASSERT_TRUE(reread.GoToElement("point-lights", "", ""));
	std::vector<float> xs;
	std::vector<float> falloffs;
	ASSERT_TRUE(reread.EnterChild("point-light"));
	do
	{
		xs.push_back(reread.GetVector3Attribute("position").x);
		falloffs.push_back(reread.GetChildAttribute<float>("falloff", ""));
	} while (reread.GoToNextSibling("point-light"));
	EXPECT_EQ(xs, (std::vector<float>{1.0f, 2.0f}));
	EXPECT_EQ(falloffs, (std::vector<float>{0.5f, 0.75f}));
	ASSERT_TRUE(reread.GoToElement("spot-lights", "spot-light", ""));
	EXPECT_EQ(reread.GetChildAttribute<float>("falloff", ""), 3.0f);
	EXPECT_EQ(ReportCount(), 0);
}

TEST_F(XMLWriteTest, InsertionCopiesTheElementAsItIsThen)
{
	XML xml(myPath);
	ASSERT_TRUE(xml.GoToElement("spot-lights", "", ""));
	XMLElement falloff("falloff");
	falloff.AddAttribute("value", 1.0f);
	XMLElement record("spot-light");
	record.AddAttribute("id", 1);
	record.InsertElement(falloff);
	falloff.AddAttribute("value", 2.0f);
	xml.InsertElement(record, false);
	record.AddAttribute("id", 2);
	record.InsertElement(falloff);
	xml.InsertElement(record, true);

	XML reread(myPath);
	ASSERT_TRUE(reread.GoToElement("spot-lights", "", ""));
	reread.GoToLastChild();
	EXPECT_EQ(reread.GetAttribute<int>("id"), 2);
	// The later record holds both falloff copies: the first still says 1.
	EXPECT_EQ(reread.GetChildAttribute<float>("falloff", ""), 1.0f);
	reread.GoToLastChild();
	EXPECT_EQ(reread.GetAttribute<float>("value"), 2.0f);

	ASSERT_TRUE(reread.GoToElement("spot-lights", "", ""));
	ASSERT_TRUE(reread.EnterChild("spot-light"));
	ASSERT_TRUE(reread.GoToNextSibling("spot-light"));
	EXPECT_EQ(reread.GetAttribute<int>("id"), 1);
	ASSERT_TRUE(reread.EnterChild("falloff"));
	EXPECT_EQ(reread.GetAttribute<float>("value"), 1.0f);
	EXPECT_FALSE(reread.GoToNextSibling(""));
	EXPECT_EQ(ReportCount(), 0);
}

TEST_F(XMLWriteTest, NumbersAreWrittenWithSixSignificantDigitsAndReadBack)
{
	{
		XML xml(myPath);
		ASSERT_TRUE(xml.GoToElement("point-lights", "", ""));
		xml.RemoveChildren();
		XMLElement values("values");
		values.AddAttribute("tenth", 0.1f);
		values.AddAttribute("two", 2.0f);
		values.AddAttribute("third", 1.0f / 3.0f);
		values.AddAttribute("big", 1234567.0f);
		values.AddAttribute("count", -42);
		values.AddAttribute("text", std::string("a<b & \"c\""));
		xml.InsertElement(values, true);
	}
	const std::string saved = TestSupport::ReadWholeFile(myPath);
	EXPECT_NE(saved.find("tenth=\"0.1\""), std::string::npos);
	EXPECT_NE(saved.find("two=\"2\""), std::string::npos);
	EXPECT_NE(saved.find("third=\"0.333333\""), std::string::npos);
	EXPECT_NE(saved.find("big=\"1.23457e+06\""), std::string::npos);
	EXPECT_NE(saved.find("count=\"-42\""), std::string::npos);

	XML reread(myPath);
	ASSERT_TRUE(reread.GoToElement("point-lights", "values", ""));
	EXPECT_EQ(reread.GetAttribute<float>("tenth"), 0.1f);
	EXPECT_EQ(reread.GetAttribute<float>("two"), 2.0f);
	EXPECT_EQ(reread.GetAttribute<float>("third"), 0.333333f);
	EXPECT_EQ(reread.GetAttribute<float>("big"), 1234570.0f);
	EXPECT_EQ(reread.GetAttribute<int>("count"), -42);
	EXPECT_EQ(reread.GetAttribute<std::string>("text"), "a<b & \"c\"");
}

namespace
{
struct CommaDecimalPoint : std::numpunct<char>
{
	char do_decimal_point() const override { return ','; }
};
} // namespace

TEST_F(XMLWriteTest, UserLocaleDoesNotChangeWrittenNumbers)
{
	XML xml(myPath);
	ASSERT_TRUE(xml.GoToElement("point-lights", "", ""));
	xml.RemoveChildren();
	const std::locale previous =
	    std::locale::global(std::locale(std::locale::classic(), new CommaDecimalPoint));
	XMLElement values("values");
	values.AddAttribute("half", 0.5f);
	std::locale::global(previous);
	xml.InsertElement(values, true);
	EXPECT_NE(TestSupport::ReadWholeFile(myPath).find("half=\"0.5\""), std::string::npos);
}

TEST_F(XMLWriteTest, FailedWriteLeavesTheOldFileAndNoTemporary)
{
	const std::string before = TestSupport::ReadWholeFile(myPath);
	XML xml(myPath);
	ASSERT_TRUE(xml.GoToElement("point-lights", "", ""));
	for (int i = 0; i < 2000; ++i)
	{
		AddPointLight(xml, static_cast<float>(i), 1.0f);
	}

	// A file size limit makes the write fail part way, as a full disk would.
	rlimit previousLimit{};
	ASSERT_EQ(getrlimit(RLIMIT_FSIZE, &previousLimit), 0);
	rlimit smallLimit = previousLimit;
	smallLimit.rlim_cur = 16 * 1024;
	void (*previousHandler)(int) = std::signal(SIGXFSZ, SIG_IGN);
	ASSERT_EQ(setrlimit(RLIMIT_FSIZE, &smallLimit), 0);
	xml.SaveFile();
	setrlimit(RLIMIT_FSIZE, &previousLimit);
	std::signal(SIGXFSZ, previousHandler);

	EXPECT_NE(Log().find("Could not save file [" + myPath + "]"), std::string::npos);
	EXPECT_EQ(TestSupport::ReadWholeFile(myPath), before);
	EXPECT_EQ(FileCount(std::filesystem::path(myPath).parent_path()), 1);
}

TEST_F(XMLWriteTest, DocumentThatFailedToLoadIsNeverWrittenOverItsFile)
{
	const std::string broken = "<root><point-lights></root>";
	const std::string path = WriteDocument("levels/demo/broken.xml", broken);
	XML xml(path);
	EXPECT_NE(Log().find("Could not open file [" + path + "]"), std::string::npos);
	EXPECT_FALSE(xml.GoToElement("", "", ""));
	xml.SaveFile();
	EXPECT_NE(Log().find("Could not save file [" + path + "]"), std::string::npos);
	xml.CopyDocument(myScratch.File("copy.xml"));
	EXPECT_NE(Log().find("No document set to copy"), std::string::npos);
	EXPECT_EQ(TestSupport::ReadWholeFile(path), broken);
	EXPECT_FALSE(std::filesystem::exists(myScratch.File("copy.xml")));
}

TEST_F(XMLWriteTest, SaveGoesToTheExistingFileWhateverTheSpelling)
{
	const std::string givenName = (myScratch.Path() / "Levels/DEMO/Lights.xml").string();
	{
		XML xml(givenName);
		ASSERT_TRUE(xml.GoToElement("point-lights", "", ""));
		xml.RemoveChildren();
		xml.SaveFile();
	}
	EXPECT_EQ(ReportCount(), 0);
	EXPECT_EQ(TestSupport::ReadWholeFile(myPath).find("point-light>"), std::string::npos);
	EXPECT_EQ(FileCount(myScratch.Path()), 2); // the log and levels/
}

TEST_F(XMLWriteTest, InsertWithoutPlaceToInsertReports)
{
	XML xml(myPath);
	XMLElement record("point-light");
	xml.InsertElement(record, false);
	EXPECT_NE(Log().find("Could not insert element [point-light] in file [" + myPath + "]"),
	          std::string::npos);

	// A comment cannot hold children that would ever be written out.
	const std::string other = WriteDocument("comment-first.xml", "<root><!-- c --><a /></root>");
	XML commented(other);
	ASSERT_TRUE(commented.GoToElement("", "", ""));
	commented.InsertElement(record, true);
	EXPECT_NE(Log().find("Could not insert element [point-light] in file [" + other + "]"),
	          std::string::npos);
	EXPECT_EQ(TestSupport::ReadWholeFile(other).find("point-light"), std::string::npos);
	EXPECT_EQ(ReportCount(), 2);
}
