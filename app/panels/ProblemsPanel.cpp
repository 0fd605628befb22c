#include "panels/ProblemsPanel.h"

#include <QHeaderView>
#include <QLabel>
#include <QTreeWidget>
#include <QVBoxLayout>

namespace LumoraEditor
{
ProblemsPanel::ProblemsPanel(QWidget* aParent) : QWidget(aParent)
{
	myHeader = new QLabel(this);
	myHeader->setWordWrap(true);
	myHeader->setTextInteractionFlags(Qt::TextSelectableByMouse);
	myTree = new QTreeWidget(this);
	myTree->setColumnCount(3);
	myTree->setHeaderLabels({tr("File"), tr("Element"), tr("Message")});
	myTree->setRootIsDecorated(false);
	myTree->setUniformRowHeights(true);
	myTree->setWordWrap(true);
	myTree->header()->setStretchLastSection(true);
	myTree->header()->setSectionResizeMode(0, QHeaderView::ResizeToContents);
	myTree->header()->setSectionResizeMode(1, QHeaderView::ResizeToContents);

	auto* layout = new QVBoxLayout(this);
	layout->setContentsMargins(2, 2, 2, 2);
	layout->addWidget(myHeader);
	layout->addWidget(myTree, 1);
	Clear();
}

void ProblemsPanel::SetProblems(const QString& aLevel, const QList<LevelProblem>& someProblems)
{
	myTree->clear();
	if (someProblems.isEmpty())
	{
		myHeader->setText(tr("No problems"));
		return;
	}
	const int count = static_cast<int>(someProblems.size());
	myHeader->setText(count == 1 ? tr("Level %1 was not opened: 1 problem").arg(aLevel)
	                             : tr("Level %1 was not opened: %2 problems").arg(aLevel).arg(count));
	const QString bakedTip = tr("A bake writes this file: baking the level again replaces it.");
	for (const LevelProblem& problem : someProblems)
	{
		auto* item = new QTreeWidgetItem(myTree, {problem.file, problem.element, problem.message});
		item->setToolTip(2, problem.message);
		if (problem.bakedFlag)
		{
			QFont font = item->font(0);
			font.setItalic(true);
			for (int column = 0; column < 3; ++column)
			{
				item->setFont(column, font);
			}
			item->setToolTip(0, bakedTip);
		}
	}
}

void ProblemsPanel::Clear()
{
	SetProblems(QString(), {});
}

int ProblemsPanel::Count() const
{
	return myTree->topLevelItemCount();
}

QString ProblemsPanel::GetHeader() const
{
	return myHeader->text();
}
} // namespace LumoraEditor
