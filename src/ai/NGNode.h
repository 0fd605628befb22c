#pragma once
// NGNode: a node of the AI path graph: an ID, a world position, the (at most two) edges
// that end at it and a small red marker box that shows it in the editor.
//
//   AI::NGNode& node = nodes.Last();   // nodes and edges live in arrays that never move them
//   node.InitDebugInstance();
//   node.SetID(7);
//   node.SetPosition({1.0f, 0.0f, 4.0f});
//   node.AddEdge(&edge);               // after edge.Connect(...)
//   node.Render();                     // the marker box, drawn over the finished frame
//   node.DestroyDebugInstance();       // before the element is removed
//
// A node is a value: copying it copies every field, so the copy refers to the same edges
// and the same marker box. The destructor releases nothing; the element kept in the
// owner's array owns the marker box and gives it back through DestroyDebugInstance.
#include <cstdint>

#include "ai/NodeStates.h"
#include "ai/StaticArray.h"
#include "core/GrowingArray.h"
#include "core/Vector3.h"

namespace Zeph
{
class Instance;
}

namespace AI
{
class NGEdge;

class NGNode
{
public:
	NGNode();
	NGNode(const NGNode& aNode) = default;
	NGNode& operator=(const NGNode& aNode) = default;
	~NGNode() = default;

	void SetID(int anID) { myID = anID; }
	int GetID() const { return myID; }
	void SetPosition(const Vector3<float>& aPosition);
	const Vector3<float>& GetPosition() const { return myPosition; }

	// Puts the edge in the first empty slot; a node with two edges refuses a third
	// (critical report) and keeps the two it has.
	void AddEdge(NGEdge* anEdge);
	// Empties the slot holding the edge (critical report when neither does). The other
	// slot keeps its edge: slots are not compacted.
	void RemoveEdge(NGEdge* anEdge);
	// The edge slot 0 or 1 (an empty slot is null).
	const StaticArray<NGEdge*, 2>& GetEdgeSlots() const { return myEdgeSlots; }

	// The first slot's edge that joins this node and anOther; when none does, a critical
	// report and the first slot's edge (null when that slot is empty).
	NGEdge* FindConnectingEdge(NGNode* anOther);
	// Appends the node at the other end of each edge of this node. Empty slots, and
	// edges whose other end is not set, add nothing.
	void GetNeighbours(GrowingArray<NGNode*>& someNeighboursOut);

	// The marker box: an instance of the shared "path-node" box model. A second call
	// replaces (and deletes) the box made by the first.
	void InitDebugInstance();
	void DestroyDebugInstance();
	Zeph::Instance* GetDebugInstance() const { return myDebugInstance; }
	// Moves the marker box to the node and queues it over the finished frame.
	void Render();

private:
	int32_t mySearchLink;
	int myID;
	NodeStates mySearchState;
	StaticArray<NGEdge*, 2> myEdgeSlots;
	float mySearchCosts[2];
	Vector3<float> myPosition;
	Zeph::Instance* myDebugInstance;
};
} // namespace AI
