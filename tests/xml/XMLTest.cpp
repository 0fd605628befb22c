// Reading through the cursor: walks, typed values and every report the cursor makes.

#include "xml/XML.h"
#include "xml/XMLElement.h"

#include <functional>
#include <tuple>
#include <vector>

#include "XMLTestFixture.h"

// The walks and readers every level load takes are held by the level suites; here what they do not
// meet: walks without a name, the cursor after a walk ran off, the first attribute and the
// components of the cursor element itself, and Try readers that keep the value.
TEST_F(XMLFixture, WalksAndReadersSilentlyTakeWhatIsThere)
{
	XML xml(myPath);
	bool flag = true;
	std::string text = "unchanged";
	EXPECT_FALSE(xml.TryGetAttribute(flag, "id")); // no cursor yet
	ASSERT_TRUE(xml.GoToElement("lights", "", ""));
	ASSERT_TRUE(xml.EnterChild("")); // past the comment
	EXPECT_FALSE(xml.TryGetAttribute(flag, "cast-shadow"));
	EXPECT_FALSE(xml.TryGetChildAttribute("position", text, "w"));
	EXPECT_TRUE(flag && text == "unchanged");
	EXPECT_TRUE(xml.TryGetAttribute(flag, "id") && !flag);
	EXPECT_TRUE(xml.TryGetChildAttribute("falloff", text, "") && text == "2.5");
	ASSERT_TRUE(xml.GoToNextSibling(""));
	EXPECT_EQ(xml.GetElementName(), "note");
	ASSERT_TRUE(xml.GoToNextSibling(""));
	EXPECT_EQ(xml.GetChildAttribute<float>("falloff", ""), 0.5f); // v="0.5"
	EXPECT_FALSE(xml.GoToNextSibling("light"));
	EXPECT_FALSE(xml.EnterChild("")); // the walk ran off the end: no cursor
	xml.ExitChild();
	EXPECT_EQ(xml.GetElementName(), "lights");
	ASSERT_TRUE(xml.GoToElement("lights", "light", "color"));
	EXPECT_EQ(Components(xml.GetVector4Attribute("")), (std::vector<float>{0.5f, 0.25f, 1, 4}));
	EXPECT_EQ(ReportCount(), 0);
}

