// Core references as users write them: DEVICE:CHAIN:CORE, each field decimal or 0x-prefixed hex.
#ifndef ZINHOST_COREREF_H
#define ZINHOST_COREREF_H

#include <cstdint>
#include <string>
#include <string_view>

#include "ZinRT/ZinCore_Types.h"

namespace ZinHost {

/// The largest field values. A command sequence names the device in two hex digits and the user
/// chain and the core in one each, so no core lies beyond these.
inline constexpr uint32_t kMaxDeviceIndex = 255;
inline constexpr uint32_t kMaxUserChainNumber = 15;
inline constexpr uint32_t kMaxCoreIndex = 15;

/// Parses "0:1:0" or "0x0:0x1:0x0". Throws TextError for a malformed text or a field above its
/// limit.
ZIN_CORE_REF parseCoreRef(std::string_view text);

/// Checks the fields of a reference given as three numbers against the same limits; throws
/// TextError.
void checkCoreRef(const ZIN_CORE_REF& ref);

/// "0:1:0".
std::string formatCoreRef(const ZIN_CORE_REF& ref);

/// Orders references by device, chain, core.
bool coreRefLess(const ZIN_CORE_REF& a, const ZIN_CORE_REF& b);

}  // namespace ZinHost

#endif
