// Test helpers that read and build the data that passes between a MOX core and the host:
// the write command text (codes 01/02), the read data of a read sequence (codes 03/04), packed
// bit vectors and status words. They are written independently of the library's own conversions
// so that a test compares the library against a second implementation of the wire format.
#ifndef ZIN_TEST_SUPPORT_WIREFORMAT_H
#define ZIN_TEST_SUPPORT_WIREFORMAT_H

#include <cstdint>
#include <random>
#include <string>
#include <vector>

namespace ZinTest {

/// The seven blank-separated fields of one command line.
struct CommandLine {
  std::string device, chain, core, code, readFlag, bitLength, data;
};

/// Splits a command text at "\n" (no trailing newline expected).
std::vector<std::string> splitLines(const std::string& text);
/// Parses one line into its seven fields; a line without exactly seven fields, or with blanks
/// other than single separators, is reported as a test failure and yields empty fields.
CommandLine parseLine(const std::string& line);

/// The `n` least significant bits of the number spelt by the hexadecimal text `hex` (either
/// case), most significant first, like a number written in base 2. A set bit above those `n`
/// bits is reported as a test failure.
std::string hexToBits(const std::string& hex, std::size_t n);
/// The hexadecimal text (upper case, ceil(n/4) digits) of the bit text `bits` (most significant
/// bit first).
std::string bitsToHex(const std::string& bits);

/// The output image carried by a write line (code 01): for a core with A_out asynchronous and
/// S_out synchronous outputs, character i of each string is port bit i, and steps[i][t] is step
/// t of synchronous output bit i.
struct WriteImage {
  std::string asyncValues;         // A_out characters
  std::vector<std::string> steps;  // S_out strings of 16 characters
  std::string asyncUpdate;         // A_out characters
  std::string syncUpdate;          // S_out characters

  /// An all-'0' image of the given size.
  static WriteImage zeros(uint32_t asyncOut, uint32_t syncOut);
};

/// The bit text D of a write line: async values, step strings (bit 0 first), async update
/// characters, sync update characters.
std::string writeBits(const WriteImage& image);
/// The data field of a write line for `image` (hexadecimal text of D).
std::string writeDataHex(const WriteImage& image);
/// Decodes the data field of a write line for a core of the given output widths.
WriteImage decodeWriteData(const std::string& dataHex, uint32_t asyncOut, uint32_t syncOut);
/// Checks that `text` is a complete write sequence (a code 01 line with the right bit length and
/// read flag, then the code 02 line) for the core at `prefix` ("DD C K ") and decodes its image.
/// Structural mismatches are reported as test failures.
WriteImage decodeWriteCommand(const std::string& text, const std::string& prefix, uint32_t asyncOut,
                              uint32_t syncOut);

/// The exact read sequence (codes 03 and 04) for a core with the given input widths.
std::string readCommandText(const std::string& prefix, uint32_t asyncIn, uint32_t syncIn);
/// The read bit count R = 8*ceil(L/8) + 8 that belongs to it, L = 4*A_in + 6*S_in + 16.
uint32_t readBitCount(uint32_t asyncIn, uint32_t syncIn);

/// The input image that a read delivers: character i of each string is port bit i.
struct InputImage {
  std::string asyncValue, asyncUp, asyncDown;                         // A_in characters each
  std::string syncValue, syncUp, syncDown, syncSyncUp, syncSyncDown;  // S_in characters each

  static InputImage zeros(uint32_t asyncIn, uint32_t syncIn);
  /// Random '0'/'1' characters everywhere.
  static InputImage random(uint32_t asyncIn, uint32_t syncIn, std::mt19937& rng);
  uint32_t asyncCount() const { return static_cast<uint32_t>(asyncValue.size()); }
  uint32_t syncCount() const { return static_cast<uint32_t>(syncValue.size()); }
};

/// The bit text B of a read (4 characters per asynchronous input bit: value, up, down, unused;
/// 6 per synchronous input bit: value, up, down, sync up, sync down, unused), with `unused` in
/// the unused places.
std::string inputBits(const InputImage& image, char unused = '0');
/// The bytes that the transport returns for a read whose first N = B.size() bits (read as a
/// little-endian number, B[k] being bit N-1-k) spell B. With `junkAbove`, every bit above N
/// (the further bits of the read lines, which the library must ignore) is set to 1.
std::vector<unsigned char> readDataFor(const std::string& bits, uint32_t readBitCount,
                                       bool junkAbove);
/// Shortcut: the read data of `image` for its core, unused characters '1' and junk above.
std::vector<unsigned char> readDataFor(const InputImage& image);

/// Packed vectors: bit i in bit (i mod 8) of byte i/8.
std::vector<uint8_t> packBits(const std::string& bits);
/// Character i is bit i of the packed vector at `data`.
std::string unpackBits(const uint8_t* data, std::size_t n);
/// The value of an unsigned number as a packed vector of `bytes` bytes (little endian).
std::vector<uint8_t> packValue(uint64_t value, std::size_t bytes);

/// Status words: bit i of the word is bit (i mod 8) of byte i/8. Sets `length` bits at `offset`
/// to `value` (least significant bit at `offset`).
void setStatusBits(std::vector<unsigned char>& word, uint32_t offset, uint32_t length,
                   uint32_t value);

}  // namespace ZinTest

#endif
