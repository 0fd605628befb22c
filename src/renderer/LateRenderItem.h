#pragma once
// LateRenderItem: one overlay object drawn over the finished frame (gizmos, room
// boxes, texts), kind first. The renderer's late list holds them for one frame.
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
};
} // namespace Zeph
