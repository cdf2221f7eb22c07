// An ordered group of port bits; its type carries the group flag.
#include "ZinRT/Zin_SignalGroup.h"

namespace ZinRT {

Zin_SignalGroup::Zin_SignalGroup(uint32_t type, uint32_t flags, std::vector<uint32_t>& positions,
                                 const std::string& name)
    : Zin_SignalBase(type | SIGNAL_TYPE_GROUP, name), flags_(flags), positions_(positions) {}

Zin_SignalGroup::Zin_SignalGroup(const Zin_SignalGroup&) = default;

Zin_SignalGroup& Zin_SignalGroup::operator=(const Zin_SignalGroup&) = default;

Zin_SignalGroup::~Zin_SignalGroup() = default;

}  // namespace ZinRT
