#include "sample_quotes.hpp"

#include "data/catalogue.hpp"
#include "text/strings.hpp"

#include <array>
#include <string>
#include <vector>

namespace belvane::quote {

namespace {

struct Plan {
  const char* qtnno;
  const char* customer;
  const char* schedType;
  double rrRate, raRate, ptRate;
  bool defaultSched, insurerChanged;
  int lines; // labour lines taken from the schedule
};

constexpr std::array<Plan, 4> kPlans{{
    {"Q1001", "J. Whitlow", "NRMA", 55, 60, 65, false, false, 3},
    {"Q1002", "Harbour Fleet Services", "MTA", 58, 58, 62, true, false, 1},
    {"Q1003", "R. Okafor", "3RD", 52, 56, 60, false, true, 0},
    {"Q1004", "Coastline Insurance", "CP", 60, 64, 70, false, false, 2},
}};

std::string Text(const data::Recordset& rs, const char* field) {
  return text::Trim(rs.Collect(field).ToText());
}

// Adds the records of one labour line: one per operation the item allows.
void AddLine(data::Recordset& items, const data::QuoteHeader& quote, const std::string& itemNo,
             const std::string& script, int allow, int index) {
  struct Operation {
    int bit;
    const char* category;
    const char* hoursField;
    double rate;
  };
  const Operation operations[] = {{4, "R&R", "rrhour", quote.rrRate},
                                  {2, "RA", "rahour", quote.raRate},
                                  {1, "PAINT", "pthour", quote.ptRate}};
  for (const Operation& op : operations) {
    if (!(allow & op.bit)) continue;
    items.AddNew();
    items.Collect("DELITEM", data::Value(false));
    items.Collect("tag", data::Value("1"));
    items.Collect("qtnno", data::Value(quote.qtnno));
    items.Collect("subquote", data::Value(quote.subquote));
    items.Collect("itemno", data::Value(itemNo));
    items.Collect("script", data::Value(script));
    items.Collect("Category", data::Value(op.category));
    items.Collect(op.hoursField, data::Value(0.5 + 0.5 * (index + op.bit % 3)));
    items.Collect("report_on", data::Value(int16_t(0)));
    items.Collect("blend", data::Value(int16_t(0)));
    items.Collect("allow_tick", data::Value(std::to_string(allow)));
    items.Collect("rr_rate2", data::Value(op.rate));
    items.Collect("partno", data::Value(""));
  }
}

} // namespace

int AddSampleQuotes(data::QuoteStore& store) {
  if (!store.ListQuotes().empty()) return 0;
  auto catalogue = data::Catalogue();
  data::RecordsetPtr models = catalogue->OpenRecordset(
      "SELECT MODEL_ID, MAKE, MODEL, SERIES, YEAR_FROM, NRMA_ID, MTA_ID, THIRD_ID FROM ALLMODEL "
      "ORDER BY MODEL_ID");
  int written = 0;
  for (const Plan& plan : kPlans) {
    if (models->Eof()) break;
    data::QuoteHeader quote;
    quote.qtnno = plan.qtnno;
    quote.customer = plan.customer;
    quote.make = Text(*models, "MAKE");
    quote.modelId = Text(*models, "MODEL_ID");
    quote.schedId = Text(*models, "NRMA_ID");
    quote.mtaId = Text(*models, "MTA_ID");
    quote.thirdId = Text(*models, "THIRD_ID");
    quote.schedType = plan.schedType;
    quote.rrRate = plan.rrRate;
    quote.raRate = plan.raRate;
    quote.ptRate = plan.ptRate;
    quote.defaultSched = plan.defaultSched;
    quote.insurerChanged = plan.insurerChanged;
    data::RecordsetPtr bodies = catalogue->OpenRecordset(
        "SELECT BODY_ID, BODY FROM BODY WHERE MODEL_ID = " +
        std::to_string(models->Collect("MODEL_ID").ToInt32()) + " ORDER BY BODY_ID");
    std::string body;
    if (!bodies->Eof()) {
      quote.bodyId = Text(*bodies, "BODY_ID");
      body = Text(*bodies, "BODY");
    }
    quote.vehicle = Text(*models, "YEAR_FROM") + " " + quote.make + " " + Text(*models, "MODEL") +
                    " " + Text(*models, "SERIES") + " " + body;
    quote.vehicle = text::Trim(quote.vehicle);
    store.SaveQuote(quote);

    if (plan.lines > 0) {
      data::RecordsetPtr schedule;
      catalogue->GetLabourItems(schedule, data::kScheduleNrma, quote.schedId, quote.mtaId,
                                quote.bodyId);
      data::RecordsetPtr items = data::QuoteStore::NewItemRecordset();
      int added = 0;
      for (; !schedule->Eof() && added < plan.lines; schedule->MoveNext()) {
        const data::Value& mask = schedule->Collect("allow_tick");
        const int allow = mask.IsNull() ? 7 : mask.ToInt32();
        const std::string script = Text(*schedule, "Script");
        if (allow == 0 || script.empty()) continue;
        AddLine(*items, quote, Text(*schedule, "ItemNo"), script, allow, added++);
      }
      store.SaveItems(quote.qtnno, *items);
    }
    ++written;
    models->MoveNext();
  }
  return written;
}

} // namespace belvane::quote
