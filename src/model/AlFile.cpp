#include "model/AlFile.h"

#include <cstring>
#include <limits>

#include "model/Model.h"
#include "model/ModelNode.h"
#include "model/Surface.h"
#include "model/TransformationNodeCurves.h"
#include "model/TransformationNodeHierarchy.h"
#include "model/VertexTypes.h"

// Model block: null object, model id, vertex type, index count, index data size,
// index format (DXGI), index bytes, vertex count, vertex data size, stride, vertex
// type again, vertex bytes, three names (the second the render technique), surfaces
// (index count, start index, two reserved integers, topology (D3D), then texture
// count and per texture path, variable name and sRGB), transformation records
// (transformation block, matrix), named records (name, 16-bit value as int, two
// ints, transformation block, matrix), matrix records (three matrices, count, ints),
// integers (count, ints), child models (count, model blocks).
//
// Transformation block: the kind; kind 1 (hierarchy) a child count and per child a
// transformation block and its matrix; kind 0 (curves) an int, two floats, an int,
// seven curve slots (presence flag, curve) and the time-0 values (axis, translation,
// angle); other kinds nothing. Curve: two doubles, key count, keys of two doubles.
namespace Zeph
{
namespace
{
// Least bytes of each repeated record, used to bound counts before allocating.
constexpr size_t ourMatrixBytes = 16 * 4;
constexpr size_t ourMinNodeBytes = 4 + 4 + ourMatrixBytes + 4 + 4;
constexpr size_t ourMinModelBytes = 19 * 4;
constexpr size_t ourMinSurfaceBytes = 6 * 4;
constexpr size_t ourMinTextureBytes = 3 * 4;
constexpr size_t ourMinTransformationBytes = 4 + ourMatrixBytes;
constexpr size_t ourMinNamedRecordBytes = 4 + 3 * 4 + 4 + ourMatrixBytes;
constexpr size_t ourMinMatrixRecordBytes = 3 * ourMatrixBytes + 4;
constexpr size_t ourMinCurveKeyBytes = 2 * 8;
// The most elements a GrowingArray (surfaces, child nodes, child models) holds.
constexpr int ourMaxArrayCount = std::numeric_limits<unsigned short>::max();

// D3D primitive topologies that the engine draws.
constexpr int ourTopologyLineList = 2;
constexpr int ourTopologyTriangleList = 4;
constexpr int ourTopologyTriangleStrip = 5;

int TopologyToFile(Gpu::PrimitiveTopology aTopology)
{
	switch (aTopology)
	{
	case Gpu::PrimitiveTopology::TriangleList:
		return ourTopologyTriangleList;
	case Gpu::PrimitiveTopology::TriangleStrip:
		return ourTopologyTriangleStrip;
	case Gpu::PrimitiveTopology::LineList:
		return ourTopologyLineList;
	}
	return ourTopologyTriangleList;
}

class Reader
{
public:
	Reader(std::span<const uint8_t> someBytes, std::vector<AlTextureBinding>& someBindings,
	       std::string& anError)
	    : myBytes(someBytes), myBindings(someBindings), myError(anError)
	{
	}

	std::unique_ptr<ModelNode> ReadFile()
	{
		int version = 0;
		if (!Int(version, "version"))
		{
			return nullptr;
		}
		if (version != 1 && version != 2)
		{
			Fail("unsupported version " + std::to_string(version));
			return nullptr;
		}
		myVersion = version;
		std::unique_ptr<ModelNode> root = ReadNode(0, true);
		if (root && myOffset != myBytes.size())
		{
			Fail(std::to_string(myBytes.size() - myOffset) + " bytes after the root node");
			return nullptr;
		}
		return root;
	}

private:
	bool Fail(const std::string& aWhat) { return FailAt(aWhat, myOffset); }

	bool FailAt(const std::string& aWhat, size_t anOffset)
	{
		if (myError.empty())
		{
			myError = aWhat + " at byte " + std::to_string(anOffset);
		}
		return false;
	}

	size_t Left() const { return myBytes.size() - myOffset; }

