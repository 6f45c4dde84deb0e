#pragma once
// The quote item rules both editors' stores share: which records an editor
// shows, the removed-items list, the first two passes of the write-back,
// and the all-or-nothing check that runs before anything is written.

#include "data/recordset.hpp"

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace belvane::editor {

// A record an editor shows: its Tag is not "D" and its DELITEM is False (a
// Null in either hides it too).
bool IsShownItem(data::Recordset& items);

// The removed-items list of an edit session: an empty in-memory record set
// of one 32-bit field, ITEMID.
std::unique_ptr<data::Recordset> NewRemovedItemsList();
// Adds a stored item's id (as the grid holds it) to the list.
void AddRemovedItem(data::Recordset& removed, const std::string& id);
// The ids in the list, as texts.
std::vector<std::string> RemovedItemIds(const data::Recordset* removed);

// A text the record set's 32-bit ITEMID can hold.
bool IsItemId(const std::string& id);
// Moves to the record with that ITEMID; false (at the end) when none.
bool FindItemId(data::Recordset& items, const std::string& id);

// One field write of a planned write-back, with the grid column its value
// comes from (-1: from the session), so a refused value can be named.
struct FieldWrite {
  // The value is made in place from whatever a Value is made of.
  template <class V>
  FieldWrite(const char* f, V&& v, int c) : field(f), value(std::forward<V>(v)), column(c) {}
  const char* field;
  data::Value value;
  int column;
};

// What the write-back does for one record: write its fields (appending a
// new record when it has no id) or delete it.
struct PlannedRecord {
  enum class Kind { Write, Delete } kind = Kind::Write;
  int row = 0;
  std::string id;           // ITEMID as the grid holds it; "" for a new record
  const char* idTitle = ""; // the title of the grid column holding the id
  std::string what;         // names the record in a message, e.g. "R&R"
  std::vector<FieldWrite> writes;
};

// How a store names a grid row and explains a refused cell in the
// estimator's words.
struct WriteBackWords {
  std::function<std::string(int row)> describeRow;
  std::function<std::string(const FieldWrite&)> refusedValue;
  const char* source;
};

// The stored record each planned write found while it was checked (as
// Recordset::CurrentStored counts), so the write-back goes straight back to
// it; nothing for a new record or a deletion.
using WriteBackTargets = std::vector<std::optional<size_t>>;

// Checks every planned record against the record set before anything is
// written: ids that are not ids, stored records that are gone (or were
// removed this session), fields the record set lacks and values it cannot
// hold all raise an error naming the row and cell; nothing has changed.
WriteBackTargets CheckWriteBack(data::Recordset& items, const std::vector<PlannedRecord>& plan,
                                const std::vector<std::string>& removedIds,
                                const WriteBackWords& words);

// Pass 1: deletes the records added earlier in this session (no ITEMID),
// so the grid's new lines are not appended twice. Hidden records ("D") and
// records without a Tag stay.
void DropSessionRecords(data::Recordset& items);
// Pass 2: deletes the stored records whose lines the estimator removed.
void ApplyRemovals(data::Recordset& items, const std::vector<std::string>& removedIds);
// Pass 3: the planned writes and deletions, in order. With the targets the
// check found, a write returns to its record without a search (a record
// deleted since is searched for as without them).
void ApplyWriteBack(data::Recordset& items, const std::vector<PlannedRecord>& plan,
                    const WriteBackTargets* targets = nullptr);

} // namespace belvane::editor
