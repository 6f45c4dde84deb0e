#include "cipher/blowfish_string.hpp"

#include "cipher/blowfish.hpp"
#include "text/error.hpp"

#include <cstdint>
#include <span>

namespace belvane::cipher {

namespace {

std::span<std::uint8_t> Bytes(std::string& s) {
  return {reinterpret_cast<std::uint8_t*>(s.data()), s.size()};
}

} // namespace

std::string BlowfishEncryptString(std::string_view plain) {
  const std::size_t pad = kBlowfishBlockBytes - plain.size() % kBlowfishBlockBytes;
  std::string out;
  out.reserve(plain.size() + pad);
  out.append(plain);
  out.append(pad, static_cast<char>(pad));
  BlowfishEncipherBytes(Bytes(out));
  return out;
}

std::string BlowfishDecryptString(std::string_view data) {
  std::string out(data);
  BlowfishDecryptInPlace(out);
  return out;
}

void BlowfishDecryptInPlace(std::string& data) {
  const std::size_t whole = data.size() - data.size() % kBlowfishBlockBytes;
  if (whole == 0) {
    throw Error(err::kSubscript,
                "Subscript out of range: enciphered data of " + std::to_string(data.size()) +
                    " bytes holds no whole 8-byte block",
                "Belvane.Cipher");
  }
  data.resize(whole);
  BlowfishDecipherBytes(Bytes(data));
  // The pad count is taken against the deciphered length, so bytes past the
  // last whole block never keep padding in the result.
  const auto pad = static_cast<std::uint8_t>(data.back());
  if (pad <= kBlowfishBlockBytes) data.resize(whole - pad);
}

} // namespace belvane::cipher
