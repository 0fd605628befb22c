#include "main/MainWindow.h"

#include <QAction>
#include <QActionGroup>
#include <QApplication>
#include <QCloseEvent>
#include <QDir>
#include <QDockWidget>
#include <QDoubleSpinBox>
#include <QInputDialog>
#include <QMenu>
#include <QMenuBar>
#include <QMessageBox>
#include <QScreen>
#include <QSettings>
#include <QStatusBar>
#include <QTimer>
#include <QToolBar>
#include <QUndoStack>
#include <QWindow>
#include <cmath>

#include "bake/BakePanel.h"
#include "bake/BakeRunner.h"
#include "main/KeyTable.h"
#include "panels/LogPanel.h"
#include "panels/OutlinerPanel.h"
#include "panels/PostProcessingPanel.h"
#include "panels/ProblemsPanel.h"
#include "panels/PropertiesPanel.h"
#include "view/EngineView.h"
#include "view/ViewController.h"

namespace LumoraEditor
{
namespace
{
// Where new objects appear in front of the camera, as the engine's own additions place them.
constexpr float ourPlacementDistance = 10.0f;
constexpr float ourNodePlacementDistance = 2.0f;
// The decal type a new decal takes when the catalogue has it, else the catalogue's first.
constexpr const char* ourDefaultDecalType = "brick";

QString Format(const std::array<float, 3>& aVector)
{
	return QStringLiteral("%1, %2, %3")
	    .arg(aVector[0], 0, 'f', 2)
	    .arg(aVector[1], 0, 'f', 2)
	    .arg(aVector[2], 0, 'f', 2);
}
} // namespace

MainWindow::MainWindow()
{
	setObjectName(QStringLiteral("MainWindow"));
	myDocument = std::make_unique<Document>(myEngine);
	myView = new EngineView(this);
	myController = new ViewController(*myDocument, myEngine, this);
	myView->SetController(myController);
	setCentralWidget(myView);
	myBakeRunner = new BakeRunner(myEngine, this);

	BuildActions();
	BuildDocks();
	BuildMenus();
	BuildStatusBar();

	connect(myView, &EngineView::exposed, this, [this](quint64 aWindow, QSize aSize) {
		myController->SetViewSize(aSize);
		myEngine.Start(aWindow, aSize);
	});
	connect(myView, &EngineView::resized, this, [this](QSize aSize) {
		myController->SetViewSize(aSize);
		myEngine.Resize(aSize);
	});
	connect(&myEngine, &EngineThread::started, this, &MainWindow::OnEngineStarted);
	connect(&myEngine, &EngineThread::frameRendered, this, &MainWindow::OnFrame);
	connect(&myEngine, &EngineThread::logReport, myLog, &LogPanel::AddReport);
	connect(&myOpenChecker, &LevelChecker::finished, this, &MainWindow::OnChecked);
	connect(&myBakeChecker, &LevelChecker::finished, this, &MainWindow::ShowBakeState);

	connect(myDocument.get(), &Document::modifiedChanged, this, &MainWindow::RefreshTitle);
	connect(myDocument.get(), &Document::selectionChanged, this, &MainWindow::ShowSelection);
	connect(myDocument.get(), &Document::objectChanged, this, &MainWindow::ShowSelection);
	connect(myDocument.get(), &Document::modeChanged, this, [this](int aMode) {
		myModeActions[aMode]->setChecked(true);
		RefreshActions();
	});
	connect(myController, &ViewController::cameraChanged, this, [this](const CameraPlacement& aPlacement) {
		myCameraLabel->setText(tr("Camera %1").arg(Format(aPlacement.myPosition)));
	});
	connect(myController, &ViewController::message, this,
	        [this](const QString& aText) { statusBar()->showMessage(aText, 4000); });
	connect(myOutliner, &OutlinerPanel::frameRequested, this, [this](ObjectId anId) {
		myDocument->Select(anId);
		myController->FrameSelection();
	});
	connect(myBakeRunner, &BakeRunner::progressChanged, this, [this](const BakeProgress& aProgress) {
		if (aProgress.myPhase != Zeph::BakePhase::IDLE)
		{
			myBakeLabel->setText(tr("Baking: %1").arg(BakeRunner::Describe(aProgress)));
			myBakeLabel->setStyleSheet(QString());
		}
	});
	connect(myBakePanel, &BakePanel::bakeFinished, this, [this](BakeOutcome) {
		myEngine.RequestFrames();
		if (myDocument->HasLevel())
		{
			myBakeChecker.Check(myDocument->GetLevel());
		}
	});

	RestoreSettings();
	RefreshTitle();
	RefreshActions();
}

MainWindow::~MainWindow()
{
	myController->CancelDrag();
	myEngine.Stop();
}

// --- building --------------------------------------------------------------------------

void MainWindow::BuildActions()
{
	myOpenAction = new QAction(tr("&Open Level…"), this);
	myOpenAction->setShortcut(QKeySequence::Open);
	connect(myOpenAction, &QAction::triggered, this, &MainWindow::ChooseLevel);
	mySaveAction = new QAction(tr("&Save"), this);
	mySaveAction->setShortcut(QKeySequence::Save);
	connect(mySaveAction, &QAction::triggered, this, [this] { Save(); });

	static constexpr const char* ourAddNames[] = {"Add &Point Light", "Add &Spot Light", "Add &Decal",
	                                              "Add Path &Node"};
	for (int kind = 0; kind < ourKindCount; ++kind)
	{
		myAddActions[kind] = new QAction(tr(ourAddNames[kind]), this);
		myAddActions[kind]->setShortcut(QKeySequence(Qt::CTRL | static_cast<Qt::Key>(Qt::Key_1 + kind)));
		connect(myAddActions[kind], &QAction::triggered, this,
		        [this, kind] { AddObject(static_cast<Kind>(kind)); });
	}
	myCopyAction = new QAction(tr("D&uplicate"), this);
	myCopyAction->setShortcut(QKeySequence(Qt::CTRL | Qt::Key_D));
	connect(myCopyAction, &QAction::triggered, this, &MainWindow::CopySelected);
	myDeleteAction = new QAction(tr("&Delete"), this);
	myDeleteAction->setShortcut(QKeySequence::Delete);
	connect(myDeleteAction, &QAction::triggered, this, &MainWindow::DeleteSelected);

	auto* modes = new QActionGroup(this);
	static constexpr const char* ourModeNames[] = {"&Lights", "&Path Nodes", "&Decals"};
	for (int mode = 0; mode < 3; ++mode)
	{
		myModeActions[mode] = new QAction(tr(ourModeNames[mode]), modes);
		myModeActions[mode]->setCheckable(true);
		// The number keys alone switch the mode while the view has the keyboard (ViewController).
		connect(myModeActions[mode], &QAction::triggered, this, [this, mode] { myDocument->SetMode(mode); });
	}
	myModeActions[0]->setChecked(true);

	// The engine's light markers: a box per light and each light's volume in outline. Off by
	// default: the icons and the selection's reach wires show the same without hiding the room.
	myMeshesAction = new QAction(tr("Light &Meshes"), this);
	myMeshesAction->setToolTip(tr("Marker boxes and light volume outlines for every light"));
	myMeshesAction->setCheckable(true);
	myRoomsAction = new QAction(tr("&Room Boxes"), this);
	myRoomsAction->setCheckable(true);
	myIconsAction = new QAction(tr("Light &Icons"), this);
	myIconsAction->setCheckable(true);
	myIconsAction->setChecked(true);
	auto* volumes = new QActionGroup(this);
	static constexpr const char* ourVolumeNames[] = {"No Light Volumes", "Selected Light's Volume",
	                                                 "All Light Volumes"};
	for (int which = 0; which < 3; ++which)
	{
		myVolumeActions[which] = new QAction(tr(ourVolumeNames[which]), volumes);
		myVolumeActions[which]->setCheckable(true);
		connect(myVolumeActions[which], &QAction::triggered, this, &MainWindow::ApplyDisplay);
	}
	myVolumeActions[1]->setChecked(true);
	myFastCameraAction = new QAction(tr("&Fast Camera"), this);
	myFastCameraAction->setToolTip(
	    tr("Draw at a third of the resolution while the camera moves, and sharp again when it stops"));
	myFastCameraAction->setCheckable(true);
	myFastCameraAction->setChecked(true);
	for (QAction* toggle : {myMeshesAction, myRoomsAction, myIconsAction, myFastCameraAction})
	{
		connect(toggle, &QAction::toggled, this, &MainWindow::ApplyDisplay);
	}
}

void MainWindow::BuildMenus()
{
	QMenu* file = menuBar()->addMenu(tr("&File"));
	file->addAction(myOpenAction);
	myRecentMenu = file->addMenu(tr("Open &Recent"));
	file->addAction(mySaveAction);
	file->addSeparator();
	QAction* quit = file->addAction(tr("&Quit"), this, &QWidget::close);
	quit->setShortcut(QKeySequence::Quit);

	QMenu* edit = menuBar()->addMenu(tr("&Edit"));
	QAction* undo = myDocument->History().createUndoAction(this, tr("&Undo"));
	undo->setShortcut(QKeySequence::Undo);
	QAction* redo = myDocument->History().createRedoAction(this, tr("&Redo"));
	redo->setShortcuts({QKeySequence(Qt::CTRL | Qt::SHIFT | Qt::Key_Z), QKeySequence::Redo});
	edit->addAction(undo);
	edit->addAction(redo);
	edit->addSeparator();
	for (QAction* add : myAddActions)
	{
		edit->addAction(add);
	}
	edit->addAction(myCopyAction);
	edit->addAction(myDeleteAction);

	myViewMenu = menuBar()->addMenu(tr("&View"));
	QMenu* modes = myViewMenu->addMenu(tr("&Mode"));
	for (QAction* mode : myModeActions)
	{
		modes->addAction(mode);
	}
	myViewMenu->addAction(myMeshesAction);
	myViewMenu->addAction(myRoomsAction);
	myViewMenu->addAction(myIconsAction);
	myViewMenu->addAction(myFastCameraAction);
	for (QAction* which : myVolumeActions)
	{
		myViewMenu->addAction(which);
	}
	myViewMenu->addSeparator();
	myViewMenu->addAction(tr("&Frame Selection\tF"), myController, &ViewController::FrameSelection);
	myViewMenu->addAction(tr("Level's &Start View\tHome"), myController, &ViewController::GoToStartView);
	QAction* faster = myViewMenu->addAction(tr("Camera Fast&er"), this,
	                                        [this] { mySpeedBox->setValue(mySpeedBox->value() * 1.5); });
	faster->setShortcut(QKeySequence(Qt::CTRL | Qt::Key_Equal));
	QAction* slower = myViewMenu->addAction(tr("Camera S&lower"), this,
	                                        [this] { mySpeedBox->setValue(mySpeedBox->value() / 1.5); });
	slower->setShortcut(QKeySequence(Qt::CTRL | Qt::Key_Minus));
	myViewMenu->addSeparator();
	for (QDockWidget* dock : findChildren<QDockWidget*>())
	{
		myViewMenu->addAction(dock->toggleViewAction());
	}

	QMenu* help = menuBar()->addMenu(tr("&Help"));
	help->addAction(tr("&Keys"), this, &MainWindow::ShowKeys)->setShortcut(QKeySequence::HelpContents);
	help->addAction(tr("&About Lumora Editor"), this, [this] {
		QMessageBox::about(this, tr("About Lumora Editor"),
		                   tr("<b>Lumora Editor</b><p>Place and tune the lights, decals and path nodes of a "
		                      "level, bake its ambient light and reflections, and save them back.</p>"));
	});

	QToolBar* tools = addToolBar(tr("Tools"));
	tools->setObjectName(QStringLiteral("Tools"));
	tools->addAction(myOpenAction);
	tools->addAction(mySaveAction);
	tools->addSeparator();
	// The tool bar's buttons keep short names (the menu's carry the step's name), so the bar
	// does not shift with every edit; the step's name is the button's tool tip.
	QUndoStack& history = myDocument->History();
	QAction* undoButton = tools->addAction(tr("Undo"), &history, &QUndoStack::undo);
	QAction* redoButton = tools->addAction(tr("Redo"), &history, &QUndoStack::redo);
	undoButton->setEnabled(false);
	redoButton->setEnabled(false);
	connect(&history, &QUndoStack::canUndoChanged, undoButton, &QAction::setEnabled);
	connect(&history, &QUndoStack::canRedoChanged, redoButton, &QAction::setEnabled);
	connect(&history, &QUndoStack::undoTextChanged, undoButton,
	        [undoButton](const QString& aText) { undoButton->setToolTip(tr("Undo %1").arg(aText)); });
	connect(&history, &QUndoStack::redoTextChanged, redoButton,
	        [redoButton](const QString& aText) { redoButton->setToolTip(tr("Redo %1").arg(aText)); });
	tools->addSeparator();
	for (QAction* add : myAddActions)
	{
		tools->addAction(add);
	}
	tools->addAction(myCopyAction);
	tools->addAction(myDeleteAction);
	tools->addSeparator();
	for (QAction* mode : myModeActions)
	{
		tools->addAction(mode);
	}
	tools->addSeparator();
	tools->addAction(myMeshesAction);
	tools->addAction(myRoomsAction);
	tools->addSeparator();
	mySpeedBox = new QDoubleSpinBox(tools);
	mySpeedBox->setObjectName(QStringLiteral("CameraSpeed"));
	mySpeedBox->setRange(0.1, 500.0);
	mySpeedBox->setDecimals(1);
	mySpeedBox->setSuffix(tr(" m/s"));
	mySpeedBox->setToolTip(tr("Camera speed while flying (Shift: four times faster)"));
	mySpeedBox->setValue(myController->Camera().GetSpeed());
	connect(mySpeedBox, &QDoubleSpinBox::valueChanged, this,
	        [this](double aSpeed) { myController->Camera().SetSpeed(static_cast<float>(aSpeed)); });
	tools->addWidget(new QLabel(tr(" Speed "), tools));
	tools->addWidget(mySpeedBox);
}

void MainWindow::BuildDocks()
{
	const auto dock = [this](const QString& aTitle, const QString& aName, QWidget* aContent,
	                         Qt::DockWidgetArea anArea) {
		auto* widget = new QDockWidget(aTitle, this);
		widget->setObjectName(aName);
		widget->setWidget(aContent);
		addDockWidget(anArea, widget);
		return widget;
	};
	myOutliner = new OutlinerPanel(*myDocument, this);
	dock(tr("Outliner"), QStringLiteral("OutlinerDock"), myOutliner, Qt::LeftDockWidgetArea);
	myProperties = new PropertiesPanel(*myDocument, this);
	QDockWidget* properties =
	    dock(tr("Properties"), QStringLiteral("PropertiesDock"), myProperties, Qt::RightDockWidgetArea);
	myPostProcessing = new PostProcessingPanel(myEngine, this);
	QDockWidget* post =
	    dock(tr("Post-processing"), QStringLiteral("PostDock"), myPostProcessing, Qt::RightDockWidgetArea);
	myBakePanel = new BakePanel(*myBakeRunner, this);
	QDockWidget* bake = dock(tr("Bake"), QStringLiteral("BakeDock"), myBakePanel, Qt::RightDockWidgetArea);
	tabifyDockWidget(properties, post);
	tabifyDockWidget(post, bake);
	properties->raise();
	myLog = new LogPanel(this);
	QDockWidget* log = dock(tr("Log"), QStringLiteral("LogDock"), myLog, Qt::BottomDockWidgetArea);
	myProblems = new ProblemsPanel(this);
	myProblemsDock =
	    dock(tr("Problems"), QStringLiteral("ProblemsDock"), myProblems, Qt::BottomDockWidgetArea);
	tabifyDockWidget(log, myProblemsDock);
	log->raise();
	// The view keeps most of the window: side docks a panel's width, the log a few lines.
	resizeDocks({findChild<QDockWidget*>(QStringLiteral("OutlinerDock")), properties}, {270, 380},
	            Qt::Horizontal);
	resizeDocks({log}, {150}, Qt::Vertical);
}

void MainWindow::BuildStatusBar()
{
	myCameraLabel = new QLabel(this);
	myFrameLabel = new QLabel(this);
	mySelectionLabel = new QLabel(tr("Nothing selected"), this);
	myBakeLabel = new QLabel(this);
	myBakeLabel->setObjectName(QStringLiteral("BakeState"));
	statusBar()->addPermanentWidget(mySelectionLabel);
	statusBar()->addPermanentWidget(myCameraLabel);
	statusBar()->addPermanentWidget(myFrameLabel);
	statusBar()->addPermanentWidget(myBakeLabel);
}

// --- settings ----------------------------------------------------------------------------

void MainWindow::RestoreSettings()
{
	QSettings settings;
	if (!restoreGeometry(settings.value(QStringLiteral("window/geometry")).toByteArray()))
	{
		resize(1600, 900);
	}
	restoreState(settings.value(QStringLiteral("window/state")).toByteArray());
	mySpeedBox->setValue(settings.value(QStringLiteral("camera/speed"), 8.0).toDouble());
	myMeshesAction->setChecked(settings.value(QStringLiteral("display/meshes"), false).toBool());
	myRoomsAction->setChecked(settings.value(QStringLiteral("display/rooms"), false).toBool());
	myIconsAction->setChecked(settings.value(QStringLiteral("display/icons"), true).toBool());
	myFastCameraAction->setChecked(settings.value(QStringLiteral("display/fast-camera"), true).toBool());
	myVolumeActions[std::clamp(settings.value(QStringLiteral("display/volumes"), 1).toInt(), 0, 2)]
	    ->setChecked(true);
	RefreshRecentMenu();
}

void MainWindow::StoreSettings() const
{
	QSettings settings;
	settings.setValue(QStringLiteral("window/geometry"), saveGeometry());
	settings.setValue(QStringLiteral("window/state"), saveState());
	settings.setValue(QStringLiteral("camera/speed"), mySpeedBox->value());
	settings.setValue(QStringLiteral("display/meshes"), myMeshesAction->isChecked());
	settings.setValue(QStringLiteral("display/rooms"), myRoomsAction->isChecked());
	settings.setValue(QStringLiteral("display/icons"), myIconsAction->isChecked());
	settings.setValue(QStringLiteral("display/fast-camera"), myFastCameraAction->isChecked());
	for (int which = 0; which < 3; ++which)
	{
		if (myVolumeActions[which]->isChecked())
		{
			settings.setValue(QStringLiteral("display/volumes"), which);
		}
	}
}

void MainWindow::RememberRecent(const QString& aLevel)
{
	QSettings settings;
	QStringList recent = settings.value(QStringLiteral("recent")).toStringList();
	recent.removeAll(aLevel);
	recent.prepend(aLevel);
	settings.setValue(QStringLiteral("recent"), recent.mid(0, ourRecentCount));
	RefreshRecentMenu();
}

void MainWindow::RefreshRecentMenu()
{
	myRecentMenu->clear();
	const QStringList levels = ListLevels();
	for (const QString& level : QSettings().value(QStringLiteral("recent")).toStringList())
	{
		// A level deleted or in another data folder is not offered.
		if (levels.contains(level))
		{
			myRecentMenu->addAction(level, this, [this, level] { OpenLevel(level); });
		}
	}
	myRecentMenu->setEnabled(!myRecentMenu->isEmpty());
}

// --- state shown -------------------------------------------------------------------------

void MainWindow::RefreshTitle()
{
	setWindowTitle(myDocument->HasLevel() ? tr("%1[*] — Lumora Editor").arg(myDocument->GetLevel())
	                                      : tr("Lumora Editor"));
	setWindowModified(myDocument->IsModified());
}

void MainWindow::RefreshActions()
{
	const bool levelFlag = myDocument->HasLevel() && myEngineStartedFlag;
	mySaveAction->setEnabled(levelFlag);
	const int mode = myDocument->GetMode();
	myAddActions[0]->setEnabled(levelFlag);
	myAddActions[1]->setEnabled(levelFlag);
	myAddActions[2]->setEnabled(levelFlag && !myDecalTypes.isEmpty());
	myAddActions[3]->setEnabled(levelFlag);
	const bool selectedFlag = myDocument->GetSelected() != 0;
	myCopyAction->setEnabled(selectedFlag && mode != 1);
	myDeleteAction->setEnabled(selectedFlag);
}

void MainWindow::ShowSelection()
{
	const ObjectId id = myDocument->GetSelected();
	const ObjectState* state = myDocument->Find(id);
	if (state == nullptr)
	{
		mySelectionLabel->setText(tr("Nothing selected"));
	}
	else
	{
		mySelectionLabel->setText(tr("%1 %2 at %3")
		                              .arg(QString::fromUtf8(KindName(state->myKind)))
		                              .arg(myDocument->IndexOf(id) + 1)
		                              .arg(Format(state->myPosition)));
		// The bake panel's "room" follows the selection: the room it stands in (the last of
		// several, as the engine places entities).
		for (size_t room = 0; room < myRoomBounds.size(); ++room)
		{
			const auto& [low, high] = myRoomBounds[room];
			bool insideFlag = true;
			for (int axis = 0; axis < 3; ++axis)
			{
				insideFlag = insideFlag && state->myPosition[axis] >= low[axis] &&
				             state->myPosition[axis] <= high[axis];
			}
			if (insideFlag)
			{
				myBakePanel->SetSelectedRoom(myRoomIds.value(static_cast<int>(room)));
			}
		}
	}
	RefreshActions();
}

void MainWindow::ShowBakeState(const CheckResult& aResult)
{
	if (aResult.myLevel != myDocument->GetLevel())
	{
		return;
	}
	const QStringList problems = aResult.BakeProblems();
	if (!aResult.myRanFlag)
	{
		myBakeState = tr("Bake state unknown");
	}
	else if (!problems.isEmpty())
	{
		myBakeState = tr("Bake stale");
	}
	else if (!aResult.myNotes.isEmpty())
	{
		myBakeState = tr("Not fully baked");
	}
	else
	{
		myBakeState = tr("Bake up to date");
	}
	myBakeLabel->setText(myBakeState);
	QStringList lines = problems + aResult.myNotes;
	if (!aResult.myRanFlag && !aResult.myProblems.isEmpty())
	{
		lines << aResult.myProblems.front().message;
	}
	myBakeLabel->setToolTip(lines.join('\n'));
	myBakeLabel->setStyleSheet(
	    problems.isEmpty() && aResult.myNotes.isEmpty() ? QString() : QStringLiteral("color: #c0392b"));
}

void MainWindow::ApplyDisplay()
{
	DisplayOptions options;
	options.myMeshesFlag = myMeshesAction->isChecked();
	options.myRoomsFlag = myRoomsAction->isChecked();
	options.myLightIconsFlag = myIconsAction->isChecked();
	options.myFastCameraFlag = myFastCameraAction->isChecked();
	for (int which = 0; which < 3; ++which)
	{
		if (myVolumeActions[which]->isChecked())
		{
			options.myLightVolumes = which;
		}
	}
	if (myEngineStartedFlag)
	{
		myEngine.SetDisplay(options);
	}
}

void MainWindow::OnFrame(double aMilliseconds, QSize aSize)
{
	myLastFrameMs = aMilliseconds;
	myDrawnSize = aSize;
	++myFrameCount;
	myFrameLabel->setText(
	    tr("%1 ms  %2×%3").arg(aMilliseconds, 0, 'f', 0).arg(aSize.width()).arg(aSize.height()));
}

// --- levels ------------------------------------------------------------------------------

QStringList MainWindow::ListLevels() const
{
	return QDir(QStringLiteral("data/XML/levels")).entryList(QDir::Dirs | QDir::NoDotAndDotDot, QDir::Name);
}

void MainWindow::OnEngineStarted(bool anOkFlag, const QString& aProblem)
{
	myEngineStartedFlag = anOkFlag;
	if (!anOkFlag)
	{
		QMessageBox::critical(this, tr("Lumora Editor"), aProblem);
		return;
	}
	ApplyDisplay();
	RefreshActions();
	if (!myPendingLevel.isEmpty())
	{
		OpenLevel(std::exchange(myPendingLevel, QString()));
	}
}

void MainWindow::ChooseLevel()
{
	const QStringList levels = ListLevels();
	if (levels.isEmpty())
	{
		QMessageBox::information(
		    this, tr("Open Level"),
		    tr("No levels under %1").arg(QDir::current().absoluteFilePath("data/XML/levels")));
		return;
	}
	bool okFlag = false;
	const QString level = QInputDialog::getItem(
	    this, tr("Open Level"), tr("Level:"), levels,
	    std::max<int>(0, static_cast<int>(levels.indexOf(myDocument->GetLevel()))), false, &okFlag);
	if (okFlag && !level.isEmpty())
	{
		OpenLevel(level);
	}
}

void MainWindow::OpenLevel(const QString& aLevel)
{
	if (!myEngineStartedFlag)
	{
		myPendingLevel = aLevel;
		return;
	}
	MaybeSaveThen([this, aLevel] {
		statusBar()->showMessage(tr("Checking %1…").arg(aLevel));
		myOpenChecker.Check(aLevel);
	});
}

void MainWindow::OnChecked(const CheckResult& aResult)
{
	if (!aResult.myRanFlag || aResult.HasLevelProblems())
	{
		QList<LevelProblem> problems;
		for (const LevelProblem& problem : aResult.myProblems)
		{
			if (!problem.bakedFlag)
			{
				problems << problem;
			}
		}
		myProblems->SetProblems(aResult.myLevel, problems);
		myProblemsDock->show();
		myProblemsDock->raise();
		statusBar()->showMessage(
		    tr("%1 was not opened: %n problem(s); see Problems", nullptr, problems.size())
		        .arg(aResult.myLevel),
		    8000);
		emit levelOpened(aResult.myLevel, false);
		return;
	}
	myProblems->Clear();
	statusBar()->showMessage(tr("Loading %1…").arg(aResult.myLevel));
	myController->CancelDrag();
	myEngine.LoadLevel(aResult.myLevel, [this, aResult](const LevelSnapshot& aSnapshot) {
		OnLevelLoaded(aSnapshot);
		ShowBakeState(aResult);
	});
}

void MainWindow::OnLevelLoaded(const LevelSnapshot& aSnapshot)
{
	myDocument->Reset(aSnapshot.myLevel, aSnapshot.myObjects);
	myDecalTypes = aSnapshot.myDecalTypes;
	myProperties->SetDecalTypes(aSnapshot.myDecalTypes);
	myBakePanel->SetLevel(aSnapshot.myLevel);
	myBakePanel->SetRooms(aSnapshot.myRoomIds);
	myRoomIds = aSnapshot.myRoomIds;
	myRoomBounds = aSnapshot.myRoomBounds;
	myController->SetStartView(aSnapshot.myStartView);
	myController->SetCamera(aSnapshot.myStartView);
	myDocument->SetMode(0);
	RememberRecent(aSnapshot.myLevel);
	RefreshTitle();
	RefreshActions();
	statusBar()->showMessage(aSnapshot.myProblems.isEmpty()
	                             ? tr("Opened %1").arg(aSnapshot.myLevel)
	                             : tr("Opened %1 with %n problem(s) reported while loading; see Log", nullptr,
	                                  aSnapshot.myProblems.size())
	                                   .arg(aSnapshot.myLevel),
	                         6000);
	emit levelOpened(aSnapshot.myLevel, true);
}

void MainWindow::Save(std::function<void(bool)> aDone)
{
	if (!myDocument->HasLevel())
	{
		if (aDone)
		{
			aDone(false);
		}
		return;
	}
	myController->CancelDrag();
	const QString level = myDocument->GetLevel();
	// What is saved is what the history's position is now; an edit made while the files are
	// written stays unsaved.
	const int savedIndex = myDocument->History().index();
	statusBar()->showMessage(tr("Saving %1…").arg(level));
	myEngine.Save(level, [this, level, savedIndex, aDone](const QStringList& someProblems) {
		const bool okFlag = someProblems.isEmpty();
		if (okFlag && myDocument->GetLevel() == level && myDocument->History().index() == savedIndex)
		{
			myDocument->MarkSaved();
		}
		if (okFlag)
		{
			statusBar()->showMessage(tr("Saved %1").arg(level), 4000);
			myBakeChecker.Check(level);
		}
		else
		{
			QMessageBox::warning(this, tr("Save"),
			                     tr("%1 could not be saved; the files on disk are as they were.\n\n%2")
			                         .arg(level, someProblems.join('\n')));
		}
		emit saved(okFlag);
		if (aDone)
		{
			aDone(okFlag);
		}
	});
}

void MainWindow::MaybeSaveThen(std::function<void()> aGoOn)
{
	if (!myDocument->IsModified())
	{
		aGoOn();
		return;
	}
	const auto answer = QMessageBox::question(
	    this, tr("Unsaved Changes"), tr("%1 has unsaved changes. Save them?").arg(myDocument->GetLevel()),
	    QMessageBox::Save | QMessageBox::Discard | QMessageBox::Cancel, QMessageBox::Save);
	if (answer == QMessageBox::Cancel)
	{
		return;
	}
	if (answer == QMessageBox::Discard)
	{
		aGoOn();
		return;
	}
	Save([aGoOn](bool anOkFlag) {
		if (anOkFlag)
		{
			aGoOn();
		}
	});
}

void MainWindow::closeEvent(QCloseEvent* anEvent)
{
	if (myClosingFlag || !myDocument->IsModified())
	{
		StoreSettings();
		myBakeRunner->Cancel();
		anEvent->accept();
		return;
	}
	anEvent->ignore();
	MaybeSaveThen([this] {
		myClosingFlag = true;
		close();
	});
}

void MainWindow::ScreenshotThenQuit(const QString& aFile, int aSettleMs)
{
	connect(
	    this, &MainWindow::levelOpened, this, [this, aFile, aSettleMs](const QString&, bool anOpenedFlag) {
		    QTimer::singleShot(aSettleMs, this, [this, aFile, anOpenedFlag] {
			    QScreen* screen =
			        windowHandle() != nullptr ? windowHandle()->screen() : QGuiApplication::primaryScreen();
			    const QRect frame = frameGeometry();
			    const bool savedFlag =
			        screen->grabWindow(0, frame.x(), frame.y(), frame.width(), frame.height()).save(aFile);
			    QApplication::exit(savedFlag && anOpenedFlag ? 0 : 1);
		    });
	    });
}

// --- editing -----------------------------------------------------------------------------

void MainWindow::AddObject(Kind aKind)
{
	if (!myDocument->HasLevel())
	{
		return;
	}
	const CameraPlacement& camera = myController->Camera().GetPlacement();
	ObjectState state;
	state.myKind = aKind;
	state.myPosition =
	    camera.InFront(aKind == Kind::PATH_NODE ? ourNodePlacementDistance : ourPlacementDistance);
	switch (aKind)
	{
	case Kind::POINT_LIGHT:
		// A reach that lights a room's corner from its middle; tuned afterwards.
		state.myFalloff = 6.0f;
		break;
	case Kind::SPOT_LIGHT:
		// Pointing down: spots hang from ceilings more often than they stand on floors.
		state.myFalloff = 10.0f;
		state.myDirection = {0.0f, -1.0f, 0.0f};
		break;
	case Kind::DECAL: {
		const auto forward = camera.Forward();
		state.myDirection = {-forward[0], -forward[1], -forward[2]};
		state.myDecalType = (myDecalTypes.contains(ourDefaultDecalType) ? QString(ourDefaultDecalType)
		                                                                : myDecalTypes.value(0))
		                        .toStdString();
		state.mySize = 1.0f;
		state.myDepth = 0.3f;
		break;
	}
	case Kind::PATH_NODE:
		break;
	}
	myDocument->Add(state, tr("Add %1").arg(QString::fromUtf8(KindName(aKind))));
	myEngine.RequestFrames();
}

void MainWindow::CopySelected()
{
	const ObjectState* state = myDocument->Find(myDocument->GetSelected());
	if (state == nullptr || state->myKind == Kind::PATH_NODE)
	{
		return;
	}
	// The copy sits a metre to the camera's right of the original, so both can be seen and
	// picked (on the same spot the copy would hide under it).
	ObjectState copy = *state;
	const auto right = myController->Camera().GetPlacement().Right();
	for (int axis = 0; axis < 3; ++axis)
	{
		copy.myPosition[axis] += right[axis];
	}
	myDocument->Add(copy, tr("Duplicate %1").arg(QString::fromUtf8(KindName(state->myKind))));
}

void MainWindow::DeleteSelected()
{
	QString problem;
	if (!myDocument->Remove(myDocument->GetSelected(), &problem) && !problem.isEmpty())
	{
		statusBar()->showMessage(problem, 8000);
	}
}

void MainWindow::ShowKeys()
{
	QMessageBox box(this);
	box.setWindowTitle(tr("Keys"));
	box.setTextFormat(Qt::RichText);
	box.setText(KeyTableHtml());
	box.exec();
}
} // namespace LumoraEditor
