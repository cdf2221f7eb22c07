// The hub transport over an engine that answers like a hub with one MOX core at index 0.
#include <gtest/gtest.h>

#include <memory>
#include <stdexcept>
#include <string>

#include "ZinHub/Crc16.h"
#include "ZinHub/HubTransport.h"

namespace ZinHub {
namespace {

class FakeHubEngine : public JtagEngine {
 public:
  void queueIrScan(uint32_t, uint32_t irLength, uint64_t instruction) override {
    ++irScans;
    chain_ = irLength == 4 && instruction == 0x8;  // only USER1 holds a hub
  }
  void queueDrScan(uint32_t, BitVector tdi) override {
    ++drScans;
    results_.push_back(chain_ ? answer(tdi) : BitVector(tdi.size(), 0));
  }
  std::vector<BitVector> execute() override {
    if (failNext) {
      failNext = false;
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
    const auto op = static_cast<unsigned>(readNumber(tdi, 0, 4));
    const auto core = static_cast<unsigned>(readNumber(tdi, 4, 4));
    BitVector tdo;
    appendNumber(tdo, 0x015A, 16);
    BitVector record;
    if (op == 0) appendNumber(record, 0x0201, 32);  // two cores, the second absent
    if (op == 5) {
      appendNumber(record, core == 0 ? 0x000A0A09A5ULL : 0, 40);
      record.resize(128, core == 0 ? 1 : 0);
    }
    if (op == 2 || op == 4) appendNumber(record, 0x3, 2);  // start bit, done
    tdo.insert(tdo.end(), record.begin(), record.end());
    if (op == 0 || op == 5) appendCrc(tdo, crc16(record, 0, record.size()));
    tdo.resize(tdi.size(), 0);
    return tdo;
  }

  bool chain_ = false;
  std::vector<BitVector> results_;
};

class HubTransportTest : public ::testing::Test {
 protected:
  std::shared_ptr<FakeHubEngine> engine = std::make_shared<FakeHubEngine>();
  HubTransport transport{engine};
};

TEST_F(HubTransportTest, StatusReadFillsOnlyWhatWasAskedFor) {
  ZIN_CORE_INFO info{};
  unsigned char status[16] = {};
  transport.readStatus({0, 1, 0}, info, status, 6, 44);
  EXPECT_EQ(info.coreType, 9U);
  EXPECT_EQ(info.coreMajorVersion, 10U);
  EXPECT_EQ(status[4], 0x00);
  EXPECT_EQ(status[5], 0x0F);  // bits 40..43 only
  EXPECT_EQ(status[6], 0x00);

  ZIN_CORE_INFO none{};
  transport.readStatus({0, 2, 0}, none, status, 16, 128);  // no hub on chain 2
  transport.readStatus({3, 1, 0}, none, status, 16, 128);  // no such device
  EXPECT_EQ(none.coreType, 0U);
}

TEST_F(HubTransportTest, CheckedWholeBeforeAnyScanAndIrOnlyOnChainChange) {
  const std::string good = "00 1 0 02 0 00000004 0\n00 1 0 04 1 00000004 0";
  try {
    transport.commandSequence(good + "\n00 1 0 02 0 00000004 1", nullptr, 0);
    ADD_FAILURE() << "a bad third line was accepted";
  } catch (const std::runtime_error& e) {
    EXPECT_EQ(std::string(e.what()).rfind("ZinHub: command line 2: ", 0), 0U) << e.what();
  }
  EXPECT_EQ(engine->drScans, 0);  // the read line needed a buffer: nothing was sent

  unsigned char read[1] = {0xEE};
  read[0] = 0;
  transport.commandSequence(good, read, 4);
  transport.commandSequence(good, read, 4);
  EXPECT_EQ(engine->irScans, 1);
  EXPECT_EQ(engine->drScans, 4);
  EXPECT_EQ(read[0], 0);

  EXPECT_THROW(transport.commandSequence("00 2 0 02 0 00000004 0", nullptr, 0),
               std::runtime_error);  // no hub: "no core at 0:2:0"
  EXPECT_EQ(engine->irScans, 2);
}

TEST_F(HubTransportTest, RejectsMalformedLines) {
  const char* bad[] = {
      "00 1 0 02 0 00000004",     // six fields
      "00 1 0 02 0  00000004 0",  // double blank
      "0 1 0 02 0 00000004 0",    // short device field
      "01 1 0 02 0 00000004 0",   // device not on the board
      "00 5 0 02 0 00000004 0",   // chain without instruction
      "00 1 0 05 0 00000004 0",   // unknown code
      "00 1 0 03 0 00000020 0",   // capture without read flag
      "00 1 0 02 0 00000005 0",   // commit length
      "00 1 0 01 0 00000004 8",   // does not fit in 3 bits
      "00 1 0 01 0 00200000 0",   // beyond the longest possible line
      "00 1 0 04 1 00000004 1",   // clear data not 0
      "00 1 0 01 0 00000004 xy",  // not hex
  };
  unsigned char read[64] = {};
  for (const char* line : bad) {
    EXPECT_THROW(transport.commandSequence(line, read, 512), std::runtime_error) << line;
  }
  EXPECT_EQ(engine->drScans, 0);
}

TEST_F(HubTransportTest, DiscoveryAndEngineFailure) {
  std::vector<ZIN_CORE_REF> refs;
  ASSERT_TRUE(transport.listCores(refs));
  ASSERT_EQ(refs.size(), 1U);
  EXPECT_EQ(refs[0].userChainNumber, 1U);
  EXPECT_EQ(refs[0].coreIndex, 0U);

  const int irBefore = engine->irScans;
  engine->failNext = true;
  ZIN_CORE_INFO info{};
  unsigned char status[16] = {};
  EXPECT_THROW(transport.readStatus({0, 1, 0}, info, status, 16, 128), std::runtime_error);
  transport.readStatus({0, 1, 0}, info, status, 16, 128);
  EXPECT_EQ(engine->irScans, irBefore + 2);  // the IR is loaded again after a failed batch
  EXPECT_EQ(info.coreType, 9U);
}

}  // namespace
}  // namespace ZinHub
