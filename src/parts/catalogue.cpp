// frmParts: the available parts (the vehicle's catalogue parts, then the
// general parts items), the text search over them, and adding an available
// part or a search result to the quote's parts.

#include "data/catalogue.hpp"
#include "cipher/field.hpp"
#include "diagram/frm_butterfly.hpp"
#include "editor/grid_layout.hpp"
#include "forms/keys.hpp"
#include "forms/runtime.hpp"
#include "parts/frm_parts.hpp"
#include "text/error.hpp"
#include "text/number.hpp"
#include "text/strings.hpp"

#include <array>
#include <charconv>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace belvane::parts {

namespace {

namespace cat = col::cat;
namespace sel = col::sel;

// The vehicle part fields, in the order the catalogue gives them.
enum VehicleField { kItemNo, kPartName, kScript, kSide, kQty, kUnitcost, kPartNo, kGroup };

// A field's text without a copy where the value is a text already.
std::string_view TextOf(const data::Value& v, std::string& scratch) {
  if (const std::string* t = v.TextIf()) return *t;
  scratch = v.ToText();
  return scratch;
}

// Without the spaces at either end (as Trim).
std::string_view Trimmed(std::string_view s) {
  const size_t first = s.find_first_not_of(' ');
  if (first == std::string_view::npos) return {};
  return s.substr(first, s.find_last_not_of(' ') - first + 1);
}

// The texts of a vehicle part row that are kept enciphered: the part name,
// the part number and the group, deciphered together (side by side, about
// twice as quick as one at a time). A blank one is empty.
struct PartClearTexts {
  std::array<std::string, 3> values;
  std::array<std::string, 3> scratch;
  bool nameBlank = false;

  void Decipher(const data::Value& name, const data::Value& partNo, const data::Value& group) {
    const std::array<std::string_view, 3> stored = {
        name.IsNull() ? std::string_view() : Trimmed(TextOf(name, scratch[0])),
        Trimmed(TextOf(partNo, scratch[1])), Trimmed(TextOf(group, scratch[2]))};
    nameBlank = stored[0].empty();
    cipher::DecryptFields(stored, values);
  }
};

// Fills `row` with the row of a vehicle part: the description deciphered,
// with the side in front of it ("L/H FRONT GUARD") unless the part has no
// side ("O").
void VehiclePartRow(const std::vector<data::Value>& part, text::NumberTexts& costs,
                    PartClearTexts& clear, std::string& row) {
  auto field = [&part](VehicleField i) -> const data::Value& { return part[i]; };
  std::string scratch;
  clear.Decipher(field(kPartName), field(kPartNo), field(kGroup));
  row.clear();
  row += TextOf(field(kItemNo), scratch);
  row += '\t';
  const data::Value& side = field(kSide);
  std::string sideText;
  if (!side.IsNull()) {
    sideText = side.ToText();
    const std::string_view s = Trimmed(sideText);
    if (!(s.size() == 1 && (s[0] == 'O' || s[0] == 'o'))) {
      row += s;
      row += "/H ";
    }
  }
  // A part without a name is described by its script.
  if (clear.nameBlank)
    row += Trimmed(TextOf(field(kScript), scratch));
  else
    row += clear.values[0];
  row += '\t';
  row += sideText;
  row += '\t';
  row += TextOf(field(kQty), scratch);
  row += '\t';
  const data::Value& unitcost = field(kUnitcost);
  row += costs(unitcost.IsNull() ? 0 : unitcost.ToDouble());
  row += '\t';
  row += clear.values[1];
  row += '\t';
  row += clear.values[2];
}

} // namespace

void frmParts::LoadVehicleParts(const std::string& make, const std::string& catNo,
                                const std::string& body) {
  editor::RedrawSuspended suspended(FGParts);
  try {
    auto catalogue = data::Catalogue();
    int16_t state = 0;
    {
      data::RecordsetPtr info = catalogue->OpenRecordset("select * from cinfo", 0, 0);
      state = info->Collect("State").ToInt16();
      if (info->State() == data::adStateOpen) info->Close();
    }
    // The parts are read one at a time straight into the grid: a catalogue
    // of a hundred thousand parts is never held twice.
    std::string row;
    text::NumberTexts costs(text::kHours);
    PartClearTexts clear;
    catalogue->ForEachVehiclePart(make, catNo, body, state,
                                  [&](const std::vector<data::Value>& part) {
                                    VehiclePartRow(part, costs, clear, row);
                                    FGParts.AddItem(row);
                                    return true;
                                  });
  } catch (const Error& e) {
    // The rows added so far stay. A catalogue without the table the parts
    // query reads has no vehicle parts: nothing to say.
    if (e.Number() != err::kNoSuchTable)
      forms::MsgBox(std::to_string(e.Number()) + ": " + e.Description(), forms::msgbox::kCritical);
  }
}

