// One core of the simulated target: what it reports to a status read and, for MOX cores, the
// core model.
#ifndef ZINSIM_SIMCORE_H
#define ZINSIM_SIMCORE_H

#include <map>
#include <memory>
#include <vector>

#include "MoxModel.h"
#include "ZinSim/Description.h"

namespace ZinSim {

struct SimCore {
  ZIN_CORE_INFO info{};
  std::vector<unsigned char> status;
  std::unique_ptr<MoxModel> mox;  // null for cores of other types
};

/// Cores by reference: (device << 8) | (chain << 4) | core.
using CoreMap = std::map<uint32_t, SimCore>;

inline uint32_t coreKey(const ZIN_CORE_REF& ref) {
  return (ref.deviceIndex << 8) | (ref.userChainNumber << 4) | ref.coreIndex;
}

inline ZIN_CORE_REF refOfKey(uint32_t key) {
  return ZIN_CORE_REF{key >> 8, (key >> 4) & 15u, key & 15u};
}

}  // namespace ZinSim

#endif
