// The subcommands of zinmox. Each lives in its own file and adds itself to an application with
// one function; registerSubcommands lists them all.
#ifndef ZINMOX_TOOL_COMMANDS_H
#define ZINMOX_TOOL_COMMANDS_H

#include <CLI/CLI.hpp>

#include "Session.h"

namespace zinmox {

/// Adds every subcommand to `app`; their callbacks work on `session`.
void registerSubcommands(CLI::App& app, Session& session);

/// Builds the command-line application: the global options (--target, --version) and the
/// subcommands. Script lines use the same application, built with `forScript` so that the
/// global options are left out.
std::unique_ptr<CLI::App> buildApp(Session& session, bool forScript);

void addScanCommand(CLI::App& app, Session& session);
void addInfoCommand(CLI::App& app, Session& session);
void addDefineCommand(CLI::App& app, Session& session);
void addUndefineCommand(CLI::App& app, Session& session);
void addWriteCommand(CLI::App& app, Session& session);
void addReadCommand(CLI::App& app, Session& session);
void addWatchCommand(CLI::App& app, Session& session);
void addPortsCommand(CLI::App& app, Session& session);
void addRunCommand(CLI::App& app, Session& session);
void addDemoCommand(CLI::App& app, Session& session);
void addServeCommand(CLI::App& app, Session& session);
void addDashboardCommand(CLI::App& app, Session& session);

}  // namespace zinmox

#endif
