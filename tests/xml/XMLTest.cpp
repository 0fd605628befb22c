// Reading through the cursor: walks, typed values and the reports of failed reads.

#include "xml/XML.h"

#include <locale>

#include "XMLTestFixture.h"

namespace
{
const char* const ourLightsText = R"(<?xml version="1.0" ?>
<!-- hand-edited lights -->
<root>
	<bare />
	<point-lights>
		<!-- first light -->
		<point-light id="1">
			<position x="1" y="2" z="3" />
			<color r="0.5" g="0.25" b="1" a="4" />
			<falloff value="2.5" />
		</point-light>
		<note text="not a light" />
		<point-light id="2">
			<position x="-1" y="0" z="7.5" extra="9" />
			<color a="1" b="0" g="0" r="2" />
			<falloff v="2.5" />
		</point-light>
		<!-- between -->
		<point-light id="3">
			<falloff value="0.5" />
			<angles inner="0.9" />
			<empty />
		</point-light>
	</point-lights>
	<spot-lights>
		<spot-light id="10">
			<angles inner="0.9" outer="0.7" />
		</spot-light>
	</spot-lights>
	<node-graph>
		<nodes number-of-nodes="0" />
	</node-graph>
</root>
)";
}

class XMLReadTest : public XMLFixture
{
protected:
	void SetUp() override
	{
		XMLFixture::SetUp();
		myPath = WriteDocument("lights.xml", ourLightsText);
	}

	std::string myPath;
};

TEST_F(XMLReadTest, SiblingWalkVisitsEveryRecordAndExitReturnsToTheSection)
{
	XML xml(myPath);
	ASSERT_TRUE(xml.GoToElement("point-lights", "", ""));
	std::vector<int> ids;
	ASSERT_TRUE(xml.EnterChild("point-light"));
	do
	{
		ids.push_back(xml.GetAttribute<int>("id"));
	} while (xml.GoToNextSibling("point-light"));
	EXPECT_EQ(ids, (std::vector<int>{1, 2, 3}));

	// The walk ran off the end: the cursor is null, and ExitChild goes through the last record.
	EXPECT_FALSE(xml.EnterChild(""));
	xml.ExitChild();
	EXPECT_EQ(xml.GetElementName(), "point-lights");

	// An unnamed sibling walk passes over comments but not over other elements.
	ASSERT_TRUE(xml.EnterChild(""));
	EXPECT_EQ(xml.GetElementName(), "point-light");
	ASSERT_TRUE(xml.GoToNextSibling(""));
	EXPECT_EQ(xml.GetElementName(), "note");
	ASSERT_TRUE(xml.GoToNextSibling(""));
	EXPECT_EQ(xml.GetAttribute<int>("id"), 2);
	ASSERT_TRUE(xml.GoToNextSibling(""));
	EXPECT_EQ(xml.GetAttribute<int>("id"), 3);
	EXPECT_FALSE(xml.GoToNextSibling(""));
	EXPECT_EQ(ReportCount(), 0);
}

TEST_F(XMLReadTest, GoToElementWalksUpToThreeLevelsAndFailsSilently)
{
	XML xml(myPath);
	ASSERT_TRUE(xml.GoToElement("node-graph", "nodes", ""));
	EXPECT_EQ(xml.GetElementName(), "nodes");
	ASSERT_TRUE(xml.GoToElement("point-lights", "point-light", "falloff"));
	EXPECT_EQ(xml.GetAttribute<float>(""), 2.5f);

	// An empty first level takes the root's first child of any kind.
	ASSERT_TRUE(xml.GoToElement("", "", ""));
	EXPECT_EQ(xml.GetElementName(), "bare");

	EXPECT_FALSE(xml.GoToElement("no-such-section", "", ""));
	EXPECT_FALSE(xml.GoToElement("point-lights", "point-light", "no-such-child"));
	EXPECT_FALSE(xml.EnterChild("anything"));
	EXPECT_FALSE(xml.GoToNextSibling("anything"));
	EXPECT_EQ(ReportCount(), 0);

	xml.RemoveChildren();
	EXPECT_NE(Log().find("No node set to remove children from"), std::string::npos);
	EXPECT_EQ(ReportCount(), 1);
}

