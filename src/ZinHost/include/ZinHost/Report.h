// What clients print about cores and signals, as an aligned table or as JSON: the readings of
// named inputs, the cores of a scan and a core's information.
#ifndef ZINHOST_REPORT_H
#define ZINHOST_REPORT_H

#include <ostream>
#include <string>
#include <vector>

#include "ZinMOX/ZinMOX.h"
#include "ZinRT/ZinCore_Types.h"

namespace ZinHost {

/// One named input as a read reports it; values are the library's hex texts.
struct InputReading {
  std::string name;
  uint32_t width = 0;
  bool sync = false;
  std::string value;
  std::string activityUp;
  std::string activityDown;
  std::string syncActivityUp;  // synchronous inputs only
  std::string syncActivityDown;
};

/// One core found by a scan; `mox` is zero unless the core is a MOX core.
struct ScannedCore {
  ZIN_CORE_REF ref;
  ZIN_CORE_INFO generic;
  ZINMOX_CORE_INFO mox;
};

/// The core type of MOX cores in the generic core information.
inline constexpr uint32_t kMoxCoreType = 9;

/// name, width, value and the activity columns ("-" for the sync columns of async inputs), or
/// {"core": ..., "signals": [...]}.
void printReadings(std::ostream& out, const ZIN_CORE_REF& ref,
                   const std::vector<InputReading>& inputs, bool json);

/// One row per core (reference, type, versions, port widths), or {"target": ..., "cores": [...]}.
void printScan(std::ostream& out, const std::vector<ScannedCore>& cores, const std::string& target,
               bool json);

/// The twelve information fields of a MOX core, as field/value rows or one JSON object.
void printInfo(std::ostream& out, const ZIN_CORE_REF& ref, const ZINMOX_CORE_INFO& info, bool json);

}  // namespace ZinHost

#endif
