// Criteria texts from outside: nesting, long runs of AND/OR, LIKE patterns
// that invite backtracking, and numbers at the edges stay within bounds and
// give the right answers.
#include "data/criteria.hpp"
#include "data/recordset.hpp"
#include "error_number.hpp"
#include "text/error.hpp"

#include <gtest/gtest.h>

#include <climits>
#include <random>

using namespace belvane;
using namespace belvane::data;
using belvane::test::ErrorNumber;

namespace {

// ITEMID 1..count, NAME "n1".."n<count>", AMOUNT a Double.
std::unique_ptr<Recordset> Numbered(int count) {
  auto rs = std::make_unique<Recordset>();
  rs->Fields().Append("ITEMID", DataType::Integer);
  rs->Fields().Append("NAME", DataType::VarWChar);
  rs->Fields().Append("AMOUNT", DataType::Double);
  rs->Open();
  for (int i = 1; i <= count; ++i)
    rs->AppendLoaded({Value(i), Value("n" + std::to_string(i)), Value(i * 1e10)});
  rs->MoveFirst();
  return rs;
}

std::string Repeat(const std::string& s, size_t n) {
  std::string out;
  out.reserve(s.size() * n);
  for (size_t i = 0; i < n; ++i)
    out += s;
  return out;
}

// The plain recursive definition of LIKE, the oracle for the matcher.
bool LikeOracle(std::string_view t, std::string_view p) {
  if (p.empty()) return t.empty();
  if (p[0] == '*' || p[0] == '%')
    return LikeOracle(t, p.substr(1)) || (!t.empty() && LikeOracle(t.substr(1), p));
  if (t.empty()) return false;
  if (p[0] != '_' && p[0] != '?' && p[0] != t[0]) return false;
  return LikeOracle(t.substr(1), p.substr(1));
}

} // namespace

TEST(CriteriaBounds, DeepParenthesesAreRefusedWithAClearError) {
  auto rs = Numbered(3);
  const std::string ok =
      Repeat("(", kMaxCriteriaNesting) + "ITEMID = 2" + Repeat(")", kMaxCriteriaNesting);
  rs->SetFilter(ok);
  EXPECT_EQ(rs->RecordCount(), 1);

  const std::string deeper = "(" + ok + ")";
  std::string why;
  EXPECT_EQ(ErrorNumber([&] { rs->SetFilter(deeper); }, &why), err::kBadArguments);
  EXPECT_NE(why.find("nest more than 100"), std::string::npos) << why;
  EXPECT_EQ(rs->RecordCount(), 1); // the filter in force is kept

  // 30,000 levels (60 KB): refused, not a stack overflow; the message
  // quotes only the start of the text.
  const std::string huge = Repeat("(", 30000) + "ITEMID = 1" + Repeat(")", 30000);
  EXPECT_EQ(ErrorNumber([&] { rs->SetFilter(huge); }, &why), err::kBadArguments);
  EXPECT_LT(why.size(), 500u);
  EXPECT_EQ(ErrorNumber([&] { ParseCriteria(Repeat("(", 30000)); }), err::kBadArguments);
}

TEST(CriteriaBounds, LongRunsOfOrAndAndEvaluateCorrectly) {
  auto rs = Numbered(20);
  // 150,000 terms: a flat node, not a chain as deep as the text is long.
  std::string ors = "ITEMID = 0";
  for (int i = 1; i < 150000; ++i)
    ors += " OR ITEMID = " + std::to_string(i == 7 || i == 14 ? i : 100000 + i);
  rs->SetFilter(ors);
  EXPECT_EQ(rs->RecordCount(), 2); // 7 and 14
  rs->MoveFirst();
  EXPECT_EQ(rs->Collect("ITEMID").ToInt32(), 7);

  std::string ands = "ITEMID > 0";
  for (int i = 1; i < 150000; ++i)
    ands += " AND ITEMID <> " + std::to_string(i % 2 == 0 ? i : 1000000);
  rs->SetFilter(ands);
  EXPECT_EQ(rs->RecordCount(), 10); // the odd ones

  // AND binds tighter than OR inside a long run.
  rs->SetFilter("ITEMID = 1 OR ITEMID > 3 AND ITEMID < 6 OR NAME = 'n20'");
  std::vector<int> ids;
  for (rs->MoveFirst(); !rs->Eof(); rs->MoveNext())
    ids.push_back(rs->Collect("ITEMID").ToInt32());
  EXPECT_EQ(ids, (std::vector<int>{1, 4, 5, 20}));
}

