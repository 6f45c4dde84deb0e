#include "qt/list_view.hpp"

#include "forms/controls.hpp"

#include <QEvent>
#include <QHeaderView>
#include <QPainter>
#include <QStandardItemModel>
#include <QTableView>

#include <algorithm>

namespace belvane::qt {

namespace {

// A thin line round the list, drawn over its edges: the list drops over the
// grid and the window, and without an edge its last items run into the
// window's background. Drawn on top rather than as the table's frame, so the
// header and the items keep the model's heights and no item is cut off.
class ListOutline : public QWidget {
public:
  explicit ListOutline(QWidget* list) : QWidget(list) {
    setObjectName("ListOutline");
    setAttribute(Qt::WA_TransparentForMouseEvents);
    setAttribute(Qt::WA_NoSystemBackground);
    setFocusPolicy(Qt::NoFocus);
    list->installEventFilter(this);
    setGeometry(list->rect());
    raise();
  }

protected:
  bool eventFilter(QObject* watched, QEvent* event) override {
    if (watched == parent() && (event->type() == QEvent::Resize || event->type() == QEvent::Show)) {
      setGeometry(parentWidget()->rect());
      raise();
    }
    return false;
  }
  void paintEvent(QPaintEvent*) override {
    QPainter painter(this);
    painter.setPen(palette().color(QPalette::Shadow));
    painter.drawRect(rect().adjusted(0, 0, -1, -1));
  }
};

} // namespace

ListViewView::ListViewView(FormWindow& window, forms::ListView& list, QWidget* parent)
    : ControlView(window, list, new QTableView(parent)), list_(list),
      table_(static_cast<QTableView*>(Widget())), items_(new QStandardItemModel(this)) {
  table_->setModel(items_);
  table_->setSelectionMode(QAbstractItemView::SingleSelection);
  table_->setSelectionBehavior(QAbstractItemView::SelectRows);
  table_->setEditTriggers(QAbstractItemView::NoEditTriggers);
  table_->setTabKeyNavigation(false);
  table_->setAutoScroll(false);
  table_->setShowGrid(false);
  table_->setWordWrap(false);
  table_->setVerticalScrollBarPolicy(Qt::ScrollBarAlwaysOff);
  table_->setHorizontalScrollBarPolicy(Qt::ScrollBarAlwaysOff);
  QHeaderView* rows = table_->verticalHeader();
  rows->hide();
  rows->setSectionResizeMode(QHeaderView::Fixed);
  rows->setMinimumSectionSize(0);
  rows->setDefaultSectionSize(GetScale().Pixels(forms::ListView::kItemHeight));
  QHeaderView* header = table_->horizontalHeader();
  header->setSectionResizeMode(QHeaderView::Fixed);
  header->setMinimumSectionSize(0);
  header->setStretchLastSection(false);
  header->setSectionsClickable(false);
  header->setHighlightSections(false);
  header->setDefaultAlignment(Qt::AlignLeft | Qt::AlignVCenter);
  table_->setFrameShape(QFrame::NoFrame);
  new ListOutline(table_);
  Watch(table_->viewport());
  Watch(header->viewport());
}

void ListViewView::SyncAll() {
  ControlView::SyncAll();
  SyncItems();
}

void ListViewView::Sync(grid::Property property) {
  switch (property) {
  case grid::Property::Items:
    SyncItems();
    break;
  case grid::Property::SelectedItem:
    SyncSelection();
    break;
  case grid::Property::ColumnHeader:
  case grid::Property::Geometry:
    SyncHeader();
    break;
  default:
    break;
  }
}

void ListViewView::SyncItems() {
  items_->clear();
  items_->setColumnCount(1);
  for (int i = 1; i <= list_.ItemCount(); ++i)
    items_->appendRow(new QStandardItem(ToQString(list_.ItemText(i))));
  SyncHeader();
  SyncSelection();
}

void ListViewView::SyncHeader() {
  items_->setHorizontalHeaderLabels({ToQString(list_.ColumnHeaderText())});
  QHeaderView* header = table_->horizontalHeader();
  header->setFixedHeight(GetScale().Pixels(forms::ListView::kHeaderHeight));
  if (header->count() > 0) header->resizeSection(0, GetScale().Pixels(list_.ColumnWidth()));
}

void ListViewView::SyncSelection() {
  const int selected = list_.SelectedIndex();
  if (selected < 1 || selected > items_->rowCount()) {
    table_->clearSelection();
    return;
  }
  const QModelIndex index = items_->index(selected - 1, 0);
  table_->selectionModel()->setCurrentIndex(index, QItemSelectionModel::ClearAndSelect |
                                                       QItemSelectionModel::Rows);
}

// Inside the item the list shows there, so the model hits the same item.
QPoint ListViewView::TwipsAt(QWidget* source, QPoint pixels) const {
  QPoint twips = ControlView::TwipsAt(source, pixels);
  if (source != table_->viewport()) return twips;
  const QModelIndex index = table_->indexAt(pixels);
  if (!index.isValid()) return twips;
  const int top = list_.ItemTop(index.row() + 1);
  twips.setY(std::clamp(twips.y(), top, top + forms::ListView::kItemHeight - 1));
  return twips;
}

bool ListViewView::Other(QWidget*, QEvent* event) {
  return event->type() == QEvent::Wheel || event->type() == QEvent::MouseMove;
}

} // namespace belvane::qt
