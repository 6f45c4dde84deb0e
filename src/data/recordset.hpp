#pragma once
// The record set: an in-memory table of records with a cursor, as the forms
// and hosts use it. Fields are found by name without regard to case, values
// are converted to the field's type as they are written, and every write
// takes effect at once (there is no pending edit to commit). Each record
// keeps its state (unchanged, new, changed, deleted) and the values it had
// when it was loaded, so a host can store exactly what changed.
//
// Iteration follows the current Sort and Filter. Deleted records are skipped
// by every move; the cursor stays on a deleted record until it is moved.

#include "data/value.hpp"

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

namespace belvane::data {

enum class RecordStatus {
  Unchanged,
  New,      // added since the record set was loaded
  Modified, // a loaded record with changed values
  Deleted,  // a loaded record that was deleted
  Discarded // added and deleted again: nothing to store
};

enum ObjectState { adStateClosed = 0, adStateOpen = 1 };
enum SearchDirection { adSearchBackward = -1, adSearchForward = 1 };
enum BookmarkEnum { adBookmarkCurrent = 0, adBookmarkFirst = 1, adBookmarkLast = 2 };
enum AffectEnum { adAffectCurrent = 1 };

struct FieldDef {
  std::string name;
  DataType type = DataType::Variant;
  long definedSize = 0;
  long attributes = -1;
};

class Recordset;

// The field definitions of a record set. Append works only while the record
// set is closed and has no records.
class FieldCollection {
public:
  explicit FieldCollection(Recordset& owner) : owner_(owner) {}
  void Append(std::string name, DataType type, long definedSize = 0, long attributes = -1);
  size_t Count() const { return defs_.size(); }
  const FieldDef& Item(size_t index) const;
  std::optional<size_t> IndexOf(std::string_view name) const;

private:
  friend class Recordset;
  friend class Field;
  Recordset& owner_;
  std::vector<FieldDef> defs_;
  // Names are found through a small open-addressed table of indexes into
  // defs_, hashed on the name with ASCII letters folded, so a look-up by a
  // literal neither allocates nor folds a copy.
  std::optional<size_t> Lookup(std::string_view folded, bool foldAscii) const;
  std::vector<std::string> upper_; // each field's name in upper case
  std::vector<int32_t> slots_;     // -1: empty
};

// A field of the current record.
class Field {
public:
  const std::string& Name() const;
  DataType Type() const;
  const data::Value& Value() const;
  void SetValue(const data::Value& v);
  Field& operator=(const data::Value& v) {
    SetValue(v);
    return *this;
  }
  // The value the record had when it was loaded (or last accepted).
  data::Value OriginalValue() const;

private:
  friend class Recordset;
  Field(Recordset& rs, size_t index) : rs_(&rs), index_(index) {}
  Recordset* rs_;
  size_t index_;
};

class Recordset {
public:
  Recordset();
  Recordset(const Recordset&) = delete;
  Recordset& operator=(const Recordset&) = delete;

  // --- Fields -------------------------------------------------------------
  FieldCollection& Fields() { return fields_; }
  const FieldCollection& Fields() const { return fields_; }
  // The named field of the current record; error 3265 when there is none.
  Field Fields(std::string_view name);
  Field Fields(size_t index);
  // Read and write a field of the current record by name.
  const data::Value& Collect(std::string_view name) const;
  void Collect(std::string_view name, const data::Value& v);
  bool HasField(std::string_view name) const { return fields_.IndexOf(name).has_value(); }

  // --- State --------------------------------------------------------------
  // Opens an in-memory record set on the appended fields, empty.
  void Open();
  void Close();
  ObjectState State() const { return open_ ? adStateOpen : adStateClosed; }

  // --- Cursor -------------------------------------------------------------
  long RecordCount() const;
  bool Eof() const;
  bool Bof() const;
  void MoveFirst();
  void MoveLast();
  void MoveNext();
  void MovePrevious();

