#include "cipher/blowfish.hpp"

#include "cipher/blowfish_tables.hpp"
#include "cipher/unsigned_word.hpp"
#include "text/error.hpp"

#include <string>

namespace belvane::cipher {

namespace {

struct ThreadCipher {
  BlowfishState state{kInitialP, kInitialS};
  bool keyed = false;
};

// Constant-initialised, so a thread's first use needs no guard.
thread_local constinit ThreadCipher tCipher;

[[gnu::always_inline]] inline std::uint32_t F(const BlowfishState& st, std::uint32_t x) {
  return ((st.S[0][x >> 24] + st.S[1][(x >> 16) & 0xFF]) ^ st.S[2][(x >> 8) & 0xFF]) +
         st.S[3][x & 0xFF];
}

// N independent blocks at once. A round depends on the one before it, so a
// single block leaves the processor waiting on each S-box load; interleaving
// blocks fills those waits. Each P-array word is folded into the half that
// the next round's F will read while the current F is still being computed,
// which keeps it off that chain of dependent loads; the result is the same
// as applying P(i) to the half before F, round by round.
template <std::size_t N>
[[gnu::always_inline]] inline void Encipher(const BlowfishState& st, std::uint32_t* l,
                                            std::uint32_t* r) {
#pragma GCC unroll 4
  for (std::size_t k = 0; k < N; ++k)
    l[k] ^= st.P[0];
#pragma GCC unroll 8
  for (std::size_t i = 1; i < 17; i += 2) {
#pragma GCC unroll 4
    for (std::size_t k = 0; k < N; ++k) {
      r[k] = (r[k] ^ st.P[i]) ^ F(st, l[k]);
      l[k] = (l[k] ^ st.P[i + 1]) ^ F(st, r[k]);
    }
  }
#pragma GCC unroll 4
  for (std::size_t k = 0; k < N; ++k) {
    const std::uint32_t left = r[k] ^ st.P[17];
    r[k] = l[k];
    l[k] = left;
  }
}

template <std::size_t N>
[[gnu::always_inline]] inline void Decipher(const BlowfishState& st, std::uint32_t* l,
                                            std::uint32_t* r) {
#pragma GCC unroll 4
  for (std::size_t k = 0; k < N; ++k)
    l[k] ^= st.P[17];
#pragma GCC unroll 8
  for (std::size_t i = 16; i > 0; i -= 2) {
#pragma GCC unroll 4
    for (std::size_t k = 0; k < N; ++k) {
      r[k] = (r[k] ^ st.P[i]) ^ F(st, l[k]);
      l[k] = (l[k] ^ st.P[i - 1]) ^ F(st, r[k]);
    }
  }
#pragma GCC unroll 4
  for (std::size_t k = 0; k < N; ++k) {
    const std::uint32_t left = r[k] ^ st.P[0];
    r[k] = l[k];
    l[k] = left;
  }
}

// Enciphers or deciphers `data` in place, four blocks at a time while it can.
template <bool Encrypt> void ProcessBytes(std::span<std::uint8_t> data) {
  if (data.size() % kBlowfishBlockBytes != 0) {
    throw Error(err::kInvalidCall,
                "Invalid procedure call: " + std::to_string(data.size()) +
                    " bytes are not a whole number of 8-byte blocks",
                "Belvane.Cipher");
  }
  const BlowfishState& st = tCipher.state;
  std::uint8_t* p = data.data();
  std::size_t blocks = data.size() / kBlowfishBlockBytes;
  auto load = [](const std::uint8_t* b) { return BytesToWord(b[0], b[1], b[2], b[3]); };
  auto store = [](std::uint8_t* b, std::uint32_t w) {
    const auto bytes = WordToBytes(w);
    b[0] = bytes[0], b[1] = bytes[1], b[2] = bytes[2], b[3] = bytes[3];
  };
  constexpr std::size_t kLanes = 4;
  for (; blocks >= kLanes; blocks -= kLanes, p += kLanes * kBlowfishBlockBytes) {
    std::uint32_t l[kLanes];
    std::uint32_t r[kLanes];
    for (std::size_t k = 0; k < kLanes; ++k) {
      l[k] = load(p + 8 * k);
      r[k] = load(p + 8 * k + 4);
    }
    if constexpr (Encrypt) {
      Encipher<kLanes>(st, l, r);
    } else {
      Decipher<kLanes>(st, l, r);
    }
    for (std::size_t k = 0; k < kLanes; ++k) {
      store(p + 8 * k, l[k]);
      store(p + 8 * k + 4, r[k]);
    }
  }
  // The last one to three blocks, side by side as well: short data (a field
  // of a block or two, a few fields at once) is mostly this tail.
  auto tail = [&]<std::size_t N>() {
    std::uint32_t l[N];
    std::uint32_t r[N];
    for (std::size_t k = 0; k < N; ++k) {
      l[k] = load(p + 8 * k);
      r[k] = load(p + 8 * k + 4);
    }
    if constexpr (Encrypt) {
      Encipher<N>(st, l, r);
    } else {
      Decipher<N>(st, l, r);
    }
    for (std::size_t k = 0; k < N; ++k) {
      store(p + 8 * k, l[k]);
      store(p + 8 * k + 4, r[k]);
    }
  };
  switch (blocks) {
  case 3:
    tail.template operator()<3>();
    break;
  case 2:
    tail.template operator()<2>();
    break;
  case 1:
    tail.template operator()<1>();
    break;
  default:
    break;
  }
}

template <bool Encrypt> void ProcessWords(std::span<std::uint32_t> words) {
  if (words.size() % 2 != 0) {
    throw Error(err::kInvalidCall,
                "Invalid procedure call: " + std::to_string(words.size()) +
                    " words do not make whole blocks",
                "Belvane.Cipher");
  }
  const BlowfishState& st = tCipher.state;
  for (std::size_t i = 0; i < words.size(); i += 2) {
    if constexpr (Encrypt) {
      Encipher<1>(st, &words[i], &words[i + 1]);
    } else {
      Decipher<1>(st, &words[i], &words[i + 1]);
    }
  }
}

} // namespace

void InitBlowfishTables() {
  tCipher.state.P = kInitialP;
  tCipher.state.S = kInitialS;
  tCipher.keyed = false;
}

void BlowfishKeySchedule(std::span<const std::uint8_t> key) {
  InitBlowfishTables();
  BlowfishState& st = tCipher.state;
  const std::size_t n = key.size();
  std::size_t j = 0;
  for (std::uint32_t& p : st.P) {
    std::uint32_t d = 0;
    for (int b = 0; b < 4; ++b) {
      d = ShiftLeft8(d);
      if (n != 0) {
        d |= key[j];
        if (++j == n) j = 0;
      }
    }
    p ^= d;
  }
  std::uint32_t l = 0;
  std::uint32_t r = 0;
  for (std::size_t i = 0; i < st.P.size(); i += 2) {
    Encipher<1>(st, &l, &r);
    st.P[i] = l;
    st.P[i + 1] = r;
  }
  for (auto& box : st.S) {
    for (std::size_t e = 0; e < box.size(); e += 2) {
      Encipher<1>(st, &l, &r);
      box[e] = l;
      box[e + 1] = r;
    }
  }
  tCipher.keyed = true;
}

bool BlowfishInitKey(std::span<const std::uint8_t> key, int length) {
  if (length < 0 || length > kBlowfishMaxKeyBytes) return false;
  if (static_cast<std::size_t>(length) > key.size()) {
    throw Error(err::kSubscript,
                "Subscript out of range: a key length of " + std::to_string(length) +
                    " exceeds the " + std::to_string(key.size()) + " key bytes given",
                "Belvane.Cipher");
  }
  BlowfishKeySchedule(key.first(static_cast<std::size_t>(length)));
  return true;
}

std::uint32_t BlowfishF(std::uint32_t x) { return F(tCipher.state, x); }

void BlowfishEncipherBlock(std::uint32_t& left, std::uint32_t& right) {
  Encipher<1>(tCipher.state, &left, &right);
}

void BlowfishDecipherBlock(std::uint32_t& left, std::uint32_t& right) {
  Decipher<1>(tCipher.state, &left, &right);
}

void BlowfishEncipherWords(std::span<std::uint32_t> words) { ProcessWords<true>(words); }
void BlowfishDecipherWords(std::span<std::uint32_t> words) { ProcessWords<false>(words); }
void BlowfishEncipherBytes(std::span<std::uint8_t> data) { ProcessBytes<true>(data); }
void BlowfishDecipherBytes(std::span<std::uint8_t> data) { ProcessBytes<false>(data); }

const BlowfishState& BlowfishCurrentState() { return tCipher.state; }
bool BlowfishKeyed() { return tCipher.keyed; }

} // namespace belvane::cipher
