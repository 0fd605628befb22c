// The editor's panels on a document over the fake engine: what they show follows the
// document, what the designer does in them becomes the right undo steps, and showing values
// never edits. Runs offscreen (QT_QPA_PLATFORM=offscreen).
#include <QCheckBox>
#include <QColorDialog>
#include <QComboBox>
#include <QDoubleSpinBox>
#include <QFile>
#include <QLabel>
#include <QPlainTextEdit>
#include <QProgressBar>
#include <QPushButton>
#include <QRadioButton>
#include <QRegularExpression>
#include <QSignalSpy>
#include <QSpinBox>
#include <QTemporaryDir>
#include <QTest>
#include <QTextDocument>
#include <QToolButton>
#include <QTreeWidget>
#include <cmath>
#include <numbers>

#include "bake/BakePanel.h"
#include "bake/BakeRunner.h"
#include "bridge/FakeEngine.h"
#include "core/Document.h"
#include "panels/LogPanel.h"
#include "panels/OutlinerPanel.h"
#include "panels/PostProcessingSettings.h"
#include "panels/ProblemsPanel.h"
#include "panels/PropertiesPanel.h"

using namespace LumoraEditor;

namespace
{
ObjectState MakeState(Kind aKind, float anX, const char* aDecalType = "")
{
	ObjectState state;
	state.myKind = aKind;
	state.myPosition = {anX, 2.0f, -3.0f};
	state.myDecalType = aDecalType;
	return state;
}

// Two point lights, a spot light, two decals and a path node.
Document::ObjectLists SampleLevel()
{
	Document::ObjectLists lists;
	lists[0] = {MakeState(Kind::POINT_LIGHT, 1.0f), MakeState(Kind::POINT_LIGHT, 2.0f)};
	ObjectState spot = MakeState(Kind::SPOT_LIGHT, 3.0f);
	spot.myInnerCos = static_cast<float>(std::cos(20.0 * std::numbers::pi / 180.0));
	spot.myOuterCos = static_cast<float>(std::cos(35.0 * std::numbers::pi / 180.0));
	lists[1] = {spot};
	lists[2] = {MakeState(Kind::DECAL, 4.0f, "brick"), MakeState(Kind::DECAL, 5.0f, "moss")};
	lists[3] = {MakeState(Kind::PATH_NODE, 6.0f)};
	return lists;
}

double Degrees(float aCosine)
{
	return std::acos(static_cast<double>(aCosine)) * 180.0 / std::numbers::pi;
}

template <typename T> T* Child(const QObject& aParent, const char* aName)
{
	T* child = aParent.findChild<T*>(QString::fromLatin1(aName));
	if (child == nullptr)
	{
		qFatal("no child named %s", aName);
	}
	return child;
}

QStringList ChildTexts(const QTreeWidgetItem& aGroup)
{
	QStringList texts;
	for (int row = 0; row < aGroup.childCount(); ++row)
	{
		texts << aGroup.child(row)->text(0);
	}
	return texts;
}

void WriteFile(const QString& aPath, const QByteArray& someBytes)
{
	QFile file(aPath);
	QVERIFY(file.open(QIODevice::WriteOnly));
	file.write(someBytes);
}

// A bake backend the test finishes by hand.
struct FakeBake
{
	BakeRunner::Backend Backend()
	{
		return {[this](const BakeRequest& aRequest, std::function<void(BakeOutcome, const QString&)> aDone) {
			        myRequests << aRequest;
			        myDone = std::move(aDone);
		        },
		        [this] { ++myCancels; }, [this] { return myProgress; }};
	}

	QList<BakeRequest> myRequests;
	std::function<void(BakeOutcome, const QString&)> myDone;
	int myCancels = 0;
	BakeProgress myProgress;
};
} // namespace

class PanelsTest : public QObject
{
	Q_OBJECT

private slots:
	void init()
	{
		myDocument = std::make_unique<Document>(myEngine);
		myDocument->Reset(QStringLiteral("sample"), SampleLevel());
	}
	void cleanup() { myDocument.reset(); }

