// Script lines: one subcommand per line, run in a session that outlives the line.
#ifndef ZINMOX_TOOL_RUNCOMMAND_H
#define ZINMOX_TOOL_RUNCOMMAND_H

#include <string>

#include "Session.h"

namespace zinmox {

/// Parses and runs one script line ("write 0:1:0 leds=A5") in `session` and returns its exit
/// status; errors have been printed. With `echo` the line is printed first as "$ zinmox LINE".
int runScriptLine(Session& session, const std::string& line, bool echo);

}  // namespace zinmox

#endif
