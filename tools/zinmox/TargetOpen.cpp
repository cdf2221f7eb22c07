// Opening the target of a --target option.
#include "TargetOpen.h"

#include <optional>

#include "Errors.h"
#include "ZinHub/BoardFile.h"
#include "ZinHub/OpenOcdTarget.h"
#include "ZinNet/Endpoint.h"
#include "ZinNet/TcpTransport.h"
#include "ZinSim/Description.h"
#include "ZinSim/Target.h"

namespace zinmox {

namespace {

// The server of a "tcp://HOST:PORT" target, or nothing for a description file.
std::optional<ZinNet::Endpoint> tcpEndpoint(const std::string& targetText) {
  try {
    return ZinNet::parseTcpTarget(targetText);
  } catch (const std::invalid_argument& error) {
    throw UsageError(error.what());
  }
}

// The OpenOCD target of an "openocd://HOST:PORT" text, or nothing.
std::optional<ZinHub::OpenOcdTarget> openOcdTarget(const std::string& targetText) {
  try {
    return ZinHub::parseOpenOcdTarget(targetText);
  } catch (const std::invalid_argument& error) {
    throw UsageError(error.what());
  }
}

}  // namespace

std::shared_ptr<ZinRT::Zin_Transport> openTarget(const std::string& targetText) {
  if (targetText.empty()) return std::make_shared<ZinSim::Target>();
  if (const auto openocd = openOcdTarget(targetText)) {
    try {
      return ZinHub::openOpenOcd(*openocd);
    } catch (const std::runtime_error& error) {
      throw Failure(error.what());
    }
  }
  if (const std::optional<ZinNet::Endpoint> server = tcpEndpoint(targetText)) {
    auto transport = std::make_shared<ZinNet::TcpTransport>(*server);
    try {
      transport->connect();  // report a missing server before any work starts
    } catch (const ZinNet::NetError& error) {
      throw Failure(error.what());
    }
    return transport;
  }
  try {
    return std::make_shared<ZinSim::Target>(ZinSim::loadDescription(targetText));
  } catch (const ZinSim::DescriptionError& error) {
    throw Failure("cannot use the target file " + targetText + ": " + error.what());
  }
}

std::string describeTarget(const std::string& targetText) {
  if (targetText.empty()) return "the built-in demo design";
  if (const auto openocd = openOcdTarget(targetText)) {
    return ZinHub::describeOpenOcdTarget(*openocd);
  }
  if (const std::optional<ZinNet::Endpoint> server = tcpEndpoint(targetText)) {
    return "the target server at " + server->text();
  }
  return targetText;
}

}  // namespace zinmox