	void outlinerMirrorsTheDocument()
	{
		OutlinerPanel outliner(*myDocument);
		QTreeWidget& tree = *outliner.GetTree();
		QTreeWidgetItem& points = *tree.topLevelItem(0);
		QTreeWidgetItem& decals = *tree.topLevelItem(2);
		QCOMPARE(points.text(0), QStringLiteral("Point lights (2)"));
		QCOMPARE(ChildTexts(points), QStringList({"Point light 1", "Point light 2"}));
		QCOMPARE(ChildTexts(decals), QStringList({"Decal 1 — brick", "Decal 2 — moss"}));
		QCOMPARE(points.child(1)->text(1), QStringLiteral("2.000, 2.000, -3.000"));

		// An added object gets a row, selected as the document selects it.
		const ObjectId added = myDocument->Add(MakeState(Kind::POINT_LIGHT, 7.0f), QStringLiteral("Add"));
		QCoreApplication::processEvents();
		QCOMPARE(points.text(0), QStringLiteral("Point lights (3)"));
		QVERIFY(outliner.FindItem(added) != nullptr);
		QCOMPARE(tree.selectedItems(), QList<QTreeWidgetItem*>{outliner.FindItem(added)});

		// The designer's click selects in the document; no undo step for it.
		const int steps = myDocument->History().count();
		const ObjectId moss = myDocument->IdAt(Kind::DECAL, 1);
		tree.setCurrentItem(outliner.FindItem(moss));
		QCOMPARE(myDocument->GetSelected(), moss);
		QCOMPARE(myDocument->History().count(), steps);

		// The document's selection comes back to the tree.
		const ObjectId first = myDocument->IdAt(Kind::POINT_LIGHT, 0);
		myDocument->Select(first);
		QCOMPARE(tree.selectedItems(), QList<QTreeWidgetItem*>{outliner.FindItem(first)});

		// A removal moves the last light into the gap: its row is kept and renamed.
		QTreeWidgetItem* addedRow = outliner.FindItem(added);
		QVERIFY(myDocument->Remove(first));
		QCoreApplication::processEvents();
		QCOMPARE(outliner.FindItem(first), nullptr);
		QCOMPARE(outliner.FindItem(added), addedRow);
		QCOMPARE(ChildTexts(points), QStringList({"Point light 1", "Point light 2"}));
		QCOMPARE(addedRow->text(0), QStringLiteral("Point light 1"));
		QVERIFY(tree.selectedItems().isEmpty());

		// The filter matches names in any case; counts show what is shown of all.
		myDocument->Select(moss);
		outliner.SetFilter(QStringLiteral("MOSS"));
		QCoreApplication::processEvents();
		QCOMPARE(ChildTexts(decals), QStringList({"Decal 2 — moss"}));
		QCOMPARE(decals.text(0), QStringLiteral("Decals (1/2)"));
		QCOMPARE(points.text(0), QStringLiteral("Point lights (0/2)"));
		QCOMPARE(tree.selectedItems(), QList<QTreeWidgetItem*>{outliner.FindItem(moss)});
		// Filtering the selected row away leaves the document's selection alone.
		outliner.SetFilter(QStringLiteral("brick"));
		QCoreApplication::processEvents();
		QVERIFY(tree.selectedItems().isEmpty());
		QCOMPARE(myDocument->GetSelected(), moss);

		outliner.SetFilter(QString());
		outliner.SetKindFilter(Kind::SPOT_LIGHT);
		QCoreApplication::processEvents();
		QVERIFY(points.isHidden());
		QVERIFY(!tree.topLevelItem(1)->isHidden());

		QSignalSpy frames(&outliner, &OutlinerPanel::frameRequested);
		emit tree.itemDoubleClicked(outliner.FindItem(moss), 0);
		QCOMPARE(frames.count(), 1);
		QCOMPARE(frames.first().first().value<ObjectId>(), moss);
	}

