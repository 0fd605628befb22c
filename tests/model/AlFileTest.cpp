// The binary model file as bytes: trees written and read back, a hand-written
// version-1 file, and damaged files failing cleanly. No GPU: effects, textures and
// buffers are the GPU suite's.
#include <array>
#include <cstring>
#include <functional>
#include <gtest/gtest.h>
#include <memory>
#include <vector>

#include "ModelTreeCheck.h"
#include "model/AlFile.h"

namespace
{
// The fields of Bytes::SmallModel that the damaged-file cases change.
struct ModelFields
{
	int myVertexType = 2;
	int mySecondType = 2;
	int myIndexCount = 3;
	int myIndexFormat = 42;
	int myIndices[3] = {0, 0, 0}; // 12 bytes, read as three 32-bit or six 16-bit indices
	int myVertexSize = 32;
	int myStride = 32;
};

// Builds a file image field by field, as the format lists them.
class Bytes
{
public:
	Bytes& Int(int aValue) { return Raw(&aValue, sizeof(aValue)); }
	Bytes& Float(float aValue) { return Raw(&aValue, sizeof(aValue)); }
	Bytes& Double(double aValue) { return Raw(&aValue, sizeof(aValue)); }
	Bytes& String(const std::string& aText)
	{
		Int(static_cast<int>(aText.size()));
		return Raw(aText.data(), aText.size());
	}
	Bytes& Matrix(float aBase)
	{
		const Matrix44<float> matrix = ModelTreeCheck::DistinctMatrix(aBase);
		return Raw(matrix.myMatrix, sizeof(matrix.myMatrix));
	}
	Bytes& Raw(const void* aSource, size_t aSize)
	{
		const auto* bytes = static_cast<const uint8_t*>(aSource);
		myBytes.insert(myBytes.end(), bytes, bytes + aSize);
		return *this;
	}
	// A fixed transformation (a hierarchy without children), its matrix, the name.
	Bytes& PlainNodeTail(const std::string& aName, int aChildCount)
	{
		return Int(1).Int(0).Matrix(0.0f).String(aName).Int(aChildCount);
	}
	// A model block of vertex type 2 with one vertex, three 32-bit indices, one
	// surface with one texture, no animation data and no child models.
	Bytes& SmallModel(const ModelFields& someFields = {})
	{
		Int(0).Int(42).Int(someFields.myVertexType);
		Int(someFields.myIndexCount).Int(12).Int(someFields.myIndexFormat);
		for (int index : someFields.myIndices)
		{
			Int(index);
		}
		Int(1).Int(someFields.myVertexSize).Int(someFields.myStride).Int(someFields.mySecondType);
		for (int index = 0; index < someFields.myVertexSize / 4; ++index)
		{
			Float(static_cast<float>(index));
		}
		String("first").String("RenderAlphaTest").String("NULL");
		Int(1).Int(3).Int(0).Int(0).Int(0).Int(4);
		Int(1).String("data/tex/a.dds").String("DiffuseTexture").Int(1);
		return Int(0).Int(0).Int(0).Int(0).Int(0);
	}
	std::vector<uint8_t> myBytes;
};

std::unique_ptr<Zeph::ModelNode> Parse(const std::vector<uint8_t>& someBytes, std::string& anError,
                                       std::vector<Zeph::AlTextureBinding>* someBindings = nullptr)
{
	std::vector<Zeph::AlTextureBinding> bindings;
	std::unique_ptr<Zeph::ModelNode> tree = Zeph::AlFile::Parse(someBytes, bindings, anError);
	if (someBindings != nullptr)
	{
		*someBindings = bindings;
	}
	return tree;
}
} // namespace

