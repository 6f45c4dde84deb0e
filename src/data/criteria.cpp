#include "data/criteria.hpp"

#include "text/error.hpp"
#include "text/number.hpp"
#include "text/strings.hpp"

#include <algorithm>
#include <cctype>
#include <cmath>
#include <cstdint>

namespace belvane::data {

namespace {

// How much of a criteria text an error quotes: enough to recognise it.
constexpr size_t kQuotedCriteriaChars = 200;

[[noreturn]] void Malformed(std::string_view criteria, std::string_view why) {
  size_t cut = std::min(criteria.size(), kQuotedCriteriaChars);
  while (cut > 0 && cut < criteria.size() &&
         (static_cast<unsigned char>(criteria[cut]) & 0xC0) == 0x80)
    --cut; // whole characters only
  std::string quoted(criteria.substr(0, cut));
  if (criteria.size() > kQuotedCriteriaChars)
    quoted += "... (" + std::to_string(criteria.size()) + " characters)";
  throw Error(err::kBadArguments, "Malformed criteria \"" + quoted + "\": " + std::string(why),
              "Belvane.Recordset");
}

class Parser {
public:
  explicit Parser(std::string_view s) : s_(s) {}

  // A run of comparisons joined by OR (or by AND) becomes one node whose
  // children are the operands, so a long run costs no depth.
  CriteriaNode ParseOr() {
    CriteriaNode first = ParseAnd();
    if (!Keyword("OR")) return first;
    CriteriaNode node;
    node.kind = CriteriaNode::Kind::Or;
    node.children.push_back(std::move(first));
    do {
      node.children.push_back(ParseAnd());
    } while (Keyword("OR"));
    return node;
  }

  CriteriaNode ParseAnd() {
    CriteriaNode first = ParsePrimary();
    if (!Keyword("AND")) return first;
    CriteriaNode node;
    node.kind = CriteriaNode::Kind::And;
    node.children.push_back(std::move(first));
    do {
      node.children.push_back(ParsePrimary());
    } while (Keyword("AND"));
    return node;
  }

  CriteriaNode ParsePrimary() {
    SkipBlanks();
    if (Peek() == '(') {
      if (++depth_ > kMaxCriteriaNesting)
        Malformed(s_,
                  "parentheses nest more than " + std::to_string(kMaxCriteriaNesting) + " deep");
      ++pos_;
      CriteriaNode inner = ParseOr();
      SkipBlanks();
      if (Peek() != ')') Malformed(s_, "missing ')'");
      ++pos_;
      --depth_;
      return inner;
    }
    CriteriaNode node;
    node.cmp = ParseComparisonHere();
    return node;
  }

  Comparison ParseComparisonHere() {
    Comparison c;
    c.field = ParseFieldName();
    SkipBlanks();
    if (Keyword("IS")) {
      bool negate = Keyword("NOT");
      if (!Keyword("NULL")) Malformed(s_, "expected NULL after IS");
      c.op = negate ? CompareOp::Ne : CompareOp::Eq;
      c.value = Value();
      return c;
    }
    c.op = ParseOperator();
    c.value = ParseLiteral();
    if (c.op == CompareOp::Like && !c.value.TextIf()) Malformed(s_, "LIKE needs a quoted pattern");
    return c;
  }

  bool AtEnd() {
    SkipBlanks();
    return pos_ >= s_.size();
  }

private:
  char Peek() const { return pos_ < s_.size() ? s_[pos_] : '\0'; }

  void SkipBlanks() {
    while (pos_ < s_.size() && (s_[pos_] == ' ' || s_[pos_] == '\t'))
      ++pos_;
  }

  // Consumes a keyword followed by a non-identifier character.
  bool Keyword(std::string_view kw) {
    SkipBlanks();
    if (s_.size() - pos_ < kw.size()) return false;
    for (size_t i = 0; i < kw.size(); ++i) {
      if (std::toupper(static_cast<unsigned char>(s_[pos_ + i])) != kw[i]) return false;
    }
    size_t after = pos_ + kw.size();
    if (after < s_.size() &&
        (std::isalnum(static_cast<unsigned char>(s_[after])) || s_[after] == '_'))
      return false;
    pos_ = after;
    return true;
  }

  std::string ParseFieldName() {
    SkipBlanks();
    if (Peek() == '[') {
      size_t end = s_.find(']', pos_);
      if (end == std::string_view::npos) Malformed(s_, "missing ']'");
      std::string name(s_.substr(pos_ + 1, end - pos_ - 1));
      pos_ = end + 1;
      if (name.empty()) Malformed(s_, "empty field name");
      return name;
    }
    size_t start = pos_;
    while (pos_ < s_.size() && (std::isalnum(static_cast<unsigned char>(s_[pos_])) ||
                                s_[pos_] == '_' || s_[pos_] == '&'))
      ++pos_;
    if (pos_ == start) Malformed(s_, "expected a field name");
    return std::string(s_.substr(start, pos_ - start));
  }

