#include "core/Document.h"

#include <utility>

#include "bridge/EngineApi.h"
#include "core/EditCommands.h"

namespace LumoraEditor
{
namespace
{
int Slot(Kind aKind)
{
	return static_cast<int>(aKind);
}
} // namespace

Document::Document(EngineApi& anEngine, QObject* aParent) : QObject(aParent), myEngine(anEngine)
{
	connect(&myHistory, &QUndoStack::cleanChanged, this,
	        [this](bool aCleanFlag) { emit modifiedChanged(!aCleanFlag); });
}

Document::~Document() = default;

void Document::Reset(const QString& aLevel, const ObjectLists& someObjects)
{
	myHistory.clear();
	myLevel = aLevel;
	for (int kind = 0; kind < ourKindCount; ++kind)
	{
		myLists[kind].clear();
		for (const ObjectState& state : someObjects[kind])
		{
			ObjectState kept = state;
			kept.myKind = static_cast<Kind>(kind);
			myLists[kind].push_back({NewId(), kept});
		}
	}
	mySelected = 0;
	emit reset();
	emit selectionChanged(0);
	emit modifiedChanged(false);
}

void Document::Clear()
{
	Reset(QString(), ObjectLists{});
}

ObjectId Document::IdAt(Kind aKind, int anIndex) const
{
	const auto& list = myLists[Slot(aKind)];
	return anIndex >= 0 && anIndex < static_cast<int>(list.size()) ? list[anIndex].myId : 0;
}

std::optional<Document::Place> Document::Locate(ObjectId anId) const
{
	if (anId == 0)
	{
		return std::nullopt;
	}
	for (int kind = 0; kind < ourKindCount; ++kind)
	{
		const auto& list = myLists[kind];
		for (size_t index = 0; index < list.size(); ++index)
		{
			if (list[index].myId == anId)
			{
				return Place{static_cast<Kind>(kind), static_cast<int>(index)};
			}
		}
	}
	return std::nullopt;
}

int Document::IndexOf(ObjectId anId) const
{
	const auto place = Locate(anId);
	return place ? place->myIndex : -1;
}

const ObjectState* Document::Find(ObjectId anId) const
{
	const auto place = Locate(anId);
	return place ? &myLists[Slot(place->myKind)][place->myIndex].myState : nullptr;
}

int Document::ModeOf(Kind aKind)
{
	switch (aKind)
	{
	case Kind::POINT_LIGHT:
	case Kind::SPOT_LIGHT:
		return 0;
	case Kind::PATH_NODE:
		return 1;
	case Kind::DECAL:
		return 2;
	}
	return 0;
}

void Document::Select(ObjectId anId)
{
	if (anId != 0 && !Locate(anId))
	{
		return;
	}
	SetSelection(anId);
}

void Document::SelectAt(Kind aKind, int anIndex)
{
	Select(IdAt(aKind, anIndex));
}

void Document::SetMode(int aMode)
{
	if (aMode < 0 || aMode > 2 || aMode == myMode)
	{
		return;
	}
	myMode = aMode;
	// An object of another mode is no longer what the view acts on.
	const auto place = Locate(mySelected);
	if (place && ModeOf(place->myKind) != aMode)
	{
		mySelected = 0;
		emit selectionChanged(0);
	}
	SyncEngineSelection();
	emit modeChanged(aMode);
}

void Document::SetSelection(ObjectId anId)
{
	const auto place = Locate(anId);
	if (!place)
	{
		anId = 0;
	}
	const bool modeFlag = place && ModeOf(place->myKind) != myMode;
	if (modeFlag)
	{
		myMode = ModeOf(place->myKind);
	}
	const bool changedFlag = anId != mySelected;
	mySelected = anId;
	SyncEngineSelection();
	if (modeFlag)
	{
		emit modeChanged(myMode);
	}
	if (changedFlag)
	{
		emit selectionChanged(anId);
	}
}

void Document::SyncEngineSelection()
{
	if (const auto place = Locate(mySelected))
	{
		myEngine.SelectObject(place->myKind, place->myIndex);
		return;
	}
	static constexpr Kind ourModeKinds[] = {Kind::POINT_LIGHT, Kind::PATH_NODE, Kind::DECAL};
	myEngine.SelectObject(ourModeKinds[myMode], -1);
}

bool Document::SetState(ObjectId anId, const ObjectState& aState, const QString& aName)
{
	const ObjectState* before = Find(anId);
	if (before == nullptr || *before == aState || aState.myKind != before->myKind)
	{
		return false;
	}
	myHistory.push(new StateCommand(*this, anId, *before, aState, aName, false));
	return true;
}

bool Document::SetStateMerging(ObjectId anId, const ObjectState& aState, const QString& aName)
{
	const ObjectState* before = Find(anId);
	if (before == nullptr || *before == aState || aState.myKind != before->myKind)
	{
		return false;
	}
	myHistory.push(new StateCommand(*this, anId, *before, aState, aName, true));
	return true;
}

ObjectId Document::Add(const ObjectState& aState, const QString& aName)
{
	const ObjectId id = NewId();
	myHistory.push(new AddCommand(*this, id, aState, aName));
	return id;
}

bool Document::Remove(ObjectId anId, QString* aProblemOut)
{
	const auto place = Locate(anId);
	if (!place)
	{
		return false;
	}
	if (place->myKind == Kind::PATH_NODE && place->myIndex != Count(Kind::PATH_NODE) - 1)
	{
		if (aProblemOut != nullptr)
		{
			*aProblemOut =
			    tr("Only the last path node can be deleted: the path graph's edges hold its nodes by "
			       "place. Delete the nodes after it first.");
		}
		return false;
	}
	const ObjectState state = myLists[Slot(place->myKind)][place->myIndex].myState;
	myHistory.push(new RemoveCommand(*this, anId, place->myIndex, state,
	                                 tr("Delete %1").arg(QString::fromUtf8(KindName(place->myKind)))));
	return true;
}

LiveEdit Document::BeginLiveEdit(ObjectId anId, const QString& aName)
{
	if (Find(anId) == nullptr)
	{
		return LiveEdit();
	}
	return LiveEdit(*this, anId, aName);
}

void Document::ApplyState(ObjectId anId, const ObjectState& aState)
{
	const auto place = Locate(anId);
	if (!place)
	{
		return;
	}
	Entry& entry = myLists[Slot(place->myKind)][place->myIndex];
	entry.myState = aState;
	entry.myState.myKind = place->myKind;
	myEngine.ApplyState(place->myIndex, entry.myState);
	emit objectChanged(anId);
}

void Document::Append(ObjectId anId, const ObjectState& aState)
{
	myLists[Slot(aState.myKind)].push_back({anId, aState});
	myEngine.AddObject(aState);
	emit objectAdded(anId);
}

void Document::RemoveAt(Kind aKind, int anIndex)
{
	auto& list = myLists[Slot(aKind)];
	if (anIndex < 0 || anIndex >= static_cast<int>(list.size()))
	{
		return;
	}
	const ObjectId id = list[anIndex].myId;
	myEngine.RemoveObject(aKind, anIndex);
	list[anIndex] = list.back();
	list.pop_back();
	if (mySelected == id)
	{
		mySelected = 0;
		emit selectionChanged(0);
	}
	emit objectRemoved(id, aKind);
}

void Document::Restore(Kind aKind, int anIndex, ObjectId anId, const ObjectState& aState)
{
	auto& list = myLists[Slot(aKind)];
	Append(anId, aState);
	const int last = static_cast<int>(list.size()) - 1;
	if (anIndex < 0 || anIndex >= last)
	{
		return;
	}
	// The removal moved the last object into the place: move it back to the end.
	std::swap(list[anIndex], list[last]);
	myEngine.ApplyState(anIndex, list[anIndex].myState);
	myEngine.ApplyState(last, list[last].myState);
	emit objectChanged(list[last].myId);
}

// --- LiveEdit ------------------------------------------------------------------------

LiveEdit::LiveEdit(Document& aDocument, ObjectId anId, const QString& aName)
    : myDocument(&aDocument), myId(anId), myName(aName), myBefore(*aDocument.Find(anId)), myLast(myBefore)
{
}

LiveEdit::LiveEdit(LiveEdit&& anOther) noexcept
    : myDocument(std::exchange(anOther.myDocument, nullptr)), myId(anOther.myId), myName(anOther.myName),
      myBefore(anOther.myBefore), myLast(anOther.myLast)
{
}

LiveEdit& LiveEdit::operator=(LiveEdit&& anOther) noexcept
{
	if (this != &anOther)
	{
		Cancel();
		myDocument = std::exchange(anOther.myDocument, nullptr);
		myId = anOther.myId;
		myName = anOther.myName;
		myBefore = anOther.myBefore;
		myLast = anOther.myLast;
	}
	return *this;
}

LiveEdit::~LiveEdit()
{
	Cancel();
}

void LiveEdit::Update(const ObjectState& aState)
{
	// The object may have gone meanwhile (a level closed under a drag): nothing to apply.
	if (myDocument == nullptr || myDocument->Find(myId) == nullptr)
	{
		return;
	}
	myLast = aState;
	myLast.myKind = myBefore.myKind;
	myDocument->ApplyState(myId, myLast);
}

void LiveEdit::Commit()
{
	if (myDocument == nullptr)
	{
		return;
	}
	Document* document = std::exchange(myDocument, nullptr);
	if (document->Find(myId) == nullptr || myLast == myBefore)
	{
		return;
	}
	document->myHistory.push(new StateCommand(*document, myId, myBefore, myLast, myName, false));
}

void LiveEdit::Cancel()
{
	if (myDocument == nullptr)
	{
		return;
	}
	Document* document = std::exchange(myDocument, nullptr);
	if (document->Find(myId) != nullptr && !(myLast == myBefore))
	{
		document->ApplyState(myId, myBefore);
	}
}
} // namespace LumoraEditor
