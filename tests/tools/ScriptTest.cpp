// run: one session for all lines of a script file or of standard input; --target FILE. (`zinmox
// serve` with tool and Python clients is tested in tests/python/test_server.py.)
#include <gtest/gtest.h>

#include "ToolOutput.h"

namespace {

using namespace zinmox_test;

const char* const kSignals = R"({"signals": [
  {"name": "leds", "port": "async_out", "bits": "0-7"},
  {"name": "leds_in", "port": "async_in", "bits": [0, 1, 2, 3, 4, 5, 6, 7]},
  {"name": "pulse", "port": "sync_out", "bits": [2]},
  {"name": "pulse_in", "port": "sync_in", "bits": "2"}
]})";

// Definitions and target state persist from line to line; comments and blank lines are skipped.
TEST(Script, KeepsOneSessionForAllLines) {
  const std::string names = " --signals " + writeTempFile("signals.json", kSignals) + " ";
  const std::string script = writeTempFile(
      "persist.zmx", "# names from a file on the first line, used on later lines\nwrite 0:1:0" +
                         names + "leds=3C pulse.pulsetrain=0100\n\nread 0:1:0 leds_in pulse_in\n" +
                         "  # indented comment\r\nread 0:1:0" + names +
                         "LEDS_IN pulse_in\nundefine 0:1:0 leds_in async_in\n");
  const auto result = runTool({"run", script});
  ASSERT_EQ(result.status, 0) << result.err;
  EXPECT_EQ(result.err, "");
  EXPECT_EQ(rowsStartingWith(result.out, "leds_in"),
            (std::vector<std::vector<std::string>>{{"leds_in", "8", "3C", "3C", "00", "-", "-"},
                                                   {"leds_in", "8", "3C", "00", "00", "-", "-"}}));
  // The train: step 0 low, step 1 high, so the second read sees the pulse.
  const auto pulse = rowsStartingWith(result.out, "pulse_in");
  ASSERT_EQ(pulse.size(), 2u);
  EXPECT_EQ(pulse[0][2] + pulse[1][2] + pulse[1][5], "011");
  EXPECT_NE(result.out.find("leds_in removed"), std::string::npos);
}

// The first failing line stops the script with its status; later lines do not run.
TEST(Script, StopsAtTheFirstFailingLine) {
  const auto failed = runTool({"run", "-", "--echo"},
                              "write 0:1:0 async_out_data=1\n"
                              "write 0:1:0 nosuch=1\n"
                              "read 0:1:0\n");
  EXPECT_EQ(failed.status, 1);
  EXPECT_NE(failed.out.find("$ zinmox write 0:1:0 async_out_data=1"), std::string::npos);
  EXPECT_EQ(failed.out.find("$ zinmox read"), std::string::npos);
  EXPECT_NE(failed.err.find("Could not find a signal with the name: nosuch"), std::string::npos);
  EXPECT_NE(failed.err.find("standard input stopped at line 2: write 0:1:0 nosuch=1"),
            std::string::npos);

  const auto usage = runTool({"run", "-"}, "scan\nread 0:1:0 --bogus\nscan\n");
  EXPECT_EQ(usage.status, 2);
  EXPECT_EQ(rowsStartingWith(usage.out, "0:1:3").size(), 1u) << "only the first scan ran";
  EXPECT_NE(usage.err.find("stopped at line 2"), std::string::npos);

  for (const char* nested : {"run -\n", "demo\n"}) {
    const auto refused = runTool({"run", "-"}, nested);
    EXPECT_EQ(refused.status, 2) << nested;
    EXPECT_NE(refused.err.find("cannot be used inside a script"), std::string::npos);
  }
}

// --target FILE: a described target instead of the demo design.
TEST(Script, UsesADescribedTarget) {
  const std::string target = writeTempFile("board.json", R"({"name": "bench", "devices": [
    {"index": 2, "chains": [{"number": 3, "cores": [
      {"index": 4, "major_version": 10, "minor_version": 1, "async_outputs": 12,
       "sync_outputs": 3, "async_inputs": 12, "sync_inputs": 3,
       "wiring": [{"input": "async", "first": 8, "count": 4,
                   "source": {"kind": "constant", "value": 1}}]}]}]}]})");
  const auto scan = runTool({"--target", target, "scan"});
  ASSERT_EQ(scan.status, 0) << scan.err;
  const auto rows = rowsStartingWith(scan.out, "2:3:4");
  ASSERT_EQ(rows.size(), 1u) << scan.out;
  EXPECT_EQ(rows[0][4] + "/" + rows[0][5], "12/3");
  EXPECT_TRUE(rowsStartingWith(scan.out, "0:1:0").empty());

  const auto run = runTool({"run", "-", "--target", target},
                           "ports 2:3:4 write --async 0A5 --sync 5\nports 2:3:4 read\n"
                           "ports 2:3:4 write --async 0 --async-mask 0F0\nports 2:3:4 read\n");
  ASSERT_EQ(run.status, 0) << run.err;
  const auto async = rowsStartingWith(run.out, "async_in");
  ASSERT_EQ(async.size(), 2u);
  EXPECT_EQ(async[0][2], "FA5") << "bits 8-11 are wired to a constant 1";
  EXPECT_EQ(rowsStartingWith(run.out, "sync_in")[0][2], "5");
  EXPECT_EQ(async[1][2], "F05") << "the mask updates bits 4-7 only";
  EXPECT_EQ(async[1][4], "0A0") << "falling activity of the cleared bits";
}

}  // namespace
