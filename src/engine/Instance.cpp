#include "engine/Instance.h"

#include "engine/Engine.h"
#include "model/Model.h"
#include "model/ModelNode.h"
#include "model/TransformationNode.h"
#include "renderer/RenderTargetCollector.h"
#include "renderer/Renderer.h"

namespace Zeph
{
Instance::Node::Node(ModelNode* aModelNode) : myModelNode(aModelNode), myChildren(4, 4)
{
	if (myModelNode == nullptr)
	{
		return;
	}
	for (ModelNode* child : myModelNode->GetChildren())
	{
		myChildren.Add(new Node(child));
	}
}

Instance::Node::~Node()
{
	myChildren.DeleteAll();
}

void Instance::Node::UpdateWorld(const Matrix44<float>& aParentWorld)
{
	const TransformationNode* transformation =
	    myModelNode != nullptr ? myModelNode->GetTransformation() : nullptr;
	myWorld = transformation != nullptr ? transformation->GetTransformationForTime(0.0) * aParentWorld
	                                    : aParentWorld;
	for (Node* child : myChildren)
	{
		child->UpdateWorld(myWorld);
	}
}

void Instance::Node::Submit()
{
	const Model* model = myModelNode != nullptr ? myModelNode->GetModel() : nullptr;
	if (model != nullptr)
	{
		// The first submission has no earlier frame: it moved by nothing.
		if (!myRenderData.mySubmittedFlag)
		{
			myRenderData.myPreviousWorld = myWorld;
			myRenderData.mySubmittedFlag = true;
		}
		SubmitModel(*model);
		myRenderData.myPreviousWorld = myWorld;
	}
	for (Node* child : myChildren)
	{
		child->Submit();
	}
}

void Instance::Node::SubmitModel(const Model& aModel)
{
	Engine* engine = Engine::GetInstance();
	if (engine == nullptr)
	{
		return;
	}
	RenderTargetCollector& collector = engine->GetRenderer().GetRTC();
	if (!aModel.IsNullObject())
	{
		for (const Surface& surface : aModel.GetSurfaces())
		{
			collector.AddInstance(surface.GetRenderCategory(), aModel, surface, myWorld,
			                      myRenderData.myPreviousWorld, myRenderData.myRoomData);
		}
	}
	for (const Model* child : aModel.GetChildModels())
	{
		SubmitModel(*child);
	}
}

Instance::Instance(ModelNode* aModelNode)
    : myModelNode(aModelNode), myRootNode(new Node(aModelNode)), myAttachedObjects(5, 5, true)
{
}

Instance::~Instance()
{
	myAttachedObjects.DeleteAll();
	delete myRootNode;
}

void Instance::SetPosition(const Vector3<float>& aPosition)
{
	myPosition = aPosition;
	myOrientation.SetPosition(aPosition);
	UpdateAttachedObjects();
}

void Instance::SetOrientation(const Matrix44<float>& anOrientation)
{
	myPreviousOrientation = myOrientation;
	myOrientation = anOrientation;
	myPosition = anOrientation.GetPosition();
	UpdateAttachedObjects();
}

void Instance::SetScale(float anX, float aY, float aZ)
{
	myOrientation = Matrix44<float>();
	myOrientation.myMatrix[0] = anX;
	myOrientation.myMatrix[5] = aY;
	myOrientation.myMatrix[10] = aZ;
}

void Instance::Render()
{
	myRootNode->UpdateWorld(myOrientation);
	myRootNode->Submit();
	for (AttachedObject* object : myAttachedObjects)
	{
		object->Render();
	}
}

void Instance::SetRoomData(const RoomData& aRoomData)
{
	Node* node = myRootNode;
	node->GetRenderData().myRoomData = aRoomData;
	while (node->GetChildren().Count() > 0)
	{
		node = node->GetChildren()[0];
		node->GetRenderData().myRoomData = aRoomData;
	}
}

void Instance::AddAttachedObject(AttachedObject* anObject)
{
	if (anObject != nullptr)
	{
		myAttachedObjects.Add(anObject);
	}
}

void Instance::UpdateAttachedObjects()
{
	for (AttachedObject* object : myAttachedObjects)
	{
		object->UpdateTransform(myOrientation);
	}
}
} // namespace Zeph
