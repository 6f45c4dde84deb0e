// belvane field: enciphers and deciphers catalogue field values, one per
// line, so a catalogue maintainer can pipe a column through.
#include "commands.hpp"

#include "cipher/field.hpp"
#include "text/error.hpp"

#include <fmt/core.h>

#include <iostream>
#include <memory>
#include <string>
#include <vector>

namespace belvane::cli {

namespace {

struct FieldOptions {
  std::string keyFile;
  std::vector<std::string> values;
};

std::string KeyHelp() {
  return fmt::format(
      "Key: with --key-file, the key is read from FILE. Without it, the key is read from\n"
      "{} when that file exists; otherwise the built-in key is\n"
      "used (the key the catalogues are enciphered under). A key file holds the key text:\n"
      "72 hexadecimal digits (36 key bytes); spaces, tabs and line breaks are ignored.\n\n"
      "Output: one result per line, in the order of the input. A value that fails gives an\n"
      "empty line, so the lines stay aligned, and is reported on standard error with its\n"
      "line (or argument) number; the exit status is then 1. A key that cannot be used\n"
      "stops the command with exit status 2.",
      cipher::kFieldKeyFilePath);
}

// Enciphers or deciphers one value; returns false after reporting a failure.
bool ProcessOne(bool encrypt, const std::string& value, const char* what, std::size_t number) {
  std::string reason;
  try {
    std::string result = encrypt ? cipher::EncryptField(value) : cipher::DecryptField(value);
    if (result.find_first_of("\r\n") == std::string::npos) {
      std::cout << result << '\n';
      return true;
    }
    reason = "the deciphered value holds a line break and cannot be written as one line "
             "(is this the right key?)";
  } catch (const Error& e) {
    reason = fmt::format("{} (error {})", e.Description(), e.Number());
  }
  std::cout << '\n';
  std::cerr << fmt::format("belvane field {}: {} {}: {}\n", encrypt ? "encrypt" : "decrypt", what,
                           number, reason);
  return false;
}

int RunField(bool encrypt, const FieldOptions& opt, bool keyFileNamed) {
  // Key problems are errors of the whole command, reported by main. A key
  // file that was named is used or fails, even when the name is empty.
  if (keyFileNamed) {
    cipher::SetFieldKeyFile(opt.keyFile);
  } else {
    cipher::InitFieldCipher();
  }
  bool allDone = true;
  std::size_t number = 0;
  if (!opt.values.empty()) {
    for (const std::string& value : opt.values) {
      allDone &= ProcessOne(encrypt, value, "argument", ++number);
    }
  } else {
    std::string line;
    while (std::getline(std::cin, line)) {
      if (!line.empty() && line.back() == '\r') line.pop_back(); // CR LF files
      allDone &= ProcessOne(encrypt, line, "line", ++number);
    }
  }
  std::cout.flush();
  return allDone ? 0 : 1;
}

void AddFieldCommand(CLI::App& group, bool encrypt, int& exitCode) {
  auto opt = std::make_shared<FieldOptions>();
  auto* cmd = group.add_subcommand(
      encrypt ? "encrypt" : "decrypt",
      encrypt ? "Encipher values (UTF-8) into enciphered field texts (uppercase hexadecimal)"
              : "Decipher enciphered field texts into their values (UTF-8)");
  auto* keyFile =
      cmd->add_option("--key-file", opt->keyFile, "File holding the key text (see below)")
          ->type_name("FILE");
  cmd->add_option(encrypt ? "VALUE" : "TEXT", opt->values,
                  encrypt ? "Values to encipher; none: read one value per line from standard "
                            "input (use -- before values that begin with -)"
                          : "Field texts to decipher; none: read one text per line from "
                            "standard input")
      ->type_name("");
  cmd->footer(KeyHelp());
  cmd->callback([opt, encrypt, keyFile, &exitCode] {
    exitCode = FinishOutput(encrypt ? "belvane field encrypt" : "belvane field decrypt",
                            RunField(encrypt, *opt, keyFile->count() > 0));
  });
}

} // namespace

void RegisterField(CLI::App& app, int& exitCode) {
  auto* group =
      app.add_subcommand("field", "Encipher or decipher catalogue field values (field cipher)");
  group->require_subcommand(1);
  group->footer(KeyHelp());
  AddFieldCommand(*group, true, exitCode);
  AddFieldCommand(*group, false, exitCode);
}

} // namespace belvane::cli
