// frmParts: one session of the editor. How the host's call arrives, the
// model's catalogue number, the design of the window, the order of loading,
// the grid layouts, view versus edit mode, closing and unloading.

#include "cipher/field.hpp"
#include "data/catalogue.hpp"
#include "diagram/frm_butterfly.hpp"
#include "editor/grid_layout.hpp"
#include "editor/keys_help.hpp"
#include "editor/modal_session.hpp"
#include "editor/quote_items.hpp"
#include "forms/keys.hpp"
#include "forms/runtime.hpp"
#include "parts/frm_parts.hpp"
#include "text/error.hpp"
#include "text/strings.hpp"

#include <array>
#include <charconv>
#include <optional>
#include <string>

namespace belvane::parts {

namespace {

using editor::GridColumn;
constexpr bool kBeyond = false; // a column laid beyond the description's fill

constexpr std::array<GridColumn, 7> kPartsColumns{{
    {"Item No", 800, grid::kAlignCenterCenter},
    {"Description", GridColumn::kFill, grid::kAlignLeftCenter},
    {"Side", 800, grid::kAlignLeftCenter},
    {"Qty", 800, grid::kAlignCenterCenter},
    {"Unit Price", 1000, grid::kAlignRightCenter},
    {"Part No.", 1800, grid::kAlignRightCenter},
    {"Grp", 800, grid::kAlignCenterCenter, kBeyond},
}};

constexpr std::array<GridColumn, 7> kSearchColumns{{
    {"Item No", 800, grid::kAlignCenterCenter},
    {"Description", GridColumn::kFill, grid::kAlignLeftCenter},
    {"Side", 800, grid::kAlignLeftCenter},
    {"Qty", 500, grid::kAlignCenterCenter},
    {"Unit Price", 1000, grid::kAlignRightCenter},
    {"Part No.", 1800, grid::kAlignRightCenter},
    {"Grp", 600, grid::kAlignCenterCenter, kBeyond},
}};

constexpr std::array<GridColumn, 11> kSelectedColumns{{
    {"Item No", 800, grid::kAlignCenterCenter},
    {"Description", GridColumn::kFill, grid::kAlignLeftCenter},
    {"Side", 500, grid::kAlignLeftCenter},
    {"New?", 600, grid::kAlignRightCenter},
    {"Qty", 500, grid::kAlignRightCenter},
    {"U.Price", 900, grid::kAlignRightCenter},
    {"Markup", 900, grid::kAlignRightCenter},
    {"Part No", 1800, grid::kAlignRightCenter},
    {"Rpt", 500, grid::kAlignCenterCenter},
    {"Rev", 900, grid::kAlignCenterCenter, kBeyond},
    {"ItemID", 800, GridColumn::kDefaultAlignment, kBeyond},
}};

// The model id as a whole number written plainly, or nothing: only such a
// text is put into the look-up's SQL, so no host text can change the query.
std::optional<std::string> WholeNumber(const std::string& modelId) {
  const std::string t = text::Trim(modelId);
  long long value = 0;
  const char* last = t.data() + t.size();
  const auto [end, error] = std::from_chars(t.data(), last, value);
  if (t.empty() || error != std::errc() || end != last) return std::nullopt;
  return std::to_string(value);
}

} // namespace

frmParts& PartsForm() {
  thread_local std::unique_ptr<frmParts> instance;
  if (!instance) instance = std::make_unique<frmParts>();
  return *instance;
}

frmParts::frmParts() : Form("frmParts") {
  Label3.Container(&Frame1);
  txtSearch.Container(&Frame1);
  cmdSearch(0).Container(&Frame1);
  cmdSearch(1).Container(&Frame1);

  // The window: sizable, F1 from anywhere, and the access keys (Alt and
  // the letter) of its buttons and the labels of its lists.
  Sizable(true);
  KeyPreview(true);
  Label3.AccessKey('S');
  cmdSearch(0).AccessKey('G');
  cmdSearch(1).AccessKey('B');
  Label1.AccessKey('A');
  Label2.AccessKey('E');
  cmdDelete.AccessKey('D');
  cmdHelp.AccessKey('H');
  cmdClose.AccessKey('C');

  // Session.
  cmdClose.OnClick = [this] { cmdClose_Click(); };
  cmdHelp.OnClick = [this] { cmdHelp_Click(); };
  for (int i = 0; i < cmdSearch.Count(); ++i)
    cmdSearch(i).OnClick = [this, i] { cmdSearch_Click(i); };

  // Catalogue and search.
  FGParts.OnDblClick = [this] { FGParts_DblClick(); };
  fgSearch.OnDblClick = [this] { fgSearch_DblClick(); };
  FGParts.OnKeyDown = [this](int& keyCode, int shift) {
    CatalogueGrid_KeyDown(FGParts, keyCode, shift);
  };
  fgSearch.OnKeyDown = [this](int& keyCode, int shift) {
    CatalogueGrid_KeyDown(fgSearch, keyCode, shift);
  };
  txtSearch.OnKeyPress = [this](int& keyAscii) { txtSearch_KeyPress(keyAscii); };
  txtSearch.OnGotFocus = [this] { txtSearch_GotFocus(); };
  txtSearch.OnLostFocus = [this] { txtSearch_LostFocus(); };

  // Editing of the selected parts.
  FGSelectedParts.OnGotFocus = [this] { FGSelectedParts_GotFocus(); };
  FGSelectedParts.OnLostFocus = [this] { FGSelectedParts_LostFocus(); };
  FGSelectedParts.OnDblClick = [this] { FGSelectedParts_DblClick(); };
  FGSelectedParts.OnKeyDown = [this](int& keyCode, int shift) {
    FGSelectedParts_KeyDown(keyCode, shift);
  };
  FGSelectedParts.OnKeyPress = [this](int& keyAscii) { FGSelectedParts_KeyPress(keyAscii); };
  FGSelectedParts.OnMouseDown = [this](int button, int shift, int x, int y) {
    FGSelectedParts_MouseDown(button, shift, x, y);
  };
  FGSelectedParts.OnEnterCell = [this] { FGSelectedParts_EnterCell(); };
  FGSelectedParts.OnLeaveCell = [this] { FGSelectedParts_LeaveCell(); };
  FGSelectedParts.OnScroll = [this] { FGSelectedParts_Scroll(); };
  T1.OnChange = [this] { T1_Change(); };
  T1.OnKeyDown = [this](int& keyCode, int shift) { T1_KeyDown(keyCode, shift); };
  T1.OnKeyPress = [this](int& keyAscii) { T1_KeyPress(keyAscii); };

  // Part types and removal.
  CB1.OnClick = [this] { CB1_Click(); };
  LV1.OnClick = [this] { CommitPartType(); };
  LV1.OnKeyPress = [this](int& keyAscii) { LV1_KeyPress(keyAscii); };
  cmdDelete.OnClick = [this] { cmdDelete_Click(); };
  cmdDelete.OnGotFocus = [this] { cmdDelete_GotFocus(); };
}

void frmParts::Design() {
  Caption("Parts");
  FontName("Tahoma");
  FontSize(8.25);
  ScaleWidth(10710);
  ScaleHeight(7215);

  // The search frame across the top; its controls sit inside it.
  Frame1.Caption("Parts search");
  Frame1.Move(60, 0, 10590, 615);
  Label3.Caption("Search for: ");
  Label3.Move(120, 270, 900, 255);
  txtSearch.Move(1080, 225, 4215, 300);
  txtSearch.BackColor(grid::kCyan);
  cmdSearch(0).Picture(forms::CommandButton::kPictureSearch);
  cmdSearch(0).ToolTipText("Search");
  cmdSearch(0).Move(5400, 195, 495, 345);
  cmdSearch(1).Picture(forms::CommandButton::kPictureBrowse);
  cmdSearch(1).ToolTipText("Browse");
  cmdSearch(1).Move(5955, 195, 495, 345);
  cmdSearch(1).Enabled(false); // until a search has found parts

  // The available parts and the search results share one area.
  Label1.Caption("Available Parts");
  Label1.Move(120, 720, 3495, 255);
  FGParts.Move(120, 975, 10470, 2925);
  fgSearch.Move(120, 975, 10470, 2925);
  fgSearch.Visible(false);

  Label2.Caption("Selected Parts");
  Label2.Move(120, 4005, 2895, 255);
  FGSelectedParts.Move(120, 4275, 10470, 2235);
  T1.Visible(false);
  T1.Move(0, 0, 900, 240);
  CB1.Picture(forms::CommandButton::kPictureDropDown);
  CB1.Move(0, 0, 240, 240);
  CB1.Visible(false);
  CB1.TabStop(false);
  LV1.ColumnHeaderText("Paint Code");
  LV1.Move(0, 0, 1815,
           forms::ListView::kHeaderHeight + kPartTypeCount * forms::ListView::kItemHeight);
  LV1.Visible(false);

  cmdDelete.Caption("Delete");
  cmdDelete.Move(6840, 6630, 1155, 435);
  cmdHelp.Caption("Help");
  cmdHelp.Move(8100, 6630, 1155, 435);
  cmdClose.Caption("Close");
  cmdClose.Move(9360, 6630, 1155, 435);
}

std::string frmParts::LookUpCatalogueNumber(const std::string& modelId) {
  const std::optional<std::string> id = WholeNumber(modelId);
  if (!id) return {}; // a model ALLMODEL cannot hold
  data::RecordsetPtr rs =
      data::Catalogue()->OpenRecordset("SELECT * FROM ALLMODEL WHERE MODEL_ID = " + *id, 0, 0);
  std::string catNo;
  if (rs->RecordCount() > 0) {
    rs->MoveFirst();
    catNo = rs->Collect("cat_no").ToText();
  }
  if (rs->State() == data::adStateOpen) rs->Close();
  return catNo;
}

void frmParts::SetQuoteNo(data::RecordsetPtr& prsParts, const std::string& psQtnNo,
                          const std::string& psSubQuoteNo, const std::string& psMake,
                          const std::string& psModelID, const std::string& psBodyID,
                          double pdNewMarkup, double pdUsedMarkup, double pdRecoreMarkup,
                          double pdAfterMarketMarkup, double pdOldNewMarkup, double pdOldUsedMarkup,
                          double pdOldRecoreMarkup, double pdOldAfterMarketMarkup,
                          EQuoteEditMode peMode) {
  // A call made while the editor is open (a host re-entering from the
  // editor's own session) is refused before it touches the open session.
  editor::RefuseWhileLoaded(*this, host::gbPartsFormLoaded, "parts editor", "frmParts.SetQuoteNo");
  if (!prsParts)
    throw Error(err::kInvalidCall, "The parts editor was given no quote item record set",
                "frmParts.SetQuoteNo");
  editor::StatusBoxScope status("Opening Parts...");

  mrsParts = prsParts;
  msQtnNo = psQtnNo;
  msSubQuoteNo = psSubQuoteNo;
  msMake = psMake;
  msModelID = psModelID;
  msBodyID = psBodyID;
  mdNewMarkup = pdNewMarkup;
  mdUsedMarkup = pdUsedMarkup;
  mdRecoreMarkup = pdRecoreMarkup;
  mdAfterMarketMarkup = pdAfterMarketMarkup;
  mdOldNewMarkup = pdOldNewMarkup;
  mdOldUsedMarkup = pdOldUsedMarkup;
  mdOldRecoreMarkup = pdOldRecoreMarkup;
  mdOldAfterMarketMarkup = pdOldAfterMarketMarkup;
  meMode = peMode;

  msCatNo.clear();
  msCatNo = LookUpCatalogueNumber(msModelID);

  editor::RunModalSession(*this);
  status.Close();
}

void frmParts::Form_Load() {
  CaptureWindowLayout();
  mrsDeletedItems.reset(); // a list of this session's only, in edit mode only
  mvLoadedParts.clear();
  mHistory.Clear();
  mbCellEdited = false;
  forms::Screen.MousePointer(forms::kPointerHourglass);
  cipher::InitFieldCipher();
  host::gbPartsFormLoaded = true;

  LayoutPartsGrid();
  LayoutSelectedGrid();

  if (meMode == eEdit) {
    mrsDeletedItems = editor::NewRemovedItemsList();
    LoadVehicleParts(msMake, msCatNo, msBodyID);
    LoadGeneralParts();
  }

  LoadSelectedParts();

  if (meMode == eEdit) {
    for (const char* item : kPartTypeItems)
      LV1.AddItem(item);
    FGSelectedParts.SetCurrentCell(1, col::sel::kDescription);
  }
  // The form is still hidden, so EnterCell did not keep the cell's text:
  // keep it here, so Escape on the first cell brings its text back.
  FGSelectedParts.Tag(FGSelectedParts.Text());
  FGSelectedParts.ToolTipText(FGSelectedParts.Text());

  EnableEditControls(meMode != eView);
  forms::Screen.MousePointer(forms::kPointerDefault);
  // What the close box compares with.
  mvLoadedParts = editor::GridRowTexts(FGSelectedParts);
}

void frmParts::LayoutPartsGrid() { editor::ApplyLayout(FGParts, kPartsColumns); }

void frmParts::LayoutSearchGrid() { editor::ApplyLayout(fgSearch, kSearchColumns); }

void frmParts::LayoutSelectedGrid() { editor::ApplyLayout(FGSelectedParts, kSelectedColumns); }

void frmParts::EnableEditControls(bool enabled) {
  txtSearch.Enabled(enabled);
  FGParts.Enabled(enabled);
  T1.Enabled(enabled);
  LV1.Enabled(enabled);
  CB1.Enabled(enabled);
  cmdDelete.Enabled(enabled);
  cmdSearch(0).Enabled(enabled);
}

// ---- the window ----

// The design's layout, shared out as the window grows: the catalogue area
// takes the larger share of the height, as in the design, the selected parts
// the rest; every grid widens by its description; the buttons stay at the
// bottom right corner.
void frmParts::CaptureWindowLayout() {
  const double top = 2925.0 / (2925.0 + 2235.0);
  mLayout.Capture(*this,
                  {
                      {&Frame1, 0, 0, 1, 0},
                      {&FGParts, 0, 0, 1, top},
                      {&fgSearch, 0, 0, 1, top},
                      {&Label2, 0, top, 0, 0},
                      {&FGSelectedParts, 0, top, 1, 1 - top},
                      {&cmdDelete, 1, 1, 0, 0},
                      {&cmdHelp, 1, 1, 0, 0},
                      {&cmdClose, 1, 1, 0, 0},
                  },
                  {{&FGParts, col::cat::kDescription},
                   {&fgSearch, col::cat::kDescription},
                   {&FGSelectedParts, col::sel::kDescription}});
}

void frmParts::Form_Resize() {
  mLayout.Apply(*this);
  if (T1.Visible())
    PlaceCellEditor();
  else if (CB1.Visible())
    PlaceTypeButton();
}

void frmParts::Form_KeyDown(int& keyCode, int shift) {
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

void frmParts::cmdHelp_Click() {
  editor::ShowKeysHelp("Parts editor keys",
                       "FINDING PARTS\r\n"
                       "Alt+S: search; type words, then Enter.\r\n"
                       "Alt+G: the parts of a panel group, picked on the vehicle diagram.\r\n"
                       "Alt+B: browse every available part again.\r\n"
                       "Alt+A: the available parts; arrows, Page Up and Down move.\r\n"
                       "Enter or Insert, or a double click: adds the part.\r\n"
                       "\r\n"
                       "EDITING THE SELECTED PARTS\r\n"
                       "Alt+E: the selected parts; arrows move.\r\n"
                       "Typing replaces a cell; F2 or a double click edits it.\r\n"
                       "Enter keeps the text and moves on; Escape takes it back.\r\n"
                       "Part type: F2 opens the list; a letter, or arrows and Enter, pick.\r\n"
                       "Space or a double click ticks or clears Rpt (report only).\r\n"
                       "Alt+D: deletes the current part.");
}

void frmParts::cmdClose_Click() {
  if (meMode == eEdit) {
    // The value being edited reaches the grid checked and priced first.
    if (T1.Visible()) FGSelectedParts_LeaveCell();
    WriteSelectedParts();
  }
  Unload();
}

void frmParts::cmdSearch_Click(int index) {
  if (index == 0)
    SearchByDiagramGroup();
  else
    BrowseAvailableParts();
}

void frmParts::Form_QueryUnload(int& cancel, int unloadMode) {
  // Only Close writes back. Closing the window any other way with edits in
  // hand asks first, so the estimator never loses them without a word.
  if (unloadMode == forms::kFormCode || meMode != eEdit || !Visible()) return;
  if (T1.Visible()) FGSelectedParts_LeaveCell();
  if (!editor::LinesChanged(FGSelectedParts, mvLoadedParts, mrsDeletedItems.get())) return;
  editor::AskBeforeDiscarding(
      "Save the changes to this quote's parts?", "Parts", [this] { WriteSelectedParts(); }, cancel);
}

void frmParts::Form_Unload(int& /*cancel*/) {
  host::gbPartsFormLoaded = false;
  // The diagram window goes with the editor; one never shown is not made.
  diagram::UnloadButterflyForm();
  if (meMode == eEdit && mrsDeletedItems && mrsDeletedItems->State() == data::adStateOpen)
    mrsDeletedItems->Close();
  data::RecordsetPtr parts = std::move(mrsParts);
  mrsParts.reset();
  if (parts && parts->State() == data::adStateOpen) parts->SetSort("itemno ASC");
}

} // namespace belvane::parts
