// Enciphered field texts and their hexadecimal forms: any text deciphers or
// is refused with an error, and every value that enciphers deciphers back.
#include "cipher/byte_utils.hpp"
#include "cipher/field.hpp"
#include "text/error.hpp"

#include <array>
#include <cstdint>
#include <cstdlib>
#include <string>

using namespace belvane;

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  const std::string s(reinterpret_cast<const char*>(data), size);
  try {
    (void)cipher::DecryptField(s);
  } catch (const Error&) {
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
