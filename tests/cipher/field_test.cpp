#include "../error_number.hpp"
#include "cipher/blowfish.hpp"
#include "cipher/blowfish_string.hpp"
#include "cipher/byte_utils.hpp"
#include "cipher/field.hpp"
#include "text/error.hpp"
#include "text/strings.hpp"

#include <gtest/gtest.h>

#include <array>
#include <cstdint>
#include <filesystem>
#include <fstream>
#include <functional>
#include <random>
#include <string>
#include <string_view>
#include <thread>
#include <unistd.h>
#include <vector>

using namespace belvane;
using namespace belvane::cipher;
using belvane::test::ErrorNumber;
using namespace std::string_literals;

namespace {

// Key text of the bytes 0x00 to 0x23, a key of the tests' own.
const std::string kTestKey =
    "000102030405060708090A0B0C0D0E0F101112131415161718191A1B1C1D1E1F20212223";

std::string AllBytes() {
  std::string all;
  for (int b = 0; b < 256; ++b)
    all.push_back(static_cast<char>(b));
  return all;
}

std::pair<long, std::string> Failure(const std::function<void()>& f) {
  std::string description;
  const long number = ErrorNumber(f, &description);
  return {number, description};
}

// Raw ECB over whole blocks, to see and to make padding directly.
std::string Ecb(std::string data, bool encipher) {
  std::span<std::uint8_t> bytes(reinterpret_cast<std::uint8_t*>(data.data()), data.size());
  encipher ? BlowfishEncipherBytes(bytes) : BlowfishDecipherBytes(bytes);
  return data;
}

bool IsUpperHex(const std::string& s) {
  return s.find_first_not_of("0123456789ABCDEF") == std::string::npos;
}

class FieldTest : public ::testing::Test {
protected:
  void SetUp() override { SetFieldKeyText(kTestKey); }
  void TearDown() override { ResetFieldKey(); }
};

} // namespace

TEST_F(FieldTest, PaddingAndUnpadding) {
  for (std::size_t n = 0; n <= 17; ++n) {
    const std::string plain(n, 'x');
    const std::string data = BlowfishEncryptString(plain);
    const std::size_t pad = 8 - n % 8;
    ASSERT_EQ(data.size(), 8 * (n / 8 + 1)) << n;
    EXPECT_EQ(Ecb(data, false), plain + std::string(pad, static_cast<char>(pad))) << n;
    EXPECT_EQ(BlowfishDecryptString(data), plain) << n;
  }
  // Only the last byte is read as the pad count, and only when it is 1 to 8.
  EXPECT_EQ(BlowfishDecryptString(Ecb("ABCDE\x01\x02\x03", true)), "ABCDE");
  EXPECT_EQ(BlowfishDecryptString(Ecb("ABCDEFG\x09", true)), "ABCDEFG\x09");
  const std::string zeroLast("ABCDEFG\0", 8);
  EXPECT_EQ(BlowfishDecryptString(Ecb(zeroLast, true)), zeroLast);
  // Bytes past the last whole block are ignored and keep no padding in.
  EXPECT_EQ(BlowfishDecryptString(BlowfishEncryptString("abc") + "XYZ"), "abc");
  EXPECT_EQ(ErrorNumber([] { BlowfishDecryptString("1234567"); }), err::kSubscript);
  EXPECT_EQ(ErrorNumber([] { BlowfishDecryptString(""); }), err::kSubscript);
}

