// frmLabour: the selected grid and the quote item record set. A grid row is
// one labour line; each of its operations (R&R, repair, paint) is a record
// of its own, whose ITEMID the row keeps in columns 13 to 15.

#include "editor/grid_layout.hpp"
#include "editor/quote_items.hpp"
#include "forms/runtime.hpp"
#include "labour/frm_labour.hpp"
#include "text/error.hpp"
#include "text/number.hpp"
#include "text/strings.hpp"

#include <array>
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

using editor::FieldWrite;
using editor::PlannedRecord;

std::string Describe(const grid::FlexGrid& g, int row) {
  std::string itemNo = g.TextMatrix(row, col::kItemNo);
  std::string desc = text::Trim(g.TextMatrix(row, col::kDescription));
  return "Labour item " + (itemNo.empty() ? std::string("(no item number)") : itemNo) +
         (desc.empty() ? std::string() : " \"" + desc + "\"") + " in row " + std::to_string(row);
}

} // namespace

LabourTotals frmLabour::Totals() const {
  LabourTotals totals;
  const grid::FlexGrid& g = FGSelectedLabour;
  for (int r = 1; r < g.Rows(); ++r) {
    if (text::Trim(g.TextView(r, col::kDescription)).empty()) continue;
    for (size_t i = 0; i < kOperations.size(); ++i) {
      const Operation& op = kOperations[i];
      const auto hours = text::ParseNumber(g.TextView(r, op.hoursCol));
      if (!hours) continue;
      double rate = i == 1 ? mdRARate : mdPTRate;
      if (i == 0) {
        const auto own = text::ParseNumber(g.TextView(r, col::kRate));
        rate = own ? *own : mdRRRate; // "<Default>", or no rate typed yet
      }
      totals.hours[i] += *hours;
      if (g.TextView(r, op.reportCol) != kTicked) totals.amounts[i] += *hours * rate;
    }
  }
  return totals;
}

std::string frmLabour::RunningTotals() const {
  if (!Loaded()) return {};
  const LabourTotals t = Totals();
  auto money = [](double v) { return text::FormatNumber(v, text::kHours); };
  const char* names[] = {"R&R", "Repair", "Paint"};
  std::string line;
  for (int i = 0; i < 3; ++i)
    line += std::string(names[i]) + " " + money(t.hours[i]) + " h  " + money(t.amounts[i]) + "    ";
  return line + "Labour " + money(t.Hours()) + " h  " + money(t.Amount());
}

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
  std::vector<std::string> damaged;

  while (!rs.Eof()) {
    if (!editor::IsShownItem(rs)) {
      rs.MoveNext();
      continue;
    }
    const std::string itemNo = rs.Collect("ItemNo").ToText();
    const std::string desc = rs.Collect("Script").ToText();
    // A stored value that does not read as the number it should be (a
    // quote damaged by another program) is taken as empty and named to the
    // estimator, so one damaged line never keeps the quote from opening.
    auto unreadable = [&](const char* what, const Value& v) {
      damaged.push_back("Labour item " +
                        (itemNo.empty() ? std::string("(no item number)") : itemNo) +
                        (desc.empty() ? std::string() : " \"" + desc + "\"") + ": " + what + " \"" +
                        v.ToText() + "\"");
    };
    auto readInt = [&](const char* field, int whenNull, const char* what) {
      const Value& v = rs.Collect(field);
      try {
        return IntOr(v, whenNull);
      } catch (const Error&) {
        unreadable(what, v);
        return whenNull;
      }
    };
    auto readHours = [&](const char* field, const char* what) {
      const Value& v = rs.Collect(field);
      try {
        return Hours(v);
      } catch (const Error&) {
        unreadable(what, v);
        return std::string();
      }
    };
    const int allow = readInt("allow_tick", 7, "allowed operations");
    const int report = readInt("report_on", 0, "report only flag");
    const int blend = readInt("blend", 0, "blend flag");
    const std::string category = rs.Collect("Category").ToText();
    const std::string id = rs.Collect("ITEMID").ToText();
    const std::string flag = IsTicked(report) ? kTicked : kUnticked;

    auto rateText = [&] {
      const Value& rate = rs.Collect("rr_rate2");
      const std::string formatted = readHours("rr_rate2", "R&R rate");
      if (!formatted.empty() && rate.ToDouble() == mdRRRate) return std::string(kDefaultRate);
      return formatted;
    };
    auto mechanical = [&] {
      return text::UCase(rs.Collect("partno").ToText()) == "M" ? std::string(kTicked)
                                                               : std::string(kUnticked);
    };

    const bool continues = itemNo == prevItem && text::EqualsNoCase(desc, prevDesc);
    if (!continues) {
      // A new line; its row text by the category of its first record.
      std::vector<std::string> cells;
      const std::string rr = readHours("rrhour", "R&R hours");
      const std::string ra = readHours("rahour", "repair hours");
      const std::string pt = readHours("pthour", "paint hours");
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
        g.TextMatrix(r, col::kRRHours, readHours("rrhour", "R&R hours"));
        if (IsTicked(report)) g.TextMatrix(r, col::kRRReport, kTicked);
        g.TextMatrix(r, col::kRate, rateText());
        g.TextMatrix(r, col::kMechanical, mechanical());
        g.TextMatrix(r, col::kItemId1, id);
      } else if (category == "RA") {
        g.TextMatrix(r, col::kRAHours, readHours("rahour", "repair hours"));
        if (IsTicked(report)) g.TextMatrix(r, col::kRAReport, kTicked);
        g.TextMatrix(r, col::kItemId2, id);
      } else if (category == "PAINT") {
        g.TextMatrix(r, col::kPTHours, readHours("pthour", "paint hours"));
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
  if (g.Rows() >= 11)
    g.ColWidth(col::kDescription, g.ColWidth(col::kDescription) - editor::kRowStepTwips);

  if (!damaged.empty()) {
    std::string list;
    for (const std::string& d : damaged)
      list += "\r\n" + d;
    forms::MsgBox("Some stored values of this quote's labour lines could not be read and are "
                  "shown empty (an unreadable allow mask as every operation allowed):" +
                      list + "\r\n\r\nCheck these lines; Close stores them as shown.",
                  forms::msgbox::kExclamation, "Labour form");
  }
}

namespace {

// Builds what the writer will do for every row, in the writer's order.
std::vector<PlannedRecord> PlanWrites(const grid::FlexGrid& g, const std::string& quoteNo,
                                      const std::string& subQuoteNo, double rrRate, double raRate,
                                      double ptRate) {
  std::vector<PlannedRecord> plan;
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
          plan.push_back(
              {PlannedRecord::Kind::Delete, r, id, kColumnTitles[op.idCol], op.category, {}});
        continue;
      }
      PlannedRecord p{PlannedRecord::Kind::Write, r, id, kColumnTitles[op.idCol], op.category, {}};
      auto flagValue = [&](int c, std::vector<FieldWrite>& out, const char* field) {
        const std::string f = g.TextMatrix(r, c);
        if (f == kTicked)
          out.emplace_back(field, int16_t{1}, c);
        else if (f == kUnticked)
          out.emplace_back(field, int16_t{0}, c);
      };
      auto& w = p.writes;
      w.emplace_back("DELITEM", false, -1);
      w.emplace_back("qtnno", Value(quoteNo), -1);
      w.emplace_back("subquote", Value(subQuoteNo), -1);
      w.emplace_back("itemno", Value(itemNo), col::kItemNo);
      w.emplace_back("script", Value(desc), col::kDescription);
      w.emplace_back("Category", Value(op.category), -1);
      const double hoursNumber = *number;
      w.emplace_back(op.hoursField, hoursNumber, op.hoursCol);
      flagValue(op.reportCol, w, "report_on");
      if (op.hoursCol == col::kPTHours) flagValue(col::kBlend, w, "blend");
      // An empty "Allow" cell (a line typed by hand) is stored as Null,
      // which reads back as every operation allowed.
      const std::string allow = g.TextMatrix(r, col::kAllow);
      w.emplace_back("allow_tick", text::Trim(allow).empty() ? Value() : Value(allow), col::kAllow);
      const std::string rev = g.TextMatrix(r, col::kRev);
      w.emplace_back("Rev", rev.empty() ? Value() : Value(rev), col::kRev);
      w.emplace_back("tag", Value(hoursNumber < 0 ? "D" : "1"), op.hoursCol);
      if (op.hoursCol == col::kRRHours) {
        const std::string rate = g.TextMatrix(r, col::kRate);
        // "<Default>", or no rate at all on a line typed by hand, is the
        // session's R&R rate.
        const bool sessionRate = rate == kDefaultRate || text::Trim(rate).empty();
        w.emplace_back("rr_rate2", sessionRate ? Value(rrRate) : Value(rate), col::kRate);
        const std::string m = g.TextMatrix(r, col::kMechanical);
        if (m == kTicked)
          w.emplace_back("partno", Value("M"), col::kMechanical);
        else if (m == kUnticked)
          w.emplace_back("partno", Value(""), col::kMechanical);
      } else {
        w.emplace_back("rr_rate2", op.hoursCol == col::kRAHours ? raRate : ptRate, -1);
      }
      plan.push_back(std::move(p));
    }
  }
  return plan;
}

