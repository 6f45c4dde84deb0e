#include "data/recordset.hpp"

#include "data/criteria.hpp"
#include "text/error.hpp"
#include "text/strings.hpp"

#include <algorithm>
#include <climits>
#include <cmath>
#include <numeric>
#include <optional>

namespace belvane::data {

namespace {

constexpr const char* kSource = "Belvane.Recordset";

[[noreturn]] void NoCurrentRecord() {
  throw Error(err::kNoCurrentRecord,
              "Either BOF or EOF is True, or the current record has been deleted. Requested "
              "operation requires a current record.",
              kSource);
}

std::string FoldName(std::string_view name) { return text::UCase(name); }

bool IsIntegerType(DataType t) { return t == DataType::Integer || t == DataType::SmallInt; }

// Evaluates a parsed filter on one record. `leaf` numbers the comparisons
// in text order; every one is visited so the numbering stays in step. The
// recursion is as deep as the parentheses nest, which the parser bounds.
bool Evaluate(const CriteriaNode& node, const std::vector<Value>& values,
              const std::vector<size_t>& fieldOf, size_t& leaf) {
  if (node.kind == CriteriaNode::Kind::Compare) return Matches(node.cmp, values[fieldOf[leaf++]]);
  const bool isAnd = node.kind == CriteriaNode::Kind::And;
  bool result = isAnd;
  for (const CriteriaNode& child : node.children) {
    const bool r = Evaluate(child, values, fieldOf, leaf);
    result = isAnd ? result && r : result || r;
  }
  return result;
}

void CollectLeaves(const CriteriaNode& node, std::vector<const Comparison*>& out) {
  if (node.kind == CriteriaNode::Kind::Compare) {
    out.push_back(&node.cmp);
    return;
  }
  for (const CriteriaNode& child : node.children)
    CollectLeaves(child, out);
}

// `from` moved `skip` records in the search direction, held within
// [-1, n] so that a huge skip count lands past the end instead of
// overflowing.
long SkipFrom(long from, long skip, SearchDirection direction, long n) {
  long moved = 0;
  const bool overflow = direction == adSearchForward ? __builtin_add_overflow(from, skip, &moved)
                                                     : __builtin_sub_overflow(from, skip, &moved);
  if (overflow) {
    const bool up = (direction == adSearchForward) == (skip > 0);
    return up ? n : -1;
  }
  return std::clamp(moved, -1L, n);
}

struct SortKey {
  size_t field;
  bool descending;
};

} // namespace

// --- FieldCollection ------------------------------------------------------

namespace {

char FoldAscii(char c) { return c >= 'a' && c <= 'z' ? static_cast<char>(c - ('a' - 'A')) : c; }

// A hash of the name with ASCII letters folded, from its length and three
// of its bytes: cheap for the short names record sets have, and the table
// sorts out the few names it does not tell apart.
uint32_t NameHash(std::string_view name) {
  if (name.empty()) return 0;
  auto at = [&name](size_t i) {
    return static_cast<uint32_t>(static_cast<unsigned char>(FoldAscii(name[i])));
  };
  uint32_t h = static_cast<uint32_t>(name.size()) * 0x9E3779B1u;
  h ^= at(0) << 16 ^ at(name.size() - 1) << 8 ^ at(name.size() / 2);
  h *= 0x85EBCA6Bu;
  return h ^ (h >> 15);
}

bool IsAscii(std::string_view s) {
  for (char c : s)
    if (static_cast<unsigned char>(c) >= 0x80) return false;
  return true;
}

} // namespace

void FieldCollection::Append(std::string name, DataType type, long definedSize, long attributes) {
  if (owner_.open_ || !owner_.records_.empty())
    throw Error(3219,
                "Operation is not allowed in this context: fields can be appended only "
                "to a closed, empty record set",
                kSource);
  if (name.empty()) throw Error(err::kBadArguments, "A field needs a name", kSource);
  std::string key = FoldName(name);
  if (IndexOf(key))
    throw Error(err::kBadArguments, "The record set already has a field \"" + name + "\"", kSource);
  upper_.push_back(std::move(key));
  defs_.push_back(FieldDef{std::move(name), type, definedSize, attributes});
  // Keep the table at most half full.
  if (slots_.size() < 2 * defs_.size()) {
    size_t size = 8;
    while (size < 2 * defs_.size())
      size *= 2;
    slots_.assign(size, -1);
    for (size_t i = 0; i + 1 < defs_.size(); ++i) {
      size_t slot = NameHash(upper_[i]) & (size - 1);
      while (slots_[slot] >= 0)
        slot = (slot + 1) & (size - 1);
      slots_[slot] = static_cast<int32_t>(i);
    }
  }
  size_t slot = NameHash(upper_.back()) & (slots_.size() - 1);
  while (slots_[slot] >= 0)
    slot = (slot + 1) & (slots_.size() - 1);
  slots_[slot] = static_cast<int32_t>(defs_.size() - 1);
}

std::optional<size_t> FieldCollection::Lookup(std::string_view name, bool foldAscii) const {
  if (slots_.empty()) return std::nullopt;
  const size_t mask = slots_.size() - 1;
  for (size_t slot = NameHash(name) & mask; slots_[slot] >= 0; slot = (slot + 1) & mask) {
    const auto index = static_cast<size_t>(slots_[slot]);
    const std::string& upper = upper_[index];
    if (upper.size() != name.size()) continue;
    bool same = true;
    for (size_t i = 0; i < name.size() && same; ++i)
      same = (foldAscii ? FoldAscii(name[i]) : name[i]) == upper[i];
    if (same) return index;
  }
  return std::nullopt;
}

const FieldDef& FieldCollection::Item(size_t index) const {
  if (index >= defs_.size())
    throw Error(err::kItemNotFound,
                "Item cannot be found in the collection corresponding to the requested name or "
                "ordinal: field " +
                    std::to_string(index),
                kSource);
  return defs_[index];
}

std::optional<size_t> FieldCollection::IndexOf(std::string_view name) const {
  // Field names are ASCII words as a rule: their letters fold as they are
  // compared. Anything else takes the full case mapping first.
  if (IsAscii(name)) return Lookup(name, true);
  return Lookup(FoldName(name), false);
}

// --- Field ----------------------------------------------------------------

const std::string& Field::Name() const { return rs_->fields_.defs_[index_].name; }
DataType Field::Type() const { return rs_->fields_.defs_[index_].type; }
const Value& Field::Value() const { return rs_->Current().values[index_]; }
void Field::SetValue(const data::Value& v) { rs_->WriteField(index_, v); }

Value Field::OriginalValue() const {
  const auto& rec = rs_->Current();
  if (rec.original) return (*rec.original)[index_];
  if (rec.status == RecordStatus::New) return data::Value();
  return rec.values[index_];
}

// --- Recordset ------------------------------------------------------------

Recordset::Recordset() : fields_(*this) {}

void Recordset::RequireOpen() const {
  if (!open_)
    throw Error(err::kClosed, "Operation is not allowed when the object is closed.", kSource);
}

size_t Recordset::RequireField(std::string_view name) const {
  auto idx = fields_.IndexOf(name);
  if (!idx)
    throw Error(err::kItemNotFound,
                "Item cannot be found in the collection corresponding to the requested name or "
                "ordinal: field \"" +
                    std::string(name) + "\"",
                kSource);
  return *idx;
}

Recordset::Record& Recordset::Current() {
  RequireOpen();
  if (pos_ < 0 || pos_ >= static_cast<long>(view_.size())) NoCurrentRecord();
  Record& rec = records_[view_[static_cast<size_t>(pos_)]];
  if (!rec.Live()) NoCurrentRecord();
  return rec;
}

const Recordset::Record& Recordset::Current() const {
  return const_cast<Recordset*>(this)->Current();
}

Field Recordset::Fields(std::string_view name) {
  RequireOpen();
  return Field(*this, RequireField(name));
}

Field Recordset::Fields(size_t index) {
  RequireOpen();
  fields_.Item(index);
  return Field(*this, index);
}

const Value& Recordset::Collect(std::string_view name) const {
  RequireOpen();
  size_t f = RequireField(name);
  return Current().values[f];
}

void Recordset::Collect(std::string_view name, const Value& v) {
  RequireOpen();
  WriteField(RequireField(name), v);
}

void Recordset::WriteField(size_t field, const Value& v) {
  Record& rec = Current();
  const FieldDef& def = fields_.defs_[field];
  // A value of the field's own type is compared and copied as it is.
  const bool asItIs = v.IsNull() || HoldsType(v, def.type);
  Value converted;
  if (!asItIs) {
    try {
      converted = v.ConvertTo(def.type);
    } catch (const Error& e) {
      throw Error(e.Number(),
                  "Field \"" + def.name + "\" (" + DataTypeName(def.type) + "): " + e.Description(),
                  kSource);
    }
  }
  const Value& wanted = asItIs ? v : converted;
  if (rec.values[field] == wanted) return;
  if (rec.status == RecordStatus::Unchanged) {
    rec.original = std::make_unique<std::vector<Value>>(rec.values);
    rec.status = RecordStatus::Modified;
  }
  if (asItIs)
    rec.values[field] = v;
  else
    rec.values[field] = std::move(converted);
  if (!index_.empty()) index_.erase(field);
}

void Recordset::Open() {
  if (open_)
    throw Error(err::kOpenAlready, "Operation is not allowed when the object is open.", kSource);
  open_ = true;
  records_.clear();
  index_.clear();
  sort_.clear();
  filter_.clear();
  RebuildView();
}

void Recordset::Close() {
  RequireOpen();
  open_ = false;
  records_.clear();
  view_.clear();
  viewPos_.clear();
  index_.clear();
  pos_ = -1;
  liveInView_ = 0;
}

long Recordset::RecordCount() const {
  RequireOpen();
  return liveInView_;
}

bool Recordset::Eof() const {
  RequireOpen();
  return pos_ >= static_cast<long>(view_.size()) || liveInView_ == 0;
}

bool Recordset::Bof() const {
  RequireOpen();
  return pos_ < 0 || liveInView_ == 0;
}

void Recordset::SkipForward() {
  while (pos_ < static_cast<long>(view_.size()) &&
         !records_[view_[static_cast<size_t>(pos_)]].Live())
    ++pos_;
}

void Recordset::SkipBackward() {
  while (pos_ >= 0 && !records_[view_[static_cast<size_t>(pos_)]].Live())
    --pos_;
}

void Recordset::MoveFirst() {
  RequireOpen();
  pos_ = 0;
  SkipForward();
}

void Recordset::MoveLast() {
  RequireOpen();
  pos_ = static_cast<long>(view_.size()) - 1;
  SkipBackward();
  if (pos_ < 0 && !view_.empty()) pos_ = static_cast<long>(view_.size());
}

void Recordset::MoveNext() {
  RequireOpen();
  if (Eof()) NoCurrentRecord();
  ++pos_;
  SkipForward();
}

void Recordset::MovePrevious() {
  RequireOpen();
  if (Bof()) NoCurrentRecord();
  --pos_;
  SkipBackward();
}

void Recordset::AddNew() {
  RequireOpen();
  Record rec;
  rec.values.resize(fields_.Count());
  rec.status = RecordStatus::New;
  records_.push_back(std::move(rec));
  viewPos_.push_back(static_cast<int64_t>(view_.size()));
  view_.push_back(static_cast<uint32_t>(records_.size() - 1));
  ++liveInView_;
  pos_ = static_cast<long>(view_.size()) - 1;
}

void Recordset::AppendLoaded(std::vector<Value> values) {
  RequireOpen();
  if (values.size() != fields_.Count())
    throw Error(err::kBadArguments,
                "A loaded record has " + std::to_string(values.size()) + " values for " +
                    std::to_string(fields_.Count()) + " fields",
                kSource);
  for (size_t i = 0; i < values.size(); ++i) {
    // A value of the field's own type (what a store reads, nearly always)
    // is kept as it is: no copy of its text.
    const DataType type = fields_.defs_[i].type;
    if (type != DataType::Variant && !values[i].IsNull() && !HoldsType(values[i], type))
      values[i] = values[i].ConvertTo(type);
  }
  Record rec;
  rec.values = std::move(values);
  records_.push_back(std::move(rec));
  viewPos_.push_back(static_cast<int64_t>(view_.size()));
  view_.push_back(static_cast<uint32_t>(records_.size() - 1));
  ++liveInView_;
  if (!index_.empty()) index_.clear();
  if (pos_ >= static_cast<long>(view_.size()) - 1 && liveInView_ == 1) pos_ = 0;
}

void Recordset::ReserveRecords(size_t count) {
  records_.reserve(count);
  view_.reserve(count);
  viewPos_.reserve(count);
}

void Recordset::Delete(AffectEnum affect) {
  if (affect != adAffectCurrent)
    throw Error(err::kBadArguments, "Only the current record can be deleted", kSource);
  Record& rec = Current();
  rec.status = rec.status == RecordStatus::New ? RecordStatus::Discarded : RecordStatus::Deleted;
  --liveInView_;
}

void Recordset::Update() const { RequireOpen(); }

RecordStatus Recordset::Status() const { return Current().status; }

void Recordset::Find(std::string_view criteria, long skipRecords, SearchDirection direction,
                     BookmarkEnum start) {
  RequireOpen();
  Comparison cmp = ParseComparison(criteria);
  size_t field = RequireField(cmp.field);
  long from = 0;
  const long n = static_cast<long>(view_.size());
  switch (start) {
  case adBookmarkFirst:
    from = 0;
    break;
  case adBookmarkLast:
    from = n - 1;
    break;
  case adBookmarkCurrent:
    if (pos_ < 0 || pos_ >= n) NoCurrentRecord();
    from = pos_;
    break;
  }
  from = SkipFrom(from, skipRecords, direction, n);

  if (cmp.op == CompareOp::Eq && IsIntegerType(fields_.defs_[field].type) && cmp.value.IsNumber()) {
    const double key = cmp.value.ToDouble();
    // A key beyond 32 bits or with a fraction matches no integer: the scan
    // below finds nothing, as it should.
    if (key >= INT32_MIN && key <= INT32_MAX && key == std::trunc(key)) {
      if (!FindWithIndex(field, static_cast<int32_t>(key), from, direction))
        pos_ = direction == adSearchForward ? n : -1;
      return;
    }
  }
  if (direction == adSearchForward) {
    for (long i = std::max(from, 0L); i < n; ++i) {
      const Record& rec = records_[view_[static_cast<size_t>(i)]];
      if (rec.Live() && Matches(cmp, rec.values[field])) {
        pos_ = i;
        return;
      }
    }
    pos_ = n;
  } else {
    for (long i = std::min(from, n - 1); i >= 0; --i) {
      const Record& rec = records_[view_[static_cast<size_t>(i)]];
      if (rec.Live() && Matches(cmp, rec.values[field])) {
        pos_ = i;
        return;
      }
    }
    pos_ = -1;
  }
}

bool Recordset::FindWithIndex(size_t field, int32_t key, long from, SearchDirection direction) {
  auto it = index_.find(field);
  if (it == index_.end()) {
    auto& idx = index_[field];
    for (size_t r = 0; r < records_.size(); ++r) {
      const Value& v = records_[r].values[field];
      if (!v.IsNull()) idx[v.ToInt32()].push_back(static_cast<uint32_t>(r));
    }
    it = index_.find(field);
  }
  auto hit = it->second.find(key);
  if (hit == it->second.end()) return false;
  long best = -1;
  for (uint32_t r : hit->second) {
    if (!records_[r].Live()) continue;
    long vp = static_cast<long>(viewPos_[r]);
    if (vp < 0) continue;
    if (direction == adSearchForward) {
      if (vp >= from && (best < 0 || vp < best)) best = vp;
    } else {
      if (vp <= from && vp > best) best = vp;
    }
  }
  if (best < 0) return false;
  pos_ = best;
  return true;
}

void Recordset::SetSort(std::string_view sortText) {
  RequireOpen();
  // Validate before changing anything.
  std::vector<SortKey> keys;
  std::string_view rest = sortText;
  while (!rest.empty()) {
    size_t comma = rest.find(',');
    std::string part = text::Trim(rest.substr(0, comma));
    rest = comma == std::string_view::npos ? std::string_view() : rest.substr(comma + 1);
    if (part.empty()) {
      if (comma == std::string_view::npos && keys.empty()) break;
      throw Error(err::kBadArguments, "Malformed sort \"" + std::string(sortText) + "\"", kSource);
    }
    bool desc = false;
    size_t sp = part.find_last_of(' ');
    if (sp != std::string::npos) {
      std::string dir = text::UCase(text::Trim(part.substr(sp + 1)));
      if (dir == "DESC" || dir == "ASC") {
        desc = dir == "DESC";
        part = text::Trim(part.substr(0, sp));
      } else {
        throw Error(err::kBadArguments,
                    "Malformed sort \"" + std::string(sortText) + "\": expected ASC or DESC",
                    kSource);
      }
    }
    if (part.size() > 2 && part.front() == '[' && part.back() == ']')
      part = part.substr(1, part.size() - 2);
    keys.push_back(SortKey{RequireField(part), desc});
  }
  sort_ = std::string(sortText);
  RebuildView();
}

void Recordset::SetFilter(std::string_view criteria) {
  RequireOpen();
  if (!text::Trim(criteria).empty() && text::Trim(criteria) != "0") {
    const CriteriaNode tree = ParseCriteria(criteria);
    std::vector<const Comparison*> leaves;
    CollectLeaves(tree, leaves);
    for (auto* c : leaves)
      RequireField(c->field);
    filter_ = std::string(criteria);
  } else {
    filter_.clear();
  }
  RebuildView();
}

void Recordset::RebuildView() {
  view_.clear();
  std::optional<CriteriaNode> tree;
  std::vector<size_t> fieldOf;
  if (!filter_.empty()) {
    tree = ParseCriteria(filter_);
    std::vector<const Comparison*> leaves;
    CollectLeaves(*tree, leaves);
    for (auto* c : leaves)
      fieldOf.push_back(RequireField(c->field));
  }
  for (size_t r = 0; r < records_.size(); ++r) {
    if (!records_[r].Live()) continue;
    if (tree) {
      size_t leaf = 0;
      if (!Evaluate(*tree, records_[r].values, fieldOf, leaf)) continue;
    }
    view_.push_back(static_cast<uint32_t>(r));
  }
  if (!sort_.empty()) {
    std::vector<SortKey> keys;
    std::string_view rest = sort_;
    while (!rest.empty()) {
      size_t comma = rest.find(',');
      std::string part = text::Trim(rest.substr(0, comma));
      rest = comma == std::string_view::npos ? std::string_view() : rest.substr(comma + 1);
      if (part.empty()) continue;
      bool desc = false;
      size_t sp = part.find_last_of(' ');
      if (sp != std::string::npos) {
        desc = text::UCase(text::Trim(part.substr(sp + 1))) == "DESC";
        part = text::Trim(part.substr(0, sp));
      }
      if (part.size() > 2 && part.front() == '[' && part.back() == ']')
        part = part.substr(1, part.size() - 2);
      keys.push_back(SortKey{RequireField(part), desc});
    }
    // Texts are folded once, not on every comparison.
    std::vector<std::vector<Value>> folded(keys.size());
    for (size_t k = 0; k < keys.size(); ++k) {
      folded[k].resize(records_.size());
      for (uint32_t r : view_) {
        const Value& v = records_[r].values[keys[k].field];
        folded[k][r] = v.TextIf() ? Value(text::UCase(*v.TextIf())) : v;
      }
    }
    std::stable_sort(view_.begin(), view_.end(), [&](uint32_t a, uint32_t b) {
      for (size_t k = 0; k < keys.size(); ++k) {
        auto c = CompareValues(folded[k][a], folded[k][b]);
        if (c != 0) return keys[k].descending ? c > 0 : c < 0;
      }
      return false;
    });
  }
  viewPos_.assign(records_.size(), -1);
  for (size_t i = 0; i < view_.size(); ++i)
    viewPos_[view_[i]] = static_cast<int64_t>(i);
  liveInView_ = static_cast<long>(view_.size());
  pos_ = view_.empty() ? -1 : 0;
  if (view_.empty()) pos_ = 0; // BOF and EOF both true on an empty record set
}

RecordStatus Recordset::StoredStatus(size_t record) const {
  if (record >= records_.size()) throw Error(err::kSubscript, "Subscript out of range", kSource);
  return records_[record].status;
}

const Value& Recordset::StoredValue(size_t record, size_t field) const {
  if (record >= records_.size() || field >= fields_.Count())
    throw Error(err::kSubscript, "Subscript out of range", kSource);
  return records_[record].values[field];
}

Value Recordset::StoredOriginal(size_t record, size_t field) const {
  if (record >= records_.size() || field >= fields_.Count())
    throw Error(err::kSubscript, "Subscript out of range", kSource);
  const Record& rec = records_[record];
  if (rec.original) return (*rec.original)[field];
  if (rec.status == RecordStatus::New || rec.status == RecordStatus::Discarded) return Value();
  return rec.values[field];
}

void Recordset::StoredAssign(size_t record, size_t field, const Value& v) {
  if (record >= records_.size() || field >= fields_.Count())
    throw Error(err::kSubscript, "Subscript out of range", kSource);
  records_[record].values[field] = v.ConvertTo(fields_.defs_[field].type);
  index_.erase(field);
}

size_t Recordset::CurrentStored() const {
  Current();
  return view_[static_cast<size_t>(pos_)];
}

bool Recordset::MoveToStored(size_t record) {
  RequireOpen();
  if (record >= records_.size() || !records_[record].Live() || viewPos_[record] < 0) return false;
  pos_ = static_cast<long>(viewPos_[record]);
  return true;
}

void Recordset::AcceptChanges() {
  RequireOpen();
  std::vector<Record> kept;
  kept.reserve(records_.size());
  for (auto& rec : records_) {
    if (!rec.Live()) continue;
    rec.status = RecordStatus::Unchanged;
    rec.original.reset();
    kept.push_back(std::move(rec));
  }
  records_ = std::move(kept);
  index_.clear();
  RebuildView();
}

} // namespace belvane::data
