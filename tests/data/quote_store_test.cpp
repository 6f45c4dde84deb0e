#include "data/quote_store.hpp"
#include "text/error.hpp"

#include <gtest/gtest.h>

#include <filesystem>

#include <sqlite3.h>

using namespace belvane;
using namespace belvane::data;

namespace {

class QuoteStoreTest : public ::testing::Test {
protected:
  void SetUp() override {
    path_ = (std::filesystem::temp_directory_path() /
             ("belvane-quotes-" + std::to_string(::getpid()) + "-" +
              ::testing::UnitTest::GetInstance()->current_test_info()->name() + ".db"))
                .string();
    std::filesystem::remove(path_);
    store_ = std::make_unique<QuoteStore>(path_);
    QuoteHeader h;
    h.qtnno = "Q100";
    h.vehicle = "Ford Ranger";
    h.rrRate = 55;
    store_->SaveQuote(h);
  }
  void TearDown() override {
    store_.reset();
    std::filesystem::remove(path_);
  }

  void AddLabour(Recordset& rs, const char* itemno, const char* category, double hours) {
    rs.AddNew();
    rs.Collect("DELITEM", Value(false));
    rs.Collect("tag", Value("1"));
    rs.Collect("qtnno", Value("Q100"));
    rs.Collect("itemno", Value(itemno));
    rs.Collect("script", Value(std::string("Item ") + itemno));
    rs.Collect("Category", Value(category));
    rs.Collect(std::string(category) == "R&R" ? "rrhour" : "pthour", Value(hours));
  }

  std::string path_;
  std::unique_ptr<QuoteStore> store_;
};

} // namespace

TEST_F(QuoteStoreTest, HeadersRoundTrip) {
  auto q = store_->GetQuote("Q100");
  ASSERT_TRUE(q);
  EXPECT_EQ(q->vehicle, "Ford Ranger");
  EXPECT_DOUBLE_EQ(q->rrRate, 55);
  EXPECT_FALSE(store_->GetQuote("nope"));
  EXPECT_EQ(store_->ListQuotes().size(), 1u);
}

TEST_F(QuoteStoreTest, StoresExactlyWhatChanged) {
  auto rs = store_->LoadItems("Q100", ItemKind::Labour);
  EXPECT_EQ(rs->RecordCount(), 0);
  AddLabour(*rs, "100", "R&R", 1.5);
  AddLabour(*rs, "100", "PAINT", 2.0);
  AddLabour(*rs, "200", "R&R", 3.0);
  auto s1 = store_->SaveItems("Q100", *rs);
  EXPECT_EQ(s1.inserted, 3);
  // The ids the database assigned are in the record set now.
  for (rs->MoveFirst(); !rs->Eof(); rs->MoveNext())
    EXPECT_FALSE(rs->Collect("ITEMID").IsNull());

  auto again = store_->LoadItems("Q100", ItemKind::Labour);
  ASSERT_EQ(again->RecordCount(), 3);
  again->Find("itemno = '200'", 0, adSearchForward, adBookmarkFirst);
  again->Collect("rrhour", Value(4.25));
  again->Find("Category = 'PAINT'", 0, adSearchForward, adBookmarkFirst);
  again->Delete();
  AddLabour(*again, "300", "R&R", 1.0);
  auto s2 = store_->SaveItems("Q100", *again);
  EXPECT_EQ(s2.inserted, 1);
  EXPECT_EQ(s2.updated, 1);
  EXPECT_EQ(s2.deleted, 1);

  auto third = store_->LoadItems("Q100", ItemKind::Labour);
  std::vector<std::string> seen;
  for (third->MoveFirst(); !third->Eof(); third->MoveNext())
    seen.push_back(third->Collect("itemno").ToText() + " " + third->Collect("Category").ToText() +
                   " " + third->Collect("rrhour").ToText());
  EXPECT_EQ(seen, (std::vector<std::string>{"100 R&R 1.5", "200 R&R 4.25", "300 R&R 1"}));
  EXPECT_EQ(store_->LoadItems("Q100", ItemKind::Parts)->RecordCount(), 0);
}

TEST_F(QuoteStoreTest, AFailedSaveStoresNothing) {
  auto rs = store_->LoadItems("Q100", ItemKind::All);
  AddLabour(*rs, "100", "R&R", 1.5);
  store_->SaveItems("Q100", *rs);

  // Another workstation removes the record; this one changes it and adds one.
  auto other = store_->LoadItems("Q100", ItemKind::All);
  other->MoveFirst();
  other->Delete();
  store_->SaveItems("Q100", *other);

  AddLabour(*rs, "500", "R&R", 9.0);
  rs->MoveFirst();
  rs->Collect("rrhour", Value(2.0));
  try {
    store_->SaveItems("Q100", *rs);
    FAIL() << "expected the save to fail";
  } catch (const Error& e) {
    EXPECT_NE(e.Description().find("no longer in the database"), std::string::npos);
  }
  EXPECT_EQ(store_->LoadItems("Q100", ItemKind::All)->RecordCount(), 0); // 500 not stored
  // The record set still holds its changes, so the user loses nothing.
  EXPECT_EQ(rs->StoredStatus(1), RecordStatus::New);
}

TEST(QuoteStore, UnopenableDatabaseNamesTheFile) {
  try {
    QuoteStore store("/nonexistent-dir/x/quotes.db");
    FAIL();
  } catch (const Error& e) {
    EXPECT_NE(e.Description().find("/nonexistent-dir/x/quotes.db"), std::string::npos);
  }
}