// Why a cell's text cannot be stored, and what the estimator can do, in
// the words of the grid rather than of the record set.
std::string RefusedValueAdvice(const FieldWrite& w) {
  const std::string value = "\"" + w.value.ToText() + "\"";
  switch (w.column) {
  case col::kRate:
    return value + " in \"R&R Rate\" is not a rate. Type a rate or clear the R&R hours.";
  case col::kRRHours:
  case col::kRAHours:
  case col::kPTHours:
    return value + " in \"" + kColumnTitles[w.column] +
           "\" is not a number of hours. Type the hours or clear the cell.";
  case col::kAllow:
    return value + " in \"Allow\" is not a whole number from 0 to 7. Delete the line and add "
                   "it again from the schedule.";
  default:
    break;
  }
  if (w.column >= 0)
    return value + " in \"" + kColumnTitles[w.column] +
           "\" cannot be kept in the quote. Correct the cell or clear it.";
  return "the quote cannot keep its " + std::string(w.field) + " value " + value + ".";
}

} // namespace

void frmLabour::WriteSelectedItems() {
  data::Recordset& rs = *mrsLab;
  const grid::FlexGrid& g = FGSelectedLabour;
  const std::vector<PlannedRecord> plan =
      PlanWrites(g, msQuoteNo, msSubQuoteNo, mdRRRate, mdRARate, mdPTRate);
  const std::vector<std::string> removed = editor::RemovedItemIds(mrsDeletedItems.get());
  // Every row the writer will touch is checked first, so a row that cannot
  // be written stops the writer before the record set has changed at all.
  const editor::WriteBackTargets targets =
      editor::CheckWriteBack(rs, plan, removed,
                             {[&g](int row) { return Describe(g, row); }, RefusedValueAdvice,
                              "frmLabour.WriteSelectedItems"});
  editor::DropSessionRecords(rs);             // pass 1
  editor::ApplyRemovals(rs, removed);         // pass 2
  editor::ApplyWriteBack(rs, plan, &targets); // pass 3: one record per present operation
}

} // namespace belvane::labour
