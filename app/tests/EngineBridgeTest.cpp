// The document and the real engine kept in step through the engine thread (headless, no
// window): after any run of additions, removals, changes, undos and redos, the engine's lists
// hold exactly what the document says, in the same order. Picking, loading and saving through
// the thread answer on this thread.
#include <QDir>
#include <QFile>
#include <QProcess>
#include <QRandomGenerator>
#include <QSignalSpy>
#include <QTemporaryDir>
#include <QTest>
#include <cmath>
#include <optional>

#include "bridge/EngineThread.h"
#include "core/Document.h"
#include "editor/LumoraWrapper.h"
#include "view/ViewController.h"

using namespace LumoraEditor;

namespace
{
// The engine's own lists, read straight from the facade (not through the thread's readers).
Document::ObjectLists EngineLists(Lumora::LumoraWrapper& aFacade)
{
	Document::ObjectLists lists;
	for (int index = 0; index < aFacade.GetPointLights().Count(); ++index)
	{
		const auto& light = aFacade.GetPointLights()[index];
		ObjectState state;
		state.myPosition = {light.myPosition.x, light.myPosition.y, light.myPosition.z};
		state.myColor = {light.myColor.x, light.myColor.y, light.myColor.z};
		state.myFalloff = light.myFalloff;
		lists[0].push_back(state);
	}
	for (int index = 0; index < aFacade.GetSpotLights().Count(); ++index)
	{
		const auto& light = aFacade.GetSpotLights()[index];
		ObjectState state;
		state.myKind = Kind::SPOT_LIGHT;
		const auto position = light.myOrientation.GetPosition();
		const auto forward = light.myOrientation.GetForward();
		state.myPosition = {position.x, position.y, position.z};
		state.myColor = {light.myColor.x, light.myColor.y, light.myColor.z};
		state.myFalloff = light.myFalloff;
		state.myDirection = {forward.x, forward.y, forward.z};
		state.myInnerCos = light.myAngles.x;
		state.myOuterCos = light.myAngles.y;
		lists[1].push_back(state);
	}
	for (int index = 0; index < aFacade.GetDecals().Count(); ++index)
	{
		const auto& decal = aFacade.GetDecals()[index];
		ObjectState state;
		state.myKind = Kind::DECAL;
		state.myPosition = {decal.myPosition.x, decal.myPosition.y, decal.myPosition.z};
		state.myColor = {decal.myColor.x, decal.myColor.y, decal.myColor.z};
		state.myDirection = {decal.myNorm.x, decal.myNorm.y, decal.myNorm.z};
		state.myDecalType = decal.myTypeId;
		state.mySize = decal.mySize;
		state.myDepth = decal.myDepth;
		lists[2].push_back(state);
	}
	for (int index = 0; index < aFacade.GetNodes().Count(); ++index)
	{
		const auto& position = aFacade.GetNodes()[index].GetPosition();
		ObjectState state;
		state.myKind = Kind::PATH_NODE;
		state.myPosition = {position.x, position.y, position.z};
		lists[3].push_back(state);
	}
	return lists;
}

bool Near(const std::array<float, 3>& a, const std::array<float, 3>& b, float aTolerance)
{
	return std::abs(a[0] - b[0]) <= aTolerance && std::abs(a[1] - b[1]) <= aTolerance &&
	       std::abs(a[2] - b[2]) <= aTolerance;
}

std::array<float, 3> Unit(const std::array<float, 3>& aVector)
{
	const float length =
	    std::sqrt(aVector[0] * aVector[0] + aVector[1] * aVector[1] + aVector[2] * aVector[2]);
	return {aVector[0] / length, aVector[1] / length, aVector[2] / length};
}

// What the engine holds agrees with what the document says: exactly for positions, colours and
// sizes; directions as the engine keeps them (a spot light's as a unit basis, a decal's at its
// old length), so by their unit vectors.
QString Disagreement(const ObjectState& anEngine, const ObjectState& aDocument)
{
	if (anEngine.myPosition != aDocument.myPosition)
	{
		return "position";
	}
	if (anEngine.myKind == Kind::PATH_NODE)
	{
		return {};
	}
	if (anEngine.myColor != aDocument.myColor)
	{
		return "colour";
	}
	if (HasFalloff(anEngine.myKind) && anEngine.myFalloff != aDocument.myFalloff)
	{
		return "falloff";
	}
	if (HasDirection(anEngine.myKind) &&
	    !Near(Unit(anEngine.myDirection), Unit(aDocument.myDirection), 1e-5f))
	{
		return "direction";
	}
	if (anEngine.myKind == Kind::SPOT_LIGHT &&
	    (anEngine.myInnerCos != aDocument.myInnerCos || anEngine.myOuterCos != aDocument.myOuterCos))
	{
		return "angles";
	}
	if (anEngine.myKind == Kind::DECAL &&
	    (anEngine.myDecalType != aDocument.myDecalType || anEngine.mySize != aDocument.mySize ||
	     anEngine.myDepth != aDocument.myDepth))
	{
		return "decal values";
	}
	return {};
}
} // namespace

