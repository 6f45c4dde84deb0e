#pragma once
// The parts editor under test: a small SQLite catalogue built by the test
// (vehicle models, the catalogue's state, vehicle parts with enciphered
// names, numbers and groups, general parts items), a quote record set, and
// the editor opened through CForms with a scripted user.

#include "../data/temp_dir.hpp"
#include "cipher/field.hpp"
#include "data/catalogue.hpp"
#include "data/quote_store.hpp"
#include "data/tools/catalogue_writer.hpp"
#include "entry/cforms.hpp"
#include "forms/runtime.hpp"
#include "forms/simulated_user.hpp"
#include "parts/frm_parts.hpp"
#include "text/error.hpp"
#include "text/number.hpp"

#include <gtest/gtest.h>

#include <algorithm>
#include <functional>
#include <optional>
#include <string>
#include <vector>

namespace belvane::test {

// A field key of the tests' own (72 hexadecimal digits).
inline constexpr const char* kPartsTestFieldKey =
    "00112233445566778899AABBCCDDEEFF0123456789ABCDEFFEDCBA98765432100F1E2D3C";

// One vehicle part of the catalogue, in clear: the fixture enciphers the
// name, number and group as the catalogue stores them.
struct VehiclePart {
  std::string itemNo = "";
  std::optional<std::string> name = std::nullopt; // PARTNAME (enciphered); nullopt: Null
  std::string script = "";                        // plain description, used when the name is blank
  std::optional<std::string> side = std::nullopt;
  int qty = 1;
  std::optional<double> unitcost = std::nullopt;
  std::optional<std::string> partNo = std::nullopt; // enciphered unless blank
  std::optional<std::string> group = std::nullopt;  // enciphered
  std::string make = "FORD", catNo = "FA1";
  std::optional<std::string> bodyId = std::nullopt; // nullopt: every body
  std::optional<int> state = std::nullopt;          // nullopt: every state
};

// One general parts item (ITEM_2).
struct GeneralItem {
  std::string itemNo = "", script = "", category = "PRT";
  std::optional<std::string> side = std::nullopt, group = std::nullopt;
};

// One stored part of the quote.
struct StoredPart {
  int id = 0;
  std::string itemNo = "", script = "";
  std::string side = "O", mark = "";
  double qty = 1;
  std::optional<double> unitcost = 100.0, rrhour = 130.0;
  std::string partno = "";
  int report = 0;
  std::optional<std::string> rev = std::nullopt;
  std::optional<std::string> tag = std::string("1");
  std::optional<bool> deleted = false;
};

class PartsFixture : public ::testing::Test {
protected:
  // The quote's context, as a host passes it.
  std::string qtnNo = "Q2001", subQuoteNo = "0";
  std::string make = "FORD", modelId = "12", bodyId = "B1";
  double newMarkup = 30, usedMarkup = 20, recoreMarkup = 15, afterMarketMarkup = 10;
  double oldNewMarkup = 25, oldUsedMarkup = 18, oldRecoreMarkup = 12, oldAfterMarketMarkup = 8;

  TempDir dir{"parts"};
  data::RecordsetPtr quote = data::QuoteStore::NewItemRecordset();
  forms::HeadlessRuntime& runtime = forms::ThreadHeadlessRuntime();
  forms::SimulatedUser user;
  CForms forms;
  text::ScopedNumberLocale locale{{".", ","}};

