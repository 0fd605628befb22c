#pragma once
// LogPanel: what the engine reports (EngineThread::logReport), newest last, one line each:
// "time  LEVEL  text  (function)". Keeps the last ourMaxEntries; the level filter shows
// everything or errors and worse only.
#include <QDateTime>
#include <QWidget>
#include <deque>

class QComboBox;
class QPlainTextEdit;

namespace LumoraEditor
{
class LogPanel : public QWidget
{
	Q_OBJECT

public:
	static constexpr int ourMaxEntries = 5000;
	// The engine's levels: 0 debug, 1 error, 2 severe, 3 critical.
	static constexpr int ourErrorLevel = 1;

	explicit LogPanel(QWidget* aParent = nullptr);

	// Reports of error level and above since the last Clear (also those no longer kept).
	int ErrorCount() const { return myErrorCount; }
	// Shows errors and worse only, or everything.
	void SetErrorsOnly(bool anErrorsOnlyFlag);
	QPlainTextEdit* GetText() const { return myText; }

	// "DEBUG", "ERROR", "SEVERE", "CRITICAL".
	static QString LevelName(int aLevel);

public slots:
	void AddReport(int aLevel, const QString& aFunction, const QString& aText);
	void Clear();

signals:
	void errorCountChanged(int aCount);

private:
	struct Entry
	{
		QDateTime myTime;
		int myLevel = 0;
		QString myFunction;
		QString myText;
	};

	bool IsShown(const Entry& anEntry) const;
	static QString Line(const Entry& anEntry);
	void Rebuild();

	QComboBox* myLevelCombo = nullptr;
	QPlainTextEdit* myText = nullptr;
	std::deque<Entry> myEntries;
	int myErrorCount = 0;
};
} // namespace LumoraEditor
