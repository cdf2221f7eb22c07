// Child processes of tests: one started with its output captured and always stopped at the end,
// or one run to its end; temporary files; loopback ports.
#ifndef ZIN_TEST_SUPPORT_CHILDPROCESS_H
#define ZIN_TEST_SUPPORT_CHILDPROCESS_H

#include <sys/types.h>

#include <regex>
#include <string>
#include <vector>

namespace ZinTest {

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
  /// Waits until `pattern` matches the output and returns its first group (or the whole match);
  /// "" when `timeoutMs` passed or the child ended first.
  std::string waitForMatch(const std::regex& pattern, int timeoutMs);
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

/// How a process that ran to its end ended, and what it wrote.
struct ProcessResult {
  int status = -1;  // exit status; -1 when the process did not exit normally
  int signal = 0;   // the signal that ended it, if any
  std::string out;  // standard output
  std::string err;  // standard error
};

/// Runs `path` with `args` to its end, `input` on its standard input; a process that is still
/// running after `timeoutMs` is killed (status -1, signal SIGKILL).
ProcessResult runProcess(const std::string& path, const std::vector<std::string>& args,
                         const std::string& input = "", int timeoutMs = 60000);

/// A file named `name` holding `text` in a temporary folder of this test process (removed when
/// the process ends); returns its path.
std::string writeTempFile(const std::string& name, const std::string& text);

/// A loopback TCP port that was free a moment ago.
int freeLoopbackPort();

/// A connected loopback TCP socket (retrying until `timeoutMs`), or -1.
int connectLoopback(int port, int timeoutMs);

}  // namespace ZinTest

#endif