  static std::vector<VehiclePart> StandardParts() {
    return {
        {"P100", "FRONT BUMPER BAR", "", "O", 1, 250.0, "FB-1001", "FRONT BUMPER"},
        {"P110", "FRONT GUARD", "", "L", 1, 1234.5, "FG-22L", "FRONT GUARD"},
        {"P111", "FRONT GUARD", "", "R", 1, std::nullopt, "FG-22R", "FRONT GUARD"},
        {"P120", std::nullopt, "  REAR BUMPER COVER  ", "o", 2, 99.9, "   ", "REAR BUMPER"},
        {"P130", "  ", "bonnet hinge", "", 2, 12.0, std::nullopt, "BONNET"},
        {"P140", "HEADLAMP", "", std::nullopt, 1, 300.0, "HL-9", "HEADLAMP"},
        // Not this vehicle's: another body, another state, another catalogue.
        {"P150", "BODY B2 BUMPER", "", "O", 1, 10.0, "X", "X", "FORD", "FA1", "B2"},
        {"P160", "STATE 3 BUMPER", "", "O", 1, 10.0, "X", "X", "FORD", "FA1", std::nullopt, 3},
        {"P170", "FOCUS BUMPER", "", "O", 1, 10.0, "X", "X", "FORD", "FO1"},
    };
  }

  static std::vector<GeneralItem> StandardItems() {
    return {
        {"G1", "  Bumper bolt kit ", "PRT", "O", "FRONT BUMPER"},
        {"G2", "Paint sundries", "PRT", std::nullopt, std::nullopt},
        {"L1", "NOT A PART", "LAB", "O", std::nullopt},
    };
  }

  void SetUp() override {
    cipher::SetFieldKeyText(kPartsTestFieldKey);
    runtime.Reset();
    BuildCatalogue(StandardParts(), StandardItems());
  }

  void TearDown() override {
    data::SetCatalogueDataObject(nullptr);
    data::SetCatalogueLocation("");
    cipher::ResetFieldKey();
    EXPECT_TRUE(runtime.UnhandledErrors().empty())
        << "a handler failed: " << runtime.UnhandledErrors().front().description;
    EXPECT_FALSE(host::gbPartsFormLoaded);
  }

  static data::Value Opt(const std::optional<std::string>& s) {
    return s ? data::Value(*s) : data::Value();
  }

  // The catalogue; `fill` may add rows of its own (models, raw parts).
  void BuildCatalogue(const std::vector<VehiclePart>& parts, const std::vector<GeneralItem>& items,
                      const std::function<void(data::tools::CatalogueWriter&)>& fill = {}) {
    const std::string path = dir.File("catalogue-" + std::to_string(++catalogues_) + ".db");
    data::tools::SqliteCatalogueWriter writer(path);
    WriteCatalogue(writer, parts, items);
    if (fill) fill(writer);
    writer.Commit();
    data::SetCatalogueLocation(path);
  }

  static void WriteCatalogue(data::tools::CatalogueWriter& writer,
                             const std::vector<VehiclePart>& parts,
                             const std::vector<GeneralItem>& items) {
    using data::Value;
    writer.Insert("ALLMODEL", {Value(int32_t{12}), Value("FORD"), Value("FALCON"), Value("XR6"),
                               Value(int16_t{2010}), Value(int16_t{2014}), Value("FA1"), Value(),
                               Value(), Value()});
    writer.Insert("ALLMODEL", {Value(int32_t{13}), Value("FORD"), Value("FOCUS"), Value(), Value(),
                               Value(), Value("FO1"), Value(), Value(), Value()});
    writer.Insert("cinfo", {Value(int16_t{2}), Value("Test catalogue"), Value("2024-01")});
    auto enciphered = [](const std::optional<std::string>& s) {
      if (!s) return Value();
      if (s->find_first_not_of(' ') == std::string::npos) return Value(*s); // blank
      return Value(cipher::EncryptField(*s));
    };
    for (const VehiclePart& p : parts)
      writer.Insert("VEHICLE_PART",
                    {Value(p.make), Value(p.catNo), Opt(p.bodyId),
                     p.state ? Value(int16_t(*p.state)) : Value(), Value(p.itemNo),
                     enciphered(p.name), Value(p.script), Opt(p.side), Value(int32_t(p.qty)),
                     p.unitcost ? Value(*p.unitcost) : Value(), enciphered(p.partNo),
                     enciphered(p.group)});
    for (const GeneralItem& i : items)
      writer.Insert("ITEM_2", {Value(i.itemNo), Value(i.script), Value(i.category), Opt(i.side),
                               Opt(i.group)});
  }

