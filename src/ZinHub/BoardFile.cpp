// Board descriptions as JSON, and the presets.
#include "ZinHub/BoardFile.h"

#include <fstream>
#include <iterator>
#include <nlohmann/json.hpp>

namespace ZinHub {

namespace {

using nlohmann::json;

constexpr size_t kMaxDevices = 256;  // the device field of a command line has two hex digits
constexpr uint32_t kMaxChain = 15;   // one hex digit
constexpr unsigned kMaxWaitBits = 65536;

struct Preset {
  const char* name;
  const char* tap;
  uint32_t irLength;
  uint64_t chains[4];  // chains 1..4; 0: none
  uint32_t idcode;     // 0: parts differ, none expected
};

const Preset kPresets[] = {
    {"rtl-model", "zinmox.tap", 4, {0x8, 0x9, 0xA, 0xB}, 0x1A5E0A5B},
    {"xilinx-7series", "xc7.tap", 6, {0x02, 0x03, 0x22, 0x23}, 0},
    {"ecp5", "ecp5.tap", 8, {0x32, 0x38, 0, 0}, 0},
};

[[noreturn]] void fail(const std::string& origin, const std::string& where,
                       const std::string& what) {
  throw BoardError("board " + origin + ": " + where + ": " + what);
}

// A number given as a JSON integer or as a "0x..." / decimal text.
uint64_t number(const json& value, const std::string& origin, const std::string& where,
                uint64_t max) {
  uint64_t result = 0;
  if (value.is_number_unsigned()) {
    result = value.get<uint64_t>();
  } else if (value.is_string()) {
    const std::string text = value.get<std::string>();
    size_t used = 0;
    try {
      result = std::stoull(text, &used, 0);
    } catch (const std::exception&) {
      used = 0;
    }
    if (used == 0 || used != text.size() || text[0] == '-') fail(origin, where, "not a number");
  } else {
    fail(origin, where, "expected a non-negative number or a \"0x...\" text");
  }
  if (result > max) fail(origin, where, "at most " + std::to_string(max));
  return result;
}

// TAP names go into Tcl scripts: only characters without a meaning there.
std::string tapName(const json& value, const std::string& origin, const std::string& where) {
  if (!value.is_string()) fail(origin, where, "expected a text");
  const std::string name = value.get<std::string>();
  const bool ok = !name.empty() && name.size() <= 128 &&
                  name.find_first_not_of(
                      "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ"
                      "0123456789_.-") == std::string::npos;
  if (!ok) fail(origin, where, "a TAP name of letters, digits, '_', '.' and '-'");
  return name;
}

BoardDevice presetDevice(const Preset& preset) {
  BoardDevice device;
  device.tapName = preset.tap;
  device.irLength = preset.irLength;
  for (uint32_t chain = 1; chain <= 4; ++chain) {
    if (preset.chains[chain - 1] != 0) device.chainInstructions[chain] = preset.chains[chain - 1];
  }
  if (preset.idcode != 0) device.idcode = preset.idcode;
  return device;
}

const Preset* findPreset(const std::string& name) {
  for (const Preset& preset : kPresets) {
    if (name == preset.name) return &preset;
  }
  return nullptr;
}

void readChains(const json& chains, BoardDevice& device, const std::string& origin,
                const std::string& where) {
  if (!chains.is_object() || chains.empty()) fail(origin, where, "expected an object of chains");
  device.chainInstructions.clear();
  for (const auto& [key, value] : chains.items()) {
    const std::string at = where + "." + key;
    const uint64_t chain = number(json(key), origin, at + " (the chain number)", kMaxChain);
    const uint64_t max =
        device.irLength >= 64 ? ~uint64_t{0} : (uint64_t{1} << device.irLength) - 1;
    device.chainInstructions[static_cast<uint32_t>(chain)] = number(value, origin, at, max);
  }
}

BoardDevice readDevice(const json& entry, const std::string& origin, const std::string& where) {
  if (!entry.is_object()) fail(origin, where, "expected an object");
  BoardDevice device;
  if (entry.contains("preset")) {
    const json& name = entry["preset"];
    const Preset* preset = name.is_string() ? findPreset(name.get<std::string>()) : nullptr;
    if (preset == nullptr) {
      fail(origin, where + ".preset", "unknown preset (rtl-model, xilinx-7series, ecp5)");
    }
    device = presetDevice(*preset);
  }
  for (const auto& [key, value] : entry.items()) {
    const std::string at = where + "." + key;
    if (key == "preset") continue;
    if (key == "tap") {
      device.tapName = tapName(value, origin, at);
    } else if (key == "ir_length") {
      device.irLength = static_cast<uint32_t>(number(value, origin, at, 64));
      if (device.irLength == 0) fail(origin, at, "at least 1");
    } else if (key == "wait_bits") {
      device.waitBits = static_cast<unsigned>(number(value, origin, at, kMaxWaitBits));
      if (device.waitBits == 0) fail(origin, at, "at least 1");
    } else if (key == "idcode") {
      device.idcode = static_cast<uint32_t>(number(value, origin, at, 0xFFFFFFFF));
    } else if (key == "idcode_mask") {
      device.idcodeMask = static_cast<uint32_t>(number(value, origin, at, 0xFFFFFFFF));
    } else if (key != "chains") {
      fail(origin, at,
           "unknown key (preset, tap, ir_length, chains, wait_bits, idcode, "
           "idcode_mask)");
    }
  }
  if (entry.contains("chains")) readChains(entry["chains"], device, origin, where + ".chains");
  if (device.tapName.empty()) fail(origin, where, "needs \"tap\" or \"preset\"");
  if (device.chainInstructions.empty()) fail(origin, where, "needs \"chains\" or \"preset\"");
  const uint64_t max = device.irLength >= 64 ? ~uint64_t{0} : (uint64_t{1} << device.irLength) - 1;
  for (const auto& [chain, instruction] : device.chainInstructions) {
    if (instruction > max) {
      fail(origin, where + ".chains." + std::to_string(chain),
           "does not fit an IR of " + std::to_string(device.irLength) + " bits");
    }
  }
  return device;
}

}  // namespace

Board presetBoard(const std::string& name) {
  const Preset* preset = findPreset(name);
  if (preset == nullptr) {
    throw BoardError("unknown board preset \"" + name.substr(0, 64) +
                     "\" (rtl-model, xilinx-7series, ecp5)");
  }
  Board board;
  board.devices.push_back(presetDevice(*preset));
  return board;
}

Board parseBoard(const std::string& text, const std::string& origin) {
  json document;
  try {
    document = json::parse(text);
  } catch (const json::parse_error& e) {
    throw BoardError("board " + origin + ": not valid JSON at byte " + std::to_string(e.byte));
  }
  if (!document.is_object()) fail(origin, "(top)", "expected an object with \"devices\"");
  for (const auto& [key, value] : document.items()) {
    (void)value;
    if (key != "devices") fail(origin, key, "unknown key (devices)");
  }
  const json& devices = document.value("devices", json());
  if (!devices.is_array() || devices.empty() || devices.size() > kMaxDevices) {
    fail(origin, "devices", "expected a list of 1 to " + std::to_string(kMaxDevices) + " devices");
  }
  Board board;
  for (size_t i = 0; i < devices.size(); ++i) {
    board.devices.push_back(readDevice(devices[i], origin, "devices[" + std::to_string(i) + "]"));
  }
  return board;
}

Board loadBoard(const std::string& textOrPath) {
  if (textOrPath.empty()) return rtlModelBoard();
  if (findPreset(textOrPath) != nullptr) return presetBoard(textOrPath);
  if (textOrPath.front() == '{') return parseBoard(textOrPath, "text");
  std::ifstream in(textOrPath, std::ios::binary);
  if (!in) throw BoardError("cannot read the board file " + textOrPath);
  std::string text;
  text.resize(kMaxBoardFileBytes + 1);
  in.read(text.data(), static_cast<std::streamsize>(text.size()));
  text.resize(static_cast<size_t>(in.gcount()));
  if (text.size() > kMaxBoardFileBytes) {
    throw BoardError("board file " + textOrPath + " is larger than " +
                     std::to_string(kMaxBoardFileBytes) + " bytes");
  }
  return parseBoard(text, "file " + textOrPath);
}

}  // namespace ZinHub
