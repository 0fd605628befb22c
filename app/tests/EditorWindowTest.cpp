// The real editor driven as a designer drives it, under an X server (Xvfb in CI): open a copy
// of sample_small, click a light in the view, drag it, type a value, recolour it, undo and redo
// back to identical values, add and delete, save and read the file, be refused a broken level,
// bake and cancel, resize. Every value is read back from the engine itself.
#include <QDirIterator>
#include <QDoubleSpinBox>
#include <QElapsedTimer>
#include <QFile>
#include <QSignalSpy>
#include <QTemporaryDir>
#include <QTest>
#include <QTreeWidget>
#include <QUndoStack>

#include "bake/BakeRunner.h"
#include "bridge/EngineThread.h"
#include "editor/LumoraWrapper.h"
#include "editor/PointLightStruct.h"
#include "engine/Engine.h"
#include "main/MainWindow.h"
#include "panels/OutlinerPanel.h"
#include "panels/ProblemsPanel.h"
#include "panels/PropertiesPanel.h"
#include "renderer/CubemapContainer.h"
#include "view/EngineView.h"
#include "view/ViewController.h"

using namespace LumoraEditor;

namespace
{
constexpr int ourStartMs = 60000;
constexpr int ourOpenMs = 60000;

bool CopyTree(const QString& aFrom, const QString& aTo)
{
	QDirIterator files(aFrom, QDir::Files | QDir::NoDotAndDotDot, QDirIterator::Subdirectories);
	while (files.hasNext())
	{
		const QString file = files.next();
		const QString target = aTo + "/" + QDir(aFrom).relativeFilePath(file);
		if (!QDir().mkpath(QFileInfo(target).path()) || !QFile::copy(file, target))
		{
			return false;
		}
	}
	return true;
}

QByteArray ReadAll(const QString& aPath)
{
	QFile file(aPath);
	return file.open(QIODevice::ReadOnly) ? file.readAll() : QByteArray();
}
} // namespace

class EditorWindowTest : public QObject
{
	Q_OBJECT

private:
	QTemporaryDir myData;
	QString myStartFolder;
	std::unique_ptr<MainWindow> myWindow;

	Document& Doc() { return myWindow->GetDocument(); }

	// Runs aWork on the engine thread and waits for it.
	void OnEngine(std::function<void(Lumora::LumoraWrapper&)> aWork)
	{
		bool doneFlag = false;
		myWindow->GetEngine().Run(std::move(aWork), [&doneFlag] { doneFlag = true; });
		QTRY_VERIFY_WITH_TIMEOUT(doneFlag, 20000);
	}

	// The point light at anIndex as the engine holds it (the engine's selection put back).
	ObjectState EngineLight(int anIndex)
	{
		ObjectState state;
		OnEngine([&state, anIndex](Lumora::LumoraWrapper& aFacade) {
			const auto& light = aFacade.GetPointLights()[anIndex];
			state.myKind = Kind::POINT_LIGHT;
			state.myPosition = {light.myPosition.x, light.myPosition.y, light.myPosition.z};
			state.myColor = {light.myColor.x, light.myColor.y, light.myColor.z};
			state.myFalloff = light.myFalloff;
		});
		return state;
	}

	int EnginePointLightCount()
	{
		int count = 0;
		OnEngine([&count](Lumora::LumoraWrapper& aFacade) { count = aFacade.GetPointLights().Count(); });
		return count;
	}

