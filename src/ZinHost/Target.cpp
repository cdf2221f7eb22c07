// Opening targets by their texts.
#include "ZinHost/Target.h"

#include <string_view>

#include "ZinHost/TextError.h"
#include "ZinHub/BoardFile.h"
#include "ZinHub/OpenOcdTarget.h"
#include "ZinNet/Endpoint.h"
#include "ZinNet/TcpTransport.h"
#include "ZinNet/Token.h"

namespace ZinHost {

namespace {

using Kind = TargetError::Kind;

bool isTls(const std::string& text) {
  return text.rfind("tls://", 0) == 0;
}

ZinNet::Endpoint serverEndpoint(const std::string& text) {
  try {
    return isTls(text) ? *ZinNet::parseTlsTarget(text) : *ZinNet::parseTcpTarget(text);
  } catch (const std::invalid_argument& error) {
    throw TargetError(Kind::Malformed, error.what());
  }
}

std::string describeServer(const std::string& text) {
  return "the target server at " + serverEndpoint(text).text() + (isTls(text) ? " (TLS)" : "");
}

ZinNet::ClientOptions clientOptions(const std::string& text, const ServerAccess& access) {
  ZinNet::ClientOptions options;
  options.tls = isTls(text);
  options.tlsCaFile = access.tlsCaFile;
  try {
    options.token = access.token.empty() ? ZinNet::tokenFromEnvironment() : access.token;
    if (!options.token.empty()) ZinNet::checkToken(options.token, "the given token");
  } catch (const std::invalid_argument& error) {
    throw TargetError(Kind::Malformed, error.what());
  }
  return options;
}

OpenedTarget openServer(const std::string& text, const ServerAccess& access) {
  auto transport =
      std::make_shared<ZinNet::TcpTransport>(serverEndpoint(text), clientOptions(text, access));
  try {
    transport->connect();  // report a missing server before any work starts
  } catch (const ZinNet::NetError& error) {
    throw TargetError(Kind::Unreachable, error.what());
  }
  return {transport, nullptr, describeServer(text)};
}

ZinHub::OpenOcdTarget openOcdTarget(const std::string& text) {
  try {
    return *ZinHub::parseOpenOcdTarget(text);
  } catch (const std::invalid_argument& error) {
    throw TargetError(Kind::Malformed, error.what());
  }
}

std::string describeOpenOcd(const std::string& text) {
  return ZinHub::describeOpenOcdTarget(openOcdTarget(text));
}

// A board behind OpenOCD: connected and checked against the board description at once.
OpenedTarget openOpenOcd(const std::string& text, const ServerAccess&) {
  const ZinHub::OpenOcdTarget target = openOcdTarget(text);
  try {
    return {ZinHub::openOpenOcd(target), nullptr, describeOpenOcd(text)};
  } catch (const ZinHub::BoardError& error) {
    throw TargetError(Kind::Unusable, error.what());
  } catch (const std::runtime_error& error) {
    throw TargetError(Kind::Unreachable, error.what());
  }
}

// A transport reached by a "SCHEME://" text.
struct Scheme {
  const char* prefix;
  std::string (*describe)(const std::string& text);
  OpenedTarget (*open)(const std::string& text, const ServerAccess& access);
};

const Scheme kSchemes[] = {
    {"tcp://", describeServer, openServer},
    {"tls://", describeServer, openServer},
    {"openocd://", describeOpenOcd, openOpenOcd},
};

// The scheme of a "SCHEME://..." text; nullptr for a file path. An unknown scheme is refused
// rather than taken for a file name.
const Scheme* schemeOf(const std::string& text) {
  for (const Scheme& scheme : kSchemes) {
    if (text.rfind(scheme.prefix, 0) == 0) return &scheme;
  }
  const size_t colon = text.find("://");
  const bool named = colon != std::string::npos && colon > 0 &&
                     text.find_first_not_of("abcdefghijklmnopqrstuvwxyz0123456789+.-") == colon;
  if (named) {
    throw TargetError(
        Kind::Malformed,
        "unknown target kind '" + text.substr(0, colon + 3) + "' in '" + quoteShort(text) +
            "' (use tcp://HOST:PORT, tls://HOST:PORT, openocd://HOST:PORT or a description "
            "file)");
  }
  return nullptr;
}

}  // namespace

OpenedTarget openDescription(const ZinSim::TargetDescription& description,
                             const std::string& origin) {
  try {
    auto target = std::make_shared<ZinSim::Target>(description);
    return {target, target, origin};
  } catch (const ZinSim::DescriptionError& error) {
    throw TargetError(Kind::Unusable, "cannot use " + origin + ": " + error.what());
  }
}

OpenedTarget openTarget(const std::string& text, const ServerAccess& access) {
  if (text.empty()) {
    auto target = std::make_shared<ZinSim::Target>();
    return {target, target, describeTarget(text)};
  }
  if (const Scheme* scheme = schemeOf(text)) return scheme->open(text, access);
  const std::string origin = "the target file " + text;
  try {
    auto target = std::make_shared<ZinSim::Target>(ZinSim::loadDescription(text));
    return {target, target, text};
  } catch (const ZinSim::DescriptionError& error) {
    throw TargetError(Kind::Unusable, "cannot use " + origin + ": " + error.what());
  }
}

std::string describeTarget(const std::string& text) {
  if (text.empty()) return "the built-in demo design";
  if (const Scheme* scheme = schemeOf(text)) return scheme->describe(text);
  return text;
}

}  // namespace ZinHost
