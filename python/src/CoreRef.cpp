// Parsing and printing of core references.
#include "CoreRef.h"

#include "Convert.h"

#include <cstdint>
#include <vector>

namespace py = pybind11;

namespace zinmox {

namespace {

constexpr const char* kRefHelp =
    "a core reference is a (device, chain, core) tuple or a \"D:C:I\" text";

uint32_t numberOfText(const std::string& part, const std::string& whole) {
  const bool hex = part.size() > 2 && part[0] == '0' && (part[1] == 'x' || part[1] == 'X');
  const std::string digits = hex ? part.substr(2) : part;
  const std::string allowed = hex ? "0123456789abcdefABCDEF" : "0123456789";
  if (digits.empty() || digits.find_first_not_of(allowed) != std::string::npos) {
    throw py::value_error("malformed core reference \"" + whole + "\": " + kRefHelp);
  }
  const uint64_t limit = UINT32_MAX;
  uint64_t value = 0;
  for (char c : digits) {
    const uint64_t digit = c <= '9' ? c - '0' : (c | 0x20) - 'a' + 10;
    value = value * (hex ? 16 : 10) + digit;
    if (value > limit) {
      throw py::value_error("core reference numbers must be 0 to 4294967295: \"" + whole + "\"");
    }
  }
  return static_cast<uint32_t>(value);
}

ZIN_CORE_REF fromText(const std::string& text) {
  std::vector<std::string> parts(1);
  for (char c : text) {
    if (c == ':') {
      parts.emplace_back();
    } else {
      parts.back() += c;
    }
  }
  if (parts.size() != 3)
    throw py::value_error("malformed core reference \"" + text + "\": " + kRefHelp);
  return {numberOfText(parts[0], text), numberOfText(parts[1], text), numberOfText(parts[2], text)};
}

}  // namespace

ZIN_CORE_REF toCoreRef(const py::handle& ref) {
  if (py::isinstance<py::str>(ref)) return fromText(ref.cast<std::string>());
  if (py::isinstance<py::tuple>(ref) || py::isinstance<py::list>(ref)) {
    const py::sequence items = py::reinterpret_borrow<py::sequence>(ref);
    if (items.size() != 3) throw py::value_error(std::string(kRefHelp) + " of three numbers");
    return {toUint32(items[0], "the device index"), toUint32(items[1], "the user chain number"),
            toUint32(items[2], "the core index")};
  }
  throw py::type_error(std::string(kRefHelp) + ", not " +
                       std::string(py::str(ref.get_type().attr("__name__"))));
}

py::tuple refTuple(const ZIN_CORE_REF& ref) {
  return py::make_tuple(ref.deviceIndex, ref.userChainNumber, ref.coreIndex);
}

std::string refText(const ZIN_CORE_REF& ref) {
  return std::to_string(ref.deviceIndex) + ":" + std::to_string(ref.userChainNumber) + ":" +
         std::to_string(ref.coreIndex);
}

}  // namespace zinmox
