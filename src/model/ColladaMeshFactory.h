#pragma once
// ColladaMeshFactory: turns model files into model trees ready to draw. This part
// reads and writes the engine's binary model files (".al"); the COLLADA import
// joins it later.
//
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
	// The tree of an ".al" file; null after a report when the file cannot be opened,
	// is damaged, or a model's buffers cannot be made. The caller owns the tree.
	static ModelNode* CreateModelNodeAL(const std::string& aFileName);
	// Writes the tree as an ".al" file through a temporary that replaces aFileName
	// only when complete; false after a report.
	static bool SaveModelNodeAL(const ModelNode& aNode, const std::string& aFileName);
};
} // namespace Zeph