	void propertiesEditsMergeIntoOneStep()
	{
		PropertiesPanel panel(*myDocument);
		const ObjectId id = myDocument->IdAt(Kind::POINT_LIGHT, 1);
		myDocument->Select(id);
		QCoreApplication::processEvents();
		QCOMPARE(Child<QLabel>(panel, "title")->text(), QStringLiteral("Point light 2"));
		QVERIFY(Child<QDoubleSpinBox>(panel, "innerAngle")->isHidden());
		QVERIFY(!Child<QDoubleSpinBox>(panel, "falloff")->isHidden());

		auto* x = Child<QDoubleSpinBox>(panel, "positionX");
		QCOMPARE(x->value(), 2.0);
		x->setValue(2.5);
		x->setValue(2.6);
		x->setValue(2.7);
		QCOMPARE(myDocument->Find(id)->myPosition[0], 2.7f);
		QCOMPARE(myDocument->History().count(), 1);
		QCOMPARE(myDocument->History().text(0), QStringLiteral("Change position"));

		myDocument->History().undo();
		QCoreApplication::processEvents();
		QCOMPARE(myDocument->Find(id)->myPosition[0], 2.0f);
		QCOMPARE(x->value(), 2.0);

		// Another field is its own step.
		Child<QDoubleSpinBox>(panel, "falloff")->setValue(4.0);
		QCOMPARE(myDocument->Find(id)->myFalloff, 4.0f);
		QCOMPARE(myDocument->History().index(), 1);
	}

	void colourKeepsTheRatioAndTheDialogCancels()
	{
		ObjectState state = *myDocument->Find(myDocument->IdAt(Kind::POINT_LIGHT, 0));
		const ObjectId id = myDocument->IdAt(Kind::POINT_LIGHT, 0);
		state.myColor = {2.0f, 1.0f, 0.5f};
		myDocument->SetState(id, state, QStringLiteral("Set up"));
		PropertiesPanel panel(*myDocument);
		QCoreApplication::processEvents();
		auto* intensity = Child<QDoubleSpinBox>(panel, "intensity");
		QCOMPARE(intensity->value(), 2.0);

		intensity->setValue(4.0);
		QCOMPARE(myDocument->Find(id)->myColor, (std::array{4.0f, 2.0f, 1.0f}));
		const int steps = myDocument->History().count();

		// A dialog session applies live and leaves no step when cancelled.
		Child<QToolButton>(panel, "color")->click();
		QColorDialog* dialog = panel.GetColorDialog();
		QVERIFY(dialog != nullptr && dialog->isVisible());
		QCOMPARE(dialog->currentColor().rgb(), QColor::fromRgbF(1.0f, 0.5f, 0.25f).rgb());
		dialog->setCurrentColor(QColor::fromRgbF(0.0f, 1.0f, 0.0f));
		QCOMPARE(myDocument->Find(id)->myColor, (std::array{0.0f, 4.0f, 0.0f}));
		dialog->setCurrentColor(QColor::fromRgbF(0.0f, 0.0f, 1.0f));
		QCOMPARE(myDocument->Find(id)->myColor, (std::array{0.0f, 0.0f, 4.0f}));
		QCOMPARE(myDocument->History().count(), steps);
		dialog->reject();
		QCOMPARE(myDocument->Find(id)->myColor, (std::array{4.0f, 2.0f, 1.0f}));
		QCOMPARE(myDocument->History().count(), steps);

		// Accepted, the session is one step, undone as one.
		Child<QToolButton>(panel, "color")->click();
		dialog->setCurrentColor(QColor::fromRgbF(1.0f, 1.0f, 0.0f));
		dialog->setCurrentColor(QColor::fromRgbF(0.0f, 1.0f, 1.0f));
		dialog->accept();
		QCOMPARE(myDocument->Find(id)->myColor, (std::array{0.0f, 4.0f, 4.0f}));
		QCOMPARE(myDocument->History().count(), steps + 1);
		myDocument->History().undo();
		QCOMPARE(myDocument->Find(id)->myColor, (std::array{4.0f, 2.0f, 1.0f}));
	}