TEST(CriteriaBounds, LikeAgreesWithTheDefinitionOnRandomTexts) {
  std::mt19937 rng(7);
  const std::string alphabet = "ab*%_?";
  for (int round = 0; round < 20000; ++round) {
    std::string t, p;
    for (size_t n = rng() % 9; n > 0; --n)
      t += "ab"[rng() % 2];
    for (size_t n = rng() % 8; n > 0; --n)
      p += alphabet[rng() % alphabet.size()];
    ASSERT_EQ(LikeMatch(t, p), LikeOracle(t, p)) << "\"" << t << "\" LIKE \"" << p << "\"";
  }
  EXPECT_TRUE(LikeMatch("Front Bumper", "front*"));
  EXPECT_FALSE(LikeMatch("Front Bumper", "bumper"));
}

TEST(CriteriaBounds, LikeDoesNotBacktrackExponentially) {
  // With a backtracking matcher each of these takes longer than the age of
  // the universe; the ctest time limit on this binary catches a regression.
  const std::string value(1000, 'a');
  EXPECT_FALSE(LikeMatch(value, Repeat("*a", 30) + "*b"));
  EXPECT_TRUE(LikeMatch(value + "b", Repeat("%a", 30) + "%b"));
  EXPECT_FALSE(LikeMatch(value, Repeat("*", 500) + Repeat("a", 999) + "?b"));

  auto rs = Numbered(1);
  rs->AppendLoaded({Value(2), Value(std::string(200, 'a')), Value()});
  rs->SetFilter("NAME LIKE '*a*a*a*a*a*a*a*a*a*a*a*a*b'");
  EXPECT_EQ(rs->RecordCount(), 0);
}

TEST(CriteriaBounds, NumbersBeyondThirtyTwoBitsCompareAsNumbers) {
  auto rs = Numbered(3);
  // An integer field never equals a value outside its range...
  rs->SetFilter("ITEMID = 99999999999");
  EXPECT_EQ(rs->RecordCount(), 0);
  rs->SetFilter("ITEMID < 99999999999 AND ITEMID > -99999999999");
  EXPECT_EQ(rs->RecordCount(), 3);
  rs->SetFilter("");
  rs->Find("ITEMID = 99999999999", 0, adSearchForward, adBookmarkFirst);
  EXPECT_TRUE(rs->Eof());
  rs->Find("ITEMID = -4294967297", 0, adSearchForward, adBookmarkFirst);
  EXPECT_TRUE(rs->Eof());
  rs->Find("ITEMID = 2.5", 0, adSearchForward, adBookmarkFirst);
  EXPECT_TRUE(rs->Eof());
  // ...and a Double field finds it.
  rs->Find("AMOUNT = 20000000000", 0, adSearchForward, adBookmarkFirst);
  ASSERT_FALSE(rs->Eof());
  EXPECT_EQ(rs->Collect("ITEMID").ToInt32(), 2);
  // A number too large for a Double is refused with a clear error.
  std::string why;
  EXPECT_EQ(ErrorNumber([&] { rs->SetFilter("AMOUNT < " + std::string(400, '9')); }, &why),
            err::kBadArguments);
  EXPECT_NE(why.find("is not a number"), std::string::npos);
}

TEST(CriteriaBounds, FindWithHugeSkipCountsLandsPastTheEnd) {
  auto rs = Numbered(5);
  // Skipping past the end finds nothing, by the index and by a scan alike.
  rs->Find("ITEMID = 1", LONG_MAX, adSearchForward, adBookmarkLast);
  EXPECT_TRUE(rs->Eof());
  rs->Find("NAME = 'n1'", LONG_MAX, adSearchForward, adBookmarkLast);
  EXPECT_TRUE(rs->Eof());
  rs->MoveFirst();
  rs->MoveNext();
  rs->Find("NAME = 'n2'", LONG_MAX, adSearchForward, adBookmarkCurrent);
  EXPECT_TRUE(rs->Eof());
  rs->Find("ITEMID = 5", LONG_MAX, adSearchBackward, adBookmarkLast);
  EXPECT_TRUE(rs->Bof());
  // A negative skip moves against the direction; a backward search that
  // starts past the end starts at the last record, however far past.
  for (long skip : {-10L, LONG_MIN}) {
    rs->Find("ITEMID = 5", skip, adSearchBackward, adBookmarkLast);
    ASSERT_FALSE(rs->Bof()) << skip;
    EXPECT_EQ(rs->Collect("ITEMID").ToInt32(), 5);
    rs->Find("NAME = 'n5'", skip, adSearchBackward, adBookmarkLast);
    ASSERT_FALSE(rs->Bof()) << skip;
    EXPECT_EQ(rs->Collect("ITEMID").ToInt32(), 5);
  }
  rs->Find("ITEMID = 4", 2, adSearchForward, adBookmarkFirst);
  ASSERT_FALSE(rs->Eof());
  EXPECT_EQ(rs->Collect("ITEMID").ToInt32(), 4);
  rs->Find("ITEMID = 2", 2, adSearchForward, adBookmarkFirst);
  EXPECT_TRUE(rs->Eof());
}
