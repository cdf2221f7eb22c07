// Reading named inputs: every input into a value map, or samples of named inputs into arrays.
#include <memory>
#include <stdexcept>
#include <string>
#include <vector>

#include "ZinMOX/ZinMOX_SignalGroup.h"
#include "format/ZinMOX_BitFormat.h"
#include "framework/ZinMOX_Framework.h"
#include "internal/ZinMOX_CoreParts.h"

namespace ZinRT {

namespace {

bool isSyncInput(const ZinMOX_SignalGroup& group) {
  return mox::plainSignalType(group.getType()) == Zin_SignalBase::SIGNAL_TYPE_MOX_SYNC_INPUT;
}

// Stores under `key` the hexadecimal text of the `width`-bit packed vector that starts at byte
// `start` of `vectors`, reusing the entry's storage when the key is already there.
const std::string& storeText(ZinMOX_ValueMap& map, const std::string& key,
                             const std::vector<uint8_t>& vectors, uint32_t start, uint32_t width) {
  std::string& text = map[key];
  mox::packedHexText(vectors.data() + start, width, text);
  return text;
}

// Writes one signal's value and activity texts under its name and suffixed keys.
void reportSignal(const ZinMOX_SignalGroup& group, ZinMOX_ValueMap& map, std::string& key,
                  std::vector<uint8_t>& vectors) {
  const uint32_t width = group.size();
  const uint32_t bytes = mox::byteCount(width);
  const bool sync = isSyncInput(group);
  // The five vectors (value, activity up and down, sync activity up and down) lie one after
  // another in one zero-filled buffer.
  vectors.assign(static_cast<size_t>(sync ? 5 : 3) * bytes, 0);
  uint8_t* at = vectors.data();
  group.getValues(at, at + bytes, at + 2 * bytes, sync ? at + 3 * bytes : nullptr,
                  sync ? at + 4 * bytes : nullptr, bytes);

  const std::string& name = group.getKeyName();
  const std::string& value = storeText(map, name, vectors, 0, width);
  const size_t nameLength = name.size();
  const auto keyOf = [&](const char* suffix) -> const std::string& {
    key.assign(name, 0, nameLength);
    key += suffix;
    return key;
  };
  map[keyOf(".value")] = value;  // element references survive the map's growth
  storeText(map, keyOf(".activity_up"), vectors, bytes, width);
  storeText(map, keyOf(".activity_down"), vectors, 2 * bytes, width);
  if (sync) {
    storeText(map, keyOf(".sync_activity_up"), vectors, 3 * bytes, width);
    storeText(map, keyOf(".sync_activity_down"), vectors, 4 * bytes, width);
  }
}

// The cursor of one of the five per-signal buffers (null when the caller gave none).
uint8_t* bufferOf(uint8_t* const* buffers, uint32_t i) {
  return buffers == nullptr ? nullptr : buffers[i];
}

}  // namespace

void ZinMOX_Core::readValues(uint32_t handle, ZIN_CORE_REF coreRef, ZinMOX_ValueMap* inputHashMap) {
  if (inputHashMap == nullptr) {
    throw std::logic_error("ZinMOX_Core::readValues() arg. failed:inputHashMap!=0");
  }
  parts->command.readInputs(handle, coreRef);
  for (const auto& entry : parts->inputSignals) {
    reportSignal(*entry.second, *inputHashMap, parts->readKey, parts->readVectors);
  }
}

void ZinMOX_Core::readValues(uint32_t handle, ZIN_CORE_REF coreRef,
                             std::vector<std::string> signalNames, uint8_t* const* values,
                             uint8_t* const* activityUp, uint8_t* const* activityDown,
                             uint8_t* const* syncActivityUp, uint8_t* const* syncActivityDown,
                             const uint32_t* valueSizes, uint32_t signalCount,
                             uint32_t sampleCount) {
  if (signalCount > signalNames.size()) {
    throw std::logic_error("ZinMOX_Core::readValues() arg. failed:signalCount<=signalNames.size()");
  }
  if (signalCount != 0 && valueSizes == nullptr) {
    throw std::logic_error("ZinMOX_Core::readValues() arg. failed:valueSizes!=0");
  }
  std::vector<ZinMOX_SignalGroup*> groups(signalCount);
  for (uint32_t i = 0; i < signalCount; ++i) {
    groups[i] = requireInputSignal(signalNames[i]);
    if (static_cast<uint64_t>(valueSizes[i]) <
        static_cast<uint64_t>(mox::byteCount(groups[i]->size())) * sampleCount) {
      throw std::logic_error("The size of the value is not large enough for the signal: " +
                             signalNames[i]);
    }
  }
  if (sampleCount == 0) return;

  struct Cursor {
    uint8_t* buffers[5];
    uint32_t bytesLeft;
  };
  std::vector<Cursor> cursors(signalCount);
  for (uint32_t i = 0; i < signalCount; ++i) {
    cursors[i] = {{bufferOf(values, i), bufferOf(activityUp, i), bufferOf(activityDown, i),
                   bufferOf(syncActivityUp, i), bufferOf(syncActivityDown, i)},
                  valueSizes[i]};
  }
  for (uint32_t sample = 0; sample < sampleCount; ++sample) {
    parts->command.readInputs(handle, coreRef);
    for (uint32_t i = 0; i < signalCount; ++i) {
      Cursor& cursor = cursors[i];
      groups[i]->getValues(cursor.buffers[0], cursor.buffers[1], cursor.buffers[2],
                           cursor.buffers[3], cursor.buffers[4], cursor.bytesLeft);
      const uint32_t step = mox::byteCount(groups[i]->size());
      for (uint8_t*& buffer : cursor.buffers) {
        if (buffer != nullptr) buffer += step;
      }
      if (cursor.bytesLeft >= step) cursor.bytesLeft -= step;
    }
  }
}

}  // namespace ZinRT