	void spotAnglesAndDirection()
	{
		const ObjectId id = myDocument->IdAt(Kind::SPOT_LIGHT, 0);
		myDocument->Select(id);
		PropertiesPanel panel(*myDocument);
		auto* inner = Child<QDoubleSpinBox>(panel, "innerAngle");
		auto* outer = Child<QDoubleSpinBox>(panel, "outerAngle");
		QVERIFY(!inner->isHidden());
		QVERIFY(Child<QComboBox>(panel, "decalType")->isHidden());
		QCOMPARE(inner->value(), 20.0);
		QCOMPARE(outer->value(), 35.0);

		inner->setValue(25.0);
		QVERIFY(std::abs(Degrees(myDocument->Find(id)->myInnerCos) - 25.0) < 1e-4);

		// Past the outer angle the inner one stops just inside it, and the box shows that.
		inner->setValue(50.0);
		QCoreApplication::processEvents();
		const ObjectState* state = myDocument->Find(id);
		QVERIFY(state->myInnerCos > state->myOuterCos);
		QCOMPARE(inner->value(), 35.0 - PropertiesPanel::ourConeGapDegrees);
		outer->setValue(5.0);
		QCoreApplication::processEvents();
		QVERIFY(myDocument->Find(id)->myInnerCos > myDocument->Find(id)->myOuterCos);
		QCOMPARE(outer->value(), 35.0);

		// Directions are normalised; all zero is refused and the box shows the direction again.
		auto* dx = Child<QDoubleSpinBox>(panel, "directionX");
		auto* dy = Child<QDoubleSpinBox>(panel, "directionY");
		dx->setValue(1.0);
		const float half = static_cast<float>(std::sqrt(0.5));
		QCOMPARE(myDocument->Find(id)->myDirection, (std::array{half, half, 0.0f}));
		dy->setValue(0.0);
		QCOMPARE(myDocument->Find(id)->myDirection, (std::array{1.0f, 0.0f, 0.0f}));
		const int steps = myDocument->History().count();
		dx->setValue(0.0);
		QCoreApplication::processEvents();
		QCOMPARE(myDocument->Find(id)->myDirection, (std::array{1.0f, 0.0f, 0.0f}));
		QCOMPARE(dx->value(), 1.0);
		QCOMPARE(myDocument->History().count(), steps);
	}

	void showingValuesMakesNoEdit()
	{
		// Values the boxes cannot show exactly: writing them back would change them.
		const ObjectId decal = myDocument->IdAt(Kind::DECAL, 0);
		ObjectState state = *myDocument->Find(decal);
		state.myPosition = {1.23456f, -7.65432f, 0.00049f};
		state.myColor = {0.33333f, 0.1f, 0.7f};
		state.mySize = 2.71828f;
		state.myDirection = {0.0f, 0.6f, 0.8f};
		myDocument->SetState(decal, state, QStringLiteral("Set up"));
		PropertiesPanel panel(*myDocument);
		panel.SetDecalTypes({QStringLiteral("brick"), QStringLiteral("moss")});
		const int steps = myDocument->History().count();

		for (const ObjectId id :
		     {decal, myDocument->IdAt(Kind::SPOT_LIGHT, 0), myDocument->IdAt(Kind::PATH_NODE, 0), decal})
		{
			myDocument->Select(id);
			QCoreApplication::processEvents();
			QCOMPARE(panel.GetShownId(), id);
		}
		// The type box lists the catalogue only: other kinds put no empty type into it.
		QCOMPARE(Child<QComboBox>(panel, "decalType")->currentText(), QStringLiteral("brick"));
		QCOMPARE(Child<QComboBox>(panel, "decalType")->count(), 2);
		QCOMPARE(*myDocument->Find(decal), state);
		QCOMPARE(myDocument->History().count(), steps);

		// An undo shows the values it restored, again without an edit.
		Child<QDoubleSpinBox>(panel, "size")->setValue(3.0);
		myDocument->History().undo();
		QCoreApplication::processEvents();
		QCOMPARE(*myDocument->Find(decal), state);
		QCOMPARE(myDocument->History().index(), steps);

		myDocument->Select(0);
		QCoreApplication::processEvents();
		QCOMPARE(Child<QLabel>(panel, "title")->text(), QStringLiteral("Nothing selected"));
	}

