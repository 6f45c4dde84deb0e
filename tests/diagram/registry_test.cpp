// Registry access over the settings store: the results the diagram window
// relies on, hives that are missing, read-only or damaged, and two
// processes writing at once.

#include "../data/temp_dir.hpp"
#include "diagram/registry.hpp"
#include "diagram/settings_store.hpp"

#include <gtest/gtest.h>

#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <sstream>

using namespace belvane::diagram;

namespace {

constexpr const char* kKey = "SOFTWARE\\tessik\\frmsplash";

std::string ReadFile(const std::string& path) {
  std::ifstream in(path, std::ios::binary);
  std::stringstream s;
  s << in.rdbuf();
  return s.str();
}

class RegistryTest : public ::testing::Test {
protected:
  void SetUp() override {
    SetHiveFilePath(Hive::LocalMachine, machine_);
    SetHiveFilePath(Hive::CurrentUser, user_);
    SetSettingsReporter([this](const std::string& m) { reports_.push_back(m); });
  }
  void TearDown() override {
    SetHiveFilePath(Hive::LocalMachine, "");
    SetHiveFilePath(Hive::CurrentUser, "");
    SetSettingsReporter(nullptr);
  }

  // Stores a value of any type and bytes directly, as another program may.
  void Store(const std::string& file, const std::string& key, const std::string& name,
             StoredValue value) {
    ASSERT_TRUE(HiveFile(file).Update([&](SettingsKey& root) {
      root.Make(SplitKeyPath(key)).SetValue(name, value);
      return true;
    }));
  }

