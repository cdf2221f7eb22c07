// Reads the library's command lines for the hub transport and checks each one before any scan
// goes out.
#ifndef ZINHUB_COMMANDLINES_H
#define ZINHUB_COMMANDLINES_H

#include <cstddef>
#include <cstdint>
#include <string_view>
#include <vector>

#include "ZinHub/Bits.h"
#include "ZinHub/Board.h"
#include "ZinRT/ZinCore_Types.h"

namespace ZinHub {

/// The longest line a MOX core can need: a stage line of 65535 asynchronous and 65535
/// synchronous outputs (2*65535 + 17*65535 + 1 bits). Longer bit lengths are refused, which
/// bounds the memory one sequence can claim.
constexpr uint32_t kMaxLineBits = 19U * 65535U + 1U;

/// The most bits all lines of one sequence may move (64 Mi): each queued bit takes a byte until
/// the scans have run, so this bounds a sequence's memory at about 64 MiB.
constexpr uint64_t kMaxSequenceBits = uint64_t{1} << 26;

struct HubLine {
  ZIN_CORE_REF ref{};
  unsigned code = 0;  // 1 stage, 2 commit, 3 capture, 4 clear
  uint32_t bitLength = 0;
  BitVector data;         // code 01: the number's bit length - 1 low bits, then the spare 0
  size_t readOffset = 0;  // read lines: first byte of the line's data in the read buffer
};

/// Parses and checks every line of `text` against `board`. Throws std::runtime_error
/// ("ZinHub: command line N: ...") for the first bad line, or when the read lines need more
/// than the `readBytes` bytes of the read buffer, or when all lines together exceed
/// kMaxSequenceBits.
std::vector<HubLine> parseHubLines(std::string_view text, const Board& board, size_t readBytes);

}  // namespace ZinHub

#endif
