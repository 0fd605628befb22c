#include "model/VertexTypes.h"

#include <array>
#include <string_view>

namespace Zeph
{
namespace
{
constexpr VertexElement ourPosition = {"POSITION", Dds::Format::R32G32B32_FLOAT, 12};
constexpr VertexElement ourNormal = {"NORMAL", Dds::Format::R32G32B32_FLOAT, 12};
constexpr VertexElement ourTangent = {"TANGENT", Dds::Format::R32G32B32_FLOAT, 12};
constexpr VertexElement ourBinormal = {"BINORMAL", Dds::Format::R32G32B32_FLOAT, 12};
constexpr VertexElement ourColor = {"COLOR", Dds::Format::R32G32B32A32_FLOAT, 16};
constexpr VertexElement ourTexCoord = {"TEXCOORD", Dds::Format::R32G32_FLOAT, 8};
constexpr VertexElement ourWeights = {"WEIGHTS", Dds::Format::R8G8B8A8_UNORM, 4};
constexpr VertexElement ourBones = {"BONES", Dds::Format::R8G8B8A8_UINT, 4};

constexpr VertexElement ourType0[] = {ourPosition, ourTexCoord};
constexpr VertexElement ourType1[] = {ourPosition, ourColor, ourTexCoord};
constexpr VertexElement ourType2[] = {ourPosition, ourNormal, ourTexCoord};
constexpr VertexElement ourType3[] = {ourPosition, ourNormal, ourTexCoord, ourTangent};
constexpr VertexElement ourType4[] = {ourPosition, ourNormal, ourTexCoord, ourTangent, ourBinormal};
constexpr VertexElement ourType5[] = {ourPosition, ourWeights, ourBones, ourNormal, ourTexCoord, ourTangent};
constexpr VertexElement ourType6[] = {ourPosition, ourWeights, ourBones,   ourNormal,
                                      ourTexCoord, ourTangent, ourBinormal};
constexpr VertexElement ourType7[] = {ourPosition, ourWeights, ourBones, ourNormal, ourTexCoord};

constexpr std::array<std::span<const VertexElement>, VERTEX_TYPE_COUNT> ourVertexTypes = {
    ourType0, ourType1, ourType2, ourType3, ourType4, ourType5, ourType6, ourType7,
};
} // namespace

std::span<const VertexElement> GetVertexTypeElements(int aVertexType)
{
	if (aVertexType < 0 || aVertexType >= VERTEX_TYPE_COUNT)
	{
		return {};
	}
	return ourVertexTypes[static_cast<size_t>(aVertexType)];
}

int GetVertexTypeStride(int aVertexType)
{
	int stride = 0;
	for (const VertexElement& element : GetVertexTypeElements(aVertexType))
	{
		stride += element.mySize;
	}
	return stride;
}

bool HasBones(int aVertexType)
{
	for (const VertexElement& element : GetVertexTypeElements(aVertexType))
	{
		if (std::string_view(element.mySemanticName) == ourBones.mySemanticName)
		{
			return true;
		}
	}
	return false;
}

void BuildInputLayoutDesc(int aVertexType, GrowingArray<Gpu::InputElement>& someElements)
{
	someElements.RemoveAll();
	uint32_t offset = 0;
	for (const VertexElement& element : GetVertexTypeElements(aVertexType))
	{
		someElements.Add({element.mySemanticName, 0, element.myFormat, 0, offset});
		offset += static_cast<uint32_t>(element.mySize);
	}
}
} // namespace Zeph
