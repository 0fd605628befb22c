#include "bake/BakePanel.h"

#include <QCheckBox>
#include <QComboBox>
#include <QFormLayout>
#include <QHBoxLayout>
#include <QLabel>
#include <QProgressBar>
#include <QPushButton>
#include <QRadioButton>
#include <QSpinBox>
#include <QVBoxLayout>
#include <algorithm>

namespace LumoraEditor
{
namespace
{
// The progress bar counts in thousandths: probe counts can pass what an int holds.
constexpr int ourProgressSteps = 1000;

template <typename T> T* Named(T* aWidget, const char* aName)
{
	aWidget->setObjectName(QString::fromLatin1(aName));
	return aWidget;
}
} // namespace

BakePanel::BakePanel(BakeRunner& aRunner, QWidget* aParent) : QWidget(aParent), myRunner(aRunner)
{
	myBounces = Named(new QSpinBox(this), "bounces");
	myBounces->setRange(1, 16);
	myBounces->setValue(2);
	myBounces->setToolTip(tr("How many times light is bounced between the probes"));
	myAmbient = Named(new QCheckBox(tr("Ambient"), this), "ambient");
	myReflections = Named(new QCheckBox(tr("Reflections"), this), "reflections");
	myAmbient->setChecked(true);
	myReflections->setChecked(true);
	myAmbient->setToolTip(tr("The light probes' indirect light"));
	myReflections->setToolTip(tr("Each room's reflection cubemap"));
	myAllRooms = Named(new QRadioButton(tr("All rooms"), this), "allRooms");
	myOneRoom = Named(new QRadioButton(tr("Room:"), this), "oneRoom");
	myAllRooms->setChecked(true);
	myRoom = Named(new QComboBox(this), "room");
	myBakeButton = Named(new QPushButton(tr("Bake"), this), "bake");
	myCancelButton = Named(new QPushButton(tr("Cancel"), this), "cancel");
	myCancelButton->setToolTip(tr("Stops the bake; the files of the last finished bake are kept"));
	myProgressBar = Named(new QProgressBar(this), "progress");
	myProgressBar->setRange(0, ourProgressSteps);
	myProgressBar->setValue(0);
	myProgressText = Named(new QLabel(this), "progressText");
	myResult = Named(new QLabel(this), "result");
	myResult->setWordWrap(true);
	myResult->setTextInteractionFlags(Qt::TextSelectableByMouse);

	auto* kinds = new QHBoxLayout;
	kinds->addWidget(myAmbient);
	kinds->addWidget(myReflections);
	kinds->addStretch(1);
	auto* oneRoom = new QHBoxLayout;
	oneRoom->addWidget(myOneRoom);
	oneRoom->addWidget(myRoom, 1);
	auto* buttons = new QHBoxLayout;
	buttons->addWidget(myBakeButton);
	buttons->addWidget(myCancelButton);
	buttons->addStretch(1);
	auto* form = new QFormLayout;
	form->addRow(tr("Bake"), kinds);
	form->addRow(tr("Bounces"), myBounces);
	form->addRow(tr("Rooms"), myAllRooms);
	form->addRow(QString(), oneRoom);
	auto* layout = new QVBoxLayout(this);
	layout->addLayout(form);
	layout->addLayout(buttons);
	layout->addWidget(myProgressBar);
	layout->addWidget(myProgressText);
	layout->addWidget(myResult);
	layout->addStretch(1);

	for (QAbstractButton* button :
	     {static_cast<QAbstractButton*>(myAmbient), static_cast<QAbstractButton*>(myReflections),
	      static_cast<QAbstractButton*>(myAllRooms), static_cast<QAbstractButton*>(myOneRoom)})
	{
		connect(button, &QAbstractButton::toggled, this, &BakePanel::UpdateControls);
	}
	connect(myBakeButton, &QPushButton::clicked, this, &BakePanel::StartBake);
	connect(myCancelButton, &QPushButton::clicked, this, [this] {
		myRunner.Cancel();
		myProgressText->setText(tr("Cancelling…"));
		UpdateControls();
	});
	connect(&myRunner, &BakeRunner::stateChanged, this, &BakePanel::UpdateControls);
	connect(&myRunner, &BakeRunner::progressChanged, this, &BakePanel::ShowProgress);
	connect(&myRunner, &BakeRunner::finished, this, &BakePanel::ShowOutcome);
	UpdateControls();
}

void BakePanel::SetLevel(const QString& aLevel)
{
	myLevel = aLevel;
	UpdateControls();
}

void BakePanel::SetRooms(const QStringList& someRooms)
{
	const QString current = myRoom->currentText();
	myRoom->clear();
	myRoom->addItems(someRooms);
	if (const int index = myRoom->findText(current); index >= 0)
	{
		myRoom->setCurrentIndex(index);
	}
	if (someRooms.isEmpty())
	{
		myAllRooms->setChecked(true);
	}
	UpdateControls();
}

void BakePanel::SetSelectedRoom(const QString& aRoom)
{
	if (const int index = myRoom->findText(aRoom); index >= 0)
	{
		myRoom->setCurrentIndex(index);
	}
}

BakeRequest BakePanel::MakeRequest() const
{
	BakeRequest request;
	request.myLevel = myLevel;
	request.myBounces = myBounces->value();
	request.myAmbientFlag = myAmbient->isChecked();
	request.myReflectionsFlag = myReflections->isChecked();
	if (myOneRoom->isChecked() && myRoom->currentIndex() >= 0)
	{
		request.myRoomIds << myRoom->currentText();
	}
	return request;
}

void BakePanel::StartBake()
{
	if (!myRunner.Start(MakeRequest()))
	{
		return;
	}
	myResult->clear();
	myProgressBar->setRange(0, 0);
	myProgressText->setText(tr("Starting…"));
}

void BakePanel::UpdateControls()
{
	const bool runningFlag = myRunner.IsRunning();
	const bool ambientFlag = myAmbient->isChecked();
	const bool reflectionsFlag = myReflections->isChecked();
	// At least one of the two stays checked: the last one checked cannot be unchecked.
	myAmbient->setEnabled(!runningFlag && reflectionsFlag);
	myReflections->setEnabled(!runningFlag && ambientFlag);
	myBounces->setEnabled(!runningFlag && ambientFlag);
	myAllRooms->setEnabled(!runningFlag);
	myOneRoom->setEnabled(!runningFlag && myRoom->count() > 0);
	myRoom->setEnabled(!runningFlag && myOneRoom->isChecked());
	myBakeButton->setEnabled(!runningFlag && !myLevel.isEmpty() && (ambientFlag || reflectionsFlag) &&
	                         (myAllRooms->isChecked() || myRoom->currentIndex() >= 0));
	myBakeButton->setToolTip(myLevel.isEmpty() ? tr("Open a level to bake it") : tr("Bake %1").arg(myLevel));
	myCancelButton->setEnabled(runningFlag && !myRunner.IsCancelling());
}

void BakePanel::ShowProgress(const BakeProgress& aProgress)
{
	if (!myRunner.IsCancelling())
	{
		const QString line = BakeRunner::Describe(aProgress);
		myProgressText->setText(line.isEmpty() ? tr("Starting…") : line);
	}
	long long done = 0;
	long long total = 0;
	QString format;
	if (aProgress.myPhase == Zeph::BakePhase::AMBIENT && aProgress.myProbesTotal > 0)
	{
		done = aProgress.myProbesDone;
		total = aProgress.myProbesTotal;
		format = tr("%1/%2 probes").arg(done).arg(total);
	}
	else if (aProgress.myPhase == Zeph::BakePhase::REFLECTIONS && aProgress.myRoomsTotal > 0)
	{
		done = aProgress.myRoomsDone;
		total = aProgress.myRoomsTotal;
		format = tr("%1/%2 rooms").arg(done).arg(total);
	}
	if (total <= 0)
	{
		// Not counting yet: a busy bar.
		myProgressBar->setRange(0, 0);
		return;
	}
	myProgressBar->setRange(0, ourProgressSteps);
	myProgressBar->setValue(static_cast<int>(std::min(done, total) * ourProgressSteps / total));
	myProgressBar->setFormat(format);
}

void BakePanel::ShowOutcome(BakeOutcome anOutcome, const QString& aMessage)
{
	myProgressText->clear();
	myProgressBar->setRange(0, ourProgressSteps);
	myProgressBar->resetFormat();
	switch (anOutcome)
	{
	case BakeOutcome::FINISHED: {
		const double seconds = myRunner.GetElapsedSeconds();
		myProgressBar->setValue(ourProgressSteps);
		myResult->setText(tr("Baked in %1")
		                      .arg(seconds < 60.0 ? tr("%1 s").arg(seconds, 0, 'f', 1)
		                                          : BakeRunner::DescribeSeconds(seconds)));
		break;
	}
	case BakeOutcome::CANCELLED:
		myProgressBar->setValue(0);
		myResult->setText(tr("Cancelled: the previous files are kept"));
		break;
	case BakeOutcome::FAILED:
		myProgressBar->setValue(0);
		myResult->setText(aMessage.trimmed().isEmpty() ? tr("Failed")
		                                               : tr("Failed: %1").arg(aMessage.trimmed()));
		break;
	}
	UpdateControls();
	emit bakeFinished(anOutcome);
}
} // namespace LumoraEditor
