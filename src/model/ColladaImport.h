#pragma once
// ColladaImport: a loaded COLLADA document turned into a model tree, without the GPU.
// ColladaMeshFactory loads the file, converts it here, and then gives the tree its
// effects, textures and buffers, the same way it finishes an ".al" file.
//
//   Collada::Document document;
//   std::string error;
//   if (!document.Load(path, error)) { ... }
//   std::vector<Zeph::AlTextureBinding> bindings;
//   std::unique_ptr<Zeph::ModelNode> tree = Zeph::ColladaImport::Convert(document, bindings, error);
//   if (!tree) { ... error names the geometry whose layout no vertex type draws ... }
//
// The tree: a root for the visual scene, one child node per scene node (joints and
// their subtrees are left out: they are the skeleton, not geometry), each with the
// node's local matrix, and a model for a geometry or skin-controller instance, a
// camera or a light record for a camera or light instance. Every model holds one
// vertex per distinct corner key, 32-bit indices with the winding reversed, one
// triangle-list surface per polygon set and its vertex type (its layout description
// set to match). The root's matrix is mirrored in x (diag(-1, 1, 1, 1)), which is
// what the reversed winding goes with. Models get no effect here; someBindings
// receives the texture bindings of the bound materials, to be made once they have one.
#include <cstddef>
#include <memory>
#include <string>
#include <vector>

#include "model/AlFile.h"

namespace Collada
{
class Document;
}

namespace Zeph
{
class ModelNode;

namespace ColladaImport
{
// The most vertex and index bytes the models of one scene may take together: each instance
// of a geometry is a model of its own, so a short document could otherwise ask for far more.
constexpr size_t ourMaxModelBytes = size_t(1) << 30;

// Null, with anError saying what of the document cannot be converted: a geometry whose layout
// no vertex type draws, a scene that expands past 65,535 nodes or past aModelByteLimit bytes of
// vertices and indices.
std::unique_ptr<ModelNode> Convert(const Collada::Document& aDocument,
                                   std::vector<AlTextureBinding>& someBindings, std::string& anError,
                                   size_t aModelByteLimit = ourMaxModelBytes);
} // namespace ColladaImport
} // namespace Zeph