TEST(AlFileTest, ATreeWrittenAndReadBackIsTheSameTreeAndEveryTruncationFails)
{
	const std::unique_ptr<Zeph::ModelNode> tree(ModelTreeCheck::MakeTree());
	std::vector<uint8_t> bytes;
	Zeph::AlFile::Encode(*tree, bytes);
	int version = 0;
	ASSERT_GE(bytes.size(), 4u);
	std::memcpy(&version, bytes.data(), 4);
	EXPECT_EQ(version, 2);

	std::string error;
	const std::unique_ptr<Zeph::ModelNode> read = Parse(bytes, error);
	ASSERT_NE(read, nullptr) << error;
	ModelTreeCheck::ExpectSameTree(*tree, *read);
	// The layout description comes from the vertex type, not from the file.
	const GrowingArray<Gpu::InputElement>& layout = read->GetModel()->GetInputLayoutDesc();
	ASSERT_EQ(layout.Count(), 5);
	EXPECT_EQ(layout[4].mySemanticName, "BINORMAL");
	EXPECT_EQ(layout[4].myAlignedByteOffset, 44u);

	std::vector<uint8_t> again;
	Zeph::AlFile::Encode(*read, again);
	EXPECT_EQ(again, bytes) << "writing the read tree gives the same bytes";

	// Every truncation of the file fails.
	for (size_t length = 0; length < bytes.size(); ++length)
	{
		const std::vector<uint8_t> cut(bytes.begin(), bytes.begin() + static_cast<std::ptrdiff_t>(length));
		EXPECT_EQ(Parse(cut, error), nullptr) << "cut at " << length;
		EXPECT_FALSE(error.empty()) << "cut at " << length;
		error.clear();
	}
}

TEST(AlFileTest, AVersionOneFileHasNoModelFlagOnTheRootOnly)
{
	Bytes file;
	file.Int(1).SmallModel().PlainNodeTail("root", 1);
	file.Int(0).PlainNodeTail("child", 0);
	std::string error;
	std::vector<Zeph::AlTextureBinding> bindings;
	const std::unique_ptr<Zeph::ModelNode> root = Parse(file.myBytes, error, &bindings);
	ASSERT_NE(root, nullptr) << error;
	EXPECT_EQ(root->GetName(), "root");
	const Zeph::Model* model = root->GetModel();
	ASSERT_NE(model, nullptr);
	EXPECT_FALSE(model->IsNullObject());
	// Model ID, vertex type, index count, vertex count and stride, in the file's order.
	EXPECT_EQ((std::array{model->GetModelID(), model->GetVertexType(), model->GetIndexCount(),
	                      model->GetVertexCount(), model->GetVertexStride()}),
	          (std::array{42, 2, 3, 1, 32}));
	float lastFloat = 0.0f;
	std::memcpy(&lastFloat, model->GetVertexData().data() + 28, 4);
	EXPECT_EQ(lastFloat, 7.0f);
	EXPECT_EQ((std::array{model->GetFirstName(), model->GetTechniqueName(), model->GetThirdName()}),
	          (std::array<std::string, 3>{"first", "RenderAlphaTest", "NULL"}));
	ASSERT_EQ(model->GetSurfaces().Count(), 1);
	EXPECT_EQ(model->GetSurfaces()[0].GetIndexCount(), 3);
	EXPECT_EQ(model->GetSurfaces()[0].GetPrimitiveTopology(), Gpu::PrimitiveTopology::TriangleList);
	ASSERT_EQ(bindings.size(), 1u);
	EXPECT_EQ(bindings[0].myModel, model);
	EXPECT_EQ(bindings[0].mySurface, 0);
	EXPECT_EQ(bindings[0].myPath, "data/tex/a.dds");
	EXPECT_EQ(bindings[0].myVariableName, "DiffuseTexture");
	EXPECT_TRUE(bindings[0].mySRGBFlag);
	ModelTreeCheck::ExpectSameMatrix(root->GetTransformation()->GetOrientation(),
	                                 ModelTreeCheck::DistinctMatrix(0.0f), "root matrix");
	ASSERT_EQ(root->GetChildren().Count(), 1);
	EXPECT_EQ(root->GetChildren()[0]->GetName(), "child");
	EXPECT_EQ(root->GetChildren()[0]->GetModel(), nullptr);

	// The same file as version 2 lacks the root's flag: the model block is misread.
	Bytes second = file;
	second.myBytes[0] = 2;
	EXPECT_EQ(Parse(second.myBytes, error), nullptr);
}

