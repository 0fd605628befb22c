#include "panels/LogPanel.h"

#include <QComboBox>
#include <QFontDatabase>
#include <QHBoxLayout>
#include <QPlainTextEdit>
#include <QPushButton>
#include <QScrollBar>
#include <QVBoxLayout>

namespace LumoraEditor
{
LogPanel::LogPanel(QWidget* aParent) : QWidget(aParent)
{
	myLevelCombo = new QComboBox(this);
	myLevelCombo->addItem(tr("All messages"));
	myLevelCombo->addItem(tr("Errors and above"));
	auto* clearButton = new QPushButton(tr("Clear"), this);
	myText = new QPlainTextEdit(this);
	myText->setReadOnly(true);
	myText->setLineWrapMode(QPlainTextEdit::NoWrap);
	myText->setMaximumBlockCount(ourMaxEntries);
	myText->setFont(QFontDatabase::systemFont(QFontDatabase::FixedFont));

	auto* bar = new QHBoxLayout;
	bar->addWidget(myLevelCombo);
	bar->addStretch(1);
	bar->addWidget(clearButton);
	auto* layout = new QVBoxLayout(this);
	layout->setContentsMargins(2, 2, 2, 2);
	layout->addLayout(bar);
	layout->addWidget(myText, 1);

	connect(myLevelCombo, &QComboBox::currentIndexChanged, this, &LogPanel::Rebuild);
	connect(clearButton, &QPushButton::clicked, this, &LogPanel::Clear);
}

void LogPanel::SetErrorsOnly(bool anErrorsOnlyFlag)
{
	myLevelCombo->setCurrentIndex(anErrorsOnlyFlag ? 1 : 0);
}

QString LogPanel::LevelName(int aLevel)
{
	switch (aLevel)
	{
	case 0:
		return QStringLiteral("DEBUG");
	case 1:
		return QStringLiteral("ERROR");
	case 2:
		return QStringLiteral("SEVERE");
	case 3:
		return QStringLiteral("CRITICAL");
	}
	return QStringLiteral("LEVEL %1").arg(aLevel);
}

void LogPanel::AddReport(int aLevel, const QString& aFunction, const QString& aText)
{
	myEntries.push_back({QDateTime::currentDateTime(), aLevel, aFunction, aText});
	if (static_cast<int>(myEntries.size()) > ourMaxEntries)
	{
		myEntries.pop_front();
	}
	if (IsShown(myEntries.back()))
	{
		myText->appendPlainText(Line(myEntries.back()));
	}
	if (aLevel >= ourErrorLevel)
	{
		emit errorCountChanged(++myErrorCount);
	}
}

void LogPanel::Clear()
{
	myEntries.clear();
	myText->clear();
	if (myErrorCount != 0)
	{
		myErrorCount = 0;
		emit errorCountChanged(0);
	}
}

bool LogPanel::IsShown(const Entry& anEntry) const
{
	return myLevelCombo->currentIndex() == 0 || anEntry.myLevel >= ourErrorLevel;
}

QString LogPanel::Line(const Entry& anEntry)
{
	QString line = anEntry.myTime.toString(QStringLiteral("HH:mm:ss")) + QStringLiteral("  ") +
	               LevelName(anEntry.myLevel).leftJustified(8) + QStringLiteral("  ") +
	               anEntry.myText.trimmed();
	if (!anEntry.myFunction.isEmpty())
	{
		line += QStringLiteral("  (%1)").arg(anEntry.myFunction);
	}
	return line;
}

void LogPanel::Rebuild()
{
	QStringList lines;
	for (const Entry& entry : myEntries)
	{
		if (IsShown(entry))
		{
			lines << Line(entry);
		}
	}
	myText->setPlainText(lines.join(QLatin1Char('\n')));
	myText->verticalScrollBar()->setValue(myText->verticalScrollBar()->maximum());
}
} // namespace LumoraEditor
