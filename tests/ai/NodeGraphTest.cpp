// The path graph without a GPU: edge slots, the queries over the graph and the reports
// they write to the log. Distances and what the editor builds from these calls are checked
// through the facade (the editing and level tests) and the graph's render test.
#include <gtest/gtest.h>
#include <string>
#include <vector>

#include "ai/NGEdge.h"
#include "ai/NGNode.h"
#include "core/GrowingArray.h"
#include "engine/EngineFixture.h"

namespace
{
// The engine fixture's log without an engine: a report the test does not take fails it.
class NodeGraphTest : public EngineTest
{
protected:
	// Expects the log written since the last look to hold aPart.
	void ExpectLogged(const std::string& aPart)
	{
		const std::string log = TakeLog();
		EXPECT_NE(log.find(aPart), std::string::npos) << aPart << "\nnot in:\n" << log;
	}

	// Expects the critical report entry, as the log writes it.
	void ExpectCritical(int aLine, const std::string& aFunction, const std::string& aMessage)
	{
		ExpectLogged("\"Error Type:\"\"CRITICAL ERROR\"\n\"Line:\"" + std::to_string(aLine) +
		             "\n\"Function:\"\"" + aFunction + "\"\n\"" + aMessage + "\n\"\n");
	}
};

std::vector<const AI::NGEdge*> Slots(const AI::NGNode& aNode)
{
	return {aNode.GetEdgeSlots()[0], aNode.GetEdgeSlots()[1]};
}

std::vector<AI::NGNode*> Neighbours(AI::NGNode& aNode)
{
	GrowingArray<AI::NGNode*> neighbours(4, 4);
	aNode.GetNeighbours(neighbours);
	return {neighbours.begin(), neighbours.end()};
}
} // namespace

TEST_F(NodeGraphTest, ANodeHoldsTwoEdgesAndRefusesAThird)
{
	AI::NGEdge edges[3];
	AI::NGNode node;
	node.AddEdge(&edges[0]);
	node.AddEdge(&edges[1]);
	EXPECT_EQ(TakeLog(), "");
	node.AddEdge(&edges[2]);
	ExpectCritical(34, "AI::NGNode::AddEdge", "Tried to connect more than 2 edges to node");
	EXPECT_EQ(Slots(node), (std::vector<const AI::NGEdge*>{&edges[0], &edges[1]}));

	// Removing the first leaves the second where it was; the next edge takes the free slot.
	node.RemoveEdge(&edges[0]);
	EXPECT_EQ(Slots(node), (std::vector<const AI::NGEdge*>{nullptr, &edges[1]}));
	node.AddEdge(&edges[2]);
	node.RemoveEdge(&edges[1]);
	EXPECT_EQ(Slots(node), (std::vector<const AI::NGEdge*>{&edges[2], nullptr}));
	EXPECT_EQ(TakeLog(), "");

	// An edge the node does not hold: reported, and both slots stay.
	node.RemoveEdge(&edges[0]);
	ExpectCritical(51, "AI::NGNode::RemoveEdge", "Tried to remove an unconnected edge from node");
	EXPECT_EQ(Slots(node), (std::vector<const AI::NGEdge*>{&edges[2], nullptr}));
}

TEST_F(NodeGraphTest, QueriesWalkAChain)
{
	// a - b - c, built as the editor builds chains.
	AI::NGNode nodes[3];
	AI::NGEdge edges[2];
	for (int at = 0; at < 2; ++at)
	{
		edges[at].Connect(&nodes[at], &nodes[at + 1]);
		nodes[at].AddEdge(&edges[at]);
		nodes[at + 1].AddEdge(&edges[at]);
	}
	EXPECT_EQ(edges[0].GetOtherNode(&nodes[1]), &nodes[0]);
	EXPECT_TRUE(edges[1].IsConnecting(&nodes[2], &nodes[1]));
	EXPECT_FALSE(edges[1].IsConnecting(&nodes[1], &nodes[1]));
	EXPECT_EQ(nodes[1].FindConnectingEdge(&nodes[2]), &edges[1]);
	EXPECT_EQ(Neighbours(nodes[1]), (std::vector<AI::NGNode*>{&nodes[0], &nodes[2]}));
	// After its first edge is removed the middle node still has the second neighbour.
	nodes[1].RemoveEdge(&edges[0]);
	EXPECT_EQ(Neighbours(nodes[1]), (std::vector<AI::NGNode*>{&nodes[2]}));
	EXPECT_EQ(TakeLog(), "");

	// Unconnected pairs: reported; the answer falls back to the first end and first slot.
	EXPECT_EQ(edges[0].GetOtherNode(&nodes[2]), &nodes[0]);
	ExpectCritical(50, "AI::NGEdge::GetOtherNode", "Tried to get other node whilst not connected to edge");
	EXPECT_EQ(nodes[0].FindConnectingEdge(&nodes[2]), &edges[0]);
	ExpectCritical(117, "AI::NGNode::FindConnectingEdge", "Tried to find connection for unconnected nodes");
	// The middle node's first slot is empty now: nothing to fall back on.
	EXPECT_EQ(nodes[1].FindConnectingEdge(&nodes[0]), nullptr);
	ExpectLogged("Tried to find connection for unconnected nodes");
}

TEST_F(NodeGraphTest, AnEdgeWithAMissingNodeKeepsItsDistanceAndVisualsNeedAnEngine)
{
	AI::NGNode node;
	node.SetID(5);
	AI::NGEdge edge;
	edge.SetDistance(7.5f);
	for (AI::NGNode* first : {&node, static_cast<AI::NGNode*>(nullptr)})
	{
		edge.Connect(first, first == nullptr ? &node : nullptr);
		ExpectLogged("Tried to connect an edge to a missing node");
	}
	edge.Render();
	EXPECT_FLOAT_EQ(edge.GetDistance(), 7.5f);
	EXPECT_EQ(edge.GetFirstConnectionID(), 0);
	EXPECT_EQ(edge.GetOtherNode(&node), nullptr) << "the other end is the missing one";
	// The missing end adds no neighbour.
	node.AddEdge(&edge);
	EXPECT_EQ(Neighbours(node), std::vector<AI::NGNode*>{});

	node.InitDebugInstance();
	EXPECT_EQ(node.GetDebugInstance(), nullptr);
	ExpectLogged("Couldn't create the path node marker without an engine");
	node.Render();
	edge.InitDebugLine();
	EXPECT_EQ(edge.GetDebugLine(), nullptr);
	ExpectLogged("Couldn't create the line model");
}
