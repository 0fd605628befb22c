#include "view/ViewController.h"

#include <algorithm>
#include <cmath>

#include "bridge/EngineThread.h"

namespace LumoraEditor
{
ViewController::ViewController(Document& aDocument, EngineThread& anEngine, QObject* aParent)
    : QObject(aParent), myDocument(aDocument), myEngine(anEngine)
{
	myFlyTimer.setInterval(16);
	connect(&myFlyTimer, &QTimer::timeout, this, &ViewController::FlyTick);
	// Anything that changes the scene or the selection needs frames.
	connect(&myDocument, &Document::objectChanged, this, &ViewController::RequestFrames);
	connect(&myDocument, &Document::objectAdded, this, &ViewController::RequestFrames);
	connect(&myDocument, &Document::objectRemoved, this, &ViewController::RequestFrames);
	connect(&myDocument, &Document::selectionChanged, this, &ViewController::RequestFrames);
	connect(&myDocument, &Document::reset, this, [this] { CancelDrag(); });
	// An undo or redo in the middle of a drag (Ctrl+Z with the button held) has put its own
	// values on the objects: the drag ends without a step and without putting anything back.
	connect(&myDocument.History(), &QUndoStack::indexChanged, this, [this] {
		if (myDrag.IsOpen())
		{
			myDrag.Abandon();
			myLeftFlag = false;
			myPickedFlag = false;
		}
	});
}

void ViewController::SetCamera(const CameraPlacement& aPlacement)
{
	myCamera.SetPlacement(aPlacement);
	CameraMoved();
}

void ViewController::RequestFrames()
{
	myEngine.RequestFrames();
}

void ViewController::CameraMoved()
{
	myEngine.SetCamera(myCamera.GetPlacement());
	emit cameraChanged(myCamera.GetPlacement());
}

void ViewController::FrameSelection()
{
	const ObjectState* state = myDocument.Find(myDocument.GetSelected());
	if (state == nullptr)
	{
		emit message(tr("Nothing selected to frame"));
		return;
	}
	// Far enough to see a light's reach, near enough to see a node.
	const float distance =
	    HasFalloff(state->myKind) ? std::clamp(state->myFalloff * 1.5f, 3.0f, 60.0f) : 5.0f;
	myCamera.Frame(state->myPosition, distance);
	CameraMoved();
}

void ViewController::GoToStartView()
{
	myCamera.SetPlacement(myStartView);
	CameraMoved();
}

void ViewController::Nudge(float aRight, float anUp, float aForward)
{
	const ObjectId id = myDocument.GetSelected();
	const ObjectState* state = myDocument.Find(id);
	if (state == nullptr || myDrag.IsOpen())
	{
		return;
	}
	const CameraPlacement& camera = myCamera.GetPlacement();
	// Along the ground as the camera faces it: the forward and right axes without their height.
	const float yawSin = std::sin(camera.myYaw);
	const float yawCos = std::cos(camera.myYaw);
	ObjectState moved = *state;
	moved.myPosition[0] += aRight * yawCos - aForward * yawSin;
	moved.myPosition[1] += anUp;
	moved.myPosition[2] += aRight * yawSin + aForward * yawCos;
	myDocument.SetStateMerging(id, moved, tr("Nudge %1").arg(QString::fromUtf8(KindName(state->myKind))));
}

void ViewController::CancelDrag()
{
	myDrag.Cancel();
	myLeftFlag = false;
	myPickedFlag = false;
}

DragAxis ViewController::HeldAxis() const
{
	for (int axis = 0; axis < 3; ++axis)
	{
		if (myAxisHeld[axis])
		{
			return axis;
		}
	}
	return -1;
}

void ViewController::MousePress(Qt::MouseButton aButton, QPointF aPosition,
                                Qt::KeyboardModifiers someModifiers)
{
	myLastMouse = aPosition;
	if (aButton == Qt::RightButton)
	{
		myLookFlag = true;
		return;
	}
	if (aButton != Qt::LeftButton || myDrag.IsOpen())
	{
		return;
	}
	myLeftFlag = true;
	myPressPosition = aPosition;
	myPressModifiers = someModifiers;
	myPickedFlag = false;
	myPickAnsweredFlag = false;
	myReleasedBeforePickFlag = false;
	const int pickId = ++myPickId;
	myEngine.Pick(static_cast<float>(aPosition.x()), static_cast<float>(aPosition.y()),
	              [this, pickId](const EngineThread::PickHits& someHits) { OnPicked(pickId, someHits); });
}

int ViewController::SelectionInHits() const
{
	const ObjectId selected = myDocument.GetSelected();
	for (size_t hit = 0; hit < myHits.size(); ++hit)
	{
		if (selected != 0 && myDocument.IdAt(myHits[hit].first, myHits[hit].second) == selected)
		{
			return static_cast<int>(hit);
		}
	}
	return -1;
}

void ViewController::FinishClick()
{
	const int kept = SelectionInHits();
	if (!myKeptSelectionFlag || kept < 0 || myHits.size() < 2)
	{
		return;
	}
	const auto& next = myHits[(static_cast<size_t>(kept) + 1) % myHits.size()];
	myDocument.SelectAt(next.first, next.second);
}

void ViewController::OnPicked(int aPickId, const std::vector<std::pair<Kind, int>>& someHits)
{
	if (aPickId != myPickId)
	{
		return;
	}
	myPickAnsweredFlag = true;
	myHits = someHits;
	myKeptSelectionFlag = SelectionInHits() >= 0;
	if (someHits.empty())
	{
		myDocument.Select(0);
	}
	else if (!myKeptSelectionFlag)
	{
		myDocument.SelectAt(someHits.front().first, someHits.front().second);
	}
	myPickedFlag = !someHits.empty() && myDocument.GetSelected() != 0;
	if (myReleasedBeforePickFlag)
	{
		myReleasedBeforePickFlag = false;
		if (myPickedFlag && QLineF(myPressPosition, myReleasePosition).length() > ourDragThreshold)
		{
			// A quick drag, over before the pick came back (a slow frame): made now, in one step.
			myLeftFlag = true;
			StartDrag(myPressPosition, myPressModifiers.testFlag(Qt::ControlModifier));
			MouseMove(myReleasePosition, myPressModifiers);
			myLeftFlag = false;
			myDrag.Commit();
		}
		else
		{
			FinishClick();
		}
		return;
	}
	// The mouse may have moved past the threshold while the pick was on its way: the drag
	// starts from where the button went down, so the object does not lag behind the cursor.
	if (myLeftFlag && myPickedFlag && !myDrag.IsOpen() &&
	    QLineF(myPressPosition, myLastMouse).length() > ourDragThreshold)
	{
		StartDrag(myPressPosition, myPressModifiers.testFlag(Qt::ControlModifier));
		MouseMove(myLastMouse, myPressModifiers);
	}
}

void ViewController::StartDrag(QPointF aPosition, bool aTurnFlag)
{
	const ObjectId id = myDocument.GetSelected();
	const ObjectState* state = myDocument.Find(id);
	if (state == nullptr)
	{
		return;
	}
	myTurnFlag = aTurnFlag && HasDirection(state->myKind);
	const QString what = QString::fromUtf8(KindName(state->myKind));
	myDrag = myDocument.BeginLiveEdit(id, myTurnFlag ? tr("Turn %1").arg(what) : tr("Move %1").arg(what));
	myDragOrigin = aPosition;
}

void ViewController::MouseMove(QPointF aPosition, Qt::KeyboardModifiers someModifiers)
{
	const QPointF delta = aPosition - myLastMouse;
	myLastMouse = aPosition;
	if (myLookFlag)
	{
		myCamera.Look(static_cast<float>(delta.x()), static_cast<float>(delta.y()));
		CameraMoved();
		return;
	}
	if (!myLeftFlag)
	{
		return;
	}
	if (!myDrag.IsOpen())
	{
		if (myPickedFlag && QLineF(myPressPosition, aPosition).length() > ourDragThreshold)
		{
			StartDrag(myPressPosition, someModifiers.testFlag(Qt::ControlModifier));
		}
		if (!myDrag.IsOpen())
		{
			return;
		}
	}
	const QPointF total = aPosition - myDragOrigin;
	ObjectState state = myDrag.GetBefore();
	if (myTurnFlag)
	{
		state.myDirection = DragTurn(myCamera.GetPlacement(), state.myDirection,
		                             static_cast<float>(total.x()), static_cast<float>(total.y()));
	}
	else
	{
		// The axis is read on every move: holding or letting go of X/Y/Z mid-drag switches from
		// the drag's start, so the object does not jump.
		state.myPosition = DragMove(myCamera.GetPlacement(), myViewSize.height(), state.myPosition,
		                            static_cast<float>(total.x()), static_cast<float>(total.y()), HeldAxis());
	}
	myDrag.Update(state);
}

void ViewController::MouseRelease(Qt::MouseButton aButton, QPointF aPosition)
{
	if (aButton == Qt::RightButton)
	{
		myLookFlag = false;
		return;
	}
	if (aButton != Qt::LeftButton)
	{
		return;
	}
	myLeftFlag = false;
	if (myDrag.IsOpen())
	{
		myDrag.Commit();
	}
	else if (!myPickAnsweredFlag)
	{
		myReleasedBeforePickFlag = true;
		myReleasePosition = aPosition;
	}
	else if (QLineF(myPressPosition, aPosition).length() <= ourDragThreshold)
	{
		FinishClick();
	}
}

void ViewController::Wheel(float aSteps, Qt::KeyboardModifiers someModifiers)
{
	myCamera.Wheel(aSteps, someModifiers.testFlag(Qt::ShiftModifier));
	CameraMoved();
}

bool ViewController::KeyPress(int aKey, Qt::KeyboardModifiers someModifiers, bool anAutoRepeatFlag)
{
	const bool fastFlag = someModifiers.testFlag(Qt::ShiftModifier);
	myKeys.myFastFlag = fastFlag;
	// Keys with Ctrl or Alt belong to the window's shortcuts.
	if (someModifiers & (Qt::ControlModifier | Qt::AltModifier))
	{
		return false;
	}
	const float nudge = ourNudgeStep * (fastFlag ? 10.0f : 1.0f);
	bool* flyFlag = nullptr;
	switch (aKey)
	{
	case Qt::Key_W:
		flyFlag = &myKeys.myForwardFlag;
		break;
	case Qt::Key_S:
		flyFlag = &myKeys.myBackFlag;
		break;
	case Qt::Key_A:
		flyFlag = &myKeys.myLeftFlag;
		break;
	case Qt::Key_D:
		flyFlag = &myKeys.myRightFlag;
		break;
	case Qt::Key_Q:
		flyFlag = &myKeys.myDownFlag;
		break;
	case Qt::Key_E:
		flyFlag = &myKeys.myUpFlag;
		break;
	case Qt::Key_X:
		myAxisHeld[0] = true;
		return true;
	case Qt::Key_Y:
		myAxisHeld[1] = true;
		return true;
	case Qt::Key_Z:
		myAxisHeld[2] = true;
		return true;
	case Qt::Key_Shift:
		return true;
	case Qt::Key_Left:
		Nudge(-nudge, 0.0f, 0.0f);
		return true;
	case Qt::Key_Right:
		Nudge(nudge, 0.0f, 0.0f);
		return true;
	case Qt::Key_Up:
		Nudge(0.0f, 0.0f, nudge);
		return true;
	case Qt::Key_Down:
		Nudge(0.0f, 0.0f, -nudge);
		return true;
	case Qt::Key_PageUp:
		Nudge(0.0f, nudge, 0.0f);
		return true;
	case Qt::Key_PageDown:
		Nudge(0.0f, -nudge, 0.0f);
		return true;
	case Qt::Key_F:
		FrameSelection();
		return true;
	case Qt::Key_Home:
		GoToStartView();
		return true;
	case Qt::Key_1:
		myDocument.SetMode(0);
		return true;
	case Qt::Key_2:
		myDocument.SetMode(1);
		return true;
	case Qt::Key_3:
		myDocument.SetMode(2);
		return true;
	case Qt::Key_Escape:
		// One step back: a drag, else the selection.
		if (myDrag.IsOpen())
		{
			CancelDrag();
		}
		else
		{
			myDocument.Select(0);
		}
		return true;
	default:
		return false;
	}
	if (!anAutoRepeatFlag)
	{
		*flyFlag = true;
		if (!myFlyTimer.isActive())
		{
			myFlyClock.start();
			myFlyTimer.start();
		}
	}
	return true;
}

bool ViewController::KeyRelease(int aKey)
{
	switch (aKey)
	{
	case Qt::Key_W:
		myKeys.myForwardFlag = false;
		break;
	case Qt::Key_S:
		myKeys.myBackFlag = false;
		break;
	case Qt::Key_A:
		myKeys.myLeftFlag = false;
		break;
	case Qt::Key_D:
		myKeys.myRightFlag = false;
		break;
	case Qt::Key_Q:
		myKeys.myDownFlag = false;
		break;
	case Qt::Key_E:
		myKeys.myUpFlag = false;
		break;
	case Qt::Key_X:
		myAxisHeld[0] = false;
		break;
	case Qt::Key_Y:
		myAxisHeld[1] = false;
		break;
	case Qt::Key_Z:
		myAxisHeld[2] = false;
		break;
	case Qt::Key_Shift:
		myKeys.myFastFlag = false;
		break;
	default:
		return false;
	}
	return true;
}

void ViewController::FocusLost()
{
	// Keys released while the window was away never arrive: forget every held key.
	myKeys = FlyKeys();
	std::fill(std::begin(myAxisHeld), std::end(myAxisHeld), false);
	myFlyTimer.stop();
	myLookFlag = false;
	CancelDrag();
}

void ViewController::FlyTick()
{
	if (!myKeys.AnyMove())
	{
		myFlyTimer.stop();
		return;
	}
	const float seconds = std::min(0.1f, static_cast<float>(myFlyClock.restart()) / 1000.0f);
	myCamera.Fly(myKeys, seconds);
	CameraMoved();
}
} // namespace LumoraEditor