TEST_F(XMLReadTest, EnterChildWithoutNamePassesOverLeadingComment)
{
	XML xml(myPath);
	ASSERT_TRUE(xml.GoToElement("point-lights", "", ""));
	ASSERT_TRUE(xml.EnterChild(""));
	EXPECT_EQ(xml.GetElementName(), "point-light");
	EXPECT_EQ(xml.GetAttribute<int>("id"), 1);

	// A failed EnterChild leaves the cursor where it was.
	EXPECT_FALSE(xml.EnterChild("no-such-child"));
	EXPECT_EQ(xml.GetAttribute<int>("id"), 1);
}

TEST_F(XMLReadTest, SingleValuesTakeTheFirstAttributeWhateverItsName)
{
	XML xml(myPath);
	ASSERT_TRUE(xml.GoToElement("point-lights", "", ""));
	ASSERT_TRUE(xml.EnterChild("point-light"));
	EXPECT_EQ(xml.GetChildAttribute<float>("falloff", ""), 2.5f);
	ASSERT_TRUE(xml.GoToNextSibling("point-light"));
	EXPECT_EQ(xml.GetChildAttribute<float>("falloff", ""), 2.5f);
	EXPECT_EQ(ReportCount(), 0);
}

TEST_F(XMLReadTest, VectorsAreReadByComponentNameInAnyOrder)
{
	XML xml(myPath);
	ASSERT_TRUE(xml.GoToElement("point-lights", "", ""));
	ASSERT_TRUE(xml.EnterChild("point-light"));
	ASSERT_TRUE(xml.GoToNextSibling("point-light"));
	const Vector3<float> position = xml.GetVector3Attribute("position");
	EXPECT_EQ(position.x, -1.0f);
	EXPECT_EQ(position.y, 0.0f);
	EXPECT_EQ(position.z, 7.5f);
	const Vector4<float> color = xml.GetVector4Attribute("color");
	EXPECT_EQ(color.x, 2.0f);
	EXPECT_EQ(color.y, 0.0f);
	EXPECT_EQ(color.z, 0.0f);
	EXPECT_EQ(color.w, 1.0f);

	// With an empty tag the cursor element itself holds the components.
	ASSERT_TRUE(xml.GoToElement("point-lights", "point-light", "color"));
	const Vector4<float> sameColor = xml.GetVector4Attribute("");
	EXPECT_EQ(sameColor.x, 0.5f);
	EXPECT_EQ(sameColor.y, 0.25f);
	EXPECT_EQ(sameColor.z, 1.0f);
	EXPECT_EQ(sameColor.w, 4.0f);
	ASSERT_TRUE(xml.GoToElement("point-lights", "point-light", "position"));
	const Vector3<float> samePosition = xml.GetVector3Attribute("");
	EXPECT_EQ(samePosition.x, 1.0f);
	EXPECT_EQ(samePosition.z, 3.0f);
	EXPECT_EQ(ReportCount(), 0);
}

TEST_F(XMLReadTest, NamedChildAttributeFoundOrReportedWithItsWholePath)
{
	XML xml(myPath);
	ASSERT_TRUE(xml.GoToElement("spot-lights", "spot-light", ""));
	EXPECT_EQ(xml.GetChildAttribute<float>("angles", "outer"), 0.7f);
	EXPECT_EQ(ReportCount(), 0);

	ASSERT_TRUE(xml.GoToElement("point-lights", "", ""));
	ASSERT_TRUE(xml.EnterChild("point-light"));
	ASSERT_TRUE(xml.GoToNextSibling("point-light"));
	ASSERT_TRUE(xml.GoToNextSibling("point-light"));
	EXPECT_EQ(xml.GetChildAttribute<float>("angles", "outer"), 0.0f);
	EXPECT_NE(Log().find("Could not find name [outer] in [angles] in [point-light] in [" + myPath + "]"),
	          std::string::npos);
}

