// frmLabour: one session of the editor. How the host's call arrives, the
// design of the window, the order of loading, the choice of schedule, the
// grid layouts, view versus edit mode, closing and unloading.

#include "cipher/field.hpp"
#include "editor/cell_editor.hpp"
#include "editor/grid_layout.hpp"
#include "editor/keys_help.hpp"
#include "editor/modal_session.hpp"
#include "editor/quote_items.hpp"
#include "forms/keys.hpp"
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

using editor::GridColumn;
constexpr bool kBeyond = false; // a column laid beyond the description's fill

constexpr std::array<GridColumn, 6> kCatalogueColumns{{
    {"Item No", 800, grid::kAlignCenterCenter},
    {"Description", GridColumn::kFill, grid::kAlignLeftCenter},
    {"R&R", 1300, grid::kAlignRightCenter},
    {"Repair", 1300, grid::kAlignRightCenter},
    {"Paint", 1300, grid::kAlignRightCenter},
    {"Allow", 600, grid::kAlignCenterCenter, kBeyond},
}};

constexpr std::array<GridColumn, 7> kSearchColumns{{
    {"Item No", 800, grid::kAlignCenterCenter},
    {"Description", GridColumn::kFill, grid::kAlignLeftCenter},
    {"R&R", 1300, grid::kAlignRightCenter},
    {"Repair", 1300, grid::kAlignRightCenter},
    {"Paint", 1300, grid::kAlignRightCenter},
    {"Allow", 600, grid::kAlignCenterCenter, kBeyond},
    {"Index", 600, grid::kAlignCenterCenter, kBeyond},
}};

constexpr std::array<GridColumn, 16> kSelectedColumns{{
    {"Item No", 800, grid::kAlignCenterCenter},
    {"Description", GridColumn::kFill, grid::kAlignLeftCenter},
    {"R&R", 900, grid::kAlignRightCenter},
    {"Rpt", 500, grid::kAlignCenterCenter},
    {"Repair", 900, grid::kAlignRightCenter},
    {"Rpt", 500, grid::kAlignCenterCenter},
    {"Paint", 900, grid::kAlignRightCenter},
    {"Rpt", 500, grid::kAlignCenterCenter},
    {"Bld", 500, grid::kAlignCenterCenter},
    {"R&R Rate", 950, grid::kAlignRightCenter},
    {"M", 500, grid::kAlignCenterCenter},
    {"Allow", 600, grid::kAlignCenterCenter, kBeyond},
    {"Rev", 600, grid::kAlignCenterCenter, kBeyond},
    {"ItemID1", 800, GridColumn::kDefaultAlignment, kBeyond},
    {"ItemID2", 800, GridColumn::kDefaultAlignment, kBeyond},
    {"ItemID3", 800, GridColumn::kDefaultAlignment, kBeyond},
}};

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

  // The window: sizable, F1 from anywhere, and the access keys (Alt and
  // the letter) of its buttons, options and the labels of its lists.
  Sizable(true);
  KeyPreview(true);
  Label3.AccessKey('S');
  cmdBrowse.AccessKey('B');
  Label1.AccessKey('A');
  const std::array<char32_t, 4> optionKeys{'N', 'M', '3', 'P'};
  for (int i = 0; i < 4; ++i)
    optSchedule(i).AccessKey(optionKeys[static_cast<size_t>(i)]);
  Label2.AccessKey('E');
  AutoReturn.AccessKey('R');
  cmdDelete.AccessKey('D');
  cmdHelp.AccessKey('H');
  cmdClose.AccessKey('C');

  // Session.
  for (int i = 0; i < 4; ++i)
    optSchedule(i).OnClick = [this, i] { optSchedule_Click(i); };
  cmdClose.OnClick = [this] { cmdClose_Click(); };
  cmdHelp.OnClick = [this] { cmdHelp_Click(); };

  // Catalogue and search.
  for (int i = 0; i < 4; ++i) {
    FGLabourItems(i).OnClick = [this, i] { FGLabourItems_Click(i); };
    FGLabourItems(i).OnGotFocus = [this, i] { FGLabourItems_GotFocus(i); };
    FGLabourItems(i).OnDblClick = [this, i] { FGLabourItems_DblClick(i); };
    FGLabourItems(i).OnKeyDown = [this, i](int& keyCode, int shift) {
      FGLabourItems_KeyDown(i, keyCode, shift);
    };
  }
  fgSearch.OnDblClick = [this] { fgSearch_DblClick(); };
  fgSearch.OnKeyDown = [this](int& keyCode, int shift) { fgSearch_KeyDown(keyCode, shift); };
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
  // A call made while the editor is open (a host re-entering from the
  // editor's own session) is refused before it touches the open session.
  editor::RefuseWhileLoaded(*this, host::gbLabourFormLoaded, "labour editor",
                            "frmLabour.SetQuoteNo");
  if (!prsLab)
    throw Error(err::kInvalidCall, "The labour editor was given no quote item record set",
                "frmLabour.SetQuoteNo");
  editor::StatusBoxScope status(host::kOpeningLabour);

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

  editor::RunModalSession(*this);
  status.Close();
  psSchedType = msSchedType;
}

