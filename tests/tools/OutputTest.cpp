// The tool's output on the demo design: --json parsed back and compared with the design and the
// table output, and the guided tour with its loopback and the counter seen by watch.
#include <gtest/gtest.h>

#include "ToolOutput.h"
#include "ZinSim/Description.h"

namespace {

using namespace zinmox_test;
using nlohmann::json;

// Each key of `expected` has its value in `document`.
void expectFields(const json& document, const json& expected) {
  for (const auto& [key, value] : expected.items()) EXPECT_EQ(document[key], value) << key;
}

TEST(JsonOutput, ScanAndInfoMatchTheDemoDesign) {
  const auto scan = runTool({"scan", "--json"});
  ASSERT_EQ(scan.status, 0) << scan.err;
  const json document = json::parse(scan.out);
  const ZinSim::TargetDescription design = ZinSim::demoDescription();
  ASSERT_EQ(document["cores"].size(), design.cores.size());
  for (size_t i = 0; i < design.cores.size(); ++i) {
    const ZinSim::CoreDescription& core = design.cores[i];
    const json& entry = document["cores"][i];
    const bool mox = core.type == ZinSim::kMoxCoreType;
    expectFields(entry, {{"core_type", core.type},
                         {"mox", mox},
                         {"core_major_version", core.majorVersion},
                         {"core_minor_version", core.minorVersion},
                         {"manufacturer_id", core.manufacturerId}});
    if (mox) {
      expectFields(entry, {{"async_output_count", core.asyncOutputs},
                           {"sync_output_count", core.syncOutputs},
                           {"async_input_count", core.asyncInputs},
                           {"sync_input_count", core.syncInputs}});
    } else {
      EXPECT_FALSE(entry.contains("async_output_count"));
    }
  }

  const auto info = runTool({"info", "0x0:0x1:0x0", "--json"});
  ASSERT_EQ(info.status, 0) << info.err;
  const json fields = json::parse(info.out);
  EXPECT_EQ(fields.size(), 13u);  // the reference and the twelve fields
  expectFields(fields, {{"core", "0:1:0"},
                        {"core_type", 9},
                        {"qx_major_version", design.cores[0].qxMajorVersion},
                        {"sync_input_count", design.cores[0].syncInputs}});
  json scanned = document["cores"][0];
  scanned.erase("core");
  scanned.erase("mox");
  expectFields(fields, scanned);
}

// Named reads and whole-port reads after writes in one session, as JSON.
TEST(JsonOutput, ReadsShowTheLoopbackOfWrites) {
  const auto result = runTool({"run", "-"},
                              "define 0:1:1 nibble async_out 3-0\n"
                              "define 0:1:1 nibble_in async_in 3-0\n"
                              "define 0:1:1 pair_in sync_in 0,1\n"
                              "write 0:1:1 nibble=6 sync_out_data=3\n"
                              "read 0:1:1 nibble_in pair_in async_in_data --json\n"
                              "ports 0:1:1 write --async C3\n"
                              "ports 0:1:1 read --json\n");
  ASSERT_EQ(result.status, 0) << result.err;
  const auto documents = jsonDocuments(result.out);
  ASSERT_EQ(documents.size(), 2u) << result.out;

  const json& read = documents[0];
  EXPECT_EQ(read["core"], "0:1:1");
  ASSERT_EQ(read["signals"].size(), 3u);
  // Value bit i is port bit 3 - i on both sides, so the value comes back unchanged.
  expectFields(read["signals"][0],
               {{"name", "nibble_in"}, {"width", 4}, {"value", "6"}, {"activity_up", "6"}});
  EXPECT_FALSE(read["signals"][0].contains("sync_activity_up"));
  expectFields(
      read["signals"][1],
      {{"width", 2}, {"value", "3"}, {"sync_activity_up", "3"}, {"sync_activity_down", "0"}});
  // nibble=6 on bits 3-0 in reverse order: bits 1 and 2.
  expectFields(read["signals"][2], {{"name", "async_in_data"}, {"width", 8}, {"value", "06"}});
  // 06 -> C3 since the previous read.
  const json& ports = documents[1];
  expectFields(ports["async_in"],
               {{"width", 8}, {"value", "C3"}, {"activity_up", "C1"}, {"activity_down", "04"}});
  EXPECT_EQ(ports["sync_in"]["value"], "3");
  EXPECT_FALSE(ports["async_in"].contains("sync_activity_up"));
}

// Rows of a read table or of watch: the second field is a number (the tour's explanations may
// start with a signal name too).
std::vector<std::vector<std::string>> numberRows(const std::string& text,
                                                 const std::string& first) {
  auto rows = rowsStartingWith(text, first);
  std::erase_if(rows, [](const auto& row) {
    return row.size() < 3 || row[1].find_first_not_of("0123456789") != std::string::npos;
  });
  return rows;
}

// The guided tour: scan rows, the loopback of a value and of a pulse train, and the counter
// advancing by one cycle per transfer, also as watch shows it (a changed value is marked).
TEST(Demo, ShowsTheDemoDesignAndItsLoopback) {
  const auto result = runTool({"demo"});
  ASSERT_EQ(result.status, 0) << result.err;
  EXPECT_EQ(result.err, "");
  for (const char* ref : {"0:1:0", "0:1:1", "0:1:2", "0:1:3"}) {
    EXPECT_EQ(rowsStartingWith(result.out, ref).size(), 1u) << ref;
  }
  EXPECT_EQ(rowsStartingWith(result.out, "sync_input_count").at(0).at(1), "12");
  // Two reads: the written value loops back with its rising activity once; the one-step pulse
  // train rises in the first read and falls in the second.
  using Rows = std::vector<std::vector<std::string>>;
  EXPECT_EQ(numberRows(result.out, "leds_in"),
            (Rows{{"leds_in", "8", "A5", "A5", "00", "-", "-"},
                  {"leds_in", "8", "A5", "00", "00", "-", "-"}}));
  EXPECT_EQ(numberRows(result.out, "strobe_in"),
            (Rows{{"strobe_in", "1", "1", "1", "0", "1", "0"},
                  {"strobe_in", "1", "0", "0", "1", "0", "1"}}));
  Rows counts = numberRows(result.out, "count");  // two reads, then watch reads 1 to 4
  ASSERT_EQ(counts.size(), 2u);
  for (const char* read : {"1", "2", "3", "4"}) {
    const Rows rows = numberRows(result.out, read);
    ASSERT_FALSE(rows.empty()) << "watch read " << read;
    counts.push_back(rows.back());
  }
  for (size_t i = 1; i < counts.size(); ++i) {
    EXPECT_EQ(std::stoi(counts[i].at(2), nullptr, 16),
              (std::stoi(counts[i - 1].at(2), nullptr, 16) + 1) % 16)
        << "read " << i;
    if (i >= 3) {
      EXPECT_NE(counts[i].at(3).find('*'), std::string::npos) << "read " << i;
    }
  }
}

}  // namespace
