// The tool's text helpers: references, bit lists, hex vectors and the signals document.
#include <gtest/gtest.h>

#include "CoreRef.h"
#include "Errors.h"
#include "Hex.h"
#include "Signals.h"
#include "SignalsFile.h"

namespace {

using namespace zinmox;

TEST(TextHelpers, CoreReferences) {
  const ZIN_CORE_REF ref = parseCoreRef("0xFF:0XF:15");
  EXPECT_EQ(ref.deviceIndex, 255u);
  EXPECT_EQ(ref.userChainNumber, 15u);
  EXPECT_EQ(ref.coreIndex, 15u);
  EXPECT_EQ(formatCoreRef(ref), "255:15:15");
  for (const char* bad : {"", "1:2", "1:2:3:4", "::", "a:1:1", "1:1:-1", "99999999999999999999:0:0",
                          "0x:1:1", "1:0x10:1", "1 :1:1"}) {
    EXPECT_THROW(parseCoreRef(bad), UsageError) << bad;
  }
}

TEST(TextHelpers, BitListsReadBackAsWritten) {
  EXPECT_EQ(parseBitList("7-4,0,2"), (std::vector<uint32_t>{7, 6, 5, 4, 0, 2}));
  EXPECT_EQ(parseBitList("3"), (std::vector<uint32_t>{3}));
  for (const char* text : {"0-7", "7-0", "3", "0,2,4", "1-3,9,5-4", "0,1"}) {
    EXPECT_EQ(formatBitList(parseBitList(text)), std::string(text) == "0,1" ? "0-1" : text);
  }
  for (const char* bad : {"", ",", "1,,2", "a", "1-", "-1", "0-70000", "1.5"}) {
    EXPECT_THROW(parseBitList(bad), UsageError) << bad;
  }
}

TEST(TextHelpers, HexVectorsRoundTripAndNeverCutBits) {
  EXPECT_EQ(cleanHex("0x1f", "v"), "1f");
  EXPECT_THROW(cleanHex("0x", "v"), UsageError);
  EXPECT_THROW(cleanHex("1 2", "v"), UsageError);
  const std::vector<uint8_t> packed = hexToPacked("3A5", 12, "v");
  EXPECT_EQ(packed, (std::vector<uint8_t>{0xA5, 0x03}));
  EXPECT_EQ(packedToHex(packed, 12), "3A5");
  EXPECT_EQ(packedToHex(packed, 10), "3A5");
  EXPECT_EQ(packedToHex(packed, 9), "1A5");
  EXPECT_EQ(hexToPacked("0003FF", 10, "v"), (std::vector<uint8_t>{0xFF, 0x03}));
  EXPECT_THROW(hexToPacked("7FF", 10, "v"), UsageError);
  EXPECT_THROW(hexToPacked("1", 0, "v"), UsageError);
  EXPECT_EQ(hexToPacked("0", 0, "v"), std::vector<uint8_t>{});
}

TEST(TextHelpers, SignalsDocument) {
  const auto signals = parseSignals(
      R"({"signals": [{"name": "a", "port": "sync_in", "bits": [5, 1]},
                      {"name": "A", "port": "async_out", "bits": "2-0"}]})",
      "test");
  ASSERT_EQ(signals.size(), 2u);
  EXPECT_EQ(signals[0].port, Port::SyncIn);
  EXPECT_EQ(signals[0].bits, (std::vector<uint32_t>{5, 1}));
  EXPECT_EQ(signals[1].port, Port::AsyncOut);  // an input and an output may share a name
  EXPECT_EQ(signals[1].bits, (std::vector<uint32_t>{2, 1, 0}));
  EXPECT_TRUE(parseSignals(R"({"signals": []})", "test").empty());
  EXPECT_THROW(
      parseSignals(R"({"signals": [{"name": "a", "port": "sync_in", "bits": [65536]}]})", "test"),
      Failure);
}

}  // namespace
