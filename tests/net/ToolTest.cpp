// The command-line tool across processes: `zinmox serve` holds the target, and a write made by
// one `zinmox --target tcp://...` process is read back by another.
#include <gtest/gtest.h>

#ifdef ZINMOX_TOOL

#include <poll.h>
#include <signal.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <regex>
#include <string>
#include <vector>

extern char** environ;

namespace {

using Clock = std::chrono::steady_clock;

/// A child process whose standard output and error come back through one pipe.
class Child {
 public:
  explicit Child(const std::vector<std::string>& args) {
    int fds[2];
    if (pipe(fds) != 0) throw std::runtime_error("pipe failed");
    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_adddup2(&actions, fds[1], 1);
    posix_spawn_file_actions_adddup2(&actions, fds[1], 2);
    posix_spawn_file_actions_addclose(&actions, fds[0]);
    std::vector<char*> argv;
    argv.push_back(const_cast<char*>(ZINMOX_TOOL));
    for (const std::string& arg : args) argv.push_back(const_cast<char*>(arg.c_str()));
    argv.push_back(nullptr);
    const int rc = posix_spawn(&pid_, ZINMOX_TOOL, &actions, nullptr, argv.data(), environ);
    posix_spawn_file_actions_destroy(&actions);
    close(fds[1]);
    out_ = fds[0];
    if (rc != 0) throw std::runtime_error("cannot start " + std::string(ZINMOX_TOOL));
  }
  ~Child() {
    if (pid_ > 0) {
      kill(pid_, SIGKILL);
      waitpid(pid_, nullptr, 0);
    }
    close(out_);
  }

  /// Reads output until `pattern` matches it or `limit` passes; returns the first group.
  std::string waitFor(const std::regex& pattern, std::chrono::milliseconds limit) {
    const auto end = Clock::now() + limit;
    std::smatch match;
    while (!std::regex_search(output_, match, pattern)) {
      if (!readSome(end)) return "";
    }
    return match.size() > 1 ? match[1].str() : match[0].str();
  }

  /// Waits for the exit (killing the child at the limit) and returns its status, -1 if killed.
  int wait(std::chrono::milliseconds limit) {
    const auto end = Clock::now() + limit;
    while (readSome(end)) {
    }
    int status = 0;
    while (waitpid(pid_, &status, WNOHANG) == 0) {
      if (Clock::now() > end) {
        kill(pid_, SIGKILL);
        waitpid(pid_, &status, 0);
        pid_ = 0;
        return -1;
      }
      usleep(10000);
    }
    pid_ = 0;
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
  }

  void signal(int number) { kill(pid_, number); }
  const std::string& output() const { return output_; }

 private:
  // Appends what the pipe holds; false at its end or at `end`.
  bool readSome(Clock::time_point end) {
    const auto left = std::chrono::duration_cast<std::chrono::milliseconds>(end - Clock::now());
    if (left.count() <= 0) return false;
    pollfd fd{out_, POLLIN, 0};
    if (poll(&fd, 1, static_cast<int>(left.count())) <= 0) return false;
    char buffer[4096];
    const ssize_t n = read(out_, buffer, sizeof buffer);
    if (n <= 0) return false;
    output_.append(buffer, static_cast<size_t>(n));
    return true;
  }

  pid_t pid_ = 0;
  int out_ = -1;
  std::string output_;
};

/// Runs the tool to its end (bounded) and returns (exit status, output).
std::pair<int, std::string> runTool(const std::vector<std::string>& args) {
  Child child(args);
  const int status = child.wait(std::chrono::seconds(20));
  return {status, child.output()};
}

TEST(Tool, AWriteInOneProcessIsReadBackByAnother) {
  Child server({"serve", "--listen", "127.0.0.1:0"});
  const std::string port = server.waitFor(std::regex("--target tcp://127\\.0\\.0\\.1:([0-9]+)"),
                                          std::chrono::seconds(20));
  ASSERT_FALSE(port.empty()) << server.output();
  EXPECT_NE(server.output().find("loopback only"), std::string::npos) << server.output();
  const std::string target = "tcp://127.0.0.1:" + port;

  auto [writeStatus, writeOut] =
      runTool({"--target", target, "write", "0:1:0", "async_out_data=A5C3"});
  EXPECT_EQ(writeStatus, 0) << writeOut;
  auto [readStatus, readOut] = runTool({"--target", target, "read", "0:1:0", "async_in_data"});
  EXPECT_EQ(readStatus, 0) << readOut;
  EXPECT_NE(readOut.find("A5C3"), std::string::npos) << readOut;

  server.signal(SIGTERM);
  EXPECT_EQ(server.wait(std::chrono::seconds(10)), 0) << server.output();
  EXPECT_NE(server.output().find("stopping on SIGTERM"), std::string::npos) << server.output();
  EXPECT_NE(server.output().find("connection 1 from 127.0.0.1:"), std::string::npos);

  // With the server gone, a client says so and fails.
  auto [lateStatus, lateOut] = runTool({"--target", target, "scan"});
  EXPECT_EQ(lateStatus, 1) << lateOut;
  EXPECT_NE(lateOut.find("cannot connect to 127.0.0.1:" + port), std::string::npos) << lateOut;
}

TEST(Tool, ServeRefusesBadListenAddresses) {
  auto [status, out] = runTool({"serve", "--listen", "127.0.0.1"});
  EXPECT_EQ(status, 2) << out;
  EXPECT_NE(out.find("missing ':PORT'"), std::string::npos) << out;
  auto [badTarget, badOut] = runTool({"--target", "tcp://localhost", "scan"});
  EXPECT_EQ(badTarget, 2) << badOut;
}

}  // namespace

#endif
