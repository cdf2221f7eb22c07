// Core references on the command line: DEVICE:CHAIN:CORE, each decimal or 0x-prefixed hex.
#ifndef ZINMOX_TOOL_COREREF_H
#define ZINMOX_TOOL_COREREF_H

#include <string>

#include "ZinRT/ZinCore_Types.h"

namespace zinmox {

/// Parses "0:1:0" or "0x0:0x1:0". Throws UsageError for a malformed text or a field out of range
/// (device 0 to 255, user chain 0 to 15, core 0 to 15).
ZIN_CORE_REF parseCoreRef(const std::string& text);

/// "0:1:0".
std::string formatCoreRef(const ZIN_CORE_REF& ref);

/// Orders references by device, chain, core.
bool coreRefLess(const ZIN_CORE_REF& a, const ZIN_CORE_REF& b);

}  // namespace zinmox

#endif
