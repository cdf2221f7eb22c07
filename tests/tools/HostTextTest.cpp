// The host library's bit lists and hex vectors below what the clients show. What both clients
// must agree on is in client_cases.json (ClientCasesTest.cpp); the signals document's errors are
// the tool's (ErrorPathTest.cpp).
#include <gtest/gtest.h>

#include "ZinHost/BitList.h"
#include "ZinHost/TextError.h"
#include "ZinHost/ValueText.h"

namespace {

using namespace ZinHost;

TEST(HostText, BitListsAreCappedAndUnique) {
  EXPECT_EQ(parseBitList("7-4,0,2"), (std::vector<uint32_t>{7, 6, 5, 4, 0, 2}));
  for (const char* text : {"0-7", "7-0", "3", "0,2,4", "1-3,9,5-4", "0,1"}) {
    EXPECT_EQ(formatBitList(parseBitList(text)), std::string(text) == "0,1" ? "0-1" : text);
  }
  for (const char* bad : {"", "a", "1-", "-1", "0-70000", "65535", "1.5"}) {
    EXPECT_THROW(parseBitList(bad), TextError) << bad;
  }
  // The cap holds before a range is expanded: 3,000 whole-port ranges fail at the first one.
  std::string huge = "0-65534";
  for (int i = 0; i < 3000; ++i) huge += ",0-65534";
  EXPECT_EQ(parseBitList("0-15", 16).size(), 16u);
  try {
    parseBitList(huge, 16);
    FAIL() << "accepted";
  } catch (const TextError& error) {
    EXPECT_LT(std::string(error.what()).size(), 160u);  // the echo stays short
  }
  EXPECT_THROW(parseBitList("0", 0), TextError);
  EXPECT_THROW(checkBitList({1, 2, 1}), TextError);
  EXPECT_THROW(checkBitList({0, 1, 2}, 2), TextError);
  std::vector<uint32_t> alternate;
  for (uint32_t bit = 0; bit < 60000; bit += 2) alternate.push_back(bit);
  EXPECT_LT(formatBitList(alternate).size(), 80u);
  EXPECT_EQ(formatBitList(alternate).substr(formatBitList(alternate).size() - 4), ",...");
}

TEST(HostText, HexVectorsRoundTripAndNeverCutBits) {
  const std::vector<uint8_t> packed = hexToPacked("3A5", 12, "v");
  EXPECT_EQ(packed, (std::vector<uint8_t>{0xA5, 0x03}));
  EXPECT_EQ(packedToHex(packed, 12), "3A5");
  EXPECT_EQ(packedToHex(packed, 9), "1A5");
  EXPECT_EQ(hexToPacked("0003FF", 10, "v"), (std::vector<uint8_t>{0xFF, 0x03}));
  EXPECT_THROW(hexToPacked("7FF", 10, "v"), TextError);
  EXPECT_THROW(hexToPacked("1", 0, "v"), TextError);
  // The library's fitting: sign-extended when short, the last digits when long.
  EXPECT_EQ(fitHexDigits("8", 2), (std::vector<uint8_t>{0xF8, 0xFF}));
  EXPECT_EQ(fitHexDigits("12345", 2), (std::vector<uint8_t>{0x45, 0x23}));
}

}  // namespace
