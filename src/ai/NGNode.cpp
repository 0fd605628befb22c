#include "ai/NGNode.h"

#include "ai/NGEdge.h"
#include "engine/Engine.h"
#include "engine/EngineReport.h"
#include "engine/Instance.h"
#include "model/ModelFactory.h"
#include "renderer/Renderer.h"

namespace AI
{
namespace
{
// The line numbers these reports have always carried in the log.
constexpr int ourAddEdgeLine = 34;
constexpr int ourRemoveEdgeLine = 51;
constexpr int ourFindConnectingEdgeLine = 117;

// One box model shared by every node's marker: half extents 0.25 around the node,
// red, filled.
constexpr const char* ourMarkerModelName = "path-node";
} // namespace

NGNode::NGNode()
    : mySearchLink(0), myID(0), mySearchState(NODE_STATE_UNVISITED), mySearchCosts{0.0f, 0.0f},
      myPosition(0.0f, 0.0f, 0.0f), myDebugInstance(nullptr)
{
}

void NGNode::SetPosition(const Vector3<float>& aPosition)
{
	myPosition.x = aPosition.x;
	myPosition.y = aPosition.y;
	myPosition.z = aPosition.z;
}

void NGNode::AddEdge(NGEdge* anEdge)
{
	if (myEdgeSlots[0] == nullptr)
	{
		myEdgeSlots[0] = anEdge;
	}
	else if (myEdgeSlots[1] == nullptr)
	{
		myEdgeSlots[1] = anEdge;
	}
	else
	{
		Zeph::ReportCritical(ourAddEdgeLine, "AI::NGNode::AddEdge",
		                     "Tried to connect more than 2 edges to node");
	}
}

void NGNode::RemoveEdge(NGEdge* anEdge)
{
	if (myEdgeSlots[0] == anEdge)
	{
		myEdgeSlots[0] = nullptr;
	}
	else if (myEdgeSlots[1] == anEdge)
	{
		myEdgeSlots[1] = nullptr;
	}
	else
	{
		Zeph::ReportCritical(ourRemoveEdgeLine, "AI::NGNode::RemoveEdge",
		                     "Tried to remove an unconnected edge from node");
	}
}

NGEdge* NGNode::FindConnectingEdge(NGNode* anOther)
{
	// An empty slot connects nothing; it is skipped rather than read.
	for (NGEdge* edge : myEdgeSlots)
	{
		if (edge != nullptr && edge->IsConnecting(this, anOther))
		{
			return edge;
		}
	}
	Zeph::ReportCritical(ourFindConnectingEdgeLine, "AI::NGNode::FindConnectingEdge",
	                     "Tried to find connection for unconnected nodes");
	return myEdgeSlots[0];
}

void NGNode::GetNeighbours(GrowingArray<NGNode*>& someNeighboursOut)
{
	// Either slot may be empty once an edge has been removed (slots are not compacted),
	// and a null neighbour would only move the fault to the caller: both are skipped.
	for (NGEdge* edge : myEdgeSlots)
	{
		if (edge == nullptr)
		{
			continue;
		}
		NGNode* other = edge->GetOtherNode(this);
		if (other != nullptr)
		{
			someNeighboursOut.Add(other);
		}
	}
}

void NGNode::InitDebugInstance()
{
	// This element owns the box it made before; replacing it must not leak it.
	DestroyDebugInstance();
	Zeph::Engine* engine = Zeph::Engine::GetInstance();
	if (engine == nullptr)
	{
		Zeph::ReportDebug(__LINE__, "AI::NGNode::InitDebugInstance",
		                  "Couldn't create the path node marker without an engine");
		return;
	}
	// The factory reports when it cannot make the model; the node then has no marker.
	Zeph::ModelNode* box = engine->GetModelFactory().CreateAABB(
	    ourMarkerModelName, Vector3<float>(0.25f, 0.25f, 0.25f), Vector4<float>(1.0f, 0.0f, 0.0f, 0.0f),
	    Gpu::PrimitiveTopology::TriangleList);
	if (box != nullptr)
	{
		myDebugInstance = new Zeph::Instance(box);
	}
}

void NGNode::DestroyDebugInstance()
{
	delete myDebugInstance;
	myDebugInstance = nullptr;
}

void NGNode::Render()
{
	Zeph::Engine* engine = Zeph::Engine::GetInstance();
	if (myDebugInstance == nullptr || engine == nullptr)
	{
		return;
	}
	myDebugInstance->SetPosition(myPosition);
	engine->GetRenderer().RenderLateInstance(myDebugInstance);
}
} // namespace AI
