// An ordered group of port bits of the framework.
#ifndef ZINRT_ZIN_SIGNALGROUP_H
#define ZINRT_ZIN_SIGNALGROUP_H

#include <vector>

#include "ZinRT/Zin_SignalBase.h"

namespace ZinRT {

// Signals are always destroyed through their own class, so the destructor is deliberately not
// virtual; the warning about it is silenced for this class only.
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wnon-virtual-dtor"
/// A named, ordered list of port bit positions. Its type is the given type with
/// SIGNAL_TYPE_GROUP added.
class ZINCORE_API Zin_SignalGroup : public Zin_SignalBase {
 public:
  /// `flags` is kept for the framework's own use and has no meaning to the signal's bits.
  Zin_SignalGroup(uint32_t type, uint32_t flags, std::vector<uint32_t>& positions,
                  const std::string& name);
  Zin_SignalGroup(const Zin_SignalGroup&);
  Zin_SignalGroup& operator=(const Zin_SignalGroup&);
  ~Zin_SignalGroup();

  /// Entry i is the port bit that carries bit i of the group's value.
  std::vector<uint32_t>& getPositionVector() { return positions_; }
  const std::vector<uint32_t>& getPositionVector() const { return positions_; }
  uint32_t getFlags() const { return flags_; }

 private:
  uint32_t flags_;
  std::vector<uint32_t> positions_;
};
#pragma GCC diagnostic pop

}  // namespace ZinRT

#endif
