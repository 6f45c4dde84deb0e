// belvane: command-line tools for catalogue maintainers and host developers.
#include "commands.hpp"

#include "text/error.hpp"

#include <fmt/core.h>

#include <iostream>

namespace belvane::cli {

void RegisterVersion(CLI::App& app, int& exitCode) {
  auto* cmd = app.add_subcommand("version", "Print the version of Belvane");
  cmd->callback([&exitCode] {
    fmt::print("belvane 1.00.0003\n");
    exitCode = 0;
  });
}

} // namespace belvane::cli

int main(int argc, char** argv) {
  using namespace belvane::cli;
  CLI::App app{"belvane: tools for the Belvane quote-editing component (catalogues, field "
               "cipher, sessions)"};
  app.require_subcommand(1);
  int exitCode = 0;
  const RegisterFn groups[] = {
      RegisterVersion,
      RegisterField,
      RegisterCatalogue,
      RegisterSettings,
  };
  for (RegisterFn fn : groups)
    fn(app, exitCode);
  try {
    app.parse(argc, argv);
  } catch (const CLI::ParseError& e) {
    return app.exit(e);
  } catch (const belvane::Error& e) {
    std::cerr << "belvane: " << e.Description() << " (error " << e.Number() << ")\n";
    return 2;
  } catch (const std::exception& e) {
    std::cerr << "belvane: " << e.what() << "\n";
    return 2;
  }
  return exitCode;
}