	// A point light drawn inside the view, away from its edges: its index and pixel (device).
	// The camera is first framed on the level's first light.
	std::pair<int, QPointF> VisibleLight()
	{
		ViewController& controller = myWindow->GetController();
		FlyCamera& camera = controller.Camera();
		CameraPlacement placement = camera.GetPlacement();
		placement.myPitch = 0.35f;
		camera.SetPlacement(placement);
		camera.Frame(Doc().Find(Doc().IdAt(Kind::POINT_LIGHT, 0))->myPosition, 4.0f);
		// Projected once the engine holds the camera the click is made against. A frame counted
		// after the request may have started before it, and the engine runs queued work before it
		// places the latest camera, so the engine's own placement is what is waited for.
		const CameraPlacement wanted = camera.GetPlacement();
		controller.SetCamera(wanted);
		const auto placed = [this, &wanted] {
			bool sameFlag = false;
			OnEngine([&sameFlag, &wanted](Lumora::LumoraWrapper& aFacade) {
				Vector3<float> position;
				float yaw = 0.0f;
				float pitch = 0.0f;
				aFacade.GetCameraPlacement(position, yaw, pitch);
				sameFlag = std::abs(position.x - wanted.myPosition[0]) < 1e-3f &&
				           std::abs(position.y - wanted.myPosition[1]) < 1e-3f &&
				           std::abs(position.z - wanted.myPosition[2]) < 1e-3f;
			});
			return sameFlag;
		};
		[&] { QTRY_VERIFY_WITH_TIMEOUT(placed(), 20000); }();
		std::pair<int, QPointF> found{-1, {}};
		const QSize size = myWindow->GetView()->DeviceSize();
		OnEngine([&found, size](Lumora::LumoraWrapper& aFacade) {
			for (int index = 0; index < aFacade.GetPointLights().Count(); ++index)
			{
				float x = 0.0f;
				float y = 0.0f;
				if (aFacade.ProjectToView(aFacade.GetPointLights()[index].myPosition, x, y) && x > 40 &&
				    y > 40 && x < size.width() - 40 && y < size.height() - 40)
				{
					found = {index, QPointF(x, y)};
					return;
				}
			}
		});
		return found;
	}

	QPoint Logical(QPointF aDevicePixel) const
	{
		return (aDevicePixel / myWindow->GetView()->devicePixelRatioF()).toPoint();
	}

	QDoubleSpinBox* Field(const char* aName)
	{
		auto* box = myWindow->GetProperties()->findChild<QDoubleSpinBox*>(QString::fromLatin1(aName));
		[&] { QVERIFY2(box != nullptr, aName); }();
		return box;
	}

	void Open(const QString& aLevel, bool anExpectedFlag)
	{
		QSignalSpy opened(myWindow.get(), &MainWindow::levelOpened);
		myWindow->OpenLevel(aLevel);
		QVERIFY(opened.wait(ourOpenMs));
		QCOMPARE(opened.front().at(1).toBool(), anExpectedFlag);
	}

private slots:
	void initTestCase()
	{
		if (QGuiApplication::platformName() != QStringLiteral("xcb"))
		{
			QSKIP("needs an X server: Xvfb is not installed (scripts/install-deps.sh installs it)");
		}
		QVERIFY(myData.isValid());
		QVERIFY(CopyTree(QDir::current().absoluteFilePath("data"), myData.path() + "/data"));
		// The small level's rooms start without cubemaps of their own, as in a fresh checkout,
		// whatever a bake in the working tree left there.
		QVERIFY(QDir(myData.path() + "/data/Cubemaps/sample_small").removeRecursively());
		myStartFolder = QDir::currentPath();
		QVERIFY(QDir::setCurrent(myData.path()));
		myWindow = std::make_unique<MainWindow>();
		myWindow->resize(1100, 700);
		myWindow->show();
		QVERIFY(QTest::qWaitForWindowExposed(myWindow.get()));
		// The window's shortcuts work only in the active window.
		myWindow->activateWindow();
		QVERIFY(QTest::qWaitForWindowActive(myWindow.get()));
		QElapsedTimer clock;
		clock.start();
		QTRY_VERIFY_WITH_TIMEOUT(myWindow->IsEngineStarted(), ourStartMs);
		qInfo("engine started in %lld ms", static_cast<long long>(clock.restart()));
		Open(QStringLiteral("sample_small"), true);
		qInfo("sample_small checked and opened in %lld ms", static_cast<long long>(clock.elapsed()));
		QCOMPARE(Doc().GetLevel(), QStringLiteral("sample_small"));
		QVERIFY(Doc().Count(Kind::POINT_LIGHT) > 0);
		QCOMPARE(EnginePointLightCount(), Doc().Count(Kind::POINT_LIGHT));
	}

