#pragma once
// What the demo host shows of a quote: its labour lines, one per record,
// and the hours and amounts per category; its parts with their cost, price
// with markup and margin. A line's amount is its hours at
// its rate (the R&R rate the line carries, else the quote's rate of the
// category); report-only lines are listed but not charged.

#include "data/quote_store.hpp"
#include "data/recordset.hpp"

#include <array>
#include <string>
#include <vector>

namespace belvane::quote {

enum Category { kRemoveReplace = 0, kRepair = 1, kPaint = 2 };
inline constexpr std::array<const char*, 3> kCategoryNames{"R&R", "Repair", "Paint"};

struct SummaryLine {
  std::string itemNo;
  std::string description;
  Category category = kRemoveReplace;
  double hours = 0;
  double rate = 0;
  double amount = 0; // 0 for a report-only line
  bool reportOnly = false;
};

struct QuoteSummary {
  std::vector<SummaryLine> lines;
  std::array<double, 3> hours{};
  std::array<double, 3> amounts{};
  double TotalHours() const { return hours[0] + hours[1] + hours[2]; }
  double TotalAmount() const { return amounts[0] + amounts[1] + amounts[2]; }
};

// The labour records of `items` that are not deleted, in the record set's
// order.
QuoteSummary Summarize(data::Recordset& items, const data::QuoteHeader& quote);

// The quote's labour lines as stored now (empty for no such quote).
QuoteSummary StoredSummary(data::QuoteStore& store, const std::string& qtnno);

// One part of the quote: its price with markup is the record's rrhour, the
// line's cost and sell are the quantity at the unit cost and at that price.
struct PartLine {
  std::string itemNo;
  std::string description;
  std::string type; // "New", "Used", "Exchange", "Recore", "After market"
  double qty = 0;
  double unitCost = 0;
  double price = 0;
  double cost = 0; // 0 for a report-only part
  double sell = 0; // 0 for a report-only part
  bool reportOnly = false;
};

struct PartsSummary {
  std::vector<PartLine> lines;
  double cost = 0;
  double sell = 0;
  double Margin() const { return sell - cost; }
};

// The name of a part-type letter ("", "U", "X", "C", "A").
std::string PartTypeName(const std::string& letter);
// The parts records of `items` that are not deleted, in the record set's
// order.
PartsSummary SummarizeParts(data::Recordset& items);
// The quote's parts as stored now.
PartsSummary StoredPartsSummary(data::QuoteStore& store, const std::string& qtnno);

// "2.50" and "1,234.50": hours and amounts as the editors show them.
std::string Hours(double value);

} // namespace belvane::quote
