// Core references as Python gives them: a (device, chain, core) tuple or "D:C:I" text.
#ifndef ZINMOX_PYTHON_COREREF_H
#define ZINMOX_PYTHON_COREREF_H

#include <pybind11/pybind11.h>

#include <string>

#include "ZinRT/ZinCore_Types.h"

namespace zinmox {

/// A tuple or list of three ints, or a text "D:C:I" whose numbers are decimal or 0x hex, within
/// the host library's limits (device 0 to 255, chain and core 0 to 15). Raises TypeError for
/// other types and ValueError (ZinHost::TextError) for malformed texts or numbers out of range.
ZIN_CORE_REF toCoreRef(const pybind11::handle& ref);

pybind11::tuple refTuple(const ZIN_CORE_REF& ref);

/// "D:C:I" in decimal.
std::string refText(const ZIN_CORE_REF& ref);

}  // namespace zinmox

#endif
