#pragma once
// The labour editor under test: a small SQLite catalogue built by the test,
// a quote record set, and the editor opened through CForms with a scripted
// user.

#include "../data/temp_dir.hpp"
#include "cipher/field.hpp"
#include "data/catalogue.hpp"
#include "data/quote_store.hpp"
#include "data/tools/catalogue_writer.hpp"
#include "entry/cforms.hpp"
#include "forms/runtime.hpp"
#include "forms/simulated_user.hpp"
#include "labour/frm_labour.hpp"
#include "text/error.hpp"

#include <gtest/gtest.h>

#include <functional>
#include <optional>
#include <string>
#include <vector>

namespace belvane::test {

// A field key of the tests' own (72 hexadecimal digits).
inline constexpr const char* kTestFieldKey =
    "0123456789ABCDEF0F1E2D3C4B5A69788796A5B4C3D2E1F0FEDCBA987654321000112233";

// One labour item of a schedule.
struct CatalogueItem {
  int schedule;
  std::string schedId;
  std::string itemNo;
  std::string script;
  std::optional<std::string> rr; // as stored: a number, or enciphered text
  std::optional<std::string> pt;
  int allow;
  std::string bodyId = "";
};

class LabourFixture : public ::testing::Test {
protected:
  // The quote's context, as a host passes it.
  std::string schedType = "NRMA";
  std::string quoteNo = "Q1001", subQuoteNo = "0";
  std::string make = "FORD", modelId = "12", bodyId = "B1";
  std::string schedId = "N1", mtaId = "M1", thirdId = "T1";
  double rrRate = 55, raRate = 60, ptRate = 65;
  bool defaultSched = false, insurerChanged = false;

  TempDir dir{"labour"};
  data::RecordsetPtr quote = data::QuoteStore::NewItemRecordset();
  forms::HeadlessRuntime& runtime = forms::ThreadHeadlessRuntime();
  forms::SimulatedUser user;
  CForms forms;

  // The catalogue every test starts with, unless it replaces it.
  static std::vector<CatalogueItem> StandardItems() {
    return {
        {0, "N1", "100", "BONNET R&I", "1.5", "0.8", 7},
        {0, "N1", "110", "FRONT BUMPER BAR", cipher::EncryptField("2.25"),
         cipher::EncryptField("1,234.5"), 5},
        {0, "N1", "120", "L/H FRONT GUARD", "1", "2", 1},
        {0, "N1", "130", "", "0.5", "0.5", 7},
        {0, "N1", "140", "Roof panel", "3", "4", 6},
        {1, "M1", "200", "MTA WINDSCREEN", "2", "", 4},
        {3, "N1", "300", "CP DOOR SKIN", "1.2", "1.4", 7},
    };
  }

  void SetUp() override {
    cipher::SetFieldKeyText(kTestFieldKey);
    runtime.Reset();
    BuildCatalogue(StandardItems());
  }

  void TearDown() override {
    data::SetCatalogueDataObject(nullptr);
    data::SetCatalogueLocation("");
    cipher::ResetFieldKey();
    EXPECT_TRUE(runtime.UnhandledErrors().empty())
        << "a handler failed: " << runtime.UnhandledErrors().front().description;
  }

  void BuildCatalogue(const std::vector<CatalogueItem>& items) {
    const std::string path = dir.File("catalogue-" + std::to_string(++catalogues_) + ".db");
    data::tools::SqliteCatalogueWriter writer(path);
    for (const auto& it : items) {
      writer.Insert("LABOUR_ITEM",
                    {data::Value(int16_t(it.schedule)), data::Value(it.schedId),
                     it.bodyId.empty() ? data::Value() : data::Value(it.bodyId),
                     data::Value(it.itemNo), data::Value(it.script),
                     it.rr ? data::Value(*it.rr) : data::Value(),
                     it.pt ? data::Value(*it.pt) : data::Value(), data::Value(int16_t(it.allow))});
    }
    writer.Commit();
    data::SetCatalogueLocation(path);
  }

  // Adds a stored labour record to the quote.
  void AddRecord(int id, const std::string& itemNo, const std::string& script,
                 const std::string& category, std::optional<double> hours, int report = 0,
                 std::optional<double> rate = std::nullopt, const std::string& allow = "7",
                 const std::string& tag = "1", bool deleted = false) {
    data::Recordset& rs = *quote;
    rs.AddNew();
    rs.Collect("ITEMID", data::Value(id));
    rs.Collect("DELITEM", data::Value(deleted));
    rs.Collect("tag", data::Value(tag));
    rs.Collect("qtnno", data::Value(quoteNo));
    rs.Collect("subquote", data::Value(subQuoteNo));
    rs.Collect("itemno", data::Value(itemNo));
    rs.Collect("script", data::Value(script));
    rs.Collect("Category", data::Value(category));
    const char* field = category == "R&R" ? "rrhour" : category == "RA" ? "rahour" : "pthour";
    rs.Collect(field, hours ? data::Value(*hours) : data::Value());
    rs.Collect("report_on", data::Value(int16_t(report)));
    rs.Collect("blend", data::Value(int16_t(0)));
    rs.Collect("allow_tick", data::Value(allow));
    rs.Collect("rr_rate2", rate ? data::Value(*rate) : data::Value(rrRate));
    rs.Collect("partno", data::Value(""));
  }

  // Marks the quote's records as stored (as a host's load leaves them).
  void Stored() { quote->AcceptChanges(); }

  // Opens the editor through CForms; `script` plays the user while it is
  // open (the form is closed by its close box if the script leaves it open).
  long Open(EQuoteEditMode mode, std::function<void(labour::frmLabour&)> script = {}) {
    runtime.QueueModal([script](forms::Form& f) {
      if (script) script(static_cast<labour::frmLabour&>(f));
    });
    return forms.ShowLabourForm(quote, schedType, quoteNo, subQuoteNo, make, modelId, bodyId,
                                schedId, mtaId, thirdId, rrRate, raRate, ptRate, defaultSched,
                                insurerChanged, mode);
  }

  // The texts of a grid row, tab-separated.
  static std::string RowText(const grid::FlexGrid& g, int row) {
    std::string out;
    for (int c = 0; c < g.Cols(); ++c) {
      if (c) out += '|';
      out += g.TextMatrix(row, c);
    }
    return out;
  }

  // The quote's records (in record set order) as "itemno Category hours".
  std::vector<std::string> Records() {
    std::vector<std::string> out;
    data::Recordset& rs = *quote;
    if (rs.RecordCount() == 0) return out;
    for (rs.MoveFirst(); !rs.Eof(); rs.MoveNext()) {
      const std::string cat = rs.Collect("Category").ToText();
      const char* field = cat == "R&R" ? "rrhour" : cat == "RA" ? "rahour" : "pthour";
      out.push_back(rs.Collect("itemno").ToText() + " " + cat + " " + rs.Collect(field).ToText());
    }
    return out;
  }

private:
  int catalogues_ = 0;
};

} // namespace belvane::test
