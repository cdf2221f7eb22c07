// The application and the list of subcommands.
#include "Commands.h"

#include "Errors.h"
#include "ZinMOX/ZinMOX_Version.h"
#include "ZinNet/Token.h"

namespace zinmox {

namespace {

using Registration = void (*)(CLI::App&, Session&);

// Every subcommand, in the order --help lists them. A new subcommand is one file and one line.
const Registration kSubcommands[] = {
    addScanCommand,  addInfoCommand, addDefineCommand, addUndefineCommand,
    addWriteCommand, addReadCommand, addWatchCommand,  addPortsCommand,
    addRunCommand,   addDemoCommand, addServeCommand,  addDashboardCommand,
};

}  // namespace

void registerSubcommands(CLI::App& app, Session& session) {
  for (Registration add : kSubcommands) add(app, session);
}

std::unique_ptr<CLI::App> buildApp(Session& session, bool forScript) {
  auto app = std::make_unique<CLI::App>(
      "zinmox: scan, describe, drive and watch the MOX cores of a target.\n"
      "Cores are named DEVICE:CHAIN:CORE (decimal or 0x hex), for example 0:1:0.",
      "zinmox");
  app->require_subcommand(0, 1);
  app->fallthrough();
  app->footer(
      "Exit status: 0 success, 1 the session or a file reported a failure, 2 usage error.\n"
      "Run 'zinmox SUBCOMMAND --help' for the options of a subcommand; 'zinmox demo' for a tour.");
  if (!forScript) {
    app->add_option_function<std::string>(
           "--target",
           [&session](const std::string& targetText) { session.setTargetText(targetText); },
           "JSON description of a simulated target, or tcp://HOST:PORT (tls://HOST:PORT over "
           "TLS) of a target server (default: the built-in demo design)")
        ->type_name("FILE");
    app->add_option_function<std::string>(
           "--token-file",
           [&session](const std::string& path) {
             try {
               session.serverAccess().token = ZinNet::readTokenFile(path);
             } catch (const std::invalid_argument& error) {
               throw UsageError(error.what());
             }
           },
           std::string("File holding the token that a target server (and serve) requires; "
                       "without it the ") +
               ZinNet::kTokenVariable + " variable is used when set")
        ->type_name("FILE");
    app->add_option_function<std::string>(
           "--tls-ca",
           [&session](const std::string& path) { session.serverAccess().tlsCaFile = path; },
           "PEM file of the certificate authorities that tls:// targets are checked against "
           "(default: the system's)")
        ->type_name("FILE");
    app->set_version_flag("--version", std::string("zinmox ") + ZINMOX_VERSION_STRING);
  }
  registerSubcommands(*app, session);
  CLI::App* top = app.get();
  app->callback([top] {
    if (top->get_subcommands().empty()) {
      throw UsageError("no subcommand given; 'zinmox demo' shows a short tour");
    }
  });
  return app;
}

}  // namespace zinmox
