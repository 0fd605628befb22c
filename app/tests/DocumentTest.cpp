// The document's edits, history and selection on a fake engine that keeps its lists by the
// engine's rules: what undo and redo leave in the engine must be exactly what was there.
#include <QSignalSpy>
#include <QTest>

#include "bridge/FakeEngine.h"
#include "core/Document.h"

using namespace LumoraEditor;

namespace
{
ObjectState Light(float anX, float aFalloff = 3.0f)
{
	ObjectState state;
	state.myKind = Kind::POINT_LIGHT;
	state.myPosition = {anX, 1.0f, 2.0f};
	state.myColor = {1.0f, 0.5f, 0.25f};
	state.myFalloff = aFalloff;
	return state;
}

ObjectState Node(float anX)
{
	ObjectState state;
	state.myKind = Kind::PATH_NODE;
	state.myPosition = {anX, 0.0f, 0.0f};
	return state;
}

// A level of four point lights and three path nodes, loaded into both the fake engine and the
// document as the engine thread hands it over.
struct Level
{
	FakeEngine myEngine;
	Document myDocument{myEngine};

	Level()
	{
		Document::ObjectLists lists;
		for (int index = 0; index < 4; ++index)
		{
			lists[0].push_back(Light(static_cast<float>(index)));
		}
		for (int index = 0; index < 3; ++index)
		{
			lists[3].push_back(Node(static_cast<float>(index)));
		}
		myEngine.myLists = lists;
		myDocument.Reset(QStringLiteral("test"), lists);
	}
	const std::vector<ObjectState>& Lights() const { return myEngine.myLists[0]; }
	ObjectId LightId(int anIndex) const { return myDocument.IdAt(Kind::POINT_LIGHT, anIndex); }
};
} // namespace

class DocumentTest : public QObject
{
	Q_OBJECT

private slots:
	void UndoAndRedoGiveBackExactValues()
	{
		Level level;
		const auto before = level.Lights();
		const ObjectId id = level.LightId(2);
		ObjectState changed = Light(9.5f, 7.25f);
		changed.myColor = {3.5f, 0.0f, 1.0f};
		QVERIFY(level.myDocument.SetState(id, changed, "Change light"));
		QCOMPARE(level.Lights()[2], changed);
		QCOMPARE(level.myDocument.GetSelected(), id);
		// The same values again is no edit.
		QVERIFY(!level.myDocument.SetState(id, changed, "Change light"));
		QCOMPARE(level.myDocument.History().count(), 1);
		QCOMPARE(level.myDocument.History().undoText(), QStringLiteral("Change light"));

		level.myDocument.History().undo();
		QVERIFY(level.Lights() == before);
		level.myDocument.History().redo();
		QCOMPARE(level.Lights()[2], changed);
		QCOMPARE(*level.myDocument.Find(id), changed);
	}

	void SliderEditsMergeIntoOneStepKeepingTheLastValues()
	{
		Level level;
		const ObjectId first = level.LightId(0);
		const ObjectState original = level.Lights()[0];
		for (float falloff : {4.0f, 5.0f, 6.0f})
		{
			QVERIFY(level.myDocument.SetStateMerging(first, Light(0.0f, falloff), "Change falloff"));
		}
		QCOMPARE(level.myDocument.History().count(), 1);
		level.myDocument.History().undo();
		QCOMPARE(level.Lights()[0], original);
		// Redo restores the last value, not one in between.
		level.myDocument.History().redo();
		QCOMPARE(level.Lights()[0].myFalloff, 6.0f);

		// Another object, or another kind of change, is a step of its own.
		QVERIFY(level.myDocument.SetStateMerging(level.LightId(1), Light(1.0f, 9.0f), "Change falloff"));
		QVERIFY(level.myDocument.SetStateMerging(level.LightId(1), Light(1.5f, 9.0f), "Change position"));
		QCOMPARE(level.myDocument.History().count(), 3);

		// Nothing merges into the step the file was saved at.
		level.myDocument.MarkSaved();
		QVERIFY(level.myDocument.SetStateMerging(level.LightId(1), Light(2.5f, 9.0f), "Change position"));
		QCOMPARE(level.myDocument.History().count(), 4);
		level.myDocument.History().undo();
		QVERIFY(!level.myDocument.IsModified());
	}

	void ALiveEditIsOneStepAndCancelPutsItBack()
	{
		Level level;
		const ObjectId id = level.LightId(1);
		const ObjectState original = level.Lights()[1];
		{
			LiveEdit drag = level.myDocument.BeginLiveEdit(id, "Move point light");
			for (int step = 1; step <= 5; ++step)
			{
				drag.Update(Light(1.0f + static_cast<float>(step)));
				QCOMPARE(level.Lights()[1].myPosition[0], 1.0f + static_cast<float>(step));
			}
			drag.Commit();
		}
		QCOMPARE(level.myDocument.History().count(), 1);
		QCOMPARE(level.myDocument.History().undoText(), QStringLiteral("Move point light"));
		level.myDocument.History().undo();
		QCOMPARE(level.Lights()[1], original);
		level.myDocument.History().redo();
		QCOMPARE(level.Lights()[1].myPosition[0], 6.0f);

		// Cancelled, or dropped without a commit: the values before, and no step.
		const ObjectState moved = level.Lights()[1];
		{
			LiveEdit drag = level.myDocument.BeginLiveEdit(id, "Move point light");
			drag.Update(Light(40.0f));
			drag.Cancel();
		}
		{
			LiveEdit drag = level.myDocument.BeginLiveEdit(id, "Move point light");
			drag.Update(Light(50.0f));
		}
		QCOMPARE(level.Lights()[1], moved);
		QCOMPARE(*level.myDocument.Find(id), moved);
		QCOMPARE(level.myDocument.History().count(), 1);
		// A live edit of nothing does nothing.
		QVERIFY(!level.myDocument.BeginLiveEdit(12345, "Move").IsOpen());
	}

