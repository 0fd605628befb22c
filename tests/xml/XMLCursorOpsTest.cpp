// The cursor's less used operations: the position stack, removal, root insertion, copying and
// recreating a document, and the attribute sets of XMLElement.

#include "xml/XML.h"
#include "xml/XMLElement.h"

#include "XMLTestFixture.h"

TEST_F(XMLFixture, PushPopAndGoToLastChildMoveBetweenPositionsAndRemovalForgetsThoseInside)
{
	XML xml(myPath);
	ASSERT_TRUE(xml.GoToElement("lights", "", ""));
	xml.PushElement();
	xml.GoToLastChild();
	EXPECT_EQ(xml.GetAttribute<int>("id"), 2);
	xml.PushElement();
	xml.GoToLastChild();
	EXPECT_EQ(xml.GetElementName(), "angles");
	xml.GoToLastChild(); // none: reported, the cursor stays
	EXPECT_EQ(xml.GetElementName(), "angles");
	xml.PopElement();
	EXPECT_EQ(xml.GetAttribute<int>("id"), 2);
	xml.PopElement();
	EXPECT_EQ(xml.GetElementName(), "lights");
	xml.PopElement(); // the stack is empty: reported, the cursor stays
	EXPECT_EQ(xml.GetElementName(), "lights");

	// With the cursor null after a walk, the push keeps the last record visited.
	ASSERT_TRUE(xml.EnterChild("light"));
	EXPECT_TRUE(xml.GoToNextSibling("light"));
	EXPECT_FALSE(xml.GoToNextSibling("light"));
	xml.PushElement();
	ASSERT_TRUE(xml.GoToElement("bare", "", ""));
	xml.PopElement();
	EXPECT_EQ(xml.GetAttribute<int>("id"), 2);
	EXPECT_EQ(ReportCount(), 2);

	// Removal forgets the positions inside the removed nodes.
	ASSERT_TRUE(xml.GoToElement("lights", "light", ""));
	xml.PushElement();
	xml.RemoveCurrentElement();
	EXPECT_FALSE(xml.EnterChild(""));
	xml.PopElement(); // the pushed position died with the node: no cursor, not a dangling one
	EXPECT_EQ(xml.GetElementName(), "");
	EXPECT_TRUE(Logged("No node set to get name from"));

	// The same holds for positions under a section whose children are removed.
	ASSERT_TRUE(xml.GoToElement("lights", "light", ""));
	EXPECT_EQ(xml.GetAttribute<int>("id"), 2);
	xml.PushElement();
	ASSERT_TRUE(xml.GoToElement("lights", "", ""));
	xml.RemoveChildren();
	EXPECT_FALSE(xml.EnterChild(""));
	xml.PopElement();
	xml.ExitChild();
	EXPECT_TRUE(Logged("Could not find element [] in [" + myPath + "]"));
	EXPECT_EQ(ReportCount(), 4);
}

TEST_F(XMLFixture, InsertElementAtRootAppendsToRootAndKeepsTheCursorEvenInANewEmptyDocument)
{
	XML xml(myPath);
	ASSERT_TRUE(xml.GoToElement("lights", "light", ""));
	XMLElement decals("decals");
	xml.InsertElementAtRoot(decals, true);
	EXPECT_EQ(xml.GetAttribute<int>("id"), 1);
	XML reread(myPath);
	ASSERT_TRUE(reread.GoToElement("bare", "", ""));
	reread.ExitChild();
	reread.GoToLastChild();
	EXPECT_EQ(reread.GetElementName(), "decals");

	// CreateEmptyDocument replaces the file with an empty <root>.
	xml.CreateEmptyDocument();
	EXPECT_FALSE(xml.GoToElement("", "", ""));
	xml.InsertElementAtRoot(XMLElement("sounds"), true);
	XML recreated(myPath);
	ASSERT_TRUE(recreated.GoToElement("sounds", "", ""));
	recreated.ExitChild();
	EXPECT_EQ(recreated.GetElementName(), "root");
	EXPECT_EQ(TestSupport::ReadWholeFile(myPath).find("lights"), std::string::npos);
	EXPECT_EQ(ReportCount(), 0);

	const std::string otherRoot = WriteDocument("other.xml", "<level><a /></level>");
	XML(otherRoot).InsertElementAtRoot(decals, true);
	EXPECT_TRUE(Logged("Could not insert element [decals] in file [" + otherRoot + "]"));
	EXPECT_EQ(TestSupport::ReadWholeFile(otherRoot).find("decals"), std::string::npos);
}

TEST_F(XMLFixture, CopyDocumentWritesTheDocumentInMemoryElsewhere)
{
	XML xml(myPath);
	ASSERT_TRUE(xml.GoToElement("bare", "", ""));
	xml.RemoveCurrentElement();
	const std::string copy = myScratch.File("copies/lights-copy.xml");
	xml.CopyDocument(copy);
	EXPECT_EQ(TestSupport::ReadWholeFile(myPath), ourLightsText);
	const std::string copied = TestSupport::ReadWholeFile(copy);
	EXPECT_EQ(copied.find("bare"), std::string::npos);
	EXPECT_NE(copied.find("<falloff v=\"0.5\" />"), std::string::npos);
	EXPECT_EQ(ReportCount(), 0);
}

TEST_F(XMLFixture, ElementAttributeSetsUseTheirComponentNames)
{
	XMLElement holder("holder");
	XMLElement vector("vector");
	vector.AddVector3Attributes(Vector3<float>(1.0f, 2.0f, 3.0f));
	holder.InsertElement(vector);
	XMLElement colour("colour");
	colour.AddVector4Attributes(Vector4<float>(0.25f, 0.5f, 0.75f, 1.5f));
	holder.InsertElement(colour);
	Matrix44<float> matrix;
	for (int i = 0; i < 16; ++i)
	{
		matrix.myMatrix[i] = static_cast<float>(i) + 0.5f;
	}
	XMLElement transform("transform");
	transform.AddMatrixAttributes(matrix);
	holder.InsertElement(transform);
	XML(myPath).InsertElementAtRoot(holder, true);

	XML reread(myPath);
	ASSERT_TRUE(reread.GoToElement("holder", "", ""));
	EXPECT_EQ(Components(reread.GetVector3Attribute("vector")), (std::vector<float>{1, 2, 3}));
	EXPECT_EQ(Components(reread.GetVector4Attribute("colour")),
	          (std::vector<float>{0.25f, 0.5f, 0.75f, 1.5f}));
	ASSERT_TRUE(reread.GoToElement("holder", "transform", ""));
	// Rows right, up, forward, position; the fourth column is not written.
	const char* const names[] = {"r-x", "r-y", "r-z", "u-x", "u-y", "u-z",
	                             "f-x", "f-y", "f-z", "p-x", "p-y", "p-z"};
	for (int i = 0; i < 12; ++i)
	{
		EXPECT_EQ(reread.GetAttribute<float>(names[i]), static_cast<float>((i / 3) * 4 + i % 3) + 0.5f)
		    << names[i];
	}
	EXPECT_EQ(ReportCount(), 0);
	EXPECT_EQ(TestSupport::ReadWholeFile(myPath).find("\"15.5\""), std::string::npos);
}
