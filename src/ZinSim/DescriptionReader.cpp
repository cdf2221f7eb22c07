// Reads a target description from JSON text, naming every problem by its JSON pointer.
#include <fstream>
#include <initializer_list>
#include <limits>
#include <nlohmann/json.hpp>
#include <set>
#include <sstream>

#include "DescriptionCheck.h"
#include "ZinSim/Description.h"

namespace ZinSim {

namespace {

using nlohmann::json;

[[noreturn]] void fail(const std::string& at, const std::string& text) {
  throw DescriptionError(at, text);
}

const char* typeName(const json& j) {
  return j.type_name();
}

// A value as JSON text for a message, cut to its first kEchoChars characters.
std::string echo(const json& j) {
  constexpr size_t kEchoChars = 64;
  std::string text = j.dump();
  if (text.size() > kEchoChars) text.resize(kEchoChars), text += "...";
  return text;
}

void requireObject(const json& j, const std::string& at) {
  if (!j.is_object()) fail(at, std::string("expected an object, found ") + typeName(j));
}

void requireArray(const json& j, const std::string& at) {
  if (!j.is_array()) fail(at, std::string("expected an array, found ") + typeName(j));
}

void checkKeys(const json& object, const std::string& at,
               std::initializer_list<const char*> allowed) {
  for (const auto& item : object.items()) {
    bool known = false;
    for (const char* key : allowed) known = known || item.key() == key;
    if (!known) fail(at + "/" + item.key(), "unknown key");
  }
}

// A number given as a JSON integer or as a "0x" hexadecimal text.
uint64_t readUInt(const json& j, const std::string& at, uint64_t most) {
  uint64_t value = 0;
  if (j.is_number_unsigned()) {
    value = j.get<uint64_t>();
  } else if (j.is_number()) {  // negative, fractional, or beyond 64 bits
    fail(at, "expected a number from 0 to " + std::to_string(most) + ", found " + echo(j));
  } else if (j.is_string() && j.get<std::string>().rfind("0x", 0) == 0 &&
             j.get<std::string>().size() > 2 && j.get<std::string>().size() <= 18) {
    const std::string text = j.get<std::string>().substr(2);
    if (text.find_first_not_of("0123456789abcdefABCDEF") != std::string::npos) {
      fail(at, "expected a number, found the text " + echo(j));
    }
    value = std::stoull(text, nullptr, 16);
  } else {
    std::string found = std::string("expected a number, found ") + typeName(j);
    if (j.is_string()) found.append(" ").append(echo(j));
    fail(at, found);
  }
  if (value > most) {
    fail(at, "expected a number from 0 to " + std::to_string(most) + ", found " +
                 std::to_string(value));
  }
  return value;
}

template <typename T>
void readField(const json& object, const char* key, const std::string& at, T& out,
               uint64_t most = std::numeric_limits<uint32_t>::max()) {
  auto it = object.find(key);
  if (it != object.end()) out = static_cast<T>(readUInt(*it, at + "/" + key, most));
}

std::string readText(const json& object, const char* key, const std::string& at) {
  auto it = object.find(key);
  if (it == object.end()) return {};
  if (!it->is_string())
    fail(at + "/" + key, std::string("expected a text, found ") + typeName(*it));
  return it->get<std::string>();
}

// One of the names in `names`, returned as its position.
size_t readChoice(const json& object, const char* key, const std::string& at,
                  std::initializer_list<const char*> names, bool required) {
  auto it = object.find(key);
  std::string expected;
  for (const char* n : names)
    expected += (expected.empty() ? "\"" : " or \"") + std::string(n) + "\"";
  if (it == object.end()) {
    if (required) fail(at + "/" + key, "missing; expected " + expected);
    return 0;
  }
  if (it->is_string()) {
    size_t index = 0;
    for (const char* n : names) {
      if (it->get<std::string>() == n) return index;
      ++index;
    }
  }
  fail(at + "/" + key, "expected " + expected + ", found " + echo(*it));
}

InputSource readSource(const json& j, const std::string& at) {
  requireObject(j, at);
  InputSource s;
  switch (readChoice(j, "kind", at, {"constant", "loopback", "counter", "square"}, true)) {
    case 0:
      checkKeys(j, at, {"kind", "value"});
      s = InputSource::constant(false);
      readField(j, "value", at, s.value, 1);
      break;
    case 1:
      checkKeys(j, at, {"kind", "output", "bit"});
      s = InputSource::loopback(readChoice(j, "output", at, {"async", "sync"}, true) == 0
                                    ? OutputPort::Async
                                    : OutputPort::Sync,
                                0);
      readField(j, "bit", at, s.bit, 65535);
      break;
    case 2:
      checkKeys(j, at, {"kind", "bit"});
      s = InputSource::counter(0);
      readField(j, "bit", at, s.bit, kMaxCounterBit);
      break;
    default:
      checkKeys(j, at, {"kind", "period", "phase"});
      if (!j.contains("period")) fail(at + "/period", "missing; expected a period in cycles");
      s = InputSource::square(2);
      readField(j, "period", at, s.period, kMaxSquarePeriod);
      readField(j, "phase", at, s.phase, std::numeric_limits<uint64_t>::max());
      if (s.period < 2) fail(at + "/period", "expected at least 2 cycles");
      break;
  }
  return s;
}

WiringRule readRule(const json& j, const std::string& at) {
  requireObject(j, at);
  checkKeys(j, at, {"input", "first", "count", "source"});
  WiringRule rule;
  rule.port =
      readChoice(j, "input", at, {"async", "sync"}, true) == 0 ? InputPort::Async : InputPort::Sync;
  readField(j, "first", at, rule.first, 65535);
  readField(j, "count", at, rule.count, 65536);
  if (!j.contains("source")) fail(at + "/source", "missing; expected an input source");
  rule.source = readSource(j.at("source"), at + "/source");
  return rule;
}

std::vector<unsigned char> readStatusBytes(const json& object, const std::string& at) {
  const std::string text = readText(object, "status", at);
  if (text.size() > 32 || text.find_first_not_of("0123456789abcdefABCDEF") != std::string::npos) {
    fail(at + "/status",
         "expected at most 32 hexadecimal digits (bit i of the number is bit i "
         "of the status word)");
  }
  std::vector<unsigned char> bytes((text.size() + 1) / 2, 0);
  for (size_t d = 0; d < text.size(); ++d) {
    const size_t fromEnd = text.size() - 1 - d;
    const unsigned digit = static_cast<unsigned>(std::stoul(text.substr(d, 1), nullptr, 16));
    bytes[fromEnd / 2] |= static_cast<unsigned char>(digit << (4 * (fromEnd % 2)));
  }
  return bytes;
}

void readVersions(const json& j, const std::string& at, CoreDescription& core) {
  readField(j, "manufacturer_id", at, core.manufacturerId);
  readField(j, "type", at, core.type);
  readField(j, "major_version", at, core.majorVersion, 255);
  readField(j, "minor_version", at, core.minorVersion, 255);
  readField(j, "revision", at, core.revision);
  if (auto it = j.find("qx_version"); it != j.end()) {
    const std::string qx = at + "/qx_version";
    requireObject(*it, qx);
    checkKeys(*it, qx, {"major", "minor", "alpha"});
    readField(*it, "major", qx, core.qxMajorVersion, 15);
    readField(*it, "minor", qx, core.qxMinorVersion, 255);
    readField(*it, "alpha", qx, core.qxMinorVersionAlpha, 255);
  }
}

void readPorts(const json& j, const std::string& at, CoreDescription& core) {
  readField(j, "async_inputs", at, core.asyncInputs, 65535);
  readField(j, "sync_inputs", at, core.syncInputs, 65535);
  readField(j, "async_outputs", at, core.asyncOutputs, 65535);
  readField(j, "sync_outputs", at, core.syncOutputs, 65535);
  if (auto it = j.find("clock"); it != j.end()) {
    requireObject(*it, at + "/clock");
    checkKeys(*it, at + "/clock", {"cycles_per_sequence"});
    readField(*it, "cycles_per_sequence", at + "/clock", core.cyclesPerSequence);
  }
  if (auto it = j.find("wiring"); it != j.end()) {
    requireArray(*it, at + "/wiring");
    for (size_t i = 0; i < it->size(); ++i) {
      core.wiring.push_back(readRule((*it)[i], at + "/wiring/" + std::to_string(i)));
    }
  }
}

CoreDescription readCore(const json& j, const std::string& at, uint32_t device, uint32_t chain,
                         size_t position) {
  requireObject(j, at);
  checkKeys(j, at,
            {"index", "name", "manufacturer_id", "type", "major_version", "minor_version",
             "revision", "qx_version", "async_inputs", "sync_inputs", "async_outputs",
             "sync_outputs", "clock", "wiring", "status"});
  CoreDescription core;
  core.ref = ZIN_CORE_REF{device, chain, static_cast<uint32_t>(position)};
  readField(j, "index", at, core.ref.coreIndex, 15);
  core.name = readText(j, "name", at);
  readVersions(j, at, core);
  readPorts(j, at, core);
  core.status = readStatusBytes(j, at);
  if (auto p = checkCore(core)) fail(at + "/" + p->place, p->text);
  return core;
}

// The index of an entry of an array: its "index"/"number" key, else its position.
uint32_t readIndex(const json& j, const char* key, const std::string& at, size_t position,
                   uint32_t most, std::set<uint32_t>& seen, const char* what) {
  uint32_t index = static_cast<uint32_t>(position);
  readField(j, key, at, index, most);
  if (!j.contains(key) && position > most) {
    fail(at, std::string("the ") + what + " at this position needs an explicit \"" + key +
                 "\" (at most " + std::to_string(most) + ")");
  }
  if (!seen.insert(index).second) {
    fail(j.contains(key) ? at + "/" + key : at,
         std::string(what) + " " + std::to_string(index) + " is described twice");
  }
  return index;
}

void readChain(const json& j, const std::string& at, uint32_t device, uint32_t chain,
               TargetDescription& target) {
  auto it = j.find("cores");
  if (it == j.end()) return;
  const std::string coresAt = at + "/cores";
  requireArray(*it, coresAt);
  std::set<uint32_t> seen;
  for (size_t i = 0; i < it->size(); ++i) {
    const std::string coreAt = coresAt + "/" + std::to_string(i);
    requireObject((*it)[i], coreAt);
    const uint32_t index = readIndex((*it)[i], "index", coreAt, i, 15, seen, "core");
    target.cores.push_back(readCore((*it)[i], coreAt, device, chain, index));
  }
}

void readDevice(const json& j, const std::string& at, uint32_t device, TargetDescription& target) {
  checkKeys(j, at, {"index", "chains"});
  auto it = j.find("chains");
  if (it == j.end()) return;
  const std::string chainsAt = at + "/chains";
  requireArray(*it, chainsAt);
  std::set<uint32_t> seen;
  for (size_t i = 0; i < it->size(); ++i) {
    const std::string chainAt = chainsAt + "/" + std::to_string(i);
    requireObject((*it)[i], chainAt);
    checkKeys((*it)[i], chainAt, {"number", "cores"});
    const uint32_t chain = readIndex((*it)[i], "number", chainAt, i, 15, seen, "user chain");
    readChain((*it)[i], chainAt, device, chain, target);
  }
}

TargetDescription readTarget(const json& j) {
  requireObject(j, "");
  checkKeys(j, "", {"name", "devices"});
  TargetDescription target;
  target.name = readText(j, "name", "");
  auto it = j.find("devices");
  if (it == j.end()) fail("/devices", "missing; expected an array of devices");
  requireArray(*it, "/devices");
  std::set<uint32_t> seen;
  for (size_t i = 0; i < it->size(); ++i) {
    const std::string at = "/devices/" + std::to_string(i);
    requireObject((*it)[i], at);
    const uint32_t device = readIndex((*it)[i], "index", at, i, 255, seen, "device");
    readDevice((*it)[i], at, device, target);
  }
  return target;
}

}  // namespace

TargetDescription parseDescription(std::string_view jsonText) {
  // Deeper than any description needs (about 10 levels); bounds the recursion of everything
  // that later walks the document.
  const json::parser_callback_t depthLimit = [](int depth, json::parse_event_t, json&) {
    if (depth > kMaxDescriptionDepth) {
      fail("", "nested deeper than " + std::to_string(kMaxDescriptionDepth) + " levels");
    }
    return true;
  };
  json document;
  try {
    document = json::parse(jsonText.begin(), jsonText.end(), depthLimit);
  } catch (const json::exception& e) {  // also a number too large for any type (out_of_range)
    fail("", std::string("not valid JSON: ") + e.what());
  }
  return readTarget(document);
}

TargetDescription loadDescription(const std::string& path) {
  std::ifstream file(path, std::ios::binary);
  if (!file) fail("", "cannot open the description file '" + path + "'");
  std::ostringstream text;
  text << file.rdbuf();
  if (file.bad()) fail("", "cannot read the description file '" + path + "'");
  try {
    return parseDescription(text.str());
  } catch (const DescriptionError& e) {
    throw DescriptionError(e.pointer(), e.problem() + " (in '" + path + "')");
  }
}

}  // namespace ZinSim
