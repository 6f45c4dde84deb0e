// frmParts: the selected grid and the quote item record set. A grid row is
// one part, one record of category "PRT", whose ITEMID the row keeps in its
// last column. Loading reprices the parts whose stored price was made with
// the markup in force before; writing back is checked whole before any
// record changes.

#include "editor/grid_layout.hpp"
#include "editor/quote_items.hpp"
#include "parts/frm_parts.hpp"
#include "text/error.hpp"
#include "text/number.hpp"
#include "text/strings.hpp"

#include <string>
#include <vector>

namespace belvane::parts {

namespace {

using data::Value;
using editor::FieldWrite;
using editor::PlannedRecord;

const char* const kColumnTitles[] = {"Item No", "Description", "Side", "New?", "Qty",   "U.Price",
                                     "Markup",  "Part No",     "Rpt",  "Rev",  "ItemID"};

std::string Describe(const grid::FlexGrid& g, int row) {
  const std::string itemNo = g.TextMatrix(row, col::sel::kItemNo);
  const std::string desc = text::Trim(g.TextMatrix(row, col::sel::kDescription));
  return "Part " + (itemNo.empty() ? std::string("(no item number)") : itemNo) +
         (desc.empty() ? std::string() : " \"" + desc + "\"") + " in row " + std::to_string(row);
}

// Why a cell's text cannot be stored, and what the estimator can do, in the
// words of the grid rather than of the record set.
std::string RefusedValueAdvice(const FieldWrite& w) {
  const std::string value = "\"" + w.value.ToText() + "\"";
  switch (w.column) {
  case col::sel::kQty:
    return value + " in \"Qty\" is not a quantity. Type the number of parts or clear the cell.";
  case col::sel::kUnitPrice:
    return value + " in \"U.Price\" is not a price. Type the unit price or clear the cell.";
  case col::sel::kMarkup:
    return value + " in \"Markup\" is not a price. Type the price with markup or clear the cell.";
  default:
    break;
  }
  if (w.column >= 0)
    return value + " in \"" + kColumnTitles[w.column] +
           "\" cannot be kept in the quote. Correct the cell or clear it.";
  return "the quote cannot keep its " + std::string(w.field) + " value " + value + ".";
}

// A number cell as written: its text, or 0 when it is empty.
void AddNumberCell(std::vector<FieldWrite>& writes, const char* field, const std::string& cellText,
                   int column) {
  if (text::Trim(cellText).empty())
    writes.emplace_back(field, int16_t{0}, column);
  else
    writes.emplace_back(field, Value(cellText), column);
}

// Builds what the writer will do for every row, in the writer's order.
std::vector<PlannedRecord> PlanWrites(const grid::FlexGrid& g, const std::string& qtnNo,
                                      const std::string& subQuoteNo) {
  namespace sel = col::sel;
  std::vector<PlannedRecord> plan;
  // What every part record gets from the session.
  const std::vector<FieldWrite> sessionWrites{{"DELITEM", Value(false), -1},
                                              {"qtnno", Value(qtnNo), -1},
                                              {"subquote", Value(subQuoteNo), -1},
                                              {"Category", Value("PRT"), -1}};
  for (int r = 1; r < g.Rows(); ++r) {
    auto cell = [&](int c) { return g.TextMatrix(r, c); };
    const std::string id = cell(sel::kItemId);
    if (text::Trim(cell(sel::kDescription)).empty()) {
      // A row without a description is no part: its stored record goes.
      if (!id.empty())
        plan.push_back(
            {PlannedRecord::Kind::Delete, r, id, kColumnTitles[sel::kItemId], "part", {}});
      continue;
    }
    PlannedRecord p{PlannedRecord::Kind::Write, r, id, kColumnTitles[sel::kItemId], "part", {}};
    auto& w = p.writes;
    for (const FieldWrite& session : sessionWrites)
      w.push_back(session);
    w.emplace_back("itemno", Value(cell(sel::kItemNo)), sel::kItemNo);
    w.emplace_back("script", Value(cell(sel::kDescription)), sel::kDescription);
    w.emplace_back("side", Value(cell(sel::kSide)), sel::kSide);
    w.emplace_back("mark", Value(cell(sel::kType)), sel::kType);
    AddNumberCell(w, "qty", cell(sel::kQty), sel::kQty);
    AddNumberCell(w, "unitcost", cell(sel::kUnitPrice), sel::kUnitPrice);
    AddNumberCell(w, "rrhour", cell(sel::kMarkup), sel::kMarkup);
    w.emplace_back("partno", Value(text::Trim(cell(sel::kPartNo))), sel::kPartNo);
    const std::string report = cell(sel::kReport);
    if (report == kTicked)
      w.emplace_back("report_on", int16_t{1}, sel::kReport);
    else if (report == kUnticked)
      w.emplace_back("report_on", int16_t{0}, sel::kReport);
    const std::string rev = cell(sel::kRev);
    w.emplace_back("Rev", rev.empty() ? Value() : Value(rev), sel::kRev);
    w.emplace_back("tag", Value("1"), -1);
    plan.push_back(std::move(p));
  }
  return plan;
}

// A stored price's markup percentage, rounded to two decimals as its text
// "###0.00" reads back.
double StoredMarkup(double unitcost, double price) {
  const double m = (price - unitcost) / unitcost * 100;
  return text::ParseNumber(text::FormatNumber(m, text::kPlain)).value_or(m);
}

} // namespace

PartsTotals frmParts::Totals() const {
  PartsTotals totals;
  const grid::FlexGrid& g = FGSelectedParts;
  for (int r = 1; r < g.Rows(); ++r) {
    if (text::Trim(g.TextView(r, col::sel::kDescription)).empty()) continue;
    if (g.TextView(r, col::sel::kReport) == kTicked) continue;
    const double qty = text::ParseNumber(g.TextView(r, col::sel::kQty)).value_or(0);
    totals.cost += qty * text::ParseNumber(g.TextView(r, col::sel::kUnitPrice)).value_or(0);
    totals.sell += qty * text::ParseNumber(g.TextView(r, col::sel::kMarkup)).value_or(0);
  }
  return totals;
}

std::string frmParts::RunningTotals() const {
  if (!Loaded()) return {};
  const PartsTotals t = Totals();
  auto money = [](double v) { return text::FormatNumber(v, text::kHours); };
  return "Parts at cost " + money(t.cost) + "    With markup " + money(t.sell) + "    Margin " +
         money(t.Margin());
}

void frmParts::SaveChanges() {
  if (meMode == eEdit) WriteSelectedParts();
}

void frmParts::UpdateChanges() {
  if (meMode != eEdit) return;
  FGSelectedParts.Clear();
  for (int r = FGSelectedParts.Rows() - 1; r >= 2; --r)
    FGSelectedParts.RemoveItem(r);
  LayoutSelectedGrid();
  LoadSelectedParts();
}

void frmParts::LoadSelectedParts() {
  namespace sel = col::sel;
  data::Recordset& rs = *mrsParts;
  grid::FlexGrid& g = FGSelectedParts;
  // The markup pair of the previous record stands for a type letter that
  // names no markup.
  double oldRate = 0, newRate = 0;
  {
    editor::RedrawSuspended suspended(g);
    // From the record set's current record on: the host positions it.
    for (; !rs.Eof(); rs.MoveNext()) {
      if (!editor::IsShownItem(rs)) continue;
      const Value& mark = rs.Collect("MARK");
      const std::string type = text::UCase(text::Trim(mark.ToText()));
      if (type.empty()) {
        oldRate = mdOldNewMarkup, newRate = mdNewMarkup;
      } else if (type == "U" || type == "X") {
        oldRate = mdOldUsedMarkup, newRate = mdUsedMarkup;
      } else if (type == "C") {
        oldRate = mdOldRecoreMarkup, newRate = mdRecoreMarkup;
      } else if (type == "A") {
        oldRate = mdOldAfterMarketMarkup, newRate = mdAfterMarketMarkup;
      }

      const Value& unitcost = rs.Collect("unitcost");
      const Value& rrhour = rs.Collect("rrhour");
      std::string price;
      if (!unitcost.IsNull() && unitcost.ToDouble() == 0) {
        price = text::FormatNumber(0, text::kPrice);
      } else if (unitcost.IsNull() || rrhour.IsNull()) {
        // No stored price to go by: the price the part's type gives now.
        const double cost = unitcost.IsNull() ? 0 : unitcost.ToDouble();
        price = text::FormatNumber(cost * (1 + MarkupOf(type) / 100), text::kPrice);
      } else {
        const double cost = unitcost.ToDouble();
        const double stored = rrhour.ToDouble();
        // A price made with the old default markup takes the new one.
        price = StoredMarkup(cost, stored) == oldRate
                    ? text::FormatNumber(cost * (1 + newRate / 100), text::kPrice)
                    : text::FormatNumber(stored, text::kPrice);
      }

      const Value& report = rs.Collect("report_on");
      const bool ticked = !report.IsNull() && report.ToDouble() == 1;
      std::string row = rs.Collect("ItemNo").ToText();
      for (const std::string& cell :
           {rs.Collect("Script").ToText(), rs.Collect("SIDE").ToText(), mark.ToText(),
            rs.Collect("QTY").ToText(),
            unitcost.IsNull() ? std::string()
                              : text::FormatNumber(unitcost.ToDouble(), text::kHours),
            price, text::Trim(rs.Collect("partno").ToText()),
            std::string(ticked ? kTicked : kUnticked), rs.Collect("rev").ToText(),
            rs.Collect("ITEMID").ToText()}) {
        row += '\t';
        row += cell;
      }
      g.AddItem(row);
      const int last = g.Rows() - 1;
      g.CellFontNameAt(last, sel::kReport, kFlagFont);
      g.CellFontSizeAt(last, sel::kReport, kFlagFontSize);
    }

    if (g.Rows() >= 3) g.RemoveItem(1);
    if (g.Rows() >= 11)
      g.ColWidth(sel::kDescription, g.ColWidth(sel::kDescription) - editor::kRowStepTwips);
  }
  g.SetCurrentCell(1, sel::kItemNo);
}

void frmParts::WriteSelectedParts() {
  data::Recordset& rs = *mrsParts;
  const grid::FlexGrid& g = FGSelectedParts;
  const std::vector<PlannedRecord> plan = PlanWrites(g, msQtnNo, msSubQuoteNo);
  const std::vector<std::string> removed = editor::RemovedItemIds(mrsDeletedItems.get());
  // Every row the writer will touch is checked first, so a row that cannot
  // be written stops the writer before the record set has changed at all.
  const editor::WriteBackTargets targets =
      editor::CheckWriteBack(rs, plan, removed,
                             {[&g](int row) { return Describe(g, row); }, RefusedValueAdvice,
                              "frmParts.WriteSelectedParts"});
  editor::DropSessionRecords(rs);             // pass 1: what this session appended before
  editor::ApplyRemovals(rs, removed);         // pass 2: the parts the estimator deleted
  editor::ApplyWriteBack(rs, plan, &targets); // pass 3: one record per part
}

} // namespace belvane::parts
