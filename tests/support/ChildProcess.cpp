// A child process of a test, and loopback socket helpers.
#include "support/ChildProcess.h"

#include <arpa/inet.h>
#include <fcntl.h>
#include <netinet/in.h>
#include <poll.h>
#include <signal.h>
#include <spawn.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

#include <atomic>
#include <chrono>
#include <filesystem>
#include <fstream>
#include <functional>
#include <sstream>
#include <stdexcept>
#include <thread>

extern char** environ;

namespace ZinTest {

namespace {

using Clock = std::chrono::steady_clock;

int msLeft(Clock::time_point end) {
  const auto left = std::chrono::duration_cast<std::chrono::milliseconds>(end - Clock::now());
  return left.count() > 0 ? static_cast<int>(left.count()) : 0;
}

sockaddr_in loopback(int port) {
  sockaddr_in address{};
  address.sin_family = AF_INET;
  address.sin_port = htons(static_cast<uint16_t>(port));
  address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
  return address;
}

// A folder of this test process, removed when the process ends.
const std::filesystem::path& tempFolder() {
  static const struct Folder {
    std::filesystem::path path;
    Folder() {
      std::string pattern =
          (std::filesystem::temp_directory_path() / "zinmox_test_XXXXXX").string();
      if (mkdtemp(pattern.data()) == nullptr) throw std::runtime_error("mkdtemp failed");
      path = pattern;
    }
    ~Folder() {
      std::error_code ignored;
      std::filesystem::remove_all(path, ignored);
    }
  } folder;
  return folder.path;
}

std::string readFile(const std::string& path) {
  std::ifstream file(path, std::ios::binary);
  std::ostringstream text;
  text << file.rdbuf();
  return text.str();
}

// Starts `path` with `args` and the file actions (which it destroys); -1 when it cannot start.
pid_t spawn(const std::string& path, const std::vector<std::string>& args,
            posix_spawn_file_actions_t& actions) {
  std::vector<char*> argv{const_cast<char*>(path.c_str())};
  for (const std::string& arg : args) argv.push_back(const_cast<char*>(arg.c_str()));
  argv.push_back(nullptr);
  pid_t pid = -1;
  const int rc = posix_spawn(&pid, path.c_str(), &actions, nullptr, argv.data(), environ);
  posix_spawn_file_actions_destroy(&actions);
  return rc == 0 ? pid : -1;
}

// Waits for `pid` until `end`, killing it then; its wait status.
int reap(pid_t pid, Clock::time_point end, const std::function<void()>& meanwhile) {
  int status = 0;
  while (waitpid(pid, &status, WNOHANG) == 0) {
    if (msLeft(end) == 0) {
      kill(pid, SIGKILL);
      waitpid(pid, &status, 0);
      return -1;
    }
    meanwhile();
  }
  return status;
}

}  // namespace

std::string writeTempFile(const std::string& name, const std::string& text) {
  const std::string path = (tempFolder() / name).string();
  std::ofstream(path, std::ios::binary) << text;
  return path;
}

ProcessResult runProcess(const std::string& path, const std::vector<std::string>& args,
                         const std::string& input, int timeoutMs) {
  static std::atomic<int> counter{0};
  const std::string id = std::to_string(getpid()) + "_" + std::to_string(++counter);
  const std::string in = writeTempFile("in_" + id, input);
  const std::string out = (tempFolder() / ("out_" + id)).string();
  const std::string err = (tempFolder() / ("err_" + id)).string();
  posix_spawn_file_actions_t actions;
  posix_spawn_file_actions_init(&actions);
  posix_spawn_file_actions_addopen(&actions, 0, in.c_str(), O_RDONLY, 0);
  posix_spawn_file_actions_addopen(&actions, 1, out.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0600);
  posix_spawn_file_actions_addopen(&actions, 2, err.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0600);
  const pid_t pid = spawn(path, args, actions);
  if (pid < 0) throw std::runtime_error("cannot start " + path);
  const int status = reap(pid, Clock::now() + std::chrono::milliseconds(timeoutMs),
                          [] { std::this_thread::sleep_for(std::chrono::milliseconds(5)); });
  ProcessResult result{-1, SIGKILL, readFile(out), readFile(err)};
  if (status == -1) return result;
  result.status = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
  result.signal = WIFSIGNALED(status) ? WTERMSIG(status) : 0;
  return result;
}

ChildProcess::ChildProcess(const std::string& path, const std::vector<std::string>& args) {
  int fds[2];
  if (pipe2(fds, O_CLOEXEC) != 0) throw std::runtime_error("pipe failed");
  posix_spawn_file_actions_t actions;
  posix_spawn_file_actions_init(&actions);
  posix_spawn_file_actions_adddup2(&actions, fds[1], 1);
  posix_spawn_file_actions_adddup2(&actions, fds[1], 2);
  pid_ = spawn(path, args, actions);
  close(fds[1]);
  out_ = fds[0];
  if (pid_ < 0) throw std::runtime_error("cannot start " + path);
}

ChildProcess::~ChildProcess() {
  if (pid_ > 0) {
    kill(pid_, SIGKILL);
    waitpid(pid_, nullptr, 0);
  }
  if (out_ >= 0) close(out_);
}

void ChildProcess::drain(int timeoutMs) {
  pollfd readable{out_, POLLIN, 0};
  if (poll(&readable, 1, timeoutMs) <= 0) return;
  char buffer[4096];
  const ssize_t n = read(out_, buffer, sizeof buffer);
  if (n > 0) output_.append(buffer, static_cast<size_t>(n));
  if (n == 0) std::this_thread::sleep_for(std::chrono::milliseconds(std::min(timeoutMs, 10)));
}

bool ChildProcess::waitForOutput(const std::string& text, int timeoutMs) {
  const auto end = Clock::now() + std::chrono::milliseconds(timeoutMs);
  while (output_.find(text) == std::string::npos) {
    if (msLeft(end) == 0) return false;
    drain(msLeft(end));
  }
  return true;
}

std::string ChildProcess::waitForMatch(const std::regex& pattern, int timeoutMs) {
  const auto end = Clock::now() + std::chrono::milliseconds(timeoutMs);
  std::smatch match;
  while (!std::regex_search(output_, match, pattern)) {
    if (msLeft(end) == 0) return "";
    drain(msLeft(end));
  }
  return match.size() > 1 ? match[1].str() : match[0].str();
}

void ChildProcess::signal(int number) {
  if (pid_ > 0) kill(pid_, number);
}

int ChildProcess::wait(int timeoutMs) {
  const auto end = Clock::now() + std::chrono::milliseconds(timeoutMs);
  const int status = reap(pid_, end, [this, end] { drain(std::min(msLeft(end), 20)); });
  pid_ = -1;
  if (status == -1) return -1;
  drain(0);
  return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

int freeLoopbackPort() {
  const int fd = socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
  sockaddr_in address = loopback(0);
  socklen_t length = sizeof address;
  bind(fd, reinterpret_cast<sockaddr*>(&address), sizeof address);
  getsockname(fd, reinterpret_cast<sockaddr*>(&address), &length);
  close(fd);
  return ntohs(address.sin_port);
}

int connectLoopback(int port, int timeoutMs) {
  const auto end = Clock::now() + std::chrono::milliseconds(timeoutMs);
  while (true) {
    const int fd = socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
    const sockaddr_in address = loopback(port);
    if (connect(fd, reinterpret_cast<const sockaddr*>(&address), sizeof address) == 0) return fd;
    close(fd);
    if (msLeft(end) == 0) return -1;
    std::this_thread::sleep_for(std::chrono::milliseconds(50));
  }
}

}  // namespace ZinTest
