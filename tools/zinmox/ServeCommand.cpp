// zinmox serve: holds a target and serves it to other processes over TCP.
#include <iostream>
#include <memory>
#include <mutex>

#include "Commands.h"
#include "Errors.h"
#include "ZinHost/Target.h"
#include "ZinNet/Endpoint.h"
#include "ZinNet/Server.h"
#include "ZinNet/Token.h"

namespace zinmox {

namespace {

constexpr const char* kDefaultListen = "127.0.0.1:7700";

// The server settings that the command line may change.
struct ServeSettings {
  std::string listen = kDefaultListen;
  uint32_t greetingTimeoutMs = ZinNet::ServerOptions{}.greetingTimeoutMs;
  uint32_t idleTimeoutMs = ZinNet::ServerOptions{}.idleTimeoutMs;
  bool insecure = false;
  std::string tlsCert;
  std::string tlsKey;
};

// The token clients must prove: --token-file, else the variable; only loopback may go without
// one unless --insecure says so.
void secure(ZinNet::ServerOptions& options, Session& session, const ServeSettings& settings) {
  try {
    options.token = session.serverAccess().token.empty() ? ZinNet::tokenFromEnvironment()
                                                         : session.serverAccess().token;
  } catch (const std::invalid_argument& error) {
    throw UsageError(error.what());
  }
  if (settings.tlsCert.empty() != settings.tlsKey.empty()) {
    throw UsageError("--tls-cert and --tls-key go together");
  }
  options.tlsCertFile = settings.tlsCert;
  options.tlsKeyFile = settings.tlsKey;
  options.insecure = settings.insecure;
  if (settings.insecure && options.token.empty()) {
    std::cerr << "zinmox serve: WARNING: --insecure: no token is required. Whoever can reach "
              << settings.listen << " drives the target, with no proof of who they are.\n";
  }
}

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
  secure(options, session, settings);
  // The server logs from its own thread: one flushed line per event, never mixed with ours.
  auto outputMutex = std::make_shared<std::mutex>();
  options.log = [outputMutex](const std::string& line) {
    std::lock_guard<std::mutex> lock(*outputMutex);
    std::cout << "zinmox serve: " << line << std::endl;
  };
  ZinNet::Server server(ZinHost::openTarget(session.targetText(), session.serverAccess()).transport,
                        options);
  try {
    server.start();
  } catch (const std::runtime_error& error) {
    throw Failure(error.what());
  }
  {
    std::lock_guard<std::mutex> lock(*outputMutex);
    std::cout << "zinmox serve: serving " << ZinHost::describeTarget(session.targetText())
              << "; connect with --target " << (options.tlsCertFile.empty() ? "tcp://" : "tls://")
              << server.address() << (options.token.empty() ? "" : " and the token")
              << "; Ctrl-C or SIGTERM stops" << std::endl;
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
                   "can connect only if HOST is not a loopback address, and then clients must "
                   "prove the token (--token-file or ZINMOX_TOKEN) unless --insecure is given")
      ->type_name("HOST:PORT")
      ->capture_default_str();
  command
      ->add_option("--idle-timeout", settings->idleTimeoutMs,
                   "Close a client connection that sends no request for this long; 0 never")
      ->type_name("MS")
      ->capture_default_str();
  command
      ->add_option("--greeting-timeout", settings->greetingTimeoutMs,
                   "Close a new connection that has not done its TLS handshake, hello and token "
                   "proof within "
                   "this time; 0 never")
      ->type_name("MS")
      ->capture_default_str();
  command->add_flag("--insecure", settings->insecure,
                    "Allow an address other than loopback without a token: anyone who reaches "
                    "the port drives the target");
  command
      ->add_option("--tls-cert", settings->tlsCert,
                   "PEM certificate chain: clients must then speak TLS (tls://HOST:PORT)")
      ->type_name("FILE");
  command->add_option("--tls-key", settings->tlsKey, "PEM private key of --tls-cert")
      ->type_name("FILE");
  command->callback([&session, settings] { serve(session, *settings); });
}

}  // namespace zinmox
