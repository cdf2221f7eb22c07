// Reads and checks a command sequence against the cores it addresses.
#include "CommandParser.h"

#include <algorithm>
#include <cstdio>
#include <map>
#include <stdexcept>
#include <string>

#include "HexNumber.h"

namespace ZinSim {

namespace {

constexpr size_t kFieldCount = 7;

std::string hex8(uint32_t value) {
  char text[16];
  std::snprintf(text, sizeof text, "%08X", value);
  return text;
}

// Splits a line at single blanks; an empty field (two blanks, a blank at either end) is an error.
std::vector<std::string_view> splitFields(std::string_view line) {
  std::vector<std::string_view> fields;
  size_t start = 0;
  while (true) {
    const size_t blank = line.find(' ', start);
    fields.push_back(line.substr(start, blank == std::string_view::npos ? blank : blank - start));
    if (blank == std::string_view::npos) break;
    start = blank + 1;
  }
  return fields;
}

class LineParser {
 public:
  LineParser(std::string_view line, CoreMap& cores) : line_(line), cores_(cores) {}

  CommandLine parse() {
    const std::vector<std::string_view> f = splitFields(line_);
    if (f.size() != kFieldCount) {
      throw std::invalid_argument("expected 7 fields separated by single blanks, found " +
                                  std::to_string(f.size()));
    }
    for (size_t i = 0; i < f.size(); ++i) {
      if (f[i].empty()) {
        throw std::invalid_argument("field " + std::to_string(i + 1) +
                                    " is empty (blanks must be single, none at either end)");
      }
    }
    CommandLine cmd;
    cmd.core = findCore(f[0], f[1], f[2]);
    readCode(f[3], f[4], cmd);
    readLength(f[5], cmd);
    readData(f[6], cmd);
    return cmd;
  }

 private:
  MoxModel* findCore(std::string_view device, std::string_view chain, std::string_view core) {
    ZIN_CORE_REF ref{};
    if (!parseHexField(device, 2, ref.deviceIndex)) {
      throw std::invalid_argument("device field \"" + std::string(device) +
                                  "\" is not 2 hexadecimal digits");
    }
    if (!parseHexField(chain, 1, ref.userChainNumber)) {
      throw std::invalid_argument("user chain field \"" + std::string(chain) +
                                  "\" is not 1 hexadecimal digit");
    }
    if (!parseHexField(core, 1, ref.coreIndex)) {
      throw std::invalid_argument("core field \"" + std::string(core) +
                                  "\" is not 1 hexadecimal digit");
    }
    auto it = cores_.find(coreKey(ref));
    if (it == cores_.end()) throw std::invalid_argument("no core at " + refText(ref));
    if (!it->second.mox) {
      throw std::invalid_argument(refText(ref) + " is not a MOX core (type " +
                                  std::to_string(it->second.info.coreType) + ")");
    }
    return it->second.mox.get();
  }

  static void readCode(std::string_view code, std::string_view flag, CommandLine& cmd) {
    if (!parseHexField(code, 2, cmd.code) || cmd.code < kWrite || cmd.code > kClear) {
      throw std::invalid_argument("unknown command code \"" + std::string(code) +
                                  "\" (expected 01, 02, 03 or 04)");
    }
    const char expected = cmd.code >= kRead ? '1' : '0';
    if (flag.size() != 1 || flag[0] != expected) {
      throw std::invalid_argument("read flag \"" + std::string(flag) + "\" for code 0" +
                                  std::to_string(cmd.code) + " (expected " + expected + ")");
    }
    cmd.read = expected == '1';
  }

  static void readLength(std::string_view length, CommandLine& cmd) {
    if (!parseHexField(length, 8, cmd.bitLength)) {
      throw std::invalid_argument("bit length \"" + std::string(length) +
                                  "\" is not 8 hexadecimal digits");
    }
    uint32_t expected = 4;
    if (cmd.code == kWrite) expected = cmd.core->writeLength();
    if (cmd.code == kRead) expected = cmd.core->readLength();
    if (cmd.bitLength != expected) {
      throw std::invalid_argument("bit length " + hex8(cmd.bitLength) +
                                  " does not match the core: code 0" + std::to_string(cmd.code) +
                                  " needs " + hex8(expected));
    }
  }

  // Checked without storing anything, and refused by its digit count first: a short text must
  // not stand for a long number.
  static void readData(std::string_view data, CommandLine& cmd) {
    if (cmd.code == kWrite) {
      const uint64_t digits = std::max<uint64_t>(1, (uint64_t{cmd.bitLength} + 2) / 4);
      if (data.size() != digits) {
        throw std::invalid_argument("data has " + std::to_string(data.size()) +
                                    " digits; bit length " + hex8(cmd.bitLength) + " needs " +
                                    std::to_string(digits));
      }
      const std::string problem = parseHexNumber(data, cmd.bitLength - 1, nullptr);
      if (!problem.empty()) throw std::invalid_argument(problem);
      cmd.data = data;
      return;
    }
    if (data != "0") {
      throw std::invalid_argument("data must be 0 for code 0" + std::to_string(cmd.code) +
                                  ", found \"" + std::string(data.substr(0, 40)) + "\"");
    }
  }

  std::string_view line_;
  CoreMap& cores_;
};

// Adds up the work of a sequence line by line. A 02 line commits a new image only when it is the
// first of its core in the sequence or a 01 line to that core came before it; the others change
// nothing and cost one.
class WorkCount {
 public:
  void add(const CommandLine& line) {
    uint64_t work = 1;
    if (line.code == kWrite || line.code == kRead) work += line.bitLength;
    if (line.code == kWrite) staged_[line.core] = true;
    if (line.code == kCommit) {
      const auto [it, first] = staged_.try_emplace(line.core, false);
      if (first || it->second) work += line.core->portBits();
      it->second = false;
    }
    total_ += work;
    if (total_ > kMaxSequenceWork) {
      throw std::invalid_argument("the sequence exceeds the work limit of " +
                                  std::to_string(kMaxSequenceWork) + " bit operations");
    }
  }

 private:
  std::map<const MoxModel*, bool> staged_;  // a 01 line since the last 02, per core
  uint64_t total_ = 0;
};

}  // namespace

std::vector<CommandLine> parseCommandSequence(std::string_view text, CoreMap& cores) {
  std::vector<CommandLine> lines;
  lines.reserve(static_cast<size_t>(std::count(text.begin(), text.end(), '\n')) + 1);
  WorkCount work;
  size_t start = 0;
  for (size_t number = 1;; ++number) {
    const size_t end = text.find('\n', start);
    const std::string_view line =
        text.substr(start, end == std::string_view::npos ? end : end - start);
    try {
      lines.push_back(LineParser(line, cores).parse());
      work.add(lines.back());
    } catch (const std::invalid_argument& e) {
      throw std::runtime_error("ZinSim: command line " + std::to_string(number) + ": " + e.what());
    }
    if (end == std::string_view::npos) break;
    start = end + 1;
  }
  return lines;
}

uint64_t readByteCount(const std::vector<CommandLine>& lines) {
  uint64_t bytes = 0;
  for (const CommandLine& line : lines) {
    if (line.read) bytes += (uint64_t{line.bitLength} + 7) / 8;
  }
  return bytes;
}

}  // namespace ZinSim
