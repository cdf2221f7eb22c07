// Target texts: the one place where what a user names as a target becomes a transport.
//
//   ""                  the built-in simulated demo design
//   "tcp://HOST:PORT"   a target server (zinmox serve), connected at once
//   "tls://HOST:PORT"   the same over TLS; the server's certificate is checked
//   "openocd://HOST:PORT[?board=B][&timeout=MS]"  a board behind OpenOCD's Tcl port, connected
//                       and checked against the board description (docs/hardware.md) at once
//   "SCHEME://..."      any other scheme is refused until a transport for it is added
//   anything else       the path of a JSON target description (docs/target.md)
//
// A new transport is one entry in the scheme table of Target.cpp: its prefix, how it is named
// and how it is opened.
#ifndef ZINHOST_TARGET_H
#define ZINHOST_TARGET_H

#include <memory>
#include <stdexcept>
#include <string>

#include "ZinRT/Zin_Transport.h"
#include "ZinSim/Description.h"
#include "ZinSim/Target.h"

namespace ZinHost {

/// An opened target.
struct OpenedTarget {
  std::shared_ptr<ZinRT::Zin_Transport> transport;
  std::shared_ptr<ZinSim::Target> simulated;  // set when the target is simulated in this process
  std::string description;                    // "the built-in demo design", ...
};

/// A target that cannot be used. `kind` tells a malformed text (a usage error) from a target
/// that is unreachable (a server that does not answer) or unusable (a bad description file).
class TargetError : public std::runtime_error {
 public:
  enum class Kind { Malformed, Unreachable, Unusable };
  TargetError(Kind kind, const std::string& text) : std::runtime_error(text), kind_(kind) {}
  Kind kind() const { return kind_; }

 private:
  Kind kind_;
};

/// How to reach a target server beyond its address.
struct ServerAccess {
  /// The token to prove; empty takes the ZINMOX_TOKEN variable when it is set.
  std::string token;
  /// PEM file of the certificate authorities that "tls://" trusts; empty: the system's.
  std::string tlsCaFile;
};

/// Opens the target that `text` names. Throws TargetError.
OpenedTarget openTarget(const std::string& text, const ServerAccess& access = {});

/// Opens a simulated target built from a description held in memory. Throws TargetError
/// (Unusable) naming `origin` when the description has a problem.
OpenedTarget openDescription(const ZinSim::TargetDescription& description,
                             const std::string& origin);

/// How the target of `text` is named in output, without opening it: "the built-in demo
/// design", "the target server at HOST:PORT" or the path of the description file. Throws
/// TargetError (Malformed) for a malformed text.
std::string describeTarget(const std::string& text);

}  // namespace ZinHost

#endif
