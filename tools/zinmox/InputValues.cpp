// Named input reads through ZinMOX_readValues.
#include "InputValues.h"

#include <algorithm>
#include <map>

#include "ZinHost/CoreRef.h"
#include "ZinHost/Signals.h"
#include "ZinMOX/ZinMOX.h"

namespace zinmox {

namespace {

using ZinHost::formatCoreRef;
using ZinHost::isReservedName;
using ZinHost::lowerCase;

const std::string kActivityUp = ".activity_up";

// The signal names in a read map: the keys that come with an activity key.
std::vector<std::string> signalNames(const ZinRT::ZinMOX_ValueMap& values) {
  std::vector<std::string> names;
  for (const auto& [key, text] : values) {
    if (key.size() > kActivityUp.size() &&
        key.compare(key.size() - kActivityUp.size(), kActivityUp.size(), kActivityUp) == 0) {
      const std::string name = key.substr(0, key.size() - kActivityUp.size());
      if (values.count(name) != 0) names.push_back(name);
    }
  }
  std::sort(names.begin(), names.end(), [](const std::string& a, const std::string& b) {
    const bool reservedA = isReservedName(a);
    const bool reservedB = isReservedName(b);
    if (reservedA != reservedB) return reservedB;
    return lowerCase(a) < lowerCase(b);
  });
  return names;
}

std::vector<uint32_t> widths(Session& session, const ZIN_CORE_REF& ref,
                             const std::vector<std::string>& names) {
  std::vector<uint32_t> sizes(names.size(), 0);
  if (names.empty()) return sizes;
  std::vector<const char*> pointers;
  for (const std::string& name : names) pointers.push_back(name.c_str());
  ZIN_CORE_REF copy = ref;
  session.check(ZinMOX_getSignalSizes(session.handle(), &copy, pointers.data(), sizes.data(),
                                      static_cast<uint32_t>(names.size()), 0),
                "looking up inputs of " + formatCoreRef(ref));
  return sizes;
}

std::string lookUpKey(const std::map<std::string, std::string>& keys, const std::string& name) {
  const auto found = keys.find(lowerCase(name));
  return found == keys.end() ? name : found->second;
}

InputValue pick(const ZinRT::ZinMOX_ValueMap& values, const std::string& key, uint32_t width) {
  InputValue input;
  input.name = key;
  input.width = width;
  auto text = [&values, &key](const char* suffix) {
    const auto found = values.find(key + suffix);
    return found == values.end() ? std::string() : found->second;
  };
  input.value = text("");
  input.activityUp = text(".activity_up");
  input.activityDown = text(".activity_down");
  input.sync = values.count(key + ".sync_activity_up") != 0;
  input.syncActivityUp = text(".sync_activity_up");
  input.syncActivityDown = text(".sync_activity_down");
  return input;
}

}  // namespace

std::vector<InputValue> readInputValues(Session& session, const ZIN_CORE_REF& ref,
                                        const std::vector<std::string>& names) {
  const std::vector<uint32_t> requestedWidths = widths(session, ref, names);
  ZinRT::ZinMOX_ValueMap values;
  uintptr_t word = reinterpret_cast<uintptr_t>(&values);
  ZIN_CORE_REF copy = ref;
  session.check(ZinMOX_readValues(session.handle(), &copy, &word),
                "reading the inputs of " + formatCoreRef(ref));
  const std::vector<std::string> present = signalNames(values);
  std::map<std::string, std::string> keys;  // lower-case name to the key the core reports
  for (const std::string& key : present) keys.emplace(lowerCase(key), key);

  std::vector<InputValue> inputs;
  if (names.empty()) {
    const std::vector<uint32_t> allWidths = widths(session, ref, present);
    for (size_t i = 0; i < present.size(); ++i) {
      inputs.push_back(pick(values, present[i], allWidths[i]));
    }
  } else {
    for (size_t i = 0; i < names.size(); ++i) {
      inputs.push_back(pick(values, lookUpKey(keys, names[i]), requestedWidths[i]));
    }
  }
  return inputs;
}

bool hasActivity(const InputValue& input) {
  for (const std::string* text :
       {&input.activityUp, &input.activityDown, &input.syncActivityUp, &input.syncActivityDown}) {
    if (text->find_first_not_of('0') != std::string::npos) return true;
  }
  return false;
}

}  // namespace zinmox
