#include "editor/quote_items.hpp"

#include "text/error.hpp"

#include <algorithm>
#include <climits>

namespace belvane::editor {

bool IsShownItem(data::Recordset& items) {
  const data::Value& tag = items.Collect("Tag");
  const data::Value& deleted = items.Collect("DELITEM");
  return !tag.IsNull() && !deleted.IsNull() && tag.ToText() != "D" && !deleted.ToBool();
}

std::unique_ptr<data::Recordset> NewRemovedItemsList() {
  auto list = std::make_unique<data::Recordset>();
  list->Fields().Append("ITEMID", data::DataType::Integer, 0, -1);
  list->Open();
  return list;
}

void AddRemovedItem(data::Recordset& removed, const std::string& id) {
  // Converted before the record is added, so a bad id adds nothing.
  const data::Value value = data::Value(id).ConvertTo(data::DataType::Integer);
  removed.AddNew();
  removed.Collect("ITEMID", value);
}

std::vector<std::string> RemovedItemIds(const data::Recordset* removed) {
  std::vector<std::string> ids;
  if (!removed || removed->State() != data::adStateOpen || removed->RecordCount() < 1) return ids;
  auto& list = const_cast<data::Recordset&>(*removed);
  for (list.MoveFirst(); !list.Eof(); list.MoveNext())
    ids.push_back(list.Collect("ITEMID").ToText());
  return ids;
}

bool IsItemId(const std::string& id) {
  if (id.empty() || id.size() > 11) return false;
  size_t i = id[0] == '-' ? 1 : 0;
  if (i == id.size()) return false;
  for (; i < id.size(); ++i)
    if (id[i] < '0' || id[i] > '9') return false;
  const long long v = std::stoll(id);
  return v >= INT32_MIN && v <= INT32_MAX;
}

bool FindItemId(data::Recordset& items, const std::string& id) {
  items.Find("ITEMID = " + id, 0, data::adSearchForward, data::adBookmarkFirst);
  return !items.Eof();
}

WriteBackTargets CheckWriteBack(data::Recordset& items, const std::vector<PlannedRecord>& plan,
                                const std::vector<std::string>& removedIds,
                                const WriteBackWords& words) {
  WriteBackTargets targets(plan.size());
  // A record set's field index and type for each field name met, found
  // once per write-back rather than once per write.
  std::vector<std::pair<const char*, std::optional<size_t>>> fieldsSeen;
  auto fieldIndex = [&](const char* field) {
    for (const auto& [name, index] : fieldsSeen)
      if (name == field) return index;
    fieldsSeen.emplace_back(field, items.Fields().IndexOf(field));
    return fieldsSeen.back().second;
  };
  for (size_t i = 0; i < plan.size(); ++i) {
    const PlannedRecord& p = plan[i];
    // The row is described only for a message.
    auto where = [&] { return words.describeRow(p.row); };
    if (!p.id.empty()) {
      auto cell = [&] { return where() + ", column \"" + p.idTitle + "\""; };
      if (!IsItemId(p.id))
        throw Error(err::kTypeMismatch,
                    cell() + ": \"" + p.id +
                        "\" is not the number of a stored record. Nothing was saved; delete "
                        "the line and add it again.",
                    words.source);
      if (p.kind == PlannedRecord::Kind::Write) {
        const bool removedBefore =
            std::find(removedIds.begin(), removedIds.end(), p.id) != removedIds.end();
        if (removedBefore || !FindItemId(items, p.id))
          throw Error(err::kNoCurrentRecord,
                      cell() + ": its stored " + p.what + " record (" + p.id +
                          ") is no longer in the quote. Nothing was saved; delete the line and "
                          "add it again.",
                      words.source);
        targets[i] = items.CurrentStored();
      }
    }
    for (const FieldWrite& w : p.writes) {
      const std::optional<size_t> index = fieldIndex(w.field);
      if (!index)
        throw Error(err::kItemNotFound,
                    where() + ": the quote has nowhere to keep the line's " + w.field +
                        " (its record set has no such field). Nothing was saved; the quoting "
                        "program must be corrected.",
                    words.source);
      try {
        // Only a value of another type can be refused.
        const data::DataType type = items.Fields().Item(*index).type;
        if (!w.value.IsNull() && !data::HoldsType(w.value, type)) (void)w.value.ConvertTo(type);
      } catch (const Error& e) {
        throw Error(e.Number(), where() + ": " + words.refusedValue(w) + " Nothing was saved.",
                    words.source);
      }
    }
  }
  return targets;
}

void DropSessionRecords(data::Recordset& items) {
  if (items.RecordCount() < 1) return;
  for (items.MoveFirst(); !items.Eof(); items.MoveNext()) {
    const data::Value& tag = items.Collect("Tag");
    if (items.Collect("ITEMID").IsNull() && !tag.IsNull() && tag.ToText() != "D") items.Delete();
  }
}

void ApplyRemovals(data::Recordset& items, const std::vector<std::string>& removedIds) {
  for (const std::string& id : removedIds)
    if (FindItemId(items, id)) items.Delete();
}

void ApplyWriteBack(data::Recordset& items, const std::vector<PlannedRecord>& plan,
                    const WriteBackTargets* targets) {
  // Each field name's index, found once per write-back.
  std::vector<std::pair<const char*, size_t>> fieldsSeen;
  auto field = [&](const char* name) {
    for (const auto& [seen, index] : fieldsSeen)
      if (seen == name) return items.Fields(index);
    const data::Field f = items.Fields(name);
    fieldsSeen.emplace_back(name, *items.Fields().IndexOf(name));
    return f;
  };
  for (size_t i = 0; i < plan.size(); ++i) {
    const PlannedRecord& p = plan[i];
    if (p.kind == PlannedRecord::Kind::Delete) {
      if (FindItemId(items, p.id)) items.Delete();
      continue;
    }
    if (p.id.empty())
      items.AddNew();
    else if (!(targets && i < targets->size() && (*targets)[i] &&
               items.MoveToStored(*(*targets)[i])))
      FindItemId(items, p.id);
    for (const FieldWrite& w : p.writes)
      field(w.field).SetValue(w.value);
  }
}

} // namespace belvane::editor
