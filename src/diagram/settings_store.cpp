#include "diagram/settings_store.hpp"

#include "text/strings.hpp"

#include <nlohmann/json.hpp>

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <limits>
#include <mutex>
#include <set>
#include <sstream>

namespace belvane::diagram {

namespace {

using Json = nlohmann::ordered_json; // keys keep the order they were written in

constexpr const char* kFormat = "belvane-settings-1";

// Key and value names compare as the registry does: without regard to the
// case of letters.
bool SameName(std::string_view a, std::string_view b) { return text::EqualsNoCase(a, b); }

bool ValidUtf8(std::string_view s) {
  std::size_t i = 0;
  while (i < s.size()) {
    const auto c = static_cast<unsigned char>(s[i]);
    int extra = 0;
    char32_t cp = 0;
    if (c < 0x80) {
      ++i;
      continue;
    }
    if ((c & 0xE0) == 0xC0) {
      extra = 1;
      cp = c & 0x1F;
    } else if ((c & 0xF0) == 0xE0) {
      extra = 2;
      cp = c & 0x0F;
    } else if ((c & 0xF8) == 0xF0) {
      extra = 3;
      cp = c & 0x07;
    } else {
      return false;
    }
    if (i + static_cast<std::size_t>(extra) >= s.size()) return false;
    for (int k = 1; k <= extra; ++k) {
      const auto d = static_cast<unsigned char>(s[i + static_cast<std::size_t>(k)]);
      if ((d & 0xC0) != 0x80) return false;
      cp = (cp << 6) | (d & 0x3F);
    }
    static constexpr char32_t kMin[] = {0, 0x80, 0x800, 0x10000};
    if (cp < kMin[extra] || cp > 0x10FFFF || (cp >= 0xD800 && cp <= 0xDFFF)) return false;
    i += static_cast<std::size_t>(extra) + 1;
  }
  return true;
}

std::string Hex(std::string_view bytes) {
  static constexpr char kDigits[] = "0123456789ABCDEF";
  std::string out;
  out.reserve(bytes.size() * 2);
  for (const char ch : bytes) {
    const auto b = static_cast<unsigned char>(ch);
    out += kDigits[b >> 4];
    out += kDigits[b & 15];
  }
  return out;
}

std::optional<std::string> FromHex(std::string_view hex) {
  if (hex.size() % 2 != 0) return std::nullopt;
  const auto digit = [](char c) -> int {
    if (c >= '0' && c <= '9') return c - '0';
    if (c >= 'A' && c <= 'F') return c - 'A' + 10;
    if (c >= 'a' && c <= 'f') return c - 'a' + 10;
    return -1;
  };
  std::string out;
  out.reserve(hex.size() / 2);
  for (std::size_t i = 0; i < hex.size(); i += 2) {
    const int hi = digit(hex[i]);
    const int lo = digit(hex[i + 1]);
    if (hi < 0 || lo < 0) return std::nullopt;
    out += static_cast<char>(hi * 16 + lo);
  }
  return out;
}

std::string NumberBytes(std::uint32_t n) {
  std::string b(4, '\0');
  for (int i = 0; i < 4; ++i)
    b[static_cast<std::size_t>(i)] = static_cast<char>((n >> (8 * i)) & 0xFFu);
  return b;
}

std::uint32_t BytesNumber(std::string_view b) {
  std::uint32_t n = 0;
  for (std::size_t i = 0; i < 4 && i < b.size(); ++i)
    n |= static_cast<std::uint32_t>(static_cast<unsigned char>(b[i])) << (8 * i);
  return n;
}

Json ValueToJson(const StoredValue& v) {
  if (v.type == kTextType && ValidUtf8(v.data) && v.data.find('\0') == std::string::npos)
    return Json{{"text", v.data}};
  if (v.type == kNumberType && v.data.size() == 4) return Json{{"number", BytesNumber(v.data)}};
  return Json{{"type", v.type}, {"hex", Hex(v.data)}};
}

// What is wrong with a value's JSON; empty when it is sound.
std::string JsonToValue(const Json& j, StoredValue& out) {
  if (!j.is_object()) return "a value is not an object";
  if (j.size() == 1 && j.contains("text")) {
    const Json& t = j["text"];
    if (!t.is_string()) return "a \"text\" value is not a string";
    out = StoredValue{kTextType, t.get<std::string>()};
    return {};
  }
  if (j.size() == 1 && j.contains("number")) {
    const Json& n = j["number"];
    if (n.is_number_unsigned() &&
        n.get<std::uint64_t>() <= std::numeric_limits<std::uint32_t>::max()) {
      out =
          StoredValue{kNumberType, NumberBytes(static_cast<std::uint32_t>(n.get<std::uint64_t>()))};
      return {};
    }
    if (n.is_number_integer() &&
        n.get<std::int64_t>() >= std::numeric_limits<std::int32_t>::min() &&
        n.get<std::int64_t>() <= std::numeric_limits<std::uint32_t>::max()) {
      out =
          StoredValue{kNumberType, NumberBytes(static_cast<std::uint32_t>(n.get<std::int64_t>()))};
      return {};
    }
    return "a \"number\" value is not a 32-bit whole number";
  }
  if (j.size() == 2 && j.contains("type") && j.contains("hex")) {
    const Json& t = j["type"];
    const Json& h = j["hex"];
    if (!t.is_number_unsigned() ||
        t.get<std::uint64_t>() > std::numeric_limits<std::uint32_t>::max())
      return "a value's \"type\" is not a type number";
    if (!h.is_string()) return "a value's \"hex\" is not a string";
    auto bytes = FromHex(h.get_ref<const std::string&>());
    if (!bytes) return "a value's \"hex\" is not hexadecimal bytes";
    out = StoredValue{static_cast<std::uint32_t>(t.get<std::uint64_t>()), std::move(*bytes)};
    return {};
  }
  return "a value is not {\"text\": ...}, {\"number\": ...} or {\"type\": ..., \"hex\": ...}";
}

std::string JsonToKey(const Json& j, SettingsKey& key, int depth, const std::string& where) {
  if (depth > kMaxDepth) return "keys nest deeper than " + std::to_string(kMaxDepth);
  if (!j.is_object()) return "key \"" + where + "\" is not an object";
  for (const auto& [field, item] : j.items()) {
    if (field == "values") {
      if (!item.is_object()) return "the values of key \"" + where + "\" are not an object";
      for (const auto& [name, value] : item.items()) {
        if (!ValidName(name)) return "key \"" + where + "\" has a value name that is not allowed";
        StoredValue v;
        if (std::string problem = JsonToValue(value, v); !problem.empty())
          return problem + " (value \"" + name + "\" of key \"" + where + "\")";
        key.SetValue(name, std::move(v));
      }
    } else if (field == "keys") {
      if (!item.is_object()) return "the subkeys of key \"" + where + "\" are not an object";
      for (const auto& [name, sub] : item.items()) {
        if (!ValidName(name) || name.find('\\') != std::string::npos)
          return "key \"" + where + "\" has a subkey name that is not allowed";
        const std::string path = where.empty() ? name : where + "\\" + name;
        if (std::string problem = JsonToKey(sub, key.Child(name), depth + 1, path);
            !problem.empty())
          return problem;
      }
    } else if (!(depth == 0 && field == "format")) {
      return "key \"" + where + "\" has an unknown entry \"" + field + "\"";
    }
  }
  return {};
}

Json KeyToJson(const SettingsKey& key) {
  Json j = Json::object();
  if (!key.Values().empty()) {
    Json values = Json::object();
    for (const auto& [name, value] : key.Values())
      values[name] = ValueToJson(value);
    j["values"] = std::move(values);
  }
  if (!key.Subkeys().empty()) {
    Json keys = Json::object();
    for (const SettingsKey& sub : key.Subkeys())
      keys[sub.Name()] = KeyToJson(sub);
    j["keys"] = std::move(keys);
  }
  return j;
}

std::string ErrnoText(int err) { return std::strerror(err); }

// The parser's message without its "[json.exception...] " prefix.
std::string ParseMessage(const std::exception& e) {
  std::string what = e.what();
  if (const auto close = what.find("] ");
      what.rfind("[json.exception", 0) == 0 && close != std::string::npos)
    what.erase(0, close + 2);
  return what;
}

bool WriteAll(int fd, std::string_view data) {
  while (!data.empty()) {
    const ssize_t n = ::write(fd, data.data(), data.size());
    if (n < 0) {
      if (errno == EINTR) continue;
      return false;
    }
    data.remove_prefix(static_cast<std::size_t>(n));
  }
  return true;
}

// ---- the reporter ----

std::mutex reporterLock;
SettingsReporter& Reporter() {
  static SettingsReporter reporter;
  return reporter;
}

} // namespace

// ---- names and paths ----

bool ValidName(std::string_view name) {
  return !name.empty() && name.size() <= kMaxNameBytes &&
         name.find('\0') == std::string_view::npos && ValidUtf8(name);
}

std::vector<std::string> SplitKeyPath(std::string_view path) {
  std::vector<std::string> parts;
  std::size_t start = 0;
  while (start <= path.size()) {
    std::size_t end = path.find('\\', start);
    if (end == std::string_view::npos) end = path.size();
    if (end > start) parts.emplace_back(path.substr(start, end - start));
    start = end + 1;
  }
  return parts;
}

// ---- SettingsKey ----

SettingsKey* SettingsKey::Find(std::string_view name) {
  for (SettingsKey& k : subkeys_)
    if (SameName(k.name_, name)) return &k;
  return nullptr;
}

const SettingsKey* SettingsKey::Find(std::string_view name) const {
  return const_cast<SettingsKey*>(this)->Find(name);
}

SettingsKey& SettingsKey::Child(std::string_view name) {
  if (SettingsKey* k = Find(name)) return *k;
  subkeys_.emplace_back(std::string(name));
  return subkeys_.back();
}

bool SettingsKey::RemoveLeaf(std::string_view name) {
  for (auto it = subkeys_.begin(); it != subkeys_.end(); ++it)
    if (SameName(it->name_, name)) {
      if (!it->subkeys_.empty()) return false;
      subkeys_.erase(it);
      return true;
    }
  return false;
}

const StoredValue* SettingsKey::Value(std::string_view name) const {
  for (const auto& [n, v] : values_)
    if (SameName(n, name)) return &v;
  return nullptr;
}

void SettingsKey::SetValue(std::string_view name, StoredValue value) {
  for (auto& [n, v] : values_)
    if (SameName(n, name)) {
      v = std::move(value);
      return;
    }
  values_.emplace_back(std::string(name), std::move(value));
}

bool SettingsKey::RemoveValue(std::string_view name) {
  for (auto it = values_.begin(); it != values_.end(); ++it)
    if (SameName(it->first, name)) {
      values_.erase(it);
      return true;
    }
  return false;
}

SettingsKey* SettingsKey::Walk(const std::vector<std::string>& path) {
  SettingsKey* key = this;
  for (const std::string& name : path) {
    key = key->Find(name);
    if (!key) return nullptr;
  }
  return key;
}

const SettingsKey* SettingsKey::Walk(const std::vector<std::string>& path) const {
  return const_cast<SettingsKey*>(this)->Walk(path);
}

SettingsKey& SettingsKey::Make(const std::vector<std::string>& path) {
  SettingsKey* key = this;
  for (const std::string& name : path)
    key = &key->Child(name);
  return *key;
}

bool SettingsKey::operator==(const SettingsKey& other) const {
  if (name_ != other.name_ || values_.size() != other.values_.size() ||
      subkeys_.size() != other.subkeys_.size())
    return false;
  for (std::size_t i = 0; i < values_.size(); ++i)
    if (values_[i].first != other.values_[i].first ||
        values_[i].second.type != other.values_[i].second.type ||
        values_[i].second.data != other.values_[i].second.data)
      return false;
  for (std::size_t i = 0; i < subkeys_.size(); ++i)
    if (!(subkeys_[i] == other.subkeys_[i])) return false;
  return true;
}

// ---- the file's text ----

ParsedHive ParseHive(std::string_view text) {
  ParsedHive out;
  if (text.size() > kMaxHiveFileBytes) {
    out.problem = "the file is larger than " + std::to_string(kMaxHiveFileBytes >> 20) + " MiB";
    return out;
  }
  Json j;
  try {
    j = Json::parse(text.begin(), text.end());
  } catch (const std::exception& e) {
    out.problem = ParseMessage(e);
    return out;
  }
  if (!j.is_object()) {
    out.problem = "the file does not hold a JSON object";
    return out;
  }
  const auto format = j.find("format");
  if (format == j.end() || !format->is_string() || *format != kFormat) {
    out.problem = std::string("the file does not say \"format\": \"") + kFormat + "\"";
    return out;
  }
  SettingsKey root;
  if (std::string problem = JsonToKey(j, root, 0, ""); !problem.empty()) {
    out.problem = std::move(problem);
    return out;
  }
  if (!root.Values().empty()) {
    out.problem = "the file holds values outside any key";
    return out;
  }
  out.root = std::move(root);
  return out;
}

std::string FormatHive(const SettingsKey& root) {
  Json j = Json::object();
  j["format"] = kFormat;
  Json keys = KeyToJson(root);
  if (keys.contains("keys")) j["keys"] = std::move(keys["keys"]);
  // Names are checked as they come in and texts that are not UTF-8 are
  // written as hexadecimal, so nothing here needs replacing.
  return j.dump(2) + "\n";
}

// ---- the file ----

HiveFile::Loaded HiveFile::Load() const {
  Loaded out;
  std::ifstream in(path_, std::ios::binary);
  if (!in) return out;
  out.exists = true;
  std::string text;
  char buffer[65536];
  while (in.read(buffer, sizeof buffer) || in.gcount() > 0) {
    text.append(buffer, static_cast<std::size_t>(in.gcount()));
    if (text.size() > kMaxHiveFileBytes) break;
  }
  if (in.bad()) {
    out.problem = "it cannot be read";
  } else {
    ParsedHive parsed = ParseHive(text);
    out.root = std::move(parsed.root);
    out.problem = std::move(parsed.problem);
  }
  if (!out.problem.empty())
    ReportSettingsProblem("The settings file " + path_ + " is damaged (" + out.problem +
                          "); it is read as empty. Repair it, or remove it to start afresh.");
  return out;
}

bool HiveFile::Writable() const {
  struct stat st {};
  if (::stat(path_.c_str(), &st) != 0 || !S_ISREG(st.st_mode)) return false;
  if ((st.st_mode & (S_IWUSR | S_IWGRP | S_IWOTH)) == 0) return false;
  if (::access(path_.c_str(), W_OK) != 0) return false;
  const std::filesystem::path dir = std::filesystem::path(path_).parent_path();
  const std::string folder = dir.empty() ? std::string(".") : dir.string();
  return ::access(folder.c_str(), W_OK | X_OK) == 0;
}

bool HiveFile::Update(const std::function<bool(SettingsKey& root)>& change,
                      std::string* error) const {
  const auto fail = [error](std::string why) {
    if (error) *error = std::move(why);
    return false;
  };
  const std::filesystem::path file(path_);
  const std::filesystem::path dir = file.parent_path();
  std::error_code ec;
  if (!dir.empty()) std::filesystem::create_directories(dir, ec);

  // An existing file marked read-only stays so, for the administrator too.
  struct stat st {};
  const bool exists = ::stat(path_.c_str(), &st) == 0;
  if (exists && !Writable()) return fail("the settings file " + path_ + " may not be written");

  const std::string lockPath = path_ + ".lock";
  const int lockFd = ::open(lockPath.c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0644);
  if (lockFd < 0) return fail("cannot open " + lockPath + ": " + ErrnoText(errno));
  struct LockGuard {
    int fd;
    ~LockGuard() {
      ::flock(fd, LOCK_UN);
      ::close(fd);
    }
  } guard{lockFd};
  while (::flock(lockFd, LOCK_EX) != 0)
    if (errno != EINTR) return fail("cannot lock " + lockPath + ": " + ErrnoText(errno));

  Loaded current = Load();
  if (!change(current.root)) return false;

  if (!current.problem.empty()) {
    // Keep the damaged file for whoever repairs it; the new file replaces it.
    std::filesystem::copy_file(file, path_ + ".damaged",
                               std::filesystem::copy_options::overwrite_existing, ec);
  }

  const std::string text = FormatHive(current.root);
  std::string tmpl = path_ + ".XXXXXX";
  const int fd = ::mkstemp(tmpl.data());
  if (fd < 0) return fail("cannot write beside " + path_ + ": " + ErrnoText(errno));
  const mode_t mode = ::stat(path_.c_str(), &st) == 0 ? (st.st_mode & 07777) : 0644;
  bool ok = ::fchmod(fd, mode) == 0 && WriteAll(fd, text) && ::fsync(fd) == 0;
  const int writeErr = errno;
  ok = (::close(fd) == 0) && ok;
  if (!ok) {
    ::unlink(tmpl.c_str());
    return fail("cannot write " + tmpl + ": " + ErrnoText(writeErr));
  }
  if (::rename(tmpl.c_str(), path_.c_str()) != 0) {
    const int err = errno;
    ::unlink(tmpl.c_str());
    return fail("cannot replace " + path_ + ": " + ErrnoText(err));
  }
  const std::string folder = dir.empty() ? std::string(".") : dir.string();
  if (const int dirFd = ::open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC); dirFd >= 0) {
    ::fsync(dirFd);
    ::close(dirFd);
  }
  return true;
}

// ---- reporting ----

void SetSettingsReporter(SettingsReporter reporter) {
  std::lock_guard lock(reporterLock);
  Reporter() = std::move(reporter);
}

void ReportSettingsProblem(const std::string& message) {
  SettingsReporter reporter;
  {
    std::lock_guard lock(reporterLock);
    reporter = Reporter();
    if (!reporter) {
      static std::set<std::string> told;
      if (!told.insert(message).second) return;
    }
  }
  if (reporter) {
    reporter(message);
    return;
  }
  std::fprintf(stderr, "belvane: %s\n", message.c_str());
}

} // namespace belvane::diagram
