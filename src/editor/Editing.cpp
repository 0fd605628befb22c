// The editing operations of LumoraWrapper: adding, copying and removing lights, decals
// and path nodes, moving and turning the selection, and changing its values.
//
// Every operation waits until the facade is free. The adds then always take it; the
// operations on a selection take it only when there is something to change and
// otherwise return after the wait with the flag untouched. Holding the flag keeps the
// frame steps (which are dropped meanwhile) from seeing a half-made change.
#include <algorithm>
#include <cmath>
#include <vector>

#include "editor/LumoraWrapper.h"
#include "editor/StringConversion.h"
#include "engine/CameraInstance.h"
#include "engine/EngineReport.h"

namespace Lumora
{
namespace
{
// New lights and decals appear this far in front of the camera, path nodes nearer.
constexpr float ourPlacementDistance = 10.0f;
constexpr float ourNodePlacementDistance = 2.0f;
constexpr const char* ourDefaultDecalType = "brick";

bool Holds(const AI::NGNode& aNode, const AI::NGEdge* anEdge)
{
	const StaticArray<AI::NGEdge*, 2>& slots = aNode.GetEdgeSlots();
	return slots[0] == anEdge || slots[1] == anEdge;
}

bool IsFull(const AI::NGNode& aNode)
{
	const StaticArray<AI::NGEdge*, 2>& slots = aNode.GetEdgeSlots();
	return slots[0] != nullptr && slots[1] != nullptr;
}

bool Connects(const AI::NGEdge& anEdge, const AI::NGNode* aNode)
{
	const StaticArray<AI::NGNode*, 2>& ends = anEdge.GetConnections();
	return ends[0] == aNode || ends[1] == aNode;
}

void SetColor(Vector4<float>& aColor, float anR, float aG, float aB)
{
	aColor.x = anR;
	aColor.y = aG;
	aColor.z = aB;
}
} // namespace

// --- helpers ---------------------------------------------------------------------------

bool LumoraWrapper::ClaimForSelection(const std::atomic<int>& aSelection)
{
	WaitUntilFree();
	// Read now, not when called: whoever held the facade may have changed the selection.
	if (aSelection.load() == -1)
	{
		return false;
	}
	Claim();
	// Another claimant may have come first and cleared it (a level loaded meanwhile).
	if (aSelection.load() == -1)
	{
		Release();
		return false;
	}
	return true;
}

bool LumoraWrapper::HasSelectionForMode(bool aNodesFlag) const
{
	switch (myMode)
	{
	case LIGHT_MODE:
		return myCurrentSelectedPoint != -1 || myCurrentSelectedSpot != -1;
	case NODE_MODE:
		return aNodesFlag && myCurrentSelectedNode != -1;
	case DECAL_MODE:
		return myCurrentSelectedDecal != -1;
	default:
		return false;
	}
}

Vector3<float> LumoraWrapper::InFrontOfCamera(float aDistance) const
{
	return myCameraInstance->GetPosition() +
	       myCameraInstance->GetActualOrientation().GetForward() * aDistance;
}

void LumoraWrapper::MoveSelectedByMode(const Vector3<float>& anOffset, bool aNodesFlag)
{
	PlaceSelected([&anOffset](const Vector3<float>& aPosition) { return aPosition + anOffset; }, aNodesFlag);
}

bool LumoraWrapper::PlaceSelected(const std::function<Vector3<float>(const Vector3<float>&)>& aPlace,
                                  bool aNodesFlag)
{
	WaitUntilFree();
	if (!HasSelectionForMode(aNodesFlag))
	{
		return false;
	}
	Claim();
	// The selection may have gone while the claim waited.
	if (!HasSelectionForMode(aNodesFlag))
	{
		Release();
		return false;
	}
	switch (myMode)
	{
	case LIGHT_MODE:
		if (myCurrentSelectedPoint != -1)
		{
			Vector3<float>& position = myEnvironmentPointLights[myCurrentSelectedPoint].myPosition;
			position = aPlace(position);
		}
		if (myCurrentSelectedSpot != -1)
		{
			Matrix44<float>& orientation = myEnvironmentSpotLights[myCurrentSelectedSpot].myOrientation;
			orientation.SetPosition(aPlace(orientation.GetPosition()));
		}
		break;
	case NODE_MODE: {
		// The edges follow when they are next drawn, which brings their distance up to date.
		AI::NGNode& node = myNodes[myCurrentSelectedNode];
		node.SetPosition(aPlace(node.GetPosition()));
		break;
	}
	case DECAL_MODE:
		myDecals[myCurrentSelectedDecal].myPosition = aPlace(myDecals[myCurrentSelectedDecal].myPosition);
		break;
	default:
		break;
	}
	Release();
	return true;
}

void LumoraWrapper::MoveSelectedAlongCamera(int anAxisRow, float aMovement)
{
	const Matrix44<float>& orientation = myCameraInstance->GetActualOrientation();
	const Vector3<float> axis = anAxisRow == 0   ? orientation.GetRight()
	                            : anAxisRow == 1 ? orientation.GetUp()
	                                             : orientation.GetForward();
	// Path nodes move only by a world-space offset.
	MoveSelectedByMode(axis * aMovement, false);
}

void LumoraWrapper::TurnSelected(const Matrix33<float>& aRotation)
{
	WaitUntilFree();
	const bool spotFlag = myMode == LIGHT_MODE && myCurrentSelectedSpot != -1;
	const bool decalFlag = myMode == DECAL_MODE && myCurrentSelectedDecal != -1;
	if (!spotFlag && !decalFlag)
	{
		return;
	}
	Claim();
	if (spotFlag)
	{
		// The rotation goes on the left: the light turns about its own axes and keeps
		// its position row.
		myEnvironmentSpotLights[myCurrentSelectedSpot].myOrientation *= aRotation;
	}
	else
	{
		// The decal keeps only a direction: turn the basis built from it and keep the new
		// forward row. That basis is not normalised, so a direction with a vertical part
		// would change length when turned; the result is brought back to the old length.
		Vector3<float>& direction = myDecals[myCurrentSelectedDecal].myNorm;
		const float length = direction.Length();
		Matrix44<float> basis;
		basis.SetRotation(direction);
		basis *= aRotation;
		Vector3<float> turned = basis.GetForward();
		const float turnedLength = turned.Length();
		if (turnedLength > 0.0f)
		{
			turned *= length / turnedLength;
		}
		direction = turned;
	}
	Release();
}

void LumoraWrapper::RemoveEdgeAt(int anIndex)
{
	AI::NGEdge* edge = &myEdges[anIndex];
	for (AI::NGNode* end : edge->GetConnections())
	{
		while (end != nullptr && Holds(*end, edge))
		{
			end->RemoveEdge(edge);
		}
	}
	edge->DestroyDebugLine();

	AI::NGEdge* last = &myEdges.Last();
	myEdges.RemoveCyclicAtIndex(anIndex);
	if (last == edge)
	{
		return;
	}
	// The last edge now lives at anIndex: its nodes still point at its old address.
	// Re-adding may change which of a node's two slots holds it; nothing depends on
	// the slot order.
	for (AI::NGNode* end : edge->GetConnections())
	{
		while (end != nullptr && Holds(*end, last))
		{
			end->RemoveEdge(last);
			end->AddEdge(edge);
		}
	}
}

// --- adding ----------------------------------------------------------------------------

void LumoraWrapper::AddPointLight()
{
	Claim();
	Zeph::PointLightData light;
	light.myPosition = InFrontOfCamera(ourPlacementDistance);
	light.myColor = Vector4<float>(1.0f, 1.0f, 1.0f, 1.0f);
	light.myFalloff = 0.5f;
	myEnvironmentPointLights.Add(light);
	myCurrentSelectedPoint = myEnvironmentPointLights.Count() - 1;
	myCurrentSelectedSpot = -1;
	Release();
}

void LumoraWrapper::AddSpotLight()
{
	Claim();
	Zeph::SpotLightData light;
	light.myColor = Vector4<float>(1.0f, 1.0f, 1.0f, 1.0f);
	light.myFalloff = 1.0f;
	light.myAngles = Vector2<float>(0.9f, 0.7f);
	// A new spot light points straight up.
	const Vector3<float> helper(0.0f, 0.0f, 1.0f);
	const Vector3<float> forward(0.0f, 1.0f, 0.0f);
	Vector3<float> right = helper.Cross(forward);
	right.Normalize();
	Vector3<float> up = forward.Cross(right);
	up.Normalize();
	light.myOrientation.SetRotation(forward, up, right);
	light.myOrientation.SetPosition(InFrontOfCamera(ourPlacementDistance));
	myEnvironmentSpotLights.Add(light);
	myCurrentSelectedPoint = -1;
	myCurrentSelectedSpot = myEnvironmentSpotLights.Count() - 1;
	Release();
}

void LumoraWrapper::AddDecal()
{
	Claim();
	// A decal needs its type's textures: without a "brick" type in the catalogue the
	// add is refused and nothing changes, rather than making a decal without textures.
	const auto type = myDecalTypes.find(ourDefaultDecalType);
	if (type == myDecalTypes.end())
	{
		Zeph::ReportDebug(__LINE__, "Lumora::LumoraWrapper::AddDecal",
		                  "No decal type \"%s\" in the decal type catalogue; no decal added",
		                  ourDefaultDecalType);
		Release();
		return;
	}
	Zeph::DecalData decal;
	decal.myPosition = InFrontOfCamera(ourPlacementDistance);
	decal.myColor = Vector4<float>(1.0f, 1.0f, 1.0f, 1.0f);
	decal.mySize = 1.0f;
	decal.myTypeId = ourDefaultDecalType;
	decal.myTexture = type->second.myTexture;
	decal.myNormalTexture = type->second.myNormalTexture;
	decal.myDepth = 0.3f;
	// Facing the camera.
	decal.myNorm = -myCameraInstance->GetActualOrientation().GetForward();
	myDecals.Add(decal);
	myCurrentSelectedPoint = -1;
	myCurrentSelectedSpot = -1;
	myCurrentSelectedDecal = myDecals.Count() - 1;
	Release();
}

void LumoraWrapper::AddPathNode()
{
	Claim();
	// Nodes and edges point at each other's elements, so neither array may grow past
	// its first block: at the limit the node is refused.
	if (myNodes.Count() >= ourArraySize)
	{
		Zeph::ReportDebug(__LINE__, "Lumora::LumoraWrapper::AddPathNode",
		                  "The path graph holds its limit of %d nodes; no node added", ourArraySize);
		Release();
		return;
	}
	myNodes.Add(AI::NGNode());
	AI::NGNode& node = myNodes.Last();
	node.SetID(TakeNodeID());
	node.InitDebugInstance();
	node.SetPosition(InFrontOfCamera(ourNodePlacementDistance));
	const int index = myNodes.Count() - 1;
	myCurrentSelectedNode = index;

	if (index > 0)
	{
		// The new node joins the one before it in the array. In a loaded graph that node
		// may already end two edges (a node takes no third) or the edges may be at the
		// limit: the node then stays unjoined.
		AI::NGNode& previous = myNodes[index - 1];
		if (IsFull(previous))
		{
			Zeph::ReportDebug(__LINE__, "Lumora::LumoraWrapper::AddPathNode",
			                  "Node %d already has two edges; node %d added without an edge",
			                  previous.GetID(), node.GetID());
		}
		else if (myEdges.Count() >= ourArraySize)
		{
			Zeph::ReportDebug(__LINE__, "Lumora::LumoraWrapper::AddPathNode",
			                  "The path graph holds its limit of %d edges; node %d added without an edge",
			                  ourArraySize, node.GetID());
		}
		else
		{
			AI::NGEdge edge;
			edge.InitDebugLine();
			myEdges.Add(edge);
			AI::NGEdge& stored = myEdges.Last();
			stored.Connect(&previous, &node);
			previous.AddEdge(&stored);
			node.AddEdge(&stored);
		}
	}
	Release();
}

// --- copying and removing --------------------------------------------------------------

void LumoraWrapper::CopyPointLight()
{
	if (!ClaimForSelection(myCurrentSelectedPoint))
	{
		return;
	}
	myEnvironmentPointLights.Add(myEnvironmentPointLights[myCurrentSelectedPoint]);
	myCurrentSelectedPoint = -1;
	Release();
}

void LumoraWrapper::CopySpotLight()
{
	if (!ClaimForSelection(myCurrentSelectedSpot))
	{
		return;
	}
	myEnvironmentSpotLights.Add(myEnvironmentSpotLights[myCurrentSelectedSpot]);
	myCurrentSelectedSpot = -1;
	Release();
}

void LumoraWrapper::CopyDecal()
{
	if (!ClaimForSelection(myCurrentSelectedDecal))
	{
		return;
	}
	myDecals.Add(myDecals[myCurrentSelectedDecal]);
	myCurrentSelectedDecal = -1;
	Release();
}

void LumoraWrapper::RemoveSelectedPointLight()
{
	if (!ClaimForSelection(myCurrentSelectedPoint))
	{
		return;
	}
	myEnvironmentPointLights.RemoveCyclicAtIndex(myCurrentSelectedPoint);
	myCurrentSelectedPoint = -1;
	Release();
}

void LumoraWrapper::RemoveSelectedSpotLight()
{
	if (!ClaimForSelection(myCurrentSelectedSpot))
	{
		return;
	}
	myEnvironmentSpotLights.RemoveCyclicAtIndex(myCurrentSelectedSpot);
	myCurrentSelectedSpot = -1;
	Release();
}

void LumoraWrapper::RemoveSelectedDecal()
{
	if (!ClaimForSelection(myCurrentSelectedDecal))
	{
		return;
	}
	myDecals.RemoveCyclicAtIndex(myCurrentSelectedDecal);
	myCurrentSelectedDecal = -1;
	Release();
}

void LumoraWrapper::RemoveSelectedNode()
{
	if (!ClaimForSelection(myCurrentSelectedNode))
	{
		return;
	}
	// Only the last node goes: removing another would move the last node, and every
	// edge pointing at it, to a new address.
	if (myCurrentSelectedNode != myNodes.Count() - 1)
	{
		Release();
		return;
	}
	// Every edge that ends at the node or that the node holds goes with it, whatever
	// shape the graph has (a loaded graph need not be a chain). Removing from the
	// highest index down keeps the indices still to remove valid: a removal moves only
	// the last edge, which lies above them.
	AI::NGNode* node = &myNodes.Last();
	std::vector<int> doomed;
	for (int index = 0; index < myEdges.Count(); ++index)
	{
		if (Connects(myEdges[index], node) || Holds(*node, &myEdges[index]))
		{
			doomed.push_back(index);
		}
	}
	std::sort(doomed.rbegin(), doomed.rend());
	for (const int index : doomed)
	{
		RemoveEdgeAt(index);
	}
	node->DestroyDebugInstance();
	myNodes.RemoveLast();
	// IDs are not handed out again: the counter keeps counting.
	myCurrentSelectedNode = -1;
	Release();
}

void LumoraWrapper::DeleteSelected()
{
	// The removal called claims the facade itself.
	WaitUntilFree();
	if (myCurrentSelectedPoint != -1)
	{
		RemoveSelectedPointLight();
	}
	else if (myCurrentSelectedSpot != -1)
	{
		RemoveSelectedSpotLight();
	}
	else if (myCurrentSelectedNode != -1)
	{
		RemoveSelectedNode();
	}
	else if (myCurrentSelectedDecal != -1)
	{
		RemoveSelectedDecal();
	}
}

// --- moving and turning ----------------------------------------------------------------

void LumoraWrapper::MoveSelectedVector(float anX, float aY, float aZ)
{
	MoveSelectedByMode(Vector3<float>(anX, aY, aZ), true);
}

void LumoraWrapper::MoveSelectedVert(float aMovement)
{
	MoveSelectedAlongCamera(1, aMovement);
}

void LumoraWrapper::MoveSelectedHor(float aMovement)
{
	MoveSelectedAlongCamera(0, aMovement);
}

void LumoraWrapper::MoveSelectedDepth(float aMovement)
{
	MoveSelectedAlongCamera(2, aMovement);
}

void LumoraWrapper::PitchSpotLight(float aPitch)
{
	TurnSelected(Matrix33<float>::CreateRotateAroundX(aPitch));
}

void LumoraWrapper::YawSpotLight(float aYaw)
{
	TurnSelected(Matrix33<float>::CreateRotateAroundY(aYaw));
}

// --- values ----------------------------------------------------------------------------

void LumoraWrapper::ChangeColorPointLight(float anR, float aG, float aB)
{
	if (!ClaimForSelection(myCurrentSelectedPoint))
	{
		return;
	}
	SetColor(myEnvironmentPointLights[myCurrentSelectedPoint].myColor, anR, aG, aB);
	Release();
}

void LumoraWrapper::ChangeColorSpotLight(float anR, float aG, float aB)
{
	if (!ClaimForSelection(myCurrentSelectedSpot))
	{
		return;
	}
	SetColor(myEnvironmentSpotLights[myCurrentSelectedSpot].myColor, anR, aG, aB);
	Release();
}

void LumoraWrapper::ChangeColorDecal(float anR, float aG, float aB)
{
	if (!ClaimForSelection(myCurrentSelectedDecal))
	{
		return;
	}
	SetColor(myDecals[myCurrentSelectedDecal].myColor, anR, aG, aB);
	Release();
}

void LumoraWrapper::ChangeFalloffPointLight(float aFalloff)
{
	if (!ClaimForSelection(myCurrentSelectedPoint))
	{
		return;
	}
	myEnvironmentPointLights[myCurrentSelectedPoint].myFalloff = aFalloff;
	Release();
}

void LumoraWrapper::ChangeFalloffSpotLight(float aFalloff)
{
	if (!ClaimForSelection(myCurrentSelectedSpot))
	{
		return;
	}
	myEnvironmentSpotLights[myCurrentSelectedSpot].myFalloff = aFalloff;
	Release();
}

void LumoraWrapper::ChangeAnglesSpotLight(float anInnerValue, float anOuterValue)
{
	if (!ClaimForSelection(myCurrentSelectedSpot))
	{
		return;
	}
	myEnvironmentSpotLights[myCurrentSelectedSpot].myAngles = Vector2<float>(anInnerValue, anOuterValue);
	Release();
}

void LumoraWrapper::ChangeDecalSize(float aSize)
{
	if (!ClaimForSelection(myCurrentSelectedDecal))
	{
		return;
	}
	myDecals[myCurrentSelectedDecal].mySize = aSize;
	Release();
}

void LumoraWrapper::ChangeDecalDepth(float aDepth)
{
	if (!ClaimForSelection(myCurrentSelectedDecal))
	{
		return;
	}
	myDecals[myCurrentSelectedDecal].myDepth = aDepth;
	Release();
}

void LumoraWrapper::ChangeDecalType(const std::u16string& aDecalType)
{
	if (!ClaimForSelection(myCurrentSelectedDecal))
	{
		return;
	}
	const std::string name = LowBytes(aDecalType);
	// A name the catalogue does not define has no textures to give: the decal keeps
	// its type.
	const auto type = myDecalTypes.find(name);
	if (type == myDecalTypes.end())
	{
		Zeph::ReportDebug(__LINE__, "Lumora::LumoraWrapper::ChangeDecalType",
		                  "No decal type \"%s\" in the decal type catalogue; the decal keeps type \"%s\"",
		                  name.c_str(), myDecals[myCurrentSelectedDecal].myTypeId.c_str());
		Release();
		return;
	}
	Zeph::DecalData& decal = myDecals[myCurrentSelectedDecal];
	decal.myTypeId = type->first;
	decal.myTexture = type->second.myTexture;
	decal.myNormalTexture = type->second.myNormalTexture;
	Release();
}

void LumoraWrapper::GetCurrentDecalTypes(DecalTypeStruct& aDecalTypeRef) const
{
	for (const auto& type : myDecalTypes)
	{
		aDecalTypeRef.decalTypes.push_back(ToWide(type.first));
	}
}
} // namespace Lumora
