// `belvane settings` as an administrator uses it: a value set, read and
// deleted in the hive the environment names, and a failure reported.
#include "../data/temp_dir.hpp"
#include "diagram/registry.hpp"

#include <gtest/gtest.h>

#include <sys/wait.h>

#include <cstdio>
#include <string>

namespace {

struct CliRun {
  int status = -1;
  std::string out;
};

CliRun Belvane(const std::string& machine, const std::string& args) {
  const std::string command = "BELVANE_MACHINE_SETTINGS='" + machine + "' BELVANE_USER_SETTINGS='" +
                              machine + ".user' " + BELVANE_CLI_PATH + " settings " + args +
                              " 2>&1";
  CliRun run;
  FILE* pipe = popen(command.c_str(), "r");
  if (!pipe) return run;
  char buffer[4096];
  std::size_t n = 0;
  while ((n = fread(buffer, 1, sizeof buffer, pipe)) > 0)
    run.out.append(buffer, n);
  const int status = pclose(pipe);
  run.status = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
  return run;
}

TEST(SettingsCli, SetGetAndDeleteAValueOfTheMachineWideHive) {
  belvane::test::TempDir dir("settings-cli");
  const std::string hive = dir.File("machine.json");
  const std::string key = "'SOFTWARE\\tessik\\frmsplash'";

  EXPECT_EQ(Belvane(hive, "set " + key + " GraphicsPath /srv/art/").status, 0);
  belvane::diagram::SetHiveFilePath(belvane::diagram::Hive::LocalMachine, hive);
  EXPECT_EQ(belvane::diagram::GetMachineSetting("tessik", "frmsplash", "GraphicsPath", "/d/"),
            "/srv/art/");
  belvane::diagram::SetHiveFilePath(belvane::diagram::Hive::LocalMachine, "");

  EXPECT_EQ(Belvane(hive, "get 'software\\TESSIK\\frmsplash' graphicspath").out, "/srv/art/\n");
  EXPECT_EQ(Belvane(hive, "set --number " + key + " Count -5").status, 0);
  EXPECT_EQ(Belvane(hive, "get " + key + " Count").out, "-5\n");
  EXPECT_EQ(Belvane(hive, "set --number " + key + " Count lots").status, 2);
  EXPECT_EQ(Belvane(hive, "delete " + key + " Count").status, 0);
  const CliRun missing = Belvane(hive, "get " + key + " Count");
  EXPECT_EQ(missing.status, 1);
  EXPECT_NE(missing.out.find("no value \"Count\""), std::string::npos) << missing.out;
  // The per-user hive is another file.
  EXPECT_EQ(Belvane(hive, "get --user " + key + " GraphicsPath").status, 1);

  const CliRun refused = Belvane("/proc/no/such/settings.json", "set " + key + " A b");
  EXPECT_EQ(refused.status, 1);
  EXPECT_NE(refused.out.find("administrator"), std::string::npos) << refused.out;
}

} // namespace
