#pragma once
// The one error type of the project. It carries what a host's error object
// carries: an error number, a description and the source that raised it.
// Numbers follow the runtime conventions the hosts know (5 invalid call,
// 9 subscript out of range, 13 type mismatch, 3021 no current record, ...).

#include <stdexcept>
#include <string>

namespace belvane {

class Error : public std::runtime_error {
public:
  Error(long number, std::string description, std::string source = "Belvane");

  long Number() const noexcept { return number_; }
  const std::string& Description() const noexcept { return description_; }
  const std::string& Source() const noexcept { return source_; }

private:
  long number_;
  std::string description_;
  std::string source_;
};

// Error numbers used across the layers.
namespace err {
inline constexpr long kInvalidCall = 5;         // invalid procedure call or argument
inline constexpr long kOverflow = 6;            // overflow
inline constexpr long kSubscript = 9;           // subscript out of range
inline constexpr long kTypeMismatch = 13;       // type mismatch
inline constexpr long kInvalidUseOfNull = 94;   // invalid use of Null
inline constexpr long kInvalidRowValue = 30009; // grid: invalid row value
inline constexpr long kInvalidColValue = 30010; // grid: invalid column value
inline constexpr long kItemNotFound = 3265;     // record set: item not found in this collection
inline constexpr long kNoCurrentRecord = 3021;  // record set: BOF or EOF, or record deleted
inline constexpr long kClosed = 3704;           // record set: operation not allowed when closed
inline constexpr long kBadArguments =
    3001; // record set: arguments of the wrong type or out of range
inline constexpr long kOpenAlready = 3705; // record set: operation not allowed when open
inline constexpr long kDataService = 3709; // catalogue data service failure
} // namespace err

} // namespace belvane
