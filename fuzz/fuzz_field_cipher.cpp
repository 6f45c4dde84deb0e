// Enciphered field texts and their hexadecimal forms: any text deciphers or
// is refused with an error, texts deciphered together read as each alone,
// and every value that enciphers deciphers back.
#include "cipher/byte_utils.hpp"
#include "cipher/field.hpp"
#include "text/error.hpp"

#include <array>
#include <cstdint>
#include <cstdlib>
#include <string>
#include <string_view>
#include <vector>

using namespace belvane;

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  const std::string s(reinterpret_cast<const char*>(data), size);
  try {
    (void)cipher::DecryptField(s);
  } catch (const Error&) {
  }
  // Split at '|', the pieces deciphered together read as each alone, and
  // fail together when one fails.
  {
    std::vector<std::string_view> pieces;
    for (std::size_t begin = 0;;) {
      const std::size_t bar = s.find('|', begin);
      pieces.push_back(std::string_view(s).substr(begin, bar - begin));
      if (bar == std::string::npos) break;
      begin = bar + 1;
    }
    std::vector<std::string> alone;
    bool failed = false;
    for (std::string_view p : pieces) {
      try {
        alone.push_back(cipher::DecryptField(p));
      } catch (const Error&) {
        failed = true;
      }
    }
    std::vector<std::string> together(pieces.size());
    try {
      cipher::DecryptFields(pieces, together);
      if (failed || together != alone) std::abort();
    } catch (const Error&) {
      if (!failed) std::abort();
    }
  }
  try {
    (void)cipher::HexToString(s);
  } catch (const Error&) {
  }
  try {
    std::array<uint8_t, 36> key{};
    (void)cipher::HexToBytes(s, key);
  } catch (const Error&) {
  }
  std::string enciphered;
  try {
    enciphered = cipher::EncryptField(s);
  } catch (const Error&) {
    return 0; // not UTF-8, or not a Windows-1252 character
  }
  if (enciphered.size() % 16 != 0) std::abort();
  if (cipher::DecryptField(enciphered) != s) std::abort();
  if (cipher::HexToString(cipher::StringToHex(s)) != s) std::abort();
  return 0;
}
