#include "core/EditCommands.h"

namespace LumoraEditor
{
StateCommand::StateCommand(Document& aDocument, ObjectId anId, const ObjectState& aBefore,
                           const ObjectState& anAfter, const QString& aName, bool aMergingFlag)
    : QUndoCommand(aName), myDocument(aDocument), myId(anId), myBefore(aBefore), myAfter(anAfter),
      mySelectedBefore(aDocument.GetSelected()), myMergingFlag(aMergingFlag)
{
	myLastChange.start();
}

void StateCommand::undo()
{
	myDocument.ApplyState(myId, myBefore);
	myDocument.SetSelection(mySelectedBefore);
}

void StateCommand::redo()
{
	myDocument.ApplyState(myId, myAfter);
	// The edited object is the selection afterwards, whatever was selected before.
	myDocument.SetSelection(myId);
}

bool StateCommand::mergeWith(const QUndoCommand* anOther)
{
	const auto* other = static_cast<const StateCommand*>(anOther);
	if (!myMergingFlag || !other->myMergingFlag || other->myId != myId || other->text() != text() ||
	    myLastChange.elapsed() > ourMergeMs)
	{
		return false;
	}
	// The later command's values survive: redo after the merge must restore the last state,
	// not one in between.
	myAfter = other->myAfter;
	myLastChange.restart();
	setObsolete(myAfter == myBefore);
	return true;
}

AddCommand::AddCommand(Document& aDocument, ObjectId anId, const ObjectState& aState, const QString& aName)
    : QUndoCommand(aName), myDocument(aDocument), myId(anId), myState(aState),
      mySelectedBefore(aDocument.GetSelected())
{
}

void AddCommand::undo()
{
	// Everything done after the addition has been undone, so the object is last of its kind.
	myDocument.RemoveAt(myState.myKind, myDocument.Count(myState.myKind) - 1);
	myDocument.SetSelection(mySelectedBefore);
}

void AddCommand::redo()
{
	myDocument.Append(myId, myState);
	myDocument.SetSelection(myId);
}

RemoveCommand::RemoveCommand(Document& aDocument, ObjectId anId, int anIndex, const ObjectState& aState,
                             const QString& aName)
    : QUndoCommand(aName), myDocument(aDocument), myId(anId), myIndex(anIndex), myState(aState),
      mySelectedBefore(aDocument.GetSelected())
{
}

void RemoveCommand::undo()
{
	myDocument.Restore(myState.myKind, myIndex, myId, myState);
	myDocument.SetSelection(mySelectedBefore);
}

void RemoveCommand::redo()
{
	myDocument.RemoveAt(myState.myKind, myIndex);
	myDocument.SetSelection(0);
}
} // namespace LumoraEditor
