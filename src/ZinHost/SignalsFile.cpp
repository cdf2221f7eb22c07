// The signals file: a JSON list of named signals with their port and port bits.
#include "ZinHost/SignalsFile.h"

#include <fstream>
#include <limits>
#include <nlohmann/json.hpp>
#include <set>

#include "ZinHost/BitList.h"
#include "ZinHost/TextError.h"

namespace ZinHost {

namespace {

using nlohmann::json;

// A signals file names at most a few thousand signals; anything larger is not one.
constexpr size_t kMaxFileBytes = 4 * 1024 * 1024;

struct Problem {
  std::string pointer;
  std::string text;
};

void require(bool ok, const std::string& pointer, const std::string& text) {
  if (!ok) throw Problem{pointer, text};
}

std::vector<uint32_t> readBits(const json& value, const std::string& pointer, uint32_t maxBits) {
  if (value.is_string()) {
    try {
      return parseBitList(value.get<std::string>(), maxBits);
    } catch (const TextError& error) {
      throw Problem{pointer, error.what()};
    }
  }
  require(value.is_array() && !value.empty(), pointer,
          "expected a non-empty array of bit numbers or a bit list such as \"0-7\"");
  std::vector<uint32_t> bits;
  for (size_t i = 0; i < value.size(); ++i) {
    const json& bit = value[i];
    require(bit.is_number_unsigned() && bit.get<uint64_t>() <= kMaxBitNumber,
            pointer + "/" + std::to_string(i),
            "expected a bit number from 0 to " + std::to_string(kMaxBitNumber));
    bits.push_back(bit.get<uint32_t>());
  }
  try {
    checkBitList(bits, maxBits);
  } catch (const TextError& error) {
    throw Problem{pointer, error.what()};
  }
  return bits;
}

SignalDefinition readSignal(const json& value, const std::string& pointer,
                            const ZINMOX_CORE_INFO* core) {
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
  std::string field = "/port";
  try {
    signal.port = parsePort(value["port"].get<std::string>());
    field = "/name";
    checkSignalName(signal.name, signal.port);
  } catch (const TextError& error) {
    throw Problem{pointer + field, error.what()};
  }
  require(value.contains("bits"), pointer + "/bits", "missing");
  const uint32_t maxBits = core != nullptr ? portWidth(*core, signal.port) : kMaxListBits;
  signal.bits = readBits(value["bits"], pointer + "/bits", maxBits);
  return signal;
}

std::vector<SignalDefinition> readDocument(const json& document, const ZINMOX_CORE_INFO* core) {
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
    signals.push_back(readSignal(list[i], pointer, core));
    const auto key = std::make_pair(isInput(signals.back().port), lowerCase(signals.back().name));
    require(seen.insert(key).second, pointer + "/name",
            "the " + std::string(key.first ? "input" : "output") + " name " + signals.back().name +
                " is defined twice");
  }
  return signals;
}

}  // namespace

std::vector<SignalDefinition> parseSignals(std::string_view jsonText, const std::string& origin,
                                           const ZINMOX_CORE_INFO* core) {
  try {
    return readDocument(json::parse(jsonText), core);
  } catch (const json::parse_error& error) {
    throw SignalsFileError("signals file " + origin + ": not valid JSON: " + error.what());
  } catch (const Problem& problem) {
    throw SignalsFileError("signals file " + origin + ": " +
                           (problem.pointer.empty() ? std::string("(document)") : problem.pointer) +
                           ": " + problem.text);
  }
}

std::vector<SignalDefinition> loadSignalsFile(const std::string& path,
                                              const ZINMOX_CORE_INFO* core) {
  std::ifstream file(path, std::ios::binary);
  if (!file) throw SignalsFileError("cannot read the signals file " + path);
  std::string text(kMaxFileBytes + 1, '\0');
  file.read(text.data(), static_cast<std::streamsize>(text.size()));
  if (file.bad()) throw SignalsFileError("cannot read the signals file " + path);
  text.resize(static_cast<size_t>(file.gcount()));
  if (text.size() > kMaxFileBytes) {
    throw SignalsFileError("the signals file " + path + " is larger than " +
                           std::to_string(kMaxFileBytes / (1024 * 1024)) + " MiB");
  }
  return parseSignals(text, path, core);
}

}  // namespace ZinHost
