// Test helpers that read and build the data passing between a MOX core and the host: the write
// sequence (codes 01/02), the read data of a read sequence (codes 03/04), packed bit vectors and
// status words. They are written independently of the library's own conversions, so a test
// compares the library against a second implementation of the wire format.
#ifndef ZIN_TEST_SUPPORT_WIREFORMAT_H
#define ZIN_TEST_SUPPORT_WIREFORMAT_H

#include <cstdint>
#include <random>
#include <string>
#include <vector>

namespace ZinTest {

/// The hexadecimal text (upper case, ceil(n/4) digits) of a bit text, most significant first.
std::string bitsToHex(const std::string& bits);

/// The output image of a write line (code 01) for A_out asynchronous and S_out synchronous
/// outputs: character i of each string is port bit i; steps[i][t] is step t of sync output i.
struct WriteImage {
  std::string asyncValues;
  std::vector<std::string> steps;
  std::string asyncUpdate;
  std::string syncUpdate;

  /// An all-'0' image of the given size.
  static WriteImage zeros(uint32_t asyncOut, uint32_t syncOut);
};

/// The data field of a write line for `image`.
std::string writeDataHex(const WriteImage& image);
/// Checks that `text` is a complete write sequence (the code 01 line with its bit length and
/// read flag, then the code 02 line) for the core at `prefix` ("DD C K ") and decodes its image.
/// Mismatches are reported as test failures.
WriteImage decodeWriteCommand(const std::string& text, const std::string& prefix, uint32_t asyncOut,
                              uint32_t syncOut);

/// The exact read sequence (codes 03 and 04) for a core with the given input widths.
std::string readCommandText(const std::string& prefix, uint32_t asyncIn, uint32_t syncIn);
/// The read bit count R = 8*ceil(L/8) + 8 that belongs to it, L = 4*A_in + 6*S_in + 16.
uint32_t readBitCount(uint32_t asyncIn, uint32_t syncIn);

/// The input image a read delivers: character i of each string is port bit i.
struct InputImage {
  std::string asyncValue, asyncUp, asyncDown;                         // A_in characters each
  std::string syncValue, syncUp, syncDown, syncSyncUp, syncSyncDown;  // S_in characters each

  static InputImage zeros(uint32_t asyncIn, uint32_t syncIn);
  static InputImage random(uint32_t asyncIn, uint32_t syncIn, std::mt19937& rng);
  /// The eight strings in the order of ZinMOX_getPortBits' vectors.
  std::vector<const std::string*> vectors() const;
};

/// The bytes a transport returns for a read of `image`: the bit text B (per async input bit
/// value, up, down, unused; per sync input bit value, up, down, sync up, sync down, unused)
/// spelt as a little-endian number, B[k] being bit N-1-k. The unused places and every bit above
/// N (which the library must ignore) are set to 1.
std::vector<unsigned char> readDataFor(const InputImage& image);

/// Packed vectors: bit i in bit (i mod 8) of byte i/8.
std::vector<uint8_t> packBits(const std::string& bits);
/// Character i is bit i of the packed vector at `data`.
std::string unpackBits(const uint8_t* data, std::size_t n);
/// An unsigned number as a packed vector of `bytes` bytes (little endian).
std::vector<uint8_t> packValue(uint64_t value, std::size_t bytes);

/// Status words: bit i is bit (i mod 8) of byte i/8. Sets `length` bits at `offset` to `value`.
void setStatusBits(std::vector<unsigned char>& word, uint32_t offset, uint32_t length,
                   uint32_t value);

}  // namespace ZinTest

#endif