// Runs SQL on the quote database as another program would.
static void RawSql(const std::string& path, const std::string& sql) {
  sqlite3* db = nullptr;
  ASSERT_EQ(sqlite3_open(path.c_str(), &db), SQLITE_OK);
  char* message = nullptr;
  const int rc = sqlite3_exec(db, sql.c_str(), nullptr, nullptr, &message);
  const std::string why = message ? message : "";
  sqlite3_free(message);
  sqlite3_close(db);
  ASSERT_EQ(rc, SQLITE_OK) << why;
}

TEST_F(QuoteStoreTest, SavingTheHeaderKeepsTheQuotesItems) {
  auto rs = store_->LoadItems("Q100", ItemKind::All);
  AddLabour(*rs, "100", "R&R", 1.5);
  AddLabour(*rs, "200", "PAINT", 2.0);
  store_->SaveItems("Q100", *rs);

  auto header = *store_->GetQuote("Q100");
  header.schedType = "MTA";
  store_->SaveQuote(header);

  EXPECT_EQ(store_->GetQuote("Q100")->schedType, "MTA");
  EXPECT_EQ(store_->LoadItems("Q100", ItemKind::All)->RecordCount(), 2);
}

TEST_F(QuoteStoreTest, StoresOnlyWhatTheLoaderReadsBack) {
  auto rs = store_->LoadItems("Q100", ItemKind::All);
  AddLabour(*rs, "100", "R&R", 1.5);
  rs->Collect("allow_tick", Value(""));
  try {
    store_->SaveItems("Q100", *rs);
    FAIL() << "an allow mask of \"\" was stored";
  } catch (const Error& e) {
    EXPECT_NE(e.Description().find("Quote item 100 \"Item 100\" (R&R)"), std::string::npos)
        << e.Description();
    EXPECT_NE(e.Description().find("0 to 7"), std::string::npos) << e.Description();
  }
  EXPECT_EQ(store_->LoadItems("Q100", ItemKind::All)->RecordCount(), 0);

  // Null is stored (read as every operation), as is a whole number; a new
  // record whose DELITEM was never set is stored as not deleted.
  rs->Collect("allow_tick", Value());
  AddLabour(*rs, "200", "R&R", 1.0);
  rs->Collect("allow_tick", Value("5"));
  rs->Collect("DELITEM", Value());
  EXPECT_EQ(store_->SaveItems("Q100", *rs).inserted, 2);
  auto back = store_->LoadItems("Q100", ItemKind::All);
  back->Find("itemno = '200'", 0, adSearchForward, adBookmarkFirst);
  EXPECT_EQ(back->Collect("allow_tick").ToText(), "5");
  EXPECT_FALSE(back->Collect("DELITEM").ToBool());
}

TEST_F(QuoteStoreTest, ItemIdsAlwaysFitTheRecordSet) {
  auto rs = store_->LoadItems("Q100", ItemKind::All);
  AddLabour(*rs, "100", "R&R", 1.5);
  store_->SaveItems("Q100", *rs);
  // Another program stored an item beyond the 32-bit ids: the quote still
  // opens, with an id that fits and finds the record again.
  RawSql(path_, "INSERT INTO quote_items (ITEMID, DELITEM, tag, qtnno, itemno, script, Category, "
                "rrhour) VALUES (5000000000, 0, '1', 'Q100', '900', 'Big', 'R&R', 1)");
  auto loaded = store_->LoadItems("Q100", ItemKind::All);
  ASSERT_EQ(loaded->RecordCount(), 2);
  loaded->Find("itemno = '900'", 0, adSearchForward, adBookmarkFirst);
  ASSERT_FALSE(loaded->Eof());
  const Value id = loaded->Collect("ITEMID");
  EXPECT_EQ(id.Type(), ValueType::Long);
  loaded->Collect("rrhour", Value(3.0));
  EXPECT_EQ(store_->SaveItems("Q100", *loaded).updated, 1);

  // New items never get an id past the 32-bit range, even after the
  // database's own counter has gone there.
  RawSql(path_, "INSERT INTO quote_items (ITEMID, DELITEM, tag, qtnno, Category) VALUES "
                "(2147483647, 0, '1', 'Other', 'R&R')");
  AddLabour(*loaded, "300", "R&R", 1.0);
  try {
    store_->SaveItems("Q100", *loaded);
    FAIL() << "an id past the 32-bit range was handed out";
  } catch (const Error& e) {
    EXPECT_NE(e.Description().find("run out of item numbers"), std::string::npos);
  }
}

TEST_F(QuoteStoreTest, TheSummaryCountsOnlyRecordsReallyDeleted) {
  auto rs = store_->LoadItems("Q100", ItemKind::All);
  AddLabour(*rs, "100", "R&R", 1.5);
  store_->SaveItems("Q100", *rs);
  auto mine = store_->LoadItems("Q100", ItemKind::All);
  auto other = store_->LoadItems("Q100", ItemKind::All);
  other->MoveFirst();
  other->Delete();
  EXPECT_EQ(store_->SaveItems("Q100", *other).deleted, 1);
  mine->MoveFirst();
  mine->Delete();
  EXPECT_EQ(store_->SaveItems("Q100", *mine).deleted, 0);
}
