// Core.ports: packed whole-port writes and reads.
#include "Ports.h"

#include <string>

#include "Convert.h"

namespace py = pybind11;

namespace zinmox {

namespace {

size_t bytesFor(uint32_t bits) {
  return (static_cast<size_t>(bits) + 7) / 8;
}

// The bytes of a bytes-like argument, which must be exactly `size` long.
std::string packed(const py::object& data, size_t size, const std::string& what) {
  std::string bytes;
  if (py::isinstance<py::bytes>(data)) {
    bytes = data.cast<std::string>();
  } else if (py::isinstance<py::bytearray>(data) || py::isinstance<py::memoryview>(data)) {
    PyObject* copy = PyBytes_FromObject(data.ptr());
    if (copy == nullptr) throw py::error_already_set();
    bytes = py::reinterpret_steal<py::bytes>(copy).cast<std::string>();
  } else {
    throw py::type_error(what + " must be bytes, not " + typeName(data));
  }
  if (bytes.size() != size) {
    throw py::value_error(what + " must be " + std::to_string(size) + " bytes long, not " +
                          std::to_string(bytes.size()));
  }
  return bytes;
}

// A packed vector of `bits` bits with the spare high bits of the last byte cleared.
py::bytes vector(std::string bytes, uint32_t bits) {
  if (bits % 8 != 0 && !bytes.empty()) {
    bytes.back() =
        static_cast<char>(static_cast<unsigned char>(bytes.back()) & ((1u << (bits % 8)) - 1));
  }
  return py::bytes(bytes);
}

struct Group {
  std::string data;
  std::string mask;
  uint32_t count = 0;  // 0 leaves the group out
};

Group outputGroup(const py::object& data, const py::object& mask, uint32_t width, size_t dataSize,
                  const std::string& name) {
  Group group;
  if (data.is_none()) {
    if (!mask.is_none()) throw py::value_error(name + "_mask was given without " + name);
    return group;
  }
  group.data = packed(data, dataSize, name);
  group.mask = mask.is_none() ? std::string(bytesFor(width), '\xFF')
                              : packed(mask, bytesFor(width), name + "_mask");
  group.count = width;
  return group;
}

const uint8_t* bytesOf(const std::string& text) {
  return text.empty() ? nullptr : reinterpret_cast<const uint8_t*>(text.data());
}

}  // namespace

void Ports::write(const py::object& asyncOut, const py::object& syncOut,
                  const py::object& asyncMask, const py::object& syncMask) {
  const PortWidths& widths = core_->widths();
  const Group async =
      outputGroup(asyncOut, asyncMask, widths.asyncOut, bytesFor(widths.asyncOut), "async_out");
  const Group sync =
      outputGroup(syncOut, syncMask, widths.syncOut, 16 * bytesFor(widths.syncOut), "sync_out");
  core_->call("ZinMOX_setPortBits", [&](uint32_t handle, ZIN_CORE_REF* ref) {
    return ZinMOX_setPortBits(handle, ref, bytesOf(async.data), bytesOf(async.mask), async.count,
                              bytesOf(sync.data), bytesOf(sync.mask), sync.count);
  });
}

py::dict Ports::read() {
  const PortWidths widths = core_->widths();
  auto buffer = [](uint32_t bits) { return std::string(bytesFor(bits), '\0'); };
  std::string asyncIn[3] = {buffer(widths.asyncIn), buffer(widths.asyncIn), buffer(widths.asyncIn)};
  std::string syncIn[5];
  for (std::string& vector : syncIn) vector = buffer(widths.syncIn);
  auto out = [](std::string& vector) {
    return vector.empty() ? nullptr : reinterpret_cast<uint8_t*>(vector.data());
  };
  core_->call("ZinMOX_getPortBits", [&](uint32_t handle, ZIN_CORE_REF* ref) {
    return ZinMOX_getPortBits(handle, ref, out(asyncIn[0]), out(asyncIn[1]), out(asyncIn[2]),
                              widths.asyncIn, out(syncIn[0]), out(syncIn[1]), out(syncIn[2]),
                              out(syncIn[3]), out(syncIn[4]), widths.syncIn);
  });
  py::dict result;
  const char* asyncKeys[3] = {"async_in", "async_in_activity_up", "async_in_activity_down"};
  const char* syncKeys[5] = {"sync_in", "sync_in_activity_up", "sync_in_activity_down",
                             "sync_in_sync_activity_up", "sync_in_sync_activity_down"};
  for (int i = 0; i < 3; ++i) result[asyncKeys[i]] = vector(asyncIn[i], widths.asyncIn);
  for (int i = 0; i < 5; ++i) result[syncKeys[i]] = vector(syncIn[i], widths.syncIn);
  return result;
}

void bindPorts(py::module_& module) {
  py::class_<Ports>(module, "Ports",
                    "Whole-port access to a core. Vectors are bytes with port bit i in bit i % 8 "
                    "of byte i // 8.")
      .def("write", &Ports::write, py::kw_only(), py::arg("async_out") = py::none(),
           py::arg("sync_out") = py::none(), py::arg("async_mask") = py::none(),
           py::arg("sync_mask") = py::none(),
           "Writes whole output ports in one transfer.\n\n"
           "async_out: ceil(A_out/8) bytes; sync_out: 16 step vectors of ceil(S_out/8) bytes, "
           "step t at byte t*ceil(S_out/8). A port given as None is left out (sent unmarked). "
           "A mask marks the bits to update; None updates every bit of a given port.")
      .def("read", &Ports::read,
           "Reads both input ports with their activity in one transfer. Returns a dict of bytes "
           "with the keys async_in, async_in_activity_up, async_in_activity_down, sync_in, "
           "sync_in_activity_up, sync_in_activity_down, sync_in_sync_activity_up and "
           "sync_in_sync_activity_down.");
}

}  // namespace zinmox
