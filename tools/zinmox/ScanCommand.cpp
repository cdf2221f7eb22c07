// zinmox scan: every core on the chain with its type, versions and, for MOX cores, port widths.
#include <iostream>

#include "Commands.h"
#include "ZinHost/CoreRef.h"
#include "ZinHost/Report.h"
#include "ZinHost/Target.h"
#include "ZinMOX/ZinMOX.h"
#include "ZinRT/Zin_CoreComm.h"

namespace zinmox {

namespace {

using ZinHost::formatCoreRef;
using ZinHost::kMoxCoreType;
using ZinHost::ScannedCore;

std::vector<ScannedCore> scanCores(Session& session) {
  std::vector<ScannedCore> cores;
  for (const ZIN_CORE_REF& ref : session.listCores()) {
    ScannedCore core{ref, {}, {}};
    session.check(ZinCore_getCoreStatus(session.handle(), ref, &core.generic, nullptr, 0),
                  "the status read of core " + formatCoreRef(ref));
    if (core.generic.coreType == kMoxCoreType) {
      ZIN_CORE_REF copy = ref;
      session.check(ZinMOX_getInfo(session.handle(), &copy, &core.mox),
                    "reading the information of core " + formatCoreRef(ref));
    }
    cores.push_back(core);
  }
  return cores;
}

}  // namespace

void addScanCommand(CLI::App& app, Session& session) {
  auto json = std::make_shared<bool>(false);
  CLI::App* command = app.add_subcommand(
      "scan", "List every core on the chain: reference, type, versions and MOX port widths");
  command->add_flag("--json", *json, "machine-readable output");
  command->callback([&session, json] {
    const std::vector<ScannedCore> cores = scanCores(session);
    ZinHost::printScan(std::cout, cores, ZinHost::describeTarget(session.targetText()), *json);
  });
}

}  // namespace zinmox