	void cleanupTestCase()
	{
		if (myWindow)
		{
			// Nothing left unsaved to ask about.
			Doc().MarkSaved();
			myWindow.reset();
		}
		QDir::setCurrent(myStartFolder);
	}

	void ClickSelectsDragAndTypingMoveUndoRedoRestore()
	{
		const auto [index, pixel] = VisibleLight();
		QVERIFY2(index >= 0, "no point light of sample_small is in view from its start");
		const ObjectId id = Doc().IdAt(Kind::POINT_LIGHT, index);
		const ObjectState original = EngineLight(index);

		// A click on the light's pixel selects it in the document, the outliner and the properties.
		QTest::mouseClick(myWindow->GetView(), Qt::LeftButton, {}, Logical(pixel));
		QTRY_COMPARE_WITH_TIMEOUT(Doc().GetSelected(), id, 10000);
		auto* tree = myWindow->GetOutliner()->findChild<QTreeWidget*>();
		QVERIFY(tree != nullptr && tree->currentItem() != nullptr);
		QCOMPARE(tree->currentItem()->data(0, OutlinerPanel::ourIdRole).toULongLong(), id);
		QTRY_VERIFY_WITH_TIMEOUT(std::abs(Field("positionX")->value() - original.myPosition[0]) < 5e-4, 5000);

		// A drag: the light moves, one undo step, the engine holds what the document says.
		const QPoint from = Logical(pixel);
		QTest::mousePress(myWindow->GetView(), Qt::LeftButton, {}, from);
		QTRY_COMPARE_WITH_TIMEOUT(Doc().GetSelected(), id, 10000);
		for (int step = 1; step <= 5; ++step)
		{
			QTest::mouseMove(myWindow->GetView(), from + QPoint(8 * step, -4 * step));
		}
		QTest::mouseRelease(myWindow->GetView(), Qt::LeftButton, {}, from + QPoint(40, -20));
		QTRY_VERIFY_WITH_TIMEOUT(!(EngineLight(index) == original), 10000);
		QCOMPARE(Doc().History().count(), 1);
		QCOMPARE(Doc().History().undoText(), QStringLiteral("Move point light"));
		const ObjectState dragged = EngineLight(index);
		QCOMPARE(dragged, *Doc().Find(id));
		// The light is drawn where the cursor let go of it (device pixels, within a pixel or two).
		float x = 0.0f;
		float y = 0.0f;
		OnEngine([&](Lumora::LumoraWrapper& aFacade) {
			aFacade.ProjectToView(aFacade.GetPointLights()[index].myPosition, x, y);
		});
		const QPointF expected = pixel + QPointF(40, -20) * myWindow->GetView()->devicePixelRatioF();
		QVERIFY2(std::abs(x - expected.x()) < 3.0 && std::abs(y - expected.y()) < 3.0,
		         qPrintable(QStringLiteral("drawn at %1,%2, let go at %3,%4")
		                        .arg(x)
		                        .arg(y)
		                        .arg(expected.x())
		                        .arg(expected.y())));

		// A typed value and a colour: each one step, applied live.
		QDoubleSpinBox* positionY = Field("positionY");
		positionY->setFocus();
		positionY->selectAll();
		QTest::keyClicks(positionY, "4.25");
		QTest::keyClick(positionY, Qt::Key_Enter);
		QTRY_COMPARE_WITH_TIMEOUT(EngineLight(index).myPosition[1], 4.25f, 10000);
		QDoubleSpinBox* intensity = Field("intensity");
		const double brighter = intensity->value() * 3.0;
		intensity->setValue(brighter);
		QTRY_VERIFY_WITH_TIMEOUT(
		    std::abs(std::max({EngineLight(index).myColor[0], EngineLight(index).myColor[1],
		                       EngineLight(index).myColor[2]}) -
		             brighter) < 1e-3,
		    10000);
		const ObjectState edited = EngineLight(index);
		QCOMPARE(edited, *Doc().Find(id));
		QVERIFY(Doc().History().count() >= 3);
		QVERIFY(myWindow->isWindowModified());

		// Back to the start and forward again: identical values in the engine.
		while (Doc().History().canUndo())
		{
			Doc().History().undo();
		}
		QTRY_COMPARE_WITH_TIMEOUT(EngineLight(index), original, 10000);
		QVERIFY(!myWindow->isWindowModified());
		while (Doc().History().canRedo())
		{
			Doc().History().redo();
		}
		QTRY_COMPARE_WITH_TIMEOUT(EngineLight(index), edited, 10000);
	}

