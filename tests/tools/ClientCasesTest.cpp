// The tool's half of the shared client cases (client_cases.json); tests/python reads the same
// file, so the tool and the Python module accept and refuse the same texts alike.
#include <gtest/gtest.h>

#include <fstream>
#include <nlohmann/json.hpp>

#include "ToolOutput.h"

namespace {

using namespace zinmox_test;
using nlohmann::json;

json cases(const char* group) {
  std::ifstream file(ZINMOX_CLIENT_CASES);
  return json::parse(file).at(group);
}

// A refused text: usage status 2 and the expected message; an accepted one: no usage error.
void expectOutcome(const json& entry, const zinmox_test::ToolResult& result) {
  SCOPED_TRACE(entry.at("text").get<std::string>() + "\n" + result.err);
  const bool refused = entry.contains("error");
  EXPECT_EQ(result.status, refused ? 2 : 0);
  const std::string error = refused ? entry.at("error").get<std::string>() : "";
  EXPECT_NE(result.err.find(error), std::string::npos);
}

TEST(ClientCases, References) {
  for (const json& entry : cases("refs")) {
    const auto result = runTool({"info", entry.at("text"), "--json"});
    if (entry.contains("ref") && entry.at("ref") != json::array({0, 1, 0})) {
      EXPECT_EQ(result.status, 1) << entry.at("text");  // accepted; no core there
      continue;
    }
    expectOutcome(entry, result);
    if (entry.contains("ref")) {
      EXPECT_EQ(zinmox_test::jsonDocuments(result.out).at(0).at("core"), "0:1:0");
    }
  }
}

TEST(ClientCases, Values) {
  for (const json& entry : cases("values")) {
    const std::string text = entry.at("text");
    const auto result =
        runTool({"run", "-"}, "define 0:1:0 wide async_out 0-9\n" +
                                  std::string("define 0:1:0 wide_in async_in 0-9\n") +
                                  "write 0:1:0 'wide=" + text + "'\nread 0:1:0 wide_in --json\n");
    expectOutcome(entry, result);
    if (entry.contains("reads")) {
      const json read = zinmox_test::jsonDocuments(result.out).at(0);
      EXPECT_EQ(read.at("signals").at(0).at("value"), entry.at("reads")) << text;
    }
  }
}

TEST(ClientCases, BitListsNamesAndTargets) {
  for (const json& entry : cases("bits")) {
    const auto result = runTool({"define", "0:1:0", "x", "async_out", entry.at("text")});
    expectOutcome(entry, result);
    if (entry.contains("width")) {
      const std::string width = std::to_string(entry.at("width").get<int>());
      EXPECT_NE(result.out.find("(" + width + " bits)"), std::string::npos) << result.out;
    }
  }
  for (const json& entry : cases("names")) {
    expectOutcome(entry, runTool({"define", "0:1:0", entry.at("text"), "async_out", "0"}));
  }
  for (const json& entry : cases("targets")) {
    expectOutcome(entry, runTool({"--target", entry.at("text"), "scan"}));
  }
}

}  // namespace
