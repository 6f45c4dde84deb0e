#pragma once
// The list view's view: a one-column report list (header and items) at the
// model's fixed header and item heights, so a click lands on the item the
// model finds at that point. Selection comes from the model only; clicks
// and keys go to Input.

#include "qt/control_view.hpp"

class QTableView;
class QStandardItemModel;

namespace belvane::forms {
class ListView;
}

namespace belvane::qt {

class ListViewView : public ControlView {
  Q_OBJECT
public:
  ListViewView(FormWindow& window, forms::ListView& list, QWidget* parent);
  void SyncAll() override;
  QTableView* Table() const noexcept { return table_; }

protected:
  void Sync(grid::Property property) override;
  bool Other(QWidget* source, QEvent* event) override;
  QPoint TwipsAt(QWidget* source, QPoint pixels) const override;

private:
  void SyncItems();
  void SyncSelection();
  void SyncHeader();

  forms::ListView& list_;
  QTableView* table_;
  QStandardItemModel* items_;
};

} // namespace belvane::qt
