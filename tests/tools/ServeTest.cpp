// The command-line tool across processes: `zinmox serve` holds the target, and a write made by
// one `zinmox --target tcp://...` process is read back by another.
#include <gtest/gtest.h>

#include <signal.h>

#include <regex>

#include "ToolOutput.h"

namespace {

using zinmox_test::runTool;

TEST(Serve, AWriteInOneProcessIsReadBackByAnother) {
  ZinTest::ChildProcess server(ZINMOX_TOOL_PATH, {"serve", "--listen", "127.0.0.1:0"});
  const std::string port =
      server.waitForMatch(std::regex("--target tcp://127\\.0\\.0\\.1:([0-9]+);"), 20000);
  ASSERT_FALSE(port.empty()) << server.output();
  EXPECT_NE(server.output().find("loopback only"), std::string::npos) << server.output();
  const std::string target = "tcp://127.0.0.1:" + port;

  const auto write = runTool({"--target", target, "write", "0:1:0", "async_out_data=A5C3"});
  EXPECT_EQ(write.status, 0) << write.err;
  const auto read = runTool({"--target", target, "read", "0:1:0", "async_in_data"});
  EXPECT_EQ(read.status, 0) << read.err;
  EXPECT_NE(read.out.find("A5C3"), std::string::npos) << read.out;

  server.signal(SIGTERM);
  EXPECT_EQ(server.wait(10000), 0) << server.output();
  EXPECT_NE(server.output().find("stopping on SIGTERM"), std::string::npos) << server.output();
  EXPECT_NE(server.output().find("connection 1 from 127.0.0.1:"), std::string::npos);

  // With the server gone, a client says so and fails.
  const auto late = runTool({"--target", target, "scan"});
  EXPECT_EQ(late.status, 1) << late.err;
  EXPECT_NE(late.err.find("cannot connect to 127.0.0.1:" + port), std::string::npos) << late.err;
}

TEST(Serve, AnOpenAddressNeedsATokenOrInsecure) {
  const std::string token = ZinTest::writeTempFile("serve_token", "0123456789abcdef-tool\n");
  ZinTest::ChildProcess server(ZINMOX_TOOL_PATH,
                               {"--token-file", token, "serve", "--listen", "0.0.0.0:0"});
  const std::string port = server.waitForMatch(
      std::regex("--target tcp://0\\.0\\.0\\.0:([0-9]+) and the token;"), 20000);
  ASSERT_FALSE(port.empty()) << server.output();
  const std::string target = "tcp://127.0.0.1:" + port;
  const auto read = runTool({"--target", target, "--token-file", token, "read", "0:1:0"});
  EXPECT_EQ(read.status, 0) << read.err;
  const auto refused = runTool({"--target", target, "scan"});
  EXPECT_EQ(refused.status, 1) << refused.err;
  EXPECT_NE(refused.err.find("this server requires a token"), std::string::npos) << refused.err;
  server.signal(SIGTERM);
  EXPECT_EQ(server.wait(10000), 0) << server.output();
  EXPECT_NE(server.output().find("refused: this server requires a token"), std::string::npos);

  ZinTest::ChildProcess open(ZINMOX_TOOL_PATH, {"serve", "--listen", "0.0.0.0:0", "--insecure"});
  EXPECT_TRUE(open.waitForOutput("SIGTERM stops", 20000)) << open.output();
  EXPECT_NE(open.output().find("WARNING: --insecure: no token is required"), std::string::npos);
  open.signal(SIGTERM);
  EXPECT_EQ(open.wait(10000), 0) << open.output();
}

}  // namespace
