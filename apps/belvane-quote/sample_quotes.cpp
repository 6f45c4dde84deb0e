#include "sample_quotes.hpp"

#include "cipher/field.hpp"
#include "data/catalogue.hpp"
#include "text/strings.hpp"

#include <array>
#include <cmath>
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
  int parts; // parts taken from the vehicle's parts catalogue
};

constexpr std::array<Plan, 4> kPlans{{
    {"Q1001", "J. Whitlow", "NRMA", 55, 60, 65, false, false, 3, 5},
    {"Q1002", "Harbour Fleet Services", "MTA", 58, 58, 62, true, false, 1, 3},
    {"Q1003", "R. Okafor", "3RD", 52, 56, 60, false, true, 0, 0},
    {"Q1004", "Coastline Insurance", "CP", 60, 64, 70, false, false, 2, 2},
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

// The markups of the sample quotes: the four in force and the four before
// them (recore unchanged).
void SetMarkups(data::QuoteHeader& quote) {
  quote.newMarkup = 30;
  quote.usedMarkup = 20;
  quote.recoreMarkup = 15;
  quote.afterMarketMarkup = 35;
  quote.oldNewMarkup = 25;
  quote.oldUsedMarkup = 18;
  quote.oldRecoreMarkup = 15;
  quote.oldAfterMarketMarkup = 30;
}

// Adds `count` parts of the vehicle's catalogue, one of each part type in
// turn (new, used, exchange, recore, after-market). Every other part is
// priced with the markup before the current one, as a quote made before the
// markups changed: the parts editor shows those repriced.
void AddParts(data::Recordset& items, const data::QuoteHeader& quote, const std::string& catNo,
              int count) {
  if (count <= 0) return;
  auto catalogue = data::Catalogue();
  data::RecordsetPtr cinfo = catalogue->OpenRecordset("select * from cinfo");
  const int16_t state = cinfo->Eof() ? int16_t{0} : cinfo->Collect("State").ToInt16();
  data::RecordsetPtr parts;
  catalogue->GetVehicleParts(parts, quote.make, catNo, quote.bodyId, state);
  if (!parts) return;
  struct Type {
    const char* letter;
    double markup, oldMarkup;
  };
  const Type types[] = {{"", quote.newMarkup, quote.oldNewMarkup},
                        {"U", quote.usedMarkup, quote.oldUsedMarkup},
                        {"X", quote.usedMarkup, quote.oldUsedMarkup},
                        {"C", quote.recoreMarkup, quote.oldRecoreMarkup},
                        {"A", quote.afterMarketMarkup, quote.oldAfterMarketMarkup}};
  int added = 0;
  for (; !parts->Eof() && added < count; parts->MoveNext()) {
    const data::Value& cost = parts->Collect("unitcost");
    const double unitCost = cost.IsNull() ? 0 : cost.ToDouble();
    if (unitCost <= 0) continue;
    const std::string name = Text(*parts, "PARTNAME");
    const std::string script = name.empty() ? Text(*parts, "Script") : cipher::DecryptField(name);
    const std::string partNo = Text(*parts, "partno");
    const Type& type = types[added % 5];
    const double markup = added % 2 ? type.oldMarkup : type.markup;
    items.AddNew();
    items.Collect("DELITEM", data::Value(false));
    items.Collect("tag", data::Value("1"));
    items.Collect("qtnno", data::Value(quote.qtnno));
    items.Collect("subquote", data::Value(quote.subquote));
    items.Collect("Category", data::Value("PRT"));
    items.Collect("itemno", data::Value(Text(*parts, "ItemNo")));
    items.Collect("script", data::Value(script));
    items.Collect("side", parts->Collect("SIDE"));
    items.Collect("mark", data::Value(type.letter));
    items.Collect("qty", data::Value(1.0 + added % 2));
    items.Collect("unitcost", data::Value(unitCost));
    items.Collect("rrhour", data::Value(std::round(unitCost * (1 + markup / 100) * 1000) / 1000));
    items.Collect("partno", data::Value(partNo.empty() ? partNo : cipher::DecryptField(partNo)));
    items.Collect("report_on", data::Value(int16_t(0)));
    ++added;
  }
}

} // namespace

int AddSampleQuotes(data::QuoteStore& store) {
  if (!store.ListQuotes().empty()) return 0;
  auto catalogue = data::Catalogue();
  data::RecordsetPtr models = catalogue->OpenRecordset(
      "SELECT MODEL_ID, MAKE, MODEL, SERIES, YEAR_FROM, cat_no, NRMA_ID, MTA_ID, THIRD_ID FROM "
      "ALLMODEL "
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
    SetMarkups(quote);
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

    data::RecordsetPtr items = data::QuoteStore::NewItemRecordset();
    AddParts(*items, quote, Text(*models, "cat_no"), plan.parts);
    if (plan.lines > 0) {
      data::RecordsetPtr schedule;
      catalogue->GetLabourItems(schedule, data::kScheduleNrma, quote.schedId, quote.mtaId,
                                quote.bodyId);
      int added = 0;
      for (; !schedule->Eof() && added < plan.lines; schedule->MoveNext()) {
        const data::Value& mask = schedule->Collect("allow_tick");
        const int allow = mask.IsNull() ? 7 : mask.ToInt32();
        const std::string script = Text(*schedule, "Script");
        if (allow == 0 || script.empty()) continue;
        AddLine(*items, quote, Text(*schedule, "ItemNo"), script, allow, added++);
      }
    }
    store.SaveItems(quote.qtnno, *items);
    ++written;
    models->MoveNext();
  }
  return written;
}

} // namespace belvane::quote
