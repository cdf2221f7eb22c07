// Reading named inputs: every input into a value map, or samples of named inputs into arrays.
#include <cstring>
#include <memory>
#include <stdexcept>
#include <string>
#include <string_view>
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

// The suffixes of the keys a signal is reported under, after its plain name; the first four
// belong to every input, the last two to synchronous inputs only. Key k > 1 holds the packed
// vector k - 1 of the signal's buffer.
constexpr std::string_view kReportSuffixes[ZinMOX_ReportedSignal::kMaxKeys] = {
    "", ".value", ".activity_up", ".activity_down", ".sync_activity_up", ".sync_activity_down"};

// Notes every input's keys with their hashes under the value map's own hash function.
void planReport(const ZinMOX_SignalTable& inputs, std::vector<ZinMOX_ReportedSignal>& plan,
                std::string& key) {
  plan.clear();
  plan.reserve(inputs.size());
  for (const auto& entry : inputs) {
    ZinMOX_ReportedSignal& signal = plan.emplace_back();
    signal.group = entry.second;
    signal.keyCount = isSyncInput(*entry.second) ? 6 : 4;
    for (uint32_t k = 0; k < signal.keyCount; ++k) {
      key.assign(entry.second->getKeyName()).append(kReportSuffixes[k]);
      signal.keyHashes[k] = ZinMOX_ValueMap::hasher{}(key);
    }
  }
}

// Whether `key` is `name` followed by `suffix`.
bool isKey(const std::string& key, const std::string& name, std::string_view suffix) {
  return key.size() == name.size() + suffix.size() &&
         std::memcmp(key.data(), name.data(), name.size()) == 0 &&
         std::memcmp(key.data() + name.size(), suffix.data(), suffix.size()) == 0;
}

// The map's entry for `name` followed by `suffix`, added empty when absent. `hash` is the map's
// hash of that key: the entry is looked for in the bucket the map keeps it in, which spares
// building and hashing the key. A key that is not there goes through the map's own lookup,
// which also keeps this right for a map that places its keys otherwise.
std::string& entryOf(ZinMOX_ValueMap& map, const std::string& name, std::string_view suffix,
                     std::size_t hash, std::string& key) {
  const std::size_t buckets = map.bucket_count();
  if (buckets != 0) {
    const std::size_t bucket = hash % buckets;
    for (auto it = map.begin(bucket), end = map.end(bucket); it != end; ++it) {
      if (isKey(it->first, name, suffix)) return it->second;
    }
  }
  key.assign(name).append(suffix);
  return map[key];
}

// Writes one signal's value and activity texts under its name and suffixed keys.
void reportSignal(const ZinMOX_ReportedSignal& signal, ZinMOX_ValueMap& map, std::string& key,
                  std::vector<uint8_t>& vectors) {
  const ZinMOX_SignalGroup& group = *signal.group;
  const uint32_t width = group.size();
  const uint32_t bytes = mox::byteCount(width);
  const bool sync = signal.keyCount == ZinMOX_ReportedSignal::kMaxKeys;
  // The five vectors (value, activity up and down, sync activity up and down) lie one after
  // another in one zero-filled buffer.
  vectors.assign(static_cast<size_t>(sync ? 5 : 3) * bytes, 0);
  uint8_t* at = vectors.data();
  group.getValues(at, at + bytes, at + 2 * bytes, sync ? at + 3 * bytes : nullptr,
                  sync ? at + 4 * bytes : nullptr, bytes);

  const std::string& name = group.getKeyName();
  const auto entry = [&](uint32_t k) -> std::string& {
    return entryOf(map, name, kReportSuffixes[k], signal.keyHashes[k], key);
  };
  std::string& value = entry(0);
  mox::packedHexText(vectors.data(), width, value);
  entry(1) = value;  // element references survive the map's growth
  for (uint32_t k = 2; k < signal.keyCount; ++k) {
    mox::packedHexText(vectors.data() + (k - 1) * bytes, width, entry(k));
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
  if (parts->readPlanStale) {
    planReport(parts->inputSignals, parts->readPlan, parts->readKey);
    parts->readPlanStale = false;
  }
  for (const ZinMOX_ReportedSignal& signal : parts->readPlan) {
    reportSignal(signal, *inputHashMap, parts->readKey, parts->readVectors);
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