TEST(ByteUtils, HexForms) {
  EXPECT_EQ(StringToHex("abc"), "616263");
  EXPECT_EQ(HexToString("616263"), "abc");
  EXPECT_EQ(StringToHex(std::string("\x00\x0F\x10\xFF", 4)), "000F10FF");
  EXPECT_EQ(HexToString("000f10Ff"), std::string("\x00\x0F\x10\xFF", 4));
  EXPECT_EQ(HexToString("6162634"), "abc"); // odd last digit ignored
  EXPECT_EQ(HexToString(StringToHex(AllBytes())), AllBytes());

  std::uint8_t bytes[4] = {9, 9, 9, 9};
  EXPECT_EQ(HexToBytes("0A0B0", bytes), 2u);
  EXPECT_EQ((std::vector<int>{bytes[0], bytes[1], bytes[2]}), (std::vector<int>{10, 11, 9}));
  EXPECT_EQ(ErrorNumber([&] { HexToBytes("AABBCCDDEE", bytes); }), err::kSubscript);
  EXPECT_EQ(bytes[0], 10); // nothing written

  for (const char* bad : {"G1", "1G", " 1", "1 ", "+1", "-1", "0x", "&H"}) {
    EXPECT_EQ(ErrorNumber([&] { HexToString(std::string("AB") + bad); }), err::kTypeMismatch)
        << bad;
  }
  EXPECT_NE(Failure([] { HexToString("00ZZ"); }).second.find("\"ZZ\" at position 3"),
            std::string::npos);
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
  EXPECT_EQ(EncryptField("12.50"), EncryptField("12.50"));
  EXPECT_EQ(DecryptField("518FA9E1F2E3FF6F"), "");
}

