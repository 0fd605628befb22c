#pragma once
// ModelLight: a light that a model document places at a node (kind and colour).
// Owned by its ModelNode; nothing draws it yet.
#include "core/Vector4.h"

namespace Zeph
{
struct ModelLight
{
	enum Kind
	{
		POINT = 0,
		DIRECTIONAL = 1,
	};

	Kind myKind = POINT;
	Vector4<float> myColor{1.0f, 1.0f, 1.0f, 1.0f};
};
} // namespace Zeph
