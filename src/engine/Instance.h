#pragma once
// Instance: a placed copy of a model tree (a level entity, a light gizmo, the debug
// box of a room or a path node). It builds one node per node of the model tree, each
// with its own render data (its room and the world matrix it submitted last), and
// carries the world matrix, the one before the last SetOrientation (motion blur) and
// the objects attached to it.
//
//   Zeph::Instance* crate = new Zeph::Instance(factory.GetModel("data/models/crate.dae"));
//   crate->SetPosition({4.0f, 0.0f, 2.0f});
//   crate->SetRoomData(roomData);
//   crate->Render();           // queues its surfaces with the renderer for this frame
//   delete crate;              // the model tree stays with the factory
//
// The instance owns its node tree and its attached objects, never the model tree.
#include "core/GrowingArray.h"
#include "core/Matrix44.h"
#include "core/Vector3.h"
#include "engine/RoomData.h"

namespace Zeph
{
class Model;
class ModelNode;

class Instance
{
public:
	// An object that follows the instance (a light, an effect of an entity).
	class AttachedObject
	{
	public:
		virtual ~AttachedObject() = default;
		virtual void UpdateTransform(const Matrix44<float>& anOrientation) = 0;
		virtual void Render() = 0;
	};

	// What one node of an instance keeps between frames.
	struct RenderData
	{
		RoomData myRoomData;
		Matrix44<float> myPreviousWorld;
		bool mySubmittedFlag = false; // myPreviousWorld holds a submitted matrix
	};

	// One node of the instance tree, made for one node of the model tree.
	class Node
	{
	public:
		explicit Node(ModelNode* aModelNode);
		~Node();
		Node(const Node&) = delete;
		Node& operator=(const Node&) = delete;

		ModelNode* GetModelNode() const { return myModelNode; }
		RenderData& GetRenderData() { return myRenderData; }
		const RenderData& GetRenderData() const { return myRenderData; }
		const Matrix44<float>& GetWorld() const { return myWorld; }
		const GrowingArray<Node*>& GetChildren() const { return myChildren; }

		// World = the node's local transformation at time 0, then aParentWorld.
		void UpdateWorld(const Matrix44<float>& aParentWorld);
		// Hands the node's surfaces, then its children's, to the renderer's collector.
		void Submit();

	private:
		void SubmitModel(const Model& aModel);

		ModelNode* myModelNode;
		Matrix44<float> myWorld;
		RenderData myRenderData;
		GrowingArray<Node*> myChildren;
	};

	explicit Instance(ModelNode* aModelNode);
	~Instance();
	Instance(const Instance&) = delete;
	Instance& operator=(const Instance&) = delete;

	// Position and row 3 of the world matrix; the attached objects follow.
	void SetPosition(const Vector3<float>& aPosition);
	const Vector3<float>& GetPosition() const { return myPosition; }
	// Keeps the old matrix as the previous one; position from row 3; attached objects follow.
	void SetOrientation(const Matrix44<float>& anOrientation);
	const Matrix44<float>& GetOrientation() const { return myOrientation; }
	const Matrix44<float>& GetPreviousOrientation() const { return myPreviousOrientation; }
	// Replaces the whole world matrix with diag(x, y, z, 1): the translation becomes
	// zero while GetPosition keeps its value, and the attached objects stay where they
	// are. Callers set the position again afterwards.
	void SetScale(float anX, float aY, float aZ);

	// Updates the node tree's world matrices, queues every node's surfaces with the
	// renderer for this frame, then renders the attached objects.
	void Render();
	// The record goes to the root node and down the first-child chain only.
	void SetRoomData(const RoomData& aRoomData);

	// Takes ownership.
	void AddAttachedObject(AttachedObject* anObject);
	int GetAttachedObjectCount() const { return myAttachedObjects.Count(); }

	ModelNode* GetModelNode() const { return myModelNode; }
	Node* GetRootNode() const { return myRootNode; }

private:
	void UpdateAttachedObjects();

	ModelNode* myModelNode; // shared, owned by its factory
	Node* myRootNode;
	Vector3<float> myPosition{0.0f, 0.0f, 0.0f};
	Matrix44<float> myOrientation;
	Matrix44<float> myPreviousOrientation;
	GrowingArray<AttachedObject*> myAttachedObjects;
};
} // namespace Zeph
