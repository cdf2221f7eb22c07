// The hub transport over an engine that answers like a hub on USER1 with one MOX core at index 0
// (other cores never answer a commit or clear). The verilated RTL covers the rest (tests/rtl-diff).
#include <gtest/gtest.h>

#include <memory>
#include <stdexcept>
#include <string>
#include <utility>

#include "ZinHub/Crc16.h"
#include "ZinHub/HubTransport.h"

namespace ZinHub {
namespace {

class FakeHubEngine : public JtagEngine {
 public:
  void queueIrScan(uint32_t, uint32_t, uint64_t instruction) override {
    ++irScans;
    hub_ = instruction == 0x8;
  }
  void queueDrScan(uint32_t, BitVector tdi) override {
    ++drScans;
    results_.push_back(hub_ ? answer(tdi) : BitVector(tdi.size(), 0));
  }
  std::vector<BitVector> execute() override {
    if (std::exchange(failNext, false)) {
      results_.clear();
      throw std::runtime_error("cable lost");
    }
    return std::move(results_);
  }

  int irScans = 0;
  int drScans = 0;
  bool failNext = false;

 private:
  static BitVector answer(const BitVector& tdi) {
    const auto op = readNumber(tdi, 0, 4);
    const bool core0 = readNumber(tdi, 4, 4) == 0;
    BitVector tdo;
    appendNumber(tdo, 0x015A, 16);
    if (op == 5) {
      BitVector record;
      appendNumber(record, core0 ? 0x000A0A09A5ULL : 0, 40);
      record.resize(128, core0 ? 1 : 0);
      tdo.insert(tdo.end(), record.begin(), record.end());
      appendCrc(tdo, crc16(record, 0, record.size()));
    }
    if ((op == 2 || op == 4) && core0) appendNumber(tdo, 0x3, 2);  // start bit, done
    tdo.resize(tdi.size(), 0);
    return tdo;
  }

  bool hub_ = false;
  std::vector<BitVector> results_;
};

std::string failure(HubTransport& transport, const std::string& text) {
  unsigned char read[64] = {};
  try {
    transport.commandSequence(text, read, 512);
  } catch (const std::runtime_error& e) {
    return e.what();
  }
  return "(no failure)";
}

TEST(HubTransport, StatusReadFillsOnlyWhatWasAskedFor) {
  HubTransport transport(std::make_shared<FakeHubEngine>());
  ZIN_CORE_INFO info{};
  unsigned char status[16] = {};
  transport.readStatus({0, 1, 0}, info, status, 6, 44);
  EXPECT_EQ(info.coreType, 9U);
  EXPECT_EQ(info.coreMajorVersion, 10U);
  EXPECT_EQ(status[5], 0x0F);  // bits 40..43 only
  EXPECT_EQ(status[6], 0x00);
  ZIN_CORE_INFO none{};
  transport.readStatus({0, 2, 0}, none, status, 16, 128);  // no hub on chain 2
  transport.readStatus({3, 1, 0}, none, status, 16, 128);  // no such device
  EXPECT_EQ(none.coreType, 0U);
}

TEST(HubTransport, EveryLineIsCheckedBeforeAnyScan) {
  auto engine = std::make_shared<FakeHubEngine>();
  HubTransport transport(engine);
  const char* bad[] = {
      "00 1 0 02 0 00000004",   "00 1 0 02 0  00000004 0", "0 1 0 02 0 00000004 0",
      "01 1 0 02 0 00000004 0", "00 5 0 02 0 00000004 0",  "00 1 0 05 0 00000004 0",
      "00 1 0 03 0 00000020 0", "00 1 0 02 0 00000005 0",  "00 1 0 01 0 00000004 8",
      "00 1 0 01 0 00200000 0", "00 1 0 04 1 00000004 1",  "00 1 0 01 0 00000004 xy",
      "00 1 0 03 1 00001000 0",  // needs more than the 64-byte read buffer
  };
  for (const char* line : bad) {
    EXPECT_EQ(failure(transport, std::string("00 1 0 02 0 00000004 0\n") + line)
                  .rfind("ZinHub: command line 2: ", 0),
              0U)
        << line;
  }
  EXPECT_EQ(engine->drScans, 0);
}

TEST(HubTransport, ScansLoadTheIrOnlyOnChangeAndReportTheFailingLine) {
  auto engine = std::make_shared<FakeHubEngine>();
  HubTransport transport(engine);
  const std::string good = "00 1 0 02 0 00000004 0\n00 1 0 04 1 00000004 0";
  EXPECT_EQ(failure(transport, good), "(no failure)");
  EXPECT_EQ(failure(transport, good), "(no failure)");
  EXPECT_EQ(engine->irScans, 1);
  EXPECT_EQ(failure(transport, good + "\n00 1 1 04 1 00000004 0"),
            "ZinHub: command line 3: core at 0:1:1 did not answer within 64 TCK cycles");
  EXPECT_EQ(failure(transport, "00 2 0 02 0 00000004 0"),
            "ZinHub: command line 1: no core at 0:2:0: no hub answers on device 0, user chain 2");
  EXPECT_EQ(engine->irScans, 2);

  engine->failNext = true;  // after a failed batch the IR contents are unknown
  EXPECT_EQ(failure(transport, good), "cable lost");
  EXPECT_EQ(failure(transport, good), "(no failure)");
  EXPECT_EQ(engine->irScans, 4);
}

}  // namespace
}  // namespace ZinHub