class EngineBridgeTest : public QObject
{
	Q_OBJECT

private:
	QTemporaryDir myScratch;
	QString myStartFolder;
	std::unique_ptr<EngineThread> myEngine;
	std::unique_ptr<Document> myDocument;
	QStringList myDecalTypes;

	void Wait(std::function<void(Lumora::LumoraWrapper&)> aWork = [](Lumora::LumoraWrapper&) {})
	{
		bool doneFlag = false;
		myEngine->Run(std::move(aWork), [&doneFlag] { doneFlag = true; });
		QTRY_VERIFY_WITH_TIMEOUT(doneFlag, 30000);
	}

	// Fails with the first object on which the engine and the document disagree.
	void ExpectInStep(const QString& aAfter)
	{
		Document::ObjectLists engine;
		Wait([&engine](Lumora::LumoraWrapper& aFacade) { engine = EngineLists(aFacade); });
		for (int kind = 0; kind < ourKindCount; ++kind)
		{
			QVERIFY2(static_cast<int>(engine[kind].size()) == myDocument->Count(static_cast<Kind>(kind)),
			         qPrintable(QStringLiteral("%1: %2 %3s in the engine, %4 in the document")
			                        .arg(aAfter, KindName(static_cast<Kind>(kind)))
			                        .arg(engine[kind].size())
			                        .arg(myDocument->Count(static_cast<Kind>(kind)))));
			for (int index = 0; index < myDocument->Count(static_cast<Kind>(kind)); ++index)
			{
				const ObjectState* state = myDocument->Find(myDocument->IdAt(static_cast<Kind>(kind), index));
				const QString what = Disagreement(engine[kind][index], *state);
				QVERIFY2(what.isEmpty(), qPrintable(QStringLiteral("%1: %2 %3 differs in its %4")
				                                        .arg(aAfter, KindName(static_cast<Kind>(kind)))
				                                        .arg(index)
				                                        .arg(what)));
			}
		}
	}

	ObjectState RandomState(Kind aKind, QRandomGenerator& aRandom)
	{
		const auto value = [&aRandom](double aLow, double aHigh) {
			return static_cast<float>(aLow + (aHigh - aLow) * aRandom.generateDouble());
		};
		ObjectState state;
		state.myKind = aKind;
		state.myPosition = {value(-5, 5), value(0, 3), value(-5, 5)};
		state.myColor = {value(0, 4), value(0, 4), value(0, 4)};
		state.myFalloff = value(0.5, 10);
		state.myDirection = Unit({value(-1, 1), value(-1, -0.2), value(-1, 1)});
		state.myInnerCos = value(0.9, 0.99);
		state.myOuterCos = value(0.5, 0.85);
		state.myDecalType =
		    myDecalTypes.isEmpty()
		        ? std::string()
		        : myDecalTypes[aRandom.bounded(static_cast<int>(myDecalTypes.size()))].toStdString();
		state.mySize = value(0.2, 3);
		state.myDepth = value(0.1, 1);
		return state;
	}

private slots:
	void initTestCase()
	{
		QVERIFY(myScratch.isValid());
		// Saving writes into the level: a copy of data/ takes it.
		QVERIFY(QProcess::execute(QStringLiteral("cp"),
		                          {QStringLiteral("-r"), QStringLiteral("data"), myScratch.path()}) == 0);
		myStartFolder = QDir::currentPath();
		QVERIFY(QDir::setCurrent(myScratch.path()));
		myEngine = std::make_unique<EngineThread>();
		myDocument = std::make_unique<Document>(*myEngine);
		QSignalSpy started(myEngine.get(), &EngineThread::started);
		myEngine->Start(0, QSize(320, 180));
		QVERIFY(started.wait(60000));
		if (!started.front().at(0).toBool())
		{
			QSKIP("no OpenGL 4.5 context here");
		}
		bool loadedFlag = false;
		myEngine->LoadLevel(QStringLiteral("sample_small"),
		                    [this, &loadedFlag](const LevelSnapshot& aSnapshot) {
			                    QVERIFY(aSnapshot.myProblems.isEmpty());
			                    myDocument->Reset(aSnapshot.myLevel, aSnapshot.myObjects);
			                    myDecalTypes = aSnapshot.myDecalTypes;
			                    loadedFlag = true;
		                    });
		QTRY_VERIFY_WITH_TIMEOUT(loadedFlag, 60000);
		// The snapshot read through the thread is what the engine holds.
		QCOMPARE(myDocument->Count(Kind::POINT_LIGHT), 3);
		QCOMPARE(myDocument->Count(Kind::SPOT_LIGHT), 2);
		QVERIFY(!myDecalTypes.isEmpty());
		ExpectInStep("the level loaded");
	}

