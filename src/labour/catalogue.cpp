// frmLabour: the schedule lists, the text search over the current list, and
// adding a catalogue or search row to the quote's selected lines.

#include "data/catalogue.hpp"
#include "cipher/field.hpp"
#include "editor/grid_layout.hpp"
#include "forms/keys.hpp"
#include "forms/runtime.hpp"
#include "labour/frm_labour.hpp"
#include "text/number.hpp"
#include "text/strings.hpp"

#include <charconv>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace belvane::labour {

namespace {

using HoursFormatter = text::NumberTexts;

// The number a deciphered hours text holds: written with "." whatever the
// reader's locale. Plain digits with one point are read directly; anything
// else goes through the general reader under that locale.
std::optional<double> StoredNumber(const std::string& plain) {
  const char* first = plain.data();
  const char* last = first + plain.size();
  bool simple = !plain.empty();
  int points = 0;
  for (const char* p = first; p != last && simple; ++p) {
    if (*p == '.')
      simple = ++points <= 1;
    else
      simple = (*p >= '0' && *p <= '9') || (*p == '-' && p == first && p + 1 != last);
  }
  if (simple && plain != "." && plain != "-.") {
    double n = 0;
    if (const auto r = std::from_chars(first, last, n); r.ec == std::errc() && r.ptr == last)
      return n;
  }
  text::ScopedNumberLocale stored({".", ","});
  return text::ParseNumber(plain);
}

// An hours value of the catalogue: a plain number, or an enciphered one
// when its text has 16 characters or more.
// A plain number may be stored as a number or as its text; an enciphered
// one holds the number written with "." whatever the reader's locale.
void AppendCatalogueHours(std::string& row, const data::Value& v, HoursFormatter& format) {
  if (v.IsNull()) return;
  if (v.IsNumber()) {
    row += format(v.ToDouble());
    return;
  }
  const std::string* t = v.TextIf();
  const std::string scratch = t ? std::string() : v.ToText();
  const std::string& stored = t ? *t : scratch;
  if (stored.size() < 16) {
    row += text::Format(stored, text::kHours);
    return;
  }
  const std::string plain = cipher::DecryptField(stored);
  if (const std::optional<double> n = StoredNumber(plain))
    row += format(*n);
  else
    row += plain;
}

// The whole-number value of a mask text ("5", " 7"); 0 when it is none.
// The load writes masks as plain digits, read directly; any other text
// goes through the general number reader.
int MaskOf(std::string_view s) {
  if (!s.empty() && s.size() <= 3 && s.find_first_not_of("0123456789") == std::string_view::npos) {
    int n = 0;
    std::from_chars(s.data(), s.data() + s.size(), n);
    return n;
  }
  auto n = text::ParseNumber(s);
  return n ? static_cast<int>(*n) : 0;
}

void GreyByMask(grid::FlexGrid& g, int row, int mask) {
  if (!(mask & 4)) g.CellBackColorAt(row, 2, grid::kGrey);
  if (!(mask & 2)) g.CellBackColorAt(row, 3, grid::kGrey);
  if (!(mask & 1)) g.CellBackColorAt(row, 4, grid::kGrey);
}

// Without the spaces at either end (as Trim).
std::string_view Trimmed(std::string_view s) {
  const size_t first = s.find_first_not_of(' ');
  if (first == std::string_view::npos) return {};
  return s.substr(first, s.find_last_not_of(' ') - first + 1);
}

} // namespace

void frmLabour::LoadScheduleItems(long scheduleNo, const std::string& firstId,
                                  const std::string& secondId, const std::string& bodyId,
                                  int16_t gridIndex) {
  forms::FlexGrid& g = FGLabourItems(gridIndex);
  if (g.Rows() > 2) return; // filled already in this session

  // The items are read one at a time straight into the grid: a schedule of
  // tens of thousands of items is never held twice.
  editor::RedrawSuspended suspended(g);
  enum Field { kMask, kItem, kScript, kRR, kPT }; // the order the catalogue gives
  HoursFormatter format(text::kHours);
  std::string row;
  int last = 0;
  data::Catalogue()->ForEachLabourItem(
      scheduleNo, firstId, secondId, bodyId, [&](const std::vector<data::Value>& item) {
        const int mask = item[kMask].ToInt32();
        row.clear();
        if (const std::string* t = item[kItem].TextIf())
          row += *t;
        else
          row += item[kItem].ToText();
        row += '\t';
        const data::Value& script = item[kScript];
        row += script.TextIf() ? Trimmed(*script.TextIf())
                               : std::string_view(text::Trim(script.ToText()));
        row += '\t';
        if (mask & 4) AppendCatalogueHours(row, item[kRR], format);
        row += "\t\t";
        if (mask & 1) AppendCatalogueHours(row, item[kPT], format);
        row += '\t';
        char digits[16];
        row.append(digits, std::to_chars(digits, digits + sizeof digits, mask).ptr);
        g.AddItem(row);
        last = g.Rows() - 1;
        GreyByMask(g, last, mask);
        return true;
      });
  if (g.Rows() > 11)
    g.ColWidth(col::kDescription, g.ColWidth(col::kDescription) - editor::kRowStepTwips);
  if (g.Rows() > 2) g.RemoveItem(1);
  // The list opens at its first item, where the keyboard starts.
  if (g.Rows() > 1) g.Row(1);
}