	void settingsFilesGoodMissingAndDamaged()
	{
		QTemporaryDir folder;
		QVERIFY(folder.isValid());
		const QString ssao = folder.filePath(QStringLiteral("SSAO.xml"));
		const QString hdr = folder.filePath(QStringLiteral("HDRBloom.xml"));
		WriteFile(
		    ssao,
		    R"(<root><!-- tuned --><ssao scale="2" sample-rad="0.75" bias="0.1" intensity="3"/></root>)");
		WriteFile(hdr, R"(<root><hdr-bloom auto-exposure="0.5" lum-min="0.1" lum-max="8" bloom-threshold="1.5"
			bloom-factor="0.4" emissive-mult="3"/></root>)");
		QStringList notes;
		PostProcessingSettings read = PostProcessingSettings::Read(ssao, hdr, notes);
		QVERIFY2(notes.isEmpty(), qPrintable(notes.join('\n')));
		QCOMPARE(read.mySsaoSampleRadius, 0.75f);
		QCOMPARE(read.mySsaoIntensity, 3.0f);
		QCOMPARE(read.myLumMax, 8.0f);
		QCOMPARE(read.myEmissiveMultiplier, 3.0f);

		// The files the editor ships read without a note.
		notes.clear();
		PostProcessingSettings::Read(QString::fromLatin1(PostProcessingSettings::ourSsaoFile),
		                             QString::fromLatin1(PostProcessingSettings::ourHdrFile), notes);
		QVERIFY2(notes.isEmpty(), qPrintable(notes.join('\n')));

		// Missing: the defaults, and a note naming the file.
		notes.clear();
		read = PostProcessingSettings::Read(folder.filePath(QStringLiteral("none.xml")), hdr, notes);
		QCOMPARE(notes.size(), 1);
		QVERIFY(notes.first().contains(QStringLiteral("none.xml")));
		QCOMPARE(read.mySsaoScale, PostProcessingSettings().mySsaoScale);
		QCOMPARE(read.myLumMax, 8.0f);

		// Broken XML: nothing of the file is used; a value that is no number: that value only.
		WriteFile(ssao, R"(<root><ssao scale="2" sample-rad="0.75" bias="0.1" intensity="3"/><root>)");
		WriteFile(hdr,
		          R"(<root><hdr-bloom auto-exposure="bright" lum-min="0.1" lum-max="8" bloom-threshold="1.5"
			bloom-factor="0.4"/></root>)");
		notes.clear();
		read = PostProcessingSettings::Read(ssao, hdr, notes);
		QCOMPARE(notes.size(), 3);
		QVERIFY(notes[0].contains(QStringLiteral("could not be read")));
		QVERIFY(notes[1].contains(QStringLiteral("auto-exposure")) &&
		        notes[1].contains(QStringLiteral("bright")));
		QVERIFY(notes[2].contains(QStringLiteral("emissive-mult")));
		const PostProcessingSettings defaults;
		QCOMPARE(read.mySsaoScale, defaults.mySsaoScale);
		QCOMPARE(read.mySsaoSampleRadius, defaults.mySsaoSampleRadius);
		QCOMPARE(read.myAutoExposure, defaults.myAutoExposure);
		QCOMPARE(read.myEmissiveMultiplier, defaults.myEmissiveMultiplier);
		QCOMPARE(read.myLumMax, 8.0f);
	}