TEST_F(XMLFixture, EveryFailureReportsOnceWithItsMessageAndNamesAsGiven)
{
	const std::string in = " in [" + myPath + "]";
	// A '%' taken as a conversion would garble the message or crash on "%n".
	const std::string missing = myScratch.File("missing%s%n%d.xml");
	const std::string blocked = WriteDocument("blocker", "not a directory") + "/copy.xml";
	XMLElement record("light");
	// Each row starts on a fresh cursor: GoToElement(first, second, "") unless first is null, then
	// ExitChild `exits` times, then the operation, which must make exactly one report: the message.
	const std::tuple<const char*, const char*, int, std::function<void(XML&)>, std::string> rows[] = {
	    {nullptr, "", 0, [&](XML&) { XML absent(missing); }, "Could not open file [" + missing + "]"},
	    // A folder where the file should be opens on Linux and measures as endless: refused, not read.
	    {nullptr, "", 0, [&](XML&) { XML folder(myScratch.Path().string()); },
	     "Could not open file [" + myScratch.Path().string() + "]: it is not a file"},
	    {nullptr, "", 0, [](XML& x) { x.GetAttribute<int>("id"); }, "No Current Element"},
	    // A single-letter name (a vector component) is left out of the message, a longer one is not.
	    {"bare", "", 0, [](XML& x) { x.GetAttribute<float>("x"); }, "Could not get attribute in [bare]" + in},
	    {"bare", "", 0, [](XML& x) { x.GetAttribute<std::string>("id"); },
	     "Could not get attribute [id] in [bare]" + in},
	    {"lights", "light", 0, [](XML& x) { x.GetAttribute<bool>("x%n%s"); },
	     "Could not find name [x%n%s] in [light]" + in},
	    {nullptr, "", 0, [](XML& x) { x.GetChildAttribute<float>("falloff", ""); }, "No Element. [falloff]"},
	    {"lights", "light", 0, [](XML& x) { x.GetChildAttribute<int>("nope", "value"); },
	     "Could not find attribute [nope] in [light]" + in},
	    {"lights", "light", 0, [](XML& x) { x.GetChildAttribute<std::string>("empty", ""); },
	     "Could not make attribute [empty] in [light]" + in},
	    {"lights", "light", 0, [](XML& x) { EXPECT_EQ(x.GetChildAttribute<float>("angles", "outer"), 0); },
	     "Could not find name [outer] in [angles] in [light]" + in},
	    // From <bare> up to <root>, to the document, and then past it.
	    {"bare", "", 2, [](XML& x) { x.ExitChild(); }, "Could not find element [" + myPath + "]" + in},
	    // On the comment that is the root's first child: a comment cannot hold children that are saved.
	    {"", "", 0, [&](XML& x) { x.InsertElement(record, false); },
	     "Could not insert element [light] in file [" + myPath + "]"},
	    // A missing level answers false without a report and leaves no cursor.
	    {"lights", "nope", 0, [](XML& x) { x.RemoveChildren(); }, "No node set to remove children from"},
	    {nullptr, "", 0, [](XML& x) { x.RemoveCurrentElement(); }, "No node set to remove"},
	    {"bare", "", 2, [](XML& x) { x.RemoveCurrentElement(); },
	     "Could not remove element [" + myPath + "]" + in},
	    {nullptr, "", 0, [&](XML& x) { x.CopyDocument(blocked); },
	     "Couldn't copy document [" + myPath + "] to [" + blocked + "]"},
	    {nullptr, "", 0, [](XML& x) { x.GetElementName(); }, "No node set to get name from"},
	    {nullptr, "", 0, [](XML& x) { x.PopElement(); }, "Stack is empty!\n"},
	    {"bare", "", 0, [](XML& x) { x.GoToLastChild(); }, "Node doesn't have a child"},
	};
	for (const auto& [first, second, exits, operation, message] : rows)
	{
		SCOPED_TRACE(message);
		const std::size_t logSize = Log().size();
		XML xml(myPath);
		if (first != nullptr)
		{
			xml.GoToElement(first, second, "");
		}
		for (int i = 0; i < exits; ++i)
		{
			xml.ExitChild();
		}
		operation(xml);
		const std::string added = Log().substr(logSize);
		EXPECT_NE(added.find(message), std::string::npos) << added;
		EXPECT_EQ(ReportCount(logSize), 1);
	}
}

TEST_F(XMLFixture, ErrorWithoutLogGoesToStandardError)
{
	Debug::Destroy();
	XML xml(myScratch.File("absent.xml"));
	testing::internal::CaptureStderr();
	xml.Error("reported while no log exists");
	EXPECT_NE(testing::internal::GetCapturedStderr().find("reported while no log exists"), std::string::npos);
}

TEST(XMLConvertValue, NumbersByStreamExtractionAndBoolOnlyForTrueAndYes)
{
	// clang-format off
	const std::tuple<const char*, int, float, bool> rows[] = {
	    {"12abc", 12, 12.0f, false}, {" 2.5", 2, 2.5f, false}, {"3.9", 3, 3.9f, false}, {"-17", -17, -17.0f, false},
	    {"1.23457e+006", 1, 1234570.0f, false}, {"abc", 0, 0.0f, false}, {"", 0, 0.0f, false}, {"1", 1, 1.0f, false},
	    {"true", 0, 0.0f, true}, {"yes", 0, 0.0f, true}, {"True", 0, 0.0f, false}, {"YES", 0, 0.0f, false},
	    {"true ", 0, 0.0f, false}};
	// clang-format on
	for (const auto& [text, asInt, asFloat, asBool] : rows)
	{
		SCOPED_TRACE(text);
		EXPECT_EQ(XML::ConvertValue<int>(text), asInt);
		EXPECT_EQ(XML::ConvertValue<float>(text), asFloat);
		EXPECT_EQ(XML::ConvertValue<bool>(text), asBool);
	}
	EXPECT_EQ(XML::ConvertValue<std::string>(" a b "), " a b ");
}