void frmLabour::FindCatalogueItemRow(int gridIndex, long& row) {
  const grid::FlexGrid& src = FGLabourItems(gridIndex);
  const std::string item = src.TextMatrix(src.Row(), col::kItemNo);
  const std::string desc = text::UCase(src.TextMatrix(src.Row(), col::kDescription));
  row = 0;
  for (int r = 1; r < FGSelectedLabour.Rows(); ++r) {
    if (text::UCase(FGSelectedLabour.TextMatrix(r, col::kDescription)) == desc &&
        FGSelectedLabour.TextMatrix(r, col::kItemNo) == item) {
      row = r;
      return;
    }
  }
}

void frmLabour::FindSearchItemRow(long& row) {
  const std::string item = fgSearch.TextMatrix(fgSearch.Row(), col::kItemNo);
  const std::string desc = fgSearch.TextMatrix(fgSearch.Row(), col::kDescription);
  row = 0;
  for (int r = 1; r < FGSelectedLabour.Rows(); ++r) {
    if (FGSelectedLabour.TextMatrix(r, col::kDescription) == desc &&
        FGSelectedLabour.TextMatrix(r, col::kItemNo) == item) {
      row = r;
      return;
    }
  }
}

void frmLabour::AddFromSourceGrid(forms::FlexGrid& source, int c,
                                  const std::function<void(long&)>& findRow) {
  grid::FlexGrid& sel = FGSelectedLabour;
  const int r = source.Row();
  if (IsGrey(source, r, c)) return;
  auto G = [&](int column) { return source.TextMatrix(r, column); };

  long found = 0;
  findRow(found);
  int mask = 0;
  if (found > 0) {
    sel.Row(static_cast<int>(found));
    mask = MaskOf(sel.TextMatrix(static_cast<int>(found), col::kAllow));
  } else {
    mask = MaskOf(G(5));
    const bool whole = c == 0 || c == 1;
    std::string rr, ra, pt, rate = kNoRate;
    if (whole) {
      rr = G(2), ra = G(3), pt = G(4);
      if (mask & 4) rate = kDefaultRate;
    } else if (c >= 2 && c <= 4) {
      if (c == 2) rr = G(2), rate = kDefaultRate;
      if (c == 3) ra = G(3);
      if (c == 4) pt = G(4);
    }
    const std::string fields[] = {G(0), G(1),      rr,        kUnticked, ra,        kUnticked,
                                  pt,   kUnticked, kUnticked, rate,      kUnticked, G(5)};
    std::string rowText;
    for (const std::string& f : fields)
      rowText += f + '\t';
    sel.AddItem(rowText);
    FormatFlagCells(sel.Rows() - 1);
    if (sel.Rows() == 3 && text::Trim(sel.TextMatrix(1, col::kItemNo)).empty()) sel.RemoveItem(1);
    if (sel.Rows() == 12)
      sel.ColWidth(col::kDescription, sel.ColWidth(col::kDescription) - editor::kRowStepTwips);
  }

  const int cur = sel.Row();
  if (!(mask & 4))
    for (int k : {col::kRRHours, col::kRRReport})
      sel.CellBackColorAt(cur, k, grid::kGrey);
  if (!(mask & 2))
    for (int k : {col::kRAHours, col::kRAReport})
      sel.CellBackColorAt(cur, k, grid::kGrey);
  if (!(mask & 1))
    for (int k : {col::kPTHours, col::kPTReport, col::kBlend})
      sel.CellBackColorAt(cur, k, grid::kGrey);

  const bool described = !G(1).empty();
  int target = col::kItemNo;
  switch (c) {
  case 0:
  case 1:
    target = described ? col::kRAHours : col::kDescription;
    break;
  case 2:
    if (sel.TextMatrix(cur, col::kRRHours).empty()) sel.TextMatrix(cur, col::kRRHours, G(2));
    if (sel.TextMatrix(cur, col::kRate) == kNoRate) sel.TextMatrix(cur, col::kRate, kDefaultRate);
    target = described ? col::kRRHours : col::kDescription;
    break;
  case 3:
    if (sel.TextMatrix(cur, col::kRAHours).empty()) sel.TextMatrix(cur, col::kRAHours, G(3));
    target = described ? col::kRAHours : col::kDescription;
    break;
  case 4:
    if (sel.TextMatrix(cur, col::kPTHours).empty()) sel.TextMatrix(cur, col::kPTHours, G(4));
    target = described ? col::kPTHours : col::kDescription;
    break;
  default:
    target = col::kItemNo;
    break;
  }
  sel.Col(target);
  if (IsGrey(sel, sel.Row(), sel.Col())) sel.Col(col::kDescription);
  OpenCellEditor(true);
}

