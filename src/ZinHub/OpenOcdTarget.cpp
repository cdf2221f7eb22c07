// Parsing and opening "openocd://" target texts.
#include "ZinHub/OpenOcdTarget.h"

#include <stdexcept>

#include "ZinHub/BoardFile.h"

namespace ZinHub {

namespace {

constexpr const char* kScheme = "openocd://";
constexpr uint32_t kMaxTimeoutMs = 3600000;

[[noreturn]] void malformed(const std::string& text, const std::string& what) {
  throw std::invalid_argument("malformed OpenOCD target '" + text.substr(0, 200) + "': " + what +
                              " (expected openocd://HOST:PORT[?board=FILE][&timeout=MS])");
}

uint32_t decimal(const std::string& text, const std::string& digits, uint32_t max,
                 const char* what) {
  if (digits.empty() || digits.size() > 10 ||
      digits.find_first_not_of("0123456789") != std::string::npos || std::stoull(digits) > max) {
    malformed(text, std::string(what) + " must be a number from 1 to " + std::to_string(max));
  }
  return static_cast<uint32_t>(std::stoull(digits));
}

void readOptions(const std::string& text, const std::string& query, OpenOcdTarget& target) {
  size_t at = 0;
  while (at <= query.size()) {
    const size_t end = std::min(query.find('&', at), query.size());
    const std::string option = query.substr(at, end - at);
    const size_t equals = option.find('=');
    const std::string key = option.substr(0, equals);
    const std::string value = equals == std::string::npos ? "" : option.substr(equals + 1);
    if (key == "board" && !value.empty()) {
      target.board = value;
    } else if (key == "timeout") {
      target.timeoutMs = decimal(text, value, kMaxTimeoutMs, "timeout");
      if (target.timeoutMs == 0) malformed(text, "timeout must be at least 1 ms");
    } else {
      malformed(text, "unknown option '" + option.substr(0, 40) + "'");
    }
    at = end + 1;
  }
}

}  // namespace

std::optional<OpenOcdTarget> parseOpenOcdTarget(const std::string& text) {
  if (text.rfind(kScheme, 0) != 0) return std::nullopt;
  const std::string rest = text.substr(std::string(kScheme).size());
  const size_t question = rest.find('?');
  const std::string address = rest.substr(0, question);
  OpenOcdTarget target;
  size_t colon = address.rfind(':');
  if (!address.empty() && address.front() == '[') {
    const size_t close = address.find(']');
    if (close == std::string::npos || close + 1 != colon) malformed(text, "bad IPv6 address");
    target.host = address.substr(1, close - 1);
  } else {
    if (colon == std::string::npos) malformed(text, "no port");
    target.host = address.substr(0, colon);
  }
  if (target.host.empty() || target.host.size() > 253 ||
      target.host.find_first_not_of("abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ"
                                    "0123456789.-:") != std::string::npos) {
    malformed(text, "bad host");
  }
  target.port = static_cast<uint16_t>(decimal(text, address.substr(colon + 1), 65535, "the port"));
  if (target.port == 0) malformed(text, "the port must be a number from 1 to 65535");
  if (question != std::string::npos) readOptions(text, rest.substr(question + 1), target);
  return target;
}

std::string describeOpenOcdTarget(const OpenOcdTarget& target) {
  const bool v6 = target.host.find(':') != std::string::npos;
  return "OpenOCD at " + (v6 ? "[" + target.host + "]" : target.host) + ":" +
         std::to_string(target.port);
}

std::shared_ptr<HubTransport> openOpenOcd(const OpenOcdTarget& target) {
  Board board = loadBoard(target.board);
  OpenOcdOptions options;
  if (target.timeoutMs != 0) {
    options.connectTimeoutMs = target.timeoutMs;
    options.requestTimeoutMs = target.timeoutMs;
  }
  auto engine = std::make_shared<OpenOcdEngine>(target.host, target.port, board, options);
  engine->connect();  // report a missing OpenOCD or a board that does not match now
  return std::make_shared<HubTransport>(engine, std::move(board));
}

}  // namespace ZinHub
