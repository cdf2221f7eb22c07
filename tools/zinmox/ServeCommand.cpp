// zinmox serve: holds a target and serves it to other processes over TCP.
#include <iostream>
#include <memory>
#include <mutex>

#include "Commands.h"
#include "Errors.h"
#include "ZinHost/Target.h"
#include "ZinNet/Endpoint.h"
#include "ZinNet/Server.h"

namespace zinmox {

namespace {

constexpr const char* kDefaultListen = "127.0.0.1:7700";

// The server settings that the command line may change.
struct ServeSettings {
  std::string listen = kDefaultListen;
  uint32_t greetingTimeoutMs = ZinNet::ServerOptions{}.greetingTimeoutMs;
  uint32_t idleTimeoutMs = ZinNet::ServerOptions{}.idleTimeoutMs;
};

void serve(Session& session, const ServeSettings& settings) {
  const std::string& listen = settings.listen;
  if (session.inScript()) throw UsageError("serve cannot run as a line of a script");
  ZinNet::Endpoint endpoint;
  try {
    endpoint = ZinNet::parseEndpoint(listen, true);
  } catch (const std::invalid_argument& error) {
    throw UsageError(error.what());
  }
  ZinNet::ServerOptions options;
  options.host = endpoint.host;
  options.port = endpoint.port;
  options.name = "zinmox serve: " + ZinHost::describeTarget(session.targetText());
  options.stopOnSignals = true;
  options.greetingTimeoutMs = settings.greetingTimeoutMs;
  options.idleTimeoutMs = settings.idleTimeoutMs;
  // The server logs from its own thread: one flushed line per event, never mixed with ours.
  auto outputMutex = std::make_shared<std::mutex>();
  options.log = [outputMutex](const std::string& line) {
    std::lock_guard<std::mutex> lock(*outputMutex);
    std::cout << "zinmox serve: " << line << std::endl;
  };
  ZinNet::Server server(ZinHost::openTarget(session.targetText()).transport, options);
  try {
    server.start();
  } catch (const std::runtime_error& error) {
    throw Failure(error.what());
  }
  {
    std::lock_guard<std::mutex> lock(*outputMutex);
    std::cout << "zinmox serve: serving " << ZinHost::describeTarget(session.targetText())
              << "; connect with --target tcp://" << server.address() << "; Ctrl-C or SIGTERM stops"
              << std::endl;
  }
  server.wait();
  server.stop();
}

}  // namespace

void addServeCommand(CLI::App& app, Session& session) {
  auto* command = app.add_subcommand(
      "serve",
      "Hold the target and serve it to other processes over TCP, so that their writes and reads "
      "meet on one target (clients use --target tcp://HOST:PORT)");
  auto settings = std::make_shared<ServeSettings>();
  command
      ->add_option("--listen", settings->listen,
                   "Address and port to listen on; port 0 takes a free one. Other machines "
                   "can connect only if HOST is not a loopback address")
      ->type_name("HOST:PORT")
      ->capture_default_str();
  command
      ->add_option("--idle-timeout", settings->idleTimeoutMs,
                   "Close a client connection that sends no request for this long; 0 never")
      ->type_name("MS")
      ->capture_default_str();
  command
      ->add_option("--greeting-timeout", settings->greetingTimeoutMs,
                   "Close a new connection that has not sent its hello within this time; 0 never")
      ->type_name("MS")
      ->capture_default_str();
  command->callback([&session, settings] { serve(session, *settings); });
}

}  // namespace zinmox
