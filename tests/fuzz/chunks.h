// Splits a fuzz input into a stream and the places where it is cut: the first byte seeds
// the piece sizes, the rest is the stream, so libFuzzer explores both at once.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

namespace fuzz {

struct Chunk {
  const char* data;
  std::size_t size;
};

class Chunks {
 public:
  Chunks(const std::uint8_t* data, std::size_t size)
      : seed_(size ? data[0] : 0),
        stream_(reinterpret_cast<const char*>(data) + (size ? 1 : 0)),
        size_(size ? size - 1 : 0) {}

  std::size_t Size() const { return size_; }

  // Pieces of 1 to 64 bytes, sizes drawn from the seed; the stream in one piece when `whole`.
  std::vector<Chunk> Pieces(bool whole = false) const {
    std::vector<Chunk> pieces;
    std::uint32_t state = seed_ * 2654435761u + 1;
    for (std::size_t at = 0; at < size_;) {
      state = state * 1103515245u + 12345u;
      std::size_t piece = whole ? size_ : 1 + (state >> 16) % 64;
      if (piece > size_ - at) piece = size_ - at;
      pieces.push_back({stream_ + at, piece});
      at += piece;
    }
    return pieces;
  }

 private:
  std::uint8_t seed_;
  const char* stream_;
  std::size_t size_;
};

}  // namespace fuzz
