// Signal base: type, name and string properties, and the signal-type constants.
#include "ZinRT/Zin_SignalBase.h"

namespace ZinRT {

// The four MOX port types are distinct from each other and from the group flag, which sits
// above them so that a group's type with the flag cleared is the port type again.
const uint32_t Zin_SignalBase::SIGNAL_TYPE_MOX_ASYNC_INPUT = 0x10;
const uint32_t Zin_SignalBase::SIGNAL_TYPE_MOX_SYNC_INPUT = 0x11;
const uint32_t Zin_SignalBase::SIGNAL_TYPE_MOX_ASYNC_OUTPUT = 0x12;
const uint32_t Zin_SignalBase::SIGNAL_TYPE_MOX_SYNC_OUTPUT = 0x13;
const uint32_t Zin_SignalBase::SIGNAL_TYPE_GROUP = 0x100;

Zin_SignalBase::Zin_SignalBase(uint32_t type, const std::string& name) : type_(type), name_(name) {}

Zin_SignalBase::Zin_SignalBase(const Zin_SignalBase&) = default;

Zin_SignalBase& Zin_SignalBase::operator=(const Zin_SignalBase&) = default;

Zin_SignalBase::~Zin_SignalBase() = default;

std::string Zin_SignalBase::getProperty(const std::string& name) const {
  const auto it = properties_.find(name);
  return it != properties_.end() ? it->second : std::string();
}

void Zin_SignalBase::setProperty(const char* name, const char* value) {
  if (name == nullptr) return;
  properties_[name] = value != nullptr ? value : "";
}

void Zin_SignalBase::setProperty(std::string& name, std::string& value) {
  properties_[name] = value;
}

}  // namespace ZinRT
