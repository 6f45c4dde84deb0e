#include "cipher/blowfish.hpp"
#include "cipher/blowfish_string.hpp"
#include "cipher/byte_utils.hpp"
#include "cipher/field.hpp"
#include "text/error.hpp"
#include "text/strings.hpp"

#include <gtest/gtest.h>

#include <cstdint>
#include <filesystem>
#include <fstream>
#include <functional>
#include <random>
#include <string>
#include <thread>
#include <unistd.h>
#include <vector>

using namespace belvane;
using namespace belvane::cipher;

namespace {

// Key text of the bytes 0x00 to 0x23, a key of the tests' own.
std::string TestKeyText() {
  std::string bytes;
  for (int i = 0; i < 36; ++i)
    bytes.push_back(static_cast<char>(i));
  return StringToHex(bytes);
}

long ErrorNumber(const std::function<void()>& f) {
  try {
    f();
  } catch (const Error& e) {
    return e.Number();
  }
  return 0;
}

std::string Description(const std::function<void()>& f) {
  try {
    f();
  } catch (const Error& e) {
    return e.Description();
  }
  return "(no error)";
}

std::string Deciphered(std::string data) {
  BlowfishDecipherBytes({reinterpret_cast<std::uint8_t*>(data.data()), data.size()});
  return data;
}

std::string Enciphered(std::string data) {
  BlowfishEncipherBytes({reinterpret_cast<std::uint8_t*>(data.data()), data.size()});
  return data;
}

bool IsUpperHex(const std::string& s) {
  return s.find_first_not_of("0123456789ABCDEF") == std::string::npos;
}

class FieldTest : public ::testing::Test {
protected:
  void SetUp() override { SetFieldKeyText(TestKeyText()); }
  void TearDown() override { ResetFieldKey(); }
};

struct TempDir {
  std::filesystem::path path =
      std::filesystem::temp_directory_path() / ("belvane-cipher-" + std::to_string(getpid()));
  TempDir() { std::filesystem::create_directories(path); }
  ~TempDir() { std::filesystem::remove_all(path); }
  std::filesystem::path Write(const std::string& name, const std::string& content) const {
    std::ofstream(path / name, std::ios::binary) << content;
    return path / name;
  }
};

} // namespace

TEST_F(FieldTest, PaddingAtEveryLength0To17) {
  for (std::size_t n = 0; n <= 17; ++n) {
    const std::string plain(n, 'x');
    const std::string data = BlowfishEncryptString(plain);
    const std::size_t pad = 8 - n % 8;
    ASSERT_EQ(data.size(), 8 * (n / 8 + 1)) << n;
    EXPECT_EQ(Deciphered(data), plain + std::string(pad, static_cast<char>(pad))) << n;
    EXPECT_EQ(BlowfishDecryptString(data), plain) << n;
  }
  EXPECT_EQ(BlowfishEncryptString(""), Enciphered(std::string(8, '\x08')));
  EXPECT_EQ(BlowfishEncryptString("ABCDEFGH").substr(8), Enciphered(std::string(8, '\x08')));
}

TEST_F(FieldTest, ByteStringsEndingInPadCodesRoundTrip) {
  for (int code = 1; code <= 8; ++code) {
    for (std::size_t n = 0; n <= 16; ++n) {
      std::string plain(n, 'q');
      plain.push_back(static_cast<char>(code));
      EXPECT_EQ(BlowfishDecryptString(BlowfishEncryptString(plain)), plain) << code << "/" << n;
      plain.push_back(static_cast<char>(code)); // a run of pad-like bytes
      EXPECT_EQ(BlowfishDecryptString(BlowfishEncryptString(plain)), plain) << code << "/" << n;
    }
  }
  std::string all;
  for (int b = 0; b < 256; ++b)
    all.push_back(static_cast<char>(b));
  EXPECT_EQ(BlowfishDecryptString(BlowfishEncryptString(all)), all);
}

