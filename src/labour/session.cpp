// frmLabour: one session of the editor. How the host's call arrives, the
// design of the window, the order of loading, the choice of schedule, the
// grid layouts, view versus edit mode, closing and unloading.

#include "cipher/field.hpp"
#include "forms/runtime.hpp"
#include "host/frm_status.hpp"
#include "labour/frm_labour.hpp"
#include "text/error.hpp"
#include "text/number.hpp"
#include "text/strings.hpp"

#include <array>
#include <string>

namespace belvane::labour {

namespace {

// The four schedules: option caption and the code kept in msSchedType.
struct Schedule {
  const char* caption;
  const char* code;
};
constexpr std::array<Schedule, 4> kSchedules{{
    {"NRMA", "NRMA"},
    {"MTA", "MTA"},
    {"3RD", "3RD"},
    {"NRMA CP", "CP"},
}};

// Column titles, widths and alignments of a layout. Width -1 marks the
// description column, sized from the others.
struct Column {
  const char* title;
  int width;
  int alignment; // -1: the grid's default
};

constexpr std::array<Column, 6> kCatalogueColumns{{
    {"Item No", 800, grid::kAlignCenterCenter},
    {"Description", -1, grid::kAlignLeftCenter},
    {"R&R", 1300, grid::kAlignRightCenter},
    {"Repair", 1300, grid::kAlignRightCenter},
    {"Paint", 1300, grid::kAlignRightCenter},
    {"Allow", 600, grid::kAlignCenterCenter},
}};

// The search grid: the catalogue's columns and the row's index in it.
constexpr std::array<Column, 7> SearchColumns() {
  std::array<Column, 7> columns{};
  for (size_t c = 0; c < kCatalogueColumns.size(); ++c)
    columns[c] = kCatalogueColumns[c];
  columns[6] = {"Index", 600, grid::kAlignCenterCenter};
  return columns;
}
constexpr std::array<Column, 7> kSearchColumns = SearchColumns();

constexpr std::array<Column, 16> kSelectedColumns{{
    {"Item No", 800, grid::kAlignCenterCenter},
    {"Description", -1, grid::kAlignLeftCenter},
    {"R&R", 900, grid::kAlignRightCenter},
    {"Rpt", 500, grid::kAlignCenterCenter},
    {"Repair", 900, grid::kAlignRightCenter},
    {"Rpt", 500, grid::kAlignCenterCenter},
    {"Paint", 900, grid::kAlignRightCenter},
    {"Rpt", 500, grid::kAlignCenterCenter},
    {"Bld", 500, grid::kAlignCenterCenter},
    {"R&R Rate", 950, grid::kAlignRightCenter},
    {"M", 500, grid::kAlignCenterCenter},
    {"Allow", 600, grid::kAlignCenterCenter},
    {"Rev", 600, grid::kAlignCenterCenter},
    {"ItemID1", 800, -1},
    {"ItemID2", 800, -1},
    {"ItemID3", 800, -1},
}};

// Lays a grid out: column count, alignments and widths, bold titles in row
// 0. The description column takes the grid's width less the columns before
// the trailing ones (those up to the "Allow" column for the catalogue and
// search grids, up to "M" for the selected grid) less 20.
template <size_t N>
void ApplyLayout(grid::FlexGrid& g, const std::array<Column, N>& columns, int lastSizingCol) {
  g.Cols(static_cast<int>(N));
  int others = 0;
  for (int c = 0; c <= lastSizingCol; ++c)
    if (columns[static_cast<size_t>(c)].width > 0) others += columns[static_cast<size_t>(c)].width;
  for (int c = 0; c < static_cast<int>(N); ++c) {
    const Column& col = columns[static_cast<size_t>(c)];
    if (col.alignment >= 0) g.ColAlignment(c, col.alignment);
    g.ColWidth(c, col.width > 0 ? col.width : g.Width() - others - 20);
    g.CellFontBoldAt(0, c, true);
    g.TextMatrix(0, c, col.title);
  }
}

} // namespace

frmLabour& LabourForm() {
  thread_local std::unique_ptr<frmLabour> instance;
  if (!instance) instance = std::make_unique<frmLabour>();
  return *instance;
}

frmLabour::frmLabour() : Form("frmLabour") {
  Label3.Container(&Frame1);
  txtSearch.Container(&Frame1);
  cmdBrowse.Container(&Frame1);

  // Session.
  for (int i = 0; i < 4; ++i)
    optSchedule(i).OnClick = [this, i] { optSchedule_Click(i); };
  cmdClose.OnClick = [this] { cmdClose_Click(); };

  // Catalogue and search.
  for (int i = 0; i < 4; ++i) {
    FGLabourItems(i).OnClick = [this, i] { FGLabourItems_Click(i); };
    FGLabourItems(i).OnGotFocus = [this, i] { FGLabourItems_GotFocus(i); };
    FGLabourItems(i).OnDblClick = [this, i] { FGLabourItems_DblClick(i); };
  }
  fgSearch.OnDblClick = [this] { fgSearch_DblClick(); };
  txtSearch.OnKeyPress = [this](int& keyAscii) { txtSearch_KeyPress(keyAscii); };
  txtSearch.OnGotFocus = [this] { txtSearch_GotFocus(); };
  txtSearch.OnLostFocus = [this] { txtSearch_LostFocus(); };
  cmdBrowse.OnClick = [this] { cmdBrowse_Click(); };

  // Editing of the selected lines.
  FGSelectedLabour.OnGotFocus = [this] { FGSelectedLabour_GotFocus(); };
  FGSelectedLabour.OnLostFocus = [this] { FGSelectedLabour_LostFocus(); };
  FGSelectedLabour.OnDblClick = [this] { FGSelectedLabour_DblClick(); };
  FGSelectedLabour.OnKeyDown = [this](int& keyCode, int shift) {
    FGSelectedLabour_KeyDown(keyCode, shift);
  };
  FGSelectedLabour.OnKeyPress = [this](int& keyAscii) { FGSelectedLabour_KeyPress(keyAscii); };
  FGSelectedLabour.OnEnterCell = [this] { FGSelectedLabour_EnterCell(); };
  FGSelectedLabour.OnLeaveCell = [this] { FGSelectedLabour_LeaveCell(); };
  FGSelectedLabour.OnScroll = [this] { FGSelectedLabour_Scroll(); };
  T1.OnChange = [this] { T1_Change(); };
  T1.OnKeyDown = [this](int& keyCode, int shift) { T1_KeyDown(keyCode, shift); };
  T1.OnKeyPress = [this](int& keyAscii) { T1_KeyPress(keyAscii); };
  cmdDelete.OnClick = [this] { cmdDelete_Click(); };
  cmdClose.OnGotFocus = [this] { HideEditorOnFocus(); };
  cmdDelete.OnGotFocus = [this] { HideEditorOnFocus(); };
  cmdHelp.OnGotFocus = [this] { HideEditorOnFocus(); };
}

void frmLabour::Design() {
  Caption("Labour");
  FontName("Tahoma");
  FontSize(8.25);
  ScaleWidth(10710);
  ScaleHeight(7215);

  // The search frame across the top; its controls sit inside it.
  Frame1.Caption("Labour search");
  Frame1.Move(60, 0, 10590, 615);
  Label3.Caption("Search for: ");
  Label3.Move(120, 270, 900, 255);
  txtSearch.Move(1080, 225, 4215, 300);
  txtSearch.BackColor(grid::kCyan);
  cmdBrowse.Caption("Browse");
  cmdBrowse.Move(5400, 195, 1095, 345);
  cmdBrowse.Enabled(false);

  // The schedule lists and the search results share one area.
  Label1.Caption("Available Labour Items");
  Label1.Move(120, 720, 3495, 255);
  for (int i = 0; i < 4; ++i) {
    FGLabourItems(i).Move(120, 975, 10470, 2925);
    FGLabourItems(i).Visible(false);
  }
  fgSearch.Move(120, 975, 10470, 2925);
  fgSearch.Visible(false);
  lblLoading.Caption("L O A D I N G . . .");
  lblLoading.Move(3255, 2040, 2415, 255);

  const std::array<int, 4> optionLefts{3120, 4200, 5160, 6000};
  const std::array<int, 4> optionWidths{975, 855, 735, 1095};
  for (int i = 0; i < 4; ++i) {
    optSchedule(i).Caption(kSchedules[static_cast<size_t>(i)].caption);
    optSchedule(i).Move(optionLefts[static_cast<size_t>(i)], 3960,
                        optionWidths[static_cast<size_t>(i)], 255);
  }

  Label2.Caption("Selected Labour Items");
  Label2.Move(120, 4005, 2895, 255);
  FGSelectedLabour.Move(120, 4275, 10470, 2235);
  T1.Visible(false);
  T1.Move(0, 0, 900, 240);

  AutoReturn.Caption("Auto Return to Col. 1");
  AutoReturn.Move(120, 6600, 2415, 255);
  CellIndicator.Caption("");
  CellIndicator.Move(2640, 6600, 3495, 255);
  cmdDelete.Caption("Delete");
  cmdDelete.Move(6840, 6630, 1155, 435);
  cmdHelp.Caption("Help");
  cmdHelp.Move(8100, 6630, 1155, 435);
  cmdClose.Caption("Close");
  cmdClose.Move(9360, 6630, 1155, 435);
}

void frmLabour::SetQuoteNo(data::RecordsetPtr& prsLab, std::string& psSchedType,
                           const std::string& psQuoteNo, const std::string& psSubQuoteNo,
                           const std::string& psMake, const std::string& psModelID,
                           const std::string& psBodyID, const std::string& psSchedID,
                           const std::string& psMTAID, const std::string& psThirdID,
                           double pdRRRate, double pdRARate, double pdPTRate, bool pbDefaultSched,
                           bool pbInsurerChanged, EQuoteEditMode peMode) {
  if (!prsLab)
    throw Error(err::kInvalidCall, "The labour editor was given no quote item record set",
                "frmLabour.SetQuoteNo");
  host::frmStatus& status = host::StatusBox();
  status.ShowStatusBox("Opening Labour...");
  // The status box goes when the session ends, also when it ends in an
  // error, so the hourglass never outlives the editor.
  struct StatusGuard {
    host::frmStatus& box;
    ~StatusGuard() {
      if (box.Loaded()) box.Unload();
    }
  } guard{status};

  mrsLab = prsLab;
  msQuoteNo = psQuoteNo;
  msSubQuoteNo = psSubQuoteNo;
  msMake = psMake;
  msModelID = psModelID;
  msBodyID = psBodyID;
  msSchedID = psSchedID;
  msMTAID = psMTAID;
  msThirdID = psThirdID;
  msSchedType = psSchedType;
  mdRRRate = pdRRRate;
  mdRARate = pdRARate;
  mdPTRate = pdPTRate;
  mbDefaultSched = pbDefaultSched;
  mbInsurerChanged = pbInsurerChanged;
  meMode = peMode;

  try {
    Show(forms::ShowStyle::Modal);
  } catch (...) {
    // A session that could not run (a desktop refusing the window, say)
    // leaves no editor loaded behind it for SaveLabourChanges to reach.
    if (Loaded()) {
      try {
        Unload();
      } catch (...) {
      }
    }
    throw;
  }

  status.Unload();
  psSchedType = msSchedType;
}

void frmLabour::Form_Load() {
  try {
    mrsDeletedItems.reset(); // a list of this session's only, in edit mode only
    cipher::InitFieldCipher();
    forms::Screen.MousePointer(forms::kPointerHourglass);
    host::gbLabourFormLoaded = true;

    for (int i = 0; i < FGLabourItems.Count(); ++i)
      LayoutCatalogueGrid(i);
    LayoutSelectedGrid();
    LayoutSearchGrid();

    if (meMode == eEdit) {
      mrsDeletedItems = std::make_unique<data::Recordset>();
      mrsDeletedItems->Fields().Append("ITEMID", data::DataType::Integer, 0, -1);
      mrsDeletedItems->Open();

      int index = mbDefaultSched ? 1 : 0;
      if (!mbInsurerChanged) {
        const std::string code = text::UCase(msSchedType);
        if (code == "NRMA")
          index = 0;
        else if (code == "MTA")
          index = 1;
        else if (code == "3RD")
          index = 2;
        else if (code == "CP")
          index = 3;
      }
      optSchedule(index).Value(true);
    }

    LoadSelectedItems();
    FGSelectedLabour.SetCurrentCell(1, meMode == eEdit ? col::kDescription : col::kItemNo);
    EnableEditControls(meMode != eView);
    forms::Screen.MousePointer(forms::kPointerDefault);
  } catch (const Error& e) {
    const long long relative = static_cast<long long>(e.Number()) + 2147221504LL;
    forms::MsgBox("Error No: " + std::to_string(relative) + "\r\nDescription: " + e.Description() +
                      "\r\nSource: " + e.Source(),
                  forms::msgbox::kCritical, "Labour form");
  } catch (const std::exception& e) {
    forms::MsgBox("Error No: " + std::to_string(2147221504LL + 5) + "\r\nDescription: " + e.what() +
                      "\r\nSource: Belvane",
                  forms::msgbox::kCritical, "Labour form");
  }
}

void frmLabour::LayoutCatalogueGrid(int index) {
  ApplyLayout(FGLabourItems(index), kCatalogueColumns, 4);
}

void frmLabour::LayoutSearchGrid() { ApplyLayout(fgSearch, kSearchColumns, 4); }

void frmLabour::LayoutSelectedGrid() { ApplyLayout(FGSelectedLabour, kSelectedColumns, 10); }

void frmLabour::EnableEditControls(bool enabled) {
  txtSearch.Enabled(enabled);
  for (auto& g : FGLabourItems)
    g.Enabled(enabled);
  T1.Enabled(enabled);
  for (auto& o : optSchedule)
    o.Enabled(enabled);
  cmdDelete.Enabled(enabled);
}

void frmLabour::optSchedule_Click(int index) {
  T1.Visible(false);
  Enabled(false);
  // The form takes input again whatever happens in the load, so a failed
  // catalogue read never leaves the estimator in front of a dead window.
  struct EnableGuard {
    frmLabour& form;
    ~EnableGuard() { form.Enabled(true); }
  } guard{*this};
  for (auto& g : FGLabourItems)
    g.Visible(false);

  if (index >= 0 && index < 4) msSchedType = kSchedules[static_cast<size_t>(index)].code;
  switch (index) {
  case 0:
    LoadScheduleItems(0, msSchedID, msMTAID, msBodyID, 0);
    break;
  case 1:
    LoadScheduleItems(1, msMTAID, msSchedID, msBodyID, 1);
    break;
  case 2:
    LoadScheduleItems(2, msThirdID, "", msBodyID, 2);
    break;
  case 3:
    LoadScheduleItems(3, msSchedID, "", msBodyID, 3);
    break;
  default:
    break;
  }

  Enabled(true);
  if (index >= 0 && index < FGLabourItems.Count()) FGLabourItems(index).Visible(true);
}

void frmLabour::cmdClose_Click() {
  if (meMode == eEdit) WriteSelectedItems();
  Unload();
}

void frmLabour::Form_Unload(int& /*cancel*/) {
  host::gbLabourFormLoaded = false;
  if (meMode == eEdit && mrsDeletedItems && mrsDeletedItems->State() == data::adStateOpen)
    mrsDeletedItems->Close();
  data::RecordsetPtr lab = std::move(mrsLab);
  mrsLab.reset();
  if (lab && lab->State() == data::adStateOpen) lab->SetSort("itemno ASC");
}

bool frmLabour::IsGrey(const grid::FlexGrid& g, int row, int col) {
  return g.CellStyleAt(row, col).backColor == grid::kGrey;
}

std::string frmLabour::DefaultRateText() const {
  return text::FormatNumber(mdRRRate, text::kHours);
}

} // namespace belvane::labour
