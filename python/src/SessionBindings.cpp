// zinmox.Session: opening on a target, context management, scanning, cores.
#include <memory>
#include <vector>

#include "Core.h"
#include "CoreRef.h"
#include "Session.h"
#include "ZinMOX/ZinMOX.h"
#include "ZinRT/ZinJtag.h"

namespace py = pybind11;

namespace zinmox {

namespace {

using Ptr = std::shared_ptr<SessionState>;

struct ScanEntry {
  ZIN_CORE_REF ref;
  bool mox;
  ZINMOX_CORE_INFO info;
};

std::vector<ZIN_CORE_REF> listCores(SessionState& session) {
  std::vector<ZIN_CORE_REF> refs;
  bool listed = false;
  session.run([&](uint32_t handle) {
    ZinJtag_session_withTransport(
        handle, [&](ZinRT::Zin_Transport& transport) { listed = transport.listCores(refs); });
  });
  if (!listed) throw Failure("scan", {}, "This target cannot list its cores.");
  return refs;
}

ScanEntry probe(SessionState& session, ZIN_CORE_REF ref) {
  ScanEntry entry{ref, false, {}};
  uint32_t isMox = 0;
  session.call("ZinMOX_isMOXCore",
               [&](uint32_t handle) { return ZinMOX_isMOXCore(handle, &entry.ref, &isMox); });
  entry.mox = isMox == 1;
  if (entry.mox) {
    session.call("ZinMOX_getInfo",
                 [&](uint32_t handle) { return ZinMOX_getInfo(handle, &entry.ref, &entry.info); });
  }
  return entry;
}

py::list scan(SessionState& session) {
  py::list cores;
  for (const ZIN_CORE_REF& ref : listCores(session)) {
    const ScanEntry entry = probe(session, ref);
    py::dict item;
    item["ref"] = refTuple(entry.ref);
    item["mox"] = entry.mox;
    item["info"] = entry.mox ? py::object(infoDict(entry.info)) : py::object(py::none());
    cores.append(item);
  }
  return cores;
}

}  // namespace

void bindSession(py::module_& module) {
  using py::arg;
  py::class_<SessionState, Ptr>(
      module, "Session",
      "A JTAG session on a target.\n\n"
      "target: None for the built-in simulated demo design, the path of a target description "
      "file, \"tcp://HOST:PORT\" of a target server (zinmox serve), \"tls://HOST:PORT\" of one "
      "that speaks TLS, \"openocd://HOST:PORT\" of OpenOCD's Tcl port, or a dict in the "
      "description format. token: the token a target server requires (default: the ZINMOX_TOKEN "
      "variable when set); tls_ca: PEM file of the certificate authorities for tls:// (default: "
      "the system's). A context manager: leaving the with block closes the session.")
      .def(py::init(
               [](const py::object& target, const std::string& token, const std::string& tlsCa) {
                 return std::make_shared<SessionState>(makeTransport(target, {token, tlsCa}));
               }),
           arg("target") = py::none(), py::kw_only(), arg("token") = "", arg("tls_ca") = "")
      .def("close", &SessionState::close,
           "Closes the session; the cores initialised on it are dropped. Closing twice does "
           "nothing. Later calls on the session or its cores raise zinmox.Error.")
      .def_property_readonly("closed", &SessionState::closed, "Whether the session is closed.")
      .def_property_readonly("handle", &SessionState::handle,
                             "The JTAG session handle (0 once closed).")
      .def_property_readonly(
          "target",
          [](const SessionState& self) -> py::object {
            if (!self.simulated()) return py::none();
            return py::cast(self.simulated());
          },
          "The zinmox.SimTarget behind the session, or None when it is not simulated.")
      .def("__enter__", [](const Ptr& self) { return self; })
      .def("__exit__",
           [](SessionState& self, const py::args&) {
             self.close();
             return false;
           })
      .def("scan", &scan,
           "Lists the cores of the target: a list of dicts with \"ref\" (a tuple), \"mox\" "
           "(whether it is a MOX core) and \"info\" (the twelve information fields of a MOX "
           "core as ints, else None).")
      .def(
          "core",
          [](const Ptr& self, const py::handle& ref) {
            return std::make_shared<Core>(self, toCoreRef(ref));
          },
          arg("ref"),
          "The core at `ref`: a (device, chain, core) tuple or a \"D:C:I\" text (numbers decimal "
          "or 0x hex). Nothing is read or initialised; call Core.init() first.")
      .def("__repr__", [](const SessionState& self) {
        const std::string state =
            self.closed() ? "closed" : "handle " + std::to_string(self.handle());
        return "<zinmox.Session on " + self.description() + ", " + state + ">";
      });
}

}  // namespace zinmox