TEST_F(FieldTest, UnpaddingIsLenient) {
  // Only the last byte is read as the pad count, and only when it is 1 to 8.
  EXPECT_EQ(BlowfishDecryptString(Enciphered("ABCDE\x01\x02\x03")), "ABCDE");
  EXPECT_EQ(BlowfishDecryptString(Enciphered(std::string("ABCDEFG\x09"))), "ABCDEFG\x09");
  EXPECT_EQ(BlowfishDecryptString(Enciphered(std::string("ABCDEFG\0", 8))),
            std::string("ABCDEFG\0", 8));
  EXPECT_EQ(BlowfishDecryptString(Enciphered(std::string(8, '\x08'))), "");
  // Bytes past the last whole block are ignored and keep no padding in.
  const std::string data = BlowfishEncryptString("abc");
  EXPECT_EQ(BlowfishDecryptString(data + "XYZ"), "abc");
  // No whole block at all.
  EXPECT_EQ(ErrorNumber([] { BlowfishDecryptString(""); }), err::kSubscript);
  EXPECT_EQ(ErrorNumber([] { BlowfishDecryptString("1234567"); }), err::kSubscript);
}

TEST(ByteUtils, HexForms) {
  EXPECT_EQ(StringToHex("abc"), "616263");
  EXPECT_EQ(HexToString("616263"), "abc");
  EXPECT_EQ(StringToHex(std::string("\x00\x0F\x10\xFF", 4)), "000F10FF");
  EXPECT_EQ(HexToString("000f10Ff"), std::string("\x00\x0F\x10\xFF", 4));
  EXPECT_EQ(HexToString("6162634"), "abc"); // odd last digit ignored
  EXPECT_EQ(HexToString("6"), "");

  std::string all;
  for (int b = 0; b < 256; ++b)
    all.push_back(static_cast<char>(b));
  const std::string hex = StringToHex(all);
  EXPECT_EQ(hex.size(), 512u);
  EXPECT_TRUE(IsUpperHex(hex));
  EXPECT_EQ(HexToString(hex), all);

  std::uint8_t bytes[4] = {9, 9, 9, 9};
  EXPECT_EQ(HexToBytes("0A0B0", bytes), 2u);
  EXPECT_EQ(bytes[0], 0x0A);
  EXPECT_EQ(bytes[1], 0x0B);
  EXPECT_EQ(bytes[2], 9);
}

TEST(ByteUtils, BadInputIsRefused) {
  for (const char* bad : {"G1", "1G", " 1", "1 ", "+1", "-1", "0x", "&H"}) {
    EXPECT_EQ(ErrorNumber([&] { HexToString(std::string("AB") + bad); }), err::kTypeMismatch)
        << bad;
  }
  EXPECT_EQ(ErrorNumber([] { HexToString(std::string("A\0", 2)); }), err::kTypeMismatch);
  EXPECT_NE(Description([] { HexToString("00ZZ"); }).find("\"ZZ\" at position 3"),
            std::string::npos);

  std::uint8_t bytes[2] = {1, 2};
  EXPECT_EQ(ErrorNumber([&] { HexToBytes("AABBCC", bytes); }), err::kSubscript);
  EXPECT_EQ(bytes[0], 1); // nothing written
}

TEST_F(FieldTest, TextForm) {
  for (std::size_t n = 0; n <= 17; ++n) {
    const std::string text = EncryptField(std::string(n, '7'));
    EXPECT_EQ(text.size(), 16 * (n / 8 + 1)) << n;
    EXPECT_TRUE(IsUpperHex(text)) << text;
  }
  // Pinned against an independent Blowfish: byte order, padding and hex form.
  EXPECT_EQ(EncryptField("12.50"), "C8FAD48D7DE50547");
  EXPECT_EQ(EncryptField(""), "518FA9E1F2E3FF6F");
  EXPECT_EQ(EncryptField("Front Bumper Bar"), "FE47DB7AF6B6D5DF4AC23AFA5BA864C8518FA9E1F2E3FF6F");
  EXPECT_EQ(DecryptField("518FA9E1F2E3FF6F"), "");
  EXPECT_EQ(EncryptField("12.50"), EncryptField("12.50"));
}

