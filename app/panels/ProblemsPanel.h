#pragma once
// ProblemsPanel: why a level was not opened, one row per problem (file, element, message),
// under a line naming the level and how many problems it has.
#include <QList>
#include <QWidget>

#include "panels/LevelProblem.h"

class QLabel;
class QTreeWidget;

namespace LumoraEditor
{
class ProblemsPanel : public QWidget
{
	Q_OBJECT

public:
	explicit ProblemsPanel(QWidget* aParent = nullptr);

	void SetProblems(const QString& aLevel, const QList<LevelProblem>& someProblems);
	void Clear();

	int Count() const;
	QString GetHeader() const;
	QTreeWidget* GetTree() const { return myTree; }

private:
	QLabel* myHeader = nullptr;
	QTreeWidget* myTree = nullptr;
};
} // namespace LumoraEditor
