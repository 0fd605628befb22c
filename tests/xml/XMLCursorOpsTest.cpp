// The cursor's less used operations: the position stack, removal, root insertion, copying and
// recreating a document, and the attribute sets of XMLElement.

#include "xml/XML.h"
#include "xml/XMLElement.h"

#include "XMLTestFixture.h"

namespace
{
const char* const ourGraphText = R"(<?xml version="1.0" ?>
<root>
	<node-graph>
		<nodes number-of-nodes="3">
			<node id="1" />
			<node id="2" />
			<node id="5" />
		</nodes>
		<edges number-of-edges="0" />
	</node-graph>
</root>
)";
}

class XMLCursorOpsTest : public XMLFixture
{
protected:
	void SetUp() override
	{
		XMLFixture::SetUp();
		myPath = WriteDocument("nodegraph.xml", ourGraphText);
	}

	std::string myPath;
};

TEST_F(XMLCursorOpsTest, PushAndPopReturnToSavedPositions)
{
	XML xml(myPath);
	ASSERT_TRUE(xml.GoToElement("node-graph", "nodes", ""));
	xml.PushElement();
	ASSERT_TRUE(xml.EnterChild("node"));
	xml.PushElement();
	ASSERT_TRUE(xml.GoToNextSibling("node"));
	EXPECT_EQ(xml.GetAttribute<int>("id"), 2);
	xml.PopElement();
	EXPECT_EQ(xml.GetAttribute<int>("id"), 1);
	xml.PopElement();
	EXPECT_EQ(xml.GetElementName(), "nodes");
	EXPECT_EQ(ReportCount(), 0);

	xml.PopElement();
	EXPECT_NE(Log().find("Stack is empty!\n"), std::string::npos);
	EXPECT_EQ(xml.GetElementName(), "nodes");

	// With the cursor null after a walk, the push keeps the last record visited.
	ASSERT_TRUE(xml.EnterChild("node"));
	while (xml.GoToNextSibling("node"))
	{
	}
	xml.PushElement();
	ASSERT_TRUE(xml.GoToElement("node-graph", "", ""));
	xml.PopElement();
	EXPECT_EQ(xml.GetAttribute<int>("id"), 5);
	EXPECT_EQ(ReportCount(), 1);
}

TEST_F(XMLCursorOpsTest, GoToLastChildAndGetElementName)
{
	XML xml(myPath);
	xml.GetElementName();
	EXPECT_NE(Log().find("No node set to get name from"), std::string::npos);

	ASSERT_TRUE(xml.GoToElement("node-graph", "nodes", ""));
	xml.GoToLastChild();
	EXPECT_EQ(xml.GetElementName(), "node");
	EXPECT_EQ(xml.GetAttribute<int>("id"), 5);
	xml.GoToLastChild();
	EXPECT_NE(Log().find("Node doesn't have a child"), std::string::npos);
	EXPECT_EQ(xml.GetAttribute<int>("id"), 5);
	EXPECT_EQ(ReportCount(), 2);
}

TEST_F(XMLCursorOpsTest, RemoveCurrentElementDeletesItAndForgetsPositionsInside)
{
	XML xml(myPath);
	xml.RemoveCurrentElement();
	EXPECT_NE(Log().find("No node set to remove"), std::string::npos);

	ASSERT_TRUE(xml.GoToElement("node-graph", "nodes", "node"));
	ASSERT_TRUE(xml.GoToNextSibling("node"));
	xml.PushElement();
	xml.RemoveCurrentElement();
	EXPECT_FALSE(xml.EnterChild(""));
	// The pushed position died with the node: popping it gives no cursor, not a dangling one.
	xml.PopElement();
	xml.GetElementName();
	EXPECT_NE(Log().find("No node set to get name from"), std::string::npos);
	EXPECT_EQ(ReportCount(), 2);

	// The same holds for positions under a section whose children are removed.
	ASSERT_TRUE(xml.GoToElement("node-graph", "nodes", "node"));
	xml.PushElement();
	ASSERT_TRUE(xml.GoToElement("node-graph", "nodes", ""));
	xml.RemoveChildren();
	EXPECT_EQ(xml.GetAttribute<int>("number-of-nodes"), 3);
	xml.PopElement();
	xml.ExitChild();
	EXPECT_NE(Log().find("Could not find element [] in [" + myPath + "]"), std::string::npos);

	ASSERT_TRUE(xml.GoToElement("node-graph", "", ""));
	xml.SaveFile();
	XML reread(myPath);
	ASSERT_TRUE(reread.GoToElement("node-graph", "nodes", ""));
	EXPECT_FALSE(reread.EnterChild("node"));
	ASSERT_TRUE(reread.GoToElement("node-graph", "edges", ""));
}

