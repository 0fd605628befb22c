#pragma once
// AlFile: the engine's binary model file (".al") as bytes: Parse turns a whole file
// image into a model tree, Encode turns a tree into one. Neither touches the GPU or
// the file system; ColladaMeshFactory reads and writes the files and gives a parsed
// tree its effects, textures and buffers.
//
//   std::vector<Zeph::AlTextureBinding> bindings;
//   std::string error;
//   std::unique_ptr<Zeph::ModelNode> tree = Zeph::AlFile::Parse(bytes, bindings, error);
//   if (!tree) { ... error says what is wrong and at which byte ... }
//
// Layout (little-endian; a string is a 32-bit length and its characters): a 32-bit
// version (1 or 2; Encode writes 2), then the root node record. A node record is
// has-model (absent for the root of a version-1 file, which always has a model), the
// model block, the transformation block, 16 floats of matrix, the name, the child
// count and the children. The model and transformation blocks are listed in
// AlFile.cpp. Counts and sizes are checked against the bytes that remain before
// anything is allocated, and nesting is limited, so a damaged file fails cleanly.
#include <cstdint>
#include <memory>
#include <span>
#include <string>
#include <vector>

namespace Zeph
{
class Model;
class ModelNode;

// A texture binding read from a file, made once the model has its effect.
struct AlTextureBinding
{
	Model* myModel = nullptr;
	int mySurface = 0;
	std::string myPath;
	std::string myVariableName;
	bool mySRGBFlag = false;
};

namespace AlFile
{
constexpr int ourVersion = 2;
// Deeper nesting (nodes, child models, transformations) is taken for damage.
constexpr int ourMaxDepth = 64;

// Null, with anError naming the problem and its byte offset, for a damaged image.
// The models have their layout descriptions but no effect, textures or buffers;
// someBindings receives the texture bindings in file order.
std::unique_ptr<ModelNode> Parse(std::span<const uint8_t> someBytes,
                                 std::vector<AlTextureBinding>& someBindings, std::string& anError);
// The tree in the current version; surfaces' bound textures are stored by path.
void Encode(const ModelNode& aRoot, std::vector<uint8_t>& someBytes);
} // namespace AlFile
} // namespace Zeph
