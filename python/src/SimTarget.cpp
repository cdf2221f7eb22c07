// zinmox.SimTarget: the simulated target behind a session, for test benches.
#include "SimTarget.h"

#include <pybind11/stl.h>

#include <memory>
#include <stdexcept>
#include <string>
#include <vector>

#include "Convert.h"
#include "CoreRef.h"
#include "Gil.h"
#include "ZinSim/Target.h"

namespace py = pybind11;

namespace zinmox {

namespace {

using Target = ZinSim::Target;
using ZinSim::InputSource;

ZinSim::InputPort inputPort(const std::string& port) {
  if (port == "async_in") return ZinSim::InputPort::Async;
  if (port == "sync_in") return ZinSim::InputPort::Sync;
  throw py::value_error("unknown input port \"" + port +
                        "\": expected \"async_in\" or \"sync_in\"");
}

ZinSim::OutputPort outputPort(const py::handle& port) {
  const std::string name = toCText(port, "output");
  if (name == "async" || name == "async_out") return ZinSim::OutputPort::Async;
  if (name == "sync" || name == "sync_out") return ZinSim::OutputPort::Sync;
  throw py::value_error("unknown output port \"" + name + "\": expected \"async\" or \"sync\"");
}

uint64_t toUint64(const py::handle& value, const std::string& what) {
  if (!py::isinstance<py::int_>(value) || py::isinstance<py::bool_>(value)) {
    throw py::type_error(what + " must be an int, not " + typeName(value));
  }
  const int tooBig = PyObject_RichCompareBool(value.ptr(), py::int_(UINT64_MAX).ptr(), Py_GT);
  if (tooBig < 0) throw py::error_already_set();
  if (isNegative(value) || tooBig == 1) {
    throw py::value_error(what + " must be 0 to 18446744073709551615, not " +
                          std::string(py::str(value)));
  }
  return value.cast<uint64_t>();
}

// Advances every MOX core, refusing a step that would carry a cycle count past 2**64-1 (the
// counts would wrap and the cores' waveforms jump back to cycle 0).
void advance(Target& target, uint64_t cycles) {
  std::vector<ZIN_CORE_REF> refs;
  target.listCores(refs);
  for (const ZIN_CORE_REF& ref : refs) {
    uint64_t now = 0;
    try {
      now = target.cycle(ref);
    } catch (const std::invalid_argument&) {
      continue;  // not a MOX core: it has no clock
    }
    if (cycles > UINT64_MAX - now) {
      throw std::overflow_error("advancing " + std::to_string(cycles) +
                                " cycles would carry the "
                                "cycle count of core " +
                                refText(ref) + " (" + std::to_string(now) + ") past 2**64-1");
    }
  }
  target.advance(cycles);
}

// The keys of a source dict other than "kind" that its kind accepts.
void checkKeys(const py::dict& source, const std::vector<std::string>& allowed) {
  for (const auto& [key, value] : source) {
    const std::string name = toCText(key, "a source key");
    if (name == "kind") continue;
    bool known = false;
    for (const std::string& a : allowed) known = known || a == name;
    if (!known) throw py::value_error("unknown key \"" + name + "\" in an input source");
  }
}

py::object entry(const py::dict& source, const char* key, py::object fallback) {
  return source.contains(key) ? py::reinterpret_borrow<py::object>(source[key]) : fallback;
}

InputSource sourceFromDict(const py::dict& source) {
  if (!source.contains("kind")) throw py::value_error("an input source needs a \"kind\"");
  const std::string kind = toCText(source["kind"], "kind");
  if (kind == "constant") {
    checkKeys(source, {"value"});
    const uint64_t value = toUint64(entry(source, "value", py::int_(0)), "value");
    if (value > 1) throw py::value_error("a constant source is 0 or 1");
    return InputSource::constant(value == 1);
  }
  if (kind == "loopback") {
    checkKeys(source, {"output", "bit"});
    if (!source.contains("output")) throw py::value_error("a loopback source needs an \"output\"");
    return InputSource::loopback(outputPort(source["output"]),
                                 toUint32(entry(source, "bit", py::int_(0)), "bit"));
  }
  if (kind == "counter") {
    checkKeys(source, {"bit"});
    return InputSource::counter(toUint32(entry(source, "bit", py::int_(0)), "bit"));
  }
  if (kind == "square") {
    checkKeys(source, {"period", "phase"});
    if (!source.contains("period")) throw py::value_error("a square source needs a \"period\"");
    return InputSource::square(toUint64(source["period"], "period"),
                               toUint64(entry(source, "phase", py::int_(0)), "phase"));
  }
  throw py::value_error("unknown source kind \"" + kind +
                        "\": expected \"constant\", \"loopback\", \"counter\" or \"square\"");
}

InputSource toSource(const py::handle& source) {
  if (py::isinstance<py::dict>(source))
    return sourceFromDict(py::reinterpret_borrow<py::dict>(source));
  if (py::isinstance<py::int_>(source)) {
    const uint64_t level = toUint64(source, "a constant level");
    if (level > 1) throw py::value_error("a constant level is 0 or 1");
    return InputSource::constant(level == 1);
  }
  throw py::type_error("source must be 0, 1 or a source dict, not " + typeName(source));
}

// A level text ('0'/'1', character i = port bit i) as an int with bit i = port bit i.
py::int_ levelsNumber(const std::string& levels) {
  if (levels.empty()) return py::int_(0);
  const std::string reversed(levels.rbegin(), levels.rend());
  PyObject* number = PyLong_FromString(reversed.c_str(), nullptr, 2);
  if (number == nullptr) throw py::error_already_set();
  return py::reinterpret_steal<py::int_>(number);
}

std::string levelsText(const Target& target, const ZIN_CORE_REF& ref, const std::string& port) {
  if (port == "async_out") return target.asyncOutputLevels(ref);
  if (port == "sync_out") return target.syncOutputLevels(ref);
  if (port == "async_in") return target.asyncInputLevels(ref);
  if (port == "sync_in") return target.syncInputLevels(ref);
  throw py::value_error("unknown port \"" + port +
                        "\": expected \"sync_out\", \"sync_in\", \"async_out\" or \"async_in\"");
}

}  // namespace

void bindSimTarget(py::module_& module) {
  using Ptr = std::shared_ptr<Target>;
  using py::arg;
  // The short calls below keep the GIL: they only take the target's mutex, which no holder
  // keeps while waiting for the GIL. The long ones release it through withoutGil.
  py::class_<Target, Ptr>(module, "SimTarget",
                          "The simulated target behind a session (Session.target), for test "
                          "benches. Core references are tuples or \"D:C:I\" texts; ports are "
                          "named \"async_out\", \"sync_out\", \"async_in\" and \"sync_in\".")
      .def(
          "set_input",
          [](Target& target, const py::handle& ref, const std::string& port, uint32_t bit,
             const py::handle& source) {
            const ZIN_CORE_REF core = toCoreRef(ref);
            const InputSource input = toSource(source);
            const ZinSim::InputPort which = inputPort(port);
            withoutGil([&] { target.setInputSource(core, which, bit, input); });
          },
          arg("ref"), arg("port"), arg("bit"), arg("source"),
          "Rewires one input bit. source: 0 or 1 (a constant level) or a dict as in a target "
          "description: {\"kind\": \"constant\", \"value\": 1}, {\"kind\": \"loopback\", "
          "\"output\": \"async\", \"bit\": 3}, {\"kind\": \"counter\", \"bit\": 0} or "
          "{\"kind\": \"square\", \"period\": 8, \"phase\": 0}. A changed level counts as "
          "activity. ValueError for a bit or a source the core does not have.")
      .def(
          "advance",
          [](Target& target, const py::handle& cycles) {
            const uint64_t count = toUint64(cycles, "cycles");
            withoutGil([&] { advance(target, count); });
          },
          arg("cycles"),
          "Lets `cycles` clock cycles pass on every MOX core. OverflowError when a core's cycle "
          "count would pass 2**64-1.")
      .def("set_cycles_per_sequence", &Target::setCyclesPerSequence, arg("cycles"),
           "Sets the cycles that pass with each command sequence, for every MOX core.")
      .def(
          "levels",
          [](const Target& target, const py::handle& ref, const std::string& port) {
            const ZIN_CORE_REF core = toCoreRef(ref);
            const std::string text = withoutGil([&] { return levelsText(target, core, port); });
            return levelsNumber(text);
          },
          arg("ref"), arg("port"),
          "The levels of a port as an int, bit i = port bit i: outputs as they drive the design "
          "now (synchronous outputs at the current cycle), asynchronous inputs now, synchronous "
          "inputs as sampled at the last clock edge.")
      .def(
          "cycle",
          [](const Target& target, const py::handle& ref) {
            const ZIN_CORE_REF core = toCoreRef(ref);
            return withoutGil([&] { return target.cycle(core); });
          },
          arg("ref"), "The clock cycle count of a core.")
      .def("command_log", &Target::commandLog,
           "The texts of the latest command sequences received, oldest first.")
      .def("clear_command_log", &Target::clearCommandLog)
      .def_property_readonly("flush_count", &Target::flushCount, "Flushes received.")
      .def(
          "fail_next_transfer",
          [](Target& target, const std::string& message) { target.failNextTransfer(message); },
          arg("message"),
          "The next command sequence fails with `message` instead of taking effect.")
      .def(
          "fail_next_status_read",
          [](Target& target, const std::string& message) {
            target.failNextStatusRead(std::make_exception_ptr(std::runtime_error(message)));
          },
          arg("message"), "The next status read fails with `message`.");
}

}  // namespace zinmox
