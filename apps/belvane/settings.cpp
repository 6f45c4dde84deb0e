// belvane settings: reads and changes values of the settings store, for
// example the folder of the diagram pages:
//
//   belvane settings set 'SOFTWARE\tessik\frmsplash' GraphicsPath /srv/belvane/graphics/
#include "commands.hpp"

#include "diagram/registry.hpp"
#include "diagram/settings_store.hpp"

#include <fmt/core.h>

#include <iostream>
#include <memory>
#include <string>

namespace belvane::cli {

namespace {

struct SettingsOptions {
  bool user = false;
  bool machine = false;
  bool number = false;
  std::string key;
  std::string name;
  std::string value;
};

diagram::Hive HiveOf(const SettingsOptions& o) {
  return o.user ? diagram::Hive::CurrentUser : diagram::Hive::LocalMachine;
}

const char* HiveName(const SettingsOptions& o) { return o.user ? "per-user" : "machine-wide"; }

void Fail(const std::string& message) { std::cerr << "belvane settings: " << message << "\n"; }

int Get(const SettingsOptions& o) {
  const diagram::HiveFile file(diagram::HiveFilePath(HiveOf(o)));
  const diagram::HiveFile::Loaded hive = file.Load();
  if (!hive.problem.empty()) return 1; // reported by the store
  const diagram::SettingsKey* key = hive.root.Walk(diagram::SplitKeyPath(o.key));
  const diagram::StoredValue* value = key ? key->Value(o.name) : nullptr;
  if (!value) {
    Fail(fmt::format("no value \"{}\" in key {} of the {} settings ({})", o.name, o.key,
                     HiveName(o), file.Path()));
    return 1;
  }
  if (value->type == diagram::kNumberType && value->data.size() == 4) {
    std::uint32_t n = 0;
    for (std::size_t i = 0; i < 4; ++i)
      n |= static_cast<std::uint32_t>(static_cast<unsigned char>(value->data[i])) << (8 * i);
    std::cout << static_cast<std::int32_t>(n) << "\n";
    return 0;
  }
  if (value->type != diagram::kTextType) {
    Fail(fmt::format("\"{}\" holds a value of type {}, which is neither text nor a number", o.name,
                     value->type));
    return 1;
  }
  std::string text = value->data;
  if (!text.empty() && text.back() == '\0') text.pop_back();
  std::cout << text << "\n";
  return 0;
}

int Set(const SettingsOptions& o) {
  if (!diagram::ValidName(o.name)) {
    Fail("a value name is 1 to 255 bytes of UTF-8 without zero bytes");
    return 2;
  }
  const auto path = diagram::SplitKeyPath(o.key);
  if (path.empty()) {
    Fail("name a key, such as SOFTWARE\\tessik\\frmsplash");
    return 2;
  }
  for (const std::string& part : path)
    if (!diagram::ValidName(part)) {
      Fail("a key name is 1 to 255 bytes of UTF-8 without zero bytes");
      return 2;
    }
  diagram::StoredValue value{diagram::kTextType, o.value};
  if (o.number) {
    std::size_t used = 0;
    long long n = 0;
    try {
      n = std::stoll(o.value, &used);
    } catch (const std::exception&) {
      used = 0;
    }
    if (used != o.value.size() || n < -2147483648LL || n > 4294967295LL) {
      Fail("--number takes a whole number of 32 bits");
      return 2;
    }
    const auto u = static_cast<std::uint32_t>(n);
    value = {diagram::kNumberType, std::string(4, '\0')};
    for (std::size_t i = 0; i < 4; ++i)
      value.data[i] = static_cast<char>((u >> (8 * i)) & 0xFFu);
  }
  const diagram::HiveFile file(diagram::HiveFilePath(HiveOf(o)));
  std::string error;
  if (!file.Update(
          [&](diagram::SettingsKey& root) {
            root.Make(path).SetValue(o.name, value);
            return true;
          },
          &error)) {
    Fail(error + (o.user ? "" : ". Run as an administrator, or use --user for your own settings"));
    return 1;
  }
  return 0;
}

int Delete(const SettingsOptions& o) {
  const diagram::HiveFile file(diagram::HiveFilePath(HiveOf(o)));
  bool found = false;
  std::string error;
  const bool written = file.Update(
      [&](diagram::SettingsKey& root) {
        diagram::SettingsKey* key = root.Walk(diagram::SplitKeyPath(o.key));
        found = key && key->RemoveValue(o.name);
        return found;
      },
      &error);
  if (!found) {
    Fail(error.empty() ? fmt::format("no value \"{}\" in key {} of the {} settings ({})", o.name,
                                     o.key, HiveName(o), file.Path())
                       : error);
    return 1;
  }
  if (!written) {
    Fail(error);
    return 1;
  }
  return 0;
}

CLI::App* Command(CLI::App& group, const char* name, const char* help,
                  const std::shared_ptr<SettingsOptions>& o) {
  auto* cmd = group.add_subcommand(name, help);
  auto* user = cmd->add_flag("--user", o->user, "The per-user settings");
  auto* machine = cmd->add_flag("--machine", o->machine, "The machine-wide settings (the default)");
  user->excludes(machine);
  cmd->add_option("KEY", o->key, "Key path, such as SOFTWARE\\tessik\\frmsplash")->required();
  cmd->add_option("NAME", o->name, "Value name, such as GraphicsPath")->required();
  return cmd;
}

} // namespace

void RegisterSettings(CLI::App& app, int& exitCode) {
  auto* group = app.add_subcommand(
      "settings", fmt::format("Read and change the settings store (machine-wide: {}; per-user: {})",
                              diagram::HiveFilePath(diagram::Hive::LocalMachine),
                              diagram::HiveFilePath(diagram::Hive::CurrentUser)));
  group->require_subcommand(1);
  group->footer("The files can be chosen with BELVANE_MACHINE_SETTINGS and BELVANE_USER_SETTINGS.\n"
                "Key and value names match without regard to case.");
  auto o = std::make_shared<SettingsOptions>();

  Command(*group, "get", "Print a value", o)->callback([o, &exitCode] { exitCode = Get(*o); });
  auto* set = Command(*group, "set", "Store a value, creating its key", o);
  set->add_option("VALUE", o->value, "The text (or, with --number, the number)")->required();
  set->add_flag("--number", o->number, "Store a 32-bit number instead of text");
  set->callback([o, &exitCode] { exitCode = Set(*o); });
  Command(*group, "delete", "Delete a value", o)->callback([o, &exitCode] {
    exitCode = Delete(*o);
  });
}

} // namespace belvane::cli
