// Lays out the status word of a MOX core as a target reports it.
#ifndef ZINTESTKIT_STATUSWORD_H
#define ZINTESTKIT_STATUSWORD_H

#include <cstdint>
#include <vector>

namespace ZinTestKit {

/// Number of status bytes a target keeps per core (enough for every layout).
inline constexpr uint32_t kStatusWordBytes = 16;

/// What a MOX core's status word says about it.
struct MoxStatus {
  uint32_t majorVersion = 10;
  uint32_t minorVersion = 0;
  uint32_t asyncInputCount = 0;
  uint32_t syncInputCount = 0;
  uint32_t asyncOutputCount = 0;
  uint32_t syncOutputCount = 0;
  uint32_t qxMajorVersion = 0;  // full layout only (version key 0xA0 and above)
  uint32_t qxMinorVersion = 0;
  uint32_t qxMinorVersionAlpha = 0;
};

/// The version key (major << 4) | minor that selects the layout: below 0x62 eight-bit port counts
/// from bit 40; below 0xA0 sixteen-bit counts from bit 40; else the qx version at bits 40/44/52
/// and sixteen-bit counts from bit 60. Bit i of the word is bit i mod 8 of byte i/8.
uint32_t versionKey(const MoxStatus& status);

/// The kStatusWordBytes status bytes of a MOX core; bits outside the fields are zero. Throws
/// std::invalid_argument when a count or a qx field does not fit its field in the layout of the
/// core's version (the two older layouts have no qx fields, so there only 0 fits).
std::vector<unsigned char> buildMoxStatusWord(const MoxStatus& status);

}  // namespace ZinTestKit

#endif