	void bakeProgressLines()
	{
		BakeProgress progress;
		QCOMPARE(BakeRunner::Describe(progress), QString());
		progress.myPhase = Zeph::BakePhase::AMBIENT;
		progress.myBounce = 1;
		progress.myBounceCount = 2;
		progress.myProbesDone = 120;
		progress.myProbesTotal = 468;
		progress.myElapsedSeconds = 3.0;
		progress.mySecondsLeft = 11.6;
		QCOMPARE(BakeRunner::Describe(progress),
		         QStringLiteral("Ambient: bounce 1/2, 120/468 probes, about 12 s left"));
		progress.mySecondsLeft = 185.0;
		QCOMPARE(BakeRunner::Describe(progress),
		         QStringLiteral("Ambient: bounce 1/2, 120/468 probes, about 3 min 05 s left"));
		progress = BakeProgress();
		progress.myPhase = Zeph::BakePhase::REFLECTIONS;
		progress.myRoomsDone = 3;
		progress.myRoomsTotal = 8;
		progress.myElapsedSeconds = 2.2;
		QCOMPARE(BakeRunner::Describe(progress), QStringLiteral("Reflections: 3/8 rooms, 2 s so far"));
		QCOMPARE(BakeRunner::DescribeSeconds(3725.0), QStringLiteral("1 h 02 min"));
	}

	void bakeRunnerAndPanel()
	{
		FakeBake bake;
		BakeRunner runner(bake.Backend());
		BakePanel panel(runner);
		auto* bakeButton = Child<QPushButton>(panel, "bake");
		auto* cancelButton = Child<QPushButton>(panel, "cancel");
		QVERIFY(!bakeButton->isEnabled());
		panel.SetLevel(QStringLiteral("sample"));
		panel.SetRooms({QStringLiteral("hall"), QStringLiteral("cellar")});
		panel.SetSelectedRoom(QStringLiteral("cellar"));
		Child<QRadioButton>(panel, "oneRoom")->setChecked(true);
		Child<QSpinBox>(panel, "bounces")->setValue(3);
		// The last kind checked cannot be unchecked.
		Child<QCheckBox>(panel, "reflections")->setChecked(false);
		QVERIFY(!Child<QCheckBox>(panel, "ambient")->isEnabled());
		QVERIFY(bakeButton->isEnabled() && !cancelButton->isEnabled());

		QSignalSpy states(&runner, &BakeRunner::stateChanged);
		bakeButton->click();
		QCOMPARE(bake.myRequests.size(), 1);
		const BakeRequest& request = bake.myRequests.first();
		QCOMPARE(request.myLevel, QStringLiteral("sample"));
		QCOMPARE(request.myBounces, 3);
		QVERIFY(request.myAmbientFlag && !request.myReflectionsFlag);
		QCOMPARE(request.myRoomIds, QStringList{QStringLiteral("cellar")});
		QCOMPARE(runner.GetState(), BakeRunner::State::RUNNING);
		QVERIFY(!bakeButton->isEnabled() && cancelButton->isEnabled());
		QVERIFY(!runner.Start(request));
		QCOMPARE(bake.myRequests.size(), 1);

		// Progress is polled while it runs.
		bake.myProgress.myPhase = Zeph::BakePhase::AMBIENT;
		bake.myProgress.myProbesDone = 5;
		bake.myProgress.myProbesTotal = 10;
		QTRY_COMPARE(Child<QProgressBar>(panel, "progress")->value(), 500);
		QVERIFY(
		    Child<QLabel>(panel, "progressText")->text().startsWith(QStringLiteral("Ambient: 5/10 probes")));

		// A cancel is asked again while the engine still bakes, then the bake ends cancelled.
		cancelButton->click();
		QVERIFY(!cancelButton->isEnabled());
		QTRY_VERIFY(bake.myCancels >= 2);
		QSignalSpy ended(&panel, &BakePanel::bakeFinished);
		bake.myProgress = BakeProgress();
		bake.myDone(BakeOutcome::CANCELLED, QString());
		QCOMPARE(runner.GetState(), BakeRunner::State::CANCELLED);
		QCOMPARE(ended.count(), 1);
		QCOMPARE(Child<QLabel>(panel, "result")->text(),
		         QStringLiteral("Cancelled: the previous files are kept"));
		QVERIFY(bakeButton->isEnabled());

		bakeButton->click();
		bake.myDone(BakeOutcome::FAILED, QStringLiteral("The level has no rooms\n"));
		QCOMPARE(Child<QLabel>(panel, "result")->text(), QStringLiteral("Failed: The level has no rooms"));
		bakeButton->click();
		bake.myDone(BakeOutcome::FINISHED, QString());
		QVERIFY(Child<QLabel>(panel, "result")->text().startsWith(QStringLiteral("Baked in ")));
		QCOMPARE(runner.GetState(), BakeRunner::State::FINISHED);
		QCOMPARE(states.count(), 6);
		// A late completion of a finished bake changes nothing.
		bake.myDone(BakeOutcome::FAILED, QStringLiteral("late"));
		QCOMPARE(runner.GetState(), BakeRunner::State::FINISHED);
	}

