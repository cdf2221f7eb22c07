// Whole-port access: Core.ports.write() and Core.ports.read() over the port-bit calls.
#ifndef ZINMOX_PYTHON_PORTS_H
#define ZINMOX_PYTHON_PORTS_H

#include <pybind11/pybind11.h>

#include <memory>

#include "Core.h"

namespace zinmox {

/// The ports of one core (Core.ports).
class Ports {
 public:
  explicit Ports(std::shared_ptr<Core> core) : core_(std::move(core)) {}

  /// Writes whole output ports from packed vectors (port bit i in bit i % 8 of byte i // 8).
  /// A port given as None is left out of the write; a mask of None updates every bit.
  void write(const pybind11::object& asyncOut, const pybind11::object& syncOut,
             const pybind11::object& asyncMask, const pybind11::object& syncMask);

  /// Reads both input ports with their activity: a dict of packed vectors.
  pybind11::dict read();

 private:
  std::shared_ptr<Core> core_;
};

void bindPorts(pybind11::module_& module);

}  // namespace zinmox

#endif