	void cleanupTestCase()
	{
		myDocument.reset();
		myEngine.reset();
		QDir::setCurrent(myStartFolder);
	}

	void AnyRunOfEditsKeepsTheEngineInStep()
	{
		QRandomGenerator random(20261124);
		static constexpr Kind ourKinds[] = {Kind::POINT_LIGHT, Kind::SPOT_LIGHT, Kind::DECAL,
		                                    Kind::PATH_NODE};
		for (int step = 0; step < 120; ++step)
		{
			const Kind kind = ourKinds[random.bounded(4)];
			const int count = myDocument->Count(kind);
			QString done;
			switch (random.bounded(6))
			{
			case 0:
				myDocument->Add(RandomState(kind, random), "Add");
				done = QStringLiteral("add %1").arg(KindName(kind));
				break;
			case 1:
				if (count > 0)
				{
					// Path nodes can only go from the end; others from anywhere (the last moves in).
					const int index =
					    kind == Kind::PATH_NODE ? count - 1 : static_cast<int>(random.bounded(count));
					QVERIFY(myDocument->Remove(myDocument->IdAt(kind, index)));
					done = QStringLiteral("remove %1 %2").arg(KindName(kind)).arg(index);
				}
				break;
			case 2:
			case 3:
				if (count > 0)
				{
					const int index = static_cast<int>(random.bounded(count));
					myDocument->SetState(myDocument->IdAt(kind, index), RandomState(kind, random), "Change");
					done = QStringLiteral("change %1 %2").arg(KindName(kind)).arg(index);
				}
				break;
			case 4:
				myDocument->History().undo();
				done = QStringLiteral("undo");
				break;
			case 5:
				myDocument->History().redo();
				done = QStringLiteral("redo");
				break;
			}
			ExpectInStep(QStringLiteral("step %1 (%2)").arg(step).arg(done));
		}
		// All the way back: the level as it was loaded.
		while (myDocument->History().canUndo())
		{
			myDocument->History().undo();
		}
		ExpectInStep("undoing everything");
		QCOMPARE(myDocument->Count(Kind::POINT_LIGHT), 3);
	}

