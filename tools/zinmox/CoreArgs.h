// The arguments that every core subcommand shares: the core reference and --signals FILE.
#ifndef ZINMOX_TOOL_COREARGS_H
#define ZINMOX_TOOL_COREARGS_H

#include <CLI/CLI.hpp>
#include <string>

#include "Session.h"
#include "ZinRT/ZinCore_Types.h"

namespace zinmox {

struct CoreArgs {
  std::string ref;
  std::string signalsFile;
};

/// Adds the REF positional to `command`.
void addRefArgument(CLI::App& command, CoreArgs& args);
/// Adds --signals FILE to `command`.
void addSignalsOption(CLI::App& command, CoreArgs& args);

/// Parses the reference, initialises the core in the session and defines the signals of the
/// signals file, if one was given.
ZIN_CORE_REF prepareCore(Session& session, const CoreArgs& args);

/// The help text of --signals.
extern const char* const kSignalsHelp;

}  // namespace zinmox

#endif
