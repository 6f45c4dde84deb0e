#include "cipher/field.hpp"

#include "cipher/blowfish.hpp"
#include "cipher/blowfish_string.hpp"
#include "cipher/byte_utils.hpp"
#include "text/error.hpp"
#include "text/strings.hpp"

#include <array>
#include <cstdint>
#include <fstream>
#include <mutex>
#include <optional>
#include <system_error>
#include <vector>

namespace belvane::cipher {

namespace {

constexpr const char* kSource = "Belvane.Cipher";
constexpr long kFileNotFound = 53;
constexpr long kFileAccess = 75;
// A key file is 72 digits and some whitespace; anything much bigger is the
// wrong file.
constexpr std::streamsize kMaxKeyFileBytes = 4096;

// The built-in key: 36 printable character codes. Catalogues are enciphered
// under these values, so they never change.
constexpr std::array<std::uint8_t, kFieldKeyBytes> kBuiltInKey = {
    75, 37, 37,  122, 106, 122, 121, 74, 77, 122, 65, 66, 80, 120, 120, 100, 40, 105,
    47, 86, 123, 96,  91,  123, 96,  47, 37, 38,  86, 75, 79, 90,  124, 94,  39, 50};

static_assert([] {
  for (std::uint8_t c : kBuiltInKey) {
    if (c < 32 || c > 126) return false;
  }
  return true;
}());

std::mutex gHostKeyMutex;
std::optional<std::string> gHostKeyText; // normalised

bool IsSpace(char c) {
  return c == ' ' || c == '\t' || c == '\n' || c == '\r' || c == '\v' || c == '\f';
}

bool IsHexDigit(char c) {
  return (c >= '0' && c <= '9') || (c >= 'A' && c <= 'F') || (c >= 'a' && c <= 'f');
}

std::optional<std::string> HostKeyText() {
  std::lock_guard lock(gHostKeyMutex);
  return gHostKeyText;
}

void SetHostKeyText(std::string normalised) {
  {
    std::lock_guard lock(gHostKeyMutex);
    gHostKeyText = std::move(normalised);
  }
  InitFieldCipher();
}

void EnsureKeyed() {
  if (!BlowfishKeyed()) InitFieldCipher();
}

} // namespace

std::string BuiltInCipherKeyText() {
  return StringToHex(
      std::string_view(reinterpret_cast<const char*>(kBuiltInKey.data()), kBuiltInKey.size()));
}

std::string BuildCipherKeyText() { return BuildCipherKeyText(kFieldKeyFilePath); }

std::string BuildCipherKeyText(const std::filesystem::path& machineKeyFile) {
  if (auto host = HostKeyText()) return *host;
  // The link itself counts: a key file that is a link to nowhere is a key
  // file that cannot be read, not an absent one.
  std::error_code ec;
  const auto status = std::filesystem::symlink_status(machineKeyFile, ec);
  if (ec && ec != std::errc::no_such_file_or_directory) {
    throw Error(kFileAccess,
                "Path/File access error: cannot look up the key file " + machineKeyFile.string() +
                    ": " + ec.message(),
                kSource);
  }
  if (std::filesystem::exists(status)) return ReadFieldKeyFile(machineKeyFile);
  return BuiltInCipherKeyText();
}

std::string NormaliseFieldKeyText(std::string_view keyText) {
  std::string digits;
  digits.reserve(2 * kFieldKeyBytes);
  for (std::size_t i = 0; i < keyText.size(); ++i) {
    const char c = keyText[i];
    if (IsSpace(c)) continue;
    if (!IsHexDigit(c)) {
      throw Error(err::kTypeMismatch,
                  "Type mismatch: the key text holds a character at position " +
                      std::to_string(i + 1) + " that is not a hexadecimal digit",
                  kSource);
    }
    digits.push_back(c >= 'a' ? static_cast<char>(c - 'a' + 'A') : c);
  }
  if (digits.size() != 2 * kFieldKeyBytes) {
    throw Error(err::kInvalidCall,
                "Invalid key: the key text holds " + std::to_string(digits.size()) +
                    " hexadecimal digits; a key is " + std::to_string(2 * kFieldKeyBytes),
                kSource);
  }
  return digits;
}

std::string ReadFieldKeyFile(const std::filesystem::path& path) {
  if (path.empty())
    throw Error(err::kInvalidCall, "Invalid key file: the key file name is empty", kSource);
  std::error_code ec;
  const auto status = std::filesystem::status(path, ec);
  if (ec == std::errc::no_such_file_or_directory) {
    std::error_code linkEc;
    if (std::filesystem::is_symlink(std::filesystem::symlink_status(path, linkEc)))
      throw Error(kFileNotFound,
                  "File not found: key file " + path.string() + " is a link to " +
                      std::filesystem::read_symlink(path, linkEc).string() +
                      ", which does not exist",
                  kSource);
    throw Error(kFileNotFound, "File not found: key file " + path.string(), kSource);
  }
  std::ifstream in;
  if (!ec && !std::filesystem::is_directory(status)) in.open(path, std::ios::binary);
  if (!in.is_open()) {
    throw Error(kFileAccess, "Path/File access error: cannot read key file " + path.string(),
                kSource);
  }
  std::string content(static_cast<std::size_t>(kMaxKeyFileBytes) + 1, '\0');
  in.read(content.data(), kMaxKeyFileBytes + 1);
  if (in.bad()) {
    throw Error(kFileAccess, "Path/File access error: cannot read key file " + path.string(),
                kSource);
  }
  content.resize(static_cast<std::size_t>(in.gcount()));
  if (content.size() > static_cast<std::size_t>(kMaxKeyFileBytes)) {
    throw Error(err::kInvalidCall,
                "Invalid key: key file " + path.string() + " is too large to hold a key text",
                kSource);
  }
  try {
    return NormaliseFieldKeyText(content);
  } catch (const Error& e) {
    throw Error(e.Number(), e.Description() + " (key file " + path.string() + ")", kSource);
  }
}

void SetFieldKeyText(std::string_view keyText) { SetHostKeyText(NormaliseFieldKeyText(keyText)); }

void SetFieldKeyFile(const std::filesystem::path& path) { SetHostKeyText(ReadFieldKeyFile(path)); }

void ResetFieldKey() {
  {
    std::lock_guard lock(gHostKeyMutex);
    gHostKeyText.reset();
  }
  InitBlowfishTables();
}

void InitFieldCipher() {
  const std::string keyText = BuildCipherKeyText();
  std::array<std::uint8_t, kFieldKeyBytes> key{};
  const std::size_t count = HexToBytes(keyText, key);
  BlowfishInitKey(key, static_cast<int>(count));
}

std::string EncryptField(std::string_view utf8) {
  const std::string bytes = text::Utf8ToCp1252(utf8);
  EnsureKeyed();
  return StringToHex(BlowfishEncryptString(bytes));
}

namespace {

// DecryptField one text at a time, for the texts the batch below does not
// take: a text with bytes past its last whole block, or one it cannot read,
// for which this raises the error.
// The deciphered bytes as UTF-8 into `value`. Most catalogue values are
// plain ASCII, which reads the same in Windows-1252 and UTF-8.
void AssignUtf8(std::string& value, std::string_view bytes) {
  bool ascii = true;
  for (char c : bytes)
    ascii &= static_cast<unsigned char>(c) < 0x80;
  if (ascii)
    value.assign(bytes);
  else
    value = text::Cp1252ToUtf8(bytes);
}

std::string DecryptOneField(std::string_view fieldText) {
  std::string bytes = HexToString(fieldText);
  if (bytes.size() < kBlowfishBlockBytes) {
    throw Error(err::kSubscript,
                "Subscript out of range: an enciphered field text of " +
                    std::to_string(fieldText.size()) +
                    " digits is shorter than one block (16 digits)",
                kSource);
  }
  EnsureKeyed();
  BlowfishDecryptInPlace(bytes);
  std::string value;
  AssignUtf8(value, bytes);
  return value;
}

// Room on the stack for the blocks of a catalogue row's fields.
constexpr std::size_t kBatchBytes = 256;

} // namespace

std::string DecryptField(std::string_view fieldText) {
  std::string value;
  DecryptFields(std::span(&fieldText, 1), std::span(&value, 1));
  return value;
}

void DecryptFields(std::span<const std::string_view> fieldTexts, std::span<std::string> values) {
  if (values.size() != fieldTexts.size()) {
    throw Error(err::kInvalidCall,
                "Invalid procedure call: " + std::to_string(fieldTexts.size()) +
                    " field texts to decipher into " + std::to_string(values.size()) + " values",
                kSource);
  }
  // Every text of whole blocks has its bytes decoded into one buffer; the
  // buffer is deciphered in one call, several blocks at a time, then each
  // value is cut from its bytes. `ends[i]` is where text i's bytes end, or
  // 0 when the text is not in the buffer.
  std::size_t total = 0;
  for (std::string_view t : fieldTexts)
    total += t.size() / 2;
  std::array<std::uint8_t, kBatchBytes> small;
  std::vector<std::uint8_t> large;
  std::uint8_t* buffer = small.data();
  if (total > small.size()) {
    large.resize(total);
    buffer = large.data();
  }
  std::array<std::size_t, 8> smallEnds;
  std::vector<std::size_t> largeEnds;
  std::size_t* ends = smallEnds.data();
  if (fieldTexts.size() > smallEnds.size()) {
    largeEnds.resize(fieldTexts.size());
    ends = largeEnds.data();
  }
  std::size_t used = 0;
  for (std::size_t i = 0; i < fieldTexts.size(); ++i) {
    const std::string_view t = fieldTexts[i];
    ends[i] = 0;
    const std::size_t count = t.size() / 2;
    if (t.empty()) {
      values[i].clear();
    } else if (count >= kBlowfishBlockBytes && count % kBlowfishBlockBytes == 0 &&
               TryHexToBytes(t, buffer + used)) {
      used += count;
      ends[i] = used;
    } else {
      values[i] = DecryptOneField(t);
    }
  }
  if (used == 0) return;
  EnsureKeyed();
  BlowfishDecipherBytes(std::span(buffer, used));
  std::size_t begin = 0;
  for (std::size_t i = 0; i < fieldTexts.size(); ++i) {
    if (ends[i] == 0) continue;
    std::size_t end = ends[i];
    const std::uint8_t pad = buffer[end - 1];
    const std::size_t length = end - begin;
    if (pad <= kBlowfishBlockBytes) end -= pad;
    const std::string_view kept(reinterpret_cast<const char*>(buffer + begin), end - begin);
    begin += length;
    AssignUtf8(values[i], kept);
  }
}

} // namespace belvane::cipher
