// zinmox-rtlsim: the demo design in RTL, verilated, behind a remote bit-bang JTAG server.
#include <CLI/CLI.hpp>
#include <csignal>
#include <cstdio>
#include <memory>
#include <stdexcept>
#include <string>

#include "BitbangServer.h"
#include "ModelPins.h"
#include "Vzinmox_demo_top.h"
#include "verilated.h"

namespace {

std::atomic<bool> stopRequested{false};

extern "C" void onStopSignal(int) {
  stopRequested = true;
}

void installStopHandlers() {
  struct sigaction action {};
  action.sa_handler = onStopSignal;
  sigemptyset(&action.sa_mask);
  action.sa_flags = 0;  // no restart: a blocked poll returns and the loop sees the request
  sigaction(SIGINT, &action, nullptr);
  sigaction(SIGTERM, &action, nullptr);
}

using DemoPins = ZinRtl::ModelPins<Vzinmox_demo_top>;

class PinsTarget final : public ZinRtl::BitbangTarget {
 public:
  explicit PinsTarget(DemoPins& pins) : pins_(pins) {}
  void setPins(bool tck, bool tms, bool tdi) override { pins_.setPins(tck, tms, tdi); }
  bool tdo() const override { return pins_.tdo(); }
  void setResets(bool trst, bool srst) override { pins_.setResets(trst, srst); }

 private:
  DemoPins& pins_;
};

ZinRtl::ClockRatio parseRatio(const std::string& text) {
  unsigned design = 0, tck = 0;
  char tail = 0;
  if (std::sscanf(text.c_str(), "%u/%u%c", &design, &tck, &tail) != 2 || design == 0 || tck == 0 ||
      design > 1000 || tck > 1000) {
    throw CLI::ValidationError("--clock-ratio", "expected N/D with N and D from 1 to 1000");
  }
  return ZinRtl::ClockRatio{design, tck};
}

}  // namespace

int main(int argc, char** argv) {
  CLI::App app{
      "zinmox-rtlsim: the demo design (four cores on user chain 1) in RTL behind its TAP, served "
      "to a debugger over the remote bit-bang protocol on 127.0.0.1. One client at a time; "
      "SIGINT, SIGTERM or the client's quit command ('Q') stop it."};
  ZinRtl::BitbangOptions options;
  std::string ratio = "7/5";
  app.add_option("--port", options.port, "TCP port; 0 picks a free one (printed on the first line)")
      ->capture_default_str();
  app.add_option("--idle-timeout", options.idleTimeoutSeconds,
                 "seconds after which a silent client is dropped so the next one can connect "
                 "(0: never)")
      ->capture_default_str()
      ->check(CLI::Range(0, 86400));
  app.add_option("--clock-ratio", ratio,
                 "design clock half cycles per TCK half period, N/D (the clocks run free)")
      ->capture_default_str();
  ZinRtl::ClockRatio clockRatio;
  try {
    app.parse(argc, argv);
    clockRatio = parseRatio(ratio);
  } catch (const CLI::ParseError& e) {
    return app.exit(e) == 0 ? 0 : 2;  // --help, or a usage error (status 2, like zinmox)
  }

  try {
    auto context = std::make_unique<VerilatedContext>();
    auto model = std::make_unique<Vzinmox_demo_top>(context.get());
    DemoPins pins(*model, clockRatio);
    pins.powerOn();
    PinsTarget target(pins);
    ZinRtl::BitbangServer server(target, options);
    installStopHandlers();
    std::printf("zinmox-rtlsim: serving remote_bitbang on 127.0.0.1:%u\n", server.port());
    std::fflush(stdout);
    const bool quit = server.run(stopRequested);
    model->final();
    std::printf("zinmox-rtlsim: stopped (%s)\n", quit ? "client quit" : "signal");
    return 0;
  } catch (const std::exception& e) {
    std::fprintf(stderr, "zinmox-rtlsim: %s\n", e.what());
    return 1;
  }
}
