// zinmox dashboard: the cores of the target in a browser page, with live reads, writes and a
// waveform (tools/zinmox/dashboard).
#include <csignal>
#include <iostream>
#include <optional>

#include "Commands.h"
#include "Errors.h"
#include "ZinNet/Endpoint.h"
#include "dashboard/HostLink.h"
#include "dashboard/Server.h"

namespace zinmox {

namespace {

struct DashboardArgs {
  std::string listen = "127.0.0.1:8080";
  std::string core;
  double rateHz = dashboard::kDefaultRateHz;
};

// Blocks SIGINT and SIGTERM in this thread and in every thread started after it, so that
// waitForStop receives them.
sigset_t stopSignals() {
  sigset_t set;
  sigemptyset(&set);
  sigaddset(&set, SIGINT);
  sigaddset(&set, SIGTERM);
  pthread_sigmask(SIG_BLOCK, &set, nullptr);
  return set;
}

void runDashboard(Session& session, const DashboardArgs& args) {
  if (session.inScript()) throw UsageError("dashboard cannot run as a line of a script");
  ZinNet::Endpoint endpoint;
  try {
    endpoint = ZinNet::parseEndpoint(args.listen, true);
  } catch (const std::invalid_argument& error) {
    throw UsageError(error.what());
  }
  const sigset_t signals = stopSignals();
  dashboard::HostLink host(session);
  dashboard::Server server(host, endpoint.host, endpoint.port);
  try {
    host.scan();  // opens the target and lists its cores: a bad target fails before serving
    const std::string target = host.targetName();
    server.start();
    if (!args.core.empty()) server.hub().configure(args.core, args.rateHz, std::nullopt);
    std::cout << "zinmox dashboard: serving " << target << " at http://" << server.address()
              << "/ ; Ctrl-C or SIGTERM stops" << std::endl;
  } catch (const dashboard::ApiError& error) {
    throw Failure(error.what());
  } catch (const std::runtime_error& error) {
    throw Failure(error.what());
  }
  int received = 0;
  sigwait(&signals, &received);
  server.stop();
  std::cout << "zinmox dashboard: stopped" << std::endl;
}

}  // namespace

void addDashboardCommand(CLI::App& app, Session& session) {
  auto args = std::make_shared<DashboardArgs>();
  CLI::App* command = app.add_subcommand(
      "dashboard",
      "Serve a page for a browser: the cores, switches and hex fields for outputs, LEDs for "
      "inputs, live reads and a waveform (docs/tool.md)");
  command
      ->add_option("--listen", args->listen,
                   "address and port of the page; port 0 takes a free one. Other machines can "
                   "reach it only if HOST is not a loopback address")
      ->type_name("HOST:PORT")
      ->capture_default_str();
  command->add_option("--core", args->core, "core to read live from the start, e.g. 0:1:0")
      ->type_name("REF");
  command
      ->add_option("--rate", args->rateHz,
                   "live reads per second (1 to 50; the page can change it)")
      ->type_name("HZ")
      ->check(CLI::Range(dashboard::kMinRateHz, dashboard::kMaxRateHz))
      ->capture_default_str();
  command->footer("Open the printed address in a browser. Ctrl-C or SIGTERM stops the server.");
  command->callback([&session, args] { runDashboard(session, *args); });
}

}  // namespace zinmox
