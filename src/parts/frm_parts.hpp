#pragma once
// frmParts: the parts editor. The estimator picks parts from the vehicle
// model's parts catalogue or from the general parts items and sets their
// side, part type, quantity, unit price and price with markup; on Close
// (edit mode) the parts are written back into the host's quote item record
// set.
//
// One class, split into files by concern:
//   session.cpp     SetQuoteNo and the model look-up, design, load, grid
//                   layouts, view and edit mode, close, unload
//   store.cpp       the selected grid <-> the quote item record set, with
//                   repricing of prices made under an old markup
//   catalogue.cpp   the vehicle and general parts, the text search, adding
//                   a catalogue part
//   editing.cpp     the selected grid's in-cell editor, keys, leaving a
//                   cell, pricing
//   part_types.cpp  the part-type list and its drop-down button, Delete

#include "data/recordset.hpp"
#include "editor/deletion_history.hpp"
#include "editor/flag_glyphs.hpp"
#include "editor/window_layout.hpp"
#include "forms/controls.hpp"
#include "forms/form.hpp"
#include "host/component_state.hpp"

#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace belvane::parts {

namespace col {
// Columns of the available parts grid FGParts and of the results grid
// fgSearch.
namespace cat {
inline constexpr int kItemNo = 0;
inline constexpr int kDescription = 1;
inline constexpr int kSide = 2;
inline constexpr int kQty = 3;
inline constexpr int kUnitPrice = 4;
inline constexpr int kPartNo = 5;
inline constexpr int kGroup = 6; // in a text-search result: the FGParts row
} // namespace cat

// Columns of the quote's parts grid FGSelectedParts.
namespace sel {
inline constexpr int kItemNo = 0;
inline constexpr int kDescription = 1;
inline constexpr int kSide = 2;
inline constexpr int kType = 3; // "New?": the part-type letter
inline constexpr int kQty = 4;
inline constexpr int kUnitPrice = 5;
inline constexpr int kMarkup = 6; // the unit price with markup
inline constexpr int kPartNo = 7;
inline constexpr int kReport = 8;
inline constexpr int kRev = 9;
inline constexpr int kItemId = 10;
} // namespace sel
} // namespace col

using editor::kFlagFont;
using editor::kFlagFontSize;
using editor::kTicked;
using editor::kUnticked;

// The part types of the drop-down list, in list order (item 1 to 5).
inline constexpr int kPartTypeCount = 5;
inline constexpr const char* kPartTypeItems[kPartTypeCount] = {
    "New(Space)", "Used(U)", "eXchange(X)", "reCore(C)", "After Market(A)"};
inline constexpr const char* kPartTypeLetters[kPartTypeCount] = {"", "U", "X", "C", "A"};

// The money of the selected parts while they are edited: the parts at
// cost (quantity times unit price), with markup (quantity times the price
// with markup) and the margin between them. Report-only parts are not
// charged.
struct PartsTotals {
  double cost = 0;
  double sell = 0;
  double Margin() const { return sell - cost; }
};

class frmParts : public forms::Form {
public:
  // ---- controls ----
  forms::Frame Frame1{*this, "Frame1"};
  forms::Label Label3{*this, "Label3"};
  forms::TextBox txtSearch{*this, "txtSearch"};
  // 0 "Search": the diagram group search; 1 "Browse": back to the
  // available parts.
  forms::ControlArray<forms::CommandButton, 2> cmdSearch{*this, "cmdSearch"};
  forms::Label Label1{*this, "Label1"};
  forms::FlexGrid FGParts{*this, "FGParts"};
  forms::FlexGrid fgSearch{*this, "fgSearch"};
  forms::Label Label2{*this, "Label2"};
  forms::FlexGrid FGSelectedParts{*this, "FGSelectedParts"};
  forms::TextBox T1{*this, "T1"};
  forms::CommandButton CB1{*this, "CB1"};
  forms::ListView LV1{*this, "LV1"};
  forms::CommandButton cmdDelete{*this, "cmdDelete"};
  forms::CommandButton cmdHelp{*this, "cmdHelp"};
  forms::CommandButton cmdClose{*this, "cmdClose"};

  frmParts();

  // ---- public methods ----
  // Opens the editor modally over the host's record set of parts; returns
  // when the estimator has closed it.
  void SetQuoteNo(data::RecordsetPtr& prsParts, const std::string& psQtnNo,
                  const std::string& psSubQuoteNo, const std::string& psMake,
                  const std::string& psModelID, const std::string& psBodyID, double pdNewMarkup,
                  double pdUsedMarkup, double pdRecoreMarkup, double pdAfterMarketMarkup,
                  double pdOldNewMarkup, double pdOldUsedMarkup, double pdOldRecoreMarkup,
                  double pdOldAfterMarketMarkup, EQuoteEditMode peMode);
  // Edit mode: writes the selected grid into the record set.
  void SaveChanges();
  // The selected parts' totals as the grid stands now, and as the line the
  // desktop shows under the window.
  PartsTotals Totals() const;
  std::string RunningTotals() const override;
  // Edit mode: reloads the selected grid from the record set.
  void UpdateChanges();

