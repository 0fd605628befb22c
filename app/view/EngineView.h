#pragma once
// EngineView: the native child window the engine draws into. It paints nothing itself (the
// engine presents into its X11 window), tells when it is first exposed (the engine may be
// created then, not before), reports its size in device pixels after a resize has settled,
// and hands every input event to its ViewController.
#include <QTimer>
#include <QWidget>

namespace LumoraEditor
{
class ViewController;

class EngineView : public QWidget
{
	Q_OBJECT

public:
	// A resize is passed on once the size has stayed put this long.
	static constexpr int ourResizeSettleMs = 120;

	explicit EngineView(QWidget* aParent = nullptr);
	void SetController(ViewController* aController) { myController = aController; }
	QPaintEngine* paintEngine() const override { return nullptr; }
	// The view's size in device pixels.
	QSize DeviceSize() const;
	QSize sizeHint() const override { return {960, 540}; }

signals:
	void exposed(quint64 aWindow, QSize aDeviceSize);
	void resized(QSize aDeviceSize);

protected:
	void paintEvent(QPaintEvent* anEvent) override;
	void resizeEvent(QResizeEvent* anEvent) override;
	void mousePressEvent(QMouseEvent* anEvent) override;
	void mouseMoveEvent(QMouseEvent* anEvent) override;
	void mouseReleaseEvent(QMouseEvent* anEvent) override;
	void wheelEvent(QWheelEvent* anEvent) override;
	void keyPressEvent(QKeyEvent* anEvent) override;
	void keyReleaseEvent(QKeyEvent* anEvent) override;
	void focusOutEvent(QFocusEvent* anEvent) override;

private:
	ViewController* myController = nullptr;
	QTimer myResizeTimer;
	bool myExposedFlag = false;
};
} // namespace LumoraEditor