void frmLabour::SearchLabourItems() {
  int k = 0;
  for (int i = 0; i < optSchedule.Count(); ++i) {
    if (optSchedule(i).Value()) {
      k = i;
      break;
    }
  }
  const std::string wanted = text::Trim(txtSearch.Text());
  if (wanted.empty()) return;
  const std::string needle = text::UCase(wanted);

  fgSearch.Visible(false);
  fgSearch.AddItem("\t\t\t\t", 1);
  while (fgSearch.Rows() > 2)
    fgSearch.RemoveItem(fgSearch.Rows() - 1);
  LayoutSearchGrid();

  const grid::FlexGrid& cat = FGLabourItems(k);
  {
    editor::RedrawSuspended suspended(fgSearch);
    int last = 0;
    for (int i = 1; i < cat.Rows(); ++i) {
      if (!text::ContainsNoCase(cat.TextView(i, col::kItemNo), needle) &&
          !text::ContainsNoCase(cat.TextView(i, col::kDescription), needle))
        continue;
      // The item's six cells, greyed as they are in the schedule grid (by
      // the item's mask), then its row there.
      char number[16];
      const char* end = std::to_chars(number, number + sizeof number, i).ptr;
      fgSearch.AddItemFrom(cat, i, 6, std::string_view(number, static_cast<size_t>(end - number)),
                           true);
      last = fgSearch.Rows() - 1;
    }
    // The last result is current, as adding each one made it.
    if (last > 0) fgSearch.Row(last);
  }

  if (fgSearch.Rows() < 3) {
    forms::MsgBox("No labour record found", forms::msgbox::kCritical, "Labour item search");
    return;
  }
  fgSearch.RemoveItem(1);
  fgSearch.Row(1); // the first result, where the keyboard starts
  if (fgSearch.Rows() >= 11)
    fgSearch.ColWidth(col::kDescription,
                      fgSearch.ColWidth(col::kDescription) - editor::kRowStepTwips);
  fgSearch.ZOrder(0);
  fgSearch.Visible(true);
  cmdBrowse.Enabled(true);
  Label1.Caption("Labour Search Result");
}

void frmLabour::FGLabourItems_Click(int index) {
  FGLabourItems(index).ToolTipText(FGLabourItems(index).Text());
}

void frmLabour::FGLabourItems_GotFocus(int /*index*/) { T1.Visible(false); }

void frmLabour::FGLabourItems_DblClick(int index) {
  AddFromSourceGrid(FGLabourItems(index), FGLabourItems(index).Col(),
                    [this, index](long& row) { FindCatalogueItemRow(index, row); });
}

void frmLabour::fgSearch_DblClick() {
  AddFromSourceGrid(fgSearch, fgSearch.Col(), [this](long& row) { FindSearchItemRow(row); });
}

namespace {
bool IsAddKey(int keyCode, int shift) {
  namespace keys = forms::keys;
  return (keyCode == keys::kEnter || keyCode == keys::kInsert) && shift == 0;
}
} // namespace

void frmLabour::FGLabourItems_KeyDown(int index, int& keyCode, int shift) {
  if (!IsAddKey(keyCode, shift) || FGLabourItems(index).Row() < 1) return;
  keyCode = 0;
  AddFromSourceGrid(FGLabourItems(index), col::kDescription,
                    [this, index](long& row) { FindCatalogueItemRow(index, row); });
}

void frmLabour::fgSearch_KeyDown(int& keyCode, int shift) {
  if (!IsAddKey(keyCode, shift) || fgSearch.Row() < 1) return;
  keyCode = 0;
  AddFromSourceGrid(fgSearch, col::kDescription, [this](long& row) { FindSearchItemRow(row); });
}

void frmLabour::txtSearch_KeyPress(int& keyAscii) {
  if (keyAscii == 13) SearchLabourItems();
}

void frmLabour::txtSearch_GotFocus() {
  txtSearch.BackColor(grid::kYellow);
  txtSearch.SelStart(0);
  txtSearch.SelLength(txtSearch.Length());
}

void frmLabour::txtSearch_LostFocus() { txtSearch.BackColor(grid::kCyan); }

void frmLabour::cmdBrowse_Click() {
  cmdBrowse.Enabled(false);
  Label1.Caption("Available Labour Item");
  fgSearch.Visible(false);
}

} // namespace belvane::labour
