// A COLLADA scene whose nodes instance shared nodes twice over, level after level: a small
// document that would expand into a tree of millions of nodes is refused by the import.
#include <gtest/gtest.h>
#include <string>
#include <vector>

#include "model/ColladaImport.h"
#include "model/ModelNode.h"
#include "platform/collada/Document.h"

namespace
{
// Library nodes n0 .. n(aLevels - 1), each instancing the next one twice; the scene holds n0.
std::string DoublingScene(int aLevels)
{
	std::string text = "<COLLADA version=\"1.4.1\"><library_nodes>";
	for (int level = 0; level < aLevels; ++level)
	{
		text += "<node id=\"n" + std::to_string(level) + "\">";
		if (level + 1 < aLevels)
		{
			const std::string next = "<instance_node url=\"#n" + std::to_string(level + 1) + "\"/>";
			text += next + next;
		}
		text += "</node>";
	}
	return text + "</library_nodes><library_visual_scenes><visual_scene id=\"s\"><node id=\"top\">"
	              "<instance_node url=\"#n0\"/></node></visual_scene></library_visual_scenes>"
	              "<scene><instance_visual_scene url=\"#s\"/></scene></COLLADA>";
}

int CountNodes(const Zeph::ModelNode& aNode)
{
	int count = 1;
	for (const Zeph::ModelNode* child : aNode.GetChildren())
	{
		count += CountNodes(*child);
	}
	return count;
}
} // namespace

TEST(ColladaExpansionTest, AScenePastTheNodeLimitIsRefusedAndOneWithinItConverts)
{
	// 2^15 - 1 library nodes under "top" fit the 65,535 a tree may hold; one level more does not.
	for (const auto& [levels, expectedNodes] : std::vector<std::pair<int, int>>{{15, 2 + 32767}, {17, 0}})
	{
		SCOPED_TRACE(levels);
		const std::string text = DoublingScene(levels);
		Collada::Document document;
		std::string error;
		ASSERT_TRUE(document.LoadFromMemory(text.data(), text.size(), error)) << error;
		std::vector<Zeph::AlTextureBinding> bindings;
		const std::unique_ptr<Zeph::ModelNode> tree = Zeph::ColladaImport::Convert(document, bindings, error);
		if (expectedNodes > 0)
		{
			ASSERT_NE(tree, nullptr) << error;
			EXPECT_EQ(CountNodes(*tree), expectedNodes);
		}
		else
		{
			EXPECT_EQ(tree, nullptr);
			EXPECT_NE(error.find("the scene expands to more than 65535 nodes"), std::string::npos) << error;
		}
	}
}
