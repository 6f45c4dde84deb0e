#pragma once
// Criteria texts of Find and Filter: "FIELD op value", where op is one of
// = <> < > <= >= LIKE, and value is a number, True, False, a 'quoted text' (a quote
// inside is doubled), a #text# or Null. Filter joins such comparisons with
// AND and OR (AND binds tighter) and groups them with parentheses. Field
// names may be written [in brackets]. LIKE takes * or % for any run of
// characters and _ or ? for one, and compares without regard to case.

#include "data/value.hpp"

#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace belvane::data {

enum class CompareOp { Eq, Ne, Lt, Gt, Le, Ge, Like };

struct Comparison {
  std::string field;
  CompareOp op = CompareOp::Eq;
  Value value; // Null for "= Null" / "IS NULL"
};

// A parsed criteria expression: comparisons joined by AND / OR.
struct CriteriaNode {
  enum class Kind { Compare, And, Or } kind = Kind::Compare;
  Comparison cmp;
  std::unique_ptr<CriteriaNode> left, right;
};

// Parses a single comparison (Find). Raises error 3001 on a malformed text.
Comparison ParseComparison(std::string_view criteria);
// Parses a full filter expression. Raises error 3001 on a malformed text.
std::unique_ptr<CriteriaNode> ParseCriteria(std::string_view criteria);

// True when the field value satisfies the comparison. A Null field matches
// only "= Null"; a value that cannot be compared (a text against a number
// that is not numeric) compares as texts.
bool Matches(const Comparison& cmp, const Value& fieldValue);
bool LikeMatch(std::string_view textValue, std::string_view pattern);

} // namespace belvane::data
