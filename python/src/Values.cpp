// Core.write() and Core.read(): Python values to hex texts and back.
#include "Values.h"

#include <algorithm>
#include <string>
#include <unordered_set>
#include <utility>
#include <vector>

#include "Convert.h"
#include "ZinHost/ValueText.h"

namespace py = pybind11;

namespace zinmox {

namespace {

constexpr size_t kSteps = 16;

// `digits` hex digits of the little-endian number in `bytes`.
std::string hexText(const std::string& bytes, size_t digits) {
  const auto* data = reinterpret_cast<const uint8_t*>(bytes.data());
  return ZinHost::packedToHex({data, bytes.size()}, 4 * static_cast<uint64_t>(digits));
}

// A value text after the clients' "0x" rule (ValueError otherwise).
std::string valueDigits(const py::handle& text, const std::string& what) {
  return ZinHost::hexDigits(text.cast<std::string>(), what);
}
constexpr const char* kPulseTrain = "pulsetrain";

enum class Kind { Text, Number, Steps };

/// What Core.read() reports per input signal.
struct Reading {
  py::object value;
  py::object activityUp;
  py::object activityDown;
  py::object syncActivityUp;    // None for asynchronous inputs
  py::object syncActivityDown;  // None for asynchronous inputs
};

struct Entry {
  std::string key;
  std::string name;    // before the first dot
  std::string suffix;  // after the first dot
  py::object value;
  Kind kind;
};

Entry makeEntry(const py::handle& key, const py::handle& value) {
  if (!py::isinstance<py::str>(key)) {
    throw py::type_error("signal names must be str, not " + typeName(key));
  }
  Entry entry{
      toCText(key, "a signal name"), {}, {}, py::reinterpret_borrow<py::object>(value), Kind::Text};
  const size_t dot = entry.key.find('.');
  entry.name = entry.key.substr(0, dot);
  entry.suffix = dot == std::string::npos ? std::string() : entry.key.substr(dot + 1);
  if (py::isinstance<py::str>(value)) {
    toCText(value, "the value of \"" + entry.key + "\"");  // the library reads it up to a NUL
    entry.value = py::str(valueDigits(value, "the value of " + entry.key));
    return entry;
  }
  if (py::isinstance<py::int_>(value)) {  // True and False write 1 and 0
    entry.kind = Kind::Number;
  } else if (py::isinstance<py::list>(value) || py::isinstance<py::tuple>(value)) {
    entry.kind = Kind::Steps;
    if (!entry.suffix.empty() && entry.suffix != kPulseTrain) {
      throw py::value_error("a pulse train (16 step values) cannot be written to the key \"" +
                            entry.key + "\"");
    }
  } else {
    throw py::type_error("the value of \"" + entry.key +
                         "\" must be an int, a hex str or a list of 16 steps, not " +
                         typeName(value));
  }
  return entry;
}

std::vector<Entry> collectEntries(const py::object& values, const py::kwargs& signals) {
  std::vector<Entry> entries;
  if (!values.is_none()) {
    const py::object mapping = py::module_::import("collections.abc").attr("Mapping");
    if (!py::isinstance(values, mapping)) {
      throw py::type_error("values must be a mapping of signal names, not " + typeName(values));
    }
    for (const py::handle item : values.attr("items")()) {
      const py::tuple pair = py::reinterpret_borrow<py::tuple>(item);
      entries.push_back(makeEntry(pair[0], pair[1]));
    }
  }
  for (const auto& [key, value] : signals) entries.push_back(makeEntry(key, value));
  return entries;
}

// Bit width and byte count of one value of a signal.
struct Width {
  uint32_t bits;
  size_t bytes;
};

std::string numberBytes(const py::object& value, uint64_t bits, size_t bytes,
                        const std::string& key) {
  if (isNegative(value)) {
    throw py::value_error("the value of \"" + key + "\" must not be negative");
  }
  if (value.attr("bit_length")().cast<uint64_t>() > bits) {
    throw py::value_error("the value " +
                          std::string(py::str(py::module_::import("builtins").attr("hex")(value))) +
                          " of \"" + key + "\" does not fit in " + std::to_string(bits) + " bits");
  }
  return value.attr("to_bytes")(bytes, "little").cast<std::string>();
}

std::string stepBytes(const py::handle& step, const Width& width, const std::string& key) {
  if (py::isinstance<py::str>(step)) {
    const std::vector<uint8_t> block =
        ZinHost::fitHexDigits(valueDigits(step, "a step of " + key), width.bytes);
    return std::string(block.begin(), block.end());
  }
  if (!py::isinstance<py::int_>(step)) {
    throw py::type_error("the steps of \"" + key + "\" must be ints or hex str, not " +
                         typeName(step));
  }
  return numberBytes(py::reinterpret_borrow<py::object>(step), width.bits, width.bytes, key);
}

// The 16 steps packed as the library reads a pulse-train text: step t in bytes
// [t * bytes, (t + 1) * bytes) of the number, so step 0 is the least significant block.
std::string pulseTrainText(const py::sequence& steps, const Width& width, const std::string& key) {
  if (steps.size() != kSteps) {
    throw py::value_error("a pulse train has 16 steps; \"" + key + "\" was given " +
                          std::to_string(steps.size()));
  }
  std::string packed;
  for (const py::handle step : steps) packed += stepBytes(step, width, key);
  return hexText(packed, 64 * width.bytes);
}

std::string valueText(const Entry& entry, const Width& width) {
  if (entry.kind == Kind::Steps) {
    return pulseTrainText(py::reinterpret_borrow<py::sequence>(entry.value), width, entry.key);
  }
  if (entry.suffix == kPulseTrain) {  // a number holding the 16 packed steps
    const std::string bytes =
        numberBytes(entry.value, 128ull * width.bytes, 16 * width.bytes, entry.key);
    return hexText(bytes, 64 * width.bytes);
  }
  return hexText(numberBytes(entry.value, width.bits, width.bytes, entry.key), 2 * width.bytes);
}

// Widths of the signals that int values and pulse trains are written to, in one call.
std::vector<Width> widthsOf(Core& core, const std::vector<Entry>& entries) {
  std::vector<std::string> names;
  for (const Entry& entry : entries) {
    if (entry.kind != Kind::Text) names.push_back(entry.name);
  }
  std::vector<Width> widths(entries.size(), Width{0, 0});
  if (names.empty()) return widths;
  const std::vector<uint32_t> sizes = core.sizes(names, true);
  size_t next = 0;
  for (size_t i = 0; i < entries.size(); ++i) {
    if (entries[i].kind == Kind::Text) continue;
    const uint32_t bits = sizes[next++];
    widths[i] = Width{bits, (static_cast<size_t>(bits) + 7) / 8};
  }
  return widths;
}

py::object hexNumber(const ZinRT::ZinMOX_ValueMap& map, const std::string& key) {
  const auto found = map.find(key);
  if (found == map.end()) return py::none();
  PyObject* number = PyLong_FromString(found->second.c_str(), nullptr, 16);
  if (number == nullptr) throw py::error_already_set();
  return py::reinterpret_steal<py::object>(number);
}

}  // namespace

void writeValues(Core& core, const py::object& values, const py::kwargs& signals) {
  const std::vector<Entry> entries = collectEntries(values, signals);
  const std::vector<Width> widths = widthsOf(core, entries);
  ZinRT::ZinMOX_ValueMap map;
  for (size_t i = 0; i < entries.size(); ++i) {
    const Entry& entry = entries[i];
    const std::string key = entry.kind == Kind::Steps ? entry.name + "." + kPulseTrain : entry.key;
    const std::string text =
        entry.kind == Kind::Text ? entry.value.cast<std::string>() : valueText(entry, widths[i]);
    if (!map.emplace(key, text).second) {
      throw py::value_error("the key \"" + key + "\" is given twice");
    }
  }
  core.call("ZinMOX_writeValues", [&](uint32_t handle, ZIN_CORE_REF* ref) {
    uintptr_t word = reinterpret_cast<uintptr_t>(&map);
    return ZinMOX_writeValues(handle, ref, &word);
  });
}

py::dict readValues(Core& core) {
  ZinRT::ZinMOX_ValueMap map;
  core.call("ZinMOX_readValues", [&](uint32_t handle, ZIN_CORE_REF* ref) {
    uintptr_t word = reinterpret_cast<uintptr_t>(&map);
    return ZinMOX_readValues(handle, ref, &word);
  });
  // A signal N comes with the keys N.value, N.activity_up and N.activity_down; names may
  // themselves hold dots, so the names are found by these companions, not by splitting keys.
  std::vector<std::string> names;
  for (const auto& [key, text] : map) {
    if (map.count(key + ".value") && map.count(key + ".activity_up") &&
        map.count(key + ".activity_down")) {
      names.push_back(key);
    }
  }
  std::sort(names.begin(), names.end());
  py::dict readings;
  for (const std::string& name : names) {
    readings[py::str(name)] = py::cast(
        Reading{hexNumber(map, name + ".value"), hexNumber(map, name + ".activity_up"),
                hexNumber(map, name + ".activity_down"), hexNumber(map, name + ".sync_activity_up"),
                hexNumber(map, name + ".sync_activity_down")});
  }
  return readings;
}

}  // namespace zinmox

