#pragma once
// frmLabour: the labour editor. The estimator picks labour operations from
// one of four labour schedules and sets their hours, flags and R&R rate; on
// Close (edit mode) the lines are written back into the host's quote item
// record set.
//
// One class, split into files by concern:
//   session.cpp    SetQuoteNo, design, load, schedule choice, close, unload
//   store.cpp      the selected grid <-> the quote item record set
//   catalogue.cpp  schedule lists, text search, adding catalogue items
//   editing.cpp    the selected grid's in-cell editor, keys, flags, delete

#include "data/recordset.hpp"
#include "editor/deletion_history.hpp"
#include "editor/flag_glyphs.hpp"
#include "editor/window_layout.hpp"
#include "forms/controls.hpp"
#include "forms/form.hpp"
#include "host/component_state.hpp"

#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace belvane::labour {

// Column numbers of the selected-lines grid.
namespace col {
inline constexpr int kItemNo = 0;
inline constexpr int kDescription = 1;
inline constexpr int kRRHours = 2;
inline constexpr int kRRReport = 3;
inline constexpr int kRAHours = 4;
inline constexpr int kRAReport = 5;
inline constexpr int kPTHours = 6;
inline constexpr int kPTReport = 7;
inline constexpr int kBlend = 8;
inline constexpr int kRate = 9;
inline constexpr int kMechanical = 10;
inline constexpr int kAllow = 11;
inline constexpr int kRev = 12;
inline constexpr int kItemId1 = 13;
inline constexpr int kItemId2 = 14;
inline constexpr int kItemId3 = 15;
} // namespace col

// Texts of the grids. The flag glyphs are the editors' shared ones.
using editor::kFlagFont;
using editor::kFlagFontSize;
using editor::kTicked;
using editor::kUnticked;
inline constexpr const char* kDefaultRate = "<Default>";
inline constexpr const char* kNoRate = "<NA>";

// The money of the selected lines while they are edited: hours and amounts
// per operation, R&R at each line's own rate and repair and paint at the
// session's rates. Report-only operations are not charged.
struct LabourTotals {
  double hours[3] = {0, 0, 0}; // R&R, repair, paint
  double amounts[3] = {0, 0, 0};
  double Hours() const { return hours[0] + hours[1] + hours[2]; }
  double Amount() const { return amounts[0] + amounts[1] + amounts[2]; }
};

class frmLabour : public forms::Form {
public:
  // ---- controls ----
  forms::Frame Frame1{*this, "Frame1"};
  forms::Label Label3{*this, "Label3"};
  forms::TextBox txtSearch{*this, "txtSearch"};
  forms::CommandButton cmdBrowse{*this, "cmdBrowse"};
  forms::Label Label1{*this, "Label1"};
  forms::ControlArray<forms::FlexGrid, 4> FGLabourItems{*this, "FGLabourItems"};
  forms::FlexGrid fgSearch{*this, "fgSearch"};
  forms::Label lblLoading{*this, "lblLoading"};
  forms::ControlArray<forms::OptionButton, 4> optSchedule{*this, "optSchedule"};
  forms::Label Label2{*this, "Label2"};
  forms::FlexGrid FGSelectedLabour{*this, "FGSelectedLabour"};
  forms::TextBox T1{*this, "T1"};
  forms::CheckBox AutoReturn{*this, "AutoReturn"};
  forms::Label CellIndicator{*this, "CellIndicator"};
  forms::CommandButton cmdDelete{*this, "cmdDelete"};
  forms::CommandButton cmdHelp{*this, "cmdHelp"};
  forms::CommandButton cmdClose{*this, "cmdClose"};

  frmLabour();

  // ---- public methods ----
  // Opens the editor modally over the host's record set; returns when the
  // estimator has closed it, with psSchedType holding the chosen schedule.
  void SetQuoteNo(data::RecordsetPtr& prsLab, std::string& psSchedType,
                  const std::string& psQuoteNo, const std::string& psSubQuoteNo,
                  const std::string& psMake, const std::string& psModelID,
                  const std::string& psBodyID, const std::string& psSchedID,
                  const std::string& psMTAID, const std::string& psThirdID, double pdRRRate,
                  double pdRARate, double pdPTRate, bool pbDefaultSched, bool pbInsurerChanged,
                  EQuoteEditMode peMode);
  // Edit mode: writes the selected grid into the record set.
  void SaveChanges();
  // Edit mode: reloads the selected grid from the record set.
  void UpdateChanges();

