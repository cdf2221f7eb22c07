// Test-bench access to a simulated target: rewiring inputs, time, output levels, fault injection.
#ifndef ZINMOX_PYTHON_SIMTARGET_H
#define ZINMOX_PYTHON_SIMTARGET_H

#include <pybind11/pybind11.h>

namespace zinmox {

void bindSimTarget(pybind11::module_& module);

}  // namespace zinmox

#endif
