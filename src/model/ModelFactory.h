#pragma once
// ModelFactory: the engine's model trees by name, each made once and shared by
// every Instance of it, with a bounding sphere per imported model.
//
//   Zeph::ModelFactory& factory = engine->GetModelFactory();
//   Zeph::ModelNode* box = factory.CreateAABB("room000246", {1, 2, 3}, {1, 0, 0, 0},
//                                             Gpu::PrimitiveTopology::LineList);
//   Zeph::ModelNode* tree = factory.GetModel("data/models/crate.dae");   // null when it cannot load
//   Intersection::Sphere bounds = factory.GetCullShapeFromModel("data/models/crate.dae");
//
// The factory owns the trees; Clear (at engine shutdown, context current) deletes them.
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "core/Sphere.h"
#include "core/Vector3.h"
#include "core/Vector4.h"
#include "platform/gpu/Context.h"

namespace Zeph
{
class ModelNode;

class ModelFactory
{
public:
	ModelFactory();
	~ModelFactory();
	ModelFactory(const ModelFactory&) = delete;
	ModelFactory& operator=(const ModelFactory&) = delete;

	// The stored tree for the name, else the result of LoadModel.
	ModelNode* GetModel(const std::string& aName);
	// As GetModel, but a name not stored yet is always read as an ".al" file.
	ModelNode* CreateModelNodeAL(const std::string& aName);
	// A box of eight coloured corners at +-aHalfSize around the origin, drawn with
	// Vertex_PosCol.fx in aTopology; stored under aName. A name already stored gives
	// the stored node whatever the size and colour.
	ModelNode* CreateAABB(const std::string& aName, const Vector3<float>& aHalfSize,
	                      const Vector4<float>& aColor, Gpu::PrimitiveTopology aTopology);
	// The bounding sphere of an imported model; the unit sphere at the origin (with a
	// report) for a name that holds none.
	Intersection::Sphere GetCullShapeFromModel(const std::string& aName) const;
	// Deletes every tree and sphere.
	void Clear();
	size_t GetCount() const { return myModels.size(); }
	// The file names of the trees read from files, sorted (a bake's inputs); boxes made by
	// CreateAABB are no files and are not named.
	std::vector<std::string> GetFileNames() const;

	// The bounding sphere of a tree: of the root's model, or of the first model found
	// depth-first (a node's model before its children's). Positions are read for the
	// lit and skinned vertex types (4 and 6) only; every other vertex counts as the
	// origin. The box is mirrored in x as the importers mirror the tree.
	static Intersection::Sphere ComputeBoundingSphere(const ModelNode& aRoot);

private:
	// Imports by extension (".dae", ".al") and stores the tree with its bounding
	// sphere; null after a report.
	ModelNode* LoadModel(const std::string& aName);
	void Store(const std::string& aName, ModelNode* aTree);

	std::map<std::string, std::unique_ptr<ModelNode>> myModels;
	std::map<std::string, Intersection::Sphere> myCullShapes;
};
} // namespace Zeph
