#include "panels/PropertiesPanel.h"

#include <QColorDialog>
#include <QComboBox>
#include <QDoubleSpinBox>
#include <QFormLayout>
#include <QHBoxLayout>
#include <QLabel>
#include <QPainter>
#include <QScrollArea>
#include <QSignalBlocker>
#include <QTimer>
#include <QToolButton>
#include <QVBoxLayout>
#include <algorithm>
#include <cmath>
#include <numbers>

#include "panels/ObjectLabels.h"

namespace LumoraEditor
{
namespace
{
constexpr double ourLargeRange = 1.0e6;
constexpr double ourMaxIntensity = 100.0;
constexpr double ourMaxConeDegrees = 89.9;

double Degrees(float aCosine)
{
	return std::acos(std::clamp(static_cast<double>(aCosine), -1.0, 1.0)) * 180.0 / std::numbers::pi;
}

float Cosine(double aDegrees)
{
	return static_cast<float>(std::cos(aDegrees * std::numbers::pi / 180.0));
}

// The colour's largest component: how bright it is beyond its hue.
float Intensity(const std::array<float, 3>& aColor)
{
	return std::max({aColor[0], aColor[1], aColor[2], 0.0f});
}

// The colour scaled so that its largest component is 1 (black stays black).
std::array<float, 3> Hue(const std::array<float, 3>& aColor)
{
	const float intensity = Intensity(aColor);
	if (intensity <= 0.0f)
	{
		return {0.0f, 0.0f, 0.0f};
	}
	return {aColor[0] / intensity, aColor[1] / intensity, aColor[2] / intensity};
}

QColor DisplayColor(const std::array<float, 3>& aColor)
{
	const auto hue = Hue(aColor);
	return QColor::fromRgbF(std::clamp(hue[0], 0.0f, 1.0f), std::clamp(hue[1], 0.0f, 1.0f),
	                        std::clamp(hue[2], 0.0f, 1.0f));
}

QDoubleSpinBox* MakeSpinBox(QWidget* aParent, const char* aName, double aMinimum, double aMaximum,
                            double aStep, int someDecimals = 3)
{
	auto* box = new QDoubleSpinBox(aParent);
	box->setObjectName(QString::fromLatin1(aName));
	box->setRange(aMinimum, aMaximum);
	box->setDecimals(someDecimals);
	box->setSingleStep(aStep);
	// Typing edits once, on Enter or leaving the field; arrows, wheel and dragging edit live.
	box->setKeyboardTracking(false);
	box->setAccelerated(true);
	// The row's width is shared out, whatever text the range could need: three coordinates fit
	// beside each other in a dock of ordinary width.
	box->setSizePolicy(QSizePolicy::Ignored, QSizePolicy::Fixed);
	box->setMinimumWidth(64);
	return box;
}

// Writes a value from the document into a spin box without making an edit; a box that
// already shows it (perhaps being typed in) keeps its text.
void Show(QDoubleSpinBox* aBox, double aValue)
{
	const double tolerance = 0.5 * std::pow(10.0, -aBox->decimals());
	if (std::abs(aBox->value() - aValue) < tolerance)
	{
		return;
	}
	const QSignalBlocker blocker(aBox);
	aBox->setValue(aValue);
}

void SetRowVisible(QFormLayout* aForm, QWidget* aField, bool aVisibleFlag)
{
	aField->setVisible(aVisibleFlag);
	if (QWidget* label = aForm->labelForField(aField))
	{
		label->setVisible(aVisibleFlag);
	}
}
} // namespace

PropertiesPanel::PropertiesPanel(Document& aDocument, QWidget* aParent)
    : QWidget(aParent), myDocument(aDocument)
{
	CreateFields();
	ConnectFields();
	connect(&myDocument, &Document::reset, this, &PropertiesPanel::ScheduleRefresh);
	connect(&myDocument, &Document::selectionChanged, this, &PropertiesPanel::ScheduleRefresh);
	connect(&myDocument, &Document::objectRemoved, this, &PropertiesPanel::ScheduleRefresh);
	connect(&myDocument, &Document::objectChanged, this, [this](ObjectId anId) {
		if (anId == myShownId)
		{
			ScheduleRefresh();
		}
	});

	Refresh();
}

void PropertiesPanel::CreateFields()
{
	myTitle = new QLabel(this);
	myTitle->setObjectName(QStringLiteral("title"));
	QFont titleFont = myTitle->font();
	titleFont.setBold(true);
	myTitle->setFont(titleFont);

	myFields = new QWidget;
	myForm = new QFormLayout(myFields);
	myForm->setFieldGrowthPolicy(QFormLayout::AllNonFixedFieldsGrow);

	static constexpr const char* ourPositionNames[] = {"positionX", "positionY", "positionZ"};
	static constexpr const char* ourDirectionNames[] = {"directionX", "directionY", "directionZ"};
	myPositionRow = new QWidget(myFields);
	myDirectionRow = new QWidget(myFields);
	auto* positionLayout = new QHBoxLayout(myPositionRow);
	auto* directionLayout = new QHBoxLayout(myDirectionRow);
	positionLayout->setContentsMargins(0, 0, 0, 0);
	directionLayout->setContentsMargins(0, 0, 0, 0);
	for (int axis = 0; axis < 3; ++axis)
	{
		myPosition[axis] =
		    MakeSpinBox(myPositionRow, ourPositionNames[axis], -ourLargeRange, ourLargeRange, 0.1);
		positionLayout->addWidget(myPosition[axis]);
		myDirection[axis] = MakeSpinBox(myDirectionRow, ourDirectionNames[axis], -1.0, 1.0, 0.05);
		myDirection[axis]->setToolTip(tr("The direction is normalised when applied; all zero is refused."));
		directionLayout->addWidget(myDirection[axis]);
	}

	myDecalType = new QComboBox(myFields);
	myDecalType->setObjectName(QStringLiteral("decalType"));
	mySize = MakeSpinBox(myFields, "size", 0.001, 10000.0, 0.1);
	myDepth = MakeSpinBox(myFields, "depth", 0.001, 10000.0, 0.1);

	myColorButton = new QToolButton(myFields);
	myColorButton->setObjectName(QStringLiteral("color"));
	myColorButton->setIconSize(QSize(48, 16));
	myIntensity = MakeSpinBox(myFields, "intensity", 0.0, ourMaxIntensity, 0.1);
	myIntensity->setToolTip(
	    tr("The colour's largest component; above 1 the light is brighter than its swatch."));
	myFalloff = MakeSpinBox(myFields, "falloff", 0.0, ourLargeRange, 0.1);

	myInnerAngle = MakeSpinBox(myFields, "innerAngle", 0.0, ourMaxConeDegrees, 1.0, 2);
	myOuterAngle = MakeSpinBox(myFields, "outerAngle", 0.0, ourMaxConeDegrees, 1.0, 2);
	const QString coneTip =
	    tr("Half-angle of the cone in degrees. The inner angle stays below the outer one: a "
	       "value past the other is clamped to %1° from it.")
	        .arg(ourConeGapDegrees);
	myInnerAngle->setToolTip(coneTip);
	myOuterAngle->setToolTip(coneTip);
	myInnerAngle->setSuffix(QStringLiteral("°"));
	myOuterAngle->setSuffix(QStringLiteral("°"));

	myForm->addRow(tr("Position"), myPositionRow);
	myForm->addRow(tr("Decal type"), myDecalType);
	myForm->addRow(tr("Size"), mySize);
	myForm->addRow(tr("Depth"), myDepth);
	myForm->addRow(tr("Colour"), myColorButton);
	myForm->addRow(tr("Intensity"), myIntensity);
	myForm->addRow(tr("Falloff"), myFalloff);
	myForm->addRow(tr("Inner angle"), myInnerAngle);
	myForm->addRow(tr("Outer angle"), myOuterAngle);
	myForm->addRow(tr("Direction"), myDirectionRow);

	auto* scroll = new QScrollArea(this);
	scroll->setWidget(myFields);
	scroll->setWidgetResizable(true);
	scroll->setFrameShape(QFrame::NoFrame);
	auto* layout = new QVBoxLayout(this);
	layout->setContentsMargins(4, 4, 4, 4);
	layout->addWidget(myTitle);
	layout->addWidget(scroll, 1);
}

void PropertiesPanel::ConnectFields()
{
	for (int axis = 0; axis < 3; ++axis)
	{
		connect(myPosition[axis], &QDoubleSpinBox::valueChanged, this, [this, axis](double aValue) {
			Edit(tr("Change position"), [axis, aValue](ObjectState& aState) {
				aState.myPosition[axis] = static_cast<float>(aValue);
			});
		});
		connect(myDirection[axis], &QDoubleSpinBox::valueChanged, this,
		        [this, axis](double aValue) { EditDirection(axis, aValue); });
	}
	connect(myIntensity, &QDoubleSpinBox::valueChanged, this, [this](double aValue) {
		Edit(tr("Change intensity"), [aValue](ObjectState& aState) {
			// Black has no hue to keep: it brightens as white.
			const auto hue =
			    Intensity(aState.myColor) > 0.0f ? Hue(aState.myColor) : std::array{1.0f, 1.0f, 1.0f};
			for (int channel = 0; channel < 3; ++channel)
			{
				aState.myColor[channel] = hue[channel] * static_cast<float>(aValue);
			}
		});
	});
	connect(myFalloff, &QDoubleSpinBox::valueChanged, this, [this](double aValue) {
		Edit(tr("Change falloff"),
		     [aValue](ObjectState& aState) { aState.myFalloff = static_cast<float>(aValue); });
	});
	connect(myInnerAngle, &QDoubleSpinBox::valueChanged, this, &PropertiesPanel::EditInnerAngle);
	connect(myOuterAngle, &QDoubleSpinBox::valueChanged, this, &PropertiesPanel::EditOuterAngle);
	connect(mySize, &QDoubleSpinBox::valueChanged, this, [this](double aValue) {
		Edit(tr("Change size"),
		     [aValue](ObjectState& aState) { aState.mySize = static_cast<float>(aValue); });
	});
	connect(myDepth, &QDoubleSpinBox::valueChanged, this, [this](double aValue) {
		Edit(tr("Change depth"),
		     [aValue](ObjectState& aState) { aState.myDepth = static_cast<float>(aValue); });
	});
	// activated: the designer's choice only, never a refresh's.
	connect(myDecalType, &QComboBox::activated, this, [this](int anIndex) {
		const std::string type = myDecalType->itemText(anIndex).toStdString();
		Edit(
		    tr("Change decal type"), [&type](ObjectState& aState) { aState.myDecalType = type; }, false);
	});
	connect(myColorButton, &QToolButton::clicked, this, &PropertiesPanel::OpenColorDialog);
}

void PropertiesPanel::SetDecalTypes(const QStringList& someTypes)
{
	{
		const QSignalBlocker blocker(myDecalType);
		myDecalType->clear();
		myDecalType->addItems(someTypes);
	}
	ScheduleRefresh();
}

void PropertiesPanel::ScheduleRefresh()
{
	if (myRefreshPendingFlag)
	{
		return;
	}
	myRefreshPendingFlag = true;
	QTimer::singleShot(0, this, &PropertiesPanel::Refresh);
}

void PropertiesPanel::Refresh()
{
	myRefreshPendingFlag = false;
	const ObjectId id = myDocument.GetSelected();
	const ObjectState* state = myDocument.Find(id);
	if (id != myShownId)
	{
		// The dialog was about the object shown before: what it applied stays, as one step.
		EndColorSession(true);
		if (myColorDialog != nullptr)
		{
			myColorDialog->hide();
		}
		myShownId = state != nullptr ? id : 0;
	}
	if (state == nullptr)
	{
		myTitle->setText(tr("Nothing selected"));
		myFields->setVisible(false);
		return;
	}
	myFields->setVisible(true);
	myTitle->setText(ObjectLabel(myDocument, id));
	ShowRows(state->myKind);

	for (int axis = 0; axis < 3; ++axis)
	{
		Show(myPosition[axis], state->myPosition[axis]);
		Show(myDirection[axis], state->myDirection[axis]);
	}
	ShowColor(*state);
	Show(myFalloff, state->myFalloff);
	Show(myInnerAngle, Degrees(state->myInnerCos));
	Show(myOuterAngle, Degrees(state->myOuterCos));
	Show(mySize, state->mySize);
	Show(myDepth, state->myDepth);
	const QString type = QString::fromStdString(state->myDecalType);
	if (state->myKind == Kind::DECAL && myDecalType->currentText() != type)
	{
		const QSignalBlocker blocker(myDecalType);
		// A type the catalogue does not list (yet) is still shown as the decal's.
		if (myDecalType->findText(type) < 0)
		{
			myDecalType->addItem(type);
		}
		myDecalType->setCurrentIndex(myDecalType->findText(type));
	}
}

void PropertiesPanel::ShowRows(Kind aKind)
{
	const bool spotFlag = aKind == Kind::SPOT_LIGHT;
	const bool decalFlag = aKind == Kind::DECAL;
	SetRowVisible(myForm, myDecalType, decalFlag);
	SetRowVisible(myForm, mySize, decalFlag);
	SetRowVisible(myForm, myDepth, decalFlag);
	SetRowVisible(myForm, myColorButton, HasColor(aKind));
	SetRowVisible(myForm, myIntensity, HasColor(aKind));
	SetRowVisible(myForm, myFalloff, HasFalloff(aKind));
	SetRowVisible(myForm, myInnerAngle, spotFlag);
	SetRowVisible(myForm, myOuterAngle, spotFlag);
	SetRowVisible(myForm, myDirectionRow, HasDirection(aKind));
}

void PropertiesPanel::ShowColor(const ObjectState& aState)
{
	QPixmap swatch(myColorButton->iconSize());
	swatch.fill(DisplayColor(aState.myColor));
	{
		QPainter painter(&swatch);
		painter.setPen(palette().color(QPalette::WindowText));
		painter.drawRect(swatch.rect().adjusted(0, 0, -1, -1));
	}
	myColorButton->setIcon(QIcon(swatch));
	myColorButton->setToolTip(tr("Linear colour %1, %2, %3: click to choose the hue")
	                              .arg(aState.myColor[0], 0, 'f', 3)
	                              .arg(aState.myColor[1], 0, 'f', 3)
	                              .arg(aState.myColor[2], 0, 'f', 3));
	Show(myIntensity, Intensity(aState.myColor));
}

void PropertiesPanel::Edit(const QString& aName, const std::function<void(ObjectState&)>& aChange,
                           bool aMergingFlag)
{
	// An edit beside an open colour session would be undone by its cancel: the colours
	// applied so far become their own step first.
	EndColorSession(true);
	const ObjectState* current = myDocument.Find(myShownId);
	if (current == nullptr)
	{
		return;
	}
	ObjectState state = *current;
	aChange(state);
	if (aMergingFlag)
	{
		myDocument.SetStateMerging(myShownId, state, aName);
	}
	else
	{
		myDocument.SetState(myShownId, state, aName);
	}
	// A clamped or refused value goes back to what the document holds.
	ScheduleRefresh();
}

void PropertiesPanel::EditInnerAngle(double aDegrees)
{
	Edit(tr("Change inner angle"), [aDegrees](ObjectState& aState) {
		const double outer = Degrees(aState.myOuterCos);
		aState.myInnerCos = Cosine(std::max(0.0, std::min(aDegrees, outer - ourConeGapDegrees)));
	});
}

void PropertiesPanel::EditOuterAngle(double aDegrees)
{
	Edit(tr("Change outer angle"), [aDegrees](ObjectState& aState) {
		const double inner = Degrees(aState.myInnerCos);
		aState.myOuterCos =
		    Cosine(std::min(ourMaxConeDegrees, std::max(aDegrees, inner + ourConeGapDegrees)));
	});
}

void PropertiesPanel::EditDirection(int anAxis, double aValue)
{
	Edit(tr("Change direction"), [anAxis, aValue](ObjectState& aState) {
		std::array<double, 3> direction{aState.myDirection[0], aState.myDirection[1], aState.myDirection[2]};
		direction[anAxis] = aValue;
		const double length = std::hypot(direction[0], direction[1], direction[2]);
		if (length < 1e-6)
		{
			return;
		}
		for (int axis = 0; axis < 3; ++axis)
		{
			aState.myDirection[axis] = static_cast<float>(direction[axis] / length);
		}
	});
}

void PropertiesPanel::OpenColorDialog()
{
	const ObjectState* state = myDocument.Find(myShownId);
	if (state == nullptr)
	{
		return;
	}
	if (myColorDialog == nullptr)
	{
		myColorDialog = new QColorDialog(this);
		myColorDialog->setObjectName(QStringLiteral("colorDialog"));
		// The platform's dialog may report only the final choice; the live preview needs Qt's.
		myColorDialog->setOption(QColorDialog::DontUseNativeDialog);
		myColorDialog->setModal(false);
		connect(myColorDialog, &QColorDialog::currentColorChanged, this, &PropertiesPanel::OnDialogColor);
		connect(myColorDialog, &QColorDialog::accepted, this, [this] { EndColorSession(true); });
		connect(myColorDialog, &QColorDialog::rejected, this, [this] { EndColorSession(false); });
	}
	myColorDialog->setWindowTitle(tr("Colour of %1").arg(ObjectLabel(myDocument, myShownId)));
	{
		const QSignalBlocker blocker(myColorDialog);
		myColorDialog->setCurrentColor(DisplayColor(state->myColor));
	}
	myColorDialog->show();
	myColorDialog->raise();
	myColorDialog->activateWindow();
}

void PropertiesPanel::OnDialogColor(const QColor& aColor)
{
	if (!myColorEdit.IsOpen())
	{
		const ObjectState* state = myDocument.Find(myShownId);
		if (state == nullptr)
		{
			return;
		}
		myColorEdit = myDocument.BeginLiveEdit(myShownId, tr("Change colour"));
		// The dialog picks the hue; the brightness stays the object's (black picks at 1).
		const float intensity = Intensity(state->myColor);
		myColorIntensity = intensity > 0.0f ? intensity : 1.0f;
	}
	const ObjectState* state = myDocument.Find(myColorEdit.GetId());
	if (state == nullptr)
	{
		return;
	}
	ObjectState changed = *state;
	changed.myColor = {static_cast<float>(aColor.redF()) * myColorIntensity,
	                   static_cast<float>(aColor.greenF()) * myColorIntensity,
	                   static_cast<float>(aColor.blueF()) * myColorIntensity};
	myColorEdit.Update(changed);
}

void PropertiesPanel::EndColorSession(bool aCommitFlag)
{
	if (!myColorEdit.IsOpen())
	{
		return;
	}
	if (aCommitFlag)
	{
		myColorEdit.Commit();
	}
	else
	{
		myColorEdit.Cancel();
	}
	ScheduleRefresh();
}
} // namespace LumoraEditor
