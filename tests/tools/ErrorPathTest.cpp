// Every error path: its exit status and its message, and never a crash.
#include <gtest/gtest.h>

#include "ToolOutput.h"

namespace {

using namespace zinmox_test;
struct ErrorCase {
  std::vector<std::string> args;
  int status;
  std::string message;  // expected in standard error
};

void expectError(const ErrorCase& c) {
  std::string line = "zinmox";
  for (const auto& arg : c.args) line += " " + arg;
  const auto result = runTool(c.args);
  SCOPED_TRACE(line + "\nstderr: " + result.err);
  EXPECT_EQ(result.signal, 0) << "crashed";
  EXPECT_EQ(result.err.find("Sanitizer"), std::string::npos);
  EXPECT_EQ(result.status, c.status);
  EXPECT_NE(result.err.find(c.message), std::string::npos);
}

TEST(ErrorPaths, UsageErrorsExitWithTwoAndAHint) {
  const std::vector<ErrorCase> cases{
      {{}, 2, "no subcommand given"},
      {{"bogus"}, 2, "unknown subcommand 'bogus'"},
      {{"info"}, 2, "REF is required"},
      {{"write", "0:1:0"}, 2, "NAME=HEX is required"},
      {{"write", "0:1:0", "async_out_data"}, 2, "is not NAME=HEX"},
      {{"write", "0:1:0", "=5"}, 2, "is not NAME=HEX"},
      {{"write", "0:1:0", "x.value=5"}, 2, "unknown suffix in 'x.value'"},
      {{"write", "0:1:0", "a=1", "A.pulsetrain=1"}, 2, "A is given more than once"},
      {{"define", "0:1:0", "x", "in", "0"}, 2, "unknown port 'in'"},
      {{"watch", "0:1:0", "--interval", "-5"}, 2, "--interval"},
      {{"watch", "0:1:0", "--count", "-1"}, 2, "--count: must not be negative"},
      {{"ports", "0:1:0"}, 2, "give read or write"},
      {{"ports", "0:1:0", "write"}, 2, "nothing to write"},
      {{"ports", "0:1:0", "write", "--sync", "1", "--async-mask", "1"},
       2,
       "--async-mask needs --async"},
      {{"ports", "0:1:0", "write", "--async", "10000"}, 2, "--async 10000 does not fit in 16 bits"},
      {{"ports", "0:1:0", "write", "--sync", "1", "--sync-train", "1"}, 2, "excludes"},
      {{"ports", "0:1:1", "write", "--sync-train", "001F"}, 2, "step 0 of --sync-train"},
      {{"ports", "0:1:3", "write", "--async", "1"}, 1, "wrong core type"},
      {{"--target", "x.json", "demo"}, 2, "leave out --target"},
      {{"serve", "--listen", "127.0.0.1"}, 2, "missing ':PORT'"},
      {{"serve", "--listen", "0.0.0.0:0"}, 1, "refusing to listen on 0.0.0.0:0 without a token"},
      {{"--token-file", "/nonexistent/token", "scan"}, 2, "cannot read the token file"},
      {{"--token-file", writeTempFile("short_token", "short\n"), "serve"}, 2, "has 5 bytes"},
      {{"serve", "--tls-cert", "cert.pem"}, 2, "--tls-cert and --tls-key go together"},
  };
  for (const ErrorCase& c : cases) expectError(c);
  const auto hinted = runTool({"read", "1:2"});
  EXPECT_NE(hinted.err.find("malformed core reference '1:2'"), std::string::npos);
  EXPECT_NE(hinted.err.find("Run 'zinmox read --help' for usage."), std::string::npos);
}

TEST(ErrorPaths, SessionFailuresExitWithOneAndTheSessionMessages) {
  const std::vector<ErrorCase> cases{
      {{"write", "0:1:0", "nosuch=1"},
       1,
       "zinmox: error: Could not find a signal with the name: nosuch"},
      {{"info", "0:1:3"}, 1, "zinmox: aborted (abort code 32768): Zin abort command"},
      {{"info", "9:9:9"}, 1, "ZinMOX_getCoreInfo() for the wrong core type or non-existant core."},
      {{"read", "0:1:3"}, 1, "ZinMOX_initCore() for the wrong core type or non-existant core."},
      {{"define", "0:1:2", "x", "async_out", "4"}, 1, "could not define x as async_out bits 4"},
      {{"undefine", "0:1:2", "x", "async_out"}, 1, "The name, x, has not been defined"},
      {{"run", "/nonexistent/script"}, 1, "cannot read the script /nonexistent/script"},
  };
  for (const ErrorCase& c : cases) expectError(c);
}

TEST(ErrorPaths, BrokenFilesAreReportedWithTheirPlace) {
  const std::vector<std::pair<std::string, std::string>> signalFiles{
      {"{\"signals\": [", "not valid JSON"},
      {"[]", "(document): expected an object"},
      {"{\"signal\": []}", "/signal: unknown key"},
      {"{\"signals\": [{\"name\": \"x\", \"port\": \"async_outs\", \"bits\": [0]}]}",
       "/signals/0/port: unknown port 'async_outs'"},
      {"{\"signals\": [{\"name\": \"x\", \"port\": \"async_out\", \"bits\": []}]}",
       "/signals/0/bits: expected a non-empty array"},
      {"{\"signals\": [{\"name\": \"x\", \"port\": \"async_out\", \"bits\": [1, -2]}]}",
       "/signals/0/bits/1: expected a bit number"},
      {"{\"signals\": [{\"name\": \"\", \"port\": \"async_out\", \"bits\": [1]}]}",
       "/signals/0/name: expected a non-empty text"},
      {"{\"signals\": [{\"name\": \"x\", \"port\": \"async_out\", \"bits\": [1], \"bit\": 2}]}",
       "/signals/0/bit: unknown key"},
      {"{\"signals\": [{\"name\": \"x\", \"port\": \"async_out\", \"bits\": [1]},"
       " {\"name\": \"X\", \"port\": \"sync_out\", \"bits\": [1]}]}",
       "/signals/1/name: the output name X is defined twice"},
  };
  int index = 0;
  for (const auto& [text, message] : signalFiles) {
    const std::string path = writeTempFile("bad" + std::to_string(index++) + ".json", text);
    expectError({{"read", "0:1:0", "--signals", path}, 1, "signals file " + path + ": " + message});
  }
  expectError({{"read", "0:1:0", "--signals", "/nonexistent.json"},
               1,
               "cannot read the signals file /nonexistent.json"});

  const std::string target = writeTempFile("badtarget.json", R"({"devices": [{"chains": 5}]})");
  expectError({{"--target", target, "scan"}, 1, "cannot use the target file " + target});
  expectError({{"scan", "--target", "/nonexistent.json"}, 1, "cannot use the target file"});
}

TEST(ErrorPaths, HelpAndVersionSucceed) {
  for (const char* command :
       {"scan", "info", "define", "undefine", "write", "read", "watch", "ports", "run", "demo"}) {
    const auto help = runTool({command, "--help"});
    EXPECT_EQ(help.status, 0) << command;
    EXPECT_NE(help.out.find("Usage:"), std::string::npos) << command;
  }
  const auto portsWrite = runTool({"ports", "0:1:0", "write", "--help"});
  EXPECT_NE(portsWrite.out.find("--sync-train"), std::string::npos);
  const auto version = runTool({"--version"});
  EXPECT_EQ(version.status, 0);
  EXPECT_EQ(version.out.rfind("zinmox ", 0), 0u);
}

}  // namespace
