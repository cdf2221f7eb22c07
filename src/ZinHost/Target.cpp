// Opening targets by their texts.
#include "ZinHost/Target.h"

#include <string_view>

#include "ZinHost/TextError.h"
#include "ZinNet/Endpoint.h"
#include "ZinNet/TcpTransport.h"

namespace ZinHost {

namespace {

using Kind = TargetError::Kind;

ZinNet::Endpoint tcpEndpoint(const std::string& text) {
  try {
    return *ZinNet::parseTcpTarget(text);
  } catch (const std::invalid_argument& error) {
    throw TargetError(Kind::Malformed, error.what());
  }
}

std::string describeTcp(const std::string& text) {
  return "the target server at " + tcpEndpoint(text).text();
}

OpenedTarget openTcp(const std::string& text) {
  auto transport = std::make_shared<ZinNet::TcpTransport>(tcpEndpoint(text));
  try {
    transport->connect();  // report a missing server before any work starts
  } catch (const ZinNet::NetError& error) {
    throw TargetError(Kind::Unreachable, error.what());
  }
  return {transport, nullptr, describeTcp(text)};
}

// A transport reached by a "SCHEME://" text.
struct Scheme {
  const char* prefix;
  std::string (*describe)(const std::string& text);
  OpenedTarget (*open)(const std::string& text);
};

const Scheme kSchemes[] = {
    {"tcp://", describeTcp, openTcp},
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
    throw TargetError(Kind::Malformed, "unknown target kind '" + text.substr(0, colon + 3) +
                                           "' in '" + quoteShort(text) +
                                           "' (use tcp://HOST:PORT or a description file)");
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

OpenedTarget openTarget(const std::string& text) {
  if (text.empty()) {
    auto target = std::make_shared<ZinSim::Target>();
    return {target, target, describeTarget(text)};
  }
  if (const Scheme* scheme = schemeOf(text)) return scheme->open(text);
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
