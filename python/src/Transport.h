// What a Session talks to: the `target` argument becomes a target of the host library.
#ifndef ZINMOX_PYTHON_TRANSPORT_H
#define ZINMOX_PYTHON_TRANSPORT_H

#include <pybind11/pybind11.h>

#include "ZinHost/Target.h"

namespace zinmox {

using TransportChoice = ZinHost::OpenedTarget;

/// None: the built-in demo design; a str or path-like: a target text of the host library
/// ("tcp://HOST:PORT", "tls://HOST:PORT" or a description file); a dict: a description in the
/// description format. Raises TypeError for other types; ZinHost::TargetError becomes ValueError,
/// or ConnectionError for a server that cannot be reached. `access` holds the token and the CA file
/// for a server.
TransportChoice makeTransport(const pybind11::object& target,
                              const ZinHost::ServerAccess& access = {});

}  // namespace zinmox

#endif
