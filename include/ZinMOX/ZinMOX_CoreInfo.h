/* The decoded information record of a MOX core. Usable from C and C++. */
#ifndef ZINMOX_COREINFO_H
#define ZINMOX_COREINFO_H

#include <stdint.h>

/* Twelve unsigned 32-bit fields (48 bytes). The first five come from the core's generic
   information, the rest from its status word; the last four are the widths in bits of the
   core's four ports. Fields that a core's status layout does not carry are 0. */
typedef struct ZINMOX_CORE_INFO {
  uint32_t manufacturer_id;
  uint32_t core_type;
  uint32_t core_major_version;
  uint32_t core_minor_version;
  uint32_t core_revision;
  uint32_t qx_major_version;
  uint32_t qx_minor_version;
  uint32_t qx_minor_version_alpha;
  uint32_t async_input_count;
  uint32_t sync_input_count;
  uint32_t async_output_count;
  uint32_t sync_output_count;
} ZINMOX_CORE_INFO;

#endif
