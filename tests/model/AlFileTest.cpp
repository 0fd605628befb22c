// The binary model file as bytes: trees written and read back, a hand-written
// version-1 file, and damaged files failing cleanly. No GPU: effects, textures and
// buffers are the GPU suite's.
#include <functional>
#include <gtest/gtest.h>
#include <memory>
#include <tuple>
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
	int myTextureCount = 1;
};

// Builds a file image field by field, as the format lists them.
class Bytes
{
public:
	Bytes& Int(int aValue) { return Raw(&aValue, sizeof(aValue)); }
	Bytes& Float(float aValue) { return Raw(&aValue, sizeof(aValue)); }
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
		Int(someFields.myTextureCount);
		for (int texture = 0; texture < someFields.myTextureCount; ++texture)
		{
			String("data/tex/a.dds").String("DiffuseTexture").Int(1);
		}
		return Int(0).Int(0).Int(0).Int(0).Int(0);
	}
	std::vector<uint8_t> myBytes;
};

std::unique_ptr<Zeph::ModelNode> Parse(const std::vector<uint8_t>& someBytes, std::string& anError)
{
	std::vector<Zeph::AlTextureBinding> bindings;
	return Zeph::AlFile::Parse(someBytes, bindings, anError);
}
} // namespace

TEST(AlFileTest, ATreeWrittenAndReadBackIsTheSameTreeAndEveryTruncationFails)
{
	const std::unique_ptr<Zeph::ModelNode> tree(ModelTreeCheck::MakeTree());
	const std::vector<uint8_t> bytes = ModelTreeCheck::Encoded(*tree);
	std::string error;
	const std::unique_ptr<Zeph::ModelNode> read = Parse(bytes, error);
	ASSERT_NE(read, nullptr) << error;
	EXPECT_EQ(ModelTreeCheck::Encoded(*read), bytes) << "writing the read tree gives the same bytes";
	// A field that the writer and the reader both left out would give the same bytes too: the
	// records' last fields reach the tree.
	const Zeph::ModelAnimationData& data = read->GetModel()->GetAnimationData();
	const auto* curves = dynamic_cast<const Zeph::TransformationNodeCurves*>(
	    data.myTransformationRecords.at(0).myTransformation.get());
	ASSERT_NE(curves, nullptr);
	const Zeph::AnimationCurve* angle = curves->GetCurve(Zeph::TransformationNodeCurves::CURVE_ANGLE);
	ASSERT_NE(angle, nullptr);
	EXPECT_EQ(std::tuple(curves->GetFourthParameter(), curves->GetAngle(), angle->GetSecondParameter(),
	                     angle->GetKeys().at(1).myValue),
	          std::tuple(-3, 45.0f, 1.5, 30.0));
	const Zeph::ModelNamedRecord& named = data.myNamedRecords.at(0);
	EXPECT_EQ(std::tuple(named.myName, named.myValue, named.mySecond,
	                     named.myTransformation->GetOrientation().myMatrix[15]),
	          std::tuple(std::string("joint"), static_cast<unsigned short>(65535), 9, 23.75f));
	EXPECT_EQ(data.myMatrixRecords.at(0).myValues, (std::vector{4, 5, 6}));
	EXPECT_EQ(data.myIntegers, (std::vector{1, -1, 2}));

	for (size_t length = 0; length < bytes.size(); ++length)
	{
		const std::vector<uint8_t> cut(bytes.begin(), bytes.begin() + static_cast<std::ptrdiff_t>(length));
		EXPECT_EQ(Parse(cut, error), nullptr) << "cut at " << length;
		EXPECT_FALSE(error.empty()) << "cut at " << length;
		error.clear();
	}
}

// Version 1 has no has-model flag on the root (the root always has a model); the writer writes
// version 2, with the flag.
TEST(AlFileTest, AVersionOneFileReadsAsTheSameTreeWithTheRootsFlag)
{
	Bytes file;
	file.Int(1).SmallModel().PlainNodeTail("root", 1);
	file.Int(0).PlainNodeTail("child", 0);
	std::string error;
	std::vector<Zeph::AlTextureBinding> bindings;
	const std::unique_ptr<Zeph::ModelNode> root = Zeph::AlFile::Parse(file.myBytes, bindings, error);
	ASSERT_NE(root, nullptr) << error;
	Bytes second;
	// The texture is a binding for the factory to make (with a GPU), not yet on the surface.
	second.Int(2).Int(1).SmallModel({.myTextureCount = 0}).PlainNodeTail("root", 1);
	second.Int(0).PlainNodeTail("child", 0);
	std::vector<uint8_t> written;
	Zeph::AlFile::Encode(*root, written);
	EXPECT_EQ(written, second.myBytes);
	ASSERT_EQ(bindings.size(), 1u);
	EXPECT_EQ(
	    std::tuple(bindings[0].myModel, bindings[0].mySurface, bindings[0].myPath, bindings[0].myVariableName,
	               bindings[0].mySRGBFlag),
	    std::tuple(root->GetModel(), 0, std::string("data/tex/a.dds"), std::string("DiffuseTexture"), true));

	// The same file as version 2 lacks the root's flag: the model block is misread.
	file.myBytes[0] = 2;
	EXPECT_EQ(Parse(file.myBytes, error), nullptr);
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
	    {"no version", [](Bytes& aFile) { aFile.Raw("\x02", 1); }, "file ends inside version"},
	    {"has-model 2", [](Bytes& aFile) { aFile.Int(2).Int(2).PlainNodeTail("r", 0); }, "not 0 or 1"},
	    {"negative child count", [](Bytes& aFile) { aFile.Int(2).Int(0).PlainNodeTail("r", -1); },
	     "child node count -1 does not fit"},
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
	}
}
