// The dashboard's calls into the tool's session and the host library (ZinHost). This is the
// only dashboard file that includes their headers.
#include "HostLink.h"

#include <algorithm>
#include <cctype>
#include <set>

#include "../Errors.h"
#include "../InputValues.h"
#include "../Session.h"
#include "ZinHost/BitList.h"
#include "ZinHost/CoreRef.h"
#include "ZinHost/Signals.h"
#include "ZinHost/Target.h"
#include "ZinHost/TextError.h"
#include "ZinHost/ValueText.h"
#include "ZinMOX/ZinMOX.h"
#include "ZinRT/Zin_CoreComm.h"
#include "internal/ZinMOX_CoreInfoFields.h"

namespace zinmox::dashboard {

using ZinHost::describeTarget;
using ZinHost::formatBitList;
using ZinHost::formatCoreRef;
using ZinHost::isInput;
using ZinHost::isReservedName;
using ZinHost::lowerCase;
using ZinHost::parseBitList;
using ZinHost::parseCoreRef;
using ZinHost::parsePort;
using ZinHost::Port;
using ZinHost::portName;
using ZinHost::portWidth;

namespace {

constexpr uint32_t kMoxCoreType = 9;
constexpr size_t kMaxMessages = 8;

void checkName(const std::string& name) {
  if (name.empty() || name.size() > kMaxNameLength) {
    throw ApiError(400, "a name has 1 to " + std::to_string(kMaxNameLength) + " characters");
  }
  const bool plain = std::all_of(name.begin(), name.end(),
                                 [](unsigned char c) { return std::isalnum(c) != 0 || c == '_'; });
  if (!plain || std::isdigit(static_cast<unsigned char>(name[0])) != 0) {
    throw ApiError(
        400, "bad name '" + name + "': use letters, digits and '_', starting with a letter or '_'");
  }
}

ZINMOX_CORE_INFO infoFromScan(const nlohmann::json& entry) {
  ZINMOX_CORE_INFO info{};
  for (const ZinRT::ZinMOX_CoreInfoField& field : ZinRT::ZINMOX_CORE_INFO_FIELDS) {
    info.*field.member = entry.at(field.key).get<uint32_t>();
  }
  return info;
}

}  // namespace

HostLink::HostLink(Session& session) : session_(session) {
  session_.setMessageObserver([this](uint32_t, const std::string& text) {
    if (messages_.size() < kMaxMessages) messages_.push_back(text);
  });
}

HostLink::~HostLink() {
  session_.setMessageObserver({});
}

void HostLink::rethrow(const std::exception& error) {
  std::string text = error.what();
  for (const std::string& message : messages_) text += (text.empty() ? "" : "; ") + message;
  if (dynamic_cast<const UsageError*>(&error) != nullptr ||
      dynamic_cast<const ZinHost::TextError*>(&error) != nullptr) {
    throw ApiError(400, text);
  }
  if (const auto* target = dynamic_cast<const ZinHost::TargetError*>(&error)) {
    throw ApiError(target->kind() == ZinHost::TargetError::Kind::Unusable ? 422 : 502, text);
  }
  if (dynamic_cast<const Failure*>(&error) != nullptr) {
    throw ApiError(422, text.empty() ? "the target reported a failure" : text);
  }
  throw ApiError(502, "the target failed: " + text);
}

template <typename Work>
auto HostLink::guarded(Work&& work) {
  std::lock_guard<std::mutex> lock(mutex_);
  messages_.clear();
  try {
    return work();
  } catch (const ApiError&) {
    throw;
  } catch (const std::exception& error) {
    rethrow(error);
  }
}

std::string HostLink::targetName() {
  return guarded([this] { return describeTarget(session_.targetText()); });
}

void HostLink::collectScan() {
  if (!scan_.is_null()) return;
  nlohmann::json cores = nlohmann::json::array();
  for (const ZIN_CORE_REF& ref : session_.listCores()) {
    ZIN_CORE_INFO generic{};
    session_.check(ZinCore_getCoreStatus(session_.handle(), ref, &generic, nullptr, 0),
                   "the status read of core " + formatCoreRef(ref));
    nlohmann::json entry{{"core", formatCoreRef(ref)},
                         {"mox", generic.coreType == kMoxCoreType},
                         {"core_type", generic.coreType},
                         {"version", std::to_string(generic.coreMajorVersion) + "." +
                                         std::to_string(generic.coreMinorVersion) + "." +
                                         std::to_string(generic.coreRevision)}};
    if (generic.coreType == kMoxCoreType) {
      ZINMOX_CORE_INFO info{};
      ZIN_CORE_REF copy = ref;
      session_.check(ZinMOX_getInfo(session_.handle(), &copy, &info),
                     "reading the information of core " + formatCoreRef(ref));
      for (const ZinRT::ZinMOX_CoreInfoField& field : ZinRT::ZINMOX_CORE_INFO_FIELDS) {
        entry[field.key] = info.*field.member;
      }
    }
    cores.push_back(entry);
  }
  scan_ = nlohmann::json{{"target", describeTarget(session_.targetText())}, {"cores", cores}};
}

nlohmann::json HostLink::scan() {
  return guarded([this] {
    collectScan();
    return scan_;
  });
}

std::string HostLink::moxCoreLocked(const std::string& refText) {
  const std::string ref = formatCoreRef(parseCoreRef(refText));
  collectScan();
  for (const nlohmann::json& entry : scan_.at("cores")) {
    if (entry.at("core") == ref && entry.at("mox").get<bool>()) {
      session_.useCore(parseCoreRef(ref));
      return ref;
    }
  }
  throw ApiError(404, "no MOX core at " + ref);
}

std::string HostLink::moxCore(const std::string& refText) {
  return guarded([&] { return moxCoreLocked(refText); });
}

nlohmann::json HostLink::coreDetails(const std::string& refText) {
  return guarded([&] {
    const std::string ref = moxCoreLocked(refText);
    nlohmann::json info;
    for (const nlohmann::json& entry : scan_.at("cores")) {
      if (entry.at("core") == ref) info = entry;
    }
    const ZINMOX_CORE_INFO widths = infoFromScan(info);
    nlohmann::json names = nlohmann::json::array();
    for (const Definition& d : names_[ref]) {
      names.push_back({{"name", d.name},
                       {"port", d.port},
                       {"bits", d.bits},
                       {"width", d.width},
                       {"reserved", false}});
    }
    for (Port port : {Port::AsyncOut, Port::SyncOut, Port::AsyncIn, Port::SyncIn}) {
      const uint32_t width = portWidth(widths, port);
      if (width == 0) continue;
      names.push_back({{"name", std::string(portName(port)) + "_data"},
                       {"port", portName(port)},
                       {"bits", "0-" + std::to_string(width - 1)},
                       {"width", width},
                       {"reserved", true}});
    }
    return nlohmann::json{
        {"core", ref}, {"info", info}, {"names", names}, {"outputs", written_[ref]}};
  });
}

void HostLink::define(const std::string& refText, const std::string& name, const std::string& port,
                      const std::string& bits) {
  guarded([&] {
    const std::string ref = moxCoreLocked(refText);
    checkName(name);
    if (isReservedName(name)) throw ApiError(400, name + " is a whole-port name");
    ZinHost::SignalDefinition signal{name, parsePort(port), parseBitList(bits)};
    auto& list = names_[ref];
    const bool input = isInput(signal.port);
    const auto same = std::find_if(list.begin(), list.end(), [&](const Definition& d) {
      return lowerCase(d.name) == lowerCase(name) && isInput(parsePort(d.port)) == input;
    });
    if (same == list.end() && list.size() >= kMaxNamesPerCore) {
      throw ApiError(409, "core " + ref + " has " + std::to_string(kMaxNamesPerCore) +
                              " names already; remove one first");
    }
    session_.defineSignal(parseCoreRef(ref), signal);
    Definition entry{name, portName(signal.port), formatBitList(signal.bits),
                     static_cast<uint32_t>(signal.bits.size())};
    if (same != list.end()) {
      *same = entry;
    } else {
      list.push_back(entry);
    }
    ++version_;
  });
}

void HostLink::undefine(const std::string& refText, const std::string& name,
                        const std::string& port) {
  guarded([&] {
    const std::string ref = moxCoreLocked(refText);
    const Port parsed = parsePort(port);
    auto& list = names_[ref];
    const auto found = std::find_if(list.begin(), list.end(), [&](const Definition& d) {
      return lowerCase(d.name) == lowerCase(name) && d.port == portName(parsed);
    });
    if (found == list.end()) {
      throw ApiError(404, "no name '" + name + "' on " + portName(parsed) + " of core " + ref);
    }
    session_.undefineSignal(parseCoreRef(ref), found->name, parsed);
    written_[ref].erase(lowerCase(found->name));
    written_[ref].erase(lowerCase(found->name) + ".pulsetrain");
    list.erase(found);
    ++version_;
  });
}

void HostLink::write(const std::string& refText,
                     const std::vector<std::pair<std::string, std::string>>& assignments) {
  guarded([&] {
    const std::string ref = moxCoreLocked(refText);
    if (assignments.empty()) throw ApiError(400, "nothing to write: give at least one value");
    ZinRT::ZinMOX_ValueMap values;
    std::set<std::string> seen;
    const auto& list = names_[ref];
    for (const auto& [key, text] : assignments) {
      const auto dot = key.find('.');
      const std::string name = lowerCase(key.substr(0, dot));
      const bool train = dot != std::string::npos;
      if (train && key.substr(dot + 1) != "pulsetrain") {
        throw ApiError(400, "unknown suffix in '" + key + "': only NAME.pulsetrain is written");
      }
      const bool known = name == "async_out_data" || name == "sync_out_data" ||
                         std::any_of(list.begin(), list.end(), [&](const Definition& d) {
                           return lowerCase(d.name) == name && !isInput(parsePort(d.port));
                         });
      if (!known) throw ApiError(404, "unknown output '" + key + "' on core " + ref);
      if (!seen.insert(name).second) throw ApiError(400, name + " is given more than once");
      values[key] = ZinHost::hexDigits(text, "the value of " + key);
    }
    ZIN_CORE_REF core = parseCoreRef(ref);
    uintptr_t word = reinterpret_cast<uintptr_t>(&values);
    session_.check(ZinMOX_writeValues(session_.handle(), &core, &word), "writing to " + ref);
    for (const auto& [key, hex] : values) {
      const std::string lower = lowerCase(key);
      written_[ref].erase(lower.substr(0, lower.find('.')));
      written_[ref].erase(lower.substr(0, lower.find('.')) + ".pulsetrain");
      written_[ref][lower] = hex;
    }
    ++version_;
  });
}

std::vector<Reading> HostLink::read(const std::string& refText) {
  return guarded([&] {
    const std::string ref = moxCoreLocked(refText);
    return readInputValues(session_, parseCoreRef(ref), {});
  });
}

uint64_t HostLink::version() {
  std::lock_guard<std::mutex> lock(mutex_);
  return version_;
}

}  // namespace zinmox::dashboard
