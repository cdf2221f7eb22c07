// Writes a target description as JSON text in the format that the reader takes.
#include <algorithm>
#include <cstdio>
#include <tuple>
#include <nlohmann/json.hpp>

#include "ZinSim/Description.h"

namespace ZinSim {

namespace {

using nlohmann::json;

json sourceJson(const InputSource& s) {
  switch (s.kind) {
    case InputSource::Kind::Constant:
      return {{"kind", "constant"}, {"value", s.value}};
    case InputSource::Kind::Loopback:
      return {{"kind", "loopback"},
              {"output", s.output == OutputPort::Async ? "async" : "sync"},
              {"bit", s.bit}};
    case InputSource::Kind::Counter:
      return {{"kind", "counter"}, {"bit", s.bit}};
    case InputSource::Kind::Square:
      break;
  }
  return {{"kind", "square"}, {"period", s.period}, {"phase", s.phase}};
}

// The status bytes as a hexadecimal number, most significant digit first.
std::string statusText(const std::vector<unsigned char>& bytes) {
  std::string text;
  for (auto it = bytes.rbegin(); it != bytes.rend(); ++it) {
    char digits[3];
    std::snprintf(digits, sizeof digits, "%02X", *it);
    text += digits;
  }
  return text;
}

json coreJson(const CoreDescription& c) {
  json j = {{"index", c.ref.coreIndex}};
  if (!c.name.empty()) j["name"] = c.name;
  j["manufacturer_id"] = c.manufacturerId;
  j["type"] = c.type;
  j["major_version"] = c.majorVersion;
  j["minor_version"] = c.minorVersion;
  j["revision"] = c.revision;
  if (c.type != kMoxCoreType) {
    if (!c.status.empty()) j["status"] = statusText(c.status);
    return j;
  }
  if (c.qxMajorVersion != 0 || c.qxMinorVersion != 0 || c.qxMinorVersionAlpha != 0) {
    j["qx_version"] = {
        {"major", c.qxMajorVersion}, {"minor", c.qxMinorVersion}, {"alpha", c.qxMinorVersionAlpha}};
  }
  j["async_outputs"] = c.asyncOutputs;
  j["sync_outputs"] = c.syncOutputs;
  j["async_inputs"] = c.asyncInputs;
  j["sync_inputs"] = c.syncInputs;
  j["clock"] = {{"cycles_per_sequence", c.cyclesPerSequence}};
  if (!c.wiring.empty()) {
    json rules = json::array();
    for (const WiringRule& r : c.wiring) {
      rules.push_back({{"input", r.port == InputPort::Async ? "async" : "sync"},
                       {"first", r.first},
                       {"count", r.count},
                       {"source", sourceJson(r.source)}});
    }
    j["wiring"] = rules;
  }
  return j;
}

}  // namespace

std::string descriptionToJson(const TargetDescription& description, int indent) {
  std::vector<const CoreDescription*> cores;
  for (const CoreDescription& c : description.cores) cores.push_back(&c);
  std::stable_sort(cores.begin(), cores.end(), [](const auto* a, const auto* b) {
    return std::tie(a->ref.deviceIndex, a->ref.userChainNumber, a->ref.coreIndex) <
           std::tie(b->ref.deviceIndex, b->ref.userChainNumber, b->ref.coreIndex);
  });
  json devices = json::array();
  for (const CoreDescription* c : cores) {
    if (devices.empty() || devices.back()["index"] != c->ref.deviceIndex) {
      devices.push_back({{"index", c->ref.deviceIndex}, {"chains", json::array()}});
    }
    json& chains = devices.back()["chains"];
    if (chains.empty() || chains.back()["number"] != c->ref.userChainNumber) {
      chains.push_back({{"number", c->ref.userChainNumber}, {"cores", json::array()}});
    }
    chains.back()["cores"].push_back(coreJson(*c));
  }
  json document = json::object();
  if (!description.name.empty()) document["name"] = description.name;
  document["devices"] = devices;
  return document.dump(indent);
}

}  // namespace ZinSim