  // --- Changes ------------------------------------------------------------
  // Appends a new empty record (all Null) and makes it current.
  void AddNew();
  // Deletes the current record.
  void Delete(AffectEnum affect = adAffectCurrent);
  // Writes take effect at once; kept for callers that commit explicitly.
  void Update() const;
  RecordStatus Status() const;

  // --- Searching and ordering ---------------------------------------------
  // Moves to the first record from `start` (after skipping `skipRecords`)
  // that meets "FIELD op value"; when none does the cursor ends at EOF
  // (forward) or BOF (backward). A skip count moves the start in the search
  // direction (a negative one against it), held to just before the first or
  // just after the last record however large it is. Equality on an integer
  // field is answered from an index.
  void Find(std::string_view criteria, long skipRecords = 0,
            SearchDirection direction = adSearchForward, BookmarkEnum start = adBookmarkCurrent);
  // "field [ASC|DESC], ..." ; "" restores load order. Stable, Nulls first
  // ascending, texts without regard to case. Moves to the first record.
  void SetSort(std::string_view sortText);
  const std::string& Sort() const { return sort_; }
  // Criteria joined with AND/OR; "" shows every record. Moves to the first.
  void SetFilter(std::string_view criteria);
  const std::string& Filter() const { return filter_; }

  // --- For data sources and hosts -----------------------------------------
  // Appends a loaded record (state Unchanged) without moving the cursor.
  // Values are converted to the field types. Used to fill a record set from
  // a store.
  void AppendLoaded(std::vector<data::Value> values);
  // Room for `count` records in all, so that a store filling the record set
  // does not grow it step by step.
  void ReserveRecords(size_t count);
  // Every record ever held, deleted ones included, in load order.
  size_t StoredCount() const { return records_.size(); }
  RecordStatus StoredStatus(size_t record) const;
  const data::Value& StoredValue(size_t record, size_t field) const;
  data::Value StoredOriginal(size_t record, size_t field) const;
  // Sets a value of a stored record without changing its state (a store
  // writing back the id it assigned).
  void StoredAssign(size_t record, size_t field, const data::Value& v);
  // The stored index of the current record, and back to it: a caller that
  // found a record once returns to it without searching again. MoveToStored
  // returns false, the cursor unchanged, when the record is deleted or not
  // in the current view.
  size_t CurrentStored() const;
  bool MoveToStored(size_t record);
  // Marks the present state as stored: changed and new records become
  // unchanged, deleted ones are dropped. Moves to the first record.
  void AcceptChanges();

private:
  friend class Field;
  friend class FieldCollection;
  struct Record {
    std::vector<data::Value> values;
    std::unique_ptr<std::vector<data::Value>> original; // set on first change
    RecordStatus status = RecordStatus::Unchanged;
    bool Live() const {
      return status != RecordStatus::Deleted && status != RecordStatus::Discarded;
    }
  };

  void RequireOpen() const;
  size_t RequireField(std::string_view name) const;
  Record& Current();
  const Record& Current() const;
  void WriteField(size_t field, const data::Value& v);
  void RebuildView();
  void SkipForward();
  void SkipBackward();
  bool FindWithIndex(size_t field, int32_t key, long from, SearchDirection direction);

  FieldCollection fields_;
  bool open_ = false;
  std::vector<Record> records_;
  std::vector<uint32_t> view_;   // iteration order: indices into records_
  std::vector<int64_t> viewPos_; // records_ index -> position in view_, -1 if absent
  long pos_ = -1;                // -1 BOF; view_.size() EOF
  long liveInView_ = 0;
  std::string sort_, filter_;
  // Lazily built equality indexes on integer fields: value -> records.
  std::unordered_map<size_t, std::unordered_map<int32_t, std::vector<uint32_t>>> index_;
};

using RecordsetPtr = std::shared_ptr<Recordset>;

} // namespace belvane::data
