// Writing named outputs: from a value map of hexadecimal texts, or from arrays of packed values.
#include <algorithm>
#include <memory>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "ZinMOX/ZinMOX_SignalGroup.h"
#include "framework/ZinMOX_Framework.h"
#include "internal/ZinMOX_CoreParts.h"
#include "values/ZinMOX_HexText.h"

namespace ZinRT {

namespace {

constexpr std::string_view PULSE_TRAIN_SUFFIX = "pulsetrain";
// A pulse-train text is fitted to 256 bits (32 bytes) per byte of the signal's width; setValues
// reads its first 16 step vectors, step 0 in the least significant block.
constexpr uint32_t PULSE_TRAIN_BITS_PER_BYTE = 256;
constexpr uint32_t BURST_STEPS = ZinMOX_Command::STEP_COUNT;

// A map key split at its first dot into the signal name and whether the suffix is the pulse
// train's.
struct ValueKey {
  std::string_view name;
  bool pulseTrain;
};

ValueKey splitKey(const std::string& key) {
  const std::string_view whole(key);
  const size_t dot = whole.find('.');
  if (dot == std::string_view::npos) return {whole, false};
  return {whole.substr(0, dot), whole.substr(dot + 1) == PULSE_TRAIN_SUFFIX};
}

bool isSyncOutput(const ZinMOX_SignalGroup& group) {
  return mox::plainSignalType(group.getType()) == Zin_SignalBase::SIGNAL_TYPE_MOX_SYNC_OUTPUT;
}

// Fits and converts one value text in the core's scratch buffers, then stages it into the group.
void stageText(ZinMOX_SignalGroup& group, const std::string& text, bool pulseTrain,
               Zin_ByteBuffer& scratch, Zin_ByteBuffer& bytes) {
  const uint32_t width =
      pulseTrain ? PULSE_TRAIN_BITS_PER_BYTE * mox::byteCount(group.size()) : group.size();
  const mox::FittedHex fitted = mox::fitHexString(text.c_str(), static_cast<int32_t>(width));
  // The fitting checked every digit. Of a pulse train only the 16 step vectors in the last
  // digits are staged, so only those are converted.
  const size_t last = fitted.size() - 1;
  const size_t first = pulseTrain ? last + 1 - 2 * BURST_STEPS * mox::byteCount(group.size()) : 0;
  mox::fittedToBin(fitted, first, last, scratch, bytes);
  group.setValues(bytes.uPtr(), bytes.getSize(), pulseTrain ? BURST_STEPS : 1);
}

}  // namespace

void ZinMOX_Core::writeValues(uint32_t handle, ZIN_CORE_REF coreRef,
                              const ZinMOX_ValueMap* outputHashMap) {
  if (outputHashMap == nullptr) {
    throw std::logic_error("ZinMOX_Core::writeValues() arg. failed:outputHashMap!=0");
  }
  // The first visit checks every key and keeps its group, so that the second, which stages the
  // values, looks nothing up again.
  std::vector<ZinMOX_StagedValue>& plan = parts->writePlan;
  plan.clear();
  for (const auto& [key, text] : *outputHashMap) {
    const ValueKey parsed = splitKey(key);
    ZinMOX_SignalGroup* group = requireSignal(parts->outputSignals, parsed.name);
    if (parsed.pulseTrain && !isSyncOutput(*group)) {
      throw std::logic_error(".pulsetrain cannot be used with the non-synchronous output: " +
                             std::string(parsed.name));
    }
    plan.push_back({group, parsed.pulseTrain});
  }
  parts->command.clearUpdateMasks();
  auto staged = plan.begin();
  for (const auto& [key, text] : *outputHashMap) {
    stageText(*staged->group, text, staged->pulseTrain, parts->writeText, parts->writeBytes);
    ++staged;
  }
  parts->command.writeOutputs(handle, coreRef);
}

void ZinMOX_Core::writeValues(uint32_t handle, ZIN_CORE_REF coreRef,
                              std::vector<std::string> signalNames, const uint8_t* const* values,
                              const uint32_t* valueSizes, uint32_t signalCount, uint32_t valueCount,
                              uint32_t burstMode) {
  // The arrays are read for every entry: check that they exist before anything is staged.
  if (signalCount > signalNames.size()) {
    throw std::logic_error(
        "ZinMOX_Core::writeValues() arg. failed:signalCount<=signalNames.size()");
  }
  if (signalCount != 0 && values == nullptr) {
    throw std::logic_error("ZinMOX_Core::writeValues() arg. failed:values!=0");
  }
  if (signalCount != 0 && valueSizes == nullptr) {
    throw std::logic_error("ZinMOX_Core::writeValues() arg. failed:valueSizes!=0");
  }
  const bool burst = burstMode == 1;
  std::vector<ZinMOX_SignalGroup*> groups(signalCount);
  for (uint32_t i = 0; i < signalCount; ++i) {
    groups[i] = requireOutputSignal(signalNames[i]);
    if (burst && !isSyncOutput(*groups[i])) {
      throw std::logic_error("Burst mode cannot be used with the non-synchronous output: " +
                             signalNames[i]);
    }
    if (static_cast<uint64_t>(valueSizes[i]) <
        static_cast<uint64_t>(mox::byteCount(groups[i]->size())) * valueCount) {
      throw std::logic_error("The size of the value is not large enough for the signal: " +
                             signalNames[i]);
    }
    if (values[i] == nullptr) {
      throw std::logic_error("Invalid values for signal: " + signalNames[i]);
    }
  }
  if (valueCount == 0) return;

  std::vector<const uint8_t*> cursors(values, values + signalCount);
  std::vector<uint32_t> bytesLeft(valueSizes, valueSizes + signalCount);
  for (uint32_t valuesLeft = valueCount; valuesLeft > 0;) {
    parts->command.clearUpdateMasks();
    const uint32_t steps = burst ? std::min(valuesLeft, BURST_STEPS) : 1;
    for (uint32_t i = 0; i < signalCount; ++i) {
      groups[i]->setValues(cursors[i], bytesLeft[i], steps);
      const uint32_t advance = (burst ? BURST_STEPS : 1) * mox::byteCount(groups[i]->size());
      cursors[i] += advance;
      if (bytesLeft[i] >= advance) bytesLeft[i] -= advance;
    }
    parts->command.writeOutputs(handle, coreRef);
    valuesLeft -= steps;
  }
}

}  // namespace ZinRT
