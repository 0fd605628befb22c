#include "main/LevelChecker.h"

#include <QCoreApplication>
#include <QFileInfo>
#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>
#include <QStandardPaths>
#include <QTimer>
#include <algorithm>

namespace LumoraEditor
{
bool CheckResult::HasLevelProblems() const
{
	return std::any_of(myProblems.begin(), myProblems.end(),
	                   [](const LevelProblem& aProblem) { return !aProblem.bakedFlag; });
}

QStringList CheckResult::BakeProblems() const
{
	QStringList lines;
	for (const LevelProblem& problem : myProblems)
	{
		if (problem.bakedFlag)
		{
			lines << problem.message;
		}
	}
	return lines;
}

LevelChecker::LevelChecker(QObject* aParent) : QObject(aParent)
{
}

LevelChecker::~LevelChecker()
{
	if (myProcess != nullptr)
	{
		myProcess->disconnect(this);
		myProcess->kill();
		myProcess->waitForFinished(2000);
	}
}

QString LevelChecker::FindTool()
{
	const QString fromEnvironment = qEnvironmentVariable("LUMORA_CLI");
	if (!fromEnvironment.isEmpty())
	{
		return fromEnvironment;
	}
	const QString here = QCoreApplication::applicationDirPath();
	for (const QString& candidate : {here + "/lumora", here + "/../tools/lumora/lumora"})
	{
		if (QFileInfo(candidate).isExecutable())
		{
			return QFileInfo(candidate).canonicalFilePath();
		}
	}
	return QStandardPaths::findExecutable(QStringLiteral("lumora"));
}

CheckResult LevelChecker::Parse(const QString& aLevel, const QByteArray& aJson)
{
	CheckResult result;
	result.myLevel = aLevel;
	QJsonParseError error;
	const QJsonDocument document = QJsonDocument::fromJson(aJson, &error);
	if (error.error != QJsonParseError::NoError || !document.isObject())
	{
		result.myProblems.push_back(
		    {QString(), QString(),
		     tr("The level check gave no readable answer (%1)").arg(error.errorString()), false});
		return result;
	}
	result.myRanFlag = true;
	const QJsonObject root = document.object();
	for (const QJsonValue& value : root.value(QStringLiteral("problems")).toArray())
	{
		const QJsonObject problem = value.toObject();
		result.myProblems.push_back({problem.value(QStringLiteral("file")).toString(),
		                             problem.value(QStringLiteral("element")).toString(),
		                             problem.value(QStringLiteral("message")).toString(),
		                             problem.value(QStringLiteral("baked")).toBool()});
	}
	for (const QJsonValue& value : root.value(QStringLiteral("notes")).toArray())
	{
		result.myNotes << value.toString();
	}
	return result;
}

void LevelChecker::Check(const QString& aLevel)
{
	if (myProcess != nullptr)
	{
		myProcess->disconnect(this);
		myProcess->kill();
		myProcess->deleteLater();
		myProcess = nullptr;
	}
	myLevel = aLevel;
	const QString tool = FindTool();
	if (tool.isEmpty())
	{
		CheckResult result;
		result.myLevel = aLevel;
		result.myProblems.push_back({QString(), QString(),
		                             tr("The lumora tool that checks levels was not found (set LUMORA_CLI)"),
		                             false});
		QMetaObject::invokeMethod(
		    this, [this, result] { emit finished(result); }, Qt::QueuedConnection);
		return;
	}
	myProcess = new QProcess(this);
	QProcess* process = myProcess;
	// Mesa's rasterizer need not spread over every core for a check.
	QProcessEnvironment environment = QProcessEnvironment::systemEnvironment();
	if (!environment.contains(QStringLiteral("LP_NUM_THREADS")))
	{
		environment.insert(QStringLiteral("LP_NUM_THREADS"), QStringLiteral("1"));
	}
	process->setProcessEnvironment(environment);
	QTimer::singleShot(ourTimeoutMs, process, [process] { process->kill(); });
	connect(
	    process, &QProcess::finished, this, [this, process](int anExitCode, QProcess::ExitStatus aStatus) {
		    CheckResult result;
		    if (aStatus == QProcess::NormalExit && (anExitCode == 0 || anExitCode == 1))
		    {
			    result = Parse(myLevel, process->readAllStandardOutput());
		    }
		    else
		    {
			    result.myLevel = myLevel;
			    const QString detail = QString::fromUtf8(process->readAllStandardError()).trimmed();
			    result.myProblems.push_back(
			        {QString(), QString(),
			         tr("The level check ended abnormally (exit %1)%2")
			             .arg(anExitCode)
			             .arg(detail.isEmpty() ? QString() : QStringLiteral(": ") + detail.section('\n', -1)),
			         false});
		    }
		    myProcess = nullptr;
		    process->deleteLater();
		    emit finished(result);
	    });
	connect(process, &QProcess::errorOccurred, this, [this, process](QProcess::ProcessError anError) {
		if (anError != QProcess::FailedToStart)
		{
			return;
		}
		CheckResult result;
		result.myLevel = myLevel;
		result.myProblems.push_back({QString(), QString(),
		                             tr("The level check could not start: %1").arg(process->errorString()),
		                             false});
		myProcess = nullptr;
		process->deleteLater();
		emit finished(result);
	});
	process->start(tool, {QStringLiteral("check"), QStringLiteral("--json"), aLevel});
}
} // namespace LumoraEditor
