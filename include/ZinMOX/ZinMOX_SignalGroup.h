// The object behind every named signal or bus of a MOX core.
#ifndef ZINMOX_SIGNALGROUP_H
#define ZINMOX_SIGNALGROUP_H

#include <cstdint>
#include <string>
#include <vector>

#include "ZinMOX/ZinMOX_Export.h"
#include "ZinRT/Zin_SignalGroup.h"

namespace ZinRT {

class ZinMOX_Command;

/// A named, ordered list of port bits of one port of a core: value bit i is carried by port bit
/// getPositionVector()[i]. It stages and reads its bits in the core's port image (not owned).
class ZINMOX_API ZinMOX_SignalGroup final : public Zin_SignalGroup {
 public:
  /// `type` is one of the four MOX signal types; `keyName` is the text under which the core's
  /// signal table holds the group.
  ZinMOX_SignalGroup(ZinMOX_Command* command, uint32_t type, std::vector<uint32_t>& positions,
                     const std::string& name, const std::string& keyName);
  ZinMOX_SignalGroup(const ZinMOX_SignalGroup& other);
  ZinMOX_SignalGroup& operator=(const ZinMOX_SignalGroup& other);
  ~ZinMOX_SignalGroup();

  /// The group's width in bits (the number of positions).
  uint32_t size() const { return static_cast<uint32_t>(getPositionVector().size()); }
  const std::string& getKeyName() const { return keyName; }
  ZinMOX_Command* getCommand() const { return command; }

  /// Stages a packed value into the port image and marks its bits for update. For a synchronous
  /// output a `stepCount` of 0 or 1 holds the value on all 16 steps; 2 or more reads that many
  /// step vectors (the last one repeats on the remaining steps, only the first 16 are used).
  /// Throws std::logic_error for a null value or too few bytes; nothing is staged then.
  void setValues(const uint8_t* value, uint32_t byteSize, uint32_t stepCount);
  /// ORs the group's value and activity bits from the port image into the non-null destinations
  /// (the two sync-activity ones only for synchronous inputs). Throws std::logic_error when
  /// `byteSize` is below ceil(size/8); nothing is written then.
  void getValues(uint8_t* value, uint8_t* activityUp, uint8_t* activityDown,
                 uint8_t* syncActivityUp, uint8_t* syncActivityDown, uint32_t byteSize) const;

 private:
  std::string keyName;
  ZinMOX_Command* command;
};

}  // namespace ZinRT

#endif