  void AddPart(const StoredPart& p) {
    data::Recordset& rs = *quote;
    rs.AddNew();
    rs.Collect("ITEMID", data::Value(int32_t(p.id)));
    rs.Collect("DELITEM", p.deleted ? data::Value(*p.deleted) : data::Value());
    rs.Collect("tag", Opt(p.tag));
    rs.Collect("qtnno", data::Value(qtnNo));
    rs.Collect("subquote", data::Value(subQuoteNo));
    rs.Collect("itemno", data::Value(p.itemNo));
    rs.Collect("script", data::Value(p.script));
    rs.Collect("Category", data::Value("PRT"));
    rs.Collect("side", data::Value(p.side));
    rs.Collect("mark", data::Value(p.mark));
    rs.Collect("qty", data::Value(p.qty));
    rs.Collect("unitcost", p.unitcost ? data::Value(*p.unitcost) : data::Value());
    rs.Collect("rrhour", p.rrhour ? data::Value(*p.rrhour) : data::Value());
    rs.Collect("partno", data::Value(p.partno));
    rs.Collect("report_on", data::Value(int16_t(p.report)));
    rs.Collect("Rev", Opt(p.rev));
  }

  // Marks the quote's records as stored (as a host's load leaves them, on
  // the first record).
  void Stored() { quote->AcceptChanges(); }

  // Opens the editor through CForms; `script` plays the user while it is
  // open (the form is closed by its close box if the script leaves it open).
  data::Value Open(EQuoteEditMode mode, std::function<void(parts::frmParts&)> script = {}) {
    runtime.QueueModal([script](forms::Form& f) {
      if (script) script(static_cast<parts::frmParts&>(f));
    });
    return forms.ShowPartsForm(quote, qtnNo, subQuoteNo, make, modelId, bodyId, newMarkup,
                               usedMarkup, recoreMarkup, afterMarketMarkup, oldNewMarkup,
                               oldUsedMarkup, oldRecoreMarkup, oldAfterMarketMarkup, mode);
  }

  // The texts of a grid row, '|'-separated.
  static std::string RowText(const grid::FlexGrid& g, int row, int lastCol = -1) {
    std::string out;
    const int last = lastCol < 0 ? g.Cols() - 1 : lastCol;
    for (int c = 0; c <= last; ++c) {
      if (c) out += '|';
      out += g.TextMatrix(row, c);
    }
    return out;
  }

  // The quote's live records, sorted, as
  // "itemno|script|side|mark|qty|unitcost|rrhour|partno|report_on|Rev|tag".
  std::vector<std::string> Records() {
    std::vector<std::string> out;
    data::Recordset& rs = *quote;
    if (rs.RecordCount() == 0) return out;
    for (rs.MoveFirst(); !rs.Eof(); rs.MoveNext()) {
      std::string r;
      for (const char* f : {"itemno", "script", "side", "mark", "qty", "unitcost", "rrhour",
                            "partno", "report_on", "Rev", "tag"}) {
        if (!r.empty()) r += '|';
        const data::Value& v = rs.Collect(f);
        r += v.IsNull() ? std::string("<Null>") : v.ToText();
      }
      out.push_back(r);
    }
    // Sorted, as the editor leaves the record set sorted; the cursor goes
    // back to the first record, where a host's load leaves it.
    std::sort(out.begin(), out.end());
    rs.MoveFirst();
    return out;
  }

  int Messages(const std::string& prompt) const {
    int n = 0;
    for (const auto& m : runtime.Messages())
      n += m.prompt == prompt;
    return n;
  }

private:
  int catalogues_ = 0;
};

} // namespace belvane::test