	void AddDeleteAndSaveWriteTheFile()
	{
		const int count = EnginePointLightCount();
		const ObjectId added = Doc().Add(
		    [] {
			    ObjectState state;
			    state.myPosition = {1.5f, 2.25f, -0.75f};
			    state.myColor = {3.0f, 2.0f, 1.0f};
			    state.myFalloff = 5.5f;
			    return state;
		    }(),
		    QStringLiteral("Add point light"));
		QTRY_COMPARE_WITH_TIMEOUT(EnginePointLightCount(), count + 1, 10000);
		QCOMPARE(EngineLight(count).myFalloff, 5.5f);
		// Deleted through the window's action, then back by undo with the same values.
		Doc().Select(added);
		// From the view: in a field, Delete edits the field's text.
		myWindow->GetView()->setFocus();
		QTest::keyClick(myWindow->GetView(), Qt::Key_Delete);
		QTRY_COMPARE_WITH_TIMEOUT(EnginePointLightCount(), count, 10000);
		Doc().History().undo();
		QTRY_COMPARE_WITH_TIMEOUT(EnginePointLightCount(), count + 1, 10000);
		QCOMPARE(EngineLight(count).myPosition, (std::array<float, 3>{1.5f, 2.25f, -0.75f}));

		QSignalSpy saved(myWindow.get(), &MainWindow::saved);
		QTest::keyClick(myWindow->GetView(), Qt::Key_S, Qt::ControlModifier);
		QVERIFY(saved.wait(20000));
		QVERIFY(saved.front().at(0).toBool());
		QVERIFY(!myWindow->isWindowModified());
		const QByteArray lights = ReadAll("data/XML/levels/sample_small/lights.xml");
		QCOMPARE(lights.count("<point-light>"), count + 1);
		QVERIFY(lights.contains("x=\"1.5\" y=\"2.25\" z=\"-0.75\""));
		QVERIFY(lights.contains("<falloff value=\"5.5\""));
	}

	void ABrokenLevelIsListedAndTheOpenOneStays()
	{
		const QString broken = "data/XML/levels/broken";
		QVERIFY(CopyTree("data/XML/levels/sample_small", broken));
		QFile entities(broken + "/entities.xml");
		QVERIFY(entities.open(QIODevice::WriteOnly | QIODevice::Truncate));
		entities.write("<root><entities><entity type=\"no-such-type\"><position x=\"0\" y=\"0\" z=\"0\"/>"
		               "</entity></entities></root>");
		entities.close();
		const int count = EnginePointLightCount();
		Open(QStringLiteral("broken"), false);
		QCOMPARE(Doc().GetLevel(), QStringLiteral("sample_small"));
		QCOMPARE(EnginePointLightCount(), count);
		auto* list = myWindow->GetProblems()->findChild<QTreeWidget*>();
		QVERIFY(list != nullptr && list->topLevelItemCount() > 0);
		bool namedFlag = false;
		for (int row = 0; row < list->topLevelItemCount(); ++row)
		{
			namedFlag = namedFlag || list->topLevelItem(row)->text(2).contains("no-such-type");
		}
		QVERIFY(namedFlag);
	}

