#pragma once
// Node: the scene graph of a visual scene, with each node's transforms and the entities it places.
//
//   const Collada::VisualScene* scene = document.GetVisualScene();
//   for (const auto& node : scene->myNodes)
//   {
//       Matrix44<float> local = node->GetLocalMatrix();       // v * local, parent space
//       for (const Collada::Instance& instance : node->myInstances)
//       {
//           if (instance.myKind == Collada::InstanceKind::Geometry) { document.FindGeometry(instance.myUrl);
//           } if (instance.myKind == Collada::InstanceKind::Node) { walk(*instance.myNode); }
//       }
//   }
//
// Transforms keep the file's order and values. The local matrix composes them as the file means
// (column vectors, the first transform outermost) and gives it in the engine's row-vector
// convention, so for <translate/><rotate/> a point is rotated first and then translated.
// instance_node is resolved when the document loads: myNode points at the instanced node (in
// library_nodes or a scene), which the document owns; a cycle of instances is a load error.

#include <memory>
#include <string>
#include <vector>

#include "core/Matrix44.h"

namespace Collada
{
enum class TransformKind
{
	Matrix,    // 16 values, row by row as written (column-vector convention)
	Translate, // x y z
	Rotate,    // axis x y z, angle in degrees
	Scale,     // x y z
	LookAt,    // eye, interest, up
	Skew       // angle in degrees, rotation axis, translation axis
};

struct Transform
{
	TransformKind myKind = TransformKind::Matrix;
	std::string mySid;
	float myValues[16] = {};

	// This transform alone, in the row-vector convention.
	Matrix44<float> GetMatrix() const;
};

struct VertexInputBinding
{
	std::string mySemantic;      // the texcoord symbol an effect uses
	std::string myInputSemantic; // TEXCOORD
	int myInputSet = 0;
};

// bind_material/technique_common/instance_material: a polygon set's material symbol to a material.
struct InstanceMaterial
{
	std::string mySymbol;
	std::string myTarget; // the material's id
	std::vector<VertexInputBinding> myVertexInputs;
};

enum class InstanceKind
{
	Geometry,
	Controller,
	Camera,
	Light,
	Node
};

struct Node;

struct Instance
{
	InstanceKind myKind = InstanceKind::Geometry;
	std::string myUrl; // the entity's id, without '#'
	std::vector<InstanceMaterial> myMaterials;
	std::vector<std::string> mySkeletons; // instance_controller <skeleton> roots, without '#'
	const Node* myNode = nullptr;         // instance_node only
	int myLine = 0;

	const InstanceMaterial* FindMaterial(const std::string& aSymbol) const;
};

struct Node
{
	std::string myId;
	std::string myName;
	std::string mySid;
	bool myIsJointFlag = false; // type="JOINT"
	std::vector<Transform> myTransforms;
	std::vector<Instance> myInstances; // in document order, whatever their kind
	std::vector<std::unique_ptr<Node>> myChildren;
	int myLine = 0;

	Matrix44<float> GetLocalMatrix() const;
};

struct VisualScene
{
	std::string myId;
	std::string myName;
	std::vector<std::unique_ptr<Node>> myNodes; // the scene's top-level nodes
	int myLine = 0;
};

struct Asset
{
	std::string myUpAxis = "Y_UP";
	float myUnitMeter = 1.0f;
	std::string myUnitName = "meter";
};
} // namespace Collada
