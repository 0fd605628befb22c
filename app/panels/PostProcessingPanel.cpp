#include "panels/PostProcessingPanel.h"

#include <QDoubleSpinBox>
#include <QFormLayout>
#include <QGroupBox>
#include <QLabel>
#include <QPushButton>
#include <QSignalBlocker>
#include <QTimer>
#include <QVBoxLayout>
#include <utility>

#include "bridge/EngineThread.h"

namespace LumoraEditor
{
namespace
{
QDoubleSpinBox* AddRow(QFormLayout* aForm, const QString& aLabel, const char* aName, double aMaximum,
                       double aStep)
{
	auto* box = new QDoubleSpinBox;
	box->setObjectName(QString::fromLatin1(aName));
	box->setRange(0.0, aMaximum);
	box->setDecimals(3);
	box->setSingleStep(aStep);
	box->setKeyboardTracking(false);
	aForm->addRow(aLabel, box);
	return box;
}

void Show(QDoubleSpinBox* aBox, float aValue)
{
	const QSignalBlocker blocker(aBox);
	aBox->setValue(aValue);
}

float Read(const QDoubleSpinBox* aBox)
{
	return static_cast<float>(aBox->value());
}
} // namespace

PostProcessingPanel::PostProcessingPanel(EngineThread& anEngine, QWidget* aParent)
    : QWidget(aParent), myEngine(anEngine)
{
	auto* ssaoGroup = new QGroupBox(tr("Ambient occlusion"), this);
	auto* ssaoForm = new QFormLayout(ssaoGroup);
	mySsaoScale = AddRow(ssaoForm, tr("Scale"), "ssaoScale", 10.0, 0.1);
	mySsaoSampleRadius = AddRow(ssaoForm, tr("Sample radius"), "ssaoSampleRadius", 10.0, 0.05);
	mySsaoBias = AddRow(ssaoForm, tr("Bias"), "ssaoBias", 1.0, 0.01);
	mySsaoIntensity = AddRow(ssaoForm, tr("Intensity"), "ssaoIntensity", 10.0, 0.1);
	mySsaoScale->setToolTip(tr("How fast occlusion fades with the occluder's distance"));
	mySsaoSampleRadius->setToolTip(tr("How far around a pixel occluders are looked for (world units)"));
	mySsaoBias->setToolTip(tr("Ignores occluders nearly in the surface's plane (against self-occlusion)"));

	auto* hdrGroup = new QGroupBox(tr("Exposure and bloom"), this);
	auto* hdrForm = new QFormLayout(hdrGroup);
	myAutoExposure = AddRow(hdrForm, tr("Auto exposure"), "autoExposure", 10.0, 0.05);
	myLumMin = AddRow(hdrForm, tr("Luminance min"), "lumMin", 100.0, 0.05);
	myLumMax = AddRow(hdrForm, tr("Luminance max"), "lumMax", 100.0, 0.1);
	myBloomThreshold = AddRow(hdrForm, tr("Bloom threshold"), "bloomThreshold", 10.0, 0.05);
	myBloomFactor = AddRow(hdrForm, tr("Bloom factor"), "bloomFactor", 10.0, 0.05);
	myEmissiveMultiplier = AddRow(hdrForm, tr("Emissive multiplier"), "emissiveMultiplier", 100.0, 0.1);
	myAutoExposure->setToolTip(tr("The brightness the adapted average luminance is mapped to"));
	myLumMin->setToolTip(tr("The eye adaptation stays between the luminance min and max"));
	myLumMax->setToolTip(myLumMin->toolTip());

	myNote = new QLabel(this);
	myNote->setObjectName(QStringLiteral("note"));
	myNote->setWordWrap(true);
	myNote->setVisible(false);
	auto* resetButton = new QPushButton(tr("Reset to file"), this);
	resetButton->setToolTip(tr("Reads %1 and %2 again")
	                            .arg(QString::fromLatin1(PostProcessingSettings::ourSsaoFile),
	                                 QString::fromLatin1(PostProcessingSettings::ourHdrFile)));

	auto* layout = new QVBoxLayout(this);
	layout->addWidget(ssaoGroup);
	layout->addWidget(hdrGroup);
	layout->addWidget(myNote);
	layout->addWidget(resetButton, 0, Qt::AlignLeft);
	layout->addStretch(1);

	for (QDoubleSpinBox* box : {mySsaoScale, mySsaoSampleRadius, mySsaoBias, mySsaoIntensity})
	{
		connect(box, &QDoubleSpinBox::valueChanged, this, [this] { ScheduleApply(true); });
	}
	for (QDoubleSpinBox* box :
	     {myAutoExposure, myLumMin, myLumMax, myBloomThreshold, myBloomFactor, myEmissiveMultiplier})
	{
		connect(box, &QDoubleSpinBox::valueChanged, this, [this] { ScheduleApply(false); });
	}
	connect(resetButton, &QPushButton::clicked, this, &PostProcessingPanel::ResetToFile);

	// The engine read the same files when it started; it only needs telling where the panel
	// fell back on defaults (the engine reads zeros there).
	if (!Load())
	{
		ScheduleApply(true);
		ScheduleApply(false);
	}
}

PostProcessingSettings PostProcessingPanel::GetSettings() const
{
	PostProcessingSettings settings;
	settings.mySsaoScale = Read(mySsaoScale);
	settings.mySsaoSampleRadius = Read(mySsaoSampleRadius);
	settings.mySsaoBias = Read(mySsaoBias);
	settings.mySsaoIntensity = Read(mySsaoIntensity);
	settings.myAutoExposure = Read(myAutoExposure);
	settings.myLumMin = Read(myLumMin);
	settings.myLumMax = Read(myLumMax);
	settings.myBloomThreshold = Read(myBloomThreshold);
	settings.myBloomFactor = Read(myBloomFactor);
	settings.myEmissiveMultiplier = Read(myEmissiveMultiplier);
	return settings;
}

void PostProcessingPanel::SetSettings(const PostProcessingSettings& someSettings)
{
	ShowValues(someSettings);
	ScheduleApply(true);
	ScheduleApply(false);
}

void PostProcessingPanel::ResetToFile()
{
	Load();
	ScheduleApply(true);
	ScheduleApply(false);
}

bool PostProcessingPanel::Load()
{
	QStringList notes;
	ShowValues(PostProcessingSettings::Read(QString::fromLatin1(PostProcessingSettings::ourSsaoFile),
	                                        QString::fromLatin1(PostProcessingSettings::ourHdrFile), notes));
	myNote->setText(notes.join(QLatin1Char('\n')));
	myNote->setVisible(!notes.isEmpty());
	return notes.isEmpty();
}

void PostProcessingPanel::ShowValues(const PostProcessingSettings& someSettings)
{
	Show(mySsaoScale, someSettings.mySsaoScale);
	Show(mySsaoSampleRadius, someSettings.mySsaoSampleRadius);
	Show(mySsaoBias, someSettings.mySsaoBias);
	Show(mySsaoIntensity, someSettings.mySsaoIntensity);
	Show(myAutoExposure, someSettings.myAutoExposure);
	Show(myLumMin, someSettings.myLumMin);
	Show(myLumMax, someSettings.myLumMax);
	Show(myBloomThreshold, someSettings.myBloomThreshold);
	Show(myBloomFactor, someSettings.myBloomFactor);
	Show(myEmissiveMultiplier, someSettings.myEmissiveMultiplier);
}

void PostProcessingPanel::ScheduleApply(bool anSsaoFlag)
{
	const bool pendingFlag = mySsaoPendingFlag || myHdrPendingFlag;
	(anSsaoFlag ? mySsaoPendingFlag : myHdrPendingFlag) = true;
	if (!pendingFlag)
	{
		QTimer::singleShot(0, this, &PostProcessingPanel::Apply);
	}
}

void PostProcessingPanel::Apply()
{
	const PostProcessingSettings settings = GetSettings();
	if (std::exchange(mySsaoPendingFlag, false))
	{
		myEngine.UpdateSsao(settings.mySsaoScale, settings.mySsaoSampleRadius, settings.mySsaoBias,
		                    settings.mySsaoIntensity);
	}
	if (std::exchange(myHdrPendingFlag, false))
	{
		myEngine.UpdateHdrAndBloom(settings.myAutoExposure, settings.myLumMin, settings.myLumMax,
		                           settings.myBloomThreshold, settings.myBloomFactor,
		                           settings.myEmissiveMultiplier);
	}
}
} // namespace LumoraEditor