TEST_F(FieldTest, RoundTrips) {
  std::vector<std::string> values = {"",
                                     "ABCDEFGH",
                                     "L/H Guard £5 – €",
                                     "Pare-chocs arrière",
                                     "x\0y"s,
                                     text::Cp1252ToUtf8(AllBytes())};
  for (char code = 1; code <= 8; ++code) {
    for (std::size_t n = 0; n <= 16; ++n) {
      values.push_back(std::string(n, 'q') + code);
      values.push_back(std::string(n, 'q') + code + code);
    }
  }
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

TEST_F(FieldTest, ManyFieldsAtOnceReadAsEachAlone) {
  // Texts of every shape side by side: empty, one block, several blocks,
  // lower case, an odd last digit, Windows-1252 characters, padding counts
  // 1 to 8, and enough of them to pass both the stack's room for eight
  // texts and for 256 bytes.
  std::vector<std::string> texts = {"", EncryptField("12.50"), EncryptField("L/H Guard £5 – €"),
                                    EncryptField("ABCDEFGH") + "F"};
  for (std::size_t n = 0; n <= 40; n += 3)
    texts.push_back(EncryptField(std::string(n, static_cast<char>('a' + n % 26))));
  std::string lower = EncryptField("Pare-chocs arrière");
  for (char& c : lower)
    c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
  texts.push_back(lower);
  texts.push_back("");
  for (std::size_t count : {std::size_t{1}, std::size_t{3}, std::size_t{8}, texts.size()}) {
    std::vector<std::string_view> views(texts.begin(), texts.begin() + static_cast<long>(count));
    std::vector<std::string> values(count, "left over");
    DecryptFields(views, values);
    for (std::size_t i = 0; i < count; ++i)
      EXPECT_EQ(values[i], DecryptField(texts[i])) << count << " texts, text " << i;
  }
  EXPECT_EQ(DecryptField(texts[2]), "L/H Guard £5 – €");

  // Bytes past the last whole block are dropped as DecryptField drops them.
  const std::string extra = EncryptField("door") + "ABCD";
  std::array<std::string_view, 2> two = {extra, texts[1]};
  std::array<std::string, 2> out;
  DecryptFields(two, out);
  EXPECT_EQ(out[0], "door");
  EXPECT_EQ(out[1], "12.50");

  // A text that cannot be read raises its error wherever it stands.
  for (const char* bad : {"C8FAD48D7DE5054G", "C8FAD48D7DE505", "C8FAD48D7DE50547ZZ"}) {
    const std::array<std::string_view, 3> withBad = {texts[1], bad, texts[2]};
    std::array<std::string, 3> values;
    EXPECT_EQ(ErrorNumber([&] { DecryptFields(withBad, values); }),
              ErrorNumber([&] { DecryptField(bad); }))
        << bad;
    EXPECT_NE(ErrorNumber([&] { DecryptField(bad); }), 0) << bad;
  }
  // The values must have a place for every text.
  std::array<std::string, 1> tooFew;
  EXPECT_EQ(ErrorNumber([&] { DecryptFields(two, tooFew); }), err::kInvalidCall);
}

TEST_F(FieldTest, Windows1252Boundary) {
  // Characters Windows-1252 holds are enciphered as their single bytes.
  EXPECT_EQ(EncryptField("€ £ é"), StringToHex(BlowfishEncryptString("\x80 \xA3 \xE9")));
  EXPECT_EQ(DecryptField(StringToHex(BlowfishEncryptString("\x80\x92"))), "€\u2019");
  // Others are refused, never substituted.
  for (const char* bad : {"Ā", "bonnet ✓", "😀", "\xFF\xFE"}) {
    EXPECT_EQ(ErrorNumber([&] { EncryptField(bad); }), err::kInvalidCall) << bad;
  }
  EXPECT_NE(Failure([] { EncryptField("Guard Ā"); }).second.find("U+0100"), std::string::npos);
}

TEST_F(FieldTest, BadFieldTexts) {
  EXPECT_EQ(ErrorNumber([] { DecryptField("C8FAD48D7DE5054G"); }), err::kTypeMismatch);
  EXPECT_EQ(ErrorNumber([] { DecryptField(" C8FAD48D7DE50547"); }), err::kTypeMismatch);
  EXPECT_EQ(ErrorNumber([] { DecryptField("ZZ"); }), err::kTypeMismatch);
  for (const char* shortText : {"C", "C8", "C8FAD48D7DE5054", "C8FAD48D7DE505"}) {
    EXPECT_EQ(ErrorNumber([&] { DecryptField(shortText); }), err::kSubscript) << shortText;
  }
  // Whatever a column holds gives a value or error 9 or 13, never more (the
  // sanitizer build checks the memory side).
  std::mt19937 rng(4);
  const std::string alphabet = "0123456789ABCDEFabcdefXz \x80\xFF";
  for (int i = 0; i < 3000; ++i) {
    std::string t(rng() % 41, ' ');
    for (char& c : t)
      c = alphabet[rng() % alphabet.size()];
    const long number = ErrorNumber([&] { DecryptField(t); });
    EXPECT_TRUE(number == 0 || number == err::kSubscript || number == err::kTypeMismatch) << t;
  }
  // Under another key a well-formed text deciphers without an error.
  const std::string enc = EncryptField("Rear Door Shell L/H");
  SetFieldKeyText(std::string(72, '5'));
  std::string other;
  EXPECT_NO_THROW(other = DecryptField(enc));
  EXPECT_NE(other, "Rear Door Shell L/H");
}

TEST_F(FieldTest, KeySetUpOnDemand) {
  InitBlowfishTables();
  EXPECT_EQ(DecryptField(""), "");
  EXPECT_FALSE(BlowfishKeyed()); // the empty text leaves the cipher alone

  EXPECT_EQ(EncryptField("12.50"), "C8FAD48D7DE50547"); // sets the field key up first
  InitBlowfishTables();
  EXPECT_EQ(DecryptField("C8FAD48D7DE50547"), "12.50");

  std::string fromOther;
  std::thread([&] { fromOther = EncryptField("12.50"); }).join();
  EXPECT_EQ(fromOther, "C8FAD48D7DE50547"); // the host's key is process-wide

  InitFieldCipher();
  const BlowfishState once = BlowfishCurrentState();
  InitFieldCipher();
  EXPECT_EQ(BlowfishCurrentState(), once);
}

TEST_F(FieldTest, KeyTextsAndKeyFiles) {
  const std::string builtIn = BuiltInCipherKeyText();
  EXPECT_EQ(builtIn.size(), 72u);
  for (char c : HexToString(builtIn))
    EXPECT_TRUE(c >= 32 && c <= 126);
  EXPECT_EQ(NormaliseFieldKeyText(" 00010203 04050607\r\n08090a0b" + kTestKey.substr(24)),
            kTestKey);
  EXPECT_EQ(ErrorNumber([] { NormaliseFieldKeyText(std::string(70, 'A')); }), err::kInvalidCall);
  EXPECT_EQ(ErrorNumber([] { NormaliseFieldKeyText(std::string(71, 'A') + "G"); }),
            err::kTypeMismatch);

  const auto dir =
      std::filesystem::temp_directory_path() / ("belvane-cipher-" + std::to_string(getpid()));
  std::filesystem::create_directories(dir);
  auto write = [&](const char* name, const std::string& content) {
    std::ofstream(dir / name, std::ios::binary) << content;
    return dir / name;
  };
  SetFieldKeyText(std::string(72, '9'));
  SetFieldKeyFile(write("spread.key", kTestKey.substr(0, 40) + "\n\t" + kTestKey.substr(40)));
  EXPECT_EQ(BuildCipherKeyText(), kTestKey);
  EXPECT_EQ(EncryptField("12.50"), "C8FAD48D7DE50547");

  // Failures name the file and keep the key in force.
  const auto [number, description] =
      Failure([&] { SetFieldKeyFile(write("short.key", std::string(71, 'A'))); });
  EXPECT_EQ(number, err::kInvalidCall);
  EXPECT_NE(description.find("short.key"), std::string::npos);
  EXPECT_EQ(ErrorNumber([&] { SetFieldKeyFile(write("comment.key", "# " + kTestKey)); }),
            err::kTypeMismatch);
  EXPECT_EQ(ErrorNumber([&] { SetFieldKeyFile(write("huge.key", std::string(5000, ' '))); }),
            err::kInvalidCall);
  EXPECT_EQ(ErrorNumber([&] { SetFieldKeyFile(dir / "missing.key"); }), 53);
  EXPECT_EQ(ErrorNumber([&] { SetFieldKeyFile(dir); }), 75);
  std::filesystem::remove_all(dir);
  EXPECT_EQ(EncryptField("12.50"), "C8FAD48D7DE50547");

  if (std::filesystem::exists(kFieldKeyFilePath)) GTEST_SKIP() << "this machine has a key file";
  ResetFieldKey();
  EXPECT_EQ(BuildCipherKeyText(), builtIn);
  EXPECT_EQ(EncryptField("12.50"), "C0A502F2F0B2EB47"); // catalogues rely on the built-in key
}

TEST_F(FieldTest, AKeyFileThatWasNamedIsNeverPassedOver) {
  const auto dir =
      std::filesystem::temp_directory_path() / ("belvane-keylink-" + std::to_string(getpid()));
  std::filesystem::remove_all(dir);
  std::filesystem::create_directories(dir);
  ResetFieldKey();
  // Nothing at the machine-wide path: the built-in key.
  EXPECT_EQ(BuildCipherKeyText(dir / "absent.key"), BuiltInCipherKeyText());
  // A link that leads nowhere is a key file that cannot be read.
  std::filesystem::create_symlink(dir / "gone.key", dir / "machine.key");
  auto [number, why] = Failure([&] { BuildCipherKeyText(dir / "machine.key"); });
  EXPECT_EQ(number, 53);
  EXPECT_NE(why.find("machine.key is a link to"), std::string::npos) << why;
  EXPECT_EQ(ErrorNumber([&] { SetFieldKeyFile(dir / "machine.key"); }), 53);
  // A folder in its place cannot be read either.
  std::filesystem::create_directories(dir / "folder.key");
  EXPECT_EQ(ErrorNumber([&] { BuildCipherKeyText(dir / "folder.key"); }), 75);
  // An empty name is not "no key file".
  std::tie(number, why) = Failure([&] { SetFieldKeyFile(""); });
  EXPECT_EQ(number, err::kInvalidCall);
  EXPECT_NE(why.find("name is empty"), std::string::npos);
  // Once the link leads to a key, that key is used.
  std::ofstream(dir / "gone.key") << kTestKey;
  EXPECT_EQ(BuildCipherKeyText(dir / "machine.key"), kTestKey);
  std::filesystem::remove_all(dir);
}
