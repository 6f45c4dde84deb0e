// Key texts and key files: any content gives a key or an error naming the
// file, never a key that was not in the file.
#include "cipher/field.hpp"
#include "text/error.hpp"

#include <unistd.h>

#include <cstdint>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <string>

using namespace belvane;
namespace fs = std::filesystem;

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  static const fs::path file = [] {
    const fs::path base = fs::exists("/dev/shm") ? fs::path("/dev/shm") : fs::temp_directory_path();
    return base / ("belvane-fuzz-" + std::to_string(::getpid()) + ".key");
  }();
  const std::string s(reinterpret_cast<const char*>(data), size);
  std::string fromText;
  try {
    fromText = cipher::NormaliseFieldKeyText(s);
    if (fromText.size() != 2 * cipher::kFieldKeyBytes) std::abort();
  } catch (const Error&) {
  }
  std::ofstream(file, std::ios::binary | std::ios::trunc)
      .write(s.data(), static_cast<std::streamsize>(s.size()));
  try {
    const std::string fromFile = cipher::ReadFieldKeyFile(file);
    // Only a file of at most 4096 bytes is read; within that it must agree
    // with the text.
    if (size <= 4096 && fromFile != fromText) std::abort();
    cipher::SetFieldKeyFile(file);
    const std::string e = cipher::EncryptField("12.50");
    if (cipher::DecryptField(e) != "12.50") std::abort();
    cipher::ResetFieldKey();
  } catch (const Error& e) {
    if (e.Description().find(file.string()) == std::string::npos) std::abort();
  }
  return 0;
}
