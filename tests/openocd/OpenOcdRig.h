// zinmox-rtlsim and OpenOCD attached to it, on free loopback ports, stopped at the end.
#ifndef ZIN_TESTS_OPENOCD_OPENOCDRIG_H
#define ZIN_TESTS_OPENOCD_OPENOCDRIG_H

#include <memory>
#include <string>

#include "support/ChildProcess.h"

namespace ZinRtlTest {

using ZinTest::ChildProcess;
using ZinTest::connectLoopback;
using ZinTest::freeLoopbackPort;

class OpenOcdRig {
 public:
  /// Starts both; check ok() (and log() when it is false).
  OpenOcdRig();
  bool ok() const { return tclPort_ > 0 && openocd_ != nullptr; }
  int tclPort() const { return tclPort_; }
  std::string target(const std::string& options = "") const;
  std::string log() const;

  void killOpenOcd();
  void killRtlsim();
  /// Starts what is not running again; OpenOCD keeps its Tcl port.
  bool restart();

 private:
  bool startRtlsim();
  bool startOpenOcd();

  std::unique_ptr<ChildProcess> rtlsim_;
  std::unique_ptr<ChildProcess> openocd_;
  int rtlsimPort_ = -1;
  int tclPort_ = -1;
};

}  // namespace ZinRtlTest

#endif
