// Checked argument conversions.
#include "Convert.h"

namespace py = pybind11;

namespace zinmox {

std::string typeName(const py::handle& object) {
  return py::str(object.get_type().attr("__name__"));
}

bool isNegative(const py::handle& value) {
  const int result = PyObject_RichCompareBool(value.ptr(), py::int_(0).ptr(), Py_LT);
  if (result < 0) throw py::error_already_set();
  return result == 1;
}

uint32_t toUint32(const py::handle& object, const std::string& what) {
  if (!py::isinstance<py::int_>(object) || py::isinstance<py::bool_>(object)) {
    throw py::type_error(what + " must be an int, not " + typeName(object));
  }
  const int tooBig = PyObject_RichCompareBool(object.ptr(), py::int_(UINT32_MAX).ptr(), Py_GT);
  if (tooBig < 0) throw py::error_already_set();
  if (isNegative(object) || tooBig == 1) {
    throw py::value_error(what + " must be 0 to 4294967295, not " + std::string(py::str(object)));
  }
  return object.cast<uint32_t>();
}

std::string toCText(const py::handle& object, const std::string& what) {
  if (!py::isinstance<py::str>(object)) {
    throw py::type_error(what + " must be a str, not " + typeName(object));
  }
  std::string text = object.cast<std::string>();
  if (text.find('\0') != std::string::npos) {
    throw py::value_error(what + " must not contain a NUL character");
  }
  return text;
}

}  // namespace zinmox
