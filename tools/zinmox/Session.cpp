// The tool's JTAG session: opening, messages, core initialisation and signal definitions.
#include "Session.h"

#include <algorithm>
#include <cstdio>
#include <iostream>

#include "Errors.h"
#include "ZinHost/BitList.h"
#include "ZinHost/CoreRef.h"
#include "ZinHost/SignalsFile.h"
#include "ZinHost/Target.h"
#include "ZinMOX/ZinMOX.h"
#include "ZinRT/ZinCore_Types.h"
#include "ZinRT/ZinJtag.h"
#include "ZinRT/Zin_CoreComm.h"

namespace zinmox {

namespace {

using ZinHost::formatCoreRef;
using ZinHost::Port;

uint32_t packRef(const ZIN_CORE_REF& ref) {
  return (ref.deviceIndex << 8) | (ref.userChainNumber << 4) | ref.coreIndex;
}

// Every reference a core can have, for transports that cannot list their cores.
std::vector<ZIN_CORE_REF> probeCores(uint32_t handle) {
  std::vector<ZIN_CORE_REF> found;
  for (uint32_t packed = 0; packed < 256 * 16 * 16; ++packed) {
    const ZIN_CORE_REF ref{packed >> 8, (packed >> 4) & 15, packed & 15};
    ZIN_CORE_INFO info{};
    if (ZinCore_getCoreStatus(handle, ref, &info, nullptr, 0) != 0) {
      throw Failure("the status read of core " + formatCoreRef(ref) + " failed");
    }
    if (info.coreType != 0 || info.manufacturerId != 0) found.push_back(ref);
  }
  return found;
}

}  // namespace

Session::Session(std::string targetText) : targetText_(std::move(targetText)) {}

Session::~Session() {
  if (handle_ == 0) return;
  try {
    ZinJtag_closeSession(handle_);
  } catch (const std::exception& error) {
    std::cerr << "zinmox: closing the session failed: " << error.what() << "\n";
  }
}

void Session::setTargetText(const std::string& targetText) {
  if (handle_ != 0 && targetText != targetText_) {
    throw UsageError("the target cannot change within one session");
  }
  targetText_ = targetText;
}

uint32_t Session::handle() {
  if (handle_ != 0) return handle_;
  transport_ = ZinHost::openTarget(targetText_, access_).transport;
  handle_ = ZinJtag_openSession(transport_);
  ZinJtag_setMessageHandler(handle_, &Session::onMessage, this);
  return handle_;
}

void Session::onMessage(void* user, uint32_t, uint32_t code, const char* text) {
  auto* self = static_cast<Session*>(user);
  ++self->messageCount_;
  std::cout.flush();
  if (code == ZINJTAG_MSG_ERROR) {
    std::cerr << "zinmox: error: " << text << "\n";
  } else if (code == ZINJTAG_MSG_ABORT) {
    std::cerr << "zinmox: aborted (abort code " << code << "): " << text << "\n";
  } else {
    std::cerr << "zinmox: message (code " << code << "): " << text << "\n";
  }
  std::cerr.flush();
  if (self->observer_) self->observer_(code, text);
}

void Session::setMessageObserver(
    std::function<void(uint32_t code, const std::string& text)> observer) {
  observer_ = std::move(observer);
}

std::vector<ZIN_CORE_REF> Session::listCores() {
  const uint32_t session = handle();
  std::vector<ZIN_CORE_REF> refs;
  bool listed = false;
  ZinJtag_session_withTransport(
      session, [&](ZinRT::Zin_Transport& transport) { listed = transport.listCores(refs); });
  if (!listed) return probeCores(session);
  std::sort(refs.begin(), refs.end(), ZinHost::coreRefLess);
  return refs;
}

void Session::check(uint32_t returnCode, const std::string& what) {
  const bool reported = messageCount_ != checkedCount_;
  checkedCount_ = messageCount_;
  if (returnCode == ZINMOX_SUCCESS) return;
  throw Failure(reported ? std::string() : what + " failed");
}

void Session::useCore(const ZIN_CORE_REF& ref) {
  const uint32_t key = packRef(ref);
  if (cores_.count(key) != 0) return;
  ZIN_CORE_REF copy = ref;
  check(ZinMOX_initCore(handle(), &copy), "initialising core " + formatCoreRef(ref));
  cores_[key];
}

const ZINMOX_CORE_INFO& Session::coreInfo(const ZIN_CORE_REF& ref) {
  useCore(ref);
  std::optional<ZINMOX_CORE_INFO>& info = cores_[packRef(ref)].info;
  if (!info) {
    ZIN_CORE_REF copy = ref;
    ZINMOX_CORE_INFO read{};
    check(ZinMOX_getInfo(handle(), &copy, &read),
          "reading the information of core " + formatCoreRef(ref));
    info = read;
  }
  return *info;
}

void Session::defineSignal(const ZIN_CORE_REF& ref, const ZinHost::SignalDefinition& signal) {
  useCore(ref);
  auto& defined = cores_[packRef(ref)].definitions;
  const DefinitionKey key{ZinHost::isInput(signal.port), ZinHost::lowerCase(signal.name)};
  const auto found = defined.find(key);
  if (found != defined.end()) {
    if (found->second.port == signal.port && found->second.bits == signal.bits) return;
    undefineSignal(ref, signal.name, found->second.port);
  }
  ZIN_CORE_REF copy = ref;
  const uint32_t type = ZinHost::portSignalType(signal.port);
  const uint32_t rc =
      signal.bits.size() == 1
          ? ZinMOX_defineSignal(handle(), &copy, signal.name.c_str(), type, signal.bits[0])
          : ZinMOX_defineBus(handle(), &copy, signal.name.c_str(), type, signal.bits.data(),
                             static_cast<uint32_t>(signal.bits.size()));
  try {
    check(rc, "defining " + signal.name);
  } catch (const Failure&) {
    throw Failure("could not define " + signal.name + " as " + ZinHost::portName(signal.port) +
                  " bits " + ZinHost::formatBitList(signal.bits) + " on core " +
                  formatCoreRef(ref));
  }
  defined[key] = Definition{signal.port, signal.bits};
}

void Session::undefineSignal(const ZIN_CORE_REF& ref, const std::string& name, Port port) {
  useCore(ref);
  ZIN_CORE_REF copy = ref;
  check(ZinMOX_undefineName(handle(), &copy, name.c_str(), ZinHost::portSignalType(port)),
        "removing " + name);
  cores_[packRef(ref)].definitions.erase(
      DefinitionKey{ZinHost::isInput(port), ZinHost::lowerCase(name)});
}

void Session::loadSignals(const ZIN_CORE_REF& ref, const std::string& path) {
  const auto signals = ZinHost::loadSignalsFile(path, &coreInfo(ref));
  for (const ZinHost::SignalDefinition& signal : signals) defineSignal(ref, signal);
}

}  // namespace zinmox
