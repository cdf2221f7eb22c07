// Named values: Core.write() and Core.read() over the value-map calls.
#ifndef ZINMOX_PYTHON_VALUES_H
#define ZINMOX_PYTHON_VALUES_H

#include <pybind11/pybind11.h>

#include "Core.h"

namespace zinmox {

/// Writes named outputs in one transfer. `values` (a mapping or None) and `signals` map a key
/// (a signal name, optionally with the library's key suffix) to an int, a hex text (passed on
/// as it is) or a sequence of 16 step values (a pulse train).
void writeValues(Core& core, const pybind11::object& values, const pybind11::kwargs& signals);

/// Reads every input signal in one transfer: name -> zinmox.Reading.
pybind11::dict readValues(Core& core);

void bindValues(pybind11::module_& module);

}  // namespace zinmox

#endif