void frmLabour::Form_Load() {
  CaptureWindowLayout();
  try {
    mrsDeletedItems.reset(); // a list of this session's only, in edit mode only
    mvLoadedLines.clear();
    mHistory.Clear();
    cipher::InitFieldCipher();
    forms::Screen.MousePointer(forms::kPointerHourglass);
    host::gbLabourFormLoaded = true;

    for (int i = 0; i < FGLabourItems.Count(); ++i)
      LayoutCatalogueGrid(i);
    LayoutSelectedGrid();
    LayoutSearchGrid();

    if (meMode == eEdit) {
      mrsDeletedItems = editor::NewRemovedItemsList();

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
    // The form is still hidden, so EnterCell did not keep the cell's text:
    // keep it here, so Escape on the first cell brings its text back.
    FGSelectedLabour.Tag(FGSelectedLabour.Text());
    FGSelectedLabour.ToolTipText(FGSelectedLabour.Text());
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
  // What the close box compares with: the lines as loaded, also when the
  // load stopped part way.
  mvLoadedLines = editor::GridRowTexts(FGSelectedLabour);
}

void frmLabour::LayoutCatalogueGrid(int index) {
  editor::ApplyLayout(FGLabourItems(index), kCatalogueColumns);
}

void frmLabour::LayoutSearchGrid() { editor::ApplyLayout(fgSearch, kSearchColumns); }

void frmLabour::LayoutSelectedGrid() { editor::ApplyLayout(FGSelectedLabour, kSelectedColumns); }

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

// ---- the window ----

// The design's layout, shared out as the window grows: the catalogue area
// takes the larger share of the height, as in the design, the selected lines
// the rest; every grid widens by its description; the buttons stay at the
// bottom right corner.
void frmLabour::CaptureWindowLayout() {
  const double top = 2925.0 / (2925.0 + 2235.0);
  std::vector<editor::Stretch> stretches{
      {&Frame1, 0, 0, 1, 0},
      {&fgSearch, 0, 0, 1, top},
      {&lblLoading, 0.5, top / 2, 0, 0},
      {&Label2, 0, top, 0, 0},
      {&FGSelectedLabour, 0, top, 1, 1 - top},
      {&AutoReturn, 0, 1, 0, 0},
      {&CellIndicator, 0, 1, 0, 0},
      {&cmdDelete, 1, 1, 0, 0},
      {&cmdHelp, 1, 1, 0, 0},
      {&cmdClose, 1, 1, 0, 0},
  };
  std::vector<editor::WideningColumn> columns{{&fgSearch, col::kDescription},
                                              {&FGSelectedLabour, col::kDescription}};
  for (int i = 0; i < 4; ++i) {
    stretches.push_back({&FGLabourItems(i), 0, 0, 1, top});
    stretches.push_back({&optSchedule(i), 0, top, 0, 0});
    columns.push_back({&FGLabourItems(i), col::kDescription});
  }
  mLayout.Capture(*this, std::move(stretches), std::move(columns));
}

void frmLabour::Form_Resize() {
  mLayout.Apply(*this);
  if (T1.Visible()) editor::PlaceOverCurrentCell(T1, FGSelectedLabour);
}

void frmLabour::Form_KeyDown(int& keyCode, int shift) {
  // Deletions are taken back and redone only while editing.
  switch (editor::WindowKeyOf(keyCode, shift, ActiveControl())) {
  case editor::WindowKey::kHelp:
    keyCode = 0;
    cmdHelp_Click();
    break;
  case editor::WindowKey::kUndo:
    if (meMode != eEdit) break;
    keyCode = 0;
    UndoDeletion();
    break;
  case editor::WindowKey::kRedo:
    if (meMode != eEdit) break;
    keyCode = 0;
    RedoDeletion();
    break;
  case editor::WindowKey::kNone:
    break;
  }
}

void frmLabour::cmdHelp_Click() {
  editor::ShowKeysHelp("Labour editor keys",
                       "FINDING LABOUR\r\n"
                       "Alt+S: search; type words, then Enter.\r\n"
                       "Alt+B: browse the schedule again.\r\n"
                       "Alt+N, Alt+M, Alt+3, Alt+P: the NRMA, MTA, 3RD, NRMA CP schedules.\r\n"
                       "Alt+A: the available items; arrows, Page Up and Down move.\r\n"
                       "Enter or Insert: adds the whole item (as a double click on\r\n"
                       "its description); a double click on an R&R, Repair or Paint\r\n"
                       "figure adds only that operation.\r\n"
                       "\r\n"
                       "EDITING THE SELECTED LINES\r\n"
                       "Alt+E: the selected lines; arrows move.\r\n"
                       "Typing replaces a cell; F2 or a double click edits it.\r\n"
                       "Enter keeps the text and moves on; Escape takes it back.\r\n"
                       "Space or a double click ticks or clears a flag.\r\n"
                       "Alt+D: deletes the current line.");
}

void frmLabour::cmdClose_Click() {
  if (meMode == eEdit) WriteSelectedItems();
  Unload();
}

void frmLabour::Form_QueryUnload(int& cancel, int unloadMode) {
  // Only Close writes back. Closing the window any other way with edits in
  // hand asks first, so the estimator never loses them without a word.
  if (unloadMode == forms::kFormCode || meMode != eEdit || !Visible()) return;
  if (T1.Visible()) CommitCellText();
  if (!editor::LinesChanged(FGSelectedLabour, mvLoadedLines, mrsDeletedItems.get())) return;
  editor::AskBeforeDiscarding(
      "Save the changes to this quote's labour lines?", "Labour", [this] { WriteSelectedItems(); },
      cancel);
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
