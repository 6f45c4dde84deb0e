#pragma once
// The Blowfish block cipher: 64-bit blocks, 16 rounds, keys of 0 to 56 bytes.
//
// Each thread has one cipher state (the P-array and the S-boxes). Every
// operation here works under the key last set up on the calling thread;
// enciphering and deciphering only read the state. A thread starts with the
// initial tables and no key.
//
// Blocks are two words, left and right; bytes map to words big-endian. Bulk
// operations are electronic code book: each block on its own, no chaining.

#include <array>
#include <cstddef>
#include <cstdint>
#include <span>

namespace belvane::cipher {

inline constexpr int kBlowfishMaxKeyBytes = 56;
inline constexpr std::size_t kBlowfishBlockBytes = 8;

struct BlowfishState {
  std::array<std::uint32_t, 18> P;
  std::array<std::array<std::uint32_t, 256>, 4> S;

  friend bool operator==(const BlowfishState&, const BlowfishState&) = default;
};

// Resets this thread's state to the initial tables (no key).
void InitBlowfishTables();

// Resets the tables, then mixes in the key bytes, used cyclically, first byte
// most significant. An empty key mixes in nothing: it is the same key as
// any run of zero bytes.
void BlowfishKeySchedule(std::span<const std::uint8_t> key);

// Sets up the first `length` bytes of `key` as this thread's key. Returns
// false and leaves the state as it was when `length` is below 0 or above 56.
// A length beyond the end of `key` raises error 9, the state unchanged.
bool BlowfishInitKey(std::span<const std::uint8_t> key, int length);

// The round function.
std::uint32_t BlowfishF(std::uint32_t x);

// One block in place.
void BlowfishEncipherBlock(std::uint32_t& left, std::uint32_t& right);
void BlowfishDecipherBlock(std::uint32_t& left, std::uint32_t& right);

// Words 0-1, 2-3, ... in place, each pair one block (left = even index). An
// odd number of words raises error 5 and changes nothing.
void BlowfishEncipherWords(std::span<std::uint32_t> words);
void BlowfishDecipherWords(std::span<std::uint32_t> words);

// Bytes in place, eight to a block. A length that is not a whole number of
// blocks raises error 5 and changes nothing.
void BlowfishEncipherBytes(std::span<std::uint8_t> data);
void BlowfishDecipherBytes(std::span<std::uint8_t> data);

// This thread's state, read-only, and whether a key has been set up on this
// thread since it started or since the last InitBlowfishTables.
const BlowfishState& BlowfishCurrentState();
bool BlowfishKeyed();

} // namespace belvane::cipher
