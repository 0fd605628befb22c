#pragma once
// Document: the open level as the editor edits it. It mirrors the engine's lists of point
// lights, spot lights, decals and path nodes in the engine's order, names every object with
// an ObjectId that survives removals, owns the selection and the undo history, and is the
// only place that changes either: panels and the view ask it, it applies the change to the
// engine (EngineApi) and says what changed through its signals.
//
//   Document document(engine);
//   document.Reset(u"sample_small", objects);          // after the engine loaded the level
//   ObjectId id = document.Add(state, "Add point light"); // one undo step, selected
//   { LiveEdit drag = document.BeginLiveEdit(id, "Move"); drag.Update(moved); drag.Commit(); }
//   document.History().undo();
//
// Only the user-interface thread calls it. Selecting is not an undo step; every edit stores
// the selection before and after it and undo restores it.
#include <QObject>
#include <QString>
#include <QUndoStack>
#include <array>
#include <optional>
#include <vector>

#include "core/ObjectState.h"

namespace LumoraEditor
{
class EngineApi;
class LiveEdit;

class Document : public QObject
{
	Q_OBJECT

public:
	using ObjectLists = std::array<std::vector<ObjectState>, ourKindCount>;

	explicit Document(EngineApi& anEngine, QObject* aParent = nullptr);
	~Document() override;

	// A level the engine has just loaded: lists in the engine's order, no history, saved.
	void Reset(const QString& aLevel, const ObjectLists& someObjects);
	// No level: empty lists, no history.
	void Clear();
	const QString& GetLevel() const { return myLevel; }
	bool HasLevel() const { return !myLevel.isEmpty(); }

	int Count(Kind aKind) const { return static_cast<int>(myLists[static_cast<int>(aKind)].size()); }
	ObjectId IdAt(Kind aKind, int anIndex) const;
	// The object's place in its kind's list, or -1 when no object has the id.
	int IndexOf(ObjectId anId) const;
	const ObjectState* Find(ObjectId anId) const;

	// The selection: one object or none (0). Selecting an object makes its kind's mode the
	// editor's mode.
	ObjectId GetSelected() const { return mySelected; }
	void Select(ObjectId anId);
	void SelectAt(Kind aKind, int anIndex);
	// Lights (point and spot), path nodes or decals: what picking and the view act on.
	int GetMode() const { return myMode; }
	void SetMode(int aMode);
	static int ModeOf(Kind aKind);

	// Edits: one undo step each, named for the Edit menu. False (nothing done) when the id
	// names no object or the values are the object's already.
	bool SetState(ObjectId anId, const ObjectState& aState, const QString& aName);
	// Edits from a slider or spin box: consecutive ones on the same object with the same
	// name within a second merge into one step.
	bool SetStateMerging(ObjectId anId, const ObjectState& aState, const QString& aName);
	// Adds the object at the end of its kind's list and selects it; its id.
	ObjectId Add(const ObjectState& aState, const QString& aName);
	// Removes the object. Path nodes: only the last of the list can go (the engine's path graph
	// holds its nodes by place); false with aProblemOut set otherwise.
	bool Remove(ObjectId anId, QString* aProblemOut = nullptr);
	// A drag or a colour-dialog session: values applied to the engine as they come, one undo
	// step at Commit, the values before restored by Cancel or by the LiveEdit's end.
	LiveEdit BeginLiveEdit(ObjectId anId, const QString& aName);

	QUndoStack& History() { return myHistory; }
	bool IsModified() const { return !myHistory.isClean(); }
	void MarkSaved() { myHistory.setClean(); }

signals:
	void reset();
	void objectAdded(LumoraEditor::ObjectId anId);
	void objectRemoved(LumoraEditor::ObjectId anId, LumoraEditor::Kind aKind);
	void objectChanged(LumoraEditor::ObjectId anId);
	void selectionChanged(LumoraEditor::ObjectId anId);
	void modeChanged(int aMode);
	void modifiedChanged(bool aModifiedFlag);

private:
	friend class LiveEdit;
	friend class StateCommand;
	friend class AddCommand;
	friend class RemoveCommand;

	struct Entry
	{
		ObjectId myId = 0;
		ObjectState myState;
	};
	struct Place
	{
		Kind myKind;
		int myIndex;
	};

	std::optional<Place> Locate(ObjectId anId) const;
	// The operations the commands are made of; each applies itself to the engine.
	void ApplyState(ObjectId anId, const ObjectState& aState);
	void Append(ObjectId anId, const ObjectState& aState);
	// Removes by the engine's rule (the last moves into the place).
	void RemoveAt(Kind aKind, int anIndex);
	// Undoes RemoveAt(kind, index) of anId: appended, then swapped back into its place.
	void Restore(Kind aKind, int anIndex, ObjectId anId, const ObjectState& aState);
	void SetSelection(ObjectId anId);
	void SyncEngineSelection();
	ObjectId NewId() { return ++myLastId; }

	EngineApi& myEngine;
	QString myLevel;
	std::array<std::vector<Entry>, ourKindCount> myLists;
	ObjectId mySelected = 0;
	ObjectId myLastId = 0;
	int myMode = 0;
	QUndoStack myHistory;
};

// One live edit of one object (Document::BeginLiveEdit). Movable, not copyable; destroyed
// without Commit it cancels.
class LiveEdit
{
public:
	LiveEdit() = default;
	LiveEdit(Document& aDocument, ObjectId anId, const QString& aName);
	LiveEdit(LiveEdit&& anOther) noexcept;
	LiveEdit& operator=(LiveEdit&& anOther) noexcept;
	~LiveEdit();

	bool IsOpen() const { return myDocument != nullptr; }
	ObjectId GetId() const { return myId; }
	const ObjectState& GetBefore() const { return myBefore; }
	// Applies the values now; no undo step yet.
	void Update(const ObjectState& aState);
	// One undo step from the values before to the last update (none when they are equal).
	void Commit();
	// The values before, applied again.
	void Cancel();
	// Ends the edit leaving the object as it is, with no step (the history moved under it).
	void Abandon() { myDocument = nullptr; }

private:
	Document* myDocument = nullptr;
	ObjectId myId = 0;
	QString myName;
	ObjectState myBefore;
	ObjectState myLast;
};
} // namespace LumoraEditor
