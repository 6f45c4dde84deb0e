// Blowfish throughput, key set-up and DecryptField, each against the same work
// done with OpenSSL's Blowfish in the same process. After the usual table the
// program prints the ratio of each pair (Belvane rate / OpenSSL rate; above 1
// means Belvane is faster); the goals follow.

// The low-level BF_* calls are deprecated in OpenSSL 3 but are exactly the
// baseline wanted: plain Blowfish, one block per call.
#define OPENSSL_SUPPRESS_DEPRECATED
#include <openssl/blowfish.h>

#include "cipher/blowfish.hpp"
#include "cipher/byte_utils.hpp"
#include "cipher/field.hpp"
#include "text/strings.hpp"

#include "goals.hpp"

#include <benchmark/benchmark.h>

#include <array>
#include <cstdint>
#include <cstdio>
#include <map>
#include <string>
#include <vector>

namespace {

using namespace belvane;
using namespace belvane::cipher;

constexpr std::size_t kEcbBytes = std::size_t{64} << 20;
constexpr std::size_t kFieldTexts = 1024;

const std::array<std::uint8_t, 36>& Key() {
  static const auto key = [] {
    std::array<std::uint8_t, 36> k{};
    for (std::size_t i = 0; i < k.size(); ++i)
      k[i] = static_cast<std::uint8_t>(0x21 + 7 * i);
    return k;
  }();
  return key;
}

std::vector<std::uint8_t>& EcbBuffer() {
  static std::vector<std::uint8_t> buf = [] {
    std::vector<std::uint8_t> b(kEcbBytes);
    for (std::size_t i = 0; i < b.size(); ++i)
      b[i] = static_cast<std::uint8_t>(i * 131 + 7);
    return b;
  }();
  return buf;
}

// One-block field texts (values of 0 to 7 characters) under the benchmark key.
const std::vector<std::string>& FieldTexts() {
  static const std::vector<std::string> texts = [] {
    BlowfishInitKey(Key(), 36);
    std::vector<std::string> t;
    for (std::size_t i = 0; i < kFieldTexts; ++i) {
      t.push_back(EncryptField(std::to_string(i * 7919 % 100000) + (i % 3 == 0 ? ".5" : "")));
    }
    return t;
  }();
  return texts;
}

BF_KEY OpenSslKey() {
  BF_KEY key;
  BF_set_key(&key, static_cast<int>(Key().size()), Key().data());
  return key;
}

template <bool Encrypt> void EcbBelvane(benchmark::State& state) {
  BlowfishInitKey(Key(), 36);
  auto& buf = EcbBuffer();
  for (auto _ : state) {
    if constexpr (Encrypt) {
      BlowfishEncipherBytes(buf);
    } else {
      BlowfishDecipherBytes(buf);
    }
    benchmark::ClobberMemory();
  }
  state.SetBytesProcessed(static_cast<std::int64_t>(state.iterations() * kEcbBytes));
}

template <bool Encrypt> void EcbOpenSsl(benchmark::State& state) {
  const BF_KEY key = OpenSslKey();
  auto& buf = EcbBuffer();
  for (auto _ : state) {
    for (std::size_t i = 0; i < buf.size(); i += 8) {
      BF_ecb_encrypt(buf.data() + i, buf.data() + i, &key, Encrypt ? BF_ENCRYPT : BF_DECRYPT);
    }
    benchmark::ClobberMemory();
  }
  state.SetBytesProcessed(static_cast<std::int64_t>(state.iterations() * kEcbBytes));
}

void KeySetupBelvane(benchmark::State& state) {
  for (auto _ : state) {
    benchmark::DoNotOptimize(BlowfishInitKey(Key(), 36));
    benchmark::ClobberMemory();
  }
  state.SetItemsProcessed(state.iterations());
}

void KeySetupOpenSsl(benchmark::State& state) {
  BF_KEY key;
  for (auto _ : state) {
    BF_set_key(&key, 36, Key().data());
    benchmark::DoNotOptimize(key);
    benchmark::ClobberMemory();
  }
  state.SetItemsProcessed(state.iterations());
}

void DecryptFieldBelvane(benchmark::State& state) {
  const auto& texts = FieldTexts();
  BlowfishInitKey(Key(), 36);
  std::size_t i = 0;
  for (auto _ : state) {
    benchmark::DoNotOptimize(DecryptField(texts[i]));
    i = (i + 1) % texts.size();
  }
  state.SetItemsProcessed(state.iterations());
}

// A catalogue row's three enciphered fields deciphered together, as the
// parts loader does; items are values.
void DecryptFieldsRowOfThree(benchmark::State& state) {
  const auto& texts = FieldTexts();
  BlowfishInitKey(Key(), 36);
  std::array<std::string, 3> values;
  std::size_t i = 0;
  for (auto _ : state) {
    const std::array<std::string_view, 3> row = {texts[i], texts[i + 1], texts[i + 2]};
    DecryptFields(row, values);
    benchmark::DoNotOptimize(values);
    i = (i + 3) % (texts.size() - 2);
  }
  state.SetItemsProcessed(state.iterations() * 3);
}

// The same steps as DecryptField with OpenSSL's Blowfish in the middle: hex
// to bytes, decipher the block, drop the padding, Windows-1252 to UTF-8.
std::string DecryptFieldOpenSsl(const std::string& text, const BF_KEY& key) {
  std::string bytes = HexToString(text);
  auto* p = reinterpret_cast<unsigned char*>(bytes.data());
  for (std::size_t b = 0; b + 8 <= bytes.size(); b += 8)
    BF_ecb_encrypt(p + b, p + b, &key, 0);
  const auto pad = static_cast<unsigned char>(bytes.back());
  if (pad <= 8) bytes.resize(bytes.size() - pad);
  return text::Cp1252ToUtf8(bytes);
}

void DecryptFieldOpenSsl(benchmark::State& state) {
  const auto& texts = FieldTexts();
  const BF_KEY key = OpenSslKey();
  if (DecryptFieldOpenSsl(texts[1], key) != "7919") state.SkipWithError("baseline disagrees");
  std::size_t i = 0;
  for (auto _ : state) {
    benchmark::DoNotOptimize(DecryptFieldOpenSsl(texts[i], key));
    i = (i + 1) % texts.size();
  }
  state.SetItemsProcessed(state.iterations());
}

} // namespace

