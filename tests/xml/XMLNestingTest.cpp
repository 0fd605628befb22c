// Documents nested too deeply for TinyXML's recursive parser: the scan that finds them and
// the two loaders (the cursor and the COLLADA reader) that refuse them before parsing.

#include "xml/XML.h"

#include <string>
#include <tuple>

#include "XMLTestFixture.h"
#include "platform/collada/Document.h"
#include "platform/xmlscan/NestingScan.h"

namespace
{
std::string Nested(int aDepth)
{
	std::string open;
	std::string close;
	for (int level = 0; level < aDepth; ++level)
	{
		open += "<a>";
		close += "</a>";
	}
	return open + close;
}
} // namespace

TEST(XMLNestingScan, CountsOnlyWhatTinyXmlEntersAndNamesTheLine)
{
	// With a limit of 2: the line on which a third level opens, or 0.
	const std::tuple<std::string, int> rows[] = {
	    {"<a><b><c/></b><b></b></a>", 0},
	    {"<a>\n<b>\n<c></c></b></a>", 3},
	    {"<a><!-- <b><c> --><![CDATA[<b><c>]]><b></b></a>", 0},
	    // "<?" and "<!" markup other than comments and CDATA ends at its first '>', as TinyXML reads it.
	    {"<?xml version='1.0'?><!DOCTYPE a><a><?pi x?><b></b></a>", 0},
	    {"<a><?pi <b>?><c><d>", 1},
	    // Quoted values may hold '>' and "/>"; an unquoted "/" followed by '>' closes the tag.
	    {"<a x='>'><b y=\"/>\"><c>", 1},
	    {"<a><b z=1/><b/></a>", 0},
	    // The declaration's version, encoding and standalone values are quoted as in a tag.
	    {"<?xml version=\"x>y\" encoding='<a><b><c>' ?><a><b></b></a>", 0},
	    {"<?XML standalone=\"'\" x'y><a>\n<b><c>", 2},
	    // Text, comments and quoted values go a UTF-8 character at a time: the '<' or quote
	    // after a lead byte is part of its character.
	    {"<a>\xe6<b><c>", 0},
	    {"<a x='\xc3'><b><c>", 0},
	    // '<' before anything but a letter, '_' or a UTF-8 byte opens no element.
	    {"<a><b>< c><1><_><\xc3\xa9>", 1},
	    {std::string("<a><b>\0<c><d>", 12), 0},
	    // A NUL where a character starts ends the text; one right after a lead byte is part of
	    // that character, and the parser reads on past it.
	    {std::string("<a>\xd0\0<b><c>", 11), 1},
	    // End tags outside every element close nothing.
	    {"</a></a></a><a><b><c>", 1},
	};
	for (const auto& [text, line] : rows)
	{
		SCOPED_TRACE(text);
		EXPECT_EQ(XmlScan::FindTooDeep(text, 2), line);
	}
}

TEST_F(XMLFixture, DocumentsNestedPastTheLimitAreRefusedBeforeParsing)
{
	// At the limit a document loads; one level more is refused by both loaders with the file and
	// the line named, and 50,000 levels do not reach the parser.
	XML atLimit(WriteDocument("at-limit.xml", Nested(XmlScan::ourMaxDepth)));
	EXPECT_TRUE(atLimit.GoToElement("a", "a", "a"));
	EXPECT_EQ(ReportCount(), 0) << Log();
	const std::string tooDeep = Nested(XmlScan::ourMaxDepth + 1);
	for (const std::string& text : {tooDeep, "<!-- -->\n" + Nested(50000)})
	{
		const std::string path = WriteDocument("deep.xml", text);
		const std::size_t logSize = Log().size();
		XML xml(path);
		EXPECT_FALSE(xml.GoToElement("", "", ""));
		EXPECT_NE(Log().find("Could not open file [" + path + "]: elements nested deeper than " +
		                         std::to_string(XmlScan::ourMaxDepth) + " (line " +
		                         (text == tooDeep ? "1" : "2") + ")",
		                     logSize),
		          std::string::npos)
		    << Log().substr(logSize);

		Collada::Document document;
		std::string error;
		EXPECT_FALSE(document.LoadFromMemory(text.data(), text.size(), error, "deep.dae"));
		EXPECT_EQ(error.rfind("deep.dae: elements nested deeper than", 0), 0u) << error;
	}
}