  belvane::test::TempDir dir_{"registry"};
  std::string machine_ = dir_.File("etc/machine.json");
  std::string user_ = dir_.File("home/user.json");
  std::vector<std::string> reports_;
};

TEST_F(RegistryTest, GetMachineSettingReadsTheMachineValueAndWritesNothing) {
  Store(machine_, kKey, "GraphicsPath", {kTextType, "/srv/art/"});
  Store(user_, kKey, "GraphicsPath", {kTextType, "/home/me/art/"});
  const std::string before = ReadFile(machine_);
  EXPECT_EQ(GetMachineSetting("tessik", "frmsplash", "GraphicsPath", "/default/"), "/srv/art/");
  EXPECT_EQ(ReadFile(machine_), before);
}

TEST_F(RegistryTest, AFallBackIsStoredMachineWideWhereTheUserMayWrite) {
  // Nothing anywhere, not even the machine-wide file: the default comes
  // back and is stored, so the next read finds it there.
  EXPECT_EQ(GetMachineSetting("tessik", "frmsplash", "GraphicsPath", "/default/"), "/default/");
  EXPECT_EQ(ReadRegValue(Hive::LocalMachine, kKey, "GraphicsPath"), "/default/");

  // A per-user value wins over the default and is copied; it stays in the
  // per-user hive.
  Store(user_, kKey, "Other", {kTextType, "mine"});
  EXPECT_EQ(GetMachineSetting("tessik", "frmsplash", "Other", "/default/"), "mine");
  EXPECT_EQ(ReadRegValue(Hive::LocalMachine, kKey, "Other"), "mine");
  EXPECT_EQ(GetSetting("tessik", "frmsplash", "Other", ""), "mine");

  // An empty default with nothing stored: nothing to copy.
  EXPECT_EQ(GetMachineSetting("tessik", "frmsplash", "Empty", ""), "");
  EXPECT_EQ(ReadRegValue(Hive::LocalMachine, kKey, "Empty"), "");
}

TEST_F(RegistryTest, AReadOnlyMachineHiveCannotBeOpenedWithFullAccess) {
  Store(machine_, kKey, "GraphicsPath", {kTextType, "/srv/art/"});
  Store(user_, kKey, "GraphicsPath", {kTextType, "/home/me/art/"});
  ASSERT_EQ(chmod(machine_.c_str(), 0444), 0);
  const std::string before = ReadFile(machine_);

  EXPECT_EQ(ReadRegValue(Hive::LocalMachine, kKey, "GraphicsPath"), "");
  EXPECT_FALSE(WriteRegValue(Hive::LocalMachine, kKey, "GraphicsPath", "/x/"));
  CreateRegKey(Hive::LocalMachine, "SOFTWARE\\new");
  // Every time: the per-user value (or the default), and the file as it was.
  for (int i = 0; i < 2; ++i)
    EXPECT_EQ(GetMachineSetting("tessik", "frmsplash", "GraphicsPath", "/d/"), "/home/me/art/");
  EXPECT_EQ(GetMachineSetting("tessik", "frmsplash", "Missing", "/d/"), "/d/");
  EXPECT_EQ(ReadFile(machine_), before);
  EXPECT_FALSE(std::filesystem::exists(machine_ + ".damaged"));
}

TEST_F(RegistryTest, ValuesReadBackAsTextByType) {
  CreateRegKey(Hive::LocalMachine, kKey);
  Store(machine_, kKey, "WithZero", {kTextType, std::string("c:\\art\\\0", 8)});
  Store(machine_, kKey, "WithoutZero", {kTextType, "c:\\art\\"});
  Store(machine_, kKey, "Number", {4, std::string("\x05\x01\0\0", 4)});
  Store(machine_, kKey, "Negative", {4, std::string("\xFE\xFF\xFF\xFF", 4)});
  Store(machine_, kKey, "Binary", {3, "\x01\x02"});
  Store(machine_, kKey, "Full", {kTextType, std::string(1024, 'a')});
  Store(machine_, kKey, "TooLong", {kTextType, std::string(1025, 'a')});
  Store(machine_, kKey, "TooLongWithZero", {kTextType, std::string(1024, 'a') + '\0'});

  EXPECT_EQ(ReadRegValue(Hive::LocalMachine, kKey, "WithZero"), "c:\\art\\");
  EXPECT_EQ(ReadRegValue(Hive::LocalMachine, kKey, "WithoutZero"), "c:\\art\\");
  EXPECT_EQ(ReadRegValue(Hive::LocalMachine, kKey, "Number"), "261");
  EXPECT_EQ(ReadRegValue(Hive::LocalMachine, kKey, "Negative"), "-2");
  EXPECT_EQ(ReadRegValue(Hive::LocalMachine, kKey, "Binary"), "");
  EXPECT_EQ(ReadRegValue(Hive::LocalMachine, kKey, "Full"), std::string(1024, 'a'));
  EXPECT_EQ(ReadRegValue(Hive::LocalMachine, kKey, "TooLong"), "");
  EXPECT_EQ(ReadRegValue(Hive::LocalMachine, kKey, "TooLongWithZero"), "");
  EXPECT_EQ(ReadRegValue(Hive::LocalMachine, kKey, "Missing"), "");
  EXPECT_EQ(ReadRegValue(Hive::LocalMachine, "SOFTWARE\\nowhere", "Number"), "");
  // Keys and value names are found whatever their case.
  EXPECT_EQ(ReadRegValue(Hive::LocalMachine, "software\\TESSIK\\FrmSplash", "number"), "261");
}

TEST_F(RegistryTest, WritesKeepTheValuesType) {
  EXPECT_FALSE(WriteRegValue(Hive::LocalMachine, kKey, "GraphicsPath", "/a/")); // no key yet
  CreateRegKey(Hive::LocalMachine, kKey);
  EXPECT_TRUE(WriteRegValue(Hive::LocalMachine, kKey, "GraphicsPath", "/a/"));
  EXPECT_TRUE(WriteRegValue(Hive::LocalMachine, kKey, "graphicspath", "/b/"));
  EXPECT_EQ(ReadRegValue(Hive::LocalMachine, kKey, "GRAPHICSPATH"), "/b/");
  // The name keeps the case it was created with.
  const HiveFile::Loaded hive = HiveFile(machine_).Load();
  const SettingsKey* key = hive.root.Walk(SplitKeyPath(kKey));
  ASSERT_NE(key, nullptr);
  ASSERT_EQ(key->Values().size(), 1u);
  EXPECT_EQ(key->Values()[0].first, "GraphicsPath");
  EXPECT_EQ(key->Values()[0].second.data, "/b/"); // no zero byte written

  Store(machine_, kKey, "Count", {kNumberType, std::string(4, '\0')});
  const auto number = [&](const char* text) {
    return WriteRegValue(Hive::LocalMachine, kKey, "Count", text)
               ? ReadRegValue(Hive::LocalMachine, kKey, "Count")
               : std::string("refused");
  };
  EXPECT_EQ(number("261"), "261");
  EXPECT_EQ(number(" 12.5 apples"), "12"); // the leading number, half to even
  EXPECT_EQ(number("13.5"), "14");
  EXPECT_EQ(number("-7"), "-7");
  EXPECT_EQ(number("apples"), "0");
  EXPECT_EQ(number("4294967295"), "-1"); // all 32 bits, read back signed
  EXPECT_EQ(number("5000000000"), "refused");
  EXPECT_EQ(ReadRegValue(Hive::LocalMachine, kKey, "Count"), "-1");

  // Values of another type, or too long to read, are left alone.
  Store(machine_, kKey, "Binary", {3, "\x01"});
  EXPECT_FALSE(WriteRegValue(Hive::LocalMachine, kKey, "Binary", "x"));
  Store(machine_, kKey, "Long", {kTextType, std::string(2000, 'x')});
  EXPECT_FALSE(WriteRegValue(Hive::LocalMachine, kKey, "Long", "short"));
  const HiveFile::Loaded after = HiveFile(machine_).Load();
  EXPECT_EQ(after.root.Walk(SplitKeyPath(kKey))->Value("Long")->data.size(), 2000u);
}

TEST_F(RegistryTest, KeysAreCreatedWithTheirParentsAndOnlyLeavesAreDeleted) {
  CreateRegKey(Hive::CurrentUser, "SOFTWARE\\a\\b\\c");
  CreateRegKey(Hive::CurrentUser, "SOFTWARE\\A\\B\\D"); // the same a and b
  HiveFile user(user_);
  const HiveFile::Loaded hive = user.Load();
  const SettingsKey* b = hive.root.Walk({"software", "a", "b"});
  ASSERT_NE(b, nullptr);
  EXPECT_EQ(b->Subkeys().size(), 2u);

  DeleteRegKey(Hive::CurrentUser, "SOFTWARE\\a\\b"); // has subkeys: stays
  EXPECT_NE(user.Load().root.Walk({"SOFTWARE", "a", "b"}), nullptr);
  DeleteRegKey(Hive::CurrentUser, "SOFTWARE\\a\\b\\c\\"); // a trailing separator is no part
  EXPECT_EQ(user.Load().root.Walk({"SOFTWARE", "a", "b", "c"}), nullptr);
  EXPECT_NE(user.Load().root.Walk({"SOFTWARE", "a", "b", "d"}), nullptr);
  DeleteRegKey(Hive::CurrentUser, "SOFTWARE\\nowhere"); // nothing to delete
}

TEST_F(RegistryTest, ADamagedHiveIsReportedReadAsEmptyAndKeptWhenReplaced) {
  std::filesystem::create_directories(std::filesystem::path(machine_).parent_path());
  const std::string damaged = "{\"format\": \"belvane-settings-1\", \"keys\": {\"SOFTWARE\": [";
  std::ofstream(machine_) << damaged;

  EXPECT_EQ(ReadRegValue(Hive::LocalMachine, kKey, "GraphicsPath"), "");
  ASSERT_FALSE(reports_.empty());
  EXPECT_NE(reports_[0].find(machine_), std::string::npos) << reports_[0];
  EXPECT_NE(reports_[0].find("damaged"), std::string::npos) << reports_[0];

  // The setting falls back to the default and is stored in a sound file;
  // the damaged one is kept beside it.
  EXPECT_EQ(GetMachineSetting("tessik", "frmsplash", "GraphicsPath", "/d/"), "/d/");
  EXPECT_EQ(ReadFile(machine_ + ".damaged"), damaged);
  reports_.clear();
  EXPECT_EQ(ReadRegValue(Hive::LocalMachine, kKey, "GraphicsPath"), "/d/");
  EXPECT_TRUE(reports_.empty());
}

TEST_F(RegistryTest, TwoProcessesWritingAtOnceLoseNeitherWrite) {
  CreateRegKey(Hive::LocalMachine, kKey);
  constexpr int kWrites = 40;
  pid_t children[2];
  for (int c = 0; c < 2; ++c) {
    children[c] = fork();
    ASSERT_GE(children[c], 0);
    if (children[c] == 0) {
      bool ok = true;
      for (int i = 0; i < kWrites; ++i) {
        const std::string key = std::string(kKey) + "\\p" + std::to_string(c);
        CreateRegKey(Hive::LocalMachine, key);
        ok = WriteRegValue(Hive::LocalMachine, kKey,
                           "v" + std::to_string(c) + "_" + std::to_string(i), std::to_string(i)) &&
             ok;
      }
      _exit(ok ? 0 : 1);
    }
  }
  for (pid_t child : children) {
    int status = 0;
    ASSERT_EQ(waitpid(child, &status, 0), child);
    EXPECT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 0);
  }
  const HiveFile::Loaded hive = HiveFile(machine_).Load();
  ASSERT_TRUE(hive.problem.empty()) << hive.problem;
  const SettingsKey* key = hive.root.Walk(SplitKeyPath(kKey));
  ASSERT_NE(key, nullptr);
  EXPECT_EQ(key->Values().size(), 2u * kWrites);
  EXPECT_EQ(key->Subkeys().size(), 2u);
  // Nothing written beside the file is left behind.
  for (const auto& entry : std::filesystem::directory_iterator(dir_.File("etc")))
    EXPECT_TRUE(entry.path().filename() == "machine.json" ||
                entry.path().filename() == "machine.json.lock")
        << entry.path();
}

