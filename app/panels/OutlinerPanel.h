#pragma once
// OutlinerPanel: every object of the open level in four groups (point lights, spot lights,
// decals, path nodes), in the engine's order, with its position; a name filter and a kind
// filter above. It mirrors the document: rows follow the document's notifications (diffed
// and coalesced into one refresh per event-loop turn, so an unchanged row is left alone),
// and the selected row follows the document's selection. Only a click of the designer's
// asks the document to select; mirroring the selection back makes no request.
#include <QHash>
#include <QWidget>
#include <optional>

#include "core/ObjectState.h"

class QComboBox;
class QLineEdit;
class QTreeWidget;
class QTreeWidgetItem;

namespace LumoraEditor
{
class Document;

class OutlinerPanel : public QWidget
{
	Q_OBJECT

public:
	// The data role (column 0) holding an object row's ObjectId; group rows hold none.
	static constexpr int ourIdRole = Qt::UserRole + 1;

	explicit OutlinerPanel(Document& aDocument, QWidget* aParent = nullptr);

	// Names containing the text (any case) are shown; empty shows all.
	void SetFilter(const QString& aText);
	// One kind's group only, or every group (no value).
	void SetKindFilter(std::optional<Kind> aKind);

	// For the main window and tests.
	QTreeWidget* GetTree() const { return myTree; }
	// The row of the object, or null when it is filtered out or unknown (after pending
	// refreshes have run).
	QTreeWidgetItem* FindItem(ObjectId anId) const;

signals:
	// The designer double-clicked the object's row: the main window frames the camera on it.
	void frameRequested(LumoraEditor::ObjectId anId);

private:
	void ScheduleRefresh();
	void Refresh();
	void RefreshGroup(Kind aKind);
	void MirrorSelection();
	void OnTreeSelectionChanged();

	Document& myDocument;
	QLineEdit* myFilterEdit = nullptr;
	QComboBox* myKindCombo = nullptr;
	QTreeWidget* myTree = nullptr;
	QTreeWidgetItem* myGroups[ourKindCount] = {};
	QHash<ObjectId, QTreeWidgetItem*> myItems;
	bool myRefreshPendingFlag = false;
	// Set while the panel moves the tree's selection itself.
	bool myMirroringFlag = false;
};
} // namespace LumoraEditor
