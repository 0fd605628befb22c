#include "model/ModelNode.h"

#include "engine/Camera.h"
#include "model/Model.h"
#include "model/ModelLight.h"
#include "model/TransformationNode.h"

namespace Zeph
{
ModelNode::ModelNode() : myTransformation(new TransformationNode()), myChildren(4, 4)
{
}

ModelNode::~ModelNode()
{
	myChildren.DeleteAll();
	delete myModel;
	delete myCamera;
	delete myLight;
	delete myTransformation;
}

void ModelNode::SetIsShadowCasterFlag(bool aFlag)
{
	if (myModel != nullptr)
	{
		myModel->SetIsShadowCasterFlag(aFlag);
	}
	for (ModelNode* child : myChildren)
	{
		child->SetIsShadowCasterFlag(aFlag);
	}
}

void ModelNode::SetTechniqueByName(const std::string& aName)
{
	if (myModel != nullptr)
	{
		myModel->SetTechniqueByName(aName);
	}
	for (ModelNode* child : myChildren)
	{
		child->SetTechniqueByName(aName);
	}
}

void ModelNode::SetModel(Model* aModel)
{
	if (aModel != myModel)
	{
		delete myModel;
		myModel = aModel;
	}
}

void ModelNode::SetCamera(Camera* aCamera)
{
	if (aCamera != myCamera)
	{
		delete myCamera;
		myCamera = aCamera;
	}
}

void ModelNode::SetLight(ModelLight* aLight)
{
	if (aLight != myLight)
	{
		delete myLight;
		myLight = aLight;
	}
}

void ModelNode::SetTransformation(TransformationNode* aTransformation)
{
	if (aTransformation != myTransformation)
	{
		delete myTransformation;
		myTransformation = aTransformation;
	}
}
} // namespace Zeph