void frmParts::LoadGeneralParts() {
  editor::RedrawSuspended suspended(FGParts);
  data::RecordsetPtr rs =
      data::Catalogue()->OpenRecordset("SELECT * FROM ITEM_2 WHERE CATEGORY = 'PRT'", 0, 0);
  for (; !rs->Eof(); rs->MoveNext()) {
    std::string row = rs->Collect("ItemNo").ToText();
    row += '\t';
    row += text::Trim(rs->Collect("Script").ToText());
    row += '\t';
    row += rs->Collect("SIDE").ToText();
    row += "\t1\t";
    row += text::FormatNumber(0, text::kHours);
    row += "\t\t";
    row += rs->Collect("Group").ToText();
    FGParts.AddItem(row);
  }
  if (rs->State() == data::adStateOpen) rs->Close();
  rs.reset();
  if (FGParts.Rows() > 11)
    FGParts.ColWidth(cat::kDescription,
                     FGParts.ColWidth(cat::kDescription) - editor::kRowStepTwips);
  // The blank row the layout left goes; an empty catalogue keeps it, so the
  // grid always has a row under its header.
  if (FGParts.Rows() > 2) FGParts.RemoveItem(1);
}

int frmParts::FindInSelection(const grid::FlexGrid& source) const {
  const int sr = source.Row();
  const std::string_view item = source.TextView(sr, cat::kItemNo);
  const std::string_view desc = source.TextView(sr, cat::kDescription);
  const std::string_view side = source.TextView(sr, cat::kSide);
  const grid::FlexGrid& g = FGSelectedParts;
  for (int r = 1; r < g.Rows(); ++r) {
    if (g.TextView(r, sel::kItemNo) == item && g.TextView(r, sel::kSide) == side &&
        text::EqualsNoCase(g.TextView(r, sel::kDescription), desc))
      return r;
  }
  return 0;
}

void frmParts::AddPartFrom(forms::FlexGrid& source) {
  if (meMode != eEdit || source.Row() < 1) return;
  grid::FlexGrid& g = FGSelectedParts;
  const int sr = source.Row();
  auto S = [&](int c) { return source.TextMatrix(sr, c); };

  // A part known only by its side gets its description typed in; any other
  // part its unit price.
  const std::string desc = S(cat::kDescription);
  const std::string trimmed = text::Trim(desc);
  const bool described = !desc.empty() && trimmed != "L/H" && trimmed != "R/H";
  const int target = described ? sel::kUnitPrice : sel::kDescription;

  int partRow = FindInSelection(source); // a part is never added twice
  if (!partRow) {
    const double unitPrice = text::ParseNumber(S(cat::kUnitPrice)).value_or(0);
    const std::array<std::string, 9> cells{
        S(cat::kItemNo),
        S(cat::kDescription),
        S(cat::kSide),
        std::string(), // a new part
        S(cat::kQty),
        S(cat::kUnitPrice),
        text::FormatNumber(unitPrice * (1 + mdNewMarkup / 100), text::kPrice),
        S(cat::kPartNo),
        std::string(kUnticked)};
    // The blank starting row of an empty selection takes the part. Only a
    // wholly blank row: a part typed by hand without an item number stays.
    const bool blankStart = g.Rows() == 2 && text::Trim(g.TextMatrix(1, sel::kItemNo)).empty() &&
                            text::Trim(g.TextMatrix(1, sel::kDescription)).empty() &&
                            g.TextMatrix(1, sel::kItemId).empty();
    int newRow = 1;
    if (blankStart) {
      for (size_t c = 0; c < cells.size(); ++c)
        g.TextMatrix(1, static_cast<int>(c), cells[c]);
      g.TextMatrix(1, sel::kRev, "");
    } else {
      std::string row;
      for (size_t c = 0; c < cells.size(); ++c) {
        if (c) row += '\t';
        row += cells[c];
      }
      g.AddItem(row);
      newRow = g.Rows() - 1;
      // The tenth part brings the scroll bar: room for it.
      if (g.Rows() == 11)
        g.ColWidth(sel::kDescription, g.ColWidth(sel::kDescription) - editor::kRowStepTwips);
    }
    g.CellFontNameAt(newRow, sel::kReport, kFlagFont);
    g.CellFontSizeAt(newRow, sel::kReport, kFlagFontSize);
    partRow = newRow;
  }
  // One move, so no cell of the part is left before it was entered.
  g.SetCurrentCell(partRow, target);
  OpenCellEditor(true);
}

