// Reads and checks a command sequence against the cores it addresses.
#ifndef ZINSIM_COMMANDPARSER_H
#define ZINSIM_COMMANDPARSER_H

#include <cstdint>
#include <string_view>
#include <vector>

#include "SimCore.h"

namespace ZinSim {

enum CommandCode : uint32_t { kWrite = 1, kCommit = 2, kRead = 3, kClear = 4 };

struct CommandLine {
  MoxModel* core = nullptr;
  uint32_t code = 0;
  bool read = false;
  uint32_t bitLength = 0;
  std::string_view data;  // the data text, checked; code 01 decodes it when carried out
};

/// Work that one command sequence may take, in bit operations (docs/target.md): every line counts
/// 1, a 01 or 03 line its bit length more, and a 02 line that commits a new image the widths of
/// all four ports of its core more.
constexpr uint64_t kMaxSequenceWork = uint64_t{1} << 26;

/// Parses every line of `text`, which must outlive the result. Throws std::runtime_error naming
/// the first bad line (counted from 1) and what is wrong with it, also the line at which the
/// sequence exceeds kMaxSequenceWork.
std::vector<CommandLine> parseCommandSequence(std::string_view text, CoreMap& cores);

/// Bytes that the read lines of a sequence shift out, each line rounded up to whole bytes.
uint64_t readByteCount(const std::vector<CommandLine>& lines);

}  // namespace ZinSim

#endif
