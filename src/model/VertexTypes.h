#pragma once
// VertexTypes: the vertex layouts the engine draws. A model's vertex type picks its
// layout here and its effect in ShaderFiles (the same number is the row there).
//
//   GrowingArray<Gpu::InputElement> layout(10, 10);
//   Zeph::BuildInputLayoutDesc(Zeph::VERTEX_TYPE_POS_NORM_UV_TAN_BI, layout);
//   int stride = Zeph::GetVertexTypeStride(Zeph::VERTEX_TYPE_POS_NORM_UV_TAN_BI);   // 56
//
// Every element has semantic index 0 and input slot 0 and sits right after the one
// before it.
#include <span>

#include "core/GrowingArray.h"
#include "platform/dds/Format.h"
#include "platform/gpu/InputLayout.h"

namespace Zeph
{
enum VertexTypes
{
	VERTEX_TYPE_POS_UV = 0,
	VERTEX_TYPE_POS_COL_UV = 1,
	VERTEX_TYPE_POS_NORM_UV = 2,
	VERTEX_TYPE_POS_NORM_UV_TAN = 3,
	VERTEX_TYPE_POS_NORM_UV_TAN_BI = 4,
	VERTEX_TYPE_POS_WEIGHT_BONES_NORM_UV_TAN = 5,
	VERTEX_TYPE_POS_WEIGHT_BONES_NORM_UV_TAN_BI = 6,
	VERTEX_TYPE_POS_WEIGHT_BONES_NORM_UV = 7,
	VERTEX_TYPE_COUNT = 8,
};

struct VertexElement
{
	const char* mySemanticName;
	Dds::Format myFormat;
	int mySize; // bytes
};

// The elements of a vertex type in order; empty for a number that is no vertex type.
std::span<const VertexElement> GetVertexTypeElements(int aVertexType);
// The sum of the element sizes; 0 for a number that is no vertex type.
int GetVertexTypeStride(int aVertexType);
// Whether the layout carries bone indices ("BONES"): the renderer draws such models as
// skinned ones (types 5, 6 and 7).
bool HasBones(int aVertexType);
// Replaces the contents of someElements with the type's layout description (left
// empty for a number that is no vertex type).
void BuildInputLayoutDesc(int aVertexType, GrowingArray<Gpu::InputElement>& someElements);
} // namespace Zeph
