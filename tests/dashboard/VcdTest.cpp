// The value-change dump writer: bit texts of odd widths, identifiers and change detection.
#include <gtest/gtest.h>

#include <set>
#include <sstream>

#include "dashboard/Vcd.h"

namespace {

using zinmox::dashboard::hexToBits;
using zinmox::dashboard::Reading;
using zinmox::dashboard::VcdWriter;

TEST(VcdTest, HexTextsBecomeTheLowBitsOfTheirWidth) {
  const struct {
    const char* hex;
    uint32_t width;
    const char* bits;
  } cases[] = {
      {"1", 1, "1"},        {"A5F", 12, "101001011111"}, {"1F", 5, "11111"}, {"FF", 3, "111"},
      {"3", 8, "00000011"}, {"g1", 8, "xxxx0001"},       {"", 4, "0000"},    {"a", 4, "1010"}};
  for (const auto& c : cases) EXPECT_EQ(hexToBits(c.hex, c.width), c.bits) << c.hex;
}

TEST(VcdTest, OnlyChangesAreDumpedAndManySignalsKeepDistinctIdentifiers) {
  std::vector<Reading> inputs;
  for (int i = 0; i < 40; ++i) {  // 40 inputs of 3 signals: identifiers past one character
    inputs.push_back(Reading{"in" + std::to_string(i), 4, false, "0", "0", "0", "", ""});
  }
  inputs.push_back(Reading{"s.x", 1, true, "1", "0", "0", "1", "0"});
  std::ostringstream out;
  VcdWriter writer(out, "core_0:1:0", inputs);
  writer.sample(5, inputs);
  inputs[39].value = "9";
  writer.sample(5, inputs);  // same time: moved just past the previous one
  writer.sample(9, inputs);  // nothing changed: nothing written
  const std::string text = out.str();
  EXPECT_NE(text.find("$scope module core_0_1_0 $end"), std::string::npos);
  EXPECT_NE(text.find(" s_x_sync_activity_up $end"), std::string::npos);
  EXPECT_NE(text.find("#6\nb1001 "), std::string::npos) << text.substr(text.size() - 40);
  EXPECT_EQ(text.find("#9"), std::string::npos);
  std::set<std::string> codes;
  std::istringstream lines(text);
  for (std::string line; std::getline(lines, line);) {
    std::istringstream words(line);
    std::string var, wire, width, code;
    if (words >> var >> wire >> width >> code && var == "$var") {
      EXPECT_TRUE(codes.insert(code).second) << line;
    }
  }
  EXPECT_EQ(codes.size(), 40u * 3 + 5);
  inputs.pop_back();
  EXPECT_THROW(writer.sample(20, inputs), std::invalid_argument);
}

}  // namespace