	void logAndProblems()
	{
		LogPanel log;
		QSignalSpy errors(&log, &LogPanel::errorCountChanged);
		log.AddReport(0, QStringLiteral("Zeph::Engine::Init"), QStringLiteral("Started"));
		log.AddReport(3, QStringLiteral("XML::Error"), QStringLiteral("Could not find name [bias]"));
		QCOMPARE(log.ErrorCount(), 1);
		QCOMPARE(errors.count(), 1);
		QStringList lines = log.GetText()->toPlainText().split('\n');
		QCOMPARE(lines.size(), 2);
		QVERIFY(lines[1].contains(QRegularExpression(
		    QStringLiteral(R"(^\d\d:\d\d:\d\d  CRITICAL  Could not find name \[bias\]  \(XML::Error\)$)"))));
		log.SetErrorsOnly(true);
		QCOMPARE(log.GetText()->toPlainText().split('\n').size(), 1);
		QVERIFY(log.GetText()->toPlainText().contains(QStringLiteral("CRITICAL")));
		log.SetErrorsOnly(false);
		for (int index = 0; index < LogPanel::ourMaxEntries; ++index)
		{
			log.AddReport(0, QString(), QStringLiteral("line %1").arg(index));
		}
		QCOMPARE(log.GetText()->document()->blockCount(), LogPanel::ourMaxEntries);
		log.SetErrorsOnly(true);
		QVERIFY(log.GetText()->toPlainText().isEmpty());
		QCOMPARE(log.ErrorCount(), 1);
		log.Clear();
		QCOMPARE(log.ErrorCount(), 0);

		ProblemsPanel problems;
		QCOMPARE(problems.GetHeader(), QStringLiteral("No problems"));
		problems.SetProblems(
		    QStringLiteral("three"),
		    {{QStringLiteral("levels/three/lights.xml"), QStringLiteral("pointlight"),
		      QStringLiteral("falloff is not a number"), false},
		     {QStringLiteral("levels/three/probes.bin"), QString(), QStringLiteral("truncated"), true}});
		QCOMPARE(problems.GetHeader(), QStringLiteral("Level three was not opened: 2 problems"));
		QCOMPARE(problems.Count(), 2);
		QCOMPARE(problems.GetTree()->topLevelItem(0)->text(1), QStringLiteral("pointlight"));
		QVERIFY(problems.GetTree()->topLevelItem(1)->font(0).italic());
		problems.Clear();
		QCOMPARE(problems.Count(), 0);
		QCOMPARE(problems.GetHeader(), QStringLiteral("No problems"));
	}

private:
	FakeEngine myEngine;
	std::unique_ptr<Document> myDocument;
};

QTEST_MAIN(PanelsTest)
#include "PanelsTest.moc"
