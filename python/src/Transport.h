// What a Session talks to: the one place where the `target` argument becomes a transport.
#ifndef ZINMOX_PYTHON_TRANSPORT_H
#define ZINMOX_PYTHON_TRANSPORT_H

#include <pybind11/pybind11.h>

#include <memory>
#include <string>

#include "ZinRT/Zin_Transport.h"
#include "ZinSim/Target.h"

namespace zinmox {

struct TransportChoice {
  std::shared_ptr<ZinRT::Zin_Transport> transport;
  std::shared_ptr<ZinSim::Target> simulated;  // set when the transport is a simulated target
  std::string description;                    // for repr()
};

/// None: the built-in demo design; "tcp://HOST:PORT": a target server (ConnectionError when it
/// cannot be reached); a str or path-like: a description file; a dict: a description
/// in the description format. Raises TypeError for other types and ValueError for an unusable
/// description (its text names the place of the problem).
TransportChoice makeTransport(const pybind11::object& target);

}  // namespace zinmox

#endif
