// The pieces both editors share: grid layouts, the redraw guard, the
// in-cell editor's arrows and Backspace, and the all-or-nothing write-back.

#include "../error_number.hpp"
#include "editor/cell_editor.hpp"
#include "editor/flag_glyphs.hpp"
#include "editor/grid_layout.hpp"
#include "editor/quote_items.hpp"
#include "forms/form.hpp"
#include "forms/keys.hpp"

#include <gtest/gtest.h>

#include <array>

namespace belvane::test {
namespace {

using editor::GridColumn;
namespace keys = forms::keys;

TEST(EditorPieces, TheFillColumnTakesWhatTheCountedColumnsLeave) {
  grid::FlexGrid g;
  g.Width(5000);
  const std::array<GridColumn, 4> columns{{
      {"No", 800, grid::kAlignCenterCenter},
      {"Description", GridColumn::kFill, grid::kAlignLeftCenter},
      {"Qty", 500},
      {"Id", 700, GridColumn::kDefaultAlignment, false},
  }};
  editor::ApplyLayout(g, columns);
  ASSERT_EQ(g.Cols(), 4);
  EXPECT_EQ(g.ColWidth(1), 5000 - 800 - 500 - 20); // "Id" lies beyond the fill
  EXPECT_EQ(g.ColWidth(3), 700);
  EXPECT_EQ(g.TextMatrix(0, 1), "Description");
  EXPECT_TRUE(g.CellStyleAt(0, 3).fontBold);
  EXPECT_EQ(g.ColAlignment(0), grid::kAlignCenterCenter);
}

TEST(EditorPieces, RedrawComesBackOnWhenTheWorkFails) {
  grid::FlexGrid g;
  try {
    editor::RedrawSuspended suspended(g);
    EXPECT_FALSE(g.Redraw());
    throw Error(5, "failed", "test");
  } catch (const Error&) {
  }
  EXPECT_TRUE(g.Redraw());
}

TEST(EditorPieces, GlyphsAndTheLastCharacter) {
  EXPECT_EQ(editor::ToggleFlagGlyph("R"), "£");
  EXPECT_EQ(editor::ToggleFlagGlyph("£"), "R");
  EXPECT_EQ(editor::ToggleFlagGlyph("x"), "");
  EXPECT_EQ(editor::FlagGlyphToYesNo("£"), "No");
  EXPECT_EQ(editor::DropLastCharacter("Roof £"), "Roof ");
  EXPECT_EQ(editor::DropLastCharacter(""), "");
}

class ArrowForm : public forms::Form {
public:
  ArrowForm() : Form("ArrowForm") {}
  forms::FlexGrid grid{*this, "grid"};
  forms::TextBox editor{*this, "editor"};

protected:
  void Design() override {
    grid.Rows(3);
    grid.Cols(4);
  }
};

TEST(EditorPieces, ArrowsLeaveTheEditorOnlyAtTheEdgesOfItsText) {
  ArrowForm f;
  f.Load();
  auto& g = f.grid;
  f.editor.Text("abc");
  g.SetCurrentCell(2, 1);
  f.editor.SelStart(1);
  editor::MoveAtTextEdges(f.editor, g, keys::kLeft); // caret inside: stays
  EXPECT_EQ(g.Col(), 1);
  f.editor.SelStart(0);
  editor::MoveAtTextEdges(f.editor, g, keys::kLeft); // column 1: last column above
  EXPECT_EQ(g.Row(), 1);
  EXPECT_EQ(g.Col(), 3);
  f.editor.SelStart(3);
  editor::MoveAtTextEdges(f.editor, g, keys::kRight); // last column: column 1 below
  EXPECT_EQ(g.Row(), 2);
  EXPECT_EQ(g.Col(), 1);
  editor::MoveAtTextEdges(f.editor, g, keys::kDown); // last row: stays
  EXPECT_EQ(g.Row(), 2);
  editor::MoveAtTextEdges(f.editor, g, keys::kUp);
  EXPECT_EQ(g.Row(), 1);
}

data::RecordsetPtr Items() {
  auto rs = std::make_shared<data::Recordset>();
  rs->Fields().Append("ITEMID", data::DataType::Integer);
  rs->Fields().Append("Tag", data::DataType::VarWChar);
  rs->Fields().Append("DELITEM", data::DataType::Boolean);
  rs->Fields().Append("qty", data::DataType::Double);
  rs->Open();
  auto add = [&](data::Value id, data::Value tag, data::Value deleted) {
    rs->AddNew();
    rs->Collect("ITEMID", id);
    rs->Collect("Tag", tag);
    rs->Collect("DELITEM", deleted);
    rs->Collect("qty", data::Value(1.0));
  };
  add(int32_t{1}, "1", false);
  add(int32_t{2}, "D", false);
  add(data::Value(), "1", false); // added earlier in the session
  add(data::Value(), data::Value(), false);
  add(int32_t{5}, "1", data::Value());
  return rs;
}

TEST(EditorPieces, WhichRecordsShowAndWhichTheFirstPassDrops) {
  auto rs = Items();
  std::vector<bool> shown;
  for (rs->MoveFirst(); !rs->Eof(); rs->MoveNext())
    shown.push_back(editor::IsShownItem(*rs));
  EXPECT_EQ(shown, (std::vector<bool>{true, false, true, false, false}));
  editor::DropSessionRecords(*rs);
  EXPECT_EQ(rs->RecordCount(), 4); // only the id-less record with a Tag other than "D"
  editor::ApplyRemovals(*rs, {"5", "77"});
  EXPECT_EQ(rs->RecordCount(), 3);
}

TEST(EditorPieces, AWriteBackThatCannotBeDoneChangesNothing) {
  auto rs = Items();
  rs->AcceptChanges();
  const editor::WriteBackWords words{
      [](int row) { return "Row " + std::to_string(row); },
      [](const editor::FieldWrite& w) { return "\"" + w.value.ToText() + "\" is refused."; },
      "test"};
  using editor::PlannedRecord;
  std::vector<PlannedRecord> plan;
  const data::Value three(3.0), lots("lots");
  plan.push_back({PlannedRecord::Kind::Write, 1, "1", "Id", "part", {{"qty", three, 4}}});
  plan.push_back({PlannedRecord::Kind::Write, 2, "", "Id", "part", {{"qty", lots, 4}}});

  std::string said;
  EXPECT_EQ(ErrorNumber([&] { editor::CheckWriteBack(*rs, plan, {}, words); }, &said), 13);
  EXPECT_EQ(said, "Row 2: \"lots\" is refused. Nothing was saved.");
  for (size_t i = 0; i < rs->StoredCount(); ++i)
    EXPECT_EQ(rs->StoredStatus(i), data::RecordStatus::Unchanged);

  // A record removed in this session, or gone from the record set, is
  // named by its id column.
  plan.pop_back();
  EXPECT_EQ(ErrorNumber([&] { editor::CheckWriteBack(*rs, plan, {"1"}, words); }, &said),
            err::kNoCurrentRecord);
  EXPECT_EQ(said.rfind("Row 1, column \"Id\": its stored part record (1)", 0), 0u) << said;
  plan[0].id = "12x";
  EXPECT_EQ(ErrorNumber([&] { editor::CheckWriteBack(*rs, plan, {}, words); }), err::kTypeMismatch);
  plan[0].id = "1";
  editor::CheckWriteBack(*rs, plan, {}, words);
  editor::ApplyWriteBack(*rs, plan);
  editor::FindItemId(*rs, "1");
  EXPECT_EQ(rs->Collect("qty").ToDouble(), 3.0);
}

} // namespace
} // namespace belvane::test

