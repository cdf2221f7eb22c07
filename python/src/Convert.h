// Checked conversions of Python arguments into the plain values the exported functions take.
#ifndef ZINMOX_PYTHON_CONVERT_H
#define ZINMOX_PYTHON_CONVERT_H

#include <pybind11/pybind11.h>

#include <cstdint>
#include <string>

namespace zinmox {

/// The name of an object's type, for messages.
std::string typeName(const pybind11::handle& object);

/// An int from 0 to 2**32-1 (TypeError for other types, bool included; ValueError out of range).
uint32_t toUint32(const pybind11::handle& object, const std::string& what);

/// Whether an int is negative.
bool isNegative(const pybind11::handle& value);

/// A str that the C interface can carry: no NUL character (ValueError).
std::string toCText(const pybind11::handle& object, const std::string& what);

}  // namespace zinmox

#endif
