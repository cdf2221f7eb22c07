// The signals file: a JSON list of named signals with their port and port bits.
#include "SignalsFile.h"

#include <fstream>
#include <limits>
#include <nlohmann/json.hpp>
#include <set>
#include <sstream>

#include "Errors.h"

namespace zinmox {

namespace {

using nlohmann::json;

struct Problem {
  std::string pointer;
  std::string text;
};

void require(bool ok, const std::string& pointer, const std::string& text) {
  if (!ok) throw Problem{pointer, text};
}

std::vector<uint32_t> readBits(const json& value, const std::string& pointer) {
  if (value.is_string()) {
    try {
      return parseBitList(value.get<std::string>());
    } catch (const UsageError& error) {
      throw Problem{pointer, error.what()};
    }
  }
  require(value.is_array() && !value.empty(), pointer,
          "expected a non-empty array of bit numbers or a bit list such as \"0-7\"");
  std::vector<uint32_t> bits;
  for (size_t i = 0; i < value.size(); ++i) {
    const json& bit = value[i];
    require(bit.is_number_unsigned() && bit.get<uint64_t>() <= 65535,
            pointer + "/" + std::to_string(i), "expected a bit number from 0 to 65535");
    bits.push_back(bit.get<uint32_t>());
  }
  return bits;
}

SignalDefinition readSignal(const json& value, const std::string& pointer) {
  require(value.is_object(), pointer, "expected an object with name, port and bits");
  for (const auto& item : value.items()) {
    require(item.key() == "name" || item.key() == "port" || item.key() == "bits",
            pointer + "/" + item.key(), "unknown key (expected name, port and bits)");
  }
  SignalDefinition signal;
  require(value.contains("name") && value["name"].is_string() &&
              !value["name"].get<std::string>().empty(),
          pointer + "/name", "expected a non-empty text");
  signal.name = value["name"].get<std::string>();
  require(value.contains("port") && value["port"].is_string(), pointer + "/port",
          "expected one of \"async_out\", \"sync_out\", \"async_in\", \"sync_in\"");
  try {
    signal.port = parsePort(value["port"].get<std::string>());
  } catch (const UsageError& error) {
    throw Problem{pointer + "/port", error.what()};
  }
  require(value.contains("bits"), pointer + "/bits", "missing");
  signal.bits = readBits(value["bits"], pointer + "/bits");
  return signal;
}

std::vector<SignalDefinition> readDocument(const json& document) {
  require(document.is_object(), "", "expected an object with a \"signals\" array");
  for (const auto& item : document.items()) {
    require(item.key() == "signals", "/" + item.key(), "unknown key (expected signals)");
  }
  require(document.contains("signals") && document["signals"].is_array(), "/signals",
          "expected an array of signals");
  std::vector<SignalDefinition> signals;
  std::set<std::pair<bool, std::string>> seen;
  const json& list = document["signals"];
  for (size_t i = 0; i < list.size(); ++i) {
    const std::string pointer = "/signals/" + std::to_string(i);
    signals.push_back(readSignal(list[i], pointer));
    const auto key = std::make_pair(isInput(signals.back().port), lowerCase(signals.back().name));
    require(seen.insert(key).second, pointer + "/name",
            "the " + std::string(key.first ? "input" : "output") + " name " + signals.back().name +
                " is defined twice");
  }
  return signals;
}

}  // namespace

std::vector<SignalDefinition> parseSignals(std::string_view jsonText, const std::string& origin) {
  try {
    return readDocument(json::parse(jsonText));
  } catch (const json::parse_error& error) {
    throw Failure("signals file " + origin + ": not valid JSON: " + error.what());
  } catch (const Problem& problem) {
    throw Failure("signals file " + origin + ": " +
                  (problem.pointer.empty() ? std::string("(document)") : problem.pointer) + ": " +
                  problem.text);
  }
}

std::vector<SignalDefinition> loadSignalsFile(const std::string& path) {
  std::ifstream file(path, std::ios::binary);
  if (!file) throw Failure("cannot read the signals file " + path);
  std::ostringstream text;
  text << file.rdbuf();
  if (file.bad()) throw Failure("cannot read the signals file " + path);
  return parseSignals(text.str(), path);
}

}  // namespace zinmox