TEST_F(XMLCursorOpsTest, InsertElementAtRootKeepsTheCursor)
{
	XML xml(myPath);
	ASSERT_TRUE(xml.GoToElement("node-graph", "nodes", ""));
	XMLElement decals("decals");
	xml.InsertElementAtRoot(decals, true);
	EXPECT_EQ(xml.GetElementName(), "nodes");
	EXPECT_EQ(ReportCount(), 0);

	XML reread(myPath);
	EXPECT_TRUE(reread.GoToElement("decals", "", ""));
	ASSERT_TRUE(reread.GoToElement("node-graph", "", ""));
	reread.ExitChild();
	reread.GoToLastChild();
	EXPECT_EQ(reread.GetElementName(), "decals");

	const std::string otherRoot = WriteDocument("other.xml", "<level><a /></level>");
	XML other(otherRoot);
	other.InsertElementAtRoot(decals, false);
	EXPECT_NE(Log().find("Could not insert element [decals] in file [" + otherRoot + "]"), std::string::npos);
}

TEST_F(XMLCursorOpsTest, CreateEmptyDocumentReplacesTheFile)
{
	XML xml(myPath);
	xml.CreateEmptyDocument();
	EXPECT_EQ(ReportCount(), 0);
	EXPECT_FALSE(xml.GoToElement("node-graph", "", ""));
	EXPECT_FALSE(xml.GoToElement("", "", ""));
	XMLElement section("lights");
	xml.InsertElementAtRoot(section, true);

	XML reread(myPath);
	ASSERT_TRUE(reread.GoToElement("lights", "", ""));
	reread.ExitChild();
	EXPECT_EQ(reread.GetElementName(), "root");
	EXPECT_EQ(TestSupport::ReadWholeFile(myPath).find("node-graph"), std::string::npos);
}

TEST_F(XMLCursorOpsTest, CopyDocumentWritesTheSameDocumentElsewhere)
{
	XML xml(myPath);
	ASSERT_TRUE(xml.GoToElement("node-graph", "edges", ""));
	xml.RemoveCurrentElement();
	const std::string copy = myScratch.File("copies/nodegraph-copy.xml");
	xml.CopyDocument(copy);
	EXPECT_EQ(ReportCount(), 0);
	// The copy holds the document as it is in memory; the original file is not touched.
	EXPECT_NE(TestSupport::ReadWholeFile(myPath).find("edges"), std::string::npos);
	const std::string copied = TestSupport::ReadWholeFile(copy);
	EXPECT_EQ(copied.find("edges"), std::string::npos);
	EXPECT_NE(copied.find("<node id=\"5\" />"), std::string::npos);

	// A target below a regular file cannot be created.
	const std::string blocked = WriteDocument("blocker", "not a directory") + "/copy.xml";
	xml.CopyDocument(blocked);
	EXPECT_NE(Log().find("Couldn't copy document [" + myPath + "] to [" + blocked + "]"), std::string::npos);
	EXPECT_EQ(ReportCount(), 1);
}

TEST_F(XMLCursorOpsTest, ElementAttributeSetsUseTheirComponentNames)
{
	XMLElement vectors("vectors");
	vectors.AddVector3Attributes(Vector3<float>(1.0f, 2.0f, 3.0f));
	XMLElement colour("colour");
	colour.AddVector4Attributes(Vector4<float>(0.25f, 0.5f, 0.75f, 1.5f));
	Matrix44<float> matrix;
	for (int i = 0; i < 16; ++i)
	{
		matrix.myMatrix[i] = static_cast<float>(i) + 0.5f;
	}
	XMLElement transform("transform");
	transform.AddMatrixAttributes(matrix);
	XMLElement holder("holder");
	holder.InsertElement(vectors);
	holder.InsertElement(colour);
	holder.InsertElement(transform);
	XML xml(myPath);
	xml.InsertElementAtRoot(holder, true);

	XML reread(myPath);
	ASSERT_TRUE(reread.GoToElement("holder", "", ""));
	const Vector3<float> vector = reread.GetVector3Attribute("vectors");
	EXPECT_EQ(vector.x, 1.0f);
	EXPECT_EQ(vector.y, 2.0f);
	EXPECT_EQ(vector.z, 3.0f);
	const Vector4<float> colourRead = reread.GetVector4Attribute("colour");
	EXPECT_EQ(colourRead.x, 0.25f);
	EXPECT_EQ(colourRead.y, 0.5f);
	EXPECT_EQ(colourRead.z, 0.75f);
	EXPECT_EQ(colourRead.w, 1.5f);

	const char* const names[12] = {"r-x", "r-y", "r-z", "u-x", "u-y", "u-z",
	                               "f-x", "f-y", "f-z", "p-x", "p-y", "p-z"};
	ASSERT_TRUE(reread.GoToElement("holder", "transform", ""));
	for (int i = 0; i < 12; ++i)
	{
		const int component = (i / 3) * 4 + i % 3;
		EXPECT_EQ(reread.GetAttribute<float>(names[i]), static_cast<float>(component) + 0.5f) << names[i];
	}
	EXPECT_EQ(ReportCount(), 0);
	// The fourth column is not written.
	const std::string saved = TestSupport::ReadWholeFile(myPath);
	for (const char* fourthColumn : {"\"3.5\"", "\"7.5\"", "\"11.5\"", "\"15.5\""})
	{
		EXPECT_EQ(saved.find(fourthColumn), std::string::npos) << fourthColumn;
	}
}
