#pragma once
// The settings store: machine-wide and per-user hives of keys and typed
// values, each hive one file. A hive is a tree of keys; a key holds named
// values and subkeys. Key and value names match without regard to case and
// keep the case they were created with. A value is a type number and its
// bytes: type 1 is text, type 4 a 32-bit number (four bytes, least
// significant first); other types are kept as they are.
//
// The file is JSON:
//
//   {
//     "format": "belvane-settings-1",
//     "keys": {
//       "SOFTWARE": { "keys": { "tessik": { "keys": { "frmsplash": {
//         "values": { "GraphicsPath": { "text": "/usr/share/belvane/graphics/" } }
//       } } } } }
//     }
//   }
//
// A value is {"text": "..."} (type 1), {"number": n} (type 4) or
// {"type": t, "hex": "..."} for any other type or bytes that are not plain
// UTF-8 text (a text with a terminating zero byte, for instance).
//
// Writers replace the file whole: they write a new file beside it and
// rename it over the old one, under a lock (an exclusive flock of the file
// "<hive>.lock"), so two processes writing at once lose neither write and
// a reader sees the old file or the new one, never a part. A damaged file
// (not JSON, or not of this shape) reads as an empty hive and is reported
// through the settings reporter; before a write replaces it, it is kept as
// "<hive>.damaged".

#include <cstddef>
#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace belvane::diagram {

// Value types of the store.
inline constexpr std::uint32_t kTextType = 1;   // text
inline constexpr std::uint32_t kNumberType = 4; // 32-bit number

struct StoredValue {
  std::uint32_t type = kTextType;
  std::string data; // the value's bytes
};

class SettingsKey {
public:
  explicit SettingsKey(std::string name = {}) : name_(std::move(name)) {}

  const std::string& Name() const noexcept { return name_; }

  // A subkey by name (case-free), or nullptr.
  SettingsKey* Find(std::string_view name);
  const SettingsKey* Find(std::string_view name) const;
  // The subkey, created when missing.
  SettingsKey& Child(std::string_view name);
  // Removes a subkey that has no subkeys of its own; false otherwise.
  bool RemoveLeaf(std::string_view name);
  const std::vector<SettingsKey>& Subkeys() const noexcept { return subkeys_; }

  const StoredValue* Value(std::string_view name) const;
  void SetValue(std::string_view name, StoredValue value);
  bool RemoveValue(std::string_view name);
  const std::vector<std::pair<std::string, StoredValue>>& Values() const noexcept {
    return values_;
  }

  // The key at a path of names below this one (nullptr when a part is
  // missing), and the same, creating what is missing.
  SettingsKey* Walk(const std::vector<std::string>& path);
  const SettingsKey* Walk(const std::vector<std::string>& path) const;
  SettingsKey& Make(const std::vector<std::string>& path);

  bool operator==(const SettingsKey& other) const;

private:
  std::string name_;
  std::vector<std::pair<std::string, StoredValue>> values_;
  std::vector<SettingsKey> subkeys_;
};

// A key path ("SOFTWARE\tessik\frmsplash") as its names: split at
// backslashes, empty parts (a leading or trailing backslash) dropped.
std::vector<std::string> SplitKeyPath(std::string_view path);

// Key and value names must be UTF-8 without zero bytes, at most 255 bytes;
// hives nest at most kMaxDepth keys deep.
inline constexpr std::size_t kMaxNameBytes = 255;
inline constexpr int kMaxDepth = 512;
bool ValidName(std::string_view name);

// The largest hive file read; a larger one counts as damaged.
inline constexpr std::size_t kMaxHiveFileBytes = 16u << 20;

struct ParsedHive {
  SettingsKey root;
  // Empty when the text was a sound hive; else what is wrong with it (the
  // root is then empty).
  std::string problem;
};

// Reads a hive from the text of its file. Never throws on any input.
ParsedHive ParseHive(std::string_view text);
// The text of a hive's file.
std::string FormatHive(const SettingsKey& root);

// One hive file.
class HiveFile {
public:
  explicit HiveFile(std::string path) : path_(std::move(path)) {}
  const std::string& Path() const noexcept { return path_; }

  struct Loaded {
    SettingsKey root;
    bool exists = false;
    std::string problem; // a damaged file: what is wrong (reported already)
  };
  // Reads the hive; a missing file is an empty hive, a damaged one is
  // reported and read as empty.
  Loaded Load() const;

  // Whether this user may write the hive: the file exists, may be written,
  // is not marked read-only (no write permission bit at all, which counts
  // for the administrator too) and its folder lets a new file be renamed
  // over it.
  bool Writable() const;

  // Changes the hive under the writers' lock: reads it afresh, runs
  // `change` and, when that returns true, writes the hive beside the file
  // and renames it over. Creates the file (and its folder) when missing.
  // Returns false, with the reason in `error` when given, when the file
  // could not be written or `change` returned false.
  bool Update(const std::function<bool(SettingsKey& root)>& change,
              std::string* error = nullptr) const;

private:
  std::string path_;
};

// Where problems with settings files go (a damaged file read as empty). The
// default writes each distinct problem once to the standard error; nullptr
// restores it. Process-wide.
using SettingsReporter = std::function<void(const std::string& message)>;
void SetSettingsReporter(SettingsReporter reporter);
void ReportSettingsProblem(const std::string& message);

} // namespace belvane::diagram