	bool Raw(void* aDestination, size_t aSize, const char* aWhat)
	{
		if (aSize > Left())
		{
			return Fail(std::string("file ends inside ") + aWhat);
		}
		if (aSize > 0)
		{
			std::memcpy(aDestination, myBytes.data() + myOffset, aSize);
			myOffset += aSize;
		}
		return true;
	}

	bool Int(int& aValue, const char* aWhat) { return Raw(&aValue, sizeof(aValue), aWhat); }
	bool Float(float& aValue, const char* aWhat) { return Raw(&aValue, sizeof(aValue), aWhat); }
	bool Double(double& aValue, const char* aWhat) { return Raw(&aValue, sizeof(aValue), aWhat); }

	bool Flag(bool& aValue, const char* aWhat)
	{
		int value = 0;
		if (!Int(value, aWhat))
		{
			return false;
		}
		if (value != 0 && value != 1)
		{
			return Fail(std::string(aWhat) + " is " + std::to_string(value) + ", not 0 or 1");
		}
		aValue = value == 1;
		return true;
	}

	// A count of records of at least aMinBytes each, which must fit in what is left.
	bool Count(int& aCount, size_t aMinBytes, const char* aWhat)
	{
		if (!Int(aCount, aWhat))
		{
			return false;
		}
		if (aCount < 0 || static_cast<size_t>(aCount) > Left() / aMinBytes)
		{
			return Fail(std::string(aWhat) + " " + std::to_string(aCount) + " does not fit the file");
		}
		return true;
	}

	// As Count, for records that a GrowingArray keeps: it holds at most 65,535, and would refuse
	// more with a critical report of its own rather than this reader's message.
	bool ArrayCount(int& aCount, size_t aMinBytes, const char* aWhat)
	{
		if (!Count(aCount, aMinBytes, aWhat))
		{
			return false;
		}
		if (aCount > ourMaxArrayCount)
		{
			return Fail(std::string(aWhat) + " " + std::to_string(aCount) + " exceeds " +
			            std::to_string(ourMaxArrayCount));
		}
		return true;
	}

	bool Size(int& aSize, const char* aWhat) { return Count(aSize, 1, aWhat); }

	bool String(std::string& aString, const char* aWhat)
	{
		int length = 0;
		if (!Size(length, aWhat))
		{
			return false;
		}
		aString.assign(reinterpret_cast<const char*>(myBytes.data() + myOffset), static_cast<size_t>(length));
		myOffset += static_cast<size_t>(length);
		return true;
	}

	bool Matrix(Matrix44<float>& aMatrix, const char* aWhat)
	{
		return Raw(aMatrix.myMatrix, sizeof(aMatrix.myMatrix), aWhat);
	}

	bool DepthOk(int aDepth)
	{
		return aDepth <= AlFile::ourMaxDepth ||
		       Fail("nesting deeper than " + std::to_string(AlFile::ourMaxDepth));
	}

	std::unique_ptr<ModelNode> ReadNode(int aDepth, bool aRootFlag)
	{
		if (!DepthOk(aDepth))
		{
			return nullptr;
		}
		auto node = std::make_unique<ModelNode>();
		bool hasModel = true;
		if (!(aRootFlag && myVersion == 1) && !Flag(hasModel, "has-model flag"))
		{
			return nullptr;
		}
		if (hasModel)
		{
			std::unique_ptr<Model> model = ReadModel(aDepth);
			if (!model)
			{
				return nullptr;
			}
			node->SetModel(model.release());
		}
		std::unique_ptr<TransformationNode> transformation = ReadTransformation(aDepth);
		Matrix44<float> matrix;
		std::string name;
		int childCount = 0;
		if (!transformation || !Matrix(matrix, "node matrix") || !String(name, "node name") ||
		    !ArrayCount(childCount, ourMinNodeBytes, "child node count"))
		{
			return nullptr;
		}
		transformation->SetOrientation(matrix);
		node->SetTransformation(transformation.release());
		node->SetName(name);
		for (int child = 0; child < childCount; ++child)
		{
			std::unique_ptr<ModelNode> childNode = ReadNode(aDepth + 1, false);
			if (!childNode)
			{
				return nullptr;
			}
			node->AddChild(childNode.release());
		}
		return node;
	}

