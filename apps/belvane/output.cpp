// Standard output that could not be written is a failure of the command.
#include "commands.hpp"

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <iostream>

namespace belvane::cli {

int FinishOutput(const char* command, int exitCode) {
  errno = 0;
  std::cout.flush();
  const bool lost = !std::cout || std::fflush(stdout) != 0 || std::ferror(stdout);
  if (!lost) return exitCode;
  const int e = errno;
  std::cerr << command
            << ": cannot write the output: " << (e ? std::strerror(e) : "the output stream failed")
            << "\n";
  return 2;
}

} // namespace belvane::cli