TEST(SettingsFileText, AnyTextParsesWithoutFailingAndSoundHivesRoundTrip) {
  SettingsKey root;
  SettingsKey& key = root.Make({"SOFTWARE", "tessik", "frmsplash"});
  key.SetValue("GraphicsPath", {kTextType, "/srv/Grafik/Übersicht/"});
  key.SetValue("Zero", {kTextType, std::string("a\0", 2)});
  key.SetValue("Latin1", {kTextType, "caf\xE9"}); // not UTF-8: kept as bytes
  key.SetValue("Number", {kNumberType, std::string("\xFF\xFF\xFF\x7F", 4)});
  key.SetValue("Binary", {3, std::string("\0\x01\xFF", 3)});
  root.Make({"SOFTWARE", "empty"});
  const ParsedHive again = ParseHive(FormatHive(root));
  EXPECT_EQ(again.problem, "");
  EXPECT_TRUE(again.root == root);

  const std::string sound = FormatHive(root);
  for (std::size_t cut = 0; cut < sound.size(); cut += 7)
    EXPECT_FALSE(ParseHive(sound.substr(0, cut)).problem.empty()) << cut;
  std::string deep = "{\"format\":\"belvane-settings-1\",\"keys\":";
  for (int i = 0; i < 600; ++i)
    deep += "{\"k\":{\"keys\":";
  EXPECT_FALSE(ParseHive(deep).problem.empty());
  for (const char* bad :
       {"[]", "{}", "{\"format\":\"belvane-settings-1\",\"values\":{\"a\":{\"text\":\"b\"}}}",
        "{\"format\":\"belvane-settings-1\",\"keys\":{\"a\":{\"values\":{\"v\":{\"number\":-"
        "3000000000}}}}}",
        "{\"format\":\"belvane-settings-1\",\"keys\":{\"a\":{\"values\":{\"v\":{\"type\":3,\"hex\":"
        "\"ABC\"}}}}}",
        "{\"format\":\"belvane-settings-1\",\"keys\":{\"a\\\\b\":{}}}", "\xFF\xFE garbage"})
    EXPECT_FALSE(ParseHive(bad).problem.empty()) << bad;
}

