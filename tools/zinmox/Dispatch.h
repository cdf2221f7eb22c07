// Running a parsed command line and turning its outcome into an exit status and messages.
#ifndef ZINMOX_TOOL_DISPATCH_H
#define ZINMOX_TOOL_DISPATCH_H

#include <CLI/CLI.hpp>
#include <functional>

namespace zinmox {

/// Calls `parse` (which parses `app` and so runs the chosen subcommand) and returns the exit
/// status: 0 on success (help and --version included), 1 for a failure, 2 for a usage error.
/// Errors are printed to standard error, usage errors with a hint to --help.
int execute(CLI::App& app, const std::function<void()>& parse);

}  // namespace zinmox

#endif