TEST(AlFileTest, DamagedFilesFailWithTheirReason)
{
	struct Case
	{
		const char* myName;
		std::function<void(Bytes&)> myBuild;
		const char* myReason;
	};
	const Case cases[] = {
	    {"version 3", [](Bytes& aFile) { aFile.Int(3).Int(0).PlainNodeTail("r", 0); },
	     "unsupported version 3"},
	    {"version 0", [](Bytes& aFile) { aFile.Int(0).Int(0).PlainNodeTail("r", 0); },
	     "unsupported version 0"},
	    {"no version", [](Bytes& aFile) { aFile.Raw("\x02", 1); }, "file ends inside version"},
	    {"has-model 2", [](Bytes& aFile) { aFile.Int(2).Int(2).PlainNodeTail("r", 0); }, "not 0 or 1"},
	    {"child count past the end", [](Bytes& aFile) { aFile.Int(2).Int(0).PlainNodeTail("r", 0x7fffffff); },
	     "child node count 2147483647 does not fit"},
	    {"negative child count", [](Bytes& aFile) { aFile.Int(2).Int(0).PlainNodeTail("r", -1); },
	     "child node count -1 does not fit"},
	    {"name longer than the file",
	     [](Bytes& aFile) { aFile.Int(2).Int(0).Int(1).Int(0).Matrix(0.0f).Int(1000000000); },
	     "node name 1000000000 does not fit"},
	    {"hierarchy children past the end",
	     [](Bytes& aFile) { aFile.Int(2).Int(0).Int(1).Int(0x10000000).Matrix(0.0f).String("r").Int(0); },
	     "transformation child count"},
	    {"negative vertex data size",
	     [](Bytes& aFile) { aFile.Int(2).Int(1).SmallModel({.myVertexSize = -4}); },
	     "vertex data size -4 does not fit"},
	    {"indices past the index data",
	     [](Bytes& aFile) { aFile.Int(2).Int(1).SmallModel({.myIndexCount = 4}); },
	     "4 indices do not fit 12 bytes"},
	    {"vertex types differ", [](Bytes& aFile) { aFile.Int(2).Int(1).SmallModel({.mySecondType = 3}); },
	     "vertex types 2 and 3 differ"},
	    {"unknown vertex type",
	     [](Bytes& aFile) { aFile.Int(2).Int(1).SmallModel({.myVertexType = 12, .mySecondType = 12}); },
	     "unknown vertex type 12"},
	    // The index data starts at byte 32; each index must name one of the model's vertices.
	    {"32-bit index past the vertices",
	     [](Bytes& aFile) {
		     aFile.Int(2).Int(1).SmallModel({.myIndices = {0, 0, 1}});
	     },
	     "index 2 is 1, past the 1 vertices, at byte 40"},
	    {"16-bit index past the vertices",
	     [](Bytes& aFile) {
		     aFile.Int(2).Int(1).SmallModel({.myIndexFormat = 57, .myIndices = {0x50000, 0, 0}});
	     },
	     "index 1 is 5, past the 1 vertices, at byte 34"},
	    {"unknown index format", [](Bytes& aFile) { aFile.Int(2).Int(1).SmallModel({.myIndexFormat = 7}); },
	     "unsupported index format 7"},
	    {"stride under the layout", [](Bytes& aFile) { aFile.Int(2).Int(1).SmallModel({.myStride = 12}); },
	     "vertex stride 12 is less than the 32 bytes of vertex type 2"},
	    {"curve keys past the end",
	     [](Bytes& aFile) {
		     aFile.Int(2).Int(0).Int(0).Int(0).Float(0).Float(0).Int(0).Int(1).Double(0).Double(0).Int(5000);
	     },
	     "curve key count 5000 does not fit"},
	    {"more children than an array holds",
	     [](Bytes& aFile) {
		     aFile.Int(2).Int(0).PlainNodeTail("r", 65536);
		     aFile.myBytes.resize(aFile.myBytes.size() + 65536 * 80);
	     },
	     "child node count 65536 exceeds 65535"},
	    {"bytes after the root", [](Bytes& aFile) { aFile.Int(2).Int(0).PlainNodeTail("r", 0).Int(0); },
	     "4 bytes after the root node"},
	    {"nesting too deep",
	     [](Bytes& aFile) {
		     aFile.Int(2);
		     for (int depth = 0; depth < 100; ++depth)
		     {
			     aFile.Int(0).PlainNodeTail("n", 1);
		     }
	     },
	     "nesting deeper than 64"},
	};
	for (const Case& test : cases)
	{
		Bytes file;
		test.myBuild(file);
		std::string error;
		EXPECT_EQ(Parse(file.myBytes, error), nullptr) << test.myName;
		EXPECT_NE(error.find(test.myReason), std::string::npos) << test.myName << ": " << error;
		EXPECT_NE(error.find(" at byte "), std::string::npos) << test.myName << ": " << error;
	}
}
