// Runs the `belvane field` commands as a catalogue maintainer would.
#include <gtest/gtest.h>

#include <sys/wait.h>
#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>

namespace {

namespace fs = std::filesystem;

constexpr const char* kTestKey =
    "000102030405060708090A0B0C0D0E0F101112131415161718191A1B1C1D1E1F20212223";

struct CliResult {
  int status = -1;
  std::string out;
  std::string err;
};

class FieldCli : public ::testing::Test {
protected:
  fs::path dir_ = fs::temp_directory_path() / ("belvane-field-cli-" + std::to_string(getpid()));

  void SetUp() override {
    fs::create_directories(dir_);
    Write("test.key", std::string(kTestKey).insert(36, "\n  ") + "\n");
  }
  void TearDown() override { fs::remove_all(dir_); }

  void Write(const std::string& name, const std::string& content) {
    std::ofstream(dir_ / name, std::ios::binary) << content;
  }

  static std::string Read(const fs::path& p) {
    std::ifstream in(p, std::ios::binary);
    std::stringstream s;
    s << in.rdbuf();
    return s.str();
  }

  // Runs `belvane <args>` in the test folder with `input` on standard input.
  CliResult Belvane(const std::string& args, const std::string& input = "") {
    Write("in.txt", input);
    const std::string cmd = "cd '" + dir_.string() + "' && '" BELVANE_CLI_PATH "' " + args +
                            " <in.txt >out.txt 2>err.txt";
    const int raw = std::system(cmd.c_str());
    CliResult r;
    r.status = WIFEXITED(raw) ? WEXITSTATUS(raw) : -1;
    r.out = Read(dir_ / "out.txt");
    r.err = Read(dir_ / "err.txt");
    return r;
  }
};

TEST_F(FieldCli, EncryptArgumentsThenDecryptStandardInput) {
  const CliResult enc = Belvane("field encrypt --key-file test.key 12.50 '' 'Front Bumper Bar'");
  ASSERT_EQ(enc.status, 0) << enc.err;
  EXPECT_EQ(enc.out, "C8FAD48D7DE50547\n518FA9E1F2E3FF6F\n"
                     "FE47DB7AF6B6D5DF4AC23AFA5BA864C8518FA9E1F2E3FF6F\n");
  const CliResult dec = Belvane("field decrypt --key-file test.key", enc.out);
  ASSERT_EQ(dec.status, 0) << dec.err;
  EXPECT_EQ(dec.out, "12.50\n\nFront Bumper Bar\n");
  EXPECT_EQ(dec.err, "");

  // A column from a Windows file, last line without a line break.
  const CliResult crlf = Belvane("field encrypt --key-file test.key", "12.50\r\nFront Bumper Bar");
  EXPECT_EQ(crlf.out, enc.out.substr(0, 17) + enc.out.substr(34));
}

TEST_F(FieldCli, FailedValuesAreReportedAndTheRestProcessed) {
  const CliResult dec = Belvane("field decrypt --key-file test.key",
                                "C8FAD48D7DE50547\nC8FAD48D7DE5054G\nC8FA\nC8FAD48D7DE50547\n");
  EXPECT_EQ(dec.status, 1);
  EXPECT_EQ(dec.out, "12.50\n\n\n12.50\n");
  EXPECT_NE(dec.err.find("line 2: "), std::string::npos) << dec.err;
  EXPECT_NE(dec.err.find("(error 13)"), std::string::npos) << dec.err;
  EXPECT_NE(dec.err.find("line 3: "), std::string::npos) << dec.err;
  EXPECT_NE(dec.err.find("(error 9)"), std::string::npos) << dec.err;

  const CliResult enc = Belvane("field encrypt --key-file test.key -- Guard 'Guard ✓' -5");
  EXPECT_EQ(enc.status, 1);
  EXPECT_EQ(enc.out.size(), 17u + 1u + 17u);
  EXPECT_NE(enc.err.find("argument 2: "), std::string::npos) << enc.err;
  EXPECT_NE(enc.err.find("U+2713"), std::string::npos) << enc.err;
}

TEST_F(FieldCli, KeyFileProblemsStopTheCommand) {
  Write("bad.key", "0102");
  const CliResult bad = Belvane("field encrypt --key-file bad.key x");
  EXPECT_EQ(bad.status, 2);
  EXPECT_EQ(bad.out, "");
  EXPECT_NE(bad.err.find("bad.key"), std::string::npos) << bad.err;
  const CliResult missing = Belvane("field decrypt --key-file nowhere.key C8FAD48D7DE50547");
  EXPECT_EQ(missing.status, 2);
  EXPECT_NE(missing.err.find("(error 53)"), std::string::npos) << missing.err;

  const CliResult help = Belvane("field encrypt --help");
  EXPECT_EQ(help.status, 0);
  EXPECT_NE(help.out.find("/etc/belvane/field-cipher.key"), std::string::npos) << help.out;
  EXPECT_NE(help.out.find("72 hexadecimal"), std::string::npos) << help.out;
}

} // namespace

TEST_F(FieldCli, AnEmptyOrDanglingKeyFileIsAnErrorNotTheBuiltInKey) {
  const CliResult empty = Belvane("field encrypt --key-file '' 12.50");
  EXPECT_EQ(empty.status, 2);
  EXPECT_EQ(empty.out, "");
  EXPECT_NE(empty.err.find("key file name is empty"), std::string::npos) << empty.err;

  fs::create_symlink(dir_ / "nowhere.key", dir_ / "link.key");
  const CliResult dangling = Belvane("field decrypt --key-file link.key C8FAD48D7DE50547");
  EXPECT_EQ(dangling.status, 2);
  EXPECT_NE(dangling.err.find("link.key is a link to"), std::string::npos) << dangling.err;
}

TEST_F(FieldCli, OutputThatCannotBeWrittenIsAFailure) {
  for (const char* args :
       {"field encrypt --key-file test.key 12.50", "field decrypt C8FAD48D7DE50547"}) {
    const std::string cmd = "cd '" + dir_.string() + "' && '" BELVANE_CLI_PATH "' " + args +
                            " </dev/null >/dev/full 2>err.txt";
    const int raw = std::system(cmd.c_str());
    ASSERT_TRUE(WIFEXITED(raw));
    EXPECT_EQ(WEXITSTATUS(raw), 2) << args;
    EXPECT_NE(Read(dir_ / "err.txt").find("cannot write the output"), std::string::npos)
        << Read(dir_ / "err.txt");
  }
}