	std::unique_ptr<TransformationNode> ReadTransformation(int aDepth)
	{
		int kind = 0;
		if (!DepthOk(aDepth) || !Int(kind, "transformation kind"))
		{
			return nullptr;
		}
		if (kind == TransformationNode_Hierarchy)
		{
			auto hierarchy = std::make_unique<TransformationNodeHierarchy>();
			int childCount = 0;
			if (!Count(childCount, ourMinTransformationBytes, "transformation child count"))
			{
				return nullptr;
			}
			for (int child = 0; child < childCount; ++child)
			{
				std::unique_ptr<TransformationNode> childNode = ReadTransformation(aDepth + 1);
				Matrix44<float> matrix;
				if (!childNode || !Matrix(matrix, "transformation child matrix"))
				{
					return nullptr;
				}
				childNode->SetOrientation(matrix);
				hierarchy->AddChild(childNode.release());
			}
			return hierarchy;
		}
		if (kind == TransformationNode_Curves)
		{
			return ReadCurves();
		}
		return std::make_unique<TransformationNode>(static_cast<TransformationNodeType>(kind));
	}

	std::unique_ptr<TransformationNode> ReadCurves()
	{
		auto curves = std::make_unique<TransformationNodeCurves>();
		int first = 0;
		float second = 0.0f;
		float third = 0.0f;
		int fourth = 0;
		if (!Int(first, "curve parameters") || !Float(second, "curve parameters") ||
		    !Float(third, "curve parameters") || !Int(fourth, "curve parameters"))
		{
			return nullptr;
		}
		curves->SetParameters(first, second, third, fourth);
		for (int slot = 0; slot < TransformationNodeCurves::CURVE_SLOT_COUNT; ++slot)
		{
			bool present = false;
			if (!Flag(present, "curve presence flag"))
			{
				return nullptr;
			}
			if (present)
			{
				auto curve = std::make_unique<AnimationCurve>();
				double start = 0.0;
				double end = 0.0;
				int keyCount = 0;
				if (!Double(start, "curve") || !Double(end, "curve") ||
				    !Count(keyCount, ourMinCurveKeyBytes, "curve key count"))
				{
					return nullptr;
				}
				if (keyCount > AnimationCurve::ourMaxKeyCount)
				{
					Fail("curve key count " + std::to_string(keyCount) + " exceeds 16 bits");
					return nullptr;
				}
				curve->SetParameters(start, end);
				curve->ReserveKeys(keyCount);
				for (int key = 0; key < keyCount; ++key)
				{
					double time = 0.0;
					double value = 0.0;
					if (!Double(time, "curve key") || !Double(value, "curve key"))
					{
						return nullptr;
					}
					curve->AddKey(time, value);
				}
				curves->SetCurve(static_cast<TransformationNodeCurves::CurveSlot>(slot), curve.release());
			}
		}
		float values[7];
		if (!Raw(values, sizeof(values), "curve values"))
		{
			return nullptr;
		}
		curves->SetRotationAxis({values[0], values[1], values[2]});
		curves->SetTranslation({values[3], values[4], values[5]});
		curves->SetAngle(values[6]);
		return curves;
	}

	// Every index drawn must name a vertex: the GPU would otherwise read past the vertex
	// buffer. The offset in the report is the offending index's own.
	bool IndicesInRange(const uint8_t* someIndices, size_t anOffset, int aCount, int anIndexBytes,
	                    int aVertexCount)
	{
		for (int index = 0; index < aCount; ++index)
		{
			const uint8_t* at = someIndices + static_cast<size_t>(index) * static_cast<size_t>(anIndexBytes);
			uint32_t value = 0;
			if (anIndexBytes == 2)
			{
				uint16_t narrow = 0;
				std::memcpy(&narrow, at, sizeof(narrow));
				value = narrow;
			}
			else
			{
				std::memcpy(&value, at, sizeof(value));
			}
			if (value >= static_cast<uint32_t>(aVertexCount))
			{
				return FailAt("index " + std::to_string(index) + " is " + std::to_string(value) +
				                  ", past the " + std::to_string(aVertexCount) + " vertices,",
				              anOffset + static_cast<size_t>(index) * static_cast<size_t>(anIndexBytes));
			}
		}
		return true;
	}