TEST_F(FieldTest, RoundTrips) {
  std::vector<std::string> values = {"",
                                     "A",
                                     "ABCDEFGH",
                                     "12.50",
                                     "L/H Guard £5 – €",
                                     "Pare-chocs arrière",
                                     std::string("x\0y", 3)};
  for (int code = 1; code <= 8; ++code) {
    values.push_back("Bonnet" + std::string(1, static_cast<char>(code)));
    values.push_back("1234567" + std::string(1, static_cast<char>(code)));
  }
  std::string all;
  for (int b = 0; b < 256; ++b)
    all.push_back(static_cast<char>(b));
  values.push_back(text::Cp1252ToUtf8(all));
  for (const std::string& v : values) {
    const std::string enc = EncryptField(v);
    EXPECT_EQ(DecryptField(enc), v);
    std::string lower = enc;
    for (char& c : lower)
      c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
    EXPECT_EQ(DecryptField(lower), v);
    EXPECT_EQ(DecryptField(enc + "F"), v); // odd last digit ignored
  }
}

TEST_F(FieldTest, Windows1252Boundary) {
  // Characters Windows-1252 holds are enciphered as their single bytes.
  EXPECT_EQ(EncryptField("€ £ é"), StringToHex(BlowfishEncryptString("\x80 \xA3 \xE9")));
  EXPECT_EQ(DecryptField(StringToHex(BlowfishEncryptString("\x80\x92"))), "€\u2019");
  // Others are refused, never substituted.
  for (const char* bad : {"Ā", "bonnet ✓", "😀", "\xFF\xFE"}) {
    EXPECT_EQ(ErrorNumber([&] { EncryptField(bad); }), err::kInvalidCall) << bad;
  }
  EXPECT_NE(Description([] { EncryptField("Guard Ā"); }).find("U+0100"), std::string::npos);
}

TEST_F(FieldTest, BadFieldTexts) {
  EXPECT_EQ(DecryptField(""), "");
  EXPECT_EQ(ErrorNumber([] { DecryptField("C8FAD48D7DE5054G"); }), err::kTypeMismatch);
  EXPECT_EQ(ErrorNumber([] { DecryptField(" C8FAD48D7DE50547"); }), err::kTypeMismatch);
  EXPECT_EQ(ErrorNumber([] { DecryptField("ZZ"); }), err::kTypeMismatch);
  for (const char* shortText : {"C", "C8", "C8FAD48D7DE5054", "C8FAD48D7DE505"}) {
    EXPECT_EQ(ErrorNumber([&] { DecryptField(shortText); }), err::kSubscript) << shortText;
  }
  // Under another key a well-formed text deciphers without an error.
  const std::string enc = EncryptField("Rear Door Shell L/H");
  SetFieldKeyText(std::string(72, '5'));
  std::string other;
  EXPECT_NO_THROW(other = DecryptField(enc));
  EXPECT_NE(other, "Rear Door Shell L/H");
}

TEST_F(FieldTest, ArbitraryTextsGiveAValueOrAnError) {
  // Whatever a catalogue column holds: a value, or error 9 or 13, never more
  // (the sanitizer build checks the memory side).
  std::mt19937 rng(4);
  const std::string alphabet = "0123456789ABCDEFabcdefXz \x80\xFF";
  for (int i = 0; i < 3000; ++i) {
    std::string t(rng() % 41, ' ');
    for (char& c : t)
      c = alphabet[rng() % alphabet.size()];
    try {
      DecryptField(t);
    } catch (const Error& e) {
      EXPECT_TRUE(e.Number() == err::kSubscript || e.Number() == err::kTypeMismatch) << t;
    }
  }
}

TEST_F(FieldTest, DecryptingTheEmptyTextLeavesTheCipherAlone) {
  InitBlowfishTables();
  EXPECT_EQ(DecryptField(""), "");
  EXPECT_FALSE(BlowfishKeyed());
}

