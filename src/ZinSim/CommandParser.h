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
  std::vector<uint8_t> data;  // code 01: the data as a little-endian number
};

/// Parses every line of `text`. Throws std::runtime_error naming the first bad line (counted
/// from 1) and what is wrong with it.
std::vector<CommandLine> parseCommandSequence(std::string_view text, CoreMap& cores);

/// Bytes that the read lines of a sequence shift out, each line rounded up to whole bytes.
uint64_t readByteCount(const std::vector<CommandLine>& lines);

}  // namespace ZinSim

#endif