	// aSize (not negative) bytes in place; null when the file ends before them.
	const uint8_t* Take(int aSize, const char* aWhat)
	{
		if (static_cast<size_t>(aSize) > Left())
		{
			Fail(std::string("file ends inside ") + aWhat);
			return nullptr;
		}
		const uint8_t* start = myBytes.data() + myOffset;
		myOffset += static_cast<size_t>(aSize);
		return start;
	}

	std::unique_ptr<Model> ReadModel(int aDepth)
	{
		if (!DepthOk(aDepth))
		{
			return nullptr;
		}
		auto model = std::make_unique<Model>();
		bool nullObject = false;
		int id = 0;
		int vertexType = 0;
		if (!Flag(nullObject, "null-object flag") || !Int(id, "model id") || !Int(vertexType, "vertex type"))
		{
			return nullptr;
		}
		if (!nullObject && GetVertexTypeElements(vertexType).empty())
		{
			Fail("unknown vertex type " + std::to_string(vertexType));
			return nullptr;
		}
		model->SetIsNullObject(nullObject);
		model->SetModelID(id);
		model->SetVertexType(vertexType);
		GrowingArray<Gpu::InputElement> layout(10, 10);
		BuildInputLayoutDesc(vertexType, layout);
		model->SetInputLayoutDesc(std::span<const Gpu::InputElement>(layout.begin(), layout.end()));

		int indexCount = 0;
		int indexSize = 0;
		int indexFormat = 0;
		if (!Size(indexCount, "index count") || !Size(indexSize, "index data size") ||
		    !Int(indexFormat, "index format"))
		{
			return nullptr;
		}
		if (!nullObject && indexFormat != Model::ourIndexFormatR16 && indexFormat != Model::ourIndexFormatR32)
		{
			Fail("unsupported index format " + std::to_string(indexFormat));
			return nullptr;
		}
		const int indexBytes = indexFormat == Model::ourIndexFormatR16 ? 2 : 4;
		if (!nullObject && static_cast<int64_t>(indexCount) * indexBytes > indexSize)
		{
			Fail(std::to_string(indexCount) + " indices do not fit " + std::to_string(indexSize) + " bytes");
			return nullptr;
		}
		const size_t indexOffset = myOffset;
		const uint8_t* indexData = Take(indexSize, "index data");
		if (indexData == nullptr)
		{
			return nullptr;
		}
		model->SetIndexData(indexCount, indexFormat, indexData, indexSize);

		int vertexCount = 0;
		int vertexSize = 0;
		int stride = 0;
		int secondType = 0;
		if (!Size(vertexCount, "vertex count") || !Size(vertexSize, "vertex data size") ||
		    !Size(stride, "vertex stride") || !Int(secondType, "second vertex type"))
		{
			return nullptr;
		}
		if (secondType != vertexType)
		{
			Fail("vertex types " + std::to_string(vertexType) + " and " + std::to_string(secondType) +
			     " differ");
			return nullptr;
		}
		if (!nullObject && stride < GetVertexTypeStride(vertexType))
		{
			// The layout's elements would be read past each vertex, and past the buffer's end.
			Fail("vertex stride " + std::to_string(stride) + " is less than the " +
			     std::to_string(GetVertexTypeStride(vertexType)) + " bytes of vertex type " +
			     std::to_string(vertexType));
			return nullptr;
		}
		if (!nullObject && static_cast<int64_t>(vertexCount) * stride > vertexSize)
		{
			Fail(std::to_string(vertexCount) + " vertices do not fit " + std::to_string(vertexSize) +
			     " bytes");
			return nullptr;
		}
		if (!nullObject && !IndicesInRange(indexData, indexOffset, indexCount, indexBytes, vertexCount))
		{
			return nullptr;
		}
		const uint8_t* vertexData = Take(vertexSize, "vertex data");
		if (vertexData == nullptr)
		{
			return nullptr;
		}
		model->SetVertexData(vertexCount, stride, vertexData, vertexSize);

		std::string firstName;
		std::string techniqueName;
		std::string thirdName;
		if (!String(firstName, "first name") || !String(techniqueName, "technique name") ||
		    !String(thirdName, "third name"))
		{
			return nullptr;
		}
		model->SetNames(firstName, techniqueName, thirdName);

		if (!ReadSurfaces(*model, indexCount) || !ReadAnimationData(model->GetAnimationData(), aDepth))
		{
			return nullptr;
		}
		int childCount = 0;
		if (!ArrayCount(childCount, ourMinModelBytes, "child model count"))
		{
			return nullptr;
		}
		for (int child = 0; child < childCount; ++child)
		{
			std::unique_ptr<Model> childModel = ReadModel(aDepth + 1);
			if (!childModel)
			{
				return nullptr;
			}
			model->AddChildModel(childModel.release());
		}
		return model;
	}

