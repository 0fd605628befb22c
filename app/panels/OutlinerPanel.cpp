#include "panels/OutlinerPanel.h"

#include <QComboBox>
#include <QHBoxLayout>
#include <QHeaderView>
#include <QLineEdit>
#include <QScopedValueRollback>
#include <QTimer>
#include <QTreeWidget>
#include <QVBoxLayout>

#include "core/Document.h"
#include "panels/ObjectLabels.h"

namespace LumoraEditor
{
namespace
{
void SetTextIfChanged(QTreeWidgetItem& anItem, int aColumn, const QString& aText)
{
	if (anItem.text(aColumn) != aText)
	{
		anItem.setText(aColumn, aText);
	}
}

ObjectId IdOf(const QTreeWidgetItem& anItem)
{
	return anItem.data(0, OutlinerPanel::ourIdRole).toULongLong();
}
} // namespace

OutlinerPanel::OutlinerPanel(Document& aDocument, QWidget* aParent) : QWidget(aParent), myDocument(aDocument)
{
	myFilterEdit = new QLineEdit(this);
	myFilterEdit->setPlaceholderText(tr("Filter by name"));
	myFilterEdit->setClearButtonEnabled(true);
	myKindCombo = new QComboBox(this);
	myKindCombo->addItem(tr("All kinds"), -1);
	for (int kind = 0; kind < ourKindCount; ++kind)
	{
		myKindCombo->addItem(tr(KindPluralTitle(static_cast<Kind>(kind))), kind);
	}

	myTree = new QTreeWidget(this);
	myTree->setColumnCount(2);
	myTree->setHeaderLabels({tr("Name"), tr("Position")});
	myTree->setSelectionMode(QAbstractItemView::SingleSelection);
	myTree->setUniformRowHeights(true);
	myTree->header()->setSectionResizeMode(0, QHeaderView::ResizeToContents);
	for (int kind = 0; kind < ourKindCount; ++kind)
	{
		auto* group = new QTreeWidgetItem(myTree);
		// A group is a heading, not something the document can select.
		group->setFlags(Qt::ItemIsEnabled);
		group->setExpanded(true);
		myGroups[kind] = group;
	}

	auto* filterRow = new QHBoxLayout;
	filterRow->addWidget(myFilterEdit, 1);
	filterRow->addWidget(myKindCombo);
	auto* layout = new QVBoxLayout(this);
	layout->setContentsMargins(2, 2, 2, 2);
	layout->addLayout(filterRow);
	layout->addWidget(myTree, 1);

	connect(myFilterEdit, &QLineEdit::textChanged, this, [this] { ScheduleRefresh(); });
	connect(myKindCombo, &QComboBox::currentIndexChanged, this, [this] { ScheduleRefresh(); });
	connect(myTree, &QTreeWidget::itemSelectionChanged, this, &OutlinerPanel::OnTreeSelectionChanged);
	connect(myTree, &QTreeWidget::itemDoubleClicked, this, [this](QTreeWidgetItem* anItem) {
		if (const ObjectId id = IdOf(*anItem); id != 0)
		{
			emit frameRequested(id);
		}
	});

	connect(&myDocument, &Document::reset, this, &OutlinerPanel::ScheduleRefresh);
	connect(&myDocument, &Document::objectAdded, this, &OutlinerPanel::ScheduleRefresh);
	connect(&myDocument, &Document::objectRemoved, this, &OutlinerPanel::ScheduleRefresh);
	connect(&myDocument, &Document::objectChanged, this, &OutlinerPanel::ScheduleRefresh);
	connect(&myDocument, &Document::selectionChanged, this, &OutlinerPanel::MirrorSelection);

	Refresh();
}

void OutlinerPanel::SetFilter(const QString& aText)
{
	myFilterEdit->setText(aText);
}

void OutlinerPanel::SetKindFilter(std::optional<Kind> aKind)
{
	myKindCombo->setCurrentIndex(myKindCombo->findData(aKind ? static_cast<int>(*aKind) : -1));
}

QTreeWidgetItem* OutlinerPanel::FindItem(ObjectId anId) const
{
	return myItems.value(anId, nullptr);
}

void OutlinerPanel::ScheduleRefresh()
{
	if (myRefreshPendingFlag)
	{
		return;
	}
	myRefreshPendingFlag = true;
	QTimer::singleShot(0, this, &OutlinerPanel::Refresh);
}

void OutlinerPanel::Refresh()
{
	myRefreshPendingFlag = false;
	{
		// Rows that go may take the tree's selection with them: that is no click.
		const QScopedValueRollback guard(myMirroringFlag, true);
		for (int kind = 0; kind < ourKindCount; ++kind)
		{
			RefreshGroup(static_cast<Kind>(kind));
		}
	}
	MirrorSelection();
}

void OutlinerPanel::RefreshGroup(Kind aKind)
{
	QTreeWidgetItem* group = myGroups[static_cast<int>(aKind)];
	const int shownKind = myKindCombo->currentData().toInt();
	group->setHidden(shownKind >= 0 && shownKind != static_cast<int>(aKind));

	const QString filter = myFilterEdit->text().trimmed();
	const int count = myDocument.Count(aKind);
	// Rows [0, row) are the ones shown, in the engine's order; whatever is left below them
	// at the end is no longer shown.
	int row = 0;
	for (int index = 0; index < count; ++index)
	{
		const ObjectId id = myDocument.IdAt(aKind, index);
		const ObjectState& state = *myDocument.Find(id);
		const QString label = ObjectLabel(aKind, index, state);
		if (!filter.isEmpty() && !label.contains(filter, Qt::CaseInsensitive))
		{
			continue;
		}
		QTreeWidgetItem* item = myItems.value(id, nullptr);
		if (item == nullptr)
		{
			item = new QTreeWidgetItem;
			item->setData(0, ourIdRole, QVariant::fromValue<quint64>(id));
			myItems.insert(id, item);
			group->insertChild(row, item);
		}
		else if (group->child(row) != item)
		{
			group->insertChild(row, group->takeChild(group->indexOfChild(item)));
		}
		SetTextIfChanged(*item, 0, label);
		SetTextIfChanged(*item, 1, PositionText(state));
		++row;
	}
	while (group->childCount() > row)
	{
		QTreeWidgetItem* item = group->takeChild(row);
		myItems.remove(IdOf(*item));
		delete item;
	}

	const QString title = tr(KindPluralTitle(aKind));
	SetTextIfChanged(*group, 0,
	                 filter.isEmpty() ? tr("%1 (%2)").arg(title).arg(count)
	                                  : tr("%1 (%2/%3)").arg(title).arg(row).arg(count));
}

void OutlinerPanel::MirrorSelection()
{
	const QScopedValueRollback guard(myMirroringFlag, true);
	QTreeWidgetItem* item = myItems.value(myDocument.GetSelected(), nullptr);
	if (item == nullptr || item->parent()->isHidden())
	{
		myTree->clearSelection();
		return;
	}
	if (myTree->currentItem() != item || !item->isSelected())
	{
		myTree->setCurrentItem(item);
	}
	item->parent()->setExpanded(true);
	myTree->scrollToItem(item);
}

void OutlinerPanel::OnTreeSelectionChanged()
{
	if (myMirroringFlag)
	{
		return;
	}
	const QList<QTreeWidgetItem*> selected = myTree->selectedItems();
	myDocument.Select(selected.isEmpty() ? 0 : IdOf(*selected.first()));
}
} // namespace LumoraEditor
