// Where the hive files and the diagram pages are. The build tree and the
// install prefix are given by the build (BELVANE_BUILD_DIR,
// BELVANE_INSTALL_GRAPHICS_DIR), to this file only.
#include "diagram/registry.hpp"

#include <pwd.h>
#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <mutex>
#include <system_error>

#ifndef BELVANE_BUILD_DIR
#define BELVANE_BUILD_DIR ""
#endif
#ifndef BELVANE_INSTALL_GRAPHICS_DIR
#define BELVANE_INSTALL_GRAPHICS_DIR "/usr/local/share/belvane/graphics/"
#endif

namespace belvane::diagram {

namespace {

std::mutex pathsLock;
std::string machineOverride;
std::string userOverride;

std::string Environment(const char* name) {
  const char* value = std::getenv(name);
  return value ? value : "";
}

std::string HomeFolder() {
  if (std::string home = Environment("HOME"); !home.empty()) return home;
  if (const passwd* pw = ::getpwuid(::getuid()); pw && pw->pw_dir) return pw->pw_dir;
  return "/";
}

std::filesystem::path Canonical(const std::filesystem::path& p) {
  std::error_code ec;
  std::filesystem::path c = std::filesystem::weakly_canonical(p, ec);
  return ec ? p : c;
}

std::string WithSeparator(std::string folder) {
  if (folder.empty() || folder.back() != '/') folder += '/';
  return folder;
}

} // namespace

bool RunningFromBuildTree() {
  static const bool fromBuildTree = [] {
    const std::string buildDir = BELVANE_BUILD_DIR;
    if (buildDir.empty()) return false;
    std::error_code ec;
    const std::filesystem::path exe = std::filesystem::read_symlink("/proc/self/exe", ec);
    if (ec) return false;
    const std::string build = WithSeparator(Canonical(buildDir).string());
    return Canonical(exe).string().rfind(build, 0) == 0;
  }();
  return fromBuildTree;
}

std::string HiveFilePath(Hive hive) {
  const bool machine = hive == Hive::LocalMachine;
  {
    std::lock_guard lock(pathsLock);
    const std::string& chosen = machine ? machineOverride : userOverride;
    if (!chosen.empty()) return chosen;
  }
  if (std::string env = Environment(machine ? "BELVANE_MACHINE_SETTINGS" : "BELVANE_USER_SETTINGS");
      !env.empty())
    return env;
  if (RunningFromBuildTree())
    return std::string(BELVANE_BUILD_DIR) +
           (machine ? "/settings/machine.json" : "/settings/user.json");
  if (machine) return "/etc/belvane/settings.json";
  std::string config = Environment("XDG_CONFIG_HOME");
  if (config.empty() || config.front() != '/') config = HomeFolder() + "/.config";
  return config + "/belvane/settings.json";
}

void SetHiveFilePath(Hive hive, std::string path) {
  std::lock_guard lock(pathsLock);
  (hive == Hive::LocalMachine ? machineOverride : userOverride) = std::move(path);
}

std::string DefaultGraphicsFolder() {
  if (RunningFromBuildTree()) return std::string(BELVANE_BUILD_DIR) + "/graphics/";
  return WithSeparator(BELVANE_INSTALL_GRAPHICS_DIR);
}

} // namespace belvane::diagram