TEST(SettingsLocations, ProgramsOfTheBuildTreeUseItsOwnHivesAndPages) {
  ASSERT_TRUE(RunningFromBuildTree());
  EXPECT_NE(HiveFilePath(Hive::LocalMachine).find("/settings/machine.json"), std::string::npos);
  EXPECT_NE(HiveFilePath(Hive::CurrentUser).find("/settings/user.json"), std::string::npos);
  const std::string graphics = DefaultGraphicsFolder();
  ASSERT_FALSE(graphics.empty());
  EXPECT_EQ(graphics.back(), '/');
  EXPECT_TRUE(std::filesystem::exists(graphics + "butterfly.html"));
  EXPECT_TRUE(std::filesystem::exists(graphics + "nobutterfly.html"));

  setenv("BELVANE_MACHINE_SETTINGS", "/tmp/elsewhere.json", 1);
  EXPECT_EQ(HiveFilePath(Hive::LocalMachine), "/tmp/elsewhere.json");
  SetHiveFilePath(Hive::LocalMachine, "/tmp/chosen.json");
  EXPECT_EQ(HiveFilePath(Hive::LocalMachine), "/tmp/chosen.json");
  SetHiveFilePath(Hive::LocalMachine, "");
  unsetenv("BELVANE_MACHINE_SETTINGS");
}

} // namespace