void frmParts::ClearSearchResults() {
  fgSearch.Visible(false);
  fgSearch.AddItem("", 1);
  while (fgSearch.Rows() > 2)
    fgSearch.RemoveItem(fgSearch.Rows() - 1);
  LayoutSearchGrid();
}

bool frmParts::ShowSearchResults() {
  if (fgSearch.Rows() <= 2) {
    forms::MsgBox("No part record found", forms::msgbox::kCritical, "Part search");
    return false;
  }
  fgSearch.RemoveItem(1);
  if (fgSearch.Rows() >= 11)
    fgSearch.ColWidth(cat::kDescription,
                      fgSearch.ColWidth(cat::kDescription) - editor::kRowStepTwips);
  fgSearch.ZOrder(0);
  fgSearch.Visible(true);
  Label1.Caption("Parts Search Result");
  cmdSearch(1).Enabled(true);
  return true;
}

void frmParts::SearchParts() {
  const std::string wanted = text::Trim(txtSearch.Text());
  if (wanted.empty()) return;
  const std::string needle = text::UCase(wanted);

  ClearSearchResults();
  {
    editor::RedrawSuspended suspended(fgSearch);
    const grid::FlexGrid& parts = FGParts;
    for (int r = 1; r < parts.Rows(); ++r) {
      if (!text::ContainsNoCase(parts.TextView(r, cat::kItemNo), needle) &&
          !text::ContainsNoCase(parts.TextView(r, cat::kDescription), needle))
        continue;
      // The part's cells up to its part number, then its row in the
      // available parts.
      char number[16];
      const char* end = std::to_chars(number, number + sizeof number, r).ptr;
      fgSearch.AddItemFrom(parts, r, cat::kPartNo + 1,
                           std::string_view(number, static_cast<size_t>(end - number)));
    }
  }
  ShowSearchResults();
}

void frmParts::SearchByDiagramGroup() {
  // The estimator picks a panel on the vehicle diagram; every available
  // part whose group is that panel's group, as a whole text in any case,
  // is listed as the text search lists its results.
  const bool hasDiagram = data::Catalogue()->HasVehicleDiagram(text::Trim(msMake));
  diagram::frmButterfly& picker = diagram::ButterflyForm();
  picker.ShowForm(hasDiagram);
  if (!picker.mbSearchGroup) return; // cancelled or closed: nothing changes
  const std::string group = text::UCase(picker.msSearchStr);

  ClearSearchResults();
  {
    editor::RedrawSuspended suspended(fgSearch);
    const grid::FlexGrid& parts = FGParts;
    std::string row;
    for (int r = 1; r < parts.Rows(); ++r) {
      if (text::UCase(parts.TextView(r, cat::kGroup)) != group) continue;
      row.clear();
      for (int c = cat::kItemNo; c <= cat::kGroup; ++c) {
        if (c) row += '\t';
        row += parts.TextView(r, c);
      }
      fgSearch.AddItem(row);
    }
  }
  ShowSearchResults();
}

void frmParts::FGParts_DblClick() { AddPartFrom(FGParts); }

void frmParts::fgSearch_DblClick() { AddPartFrom(fgSearch); }

void frmParts::CatalogueGrid_KeyDown(forms::FlexGrid& source, int& keyCode, int shift) {
  namespace keys = forms::keys;
  if ((keyCode != keys::kEnter && keyCode != keys::kInsert) || shift != 0) return;
  keyCode = 0;
  AddPartFrom(source);
}

void frmParts::txtSearch_KeyPress(int& keyAscii) {
  if (keyAscii == 13) SearchParts();
}

void frmParts::txtSearch_GotFocus() {
  txtSearch.BackColor(grid::kYellow);
  txtSearch.SelStart(0);
  txtSearch.SelLength(txtSearch.Length());
}

void frmParts::txtSearch_LostFocus() { txtSearch.BackColor(grid::kCyan); }

void frmParts::BrowseAvailableParts() {
  fgSearch.Visible(false);
  Label1.Caption("Available Parts");
  cmdSearch(1).Enabled(false);
}

} // namespace belvane::parts
