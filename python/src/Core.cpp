// zinmox.Core: lifecycle, information, signal definitions and sizes.
#include "Core.h"

#include <array>
#include <utility>

#include "Convert.h"
#include "ZinHost/BitList.h"
#include "ZinHost/Signals.h"
#include "internal/ZinMOX_CoreInfoFields.h"

namespace py = pybind11;

namespace zinmox {

namespace {

void checkName(const std::string& name) {
  if (name.find('\0') != std::string::npos) {
    throw py::value_error("a signal name must not contain a NUL character");
  }
}

// A sequence of bit numbers, or a bit-list text ("0-7") capped at the port's width; either
// without a bit listed twice.
std::vector<uint32_t> bitList(Core& core, ZinHost::Port port, const py::handle& bits) {
  if (py::isinstance<py::str>(bits)) {
    return ZinHost::parseBitList(bits.cast<std::string>(), ZinHost::portWidth(core.info(), port));
  }
  if (py::isinstance<py::bytes>(bits) || !py::isinstance<py::sequence>(bits)) {
    throw py::type_error("bits must be an int, a sequence of ints or a bit-list str, not " +
                         typeName(bits));
  }
  std::vector<uint32_t> list;
  for (const py::handle item : py::reinterpret_borrow<py::sequence>(bits)) {
    list.push_back(toUint32(item, "a bit index"));
  }
  ZinHost::checkBitList(list, UINT32_MAX);  // the width is the library's to check
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

py::dict Core::infoFields() {
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

void Core::define(const py::handle& nameObject, const py::handle& portObject,
                  const py::handle& bits) {
  const std::string name = toCText(nameObject, "a signal name");
  const ZinHost::Port port = ZinHost::parsePort(toCText(portObject, "the port"));
  ZinHost::checkSignalName(name, port);
  const uint32_t code = ZinHost::portSignalType(port);
  if (py::isinstance<py::int_>(bits) && !py::isinstance<py::bool_>(bits)) {
    const uint32_t bit = toUint32(bits, "a bit index");
    call("ZinMOX_defineSignal", [&](uint32_t handle, ZIN_CORE_REF* ref) {
      return ZinMOX_defineSignal(handle, ref, name.c_str(), code, bit);
    });
    return;
  }
  std::vector<uint32_t> list = bitList(*this, port, bits);
  const uint32_t none = 0;  // an empty bus is the library's to refuse, with its own message
  call("ZinMOX_defineBus", [&](uint32_t handle, ZIN_CORE_REF* ref) {
    return ZinMOX_defineBus(handle, ref, name.c_str(), code, list.empty() ? &none : list.data(),
                            static_cast<uint32_t>(list.size()));
  });
}

void Core::undefine(const py::handle& nameObject, const py::handle& portObject) {
  const std::string name = toCText(nameObject, "a signal name");
  const uint32_t code =
      ZinHost::portSignalType(ZinHost::parsePort(toCText(portObject, "the port")));
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

const ZINMOX_CORE_INFO& Core::info() {
  if (!info_) {
    ZINMOX_CORE_INFO read{};
    call("ZinMOX_getInfo",
         [&](uint32_t handle, ZIN_CORE_REF* ref) { return ZinMOX_getInfo(handle, ref, &read); });
    info_ = read;
  }
  return *info_;
}

PortWidths Core::widths() {
  const ZINMOX_CORE_INFO& read = info();
  return PortWidths{read.async_output_count, read.sync_output_count, read.async_input_count,
                    read.sync_input_count};
}

py::dict infoDict(const ZINMOX_CORE_INFO& info) {
  py::dict dict;
  for (const ZinRT::ZinMOX_CoreInfoField& field : ZinRT::ZINMOX_CORE_INFO_FIELDS) {
    dict[field.key] = info.*field.member;
  }
  return dict;
}

}  // namespace zinmox
