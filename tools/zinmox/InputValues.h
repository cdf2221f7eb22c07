// Reading named inputs with their activity, for read and watch.
#ifndef ZINMOX_TOOL_INPUTVALUES_H
#define ZINMOX_TOOL_INPUTVALUES_H

#include <string>
#include <vector>

#include "Session.h"
#include "ZinHost/Report.h"
#include "ZinRT/ZinCore_Types.h"

namespace zinmox {

using InputValue = ZinHost::InputReading;

/// Reads every input of the core in one transfer and returns the signals asked for, in the
/// order asked; with no names, every input signal (user names sorted, then the whole ports).
/// An unknown name fails before anything is read.
std::vector<InputValue> readInputValues(Session& session, const ZIN_CORE_REF& ref,
                                        const std::vector<std::string>& names);

/// Whether any activity bit of the signal is set.
bool hasActivity(const InputValue& input);

}  // namespace zinmox

#endif
