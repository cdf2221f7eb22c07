// The keys under which ZinMOX_getCoreInfo reports the fields of a MOX core's information record,
// in the record's order. Internal: the library and the project's clients share it; hosts read the
// keys from the map (ZinMOX.h lists them).
#ifndef ZINMOX_COREINFOFIELDS_H
#define ZINMOX_COREINFOFIELDS_H

#include <array>
#include <cstdint>

#include "ZinMOX/ZinMOX_CoreInfo.h"

namespace ZinRT {

/// One field of ZINMOX_CORE_INFO and its key.
struct ZinMOX_CoreInfoField {
  const char* key;
  uint32_t ZINMOX_CORE_INFO::*member;
};

/// The twelve fields in the record's order.
inline constexpr std::array<ZinMOX_CoreInfoField, 12> ZINMOX_CORE_INFO_FIELDS{{
    {"manufacturer_id", &ZINMOX_CORE_INFO::manufacturer_id},
    {"core_type", &ZINMOX_CORE_INFO::core_type},
    {"core_major_version", &ZINMOX_CORE_INFO::core_major_version},
    {"core_minor_version", &ZINMOX_CORE_INFO::core_minor_version},
    {"core_revision", &ZINMOX_CORE_INFO::core_revision},
    {"qx_major_version", &ZINMOX_CORE_INFO::qx_major_version},
    {"qx_minor_version", &ZINMOX_CORE_INFO::qx_minor_version},
    {"qx_minor_version_alpha", &ZINMOX_CORE_INFO::qx_minor_version_alpha},
    {"async_input_count", &ZINMOX_CORE_INFO::async_input_count},
    {"sync_input_count", &ZINMOX_CORE_INFO::sync_input_count},
    {"async_output_count", &ZINMOX_CORE_INFO::async_output_count},
    {"sync_output_count", &ZINMOX_CORE_INFO::sync_output_count},
}};

}  // namespace ZinRT

#endif
