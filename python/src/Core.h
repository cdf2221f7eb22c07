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
  /// The twelve fields of a fresh status read (the core need not be initialised).
  pybind11::dict infoFields();
  /// Names port bits: `bits` is an int, a sequence of ints or a bit-list text. Names with '.'
  /// or '=' and bits listed twice raise ValueError; a name that is not a str, TypeError.
  void define(const pybind11::handle& name, const pybind11::handle& port,
              const pybind11::handle& bits);
  void undefine(const pybind11::handle& name, const pybind11::handle& port);
  std::vector<uint32_t> sizes(const std::vector<std::string>& names, bool output);

  /// The core's information from its status (port widths and versions), read once.
  const ZINMOX_CORE_INFO& info();
  /// The port widths of info().
  PortWidths widths();

 private:
  std::shared_ptr<SessionState> session_;
  ZIN_CORE_REF ref_;
  std::optional<ZINMOX_CORE_INFO> info_;
};

/// The twelve fields of the information record as a dict of ints, in field order.
pybind11::dict infoDict(const ZINMOX_CORE_INFO& info);

void bindCore(pybind11::module_& module);

}  // namespace zinmox

#endif