	bool ReadSurfaces(Model& aModel, int anIndexCount)
	{
		int surfaceCount = 0;
		if (!ArrayCount(surfaceCount, ourMinSurfaceBytes, "surface count"))
		{
			return false;
		}
		for (int index = 0; index < surfaceCount; ++index)
		{
			int values[5];
			if (!Raw(values, sizeof(values), "surface"))
			{
				return false;
			}
			const int count = values[0];
			const int start = values[1];
			if (count < 0 || start < 0 || static_cast<int64_t>(start) + count > anIndexCount)
			{
				return Fail("surface indices " + std::to_string(start) + "+" + std::to_string(count) +
				            " lie outside the " + std::to_string(anIndexCount) + " indices");
			}
			Surface surface;
			surface.SetIndexCount(count);
			surface.SetStartIndex(start);
			surface.SetReservedValues(values[2], values[3]);
			switch (values[4])
			{
			case ourTopologyLineList:
				surface.SetPrimitiveTopology(Gpu::PrimitiveTopology::LineList);
				break;
			case ourTopologyTriangleList:
				surface.SetPrimitiveTopology(Gpu::PrimitiveTopology::TriangleList);
				break;
			case ourTopologyTriangleStrip:
				surface.SetPrimitiveTopology(Gpu::PrimitiveTopology::TriangleStrip);
				break;
			default:
				return Fail("unsupported primitive topology " + std::to_string(values[4]));
			}
			int textureCount = 0;
			if (!Count(textureCount, ourMinTextureBytes, "texture count"))
			{
				return false;
			}
			for (int texture = 0; texture < textureCount; ++texture)
			{
				AlTextureBinding binding;
				binding.myModel = &aModel;
				binding.mySurface = index;
				if (!String(binding.myPath, "texture path") ||
				    !String(binding.myVariableName, "texture variable name") ||
				    !Flag(binding.mySRGBFlag, "sRGB flag"))
				{
					return false;
				}
				myBindings.push_back(std::move(binding));
			}
			aModel.GetSurfaces().Add(surface);
		}
		return true;
	}

	bool ReadAnimationData(ModelAnimationData& aData, int aDepth)
	{
		int count = 0;
		if (!Count(count, ourMinTransformationBytes, "transformation record count"))
		{
			return false;
		}
		for (int index = 0; index < count; ++index)
		{
			ModelTransformationRecord record;
			record.myTransformation = ReadTransformation(aDepth + 1);
			Matrix44<float> matrix;
			if (!record.myTransformation || !Matrix(matrix, "transformation record matrix"))
			{
				return false;
			}
			record.myTransformation->SetOrientation(matrix);
			aData.myTransformationRecords.push_back(std::move(record));
		}
		if (!Count(count, ourMinNamedRecordBytes, "named record count"))
		{
			return false;
		}
		for (int index = 0; index < count; ++index)
		{
			ModelNamedRecord record;
			int value = 0;
			if (!String(record.myName, "named record") || !Int(value, "named record") ||
			    !Int(record.myFirst, "named record") || !Int(record.mySecond, "named record"))
			{
				return false;
			}
			if (value < 0 || value > std::numeric_limits<unsigned short>::max())
			{
				return Fail("named record value " + std::to_string(value) + " exceeds 16 bits");
			}
			record.myValue = static_cast<unsigned short>(value);
			record.myTransformation = ReadTransformation(aDepth + 1);
			Matrix44<float> matrix;
			if (!record.myTransformation || !Matrix(matrix, "named record matrix"))
			{
				return false;
			}
			record.myTransformation->SetOrientation(matrix);
			aData.myNamedRecords.push_back(std::move(record));
		}
		if (!Count(count, ourMinMatrixRecordBytes, "matrix record count"))
		{
			return false;
		}
		for (int index = 0; index < count; ++index)
		{
			ModelMatrixRecord record;
			int valueCount = 0;
			if (!Matrix(record.myMatrices[0], "matrix record") ||
			    !Matrix(record.myMatrices[1], "matrix record") ||
			    !Matrix(record.myMatrices[2], "matrix record") ||
			    !Count(valueCount, sizeof(int), "matrix record value count"))
			{
				return false;
			}
			record.myValues.resize(static_cast<size_t>(valueCount));
			Raw(record.myValues.data(), record.myValues.size() * sizeof(int), "matrix record values");
			aData.myMatrixRecords.push_back(std::move(record));
		}
		if (!Count(count, sizeof(int), "integer count"))
		{
			return false;
		}
		aData.myIntegers.resize(static_cast<size_t>(count));
		return Raw(aData.myIntegers.data(), aData.myIntegers.size() * sizeof(int), "integers");
	}

