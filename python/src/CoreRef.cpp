// Core references from Python: texts parsed and tuples checked by the host library.
#include "CoreRef.h"

#include "Convert.h"
#include "ZinHost/CoreRef.h"

namespace py = pybind11;

namespace zinmox {

namespace {

constexpr const char* kRefHelp =
    "a core reference is a (device, chain, core) tuple or a \"D:C:I\" text";

}  // namespace

ZIN_CORE_REF toCoreRef(const py::handle& ref) {
  if (py::isinstance<py::str>(ref)) return ZinHost::parseCoreRef(ref.cast<std::string>());
  if (py::isinstance<py::tuple>(ref) || py::isinstance<py::list>(ref)) {
    const py::sequence items = py::reinterpret_borrow<py::sequence>(ref);
    if (items.size() != 3) throw py::value_error(std::string(kRefHelp) + " of three numbers");
    const ZIN_CORE_REF parsed{toUint32(items[0], "the device index"),
                              toUint32(items[1], "the user chain number"),
                              toUint32(items[2], "the core index")};
    ZinHost::checkCoreRef(parsed);
    return parsed;
  }
  throw py::type_error(std::string(kRefHelp) + ", not " +
                       std::string(py::str(ref.get_type().attr("__name__"))));
}

py::tuple refTuple(const ZIN_CORE_REF& ref) {
  return py::make_tuple(ref.deviceIndex, ref.userChainNumber, ref.coreIndex);
}

std::string refText(const ZIN_CORE_REF& ref) {
  return ZinHost::formatCoreRef(ref);
}

}  // namespace zinmox
