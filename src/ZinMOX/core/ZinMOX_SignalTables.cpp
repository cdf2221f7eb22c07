// The tables of named signals of a MOX core: definition, removal, lookup and sizes.
#include <memory>
#include <numeric>
#include <stdexcept>

#include "ZinMOX/ZinMOX_SignalGroup.h"
#include "framework/ZinMOX_Framework.h"
#include "internal/ZinMOX_CoreParts.h"

namespace ZinRT {

namespace {

// What a signal-type code of the define and undefine calls selects.
struct PortSelection {
  bool isInput;
  uint32_t groupType;
  uint32_t width;
};

bool selectPort(uint32_t signalType, const ZINMOX_CORE_INFO& info, PortSelection& port) {
  switch (signalType) {
    case 0:
      port = {false, Zin_SignalBase::SIGNAL_TYPE_MOX_SYNC_OUTPUT, info.sync_output_count};
      return true;
    case 1:
      port = {true, Zin_SignalBase::SIGNAL_TYPE_MOX_SYNC_INPUT, info.sync_input_count};
      return true;
    case 2:
      port = {false, Zin_SignalBase::SIGNAL_TYPE_MOX_ASYNC_OUTPUT, info.async_output_count};
      return true;
    case 3:
      port = {true, Zin_SignalBase::SIGNAL_TYPE_MOX_ASYNC_INPUT, info.async_input_count};
      return true;
    default:
      return false;
  }
}

bool isInputCode(uint32_t signalType) {
  return signalType == 1 || signalType == 3;
}

std::vector<uint32_t> ascendingPositions(uint32_t count) {
  std::vector<uint32_t> positions(count);
  std::iota(positions.begin(), positions.end(), 0u);
  return positions;
}

}  // namespace

void ZinMOX_Core::defineSignal(const std::string& name, uint32_t signalType,
                               std::vector<uint32_t>& bitIndexes) {
  if (name.empty()) throw std::logic_error("Invalid signal name.");
  if (bitIndexes.empty()) throw std::logic_error("This signal cannot be defined with a size of 0.");
  PortSelection port{};
  if (!selectPort(signalType, moxCoreInfo, port)) {
    throw std::logic_error("This signal cannot be defined because the type is unknown.");
  }
  for (uint32_t index : bitIndexes) {
    if (index >= port.width) {
      throw std::logic_error(
          "This signal cannot be defined because an index is greater than the number of this "
          "signal type.");
    }
  }
  ZinMOX_SignalTable& table = port.isInput ? parts->inputSignals : parts->outputSignals;
  if (findSignal(table, name) != nullptr) {
    throw std::logic_error("The name, " + name +
                           ", is already used by another signal and will not be re-defined. "
                           "Note: Signal names are case-insensitive");
  }
  auto group =
      std::make_unique<ZinMOX_SignalGroup>(&parts->command, port.groupType, bitIndexes, name, name);
  table.emplace(group->getKeyName(), group.get());
  group.release();
  parts->readPlanStale = true;
}

void ZinMOX_Core::undefineSignal(const std::string& name, uint32_t signalType) {
  if (name.empty()) throw std::logic_error("Invalid signal name.");
  ZinMOX_SignalTable& table = isInputCode(signalType) ? parts->inputSignals : parts->outputSignals;
  auto found = table.find(name);
  if (found == table.end()) {
    throw std::logic_error("The name, " + name +
                           ", has not been defined. Note: Signal names are case-insensitive");
  }
  ZinMOX_SignalGroup* group = found->second;
  table.erase(found);  // the key views the group's name, so erase before destroying it
  delete group;
  parts->readPlanStale = true;
}

ZinMOX_SignalGroup* findSignal(const ZinMOX_SignalTable& table, std::string_view name) {
  const auto found = table.find(name);
  return found == table.end() ? nullptr : found->second;
}

ZinMOX_SignalGroup* requireSignal(const ZinMOX_SignalTable& table, std::string_view name) {
  ZinMOX_SignalGroup* group = findSignal(table, name);
  if (group == nullptr) {
    throw std::logic_error("Could not find a signal with the name: " + std::string(name));
  }
  return group;
}

ZinMOX_SignalGroup* ZinMOX_Core::getInputSignal(const std::string& name) {
  return findSignal(parts->inputSignals, name);
}

ZinMOX_SignalGroup* ZinMOX_Core::getOutputSignal(const std::string& name) {
  return findSignal(parts->outputSignals, name);
}

ZinMOX_SignalGroup* ZinMOX_Core::requireOutputSignal(const std::string& name) {
  return requireSignal(parts->outputSignals, name);
}

ZinMOX_SignalGroup* ZinMOX_Core::requireInputSignal(const std::string& name) {
  return requireSignal(parts->inputSignals, name);
}

void ZinMOX_Core::getSignalSizes(std::vector<std::string> names, uint32_t* sizes, uint32_t count,
                                 uint32_t isOutput) {
  if (count > names.size()) {
    throw std::logic_error("ZinMOX_Core::getSignalSizes(): count " + std::to_string(count) +
                           " exceeds the " + std::to_string(names.size()) + " names given");
  }
  for (uint32_t i = 0; i < count; ++i) {
    ZinMOX_SignalGroup* group =
        isOutput != 0 ? requireOutputSignal(names[i]) : requireInputSignal(names[i]);
    sizes[i] = group->size();
  }
}

void ZinMOX_Core::addReservedSignals() {
  struct Reserved {
    const char* name;
    uint32_t code;
    uint32_t width;
  };
  const Reserved reserved[] = {{"async_out_data", 2, moxCoreInfo.async_output_count},
                               {"sync_out_data", 0, moxCoreInfo.sync_output_count},
                               {"async_in_data", 3, moxCoreInfo.async_input_count},
                               {"sync_in_data", 1, moxCoreInfo.sync_input_count}};
  for (const Reserved& signal : reserved) {
    if (signal.width == 0) continue;
    std::vector<uint32_t> positions = ascendingPositions(signal.width);
    defineSignal(signal.name, signal.code, positions);
  }
}

}  // namespace ZinRT
