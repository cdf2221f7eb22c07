// The one place where a target text becomes a transport.
#ifndef ZINMOX_TOOL_TARGETOPEN_H
#define ZINMOX_TOOL_TARGETOPEN_H

#include <memory>
#include <string>

#include "ZinRT/Zin_Transport.h"

namespace zinmox {

/// Opens the target that `targetText` names: "" is the built-in simulated demo design,
/// "tcp://HOST:PORT" a target server (connected at once), anything else the path of a JSON target
/// description (docs/target.md). Throws Failure with a readable text when the target cannot be
/// opened.
std::shared_ptr<ZinRT::Zin_Transport> openTarget(const std::string& targetText);

/// How the target of `targetText` is named in output: "the built-in demo design" or the file name.
std::string describeTarget(const std::string& targetText);

}  // namespace zinmox

#endif