	std::span<const uint8_t> myBytes;
	std::vector<AlTextureBinding>& myBindings;
	std::string& myError;
	size_t myOffset = 0;
	int myVersion = 0;
};

class Writer
{
public:
	explicit Writer(std::vector<uint8_t>& someBytes) : myBytes(someBytes) {}

	void Raw(const void* aSource, size_t aSize)
	{
		if (aSize > 0)
		{
			const uint8_t* bytes = static_cast<const uint8_t*>(aSource);
			myBytes.insert(myBytes.end(), bytes, bytes + aSize);
		}
	}
	void Int(int aValue) { Raw(&aValue, sizeof(aValue)); }
	void Float(float aValue) { Raw(&aValue, sizeof(aValue)); }
	void Double(double aValue) { Raw(&aValue, sizeof(aValue)); }
	void Size(size_t aSize) { Int(static_cast<int>(aSize)); }
	void String(const std::string& aString)
	{
		Size(aString.size());
		Raw(aString.data(), aString.size());
	}
	void Matrix(const Matrix44<float>& aMatrix) { Raw(aMatrix.myMatrix, sizeof(aMatrix.myMatrix)); }

	void Node(const ModelNode& aNode)
	{
		const Model* model = aNode.GetModel();
		Int(model != nullptr ? 1 : 0);
		if (model != nullptr)
		{
			ModelBlock(*model);
		}
		const TransformationNode* transformation = aNode.GetTransformation();
		const TransformationNode fallback;
		TransformationBlock(transformation != nullptr ? *transformation : fallback);
		Matrix(transformation != nullptr ? transformation->GetOrientation() : fallback.GetOrientation());
		String(aNode.GetName());
		Int(aNode.GetChildren().Count());
		for (const ModelNode* child : aNode.GetChildren())
		{
			Node(*child);
		}
	}

	void TransformationBlock(const TransformationNode& aNode)
	{
		Int(aNode.GetType());
		if (aNode.GetType() == TransformationNode_Hierarchy)
		{
			const auto* hierarchy = dynamic_cast<const TransformationNodeHierarchy*>(&aNode);
			const int count = hierarchy != nullptr ? hierarchy->GetChildCount() : 0;
			Int(count);
			for (int index = 0; index < count; ++index)
			{
				TransformationBlock(hierarchy->GetChild(index));
				Matrix(hierarchy->GetChild(index).GetOrientation());
			}
		}
		else if (aNode.GetType() == TransformationNode_Curves)
		{
			const TransformationNodeCurves fallback;
			const auto* found = dynamic_cast<const TransformationNodeCurves*>(&aNode);
			const TransformationNodeCurves& curves = found != nullptr ? *found : fallback;
			Int(curves.GetFirstParameter());
			Float(curves.GetSecondParameter());
			Float(curves.GetThirdParameter());
			Int(curves.GetFourthParameter());
			for (int slot = 0; slot < TransformationNodeCurves::CURVE_SLOT_COUNT; ++slot)
			{
				const AnimationCurve* curve = curves.GetCurve(slot);
				Int(curve != nullptr ? 1 : 0);
				if (curve != nullptr)
				{
					Double(curve->GetFirstParameter());
					Double(curve->GetSecondParameter());
					Size(curve->GetKeys().size());
					for (const AnimationKey& key : curve->GetKeys())
					{
						Double(key.myTime);
						Double(key.myValue);
					}
				}
			}
			const Vector3<float>& axis = curves.GetRotationAxis();
			const Vector3<float>& translation = curves.GetTranslation();
			const float values[7] = {axis.x,        axis.y,        axis.z,           translation.x,
			                         translation.y, translation.z, curves.GetAngle()};
			Raw(values, sizeof(values));
		}
	}

