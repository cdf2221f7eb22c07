// zinmox scan: every core on the chain with its type, versions and, for MOX cores, port widths.
#include <iostream>
#include <nlohmann/json.hpp>

#include "Commands.h"
#include "CoreRef.h"
#include "Table.h"
#include "TargetOpen.h"
#include "ZinMOX/ZinMOX.h"
#include "ZinMOX/ZinMOX_CoreInfoFields.h"
#include "ZinRT/Zin_CoreComm.h"

namespace zinmox {

namespace {

constexpr uint32_t kMoxCoreType = 9;

struct ScannedCore {
  ZIN_CORE_REF ref;
  ZIN_CORE_INFO generic;
  ZINMOX_CORE_INFO mox;  // zero unless a MOX core
};

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

std::string versionText(uint32_t major, uint32_t minor, uint32_t third) {
  return std::to_string(major) + "." + std::to_string(minor) + "." + std::to_string(third);
}

void printTable(const std::vector<ScannedCore>& cores) {
  Table table({"core", "type", "version", "qx", "async_out", "sync_out", "async_in", "sync_in"});
  for (const ScannedCore& core : cores) {
    const ZIN_CORE_INFO& g = core.generic;
    const std::string version = versionText(g.coreMajorVersion, g.coreMinorVersion, g.coreRevision);
    if (g.coreType != kMoxCoreType) {
      table.addRow({formatCoreRef(core.ref), "type " + std::to_string(g.coreType), version, "-",
                    "-", "-", "-", "-"});
      continue;
    }
    const ZINMOX_CORE_INFO& m = core.mox;
    table.addRow({formatCoreRef(core.ref), "MOX", version,
                  versionText(m.qx_major_version, m.qx_minor_version, m.qx_minor_version_alpha),
                  std::to_string(m.async_output_count), std::to_string(m.sync_output_count),
                  std::to_string(m.async_input_count), std::to_string(m.sync_input_count)});
  }
  table.print(std::cout);
}

void printJson(const std::vector<ScannedCore>& cores, const std::string& target) {
  nlohmann::json list = nlohmann::json::array();
  for (const ScannedCore& core : cores) {
    nlohmann::json entry{{"core", formatCoreRef(core.ref)},
                         {"mox", core.generic.coreType == kMoxCoreType},
                         {"manufacturer_id", core.generic.manufacturerId},
                         {"core_type", core.generic.coreType},
                         {"core_major_version", core.generic.coreMajorVersion},
                         {"core_minor_version", core.generic.coreMinorVersion},
                         {"core_revision", core.generic.coreRevision}};
    if (core.generic.coreType == kMoxCoreType) {
      for (const ZinRT::ZinMOX_CoreInfoField& field : ZinRT::ZINMOX_CORE_INFO_FIELDS)
        entry[field.key] = core.mox.*field.member;
    }
    list.push_back(entry);
  }
  std::cout << nlohmann::json{{"target", target}, {"cores", list}}.dump(2) << "\n";
}

}  // namespace

void addScanCommand(CLI::App& app, Session& session) {
  auto json = std::make_shared<bool>(false);
  CLI::App* command = app.add_subcommand(
      "scan", "List every core on the chain: reference, type, versions and MOX port widths");
  command->add_flag("--json", *json, "machine-readable output");
  command->callback([&session, json] {
    const std::vector<ScannedCore> cores = scanCores(session);
    if (*json) {
      printJson(cores, describeTarget(session.targetText()));
    } else if (cores.empty()) {
      std::cout << "no core answers on " << describeTarget(session.targetText()) << "\n";
    } else {
      printTable(cores);
    }
  });
}

}  // namespace zinmox
