#include "cipher/blowfish.hpp"
#include "cipher/byte_utils.hpp"
#include "cipher/unsigned_word.hpp"
#include "text/error.hpp"

#include "error_number.hpp"

#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <functional>
#include <limits>
#include <string>
#include <thread>
#include <vector>

using namespace belvane;
using namespace belvane::cipher;

namespace {

std::vector<std::uint8_t> Hex(std::string_view hex) {
  std::vector<std::uint8_t> out(hex.size() / 2);
  HexToBytes(hex, out);
  return out;
}

using belvane::test::ErrorNumber;

std::uint64_t Block(std::string_view hex) { return std::stoull(std::string(hex), nullptr, 16); }

// Enciphers one block given as 16 hex digits through the block API and checks
// that deciphering gives it back.
std::uint64_t EncipherChecked(std::uint64_t plain) {
  auto l = static_cast<std::uint32_t>(plain >> 32);
  auto r = static_cast<std::uint32_t>(plain);
  BlowfishEncipherBlock(l, r);
  const std::uint64_t out = std::uint64_t{l} << 32 | r;
  BlowfishDecipherBlock(l, r);
  EXPECT_EQ(std::uint64_t{l} << 32 | r, plain);
  return out;
}

struct Vector {
  const char* key;
  const char* plain;
  const char* cipher;
};

// The published variable-key ECB vectors.
constexpr Vector kVariableKey[] = {
    {"0000000000000000", "0000000000000000", "4EF997456198DD78"},
    {"FFFFFFFFFFFFFFFF", "FFFFFFFFFFFFFFFF", "51866FD5B85ECB8A"},
    {"3000000000000000", "1000000000000001", "7D856F9A613063F2"},
    {"1111111111111111", "1111111111111111", "2466DD878B963C9D"},
    {"0123456789ABCDEF", "1111111111111111", "61F9C3802281B096"},
    {"1111111111111111", "0123456789ABCDEF", "7D0CC630AFDA1EC7"},
    {"0000000000000000", "0000000000000000", "4EF997456198DD78"},
    {"FEDCBA9876543210", "0123456789ABCDEF", "0ACEAB0FC6A0A28D"},
    {"7CA110454A1A6E57", "01A1D6D039776742", "59C68245EB05282B"},
    {"0131D9619DC1376E", "5CD54CA83DEF57DA", "B1B8CC0B250F09A0"},
    {"07A1133E4A0B2686", "0248D43806F67172", "1730E5778BEA1DA4"},
    {"3849674C2602319E", "51454B582DDF440A", "A25E7856CF2651EB"},
    {"04B915BA43FEB5B6", "42FD443059577FA2", "353882B109CE8F1A"},
    {"0113B970FD34F2CE", "059B5E0851CF143A", "48F4D0884C379918"},
    {"0170F175468FB5E6", "0756D8E0774761D2", "432193B78951FC98"},
    {"43297FAD38E373FE", "762514B829BF486A", "13F04154D69D1AE5"},
    {"07A7137045DA2A16", "3BDD119049372802", "2EEDDA93FFD39C79"},
    {"04689104C2FD3B2F", "26955F6835AF609A", "D887E0393C2DA6E3"},
    {"37D06BB516CB7546", "164D5E404F275232", "5F99D04F5B163969"},
    {"1F08260D1AC2465E", "6B056E18759F5CCA", "4A057A3B24D3977B"},
    {"584023641ABA6176", "004BD6EF09176062", "452031C1E4FADA8E"},
    {"025816164629B007", "480D39006EE762F2", "7555AE39F59B87BD"},
    {"49793EBC79B3258F", "437540C8698F3CFA", "53C55F9CB49FC019"},
    {"4FB05E1515AB73A7", "072D43A077075292", "7A8E7BFA937E89A3"},
    {"49E95D6D4CA229BF", "02FE55778117F12A", "CF9C5D7A4986ADB5"},
    {"018310DC409B26D6", "1D9D5C5018F728C2", "D1ABB290658BC778"},
    {"1C587F1C13924FEF", "305532286D6F295A", "55CB3774D13EF201"},
    {"0101010101010101", "0123456789ABCDEF", "FA34EC4847B268B2"},
    {"1F1F1F1F0E0E0E0E", "0123456789ABCDEF", "A790795108EA3CAE"},
    {"E0FEE0FEF1FEF1FE", "0123456789ABCDEF", "C39E072D9FAC631D"},
    {"0000000000000000", "FFFFFFFFFFFFFFFF", "014933E0CDAFF6E4"},
    {"FFFFFFFFFFFFFFFF", "0000000000000000", "F21E9A77B71C49BC"},
    {"0123456789ABCDEF", "0000000000000000", "245946885754369A"},
    {"FEDCBA9876543210", "FFFFFFFFFFFFFFFF", "6B5C5A9C5D9E0A5A"},
};

// The published set-key vectors: the first 1 to 24 bytes of this key, plain
// block FEDCBA9876543210.
constexpr const char* kSetKeyKey = "F0E1D2C3B4A5968778695A4B3C2D1E0F0011223344556677";
constexpr const char* kSetKeyCipher[] = {
    "F9AD597C49DB005E", "E91D21C1D961A6D6", "E9C2B70A1BC65CF3", "BE1E639408640F05",
    "B39E44481BDB1E6E", "9457AA83B1928C0D", "8BB77032F960629D", "E87A244E2CC85E82",
    "15750E7A4F4EC577", "122BA70B3AB64AE0", "3A833C9AFFC537F6", "9409DA87A90F6BF2",
    "884F80625060B8B4", "1F85031C19E11968", "79D9373A714CA34F", "93142887EE3BE15C",
    "03429E838CE2D14B", "A4299E27469FF67B", "AFD5AED1C1BC96A8", "10851C0E3858DA9F",
    "E6F51ED79B9DB21F", "64A6E14AFD36B46F", "80C7D7D45A5479AD", "05044B62FA52D080",
};

} // namespace

