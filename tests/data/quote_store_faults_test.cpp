// Faults of the quote database during a save: another program holding it
// locked, a file that cannot be written, a file damaged under the store.
// Each save fails with a message that says what happened, stores nothing of
// the save, and leaves the record set's changes in place so that the save
// can be tried again.
#include "data/quote_store.hpp"
#include "error_number.hpp"
#include "temp_dir.hpp"
#include "text/error.hpp"

#include <gtest/gtest.h>
#include <sqlite3.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdio>
#include <filesystem>
#include <fstream>

using namespace belvane;
using namespace belvane::data;
using belvane::test::ErrorNumber;

namespace {

class QuoteStoreFaults : public ::testing::Test {
protected:
  void SetUp() override {
    path_ = dir_.File("quotes.db");
    store_ = std::make_unique<QuoteStore>(path_);
    QuoteHeader h;
    h.qtnno = "Q1";
    store_->SaveQuote(h);
    auto rs = store_->LoadItems("Q1", ItemKind::Labour);
    for (int i = 0; i < 200; ++i)
      AddLine(*rs, "L" + std::to_string(i), 1.5);
    store_->SaveItems("Q1", *rs);
  }

  static void AddLine(Recordset& rs, const std::string& itemno, double hours) {
    rs.AddNew();
    rs.Collect("DELITEM", Value(false));
    rs.Collect("qtnno", Value("Q1"));
    rs.Collect("itemno", Value(itemno));
    rs.Collect("script", Value("Item " + itemno));
    rs.Collect("Category", Value("R&R"));
    rs.Collect("rrhour", Value(hours));
  }

  // A pending change of each kind: a new line, a changed one, a deleted one.
  RecordsetPtr PendingChanges() {
    auto rs = store_->LoadItems("Q1", ItemKind::Labour);
    rs->MoveFirst();
    rs->Collect("rrhour", Value(9.0));
    rs->MoveNext();
    rs->Delete();
    AddLine(*rs, "NEW", 2.0);
    return rs;
  }

  static void ExpectStillPending(Recordset& rs) {
    int added = 0, changed = 0, deleted = 0;
    for (size_t r = 0; r < rs.StoredCount(); ++r) {
      added += rs.StoredStatus(r) == RecordStatus::New;
      changed += rs.StoredStatus(r) == RecordStatus::Modified;
      deleted += rs.StoredStatus(r) == RecordStatus::Deleted;
    }
    EXPECT_EQ(added, 1);
    EXPECT_EQ(changed, 1);
    EXPECT_EQ(deleted, 1);
  }

  // The stored items as text, to see that a failed save changed nothing.
  std::string Stored() {
    auto rs = store_->LoadItems("Q1", ItemKind::All);
    std::string out;
    for (rs->MoveFirst(); !rs->Eof(); rs->MoveNext())
      out += rs->Collect("ITEMID").ToText() + ":" + rs->Collect("itemno").ToText() + ":" +
             rs->Collect("rrhour").ToText() + "\n";
    return out;
  }

  test::TempDir dir_{"quote-faults"};
  std::string path_;
  std::unique_ptr<QuoteStore> store_;
};

} // namespace

TEST_F(QuoteStoreFaults, ADatabaseLockedByAnotherProgram) {
  const std::string before = Stored();
  auto rs = PendingChanges();
  // Another program is writing to the database and holds it for itself.
  sqlite3* other = nullptr;
  ASSERT_EQ(sqlite3_open(path_.c_str(), &other), SQLITE_OK);
  ASSERT_EQ(sqlite3_exec(other, "BEGIN EXCLUSIVE", nullptr, nullptr, nullptr), SQLITE_OK);

  std::string why;
  EXPECT_EQ(ErrorNumber([&] { store_->SaveItems("Q1", *rs); }, &why), err::kDataService);
  EXPECT_NE(why.find("Quote database " + path_), std::string::npos) << why;
  EXPECT_NE(why.find("locked"), std::string::npos) << why;
  ExpectStillPending(*rs);

  sqlite3_exec(other, "ROLLBACK", nullptr, nullptr, nullptr);
  sqlite3_close(other);
  EXPECT_EQ(Stored(), before);
  // Once the other program lets go, the same save goes through, once.
  const SaveSummary s = store_->SaveItems("Q1", *rs);
  EXPECT_EQ(s.inserted, 1);
  EXPECT_EQ(s.updated, 1);
  EXPECT_EQ(s.deleted, 1);
}

TEST_F(QuoteStoreFaults, ADatabaseThatCannotBeWritten) {
  const std::string before = Stored();
  store_.reset();
  ASSERT_EQ(::chmod(path_.c_str(), 0444), 0);
  ASSERT_EQ(::chmod(dir_.Path().c_str(), 0755), 0);
  // Root writes whatever the permissions say: the save runs in a child that
  // has given up root when the test runs as root.
  const pid_t child = ::fork();
  ASSERT_GE(child, 0);
  if (child == 0) {
    if (::geteuid() == 0 && (::setgid(65534) != 0 || ::setuid(65534) != 0)) ::_exit(10);
    int code = 0;
    try {
      QuoteStore store(path_);
      auto rs = store.LoadItems("Q1", ItemKind::Labour);
      rs->MoveFirst();
      rs->Collect("rrhour", Value(9.0));
      std::string why;
      if (ErrorNumber([&] { store.SaveItems("Q1", *rs); }, &why) != err::kDataService)
        code = 11;
      else if (why.find("readonly") == std::string::npos)
        code = 12;
      else if (rs->Status() != RecordStatus::Modified)
        code = 13;
    } catch (...) {
      code = 14;
    }
    ::_exit(code);
  }
  int status = 0;
  ASSERT_EQ(::waitpid(child, &status, 0), child);
  ASSERT_TRUE(WIFEXITED(status));
  EXPECT_EQ(WEXITSTATUS(status), 0) << "11: no error, 12: unclear message, 13: changes dropped";
  ::chmod(path_.c_str(), 0644);
  store_ = std::make_unique<QuoteStore>(path_);
  EXPECT_EQ(Stored(), before);
}

TEST_F(QuoteStoreFaults, ADatabaseDamagedUnderTheStore) {
  auto rs = PendingChanges();
  // Another program overwrites every page after the first with garbage
  // (and, as any writer does, changes the file's change counter, so the
  // store cannot trust what it read before).
  {
    std::fstream f(path_, std::ios::in | std::ios::out | std::ios::binary);
    f.seekg(0, std::ios::end);
    const auto size = static_cast<long>(f.tellg());
    const std::string garbage(static_cast<size_t>(size - 4096), '\xA5');
    f.seekp(4096);
    f.write(garbage.data(), static_cast<std::streamsize>(garbage.size()));
    char counter = 0;
    f.seekg(27);
    f.read(&counter, 1);
    counter = static_cast<char>(counter + 1);
    f.seekp(27);
    f.write(&counter, 1);
  }
  std::string why;
  EXPECT_EQ(ErrorNumber([&] { store_->SaveItems("Q1", *rs); }, &why), err::kDataService);
  EXPECT_NE(why.find("Quote database " + path_), std::string::npos) << why;
  EXPECT_NE(why.find("malformed"), std::string::npos) << why;
  ExpectStillPending(*rs);
  // The failed save left no journal of a half-written change behind.
  EXPECT_FALSE(std::filesystem::exists(path_ + "-journal"));
}
