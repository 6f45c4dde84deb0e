#pragma once
// Subcommand registry of the `belvane` tool. A file defines a registration
// function and adds it to kCommandGroups in main.cpp.

#include <CLI/CLI.hpp>

#include <functional>

namespace belvane::cli {

// Adds a subcommand group to the application. The callback of a subcommand
// stores its exit status in `exitCode`.
using RegisterFn = void (*)(CLI::App& app, int& exitCode);

void RegisterVersion(CLI::App& app, int& exitCode);
void RegisterField(CLI::App& app, int& exitCode);
void RegisterCatalogue(CLI::App& app, int& exitCode);
void RegisterSettings(CLI::App& app, int& exitCode);

} // namespace belvane::cli