  // Read-only views of the session, for hosts' tests and the desktop views.
  EQuoteEditMode Mode() const noexcept { return meMode; }
  const std::string& CatNo() const noexcept { return msCatNo; }
  const data::Recordset* DeletedItems() const noexcept { return mrsDeletedItems.get(); }

protected:
  void Design() override;
  void Form_Load() override;
  // F1 anywhere in the window: the key reference; Ctrl+Z and Ctrl+Y
  // (but in a text box): take back a deletion, or do it again.
  void Form_KeyDown(int& keyCode, int shift) override;
  // A larger window gives its room to the grids (the descriptions widen).
  void Form_Resize() override;
  // Closing the window otherwise than by Close asks whether to keep edits.
  void Form_QueryUnload(int& cancel, int unloadMode) override;
  void Form_Unload(int& cancel) override;

private:
  // ---- session (session.cpp) ----
  // The catalogue number of a vehicle model, from ALLMODEL; empty when the
  // model id is not a whole number or no model has it.
  static std::string LookUpCatalogueNumber(const std::string& modelId);
  void LayoutPartsGrid();
  void LayoutSearchGrid();
  void LayoutSelectedGrid();
  void EnableEditControls(bool enabled);
  void cmdClose_Click();
  void cmdHelp_Click();
  void CaptureWindowLayout();
  void cmdSearch_Click(int index);
  // The diagram group search (the "Search" picture button, catalogue.cpp):
  // the diagram window picks a panel group, and the available parts of that
  // group become the results.
  void SearchByDiagramGroup();

  // ---- store (store.cpp) ----
  void LoadSelectedParts();
  // Checks every row that will be written, then writes in three passes; a
  // row that cannot be written stops the writer before anything changes.
  void WriteSelectedParts();

  // ---- catalogue and search (catalogue.cpp) ----
  void LoadVehicleParts(const std::string& make, const std::string& catNo, const std::string& body);
  void LoadGeneralParts();
  int FindInSelection(const grid::FlexGrid& source) const;
  void AddPartFrom(forms::FlexGrid& source);
  void SearchParts();
  // The two steps the text search and the diagram group search share.
  void ClearSearchResults();
  // False (with the message) when the search found nothing.
  bool ShowSearchResults();
  void FGParts_DblClick();
  void fgSearch_DblClick();
  // Enter or Insert on a row adds the part, as a double click does.
  void CatalogueGrid_KeyDown(forms::FlexGrid& source, int& keyCode, int shift);
  void txtSearch_KeyPress(int& keyAscii);
  void txtSearch_GotFocus();
  void txtSearch_LostFocus();
  void BrowseAvailableParts(); // cmdSearch(1)

  // ---- editing (editing.cpp) ----
  void OpenCellEditor(bool selectAll);
  // Lays the editor, its drop-down button and list over the current cell.
  void PlaceCellEditor();
  // The drop-down button at the right end of the current type cell.
  void PlaceTypeButton();
  void MoveToNextCell();
  void RepriceRow(int row);
  // The current markup percentage of a part-type letter.
  double MarkupOf(const std::string& letter) const;
  void FGSelectedParts_GotFocus();
  void FGSelectedParts_LostFocus();
  void FGSelectedParts_DblClick();
  void FGSelectedParts_KeyDown(int& keyCode, int shift);
  void FGSelectedParts_KeyPress(int& keyAscii);
  void FGSelectedParts_MouseDown(int button, int shift, int x, int y);
  void FGSelectedParts_EnterCell();
  void FGSelectedParts_LeaveCell();
  void FGSelectedParts_Scroll();
  void T1_Change();
  void T1_KeyDown(int& keyCode, int shift);
  void T1_KeyPress(int& keyAscii);
  void ToggleReportFlag();

  // ---- part types and removal (part_types.cpp) ----
  // Shows the list over the current cell with the item of `letter` chosen.
  void DropPartTypeList(const std::string& letter);
  void CB1_Click();
  void LV1_KeyPress(int& keyAscii);
  void CommitPartType();
  void cmdDelete_Click();
  // Deletes the current part; returns it as it stood, for taking it back.
  editor::DeletedRow DeleteCurrentPart();
  void UndoDeletion(); // Ctrl+Z
  void RedoDeletion(); // Ctrl+Y
  void cmdDelete_GotFocus();

  // ---- session fields ----
  data::RecordsetPtr mrsParts;
  std::string msQtnNo, msSubQuoteNo;
  std::string msMake, msModelID, msCatNo, msBodyID;
  double mdNewMarkup = 0, mdUsedMarkup = 0, mdRecoreMarkup = 0, mdAfterMarketMarkup = 0;
  double mdOldNewMarkup = 0, mdOldUsedMarkup = 0, mdOldRecoreMarkup = 0, mdOldAfterMarketMarkup = 0;
  EQuoteEditMode meMode = eView;
  std::unique_ptr<data::Recordset> mrsDeletedItems;
  bool mbCellEdited = false;
  std::vector<std::string> mvLoadedParts; // the selected grid as loaded
  editor::DeletionHistory mHistory;       // this session's deletions
  editor::WindowLayout mLayout;           // the window's layout for its size
};

// The list item (1 to 5) of a part-type letter as the cell holds it; 0 for
// a text that is no part type.
int PartTypeItem(const std::string& letter);

// The side a description names: "L" or "R" for a description that ends in
// "L/H" or "R/H" or begins with "L/H " or "R/H " (either slash, any case),
// "O" for any other description, nothing for an empty one.
std::optional<std::string> SideOfDescription(const std::string& description);

// The thread's parts editor, created on first use and kept.
frmParts& PartsForm();

} // namespace belvane::parts
