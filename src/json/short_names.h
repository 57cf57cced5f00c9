// Comparison of member names, which are short: two overlapping word loads compare 4 to 16
// bytes without a call, where most of an object's cost is finding its members.
#pragma once

#include <cstdint>
#include <cstring>

namespace LSP {

template <typename Word>
Word LoadWord(const char* bytes) {
  Word word;
  std::memcpy(&word, bytes, sizeof word);
  return word;
}

// Whether the `length` bytes at `a` and `b` are the same.
inline bool SameNameBytes(const char* a, const char* b, std::size_t length) {
  if (length >= 8 && length <= 16)
    return LoadWord<std::uint64_t>(a) == LoadWord<std::uint64_t>(b) &&
           LoadWord<std::uint64_t>(a + length - 8) == LoadWord<std::uint64_t>(b + length - 8);
  if (length >= 4 && length < 8)
    return LoadWord<std::uint32_t>(a) == LoadWord<std::uint32_t>(b) &&
           LoadWord<std::uint32_t>(a + length - 4) == LoadWord<std::uint32_t>(b + length - 4);
  return std::memcmp(a, b, length) == 0;
}

}  // namespace LSP