	void ABakeCancelledKeepsTheFilesAndOneFinishedShows()
	{
		const QString ambient = "data/XML/levels/sample_small/ambient.sh";
		const bool hadFlag = QFile::exists(ambient);
		const QByteArray before = ReadAll(ambient);
		BakeRunner& runner = myWindow->GetBakeRunner();
		QSignalSpy finished(&runner, &BakeRunner::finished);
		BakeRequest request;
		request.myLevel = Doc().GetLevel();
		request.myBounces = 3;
		request.myReflectionsFlag = false;
		runner.Start(request);
		QTRY_VERIFY_WITH_TIMEOUT(myWindow->GetEngine().GetBakeProgress().myProbesDone > 0, 30000);
		// The window answers while the bake runs.
		QVERIFY(QTest::qWaitFor([] { return true; }, 10));
		runner.Cancel();
		QVERIFY(finished.wait(30000));
		QCOMPARE(finished.front().at(0).value<BakeOutcome>(), BakeOutcome::CANCELLED);
		QCOMPARE(QFile::exists(ambient), hadFlag);
		QCOMPARE(ReadAll(ambient), before);

		// Until the rooms have cubemaps of their own, every entity shows the fallback.
		const auto roomCubemaps = [this] {
			size_t count = 0;
			OnEngine([&count](Lumora::LumoraWrapper&) {
				count = Zeph::Engine::GetInstance()->GetCubemapContainer().GetCount();
			});
			return count;
		};
		QCOMPARE(roomCubemaps(), size_t(0));
		finished.clear();
		request.myBounces = 1;
		request.myReflectionsFlag = true;
		runner.Start(request);
		QElapsedTimer clock;
		clock.start();
		QVERIFY(finished.wait(120000));
		qInfo("bake %lld ms", static_cast<long long>(clock.restart()));
		QCOMPARE(finished.front().at(0).value<BakeOutcome>(), BakeOutcome::FINISHED);
		QVERIFY(QFile::exists(ambient));
		QVERIFY(ReadAll(ambient) != before);
		// The view shows what was baked: the rooms' new cubemaps are read in.
		QVERIFY(roomCubemaps() > 0);
		QTRY_COMPARE_WITH_TIMEOUT(myWindow->GetBakeState(), QStringLiteral("Bake up to date"), 60000);
		qInfo("state %lld ms", static_cast<long long>(clock.restart()));
	}

	void TheViewFollowsAResizeAndRestsWhenIdle()
	{
		const QSize before = myWindow->GetDrawnSize();
		myWindow->resize(820, 560);
		QTRY_VERIFY_WITH_TIMEOUT(myWindow->GetDrawnSize() != before &&
		                             myWindow->GetDrawnSize() == myWindow->GetView()->DeviceSize(),
		                         20000);
		QVERIFY(myWindow->GetDrawnSize().width() < 820);
		// Picking follows the new size.
		const auto [index, pixel] = VisibleLight();
		QVERIFY(index >= 0);
		QTest::mouseClick(myWindow->GetView(), Qt::LeftButton, {}, Logical(pixel));
		QTRY_COMPARE_WITH_TIMEOUT(Doc().GetSelected(), Doc().IdAt(Kind::POINT_LIGHT, index), 10000);
		// Once the eye adaptation has settled, no frame is drawn until something changes.
		QTest::qWait(EngineThread::ourSettleMs + 1500);
		const int frames = myWindow->GetFrameCount();
		QTest::qWait(1500);
		QCOMPARE(myWindow->GetFrameCount(), frames);
		myWindow->GetController().Wheel(1.0f, {});
		QTRY_VERIFY_WITH_TIMEOUT(myWindow->GetFrameCount() > frames, 10000);
	}
};

QTEST_MAIN(EditorWindowTest)
#include "EditorWindowTest.moc"
