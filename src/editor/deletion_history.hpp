#pragma once
// Taking back deletions: each line the estimator deletes from an editor's
// selected grid is remembered with its texts, its cell formats and the
// stored ids its deletion put on the removed-items list, so that it can be
// put back exactly where it stood (Ctrl+Z) and deleted again (Ctrl+Y).

#include "data/recordset.hpp"
#include "grid/flex_grid.hpp"

#include <string>
#include <vector>

namespace belvane::editor {

// A deleted line as it stood.
struct DeletedRow {
  int row = 0;
  // The grid's only line: its cells were emptied and the row kept as the
  // placeholder, rather than removed.
  bool blanked = false;
  std::vector<std::string> texts;
  std::vector<grid::CellStyle> styles;
  // The stored ids its deletion added to the removed-items list.
  std::vector<std::string> ids;
};

// The row's texts and formats (the current-cell highlight is not the row's
// own format and is kept as white).
DeletedRow SnapshotRow(const grid::FlexGrid& grid, int row, std::vector<std::string> ids,
                       bool blanked);

// Puts a deleted line back: inserted at its row (or written into the
// placeholder row it was blanked in), with its texts and formats.
void RestoreRow(grid::FlexGrid& grid, const DeletedRow& deleted);

// Takes the ids off the removed-items list, so the write-back keeps their
// records as if they had never been deleted.
void ForgetRemovedItems(data::Recordset& removed, const std::vector<std::string>& ids);

// The deletions of one session, to take back and to do again.
class DeletionHistory {
public:
  // A new deletion; what had been taken back can no longer be done again.
  void Deleted(DeletedRow row);
  // A deletion done again by Redo goes back on the undo list.
  void Redone(DeletedRow row) { undo_.push_back(std::move(row)); }
  bool CanUndo() const noexcept { return !undo_.empty(); }
  bool CanRedo() const noexcept { return !redo_.empty(); }
  // The last deletion, moved to the redo list.
  DeletedRow Undo();
  // The last deletion taken back, off the redo list.
  DeletedRow Redo();
  void Clear();

private:
  std::vector<DeletedRow> undo_;
  std::vector<DeletedRow> redo_;
};

} // namespace belvane::editor
