// ModRegistry over the settings store.
#include "diagram/registry.hpp"

#include "diagram/settings_store.hpp"

#include <cfenv>
#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <limits>
#include <optional>

namespace belvane::diagram {

namespace {

// A key opened with full access: the hive file may be written and the key
// exists in it. The tree read is what the key's queries answer from.
struct OpenKey {
  HiveFile file;
  HiveFile::Loaded hive;
  const SettingsKey* key = nullptr;
};

std::optional<OpenKey> OpenFullAccess(Hive hive, std::string_view keyPath) {
  HiveFile file(HiveFilePath(hive));
  if (!file.Writable()) return std::nullopt;
  OpenKey open{file, file.Load(), nullptr};
  open.key = open.hive.root.Walk(SplitKeyPath(keyPath));
  if (!open.key) return std::nullopt;
  return open;
}

std::string ValueText(const StoredValue& value) {
  if (value.data.size() > kReadBufferBytes) return {};
  std::string bytes = value.data;
  if (!bytes.empty() && bytes.back() == '\0') bytes.pop_back();
  switch (value.type) {
  case kTextType:
    return bytes;
  case kNumberType: {
    // The four bytes as the buffer holds them, least significant first: a
    // dropped trailing zero byte is still zero there.
    std::uint32_t n = 0;
    for (std::size_t i = 0; i < 4 && i < value.data.size(); ++i)
      n |= static_cast<std::uint32_t>(static_cast<unsigned char>(value.data[i])) << (8 * i);
    return std::to_string(static_cast<std::int32_t>(n));
  }
  default:
    return {};
  }
}

// The leading number of a text: blanks, a sign, digits with one decimal
// point and an exponent; 0 when there is none.
double LeadingNumber(std::string_view s) {
  std::size_t i = 0;
  while (i < s.size() && (s[i] == ' ' || s[i] == '\t'))
    ++i;
  std::string number;
  if (i < s.size() && (s[i] == '+' || s[i] == '-')) number += s[i++];
  bool digits = false, point = false;
  for (; i < s.size(); ++i) {
    if (s[i] >= '0' && s[i] <= '9') {
      digits = true;
      number += s[i];
    } else if (s[i] == '.' && !point) {
      point = true;
      number += '.';
    } else {
      break;
    }
  }
  if (!digits) return 0;
  if (i < s.size() && (s[i] == 'e' || s[i] == 'E')) {
    std::string exponent = "e";
    std::size_t j = i + 1;
    if (j < s.size() && (s[j] == '+' || s[j] == '-')) exponent += s[j++];
    const std::size_t start = j;
    while (j < s.size() && s[j] >= '0' && s[j] <= '9')
      exponent += s[j++];
    if (j > start) number += exponent;
  }
  return std::strtod(number.c_str(), nullptr);
}

// The number as four bytes, rounded half to even; nothing when it does not
// fit a 32-bit number (signed, or unsigned for large positive numbers).
std::optional<std::string> NumberData(std::string_view text) {
  const double value = LeadingNumber(text);
  if (!std::isfinite(value)) return std::nullopt;
  const double rounded = std::nearbyint(value); // the default rounding: half to even
  if (rounded < static_cast<double>(std::numeric_limits<std::int32_t>::min()) ||
      rounded > static_cast<double>(std::numeric_limits<std::uint32_t>::max()))
    return std::nullopt;
  const auto n = static_cast<std::uint32_t>(static_cast<std::int64_t>(rounded));
  std::string data(4, '\0');
  for (int i = 0; i < 4; ++i)
    data[static_cast<std::size_t>(i)] = static_cast<char>((n >> (8 * i)) & 0xFFu);
  return data;
}

std::string SettingsKeyPath(std::string_view application, std::string_view section) {
  std::string path = "SOFTWARE\\";
  path.append(application);
  path += '\\';
  path.append(section);
  return path;
}

} // namespace

std::string ReadRegValue(Hive hive, std::string_view keyPath, std::string_view valueName) {
  const auto open = OpenFullAccess(hive, keyPath);
  if (!open) return {};
  const StoredValue* value = open->key->Value(valueName);
  return value ? ValueText(*value) : std::string();
}

bool WriteRegValue(Hive hive, std::string_view keyPath, std::string_view valueName,
                   std::string_view text) {
  if (!ValidName(valueName)) return false;
  const HiveFile file(HiveFilePath(hive));
  if (!file.Writable()) return false;
  const std::vector<std::string> path = SplitKeyPath(keyPath);
  return file.Update([&](SettingsKey& root) {
    SettingsKey* key = root.Walk(path);
    if (!key) return false;
    std::uint32_t type = kTextType;
    if (const StoredValue* existing = key->Value(valueName)) {
      if (existing->data.size() > kReadBufferBytes) return false;
      type = existing->type;
    }
    StoredValue value{type, {}};
    if (type == kTextType) {
      value.data = std::string(text);
    } else if (type == kNumberType) {
      auto data = NumberData(text);
      if (!data) return false;
      value.data = std::move(*data);
    } else {
      return false; // another type is left as it is
    }
    key->SetValue(valueName, std::move(value));
    return true;
  });
}

void CreateRegKey(Hive hive, std::string_view keyPath) {
  const std::vector<std::string> path = SplitKeyPath(keyPath);
  if (path.empty() || static_cast<int>(path.size()) > kMaxDepth) return;
  for (const std::string& name : path)
    if (!ValidName(name)) return;
  HiveFile(HiveFilePath(hive)).Update([&](SettingsKey& root) {
    if (root.Walk(path)) return false; // there already: nothing to write
    root.Make(path);
    return true;
  });
}

void DeleteRegKey(Hive hive, std::string_view keyPath) {
  std::vector<std::string> path = SplitKeyPath(keyPath);
  if (path.empty()) return;
  const HiveFile file(HiveFilePath(hive));
  if (!file.Writable()) return;
  const std::string leaf = path.back();
  path.pop_back();
  file.Update([&](SettingsKey& root) {
    SettingsKey* parent = root.Walk(path);
    return parent && parent->RemoveLeaf(leaf);
  });
}

std::string GetSetting(std::string_view application, std::string_view section,
                       std::string_view name, std::string_view defaultValue) {
  const HiveFile file(HiveFilePath(Hive::CurrentUser));
  const HiveFile::Loaded hive = file.Load();
  const SettingsKey* key = hive.root.Walk(SplitKeyPath(SettingsKeyPath(application, section)));
  const StoredValue* value = key ? key->Value(name) : nullptr;
  if (!value) return std::string(defaultValue);
  return ValueText(*value);
}

std::string GetMachineSetting(std::string_view application, std::string_view section,
                              std::string_view name, std::string_view defaultValue) {
  const std::string keyPath = SettingsKeyPath(application, section);
  std::string v = ReadRegValue(Hive::LocalMachine, keyPath, name);
  if (v.empty()) {
    v = GetSetting(application, section, name, defaultValue);
    if (!v.empty()) {
      if (!WriteRegValue(Hive::LocalMachine, keyPath, name, v)) {
        CreateRegKey(Hive::LocalMachine, keyPath);
        WriteRegValue(Hive::LocalMachine, keyPath, name, v);
      }
      // The per-user key named after the value, as the product has always
      // removed it; the per-user value itself stays where it is.
      DeleteRegKey(Hive::CurrentUser, keyPath + "\\" + std::string(name) + "\\");
    }
  }
  return v;
}

} // namespace belvane::diagram
