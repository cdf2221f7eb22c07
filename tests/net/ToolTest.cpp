// The command-line tool across processes: `zinmox serve` holds the target, and a write made by
// one `zinmox --target tcp://...` process is read back by another.
#include <gtest/gtest.h>

#ifdef ZINMOX_TOOL

#include <signal.h>

#include <regex>
#include <string>
#include <vector>

#include "support/ChildProcess.h"

namespace {

using ZinTest::ChildProcess;

/// Runs the tool to its end (bounded) and returns (exit status, standard output and error).
std::pair<int, std::string> runTool(const std::vector<std::string>& args) {
  const ZinTest::ProcessResult result = ZinTest::runProcess(ZINMOX_TOOL, args, "", 20000);
  return {result.status, result.out + result.err};
}

TEST(Tool, AWriteInOneProcessIsReadBackByAnother) {
  ChildProcess server(ZINMOX_TOOL, {"serve", "--listen", "127.0.0.1:0"});
  const std::string port =
      server.waitForMatch(std::regex("--target tcp://127\\.0\\.0\\.1:([0-9]+);"), 20000);
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
  EXPECT_EQ(server.wait(10000), 0) << server.output();
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