TEST_F(FieldTest, AnUnkeyedThreadSetsTheFieldKeyUpFirst) {
  const std::string expected = EncryptField("Radiator Support");
  InitBlowfishTables();
  EXPECT_EQ(EncryptField("Radiator Support"), expected);
  InitBlowfishTables();
  EXPECT_EQ(DecryptField(expected), "Radiator Support");

  std::string fromOther;
  std::thread([&] { fromOther = EncryptField("Radiator Support"); }).join();
  EXPECT_EQ(fromOther, expected); // the host's key is process-wide
}

TEST(FieldKey, KeyTextsAndTheBuiltInKey) {
  const std::string builtIn = BuiltInCipherKeyText();
  EXPECT_EQ(builtIn.size(), 72u);
  EXPECT_TRUE(IsUpperHex(builtIn));
  for (char c : HexToString(builtIn))
    EXPECT_TRUE(c >= 32 && c <= 126);

  std::string spaced;
  for (std::size_t i = 0; i < 72; i += 8)
    spaced += "  " + TestKeyText().substr(i, 8) + "\r\n";
  for (char& c : spaced)
    c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
  EXPECT_EQ(NormaliseFieldKeyText(spaced), TestKeyText());
  EXPECT_EQ(ErrorNumber([] { NormaliseFieldKeyText(std::string(70, 'A')); }), err::kInvalidCall);
  EXPECT_EQ(ErrorNumber([] { NormaliseFieldKeyText(std::string(74, 'A')); }), err::kInvalidCall);
  EXPECT_EQ(ErrorNumber([] { NormaliseFieldKeyText(std::string(71, 'A') + "G"); }),
            err::kTypeMismatch);

  if (std::filesystem::exists(kFieldKeyFilePath)) GTEST_SKIP() << "this machine has a key file";
  ResetFieldKey();
  EXPECT_EQ(BuildCipherKeyText(), builtIn);
  EXPECT_EQ(EncryptField("12.50"), "C0A502F2F0B2EB47"); // catalogues rely on this
  SetFieldKeyText(TestKeyText());
  EXPECT_EQ(BuildCipherKeyText(), TestKeyText());
  ResetFieldKey();
  EXPECT_EQ(BuildCipherKeyText(), builtIn);
}

TEST_F(FieldTest, KeyFiles) {
  TempDir dir;
  const std::string underTestKey = EncryptField("Hinge");
  const auto comment = dir.Write("comment.key", "# \n" + std::string(72, 'A'));
  EXPECT_EQ(ErrorNumber([&] { SetFieldKeyFile(comment); }), err::kTypeMismatch);
  const auto spread = dir.Write("spread.key", TestKeyText().substr(0, 40) + "\n\t" +
                                                  TestKeyText().substr(40) + "\n");
  SetFieldKeyText(std::string(72, '9'));
  SetFieldKeyFile(spread);
  EXPECT_EQ(BuildCipherKeyText(), TestKeyText());
  EXPECT_EQ(EncryptField("Hinge"), underTestKey);

  // Failures name the file and keep the key in force.
  const auto shortKey = dir.Write("short.key", std::string(71, 'A'));
  const auto huge = dir.Write("huge.key", std::string(5000, ' '));
  EXPECT_EQ(ErrorNumber([&] { SetFieldKeyFile(shortKey); }), err::kInvalidCall);
  EXPECT_NE(Description([&] { SetFieldKeyFile(shortKey); }).find("short.key"), std::string::npos);
  EXPECT_EQ(ErrorNumber([&] { SetFieldKeyFile(huge); }), err::kInvalidCall);
  EXPECT_EQ(ErrorNumber([&] { SetFieldKeyFile(dir.path / "missing.key"); }), 53);
  EXPECT_EQ(ErrorNumber([&] { SetFieldKeyFile(dir.path); }), 75);
  EXPECT_EQ(BuildCipherKeyText(), TestKeyText());
  EXPECT_EQ(EncryptField("Hinge"), underTestKey);

  InitFieldCipher();
  const BlowfishState once = BlowfishCurrentState();
  InitFieldCipher();
  EXPECT_EQ(BlowfishCurrentState(), once);
}