int main(int argc, char** argv) {
  using benchmark::RegisterBenchmark;
  RegisterBenchmark("EcbEncrypt64MiB/Belvane", EcbBelvane<true>)->Unit(benchmark::kMillisecond);
  RegisterBenchmark("EcbEncrypt64MiB/OpenSSL", EcbOpenSsl<true>)->Unit(benchmark::kMillisecond);
  RegisterBenchmark("EcbDecrypt64MiB/Belvane", EcbBelvane<false>)->Unit(benchmark::kMillisecond);
  RegisterBenchmark("EcbDecrypt64MiB/OpenSSL", EcbOpenSsl<false>)->Unit(benchmark::kMillisecond);
  RegisterBenchmark("KeySetup36/Belvane", KeySetupBelvane)->Unit(benchmark::kMicrosecond);
  RegisterBenchmark("KeySetup36/OpenSSL", KeySetupOpenSsl)->Unit(benchmark::kMicrosecond);
  RegisterBenchmark("DecryptFieldOneBlock/Belvane", DecryptFieldBelvane);
  RegisterBenchmark("DecryptFieldOneBlock/OpenSSL", DecryptFieldOpenSsl);
  RegisterBenchmark("DecryptFieldsRowOfThree/Belvane", DecryptFieldsRowOfThree);
  using belvane::bench::Measure;
  auto rate = [](const char* name, const char* counter, const char* label = "") {
    return Measure{name, counter, label};
  };
  belvane::bench::AddRatioGoal(
      "DecryptField, one-block values (rate)",
      rate("DecryptFieldOneBlock/Belvane", "items_per_second"),
      rate("DecryptFieldOneBlock/OpenSSL", "items_per_second", "OpenSSL Blowfish, same steps"), 1.5,
      belvane::bench::Limit::AtLeast);
  belvane::bench::AddValueGoal("DecryptField, one-block values per second",
                               rate("DecryptFieldOneBlock/Belvane", "items_per_second"), 15e6,
                               belvane::bench::Limit::AtLeast, "values/s");
  belvane::bench::AddRatioGoal(
      "DecryptFields, one-block values three at a time (a catalogue row)",
      rate("DecryptFieldsRowOfThree/Belvane", "items_per_second"),
      rate("DecryptFieldOneBlock/OpenSSL", "items_per_second", "OpenSSL Blowfish, same steps"), 1.5,
      belvane::bench::Limit::AtLeast);
  belvane::bench::AddValueGoal("DecryptFields, one-block values three at a time per second",
                               rate("DecryptFieldsRowOfThree/Belvane", "items_per_second"), 15e6,
                               belvane::bench::Limit::AtLeast, "values/s");
  return belvane::bench::RunWithGoals(argc, argv);
}
