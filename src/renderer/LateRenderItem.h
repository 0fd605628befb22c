#pragma once
// LateRenderItem: one overlay object drawn over the finished frame (gizmos, room
// boxes, texts), kind first. The renderer's late list holds them for one frame.
#include "core/Vector4.h"

namespace Zeph
{
class Instance;
class Text;

struct LateRenderItem
{
	enum Kind
	{
		TEXT = 0,
		SPRITE = 1,
		INSTANCE = 3,
	};

	Kind myKind = INSTANCE;
	Instance* myInstance = nullptr; // kind INSTANCE; not owned
	Text* myText = nullptr;         // kind TEXT; not owned
	// Kind INSTANCE: the overlay effect's "Tint" while the instance draws (effects
	// without it ignore it).
	Vector4<float> myTint{1.0f, 1.0f, 1.0f, 1.0f};
};
} // namespace Zeph
