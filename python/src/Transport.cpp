// Turns the `target` argument of Session into a transport.
#include "Transport.h"

#include <optional>

#include "ZinHub/BoardFile.h"
#include "ZinHub/OpenOcdTarget.h"
#include "ZinNet/Endpoint.h"
#include "ZinNet/TcpTransport.h"
#include "ZinSim/Description.h"

namespace py = pybind11;

namespace zinmox {

namespace {

TransportChoice simulated(std::shared_ptr<ZinSim::Target> target, std::string description) {
  TransportChoice choice;
  choice.transport = target;
  choice.simulated = std::move(target);
  choice.description = std::move(description);
  return choice;
}

TransportChoice fromDescription(const ZinSim::TargetDescription& description, std::string what) {
  try {
    return simulated(std::make_shared<ZinSim::Target>(description), std::move(what));
  } catch (const ZinSim::DescriptionError& error) {
    throw py::value_error(error.what());
  }
}

// "tcp://HOST:PORT": a target server, connected at once so that a missing one is reported here
// (ConnectionError); a malformed address raises ValueError.
TransportChoice fromServer(const std::string& url) {
  std::optional<ZinNet::Endpoint> server;
  try {
    server = ZinNet::parseTcpTarget(url);
  } catch (const std::invalid_argument& error) {
    throw py::value_error(error.what());
  }
  auto transport = std::make_shared<ZinNet::TcpTransport>(*server);
  try {
    transport->connect();
  } catch (const ZinNet::NetError& error) {
    PyErr_SetString(PyExc_ConnectionError, error.what());
    throw py::error_already_set();
  }
  TransportChoice choice;
  choice.transport = std::move(transport);
  choice.description = "target server " + server->text();
  return choice;
}

// "openocd://HOST:PORT[?board=...]": a board behind OpenOCD, connected and checked at once
// (ConnectionError when unreachable or not matching the board; ValueError for a bad text or
// board file).
TransportChoice fromOpenOcd(const std::string& url) {
  std::optional<ZinHub::OpenOcdTarget> target;
  try {
    target = ZinHub::parseOpenOcdTarget(url);
  } catch (const std::invalid_argument& error) {
    throw py::value_error(error.what());
  }
  TransportChoice choice;
  try {
    choice.transport = ZinHub::openOpenOcd(*target);
  } catch (const ZinHub::BoardError& error) {
    throw py::value_error(error.what());
  } catch (const std::runtime_error& error) {
    PyErr_SetString(PyExc_ConnectionError, error.what());
    throw py::error_already_set();
  }
  choice.description = ZinHub::describeOpenOcdTarget(*target);
  return choice;
}

TransportChoice fromPath(const std::string& path) {
  if (path.rfind("tcp://", 0) == 0) return fromServer(path);
  if (path.rfind("openocd://", 0) == 0) return fromOpenOcd(path);
  try {
    return fromDescription(ZinSim::loadDescription(path), "description file " + path);
  } catch (const ZinSim::DescriptionError& error) {
    throw py::value_error(error.what());
  }
}

TransportChoice fromDict(const py::dict& target) {
  const std::string json = py::str(py::module_::import("json").attr("dumps")(target));
  try {
    return fromDescription(ZinSim::parseDescription(json), "description dict");
  } catch (const ZinSim::DescriptionError& error) {
    throw py::value_error(error.what());
  }
}

}  // namespace

TransportChoice makeTransport(const py::object& target) {
  if (target.is_none()) return simulated(std::make_shared<ZinSim::Target>(), "demo design");
  if (py::isinstance<py::dict>(target)) return fromDict(target);
  const py::object pathLike = py::module_::import("os").attr("PathLike");
  if (py::isinstance<py::str>(target) || py::isinstance(target, pathLike)) {
    const py::object path = py::module_::import("os").attr("fsdecode")(target);
    return fromPath(path.cast<std::string>());
  }
  throw py::type_error("target must be None, a description file path or a description dict, not " +
                       std::string(py::str(target.get_type().attr("__name__"))));
}

}  // namespace zinmox