namespace zinmox {

namespace {

std::string hexOrNone(const py::object& number) {
  if (number.is_none()) return "None";
  return py::str(py::module_::import("builtins").attr("hex")(number));
}

bool sameReading(const Reading& a, const Reading& b) {
  return a.value.equal(b.value) && a.activityUp.equal(b.activityUp) &&
         a.activityDown.equal(b.activityDown) && a.syncActivityUp.equal(b.syncActivityUp) &&
         a.syncActivityDown.equal(b.syncActivityDown);
}

}  // namespace

void bindValues(py::module_& module) {
  py::class_<Reading>(module, "Reading",
                      "What Core.read() reports for one input signal. Each field is an int whose "
                      "bit i belongs to bit i of the signal; the two sync fields are None for "
                      "asynchronous inputs.")
      .def(py::init([](py::object value, py::object up, py::object down, py::object syncUp,
                       py::object syncDown) {
             return Reading{std::move(value), std::move(up), std::move(down), std::move(syncUp),
                            std::move(syncDown)};
           }),
           py::arg("value"), py::arg("activity_up"), py::arg("activity_down"),
           py::arg("sync_activity_up") = py::none(), py::arg("sync_activity_down") = py::none())
      .def_readonly("value", &Reading::value, "Current level of each bit.")
      .def_readonly("activity_up", &Reading::activityUp, "Rising changes since the last read.")
      .def_readonly("activity_down", &Reading::activityDown, "Falling changes since the last read.")
      .def_readonly("sync_activity_up", &Reading::syncActivityUp,
                    "Rises between two clock samples since the last read (synchronous inputs).")
      .def_readonly("sync_activity_down", &Reading::syncActivityDown,
                    "Falls between two clock samples since the last read (synchronous inputs).")
      .def("__eq__",
           [](const Reading& self, const py::object& other) -> py::object {
             if (!py::isinstance<Reading>(other))
               return py::reinterpret_borrow<py::object>(Py_NotImplemented);
             return py::bool_(sameReading(self, other.cast<const Reading&>()));
           })
      .def("__repr__", [](const Reading& self) {
        return "Reading(value=" + hexOrNone(self.value) +
               ", activity_up=" + hexOrNone(self.activityUp) +
               ", activity_down=" + hexOrNone(self.activityDown) +
               ", sync_activity_up=" + hexOrNone(self.syncActivityUp) +
               ", sync_activity_down=" + hexOrNone(self.syncActivityDown) + ")";
      });
}

}  // namespace zinmox
