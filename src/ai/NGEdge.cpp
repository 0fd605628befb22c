#include "ai/NGEdge.h"

#include "ai/NGNode.h"
#include "core/Vector3.h"
#include "core/Vector4.h"
#include "engine/DebugLine.h"
#include "engine/EngineReport.h"

namespace AI
{
namespace
{
// The line number this report has always carried in the log.
constexpr int ourGetOtherNodeLine = 50;

float DistanceBetween(const NGNode& aFirst, const NGNode& aSecond)
{
	return (aSecond.GetPosition() - aFirst.GetPosition()).Length();
}
} // namespace

NGEdge::NGEdge() : myDistance(0.0f), myDebugLine(nullptr)
{
}

void NGEdge::Connect(NGNode* aFirst, NGNode* aSecond)
{
	myConnections[0] = aFirst;
	myConnections[1] = aSecond;
	// A level file can name a node that does not exist. The end stays empty (its ID
	// reads as 0) and the distance read with the edge is kept rather than lost.
	if (aFirst == nullptr || aSecond == nullptr)
	{
		Zeph::ReportDebug(__LINE__, "AI::NGEdge::Connect", "Tried to connect an edge to a missing node");
		return;
	}
	myDistance = DistanceBetween(*aFirst, *aSecond);
}

int NGEdge::GetFirstConnectionID() const
{
	return myConnections[0] != nullptr ? myConnections[0]->GetID() : 0;
}

int NGEdge::GetSecondConnectionID() const
{
	return myConnections[1] != nullptr ? myConnections[1]->GetID() : 0;
}

NGNode* NGEdge::GetOtherNode(NGNode* aNode) const
{
	if (myConnections[0] == aNode)
	{
		return myConnections[1];
	}
	if (myConnections[1] != aNode)
	{
		Zeph::ReportCritical(ourGetOtherNodeLine, "AI::NGEdge::GetOtherNode",
		                     "Tried to get other node whilst not connected to edge");
	}
	return myConnections[0];
}

bool NGEdge::IsConnecting(NGNode* aFirst, NGNode* aSecond) const
{
	return (myConnections[0] == aFirst && myConnections[1] == aSecond) ||
	       (myConnections[0] == aSecond && myConnections[1] == aFirst);
}

void NGEdge::InitDebugLine()
{
	// This element owns the line it made before; replacing it must not leak it.
	DestroyDebugLine();
	const Vector4<float> green(0.0f, 1.0f, 0.0f, 0.0f);
	const Zeph::DebugLine::Vertex end = {Vector3<float>(0.0f, 0.0f, 0.0f), green};
	Zeph::DebugLine* line = new Zeph::DebugLine();
	// DebugLine::Init reports its own failure; the edge is then left without a line.
	if (!line->Init(end, end))
	{
		delete line;
		return;
	}
	myDebugLine = line;
}

void NGEdge::DestroyDebugLine()
{
	if (myDebugLine != nullptr)
	{
		myDebugLine->Destroy();
		delete myDebugLine;
		myDebugLine = nullptr;
	}
}

void NGEdge::Render()
{
	// An edge with an end missing joins nothing: no line is drawn and the distance stays.
	// This runs every frame, so it does not report (Connect reported when the end went
	// missing).
	NGNode* first = myConnections[0];
	NGNode* second = myConnections[1];
	if (first == nullptr || second == nullptr)
	{
		return;
	}
	if (myDebugLine != nullptr)
	{
		myDebugLine->SetVertexPosition(0, first->GetPosition());
		myDebugLine->SetVertexPosition(1, second->GetPosition());
	}
	myDistance = DistanceBetween(*first, *second);
	if (myDebugLine != nullptr)
	{
		// Queues the line's instance on the renderer's late list.
		myDebugLine->Render();
	}
}
} // namespace AI
