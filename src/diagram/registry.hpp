#pragma once
// ModRegistry: machine-wide settings of the host product, kept in the
// settings store (settings_store.hpp). Its one user is the diagram window,
// which asks for the folder of its pages: value "GraphicsPath" of the key
// SOFTWARE\tessik\frmsplash in the machine-wide hive.
//
// Two hives, each a file:
//   machine-wide  /etc/belvane/settings.json
//   per-user      $XDG_CONFIG_HOME/belvane/settings.json (~/.config/...)
// chosen, first match wins, by SetHiveFilePath, the environment variables
// BELVANE_MACHINE_SETTINGS and BELVANE_USER_SETTINGS, or, for a program run
// from the build tree (the tests, the demo), files of the build tree's own
// ("<build>/settings/machine.json" and "user.json"), so that nothing run
// from there writes into the real settings.
//
// Opening a key "with full access" (ReadRegValue, WriteRegValue) needs a
// hive file the user may write; without it the key cannot be opened, as a
// user without the right to write machine-wide settings finds. No operation
// raises an error: failures give the empty text, false or nothing.

#include <cstdint>
#include <string>
#include <string_view>

namespace belvane::diagram {

enum class Hive : std::uint32_t {
  CurrentUser = 0x80000001u,  // the per-user hive
  LocalMachine = 0x80000002u, // the machine-wide hive
};

// The most bytes a value may hold to be read by ReadRegValue.
inline constexpr std::size_t kReadBufferBytes = 1024;

// The value as text: a text value's bytes (one trailing zero byte dropped),
// a number value as decimal text of the signed 32-bit number, the empty
// text for any other type, for a value larger than 1024 bytes, or when the
// key cannot be opened with full access or the value is missing.
std::string ReadRegValue(Hive hive, std::string_view keyPath, std::string_view valueName);

// Writes the text into the value, keeping the value's type: a text value
// gets the text's bytes (no terminating zero byte); a number value gets the
// text's leading number rounded to a whole number (half to even). A missing
// value becomes a text value. True when written; false when the key cannot
// be opened with full access, the existing value cannot be read (larger
// than 1024 bytes) or is of another type, or the number does not fit 32
// bits.
bool WriteRegValue(Hive hive, std::string_view keyPath, std::string_view valueName,
                   std::string_view text);

// Creates the key and every missing key above it. Failures are not
// reported.
void CreateRegKey(Hive hive, std::string_view keyPath);

// Deletes the key when it has no subkeys. Failures are not reported.
void DeleteRegKey(Hive hive, std::string_view keyPath);

// The per-user setting `name` of key SOFTWARE\<application>\<section> in
// the per-user hive (read access is enough), or `defaultValue` when there
// is none.
std::string GetSetting(std::string_view application, std::string_view section,
                       std::string_view name, std::string_view defaultValue);

// The machine-wide setting; when it has none, the per-user setting (or the
// default), which is then stored machine-wide where the user may write it,
// so later reads find it there.
std::string GetMachineSetting(std::string_view application, std::string_view section,
                              std::string_view name, std::string_view defaultValue);

// ---- where the hives are ----

// The file of a hive now in force.
std::string HiveFilePath(Hive hive);
// Chooses the file of a hive for this process; the empty text goes back to
// the environment and the defaults.
void SetHiveFilePath(Hive hive, std::string path);

// Whether the running program lies in the build tree it was built in.
bool RunningFromBuildTree();

// The folder of the diagram pages when no setting names one, with its
// trailing separator: the build tree's "graphics/" for a program run from
// the build tree, else the installed "<prefix>/share/belvane/graphics/".
std::string DefaultGraphicsFolder();

} // namespace belvane::diagram