	void TheViewsInputMovesTheSelectionAndEscOrLosingFocusPutsItBack()
	{
		myDocument->SetMode(0);
		ViewController controller(*myDocument, *myEngine);
		controller.SetViewSize(QSize(320, 180));
		const ObjectId id = myDocument->IdAt(Kind::POINT_LIGHT, 1);
		CameraPlacement camera;
		camera.myYaw = 0.4f;
		controller.SetCamera(camera);
		controller.Camera().Frame(myDocument->Find(id)->myPosition, 4.0f);
		controller.SetCamera(controller.Camera().GetPlacement());
		// Twice: the first runs before the frame that puts the camera, the second after it.
		Wait();
		Wait();
		float x = 0.0f;
		float y = 0.0f;
		const auto at = myDocument->Find(id)->myPosition;
		Wait([&](Lumora::LumoraWrapper& aFacade) {
			aFacade.ProjectToView(Vector3<float>(at[0], at[1], at[2]), x, y);
		});
		const QPointF pixel(x, y);
		const ObjectState before = *myDocument->Find(id);
		myDocument->History().clear();
		const int steps = 0;

		// Pressed on the light, moved, let go: one step, the light moved along the camera's right.
		controller.MousePress(Qt::LeftButton, pixel, {});
		QTRY_COMPARE_WITH_TIMEOUT(myDocument->GetSelected(), id, 30000);
		controller.MouseMove(pixel + QPointF(20, 0), {});
		controller.MouseMove(pixel + QPointF(40, 0), {});
		controller.MouseRelease(Qt::LeftButton, pixel + QPointF(40, 0));
		QCOMPARE(myDocument->History().count(), steps + 1);
		const ObjectState moved = *myDocument->Find(id);
		const auto right = controller.Camera().GetPlacement().Right();
		const float along = (moved.myPosition[0] - before.myPosition[0]) * right[0] +
		                    (moved.myPosition[2] - before.myPosition[2]) * right[2];
		QVERIFY2(along > 0.1f, qPrintable(QString::number(along)));
		QCOMPARE(moved.myPosition[1], before.myPosition[1]);
		ExpectInStep("a drag");

		// Esc in the middle of a drag, or the window losing the keyboard, puts it back: no step.
		for (int ending = 0; ending < 2; ++ending)
		{
			controller.MousePress(Qt::LeftButton, pixel + QPointF(40, 0), {});
			QTRY_VERIFY_WITH_TIMEOUT(
			    controller.IsDragging() ||
			        (controller.MouseMove(pixel + QPointF(60, 10), {}), controller.IsDragging()),
			    30000);
			QVERIFY(!(*myDocument->Find(id) == moved));
			if (ending == 0)
			{
				QVERIFY(controller.KeyPress(Qt::Key_Escape, {}, false));
			}
			else
			{
				controller.FocusLost();
			}
			controller.MouseRelease(Qt::LeftButton, pixel + QPointF(60, 10));
			QCOMPARE(*myDocument->Find(id), moved);
			QCOMPARE(myDocument->History().count(), steps + 1);
		}
		ExpectInStep("cancelled drags");

		// An undo with the button still held ends the drag: the undone values stay, no step is made.
		controller.MousePress(Qt::LeftButton, pixel + QPointF(40, 0), {});
		QTRY_VERIFY_WITH_TIMEOUT(
		    controller.IsDragging() ||
		        (controller.MouseMove(pixel + QPointF(60, 10), {}), controller.IsDragging()),
		    30000);
		myDocument->History().undo();
		QVERIFY(!controller.IsDragging());
		controller.MouseMove(pixel + QPointF(80, 20), {});
		controller.MouseRelease(Qt::LeftButton, pixel + QPointF(80, 20));
		QCOMPARE(*myDocument->Find(id), before);
		QCOMPARE(myDocument->History().index(), steps);
		ExpectInStep("an undo during a drag");
		myDocument->History().redo();
		QCOMPARE(*myDocument->Find(id), moved);

		// A drag over before the pick's answer came is still made, as one step.
		controller.MousePress(Qt::LeftButton, pixel + QPointF(40, 0), {});
		controller.MouseMove(pixel + QPointF(40, 30), {});
		controller.MouseRelease(Qt::LeftButton, pixel + QPointF(40, 30));
		QTRY_COMPARE_WITH_TIMEOUT(myDocument->History().count(), steps + 2, 30000);
		QVERIFY(myDocument->Find(id)->myPosition[1] < moved.myPosition[1]);

		// Nudges go along the ground as the camera faces it, Shift ten times as far, a burst one step.
		CameraPlacement turned = controller.Camera().GetPlacement();
		turned.myYaw = 1.5707963f;
		controller.SetCamera(turned);
		const ObjectState start = *myDocument->Find(id);
		controller.KeyPress(Qt::Key_Right, {}, false);
		controller.KeyPress(Qt::Key_Up, Qt::ShiftModifier, false);
		controller.KeyPress(Qt::Key_PageUp, {}, false);
		const ObjectState nudged = *myDocument->Find(id);
		QVERIFY(std::abs(nudged.myPosition[2] - start.myPosition[2] - 0.1f) < 1e-4f);
		QVERIFY(std::abs(nudged.myPosition[0] - start.myPosition[0] + 1.0f) < 1e-4f);
		QVERIFY(std::abs(nudged.myPosition[1] - start.myPosition[1] - 0.1f) < 1e-4f);
		QCOMPARE(myDocument->History().count(), steps + 3);
		ExpectInStep("nudges");
	}

	void ChangesQueuedFasterThanFramesCollapseAndTheLastValuesWin()
	{
		const ObjectId id = myDocument->IdAt(Kind::SPOT_LIGHT, 0);
		ObjectState state = *myDocument->Find(id);
		// A drag's worth of values queued at once: the engine ends with the last.
		for (int step = 0; step < 50; ++step)
		{
			state.myPosition[0] += 0.01f;
			myDocument->SetStateMerging(id, state, "Change position");
		}
		ExpectInStep("fifty queued changes");
		// A change queued after the engine took the last one, behind other work, is not lost.
		state.myPosition[2] += 1.0f;
		myDocument->SetState(id, state, "Move");
		Wait();
		myEngine->Run([](Lumora::LumoraWrapper&) {});
		state.myColor[1] = 3.0f;
		myDocument->SetState(id, state, "Colour");
		ExpectInStep("a change behind other work");
	}