TEST(BlowfishVectors, VariableKey) {
  ASSERT_EQ(std::size(kVariableKey), 34u);
  for (const Vector& v : kVariableKey) {
    const auto key = Hex(v.key);
    ASSERT_TRUE(BlowfishInitKey(key, 8));
    EXPECT_EQ(EncipherChecked(Block(v.plain)), Block(v.cipher)) << "key " << v.key;
  }
}

TEST(BlowfishVectors, SetKeyLengths1To24) {
  const auto key = Hex(kSetKeyKey);
  for (int len = 1; len <= 24; ++len) {
    ASSERT_TRUE(BlowfishInitKey(key, len));
    EXPECT_EQ(EncipherChecked(Block("FEDCBA9876543210")), Block(kSetKeyCipher[len - 1]))
        << "key length " << len;
  }
}

TEST(BlowfishVectors, BulkOperationsMatchTheBlockOperation) {
  ASSERT_TRUE(BlowfishInitKey(Hex(kSetKeyKey), 24));
  // 0 to 11 blocks: four side by side, the tails of one to three, and both.
  for (std::size_t blocks = 0; blocks <= 11; ++blocks) {
    std::vector<std::uint32_t> plain(blocks * 2);
    std::vector<std::uint8_t> bytes;
    for (std::size_t i = 0; i < plain.size(); ++i) {
      plain[i] = static_cast<std::uint32_t>(0x9E3779B9u * (i + 1));
      for (std::uint8_t b : WordToBytes(plain[i]))
        bytes.push_back(b);
    }
    std::vector<std::uint32_t> words = plain;
    BlowfishEncipherWords(words);
    BlowfishEncipherBytes(bytes);
    auto wordAt = [&](std::size_t i) {
      return BytesToWord(bytes[4 * i], bytes[4 * i + 1], bytes[4 * i + 2], bytes[4 * i + 3]);
    };
    for (std::size_t i = 0; i < plain.size(); i += 2) {
      std::uint32_t l = plain[i];
      std::uint32_t r = plain[i + 1];
      BlowfishEncipherBlock(l, r);
      EXPECT_EQ(words[i], l);
      EXPECT_EQ(words[i + 1], r);
      EXPECT_EQ(wordAt(i), l);
      EXPECT_EQ(wordAt(i + 1), r);
    }
    BlowfishDecipherWords(words);
    EXPECT_EQ(words, plain) << blocks << " blocks";
    BlowfishDecipherBytes(bytes);
    for (std::size_t i = 0; i < plain.size(); ++i)
      EXPECT_EQ(wordAt(i), plain[i]);
  }
  // Partial blocks are refused and left as they are.
  std::vector<std::uint8_t> bytes(12, 0xAB);
  std::vector<std::uint32_t> words(3, 7);
  EXPECT_THROW(BlowfishEncipherBytes(bytes), Error);
  EXPECT_THROW(BlowfishDecipherWords(words), Error);
  EXPECT_EQ(bytes, std::vector<std::uint8_t>(12, 0xAB));
  EXPECT_EQ(words, std::vector<std::uint32_t>(3, 7));
}