  CompareOp ParseOperator() {
    SkipBlanks();
    auto rest = s_.substr(pos_);
    auto take = [&](size_t n, CompareOp op) {
      pos_ += n;
      return op;
    };
    if (rest.starts_with("<=")) return take(2, CompareOp::Le);
    if (rest.starts_with(">=")) return take(2, CompareOp::Ge);
    if (rest.starts_with("<>")) return take(2, CompareOp::Ne);
    if (rest.starts_with("=")) return take(1, CompareOp::Eq);
    if (rest.starts_with("<")) return take(1, CompareOp::Lt);
    if (rest.starts_with(">")) return take(1, CompareOp::Gt);
    if (Keyword("LIKE")) return CompareOp::Like;
    Malformed(s_, "expected an operator (=, <>, <, >, <=, >=, LIKE)");
  }

  Value ParseLiteral() {
    SkipBlanks();
    char q = Peek();
    if (q == '\'' || q == '#') {
      std::string out;
      ++pos_;
      while (true) {
        if (pos_ >= s_.size()) Malformed(s_, "unterminated quoted value");
        char c = s_[pos_++];
        if (c == q) {
          if (q == '\'' && Peek() == '\'') {
            out.push_back('\'');
            ++pos_;
            continue;
          }
          break;
        }
        out.push_back(c);
      }
      return Value(std::move(out));
    }
    if (Keyword("NULL")) return Value();
    if (Keyword("TRUE")) return Value(true);
    if (Keyword("FALSE")) return Value(false);
    size_t start = pos_;
    while (pos_ < s_.size() &&
           (std::isdigit(static_cast<unsigned char>(s_[pos_])) || s_[pos_] == '.' ||
            s_[pos_] == '-' || s_[pos_] == '+' || s_[pos_] == 'e' || s_[pos_] == 'E'))
      ++pos_;
    std::string num(s_.substr(start, pos_ - start));
    if (num.empty()) Malformed(s_, "expected a value");
    // Criteria numbers are written with "." whatever the user's locale.
    text::ScopedNumberLocale c({".", ","});
    auto n = text::ParseNumber(num);
    if (!n) Malformed(s_, "\"" + num + "\" is not a number");
    // A whole number within 32 bits is an Integer; any other number (a
    // fraction, or too large for 32 bits) is a Double.
    const double d = *n;
    if (num.find('.') == std::string::npos && d >= INT32_MIN && d <= INT32_MAX &&
        d == std::trunc(d))
      return Value(static_cast<int32_t>(d));
    return Value(d);
  }

  std::string_view s_;
  size_t pos_ = 0;
  int depth_ = 0;
};

bool IsAnyRun(char c) { return c == '*' || c == '%'; }
bool IsAnyOne(char c) { return c == '_' || c == '?'; }

// Wildcard matching without recursion: on a mismatch only the most recent
// run wildcard is widened by one character, which is enough because a later
// run can absorb whatever an earlier one would have. At worst the value is
// scanned once per pattern character.
bool LikeAt(std::string_view t, std::string_view p) {
  size_t ti = 0, pi = 0;
  size_t runP = std::string_view::npos, runT = 0;
  while (ti < t.size()) {
    if (pi < p.size() && IsAnyRun(p[pi])) {
      runP = ++pi;
      runT = ti;
    } else if (pi < p.size() && (IsAnyOne(p[pi]) || p[pi] == t[ti])) {
      ++ti;
      ++pi;
    } else if (runP != std::string_view::npos) {
      pi = runP;
      ti = ++runT;
    } else {
      return false;
    }
  }
  while (pi < p.size() && IsAnyRun(p[pi]))
    ++pi;
  return pi == p.size();
}

} // namespace

Comparison ParseComparison(std::string_view criteria) {
  Parser p(criteria);
  Comparison c = p.ParseComparisonHere();
  if (!p.AtEnd()) Malformed(criteria, "unexpected text after the comparison");
  return c;
}

CriteriaNode ParseCriteria(std::string_view criteria) {
  Parser p(criteria);
  CriteriaNode node = p.ParseOr();
  if (!p.AtEnd()) Malformed(criteria, "unexpected text");
  return node;
}

bool LikeMatch(std::string_view textValue, std::string_view pattern) {
  std::string t = text::UCase(textValue), p = text::UCase(pattern);
  return LikeAt(t, p);
}

bool Matches(const Comparison& cmp, const Value& fieldValue) {
  if (cmp.value.IsNull() || fieldValue.IsNull()) {
    bool bothNull = cmp.value.IsNull() && fieldValue.IsNull();
    if (cmp.op == CompareOp::Eq) return bothNull;
    if (cmp.op == CompareOp::Ne) return cmp.value.IsNull() != fieldValue.IsNull();
    return false;
  }
  if (cmp.op == CompareOp::Like) return LikeMatch(fieldValue.ToText(), *cmp.value.TextIf());
  auto order = CompareValues(fieldValue, cmp.value);
  switch (cmp.op) {
  case CompareOp::Eq:
    return order == 0;
  case CompareOp::Ne:
    return order != 0;
  case CompareOp::Lt:
    return order < 0;
  case CompareOp::Gt:
    return order > 0;
  case CompareOp::Le:
    return order <= 0;
  case CompareOp::Ge:
    return order >= 0;
  case CompareOp::Like:
    break;
  }
  return false;
}

} // namespace belvane::data
