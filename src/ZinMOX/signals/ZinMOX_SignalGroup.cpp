// ZinMOX_SignalGroup: construction, copying, and the packing of its value bits onto port bits.
#include "ZinMOX/ZinMOX_SignalGroup.h"

#include <stdexcept>

#include "format/ZinMOX_BitFormat.h"
#include "framework/ZinMOX_Framework.h"
#include "internal/ZinMOX_Command.h"

namespace ZinRT {

namespace {

inline bool packedBit(const uint8_t* bytes, uint32_t bit) {
  return ((bytes[bit / 8] >> (bit % 8)) & 1u) != 0;
}

// ORs value bit i into `packed` (skipped when null) wherever the image character of port bit
// positions[i] is '1'; other characters leave the bit as it was. Eight bits are gathered in a
// register before each byte is touched.
void collectBits(const std::string& image, const uint32_t* positions, uint32_t n, uint8_t* packed,
                 bool contiguous) {
  if (packed == nullptr) return;
  const char* chars = image.data();
  uint32_t i = 0;
  if (contiguous) {  // positions[i] is positions[0] + i: eight characters at a time
    const char* run = chars + (n != 0 ? positions[0] : 0);
    for (; i + 16 <= n; i += 16) {
      const unsigned ones = mox::onesLsbFirst16(run + i);
      packed[i / 8] |= static_cast<uint8_t>(ones);
      packed[i / 8 + 1] |= static_cast<uint8_t>(ones >> 8);
    }
    if (i + 8 <= n) {
      packed[i / 8] |= static_cast<uint8_t>(mox::onesWordLsbFirst(mox::loadWord(run + i)));
      i += 8;
    }
  }
  for (; i + 8 <= n; i += 8) {
    unsigned byte = 0;
    for (unsigned k = 0; k < 8; ++k) byte |= (chars[positions[i + k]] == '1' ? 1u : 0u) << k;
    packed[i / 8] |= static_cast<uint8_t>(byte);
  }
  if (i < n) {
    unsigned byte = 0;
    for (unsigned k = 0; i + k < n; ++k) byte |= (chars[positions[i + k]] == '1' ? 1u : 0u) << k;
    packed[i / 8] |= static_cast<uint8_t>(byte);
  }
}

// Whether the positions are one run of consecutive port bits.
bool isContiguous(const uint32_t* positions, uint32_t n) {
  if (n == 0) return true;
  const uint32_t first = positions[0];
  if (positions[n - 1] - first != n - 1) return false;  // most groups that are not a run
  uint32_t differences = 0;  // no early exit: the loop is a few vector instructions per 4 bits
#pragma GCC unroll 4
  for (uint32_t i = 1; i < n; ++i) differences |= positions[i] ^ (first + i);
  return differences == 0;
}

bool isInputType(uint32_t type) {
  return type == Zin_SignalBase::SIGNAL_TYPE_MOX_SYNC_INPUT ||
         type == Zin_SignalBase::SIGNAL_TYPE_MOX_ASYNC_INPUT;
}

// The group's positions index the port image of its own kind only: staging an input or
// collecting an output would index another port's image.
void checkDirection(uint32_t type, bool wantInput, const std::string& name) {
  if (isInputType(type) != wantInput) {
    throw std::logic_error(
        std::string(wantInput ? "Not an input signal: " : "Not an output signal: ") + name);
  }
}

[[noreturn]] void failTooSmall(const std::string& name) {
  throw std::logic_error("The size of the value is not large enough for the signal: " + name);
}

}  // namespace

ZinMOX_SignalGroup::ZinMOX_SignalGroup(ZinMOX_Command* command, uint32_t type,
                                       std::vector<uint32_t>& positions, const std::string& name,
                                       const std::string& keyName)
    : Zin_SignalGroup(type, 0, positions, name), keyName(keyName), command(command) {}

ZinMOX_SignalGroup::ZinMOX_SignalGroup(const ZinMOX_SignalGroup& other) = default;

ZinMOX_SignalGroup& ZinMOX_SignalGroup::operator=(const ZinMOX_SignalGroup& other) {
  Zin_SignalGroup::operator=(other);
  if (this != &other) keyName = other.keyName;
  command = other.command;
  return *this;
}

ZinMOX_SignalGroup::~ZinMOX_SignalGroup() = default;

void ZinMOX_SignalGroup::setValues(const uint8_t* value, uint32_t byteSize, uint32_t stepCount) {
  const uint32_t type = mox::plainSignalType(getType());
  const std::vector<uint32_t>& positions = getPositionVector();
  const uint32_t n = size();
  const uint32_t bytes = mox::byteCount(n);
  if (value == nullptr) throw std::logic_error("Null value for signal: " + getName());
  checkDirection(type, false, getName());

  // A run of consecutive port bits (a bus or a whole port) is staged a byte at a time.
  const bool run = n != 0 && isContiguous(positions.data(), n);
  if (type == Zin_SignalBase::SIGNAL_TYPE_MOX_SYNC_OUTPUT && stepCount <= 1) {
    if (byteSize < bytes) failTooSmall(getName());
    if (run) {
      command->holdPulseTrainRun(positions[0], value, n);
      return;
    }
    for (uint32_t i = 0; i < n; ++i) {
      command->holdPulseTrain(positions[i], packedBit(value, i) ? '1' : '0');
      command->setSyncOutUpdateChar(positions[i], '1');
    }
  } else if (type == Zin_SignalBase::SIGNAL_TYPE_MOX_SYNC_OUTPUT) {
    if (static_cast<uint64_t>(byteSize) < static_cast<uint64_t>(stepCount) * bytes) {
      failTooSmall(getName());
    }
    // All 16 steps are written: the last given vector repeats, vectors past 16 are not used.
    const uint8_t* vectors[ZinMOX_Command::STEP_COUNT];
    const uint8_t* vector = value;
    for (uint32_t step = 0; step < ZinMOX_Command::STEP_COUNT; ++step) {
      vectors[step] = vector;
      if (step + 1 < stepCount) vector += bytes;
    }
    if (run) {
      command->stageStepVectors(vectors, nullptr, positions[0], n);
      command->markSyncOutRun(positions[0], n);
      return;
    }
    command->stageStepVectors(vectors, positions.data(), 0, n);
    for (uint32_t i = 0; i < n; ++i) command->setSyncOutUpdateChar(positions[i], '1');
  } else {
    if (byteSize < bytes) failTooSmall(getName());
    if (run) {
      command->stageAsyncRun(positions[0], value, n);
      return;
    }
    for (uint32_t i = 0; i < n; ++i) {
      command->setAsyncOutValueChar(positions[i], packedBit(value, i) ? '1' : '0');
      command->setAsyncOutUpdateChar(positions[i], '1');
    }
  }
}

void ZinMOX_SignalGroup::getValues(uint8_t* value, uint8_t* activityUp, uint8_t* activityDown,
                                   uint8_t* syncActivityUp, uint8_t* syncActivityDown,
                                   uint32_t byteSize) const {
  const uint32_t type = mox::plainSignalType(getType());
  const std::vector<uint32_t>& positions = getPositionVector();
  const uint32_t n = size();
  if (byteSize < mox::byteCount(n)) failTooSmall(getName());
  checkDirection(type, true, getName());

  const uint32_t* at = positions.data();
  const bool run = isContiguous(at, n);
  if (type == Zin_SignalBase::SIGNAL_TYPE_MOX_SYNC_INPUT) {
    collectBits(command->getSyncInValueBits(), at, n, value, run);
    collectBits(command->getSyncInActivityUpBits(), at, n, activityUp, run);
    collectBits(command->getSyncInActivityDownBits(), at, n, activityDown, run);
    collectBits(command->getSyncInSyncActivityUpBits(), at, n, syncActivityUp, run);
    collectBits(command->getSyncInSyncActivityDownBits(), at, n, syncActivityDown, run);
  } else {
    collectBits(command->getAsyncInValueBits(), at, n, value, run);
    collectBits(command->getAsyncInActivityUpBits(), at, n, activityUp, run);
    collectBits(command->getAsyncInActivityDownBits(), at, n, activityDown, run);
  }
}

}  // namespace ZinRT