TEST(BlowfishKey, RefusedLengthsKeepThePreviousKey) {
  std::vector<std::uint8_t> key(60);
  for (std::size_t i = 0; i < key.size(); ++i)
    key[i] = static_cast<std::uint8_t>(i + 1);

  ASSERT_TRUE(BlowfishInitKey(key, 56));
  const BlowfishState keyed56 = BlowfishCurrentState();
  for (int bad : {57, 60, -1, -32768, 32767}) {
    EXPECT_FALSE(BlowfishInitKey(key, bad)) << bad;
    EXPECT_EQ(BlowfishCurrentState(), keyed56) << bad;
  }
  // A length within the rule but beyond the bytes given is an error, and the
  // key stays as it was.
  EXPECT_EQ(ErrorNumber([&] { BlowfishInitKey(std::span(key).first(10), 11); }), err::kSubscript);
  EXPECT_EQ(BlowfishCurrentState(), keyed56);

  InitBlowfishTables();
  EXPECT_FALSE(BlowfishKeyed());
  EXPECT_EQ(BlowfishCurrentState().P[0], 0x243F6A88u);
  EXPECT_EQ(BlowfishCurrentState().S[3][255], 0x3AC372E6u);
}

TEST(BlowfishKey, SetupDependsOnlyOnTheKey) {
  const auto a = Hex("0123456789ABCDEF");
  const auto b = Hex(kSetKeyKey);
  ASSERT_TRUE(BlowfishInitKey(b, 24));
  const BlowfishState once = BlowfishCurrentState();
  ASSERT_TRUE(BlowfishInitKey(b, 24));
  EXPECT_EQ(BlowfishCurrentState(), once);
  ASSERT_TRUE(BlowfishInitKey(a, 8));
  EXPECT_NE(BlowfishCurrentState(), once);
  ASSERT_TRUE(BlowfishInitKey(b, 24));
  EXPECT_EQ(BlowfishCurrentState(), once);

  // The empty key is accepted and is the key of zero bytes.
  ASSERT_TRUE(BlowfishInitKey({}, 0));
  EXPECT_TRUE(BlowfishKeyed());
  const BlowfishState empty = BlowfishCurrentState();
  ASSERT_TRUE(BlowfishInitKey(Hex("00"), 1));
  EXPECT_EQ(BlowfishCurrentState(), empty);
  EXPECT_EQ(EncipherChecked(0), Block("4EF997456198DD78"));
}

TEST(BlowfishKey, EachThreadHasItsOwnState) {
  const auto key = Hex(kSetKeyKey);
  ASSERT_TRUE(BlowfishInitKey(key, 24));
  const BlowfishState mine = BlowfishCurrentState();
  bool otherStartedUnkeyed = false;
  BlowfishState otherInitial{};
  std::thread other([&] {
    otherStartedUnkeyed = !BlowfishKeyed();
    otherInitial = BlowfishCurrentState();
    BlowfishInitKey(key, 8);
  });
  other.join();
  EXPECT_TRUE(otherStartedUnkeyed);
  EXPECT_EQ(otherInitial.P[0], 0x243F6A88u);
  EXPECT_EQ(otherInitial.S[3][255], 0x3AC372E6u);
  EXPECT_EQ(BlowfishCurrentState(), mine);
}

TEST(UnsignedWord, DoubleToWordRangeAndRounding) {
  EXPECT_EQ(DoubleToWord(4294967295.0), 0xFFFFFFFFu);
  EXPECT_EQ(DoubleToWord(2.5), 2u);
  EXPECT_EQ(DoubleToWord(3.5), 4u);
  for (double bad : {-1.0, -0.25, 4294967296.0, 4294967295.5, std::nan(""),
                     std::numeric_limits<double>::infinity()}) {
    EXPECT_EQ(ErrorNumber([&] { DoubleToWord(bad); }), err::kOverflow) << bad;
  }
}
