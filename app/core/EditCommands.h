#pragma once
// The undo steps of the document. Each stores whole object states (and the selection before
// and after) and applies them through the document, so undo and redo give back exactly the
// values the designer saw.
#include <QElapsedTimer>
#include <QUndoCommand>

#include "core/Document.h"

namespace LumoraEditor
{
// One object's values changed. Merging commands (sliders, spin boxes) of the same object and
// name within ourMergeMs of each other become one step that keeps the first before-state and
// the latest after-state.
class StateCommand : public QUndoCommand
{
public:
	static constexpr int ourMergeId = 1;
	static constexpr qint64 ourMergeMs = 1000;

	StateCommand(Document& aDocument, ObjectId anId, const ObjectState& aBefore, const ObjectState& anAfter,
	             const QString& aName, bool aMergingFlag);
	void undo() override;
	void redo() override;
	int id() const override { return myMergingFlag ? ourMergeId : -1; }
	bool mergeWith(const QUndoCommand* anOther) override;

private:
	Document& myDocument;
	ObjectId myId;
	ObjectState myBefore;
	ObjectState myAfter;
	ObjectId mySelectedBefore;
	bool myMergingFlag;
	QElapsedTimer myLastChange;
};

class AddCommand : public QUndoCommand
{
public:
	AddCommand(Document& aDocument, ObjectId anId, const ObjectState& aState, const QString& aName);
	void undo() override;
	void redo() override;

private:
	Document& myDocument;
	ObjectId myId;
	ObjectState myState;
	ObjectId mySelectedBefore;
};

class RemoveCommand : public QUndoCommand
{
public:
	RemoveCommand(Document& aDocument, ObjectId anId, int anIndex, const ObjectState& aState,
	              const QString& aName);
	void undo() override;
	void redo() override;

private:
	Document& myDocument;
	ObjectId myId;
	int myIndex;
	ObjectState myState;
	ObjectId mySelectedBefore;
};
} // namespace LumoraEditor
