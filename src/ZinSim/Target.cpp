// The simulated target: the cores, the transport operations and the inspection calls.
#include "ZinSim/Target.h"

#include <algorithm>
#include <cstring>
#include <deque>
#include <stdexcept>
#include <utility>

#include "CommandParser.h"
#include "DescriptionCheck.h"
#include "HexNumber.h"
#include "SimCore.h"
#include "ZinTestKit/StatusWord.h"

namespace ZinSim {

namespace {

// The latest texts received, bounded by entries and bytes; a text longer than the byte limit
// keeps its beginning.
struct CommandLog {
  void add(const std::string& text) {
    texts.push_back(text.substr(0, Target::kCommandLogBytes));
    bytes += texts.back().size();
    trim();
  }
  void trim() {
    while (texts.size() > limit || bytes > Target::kCommandLogBytes) {
      bytes -= texts.front().size();
      texts.pop_front();
    }
  }
  std::deque<std::string> texts;
  size_t limit = 1000;
  size_t bytes = 0;
};

}  // namespace

struct Target::State {
  CoreMap cores;
  CommandLog log;
  uint64_t flushes = 0;
  std::exception_ptr transferFailure;
  std::exception_ptr statusFailure;
};

namespace {

std::vector<unsigned char> moxStatusWord(const CoreDescription& d) {
  ZinTestKit::MoxStatus s;
  s.majorVersion = d.majorVersion;
  s.minorVersion = d.minorVersion;
  s.asyncInputCount = d.asyncInputs;
  s.syncInputCount = d.syncInputs;
  s.asyncOutputCount = d.asyncOutputs;
  s.syncOutputCount = d.syncOutputs;
  s.qxMajorVersion = d.qxMajorVersion;
  s.qxMinorVersion = d.qxMinorVersion;
  s.qxMinorVersionAlpha = d.qxMinorVersionAlpha;
  return ZinTestKit::buildMoxStatusWord(s);
}

SimCore buildCore(const CoreDescription& d) {
  SimCore core;
  core.info = ZIN_CORE_INFO{d.manufacturerId, d.type, d.majorVersion, d.minorVersion, d.revision};
  if (d.type == kMoxCoreType) {
    core.status = moxStatusWord(d);
    core.mox = std::make_unique<MoxModel>(d);
  } else {
    core.status = d.status;
  }
  return core;
}

MoxModel& moxAt(CoreMap& cores, const ZIN_CORE_REF& ref) {
  if (ref.deviceIndex <= 255 && ref.userChainNumber <= 15 && ref.coreIndex <= 15) {
    auto it = cores.find(coreKey(ref));
    if (it != cores.end() && it->second.mox) return *it->second.mox;
  }
  throw std::invalid_argument("ZinSim: no MOX core at " + refText(ref));
}

void applyLines(const std::vector<CommandLine>& lines, unsigned char* readData) {
  uint64_t offset = 0;
  std::vector<uint8_t> number;  // one 01 line's data at a time
  for (const CommandLine& line : lines) {
    switch (line.code) {
      case kWrite:
        parseHexNumber(line.data, line.bitLength - 1, &number);
        line.core->stage(number);
        break;
      case kCommit:
        line.core->commit();
        break;
      case kRead:
        if (readData != nullptr) line.core->capture(readData + offset);
        break;
      default:
        line.core->requestClear();
        break;
    }
    if (line.read) offset += (uint64_t{line.bitLength} + 7) / 8;
  }
}

}  // namespace

Target::Target() : Target(demoDescription()) {}

Target::Target(const TargetDescription& description)
    : description_(description), state_(std::make_unique<State>()) {
  if (auto problem = findProblem(description_))
    throw DescriptionError(problem->place, problem->text);
  for (const CoreDescription& d : description_.cores) {
    state_->cores.emplace(coreKey(d.ref), buildCore(d));
  }
}

Target::~Target() = default;

void Target::readStatus(const ZIN_CORE_REF& ref, ZIN_CORE_INFO& info, unsigned char* status,
                        uint32_t statusBytes, uint32_t statusBitCount) {
  std::lock_guard<std::mutex> lock(mutex_);
  if (state_->statusFailure) std::rethrow_exception(std::exchange(state_->statusFailure, nullptr));
  if (ref.deviceIndex > 255 || ref.userChainNumber > 15 || ref.coreIndex > 15) return;
  auto it = state_->cores.find(coreKey(ref));
  if (it == state_->cores.end()) return;
  info = it->second.info;
  const std::vector<unsigned char>& word = it->second.status;
  const uint64_t wanted = std::min<uint64_t>((uint64_t{statusBitCount} + 7) / 8, statusBytes);
  const size_t count = static_cast<size_t>(std::min<uint64_t>(wanted, word.size()));
  if (status == nullptr || count == 0) return;
  std::memcpy(status, word.data(), count);
  if (statusBitCount / 8 < count) {  // keep no bit beyond the asked ones
    status[statusBitCount / 8] &= static_cast<unsigned char>((1u << (statusBitCount % 8)) - 1);
  }
}

void Target::commandSequence(const std::string& text, unsigned char* readData,
                             uint32_t readBitCount) {
  std::lock_guard<std::mutex> lock(mutex_);
  State& s = *state_;
  s.log.add(text);
  if (s.transferFailure) std::rethrow_exception(std::exchange(s.transferFailure, nullptr));
  if (readBitCount != 0 && readData == nullptr) {
    throw std::invalid_argument("ZinSim: no read buffer for " + std::to_string(readBitCount) +
                                " bits");
  }
  const std::vector<CommandLine> lines = parseCommandSequence(text, s.cores);
  const uint64_t needed = readByteCount(lines);
  const uint64_t held = (uint64_t{readBitCount} + 7) / 8;
  if (needed > held) {
    throw std::runtime_error("ZinSim: the command sequence shifts out " + std::to_string(needed) +
                             " bytes but the read buffer holds " + std::to_string(held));
  }
  applyLines(lines, readBitCount != 0 ? readData : nullptr);
  for (auto& [key, core] : s.cores) {
    if (core.mox) core.mox->endSequence();
  }
}

void Target::flush() {
  std::lock_guard<std::mutex> lock(mutex_);
  ++state_->flushes;
}

bool Target::listCores(std::vector<ZIN_CORE_REF>& refs) {
  std::lock_guard<std::mutex> lock(mutex_);
  for (const auto& [key, core] : state_->cores) refs.push_back(refOfKey(key));
  return true;
}

std::string Target::asyncOutputLevels(const ZIN_CORE_REF& ref) const {
  std::lock_guard<std::mutex> lock(mutex_);
  return moxAt(state_->cores, ref).asyncOutputLevels();
}

std::string Target::syncOutputLevels(const ZIN_CORE_REF& ref) const {
  std::lock_guard<std::mutex> lock(mutex_);
  return moxAt(state_->cores, ref).syncOutputLevels();
}

std::string Target::asyncInputLevels(const ZIN_CORE_REF& ref) const {
  std::lock_guard<std::mutex> lock(mutex_);
  return moxAt(state_->cores, ref).asyncInputLevels();
}

std::string Target::syncInputLevels(const ZIN_CORE_REF& ref) const {
  std::lock_guard<std::mutex> lock(mutex_);
  return moxAt(state_->cores, ref).syncInputLevels();
}

uint64_t Target::cycle(const ZIN_CORE_REF& ref) const {
  std::lock_guard<std::mutex> lock(mutex_);
  return moxAt(state_->cores, ref).cycle();
}

void Target::setInputSource(const ZIN_CORE_REF& ref, InputPort port, uint32_t bit,
                            const InputSource& source) {
  std::lock_guard<std::mutex> lock(mutex_);
  MoxModel& core = moxAt(state_->cores, ref);
  // Checked as a one-bit wiring rule of a core with this core's widths.
  CoreDescription probe;
  probe.asyncInputs = core.width(InputPort::Async);
  probe.syncInputs = core.width(InputPort::Sync);
  probe.asyncOutputs = core.width(OutputPort::Async);
  probe.syncOutputs = core.width(OutputPort::Sync);
  probe.wiring.push_back(WiringRule{port, bit, 1, source});
  if (auto problem = checkCore(probe)) {
    throw std::invalid_argument("ZinSim: setInputSource on " + refText(ref) + ": " +
                                problem->place + ": " + problem->text);
  }
  core.setInputSource(port, bit, source);
}

void Target::advance(uint64_t cycles) {
  std::lock_guard<std::mutex> lock(mutex_);
  for (auto& [key, core] : state_->cores) {
    if (core.mox) core.mox->advance(cycles);
  }
}

void Target::setCyclesPerSequence(uint32_t cycles) {
  std::lock_guard<std::mutex> lock(mutex_);
  for (auto& [key, core] : state_->cores) {
    if (core.mox) core.mox->setCyclesPerSequence(cycles);
  }
}

std::vector<std::string> Target::commandLog() const {
  std::lock_guard<std::mutex> lock(mutex_);
  return {state_->log.texts.begin(), state_->log.texts.end()};
}

void Target::clearCommandLog() {
  std::lock_guard<std::mutex> lock(mutex_);
  state_->log.texts.clear();
  state_->log.bytes = 0;
}

void Target::setCommandLogLimit(size_t entries) {
  std::lock_guard<std::mutex> lock(mutex_);
  state_->log.limit = entries;
  state_->log.trim();
}

uint64_t Target::flushCount() const {
  std::lock_guard<std::mutex> lock(mutex_);
  return state_->flushes;
}

void Target::failNextTransfer(std::exception_ptr error) {
  std::lock_guard<std::mutex> lock(mutex_);
  state_->transferFailure = std::move(error);
}

void Target::failNextTransfer(const std::string& message) {
  failNextTransfer(std::make_exception_ptr(std::runtime_error(message)));
}

void Target::failNextStatusRead(std::exception_ptr error) {
  std::lock_guard<std::mutex> lock(mutex_);
  state_->statusFailure = std::move(error);
}

}  // namespace ZinSim
