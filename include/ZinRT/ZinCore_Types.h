/* Plain records shared by the framework libraries and their hosts. Usable from C and C++. */
#ifndef ZINRT_ZINCORE_TYPES_H
#define ZINRT_ZINCORE_TYPES_H

#include <stdint.h>

/* Reference to one core on the JTAG chain of a session. */
typedef struct ZIN_CORE_REF {
  uint32_t deviceIndex;     /* device on the chain, 0 to 255 */
  uint32_t userChainNumber; /* user chain of the device, 0 to 15 */
  uint32_t coreIndex;       /* core on the user chain, 0 to 15 */
} ZIN_CORE_REF;

/* Generic description that every core reports with its status word. */
typedef struct ZIN_CORE_INFO {
  uint32_t manufacturerId;
  uint32_t coreType; /* 9 identifies a MOX core */
  uint32_t coreMajorVersion;
  uint32_t coreMinorVersion;
  uint32_t coreRevision;
} ZIN_CORE_INFO;

#endif
