#pragma once
// ModelNode: one node of a model tree: an optional model (geometry), camera and
// light, the node's local transformation, its name and its child nodes.
//
//   Zeph::ModelNode* box = engine->GetModelFactory().CreateAABB("box", half, red, topology);
//   box->SetIsShadowCasterFlag(true);          // every model of the tree
//   box->SetTechniqueByName("RenderBase");     // every model of the tree
//
// A node owns its model, camera, light, transformation and children. A tree is
// owned by the ModelFactory (or a DebugLine) and shared by every Instance made of it.
#include <string>

#include "core/GrowingArray.h"

namespace Zeph
{
class Camera;
class Model;
class TransformationNode;
struct ModelLight;

class ModelNode
{
public:
	// With an identity transformation and nothing else.
	ModelNode();
	~ModelNode();
	ModelNode(const ModelNode&) = delete;
	ModelNode& operator=(const ModelNode&) = delete;

	// The flag on this node's model and on the models of every descendant node.
	void SetIsShadowCasterFlag(bool aFlag);
	// Technique selection by aName on this node's model, then on every child node.
	void SetTechniqueByName(const std::string& aName);

	// The setters take ownership and delete what was there.
	void SetModel(Model* aModel);
	Model* GetModel() const { return myModel; }
	void SetCamera(Camera* aCamera);
	Camera* GetCamera() const { return myCamera; }
	void SetLight(ModelLight* aLight);
	ModelLight* GetLight() const { return myLight; }
	void SetTransformation(TransformationNode* aTransformation);
	TransformationNode* GetTransformation() const { return myTransformation; }
	void SetName(const std::string& aName) { myName = aName; }
	const std::string& GetName() const { return myName; }
	// Takes ownership.
	void AddChild(ModelNode* aChild) { myChildren.Add(aChild); }
	const GrowingArray<ModelNode*>& GetChildren() const { return myChildren; }

private:
	Camera* myCamera = nullptr;
	ModelLight* myLight = nullptr;
	Model* myModel = nullptr;
	TransformationNode* myTransformation;
	std::string myName;
	GrowingArray<ModelNode*> myChildren;
};
} // namespace Zeph
