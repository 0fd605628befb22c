#pragma once
// PropertiesPanel: the values of the selected object, to read and to change. Each change is
// an edit of the document (spin boxes merge into one undo step while they keep moving; a
// colour-dialog session is one live edit, committed when the dialog is accepted and undone
// when it is cancelled). Values come back from the document's notifications, written into
// the widgets with their signals blocked, so showing a value never makes an edit; a field
// that already shows the value is left alone, so a refresh does not disturb typing.
//
// The widgets carry object names ("positionX", "color", "intensity", "falloff",
// "innerAngle", "outerAngle", "directionX", "decalType", "size", "depth", ...) for the
// main window's tests and tools.
#include <QWidget>
#include <array>
#include <functional>

#include "core/Document.h"

class QColorDialog;
class QComboBox;
class QDoubleSpinBox;
class QFormLayout;
class QLabel;
class QToolButton;

namespace LumoraEditor
{
class PropertiesPanel : public QWidget
{
	Q_OBJECT

public:
	// The smallest gap kept between a spot light's inner and outer half-angles (degrees).
	static constexpr double ourConeGapDegrees = 0.1;

	explicit PropertiesPanel(Document& aDocument, QWidget* aParent = nullptr);

	// The decal types the level's catalogue offers, for the decal type box.
	void SetDecalTypes(const QStringList& someTypes);

	// The object shown (after pending refreshes have run); 0 for none.
	ObjectId GetShownId() const { return myShownId; }
	// The colour dialog once it has been opened (it is kept for the next time).
	QColorDialog* GetColorDialog() const { return myColorDialog; }

private:
	void CreateFields();
	// The fields' changes become edits of the shown object.
	void ConnectFields();
	void ScheduleRefresh();
	void Refresh();
	void ShowRows(Kind aKind);
	// Applies aChange to the shown object's current values as one (merging) edit.
	void Edit(const QString& aName, const std::function<void(ObjectState&)>& aChange,
	          bool aMergingFlag = true);
	void EditInnerAngle(double aDegrees);
	void EditOuterAngle(double aDegrees);
	void EditDirection(int anAxis, double aValue);
	void OpenColorDialog();
	void OnDialogColor(const QColor& aColor);
	void EndColorSession(bool aCommitFlag);
	void ShowColor(const ObjectState& aState);

	Document& myDocument;
	ObjectId myShownId = 0;
	bool myRefreshPendingFlag = false;

	QLabel* myTitle = nullptr;
	QWidget* myFields = nullptr;
	QFormLayout* myForm = nullptr;
	QWidget* myPositionRow = nullptr;
	std::array<QDoubleSpinBox*, 3> myPosition{};
	QComboBox* myDecalType = nullptr;
	QDoubleSpinBox* mySize = nullptr;
	QDoubleSpinBox* myDepth = nullptr;
	QToolButton* myColorButton = nullptr;
	QDoubleSpinBox* myIntensity = nullptr;
	QDoubleSpinBox* myFalloff = nullptr;
	QDoubleSpinBox* myInnerAngle = nullptr;
	QDoubleSpinBox* myOuterAngle = nullptr;
	QWidget* myDirectionRow = nullptr;
	std::array<QDoubleSpinBox*, 3> myDirection{};

	QColorDialog* myColorDialog = nullptr;
	// The colour dialog's session: open from the first colour picked to accept or cancel.
	LiveEdit myColorEdit;
	// The intensity the session's colours are scaled to (the swatch is the colour divided by it).
	float myColorIntensity = 1.0f;
};
} // namespace LumoraEditor