	void PicksAndSavesAnswerOnThisThread()
	{
		// The first point light, projected and clicked in the lights' mode: the pick names it.
		myDocument->SetMode(0);
		float x = 0.0f;
		float y = 0.0f;
		bool inViewFlag = false;
		Wait([&](Lumora::LumoraWrapper& aFacade) {
			const auto position = aFacade.GetPointLights()[0].myPosition;
			aFacade.PlaceCamera(position + Vector3<float>(0.0f, 0.0f, -3.0f), 0.0f, 0.0f);
			inViewFlag = aFacade.ProjectToView(position, x, y);
		});
		QVERIFY(inViewFlag);
		std::optional<EngineThread::PickHits> picked;
		myEngine->Pick(x, y, [&picked](const EngineThread::PickHits& someHits) { picked = someHits; });
		QTRY_VERIFY_WITH_TIMEOUT(picked.has_value(), 30000);
		QVERIFY(!picked->empty());
		QCOMPARE(picked->front(), std::make_pair(Kind::POINT_LIGHT, 0));

		// A second light right behind the first: a click takes the nearer, the same click again the
		// one behind, and again the nearer; a drag from the spot moves whichever is selected.
		const ObjectId front = myDocument->IdAt(Kind::POINT_LIGHT, 0);
		const ObjectId behind = myDocument->IdAt(Kind::POINT_LIGHT, 1);
		ObjectState hidden = *myDocument->Find(behind);
		hidden.myPosition = myDocument->Find(front)->myPosition;
		hidden.myPosition[2] += 2.0f;
		QVERIFY(myDocument->SetState(behind, hidden, "Move"));
		myDocument->Select(0);
		ViewController controller(*myDocument, *myEngine);
		controller.SetViewSize(QSize(320, 180));
		const auto click = [&controller, x, y] {
			controller.MousePress(Qt::LeftButton, QPointF(x, y), {});
			controller.MouseRelease(Qt::LeftButton, QPointF(x, y));
		};
		for (const ObjectId expected : {front, behind, front})
		{
			click();
			QTRY_COMPARE_WITH_TIMEOUT(myDocument->GetSelected(), expected, 30000);
			Wait();
		}
		click();
		QTRY_COMPARE_WITH_TIMEOUT(myDocument->GetSelected(), behind, 30000);
		Wait();
		controller.MousePress(Qt::LeftButton, QPointF(x, y), {});
		Wait();
		controller.MouseMove(QPointF(x + 30, y), {});
		controller.MouseRelease(Qt::LeftButton, QPointF(x + 30, y));
		QCOMPARE(myDocument->GetSelected(), behind);
		QVERIFY(myDocument->Find(behind)->myPosition != hidden.myPosition);
		ExpectInStep("picks through two lights");

		// A change saved: the file holds it; a save the disk refuses (a folder where lights.xml
		// goes) reports why, and nothing ends.
		ObjectState moved = *myDocument->Find(myDocument->IdAt(Kind::POINT_LIGHT, 0));
		moved.myPosition = {1.25f, 2.5f, -3.75f};
		QVERIFY(myDocument->SetState(myDocument->IdAt(Kind::POINT_LIGHT, 0), moved, "Move"));
		std::optional<QStringList> problems;
		myEngine->Save(QStringLiteral("sample_small"),
		               [&problems](const QStringList& someProblems) { problems = someProblems; });
		QTRY_VERIFY_WITH_TIMEOUT(problems.has_value(), 30000);
		QVERIFY2(problems->isEmpty(), qPrintable(problems->join('\n')));
		QFile lights(QStringLiteral("data/XML/levels/sample_small/lights.xml"));
		QVERIFY(lights.open(QIODevice::ReadOnly));
		QVERIFY(lights.readAll().contains("x=\"1.25\" y=\"2.5\" z=\"-3.75\""));
		problems.reset();
		QVERIFY(QDir().mkpath(QStringLiteral("data/XML/levels/blocked/lights.xml")));
		myEngine->Save(QStringLiteral("blocked"),
		               [&problems](const QStringList& someProblems) { problems = someProblems; });
		QTRY_VERIFY_WITH_TIMEOUT(problems.has_value(), 30000);
		QVERIFY(!problems->isEmpty());
		QVERIFY2(problems->join('\n').contains("lights.xml"), qPrintable(problems->join('\n')));
	}
};

QTEST_GUILESS_MAIN(EngineBridgeTest)
#include "EngineBridgeTest.moc"