namespace belvane::test {
namespace {

// The write-back returns to the records its check found; a record deleted
// between the check and the write (here by an earlier deletion in the same
// plan) is searched for again, as it was before targets existed.
TEST(EditorPieces, TheWriteBackGoesToTheRecordsItsCheckFound) {
  auto rs = Items();
  rs->AcceptChanges();
  const editor::WriteBackWords words{[](int row) { return "Row " + std::to_string(row); },
                                     [](const editor::FieldWrite&) { return std::string(); },
                                     "test"};
  using editor::PlannedRecord;
  std::vector<PlannedRecord> plan;
  plan.push_back(
      {PlannedRecord::Kind::Write, 1, "5", "Id", "part", {{"qty", data::Value(4.0), 4}}});
  plan.push_back({PlannedRecord::Kind::Delete, 2, "1", "Id", "part", {}});
  plan.push_back(
      {PlannedRecord::Kind::Write, 3, "1", "Id", "part", {{"qty", data::Value(9.0), 4}}});
  plan.push_back({PlannedRecord::Kind::Write, 4, "", "Id", "part", {{"qty", data::Value(2.0), 4}}});
  const editor::WriteBackTargets targets = editor::CheckWriteBack(*rs, plan, {}, words);
  ASSERT_EQ(targets.size(), plan.size());
  EXPECT_TRUE(targets[0] && targets[2]);
  EXPECT_FALSE(targets[1] || targets[3]); // a deletion and a new record have none
  // The same write-back with and without targets gives the same records.
  auto plain = Items();
  plain->AcceptChanges();
  editor::CheckWriteBack(*plain, plan, {}, words);
  // Record 1 is deleted by the plan's second entry, so its later write
  // fails alike both ways, after the same writes.
  EXPECT_EQ(ErrorNumber([&] { editor::ApplyWriteBack(*rs, plan, &targets); }),
            err::kNoCurrentRecord);
  EXPECT_EQ(ErrorNumber([&] { editor::ApplyWriteBack(*plain, plan); }), err::kNoCurrentRecord);
  ASSERT_EQ(rs->StoredCount(), plain->StoredCount());
  for (size_t r = 0; r < rs->StoredCount(); ++r) {
    EXPECT_EQ(rs->StoredStatus(r), plain->StoredStatus(r)) << r;
    EXPECT_EQ(rs->StoredValue(r, 3), plain->StoredValue(r, 3)) << r;
  }
  editor::FindItemId(*rs, "5");
  EXPECT_EQ(rs->Collect("qty").ToDouble(), 4.0);

  // Without the deletion the writes land where the check found them.
  plan.erase(plan.begin() + 1);
  auto again = Items();
  again->AcceptChanges();
  const editor::WriteBackTargets found = editor::CheckWriteBack(*again, plan, {}, words);
  editor::ApplyWriteBack(*again, plan, &found);
  editor::FindItemId(*again, "1");
  EXPECT_EQ(again->Collect("qty").ToDouble(), 9.0);
  EXPECT_EQ(again->RecordCount(), 6);
}

} // namespace
} // namespace belvane::test
