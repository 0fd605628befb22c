// COLLADA scenes whose nodes instance shared nodes twice over, level after level: a small
// document that would expand into a tree of millions of nodes, or into models of far more
// bytes than it has, is refused by the import.
#include <gtest/gtest.h>
#include <string>
#include <tuple>
#include <vector>

#include "model/ColladaImport.h"
#include "model/ModelNode.h"
#include "platform/collada/Document.h"

namespace
{
// Library nodes n0 .. n(aLevels - 1), each instancing the next one twice (and, with
// aGeometryFlag, a one-triangle geometry of vertex type 0); the scene holds n0.
std::string DoublingScene(int aLevels, bool aGeometryFlag)
{
	std::string text = "<COLLADA version=\"1.4.1\">";
	if (aGeometryFlag)
	{
		text += "<library_geometries><geometry id=\"g\"><mesh>"
		        "<source id=\"p\"><float_array id=\"pa\" count=\"3\">0 0 0</float_array><technique_common>"
		        "<accessor source=\"#pa\" count=\"1\" stride=\"3\"/></technique_common></source>"
		        "<source id=\"t\"><float_array id=\"ta\" count=\"2\">0 0</float_array><technique_common>"
		        "<accessor source=\"#ta\" count=\"1\" stride=\"2\"/></technique_common></source>"
		        "<vertices id=\"v\"><input semantic=\"POSITION\" source=\"#p\"/></vertices>"
		        "<triangles count=\"1\"><input semantic=\"VERTEX\" source=\"#v\" offset=\"0\"/>"
		        "<input semantic=\"TEXCOORD\" source=\"#t\" offset=\"1\"/><p>0 0 0 0 0 0</p></triangles>"
		        "</mesh></geometry></library_geometries>";
	}
	text += "<library_nodes>";
	for (int level = 0; level < aLevels; ++level)
	{
		text += "<node id=\"n" + std::to_string(level) + "\">";
		text += aGeometryFlag ? "<instance_geometry url=\"#g\"/>" : "";
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

TEST(ColladaExpansionTest, ScenesPastTheNodeOrByteLimitAreRefusedAndOthersConvert)
{
	// 2^15 - 1 library nodes under "top" fit the 65,535 a tree may hold; one level more does not.
	// 1,023 instances of a triangle of vertex type 0 take at most 1,023 x 3 x (4 + 20) bytes.
	const std::tuple<int, bool, size_t, int, const char*> rows[] = {
	    {15, false, Zeph::ColladaImport::ourMaxModelBytes, 2 + 32767, ""},
	    {17, false, Zeph::ColladaImport::ourMaxModelBytes, 0, "the scene expands to more than 65535 nodes"},
	    {10, true, 1023 * 72, 2 + 1023, ""},
	    {10, true, 1023 * 72 - 1, 0, "the scene's models would take more than 73655 bytes"},
	};
	for (const auto& [levels, geometryFlag, byteLimit, expectedNodes, reason] : rows)
	{
		SCOPED_TRACE(levels);
		const std::string text = DoublingScene(levels, geometryFlag);
		Collada::Document document;
		std::string error;
		ASSERT_TRUE(document.LoadFromMemory(text.data(), text.size(), error)) << error;
		std::vector<Zeph::AlTextureBinding> bindings;
		const std::unique_ptr<Zeph::ModelNode> tree =
		    Zeph::ColladaImport::Convert(document, bindings, error, byteLimit);
		if (expectedNodes > 0)
		{
			ASSERT_NE(tree, nullptr) << error;
			EXPECT_EQ(CountNodes(*tree), expectedNodes);
		}
		else
		{
			EXPECT_EQ(tree, nullptr);
			EXPECT_NE(error.find(reason), std::string::npos) << error;
		}
	}
}
