// Starting and stopping zinmox-rtlsim and OpenOCD for the tests.
#include "OpenOcdRig.h"

#include <signal.h>
#include <unistd.h>

#include <regex>

namespace ZinRtlTest {

namespace {
constexpr int kStartMs = 10000;
}  // namespace

OpenOcdRig::OpenOcdRig() {
  if (!startRtlsim()) return;
  tclPort_ = freeLoopbackPort();
  if (!startOpenOcd()) tclPort_ = -1;
}

std::string OpenOcdRig::target(const std::string& options) const {
  return "openocd://127.0.0.1:" + std::to_string(tclPort_) + options;
}

std::string OpenOcdRig::log() const {
  return (rtlsim_ ? rtlsim_->output() : "") + (openocd_ ? openocd_->output() : "");
}

bool OpenOcdRig::startRtlsim() {
  rtlsim_ = std::make_unique<ChildProcess>(
      ZINMOX_RTLSIM_PATH, std::vector<std::string>{"--port", "0", "--idle-timeout", "0"});
  const std::string port = rtlsim_->waitForMatch(std::regex("127\\.0\\.0\\.1:([0-9]+)"), kStartMs);
  rtlsimPort_ = port.empty() ? -1 : std::stoi(port);
  return rtlsimPort_ > 0;
}

bool OpenOcdRig::startOpenOcd() {
  openocd_ = std::make_unique<ChildProcess>(
      ZINMOX_OPENOCD_PATH,
      std::vector<std::string>{"-c", "set ZINMOX_RTLSIM_PORT " + std::to_string(rtlsimPort_), "-f",
                               ZINMOX_OPENOCD_CFG, "-c",
                               "bindto 127.0.0.1; tcl_port " + std::to_string(tclPort_) +
                                   "; telnet_port disabled; gdb_port disabled"});
  const bool up = openocd_->waitForOutput("tap/device found", kStartMs);
  const int fd = up ? connectLoopback(tclPort_, kStartMs) : -1;
  if (fd >= 0) close(fd);
  return fd >= 0;
}

void OpenOcdRig::killOpenOcd() {
  openocd_->signal(SIGKILL);
  openocd_->wait(kStartMs);
  openocd_.reset();
}

void OpenOcdRig::killRtlsim() {
  rtlsim_->signal(SIGKILL);
  rtlsim_->wait(kStartMs);
  rtlsim_.reset();
}

bool OpenOcdRig::restart() {
  if (!rtlsim_) {
    if (openocd_) killOpenOcd();  // OpenOCD does not find a new bit-bang server by itself
    if (!startRtlsim()) return false;
  }
  return openocd_ || startOpenOcd();
}

}  // namespace ZinRtlTest
