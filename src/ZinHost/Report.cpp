// Tables and JSON of readings, scans and core information.
#include "ZinHost/Report.h"

#include "ZinHost/ReadingJson.h"

#include <nlohmann/json.hpp>

#include "ZinHost/CoreRef.h"
#include "ZinHost/Table.h"
#include "internal/ZinMOX_CoreInfoFields.h"

namespace ZinHost {

namespace {

using nlohmann::json;

std::string versionText(uint32_t major, uint32_t minor, uint32_t third) {
  return std::to_string(major) + "." + std::to_string(minor) + "." + std::to_string(third);
}

json readingsJson(const ZIN_CORE_REF& ref, const std::vector<InputReading>& inputs) {
  json list = json::array();
  for (const InputReading& input : inputs) list.push_back(readingJson(input));
  return json{{"core", formatCoreRef(ref)}, {"signals", list}};
}

json scanJson(const std::vector<ScannedCore>& cores, const std::string& target) {
  json list = json::array();
  for (const ScannedCore& core : cores) {
    const bool mox = core.generic.coreType == kMoxCoreType;
    json entry{{"core", formatCoreRef(core.ref)},
               {"mox", mox},
               {"manufacturer_id", core.generic.manufacturerId},
               {"core_type", core.generic.coreType},
               {"core_major_version", core.generic.coreMajorVersion},
               {"core_minor_version", core.generic.coreMinorVersion},
               {"core_revision", core.generic.coreRevision}};
    if (mox) {
      for (const ZinRT::ZinMOX_CoreInfoField& field : ZinRT::ZINMOX_CORE_INFO_FIELDS)
        entry[field.key] = core.mox.*field.member;
    }
    list.push_back(entry);
  }
  return json{{"target", target}, {"cores", list}};
}

Table scanTable(const std::vector<ScannedCore>& cores) {
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
  return table;
}

}  // namespace

void printReadings(std::ostream& out, const ZIN_CORE_REF& ref,
                   const std::vector<InputReading>& inputs, bool json) {
  if (json) {
    out << readingsJson(ref, inputs).dump(2) << "\n";
    return;
  }
  Table table({"name", "width", "value", "activity_up", "activity_down", "sync_activity_up",
               "sync_activity_down"});
  for (const InputReading& input : inputs) {
    table.addRow({input.name, std::to_string(input.width), input.value, input.activityUp,
                  input.activityDown, input.sync ? input.syncActivityUp : "-",
                  input.sync ? input.syncActivityDown : "-"});
  }
  table.print(out);
}

void printScan(std::ostream& out, const std::vector<ScannedCore>& cores, const std::string& target,
               bool json) {
  if (json) {
    out << scanJson(cores, target).dump(2) << "\n";
  } else if (cores.empty()) {
    out << "no core answers on " << target << "\n";
  } else {
    scanTable(cores).print(out);
  }
}

void printInfo(std::ostream& out, const ZIN_CORE_REF& ref, const ZINMOX_CORE_INFO& info,
               bool json) {
  if (json) {
    nlohmann::json object{{"core", formatCoreRef(ref)}};
    for (const ZinRT::ZinMOX_CoreInfoField& field : ZinRT::ZINMOX_CORE_INFO_FIELDS) {
      object[field.key] = info.*field.member;
    }
    out << object.dump(2) << "\n";
    return;
  }
  Table table({"field", "value"});
  for (const ZinRT::ZinMOX_CoreInfoField& field : ZinRT::ZINMOX_CORE_INFO_FIELDS) {
    table.addRow({field.key, std::to_string(info.*field.member)});
  }
  table.print(out);
}

json readingJson(const InputReading& input) {
  json entry{{"name", input.name},
             {"width", input.width},
             {"value", input.value},
             {"activity_up", input.activityUp},
             {"activity_down", input.activityDown}};
  if (input.sync) {
    entry["sync_activity_up"] = input.syncActivityUp;
    entry["sync_activity_down"] = input.syncActivityDown;
  }
  return entry;
}

}  // namespace ZinHost
