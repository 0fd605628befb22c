#pragma once
// NGEdge: an edge of the AI path graph: the two nodes it joins, its length and a green
// line that shows it in the editor.
//
//   AI::NGEdge edge;
//   edge.InitDebugLine();
//   edges.Add(edge);                        // the array element now owns the line
//   AI::NGEdge& stored = edges.Last();
//   stored.Connect(&nodes[0], &nodes[1]);   // stores the distance between them
//   nodes[0].AddEdge(&stored);              // Connect does not register the edge
//   nodes[1].AddEdge(&stored);
//   stored.Render();                        // line and distance follow the nodes
//   stored.DestroyDebugLine();              // before the element is removed
//
// An edge is a value: copying it copies every field, so the copy refers to the same
// nodes and the same line. The destructor releases nothing; the element kept in the
// owner's array owns the line and gives it back through DestroyDebugLine.
#include "ai/StaticArray.h"

namespace Zeph
{
class DebugLine;
}

namespace AI
{
class NGNode;

class NGEdge
{
public:
	NGEdge();
	NGEdge(const NGEdge& anEdge) = default;
	NGEdge& operator=(const NGEdge& anEdge) = default;
	~NGEdge() = default;

	// Stores both nodes and sets the distance to the length between their positions.
	// With a node missing the distance is kept as it was (see the definition).
	void Connect(NGNode* aFirst, NGNode* aSecond);
	void SetDistance(float aDistance) { myDistance = aDistance; }
	float GetDistance() const { return myDistance; }
	// The ID of the first or second node; 0 when that end is not set.
	int GetFirstConnectionID() const;
	int GetSecondConnectionID() const;
	// The nodes, first (0) and second (1); an end not set is null.
	const StaticArray<NGNode*, 2>& GetConnections() const { return myConnections; }

	// The node at the other end from aNode: the second node when aNode is the first,
	// otherwise the first node (with a critical report when aNode is neither end).
	NGNode* GetOtherNode(NGNode* aNode) const;
	// True when the edge joins aFirst and aSecond, in either order.
	bool IsConnecting(NGNode* aFirst, NGNode* aSecond) const;

	// The line: two green vertices at the origin until the first Render. A second call
	// replaces (and destroys) the line made by the first.
	void InitDebugLine();
	void DestroyDebugLine();
	Zeph::DebugLine* GetDebugLine() const { return myDebugLine; }
	// Moves the line's ends to the nodes, recomputes the distance and queues the line
	// over the finished frame.
	void Render();

private:
	float myDistance;
	StaticArray<NGNode*, 2> myConnections;
	Zeph::DebugLine* myDebugLine;
};
} // namespace AI
