#pragma once
// LevelChecker: a level looked at before it is opened, by the same checks as `lumora check`,
// run as its own process (`lumora check --json LEVEL` in the data folder): a level bad enough
// to upset the engine cannot take the editor, or the level open in it, down with it.
#include <QList>
#include <QObject>
#include <QProcess>
#include <QString>
#include <QStringList>

#include "panels/LevelProblem.h"

namespace LumoraEditor
{
struct CheckResult
{
	QString myLevel;
	// False when the check itself could not run (no lumora tool, it crashed): myProblems
	// then holds one line saying why.
	bool myRanFlag = false;
	QList<LevelProblem> myProblems;
	QStringList myNotes;

	bool HasLevelProblems() const;
	// The baked files' problems (stale or damaged bakes), one line each.
	QStringList BakeProblems() const;
};

class LevelChecker : public QObject
{
	Q_OBJECT

public:
	static constexpr int ourTimeoutMs = 60000;

	explicit LevelChecker(QObject* aParent = nullptr);
	~LevelChecker() override;
	// The tool: $LUMORA_CLI, else "lumora" beside the editor or in the build tree's tools/lumora/,
	// else "lumora" on the PATH.
	static QString FindTool();
	// Reads the tool's JSON output.
	static CheckResult Parse(const QString& aLevel, const QByteArray& aJson);

	// Checks aLevel in the working directory; finished() follows. A check still running is
	// abandoned.
	void Check(const QString& aLevel);
	bool IsRunning() const { return myProcess != nullptr; }

signals:
	void finished(const LumoraEditor::CheckResult& aResult);

private:
	QProcess* myProcess = nullptr;
	QString myLevel;
};
} // namespace LumoraEditor
