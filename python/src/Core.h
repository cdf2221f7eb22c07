// One MOX core of a session, as zinmox.Core: lifecycle, information and the signal table.
#ifndef ZINMOX_PYTHON_CORE_H
#define ZINMOX_PYTHON_CORE_H

#include <pybind11/pybind11.h>

#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "Session.h"
#include "ZinMOX/ZinMOX.h"

namespace zinmox {

/// The widths in bits of a core's four ports.
struct PortWidths {
  uint32_t asyncOut = 0;
  uint32_t syncOut = 0;
  uint32_t asyncIn = 0;
  uint32_t syncIn = 0;
};

class Core {
 public:
  Core(std::shared_ptr<SessionState> session, ZIN_CORE_REF ref);

  const ZIN_CORE_REF& ref() const { return ref_; }
  SessionState& session() { return *session_; }

  /// Runs one exported call on this core (see SessionState::call).
  void call(const std::string& function,
            const std::function<uint32_t(uint32_t, ZIN_CORE_REF*)>& work);

  void init();
  void terminate();
  pybind11::dict info();
  void define(const std::string& name, const std::string& port, const pybind11::handle& bits);
  void undefine(const std::string& name, const std::string& port);
  std::vector<uint32_t> sizes(const std::vector<std::string>& names, bool output);

  /// The port widths from the core's status, read once.
  const PortWidths& widths();

 private:
  std::shared_ptr<SessionState> session_;
  ZIN_CORE_REF ref_;
  std::optional<PortWidths> widths_;
};

/// The twelve fields of the information record as a dict of ints, in field order.
pybind11::dict infoDict(const ZINMOX_CORE_INFO& info);

void bindCore(pybind11::module_& module);

}  // namespace zinmox

#endif
