// A child process of a test: started with its output captured, always stopped at the end.
#ifndef ZIN_TESTS_RTLSIM_CHILDPROCESS_H
#define ZIN_TESTS_RTLSIM_CHILDPROCESS_H

#include <sys/types.h>

#include <string>
#include <vector>

namespace ZinRtlTest {

class ChildProcess {
 public:
  /// Starts `path` with `args`; standard output and error go to one captured stream.
  ChildProcess(const std::string& path, const std::vector<std::string>& args);
  /// Kills the child if it still runs and reaps it.
  ~ChildProcess();
  ChildProcess(const ChildProcess&) = delete;
  ChildProcess& operator=(const ChildProcess&) = delete;

  /// Waits until the output contains `text` (true) or `timeoutMs` passed or the child ended.
  bool waitForOutput(const std::string& text, int timeoutMs);
  const std::string& output() const { return output_; }

  void signal(int number);
  /// Waits for the exit (killing the child at the limit); the exit status, or -1 if killed.
  int wait(int timeoutMs);

 private:
  void drain(int timeoutMs);

  pid_t pid_ = -1;
  int out_ = -1;
  std::string output_;
};

/// A loopback TCP port that was free a moment ago.
int freeLoopbackPort();

/// A connected loopback TCP socket (retrying until `timeoutMs`), or -1.
int connectLoopback(int port, int timeoutMs);

}  // namespace ZinRtlTest

#endif
