// Hex texts of values, most significant digit first, and little-endian byte blocks.
#ifndef ZINMOX_PYTHON_HEXTEXT_H
#define ZINMOX_PYTHON_HEXTEXT_H

#include <cstddef>
#include <string>

namespace zinmox {

/// `digits` hex digits of the little-endian number in `bytes` (zero above its last byte).
std::string hexText(const std::string& bytes, size_t digits);

/// The value of a hex text as the library fits it to a block of `bytes` bytes: a shorter text
/// is sign-extended from its first digit, a longer one keeps its last 2 * `bytes` digits.
/// Returns the block little-endian; throws std::invalid_argument for a text that is empty or
/// holds a character that is not a hex digit.
std::string fitHexText(const std::string& text, size_t bytes);

}  // namespace zinmox

#endif
