#pragma once
// MainWindow: the editor's window. It owns the document, the engine thread, the view and its
// controller, the docks (outliner, properties, post-processing, bake, log, problems), the
// menus, tool bar and status bar, and the level's life: open (checked first), save, ask
// before unsaved changes go, remember the layout and recent levels.
#include <QLabel>
#include <QMainWindow>
#include <QPointer>
#include <functional>
#include <memory>

#include "bridge/EngineThread.h"
#include "core/Document.h"
#include "main/LevelChecker.h"

class QAction;
class QActionGroup;
class QDoubleSpinBox;
class QMenu;

namespace LumoraEditor
{
class BakePanel;
class BakeRunner;
class EngineView;
class LogPanel;
class OutlinerPanel;
class PostProcessingPanel;
class ProblemsPanel;
class PropertiesPanel;
class ViewController;

class MainWindow : public QMainWindow
{
	Q_OBJECT

public:
	static constexpr int ourRecentCount = 8;

	MainWindow();
	~MainWindow() override;

	// Opens aLevel once the engine runs (at once when it does): checked, then loaded.
	void OpenLevel(const QString& aLevel);
	// Saves the level; aDone(true) once the files are written.
	void Save(std::function<void(bool)> aDone = {});
	// Ask, when there are unsaved changes, whether to save them; aGoOn runs unless the user
	// cancels (after a save that worked, when asked to save).
	void MaybeSaveThen(std::function<void()> aGoOn);
	// After the level has loaded and frames have settled: grabs the whole window into aFile
	// and closes the editor (for the README's picture).
	void ScreenshotThenQuit(const QString& aFile, int aSettleMs);

	// For the window tests.
	Document& GetDocument() { return *myDocument; }
	EngineThread& GetEngine() { return myEngine; }
	EngineView* GetView() { return myView; }
	ViewController& GetController() { return *myController; }
	OutlinerPanel* GetOutliner() { return myOutliner; }
	PropertiesPanel* GetProperties() { return myProperties; }
	ProblemsPanel* GetProblems() { return myProblems; }
	BakePanel* GetBakePanel() { return myBakePanel; }
	BakeRunner& GetBakeRunner() { return *myBakeRunner; }
	const QString& GetBakeState() const { return myBakeState; }
	bool IsEngineStarted() const { return myEngineStartedFlag; }
	QSize GetDrawnSize() const { return myDrawnSize; }
	double GetLastFrameMs() const { return myLastFrameMs; }
	int GetFrameCount() const { return myFrameCount; }

signals:
	// A level was opened (or refused: anOpenedFlag false, the problems panel tells why).
	void levelOpened(const QString& aLevel, bool anOpenedFlag);
	void saved(bool anOkFlag);

protected:
	void closeEvent(QCloseEvent* anEvent) override;

private:
	void BuildActions();
	void BuildMenus();
	void BuildDocks();
	void BuildStatusBar();
	void RestoreSettings();
	void StoreSettings() const;
	void RememberRecent(const QString& aLevel);
	void RefreshRecentMenu();
	void RefreshTitle();
	void RefreshActions();
	void ShowSelection();
	void ShowBakeState(const CheckResult& aResult);
	void ApplyDisplay();
	QStringList ListLevels() const;

	void OnEngineStarted(bool anOkFlag, const QString& aProblem);
	void OnChecked(const CheckResult& aResult);
	void OnLevelLoaded(const LevelSnapshot& aSnapshot);
	void OnFrame(double aMilliseconds, QSize aSize);

	void ChooseLevel();
	void AddObject(Kind aKind);
	void CopySelected();
	void DeleteSelected();
	void ShowKeys();

	EngineThread myEngine;
	std::unique_ptr<Document> myDocument;
	EngineView* myView = nullptr;
	ViewController* myController = nullptr;
	LevelChecker myOpenChecker;
	// Re-checks the open level after a save or bake, for the status bar's bake state.
	LevelChecker myBakeChecker;
	BakeRunner* myBakeRunner = nullptr;

	OutlinerPanel* myOutliner = nullptr;
	PropertiesPanel* myProperties = nullptr;
	PostProcessingPanel* myPostProcessing = nullptr;
	BakePanel* myBakePanel = nullptr;
	LogPanel* myLog = nullptr;
	ProblemsPanel* myProblems = nullptr;
	QDockWidget* myProblemsDock = nullptr;

	QAction* myOpenAction = nullptr;
	QAction* mySaveAction = nullptr;
	QAction* myAddActions[ourKindCount] = {};
	QAction* myCopyAction = nullptr;
	QAction* myDeleteAction = nullptr;
	QAction* myModeActions[3] = {};
	QAction* myMeshesAction = nullptr;
	QAction* myRoomsAction = nullptr;
	QAction* myIconsAction = nullptr;
	QAction* myFastCameraAction = nullptr;
	QAction* myVolumeActions[3] = {};
	QMenu* myRecentMenu = nullptr;
	QMenu* myViewMenu = nullptr;
	QDoubleSpinBox* mySpeedBox = nullptr;

	QLabel* myCameraLabel = nullptr;
	QLabel* myFrameLabel = nullptr;
	QLabel* mySelectionLabel = nullptr;
	QLabel* myBakeLabel = nullptr;

	QString myPendingLevel;
	QStringList myDecalTypes;
	QStringList myRoomIds;
	std::vector<std::pair<std::array<float, 3>, std::array<float, 3>>> myRoomBounds;
	QString myBakeState;
	bool myEngineStartedFlag = false;
	bool myClosingFlag = false;
	QSize myDrawnSize;
	double myLastFrameMs = 0.0;
	int myFrameCount = 0;
};
} // namespace LumoraEditor
