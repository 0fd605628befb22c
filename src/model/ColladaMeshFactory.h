#pragma once
// ColladaMeshFactory: turns model files into model trees ready to draw: COLLADA
// documents (".dae") and the engine's binary model files (".al"), which it also writes.
//
//   Zeph::ModelNode* scene = Zeph::ColladaMeshFactory::CreateModelNodeDAE("data/models/crate.dae");
//   Zeph::ModelNode* tree = Zeph::ColladaMeshFactory::CreateModelNodeAL("data/models/crate.al");
//   if (tree != nullptr) { ... the caller owns it ... }
//   Zeph::ColladaMeshFactory::SaveModelNodeAL(*tree, "data/models/copy.al");
//
// Reading needs the Engine (its context current): every model gets the effect of
// its vertex type, its textures bound again by path, its buffers and its technique.
#include <string>

namespace Zeph
{
class ModelNode;

class ColladaMeshFactory
{
public:
	// The tree of a COLLADA document (see ColladaImport.h for what it holds), with
	// effects, textures and buffers; null when the document does not load, a model's
	// layout is none of the vertex types (the reason goes to the log as a debug
	// message, the caller reports the failure) or a model's buffers cannot be made.
	// The caller owns the tree and selects its technique.
	static ModelNode* CreateModelNodeDAE(const std::string& aFileName);
	// The tree of an ".al" file; null after a report when the file cannot be opened,
	// is damaged, or a model's buffers cannot be made. The caller owns the tree.
	static ModelNode* CreateModelNodeAL(const std::string& aFileName);
	// Writes the tree as an ".al" file through a temporary that replaces aFileName
	// only when complete; false after a report.
	static bool SaveModelNodeAL(const ModelNode& aNode, const std::string& aFileName);
};
} // namespace Zeph