	void ModelBlock(const Model& aModel)
	{
		Int(aModel.IsNullObject() ? 1 : 0);
		Int(aModel.GetModelID());
		Int(aModel.GetVertexType());
		Int(aModel.GetIndexCount());
		Size(aModel.GetIndexData().size());
		Int(aModel.GetIndexFormat());
		Raw(aModel.GetIndexData().data(), aModel.GetIndexData().size());
		Int(aModel.GetVertexCount());
		Size(aModel.GetVertexData().size());
		Int(aModel.GetVertexStride());
		Int(aModel.GetVertexType());
		Raw(aModel.GetVertexData().data(), aModel.GetVertexData().size());
		String(aModel.GetFirstName());
		String(aModel.GetTechniqueName());
		String(aModel.GetThirdName());

		Int(aModel.GetSurfaces().Count());
		for (const Surface& surface : aModel.GetSurfaces())
		{
			Int(surface.GetIndexCount());
			Int(surface.GetStartIndex());
			Int(surface.GetReservedValue());
			Int(surface.GetSecondReservedValue());
			Int(TopologyToFile(surface.GetPrimitiveTopology()));
			Int(surface.GetTextureCount());
			for (int texture = 0; texture < surface.GetTextureCount(); ++texture)
			{
				String(surface.GetTextureFileName(texture));
				String(surface.GetTextureVariableName(texture));
				Int(surface.GetTextureSRGBFlag(texture) ? 1 : 0);
			}
		}

		const ModelAnimationData& data = aModel.GetAnimationData();
		Size(data.myTransformationRecords.size());
		for (const ModelTransformationRecord& record : data.myTransformationRecords)
		{
			RecordTransformation(record.myTransformation.get());
		}
		Size(data.myNamedRecords.size());
		for (const ModelNamedRecord& record : data.myNamedRecords)
		{
			String(record.myName);
			Int(record.myValue);
			Int(record.myFirst);
			Int(record.mySecond);
			RecordTransformation(record.myTransformation.get());
		}
		Size(data.myMatrixRecords.size());
		for (const ModelMatrixRecord& record : data.myMatrixRecords)
		{
			for (const Matrix44<float>& matrix : record.myMatrices)
			{
				Matrix(matrix);
			}
			Size(record.myValues.size());
			Raw(record.myValues.data(), record.myValues.size() * sizeof(int));
		}
		Size(data.myIntegers.size());
		Raw(data.myIntegers.data(), data.myIntegers.size() * sizeof(int));

		Int(aModel.GetChildModels().Count());
		for (const Model* child : aModel.GetChildModels())
		{
			ModelBlock(*child);
		}
	}

	// A record without a transformation is written as a fixed identity one.
	void RecordTransformation(const TransformationNode* aNode)
	{
		const TransformationNode fallback;
		TransformationBlock(aNode != nullptr ? *aNode : fallback);
		Matrix(aNode != nullptr ? aNode->GetOrientation() : fallback.GetOrientation());
	}

private:
	std::vector<uint8_t>& myBytes;
};
} // namespace

std::unique_ptr<ModelNode> AlFile::Parse(std::span<const uint8_t> someBytes,
                                         std::vector<AlTextureBinding>& someBindings, std::string& anError)
{
	anError.clear();
	someBindings.clear();
	Reader reader(someBytes, someBindings, anError);
	std::unique_ptr<ModelNode> root = reader.ReadFile();
	if (!root)
	{
		someBindings.clear();
	}
	return root;
}

void AlFile::Encode(const ModelNode& aRoot, std::vector<uint8_t>& someBytes)
{
	someBytes.clear();
	Writer writer(someBytes);
	writer.Int(ourVersion);
	writer.Node(aRoot);
}
} // namespace Zeph
