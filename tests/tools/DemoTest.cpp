// The guided tour, checked against the demo design it runs on.
#include <gtest/gtest.h>

#include "ToolOutput.h"
#include "ZinSim/Description.h"

namespace {

using zinmox_test::runTool;

using zinmox_test::rowsStartingWith;

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

std::string refText(const ZIN_CORE_REF& ref) {
  return std::to_string(ref.deviceIndex) + ":" + std::to_string(ref.userChainNumber) + ":" +
         std::to_string(ref.coreIndex);
}

// Scan rows, the loopback of a value and a pulse train, and the counter seen by watch.
TEST(Demo, ShowsTheDemoDesignAndItsLoopback) {
  const auto result = runTool({"demo"});
  ASSERT_EQ(result.status, 0) << result.err;
  EXPECT_EQ(result.err, "");

  // Scan and info show the demo design (their fields are compared with it in JsonOutputTest).
  const ZinSim::TargetDescription design = ZinSim::demoDescription();
  for (const ZinSim::CoreDescription& core : design.cores) {
    EXPECT_EQ(rowsStartingWith(result.out, refText(core.ref)).size(), 1u) << refText(core.ref);
  }
  EXPECT_EQ(rowsStartingWith(result.out, "sync_input_count")[0][1],
            std::to_string(design.cores[0].syncInputs))
      << "info 0:1:0 lists the widths of the full-layout core";

  // Two reads: the written value loops back with its rising activity once; the one-step pulse
  // train rises in the first read and falls in the second.
  const auto leds = numberRows(result.out, "leds_in");
  ASSERT_EQ(leds.size(), 2u);
  EXPECT_EQ(leds[0], (std::vector<std::string>{"leds_in", "8", "A5", "A5", "00", "-", "-"}));
  EXPECT_EQ(leds[1], (std::vector<std::string>{"leds_in", "8", "A5", "00", "00", "-", "-"}));
  const auto strobe = numberRows(result.out, "strobe_in");
  ASSERT_EQ(strobe.size(), 2u);
  EXPECT_EQ(strobe[0], (std::vector<std::string>{"strobe_in", "1", "1", "1", "0", "1", "0"}));
  EXPECT_EQ(strobe[1], (std::vector<std::string>{"strobe_in", "1", "0", "0", "1", "0", "1"}));

  // The counter bits advance by one cycle per transfer.
  const auto count = numberRows(result.out, "count");
  ASSERT_EQ(count.size(), 2u);
  const int first = std::stoi(count[0][2], nullptr, 16);
  EXPECT_EQ(std::stoi(count[1][2], nullptr, 16), (first + 1) % 16);
  int previous = std::stoi(count[1][2], nullptr, 16);
  for (const char* read : {"1", "2", "3", "4"}) {
    const auto rows = numberRows(result.out, read);
    ASSERT_FALSE(rows.empty()) << "watch read " << read;
    const auto& row = rows.back();
    ASSERT_GE(row.size(), 3u);
    const int value = std::stoi(row[2], nullptr, 16);
    EXPECT_EQ(value, (previous + 1) % 16) << "watch read " << read;
    if (std::string(read) != "1") {
      ASSERT_GE(row.size(), 4u);
      EXPECT_NE(row[3].find('*'), std::string::npos) << "a changed value is marked";
    }
    previous = value;
  }
}

}  // namespace