TEST_F(XMLReadTest, FailedGetAttributeReportsAndYieldsZero)
{
	XML xml(myPath);
	EXPECT_EQ(xml.GetAttribute<int>("id"), 0);
	EXPECT_NE(Log().find("No Current Element"), std::string::npos);

	ASSERT_TRUE(xml.GoToElement("bare", "", ""));
	// A single-letter name (a vector component) is left out of the message, a longer one is not.
	EXPECT_EQ(xml.GetAttribute<float>("x"), 0.0f);
	EXPECT_NE(Log().find("Could not get attribute in [bare] in [" + myPath + "]"), std::string::npos);
	EXPECT_EQ(xml.GetAttribute<std::string>("id"), "");
	EXPECT_NE(Log().find("Could not get attribute [id] in [bare] in [" + myPath + "]"), std::string::npos);

	ASSERT_TRUE(xml.GoToElement("point-lights", "point-light", ""));
	EXPECT_FALSE(xml.GetAttribute<bool>("enabled"));
	EXPECT_NE(Log().find("Could not find name [enabled] in [point-light] in [" + myPath + "]"),
	          std::string::npos);

	EXPECT_EQ(ReportCount(), 4);
	const std::string log = Log();
	EXPECT_NE(log.find("XML::Error"), std::string::npos);
	EXPECT_NE(log.find("278"), std::string::npos);
}

TEST_F(XMLReadTest, FailedGetChildAttributeReportsAndYieldsZero)
{
	XML xml(myPath);
	EXPECT_EQ(xml.GetChildAttribute<float>("falloff", ""), 0.0f);
	EXPECT_NE(Log().find("No Element. [falloff]"), std::string::npos);

	ASSERT_TRUE(xml.GoToElement("point-lights", "", ""));
	ASSERT_TRUE(xml.EnterChild("point-light"));
	ASSERT_TRUE(xml.GoToNextSibling("point-light"));
	ASSERT_TRUE(xml.GoToNextSibling("point-light"));
	EXPECT_EQ(xml.GetChildAttribute<int>("no-such-tag", "value"), 0);
	EXPECT_NE(Log().find("Could not find attribute [no-such-tag] in [point-light] in [" + myPath + "]"),
	          std::string::npos);
	EXPECT_EQ(xml.GetChildAttribute<std::string>("empty", ""), "");
	EXPECT_NE(Log().find("Could not make attribute [empty] in [point-light] in [" + myPath + "]"),
	          std::string::npos);
	EXPECT_EQ(ReportCount(), 3);
}

TEST_F(XMLReadTest, TryReadersAnswerFalseWithoutReportAndKeepTheValue)
{
	XML xml(myPath);
	bool flag = true;
	std::string text = "unchanged";
	EXPECT_FALSE(xml.TryGetAttribute(flag, "id"));
	EXPECT_FALSE(xml.TryGetChildAttribute("falloff", text, ""));

	ASSERT_TRUE(xml.GoToElement("point-lights", "point-light", ""));
	EXPECT_FALSE(xml.TryGetAttribute(flag, "cast-shadow"));
	EXPECT_FALSE(xml.TryGetChildAttribute("no-such-tag", text, ""));
	EXPECT_FALSE(xml.TryGetChildAttribute("position", text, "w"));
	EXPECT_TRUE(flag);
	EXPECT_EQ(text, "unchanged");
	EXPECT_EQ(ReportCount(), 0);

	EXPECT_TRUE(xml.TryGetAttribute(flag, "id"));
	EXPECT_FALSE(flag);
	EXPECT_TRUE(xml.TryGetChildAttribute("color", text, "g"));
	EXPECT_EQ(text, "0.25");
	EXPECT_TRUE(xml.TryGetChildAttribute("falloff", text, ""));
	EXPECT_EQ(text, "2.5");
}

TEST_F(XMLReadTest, ExitChildPastTheDocumentReports)
{
	XML xml(myPath);
	ASSERT_TRUE(xml.GoToElement("bare", "", ""));
	xml.ExitChild();
	EXPECT_EQ(xml.GetElementName(), "root");
	xml.ExitChild();
	EXPECT_EQ(xml.GetElementName(), myPath);
	EXPECT_EQ(ReportCount(), 0);
	xml.ExitChild();
	EXPECT_NE(Log().find("Could not find element [" + myPath + "] in [" + myPath + "]"), std::string::npos);
	// The cursor is null now; another ExitChild has no node at all and still only reports.
	xml.ExitChild();
	EXPECT_NE(Log().find("Could not find element [] in [" + myPath + "]"), std::string::npos);
	EXPECT_EQ(ReportCount(), 2);
}

