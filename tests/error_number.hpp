#pragma once
// The error number a call raises as belvane::Error (0 when it raises none),
// and its description when asked for: how the tests check failures.

#include "text/error.hpp"

#include <functional>
#include <string>

namespace belvane::test {

inline long ErrorNumber(const std::function<void()>& fn, std::string* description = nullptr) {
  try {
    fn();
  } catch (const Error& e) {
    if (description) *description = e.Description();
    return e.Number();
  }
  return 0;
}

} // namespace belvane::test
