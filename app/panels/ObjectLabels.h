#pragma once
// How panels name an object to the designer: its kind and its place in the engine's list,
// counted from 1 ("Point light 3"), a decal with its type ("Decal 2 — brick"). The place
// changes when an earlier object of the kind is deleted (the engine moves its last object
// into the gap), so labels are worked out afresh at each refresh, never stored.
#include <QString>

#include "core/ObjectState.h"

namespace LumoraEditor
{
class Document;

QString ObjectLabel(Kind aKind, int anIndex, const ObjectState& aState);
// The label of a document's object; empty when no object has the id.
QString ObjectLabel(const Document& aDocument, ObjectId anId);
// "1.250, 0.000, -3.500".
QString PositionText(const ObjectState& aState);
} // namespace LumoraEditor
