#pragma once
// BakePanel: what to bake (bounces, ambient and/or reflections, every room or one), the Bake
// and Cancel buttons, the progress of the running bake and how the last one ended. The bake
// itself is the BakeRunner's; the panel asks it and shows what it says.
//
// The widgets carry object names ("bounces", "ambient", "reflections", "allRooms",
// "oneRoom", "room", "bake", "cancel", "progress", "progressText", "result") for tests.
#include <QWidget>

#include "bake/BakeRunner.h"

class QCheckBox;
class QComboBox;
class QLabel;
class QProgressBar;
class QPushButton;
class QRadioButton;
class QSpinBox;

namespace LumoraEditor
{
class BakePanel : public QWidget
{
	Q_OBJECT

public:
	explicit BakePanel(BakeRunner& aRunner, QWidget* aParent = nullptr);

	// The open level (empty: none, nothing to bake).
	void SetLevel(const QString& aLevel);
	// The level's rooms, for baking one of them.
	void SetRooms(const QStringList& someRooms);
	// Picks the room in the room box (the one the camera is in, say); the choice between
	// all rooms and one stays the designer's.
	void SetSelectedRoom(const QString& aRoom);

	// The bake the controls describe.
	BakeRequest MakeRequest() const;

signals:
	void bakeFinished(LumoraEditor::BakeOutcome anOutcome);

private:
	void StartBake();
	void UpdateControls();
	void ShowProgress(const BakeProgress& aProgress);
	void ShowOutcome(BakeOutcome anOutcome, const QString& aMessage);

	BakeRunner& myRunner;
	QString myLevel;
	QSpinBox* myBounces = nullptr;
	QCheckBox* myAmbient = nullptr;
	QCheckBox* myReflections = nullptr;
	QRadioButton* myAllRooms = nullptr;
	QRadioButton* myOneRoom = nullptr;
	QComboBox* myRoom = nullptr;
	QPushButton* myBakeButton = nullptr;
	QPushButton* myCancelButton = nullptr;
	QProgressBar* myProgressBar = nullptr;
	QLabel* myProgressText = nullptr;
	QLabel* myResult = nullptr;
};
} // namespace LumoraEditor
