// The host library's texts: references, bit lists, hex vectors, names, targets and the signals
// document. What both clients must agree on is in client_cases.json (ClientCasesTest.cpp).
#include <gtest/gtest.h>

#include "ZinHost/BitList.h"
#include "ZinHost/Signals.h"
#include "ZinHost/SignalsFile.h"
#include "ZinHost/Target.h"
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

TEST(HostText, Targets) {
  EXPECT_EQ(describeTarget(""), "the built-in demo design");
  EXPECT_EQ(describeTarget("tcp://127.0.0.1:7700"), "the target server at 127.0.0.1:7700");
  EXPECT_EQ(describeTarget("tls://[::1]:7700"), "the target server at [::1]:7700 (TLS)");
  EXPECT_EQ(describeTarget("openocd://127.0.0.1:6666?board=ecp5"), "OpenOCD at 127.0.0.1:6666");
  for (const char* text : {"tcp://nohost", "openocd://127.0.0.1", "x://y"}) {
    try {
      openTarget(text);
      FAIL() << text;
    } catch (const TargetError& error) {
      EXPECT_EQ(error.kind(), TargetError::Kind::Malformed) << text;
    }
  }
  const OpenedTarget demo = openTarget("");
  EXPECT_TRUE(demo.simulated != nullptr && demo.transport == demo.simulated);
}

TEST(HostText, SignalsDocument) {
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
  ZINMOX_CORE_INFO narrow{};
  narrow.async_output_count = 2;
  for (const char* bad : {R"({"signals": [{"name": "a", "port": "sync_in", "bits": [65536]}]})",
                          R"({"signals": [{"name": "a", "port": "sync_in", "bits": [1, 1]}]})",
                          R"({"signals": [{"name": "a.b", "port": "sync_out", "bits": "0"}]})",
                          R"({"signals": [{"name": "a", "port": "async_out", "bits": "0-2"}]})"}) {
    EXPECT_THROW(parseSignals(bad, "test", &narrow), SignalsFileError) << bad;
  }
}

}  // namespace