  // The selected lines' totals as the grid stands now, and as the line
  // the desktop shows under the window.
  LabourTotals Totals() const;
  std::string RunningTotals() const override;

  // Read-only views of the session, for hosts' tests and the desktop views.
  EQuoteEditMode Mode() const noexcept { return meMode; }
  const std::string& SchedType() const noexcept { return msSchedType; }
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
  void LayoutCatalogueGrid(int index);
  void LayoutSearchGrid();
  void LayoutSelectedGrid();
  void EnableEditControls(bool enabled);
  void optSchedule_Click(int index);
  void cmdClose_Click();
  void cmdHelp_Click();
  void CaptureWindowLayout();

  // ---- store (store.cpp) ----
  void LoadSelectedItems();
  // Checks every row that will be written, then writes; a row that cannot
  // be written stops the writer before anything is changed.
  void WriteSelectedItems();
  void AddSelectedRow(const std::string& rowText);
  void GreyDisallowedCells(std::uint8_t allow);

  // ---- catalogue and search (catalogue.cpp) ----
  void LoadScheduleItems(long scheduleNo, const std::string& firstId, const std::string& secondId,
                         const std::string& bodyId, int16_t gridIndex);
  void FindCatalogueItemRow(int gridIndex, long& row);
  void FindSearchItemRow(long& row);
  // Adds the source grid's current row as a double click in column `col`
  // would: the whole item from the number or description, else only the
  // operation of that column.
  void AddFromSourceGrid(forms::FlexGrid& source, int col,
                         const std::function<void(long&)>& findRow);
  void FormatFlagCells(long row);
  void SearchLabourItems();
  void FGLabourItems_Click(int index);
  void FGLabourItems_GotFocus(int index);
  void FGLabourItems_DblClick(int index);
  void fgSearch_DblClick();
  // Enter or Insert on a row adds the whole item.
  void FGLabourItems_KeyDown(int index, int& keyCode, int shift);
  void fgSearch_KeyDown(int& keyCode, int shift);
  void txtSearch_KeyPress(int& keyAscii);
  void txtSearch_GotFocus();
  void txtSearch_LostFocus();
  void cmdBrowse_Click();

  // ---- editing (editing.cpp) ----
  void OpenCellEditor(bool selectAll);
  void MoveToNextCell();
  void CommitCellText();
  // The rate cell's rule: "<Default>" for empty or the default rate, else
  // the formatted number; markers are left as they are.
  void ApplyRateRule(int row);
  void FGSelectedLabour_GotFocus();
  void FGSelectedLabour_LostFocus();
  void FGSelectedLabour_DblClick();
  void FGSelectedLabour_KeyDown(int& keyCode, int shift);
  void FGSelectedLabour_KeyPress(int& keyAscii);
  void FGSelectedLabour_EnterCell();
  void FGSelectedLabour_LeaveCell();
  void FGSelectedLabour_Scroll();
  void T1_Change();
  void T1_KeyDown(int& keyCode, int shift);
  void T1_KeyPress(int& keyAscii);
  void cmdDelete_Click();
  // Deletes the current line; returns it as it stood, for taking it back.
  editor::DeletedRow DeleteCurrentLine();
  void UndoDeletion();      // Ctrl+Z
  void RedoDeletion();      // Ctrl+Y
  void HideEditorOnFocus(); // cmdClose, cmdDelete, cmdHelp GotFocus

  // ---- shared helpers ----
  // A cell whose back colour is grey: an operation the item does not allow.
  static bool IsGrey(const grid::FlexGrid& grid, int row, int col);
  // The formatted default R&R rate.
  std::string DefaultRateText() const;

  // ---- session fields ----
  data::RecordsetPtr mrsLab;
  std::string msQuoteNo, msSubQuoteNo;
  std::string msMake, msModelID, msBodyID;
  std::string msSchedID, msMTAID, msThirdID;
  std::string msSchedType;
  double mdRRRate = 0, mdRARate = 0, mdPTRate = 0;
  bool mbDefaultSched = false, mbInsurerChanged = false;
  EQuoteEditMode meMode = eView;
  std::unique_ptr<data::Recordset> mrsDeletedItems;
  std::vector<std::string> mvLoadedLines; // the selected grid as loaded
  editor::DeletionHistory mHistory;       // this session's deletions
  editor::WindowLayout mLayout;           // the window's layout for its size
};

// The thread's labour editor, created on first use and kept.
frmLabour& LabourForm();

} // namespace belvane::labour
