#include "view/EngineView.h"

#include <QKeyEvent>
#include <QMouseEvent>
#include <QWheelEvent>
#include <QWindow>
#include <cmath>

#include "view/ViewController.h"

namespace LumoraEditor
{
EngineView::EngineView(QWidget* aParent) : QWidget(aParent)
{
	setAttribute(Qt::WA_NativeWindow);
	setAttribute(Qt::WA_PaintOnScreen);
	setAttribute(Qt::WA_NoSystemBackground);
	setAttribute(Qt::WA_OpaquePaintEvent);
	setAttribute(Qt::WA_DontCreateNativeAncestors);
	setFocusPolicy(Qt::StrongFocus);
	setMouseTracking(true);
	setMinimumSize(160, 120);
	myResizeTimer.setSingleShot(true);
	myResizeTimer.setInterval(ourResizeSettleMs);
	connect(&myResizeTimer, &QTimer::timeout, this, [this] { emit resized(DeviceSize()); });
}

QSize EngineView::DeviceSize() const
{
	const qreal ratio = devicePixelRatioF();
	return {static_cast<int>(std::lround(width() * ratio)), static_cast<int>(std::lround(height() * ratio))};
}

void EngineView::paintEvent(QPaintEvent*)
{
	// The first paint comes once the window is mapped and exposed: the engine can present now.
	if (!myExposedFlag && windowHandle() != nullptr && windowHandle()->isExposed())
	{
		myExposedFlag = true;
		emit exposed(static_cast<quint64>(winId()), DeviceSize());
	}
	if (myController != nullptr)
	{
		myController->RequestFrames();
	}
}

void EngineView::resizeEvent(QResizeEvent*)
{
	if (myExposedFlag)
	{
		myResizeTimer.start();
	}
}

void EngineView::mousePressEvent(QMouseEvent* anEvent)
{
	setFocus(Qt::MouseFocusReason);
	if (myController != nullptr)
	{
		myController->MousePress(anEvent->button(), anEvent->position() * devicePixelRatioF(),
		                         anEvent->modifiers());
	}
}

void EngineView::mouseMoveEvent(QMouseEvent* anEvent)
{
	if (myController != nullptr)
	{
		myController->MouseMove(anEvent->position() * devicePixelRatioF(), anEvent->modifiers());
	}
}

void EngineView::mouseReleaseEvent(QMouseEvent* anEvent)
{
	if (myController != nullptr)
	{
		myController->MouseRelease(anEvent->button(), anEvent->position() * devicePixelRatioF());
	}
}

void EngineView::wheelEvent(QWheelEvent* anEvent)
{
	if (myController != nullptr)
	{
		myController->Wheel(static_cast<float>(anEvent->angleDelta().y()) / 120.0f, anEvent->modifiers());
	}
}

void EngineView::keyPressEvent(QKeyEvent* anEvent)
{
	if (myController == nullptr ||
	    !myController->KeyPress(anEvent->key(), anEvent->modifiers(), anEvent->isAutoRepeat()))
	{
		QWidget::keyPressEvent(anEvent);
	}
}

void EngineView::keyReleaseEvent(QKeyEvent* anEvent)
{
	// Auto-repeat sends releases while a key is held: only the real one counts.
	if (anEvent->isAutoRepeat())
	{
		return;
	}
	if (myController == nullptr || !myController->KeyRelease(anEvent->key()))
	{
		QWidget::keyReleaseEvent(anEvent);
	}
}

void EngineView::focusOutEvent(QFocusEvent* anEvent)
{
	if (myController != nullptr)
	{
		myController->FocusLost();
	}
	QWidget::focusOutEvent(anEvent);
}
} // namespace LumoraEditor
