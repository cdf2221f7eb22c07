// Scans through OpenOCD's Tcl server.
#include "ZinHub/OpenOcdEngine.h"

#include <sstream>
#include <stdexcept>

namespace ZinHub {

namespace {

constexpr char kDigits[] = "0123456789abcdef";
constexpr const char* kOk = "ZINOK";
constexpr const char* kFailed = "ZINERR";

std::string hexText(uint64_t value) {
  std::ostringstream out;
  out << "0x" << std::hex << value;
  return out.str();
}

// Bits [first, first+count) as a hex number, most significant digit first.
void appendHex(std::string& out, const BitVector& bits, size_t first, size_t count) {
  out += "0x";
  for (size_t digit = (count + 3) / 4; digit-- > 0;) {
    unsigned value = 0;
    for (unsigned b = 0; b < 4; ++b) {
      const size_t at = digit * 4 + b;
      if (at < count && bits[first + at] != 0) value |= 1U << b;
    }
    out += kDigits[value];
  }
}

int hexValue(char c) {
  if (c >= '0' && c <= '9') return c - '0';
  if (c >= 'a' && c <= 'f') return c - 'a' + 10;
  if (c >= 'A' && c <= 'F') return c - 'A' + 10;
  return -1;
}

// Appends the `count` low bits of a hex field (most significant digit first) to `bits`.
bool appendField(BitVector& bits, std::string_view hex, size_t count) {
  const size_t base = bits.size();
  bits.resize(base + count, 0);
  for (size_t i = 0; i < hex.size(); ++i) {
    const int value = hexValue(hex[hex.size() - 1 - i]);
    if (value < 0) return false;
    for (unsigned b = 0; b < 4; ++b) {
      const size_t at = i * 4 + b;
      if (((value >> b) & 1) == 0) continue;
      if (at >= count) return false;
      bits[base + at] = 1;
    }
  }
  return true;
}

std::vector<std::string_view> words(std::string_view text) {
  std::vector<std::string_view> out;
  size_t at = 0;
  while (true) {
    at = text.find_first_not_of(" \t\r\n", at);
    if (at == std::string_view::npos) return out;
    const size_t end = text.find_first_of(" \t\r\n", at);
    out.push_back(text.substr(at, end == std::string_view::npos ? end : end - at));
    if (end == std::string_view::npos) return out;
    at = end;
  }
}

}  // namespace

OpenOcdEngine::OpenOcdEngine(std::string host, uint16_t port, Board board, OpenOcdOptions options)
    : connection_(std::move(host), port, options),
      board_(std::move(board)),
      instruction_(board_.devices.size()) {}

void OpenOcdEngine::connect() {
  if (!connection_.ensureConnected()) return;
  try {
    checkBoard(connection_.request("scan_chain", kMaxTclRequest));
  } catch (...) {
    connection_.close();  // the next call checks again
    throw;
  }
}

std::string OpenOcdEngine::tcl(const std::string& script) {
  connect();
  return connection_.request(script, kMaxTclRequest * 4);
}

// OpenOCD's scan_chain table: index, TAP name, enabled, IDCODE found, expected, IR length, ...
void OpenOcdEngine::checkBoard(const std::string& scanChain) const {
  std::istringstream rows(scanChain);
  std::string row;
  std::vector<std::vector<std::string_view>> taps;
  std::vector<std::string> keep;
  while (std::getline(rows, row)) keep.push_back(row);
  for (const std::string& r : keep) {
    const auto w = words(r);
    if (w.size() >= 6 && !w[0].empty() && std::isdigit(static_cast<unsigned char>(w[0][0]))) {
      taps.push_back(w);
    }
  }
  for (size_t d = 0; d < board_.devices.size(); ++d) {
    const BoardDevice& device = board_.devices[d];
    const std::string name = "board device " + std::to_string(d) + " (" + device.tapName + ")";
    const std::vector<std::string_view>* tap = nullptr;
    for (const auto& t : taps) {
      if (t[1] == device.tapName) tap = &t;
    }
    if (tap == nullptr) {
      throw std::runtime_error("ZinHub: " + where() + " has no TAP named " + device.tapName + " (" +
                               name + ")");
    }
    const unsigned long irLength = std::strtoul(std::string((*tap)[5]).c_str(), nullptr, 10);
    if (irLength != device.irLength) {
      throw std::runtime_error("ZinHub: " + name + " has IR length " +
                               std::to_string(device.irLength) + ", but " + where() +
                               " declares IR length " + std::to_string(irLength) + " for that TAP");
    }
    if (!device.idcode) continue;
    const uint32_t found =
        static_cast<uint32_t>(std::strtoul(std::string((*tap)[3]).c_str(), nullptr, 16));
    if ((found & device.idcodeMask) != (*device.idcode & device.idcodeMask)) {
      throw std::runtime_error("ZinHub: " + name + " expects IDCODE " + hexText(*device.idcode) +
                               ", but " + where() + " found " + hexText(found) +
                               " on that TAP (wrong board file or wrong cable?)");
    }
  }
}

void OpenOcdEngine::queueIrScan(uint32_t device, uint32_t irLength, uint64_t instruction) {
  if (device >= board_.devices.size()) {
    throw std::invalid_argument("no device " + std::to_string(device) + " on the board");
  }
  if (irLength != board_.devices[device].irLength) {
    throw std::invalid_argument("IR length " + std::to_string(irLength) +
                                " does not match the board");
  }
  queue_.push_back(Scan{device, true, instruction, {}});
}

void OpenOcdEngine::queueDrScan(uint32_t device, BitVector tdi) {
  if (device >= board_.devices.size()) {
    throw std::invalid_argument("no device " + std::to_string(device) + " on the board");
  }
  if (tdi.empty()) throw std::invalid_argument("a DR scan needs at least one bit");
  queue_.push_back(Scan{device, false, 0, std::move(tdi)});
}

std::string OpenOcdEngine::irCommand(uint32_t device, uint64_t instruction) const {
  return "irscan " + board_.devices[device].tapName + " " + hexText(instruction) + "; ";
}

std::string OpenOcdEngine::drCommand(const Scan& scan) const {
  std::string command = "append _z [drscan " + board_.devices[scan.device].tapName;
  command.reserve(command.size() + scan.tdi.size() / 4 + scan.tdi.size() / kFieldBits * 8 + 32);
  for (size_t first = 0; first < scan.tdi.size(); first += kFieldBits) {
    const size_t count = std::min<size_t>(kFieldBits, scan.tdi.size() - first);
    command += " " + std::to_string(count) + " ";
    appendHex(command, scan.tdi, first, count);
  }
  return command + "] {;}; ";
}

std::vector<BitVector> OpenOcdEngine::execute() {
  std::vector<Scan> queue;
  queue.swap(queue_);
  std::vector<BitVector> results;
  try {
    connect();
    std::vector<const Scan*> request;
    size_t size = 0;
    for (const Scan& scan : queue) {
      const size_t cost = scan.tdi.size() / 4 + scan.tdi.size() / kFieldBits * 8 + 128;
      if (!request.empty() && size + cost > kMaxTclRequest) {
        runRequest(request, results);
        request.clear();
        size = 0;
      }
      request.push_back(&scan);
      size += cost;
    }
    if (!request.empty()) runRequest(request, results);
  } catch (...) {
    // What the instruction registers hold is unknown now.
    for (auto& instruction : instruction_) instruction.reset();
    throw;
  }
  return results;
}

void OpenOcdEngine::runRequest(const std::vector<const Scan*>& scans,
                               std::vector<BitVector>& results) {
  std::string body = "set _z {}; ";
  std::vector<bool> selected(board_.devices.size(), false);
  size_t drScans = 0;
  for (const Scan* scan : scans) {
    if (scan->ir) {
      body += irCommand(scan->device, scan->instruction);
      instruction_[scan->device] = scan->instruction;
      selected[scan->device] = true;
      continue;
    }
    if (!selected[scan->device] && instruction_[scan->device]) {
      body += irCommand(scan->device, *instruction_[scan->device]);
    }
    selected[scan->device] = true;
    body += drCommand(*scan);
    ++drScans;
  }
  const std::string script = "if {[catch {" + body + "set _z} _z]} {set _z \"" + kFailed +
                             " $_z\"} else {set _z \"" + kOk + " $_z\"}";
  lastScript_ = script;
  std::string answer = connection_.request(script, script.size() * 2 + 4096);
  if (answer.rfind(kFailed, 0) == 0) {
    connection_.close();
    std::string why = answer.substr(std::string(kFailed).size() + 1, 400);
    if (why.empty()) why = "OpenOCD reports no reason; see its log";
    throw std::runtime_error("ZinHub: " + where() +
                             " could not carry out the scans (has it lost the cable or the "
                             "target?): " +
                             why);
  }
  if (answer.rfind(kOk, 0) != 0) {
    connection_.close();
    throw std::runtime_error("ZinHub: " + where() +
                             " gave an unexpected answer: " + answer.substr(0, 200));
  }
  std::string_view rest = std::string_view(answer).substr(std::string(kOk).size());
  for (const Scan* scan : scans) {
    if (scan->ir) continue;
    const size_t end = rest.find(';');
    const std::vector<std::string_view> fields =
        words(rest.substr(0, end == std::string_view::npos ? rest.size() : end));
    const size_t expected = (scan->tdi.size() + kFieldBits - 1) / kFieldBits;
    BitVector tdo;
    tdo.reserve(scan->tdi.size());
    bool ok = end != std::string_view::npos && fields.size() == expected;
    for (size_t f = 0; ok && f < expected; ++f) {
      ok = appendField(tdo, fields[f],
                       std::min<size_t>(kFieldBits, scan->tdi.size() - f * kFieldBits));
    }
    if (!ok) {
      connection_.close();
      throw std::runtime_error("ZinHub: " + where() + " returned a malformed scan result");
    }
    results.push_back(std::move(tdo));
    rest = rest.substr(end + 1);
  }
  (void)drScans;
}

}  // namespace ZinHub
