#pragma once
// Pieces the benchmark programs share: the thread's processor clock (the
// machines these run on are shared, and the wall clock there measures the
// neighbours as much as the code) and the plain text scan searches are
// measured against.

#include <time.h>

#include <algorithm>
#include <chrono>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace belvane::bench {

// The calling thread's processor time.
struct ThreadClock {
  using time_point = std::chrono::nanoseconds;
  static time_point now() {
    timespec ts{};
    clock_gettime(CLOCK_THREAD_CPUTIME_ID, &ts);
    return std::chrono::seconds(ts.tv_sec) + std::chrono::nanoseconds(ts.tv_nsec);
  }
};

inline double Seconds(ThreadClock::time_point from, ThreadClock::time_point to) {
  return std::chrono::duration<double>(to - from).count();
}

// A plain case-free substring scan: the rows whose first or second text
// holds `needleUpper` (ASCII, upper case), letters compared folded.
inline int PlainScan(const std::vector<std::pair<std::string, std::string>>& texts,
                     const std::string& needleUpper) {
  auto contains = [&needleUpper](const std::string& s) {
    const auto it =
        std::search(s.begin(), s.end(), needleUpper.begin(), needleUpper.end(), [](char a, char b) {
          return (a >= 'a' && a <= 'z' ? static_cast<char>(a - 32) : a) == b;
        });
    return it != s.end();
  };
  int found = 0;
  for (const auto& [first, second] : texts)
    if (contains(first) || contains(second)) ++found;
  return found;
}

} // namespace belvane::bench
