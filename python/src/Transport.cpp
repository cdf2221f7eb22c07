// Turns the `target` argument of Session into a target.
#include "Transport.h"

namespace py = pybind11;

namespace zinmox {

namespace {

TransportChoice fromDict(const py::dict& target) {
  const std::string json = py::str(py::module_::import("json").attr("dumps")(target));
  ZinSim::TargetDescription description;
  try {
    description = ZinSim::parseDescription(json);
  } catch (const ZinSim::DescriptionError& error) {
    throw py::value_error(error.what());
  }
  return ZinHost::openDescription(description, "a description dict");
}

}  // namespace

TransportChoice makeTransport(const py::object& target, const ZinHost::ServerAccess& access) {
  if (target.is_none()) return ZinHost::openTarget("");
  if (py::isinstance<py::dict>(target)) return fromDict(target);
  const py::object pathLike = py::module_::import("os").attr("PathLike");
  if (py::isinstance<py::str>(target) || py::isinstance(target, pathLike)) {
    const py::object text = py::module_::import("os").attr("fsdecode")(target);
    return ZinHost::openTarget(text.cast<std::string>(), access);
  }
  throw py::type_error("target must be None, a description file path or a description dict, not " +
                       std::string(py::str(target.get_type().attr("__name__"))));
}

}  // namespace zinmox
