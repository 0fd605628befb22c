#pragma once
// ViewController: what the mouse and keys do in the view. The right button held looks,
// W/A/S/D/Q/E fly (Shift faster), the wheel moves along the view; a left click picks (the
// engine's picking, in device pixels) and a left drag from the picked selection moves it in
// the plane facing the camera, or along one world axis with X, Y or Z held; Ctrl+drag turns a
// spot light or decal. A drag is one undo step; Esc or losing focus puts the object back.
// Arrow keys and Page Up/Down nudge the selection (Shift: ten times as far). F frames the
// selection, Home returns to the level's start view, 1/2/3 switch the mode.
#include <QElapsedTimer>
#include <QLineF>
#include <QObject>
#include <QPointF>
#include <QSize>
#include <QTimer>
#include <utility>
#include <vector>

#include "core/Document.h"
#include "view/DragMath.h"
#include "view/FlyCamera.h"

namespace LumoraEditor
{
class EngineThread;

class ViewController : public QObject
{
	Q_OBJECT

public:
	// A press that moves less than this (device pixels) before release is a click.
	static constexpr float ourDragThreshold = 3.0f;
	static constexpr float ourNudgeStep = 0.1f;

	ViewController(Document& aDocument, EngineThread& anEngine, QObject* aParent = nullptr);

	FlyCamera& Camera() { return myCamera; }
	void SetCamera(const CameraPlacement& aPlacement);
	void SetStartView(const CameraPlacement& aPlacement) { myStartView = aPlacement; }
	void SetViewSize(QSize aDeviceSize) { myViewSize = aDeviceSize; }
	void RequestFrames();
	// Frames the selection (or nothing when none).
	void FrameSelection();
	void GoToStartView();
	// Nudges the selection by (right, up, forward) steps: right and forward along the ground
	// as the camera faces it, up along the world's up. One merged undo step per burst.
	void Nudge(float aRight, float anUp, float aForward);
	bool IsDragging() const { return myDrag.IsOpen(); }
	// Puts a dragged object back (Esc, focus lost, a level closing).
	void CancelDrag();

	// Input, from the view (positions in device pixels).
	void MousePress(Qt::MouseButton aButton, QPointF aPosition, Qt::KeyboardModifiers someModifiers);
	void MouseMove(QPointF aPosition, Qt::KeyboardModifiers someModifiers);
	void MouseRelease(Qt::MouseButton aButton, QPointF aPosition);
	void Wheel(float aSteps, Qt::KeyboardModifiers someModifiers);
	bool KeyPress(int aKey, Qt::KeyboardModifiers someModifiers, bool anAutoRepeatFlag);
	bool KeyRelease(int aKey);
	void FocusLost();

signals:
	void cameraChanged(const LumoraEditor::CameraPlacement& aPlacement);
	void message(const QString& aText);

private:
	void CameraMoved();
	void FlyTick();
	void OnPicked(int aPickId, const std::vector<std::pair<Kind, int>>& someHits);
	// A click (no drag) has ended: pressed on the selection, the next object behind it is selected.
	void FinishClick();
	// The selection's place in myHits, or -1.
	int SelectionInHits() const;
	void StartDrag(QPointF aPosition, bool aTurnFlag);
	DragAxis HeldAxis() const;

	Document& myDocument;
	EngineThread& myEngine;
	FlyCamera myCamera;
	CameraPlacement myStartView;
	QSize myViewSize{1, 1};

	bool myLookFlag = false;
	QPointF myLastMouse;
	bool myLeftFlag = false;
	QPointF myPressPosition;
	Qt::KeyboardModifiers myPressModifiers;
	// The pick the last left press asked for, and whether its result has selected something
	// a drag may move.
	int myPickId = 0;
	bool myPickAnsweredFlag = false;
	bool myPickedFlag = false;
	// What the last press's pick found, nearest first, and whether the press was on the
	// selection already (which then stays selected, to be dragged or cycled from).
	std::vector<std::pair<Kind, int>> myHits;
	bool myKeptSelectionFlag = false;
	// The button came up before the pick's answer: a drag made meanwhile is applied when it comes.
	bool myReleasedBeforePickFlag = false;
	QPointF myReleasePosition;
	LiveEdit myDrag;
	bool myTurnFlag = false;
	QPointF myDragOrigin;

	FlyKeys myKeys;
	bool myAxisHeld[3] = {false, false, false};
	QTimer myFlyTimer;
	QElapsedTimer myFlyClock;
};
} // namespace LumoraEditor