TEST(XMLConvertValue, NumbersAreReadByStreamExtraction)
{
	EXPECT_EQ(XML::ConvertValue<int>("12abc"), 12);
	EXPECT_EQ(XML::ConvertValue<int>("3.9"), 3);
	EXPECT_EQ(XML::ConvertValue<int>("-17"), -17);
	EXPECT_EQ(XML::ConvertValue<float>(" 2.5"), 2.5f);
	EXPECT_EQ(XML::ConvertValue<float>("1.23457e+006"), 1234570.0f);
	EXPECT_EQ(XML::ConvertValue<int>("abc"), 0);
	EXPECT_EQ(XML::ConvertValue<float>("abc"), 0.0f);
	EXPECT_EQ(XML::ConvertValue<float>(""), 0.0f);
	EXPECT_EQ(XML::ConvertValue<std::string>(" a b "), " a b ");
}

TEST(XMLConvertValue, BoolIsTrueOnlyForTrueAndYes)
{
	EXPECT_TRUE(XML::ConvertValue<bool>("true"));
	EXPECT_TRUE(XML::ConvertValue<bool>("yes"));
	EXPECT_FALSE(XML::ConvertValue<bool>("True"));
	EXPECT_FALSE(XML::ConvertValue<bool>("YES"));
	EXPECT_FALSE(XML::ConvertValue<bool>("1"));
	EXPECT_FALSE(XML::ConvertValue<bool>(""));
	EXPECT_FALSE(XML::ConvertValue<bool>("true "));
}

namespace
{
struct CommaDecimalPoint : std::numpunct<char>
{
	char do_decimal_point() const override { return ','; }
};
} // namespace

TEST(XMLConvertValue, UserLocaleDoesNotChangeNumbers)
{
	const std::locale previous =
	    std::locale::global(std::locale(std::locale::classic(), new CommaDecimalPoint));
	const float value = XML::ConvertValue<float>("2.5");
	std::locale::global(previous);
	EXPECT_EQ(value, 2.5f);
}

TEST_F(XMLFixture, LoadFailureReportsTheNameAsGivenEvenWithPercentSigns)
{
	// A '%' taken as a conversion would garble the message or crash on "%n".
	const std::string name = myScratch.File("missing%s%n%d.xml");
	XML xml(name);
	EXPECT_NE(Log().find("Could not open file [" + name + "]"), std::string::npos);
	EXPECT_FALSE(xml.GoToElement("", "", ""));
	EXPECT_EQ(ReportCount(), 1);

	const std::string other = WriteDocument("p.xml", "<root><a b=\"1\" /></root>");
	XML xml2(other);
	ASSERT_TRUE(xml2.GoToElement("a", "", ""));
	xml2.GetAttribute<int>("x%n%s");
	EXPECT_NE(Log().find("Could not find name [x%n%s] in [a] in [" + other + "]"), std::string::npos);
}

TEST_F(XMLFixture, DocumentWithoutRootAnswersFalse)
{
	XML xml(WriteDocument("comments.xml", "<!-- nothing but a comment -->\n"));
	EXPECT_FALSE(xml.GoToElement("", "", ""));
	EXPECT_FALSE(xml.EnterChild(""));
	EXPECT_FALSE(xml.GoToNextSibling(""));
}

TEST_F(XMLFixture, MixedCasePathFindsTheOneFile)
{
	WriteDocument("data/XML/x.xml", "<root><section value=\"5\" /></root>");
	const std::string givenName = (myScratch.Path() / "Data/xml/X.xml").string();
	XML xml(givenName);
	ASSERT_TRUE(xml.GoToElement("section", "", ""));
	EXPECT_EQ(xml.GetAttribute<int>("value"), 5);
	EXPECT_EQ(ReportCount(), 0);

	// Messages carry the name as given.
	xml.GetAttribute<int>("missing");
	EXPECT_NE(Log().find("Could not find name [missing] in [section] in [" + givenName + "]"),
	          std::string::npos);
}

TEST_F(XMLFixture, ErrorWithoutLogGoesToStandardError)
{
	Debug::Destroy();
	XML xml(myScratch.File("absent.xml"));
	testing::internal::CaptureStderr();
	xml.Error("reported while no log exists");
	const std::string output = testing::internal::GetCapturedStderr();
	EXPECT_NE(output.find("reported while no log exists"), std::string::npos);
}
