// The cursor's position stack and removal. (Root insertion is the content generator's, held by its
// committed output; copying is held by the sample levels' byte-for-byte copy; vector attributes by
// every level save.)

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
	xml.GoToLastChild(); // none: reported, the cursor stays
	EXPECT_EQ(xml.GetElementName(), "angles");
	xml.PopElement();
	EXPECT_EQ(xml.GetAttribute<int>("id"), 2);
	xml.PopElement();
	xml.PopElement(); // the stack is empty: reported, the cursor stays
	EXPECT_EQ(xml.GetElementName(), "lights");
	EXPECT_EQ(ReportCount(), 2);

	// Removal forgets the positions inside the removed nodes, whether the node itself or a section's
	// children are removed: the pop leaves no cursor, not a dangling one.
	for (const bool childrenFlag : {false, true})
	{
		ASSERT_TRUE(xml.GoToElement("lights", "light", ""));
		xml.PushElement();
		if (childrenFlag)
		{
			ASSERT_TRUE(xml.GoToElement("lights", "", ""));
			xml.RemoveChildren();
		}
		else
		{
			xml.RemoveCurrentElement();
		}
		xml.PopElement();
		EXPECT_EQ(xml.GetElementName(), "") << childrenFlag;
	}
	EXPECT_EQ(ReportCount(), 4);
}