	void DeletionUndoesToTheSameIdValuesAndOrder()
	{
		Level level;
		const auto before = level.Lights();
		std::vector<ObjectId> ids;
		for (int index = 0; index < 4; ++index)
		{
			ids.push_back(level.LightId(index));
		}
		level.myDocument.Select(ids[1]);
		QVERIFY(level.myDocument.Remove(ids[1]));
		// The engine's rule: the last light moved into the gap.
		QCOMPARE(level.Lights().size(), size_t(3));
		QCOMPARE(level.Lights()[1], before[3]);
		QCOMPARE(level.myDocument.IdAt(Kind::POINT_LIGHT, 1), ids[3]);
		QCOMPARE(level.myDocument.GetSelected(), ObjectId(0));
		QCOMPARE(level.myDocument.History().undoText(), QStringLiteral("Delete point light"));

		level.myDocument.History().undo();
		QVERIFY(level.Lights() == before);
		for (int index = 0; index < 4; ++index)
		{
			QCOMPARE(level.myDocument.IdAt(Kind::POINT_LIGHT, index), ids[index]);
		}
		QCOMPARE(level.myDocument.GetSelected(), ids[1]);
		QCOMPARE(level.myEngine.mySelectedIndex, 1);

		// An edit after the undone deletion still finds the object by its id.
		level.myDocument.History().redo();
		level.myDocument.History().undo();
		QVERIFY(level.myDocument.SetState(ids[1], Light(20.0f), "Change light"));
		QCOMPARE(level.Lights()[1].myPosition[0], 20.0f);
	}

	void AdditionsAndPathNodeRemovals()
	{
		Level level;
		const ObjectId added = level.myDocument.Add(Light(7.0f), "Add point light");
		QCOMPARE(level.Lights().size(), size_t(5));
		QCOMPARE(level.Lights()[4], Light(7.0f));
		QCOMPARE(level.myDocument.GetSelected(), added);
		level.myDocument.History().undo();
		QCOMPARE(level.Lights().size(), size_t(4));
		QCOMPARE(level.myDocument.Find(added), nullptr);
		level.myDocument.History().redo();
		QCOMPARE(level.myDocument.IdAt(Kind::POINT_LIGHT, 4), added);

		// The path graph holds its nodes by place: only the last may go.
		QString problem;
		QVERIFY(!level.myDocument.Remove(level.myDocument.IdAt(Kind::PATH_NODE, 0), &problem));
		QVERIFY(problem.contains("last path node"));
		QCOMPARE(level.myEngine.myLists[3].size(), size_t(3));
		QVERIFY(level.myDocument.Remove(level.myDocument.IdAt(Kind::PATH_NODE, 2), &problem));
		QCOMPARE(level.myEngine.myLists[3].size(), size_t(2));
		level.myDocument.History().undo();
		QCOMPARE(level.myEngine.myLists[3].back(), Node(2.0f));
	}

	void ModifiedFollowsTheSavedPlaceInHistory()
	{
		Level level;
		QSignalSpy modified(&level.myDocument, &Document::modifiedChanged);
		QVERIFY(!level.myDocument.IsModified());
		level.myDocument.SetState(level.LightId(0), Light(5.0f), "Change light");
		QVERIFY(level.myDocument.IsModified());
		level.myDocument.MarkSaved();
		QVERIFY(!level.myDocument.IsModified());
		level.myDocument.History().undo();
		QVERIFY(level.myDocument.IsModified());
		// Saved, undone, then edited otherwise: the saved state can no longer be reached.
		level.myDocument.SetState(level.LightId(0), Light(6.0f), "Change light");
		QVERIFY(level.myDocument.IsModified());
		level.myDocument.History().undo();
		QVERIFY(level.myDocument.IsModified());
		QVERIFY(modified.count() >= 3);
	}

	void SelectionIsNoStepAndModesFollowIt()
	{
		Level level;
		QSignalSpy modes(&level.myDocument, &Document::modeChanged);
		level.myDocument.SelectAt(Kind::PATH_NODE, 1);
		QCOMPARE(level.myDocument.GetMode(), 1);
		QCOMPARE(level.myEngine.mySelectedKind, Kind::PATH_NODE);
		QCOMPARE(level.myEngine.mySelectedIndex, 1);
		QCOMPARE(modes.count(), 1);
		level.myDocument.SelectAt(Kind::POINT_LIGHT, 3);
		QCOMPARE(level.myDocument.GetMode(), 0);
		QCOMPARE(level.myDocument.History().count(), 0);
		// A bad index selects nothing; switching to another mode drops a selection of this one.
		level.myDocument.SelectAt(Kind::POINT_LIGHT, 99);
		QCOMPARE(level.myDocument.GetSelected(), ObjectId(0));
		level.myDocument.SelectAt(Kind::POINT_LIGHT, 0);
		level.myDocument.SetMode(2);
		QCOMPARE(level.myDocument.GetSelected(), ObjectId(0));
		QCOMPARE(level.myEngine.mySelectedKind, Kind::DECAL);
		QCOMPARE(level.myEngine.mySelectedIndex, -1);
		// Undo gives the edit's selection back.
		level.myDocument.SetState(level.LightId(2), Light(8.0f), "Change light");
		level.myDocument.Select(0);
		level.myDocument.History().undo();
		level.myDocument.History().redo();
		QCOMPARE(level.myDocument.GetSelected(), level.LightId(2));
	}
};

QTEST_GUILESS_MAIN(DocumentTest)
#include "DocumentTest.moc"
