// Settings hive files: any text reads as a hive or as a damaged file with
// its reason, never a crash or a throw; a hive that reads is written back
// to a text that reads as the same hive.
#include "diagram/settings_store.hpp"

#include <cstdint>
#include <cstdlib>
#include <string_view>

using namespace belvane;

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  const std::string_view text(reinterpret_cast<const char*>(data), size);
  const diagram::ParsedHive hive = diagram::ParseHive(text);
  if (!hive.problem.empty()) return 0;
  const std::string written = diagram::FormatHive(hive.root);
  const diagram::ParsedHive again = diagram::ParseHive(written);
  if (!again.problem.empty() || diagram::FormatHive(again.root) != written) std::abort();
  return 0;
}
