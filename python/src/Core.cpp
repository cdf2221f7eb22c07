// zinmox.Core: lifecycle, information, signal definitions and sizes.
#include "Core.h"

#include <array>
#include <utility>

#include "Convert.h"
#include "ZinMOX/ZinMOX_CoreInfoFields.h"

namespace py = pybind11;

namespace zinmox {

namespace {

uint32_t portCode(const std::string& port) {
  if (port == "sync_out") return ZINMOX_SYNC_OUTPUT;
  if (port == "sync_in") return ZINMOX_SYNC_INPUT;
  if (port == "async_out") return ZINMOX_ASYNC_OUTPUT;
  if (port == "async_in") return ZINMOX_ASYNC_INPUT;
  throw py::value_error("unknown port \"" + port +
                        "\": expected \"sync_out\", \"sync_in\", \"async_out\" or \"async_in\"");
}

void checkName(const std::string& name) {
  if (name.find('\0') != std::string::npos) {
    throw py::value_error("a signal name must not contain a NUL character");
  }
}

std::vector<uint32_t> bitList(const py::handle& bits) {
  if (py::isinstance<py::str>(bits) || py::isinstance<py::bytes>(bits) ||
      !py::isinstance<py::sequence>(bits)) {
    throw py::type_error("bits must be an int or a sequence of ints, not " + typeName(bits));
  }
  std::vector<uint32_t> list;
  for (const py::handle item : py::reinterpret_borrow<py::sequence>(bits)) {
    list.push_back(toUint32(item, "a bit index"));
  }
  return list;
}

}  // namespace

Core::Core(std::shared_ptr<SessionState> session, ZIN_CORE_REF ref)
    : session_(std::move(session)), ref_(ref) {}

void Core::call(const std::string& function,
                const std::function<uint32_t(uint32_t, ZIN_CORE_REF*)>& work) {
  ZIN_CORE_REF ref = ref_;
  session_->call(function, [&](uint32_t handle) { return work(handle, &ref); });
}

void Core::init() {
  call("ZinMOX_initCore",
       [](uint32_t handle, ZIN_CORE_REF* ref) { return ZinMOX_initCore(handle, ref); });
}

void Core::terminate() {
  call("ZinMOX_terminateCore",
       [](uint32_t handle, ZIN_CORE_REF* ref) { return ZinMOX_terminateCore(handle, ref); });
}

py::dict Core::info() {
  ZinRT::ZinMOX_ValueMap map;
  call("ZinMOX_getCoreInfo", [&](uint32_t handle, ZIN_CORE_REF* ref) {
    uintptr_t word = reinterpret_cast<uintptr_t>(&map);
    return ZinMOX_getCoreInfo(handle, ref, &word);
  });
  py::dict info;
  for (const ZinRT::ZinMOX_CoreInfoField& field : ZinRT::ZINMOX_CORE_INFO_FIELDS) {
    const auto found = map.find(field.key);
    info[field.key] = found == map.end() ? py::int_(0) : py::int_(py::str(found->second));
  }
  return info;
}

void Core::define(const std::string& name, const std::string& port, const py::handle& bits) {
  checkName(name);
  const uint32_t code = portCode(port);
  if (py::isinstance<py::int_>(bits) && !py::isinstance<py::bool_>(bits)) {
    const uint32_t bit = toUint32(bits, "a bit index");
    call("ZinMOX_defineSignal", [&](uint32_t handle, ZIN_CORE_REF* ref) {
      return ZinMOX_defineSignal(handle, ref, name.c_str(), code, bit);
    });
    return;
  }
  std::vector<uint32_t> list = bitList(bits);
  const uint32_t none = 0;  // an empty bus is the library's to refuse, with its own message
  call("ZinMOX_defineBus", [&](uint32_t handle, ZIN_CORE_REF* ref) {
    return ZinMOX_defineBus(handle, ref, name.c_str(), code, list.empty() ? &none : list.data(),
                            static_cast<uint32_t>(list.size()));
  });
}

void Core::undefine(const std::string& name, const std::string& port) {
  checkName(name);
  const uint32_t code = portCode(port);
  call("ZinMOX_undefineName", [&](uint32_t handle, ZIN_CORE_REF* ref) {
    return ZinMOX_undefineName(handle, ref, name.c_str(), code);
  });
}

std::vector<uint32_t> Core::sizes(const std::vector<std::string>& names, bool output) {
  std::vector<const char*> pointers;
  for (const std::string& name : names) {
    checkName(name);
    pointers.push_back(name.c_str());
  }
  std::vector<uint32_t> result(names.size(), 0);
  const char* none = "";
  uint32_t noSize = 0;
  call("ZinMOX_getSignalSizes", [&](uint32_t handle, ZIN_CORE_REF* ref) {
    return ZinMOX_getSignalSizes(handle, ref, names.empty() ? &none : pointers.data(),
                                 names.empty() ? &noSize : result.data(),
                                 static_cast<uint32_t>(names.size()), output ? 1 : 0);
  });
  return result;
}

const PortWidths& Core::widths() {
  if (!widths_) {
    ZINMOX_CORE_INFO info{};
    call("ZinMOX_getInfo",
         [&](uint32_t handle, ZIN_CORE_REF* ref) { return ZinMOX_getInfo(handle, ref, &info); });
    widths_ = PortWidths{info.async_output_count, info.sync_output_count, info.async_input_count,
                         info.sync_input_count};
  }
  return *widths_;
}

py::dict infoDict(const ZINMOX_CORE_INFO& info) {
  py::dict dict;
  for (const ZinRT::ZinMOX_CoreInfoField& field : ZinRT::ZINMOX_CORE_INFO_FIELDS) {
    dict[field.key] = info.*field.member;
  }
  return dict;
}

}  // namespace zinmox
