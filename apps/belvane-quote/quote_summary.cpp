#include "quote_summary.hpp"

#include "text/number.hpp"
#include "text/strings.hpp"

namespace belvane::quote {

std::string Hours(double value) { return text::FormatNumber(value, text::kHours); }

QuoteSummary StoredSummary(data::QuoteStore& store, const std::string& qtnno) {
  const auto header = store.GetQuote(qtnno);
  if (!header) return {};
  data::RecordsetPtr items = store.LoadItems(qtnno, data::ItemKind::Labour);
  return Summarize(*items, *header);
}

QuoteSummary Summarize(data::Recordset& items, const data::QuoteHeader& quote) {
  QuoteSummary summary;
  if (items.RecordCount() == 0) return summary;
  for (items.MoveFirst(); !items.Eof(); items.MoveNext()) {
    const data::Value& deleted = items.Collect("DELITEM");
    if ((!deleted.IsNull() && deleted.ToBool()) || items.Collect("tag").ToText() == "D") continue;
    const std::string category = items.Collect("Category").ToText();
    SummaryLine line;
    const char* hoursField = nullptr;
    double defaultRate = 0;
    if (category == "R&R") {
      line.category = kRemoveReplace;
      hoursField = "rrhour";
      defaultRate = quote.rrRate;
    } else if (category == "RA") {
      line.category = kRepair;
      hoursField = "rahour";
      defaultRate = quote.raRate;
    } else if (category == "PAINT") {
      line.category = kPaint;
      hoursField = "pthour";
      defaultRate = quote.ptRate;
    } else {
      continue;
    }
    const data::Value& hours = items.Collect(hoursField);
    const data::Value& rate = items.Collect("rr_rate2");
    const data::Value& report = items.Collect("report_on");
    line.itemNo = items.Collect("itemno").ToText();
    line.description = items.Collect("script").ToText();
    line.hours = hours.IsNull() ? 0 : hours.ToDouble();
    line.rate = category == "R&R" && !rate.IsNull() ? rate.ToDouble() : defaultRate;
    line.reportOnly = !report.IsNull() && report.ToInt32() == 1;
    if (!line.reportOnly) {
      line.amount = line.hours * line.rate;
      summary.hours[line.category] += line.hours;
      summary.amounts[line.category] += line.amount;
    }
    summary.lines.push_back(std::move(line));
  }
  return summary;
}

std::string PartTypeName(const std::string& letter) {
  const std::string t = text::UCase(text::Trim(letter));
  if (t.empty()) return "New";
  if (t == "U") return "Used";
  if (t == "X") return "Exchange";
  if (t == "C") return "Recore";
  if (t == "A") return "After market";
  return t;
}

PartsSummary SummarizeParts(data::Recordset& items) {
  PartsSummary summary;
  if (items.RecordCount() == 0) return summary;
  auto number = [&items](const char* field) {
    const data::Value& v = items.Collect(field);
    return v.IsNull() ? 0.0 : v.ToDouble();
  };
  for (items.MoveFirst(); !items.Eof(); items.MoveNext()) {
    const data::Value& deleted = items.Collect("DELITEM");
    if ((!deleted.IsNull() && deleted.ToBool()) || items.Collect("tag").ToText() == "D") continue;
    if (items.Collect("Category").ToText() != "PRT") continue;
    PartLine line;
    line.itemNo = items.Collect("itemno").ToText();
    line.description = items.Collect("script").ToText();
    line.type = PartTypeName(items.Collect("mark").ToText());
    line.qty = number("qty");
    line.unitCost = number("unitcost");
    line.price = number("rrhour");
    const data::Value& report = items.Collect("report_on");
    line.reportOnly = !report.IsNull() && report.ToInt32() == 1;
    if (!line.reportOnly) {
      line.cost = line.qty * line.unitCost;
      line.sell = line.qty * line.price;
      summary.cost += line.cost;
      summary.sell += line.sell;
    }
    summary.lines.push_back(std::move(line));
  }
  return summary;
}

PartsSummary StoredPartsSummary(data::QuoteStore& store, const std::string& qtnno) {
  if (!store.GetQuote(qtnno)) return {};
  data::RecordsetPtr items = store.LoadItems(qtnno, data::ItemKind::Parts);
  return SummarizeParts(*items);
}

} // namespace belvane::quote
