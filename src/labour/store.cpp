// frmLabour: the selected grid and the quote item record set. A grid row is
// one labour line; each of its operations (R&R, repair, paint) is a record
// of its own, whose ITEMID the row keeps in columns 13 to 15.

#include "labour/frm_labour.hpp"
#include "text/error.hpp"
#include "text/number.hpp"
#include "text/strings.hpp"

#include <algorithm>
#include <array>
#include <climits>
#include <string>
#include <vector>

namespace belvane::labour {

namespace {

using data::Value;

std::string Hours(const Value& v) {
  return v.IsNull() ? std::string() : text::FormatNumber(v.ToDouble(), text::kHours);
}

// A field read as a whole number, with the value Null stands for.
int IntOr(const Value& v, int whenNull) { return v.IsNull() ? whenNull : v.ToInt32(); }

bool IsTicked(int flag) { return flag == 1; }

// One operation of a line: its category, the grid columns that hold it and
// the record field of its hours.
struct Operation {
  const char* category;
  int hoursCol;
  int idCol;
  int reportCol;
  const char* hoursField;
};
constexpr std::array<Operation, 3> kOperations{{
    {"R&R", col::kRRHours, col::kItemId1, col::kRRReport, "rrhour"},
    {"RA", col::kRAHours, col::kItemId2, col::kRAReport, "rahour"},
    {"PAINT", col::kPTHours, col::kItemId3, col::kPTReport, "pthour"},
}};

const char* kColumnTitles[] = {"Item No", "Description", "R&R",     "Rpt",      "Repair", "Rpt",
                               "Paint",   "Rpt",         "Bld",     "R&R Rate", "M",      "Allow",
                               "Rev",     "ItemID1",     "ItemID2", "ItemID3"};

// One field write of the plan, with the grid column its value comes from
// (-1: from the session) so a refused value can be named.
struct FieldWrite {
  FieldWrite(const char* f, Value v, int c) : field(f), value(std::move(v)), column(c) {}
  const char* field;
  Value value;
  int column;
};

// What the writer does for one operation of one row.
struct PlannedOperation {
  enum class Kind { Write, Delete } kind = Kind::Write;
  int row = 0;
  const Operation* op = nullptr;
  std::string id; // the record's ITEMID as the grid holds it; "" for a new record
  std::vector<FieldWrite> writes;
};

std::string Describe(const grid::FlexGrid& g, int row) {
  std::string itemNo = g.TextMatrix(row, col::kItemNo);
  std::string desc = text::Trim(g.TextMatrix(row, col::kDescription));
  return "Labour item " + (itemNo.empty() ? std::string("(no item number)") : itemNo) +
         (desc.empty() ? std::string() : " \"" + desc + "\"") + " in row " + std::to_string(row);
}

} // namespace

void frmLabour::SaveChanges() {
  if (meMode == eEdit) WriteSelectedItems();
}

void frmLabour::UpdateChanges() {
  if (meMode != eEdit) return;
  FGSelectedLabour.Clear();
  for (int r = FGSelectedLabour.Rows() - 1; r >= 2; --r)
    FGSelectedLabour.RemoveItem(r);
  LayoutSelectedGrid();
  LoadSelectedItems();
}

void frmLabour::FormatFlagCells(long row) {
  grid::FlexGrid& g = FGSelectedLabour;
  g.Row(static_cast<int>(row));
  const int r = static_cast<int>(row);
  for (int c : {col::kRRReport, col::kRAReport, col::kPTReport, col::kBlend, col::kMechanical}) {
    g.CellFontNameAt(r, c, kFlagFont);
    g.CellFontSizeAt(r, c, kFlagFontSize);
  }
  const std::string rate = g.TextMatrix(r, col::kRate);
  if (rate == kNoRate || rate == kDefaultRate) g.CellFontItalicAt(r, col::kRate, true);
}

void frmLabour::AddSelectedRow(const std::string& rowText) {
  FGSelectedLabour.AddItem(rowText);
  FormatFlagCells(FGSelectedLabour.Rows() - 1);
}

void frmLabour::GreyDisallowedCells(std::uint8_t allow) {
  grid::FlexGrid& g = FGSelectedLabour;
  const int r = g.Row();
  auto grey = [&](std::initializer_list<int> cols, int hoursCol) {
    for (int c : cols)
      g.CellBackColorAt(r, c, grid::kGrey);
    g.TextMatrix(r, hoursCol, "");
  };
  if (!(allow & 4)) grey({col::kRRHours, col::kRRReport}, col::kRRHours);
  if (!(allow & 2)) grey({col::kRAHours, col::kRAReport}, col::kRAHours);
  if (!(allow & 1)) grey({col::kPTHours, col::kPTReport, col::kBlend}, col::kPTHours);
}

void frmLabour::LoadSelectedItems() {
  data::Recordset& rs = *mrsLab;
  if (rs.RecordCount() < 1) return;
  rs.MoveFirst();
  std::string prevItem, prevDesc;
  grid::FlexGrid& g = FGSelectedLabour;

  while (!rs.Eof()) {
    const Value& tag = rs.Collect("Tag");
    const Value& deleted = rs.Collect("DELITEM");
    if (tag.IsNull() || deleted.IsNull() || tag.ToText() == "D" || deleted.ToBool()) {
      rs.MoveNext();
      continue;
    }
    const int allow = IntOr(rs.Collect("allow_tick"), 7);
    const int report = IntOr(rs.Collect("report_on"), 0);
    const int blend = IntOr(rs.Collect("blend"), 0);
    const std::string itemNo = rs.Collect("ItemNo").ToText();
    const std::string desc = rs.Collect("Script").ToText();
    const std::string category = rs.Collect("Category").ToText();
    const std::string id = rs.Collect("ITEMID").ToText();
    const std::string flag = IsTicked(report) ? kTicked : kUnticked;

    auto rateText = [&] {
      const Value& rate = rs.Collect("rr_rate2");
      if (!rate.IsNull() && rate.ToDouble() == mdRRRate) return std::string(kDefaultRate);
      return Hours(rate);
    };
    auto mechanical = [&] {
      return text::UCase(rs.Collect("partno").ToText()) == "M" ? std::string(kTicked)
                                                               : std::string(kUnticked);
    };

    const bool continues = itemNo == prevItem && text::EqualsNoCase(desc, prevDesc);
    if (!continues) {
      // A new line; its row text by the category of its first record.
      std::vector<std::string> cells;
      const std::string rr = Hours(rs.Collect("rrhour"));
      const std::string ra = Hours(rs.Collect("rahour"));
      const std::string pt = Hours(rs.Collect("pthour"));
      const std::string allowText = std::to_string(allow);
      const std::string rev = rs.Collect("rev").ToText();
      if (category == "R&R") {
        cells = {itemNo,    desc,      rr,         flag,         ra,        kUnticked, pt,
                 kUnticked, kUnticked, rateText(), mechanical(), allowText, rev,       id};
      } else if (category == "RA") {
        cells = {itemNo,    desc,    rr,        kUnticked, ra,  flag, pt, kUnticked,
                 kUnticked, kNoRate, kUnticked, allowText, rev, "",   id};
      } else if (category == "PAINT") {
        cells = {itemNo,    desc,      rr,
                 kUnticked, ra,        kUnticked,
                 pt,        flag,      IsTicked(blend) ? kTicked : kUnticked,
                 kNoRate,   kUnticked, allowText,
                 rev,       "",        "",
                 id};
      }
      // A line that starts with a record of another category has no row of
      // its own: it is skipped rather than adding the previous line again.
      if (!cells.empty()) {
        std::string rowText;
        for (size_t i = 0; i < cells.size(); ++i) {
          if (i) rowText += '\t';
          rowText += cells[i];
        }
        AddSelectedRow(rowText);
        GreyDisallowedCells(static_cast<std::uint8_t>(allow));
      }
    } else {
      const int r = g.Rows() - 1;
      if (category == "R&R") {
        g.TextMatrix(r, col::kRRHours, Hours(rs.Collect("rrhour")));
        if (IsTicked(report)) g.TextMatrix(r, col::kRRReport, kTicked);
        g.TextMatrix(r, col::kRate, rateText());
        g.TextMatrix(r, col::kMechanical, mechanical());
        g.TextMatrix(r, col::kItemId1, id);
      } else if (category == "RA") {
        g.TextMatrix(r, col::kRAHours, Hours(rs.Collect("rahour")));
        if (IsTicked(report)) g.TextMatrix(r, col::kRAReport, kTicked);
        g.TextMatrix(r, col::kItemId2, id);
      } else if (category == "PAINT") {
        g.TextMatrix(r, col::kPTHours, Hours(rs.Collect("pthour")));
        if (IsTicked(report)) g.TextMatrix(r, col::kPTReport, kTicked);
        if (IsTicked(blend)) g.TextMatrix(r, col::kBlend, kTicked);
        g.TextMatrix(r, col::kItemId3, id);
      }
    }
    prevItem = itemNo;
    prevDesc = desc;
    rs.MoveNext();
  }

  if (g.Rows() > 2) g.RemoveItem(1);
  if (g.Rows() >= 11) g.ColWidth(col::kDescription, g.ColWidth(col::kDescription) - 240);
}

namespace {

// Builds what the writer will do for every row, in the writer's order.
std::vector<PlannedOperation> PlanWrites(const grid::FlexGrid& g, const std::string& quoteNo,
                                         const std::string& subQuoteNo, double rrRate,
                                         double raRate, double ptRate) {
  std::vector<PlannedOperation> plan;
  for (int r = 1; r < g.Rows(); ++r) {
    const std::string itemNo = g.TextMatrix(r, col::kItemNo);
    const std::string desc = g.TextMatrix(r, col::kDescription);
    const bool described = !text::Trim(desc).empty();
    for (const Operation& op : kOperations) {
      const std::string hours = g.TextMatrix(r, op.hoursCol);
      const std::string id = g.TextMatrix(r, op.idCol);
      const auto number = text::ParseNumber(hours);
      if (!(described && number)) {
        if ((!described || text::Trim(hours).empty()) && !id.empty())
          plan.push_back({PlannedOperation::Kind::Delete, r, &op, id, {}});
        continue;
      }
      PlannedOperation p{PlannedOperation::Kind::Write, r, &op, id, {}};
      auto flagValue = [&](int c, std::vector<FieldWrite>& out, const char* field) {
        const std::string f = g.TextMatrix(r, c);
        if (f == kTicked)
          out.emplace_back(field, Value(int16_t{1}), c);
        else if (f == kUnticked)
          out.emplace_back(field, Value(int16_t{0}), c);
      };
      auto& w = p.writes;
      w.emplace_back("DELITEM", Value(false), -1);
      w.emplace_back("qtnno", Value(quoteNo), -1);
      w.emplace_back("subquote", Value(subQuoteNo), -1);
      w.emplace_back("itemno", Value(itemNo), col::kItemNo);
      w.emplace_back("script", Value(desc), col::kDescription);
      w.emplace_back("Category", Value(op.category), -1);
      w.emplace_back(op.hoursField, Value(*number), op.hoursCol);
      flagValue(op.reportCol, w, "report_on");
      if (op.hoursCol == col::kPTHours) flagValue(col::kBlend, w, "blend");
      w.emplace_back("allow_tick", Value(g.TextMatrix(r, col::kAllow)), col::kAllow);
      const std::string rev = g.TextMatrix(r, col::kRev);
      w.emplace_back("Rev", rev.empty() ? Value() : Value(rev), col::kRev);
      w.emplace_back("tag", Value(*number < 0 ? "D" : "1"), op.hoursCol);
      if (op.hoursCol == col::kRRHours) {
        const std::string rate = g.TextMatrix(r, col::kRate);
        w.emplace_back("rr_rate2", rate == kDefaultRate ? Value(rrRate) : Value(rate), col::kRate);
        const std::string m = g.TextMatrix(r, col::kMechanical);
        if (m == kTicked)
          w.emplace_back("partno", Value("M"), col::kMechanical);
        else if (m == kUnticked)
          w.emplace_back("partno", Value(""), col::kMechanical);
      } else {
        w.emplace_back("rr_rate2", Value(op.hoursCol == col::kRAHours ? raRate : ptRate), -1);
      }
      plan.push_back(std::move(p));
    }
  }
  return plan;
}

bool ValidId(const std::string& id) {
  if (id.empty() || id.size() > 10) return false;
  size_t i = id[0] == '-' ? 1 : 0;
  if (i == id.size()) return false;
  for (; i < id.size(); ++i)
    if (id[i] < '0' || id[i] > '9') return false;
  const long long v = std::stoll(id);
  return v >= INT32_MIN && v <= INT32_MAX;
}

bool FindId(data::Recordset& rs, const std::string& id) {
  rs.Find("ITEMID = " + id, 0, data::adSearchForward, data::adBookmarkFirst);
  return !rs.Eof();
}

} // namespace

void frmLabour::CheckSelectedItems() {
  // Every row the writer will touch is checked first, so a row that cannot
  // be written stops the writer before the record set has changed at all.
  data::Recordset& rs = *mrsLab;
  const grid::FlexGrid& g = FGSelectedLabour;
  std::vector<std::string> removed;
  if (mrsDeletedItems && mrsDeletedItems->State() == data::adStateOpen &&
      mrsDeletedItems->RecordCount() > 0) {
    for (mrsDeletedItems->MoveFirst(); !mrsDeletedItems->Eof(); mrsDeletedItems->MoveNext())
      removed.push_back(mrsDeletedItems->Collect("ITEMID").ToText());
  }
  for (const PlannedOperation& p :
       PlanWrites(g, msQuoteNo, msSubQuoteNo, mdRRRate, mdRARate, mdPTRate)) {
    const std::string where = Describe(g, p.row);
    if (!p.id.empty()) {
      if (!ValidId(p.id))
        throw Error(err::kTypeMismatch,
                    where + ", column \"" + kColumnTitles[p.op->idCol] + "\": \"" + p.id +
                        "\" is not a record id",
                    "frmLabour.WriteSelectedItems");
      const bool goneBefore = std::find(removed.begin(), removed.end(), p.id) != removed.end();
      if (p.kind == PlannedOperation::Kind::Write && (goneBefore || !FindId(rs, p.id)))
        throw Error(err::kNoCurrentRecord,
                    where + ", column \"" + kColumnTitles[p.op->idCol] + "\": record " + p.id +
                        " of the " + p.op->category + " operation is no longer in the quote",
                    "frmLabour.WriteSelectedItems");
    }
    for (const FieldWrite& w : p.writes) {
      auto index = rs.Fields().IndexOf(w.field);
      if (!index)
        throw Error(err::kItemNotFound,
                    where + ": the quote's record set has no field \"" + w.field + "\"",
                    "frmLabour.WriteSelectedItems");
      try {
        (void)w.value.ConvertTo(rs.Fields().Item(*index).type);
      } catch (const Error& e) {
        const std::string column =
            w.column >= 0 ? std::string(", column \"") + kColumnTitles[w.column] + "\"" : "";
        throw Error(e.Number(),
                    where + column + ": \"" + w.value.ToText() + "\" cannot be stored in " +
                        w.field + " (" + e.Description() + ")",
                    "frmLabour.WriteSelectedItems");
      }
    }
  }
}

void frmLabour::WriteSelectedItems() {
  data::Recordset& rs = *mrsLab;
  CheckSelectedItems();

  // Pass 1: drop the records added earlier in this session (no ITEMID), so
  // the grid's new operations are not appended twice. Hidden records ("D")
  // and records without a Tag stay.
  if (rs.RecordCount() >= 1) {
    for (rs.MoveFirst(); !rs.Eof(); rs.MoveNext()) {
      const Value& tag = rs.Collect("Tag");
      if (rs.Collect("ITEMID").IsNull() && !tag.IsNull() && tag.ToText() != "D") rs.Delete();
    }
  }

  // Pass 2: the stored records whose lines the estimator deleted.
  if (mrsDeletedItems && mrsDeletedItems->State() == data::adStateOpen &&
      mrsDeletedItems->RecordCount() >= 1) {
    for (mrsDeletedItems->MoveFirst(); !mrsDeletedItems->Eof(); mrsDeletedItems->MoveNext()) {
      if (FindId(rs, mrsDeletedItems->Collect("ITEMID").ToText())) rs.Delete();
    }
  }

  // Pass 3: the grid, one record per present operation.
  for (const PlannedOperation& p :
       PlanWrites(FGSelectedLabour, msQuoteNo, msSubQuoteNo, mdRRRate, mdRARate, mdPTRate)) {
    if (p.kind == PlannedOperation::Kind::Delete) {
      if (FindId(rs, p.id)) rs.Delete();
      continue;
    }
    if (p.id.empty())
      rs.AddNew();
    else
      FindId(rs, p.id);
    for (const FieldWrite& w : p.writes)
      rs.Collect(w.field, w.value);
  }
}

} // namespace belvane::labour
