#pragma once
// Criteria texts of Find and Filter: "FIELD op value", where op is one of
// = <> < > <= >= LIKE, and value is a number, True, False, a 'quoted text' (a quote
// inside is doubled), a #text# or Null. Filter joins such comparisons with
// AND and OR (AND binds tighter) and groups them with parentheses. Field
// names may be written [in brackets]. LIKE takes * or % for any run of
// characters and _ or ? for one, and compares without regard to case.
//
// Criteria texts come from outside (a host, a user's search text), so the
// parser and the matcher stay within fixed bounds whatever they are given:
// parentheses nest at most kMaxCriteriaNesting deep, a run of comparisons
// joined by AND or OR becomes one node with many children (not a deep
// chain), and LIKE runs in time proportional to the value times the pattern
// at worst, never exponential.

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

// How deep parentheses may nest in a criteria text.
inline constexpr int kMaxCriteriaNesting = 100;

// A parsed criteria expression: a comparison, or comparisons and groups
// joined by AND / OR. An And or Or node holds two or more children; its
// depth is bounded by the nesting of parentheses.
struct CriteriaNode {
  enum class Kind { Compare, And, Or } kind = Kind::Compare;
  Comparison cmp;
  std::vector<CriteriaNode> children;
};

// Parses a single comparison (Find). Raises error 3001 on a malformed text.
Comparison ParseComparison(std::string_view criteria);
// Parses a full filter expression. Raises error 3001 on a malformed text,
// parentheses nested deeper than kMaxCriteriaNesting included.
CriteriaNode ParseCriteria(std::string_view criteria);

// True when the field value satisfies the comparison. A Null field matches
// only "= Null"; a value that cannot be compared (a text against a number
// that is not numeric) compares as texts.
bool Matches(const Comparison& cmp, const Value& fieldValue);
// LIKE, without regard to case; wildcards as above.
bool LikeMatch(std::string_view textValue, std::string_view pattern);

} // namespace belvane::data
