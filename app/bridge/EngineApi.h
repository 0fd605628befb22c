#pragma once
// EngineApi: what the document asks of the engine, from the user-interface thread, without
// waiting. The engine thread (EngineThread) queues each call and runs it between frames; a
// fake (tests) records them. Objects are named by kind and index in the engine's own lists,
// which the document mirrors: a removal moves the last object of its kind into the removed
// one's place, an addition appends.
#include "core/ObjectState.h"

namespace LumoraEditor
{
class EngineApi
{
public:
	virtual ~EngineApi() = default;

	// Appends an object of aState's kind with aState's values. A path node joins the node
	// before it in the list, as the engine joins a new node.
	virtual void AddObject(const ObjectState& aState) = 0;
	// Gives the object at anIndex of aState's kind aState's values.
	virtual void ApplyState(int anIndex, const ObjectState& aState) = 0;
	// Removes the object; the last object of the kind takes its place (path nodes: only the
	// last can go).
	virtual void RemoveObject(Kind aKind, int anIndex) = 0;
	// The engine's selection and mode (a kind's mode: lights, decals or path nodes). -1
	// selects nothing in that kind's mode.
	virtual void SelectObject(Kind aKind, int anIndex) = 0;
};
} // namespace LumoraEditor
