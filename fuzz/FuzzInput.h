// Reads typed values out of a fuzzer's input bytes; past the end every read gives zeros.
#ifndef ZIN_FUZZ_FUZZINPUT_H
#define ZIN_FUZZ_FUZZINPUT_H

#include <cstddef>
#include <cstdint>
#include <string>

namespace ZinFuzz {

class FuzzInput {
 public:
  FuzzInput(const uint8_t* data, size_t size) : data_(data), size_(size) {}

  bool empty() const { return pos_ >= size_; }
  uint8_t byte() { return pos_ < size_ ? data_[pos_++] : 0; }
  uint32_t u16() { return byte() | (static_cast<uint32_t>(byte()) << 8); }
  uint32_t u32() { return u16() | (u16() << 16); }
  /// A value below `bound` (bound > 0).
  uint32_t below(uint32_t bound) { return (bound <= 256 ? byte() : u32()) % bound; }
  /// Bytes up to the next `separator` (which is consumed) or the end; any byte values.
  std::string text(uint8_t separator) {
    std::string out;
    while (pos_ < size_ && data_[pos_] != separator) out += static_cast<char>(data_[pos_++]);
    if (pos_ < size_) ++pos_;
    return out;
  }
  /// `count` bytes (zeros past the end).
  std::string bytes(size_t count) {
    std::string out(count, '\0');
    for (char& c : out) c = static_cast<char>(byte());
    return out;
  }

 private:
  const uint8_t* data_;
  size_t size_;
  size_t pos_ = 0;
};

}  // namespace ZinFuzz

#endif
